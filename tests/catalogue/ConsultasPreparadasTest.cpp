// Look-ups asked again with other values reuse their compiled statement: what they answer
// follows every change of the catalogue, whoever makes it, and the file stays writable.
#include "CatalogoTeste.h"

#include "catalogue/CEConexaoCatalogo.h"
#include "catalogue/CEConsultasCatalogo.h"

#include <QtSql/QSqlDatabase>
#include <QtSql/QSqlError>
#include <QtSql/QSqlQuery>

namespace {

const QChar kSep(0x000C);

class ConsultasPreparadasTest : public CatalogoTeste {
protected:
    void SetUp() override {
        CatalogoTeste::SetUp();
        UsarDemo("1");
    }
    CEConexaoCatalogo& Conexao() { return *CEConexaoCatalogo::ObterCatalogo(); }

    // Runs a statement on a connection of its own, as another program would; its error.
    QString Outro(const QString& instrucao) {
        QString erro;
        {
            QSqlDatabase banco = QSqlDatabase::addDatabase("QSQLITE", "outro-programa");
            banco.setDatabaseName(Pasta() + "/catalogo.db");
            banco.setConnectOptions("QSQLITE_BUSY_TIMEOUT=0");
            if (!banco.open()) return "no connection";
            QSqlQuery consulta(banco);
            if (!consulta.exec(instrucao)) erro = consulta.lastError().text();
        }
        QSqlDatabase::removeDatabase("outro-programa");
        return erro;
    }
};

TEST_F(ConsultasPreparadasTest, AnswersFollowChangesMadeThroughTheConnection) {
    CEConsultasCatalogo consultas;
    EXPECT_EQ(consultas.ListaComp("7001", "1"), "S");
    EXPECT_EQ(consultas.ListaComp("8503", "2"), "N");
    ASSERT_TRUE(Conexao().Executar("update BDZV set ZV_LISTA = 'x' where ZV_KEY = '7001'"));
    EXPECT_EQ(consultas.ListaComp("7001", "1"), "x");
    // A new column shows in the rows of every key, the ones asked before included.
    EXPECT_FALSE(consultas.ColunasComp("1001").join('|').contains("EXTRA_Z"));
    ASSERT_TRUE(Conexao().Executar("alter table BDUSER add column EXTRA_Z varchar(10)"));
    ASSERT_TRUE(Conexao().Executar("update BDUSER set EXTRA_Z = 'novo' where USER_KEY = '1001'"));
    EXPECT_TRUE(consultas.ColunasComp("1001").contains("EXTRA_Z" + QString(kSep) + "novo"));
    EXPECT_TRUE(consultas.ColunasComp("2001").contains("EXTRA_Z" + QString(kSep)));
    // A table gone answers nothing, and the look-up works again once it is back.
    ASSERT_TRUE(Conexao().Executar("alter table BDTIPOCOMP rename to BDTIPO_GUARDADA"));
    EXPECT_EQ(consultas.TipoComp("8502"), "");
    ASSERT_TRUE(Conexao().Executar("drop table if exists BDTIPOCOMP"));
    ASSERT_TRUE(Conexao().Executar("alter table BDTIPO_GUARDADA rename to BDTIPOCOMP"));
    EXPECT_EQ(consultas.TipoComp("8502"), "18");
}

TEST_F(ConsultasPreparadasTest, AnswersFollowChangesOfAnotherProgram) {
    CEConsultasCatalogo consultas;
    EXPECT_EQ(consultas.MaterialSap("7001"), "100070011");
    EXPECT_EQ(consultas.TipoComp("8502"), "18");
    // The file is not held locked between look-ups: another program writes at once.
    EXPECT_EQ(Outro("update BDMATSAP set MATSAP_MAT = '42' where MATSAP_ZVKEY = '7001'"), "");
    EXPECT_EQ(consultas.MaterialSap("7001"), "42");
    // Its change of the tables' shape leaves the compiled look-ups right.
    EXPECT_EQ(Outro("alter table BDMATSAP add column OUTRA_W varchar(10)"), "");
    EXPECT_EQ(Outro("update BDTIPOCOMP set TIPO_KEY = 7 where COMP_KEY = '8502'"), "");
    EXPECT_EQ(consultas.MaterialSap("7001"), "42");
    EXPECT_EQ(consultas.TipoComp("8502"), "7");
    EXPECT_EQ(Outro("alter table BDMATSAP rename to BDMATSAP_VELHA"), "");
    EXPECT_EQ(consultas.MaterialSap("7001"), "");
    EXPECT_EQ(Outro("drop table if exists BDMATSAP"), "");
    EXPECT_EQ(Outro("alter table BDMATSAP_VELHA rename to BDMATSAP"), "");
    EXPECT_EQ(consultas.MaterialSap("7001"), "42");
}

TEST_F(ConsultasPreparadasTest, WholeRowsFollowAColumnAddedByAnotherProgram) {
    CEConsultasCatalogo consultas;
    EXPECT_FALSE(consultas.ColunasComp("1001").join('|').contains("OUTRA_W"));
    // The connection's idea of the table is older than the table now: the row still comes
    // whole, with the new column.
    EXPECT_EQ(Outro("alter table BDUSER add column OUTRA_W varchar(10)"), "");
    EXPECT_EQ(Outro("update BDUSER set OUTRA_W = 'dele' where USER_KEY = '1001'"), "");
    EXPECT_TRUE(consultas.ColunasComp("1001").contains("OUTRA_W" + QString(kSep) + "dele"));
    EXPECT_TRUE(consultas.ColunasComp("2001").contains("OUTRA_W" + QString(kSep)));
    // A column gone goes from the rows too.
    EXPECT_EQ(Outro("alter table BDUSER drop column OUTRA_W"), "");
    EXPECT_FALSE(consultas.ColunasComp("1001").join('|').contains("OUTRA_W"));
}

TEST_F(ConsultasPreparadasTest, EachLookUpCountsAndShowsItsStatementText) {
    CEConsultasCatalogo consultas;
    const int antes = Conexao().InstrucoesEnviadas();
    EXPECT_EQ(consultas.DescricaoComp("7001"), "Fonte chaveada 24 Vcc 5 A");
    EXPECT_EQ(consultas.BlocoRepresentacao("1001", "1", "2"), "REGUA_BX2_5_GY");
    EXPECT_EQ(consultas.BlocoRepresentacao("2001", "2", "1"), "TOPO_CT09_10_24DC");
    EXPECT_EQ(Conexao().InstrucoesEnviadas() - antes, 3);
    EXPECT_EQ(Conexao().UltimaInstrucao(),
              "select BLK_BLOCO from BDBLOCOS where BLK_ZV_KEY='2001' and BLK_NORMA='2' and "
              "BLK_REP_KEY='1'");
    const QStringList acessorios = consultas.AcessoriosDe("2001");
    EXPECT_EQ(Conexao().UltimaInstrucao(),
              "select VL_KEY_B, VL_QTDE from BDVINCL where VL_KEY_A = '2001'");
    // A value with a question mark is a value, not a place for another.
    EXPECT_EQ(consultas.ListaComp("70?1", "1"), "");
    EXPECT_EQ(Conexao().UltimaInstrucao(),
              "select ZV_LISTA from BDZV where ZV_KEY='70?1' and\tZV_KEY_NOR ='1'");
}

}  // namespace
