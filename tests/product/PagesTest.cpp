// Pages and groups: lists, creation and deletion, kept through a DXF round trip.
#include "ProductFixture.h"
#include "QtPrinters.h"
#include "product/PageRegistry.h"

#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "drawing/LayerRecord.h"

#include <QTemporaryDir>

namespace zvproduct::testing {
namespace {

class PagesTest : public ProductFixture {
protected:
    PagesTest() {
        addGroup("CAPA", 1, {"CAPA$0001$A"});
        addGroup("ESQ", 4, {"ESQ$0001$A", "ESQ$0002$A"});
    }
    void roundTrip() { database = zvdb::DxfLoader::load(zvdb::DxfWriter::toText(*database)); }
};

TEST_F(PagesTest, GroupsAndPagesInRegistryOrder) {
    EXPECT_EQ(show("(buscaListaGrupos)"), "(\"CAPA\" \"ESQ\")");
    EXPECT_EQ(show("(buscalistapaginas)"), "(\"CAPA$0001$A\" \"ESQ$0001$A\" \"ESQ$0002$A\")");
    EXPECT_EQ(show("(buscalistapaginas T)"),
              "((\"CAPA\" \"CAPA$0001$A\") (\"ESQ\" \"ESQ$0001$A\" \"ESQ$0002$A\"))");
    EXPECT_EQ(show("(getprimeirapagina)"), "\"CAPA$0001$A\"");
    database = std::make_unique<zvdb::Database>();
    EXPECT_EQ(show("(list (getprimeirapagina) (buscalistapaginas))"), "(nil nil)");
}

TEST_F(PagesTest, NewPageAtTheEndOfItsGroupSurvivesASave) {
    EXPECT_EQ(show("(criarpagina \"ESQ$0001$A\" 0)"), "\"ESQ$0003$A\"");
    EXPECT_EQ(database->currentLayer(), "ESQ$0003$A");
    EXPECT_NE(database->layer("ESQ$FORMATO"), nullptr);
    EXPECT_NE(database->layer("ESQ$DE"), nullptr);
    EXPECT_EQ(show("(criarpagina \"NOVO\" 0)"), "\"NOVO$0001$A\"");
    roundTrip();
    EXPECT_EQ(show("(buscalistapaginas T)"),
              "((\"CAPA\" \"CAPA$0001$A\") (\"ESQ\" \"ESQ$0001$A\" \"ESQ$0002$A\" \"ESQ$0003$A\") "
              "(\"NOVO\" \"NOVO$0001$A\"))");
    EXPECT_EQ(database->currentLayer(), "NOVO$0001$A");
    EXPECT_NE(database->layer("NOVO$0001$A"), nullptr);
}

TEST_F(PagesTest, NewGroupGetsTheSheetFrameOfTheProductData) {
    QTemporaryDir data;
    ASSERT_TRUE(QDir(data.path()).mkpath("DADOS/1/BLOCOS"));
    zvdb::Database frame;
    frame.modelSpace()->addLine({0, 0, 0}, {420, 297, 0});
    zvdb::DxfWriter::saveFile(
        frame, QString(data.path() + "/DADOS/1/BLOCOS/FORMATO_A3.dxf").toStdString());
    lisp.setGlobal("*DIRETORIO_REDE*", zvlisp::Value::string(data.path()));
    run("(criarpagina \"NOVO\" 0)");
    int frames = 0;
    for (zvdb::Entity* entity : database->modelSpace()->entities())
        if (auto* reference = dynamic_cast<zvdb::BlockReference*>(entity))
            frames += reference->blockName() == "FORMATO_A3" && entity->layer() == "NOVO$FORMATO";
    EXPECT_EQ(frames, 1);
    run("(criarpagina \"NOVO\" 0)");  // one frame per group
    ASSERT_NE(database->block("FORMATO_A3"), nullptr);
    EXPECT_EQ(database->block("FORMATO_A3")->entityCount(), 1u);
}

TEST_F(PagesTest, PagesMadeInARowCountOnAndSeeTheRegistryChangedBetweenThem) {
    // The running number each page shows at its corner, by page.
    auto numeros = [this] {
        QStringList texts;
        for (zvdb::Entity* entity : database->modelSpace()->entities())
            if (entity->isType("TEXT") && entity->layer().starts_with("LISTAS$"))
                texts << QString::fromStdString(std::string(entity->layer()) + "=" +
                                                std::string(entity->text(1)));
        return texts;
    };
    for (int i = 0; i < 3; ++i)
        run("(criarpagina \"LISTAS\" 0)");
    EXPECT_EQ(numeros(), QStringList({"LISTAS$0001$A=4", "LISTAS$0002$A=5", "LISTAS$0003$A=6"}));
    // A group rewritten between two calls, with no new object: one page fewer before.
    addGroup("ESQ", 4, {"ESQ$0001$A"});
    EXPECT_EQ(show("(criarpagina \"LISTAS\" 0)"), "\"LISTAS$0004$A\"");
    EXPECT_EQ(numeros().last(), "LISTAS$0004$A=6");
    // Another group's next page follows its highest number, and shifts the lists.
    addGroup("ESQ", 4, {"ESQ$0001$A", "ESQ$0007$A"});
    EXPECT_EQ(show("(criarpagina \"ESQ\" 0)"), "\"ESQ$0008$A\"");
    EXPECT_EQ(show("(criarpagina \"LISTAS\" 0)"), "\"LISTAS$0005$A\"");
    EXPECT_EQ(numeros().last(), "LISTAS$0005$A=9");
    // A group erased and made again starts from 1.
    run("(apagargrupo \"LISTAS\")");
    EXPECT_EQ(show("(criarpagina \"LISTAS\" 0)"), "\"LISTAS$0001$A\"");
    EXPECT_EQ(show("(buscalistapaginas T)"),
              "((\"CAPA\" \"CAPA$0001$A\") (\"ESQ\" \"ESQ$0001$A\" \"ESQ$0007$A\" "
              "\"ESQ$0008$A\") (\"LISTAS\" \"LISTAS$0001$A\"))");
    EXPECT_EQ(numeros(), QStringList({"LISTAS$0001$A=5"}));
}

TEST_F(PagesTest, ErasedGroupTakesItsPagesEntitiesAndLayers) {
    terminal("ESQ$0001$A", {10, 10, 0}, "X1", "1");
    wire("ESQ$0002$A", {{0, 0, 0}, {5, 5, 0}}, "1");
    terminal("CAPA$0001$A", {10, 10, 0}, "X9", "1");
    run("(criarpagina \"ESQ\" 0)");
    run("(apagargrupo \"ESQ\")");
    roundTrip();
    EXPECT_EQ(show("(buscaListaGrupos)"), "(\"CAPA\")");
    EXPECT_EQ(database->layer("ESQ$0001$A"), nullptr);
    EXPECT_EQ(database->layer("ESQ$FORMATO"), nullptr);
    EXPECT_EQ(database->currentLayer(), "0");
    ASSERT_EQ(database->modelSpace()->entities().size(), 1u);
    EXPECT_EQ(database->modelSpace()->entities()[0]->layer(), "CAPA$0001$A");
}

TEST_F(PagesTest, ThawingAPageAndTheGroupCounts) {
    run("(criarpagina \"ESQ\" 0)");
    database->layer("ESQ$0002$A")->setFrozen(true);
    database->layer("ESQ$SELO")->setFrozen(true);
    EXPECT_EQ(show("(Descongela_as_layers_da_pagina \"ESQ$0002$A\")"), "T");
    EXPECT_FALSE(database->layer("ESQ$0002$A")->isFrozen());
    EXPECT_FALSE(database->layer("ESQ$SELO")->isFrozen());
    EXPECT_EQ(show("(Descongela_as_layers_da_pagina \"ESQ$0099$A\")"), "nil");
    // a cover keeps its title block frozen
    database->layer("CAPA$0001$A")
        ->setXData("KVR_ZV_CAPA", zvsample::XDataItems().text("CAPA").tags());
    run("(criarpagina \"CAPA\" 0)");
    run("(Descongela_as_layers_da_pagina \"CAPA$0001$A\")");
    EXPECT_TRUE(database->layer("CAPA$SELO")->isFrozen());

    zvdb::BlockRecord* count = database->createBlock("PAGINA_DE");
    auto* de =
        database->modelSpace()->addBlockReference(*count, {380, 14, 0}, {1, 1, 1}, 0, "ESQ$DE");
    de->addAttribute("TOTAL", "1", {380, 14, 0}, 2.5);
    run("(atualizarpaginas)");
    EXPECT_EQ(de->attribute("TOTAL")->text(1), "3");
    // Counts that stand leave the drawing as it is.
    const std::uint64_t shapes = database->shapeCount();
    run("(atualizarpaginas)");
    EXPECT_EQ(database->shapeCount(), shapes);
    de->attribute("TOTAL")->setText(1, "9");
    const std::uint64_t edited = database->shapeCount();
    run("(atualizarpaginas)");
    EXPECT_EQ(de->attribute("TOTAL")->text(1), "3");
    EXPECT_NE(database->shapeCount(), edited);
    database->setCurrentLayer("ESQ$0002$A");
    run("(AtualizaModemacro)");
    EXPECT_EQ(show("*ZV_MODEMACRO*"), "\"ZV ESQ$0002$A (4)\"");
}

// A count goes to the title blocks on the "$DE" layer of its group, spelt as the registry
// spells it; a layer of the same length or the same ending that is not one keeps its own.
TEST_F(PagesTest, TotalsGoOnlyToTheTitleBlocksOfTheGroupsOwnLayers) {
    run("(criarpagina \"ESQ\" 0)");
    run("(criarpagina \"ESQ\" 0)");
    run("(criarpagina \"COMANDO\" 0)");
    zvdb::BlockRecord* count = database->createBlock("PAGINA_DE");
    std::vector<zvdb::BlockReference*> blocks;
    for (const char* layer :
         {"ESQ$DE", "COMANDO$DE", "XYZ$DE", "esq$de", "ESQ$0001$A", "OUTRO$COMANDO$DE", "ESQ$DE"}) {
        auto* title =
            database->modelSpace()->addBlockReference(*count, {380, 14, 0}, {1, 1, 1}, 0, layer);
        title->addAttribute("TOTAL", "7", {380, 14, 0}, 2.5);
        blocks.push_back(title);
    }
    run("(atualizarpaginas)");
    QStringList totals;
    for (const zvdb::BlockReference* title : blocks) {
        const std::string_view total = title->attribute("TOTAL")->text(1);
        totals << QString::fromUtf8(total.data(), int(total.size()));
    }
    const QString esq = QString::number(PageRegistry(*database).group("ESQ")->pages.size());
    EXPECT_EQ(esq, "4") << "the fixture's two pages and two more";
    EXPECT_EQ(totals, QStringList({esq, "1", "7", "7", "7", "7", esq}));
}

TEST_F(PagesTest, PageExportedToItsOwnDxf) {
    terminal("ESQ$0001$A", {10, 10, 0}, "X1", "1");
    wire("ESQ$0001$A", {{0, 0, 0}, {5, 5, 0}}, "1");
    wire("ESQ$0002$A", {{0, 0, 0}, {5, 5, 0}}, "2");
    QTemporaryDir out;
    const QString path = out.path() + "/page.dxf";
    EXPECT_EQ(show("(zvExportaLayerDxf \"" + path + "\" \"ESQ$0001$A\")"), "T");
    auto page = zvdb::DxfLoader::loadFile(path.toStdString());
    EXPECT_EQ(page->modelSpace()->entities().size(), 2u);
    EXPECT_NE(page->block("BORNE_1"), nullptr);
    EXPECT_EQ(show("(zvExportaLayerDxf \"" + path + "x\" \"NADA$0001$A\")"), "nil");
    EXPECT_FALSE(QFileInfo::exists(path + "x"));
    EXPECT_EQ(show("(zvExportaLayer \"ESQ$0001$A\" \"x.dwg\")"), "nil");
    EXPECT_TRUE(printed.contains("not available")) << printed.toStdString();
}

}  // namespace
}  // namespace zvproduct::testing
