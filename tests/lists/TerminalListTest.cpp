// The terminal list from end to end through zvhost, on a generated project with the demo
// catalogue and product data, read back from the saved drawing.
#include "ProductFolder.h"
#include "QtPrinters.h"
#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "drawing/PythonChecker.h"
#include "lists/CETemplateLisp.h"

#include <gtest/gtest.h>

#include <QDir>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QProcess>
#include <QSet>
#include <QTemporaryDir>

namespace {

using Resultado = zvtest::HostRun;

class TerminalListTest : public ::testing::Test {
protected:
    static void SetUpTestSuite() {
        pasta_ = new zvtest::ProductFolder;
        const QString problema = pasta_->prepare();
        ASSERT_TRUE(problema.isEmpty()) << problema.toStdString();
    }
    static void TearDownTestSuite() { delete pasta_; }

    static Resultado zvhost(const QStringList& args) { return pasta_->zvhost(args); }
    static Resultado lista(const QString& entrada, const QString& saida, QStringList extra = {}) {
        QStringList args = {"--quiet", "--load", pasta_->path("produto/config/zvconfig.lsp")};
        args << extra << entrada << "-o" << saida << "gerarListaBornesGrf";
        return zvhost(args);
    }
    // The detail rows of the terminal list: page layer and the printed fields in order.
    static QStringList linhas(const QString& arquivo, QStringList* paginas = nullptr) {
        const auto db = zvdb::DxfLoader::loadFile(arquivo.toStdString());
        QStringList texto;
        QSet<QString> vistas;
        for (zvdb::Entity* e : db->modelSpace()->entities()) {
            auto* ref = dynamic_cast<zvdb::BlockReference*>(e);
            if (!ref || !ref->blockName().starts_with("BLK_CTR_LST_DET_BORN")) continue;
            const QString layer = QString::fromStdString(std::string(ref->layer()));
            if (paginas && !vistas.contains(layer)) *paginas << layer;
            vistas.insert(layer);
            QStringList campos;
            for (zvdb::Attribute* a : ref->attributes())
                campos << QString::fromStdString(std::string(a->textValue()));
            texto << layer + " " + campos.join("|");
        }
        return texto;
    }

    // A template of the suite's product folder: `texto` after loading the demo's terminal
    // template; the list commands then use it.
    static QStringList modelo(const QString& nome, const QByteArray& texto) {
        QFile arquivo(pasta_->path("produto/templates/" + nome));
        EXPECT_TRUE(arquivo.open(QIODevice::WriteOnly));
        arquivo.write("(load (strcat *DIR_ZVCFG_TEMPL* \"bornes.grt\"))\n" + texto + "\n");
        return {"--eval", "(setq *DEF_LISTA_BORNES* \"" + nome + "\")"};
    }

    // The detail rows of a single-column list with the strip of the terminal each one links
    // back to; a blank row takes the strip of the row before it.
    struct Linha {
        QString texto, regua;
    };
    static std::vector<Linha> linhasComRegua(const QString& arquivo) {
        const auto db = zvdb::DxfLoader::loadFile(arquivo.toStdString());
        std::vector<Linha> linhas;
        for (zvdb::Entity* e : db->modelSpace()->entities()) {
            auto* ref = dynamic_cast<zvdb::BlockReference*>(e);
            if (!ref || !ref->blockName().starts_with("BLK_CTR_LST_DET_BORN")) continue;
            QStringList campos;
            for (zvdb::Attribute* a : ref->attributes())
                campos << QString::fromStdString(std::string(a->textValue()));
            Linha linha{campos.join("|"), linhas.empty() ? QString() : linhas.back().regua};
            const auto link = ref->xdata("KVR_ZV_LINK");
            if (!link.empty()) {
                const auto handle = QString::fromStdString(std::string(link[0].value));
                auto* borne = dynamic_cast<zvdb::BlockReference*>(
                    db->entityByHandle(handle.toULongLong(nullptr, 16)));
                EXPECT_TRUE(borne) << handle.toStdString();
                linha.regua.clear();
                for (const char* tag : {"REGUA", "STRIP", "REGLETA"})
                    if (zvdb::Attribute* a = borne ? borne->attribute(tag) : nullptr)
                        linha.regua = QString::fromStdString(std::string(a->textValue()));
            }
            linhas.push_back(linha);
        }
        return linhas;
    }

    static zvtest::ProductFolder* pasta_;
};

zvtest::ProductFolder* TerminalListTest::pasta_ = nullptr;

TEST_F(TerminalListTest, EveryListedTerminalGetsARowOnPagesOfTheTemplateGroup) {
    const Resultado r = lista(pasta_->path("p.dxf"), pasta_->path("l1.dxf"));
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    EXPECT_TRUE(r.out.contains("List created.")) << r.out.toStdString();
    QStringList paginas;
    const QStringList rows = linhas(pasta_->path("l1.dxf"), &paginas);
    ASSERT_FALSE(rows.isEmpty());
    EXPECT_GE(rows.size(), 60);
    for (int i = 0; i < paginas.size(); ++i)
        EXPECT_EQ(paginas[i], QString("LISTAS$%1$A").arg(i + 1, 4, 10, QChar('0')));
    // Rows print the wires on the sides of the terminals they read.
    const int comFio = int(std::count_if(rows.begin(), rows.end(), [](const QString& linha) {
        const QStringList campos = linha.split('|');
        return !campos.value(2).isEmpty() || !campos.value(3).isEmpty();
    }));
    EXPECT_GT(comFio, rows.size() / 2);
}

TEST_F(TerminalListTest, ARunAgainAppendsOnNoAndReplacesOnYes) {
    ASSERT_EQ(lista(pasta_->path("p.dxf"), pasta_->path("l1.dxf")).status, 0);
    QStringList uma, nao, sim;
    const int linhasUma = int(linhas(pasta_->path("l1.dxf"), &uma).size());
    Resultado r =
        lista(pasta_->path("l1.dxf"), pasta_->path("l2.dxf"), {"--answer", "question:89=no"});
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    EXPECT_EQ(int(linhas(pasta_->path("l2.dxf"), &nao).size()), 2 * linhasUma);
    EXPECT_EQ(nao.size(), 2 * uma.size());
    r = lista(pasta_->path("l1.dxf"), pasta_->path("l3.dxf"), {"--answer", "question:89=yes"});
    ASSERT_EQ(r.status, 0);
    EXPECT_EQ(int(linhas(pasta_->path("l3.dxf"), &sim).size()), linhasUma);
}

TEST_F(TerminalListTest, AMissingBlockFileStopsWithMessage150) {
    const Resultado r = lista(pasta_->path("p.dxf"), pasta_->path("l4.dxf"),
                              {"--eval", "(setq *DIRETORIO_REDE* \"/nao/existe/\")"});
    // The writer stops: the command failed, and the drawing is not saved.
    EXPECT_EQ(r.status, 3);
    EXPECT_TRUE(r.err.contains("/nao/existe/")) << r.err.toStdString();
    EXPECT_FALSE(r.out.contains("List created."));
    EXPECT_FALSE(QFile::exists(pasta_->path("l4.dxf")));
}

TEST_F(TerminalListTest, StripPickerAnsweredKeepsItsStripsAndCancelledListsNothing) {
    // A template that asks for the strips, on top of the demo's terminal template.
    QFile modelo(pasta_->path("produto/templates/escolhe.grt"));
    ASSERT_TRUE(modelo.open(QIODevice::WriteOnly));
    modelo.write(
        "(load (strcat *DIR_ZVCFG_TEMPL* \"bornes.grt\"))\n"
        "(setq *SEL_REGUA_BORNE_CFG* T *FILTRO_TEMPLATE* \"\")\n");
    modelo.close();
    const QStringList escolhe = {"--eval", "(setq *DEF_LISTA_BORNES* \"escolhe.grt\")"};
    // Nobody picks: the command is cancelled and nothing is saved.
    Resultado r = lista(pasta_->path("p.dxf"), pasta_->path("l5.dxf"), escolhe);
    ASSERT_EQ(r.status, 4) << r.err.toStdString();
    EXPECT_TRUE(r.out.contains("No terminals were found for the list.")) << r.out.toStdString();
    EXPECT_FALSE(QFile::exists(pasta_->path("l5.dxf")));

    ASSERT_EQ(lista(pasta_->path("p.dxf"), pasta_->path("l7.dxf")).status, 0);
    const QStringList rows = linhas(pasta_->path("l7.dxf"));
    r = lista(pasta_->path("p.dxf"), pasta_->path("l6.dxf"),
              escolhe + QStringList{"--answer", "strips=X1"});
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    const QStringList x1 = linhas(pasta_->path("l6.dxf"));
    EXPECT_FALSE(x1.isEmpty());
    EXPECT_LT(x1.size(), rows.size());
}

TEST_F(TerminalListTest, InvertedTerminalsSwapTheirSidesOnTheRowsAndNothingElse) {
    // The same project with the flag of every drawn terminal turned over.
    auto db = zvdb::DxfLoader::loadFile(pasta_->path("p.dxf").toStdString());
    ASSERT_TRUE(db);
    int virados = 0;
    for (zvdb::Entity* e : db->modelSpace()->entities()) {
        auto* ref = dynamic_cast<zvdb::BlockReference*>(e);
        zvdb::Attribute* flag = ref ? ref->attribute("INVERTIDO") : nullptr;
        if (!flag) continue;
        flag->setTextValue(flag->textValue() == "S" ? "N" : "S");
        ++virados;
    }
    ASSERT_GT(virados, 50);
    zvdb::DxfWriter::saveFile(*db, pasta_->path("inv.dxf").toStdString());
    ASSERT_EQ(lista(pasta_->path("p.dxf"), pasta_->path("l8.dxf")).status, 0);
    const Resultado r = lista(pasta_->path("inv.dxf"), pasta_->path("l9.dxf"));
    ASSERT_EQ(r.status, 0) << r.err.toStdString();

    // Row cells: number, element and wire of the first side, wire and element of the other
    // side, key, and "inv" for an inverted terminal.
    const QStringList antes = linhas(pasta_->path("l8.dxf"));
    QStringList esperado;
    int lados = 0, invertidos = 0;
    for (const QString& linha : antes) {
        QStringList c = linha.split('|');
        ASSERT_EQ(c.size(), 7) << linha.toStdString();
        if (c[1] != c[4] || c[2] != c[3]) ++lados;
        if (c[6] == "inv") ++invertidos;
        std::swap(c[1], c[4]);
        std::swap(c[2], c[3]);
        if (!c[5].isEmpty()) c[6] = c[6] == "inv" ? "" : "inv";  // blank rows have no key
        esperado << c.join('|');
    }
    EXPECT_GT(lados, antes.size() / 2);
    EXPECT_GT(invertidos, 0);
    EXPECT_EQ(linhas(pasta_->path("l9.dxf")), esperado);
}

TEST_F(TerminalListTest, AFilterExpressionKeepsOnlyTheTerminalsItAccepts) {
    // One column, so that each row links back to its terminal.
    const QStringList todos = modelo("uma-coluna.grt", "(setq *COLUNA_SN* nil)");
    // Strips X0 and X2, tagged in any language.
    const QStringList filtrado = modelo("filtro.grt", R"LSP((setq *COLUNA_SN* nil)
(setq *FILTRO_TEMPLATE* "(member (cond ((cdr (assoc \"REGUA\" reg)))
                                       ((cdr (assoc \"STRIP\" reg)))
                                       ((cdr (assoc \"REGLETA\" reg))))
                                 '(\"X0\" \"X2\"))"))LSP");
    Resultado r = lista(pasta_->path("p.dxf"), pasta_->path("l10.dxf"), todos);
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    r = lista(pasta_->path("p.dxf"), pasta_->path("l11.dxf"), filtrado);
    ASSERT_EQ(r.status, 0) << r.err.toStdString();

    const std::vector<Linha> completa = linhasComRegua(pasta_->path("l10.dxf"));
    QStringList esperado;
    QSet<QString> reguas;
    for (const Linha& linha : completa) {
        reguas.insert(linha.regua);
        if (linha.regua == "X0" || linha.regua == "X2") esperado << linha.texto;
    }
    ASSERT_TRUE(reguas.contains("X0") && reguas.contains("X1") && reguas.contains("X2"));
    ASSERT_FALSE(esperado.isEmpty());
    QStringList obtido;
    for (const Linha& linha : linhasComRegua(pasta_->path("l11.dxf"))) {
        EXPECT_TRUE(linha.regua == "X0" || linha.regua == "X2") << linha.regua.toStdString();
        obtido << linha.texto;
    }
    EXPECT_EQ(obtido, esperado);
}

TEST_F(TerminalListTest, RowCellsShowTheSidesFieldsThatAFunctionCellWouldSee) {
    const char* const tags[] = {"VARIAVEL_N", "VARIAVEL_A", "VARIAVEL_B",
                                "VARIAVEL_C", "VARIAVEL_D", "VARIAVEL_E"};
    // A row block naming fields of the sides' neighbours and wires, with or without a
    // function cell (which may read any field, so every one is copied).
    const auto bloco = [&](const QString& nome, bool funcao) {
        zvdb::Database db;
        const std::vector<std::pair<std::string, std::string>> celulas{
            {tags[0], "NUMERO"},           {tags[1], " DESCRICAO_FIM "}, {tags[2], "DESCRICAO_INI"},
            {tags[3], "SECAO_MM2_SEGINI"}, {tags[4], "RELACAO_INI"},     {tags[5], "COR_SEGFIM"}};
        double x = 0;
        for (const auto& [tag, valor] : celulas)
            db.modelSpace()->addAttributeDefinition(tag, tag, valor, {x += 10, 0, 0}, 1.0);
        if (funcao)
            db.modelSpace()->addAttributeDefinition("FUNCAO_N", "FUNCAO_N", "(itoa (length reg))",
                                                    {x + 10, 0, 0}, 1.0);
        zvdb::DxfWriter::saveFile(
            db, pasta_->path("produto/DADOS/1/BLOCOS/" + nome + ".dxf").toStdString());
    };
    bloco("LINHA_C", false);
    bloco("LINHA_F", true);
    // Each row's named cells, in order.
    const auto celulas = [&](const QString& arquivo) {
        QStringList linhas;
        const auto db = zvdb::DxfLoader::loadFile(arquivo.toStdString());
        for (zvdb::Entity* e : db->modelSpace()->entities()) {
            auto* ref = dynamic_cast<zvdb::BlockReference*>(e);
            if (!ref || !ref->blockName().starts_with("BLK_CTR_LST_DET_BORN")) continue;
            QStringList valores;
            for (const char* tag : tags) {
                zvdb::Attribute* a = ref->attribute(tag);
                valores << (a ? QString::fromStdString(std::string(a->textValue())) : "-");
            }
            linhas << valores.join('|');
        }
        return linhas;
    };
    const auto lista = [&](const QString& nome, const QString& bloco, const QString& filtro) {
        const QString saida = pasta_->path(nome + ".dxf");
        const QStringList extra =
            modelo(nome + ".grt", ("(setq LISTA_DETALHE \"DADOS\\\\1\\\\BLOCOS\\\\" + bloco +
                                   "\" *FILTRO_TEMPLATE* \"" + filtro + "\")")
                                      .toUtf8());
        const Resultado r = TerminalListTest::lista(pasta_->path("p.dxf"), saida, extra);
        EXPECT_EQ(r.status, 0) << r.err.toStdString();
        return celulas(saida);
    };
    // The demo's filter reads the strip alone.
    const QString demo = "(/= (cdr (assoc \\\"REGUA\\\" reg)) \\\"XV\\\")";
    const QStringList simples = lista("campos-c", "LINHA_C", demo);
    ASSERT_GT(simples.size(), 20);
    EXPECT_EQ(simples, lista("campos-f", "LINHA_F", demo));
    // The cells hold values of both sides' neighbours and wires.
    int cheias[6] = {};
    for (const QString& linha : simples) {
        const QStringList v = linha.split('|');
        for (int i = 0; i < 6; ++i)
            cheias[i] += !v[i].isEmpty();
    }
    for (int i = 1; i < 6; ++i)
        EXPECT_GT(cheias[i], 0) << tags[i];
    // A filter on a side's field no cell names still sees it: the terminals it drops leave
    // blank rows.
    const QString lado = "(/= (cdr (assoc \\\"FABRICANTE_INI\\\" reg)) \\\"Conexa\\\")";
    const QStringList filtrada = lista("campos-lado-c", "LINHA_C", lado);
    EXPECT_FALSE(filtrada.isEmpty());
    EXPECT_NE(filtrada, simples);
    EXPECT_EQ(filtrada, lista("campos-lado-f", "LINHA_F", lado));
}

TEST(TerminalListFilterTest, AFilterReadsTheFieldsItLooksUpByNameAndAnyOtherReadsAll) {
    using Nomes = std::optional<QSet<QString>>;
    EXPECT_EQ(CETemplateLisp::CamposDaExpressao(""), Nomes(QSet<QString>{}));
    EXPECT_EQ(
        CETemplateLisp::CamposDaExpressao(
            "(and (/= (cdr (assoc \"REGUA\" reg)) \"XV\")\n"
            "     (or (not (assoc \"cor_ini\" REG)) (> (atoi (cdr (assoc \"N\" reg))) -2.5)))"),
        Nomes(QSet<QString>({"REGUA", "COR_INI", "N"})));
    // reg as a whole, a function of the product's, a quoted form, a symbol that looks like
    // a number, an escape, an open string: any field may be read.
    for (const char* filtro :
         {"(length reg)", "(assoc (strcat \"A\" \"_INI\") reg)", "(meufiltro reg)",
          "(member (cdr (assoc \"REGUA\" reg)) '(\"X0\"))", "(inf)", "(assoc \"A\\\"B\" reg)",
          "(assoc \"REGUA reg)", "(setq reg nil)", "(cdr (assoc \"A\" reg) reg)"})
        EXPECT_EQ(CETemplateLisp::CamposDaExpressao(filtro), std::nullopt) << filtro;
}

TEST_F(TerminalListTest, TheListedDrawingPassesTheAuditOfAnotherReader) {
    const QString faltando = zvtest::PythonChecker::missing();
    if (!faltando.isEmpty()) GTEST_SKIP() << faltando.toStdString();
    ASSERT_EQ(lista(pasta_->path("p.dxf"), pasta_->path("l12.dxf")).status, 0);
    QString saida;
    ASSERT_EQ(
        zvtest::PythonChecker::run("../drawing/inspect_dxf.py", {pasta_->path("l12.dxf")}, &saida),
        0)
        << saida.toStdString();
    // ezdxf sees the same rows, with the same texts, as the drawing reader.
    const QJsonObject visto = QJsonDocument::fromJson(saida.toUtf8()).object();
    QStringList linhasEzdxf;
    for (const QJsonValue& e : visto.value("modelspace").toArray()) {
        const QJsonObject o = e.toObject();
        if (!o.value("name").toString().startsWith("BLK_CTR_LST_DET_BORN")) continue;
        QStringList campos;
        for (const QJsonValue& a : o.value("attribs").toArray())
            campos << a.toArray().at(1).toString();
        linhasEzdxf << o.value("layer").toString() + " " + campos.join('|');
    }
    EXPECT_EQ(linhasEzdxf, linhas(pasta_->path("l12.dxf")));
    EXPECT_TRUE(visto.value("layers").toObject().contains("LISTAS$0001$A"));
}

}  // namespace
