// Connection lists worked out from small drawings.
#include "ProductFixture.h"

#include "product/ConnectionAnswers.h"
#include "product/ConnectionFinder.h"
#include "product/WireLayerIndex.h"
#include "product/WireListIndex.h"

#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"

#include <array>
#include <cmath>
#include <sstream>

namespace zvproduct::testing {
namespace {

std::string hex(const zvdb::DbObject* object) {
    return QString::number(object->handle(), 16).toUpper().toStdString();
}

class ConnectionsTest : public ProductFixture {
protected:
    ConnectionsTest() { addGroup("ESQ", 4, {"ESQ$0001$A", "ESQ$0002$A"}); }

    zvdb::BlockReference* contact(const std::string& layer, zvdb::Point3 at) {
        auto* reference = twoPoint("NA-1", layer, at);
        reference->addAttribute("LIGACAO1", "13", at, 2.5);
        reference->addAttribute("LIGACAO2", "14", {at.x, at.y - 10, 0}, 2.5);
        return reference;
    }

    // The drawing read again from its file with the handles of `a` and `b` swapped.
    void reloadWithHandlesSwapped(const zvdb::DbObject* a, const zvdb::DbObject* b) {
        std::vector<std::string> lines;
        std::istringstream text(zvdb::DxfWriter::toText(*database));
        for (std::string line; std::getline(text, line);)
            lines.push_back(line);
        int swapped = 0;
        for (std::size_t i = 0; i + 1 < lines.size(); ++i) {
            if (lines[i].find_first_not_of(' ') == std::string::npos ||
                lines[i].substr(lines[i].find_first_not_of(' ')) != "5")
                continue;
            std::string& handle = lines[i + 1];
            if (handle == hex(a) || handle == hex(b)) {
                handle = handle == hex(a) ? hex(b) : hex(a);
                ++swapped;
            }
        }
        ASSERT_EQ(swapped, 2);
        std::string swappedText;
        for (const std::string& line : lines)
            swappedText += line + "\n";
        database = zvdb::DxfLoader::load(swappedText);
        ASSERT_TRUE(database);
    }
};

TEST_F(ConnectionsTest, WireThroughTerminalContactAndSecondTerminal) {
    auto* first = terminal("ESQ$0001$A", {100, 200, 0}, "X1", "1");
    auto* middle = contact("ESQ$0001$A", {150, 200, 0});
    auto* last = terminal("ESQ$0001$A", {200, 200, 0}, "X1", "2");
    // the second vertex is a bend; the others touch within the tolerance
    wire("ESQ$0001$A",
         {{100, 190.05, 0}, {120, 220, 0}, {150, 200, 0}, {150, 190, 0}, {200, 200, 0}}, "101");
    EXPECT_EQ(show("(getConexoesTodosFios)"),
              "((\"101\" (\"" + hex(first) + "##BORNE_1\" 100.0 190.0 0.0) (\"" + hex(middle) +
                  "#13#NA-1\" 150.0 200.0 0.0) (\"" + hex(middle) +
                  "#14#NA-1\" 150.0 190.0 0.0) (\"" + hex(last) + "##BORNE_1\" 200.0 200.0 0.0)))");
}

TEST_F(ConnectionsTest, TouchNeedsTheToleranceAndTheSameLayer) {
    terminal("ESQ$0001$A", {100, 200, 0}, "X1", "1");
    terminal("ESQ$0002$A", {300, 200, 0}, "X1", "2");
    wire("ESQ$0001$A", {{100, 190.2, 0}, {300, 200, 0}}, "101");  // 0.2 off; other page
    EXPECT_EQ(show("(getConexoesTodosFios)"), "((\"101\"))");
    run("(setq *ESPESSURA_BARRAMENTO* 0.5)");
    EXPECT_EQ(show("(length (cdr (car (getConexoesTodosFios))))"), "1");
}

TEST_F(ConnectionsTest, WireContinuedOnAnotherPageFollowsPageOrder) {
    auto* second = terminal("ESQ$0002$A", {100, 200, 0}, "X1", "3");
    wire("ESQ$0002$A", {{80, 200, 0}, {100, 200, 0}}, "102");  // drawn first, page 2
    auto* first = terminal("ESQ$0001$A", {100, 200, 0}, "X1", "2");
    wire("ESQ$0001$A", {{100, 190, 0}, {250, 190, 0}}, "102");
    EXPECT_EQ(show("(mapcar 'car (cdr (car (getConexoesTodosFios))))"),
              "(\"" + hex(first) + "##BORNE_1\" \"" + hex(second) + "##BORNE_1\")");
    EXPECT_EQ(show("(length (getConexoesTodosFios))"), "1");
}

TEST_F(ConnectionsTest, TerminalStandingTwiceOnOneWire) {
    auto* both = terminal("ESQ$0001$A", {300, 200, 0}, "X1", "4");
    wire("ESQ$0001$A", {{300, 200, 0}, {320, 180, 0}, {300, 190, 0}}, "103");
    const std::string h = hex(both);
    EXPECT_EQ(
        show("(cdr (car (getConexoesTodosFios)))"),
        "((\"" + h + "##BORNE_1\" 300.0 200.0 0.0) (\"" + h + "##BORNE_1\" 300.0 190.0 0.0))");
}

TEST_F(ConnectionsTest, CableLeadWithBlindConnectionOnTheNextPage) {
    auto* near = terminal("ESQ$0001$A", {100, 100, 0}, "X2", "1");
    auto* far = terminal("ESQ$0002$A", {100, 100, 0}, "X2", "2");
    const std::string path[] = {"ZV_CABOS"};
    auto* cable = database->dictionaryAt(path, true)->getOrCreateXRecord("W1");
    cable->setData(zvsample::XDataItems().add(1, "W1").tags());
    cable->setXData("KVR_ZV_CABO", zvsample::XDataItems().text("20001\f1").tags());
    cable->setXData("KVR_ZV_ATT_VIRTUAL", zvsample::XDataItems().text("CABO\fW1\fN").tags());
    auto* lead =
        database->modelSpace()->addLwPolyline({{100, 90.2, 0}, {400, 90, 0}}, false, "ESQ$0001$A");
    lead->setXData("KVR_ZV_CABO", zvsample::XDataItems()
                                      .text("20001\f1")
                                      .handle(cable->handle())
                                      .handle(cable->handle())
                                      .tags());
    auto* blind =
        database->modelSpace()->addLwPolyline({{10, 50, 0}, {100, 90, 0}}, false, "ESQ$0002$A");
    blind->setXData("KVR_ZV_CONEX_BLIND",
                    zvsample::XDataItems().text("W1").handle(lead->handle()).tags());
    EXPECT_EQ(show("(= (car (car (getConexoesTodosCabos))) (strcat \"W1\" (chr 12) \"20001\"))"),
              "T");
    EXPECT_EQ(show("(cdr (car (getConexoesTodosCabos)))"),
              "((\"" + hex(near) + "\" 100.0 90.0 0.0) (\"" + hex(far) + "\" 100.0 90.0 0.0))");
    EXPECT_EQ(show("(getFiosPorLayer \"ESQ$0001$A\")"), "(\"" + hex(lead) + "\")");
}

TEST_F(ConnectionsTest, CablesAmongEachOtherKeepTheirLeadsAndBlindConnectionsInOrder) {
    const std::string path[] = {"ZV_CABOS"};
    auto makeCable = [&](const std::string& name) {
        auto* cable = database->dictionaryAt(path, true)->getOrCreateXRecord(name);
        cable->setData(zvsample::XDataItems().add(1, name).tags());
        cable->setXData("KVR_ZV_ATT_VIRTUAL",
                        zvsample::XDataItems().text("CABO\f" + name + "\fN").tags());
        return cable;
    };
    auto addLead = [&](zvdb::DbObject* cable, const std::string& layer, double x) {
        auto* lead = database->modelSpace()->addLwPolyline({{x, 90, 0}, {x, 10, 0}}, false, layer);
        lead->setXData("KVR_ZV_CABO",
                       zvsample::XDataItems().text("20001\f1").handle(cable->handle()).tags());
        return lead;
    };
    auto addBlind = [&](zvdb::Polyline* lead, const std::string& layer, double x) {
        auto* blind = database->modelSpace()->addLwPolyline({{0, 0, 0}, {x, 10, 0}}, false, layer);
        blind->setXData("KVR_ZV_CONEX_BLIND",
                        zvsample::XDataItems().text("W").handle(lead->handle()).tags());
    };
    zvdb::DbObject* w1 = makeCable("W1");
    zvdb::DbObject* w2 = makeCable("W2");
    std::vector<std::uint64_t> at;  // terminals at the leads' first ends, then the blinds'
    for (double x : {100.0, 200.0, 300.0})
        at.push_back(terminal("ESQ$0001$A", {x, 100, 0}, "X5", "1")->handle());
    for (double x : {100.0, 200.0, 300.0})
        at.push_back(terminal("ESQ$0002$A", {x, 20, 0}, "X5", "2")->handle());
    auto* second = addLead(w1, "ESQ$0001$A", 300);
    auto* other = addLead(w2, "ESQ$0001$A", 200);
    auto* first = addLead(w1, "ESQ$0001$A", 100);
    // blinds drawn in another order than their leads, two for the second lead
    addBlind(second, "ESQ$0002$A", 300);
    addBlind(other, "ESQ$0002$A", 200);
    addBlind(first, "ESQ$0002$A", 100);
    addBlind(second, "ESQ$0002$A", 200);
    const std::vector<WireConnections> cables = ConnectionFinder(*database, 0.1).cables();
    ASSERT_EQ(cables.size(), 2u);
    EXPECT_EQ(cables[0].number, "W1\f20001");
    EXPECT_EQ(cables[1].number, "W2\f20001");
    EXPECT_EQ(cables[0].polylines, (std::vector<std::uint64_t>{second->handle(), first->handle()}));
    EXPECT_EQ(cables[1].polylines, std::vector<std::uint64_t>{other->handle()});
    auto symbols = [](const WireConnections& cable) {
        std::vector<std::uint64_t> found;
        for (const Touch& touch : cable.touches)
            found.push_back(touch.symbol);
        return found;
    };
    EXPECT_EQ(symbols(cables[0]), (std::vector<std::uint64_t>{at[2], at[5], at[4], at[0], at[3]}));
    EXPECT_EQ(symbols(cables[1]), (std::vector<std::uint64_t>{at[1], at[4]}));
}

TEST_F(ConnectionsTest, LeadsOfOneCableAndPolylinesOfOneWireMakeOneEntryEach) {
    auto* a = terminal("ESQ$0001$A", {100, 100, 0}, "X3", "1");
    auto* b = terminal("ESQ$0001$A", {200, 100, 0}, "X3", "2");
    const std::string path[] = {"ZV_CABOS"};
    auto* cable = database->dictionaryAt(path, true)->getOrCreateXRecord("W2");
    cable->setData(zvsample::XDataItems().add(1, "W2").tags());
    cable->setXData("KVR_ZV_CABO", zvsample::XDataItems().text("20002\f1").tags());
    cable->setXData("KVR_ZV_ATT_VIRTUAL", zvsample::XDataItems().text("CABO\fW2\fN").tags());
    for (double x : {100.0, 200.0}) {
        auto* lead = database->modelSpace()->addLwPolyline({{x, 90, 0}, {x + 20, 50, 0}}, false,
                                                           "ESQ$0001$A");
        lead->setXData("KVR_ZV_CABO",
                       zvsample::XDataItems().text("20002\f1").handle(cable->handle()).tags());
    }
    EXPECT_EQ(show("(length (getConexoesTodosCabos))"), "1");
    EXPECT_EQ(show("(cdr (car (getConexoesTodosCabos)))"),
              "((\"" + hex(a) + "\" 100.0 90.0 0.0) (\"" + hex(b) + "\" 200.0 90.0 0.0))");
    wire("ESQ$0001$A", {{100, 190, 0}, {100, 150, 0}}, "301");
    wire("ESQ$0002$A", {{100, 190, 0}, {100, 150, 0}}, "302");
    wire("ESQ$0001$A", {{300, 190, 0}, {300, 150, 0}}, "301");
    EXPECT_EQ(show("(mapcar 'car (getConexoesTodosFios))"), "(\"301\" \"302\")");
}

TEST_F(ConnectionsTest, AWiresPolylinesAmongOtherWiresMakeOneEntryInPageOrder) {
    auto* onTwo = terminal("ESQ$0002$A", {100, 200, 0}, "X1", "3");
    auto* later = wire("ESQ$0002$A", {{100, 190, 0}, {100, 150, 0}}, "401");  // drawn first
    auto* other = terminal("ESQ$0001$A", {200, 200, 0}, "X1", "2");
    auto* between = wire("ESQ$0001$A", {{200, 190, 0}, {200, 150, 0}}, "402");
    auto* onOne = terminal("ESQ$0001$A", {100, 200, 0}, "X1", "1");
    auto* first = wire("ESQ$0001$A", {{100, 150, 0}, {100, 190, 0}}, "401");
    wire("ESQ$0001$A", {{300, 190, 0}, {300, 150, 0}}, "403");
    const std::vector<WireConnections> wires = ConnectionFinder(*database, 0.1).wires();
    ASSERT_EQ(wires.size(), 3u);
    EXPECT_EQ(wires[0].number, "402");
    EXPECT_EQ(wires[1].number, "401");
    EXPECT_EQ(wires[2].number, "403");
    EXPECT_EQ(wires[1].polylines, (std::vector<std::uint64_t>{first->handle(), later->handle()}));
    EXPECT_EQ(wires[0].polylines, std::vector<std::uint64_t>{between->handle()});
    ASSERT_EQ(wires[1].touches.size(), 2u);
    EXPECT_EQ(wires[1].touches[0].symbol, onOne->handle());
    EXPECT_EQ(wires[1].touches[1].symbol, onTwo->handle());
    ASSERT_EQ(wires[0].touches.size(), 1u);
    EXPECT_EQ(wires[0].touches[0].symbol, other->handle());
    EXPECT_EQ(wires[0].touches[0].point, (zvdb::Point3{200, 190, 0}));
    EXPECT_TRUE(wires[2].touches.empty());
}

// A drawing read from a file may hold a page's polylines out of their handles' order: the
// wires still come by page, then by handle, and those off the pages last.
TEST_F(ConnectionsTest, WiresByPageThenByHandleWhateverTheOrderOfTheDrawing) {
    wire("OUTRO", {{0, 0, 0}, {10, 0, 0}}, "604");
    wire("ESQ$0002$A", {{0, 0, 0}, {10, 0, 0}}, "603");
    auto* a = wire("ESQ$0001$A", {{0, 0, 0}, {10, 0, 0}}, "601");
    wire("ESQ$0001$A", {{0, 5, 0}, {10, 5, 0}}, "605");
    auto* b = wire("ESQ$0001$A", {{0, 9, 0}, {10, 9, 0}}, "602");
    EXPECT_EQ(show("(mapcar 'car (getConexoesTodosFios))"),
              "(\"601\" \"605\" \"602\" \"603\" \"604\")");
    // the file with the handles of 601 and 602 swapped: 602 now comes first on its page
    reloadWithHandlesSwapped(a, b);
    EXPECT_EQ(show("(mapcar 'car (getConexoesTodosFios))"),
              "(\"602\" \"605\" \"601\" \"603\" \"604\")");
}

TEST_F(ConnectionsTest, PolylinesInPageOrderThenByHandleAndOffThePagesLast) {
    auto* second = wire("ESQ$0002$A", {{0, 0, 0}, {10, 0, 0}}, "501");
    auto* off = wire("OUTRO", {{0, 0, 0}, {10, 0, 0}}, "502");
    auto* first = wire("ESQ$0001$A", {{0, 0, 0}, {10, 0, 0}}, "503");
    database->modelSpace()->addLwPolyline({{0, 0, 0}, {5, 5, 0}}, false, "ESQ$0001$A");
    auto* secondToo = wire("ESQ$0002$A", {{0, 5, 0}, {10, 5, 0}}, "504");
    auto* firstToo = wire("ESQ$0001$A", {{0, 5, 0}, {10, 5, 0}}, "505");
    const std::vector<zvdb::Polyline*> expected = {first, firstToo, second, secondToo, off};
    EXPECT_EQ(ConnectionFinder::polylinesInPageOrder(*database, "KVR_ZV_WIRE"), expected);
}

TEST_F(ConnectionsTest, PolylinesOfAPageComeByHandleWhateverTheOrderOfTheDrawing) {
    wire("ESQ$0002$A", {{0, 0, 0}, {10, 0, 0}}, "511");
    auto* early = wire("ESQ$0001$A", {{0, 0, 0}, {10, 0, 0}}, "512");
    wire("OUTRO", {{0, 0, 0}, {10, 0, 0}}, "513");
    wire("ESQ$0001$A", {{0, 5, 0}, {10, 5, 0}}, "514");
    wire("ESQ$0002$A", {{0, 5, 0}, {10, 5, 0}}, "515");
    auto* late = wire("ESQ$0001$A", {{0, 9, 0}, {10, 9, 0}}, "516");
    auto numbers = [&] {
        std::vector<std::string_view> found;
        for (const zvdb::Polyline* line :
             ConnectionFinder::polylinesInPageOrder(*database, "KVR_ZV_WIRE"))
            found.push_back(ConnectionFinder::wireNumber(*line));
        return found;
    };
    EXPECT_EQ(numbers(), (std::vector<std::string_view>{"512", "514", "516", "511", "515", "513"}));
    reloadWithHandlesSwapped(early, late);
    EXPECT_EQ(numbers(), (std::vector<std::string_view>{"516", "514", "512", "511", "515", "513"}));
}

TEST_F(ConnectionsTest, SymbolsDrawnAcrossPagesAndCellsInAnyOrderTouchTheirOwnWires) {
    // drawn right to left, the pages in turn: the index reorders them by page and cell
    std::vector<std::uint64_t> onFirst(5), onSecond(5);
    for (int i = 4; i >= 0; --i) {
        const double x = 100.0 + 50 * i;
        onSecond[static_cast<std::size_t>(i)] = contact("ESQ$0002$A", {x, 200, 0})->handle();
        onFirst[static_cast<std::size_t>(i)] = contact("ESQ$0001$A", {x, 300, 0})->handle();
        contact("OUTRO", {x, 300, 0});
    }
    wire("ESQ$0002$A", {{100, 190, 0}, {300, 190, 0}}, "702");
    wire("ESQ$0001$A", {{100, 300, 0}, {150, 300, 0}, {200, 300, 0}, {250, 300, 0}, {300, 300, 0}},
         "701");
    const auto wires = ConnectionFinder(*database, 0.1).wires();
    ASSERT_EQ(wires.size(), 2u);
    auto touched = [](const WireConnections& wire) {
        std::vector<std::uint64_t> symbols;
        for (const Touch& touch : wire.touches)
            symbols.push_back(touch.symbol);
        return symbols;
    };
    EXPECT_EQ(wires[0].number, "701");
    EXPECT_EQ(touched(wires[0]), onFirst);
    for (const Touch& touch : wires[0].touches)
        EXPECT_EQ(touch.connection, "13");
    // the second page's wire runs on the lower connections, and only its two ends touch
    EXPECT_EQ(wires[1].number, "702");
    EXPECT_EQ(touched(wires[1]), (std::vector<std::uint64_t>{onSecond[0], onSecond[4]}));
    for (const Touch& touch : wires[1].touches)
        EXPECT_EQ(touch.connection, "14");
}

TEST_F(ConnectionsTest, WireListsByPage) {
    terminal("ESQ$0001$A", {100, 200, 0}, "X1", "1");
    auto* one = wire("ESQ$0001$A", {{100, 190, 0}, {100, 150, 0}}, "201");
    auto* oneOnTwo = wire("ESQ$0002$A", {{100, 190, 0}, {100, 150, 0}}, "201");
    auto* two = wire("ESQ$0002$A", {{200, 190, 0}, {200, 150, 0}}, "202");
    EXPECT_EQ(show("(getListaFiosProj \"proj.dxf\" \"ESQ$0002$A\")"),
              "(\"" + hex(oneOnTwo) + "\" \"" + hex(two) + "\")");
    EXPECT_EQ(show("(getListaFiosProj \"proj.dxf\" nil)"),
              "(\"" + hex(one) + "\" \"" + hex(two) + "\")");
    EXPECT_EQ(show("(length (getListaFios \"ESQ$0001$A\" \"0\"))"), "1");
    EXPECT_EQ(show("(getFiosPorLayer \"ESQ$0002$A\")"),
              "(\"" + hex(oneOnTwo) + "\" \"" + hex(two) + "\")");
    // the answers follow the drawing: a wire drawn and a wire erased since
    auto* three = wire("ESQ$0002$A", {{300, 190, 0}, {300, 150, 0}}, "203");
    oneOnTwo->erase();
    EXPECT_EQ(show("(getFiosPorLayer \"ESQ$0002$A\")"),
              "(\"" + hex(two) + "\" \"" + hex(three) + "\")");
}

TEST_F(ConnectionsTest, TheWiresByLayerThatAnIndexHandsOverAreThoseOfAWalkOfTheirOwn) {
    wire("ESQ$0001$A", {{0, 0, 0}, {10, 0, 0}}, "1");
    auto* both = wire("ESQ$0002$A", {{0, 5, 0}, {10, 5, 0}}, "2");
    both->setXData("KVR_ZV_CABO", zvsample::XDataItems().text("20001\f1").tags());
    auto* lower =
        database->modelSpace()->addLwPolyline({{0, 9, 0}, {9, 9, 0}}, false, "ESQ$0002$A");
    lower->setXData("kvr_zv_wire", zvsample::XDataItems().text("10006\f1").text("FIO\f3").tags());
    auto* lead = database->modelSpace()->addLwPolyline({{0, 1, 0}, {9, 1, 0}}, false, "ESQ$0001$A");
    lead->setXData("KVR_ZV_CABO", zvsample::XDataItems().text("20001\f1").tags());
    auto* blind =
        database->modelSpace()->addLwPolyline({{0, 2, 0}, {9, 2, 0}}, false, "ESQ$0001$A");
    blind->setXData("KVR_ZV_CONEX_BLIND", zvsample::XDataItems().text("W1").tags());
    database->modelSpace()->addLwPolyline({{0, 3, 0}, {9, 3, 0}}, false, "ESQ$0001$A");
    wire("OFF", {{0, 0, 0}, {10, 0, 0}}, "4");
    const std::vector<std::string> layers = {"ESQ$0001$A", "ESQ$0002$A", "OFF", "esq$0001$a",
                                             "NONE"};
    const auto compare = [&] {
        ConnectionAnswers answers;
        answers.answer(*database, 0.1, ConnectionAnswers::Kind::Wires);
        // Handed over by the index, not walked again.
        ASSERT_TRUE(answers.wireLayers().current(*database));
        WireLayerIndex own;
        for (const std::string& layer : layers)
            EXPECT_EQ(answers.wireLayers().polylinesOn(*database, layer),
                      own.polylinesOn(*database, layer))
                << layer;
    };
    compare();
    ConnectionAnswers answers;
    answers.answer(*database, 0.1, ConnectionAnswers::Kind::Cables);
    EXPECT_EQ(answers.wireLayers().polylinesOn(*database, "ESQ$0002$A"),
              (std::vector<std::uint64_t>{both->handle(), lower->handle()}));
    EXPECT_EQ(answers.wireLayers().polylinesOn(*database, "ESQ$0001$A").size(), 2u);
    // A change since: the next question walks the drawing as it stands.
    lead->erase();
    both->setText(8, "OFF");
    EXPECT_FALSE(answers.wireLayers().current(*database));
    EXPECT_EQ(answers.wireLayers().polylinesOn(*database, "ESQ$0002$A"),
              (std::vector<std::uint64_t>{lower->handle()}));
    EXPECT_EQ(answers.wireLayers().polylinesOn(*database, "ESQ$0001$A").size(), 1u);
    compare();
}

TEST_F(ConnectionsTest, TheWireListThatAnIndexHandsOverIsThatOfAWalkOfItsOwn) {
    auto* late = wire("ESQ$0002$A", {{0, 0, 0}, {10, 0, 0}}, "701");
    auto* off = wire("OFF", {{0, 0, 0}, {10, 0, 0}}, "702");
    auto* early = wire("ESQ$0001$A", {{0, 0, 0}, {10, 0, 0}}, "701");
    wire("ESQ$0001$A", {{0, 5, 0}, {10, 5, 0}}, "");  // no number
    auto* lower =
        database->modelSpace()->addLwPolyline({{0, 9, 0}, {9, 9, 0}}, false, "ESQ$0002$A");
    // the application named in another case, the number as its third item
    lower->setXData("kvr_zv_wire",
                    zvsample::XDataItems().text("10006\f1").text("1").text("FIO\f703").tags());
    auto* lead = database->modelSpace()->addLwPolyline({{0, 1, 0}, {9, 1, 0}}, false, "ESQ$0001$A");
    lead->setXData("KVR_ZV_CABO", zvsample::XDataItems().text("20001\f1").tags());
    auto* onPage = wire("ESQ$0002$A", {{0, 7, 0}, {10, 7, 0}}, "702");
    terminal("ESQ$0001$A", {0, 0, 0}, "X1", "1");

    // What the finder saw is what the walk of the lists sees.
    const ConnectionFinder finder(*database, 0.1);
    std::vector<WireLine> walked;
    for (zvdb::Polyline* line : ConnectionFinder::polylinesInPageOrder(*database, "KVR_ZV_WIRE"))
        walked.push_back({line->handle(), ConnectionFinder::wireNumber(*line), line->layer()});
    EXPECT_EQ(finder.wireLinesInPageOrder(), walked);
    ASSERT_EQ(walked.size(), 6u);
    EXPECT_EQ(walked.front().handle, early->handle());

    const std::vector<std::unordered_set<std::string>> asked = {
        {}, {"ESQ$0001$A"}, {"ESQ$0002$A"}, {"OFF", "ESQ$0002$A"}, {"NONE"}, {"esq$0001$a"}};
    const auto compare = [&] {
        ConnectionAnswers answers;
        answers.table(*database, 0.1, ConnectionAnswers::Kind::Wires, true,
                      [](const ConnectionTable&) {});
        // Handed over by the index, not walked again.
        ASSERT_TRUE(answers.wireList().current(*database));
        for (const auto& layers : asked) {
            WireListIndex own;
            EXPECT_EQ(answers.wireList().firstPolylines(*database, layers),
                      own.firstPolylines(*database, layers))
                << layers.size();
        }
    };
    compare();
    ConnectionAnswers answers;
    answers.answer(*database, 0.1, ConnectionAnswers::Kind::Cables);
    EXPECT_EQ(answers.wireList().firstPolylines(*database, {}),
              (std::vector<std::uint64_t>{early->handle(), lower->handle(), onPage->handle()}));
    EXPECT_EQ(answers.wireList().firstPolylines(*database, {"ESQ$0002$A"}).front(), late->handle());
    // A change since: the next question walks the drawing as it stands.
    early->erase();
    EXPECT_FALSE(answers.wireList().current(*database));
    EXPECT_EQ(answers.wireList().firstPolylines(*database, {}).front(), late->handle());
    compare();
    // The LISP functions share the index their connection answer handed over.
    const std::string all =
        "(\"" + hex(late) + "\" \"" + hex(lower) + "\" \"" + hex(onPage) + "\")";
    EXPECT_EQ(show("(getListaFiosProj \"proj.dxf\" nil)"), all);
    show("(getConexoesTodosFios)");
    EXPECT_EQ(show("(getListaFiosProj \"proj.dxf\" nil)"), all);
    EXPECT_EQ(show("(getListaFiosProj \"proj.dxf\" \"OFF\")"), "(\"" + hex(off) + "\")");
}

TEST_F(ConnectionsTest, BothWireIndexesMadeFromOneWalkAreThoseOfWalksOfTheirOwn) {
    auto* late = wire("ESQ$0002$A", {{0, 0, 0}, {10, 0, 0}}, "801");
    wire("OFF", {{0, 0, 0}, {10, 0, 0}}, "802");
    auto* early = wire("ESQ$0001$A", {{0, 0, 0}, {10, 0, 0}}, "801");
    wire("ESQ$0001$A", {{0, 5, 0}, {10, 5, 0}}, "");  // no number
    auto* both = wire("ESQ$0002$A", {{0, 6, 0}, {10, 6, 0}}, "803");
    both->setXData("kvr_zv_cabo", zvsample::XDataItems().text("20001\f1").tags());
    auto* lead = database->modelSpace()->addLwPolyline({{0, 1, 0}, {9, 1, 0}}, false, "OFF");
    lead->setXData("KVR_ZV_CABO", zvsample::XDataItems().text("20001\f1").tags());
    auto* empty =
        database->modelSpace()->addLwPolyline({{0, 2, 0}, {9, 2, 0}}, false, "ESQ$0001$A");
    empty->setXData("KVR_ZV_WIRE", std::vector<zvdb::Tag>{});  // a wire without items
    database->modelSpace()
        ->addLine({0, 3, 0}, {9, 3, 0})
        ->setXData("KVR_ZV_WIRE", zvsample::XDataItems().text("10006\f1").text("FIO\f9").tags());
    terminal("ESQ$0001$A", {0, 0, 0}, "X1", "1");

    const std::vector<std::string> layers = {"ESQ$0001$A", "ESQ$0002$A", "OFF", "NONE"};
    const std::vector<std::unordered_set<std::string>> asked = {
        {}, {"ESQ$0001$A"}, {"OFF", "ESQ$0002$A"}, {"NONE"}};
    const auto compare = [&](ConnectionAnswers& answers) {
        WireLayerIndex ownLayers;
        WireListIndex ownList;
        for (const std::string& layer : layers)
            EXPECT_EQ(answers.wireLayersOf(*database).polylinesOn(*database, layer),
                      ownLayers.polylinesOn(*database, layer))
                << layer;
        for (const auto& names : asked)
            EXPECT_EQ(answers.wireListOf(*database).firstPolylines(*database, names),
                      ownList.firstPolylines(*database, names))
                << names.size();
    };
    ConnectionAnswers answers;
    // whichever is asked first, the other is made by the same walk
    answers.wireListOf(*database);
    EXPECT_TRUE(answers.wireLayers().current(*database));
    EXPECT_TRUE(answers.wireList().current(*database));
    compare(answers);
    EXPECT_EQ(answers.wireListOf(*database).firstPolylines(*database, {}).front(), early->handle());
    EXPECT_EQ(answers.wireLayersOf(*database).polylinesOn(*database, "OFF").size(), 2u);
    // A change since: both are made again from the drawing as it stands.
    early->erase();
    lead->setText(8, "ESQ$0002$A");
    EXPECT_FALSE(answers.wireList().current(*database));
    EXPECT_EQ(answers.wireListOf(*database).firstPolylines(*database, {}).front(), late->handle());
    EXPECT_TRUE(answers.wireLayers().current(*database));
    EXPECT_EQ(answers.wireLayersOf(*database).polylinesOn(*database, "OFF").size(), 1u);
    compare(answers);
    // One stale index alone is made again by itself, and the other is kept.
    ConnectionAnswers one;
    one.wireList().firstPolylines(*database, {});
    EXPECT_FALSE(one.wireLayers().current(*database));
    one.wireLayersOf(*database);
    EXPECT_FALSE(one.wireLayers().current(*database));
    compare(one);
}

TEST_F(ConnectionsTest, WireListsOfLayersOffThePagesWhosePolylinesAlternate) {
    // off the pages the polylines go by handle alone, so their layers take turns
    auto* one = wire("OFF1", {{0, 0, 0}, {10, 0, 0}}, "601");
    auto* two = wire("OFF2", {{0, 0, 0}, {10, 0, 0}}, "602");
    auto* three = wire("OFF1", {{0, 5, 0}, {10, 5, 0}}, "603");
    auto* oneAgain = wire("OFF2", {{0, 5, 0}, {10, 5, 0}}, "601");
    EXPECT_EQ(show("(getListaFiosProj \"proj.dxf\" \"OFF1\")"),
              "(\"" + hex(one) + "\" \"" + hex(three) + "\")");
    EXPECT_EQ(show("(getListaFiosProj \"proj.dxf\" \"OFF2\")"),
              "(\"" + hex(oneAgain) + "\" \"" + hex(two) + "\")");
}

TEST_F(ConnectionsTest, WireHandlesAreUpperCaseHexadecimalTexts) {
    // Wires until one's handle has a letter among its digits.
    std::string texts = "(";
    for (int i = 0; texts.find_first_of("ABCDEF") == std::string::npos; ++i) {
        ASSERT_LT(i, 300);
        auto* one = wire("ESQ$0003$A", {{10.0 * i, 10, 0}, {10.0 * i + 5, 10, 0}}, "5");
        texts += (texts.size() > 1 ? " \"" : "\"") + hex(one) + "\"";
    }
    EXPECT_EQ(show("(getFiosPorLayer \"ESQ$0003$A\")"), texts + ")");
}

TEST_F(ConnectionsTest, WireListTakesEachWiresFirstPolylineOnThePagesAndFollowsEdits) {
    auto* late = wire("ESQ$0002$A", {{10, 10, 0}, {20, 10, 0}}, "401");  // drawn first, page 2
    auto* early = wire("ESQ$0001$A", {{10, 10, 0}, {20, 10, 0}}, "401");
    auto* other = wire("ESQ$0002$A", {{30, 10, 0}, {40, 10, 0}}, "402");
    wire("ESQ$0001$A", {{50, 10, 0}, {60, 10, 0}}, "");  // no number: no wire of the lists
    auto list = [this](const char* pages) {
        return show(QString("(getListaFiosProj \"proj.dxf\" %1)").arg(pages));
    };
    auto texts = [](std::initializer_list<const zvdb::DbObject*> objects) {
        std::string out = "(";
        for (const zvdb::DbObject* object : objects)
            out += (out.size() > 1 ? " \"" : "\"") + hex(object) + "\"";
        return out + ")";
    };
    EXPECT_EQ(list("nil"), texts({early, other}));
    EXPECT_EQ(list("\"ESQ$0002$A\""), texts({late, other}));
    EXPECT_EQ(list("\"ESQ$0002$A;ESQ$0001$A\""), texts({early, other}))
        << "a wire on several of the pages answers with its first polyline among them";
    EXPECT_EQ(list("'(\"ESQ$0002$A\")"), texts({late, other}));
    EXPECT_EQ(list("\"NOPE$0001$A\""), "nil");
    EXPECT_EQ(show("(length (getListaFios \"ESQ$0001$A\" \"ESQ$0002$A\"))"), "2");

    // a number changed, a polyline erased, a polyline moved to another page
    early->setXData("KVR_ZV_WIRE",
                    zvsample::XDataItems().text("10006\f1").text("1").text("FIO\f403").tags());
    EXPECT_EQ(list("nil"), texts({early, late, other}));
    early->erase();
    EXPECT_EQ(list("nil"), texts({late, other}));
    other->setLayer("ESQ$0001$A");
    EXPECT_EQ(list("nil"), texts({other, late}));
    EXPECT_EQ(list("\"ESQ$0001$A\""), texts({other}));
    EXPECT_EQ(show("(length (getListaFios \"ESQ$0001$A\"))"), "1");
}

TEST_F(ConnectionsTest, ConnectionAttributesAreReadAsTheDrawingReadsThem) {
    auto* element = contact("ESQ$0001$A", {150, 200, 0});
    const std::string h = hex(element);
    wire("ESQ$0001$A", {{150, 200, 0}, {150, 190, 0}}, "601");
    auto entries = [this] { return show("(cdr (car (getConexoesTodosFios)))"); };
    EXPECT_EQ(entries(),
              "((\"" + h + "#13#NA-1\" 150.0 200.0 0.0) (\"" + h + "#14#NA-1\" 150.0 190.0 0.0))");
    // An application group before the attribute's own tags holds codes of its own: they
    // are not the attribute's tag, value or position.
    std::vector<zvdb::Attribute*> attributes = element->attributes();
    ASSERT_EQ(attributes.size(), 2u);
    {
        auto& tags = attributes[0]->editTags();
        const std::vector<zvdb::Tag> group = {{102, database->store("{ACAD_REACTORS")},
                                              {2, database->store("OUTRO")},
                                              {1, database->store("99")},
                                              {10, database->store("150.0")},
                                              {20, database->store("190.0")},
                                              {102, database->store("}")}};
        tags.insert(tags.begin() + 2, group.begin(), group.end());
    }
    EXPECT_EQ(attributes[0]->tag(), "LIGACAO1");
    EXPECT_EQ(entries(),
              "((\"" + h + "#13#NA-1\" 150.0 200.0 0.0) (\"" + h + "#14#NA-1\" 150.0 190.0 0.0))");
    // a new value, a new position, a tag that is no connection, an erased attribute
    attributes[0]->setTextValue("A1");
    EXPECT_EQ(entries(),
              "((\"" + h + "#A1#NA-1\" 150.0 200.0 0.0) (\"" + h + "#14#NA-1\" 150.0 190.0 0.0))");
    attributes[1]->setPosition({150, 195, 0});
    EXPECT_EQ(entries(),
              "((\"" + h + "#A1#NA-1\" 150.0 200.0 0.0) (\"" + h + "##NA-1\" 150.0 190.0 0.0))");
    attributes[0]->setTag("BORNE");
    attributes[1]->erase();
    EXPECT_EQ(entries(),
              "((\"" + h + "##NA-1\" 150.0 200.0 0.0) (\"" + h + "##NA-1\" 150.0 190.0 0.0))");
}

// The points of the connections and the vertices of the wires are the reals the drawing
// reads, however their texts are written.
TEST_F(ConnectionsTest, PointsAreTheRealsTheDrawingReadsOfAnyText) {
    auto* element = contact("ESQ$0001$A", {150, 200, 0});
    auto* line = wire("ESQ$0001$A", {{150, 200, 0}, {150, 190, 0}}, "601");
    zvdb::Attribute* attribute = element->attributes()[0];
    const auto setText = [this](zvdb::DbObject& object, int code, const char* text) {
        for (zvdb::Tag& tag : object.editTags())
            if (tag.code == code) {
                tag.value = database->store(text);
                return;
            }
    };
    // an x, a z and a wire's y, each spelled in many ways
    const std::vector<std::array<const char*, 3>> texts = {
        {"150", "0", "200"},
        {"150.0", "0.0", "200.0"},
        {"150.0625", "-0.0", "199.9375"},
        {"+150.0", "+0.0", "+200.0"},
        {" 150.0", " 0.0", " 200.0"},
        {"150.0 ", "0.0 ", "200.0\r"},
        {"150.", "0.", "200."},
        {"0150.000", ".0", "0200.0"},
        {"150.00000000000001", "0.00000000000000001", "200.00000000000001"},
        {"150000000000000e-12", "1e-300", "2e2"},
        {"150.0x", "-", "200.0abc"},
    };
    for (const auto& [x, z, y] : texts) {
        SCOPED_TRACE(std::string(x) + "|" + z + "|" + y);
        setText(*attribute, 10, x);
        setText(*attribute, 30, z);
        setText(*line, 20, y);
        const ConnectionFinder finder(*database, 1.0);
        const std::vector<WireConnections> wires = finder.wires();
        ASSERT_EQ(wires.size(), 1u);
        const zvdb::Point3 read = attribute->position();
        int found = 0;
        for (const Touch& touch : wires[0].touches) {
            if (touch.connection != "13") continue;
            ++found;
            EXPECT_EQ(touch.point.x, read.x);
            EXPECT_EQ(touch.point.z, read.z);
            EXPECT_EQ(std::signbit(touch.point.z), std::signbit(read.z));
        }
        EXPECT_EQ(found, 1);
        WireLayerIndex::VerticesByLayer byLayer;
        finder.wiresAndLeadsByLayer(&byLayer);
        const std::span<const zvdb::Point3> walked = byLayer.at("ESQ$0001$A").of(0);
        ASSERT_FALSE(walked.empty());
        EXPECT_EQ(walked[0].y, line->vertices()[0].y);
        EXPECT_EQ(std::signbit(walked[0].y), std::signbit(line->vertices()[0].y));
    }
}

TEST_F(ConnectionsTest, AWiresElevationIsTheZOfItsVertices) {
    auto* high = terminal("ESQ$0001$A", {100, 200, 5}, "X1", "1");
    terminal("ESQ$0001$A", {200, 200, 0}, "X1", "2");
    auto* line = wire("ESQ$0001$A", {{100, 200, 0}, {200, 200, 0}}, "701");
    line->setReal(38, 5.0, "AcDbPolyline");
    // a group of another application names a 38 of its own before the polyline's
    auto& tags = line->editTags();
    const std::vector<zvdb::Tag> group = {{102, database->store("{ACAD_REACTORS")},
                                          {38, database->store("7.5")},
                                          {102, database->store("}")}};
    tags.insert(tags.begin() + 2, group.begin(), group.end());
    ASSERT_EQ(line->vertices().front().z, 5.0);
    EXPECT_EQ(show("(cdr (car (getConexoesTodosFios)))"),
              "((\"" + hex(high) + "##BORNE_1\" 100.0 200.0 5.0))");
    line->setReal(38, 0.0, "AcDbPolyline");
    EXPECT_EQ(show("(length (cdr (car (getConexoesTodosFios))))"), "1");
    EXPECT_EQ(show("(cadr (car (cdr (car (getConexoesTodosFios)))))"), "200.0");
}

// A wire's layer, vertices, elevation and number come from its own tags, whatever the lines
// read before it hold.
TEST_F(ConnectionsTest, EachWireIsReadFromItsOwnTags) {
    auto* first = terminal("ESQ$0001$A", {100, 200, 0}, "X1", "1");
    auto* high = terminal("ESQ$0001$A", {300, 200, 5}, "X1", "2");
    auto* other = terminal("ESQ$0001$A", {500, 200, 0}, "X1", "3");
    wire("ESQ$0001$A", {{50, 200, 0}, {100, 200, 0}}, "901");
    auto* raised = wire("ESQ$0001$A", {{300, 200, 0}, {350, 200, 0}}, "902");
    raised->setReal(38, 5.0, "AcDbPolyline");
    {
        // a group of another application with a layer of its own before the polyline's, and
        // a stray y before its first vertex
        auto& tags = raised->editTags();
        const std::vector<zvdb::Tag> group = {{102, database->store("{ACAD_REACTORS")},
                                              {8, database->store("ESQ$0002$A")},
                                              {102, database->store("}")}};
        tags.insert(tags.begin() + 2, group.begin(), group.end());
        const auto vertex = std::find_if(tags.begin(), tags.end(),
                                         [](const zvdb::Tag& tag) { return tag.code == 10; });
        tags.insert(vertex, {20, database->store("999.0")});
    }
    ASSERT_EQ(raised->layer(), "ESQ$0001$A");
    // a second group of the wires' application after another one: the first tells the number
    auto* twice = wire("ESQ$0001$A", {{500, 200, 0}, {550, 200, 0}}, "903");
    twice->addXData("KVR_ZV_ATT_VIRTUAL", zvsample::XDataItems().text("CABO\fW9\fN").tags());
    twice->addXData("KVR_ZV_WIRE",
                    zvsample::XDataItems().text("10006\f1").text("1").text("FIO\f904").tags());
    EXPECT_EQ(show("(getConexoesTodosFios)"),
              "((\"901\" (\"" + hex(first) + "##BORNE_1\" 100.0 200.0 0.0)) (\"902\" (\"" +
                  hex(high) + "##BORNE_1\" 300.0 200.0 5.0)) (\"903\" (\"" + hex(other) +
                  "##BORNE_1\" 500.0 200.0 0.0)))");
    // the table the module reads holds the same touches
    const ConnectionFinder finder(*database, 0.1);
    const ConnectionTable table = finder.wireTable();
    EXPECT_EQ(table.numbers, (std::vector<std::string_view>{"901", "902", "903"}));
    EXPECT_EQ(table.ends, (std::vector<std::uint32_t>{1, 2, 3}));
    ASSERT_EQ(table.entries.size(), 3u);
    const zvdb::DbObject* expected[] = {first, high, other};
    for (std::size_t k = 0; k < 3; ++k) {
        EXPECT_EQ(table.touch(k).symbol, expected[k]->handle()) << k;
        EXPECT_EQ(table.touch(k).block, "BORNE_1") << k;
    }
    EXPECT_EQ(table.touch(1).point, (zvdb::Point3{300, 200, 5}));
}

// Two connections of a symbol in one cell of the index, as near to a vertex as each other:
// the touch is at the one whose attribute comes first.
TEST_F(ConnectionsTest, EquallyNearConnectionsOfASymbolTouchByTheOrderOfItsAttributes) {
    auto* ab = twoPoint("NA-1", "ESQ$0001$A", {100, 200, 0});
    ab->addAttribute("LIGACAO1", "13", {100, 200, 0}, 2.5);
    ab->addAttribute("LIGACAO2", "14", {100.125, 200, 0}, 2.5);
    auto* ba = twoPoint("NA-1", "ESQ$0001$A", {100, 300, 0});
    ba->addAttribute("LIGACAO2", "14", {100.125, 300, 0}, 2.5);
    ba->addAttribute("LIGACAO1", "13", {100, 300, 0}, 2.5);
    wire("ESQ$0001$A", {{100.0625, 200, 0}, {50, 200, 0}}, "501");
    wire("ESQ$0001$A", {{100.0625, 300, 0}, {50, 300, 0}}, "502");
    EXPECT_EQ(show("(mapcar 'cadr (getConexoesTodosFios))"),
              "((\"" + hex(ab) + "#13#NA-1\" 100.0 200.0 0.0) (\"" + hex(ba) +
                  "#14#NA-1\" 100.125 300.0 0.0))");
}

// One wire ends where the next one starts, on a terminal: each touches it, in the answer
// as much as in the table the module reads.
TEST_F(ConnectionsTest, TwoWiresOnOnePointOfASymbolEachTouchIt) {
    auto* shared = terminal("ESQ$0001$A", {100, 200, 0}, "X1", "1");
    wire("ESQ$0001$A", {{0, 200, 0}, {100, 200, 0}}, "601");
    wire("ESQ$0001$A", {{100, 200, 0}, {200, 200, 0}}, "602");
    const std::string entry = "(\"" + hex(shared) + "##BORNE_1\" 100.0 200.0 0.0)";
    EXPECT_EQ(show("(getConexoesTodosFios)"), "((\"601\" " + entry + ") (\"602\" " + entry + "))");
    const ConnectionFinder finder(*database, 0.1);
    const ConnectionTable table = finder.wireTable();
    EXPECT_EQ(table.ends, (std::vector<std::uint32_t>{1, 2}));
    ASSERT_EQ(table.entries.size(), 2u);
    EXPECT_EQ(table.touch(1).symbol, shared->handle());
}

TEST_F(ConnectionsTest, TouchesAcrossTheIndexsCellsAndAtTheToleranceItself) {
    // the index's cells are one unit wide: each vertex here is in another cell than its
    // terminal, the last one exactly the tolerance away from it
    auto* a = terminal("ESQ$0001$A", {99.95, 200, 0}, "X1", "1");
    auto* b = terminal("ESQ$0001$A", {0.04, 300, 0}, "X1", "2");
    auto* c = terminal("ESQ$0001$A", {200, 400, 0}, "X1", "3");
    terminal("ESQ$0001$A", {300.12, 500, 0}, "X1", "4");  // beyond the tolerance
    wire("ESQ$0001$A", {{100.04, 200, 0}, {-0.05, 300, 0}, {199.9, 400, 0}, {300, 500, 0}}, "801");
    EXPECT_EQ(
        show("(mapcar 'car (cdr (car (getConexoesTodosFios))))"),
        "(\"" + hex(a) + "##BORNE_1\" \"" + hex(b) + "##BORNE_1\" \"" + hex(c) + "##BORNE_1\")");
}

TEST_F(ConnectionsTest, ProjectCheckFindsDuplicateTerminalsAndOpenWires) {
    terminal("ESQ$0001$A", {100, 200, 0}, "X1", "1");
    terminal("ESQ$0001$A", {200, 200, 0}, "X1", "2");
    wire("ESQ$0001$A", {{100, 190, 0}, {200, 200, 0}}, "301");
    EXPECT_EQ(show("(zvBuild)"), "T");
    EXPECT_TRUE(printed.isEmpty()) << printed.toStdString();
    terminal("ESQ$0002$A", {100, 200, 0}, "X1", "2");
    wire("ESQ$0002$A", {{100, 190, 0}, {50, 50, 0}}, "302");
    EXPECT_EQ(show("(zvBuild)"), "nil");
    EXPECT_TRUE(printed.contains("Terminal X1:2 stands twice")) << printed.toStdString();
    EXPECT_TRUE(printed.contains("Wire 302 has only one end")) << printed.toStdString();
    EXPECT_FALSE(printed.contains("Wire 301")) << printed.toStdString();
}

}  // namespace
}  // namespace zvproduct::testing
