// The product settings file: one XML file of key/value records shared by all modules.
#include "AmbienteTeste.h"
#include "QtPrinters.h"
#include "settings/CIRegistro.h"

#include <QDomDocument>
#include <QStandardPaths>

#include <atomic>
#include <functional>
#include <thread>

#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>
#include <csignal>

namespace {

class CIRegistroTest : public AmbienteTeste {
protected:
    QString Arquivo() const { return PastaDados() + "/FV/FVREG2022SP0.xml"; }

    // The records of the file on disk, in order, as "key=value".
    QStringList Registros() const {
        QDomDocument documento;
        if (!documento.setContent(Le(Arquivo()))) return {"<unreadable>"};
        QStringList registros;
        for (QDomElement e = documento.documentElement().firstChildElement("registro"); !e.isNull();
             e = e.nextSiblingElement("registro"))
            registros << e.attribute("key") + "=" + e.attribute("value");
        return registros;
    }
};

TEST_F(CIRegistroTest, TheFileLiesBelowTheDataFolderWithOneSeparator) {
    EXPECT_EQ(CIRegistro::ArquivoRegistro(), Arquivo());
    qputenv("ZV_DATA_DIR", (PastaDados() + "/").toUtf8());
    EXPECT_EQ(CIRegistro::ArquivoRegistro(), Arquivo());
    // Without the variable, a machine-wide folder, never the user's own data folder.
    qunsetenv("ZV_DATA_DIR");
    const QString pasta = CIRegistro::PastaDadosComuns();
    EXPECT_TRUE(QDir::isAbsolutePath(pasta)) << pasta.toStdString();
    EXPECT_NE(pasta, QStandardPaths::writableLocation(QStandardPaths::GenericDataLocation));
}

TEST_F(CIRegistroTest, AMissingFileReadsAsEmptyAndIsNotCreatedByReading) {
    EXPECT_EQ(CIRegistro::LerRegistro("Database"), QString());
    EXPECT_EQ(CIRegistro::NetworkZV(), QString());
    EXPECT_EQ(CIRegistro::DBPass(), QString());
    EXPECT_EQ(CIRegistro::IdiomaMenuSel(), 0);
    EXPECT_FALSE(QFile::exists(Arquivo()));
}

TEST_F(CIRegistroTest, AMissingKeyReadsAsEmptyAndTheLanguageAsZero) {
    ASSERT_TRUE(Escreve(Arquivo(), R"(<?xml version="1.0" encoding="UTF-8"?>
<registros><registro key="Database" value="MDB"/></registros>)"));
    EXPECT_EQ(CIRegistro::Database(), "MDB");
    EXPECT_EQ(CIRegistro::DBServer(), QString());
    EXPECT_EQ(CIRegistro::LibLang(), QString());
    EXPECT_EQ(CIRegistro::IdiomaMenuSel(), 0);
}

TEST_F(CIRegistroTest, WritingAddsOneRecordPerKeyAndKeepsTheOtherModulesKeys) {
    ASSERT_TRUE(Escreve(Arquivo(), R"(<?xml version="1.0" encoding="UTF-8"?>
<registros>
  <registro key="ZVPaletteDock" value="esquerda"/>
  <registro key="DBName" value="antigo.mdb"/>
  <registro key="Plot&amp;Co" value="ação €"/>
</registros>)"));
    CIRegistro::SetDBName("catalogo.mdb");
    CIRegistro::SetNetworkZV("/srv/zv/");
    CIRegistro::SetNetworkZV("/srv/zv2/");
    EXPECT_EQ(Registros(), QStringList({"ZVPaletteDock=esquerda", "DBName=catalogo.mdb",
                                        "Plot&Co=ação €", "NetworkZV=/srv/zv2/"}));
    EXPECT_EQ(CIRegistro::DBName(), "catalogo.mdb");
    EXPECT_EQ(CIRegistro::LerRegistro("Plot&Co"), "ação €");
}

TEST_F(CIRegistroTest, WritingWithoutAFileCreatesItsFolderAndAUtf8File) {
    CIRegistro::SetVersionIN("2022 SP0 – versão");
    CIRegistro::SetDatabase("SQLSERVER");
    EXPECT_EQ(Registros(), QStringList({"VersionIN=2022 SP0 – versão", "Database=SQLSERVER"}));
    const QByteArray inicio = Le(Arquivo()).left(Le(Arquivo()).indexOf("?>"));
    EXPECT_TRUE(inicio.startsWith("<?xml ") && inicio.contains("encoding=")) << inicio.data();
    EXPECT_TRUE(inicio.contains("UTF-8")) << inicio.data();
    EXPECT_TRUE(Le(Arquivo()).contains(QString("versão").toUtf8()));
    EXPECT_EQ(CIRegistro::VersionIN(), "2022 SP0 – versão");
}

TEST_F(CIRegistroTest, KeysAreCaseSensitive) {
    CIRegistro::GravarRegistro("Database", "MDB");
    EXPECT_EQ(CIRegistro::LerRegistro("database"), QString());
    EXPECT_EQ(CIRegistro::LerRegistro("DATABASE"), QString());
    CIRegistro::GravarRegistro("database", "LOCALDB");
    EXPECT_EQ(CIRegistro::Database(), "MDB");
    EXPECT_EQ(CIRegistro::LerRegistro("database"), "LOCALDB");
    EXPECT_EQ(Registros().size(), 2);
}

TEST_F(CIRegistroTest, ThePasswordComesBackAndIsNotStoredInClear) {
    const QStringList senhas = {"segredo",     "ZVListas", "ZVListasZVListas!", "sênha €😀", "pw1",
                                "  espaços  ", "<&\">"};
    for (const QString& senha : senhas) {
        CIRegistro::SetDBPass(senha);
        EXPECT_EQ(CIRegistro::DBPass(), senha);
        const QString guardada = CIRegistro::LerRegistro("DBPass");
        EXPECT_FALSE(guardada.isEmpty());
        EXPECT_FALSE(guardada.contains(senha)) << guardada.toStdString();
        EXPECT_FALSE(Le(Arquivo()).contains(senha.toUtf8())) << senha.toStdString();
    }
    CIRegistro::SetDBPass(QString());
    EXPECT_EQ(CIRegistro::DBPass(), QString());
}

TEST_F(CIRegistroTest, TheLanguageReadsLikeAtoi) {
    const QList<QPair<QString, int>> casos = {{"3", 3},   {" 2", 2}, {"1x", 1},
                                              {"abc", 0}, {"", 0},   {"-1", -1}};
    for (const auto& [texto, esperado] : casos) {
        CIRegistro::GravarRegistro("IdiomaMenuSel", texto);
        EXPECT_EQ(CIRegistro::IdiomaMenuSel(), esperado) << texto.toStdString();
    }
    CIRegistro::SetIdiomaMenuSel(3);
    EXPECT_EQ(CIRegistro::LerRegistro("IdiomaMenuSel"), "3");
}

TEST_F(CIRegistroTest, AChangeByAnotherWriterShowsAtTheNextRead) {
    CIRegistro::SetDBUser("ana");
    EXPECT_EQ(CIRegistro::DBUser(), "ana");
    ASSERT_TRUE(Escreve(Arquivo(), R"(<?xml version="1.0" encoding="UTF-8"?>
<registros><registro key="DBUser" value="bruno"/></registros>)"));
    EXPECT_EQ(CIRegistro::DBUser(), "bruno");
    QFile::remove(Arquivo());
    EXPECT_EQ(CIRegistro::DBUser(), QString());
}

TEST_F(CIRegistroTest, AnUnreadableFileReadsAsEmptyAndIsNeverOverwritten) {
    const QByteArray estragado = "<registros><registro key=\"DBName\" value=\"x\"";
    ASSERT_TRUE(Escreve(Arquivo(), estragado));
    EXPECT_EQ(CIRegistro::DBName(), QString());
    EXPECT_FALSE(CIRegistro::SetDBName("novo"));
    QString erro;
    EXPECT_FALSE(CIRegistro::GravarRegistros({{"DBName", "novo"}, {"libLang", "2"}}, &erro));
    EXPECT_TRUE(erro.startsWith("the settings file " + Arquivo() + " does not parse (line 1"))
        << erro.toStdString();
    EXPECT_TRUE(erro.endsWith("; nothing was saved")) << erro.toStdString();
    EXPECT_EQ(CIRegistro::ProblemaArquivo(), erro.left(erro.indexOf(';')));
    EXPECT_EQ(Le(Arquivo()), estragado);
    // Blanks alone are no XML either.
    ASSERT_TRUE(Escreve(Arquivo(), " \n"));
    EXPECT_FALSE(CIRegistro::SetDBName("novo"));
    EXPECT_EQ(Le(Arquivo()), " \n");
    // An empty file holds nothing to keep.
    ASSERT_TRUE(Escreve(Arquivo(), QByteArray()));
    EXPECT_TRUE(CIRegistro::ProblemaArquivo().isEmpty());
    EXPECT_TRUE(CIRegistro::SetDBName("novo"));
    EXPECT_EQ(CIRegistro::DBName(), "novo");
}

TEST_F(CIRegistroTest, AFolderInPlaceOfTheFileIsReportedAndLeftAlone) {
    ASSERT_TRUE(QDir().mkpath(Arquivo()));
    EXPECT_EQ(CIRegistro::Database(), QString());
    QString erro;
    EXPECT_FALSE(CIRegistro::GravarRegistro("Database", "SQLITE", &erro));
    EXPECT_EQ(erro, "cannot read " + Arquivo() + ": it is a folder; nothing was saved");
    EXPECT_TRUE(QFileInfo(Arquivo()).isDir());
}

TEST_F(CIRegistroTest, SeveralKeysGoInOneSave) {
    ASSERT_TRUE(CIRegistro::SetDatabase("MDB"));
    QString erro;
    ASSERT_TRUE(CIRegistro::GravarRegistros({{"Database", "SQLITE"},
                                             {"NetworkZV", "/srv/zv/"},
                                             {"DBPass", CIRegistro::SenhaGuardada("pw")}},
                                            &erro))
        << erro.toStdString();
    EXPECT_EQ(Registros(), QStringList({"Database=SQLITE", "NetworkZV=/srv/zv/",
                                        "DBPass=" + CIRegistro::SenhaGuardada("pw")}));
    EXPECT_EQ(CIRegistro::DBPass(), "pw");
    // One value that can't be stored stops them all.
    const QByteArray antes = Le(Arquivo());
    EXPECT_FALSE(CIRegistro::GravarRegistros({{"DBName", "ok"}, {"DBUser", "a\x01b"}}, &erro));
    EXPECT_EQ(erro, "could not save " + Arquivo() +
                        ": the setting \"DBUser\" holds a character that the file cannot hold");
    EXPECT_EQ(Le(Arquivo()), antes);
}

TEST_F(CIRegistroTest, ValuesComeBackExactlyOrAreRefused) {
    ASSERT_TRUE(CIRegistro::SetDBServer("antes"));
    const QStringList guardaveis = {"linha\nlinha", "tab\there", "cr\r\nlf", "  bordas  ",
                                    "<&\"'>",       "😀 ação",    QString()};
    for (const QString& valor : guardaveis) {
        QString erro;
        EXPECT_TRUE(CIRegistro::GravarRegistro("DBUser", valor, &erro)) << erro.toStdString();
        EXPECT_EQ(CIRegistro::DBUser(), valor) << valor.toStdString();
    }
    const QByteArray antes = Le(Arquivo());
    const QStringList recusados = {QString("a") + QChar(0), "b\x1f", QString(QChar(0xD800)),
                                   QString(QChar(0xDC00)) + "x", QString(QChar(0xFFFF))};
    for (const QString& valor : recusados) {
        EXPECT_FALSE(CIRegistro::SetDBUser(valor));
        EXPECT_FALSE(CIRegistro::GravarRegistro(valor, "x"));
    }
    EXPECT_FALSE(CIRegistro::GravarRegistro(QString(), "x"));
    EXPECT_EQ(Le(Arquivo()), antes);
    EXPECT_EQ(CIRegistro::DBServer(), "antes");
}

// Runs a save in a child process whose files can't grow past `limite` bytes; the signal
// that would end it is ignored, so the writes themselves fail. The save's answer and
// error text come back through a pipe.
QPair<bool, QString> GravaSobLimite(rlim_t limite, const std::function<bool(QString*)>& gravar) {
    int canal[2];
    if (pipe(canal) != 0) return {true, "no pipe"};
    const pid_t filho = fork();
    if (filho == 0) {
        close(canal[0]);
        signal(SIGXFSZ, SIG_IGN);
        const rlimit limiteArquivo{limite, limite};
        setrlimit(RLIMIT_FSIZE, &limiteArquivo);
        QString erro;
        const bool ok = gravar(&erro);
        const QByteArray resposta = QByteArray(ok ? "1" : "0") + erro.toUtf8();
        const ssize_t escrito = write(canal[1], resposta.constData(), size_t(resposta.size()));
        _exit(escrito == resposta.size() ? 0 : 3);
    }
    close(canal[1]);
    QByteArray resposta;
    char bloco[4096];
    for (ssize_t n; (n = read(canal[0], bloco, sizeof bloco)) > 0;)
        resposta.append(bloco, int(n));
    close(canal[0]);
    int estado = 0;
    waitpid(filho, &estado, 0);
    if (!WIFEXITED(estado) || WEXITSTATUS(estado) != 0 || resposta.isEmpty())
        return {true, "the child did not answer"};
    return {resposta[0] == '1', QString::fromUtf8(resposta.mid(1))};
}

TEST_F(CIRegistroTest, ASaveThatHitsTheFileSizeLimitKeepsTheOldFileByteForByte) {
    ASSERT_TRUE(CIRegistro::SetDatabase("SQLITE"));
    ASSERT_TRUE(CIRegistro::SetDBName("catalogo.db"));
    const QByteArray antes = Le(Arquivo());
    ASSERT_LT(antes.size(), 1024);

    // Under the limit a save still goes through.
    const auto pequena = GravaSobLimite(
        4096, [](QString* erro) { return CIRegistro::GravarRegistro("DBUser", "ana", erro); });
    EXPECT_TRUE(pequena.first) << pequena.second.toStdString();
    EXPECT_EQ(CIRegistro::DBUser(), "ana");
    const QByteArray depoisDaPequena = Le(Arquivo());

    const QString grande(20000, 'x');
    const auto falha = GravaSobLimite(
        4096, [&](QString* erro) { return CIRegistro::GravarRegistro("NetworkZV", grande, erro); });
    EXPECT_FALSE(falha.first);
    EXPECT_EQ(falha.second, QString("could not save " + Arquivo() + ": File too large"))
        << falha.second.toStdString();
    EXPECT_EQ(Le(Arquivo()), depoisDaPequena);
    EXPECT_EQ(QDir(PastaDados() + "/FV").entryList(QDir::Files | QDir::Hidden),
              QStringList({"FVREG2022SP0.xml"}));
    EXPECT_EQ(CIRegistro::NetworkZV(), QString());
}

TEST_F(CIRegistroTest, SavesReplaceTheWholeFileAtOnce) {
    CIRegistro::GravarRegistro("Contador", "0");
    std::atomic<bool> fim = false;
    std::atomic<int> leituras = 0;
    std::atomic<int> parciais = 0;
    // Another process's view: the raw file, read without the settings lock.
    std::thread leitor([&] {
        while (!fim) {
            QDomDocument documento;
            const QByteArray conteudo = Le(Arquivo());
            if (!documento.setContent(conteudo) || !conteudo.contains("Contador")) ++parciais;
            ++leituras;
        }
    });
    for (int i = 1; i <= 300; ++i) {
        CIRegistro::GravarRegistro("Contador", QString::number(i));
        CIRegistro::GravarRegistro("Outra", QString(i % 50, 'x'));
    }
    fim = true;
    leitor.join();
    EXPECT_EQ(parciais, 0) << "of " << leituras << " reads";
    EXPECT_GT(leituras, 0);
    EXPECT_EQ(QDir(PastaDados() + "/FV").entryList(QDir::Files | QDir::Hidden),
              QStringList({"FVREG2022SP0.xml"}));
}

TEST_F(CIRegistroTest, WritersOnSeveralThreadsLoseNoKey) {
    auto escritor = [](const QString& chave) {
        for (int i = 1; i <= 40; ++i)
            CIRegistro::GravarRegistro(chave, QString::number(i));
    };
    std::thread a(escritor, "ChaveA");
    std::thread b(escritor, "ChaveB");
    std::thread c(escritor, "ChaveC");
    a.join();
    b.join();
    c.join();
    EXPECT_EQ(CIRegistro::LerRegistro("ChaveA"), "40");
    EXPECT_EQ(CIRegistro::LerRegistro("ChaveB"), "40");
    EXPECT_EQ(CIRegistro::LerRegistro("ChaveC"), "40");
    EXPECT_EQ(Registros().size(), 3);
}

TEST_F(CIRegistroTest, TheTemporaryFolderIsTheSystemsOrEmpty) {
    EXPECT_EQ(QDir(CIRegistro::PastaTemporaria()).canonicalPath(),
              QDir(PastaTemp()).canonicalPath());
    qputenv("TMPDIR", (PastaTemp() + "/nao-existe").toUtf8());
    EXPECT_EQ(CIRegistro::PastaTemporaria(), QString());
}

}  // namespace
