// The export command's road inside a host document: configuration from the folder of
// `*DIR_ZVCFG*`, the dialog's answers, a reader handed in by the test, the file, and the
// messages and results the user gets.
#include "QtPrinters.h"
#include "app/Application.h"
#include "app/ConsoleUserInterface.h"
#include "app/HostDocument.h"
#include "export/CEExportacao.h"
#include "sdk/Document.h"
#include "sdk/LispInterface.h"

#include <QFile>
#include <QTemporaryDir>
#include <QTextStream>

#include <gtest/gtest.h>

namespace {

class Comando : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(pasta.isValid());
        qputenv("ZV_DATA_DIR", pasta.path().toUtf8());
        auto interface = std::make_unique<zvhost::ConsoleUserInterface>(out, err, false);
        ui = interface.get();
        app = std::make_unique<zvhost::Application>(std::move(interface), out);
        app->setExecutableFolder(ZV_BIN_DIR);
        documento = app->openDocument(pasta.filePath("p.dxf"));
        ASSERT_TRUE(
            documento->lisp()->lispEvaluate("(setq *DIR_ZVCFG* \"" + pasta.path() + "/\")"));
        QFile config(pasta.filePath("cfgexportacao.ini"));  // the older name: migrated
        ASSERT_TRUE(config.open(QIODevice::WriteOnly));
        config.write(
            "{}\r\n-CFG_ATIVO=P\r\n\r\n{P}\r\n[BORNES]\r\nTIPO_OUT=CSV\r\n"
            "FLT_NOME_ORDENAR_POR=NUMERO\r\n*NUMERO*S*N*N*N*N*S*3*0\r\n#REGUA#0#X1\r\n");
    }
    static std::unique_ptr<VetorItens> Terminais(CEExportacao&) {
        auto itens = std::make_unique<VetorItens>();
        for (const char* n : {"12", "3"}) {
            auto* item = new CEItemLista;
            item->definirCampo("ZV_LISTA_TIPO", "BORNE");
            item->definirCampo("REGUA", "X1");
            item->definirCampo("NUMERO", n);
            itens->push_back(item);
        }
        return itens;
    }
    // Runs the export as a command of the document, and says how it ended.
    zvsdk::CommandResult Roda(const QString& tipo) {
        documento->addCommand("testeExporta", [tipo] {
            CEExportacao::Exporta(tipo, &Terminais);
            return 1;
        });
        zvsdk::CommandResult resultado = zvsdk::CommandResult::OutOfMemory;
        EXPECT_TRUE(documento->execute("testeExporta", &resultado));
        return resultado;
    }
    QString Saida() {
        out.flush();
        return saida;
    }
    QString Erros() {
        err.flush();
        return erros;
    }

    QTemporaryDir pasta;
    QString saida, erros;
    QTextStream out{&saida}, err{&erros};
    zvhost::ConsoleUserInterface* ui = nullptr;
    std::unique_ptr<zvhost::Application> app;
    zvhost::HostDocument* documento = nullptr;
};

}  // namespace

TEST_F(Comando, WritesTheFileAndPrintsItsPath) {
    const QString alvo = pasta.filePath("bornes.csv");
    ui->addAnswer("export:file=" + alvo);
    EXPECT_EQ(Roda("BORNES"), zvsdk::CommandResult::Succeeded);
    QFile f(alvo);
    ASSERT_TRUE(f.open(QIODevice::ReadOnly)) << Saida().toStdString() << Erros().toStdString();
    // The heading is padded to the width with blanks, the values with the fill in front.
    EXPECT_EQ(f.readAll(), "\"N  \"\r\n\"003\"\r\n\"012\"\r\n");
    EXPECT_TRUE(Saida().contains(alvo + "\n")) << Saida().toStdString();
    EXPECT_TRUE(QFile::exists(pasta.filePath("cfgexportacao_2014.ini")));
}

TEST_F(Comando, ATargetFolderThatIsNotThereIsAMessage) {
    ui->addAnswer("export:file=" + pasta.filePath("nao/existe.csv"));
    EXPECT_EQ(Roda("BORNES"), zvsdk::CommandResult::Failed);
    EXPECT_TRUE(Saida().contains("The export file was not written: could not save"))
        << Saida().toStdString();
}

TEST_F(Comando, NoFileAnswerCancels) {
    EXPECT_EQ(Roda("BORNES"), zvsdk::CommandResult::Cancelled);
    EXPECT_TRUE(Erros().contains("export:file")) << Erros().toStdString();
}

TEST_F(Comando, ABadAnswerIsAMessage) {
    ui->addAnswer("export:format=XLS");
    ui->addAnswer("export:file=" + pasta.filePath("x.csv"));
    EXPECT_EQ(Roda("BORNES"), zvsdk::CommandResult::Failed);
    EXPECT_TRUE(Saida().contains("Invalid answer for the export dialog: 'XLS'"))
        << Saida().toStdString();
    EXPECT_FALSE(QFile::exists(pasta.filePath("x.csv")));
}

TEST_F(Comando, ADamagedConfigurationIsKeptAndNothingIsExported) {
    QFile danificado(pasta.filePath("cfgexportacao_2014.ini"));
    ASSERT_TRUE(danificado.open(QIODevice::WriteOnly));
    const QByteArray bytes = "{A}\r\n" + QByteArray(2500, 'x') + "\r\n";
    danificado.write(bytes);
    danificado.close();
    ui->addAnswer("export:file=" + pasta.filePath("x.csv"));
    EXPECT_EQ(Roda("BORNES"), zvsdk::CommandResult::Failed);
    EXPECT_TRUE(Saida().contains("The export configuration file is damaged"))
        << Saida().toStdString();
    EXPECT_FALSE(QFile::exists(pasta.filePath("x.csv")));
    ASSERT_TRUE(danificado.open(QIODevice::ReadOnly));
    EXPECT_EQ(danificado.readAll(), bytes);
}
