// The wire list from end to end through zvhost, on generated projects with the demo
// catalogue and product data (the demo's own among them), read back from the saved drawing
// and checked against the wires of the drawing itself.
#include "ProductFolder.h"
#include "QtPrinters.h"
#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/DxfLoader.h"
#include "drawing/Polyline.h"
#include "drawing/PythonChecker.h"
#include "readers/ZVString.h"

#include <gtest/gtest.h>

#include <QCryptographicHash>
#include <QDir>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

namespace {

using Resultado = zvtest::HostRun;

// A saved wire list: its rows (page, cells, the wire each row links to) and pages.
struct Lista {
    struct Linha {
        QString pagina;
        QStringList celulas;  // wire, from, to, key, description, mm, route
        QString fioLigado;    // the number of the polyline the row links back to
        QString layerLigado;  // and its page
    };
    std::vector<Linha> linhas;
    QStringList paginas;       // in drawing order, each once
    QStringList cabecalhoQtd;  // QTD of each page's header
    QString total, paginaTotal;
};

std::string Texto(std::string_view v) {
    return std::string(v);
}

Lista LeLista(const QString& arquivo) {
    Lista lista;
    const auto db = zvdb::DxfLoader::loadFile(arquivo.toStdString());
    if (!db) return lista;
    for (zvdb::Entity* e : db->modelSpace()->entities()) {
        auto* ref = dynamic_cast<zvdb::BlockReference*>(e);
        if (!ref || !ref->blockName().starts_with("BLK_CTR_LST_")) continue;
        const QString nome = QString::fromStdString(Texto(ref->blockName()));
        const QString layer = QString::fromStdString(Texto(ref->layer()));
        if (!lista.paginas.contains(layer)) lista.paginas << layer;
        QStringList celulas;
        for (zvdb::Attribute* a : ref->attributes())
            celulas << QString::fromStdString(Texto(a->textValue()));
        if (nome.startsWith("BLK_CTR_LST_CABEC_CABLA")) {
            lista.cabecalhoQtd << celulas.value(2);
        } else if (nome.startsWith("BLK_CTR_LST_TOTAL_CABLA")) {
            lista.total = celulas.value(0);
            lista.paginaTotal = layer;
        } else if (nome.startsWith("BLK_CTR_LST_DET_CABLA")) {
            Lista::Linha linha{layer, celulas, {}, {}};
            const auto link = ref->xdata("KVR_ZV_LINK");
            if (!link.empty()) {
                const QString handle = QString::fromStdString(Texto(link[0].value));
                auto* fio = dynamic_cast<zvdb::Polyline*>(
                    db->entityByHandle(handle.toULongLong(nullptr, 16)));
                if (fio) {
                    linha.layerLigado = QString::fromStdString(Texto(fio->layer()));
                    for (const auto& tag : fio->xdata("KVR_ZV_WIRE")) {
                        const QString v = QString::fromStdString(Texto(tag.value));
                        if (v.startsWith("FIO\f")) linha.fioLigado = v.mid(4);
                    }
                }
            }
            lista.linhas.push_back(linha);
        }
    }
    return lista;
}

QByteArray Digest(const QString& arquivo) {
    QFile f(arquivo);
    return f.open(QIODevice::ReadOnly)
               ? QCryptographicHash::hash(f.readAll(), QCryptographicHash::Sha256)
               : QByteArray();
}

class WireListTest : public ::testing::Test {
protected:
    static void SetUpTestSuite() {
        pasta_ = new zvtest::ProductFolder;
        const QString problema = pasta_->prepare();
        ASSERT_TRUE(problema.isEmpty()) << problema.toStdString();
    }
    static void TearDownTestSuite() { delete pasta_; }

    static Resultado lista(const QString& entrada, const QString& saida, QStringList extra = {},
                           zvtest::ProductFolder* pasta = nullptr) {
        pasta = pasta ? pasta : pasta_;
        QStringList args = {"--quiet", "--load", pasta->path("produto/config/zvconfig.lsp")};
        args << extra << entrada;
        if (!saida.isEmpty()) args << "-o" << saida;
        args << "gerarListaFiosGrf";
        return pasta->zvhost(args);
    }
    // A template of the suite's product folder: the demo's wire template and `texto`.
    static QStringList modelo(const QString& nome, const QByteArray& texto) {
        QFile arquivo(pasta_->path("produto/templates/" + nome));
        EXPECT_TRUE(arquivo.open(QIODevice::WriteOnly));
        arquivo.write("(load (strcat *DIR_ZVCFG_TEMPL* \"fios.grw\"))\n" + texto + "\n");
        return {"--eval", "(setq *DEF_LISTA_FIOS* \"" + nome + "\")"};
    }
    // Every row of a list and its pages checked against the drawing's own wires.
    // The total sums the lengths before each row rounds its own: `tolerancia` is the
    // rounding of one row.
    static void ConfereLista(const Lista& l, double tolerancia) {
        ASSERT_FALSE(l.linhas.empty());
        // Pages of the list's group, numbered on; the last holds the total alone.
        for (int i = 0; i < l.paginas.size(); ++i)
            EXPECT_EQ(l.paginas[i], QString("LISTAS$%1$A").arg(i + 1, 4, 10, QChar('0')));
        EXPECT_EQ(l.paginaTotal, l.paginas.last());
        for (const QString& qtd : l.cabecalhoQtd.mid(0, l.cabecalhoQtd.size() - 1))
            EXPECT_EQ(qtd, QString::number(l.linhas.size()));
        double soma = 0;
        int roteadas = 0;
        QString anterior;
        for (const Lista::Linha& linha : l.linhas) {
            ASSERT_EQ(linha.celulas.size(), 7) << linha.celulas.join('|').toStdString();
            // Each row is a stretch of the wire it links back to; rows go by wire number.
            EXPECT_EQ(linha.celulas[0], linha.fioLigado) << linha.celulas.join('|').toStdString();
            EXPECT_NE(linha.pagina, l.paginaTotal);
            EXPECT_LE(ZVString::FormaNatural(anterior), ZVString::FormaNatural(linha.celulas[0]));
            anterior = linha.celulas[0];
            soma += linha.celulas[5].toDouble();
            if (!linha.celulas[6].isEmpty()) ++roteadas;
        }
        EXPECT_GT(roteadas, 0);
        EXPECT_NEAR(l.total.toDouble(), soma, tolerancia * double(l.linhas.size()));
        // At most a page's rows on a page.
        QHash<QString, int> porPagina;
        for (const Lista::Linha& linha : l.linhas)
            ++porPagina[linha.pagina];
        for (int n : porPagina)
            EXPECT_LE(n, 48);
    }

    static zvtest::ProductFolder* pasta_;
};

zvtest::ProductFolder* WireListTest::pasta_ = nullptr;

TEST_F(WireListTest, EveryListedWireStretchGetsARowOnPagesOfTheTemplateGroup) {
    const Resultado r = lista(pasta_->project(), pasta_->path("w1.dxf"),
                              {"--eval", "(setq PBLINTFIODGTSAFTERDOT 4)"});
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    EXPECT_TRUE(r.out.contains("List created.")) << r.out.toStdString();
    const Lista l = LeLista(pasta_->path("w1.dxf"));
    ConfereLista(l, 0.0001);
    // Lengths print with the digits asked for.
    for (const Lista::Linha& linha : l.linhas)
        EXPECT_EQ(linha.celulas[5].section('.', 1).size(), 4) << linha.celulas[5].toStdString();
    // Every numbered wire with a listed key has rows; the demo's unknown key has none.
    const auto db = zvdb::DxfLoader::loadFile(pasta_->project().toStdString());
    QSet<QString> listados, desconhecidos, nasLinhas;
    for (zvdb::Entity* e : db->modelSpace()->entities()) {
        auto* fio = dynamic_cast<zvdb::Polyline*>(e);
        if (!fio) continue;
        const auto dados = fio->xdata("KVR_ZV_WIRE");
        if (dados.size() < 3) continue;
        const QString chave = QString::fromStdString(Texto(dados[0].value)).section('\f', 0, 0);
        for (const auto& tag : dados) {
            const QString v = QString::fromStdString(Texto(tag.value));
            if (v.startsWith("FIO\f")) (chave == "10099" ? desconhecidos : listados) << v.mid(4);
        }
    }
    for (const Lista::Linha& linha : l.linhas)
        nasLinhas << linha.celulas[0];
    EXPECT_EQ(nasLinhas, listados);
    ASSERT_FALSE(desconhecidos.isEmpty());
    for (const QString& numero : desconhecidos)
        EXPECT_FALSE(nasLinhas.contains(numero)) << numero.toStdString();
}

TEST_F(WireListTest, ATemplateWithoutTheWireListsVariablesIsRefusedWithMessage88) {
    const QByteArray antes = Digest(pasta_->project());
    const Resultado r = lista(pasta_->project(), pasta_->path("w2.dxf"),
                              {"--eval", "(setq *DEF_LISTA_FIOS* \"bornes.grt\")"});
    EXPECT_EQ(r.status, 3) << r.err.toStdString();
    EXPECT_TRUE(r.out.contains("The template could not be loaded.")) << r.out.toStdString();
    EXPECT_FALSE(r.out.contains("List created."));
    EXPECT_FALSE(QFile::exists(pasta_->path("w2.dxf")));
    EXPECT_EQ(Digest(pasta_->project()), antes);
}

TEST_F(WireListTest, TheDrawingIsWrittenOnlyWhenAsked) {
    QFile::copy(pasta_->project(), pasta_->path("copia.dxf"));
    const QByteArray antes = Digest(pasta_->path("copia.dxf"));
    const QStringList arquivos = QDir(pasta_->path(".")).entryList(QDir::Files);
    const Resultado r = lista(pasta_->path("copia.dxf"), QString());
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    EXPECT_TRUE(r.out.contains("List created."));
    EXPECT_EQ(Digest(pasta_->path("copia.dxf")), antes);
    EXPECT_EQ(QDir(pasta_->path(".")).entryList(QDir::Files), arquivos);
    // --in-place writes the list into the drawing itself.
    const Resultado escrito =
        pasta_->zvhost({"--quiet", "--load", pasta_->path("produto/config/zvconfig.lsp"),
                        pasta_->path("copia.dxf"), "--in-place", "gerarListaFiosGrf"});
    ASSERT_EQ(escrito.status, 0) << escrito.err.toStdString();
    EXPECT_FALSE(LeLista(pasta_->path("copia.dxf")).linhas.empty());
}

TEST_F(WireListTest, ThePagePickerKeepsTheWiresOfThePagesAnswered) {
    const QStringList pergunta = modelo("escolhe.grw", "(setq *SELECAO_PAG_FIOS* T)");
    const Resultado todas = lista(pasta_->project(), pasta_->path("w3.dxf"));
    ASSERT_EQ(todas.status, 0) << todas.err.toStdString();
    const Lista completa = LeLista(pasta_->path("w3.dxf"));
    const QString pagina = "COMANDO$0002$A";
    Resultado r = lista(pasta_->project(), pasta_->path("w4.dxf"),
                        pergunta + QStringList{"--answer", "pages=" + pagina});
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    const Lista escolhida = LeLista(pasta_->path("w4.dxf"));
    ASSERT_FALSE(escolhida.linhas.empty());
    EXPECT_LT(escolhida.linhas.size(), completa.linhas.size());
    // Each row links to its wire's polyline on the page answered; the whole wire is listed.
    QHash<QString, int> trechos, trechosCompleta;
    for (const Lista::Linha& linha : escolhida.linhas) {
        EXPECT_EQ(linha.layerLigado, pagina) << linha.celulas.join('|').toStdString();
        ++trechos[linha.celulas[0]];
    }
    for (const Lista::Linha& linha : completa.linhas)
        if (trechos.contains(linha.celulas[0])) ++trechosCompleta[linha.celulas[0]];
    EXPECT_EQ(trechos, trechosCompleta);
    // Nobody answers: the command is cancelled and nothing is saved.
    r = lista(pasta_->project(), pasta_->path("w5.dxf"), pergunta);
    EXPECT_EQ(r.status, 4) << r.err.toStdString();
    EXPECT_FALSE(QFile::exists(pasta_->path("w5.dxf")));
}

TEST_F(WireListTest, TheDemosWireListPassesTheAuditOfAnotherReader) {
    const QString faltando = zvtest::PythonChecker::missing();
    if (!faltando.isEmpty()) GTEST_SKIP() << faltando.toStdString();
    // The demo project, as ./zv demo makes it.
    zvtest::ProductFolder demo;
    const QString problema = demo.prepare(
        {"--seed", "1", "--terminals", "120", "--pages", "10", "--numbers", "project"});
    ASSERT_TRUE(problema.isEmpty()) << problema.toStdString();
    const Resultado r = lista(demo.project(), demo.path("wire-list.dxf"), {}, &demo);
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    const Lista l = LeLista(demo.path("wire-list.dxf"));
    ConfereLista(l, 0.5);
    QString saida;
    ASSERT_EQ(zvtest::PythonChecker::run("../drawing/inspect_dxf.py", {demo.path("wire-list.dxf")},
                                         &saida),
              0)
        << saida.toStdString();
    // ezdxf sees the same rows, on the same pages, as the drawing reader.
    const QJsonObject visto = QJsonDocument::fromJson(saida.toUtf8()).object();
    QStringList linhasEzdxf, linhasLidas;
    for (const QJsonValue& e : visto.value("modelspace").toArray()) {
        const QJsonObject o = e.toObject();
        if (!o.value("name").toString().startsWith("BLK_CTR_LST_DET_CABLA")) continue;
        QStringList campos;
        for (const QJsonValue& a : o.value("attribs").toArray())
            campos << a.toArray().at(1).toString();
        linhasEzdxf << o.value("layer").toString() + " " + campos.join('|');
    }
    for (const Lista::Linha& linha : l.linhas)
        linhasLidas << linha.pagina + " " + linha.celulas.join('|');
    EXPECT_EQ(linhasEzdxf, linhasLidas);
    for (const QString& pagina : l.paginas)
        EXPECT_TRUE(visto.value("layers").toObject().contains(pagina)) << pagina.toStdString();
}

}  // namespace
