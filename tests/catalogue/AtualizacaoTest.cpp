// An old catalogue is upgraded the first time a newer statement fails, then the statement
// runs again and answers.
#include "CatalogoTeste.h"

#include "catalogue/CEAtualizacaoCatalogo.h"
#include "catalogue/CECacheCatalogo.h"
#include "catalogue/CEConexaoCatalogo.h"
#include "catalogue/CEConsultasCatalogo.h"
#include "settings/CIRegistro.h"

namespace {

class AtualizacaoTest : public CatalogoTeste {
protected:
    void SetUp() override {
        CatalogoTeste::SetUp();
        ASSERT_TRUE(
            Construir(Pasta() + "/antigo.db", {QString(ZV_TEST_DIR) + "/catalogo-antigo.sql"}));
    }
    CEConexaoCatalogo& Conexao() { return *CEConexaoCatalogo::ObterCatalogo(); }
    static int Passo(const QString& linha) { return linha.section(':', 0, 0).toInt(); }
};

TEST_F(AtualizacaoTest, TheFailingLookUpUpgradesAndSucceedsOnItsSecondTry) {
    UsarSqlite("antigo.db", "2");
    CEAtualizacaoCatalogo atualizacao(Conexao());
    const QStringList pendentes = atualizacao.Pendentes();
    EXPECT_TRUE(pendentes.contains("1: add column BDVINCL.VL_USAR_REP"));
    EXPECT_TRUE(pendentes.contains("2: create table BDTIPOCOMP"));
    EXPECT_TRUE(pendentes.contains("15: add column BDSAPCFG.SAP_USER"));
    EXPECT_TRUE(pendentes.contains("18: create table BDGROUP"));
    EXPECT_FALSE(pendentes.contains("15: create table BDSAPCFG"));

    CEConsultasCatalogo consultas;
    EXPECT_EQ(consultas.DescricaoComp("7001"), "Switch-mode power supply 24 V DC 5 A");
    EXPECT_TRUE(Caixas().isEmpty()) << Caixas().toStdString();

    // Every table and column of the steps is there now, and the rows of the new tables.
    EXPECT_TRUE(atualizacao.Pendentes().isEmpty())
        << atualizacao.Pendentes().join("\n").toStdString();
    for (const char* tabela : {"BDTIPOCOMP", "BDEQUIP", "BDCENU", "BDCABO2", "BDCUSER", "BDCDIC",
                               "BDPINOS", "BDCONTRAPECAS", "BDREP", "BDBLOCOS", "BDNUMBORN",
                               "BDCFG", "BDBARRAMENTO", "BDGROUP", "BDPAGE", "BDPAGEBLOCKS"})
        EXPECT_TRUE(Conexao().ExisteTabela(tabela)) << tabela;
    EXPECT_TRUE(Conexao().ExisteColuna("BDWIRE", "WIRE_SEG"));
    EXPECT_TRUE(Conexao().ExisteColuna("BDDIC", "DIC_ORDEM"));
    EXPECT_TRUE(Conexao().ExisteColuna("BDGROUP", "NUM_INIT"));
    EXPECT_EQ(consultas.DescricaoFio("10008"), "Flexible wire 2.5 mm² black");
    EXPECT_EQ(consultas.GrupoNome("1", "2"), "Diagrams");
    EXPECT_EQ(consultas.GrupoDescricao("1", "1"), "TITULO");
    EXPECT_EQ(Conexao().Consultar("select BOR_DESCR from BDNUMBORN").Primeiro("BOR_DESCR"),
              "Sequencial");
    // Old data stays.
    EXPECT_EQ(consultas.AcessoriosDe("7001"), QStringList{"1105#2"});
    EXPECT_EQ(consultas.ListaComp("7001", "1"), "S");
    EXPECT_EQ(consultas.TipoComp("7001"), "");  // the new type table starts empty
}

TEST_F(AtualizacaoTest, TheLanguageInUseIsWrittenToTheSettingsAndFillsTheNewColumns) {
    UsarSqlite("antigo.db", "");
    CECacheCatalogo cache;
    // The retried statement still names the language it was built with.
    EXPECT_EQ(cache.Consultas().DescricaoComp("7001"), "");
    EXPECT_EQ(CIRegistro::LibLang(), "2");
    EXPECT_EQ(cache.DescricaoComp("7001"), "Switch-mode power supply 24 V DC 5 A");
    const CERegistrosCatalogo linhas =
        Conexao().Consultar("select distinct MENU_KEY_LANG from BDMENUS");
    ASSERT_EQ(linhas.Linhas(), 1);
    EXPECT_EQ(linhas.Primeiro("MENU_KEY_LANG"), "2");
}

TEST_F(AtualizacaoTest, StepsRunInOrderAndOnceOnly) {
    UsarSqlite("antigo.db", "2");
    CEAtualizacaoCatalogo atualizacao(Conexao());
    const QStringList feitas = atualizacao.Executar();
    ASSERT_FALSE(feitas.isEmpty());
    for (int i = 1; i < feitas.size(); ++i)
        EXPECT_LE(Passo(feitas[i - 1]), Passo(feitas[i]));
    for (const QString& feita : feitas)
        EXPECT_FALSE(feita.endsWith("(failed)")) << feita.toStdString();
    EXPECT_EQ(Passo(feitas.first()), 1);
    EXPECT_EQ(Passo(feitas.last()), 19);
    EXPECT_TRUE(atualizacao.Executar().isEmpty());
}

TEST_F(AtualizacaoTest, TheDemoCatalogueNeedsNoUpgrade) {
    UsarDemo();
    EXPECT_TRUE(CEAtualizacaoCatalogo(Conexao()).Pendentes().isEmpty());
}

}  // namespace
