// The wires' and cables' answers come from one index of the drawing: the second of a pair
// of calls may be served from the first, but never past a change of the drawing, of the
// tolerance or of the drawing itself.
#include "ProductFixture.h"

#include "product/ConnectionAnswers.h"
#include "sample/ProjectGenerator.h"

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
