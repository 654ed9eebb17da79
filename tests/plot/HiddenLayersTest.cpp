// The hidden layers a zoom takes follow every change of the layers however it is made, and a
// set taken earlier keeps what it said.
#include "drawing/Database.h"
#include "drawing/LayerRecord.h"
#include "drawing/SymbolTable.h"
#include "drawing/TagValues.h"
#include "plot/HiddenLayers.h"

#include <gtest/gtest.h>

#include <string>

namespace {

using Names = zvplot::HiddenLayers::Names;

class HiddenLayersTest : public ::testing::Test {
protected:
    void SetUp() override {
        for (int i = 0; i < 6; ++i)
            db.createLayer(page(i));
    }
    static std::string page(int i) {
        std::string name(1, 'p');
        name.push_back(char('0' + i));
        return name;
    }
    // What is hidden, from the whole table.
    Names expected() const {
        Names names;
        for (const zvdb::LayerRecord* record : db.layers())
            if (record->isFrozen() || record->isOff())
                names.insert(zvdb::TagValues::upperName(record->name()));
        return names;
    }
    void expectAsDrawing(const char* when) { EXPECT_EQ(*hidden.now(db), expected()) << when; }
    void freezeAllBut(int shown) {
        for (int i = 0; i < 6; ++i)
            if (zvdb::LayerRecord* layer = db.layer(page(i))) layer->setFrozen(i != shown);
    }

    zvdb::Database db;
    zvplot::HiddenLayers hidden;
};

TEST_F(HiddenLayersTest, FollowsEveryWayALayerChanges) {
    expectAsDrawing("start");
    for (int shown : {2, 4, 2, 0})
        freezeAllBut(shown), expectAsDrawing("page shown");
    db.layer("P4")->setOff(true);
    expectAsDrawing("off by its colour");
    db.layer("P1")->setInteger(70, 0);
    db.layer("P4")->setInteger(62, 3);
    expectAsDrawing("flags written as tags");
    db.layer("P3")->erase();
    db.table("LAYER")->reindex();
    expectAsDrawing("erased");
    zvdb::LayerRecord* renamed = db.layer("P2");
    renamed->setText(2, "Other");
    db.table("LAYER")->reindex();
    expectAsDrawing("renamed");
    renamed->setFrozen(false);
    expectAsDrawing("thawed under its new name");
    db.createLayer("NEW")->setFrozen(true);
    expectAsDrawing("a record added");
    for (int i = 0; i < 5000; ++i)
        freezeAllBut(i % 6);
    expectAsDrawing("more edits than the log keeps");
}

TEST_F(HiddenLayersTest, ASetTakenEarlierKeepsWhatItSaid) {
    freezeAllBut(1);
    const auto first = hidden.now(db);
    const Names then = expected();
    freezeAllBut(5);
    const auto second = hidden.now(db);
    EXPECT_EQ(*first, then);
    EXPECT_EQ(*second, expected());
    EXPECT_NE(*first, *second);
    // Nothing changed: the same set again.
    EXPECT_EQ(hidden.now(db), second);
}

}  // namespace
