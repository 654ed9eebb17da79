// Which engine the settings pick, what opens nothing, how each engine is reached, and the
// SQL forms that differ between them.
#include "CatalogoTeste.h"

#include "catalogue/CEAtualizacaoCatalogo.h"
#include "catalogue/CEConexaoCatalogo.h"
#include "catalogue/CEConsultasCatalogo.h"
#include "catalogue/CEDialetoCatalogo.h"
#include "catalogue/CEScriptSql.h"
#include "settings/CIMensagens.h"
#include "settings/CIRegistro.h"

#include <QFile>
#include <QFileInfo>

namespace {

using D = CEDialetoCatalogo;

class ConexaoTest : public CatalogoTeste {};

TEST_F(ConexaoTest, EnginesThatOpenNothingAnswerEmptyAndSilently) {
    CEConsultasCatalogo consultas;
    for (const char* palavra : {"", "ORACLE", "sqlite", "SQLITE", "MDB"}) {
        CIRegistro::SetDatabase(palavra);
        CIRegistro::SetNetworkZV(Pasta() + "/");
        CIRegistro::SetDBName("nao-existe.db");
        EXPECT_EQ(consultas.DescricaoComp("7001"), "") << palavra;
        EXPECT_FALSE(CEConexaoCatalogo::ObterCatalogo()->Conectado()) << palavra;
    }
    EXPECT_FALSE(QFileInfo::exists(Pasta() + "/nao-existe.db"));
    EXPECT_TRUE(Caixas().isEmpty()) << Caixas().toStdString();
    EXPECT_TRUE(LinhaComando().isEmpty()) << LinhaComando().toStdString();
}

TEST_F(ConexaoTest, AFileThatIsNoDatabaseIsReportedAndLeftAsItWas) {
    const QByteArray texto = "isto não é um catálogo\n";
    QFile arquivo(Pasta() + "/texto.db");
    ASSERT_TRUE(arquivo.open(QIODevice::WriteOnly));
    arquivo.write(texto);
    arquivo.close();
    UsarSqlite("texto.db", "1");
    CEConsultasCatalogo consultas;
    EXPECT_EQ(consultas.DescricaoComp("7001"), "");
    EXPECT_EQ(Caixas().count("SQL ERROR: "), 1) << Caixas().toStdString();
    ASSERT_TRUE(arquivo.open(QIODevice::ReadOnly));
    EXPECT_EQ(arquivo.readAll(), texto);
}

TEST_F(ConexaoTest, LocalDbSaysOnceWhyItOpensNothing) {
    CIRegistro::SetDatabase("LOCALDB");
    CEConsultasCatalogo consultas;
    EXPECT_EQ(consultas.DescricaoComp("7001"), "");
    EXPECT_EQ(consultas.ListaComp("7001", "1"), "");
    const QString mensagem = CIMensagens::Mensagem("ZVLISTAS", 950);
    ASSERT_FALSE(mensagem.isEmpty());
    EXPECT_EQ(LinhaComando(), "\n" + mensagem + "\n");
    // A new load of the module says it again.
    CEConexaoCatalogo::LiberarCatalogo();
    EXPECT_EQ(CEConsultasCatalogo().TipoComp("7001"), "");
    EXPECT_EQ(LinhaComando().count(mensagem), 2);
}

TEST_F(ConexaoTest, ReleasingIsHarmlessWithOrWithoutAConnection) {
    EXPECT_FALSE(CEConexaoCatalogo::Existe());
    CEConexaoCatalogo::LiberarCatalogo();
    EXPECT_FALSE(CEConexaoCatalogo::Existe());
    UsarDemo();
    EXPECT_EQ(CEConsultasCatalogo().TipoComp("1001"), "5");
    CEConexaoCatalogo::LiberarCatalogo();
    EXPECT_FALSE(CEConexaoCatalogo::Existe());
    // A later look-up opens it again.
    EXPECT_EQ(CEConsultasCatalogo().TipoComp("2001"), "2");
}

TEST_F(ConexaoTest, AFailedOpeningIsTriedAgainAndShownAtEveryQuery) {
    ASSERT_TRUE(Construir(Pasta() + "/catalogo.db", ScriptsDemo()));
    CIRegistro::SetDatabase("ODBC");
    CIRegistro::SetDBName("DRIVER={Driver That Is Not Installed};SERVER=127.0.0.1;");
    CIRegistro::SetDBPass("segredo;1");
    CEConsultasCatalogo consultas;
    const int vezes = 20;
    for (int i = 0; i < vezes; ++i)
        EXPECT_EQ(consultas.DescricaoComp(QString::number(7001 + i)), "");
    EXPECT_EQ(Caixas().count("Connection Error\nCode = "), vezes) << Caixas().toStdString();
    EXPECT_EQ(Caixas().count("\nSource = QODBC\nDescription = "), vezes);
    EXPECT_FALSE(Caixas().contains("segredo"));
    // Settings put right take effect at the next query, with no pause after the failures.
    UsarSqlite("catalogo.db", "1");
    LimparSaidas();
    EXPECT_EQ(consultas.DescricaoComp("7001"), "Fonte chaveada 24 Vcc 5 A");
    EXPECT_TRUE(Caixas().isEmpty()) << Caixas().toStdString();
}

TEST_F(ConexaoTest, UpgradesNeverWriteIntoADatabaseThatIsNoCatalogue) {
    // Another program's SQLite file: it opens, its statements run, but it is not ours.
    const QString outro = Pasta() + "/outro.db";
    ASSERT_TRUE(Construir(outro, {QString(ZV_TEST_DIR) + "/outro-programa.sql"}));
    QFile arquivo(outro);
    ASSERT_TRUE(arquivo.open(QIODevice::ReadOnly));
    const QByteArray antes = arquivo.readAll();
    arquivo.close();
    UsarSqlite("outro.db", "1");
    CEConexaoCatalogo& conexao = *CEConexaoCatalogo::ObterCatalogo();
    EXPECT_EQ(conexao.Examinar(), CEConexaoCatalogo::Outro);
    EXPECT_TRUE(CEAtualizacaoCatalogo(conexao).Pendentes().isEmpty());
    EXPECT_EQ(CEConsultasCatalogo().TipoComp("7001"), "");
    EXPECT_EQ(Caixas().count("SQL ERROR: "), 1) << Caixas().toStdString();
    EXPECT_FALSE(conexao.ExisteTabela("BDTIPOCOMP"));
    CEConexaoCatalogo::LiberarCatalogo();
    ASSERT_TRUE(arquivo.open(QIODevice::ReadOnly));
    EXPECT_EQ(arquivo.readAll(), antes);
    arquivo.close();

    // A file that is no database: nothing runs on it, nothing is made in it.
    QFile texto(Pasta() + "/texto.db");
    ASSERT_TRUE(texto.open(QIODevice::WriteOnly));
    texto.write("BDZV;BDMENUS\n");
    texto.close();
    UsarSqlite("texto.db", "1");
    EXPECT_EQ(CEConexaoCatalogo::ObterCatalogo()->Examinar(), CEConexaoCatalogo::Ilegivel);
    EXPECT_TRUE(CEAtualizacaoCatalogo(*CEConexaoCatalogo::ObterCatalogo()).Executar().isEmpty());
    CEConexaoCatalogo::LiberarCatalogo();

    // An empty file is an empty database: the upgrades may make their tables there.
    QFile vazio(Pasta() + "/vazio.db");
    ASSERT_TRUE(vazio.open(QIODevice::WriteOnly));
    vazio.close();
    UsarSqlite("vazio.db", "1");
    EXPECT_EQ(CEConexaoCatalogo::ObterCatalogo()->Examinar(), CEConexaoCatalogo::Vazio);
    EXPECT_EQ(CEConsultasCatalogo().TipoComp("7001"), "");
    EXPECT_TRUE(CEConexaoCatalogo::ObterCatalogo()->ExisteTabela("BDTIPOCOMP"));
}

TEST_F(ConexaoTest, SettingsBuildTheConnectionOfEachEngine) {
    CIRegistro::SetNetworkZV("/srv/catalogo/");
    CIRegistro::SetDBName("FV.mdb");
    D::Ligacao mdb = D(D::Mdb).LigacaoDaConfiguracao();
    EXPECT_EQ(mdb.arquivo, "/srv/catalogo/FV.mdb");
    EXPECT_EQ(mdb.texto, "DRIVER={MDBTools};DBQ=/srv/catalogo/FV.mdb;");

    CIRegistro::SetDBServer("sql01,1433");
    CIRegistro::SetDBName("FV 2022");
    CIRegistro::SetDBUser("zv");
    CIRegistro::SetDBPass("p;w}d");
    const D::Ligacao servidor = D(D::SqlServer).LigacaoDaConfiguracao();
    EXPECT_EQ(servidor.texto,
              "DRIVER={FreeTDS};SERVER=sql01;PORT=1433;DATABASE={FV 2022};TDS_Version=7.4;");
    EXPECT_EQ(servidor.usuario, "zv");
    EXPECT_EQ(servidor.senha, "p;w}d");

    CIRegistro::SetDBServer("");
    EXPECT_EQ(D(D::LocalDb).LigacaoDaConfiguracao().texto,
              "Server=(localdb)\\MSSQLLocalDB;Database=FV2022SP0;");
    EXPECT_TRUE(D(D::LocalDb).LigacaoDaConfiguracao().driver.isEmpty());

    CIRegistro::SetDBName("DSN=catalogo");
    EXPECT_EQ(D(D::Odbc).LigacaoDaConfiguracao().texto, "DSN=catalogo");
    EXPECT_EQ(D::TextoSemSenha("DSN=x;UID=a;PWD={p;w}}d};PORT=1"), "DSN=x;UID=a;PWD=****;PORT=1");
}

TEST(DialetoCatalogo, TheEngineWordIsComparedExactly) {
    EXPECT_EQ(D::MotorDaPalavra("SQLITE"), D::Sqlite);
    EXPECT_EQ(D::MotorDaPalavra("MDB"), D::Mdb);
    EXPECT_EQ(D::MotorDaPalavra("SQLSERVER"), D::SqlServer);
    EXPECT_EQ(D::MotorDaPalavra("LOCALDB"), D::LocalDb);
    EXPECT_EQ(D::MotorDaPalavra("ODBC"), D::Odbc);
    EXPECT_EQ(D::MotorDaPalavra("mdb"), D::Nenhum);
    EXPECT_EQ(D::MotorDaPalavra(" MDB"), D::Nenhum);
}

TEST(DialetoCatalogo, FormsOfTheFileDatabaseTheServersAndTheOthers) {
    const D mdb(D::Mdb), servidor(D::SqlServer), sqlite(D::Sqlite);
    D postgres(D::Odbc);
    postgres.DefinirServidor(QSqlDriver::PostgreSQL);
    D outro(D::Odbc);
    outro.DefinirServidor(QSqlDriver::MSSqlServer);

    EXPECT_EQ(mdb.Texto(1), "char(1)");
    EXPECT_EQ(servidor.Texto(1), "varchar(1)");
    EXPECT_EQ(postgres.Texto(6), "varchar(6)");
    EXPECT_EQ(mdb.InteiroDe("X"), "val(X)");
    EXPECT_EQ(servidor.InteiroDe("X"), "convert(INT, X)");
    EXPECT_EQ(outro.InteiroDe("X"), "convert(INT, X)");
    EXPECT_EQ(postgres.InteiroDe("X"), "CAST(X AS INTEGER)");
    EXPECT_EQ(mdb.Trecho("K", 2, 3), "MID(K, 2, 3)");
    EXPECT_EQ(servidor.Trecho("K", 2, 3), "SUBSTRING(K, 2, 3)");
    EXPECT_EQ(sqlite.Trecho("K", 2, 3), "substr(K, 2, 3)");
    EXPECT_EQ(postgres.Logico(), "SMALLINT");
    EXPECT_EQ(servidor.Logico(), "BIT");
    EXPECT_EQ(servidor.AlargarColuna("BDZV", "ZV_DWG", "varchar(50)"),
              "ALTER TABLE BDZV ALTER COLUMN ZV_DWG varchar(50)");
    EXPECT_EQ(postgres.AlargarColuna("BDZV", "ZV_DWG", "varchar(50)"),
              "ALTER TABLE BDZV ALTER COLUMN ZV_DWG TYPE varchar(50)");
    EXPECT_EQ(sqlite.AlargarColuna("BDZV", "ZV_DWG", "char(50)"), "");
    EXPECT_EQ(postgres.NomeColuna("menu_descr"), "MENU_DESCR");
    EXPECT_EQ(postgres.NomeColuna("Mixed"), "Mixed");
    EXPECT_EQ(servidor.NomeColuna("menu_descr"), "menu_descr");
    // Only an ODBC source learns its family from the server.
    D fixo(D::Mdb);
    fixo.DefinirServidor(QSqlDriver::PostgreSQL);
    EXPECT_EQ(fixo.familia(), D::Arquivo);
}

TEST(ScriptSql, StatementsEndAtSemicolonsOutsideQuotes) {
    const QStringList instrucoes = CEScriptSql::Instrucoes(
        "-- a comment; with a semicolon\n"
        "create table T (A varchar(10));\n"
        "insert into T (A) values ('a;b'), ('it''s -- no comment');  -- trailing\n"
        "\n;;select 1");
    ASSERT_EQ(instrucoes.size(), 3);
    EXPECT_EQ(instrucoes[0], "create table T (A varchar(10))");
    EXPECT_EQ(instrucoes[1], "insert into T (A) values ('a;b'), ('it''s -- no comment')");
    EXPECT_EQ(instrucoes[2], "select 1");
}

}  // namespace
