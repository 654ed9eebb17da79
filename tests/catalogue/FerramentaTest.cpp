// The catalogue tool, called in the process and through "zvhost catalogue".
#include "CatalogoTeste.h"

#include "settings/CIRegistro.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QProcess>

namespace {

class FerramentaTest : public CatalogoTeste {};

TEST_F(FerramentaTest, CheckTellsEngineOpeningVersionAndUpgrades) {
    UsarDemo();
    QString saida, erros;
    EXPECT_EQ(Ferramenta({"--check"}, &saida, &erros), 0) << erros.toStdString();
    EXPECT_TRUE(saida.contains("engine: SQLITE\n"));
    EXPECT_TRUE(saida.contains("connection: " + Pasta() + "/catalogo.db\n"));
    EXPECT_TRUE(saida.contains("opens: yes\n"));
    EXPECT_TRUE(saida.contains("schema version: 2022.0\n"));
    EXPECT_TRUE(saida.contains("upgrades to run: none\n")) << saida.toStdString();

    ASSERT_TRUE(Construir(Pasta() + "/antigo.db", {QString(ZV_TEST_DIR) + "/catalogo-antigo.sql"}));
    CIRegistro::SetDBName("antigo.db");
    saida.clear();
    EXPECT_EQ(Ferramenta({"--check"}, &saida), 0);
    EXPECT_TRUE(saida.contains("schema version: 2009.1\n"));
    EXPECT_TRUE(saida.contains("  2: create table BDTIPOCOMP\n")) << saida.toStdString();
    // Checking changes nothing.
    saida.clear();
    Ferramenta({"--check"}, &saida);
    EXPECT_TRUE(saida.contains("  2: create table BDTIPOCOMP\n"));
}

TEST_F(FerramentaTest, CheckWithoutACatalogueSaysWhy) {
    QString saida, erros;
    EXPECT_EQ(Ferramenta({"--check"}, &saida, &erros), 1);
    EXPECT_TRUE(erros.contains("no catalogue is configured")) << erros.toStdString();
    UsarSqlite("falta.db", "1");
    erros.clear();
    EXPECT_EQ(Ferramenta({"--check"}, &saida, &erros), 1);
    EXPECT_TRUE(erros.contains("the catalogue file does not exist: " + Pasta() + "/falta.db"));
}

TEST_F(FerramentaTest, CheckOpensOnlyWhatAStatementRunsOn) {
    QFile texto(Pasta() + "/texto.db");
    ASSERT_TRUE(texto.open(QIODevice::WriteOnly));
    texto.write("isto não é um catálogo\n");
    texto.close();
    UsarSqlite("texto.db", "1");
    QString saida, erros;
    EXPECT_EQ(Ferramenta({"--check"}, &saida, &erros), 1);
    EXPECT_TRUE(saida.contains("opens: no\n")) << saida.toStdString();
    EXPECT_FALSE(saida.contains("opens: yes"));
    EXPECT_TRUE(erros.contains("no statement runs on the catalogue: file is not a database"))
        << erros.toStdString();

    ASSERT_TRUE(Construir(Pasta() + "/outro.db", {QString(ZV_TEST_DIR) + "/outro-programa.sql"}));
    UsarSqlite("outro.db", "1");
    saida.clear();
    erros.clear();
    EXPECT_EQ(Ferramenta({"--check"}, &saida, &erros), 1);
    EXPECT_TRUE(saida.contains("opens: yes\n"));
    EXPECT_TRUE(saida.contains("upgrades to run: none (not a catalogue)\n")) << saida.toStdString();
    EXPECT_TRUE(erros.contains("this database is not a ZVListas catalogue")) << erros.toStdString();
    saida.clear();
    EXPECT_EQ(Ferramenta({"--sql", "select name from sqlite_master"}, &saida), 0);
    EXPECT_EQ(saida, "name\nclientes\n");

    QFile vazio(Pasta() + "/vazio.db");
    ASSERT_TRUE(vazio.open(QIODevice::WriteOnly));
    vazio.close();
    UsarSqlite("vazio.db", "1");
    saida.clear();
    EXPECT_EQ(Ferramenta({"--check"}, &saida, &erros), 0);
    EXPECT_TRUE(saida.contains("tables: none (an empty database)\n")) << saida.toStdString();
    EXPECT_TRUE(saida.contains("  2: create table BDTIPOCOMP\n")) << saida.toStdString();
}

TEST_F(FerramentaTest, CheckTellsASettingsFileThatDoesNotParse) {
    UsarDemo();
    QFile f(CIRegistro::ArquivoRegistro());
    ASSERT_TRUE(f.open(QIODevice::Append));
    f.write("<registro key=\"solto\"/>");
    f.close();
    QString saida, erros;
    EXPECT_EQ(Ferramenta({"--check"}, &saida, &erros), 1);
    EXPECT_TRUE(erros.contains("does not parse")) << erros.toStdString();
}

TEST_F(FerramentaTest, SqlPrintsRowsAndLookupRunsTheReadersPath) {
    UsarDemo("2");
    QString saida, erros;
    EXPECT_EQ(
        Ferramenta({"--sql", "select TIPO_KEY, COMP_KEY from BDTIPOCOMP where TIPO_KEY = '17'"},
                   &saida, &erros),
        0);
    EXPECT_EQ(saida, "TIPO_KEY\tCOMP_KEY\n17\t8001\n17\t8002\n");
    saida.clear();
    EXPECT_EQ(Ferramenta({"--lookup", "DescricaoComp", "7001"}, &saida), 0);
    EXPECT_EQ(saida, "Switch-mode power supply 24 V DC 5 A\n");
    saida.clear();
    EXPECT_EQ(Ferramenta({"--lookup", "ListaComp", "7001", "1"}, &saida), 0);
    EXPECT_EQ(saida, "S\n");
    saida.clear();
    EXPECT_EQ(Ferramenta({"--lookup", "AcessoriosDe", "8001"}, &saida), 0);
    EXPECT_EQ(saida, "8003#3\n");
    saida.clear();
    EXPECT_EQ(Ferramenta({"--lookup", "ColunasCabo", "20004"}, &saida), 0);
    EXPECT_TRUE(saida.contains("BLINDADO=S\n")) << saida.toStdString();
    saida.clear();
    erros.clear();
    EXPECT_EQ(Ferramenta({"--lookup", "TipoComp", "4242"}, &saida, &erros), 0);
    EXPECT_TRUE(erros.contains("empty answer"));
    EXPECT_EQ(Ferramenta({"--lookup", "ListaComp", "7001"}, &saida, &erros), 2);
    EXPECT_EQ(Ferramenta({"--lookup", "Nada", "1"}, &saida, &erros), 2);
    saida.clear();
    EXPECT_EQ(Ferramenta({"--sql", "update BDZV set ZV_LISTA = 'N' where ZV_KEY = '7001'"}, &saida),
              0);
    EXPECT_EQ(saida, "statement ran\n");
    saida.clear();
    EXPECT_EQ(Ferramenta({"--lookup", "ListaComp", "7001", "1"}, &saida), 0);
    EXPECT_EQ(saida, "N\n");
    EXPECT_EQ(Ferramenta({"--sql", "select NADA from BDZV"}, &saida, &erros), 1);
    EXPECT_TRUE(Caixas().contains("SQL ERROR: "));
}

TEST_F(FerramentaTest, BuildReplacesTheFileOnlyWhenEveryStatementRan) {
    const QString arquivo = Pasta() + "/catalogo.db";
    ASSERT_TRUE(Construir(arquivo, ScriptsDemo()));
    QFile quebrado(Pasta() + "/quebrado.sql");
    ASSERT_TRUE(quebrado.open(QIODevice::WriteOnly));
    quebrado.write("create table X (A varchar(2));\ninsert into NADA values (1);\n");
    quebrado.close();
    QFile antes(arquivo);
    ASSERT_TRUE(antes.open(QIODevice::ReadOnly));
    const QByteArray conteudo = antes.readAll();
    antes.close();
    QString saida, erros;
    EXPECT_EQ(Ferramenta({"--build", arquivo, quebrado.fileName()}, &saida, &erros), 1);
    EXPECT_TRUE(erros.contains("insert into NADA")) << erros.toStdString();
    QFile depois(arquivo);
    ASSERT_TRUE(depois.open(QIODevice::ReadOnly));
    EXPECT_EQ(depois.readAll(), conteudo);
    EXPECT_FALSE(QFile::exists(arquivo + ".part"));
}

TEST_F(FerramentaTest, SetWritesOnlyCatalogueSettings) {
    QString saida, erros;
    EXPECT_EQ(Ferramenta({"--set", "Database=SQLITE", "DBPass=s3gredo", "libLang=3"}, &saida), 0);
    EXPECT_EQ(CIRegistro::Database(), "SQLITE");
    EXPECT_EQ(CIRegistro::DBPass(), "s3gredo");
    EXPECT_NE(CIRegistro::LerRegistro("DBPass"), "s3gredo");
    EXPECT_EQ(CIRegistro::LibLang(), "3");
    EXPECT_EQ(Ferramenta({"--set", "Database=MDB", "VersionIN=9"}, &saida, &erros), 2);
    EXPECT_EQ(CIRegistro::Database(), "SQLITE");  // nothing written when one is refused
    EXPECT_EQ(Ferramenta({}, &saida, &erros), 2);
    EXPECT_TRUE(erros.contains("usage: zvhost catalogue"));
}

TEST_F(FerramentaTest, SetOnASettingsFileThatDoesNotParseSaysSoAndWritesNothing) {
    const QString arquivo = CIRegistro::ArquivoRegistro();
    const QByteArray estragado = "<registros><registro key=\"ZVPalette\" value=\"x\"/>\n";
    ASSERT_TRUE(QDir().mkpath(QFileInfo(arquivo).absolutePath()));
    QFile f(arquivo);
    ASSERT_TRUE(f.open(QIODevice::WriteOnly));
    f.write(estragado);
    f.close();
    QString saida, erros;
    EXPECT_EQ(Ferramenta({"--set", "Database=SQLITE", "DBName=c.db"}, &saida, &erros), 1);
    EXPECT_TRUE(erros.startsWith("zvhost catalogue: the settings file " + arquivo +
                                 " does not parse (line 2"))
        << erros.toStdString();
    EXPECT_TRUE(erros.contains("nothing was saved"));
    EXPECT_TRUE(saida.isEmpty());
    ASSERT_TRUE(f.open(QIODevice::ReadOnly));
    EXPECT_EQ(f.readAll(), estragado);
}

// Runs zvhost with arguments in a shell whose files can't grow past `blocos` blocks of
// 512 bytes, the signal of that limit ignored; its exit status and stderr.
int ZvhostSobLimite(int blocos, const QStringList& argumentos, QString* erros) {
    QProcess shell;
    QStringList comando{QString(ZV_BIN_DIR) + "/zvhost"};
    for (const QString& a : argumentos)
        comando << "'" + QString(a).replace("'", "'\\''") + "'";
    shell.start(
        "/bin/sh",
        {"-c", QString("ulimit -f %1; trap '' XFSZ; exec %2").arg(blocos).arg(comando.join(' '))});
    if (!shell.waitForFinished(60000)) return -1;
    *erros = QString::fromUtf8(shell.readAllStandardError());
    return shell.exitStatus() == QProcess::NormalExit ? shell.exitCode() : -1;
}

TEST_F(FerramentaTest, ASaveOfTheSettingsThatFailsExitsOneAndKeepsTheOldFile) {
    ASSERT_TRUE(CIRegistro::GravarRegistros({{"Database", "SQLITE"}, {"DBName", "c.db"}}));
    const QString arquivo = CIRegistro::ArquivoRegistro();
    QFile f(arquivo);
    ASSERT_TRUE(f.open(QIODevice::ReadOnly));
    const QByteArray antes = f.readAll();
    f.close();
    QString erros;
    // Small settings still save under the limit.
    EXPECT_EQ(ZvhostSobLimite(64, {"catalogue", "--set", "libLang=2"}, &erros), 0)
        << erros.toStdString();
    EXPECT_EQ(CIRegistro::LibLang(), "2");
    ASSERT_TRUE(f.open(QIODevice::ReadOnly));
    const QByteArray depois = f.readAll();
    f.close();
    EXPECT_NE(depois, antes);

    EXPECT_EQ(
        ZvhostSobLimite(64, {"catalogue", "--set", "NetworkZV=" + QString(70000, 'p'), "libLang=3"},
                        &erros),
        1);
    EXPECT_TRUE(
        erros.contains("zvhost catalogue: could not save " + arquivo + ": File too large\n"))
        << erros.toStdString();
    ASSERT_TRUE(f.open(QIODevice::ReadOnly));
    EXPECT_EQ(f.readAll(), depois);
    EXPECT_EQ(QDir(QFileInfo(arquivo).absolutePath()).entryList(QDir::Files | QDir::Hidden),
              QStringList({"FVREG2022SP0.xml"}));
}

TEST_F(FerramentaTest, TheHostSubcommandRunsTheModulesTool) {
    UsarDemo("3");
    QProcess zvhost;
    zvhost.setProgram(QString(ZV_BIN_DIR) + "/zvhost");
    zvhost.setArguments({"catalogue", "--lookup", "DescricaoComp", "7001"});
    zvhost.start();
    ASSERT_TRUE(zvhost.waitForFinished(60000));
    EXPECT_EQ(zvhost.exitCode(), 0) << zvhost.readAllStandardError().toStdString();
    EXPECT_EQ(QString::fromUtf8(zvhost.readAllStandardOutput()), "Fuente conmutada 24 V CC 5 A\n");

    // Text that would rewrite the statement finds nothing, at once.
    zvhost.setArguments({"catalogue", "--lookup", "DescricaoComp", "NOPE' OR '1'='1"});
    zvhost.start();
    ASSERT_TRUE(zvhost.waitForFinished(60000));
    EXPECT_EQ(zvhost.exitCode(), 0);
    EXPECT_EQ(QString::fromUtf8(zvhost.readAllStandardOutput()),
              "Component without description in the catalogue\n");
    const QString erros = QString::fromUtf8(zvhost.readAllStandardError());
    EXPECT_EQ(erros.toStdString(),
              "zvhost catalogue: empty answer: a value holding a quote or a backslash is never "
              "sent to the catalogue\n");
    zvhost.setArguments({"catalogue", "--lookup", "ListaComp", "x'; DROP TABLE BDZV; --", "1"});
    zvhost.start();
    ASSERT_TRUE(zvhost.waitForFinished(60000));
    EXPECT_EQ(zvhost.readAllStandardOutput(), "\n");
    EXPECT_TRUE(zvhost.readAllStandardError().contains("empty answer"));
    zvhost.setArguments({"catalogue", "--lookup", "ListaComp", "7001", "1"});
    zvhost.start();
    ASSERT_TRUE(zvhost.waitForFinished(60000));
    EXPECT_EQ(zvhost.readAllStandardOutput(), "S\n");

    // A failing statement shows its message box on stderr.
    zvhost.setArguments({"catalogue", "--sql", "select NADA from BDZV"});
    zvhost.start();
    ASSERT_TRUE(zvhost.waitForFinished(60000));
    EXPECT_EQ(zvhost.exitCode(), 1);
    EXPECT_TRUE(zvhost.readAllStandardError().contains("SQL ERROR: "));
}

}  // namespace
