// The module's commands on documents: opened before the load, after it, or none at all.
#include "app/Application.h"
#include "app/ConsoleUserInterface.h"
#include "app/HostDocument.h"

#include "QtPrinters.h"

#include <gtest/gtest.h>

#include <QTemporaryDir>

namespace {

const QStringList kComandos = {
    "gerarListaBornesGrf", "gerarListaBornesDwg", "gerarListaFiosGrf", "gerarListaMateriaisGrf",
    "gerarListaCabosGrf",  "exportacao",          "exportacaoFios",    "exportacaoAnilhas",
    "exportacaoBornes",    "exportacaoMateriais", "exportacaoCabos",   "diagramaTopografico"};

class CommandTableTest : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(dados_.isValid());
        qputenv("ZV_DATA_DIR", dados_.path().toUtf8());
        auto ui = std::make_unique<zvhost::ConsoleUserInterface>(out_, err_, false);
        app_ = std::make_unique<zvhost::Application>(std::move(ui), out_);
        app_->setExecutableFolder(ZV_BIN_DIR);
    }
    void carregar() {
        QString erro;
        ASSERT_TRUE(app_->loadModule(QString(ZV_BIN_DIR) + "/libzvlistas.so", &erro))
            << erro.toStdString();
    }
    static QStringList comandos(zvhost::HostDocument* documento) {
        QStringList nomes = documento->commandNames();
        nomes.sort(Qt::CaseInsensitive);
        return nomes;
    }
    static QStringList esperados() {
        QStringList nomes = kComandos;
        nomes.sort(Qt::CaseInsensitive);
        return nomes;
    }

    QTemporaryDir dados_;
    QString saida_, erros_;
    QTextStream out_{&saida_}, err_{&erros_};
    std::unique_ptr<zvhost::Application> app_;
};

TEST_F(CommandTableTest, DocumentsOpenBeforeAndAfterTheLoadGetAllTwelve) {
    zvhost::HostDocument* antes = app_->openDocument("antes.dxf");
    carregar();
    zvhost::HostDocument* depois = app_->openDocument("depois.dxf");
    EXPECT_EQ(comandos(antes), esperados());
    EXPECT_EQ(comandos(depois), esperados());
    // Users type command names in any case.
    EXPECT_TRUE(depois->hasCommand("GERARLISTABORNESGRF"));
}

TEST_F(CommandTableTest, LoadingWithNoDocumentAddsNothingUntilOneOpens) {
    carregar();
    EXPECT_EQ(app_->documentCount(), 0);
    zvhost::HostDocument* documento = app_->openDocument("novo.dxf");
    EXPECT_EQ(comandos(documento), esperados());
}

TEST_F(CommandTableTest, UnloadRemovesTheCommandsAndClosingADocumentIsHarmless) {
    zvhost::HostDocument* a = app_->openDocument("a.dxf");
    zvhost::HostDocument* b = app_->openDocument("b.dxf");
    carregar();
    app_->closeDocument(b);
    EXPECT_EQ(comandos(a), esperados());
    // The catalogue was never opened: unloading releases nothing and does not fail.
    app_->unloadModules();
    EXPECT_TRUE(a->commandNames().isEmpty());
    zvhost::HostDocument* c = app_->openDocument("c.dxf");
    EXPECT_TRUE(c->commandNames().isEmpty());
}

TEST_F(CommandTableTest, EveryHandlerMakesTheStartOfCommandCall) {
    zvhost::HostDocument* documento = app_->openDocument("a.dxf");
    carregar();
    for (const QString& nome : kComandos)
        ASSERT_TRUE(documento->execute(nome));
    EXPECT_EQ(documento->commandsStarted(), kComandos.size());
}

}  // namespace
