// The wires' and cables' answers come from one index of the drawing: the second of a pair
// of calls may be served from the first, but never past a change of the drawing, of the
// tolerance or of the drawing itself.
#include "ProductFixture.h"

#include "drawing/BlockRecord.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "drawing/Polyline.h"
#include "product/ConnectionAnswers.h"
#include "sample/ProjectGenerator.h"

#include <typeinfo>

namespace zvproduct::testing {
namespace {

// Numbers, touches and points of an answer, one line each.
std::string summary(const std::vector<WireConnections>& answer) {
    std::string text;
    for (const WireConnections& wire : answer) {
        text += wire.number;
        text += ':';
        for (const Touch& touch : wire.touches) {
            text += ' ';
            text += std::to_string(touch.symbol);
            text += '#';
            text += touch.connection;
            text += '#';
            text += touch.block;
            text += '@';
            text += std::to_string(touch.point.x);
            text += ',';
            text += std::to_string(touch.point.y);
        }
        text += '\n';
    }
    return text;
}

class ConnectionAnswersTest : public ProductFixture {
protected:
    ConnectionAnswersTest() {
        addGroup("ESQ", 4, {"ESQ$0001$A", "ESQ$0002$A"});
        near = terminal("ESQ$0001$A", {100, 100, 0}, "X2", "1");
        far = terminal("ESQ$0001$A", {300, 100, 0}, "X2", "2");
        line = wire("ESQ$0001$A", {{100, 100, 0}, {300, 100, 0}}, "101");
        const std::string path[] = {"ZV_CABOS"};
        auto* cable = database->dictionaryAt(path, true)->getOrCreateXRecord("W1");
        cable->setData(zvsample::XDataItems().add(1, "W1").tags());
        cable->setXData("KVR_ZV_ATT_VIRTUAL", zvsample::XDataItems().text("CABO\fW1\fN").tags());
        lead = database->modelSpace()->addLwPolyline({{100, 90, 0}, {300, 90, 0}}, false,
                                                     "ESQ$0001$A");
        lead->setXData("KVR_ZV_CABO",
                       zvsample::XDataItems().text("20001\f1").handle(cable->handle()).tags());
    }

    zvdb::BlockReference* near = nullptr;
    zvdb::BlockReference* far = nullptr;
    zvdb::Polyline* line = nullptr;
    zvdb::Polyline* lead = nullptr;
    ConnectionAnswers answers;
};

TEST_F(ConnectionAnswersTest, TheSecondCallSeesWhatChangedAfterTheFirst) {
    using Kind = ConnectionAnswers::Kind;
    auto touches = [&](Kind kind, double tolerance = 0.1) {
        const auto answer = answers.answer(*database, tolerance, kind);
        return answer.empty() ? -1 : static_cast<int>(answer.front().touches.size());
    };
    const std::string cables = summary(answers.answer(*database, 0.1, Kind::Cables));
    EXPECT_EQ(touches(Kind::Cables), 2);
    // the wires first, then the lead's far end moved off the terminal
    EXPECT_EQ(touches(Kind::Wires), 2);
    lead->setVertices({{100, 90, 0}, {250, 90, 0}});
    EXPECT_EQ(touches(Kind::Cables), 1);
    // the cables first, then the wire erased
    touches(Kind::Cables);
    line->erase();
    EXPECT_EQ(touches(Kind::Wires), -1);
    // and the other way round: a wire drawn after the cables were asked
    lead->setVertices({{100, 90, 0}, {300, 90, 0}});
    touches(Kind::Cables);
    wire("ESQ$0001$A", {{100, 100, 0}, {200, 150, 0}, {300, 100, 0}}, "102");
    EXPECT_EQ(answers.answer(*database, 0.1, Kind::Wires).front().number, "102");
    EXPECT_EQ(summary(answers.answer(*database, 0.1, Kind::Cables)), cables);
    // a changed tolerance is worked out again
    line = wire("ESQ$0001$A", {{100, 100.2, 0}, {300, 100, 0}}, "101");  // 0.2 off
    touches(Kind::Cables, 0.1);
    EXPECT_EQ(summary(answers.answer(*database, 0.5, Kind::Wires)),
              summary(ConnectionFinder(*database, 0.5).wires()));
    touches(Kind::Cables, 0.5);
    EXPECT_EQ(summary(answers.answer(*database, 0.1, Kind::Wires)),
              summary(ConnectionFinder(*database, 0.1).wires()));
    EXPECT_NE(summary(ConnectionFinder(*database, 0.1).wires()),
              summary(ConnectionFinder(*database, 0.5).wires()));
}

TEST_F(ConnectionAnswersTest, AnAnswerServedFromTheFirstCallIsTheOneWorkedOutAlone) {
    using Kind = ConnectionAnswers::Kind;
    const std::string wiresAlone = summary(ConnectionFinder(*database, 0.1).wires());
    const std::string cablesAlone = summary(ConnectionFinder(*database, 0.1).cables());
    EXPECT_EQ(summary(answers.answer(*database, 0.1, Kind::Wires)), wiresAlone);
    EXPECT_EQ(summary(answers.answer(*database, 0.1, Kind::Cables)), cablesAlone);
    EXPECT_EQ(summary(answers.answer(*database, 0.1, Kind::Cables)), cablesAlone);
    EXPECT_EQ(summary(answers.answer(*database, 0.1, Kind::Wires)), wiresAlone);
    EXPECT_NE(wiresAlone, cablesAlone);
    const std::string h = std::to_string(far->handle());
    EXPECT_NE(wiresAlone.find(h + "##BORNE_1"), std::string::npos) << wiresAlone;
    // the LISP functions answer alike, one kind at a time
    EXPECT_EQ(show("(length (cdr (car (getConexoesTodosFios))))"), "2");
    EXPECT_EQ(show("(length (cdr (car (getConexoesTodosCabos))))"), "2");
}

TEST_F(ConnectionAnswersTest, TheIndexIsKeptForOneMoreCallOfTheSameDrawing) {
    using Kind = ConnectionAnswers::Kind;
    const std::string wiresAlone = summary(ConnectionFinder(*database, 0.1).wires());
    const std::string cablesAlone = summary(ConnectionFinder(*database, 0.1).cables());
    EXPECT_FALSE(answers.keepsIndex());
    answers.answer(*database, 0.1, Kind::Wires);
    EXPECT_TRUE(answers.keepsIndex());
    // the second call of a pair takes it and keeps nothing
    EXPECT_EQ(summary(answers.answer(*database, 0.1, Kind::Cables)), cablesAlone);
    EXPECT_FALSE(answers.keepsIndex());
    // a call that keeps nothing leaves nothing, and drops what was kept
    answers.answer(*database, 0.1, Kind::Wires);
    EXPECT_EQ(summary(answers.answer(*database, 0.1, Kind::Wires, false)), wiresAlone);
    EXPECT_FALSE(answers.keepsIndex());
    // a kept index of a changed drawing is not used: the new one is kept in its place
    answers.answer(*database, 0.1, Kind::Cables);
    far->setPosition({300, 90, 0});
    const std::string moved = summary(answers.answer(*database, 0.1, Kind::Wires));
    EXPECT_NE(moved, wiresAlone);
    EXPECT_EQ(moved, summary(ConnectionFinder(*database, 0.1).wires()));
    EXPECT_TRUE(answers.keepsIndex());
    EXPECT_EQ(summary(answers.answer(*database, 0.1, Kind::Cables)),
              summary(ConnectionFinder(*database, 0.1).cables()));
}

TEST_F(ConnectionAnswersTest, TwoDrawingsAndAnUndoSwapDoNotShareAnswers) {
    zvsample::ProjectGenerator generator({7, 60, 4});
    std::unique_ptr<zvdb::Database> other = generator.generate();
    const std::string otherCables = summary(ConnectionFinder(*other, 0.1).cables());
    const std::string ownCables = summary(ConnectionFinder(*database, 0.1).cables());
    ASSERT_NE(otherCables, ownCables);

    answers.answer(*database, 0.1, ConnectionAnswers::Kind::Wires);
    EXPECT_EQ(summary(answers.answer(*other, 0.1, ConnectionAnswers::Kind::Cables)), otherCables);

    // undo trades the contents of a drawing, the object staying where it is
    answers.answer(*database, 0.1, ConnectionAnswers::Kind::Wires);
    database->swapContents(*other);
    EXPECT_EQ(summary(answers.answer(*database, 0.1, ConnectionAnswers::Kind::Cables)),
              otherCables);
    answers.answer(*database, 0.1, ConnectionAnswers::Kind::Wires);
    database->swapContents(*other);
    EXPECT_EQ(summary(answers.answer(*database, 0.1, ConnectionAnswers::Kind::Cables)), ownCables);
    // unchanged, the kept answer is the one asked for
    answers.answer(*database, 0.1, ConnectionAnswers::Kind::Cables);
    EXPECT_EQ(summary(answers.answer(*database, 0.1, ConnectionAnswers::Kind::Wires)),
              summary(ConnectionFinder(*database, 0.1).wires()));
}

// A table's numbers and touches, one line a wire.
std::string summary(const ConnectionTable& table) {
    std::vector<WireConnections> wires(table.numbers.size());
    std::size_t k = 0;
    for (std::size_t w = 0; w < wires.size(); ++w) {
        wires[w].number = table.numbers[w];
        for (; k < table.ends[w]; ++k)
            wires[w].touches.push_back(table.touch(k));
    }
    return summary(wires);
}

// An index announced ahead is worked out on another thread from a drawing read from its
// file, while nothing changes it.
class PreparedAnswersTest : public ConnectionAnswersTest {
protected:
    using Kind = ConnectionAnswers::Kind;
    PreparedAnswersTest() : drawing(readBack()) {}
    // The generator's drawing as its file reads back: the generator makes patterned objects.
    static std::unique_ptr<zvdb::Database> readBack() {
        const std::unique_ptr<zvdb::Database> made =
            zvsample::ProjectGenerator({7, 60, 4}).generate();
        return zvdb::DxfLoader::load(zvdb::DxfWriter::toText(*made));
    }
    void SetUp() override { ASSERT_FALSE(drawing->hasPatternedObjects()); }

    std::string alone(Kind kind, double tolerance = 0.1) {
        const ConnectionFinder finder(*drawing, tolerance);
        return summary(kind == Kind::Wires ? finder.wires() : finder.cables());
    }
    std::string table(Kind kind, double tolerance = 0.1) {
        std::string text;
        answers.table(*drawing, tolerance, kind, true,
                      [&](const ConnectionTable& made) { text = summary(made); });
        return text;
    }
    zvdb::Polyline* firstWire() {
        zvdb::Polyline* found = nullptr;
        drawing->modelSpace()->forEachEntity([&](zvdb::Entity& entity) {
            if (!found && typeid(entity) == typeid(zvdb::Polyline) &&
                !entity.xdata("KVR_ZV_WIRE").empty())
                found = static_cast<zvdb::Polyline*>(&entity);
        });
        return found;
    }

    std::unique_ptr<zvdb::Database> drawing;
};

TEST_F(PreparedAnswersTest, ThePreparedIndexServesBothCallsWithTheAnswersWorkedOutAlone) {
    const std::string wires = alone(Kind::Wires), cables = alone(Kind::Cables);
    ASSERT_NE(wires, cables);
    for (const bool tables : {false, true}) {
        SCOPED_TRACE(tables ? "tables" : "answers");
        ASSERT_TRUE(answers.prepare(*drawing, 0.1, Kind::Wires));
        EXPECT_TRUE(answers.prepare(*drawing, 0.1, Kind::Cables)) << "one index serves both";
        EXPECT_TRUE(answers.isPrepared());
        EXPECT_FALSE(answers.keepsIndex());
        EXPECT_EQ(tables ? table(Kind::Wires) : summary(answers.answer(*drawing, 0.1, Kind::Wires)),
                  wires);
        EXPECT_FALSE(answers.isPrepared());
        EXPECT_TRUE(answers.keepsIndex()) << "kept for the second call, as one built then";
        EXPECT_EQ(
            tables ? table(Kind::Cables) : summary(answers.answer(*drawing, 0.1, Kind::Cables)),
            cables);
        EXPECT_FALSE(answers.keepsIndex());
    }
    // the tables the thread made ahead are those of the index, given once
    ASSERT_TRUE(answers.prepare(*drawing, 0.1, Kind::Cables));
    EXPECT_EQ(table(Kind::Cables), cables);
    // a kept index of the drawing as it stands serves without another thread
    EXPECT_FALSE(answers.prepare(*drawing, 0.1, Kind::Wires));
    EXPECT_EQ(table(Kind::Cables), cables);
}

// A reader reads the drawing meanwhile as the components' walk does, through the same
// questions; a build with the thread sanitizer checks that the two threads only read.
TEST_F(PreparedAnswersTest, TheDrawingIsReadOnBothThreadsAtOnce) {
    const std::string wires = alone(Kind::Wires), cables = alone(Kind::Cables);
    ASSERT_TRUE(answers.prepare(*drawing, 0.1, Kind::Wires));
    ASSERT_TRUE(answers.prepare(*drawing, 0.1, Kind::Cables));
    std::size_t read = 0;
    for (int pass = 0; pass < 3; ++pass)
        drawing->modelSpace()->forEachEntity([&](zvdb::Entity& entity) {
            read += entity.layer().size() + entity.xdataItems("KVR_ZV").size();
            read += drawing->entityByHandle(entity.handle()) == &entity ? 1 : 0;
            for (zvdb::Entity* sub : entity.subEntities())
                read += sub->text(2).size() + sub->text(1).size();
            if (typeid(entity) == typeid(zvdb::Polyline))
                read += static_cast<zvdb::Polyline&>(entity).vertices().size();
        });
    EXPECT_GT(read, 0u);
    EXPECT_EQ(table(Kind::Wires), wires);
    EXPECT_EQ(table(Kind::Cables), cables);
}

TEST_F(PreparedAnswersTest, AChangeDropsThePreparedIndexAndTheCallSeesTheChange) {
    const std::string before = alone(Kind::Wires);
    ASSERT_TRUE(answers.prepare(*drawing, 0.1, Kind::Wires));
    zvdb::Polyline* wire = firstWire();
    ASSERT_NE(wire, nullptr);
    wire->erase();
    EXPECT_FALSE(answers.isPrepared()) << "the change waited for the thread and dropped it";
    const std::string after = summary(answers.answer(*drawing, 0.1, Kind::Wires));
    EXPECT_NE(after, before);
    EXPECT_EQ(after, alone(Kind::Wires));
}

TEST_F(PreparedAnswersTest, AnotherToleranceOrDrawingIsWorkedOutForTheCall) {
    ASSERT_TRUE(answers.prepare(*drawing, 0.1, Kind::Wires));
    EXPECT_EQ(summary(answers.answer(*drawing, 25.0, Kind::Wires)), alone(Kind::Wires, 25.0));
    ASSERT_NE(alone(Kind::Wires, 25.0), alone(Kind::Wires));
    ASSERT_TRUE(answers.prepare(*drawing, 0.1, Kind::Wires));
    EXPECT_EQ(summary(answers.answer(*database, 0.1, Kind::Wires)),
              summary(ConnectionFinder(*database, 0.1).wires()));
    EXPECT_FALSE(answers.isPrepared());
}

TEST_F(PreparedAnswersTest, ADrawingWhoseReadingChangesItIsNotReadOnAnotherThread) {
    // the fixture's symbols were inserted with attributes made from their layouts
    ASSERT_TRUE(database->hasPatternedObjects());
    EXPECT_FALSE(answers.prepare(*database, 0.1, Kind::Wires));
    EXPECT_FALSE(answers.isPrepared());
}

TEST_F(PreparedAnswersTest, TheDrawingOrTheAnswersMayGoWhileTheThreadWorks) {
    ASSERT_TRUE(answers.prepare(*drawing, 0.1, Kind::Wires));
    drawing.reset();
    EXPECT_FALSE(answers.isPrepared());
    drawing = readBack();
    {
        ConnectionAnswers own;
        ASSERT_TRUE(own.prepare(*drawing, 0.1, Kind::Cables));
    }
    // nothing of the answers that went is left to settle
    zvdb::Polyline* wire = firstWire();
    ASSERT_NE(wire, nullptr);
    wire->erase();
    EXPECT_EQ(summary(answers.answer(*drawing, 0.1, Kind::Cables)), alone(Kind::Cables));
}

TEST_F(ConnectionAnswersTest, EntryTextsInUpperCaseHexadecimalWithTheirDetails) {
    Touch touch{0xabc12f, "13", "NA-1", {}};
    std::string text = "x";
    ConnectionAnswers::appendEntryText(touch, true, text);
    EXPECT_EQ(text, "xABC12F#13#NA-1");
    text.clear();
    ConnectionAnswers::appendEntryText(touch, false, text);
    EXPECT_EQ(text, "ABC12F");
    touch.connection = {};
    text.clear();
    ConnectionAnswers::appendEntryText(touch, true, text);
    EXPECT_EQ(text, "ABC12F##NA-1");
}

}  // namespace
}  // namespace zvproduct::testing
