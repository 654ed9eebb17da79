#pragma once
// A host with one open document on a drawing built by the test, for the facade's tests.
#include "app/Application.h"
#include "app/ConsoleUserInterface.h"
#include "app/HostDocument.h"
#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/DxfWriter.h"
#include "drawing/LayerRecord.h"

#include <gtest/gtest.h>

#include <QTemporaryDir>

class FacadeFixture : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(pasta_.isValid());
        qputenv("ZV_DATA_DIR", pasta_.path().toUtf8());
        qputenv("TMPDIR", pasta_.path().toUtf8());
        auto ui = std::make_unique<zvhost::ConsoleUserInterface>(out_, err_, false);
        ui_ = ui.get();
        app_ = std::make_unique<zvhost::Application>(std::move(ui), out_);
        app_->setExecutableFolder(QString(ZV_BIN_DIR));
        documento_ = app_->openDocument(pasta_.filePath("projeto.dxf"));
    }

    zvdb::Database& db() { return *documento_->database(); }
    QString arquivo(const QString& nome) const { return pasta_.filePath(nome); }
    QString saida() {
        out_.flush();
        return saida_;
    }

    // The layers that are not frozen, sorted.
    QStringList descongelados() {
        QStringList nomes;
        for (zvdb::LayerRecord* layer : db().layers())
            if (!layer->isFrozen()) nomes << QString::fromStdString(std::string(layer->name()));
        nomes.sort();
        return nomes;
    }

    // A block drawing file: one line, attribute definitions, and whatever `extra` adds.
    QString arquivoBloco(const QString& nome, const QStringList& tags,
                         const std::function<void(zvdb::Database&)>& extra = {}) {
        zvdb::Database bloco;
        bloco.modelSpace()->addLine({0, 0, 0}, {10, 0, 0});
        double y = 0;
        for (const QString& tag : tags)
            bloco.modelSpace()->addAttributeDefinition(
                tag.toStdString(), "prompt " + tag.toStdString(), "", {0, y -= 2, 0}, 1.0);
        if (extra) extra(bloco);
        const QString caminho = arquivo(nome + ".dxf");
        zvdb::DxfWriter::saveFile(bloco, caminho.toStdString());
        return caminho;
    }

    QTemporaryDir pasta_;
    QString saida_, erros_;
    QTextStream out_{&saida_}, err_{&erros_};
    std::unique_ptr<zvhost::Application> app_;
    zvhost::ConsoleUserInterface* ui_ = nullptr;  // for scripted answers
    zvhost::HostDocument* documento_ = nullptr;
};
