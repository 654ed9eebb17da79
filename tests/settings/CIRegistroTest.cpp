// The product settings file: one XML file of key/value records shared by all modules.
#include "AmbienteTeste.h"
#include "settings/CIRegistro.h"

#include <QDomDocument>
#include <QStandardPaths>

#include <atomic>
#include <thread>

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
    CIRegistro::SetDBName("novo");
    EXPECT_EQ(Le(Arquivo()), estragado);
    // An empty file holds nothing to keep.
    ASSERT_TRUE(Escreve(Arquivo(), QByteArray()));
    CIRegistro::SetDBName("novo");
    EXPECT_EQ(CIRegistro::DBName(), "novo");
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
