// The undo journal: whole steps, taken back and put back on the same database object.
#include "drawing/BlockRecord.h"
#include "drawing/Database.h"
#include "drawing/DxfWriter.h"
#include "drawing/Entity.h"
#include "drawing/LayerRecord.h"
#include "drawing/UndoJournal.h"

#include <gtest/gtest.h>

namespace {

using namespace zvdb;

std::string text(Database& db) {
    return DxfWriter::toText(db);
}

// What a list run does: pages, entities on them, a changed layer state.
void runSomething(Database& db, const char* page) {
    db.createLayer(page);
    db.modelSpace()->addLine({0, 0, 0}, {10, 5, 0}, page);
    db.layer("0")->setFrozen(false);
    db.setCurrentLayer(page);
}

TEST(UndoJournal, AStepIsTakenBackAndPutBackExactly) {
    Database db;
    db.createLayer("ESQ$0001$A");
    const std::uint64_t kept = db.modelSpace()->addLine({1, 1, 0}, {2, 2, 0})->handle();
    UndoJournal journal;
    const std::string before = text(db);

    journal.beginGroup(db);
    runSomething(db, "LISTAS$0001$A");
    db.entityByHandle(kept)->erase();
    journal.endGroup(db);
    const std::string after = text(db);
    ASSERT_NE(before, after);
    EXPECT_TRUE(journal.canUndo());
    EXPECT_FALSE(journal.canRedo());

    const std::uint64_t changes = db.changeCount();
    ASSERT_TRUE(journal.undo(db));
    EXPECT_EQ(text(db), before);
    EXPECT_NE(db.changeCount(), changes) << "what was worked out from the drawing is stale";
    EXPECT_EQ(db.layer("LISTAS$0001$A"), nullptr);
    ASSERT_NE(db.entityByHandle(kept), nullptr) << "the erased line is back";
    EXPECT_EQ(&db.entityByHandle(kept)->database(), &db);
    EXPECT_FALSE(journal.canUndo());
    EXPECT_TRUE(journal.canRedo());

    ASSERT_TRUE(journal.redo(db));
    EXPECT_EQ(text(db), after);
    EXPECT_EQ(db.entityByHandle(kept), nullptr);
    EXPECT_TRUE(journal.canUndo());
    EXPECT_FALSE(journal.redo(db)) << "nothing more to put back";
}

TEST(UndoJournal, NestedGroupsMakeOneStepAndAnUnchangedGroupNone) {
    Database db;
    UndoJournal journal;
    journal.beginGroup(db);
    journal.endGroup(db);
    EXPECT_FALSE(journal.canUndo()) << "nothing changed";

    journal.beginGroup(db);
    runSomething(db, "A$0001$A");
    journal.beginGroup(db);
    runSomething(db, "B$0001$A");
    journal.endGroup(db);
    EXPECT_FALSE(journal.canUndo()) << "no undo while the outer group is open";
    EXPECT_FALSE(journal.undo(db));
    journal.endGroup(db);
    EXPECT_EQ(journal.undoSteps(), 1u);
    ASSERT_TRUE(journal.undo(db));
    EXPECT_EQ(db.layer("A$0001$A"), nullptr);
    EXPECT_EQ(db.layer("B$0001$A"), nullptr);
    journal.endGroup(db);  // one end too many changes nothing
    EXPECT_TRUE(journal.canRedo());
}

TEST(UndoJournal, ANewStepDropsWhatWasUndoneAndTheOldestStepsGo) {
    Database db;
    UndoJournal journal(2);
    for (const char* page : {"A$0001$A", "B$0001$A", "C$0001$A"}) {
        journal.beginGroup(db);
        runSomething(db, page);
        journal.endGroup(db);
    }
    EXPECT_EQ(journal.undoSteps(), 2u) << "the first step was dropped";
    ASSERT_TRUE(journal.undo(db));
    ASSERT_TRUE(journal.undo(db));
    EXPECT_FALSE(journal.undo(db));
    EXPECT_NE(db.layer("A$0001$A"), nullptr) << "the dropped step stays done";
    EXPECT_EQ(db.layer("B$0001$A"), nullptr);

    journal.beginGroup(db);
    runSomething(db, "D$0001$A");
    journal.endGroup(db);
    EXPECT_FALSE(journal.canRedo());
    EXPECT_EQ(journal.undoSteps(), 1u);
}

TEST(UndoJournal, AfterUndoNewObjectsTakeFreshHandles) {
    Database db;
    UndoJournal journal;
    journal.beginGroup(db);
    const std::uint64_t undone = db.modelSpace()->addLine({0, 0, 0}, {1, 0, 0})->handle();
    journal.endGroup(db);
    ASSERT_TRUE(journal.undo(db));
    Entity* line = db.modelSpace()->addLine({0, 0, 0}, {0, 1, 0});
    EXPECT_NE(line, nullptr);
    EXPECT_EQ(&line->database(), &db);
    EXPECT_EQ(db.entityByHandle(line->handle()), line);
    EXPECT_GE(line->handle(), undone) << "handles are never taken below the seed";
    EXPECT_EQ(db.modelSpace()->entityCount(), 1u);
}

}  // namespace
