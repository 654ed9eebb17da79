// The cable list from end to end through zvhost on the demo's generated project: a row for
// every core with both its ends, a first-row block that opens each cable on each page, the
// break by blank rows or by pages as the template says, and the drawing left alone.
#include "ProductFolder.h"
#include "QtPrinters.h"
#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/DxfLoader.h"
#include "drawing/Polyline.h"

#include <gtest/gtest.h>

#include <QCryptographicHash>
#include <QFile>
#include <QSet>

namespace {

// A saved cable list: rows in drawing order with their page, and whether each is a first row.
struct Linha {
    QString pagina;
    bool primeira = false;
    QStringList celulas;  // [cable, key, description,] core, from, to, page of the lead
    QString cabo;         // the cable a first row names; carried on to the rows after it
    double y = 0;
};

struct Lista {
    std::vector<Linha> linhas;
    QStringList paginas;
    bool total = false;
};

Lista LeLista(const QString& arquivo) {
    Lista lista;
    const auto db = zvdb::DxfLoader::loadFile(arquivo.toStdString());
    if (!db) return lista;
    QString cabo;
    for (zvdb::Entity* e : db->modelSpace()->entities()) {
        auto* ref = dynamic_cast<zvdb::BlockReference*>(e);
        if (!ref || !ref->blockName().starts_with("BLK_CTR_LST_")) continue;
        const QString nome = QString::fromStdString(std::string(ref->blockName()));
        const QString layer = QString::fromStdString(std::string(ref->layer()));
        if (!lista.paginas.contains(layer)) lista.paginas << layer;
        if (nome.startsWith("BLK_CTR_LST_TOTAL")) lista.total = true;
        const bool primeira = nome.startsWith("BLK_CTR_LST_DET_PRIM");
        if (!primeira && !nome.startsWith("BLK_CTR_LST_DET_CABLA")) continue;
        Linha linha{layer, primeira, {}, {}, ref->position().y};
        for (zvdb::Attribute* a : ref->attributes())
            linha.celulas << QString::fromStdString(std::string(a->textValue()));
        if (primeira) cabo = linha.celulas.value(0);
        linha.cabo = cabo;
        lista.linhas.push_back(linha);
    }
    return lista;
}

QByteArray Digest(const QString& arquivo) {
    QFile f(arquivo);
    return f.open(QIODevice::ReadOnly)
               ? QCryptographicHash::hash(f.readAll(), QCryptographicHash::Sha256)
               : QByteArray();
}

class CableListTest : public ::testing::Test {
protected:
    static void SetUpTestSuite() {
        pasta_ = new zvtest::ProductFolder;
        const QString problema = pasta_->prepare({"--seed", "1", "--terminals", "120"});
        ASSERT_TRUE(problema.isEmpty()) << problema.toStdString();
        // The drawn cores: one lead each, the blind connections stand for leads.
        const auto db = zvdb::DxfLoader::loadFile(pasta_->project().toStdString());
        for (zvdb::Entity* e : db->modelSpace()->entities())
            if (dynamic_cast<zvdb::Polyline*>(e) && !e->xdata("KVR_ZV_CABO").empty()) ++leads_;
    }
    static void TearDownTestSuite() { delete pasta_; }

    // The cable list of the suite's project, with `extra` LISP after the template.
    static zvtest::HostRun lista(const QString& saida, const QByteArray& extra = {}) {
        QStringList args = {"--quiet", "--load", pasta_->path("produto/config/zvconfig.lsp")};
        if (!extra.isEmpty()) {
            QFile modelo(pasta_->path("produto/templates/cabos-teste.grc"));
            EXPECT_TRUE(modelo.open(QIODevice::WriteOnly));
            modelo.write("(load (strcat *DIR_ZVCFG_TEMPL* \"cabos.grc\"))\n" + extra + "\n");
            args << "--eval"
                 << "(setq *DEF_LISTA_CABOS* \"cabos-teste.grc\")";
        }
        args << pasta_->project();
        if (!saida.isEmpty()) args << "-o" << saida;
        return pasta_->zvhost(args << "gerarListaCabosGrf");
    }

    static zvtest::ProductFolder* pasta_;
    static int leads_;
};

zvtest::ProductFolder* CableListTest::pasta_ = nullptr;
int CableListTest::leads_ = 0;

TEST_F(CableListTest, EveryCoreIsOneRowWithBothEndsAndEachCableOpensWithItsFirstRow) {
    const zvtest::HostRun r = lista(pasta_->path("c1.dxf"));
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    EXPECT_TRUE(r.out.contains("List created."));
    const Lista l = LeLista(pasta_->path("c1.dxf"));
    ASSERT_GT(leads_, 20);
    EXPECT_EQ(int(l.linhas.size()), leads_);
    EXPECT_TRUE(l.total);
    QSet<QString> cores, cabos;
    QString paginaAnterior, caboAnterior;
    for (const Linha& linha : l.linhas) {
        const QStringList nucleo = linha.celulas.mid(linha.primeira ? 3 : 0);
        ASSERT_EQ(nucleo.size(), 4) << linha.celulas.join('|').toStdString();
        // Both ends: a terminal "X1:5" or a pin "-XS1:2", never blank.
        EXPECT_TRUE(nucleo[1].contains(':') && !nucleo[1].startsWith(':'))
            << linha.celulas.join('|').toStdString();
        EXPECT_TRUE(nucleo[2].contains(':') && !nucleo[2].startsWith(':'))
            << linha.celulas.join('|').toStdString();
        EXPECT_TRUE(nucleo[3].startsWith("COMANDO$") || nucleo[3].startsWith("FORCA$"));
        const QString core = linha.cabo + "/" + nucleo[0];
        EXPECT_FALSE(cores.contains(core)) << core.toStdString();
        cores.insert(core);
        cabos.insert(linha.cabo);
        // A first row where a cable starts or a page does, nowhere else.
        const bool abre = linha.pagina != paginaAnterior || linha.cabo != caboAnterior;
        if (linha.pagina == paginaAnterior && linha.cabo != caboAnterior) {
            EXPECT_TRUE(linha.primeira) << core.toStdString();
        }
        if (!abre) {
            EXPECT_FALSE(linha.primeira) << core.toStdString();
        }
        paginaAnterior = linha.pagina, caboAnterior = linha.cabo;
    }
    EXPECT_GE(cabos.size(), 10);
}

TEST_F(CableListTest, AChangeOfCableBreaksByBlankRowsOrByAPageAsTheTemplateSays) {
    ASSERT_EQ(lista(pasta_->path("c2.dxf")).status, 0);
    const Lista linhas = LeLista(pasta_->path("c2.dxf"));
    ASSERT_GT(linhas.linhas.size(), 2u);
    // "L": two blank rows of 5 between the last core of a cable and the next cable.
    for (size_t i = 1; i < linhas.linhas.size(); ++i) {
        const Linha& a = linhas.linhas[i - 1];
        const Linha& b = linhas.linhas[i];
        if (a.pagina != b.pagina || b.y > a.y) continue;
        EXPECT_NEAR(a.y - b.y, b.cabo == a.cabo ? 5.0 : 15.0, 1e-6) << b.cabo.toStdString();
    }

    ASSERT_EQ(lista(pasta_->path("c3.dxf"), "(setq *QUEBRA_POR_CFG* \"P\")").status, 0);
    const Lista paginas = LeLista(pasta_->path("c3.dxf"));
    QSet<QString> cabos;
    for (const Linha& linha : paginas.linhas) {
        cabos.insert(linha.cabo);
        // Each cable on pages of its own: its page holds no row of another cable.
        for (const Linha& outra : paginas.linhas) {
            if (outra.pagina == linha.pagina) {
                EXPECT_EQ(outra.cabo, linha.cabo);
            }
        }
    }
    EXPECT_GE(paginas.paginas.size(), cabos.size() + 1);  // and the total page
}

TEST_F(CableListTest, WithoutAFirstRowBlockEveryRowIsPlainAndTheDrawingIsWrittenOnlyWhenAsked) {
    const QByteArray antes = Digest(pasta_->project());
    const zvtest::HostRun r = lista(QString(), "(setq LISTA_DETALHE_PRIM \"\")");
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    EXPECT_EQ(Digest(pasta_->project()), antes);

    ASSERT_EQ(lista(pasta_->path("c4.dxf"), "(setq LISTA_DETALHE_PRIM \"\")").status, 0);
    const Lista l = LeLista(pasta_->path("c4.dxf"));
    EXPECT_EQ(int(l.linhas.size()), leads_);
    for (const Linha& linha : l.linhas)
        EXPECT_FALSE(linha.primeira);
}

}  // namespace
