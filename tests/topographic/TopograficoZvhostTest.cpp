// The diagram through zvhost as a user runs it, on a generated project with the product's
// template and configuration: the written drawing is audited with ezdxf, every block is
// tied to a symbol that names it back, and runs on the diagram's own output add nothing
// twice.
#include "ProductFolder.h"
#include "QtPrinters.h"
#include "drawing/BlockRecord.h"
#include "drawing/Database.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "drawing/PythonChecker.h"

#include <gtest/gtest.h>

#include <QDir>
#include <QFile>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

#include <map>
#include <set>

namespace {

struct Diagrama {
    bool ok = false;
    std::map<QString, QString> blocoDoSimbolo;    // symbol handle -> block handle
    std::map<QString, QString> paginaDoBloco;     // block handle -> layer
    std::map<QString, QStringList> esq;           // symbol handle -> its representation chain
    std::map<QString, QString> blocoDoAcessorio;  // place "_" symbol handle -> block handle
    std::map<QString, QString> chaveDoAcessorio;  // place "_" symbol handle -> catalogue key
    std::map<QString, QStringList> aceEsq;        // symbol handle -> its accessories' chain
    std::set<QString> handles;
};

class TopograficoZvhost : public ::testing::Test {
protected:
    static void SetUpTestSuite() {
        product_ = new zvtest::ProductFolder;
        const QString erro =
            product_->prepare({"--seed", "5", "--terminals", "80", "--numbers", "project"});
        ASSERT_TRUE(erro.isEmpty()) << erro.toStdString();
    }
    static void TearDownTestSuite() {
        delete product_;
        product_ = nullptr;
    }
    static QString path(const QString& nome) { return product_->path(nome); }
    static zvtest::HostRun Diagrama(const QString& entrada, const QString& saida,
                                    const QStringList& respostas = {}) {
        QStringList args = {"--quiet", "--load", path("produto/config/zvconfig.lsp"), "--answer",
                            "template=" + path("produto/templates/topografico.dtp")};
        for (const QString& r : respostas)
            args << "--answer" << r;
        return product_->zvhost(args << entrada << "-o" << saida << "diagramaTopografico");
    }
    static ::Diagrama Le(const QString& arquivo) {
        ::Diagrama d;
        const QString falta = zvtest::PythonChecker::missing();
        if (!falta.isEmpty()) {
            ADD_FAILURE() << falta.toStdString();
            return d;
        }
        QString saida;
        const int estado = zvtest::PythonChecker::run("topografico_dxf.py", {arquivo}, &saida);
        EXPECT_EQ(estado, 0) << saida.toStdString();
        for (const QJsonValue& v :
             QJsonDocument::fromJson(saida.toUtf8()).object()["inserts"].toArray()) {
            const QJsonObject o = v.toObject();
            const QString handle = o["handle"].toString();
            d.handles.insert(handle);
            const QJsonArray rep = o["rep"].toArray();
            // The diagram's representation; the project's layout ties others of its own.
            if (rep.size() == 2 && rep[0].toString() == "1") {
                const QString simbolo = rep[1].toString();
                EXPECT_EQ(d.blocoDoSimbolo.count(simbolo), 0u)
                    << "two blocks for " << simbolo.toStdString();
                d.blocoDoSimbolo[simbolo] = handle;
                d.paginaDoBloco[handle] = o["layer"].toString();
            }
            // An accessory's block: representation, symbol, place, key.
            const QJsonArray ace = o["ace"].toArray();
            if (ace.size() == 4 && ace[0].toString() == "1") {
                const QString lugar = ace[2].toString() + "_" + ace[1].toString();
                EXPECT_EQ(d.blocoDoAcessorio.count(lugar), 0u)
                    << "two blocks for " << lugar.toStdString();
                d.blocoDoAcessorio[lugar] = handle;
                d.chaveDoAcessorio[lugar] = ace[3].toString();
                d.paginaDoBloco[handle] = o["layer"].toString();
            }
        }
        const QJsonObject cadeiasAce =
            QJsonDocument::fromJson(saida.toUtf8()).object()["ace_esq"].toObject();
        for (auto it = cadeiasAce.begin(); it != cadeiasAce.end(); ++it)
            for (const QJsonValue& e : it.value().toArray())
                d.aceEsq[it.key()] << e.toString();
        const QJsonObject cadeias =
            QJsonDocument::fromJson(saida.toUtf8()).object()["esq"].toObject();
        for (auto it = cadeias.begin(); it != cadeias.end(); ++it)
            for (const QJsonValue& e : it.value().toArray())
                d.esq[it.key()] << e.toString();
        d.ok = estado == 0;
        return d;
    }

    static zvtest::ProductFolder* product_;
};

zvtest::ProductFolder* TopograficoZvhost::product_ = nullptr;

TEST_F(TopograficoZvhost, TheDemoTemplateDrawsEveryListedSymbolOnceTiedBothWays) {
    const QString saida = path("topo.dxf");
    const zvtest::HostRun run = Diagrama(product_->project(), saida);
    ASSERT_EQ(run.status, 0) << run.out.toStdString() << run.err.toStdString();
    EXPECT_TRUE(run.out.contains("Topographic diagram drawn.")) << run.out.toStdString();
    const ::Diagrama d = Le(saida);
    ASSERT_TRUE(d.ok);
    // The generated project has contactors, relays, lamps, buttons and 80 terminals.
    EXPECT_GT(d.blocoDoSimbolo.size(), 80u);
    std::set<QString> paginas;
    for (const auto& [simbolo, bloco] : d.blocoDoSimbolo) {
        ASSERT_TRUE(d.esq.count(simbolo)) << simbolo.toStdString();
        EXPECT_EQ(d.esq.at(simbolo), QStringList({"1", bloco})) << simbolo.toStdString();
        paginas.insert(d.paginaDoBloco.at(bloco));
    }
    // Accessories with a front view: their symbols' chains name exactly their blocks.
    EXPECT_GT(d.blocoDoAcessorio.size(), 10u);
    std::map<QString, std::set<QString>> porSimbolo;
    for (const auto& [lugar, bloco] : d.blocoDoAcessorio) {
        porSimbolo[lugar.section('_', -1)].insert(bloco);
        paginas.insert(d.paginaDoBloco.at(bloco));
    }
    EXPECT_EQ(porSimbolo.size(), d.aceEsq.size());
    for (const auto& [simbolo, blocos] : porSimbolo) {
        const auto achada = d.aceEsq.find(simbolo);
        const QStringList cadeia = achada == d.aceEsq.end() ? QStringList() : achada->second;
        std::set<QString> nomeados;
        for (int i = 0; i + 1 < cadeia.size(); i += 2) {
            EXPECT_EQ(cadeia[i], "1");
            nomeados.insert(cadeia[i + 1]);
        }
        EXPECT_EQ(nomeados, blocos) << simbolo.toStdString();
    }
    // The demo catalogue's end covers of terminals have one; its jumpers don't.
    std::set<QString> chaves;
    for (const auto& [lugar, chave] : d.chaveDoAcessorio)
        chaves.insert(chave);
    EXPECT_EQ(chaves.count("1101"), 1u);
    EXPECT_EQ(chaves.count("1102"), 0u);
    // Ordinary blocks and terminals on pages of their own in the template's group.
    EXPECT_GE(paginas.size(), 2u);
    for (const QString& p : paginas)
        EXPECT_TRUE(p.startsWith("TOPOGRAFICO$")) << p.toStdString();
    // The input drawing is never written.
    EXPECT_TRUE(Le(product_->project()).blocoDoSimbolo.empty());
}

TEST_F(TopograficoZvhost, RunsOnItsOwnOutputKeepOrReplaceButNeverDuplicate) {
    const QString primeira = path("r1.dxf"), mantida = path("r2.dxf"), refeita = path("r3.dxf");
    ASSERT_EQ(Diagrama(product_->project(), primeira).status, 0);
    const ::Diagrama d1 = Le(primeira);
    // Keep the group: nothing new to add, the drawing saved as it was asked.
    zvtest::HostRun run = Diagrama(primeira, mantida, {"question:89=no"});
    ASSERT_EQ(run.status, 0) << run.out.toStdString() << run.err.toStdString();
    EXPECT_TRUE(run.out.contains("Every symbol is on the diagram already"))
        << run.out.toStdString();
    const ::Diagrama d2 = Le(mantida);
    EXPECT_EQ(d2.blocoDoSimbolo, d1.blocoDoSimbolo);
    EXPECT_FALSE(d1.blocoDoAcessorio.empty());
    EXPECT_EQ(d2.blocoDoAcessorio, d1.blocoDoAcessorio);
    // Delete the group: every symbol drawn again, by new blocks, each once.
    run = Diagrama(primeira, refeita, {"question:89=yes"});
    ASSERT_EQ(run.status, 0) << run.out.toStdString() << run.err.toStdString();
    const ::Diagrama d3 = Le(refeita);
    ASSERT_EQ(d3.blocoDoSimbolo.size(), d1.blocoDoSimbolo.size());
    for (const auto& [simbolo, bloco] : d3.blocoDoSimbolo) {
        EXPECT_EQ(d1.handles.count(bloco), 0u) << bloco.toStdString();
        EXPECT_EQ(d3.esq.at(simbolo), QStringList({"1", bloco}));
    }
    ASSERT_EQ(d3.blocoDoAcessorio.size(), d1.blocoDoAcessorio.size());
    for (const auto& [lugar, bloco] : d3.blocoDoAcessorio)
        EXPECT_EQ(d1.handles.count(bloco), 0u) << lugar.toStdString();
    // Nobody answers the question: the run is cancelled and nothing is saved.
    const QString cancelada = path("r4.dxf");
    run = Diagrama(primeira, cancelada);
    EXPECT_EQ(run.status, 4) << run.err.toStdString();
    EXPECT_FALSE(QFile::exists(cancelada));
}

TEST_F(TopograficoZvhost, AMissingTemplateOrFolderWritesNothing) {
    const QString saida = path("nada.dxf");
    // A template that is not there.
    zvtest::HostRun run =
        product_->zvhost({"--quiet", "--load", path("produto/config/zvconfig.lsp"), "--answer",
                          "template=" + path("nao-existe.dtp"), product_->project(), "-o", saida,
                          "diagramaTopografico"});
    EXPECT_EQ(run.status, 3) << run.err.toStdString();
    EXPECT_TRUE(run.out.contains("The template could not be loaded.")) << run.out.toStdString();
    EXPECT_FALSE(QFile::exists(saida));
    // Without the configuration there is no template folder: nothing happens.
    run = product_->zvhost({"--quiet", "--answer",
                            "template=" + path("produto/templates/topografico.dtp"),
                            product_->project(), "-o", saida, "diagramaTopografico"});
    EXPECT_EQ(run.status, 4) << run.err.toStdString();
    EXPECT_FALSE(run.out.contains("Topographic diagram drawn."));
    EXPECT_FALSE(QFile::exists(saida));
}

// The diagram reads no wiring: a block that asks for what is wired at a terminal's side
// gets blanks, and the blocks of every symbol are drawn as they are without it.
TEST(TopograficoLados, ABlockAskingForATerminalsSideGetsABlank) {
    zvtest::ProductFolder produto;
    const QString erro =
        produto.prepare({"--seed", "7", "--terminals", "40", "--numbers", "project"});
    ASSERT_TRUE(erro.isEmpty()) << erro.toStdString();
    // Every front view of the product gets an attribute for the element at the first side.
    const QDir blocos(produto.path("produto/DADOS/1/BLOCOS"));
    int alterados = 0;
    for (const QString& nome : blocos.entryList({"TOPO_*.dxf"}, QDir::Files)) {
        const std::string arquivo = blocos.filePath(nome).toStdString();
        std::unique_ptr<zvdb::Database> bloco = zvdb::DxfLoader::loadFile(arquivo);
        ASSERT_TRUE(bloco) << nome.toStdString();
        bloco->modelSpace()->addAttributeDefinition("REL_INI", "REL_INI", "", {0, -5, 0}, 1.0);
        zvdb::DxfWriter::saveFile(*bloco, arquivo);
        ++alterados;
    }
    ASSERT_GT(alterados, 5);
    const QString saida = produto.path("lados.dxf");
    const zvtest::HostRun run =
        produto.zvhost({"--quiet", "--load", produto.path("produto/config/zvconfig.lsp"),
                        "--answer", "template=" + produto.path("produto/templates/topografico.dtp"),
                        produto.project(), "-o", saida, "diagramaTopografico"});
    ASSERT_EQ(run.status, 0) << run.out.toStdString() << run.err.toStdString();
    const QString falta = zvtest::PythonChecker::missing();
    ASSERT_TRUE(falta.isEmpty()) << falta.toStdString();
    QString texto;
    ASSERT_EQ(zvtest::PythonChecker::run("topografico_dxf.py", {saida}, &texto), 0)
        << texto.toStdString();
    int comAtributo = 0, vazios = 0, comRelacao = 0;
    for (const QJsonValue& v :
         QJsonDocument::fromJson(texto.toUtf8()).object()["inserts"].toArray()) {
        const QJsonObject atributos = v.toObject()["attribs"].toObject();
        if (!atributos.contains("REL_INI")) continue;
        ++comAtributo;
        if (atributos["REL_INI"].toString().isEmpty()) ++vazios;
        if (!atributos["RELACAO"].toString().isEmpty()) ++comRelacao;
    }
    EXPECT_GT(comAtributo, 40);
    EXPECT_EQ(vazios, comAtributo);
    // The symbols' own fields are there all the same.
    EXPECT_GT(comRelacao, 10);
}

}  // namespace
