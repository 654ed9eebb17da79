#pragma once
// A host with one open document, a small catalogue of the test's own (keys, list flags,
// descriptions, accessories) and helpers that draw symbols, virtual symbols and pages.
#include "ZvhostRun.h"
#include "app/Application.h"
#include "app/ConsoleUserInterface.h"
#include "app/HostDocument.h"
#include "cad/CICad.h"
#include "catalogue/CEConexaoCatalogo.h"
#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/LayerRecord.h"
#include "drawing/XRecord.h"
#include "settings/CIMensagens.h"
#include "settings/CIRegistro.h"

#include <gtest/gtest.h>

#include <QFile>
#include <QTemporaryDir>
#include <QTextStream>

class ReaderFixture : public ::testing::Test {
protected:
    // Keys: A1 owner (three B3, Z0 with 0 and 2), CA and CB accessories of each other,
    // NL not listed (its accessory B3 still exists), MD listed without a description,
    // SO and SY plain listed keys, BUSX a bus bar.
    static constexpr const char* kDados = R"(
insert into BDZV (ZV_KEY, ZV_KEY_NOR, ZV_LISTA) values
  ('A1','1','S'),('B3','1','S'),('Z0','1','S'),('CA','1','S'),('CB','1','S'),('NL','1','N'),
  ('MD','1','S'),('SO','1','S'),('SY','1','S'),('BUSX','1','S');
insert into BDMENUS (MENU_KEY, MENU_NIVEL, MENU_DESCR, MENU_KEY_LANG) values
  ('A1','1','Owner','1'),('B3','1','Three of them','1'),('Z0','1','Zero and two','1'),
  ('CA','1','Cycle A','1'),('CB','1','Cycle B','1'),('NL','1','Not listed','1'),
  ('SO','1','Symbol own','1'),('SY','1','Symbol accessory','1'),('BUSX','1','Bar','1');
insert into BDVINCL (VL_KEY_A, VL_KEY_B, VL_QTDE, VL_USAR_REP) values
  ('A1','B3',3,'N'),('A1','Z0',0,'N'),('A1','Z0',2,'N'),('CA','CB',1,'N'),('CB','CA',1,'N'),
  ('NL','B3',1,'N');
)";

    void SetUp() override {
        ASSERT_TRUE(pasta_.isValid());
        qputenv("ZV_DATA_DIR", pasta_.path().toUtf8());
        qputenv("TMPDIR", pasta_.path().toUtf8());
        QFile dados(pasta_.filePath("dados.sql"));
        ASSERT_TRUE(dados.open(QIODevice::WriteOnly));
        dados.write(kDados);
        dados.close();
        const QString catalogo = QString(ZV_SOURCE_DIR) + "/data/catalogue/";
        const zvtest::HostRun run =
            zvtest::runZvhost({"catalogue", "--build", pasta_.filePath("catalogo.db"),
                               catalogo + "catalogo-esquema.sql", pasta_.filePath("dados.sql")});
        ASSERT_EQ(run.status, 0) << run.err.toStdString();
        CEConexaoCatalogo::LiberarCatalogo();
        CIRegistro::SetDatabase("SQLITE");
        CIRegistro::SetNetworkZV(pasta_.path() + "/");
        CIRegistro::SetDBName("catalogo.db");
        CIRegistro::SetLibLang("1");
        auto ui = std::make_unique<zvhost::ConsoleUserInterface>(out_, err_, false);
        ui_ = ui.get();
        app_ = std::make_unique<zvhost::Application>(std::move(ui), out_);
        app_->setExecutableFolder(QString(ZV_BIN_DIR));
        documento_ = app_->openDocument(pasta_.filePath("ProjA.dxf"));
    }
    void TearDown() override {
        CEConexaoCatalogo::LiberarCatalogo();
        CIMensagens::Descarregar();
        app_.reset();
    }

    zvdb::Database& db() { return *documento_->database(); }
    OdDbObjectId Id(zvdb::DbObject* objeto) { return OdDbObjectId(&db(), objeto->handle()); }

    // A symbol of `chave` on a page, with attributes (tag, value) and its key's extended data.
    OdDbObjectId Simbolo(const QString& bloco, const QString& chave, const QString& layer,
                         const std::vector<std::pair<QString, QString>>& atributos = {},
                         double x = 0) {
        zvdb::BlockRecord* definicao = db().block(bloco.toStdString());
        if (!definicao) definicao = db().createBlock(bloco.toStdString());
        if (!db().layer(layer.toStdString())) db().createLayer(layer.toStdString());
        zvdb::BlockReference* ref = db().modelSpace()->addBlockReference(
            *definicao, {x, 0, 0}, {1, 1, 1}, 0, layer.toStdString());
        const OdDbObjectId id = Id(ref);
        double y = 0;
        for (const auto& [tag, valor] : atributos)
            ref->addAttribute(tag.toStdString(), valor.toStdString(), {x, y -= 2, 0}, 1.0);
        CICad::SetXData(id, "KVR_ZV", {{1000, chave + QChar(0x0C) + "1"}});
        return id;
    }
    // A virtual symbol of `chave` in ESQ_VIRTUAL_ZV.
    OdDbObjectId Virtual(const QString& nome, const QString& chave) {
        const std::vector<std::string> caminho = {"ESQ_VIRTUAL_ZV", nome.toStdString()};
        zvdb::XRecord* registro = db().xrecordAt(caminho, true);
        const OdDbObjectId id = Id(registro);
        CICad::SetXData(id, "KVR_ZV", {{1000, chave + QChar(0x0C) + "1"}});
        return id;
    }

    QTemporaryDir pasta_;
    QString saida_, erros_;
    QTextStream out_{&saida_}, err_{&erros_};
    zvhost::ConsoleUserInterface* ui_ = nullptr;
    std::unique_ptr<zvhost::Application> app_;
    zvhost::HostDocument* documento_ = nullptr;
};
