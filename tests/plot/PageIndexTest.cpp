// What shows follows every change of the layers' states and of the entities, however it is
// made, while the index only follows the layers that were edited.
#include "drawing/BlockRecord.h"
#include "drawing/Database.h"
#include "drawing/Entity.h"
#include "drawing/Extents.h"
#include "drawing/LayerRecord.h"
#include "drawing/SymbolTable.h"
#include "plot/PageIndex.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace {

using zvdb::Point3;

class PageIndexTest : public ::testing::Test {
protected:
    static std::string pageName(int i) { return std::string(1, 'P') + char('0' + i); }
    void SetUp() override {
        for (int i = 0; i < 6; ++i) {
            const std::string name = pageName(i);
            db.createLayer(name);
            lines.push_back(db.modelSpace()->addLine({10.0 * i, 0, 0}, {10.0 * i + 5, 3, 0}, name));
        }
        // An entity on a layer the table does not know always shows.
        lines.push_back(db.modelSpace()->addLine({-7, -7, 0}, {-6, -6, 0}, "NO_RECORD"));
    }

    // What shows, worked out from the drawing alone.
    std::vector<zvdb::Entity*> expected() const {
        std::vector<zvdb::Entity*> out;
        for (zvdb::Entity* entity : db.modelSpace()->entities()) {
            if (entity->isErased()) continue;
            const zvdb::LayerRecord* layer = db.layer(entity->layer());
            if (!layer || (!layer->isFrozen() && !layer->isOff())) out.push_back(entity);
        }
        return out;
    }
    static zvdb::BoundingBox boundsOf(const std::vector<zvdb::Entity*>& entities) {
        zvdb::BoundingBox box;
        for (const zvdb::Entity* entity : entities)
            box.add(zvdb::Extents::ofEntity(*entity, true));
        return box;
    }
    void expectAsDrawing(const zvplot::PageIndex& index, const char* step) {
        SCOPED_TRACE(step);
        ASSERT_TRUE(index.matches(db));
        const std::vector<zvdb::Entity*> shown = expected();
        EXPECT_EQ(index.visibleEntities(), shown);
        const zvdb::BoundingBox want = boundsOf(shown), got = index.visibleBounds();
        EXPECT_EQ(got.isEmpty(), want.isEmpty());
        if (want.isEmpty()) return;
        EXPECT_DOUBLE_EQ(got.min.x, want.min.x);
        EXPECT_DOUBLE_EQ(got.min.y, want.min.y);
        EXPECT_DOUBLE_EQ(got.max.x, want.max.x);
        EXPECT_DOUBLE_EQ(got.max.y, want.max.y);
    }
    void freezeAllBut(int page) {
        for (int i = 0; i < 6; ++i)
            db.layer(pageName(i))->setFrozen(i != page);
    }

    zvdb::Database db;
    std::vector<zvdb::Entity*> lines;
};

TEST_F(PageIndexTest, FollowsLayerStatesHoweverTheyChange) {
    const zvplot::PageIndex index(db);
    expectAsDrawing(index, "all thawed");
    // Pages shown one after the other, and shown again: the same sets come back.
    for (int page : {2, 4, 2, 0, 4}) {
        freezeAllBut(page);
        expectAsDrawing(index, page == 0 ? "page 0" : page == 2 ? "page 2" : "page 4");
    }
    // A layer turned off by its colour, and the flags written as tags, as LISP would.
    db.layer("P4")->setOff(true);
    expectAsDrawing(index, "off");
    db.layer("P1")->setInteger(70, 0);
    db.layer("P4")->setInteger(62, 3);
    expectAsDrawing(index, "tags");
    // A layer record erased: its entities show as those of a layer the table lacks.
    db.layer("P3")->erase();
    expectAsDrawing(index, "erased");
}

TEST_F(PageIndexTest, ARenamedLayerIsReadAgainWhole) {
    const zvplot::PageIndex index(db);
    freezeAllBut(1);
    expectAsDrawing(index, "page 1");
    // P2 (frozen) takes the name of the record-less layer, whose line now hides with it.
    zvdb::LayerRecord* renamed = db.layer("P2");
    renamed->setText(2, "NO_RECORD");
    db.table("LAYER")->reindex();
    expectAsDrawing(index, "renamed");
    renamed->setFrozen(false);
    expectAsDrawing(index, "thawed under its new name");
}

TEST_F(PageIndexTest, BoundsFollowEntitiesChangedBetweenTwoShowingsOfAPage) {
    const zvplot::PageIndex index(db);
    freezeAllBut(5);
    expectAsDrawing(index, "page 5");
    freezeAllBut(0);
    expectAsDrawing(index, "page 0");
    // The line of page 5 moves while page 0 shows; page 5 shows again.
    lines[5]->setPoint(11, {90, 40, 0});
    freezeAllBut(5);
    expectAsDrawing(index, "page 5 after the move");
    EXPECT_DOUBLE_EQ(index.visibleBounds().max.y, 40);
    // An entity erased leaves the bounds it made.
    lines[6]->erase();
    expectAsDrawing(index, "record-less line erased");
}

TEST_F(PageIndexTest, ALongRunOfLayerEditsIsFollowed) {
    const zvplot::PageIndex index(db);
    expectAsDrawing(index, "start");
    // More edits than the drawing keeps in its log between two looks.
    for (int i = 0; i < 5000; ++i)
        freezeAllBut(i % 6);
    expectAsDrawing(index, "after the long run");
    freezeAllBut(3);
    expectAsDrawing(index, "page 3");
}

TEST(DatabaseLayerEdits, LayerEditsChangeTheDrawingButNotItsShapes) {
    zvdb::Database db;
    zvdb::LayerRecord* layer = db.createLayer("A");
    zvdb::Entity* line = db.modelSpace()->addLine({0, 0, 0}, {1, 1, 0}, "A");
    const std::uint64_t changes = db.changeCount(), shapes = db.shapeCount();
    const std::size_t logged = db.layerEdits().size();
    layer->setFrozen(true);
    EXPECT_NE(db.changeCount(), changes);
    EXPECT_EQ(db.shapeCount(), shapes);
    ASSERT_EQ(db.layerEdits().size(), logged + 1);
    EXPECT_EQ(db.layerEdits().back(), layer);
    line->setColor(3);
    EXPECT_NE(db.shapeCount(), shapes);
    EXPECT_EQ(db.layerEdits().size(), logged + 1);
}

}  // namespace
