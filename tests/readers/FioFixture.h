#pragma once
// Small schematics built by the wire reader's tests in an open document, with the demo
// catalogue behind the settings (wire key 10006 is listed, 10099 is unknown): terminals,
// components with connection attributes, equipment, pins, numbered wires, and a panel
// layout with views and routes.
#include "QtPrinters.h"
#include "ZvhostRun.h"
#include "cad/CICad.h"
#include "cad/FacadeFixture.h"
#include "catalogue/CEConexaoCatalogo.h"
#include "drawing/Polyline.h"
#include "lists/TemplateDouble.h"
#include "module/CIProgress.h"
#include "readers/CCFioDataReader.h"
#include "readers/ZVString.h"
#include "sample/XDataItems.h"
#include "sdk/LispInterface.h"

#include <QCoreApplication>
#include <QDir>
#include <QFile>

#include <memory>
#include <unordered_set>

class FioFixture : public FacadeFixture {
protected:
    static constexpr const char* kPagina1 = "ESQ$0001$A";
    static constexpr const char* kPagina2 = "ESQ$0002$A";
    static constexpr const char* kLayout = "LAYOUT$0001$A";

    struct Atributo {
        std::string tag, valor;
        zvdb::Point3 em;
    };

    static void SetUpTestSuite() {
        // Qt loads its database drivers only under an application object.
        static int argc = 1;
        static char nome[] = "readers_tests";
        static char* argv[] = {nome, nullptr};
        if (!QCoreApplication::instance()) new QCoreApplication(argc, argv);
        catalogo_ = new QTemporaryDir;
        QProcessEnvironment env = QProcessEnvironment::systemEnvironment();
        env.insert("ZV_DATA_DIR", catalogo_->path());
        const QString sql = QString(ZV_SOURCE_DIR) + "/data/catalogue/";
        zvtest::HostRun r =
            zvtest::runZvhost({"catalogue", "--build", catalogo_->filePath("c.db"),
                               sql + "catalogo-esquema.sql", sql + "catalogo-dados.sql"},
                              env);
        ASSERT_EQ(r.status, 0) << r.err.toStdString();
        r = zvtest::runZvhost({"catalogue", "--set", "Database=SQLITE",
                               "NetworkZV=" + catalogo_->path() + "/", "DBName=c.db", "libLang=1"},
                              env);
        ASSERT_EQ(r.status, 0) << r.err.toStdString();
    }
    static void TearDownTestSuite() {
        delete catalogo_;
        catalogo_ = nullptr;
    }

    void SetUp() override {
        // The settings that name the suite's catalogue, before the host reads them.
        QDir().mkpath(pasta_.filePath("FV"));
        ASSERT_TRUE(QFile::copy(catalogo_->filePath("FV/FVREG2022SP0.xml"),
                                pasta_.filePath("FV/FVREG2022SP0.xml")));
        FacadeFixture::SetUp();
        CEConexaoCatalogo::LiberarCatalogo();
        // Pages of the project's registry, as the page picker knows them.
        for (const char* grupo : {"ESQ", "ESQ", "LAYOUT"})
            ASSERT_TRUE(lisp("(criarpagina \"" + QString(grupo) + "\" 0)"));
        ASSERT_TRUE(CICad::ExisteLayer(kPagina2));
        ASSERT_TRUE(CICad::ExisteLayer(kLayout));
        modelo_.simbolos["*CHAR_SEP_STD_CFG*"] = ":";
        modelo_.simbolos["*CHAR_SEP_LIG_CFG*"] = "/";
        modelo_.simbolos["*ORDEM_CONCAT_STD*"] = "1";
    }
    void TearDown() override {
        itens_.destruirItens();
        CEConexaoCatalogo::LiberarCatalogo();
    }

    bool lisp(const QString& texto) { return documento_->lisp()->lispEvaluate(texto); }
    OdDbObjectId id(const zvdb::DbObject* objeto) { return OdDbObjectId(&db(), objeto->handle()); }
    static QString handle(const zvdb::DbObject* objeto) {
        return ZVString::DeHandle(objeto->handle());
    }

    zvdb::BlockRecord& bloco(const std::string& nome) {
        if (zvdb::BlockRecord* achado = db().block(nome)) return *achado;
        zvdb::BlockRecord* feito = db().createBlock(nome);
        feito->addLine({0, 0, 0}, {0, -10, 0});
        return *feito;
    }

    // A symbol with its key and attributes (text positions as given).
    zvdb::BlockReference* simbolo(const std::string& nome, zvdb::Point3 em,
                                  const std::vector<Atributo>& atributos,
                                  const std::string& chave = "7001",
                                  const std::string& layer = kPagina1) {
        auto* ref = db().modelSpace()->addBlockReference(bloco(nome), em, {1, 1, 1}, 0, layer);
        for (const Atributo& a : atributos)
            ref->addAttribute(a.tag, a.valor, a.em, 1.0);
        ref->setXData("KVR_ZV", zvsample::XDataItems().text(chave + "\f1").tags());
        return ref;
    }
    // A terminal: touched at its insertion point and at its cut point 10 below.
    zvdb::BlockReference* borne(const std::string& regua, const std::string& numero,
                                zvdb::Point3 em, const std::string& layer = kPagina1,
                                const char* tagRegua = "REGUA", const char* tagNumero = "NUMERO") {
        zvdb::BlockReference* ref = simbolo("BORNE_1", em,
                                            {{tagRegua, regua, {em.x + 4, em.y - 3, 0}},
                                             {tagNumero, numero, {em.x + 4, em.y - 6, 0}}},
                                            "1001", layer);
        ref->setXData("KVR_ZV_PTS_CORTE",
                      zvsample::XDataItems().point(em).point({em.x, em.y - 10, em.z}).tags());
        return ref;
    }
    // A component touched at its connection attributes, placed 30 to the right of its
    // insertion point.
    zvdb::BlockReference* componente(
        const std::string& relacao, const std::vector<std::pair<std::string, zvdb::Point3>>& pontos,
        const std::string& nome = "BOBINA", const std::string& layer = kPagina1) {
        const zvdb::Point3 em = pontos.empty() ? zvdb::Point3{} : pontos[0].second;
        std::vector<Atributo> atributos{{"RELACAO", relacao, {em.x + 30, em.y + 20, 0}}};
        int n = 0;
        for (const auto& [valor, ponto] : pontos)
            atributos.push_back({"LIGACAO" + std::to_string(++n), valor, ponto});
        return simbolo(nome, {em.x + 30, em.y, 0}, atributos, "7001", layer);
    }
    // A numbered wire: key, numbering rule, number under `campo`.
    zvdb::Polyline* fio(const std::vector<zvdb::Point3>& pontos, const std::string& numero,
                        const std::string& layer = kPagina1, const std::string& chave = "10006",
                        const std::string& campo = "FIO") {
        zvdb::Polyline* linha = db().modelSpace()->addLwPolyline(pontos, false, layer);
        linha->setXData("KVR_ZV_WIRE", zvsample::XDataItems()
                                           .text(chave + "\f1")
                                           .text("1")
                                           .text(campo + "\f" + numero)
                                           .tags());
        return linha;
    }

    // Reads the wires into the fixture's vector (it destroys them).
    const VetorItens& le(CCFioDataReader& leitor,
                         const std::optional<QStringList>& paginas = std::nullopt) {
        std::unique_ptr<VetorItens> lidos(leitor.LeFios(paginas, &modelo_, nullptr));
        itens_.juntarSemRepetir(*lidos);
        return itens_;
    }
    // The chains of the items, head first, each stretch as "start>end" of the fields.
    QStringList cadeias(const QString& campo = "RELACAO") const {
        std::unordered_set<const CEItemLista*> seguintes;
        for (const CEItemLista* item : itens_)
            if (item->ligado) seguintes.insert(item->ligado);
        QStringList texto;
        for (const CEItemLista* item : itens_) {
            if (seguintes.count(item)) continue;
            QStringList trechos;
            for (const CEItemLista* p = item; p; p = p->ligado)
                trechos << p->valorCampo(campo + "_INI") + ">" + p->valorCampo(campo + "_FIM");
            texto << trechos.join(" ");
        }
        texto.sort();
        return texto;
    }

    static QTemporaryDir* catalogo_;
    TemplateDouble modelo_;
    VetorItens itens_;
};

inline QTemporaryDir* FioFixture::catalogo_ = nullptr;
