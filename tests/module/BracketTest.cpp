// The checks before a command and the bracket around it, on a drawing with pages, with the
// product's LISP functions defined by the test.
#include "QtPrinters.h"
#include "app/Application.h"
#include "app/ConsoleUserInterface.h"
#include "app/HostDocument.h"
#include "drawing/Database.h"
#include "drawing/LayerRecord.h"
#include "sdk/LispInterface.h"

#include <gtest/gtest.h>

#include <QTemporaryDir>

namespace {

class BracketTest : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(dados_.isValid());
        qputenv("ZV_DATA_DIR", dados_.path().toUtf8());
        auto ui = std::make_unique<zvhost::ConsoleUserInterface>(out_, err_, false);
        app_ = std::make_unique<zvhost::Application>(std::move(ui), out_);
        app_->setExecutableFolder(ZV_BIN_DIR);
        documento_ = app_->openDocument(dados_.filePath("p.dxf"));
        for (const char* nome : {"ESQ$0001$A", "ESQ$0002$A", "ESQ$DE", "ESQ$FORMATO", "ESQ$SELO"})
            documento_->database()->createLayer(nome);
        QString erro;
        ASSERT_TRUE(app_->loadModule(QString(ZV_BIN_DIR) + "/libzvlistas.so", &erro));
        // The product's page functions, recording how they were called.
        lisp(
            "(setq chamadas nil)"
            "(defun getprimeirapagina () (setq chamadas (cons \"primeira\" chamadas))"
            "  (list \"ESQ$0001$A\"))"
            "(defun atualizarpaginas () (setq chamadas (cons \"atualizar\" chamadas)) nil)"
            "(defun Descongela_as_layers_da_pagina (p)"
            "  (setq chamadas (cons (strcat \"descongela \" p) chamadas)) nil)"
            "(defun zvBuild () (setq chamadas (cons \"build\" chamadas)) construiu)");
    }
    void lisp(const QString& texto) { ASSERT_TRUE(documento_->lisp()->lispEvaluate(texto)); }
    QString simbolo(const QString& nome) {
        zvsdk::ResultBuffer* valor = nullptr;
        documento_->lisp()->lispGetSymbol(nome, &valor);
        QString texto;
        for (zvsdk::ResultBuffer* no = valor; no; no = no->rbnext)
            if (no->restype == zvsdk::RTSTR) texto += (texto.isEmpty() ? "" : "|") + no->rstring;
        zvsdk::releaseChain(valor);
        return texto;
    }
    QStringList descongelados() {
        QStringList nomes;
        for (zvdb::LayerRecord* layer : documento_->database()->layers())
            if (!layer->isFrozen())
                nomes << QString::fromUtf8(layer->name().data(), int(layer->name().size()));
        nomes.sort();
        return nomes;
    }
    QString erros() {
        err_.flush();
        return erros_;
    }
    QString saida() {
        out_.flush();
        return saida_;
    }

    QTemporaryDir dados_;
    QString saida_, erros_;
    QTextStream out_{&saida_}, err_{&erros_};
    std::unique_ptr<zvhost::Application> app_;
    zvhost::HostDocument* documento_ = nullptr;
};

TEST_F(BracketTest, AFailedBuildStopsTheListsWithMessage326AndChangesNothing) {
    lisp("(setq PBLBLNRUNONLSTS T construiu nil)");
    documento_->database()->setCurrentLayer("ESQ$0002$A");
    const QStringList antes = descongelados();
    zvsdk::CommandResult resultado{};
    documento_->execute("gerarListaBornesGrf", &resultado);
    EXPECT_EQ(simbolo("chamadas"), "build");
    EXPECT_EQ(descongelados(), antes);
    EXPECT_FALSE(erros().contains("file dialog"));
    EXPECT_TRUE(saida().contains("\nThe project build failed. The list was not created.\n"));
    EXPECT_EQ(resultado, zvsdk::CommandResult::Failed);
}

TEST_F(BracketTest, TheDiagramStopsOnAFailedBuildWithItsOwnMessageBeforeAnythingElse) {
    // Every flag that would run a build, open the bracket or ask for a template is set.
    lisp("(setq PBLBLNRUNONLSTS T PBLBLNRUNONEXPORT T construiu nil)");
    lisp("(setq *DIR_ZVCFG_TEMPL* \"/modelos/\")");
    documento_->database()->setCurrentLayer("ESQ$0002$A");
    const QStringList antes = descongelados();
    const int inicio = saida().size();
    zvsdk::CommandResult resultado{};
    documento_->execute("diagramaTopografico", &resultado);
    EXPECT_EQ(saida().mid(inicio),
              "\nThe project build failed. The topographic diagram was not drawn.\n");
    EXPECT_EQ(resultado, zvsdk::CommandResult::Failed);
    EXPECT_EQ(simbolo("chamadas"), "build");
    EXPECT_EQ(descongelados(), antes);
    EXPECT_FALSE(erros().contains("file dialog"));
}

TEST_F(BracketTest, TheDiagramWithoutATemplateFolderDoesNothingInsideTheBracket) {
    lisp("(setq PBLBLNRUNONLSTS T construiu T)");
    documento_->database()->setCurrentLayer("ESQ$0002$A");
    const int layers = int(documento_->database()->layers().size());
    zvsdk::CommandResult resultado{};
    documento_->execute("diagramaTopografico", &resultado);
    // Built, bracket opened and closed, and no template asked for.
    EXPECT_EQ(simbolo("chamadas"), "descongela ESQ$0002$A|atualizar|build");
    EXPECT_FALSE(erros().contains("file dialog"));
    EXPECT_EQ(int(documento_->database()->layers().size()), layers);
    EXPECT_EQ(resultado, zvsdk::CommandResult::Cancelled);
    // With a folder, the template is asked for, and nobody answers.
    lisp("(setq chamadas nil *DIR_ZVCFG_TEMPL* \"/modelos/\")");
    documento_->execute("diagramaTopografico", &resultado);
    EXPECT_TRUE(erros().contains("file dialog 'template'"));
    EXPECT_EQ(simbolo("chamadas"), "descongela ESQ$0002$A|atualizar|build");
    EXPECT_EQ(resultado, zvsdk::CommandResult::Cancelled);
}

TEST_F(BracketTest, APassingBuildRunsTheCommandInsideTheBracket) {
    lisp("(setq PBLBLNRUNONLSTS T construiu T)");
    documento_->database()->setCurrentLayer("ESQ$0002$A");
    zvsdk::CommandResult resultado{};
    documento_->execute("gerarListaBornesGrf", &resultado);
    // Built, then the user's page shown again with its companions, the product told.
    EXPECT_EQ(simbolo("chamadas"), "descongela ESQ$0002$A|atualizar|build");
    EXPECT_EQ(descongelados(),
              QStringList({"0", "ESQ$0002$A", "ESQ$DE", "ESQ$FORMATO", "ESQ$SELO"}));
    EXPECT_EQ(QString::fromStdString(std::string(documento_->database()->currentLayer())),
              "ESQ$0002$A");
    // Nobody answered the template dialog.
    EXPECT_TRUE(erros().contains("file dialog 'template'"));
    EXPECT_EQ(resultado, zvsdk::CommandResult::Cancelled);
}

TEST_F(BracketTest, WithoutTheSymbolNoBuildAndFromLayerZeroTheFirstPage) {
    documento_->database()->setCurrentLayer("0");
    documento_->execute("gerarListaBornesGrf");
    EXPECT_TRUE(erros().contains("file dialog 'template'"));
    EXPECT_EQ(simbolo("chamadas"), "descongela ESQ$0001$A|atualizar|primeira");
    EXPECT_EQ(descongelados(),
              QStringList({"0", "ESQ$0001$A", "ESQ$DE", "ESQ$FORMATO", "ESQ$SELO"}));
    // The zoom ends on the page's extents, not on the bracket's tiny window.
    EXPECT_NE(documento_->view().maxX, 0.5);
}

}  // namespace
