// The database API that the CAD facade uses: layers, blocks and references, extended data,
// dictionaries, handles, erasing, cloning and extents. Drawings changed through it are
// written and checked by ezdxf (audit and content).
#include "PythonChecker.h"
#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/DeepCloner.h"
#include "drawing/Dictionary.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "drawing/Extents.h"
#include "drawing/LayerRecord.h"
#include "drawing/Polyline.h"
#include "drawing/SymbolTable.h"
#include "drawing/TextEntity.h"
#include "drawing/XRecord.h"

#include <gtest/gtest.h>

#include <QFile>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

using namespace zvdb;
using zvtest::PythonChecker;

namespace {

// Writes the database and answers what ezdxf sees in the file.
QJsonObject inspect(Database& database) {
    const QString path = PythonChecker::scratchFolder() + "/drawing.dxf";
    DxfWriter::saveFile(database, path.toStdString());
    QString output;
    const int status = PythonChecker::run("inspect_dxf.py", {path}, &output);
    EXPECT_EQ(status, 0) << output.toStdString();
    return QJsonDocument::fromJson(output.toUtf8()).object();
}

std::unique_ptr<Database> reloaded(Database& database) {
    return DxfLoader::load(DxfWriter::toText(database));
}

Tag tag(int code, std::string_view value) {
    return Tag{static_cast<std::int16_t>(code), value};
}

class DatabaseApi : public ::testing::Test {
protected:
    void SetUp() override {
        const QString missing = PythonChecker::missing();
        ASSERT_TRUE(missing.isEmpty()) << missing.toStdString();
    }
    Database db;
};

TEST_F(DatabaseApi, NewDrawingIsAnEmptyR2013DrawingThatEzdxfAccepts) {
    EXPECT_EQ(db.version(), "AC1027");
    ASSERT_NE(db.layer("0"), nullptr);
    ASSERT_NE(db.modelSpace(), nullptr);
    ASSERT_NE(db.paperSpace(), nullptr);
    EXPECT_EQ(db.modelSpace()->entityCount(), 0u);
    ASSERT_NE(db.namedObjects(), nullptr);
    EXPECT_NE(db.namedObjects()->getDictionary("ACAD_GROUP"), nullptr);
    const QJsonObject seen = inspect(db);
    EXPECT_EQ(seen["version"].toString(), "AC1027");
    EXPECT_TRUE(seen["modelspace"].toArray().isEmpty());
}

TEST_F(DatabaseApi, LayersKeepTheirStatesAndExtendedData) {
    LayerRecord* page = db.createLayer("PAGE$1");
    EXPECT_EQ(db.createLayer("page$1"), page) << "names are found without regard to case";
    db.createLayer("PAGE$1$SELO")->setFrozen(true);
    db.createLayer("HIDDEN")->setOff(true);
    db.createLayer("LOCKED")->setLocked(true);
    const Tag mark[] = {tag(1000, "CAPA")};
    page->setXData("KVR_ZV_CAPA", mark);
    EXPECT_TRUE(db.isApplicationRegistered("KVR_ZV_CAPA"));
    EXPECT_TRUE(db.setCurrentLayer("PAGE$1"));
    EXPECT_FALSE(db.setCurrentLayer("NO SUCH LAYER"));
    EXPECT_EQ(db.currentLayer(), "PAGE$1");
    EXPECT_TRUE(db.layer("PAGE$1$SELO")->isFrozen());
    db.layer("PAGE$1$SELO")->setFrozen(false);
    EXPECT_FALSE(db.layer("PAGE$1$SELO")->isFrozen());
    db.layer("PAGE$1$SELO")->setFrozen(true);
    EXPECT_TRUE(db.layer("HIDDEN")->isOff());
    db.layer("LOCKED")->erase();
    EXPECT_EQ(db.layer("LOCKED"), nullptr);
    LayerRecord* again = db.createLayer("LOCKED");
    EXPECT_EQ(db.layer("locked"), again) << "an erased name can be used again";
    again->setLocked(true);
    EXPECT_EQ(db.layer("HIDDEN")->color(), 7);

    const QJsonObject layers = inspect(db)["layers"].toObject();
    EXPECT_TRUE(layers["PAGE$1$SELO"].toObject()["frozen"].toBool());
    EXPECT_TRUE(layers["HIDDEN"].toObject()["off"].toBool());
    EXPECT_TRUE(layers["LOCKED"].toObject()["locked"].toBool());
    EXPECT_FALSE(layers["PAGE$1"].toObject()["frozen"].toBool());
    EXPECT_EQ(layers["PAGE$1"]
                  .toObject()["xdata"]
                  .toObject()["KVR_ZV_CAPA"]
                  .toArray()[1]
                  .toArray()[1]
                  .toString(),
              "CAPA");
    std::vector<std::string> names;
    for (LayerRecord* layer : db.layers())
        names.emplace_back(layer->name());
    EXPECT_EQ(names, (std::vector<std::string>{"0", "PAGE$1", "PAGE$1$SELO", "HIDDEN", "LOCKED"}));
}

// A block with two attribute definitions, referenced twice in model space.
BlockReference* insertTerminal(Database& db, const Point3& at, std::string_view number) {
    BlockRecord* block = db.block("BORNE");
    if (!block) {
        block = db.createBlock("BORNE", {1, 1, 0});
        block->addLine({0, 0, 0}, {4, 0, 0});
        block->addAttributeDefinition("REGUA", "Strip", "X1", {0, 2, 0}, 2.5);
        block->addAttributeDefinition("NUMERO", "Number", "", {0, 5, 0}, 2.5);
    }
    BlockReference* reference =
        db.modelSpace()->addBlockReference(*block, at, {2, 2, 1}, 90, "PAGE");
    for (Attribute* definition : block->attributeDefinitions())
        reference->addAttributeFromDefinition(*definition);
    reference->attribute("numero")->setTextValue(number);
    return reference;
}

TEST_F(DatabaseApi, BlockReferencesCarryAttributesFromTheirDefinitions) {
    db.createLayer("PAGE");
    BlockReference* first = insertTerminal(db, {10, 20, 0}, "1");
    insertTerminal(db, {50, 20, 0}, "2");
    ASSERT_EQ(first->attributes().size(), 2u);
    EXPECT_EQ(first->attribute("REGUA")->textValue(), "X1");
    EXPECT_EQ(first->attribute("Numero")->textValue(), "1");
    EXPECT_EQ(first->attribute("NOPE"), nullptr);
    ASSERT_NE(first->seqend(), nullptr);
    EXPECT_EQ(first->attributes()[0]->ownerHandle(), first->handle());
    EXPECT_EQ(first->seqend()->ownerHandle(), first->handle());
    // Block (1,2) lands at base-relative (0,1), scaled by 2, turned by 90 degrees.
    const Point3 p = first->attribute("REGUA")->position();
    EXPECT_NEAR(p.x, 10 - 2, 1e-9);
    EXPECT_NEAR(p.y, 20 - 2, 1e-9);
    EXPECT_EQ(db.block("BORNE")->attributeDefinitions()[0]->prompt(), "Strip");

    const QJsonArray model = inspect(db)["modelspace"].toArray();
    ASSERT_EQ(model.size(), 2);
    const QJsonObject seen = model[0].toObject();
    EXPECT_EQ(seen["name"].toString(), "BORNE");
    EXPECT_EQ(seen["layer"].toString(), "PAGE");
    const QJsonArray attribs = seen["attribs"].toArray();
    ASSERT_EQ(attribs.size(), 2);
    EXPECT_EQ(attribs[0].toArray()[0].toString(), "REGUA");
    EXPECT_EQ(attribs[1].toArray()[1].toString(), "1");
    EXPECT_TRUE(seen["seqend"].toBool());
}

TEST_F(DatabaseApi, ExtendedDataKeepsApplicationsAndRepeatedGroups) {
    Entity* wire = db.modelSpace()->addLwPolyline({{0, 0, 0}, {5, 0, 0}}, false);
    const Tag a[] = {tag(1000, "W1"), tag(1070, "3")};
    const Tag b[] = {tag(1000, "first")};
    const Tag c[] = {tag(1000, "second")};
    wire->setXData("KVR_ZV_WIRE", a);
    wire->setXData("ZV_OTHER", b);
    wire->addXData("ZV_OTHER", c);
    EXPECT_EQ(wire->xdataGroups("zv_other").size(), 2u);
    EXPECT_EQ(wire->xdata("ZV_OTHER")[0].value, "first");
    const Tag replaced[] = {tag(1000, "changed")};
    wire->setXData("ZV_OTHER", replaced);
    ASSERT_EQ(wire->xdataGroups("ZV_OTHER").size(), 2u);
    EXPECT_EQ(wire->xdataGroups("ZV_OTHER")[0][0].value, "changed");
    EXPECT_EQ(wire->xdataGroups("ZV_OTHER")[1][0].value, "second");
    EXPECT_EQ(wire->xdata("KVR_ZV_WIRE").size(), 2u);
    EXPECT_EQ(wire->xdata("MISSING").size(), 0u);
    // The view in place holds the first group only, as xdata() does, and nothing when absent.
    const std::span<const Tag> first = wire->xdataItems("zv_other");
    ASSERT_EQ(first.size(), 1u);
    EXPECT_EQ(first[0].value, "changed");
    EXPECT_EQ(std::vector<Tag>(first.begin(), first.end()), wire->xdata("ZV_OTHER"));
    EXPECT_EQ(wire->xdataItems("KVR_ZV_WIRE").size(), 2u);
    EXPECT_TRUE(wire->xdataItems("MISSING").empty());

    auto again = reloaded(db);
    Entity* read = again->entityByHandle(wire->handle());
    ASSERT_NE(read, nullptr);
    EXPECT_EQ(read->xdataApplications(),
              (std::vector<std::string_view>{"KVR_ZV_WIRE", "ZV_OTHER", "ZV_OTHER"}));
    EXPECT_TRUE(read->removeXData("ZV_OTHER"));
    EXPECT_FALSE(read->hasXData("ZV_OTHER"));
    EXPECT_TRUE(read->hasXData("kvr_zv_wire"));

    const QJsonObject seen = inspect(db);
    const QJsonObject xdata = seen["modelspace"].toArray()[0].toObject()["xdata"].toObject();
    EXPECT_EQ(xdata["KVR_ZV_WIRE"].toArray()[1].toArray()[1].toString(), "W1");
    EXPECT_TRUE(seen["appids"].toArray().contains("ZV_OTHER"));
}

// Extended data given to a new reference or to an object read from a file takes the room
// it needs and no more: a list run gives it to tens of thousands of objects.
TEST_F(DatabaseApi, ExtendedDataLeavesNoSpareRoomBehind) {
    BlockRecord* block = db.createBlock("ROW");
    BlockReference* made = db.modelSpace()->addBlockReference(*block, {1, 2, 0});
    const Tag link[] = {tag(1000, "REP"), tag(1000, "1F"), tag(1000, "*0"), tag(1000, "KEY")};
    made->setXData("KVR_ZV_LINK", link);
    EXPECT_EQ(made->editTags().capacity(), made->tags().size());
    ASSERT_EQ(made->xdata("KVR_ZV_LINK").size(), 4u);
    EXPECT_EQ(made->xdata("KVR_ZV_LINK")[3].value, "KEY");

    auto again = reloaded(db);
    Entity* read = again->entityByHandle(made->handle());
    ASSERT_NE(read, nullptr);
    const std::size_t before = read->tags().size();
    const Tag pair[] = {tag(1000, "REP"), tag(1000, "2A")};
    read->setXData("KVR_ZV_OTHER", pair);
    EXPECT_EQ(read->tags().size(), before + 3);
    EXPECT_EQ(read->editTags().capacity(), read->tags().size());
    // Replaced by a longer group, it grows to that size.
    const Tag longer[] = {tag(1000, "REP"), tag(1000, "2A"), tag(1000, "REP2"), tag(1000, "3B")};
    read->setXData("KVR_ZV_OTHER", longer);
    EXPECT_EQ(read->tags().size(), before + 5);
    EXPECT_EQ(read->editTags().capacity(), read->tags().size());
    EXPECT_EQ(read->xdata("KVR_ZV_LINK").size(), 4u);
    EXPECT_EQ(read->xdata("KVR_ZV_OTHER")[3].value, "3B");
}

TEST_F(DatabaseApi, DictionariesAndXrecordsByPath) {
    const std::vector<std::string> none = {"ZV_DATA_MGR", "CELayoutRotasFios"};
    EXPECT_EQ(db.dictionaryAt(none, false), nullptr);
    Dictionary* cls = db.dictionaryAt(none, true);
    ASSERT_NE(cls, nullptr);
    EXPECT_EQ(db.dictionaryAt(none, false), cls);
    const std::vector<std::string> path = {"ZV_DATA_MGR", "CELayoutRotasFios", "41", "strKeyFio"};
    XRecord* record = db.xrecordAt(path, true);
    ASSERT_NE(record, nullptr);
    const Tag data[] = {tag(1000, "W41")};
    record->setData(data);
    EXPECT_EQ(db.xrecordAt(path, false)->data()[0].value, "W41");
    cls->getOrCreateDictionary("77")->getOrCreateXRecord("strKeyFio");
    EXPECT_EQ(cls->size(), 2u);
    cls->getDictionary("77")->erase();
    EXPECT_EQ(cls->size(), 1u) << "an erased dictionary leaves its parent";
    EXPECT_EQ(cls->get("77"), nullptr);
    // An entry that only points at an object (not its owner) is dropped when it is erased.
    XRecord* shared = cls->getOrCreateXRecord("shared");
    db.namedObjects()->getOrCreateDictionary("OTHER")->setAt("alias", *shared);
    shared->setOwner(cls->handle());
    shared->erase();
    EXPECT_EQ(DxfWriter::toText(db).find("alias"), std::string::npos);

    Entity* line = db.modelSpace()->addLine({0, 0, 0}, {1, 1, 0});
    Dictionary* xdict = line->getOrCreateExtensionDictionary();
    EXPECT_EQ(line->extensionDictionary(), xdict);
    EXPECT_EQ(xdict->ownerHandle(), line->handle());
    xdict->getOrCreateXRecord("NOTE")->setData(data);

    const QJsonObject seen = inspect(db);
    const QJsonObject tree = seen["dictionaries"].toObject()["ZV_DATA_MGR"].toObject();
    const QJsonArray stored =
        tree["CELayoutRotasFios"].toObject()["41"].toObject()["strKeyFio"].toArray();
    ASSERT_EQ(stored.size(), 1);
    EXPECT_EQ(stored[0].toArray()[1].toString(), "W41");
    EXPECT_FALSE(tree["CELayoutRotasFios"].toObject().contains("77"));
    const QJsonObject lineSeen = seen["modelspace"].toArray()[0].toObject();
    EXPECT_TRUE(lineSeen["xdict"].toObject().contains("NOTE"));
}

TEST_F(DatabaseApi, ADictionaryHoldsAHundredThousandEntries) {
    const std::vector<std::string> path = {"ESQ_VIRTUAL_ZV"};
    Dictionary* store = db.dictionaryAt(path, true);
    for (int i = 0; i < 100000; ++i)
        store->getOrCreateXRecord(std::to_string(i));
    EXPECT_EQ(store->size(), 100000u);
    EXPECT_NE(store->getXRecord("99999"), nullptr);
    for (int i = 0; i < 100000; i += 2)
        store->getXRecord(std::to_string(i))->erase();
    EXPECT_EQ(store->size(), 50000u);
    EXPECT_EQ(store->getXRecord("2"), nullptr);
    EXPECT_NE(store->getXRecord("3"), nullptr);
    auto again = reloaded(db);
    EXPECT_EQ(again->dictionaryAt(path, false)->size(), 50000u);
}

TEST_F(DatabaseApi, HandlesAreUniqueStableAndErasedObjectsVanish) {
    db.createLayer("PAGE");
    BlockReference* reference = insertTerminal(db, {0, 0, 0}, "1");
    Entity* line = db.modelSpace()->addLine({0, 0, 0}, {1, 0, 0});
    const std::uint64_t handle = line->handle();
    EXPECT_EQ(db.objectByHandle(handle), line);
    EXPECT_GE(db.handleSeed(), handle + 1);
    Attribute* attribute = reference->attributes()[0];
    const std::uint64_t attributeHandle = attribute->handle();
    reference->erase();
    line->erase();
    EXPECT_EQ(db.objectByHandle(handle), nullptr);
    EXPECT_EQ(db.objectByHandle(attributeHandle), nullptr) << "attributes go with their reference";
    EXPECT_EQ(db.modelSpace()->entityCount(), 0u);

    auto again = reloaded(db);
    EXPECT_EQ(again->modelSpace()->entityCount(), 0u);
    EXPECT_EQ(again->objectByHandle(handle), nullptr);
    EXPECT_GE(again->handleSeed(), db.handleSeed());
    Entity* fresh = again->modelSpace()->addPoint({1, 1, 0});
    EXPECT_GE(fresh->handle(), db.handleSeed()) << "handles are never reused";
}

TEST_F(DatabaseApi, ChangeCountMovesOnEveryChangeAndOnlyThen) {
    Entity* line = db.modelSpace()->addLine({0, 0, 0}, {1, 0, 0});
    std::uint64_t seen = db.changeCount();
    auto changed = [&] {
        const bool moved = db.changeCount() != seen;
        seen = db.changeCount();
        return moved;
    };
    (void)line->layer();
    (void)line->xdata("APP");
    (void)db.modelSpace()->entities();
    EXPECT_FALSE(changed()) << "reading changes nothing";
    line->setXData("APP", std::vector<Tag>{tag(1000, "A")});
    EXPECT_TRUE(changed());
    line->setLayer("OTHER");
    EXPECT_TRUE(changed());
    db.modelSpace()->addPoint({1, 1, 0});
    EXPECT_TRUE(changed());
    line->erase();
    EXPECT_TRUE(changed());
    Database other;
    EXPECT_NE(other.changeCount(), db.changeCount()) << "two drawings never share a count";
}

// What reads the drawing on another thread is settled before anything it reads moves.
TEST_F(DatabaseApi, ASettleRunsOnceBeforeTheNextChangeOrWhenTheDrawingGoes) {
    Entity* line = db.modelSpace()->addLine({0, 0, 0}, {1, 0, 0});
    std::vector<std::string> runs;
    auto settle = [&runs](const char* who) { return [&runs, who] { runs.emplace_back(who); }; };
    const int first = 0, second = 0, dropped = 0;
    db.settleBeforeChange(&first, settle("first"));
    db.settleBeforeChange(&second, settle("old second"));
    db.settleBeforeChange(&second, settle("second"));  // takes the place of the one before
    db.settleBeforeChange(&dropped, settle("dropped"));
    db.forgetSettle(&dropped);
    (void)line->layer();
    (void)db.modelSpace()->entities();
    EXPECT_TRUE(runs.empty()) << "reading settles nothing";
    std::uint64_t countSeen = 0;
    db.settleBeforeChange(&first, [&] {
        runs.emplace_back("first");
        countSeen = db.changeCount();
    });
    const std::uint64_t before = db.changeCount();
    line->setLayer("OTHER");
    EXPECT_EQ(runs, (std::vector<std::string>{"second", "first"}));
    EXPECT_EQ(countSeen, before) << "settled on the drawing as it was";
    line->setLayer("THIRD");
    EXPECT_EQ(runs.size(), 2u) << "once";
    // an erasure and the drawing's end settle too
    db.settleBeforeChange(&first, settle("erase"));
    line->erase();
    auto other = std::make_unique<Database>();
    other->settleBeforeChange(&first, settle("end"));
    other.reset();
    EXPECT_EQ(runs, (std::vector<std::string>{"second", "first", "erase", "end"}));
}

TEST_F(DatabaseApi, SavingChangesNothingAndCountsEachTableAsItStands) {
    const std::uint64_t layersBefore = db.table("LAYER")->size();
    for (const char* name : {"A", "B", "C"})
        db.createLayer(name);
    const std::uint64_t changes = db.changeCount();
    const std::uint64_t shapes = db.shapeCount();
    const std::unique_ptr<Database> again = reloaded(db);
    EXPECT_EQ(db.changeCount(), changes) << "a save is no edit";
    EXPECT_EQ(db.shapeCount(), shapes);
    for (const auto& table : again->tables()) {
        if (!table->head() || !table->head()->has(70)) continue;
        EXPECT_EQ(table->head()->integer(70), static_cast<long long>(table->size()))
            << table->name();
    }
    EXPECT_EQ(again->table("LAYER")->size(), layersBefore + 3);
    EXPECT_EQ(DxfWriter::toText(*again), DxfWriter::toText(db)) << "the counts read back stand";
}

TEST_F(DatabaseApi, ExtendedDataOfAFilesObjectsFollowsEveryEdit) {
    // Objects read from a file: their extended data found before and after each kind of
    // edit, on short and very long tag lists.
    for (const int vertices : {2, 40000}) {
        std::vector<Point3> points;
        for (int i = 0; i < vertices; ++i)
            points.push_back({double(i), double(i % 7), 0});
        Polyline* made = db.modelSpace()->addLwPolyline(points, false);
        made->setXData("APP", std::vector<Tag>{tag(1000, "W1"), tag(1070, "3")});
    }
    db.modelSpace()
        ->addLine({0, 0, 0}, {5, 5, 0})
        ->setXData("OUTRA", std::vector<Tag>{tag(1000, "L")});
    const std::unique_ptr<Database> again = reloaded(db);
    for (Entity* entity : again->modelSpace()->entities()) {
        const bool line = entity->isType("LINE");
        const std::string_view app = line ? "OUTRA" : "APP";
        ASSERT_TRUE(entity->hasXData(app));
        EXPECT_EQ(entity->text(8), "0") << "a tag before the extended data";
        // a tag added before the extended data moves it
        entity->setColor(3);
        EXPECT_EQ(entity->xdataItems(app).front().value, line ? "L" : "W1");
        entity->setXData("MAIS", std::vector<Tag>{tag(1000, "M")});
        EXPECT_EQ(entity->xdataApplications(), (std::vector<std::string_view>{app, "MAIS"}));
        EXPECT_TRUE(entity->removeXData(app));
        EXPECT_FALSE(entity->hasXData(app));
        EXPECT_EQ(entity->xdataItems("MAIS").front().value, "M");
        EXPECT_EQ(entity->color(), 3);
    }
    // A value written in place (the tags stay the file's) leaves the extended data be.
    const std::unique_ptr<Database> third = reloaded(db);
    for (Entity* entity : third->modelSpace()->entities()) {
        entity->setLayer("OUTRO");
        EXPECT_EQ(entity->layer(), "OUTRO");
        EXPECT_EQ(entity->xdataApplications().size(), 1u);
    }
}

TEST_F(DatabaseApi, ReplacedExtendedDataOfAFilesObjectsFollowsEachEditAndLeavesNeighboursBe) {
    // A group replaced by one of the same size is written where it is; one of another size
    // moves the object's tags elsewhere. Either way the object's other groups and tags, and
    // the objects read next to it, keep what they had.
    for (const char* name : {"A", "B", "C"}) {
        Entity* line = db.modelSpace()->addLine({0, 0, 0}, {1, 1, 0});
        line->setXData("APP", std::vector<Tag>{tag(1000, name), tag(1000, "2")});
        line->setXData("OUTRA", std::vector<Tag>{tag(1000, std::string(name) + "x")});
    }
    const std::unique_ptr<Database> again = reloaded(db);
    const std::vector<Entity*> lines = again->modelSpace()->entities();
    ASSERT_EQ(lines.size(), 3u);
    Entity* middle = lines[1];
    const auto texts = [](const Entity& entity, std::string_view app) {
        std::vector<std::string_view> values;
        for (const Tag& item : entity.xdataItems(app))
            values.push_back(item.value);
        return values;
    };
    using Texts = std::vector<std::string_view>;
    const auto neighboursKept = [&] {
        EXPECT_EQ(texts(*lines[0], "APP"), (Texts{"A", "2"}));
        EXPECT_EQ(texts(*lines[0], "OUTRA"), (Texts{"Ax"}));
        EXPECT_EQ(texts(*lines[2], "APP"), (Texts{"C", "2"}));
        EXPECT_EQ(texts(*lines[2], "OUTRA"), (Texts{"Cx"}));
    };
    const std::string_view same[] = {"B2", "3"};
    middle->setXDataTexts("APP", same);
    EXPECT_EQ(texts(*middle, "app"), (Texts{"B2", "3"}));
    EXPECT_EQ(texts(*middle, "OUTRA"), (Texts{"Bx"}));
    EXPECT_EQ(middle->xdataApplications(), (Texts{"APP", "OUTRA"}));
    neighboursKept();

    const std::string_view shorter[] = {"B3"};
    middle->setXDataTexts("APP", shorter);
    EXPECT_EQ(texts(*middle, "APP"), (Texts{"B3"}));
    EXPECT_EQ(texts(*middle, "OUTRA"), (Texts{"Bx"}));
    EXPECT_EQ(middle->xdataApplications(), (Texts{"APP", "OUTRA"}));
    neighboursKept();

    // Its items given back to it, as a caller may do with what it read.
    const std::vector<Tag> own = middle->xdata("OUTRA");
    middle->setXData("OUTRA", own);
    EXPECT_EQ(texts(*middle, "OUTRA"), (Texts{"Bx"}));
    const std::span<const Tag> inPlace = middle->xdataItems("APP");
    middle->setXData("APP", inPlace);
    EXPECT_EQ(texts(*middle, "APP"), (Texts{"B3"}));

    // Edits after the move find the tags where they are now.
    middle->setColor(5);
    middle->setLayer("OUTRO");
    const std::string_view longer[] = {"B4", "5", "6"};
    middle->setXDataTexts("APP", longer);
    middle->setXDataTexts("NOVA", longer);
    EXPECT_EQ(middle->color(), 5);
    EXPECT_EQ(middle->layer(), "OUTRO");
    EXPECT_EQ(texts(*middle, "APP"), (Texts{"B4", "5", "6"}));
    EXPECT_EQ(texts(*middle, "NOVA"), (Texts{"B4", "5", "6"}));
    EXPECT_EQ(middle->xdataApplications(), (Texts{"APP", "OUTRA", "NOVA"}));
    neighboursKept();

    // And so it is written.
    const std::unique_ptr<Database> third = reloaded(*again);
    Entity* read = third->entityByHandle(middle->handle());
    ASSERT_NE(read, nullptr);
    EXPECT_EQ(read->layer(), "OUTRO");
    EXPECT_EQ(texts(*read, "APP"), (Texts{"B4", "5", "6"}));
    EXPECT_EQ(texts(*read, "OUTRA"), (Texts{"Bx"}));
    EXPECT_EQ(read->xdataApplications(), (Texts{"APP", "OUTRA", "NOVA"}));
    EXPECT_EQ(texts(*third->entityByHandle(lines[2]->handle()), "APP"), (Texts{"C", "2"}));
}

TEST_F(DatabaseApi, DeepCloneBringsBlocksLayersAndTranslatesHandles) {
    Database source;
    source.createLayer("SYMBOLS")->setColor(3);
    BlockRecord* inner = source.createBlock("INNER");
    inner->addCircle({0, 0, 0}, 1, "SYMBOLS");
    BlockRecord* outer = source.createBlock("OUTER", {5, 5, 0});
    outer->addBlockReference(*inner, {1, 1, 0});
    outer->addAttributeDefinition("TAG", "Tag", "K1", {0, 0, 0}, 1.0);
    Entity* marked = outer->addLine({0, 0, 0}, {2, 0, 0}, "SYMBOLS");
    const Tag item[] = {tag(1000, "kept")};
    marked->setXData("KVR_ZV", item);
    marked->getOrCreateExtensionDictionary()->getOrCreateXRecord("R");

    DeepCloner cloner(source, db);
    BlockRecord* copy = cloner.cloneBlock(*outer);
    ASSERT_NE(copy, nullptr);
    EXPECT_EQ(copy->name(), "OUTER");
    EXPECT_EQ(copy->basePoint(), (Point3{5, 5, 0}));
    ASSERT_NE(db.block("INNER"), nullptr) << "nested blocks come along";
    ASSERT_NE(db.layer("SYMBOLS"), nullptr);
    EXPECT_EQ(db.layer("SYMBOLS")->color(), 3);
    const auto entities = copy->entities();
    ASSERT_EQ(entities.size(), 3u);
    for (Entity* entity : entities)
        EXPECT_EQ(entity->ownerHandle(), copy->handle());
    const std::uint64_t lineCopy = cloner.translated(marked->handle());
    ASSERT_NE(lineCopy, 0u);
    Entity* copiedLine = db.entityByHandle(lineCopy);
    ASSERT_NE(copiedLine, nullptr);
    EXPECT_EQ(copiedLine->xdata("KVR_ZV")[0].value, "kept");
    ASSERT_NE(copiedLine->extensionDictionary(), nullptr);
    EXPECT_EQ(copiedLine->extensionDictionary()->ownerHandle(), lineCopy);
    EXPECT_NE(copiedLine->extensionDictionary()->getXRecord("R"), nullptr);
    EXPECT_EQ(cloner.cloneBlock(*outer), copy) << "a block already there is not copied again";

    BlockReference* placed = db.modelSpace()->addBlockReference(*copy, {0, 0, 0});
    placed->addAttributeFromDefinition(*copy->attributeDefinitions()[0]);
    const QJsonObject seen = inspect(db);
    EXPECT_EQ(seen["blocks"].toObject()["OUTER"].toArray().size(), 3);
    EXPECT_EQ(
        seen["modelspace"].toArray()[0].toObject()["attribs"].toArray()[0].toArray()[1].toString(),
        "K1");
}

TEST_F(DatabaseApi, ABlockIsRedefinedFromAnotherInTheSameDrawing) {
    BlockRecord* existing = db.createBlock("BORNE");
    existing->addLine({0, 0, 0}, {1, 0, 0});
    BlockRecord* temporary = db.createBlock("ZV_TMP_41");
    temporary->addCircle({0, 0, 0}, 2);
    temporary->addAttributeDefinition("NUMERO", "", "", {0, 3, 0}, 1);
    for (Entity* entity : existing->entities())
        entity->erase();
    DeepCloner cloner(db, db);
    const auto copies = cloner.cloneEntities(temporary->entities(), *existing);
    ASSERT_EQ(copies.size(), 2u);
    temporary->erase();
    EXPECT_EQ(db.block("ZV_TMP_41"), nullptr);
    const auto entities = existing->entities();
    ASSERT_EQ(entities.size(), 2u);
    EXPECT_TRUE(entities[0]->isType("CIRCLE"));
    EXPECT_EQ(entities[1]->ownerHandle(), existing->handle());
    EXPECT_EQ(existing->attributeDefinitions().size(), 1u);
    EXPECT_NE(db.createBlock("ZV_TMP_41"), temporary) << "the name is free again";
    const QJsonObject blocks = inspect(db)["blocks"].toObject();
    EXPECT_EQ(blocks["BORNE"].toArray().size(), 2);
    EXPECT_EQ(blocks["ZV_TMP_41"].toArray().size(), 0);
}

TEST_F(DatabaseApi, ModelSpaceOfAFileBecomesABlock) {
    Database file;
    file.modelSpace()->addLine({0, 0, 0}, {3, 0, 0});
    file.modelSpace()->addCircle({1, 1, 0}, 0.5);
    DeepCloner cloner(file, db);
    BlockRecord* block = cloner.cloneModelSpaceAsBlock("SIMBOLO");
    ASSERT_NE(block, nullptr);
    EXPECT_EQ(block->entityCount(), 2u);
    EXPECT_EQ(db.modelSpace()->entityCount(), 0u);
    const QJsonObject seen = inspect(db);
    EXPECT_EQ(seen["blocks"].toObject()["SIMBOLO"].toArray().size(), 2);
}

TEST_F(DatabaseApi, ExtentsOfEntitiesAndBlocks) {
    BlockRecord* ms = db.modelSpace();
    BoundingBox box = Extents::ofEntity(*ms->addLine({1, 2, 0}, {-3, 5, 0}), false);
    EXPECT_EQ(box.min, (Point3{-3, 2, 0}));
    EXPECT_EQ(box.max, (Point3{1, 5, 0}));
    box = Extents::ofEntity(*ms->addCircle({10, 10, 0}, 2), false);
    EXPECT_EQ(box.min, (Point3{8, 8, 0}));
    box = Extents::ofEntity(*ms->addLwPolyline({{0, 0, 0}, {4, -1, 0}, {2, 7, 0}}, true), false);
    EXPECT_EQ(box.max, (Point3{4, 7, 0}));
    box = Extents::ofEntity(*ms->addArc({0, 0, 0}, 1, 0, 90), false);
    EXPECT_NEAR(box.min.x, 0, 1e-12);
    EXPECT_NEAR(box.max.y, 1, 1e-12);

    BlockRecord* block = db.createBlock("SQUARE", {1, 1, 0});
    block->addLine({1, 1, 0}, {3, 1, 0});
    block->addLine({3, 1, 0}, {3, 3, 0});
    const BoundingBox own = Extents::ofBlock(*block);
    EXPECT_EQ(own.min, (Point3{1, 1, 0}));
    EXPECT_EQ(own.max, (Point3{3, 3, 0}));
    BlockReference* reference = ms->addBlockReference(*block, {10, 0, 0}, {2, 2, 1}, 90);
    box = Extents::ofEntity(*reference, false);
    EXPECT_NEAR(box.min.x, 6, 1e-9);
    EXPECT_NEAR(box.max.x, 10, 1e-9);
    EXPECT_NEAR(box.min.y, 0, 1e-9);
    EXPECT_NEAR(box.max.y, 4, 1e-9);
    const Point3 moved = reference->transform().apply({3, 1, 0});
    EXPECT_NEAR(moved.x, 10, 1e-9);
    EXPECT_NEAR(moved.y, 4, 1e-9);
    EXPECT_TRUE(Extents::ofEntity(*ms->addMText({0, 0, 0}, 1, "abc"), false).max.x > 0);
}

// A block's bounds are kept between questions: every kind of change to its entities must
// be seen by the next question.
TEST_F(DatabaseApi, BlockBoundsFollowChangesOfTheBlock) {
    BlockRecord* ms = db.modelSpace();
    BlockRecord* block = db.createBlock("KEPT", {0, 0, 0});
    Entity* line = block->addLine({0, 0, 0}, {2, 1, 0});
    BlockReference* a = ms->addBlockReference(*block, {10, 0, 0}, {1, 1, 1}, 0);
    BlockReference* b = ms->addBlockReference(*block, {20, 0, 0}, {1, 1, 1}, 0);
    EXPECT_EQ(Extents::ofEntity(*a, false).max, (Point3{12, 1, 0}));
    EXPECT_EQ(Extents::ofEntity(*b, false).max, (Point3{22, 1, 0}));

    line->setPoint(11, {4, 3, 0});  // an entity of the block edited
    EXPECT_EQ(Extents::ofEntity(*a, false).max, (Point3{14, 3, 0}));
    Entity* circle = block->addCircle({0, 0, 0}, 5);  // an entity added
    EXPECT_EQ(Extents::ofEntity(*b, false).min, (Point3{15, -5, 0}));
    circle->erase();  // and taken away
    EXPECT_EQ(Extents::ofEntity(*b, false).min, (Point3{20, 0, 0}));
    EXPECT_EQ(Extents::ofBlock(*block).max, (Point3{4, 3, 0}));

    // Nested: the inner block's change shows through the outer one.
    BlockRecord* outer = db.createBlock("OUTER", {0, 0, 0});
    outer->addBlockReference(*block, {100, 0, 0}, {1, 1, 1}, 0);
    BlockReference* c = ms->addBlockReference(*outer, {0, 0, 0}, {1, 1, 1}, 0);
    EXPECT_EQ(Extents::ofEntity(*c, false).max, (Point3{104, 3, 0}));
    line->setPoint(11, {6, 3, 0});
    EXPECT_EQ(Extents::ofEntity(*c, false).max, (Point3{106, 3, 0}));

    // Another drawing swapped in (as undo does): its blocks' bounds, not the kept ones.
    Database other;
    BlockRecord* same = other.createBlock("KEPT", {0, 0, 0});
    same->addLine({0, 0, 0}, {1, 9, 0});
    db.swapContents(other);
    const BlockRecord* swapped = db.block("KEPT");
    ASSERT_NE(swapped, nullptr);
    EXPECT_EQ(Extents::ofBlock(*swapped).max, (Point3{1, 9, 0}));
}

TEST_F(DatabaseApi, EntitiesMoveByAnOffset) {
    BlockRecord* block = db.createBlock("MOVED", {5, 5, 0});
    Entity* line = block->addLine({5, 5, 0}, {7, 5, 0});
    Polyline* wire = block->addLwPolyline({{5, 5, 0}, {6, 9, 0}}, false);
    Entity* circle = block->addCircle({6, 6, 0}, 1);
    Attribute* definition = block->addAttributeDefinition("T", "", "", {5, 8, 0}, 1);
    Entity* unknown = db.addEntity(*block, "ACME_THING", {}, "0");
    for (Entity* entity : block->entities()) {
        if (entity != unknown) {
            EXPECT_TRUE(entity->moveBy({-5, -5, 0}));
        }
    }
    EXPECT_FALSE(unknown->moveBy({-5, -5, 0}));
    block->setBasePoint({0, 0, 0});
    EXPECT_EQ(line->point(11), (Point3{2, 0, 0}));
    EXPECT_EQ(wire->vertices()[1], (Point3{1, 4, 0}));
    EXPECT_EQ(circle->point(10), (Point3{1, 1, 0}));
    EXPECT_EQ(definition->position(), (Point3{0, 3, 0}));
    EXPECT_EQ(Extents::ofBlock(*block).min, (Point3{0, 0, 0}));
}

TEST_F(DatabaseApi, TextsPolylinesAndLongMText) {
    BlockRecord* ms = db.modelSpace();
    std::string longText;
    for (int i = 0; i < 120; ++i)
        longText += "ção-";
    TextEntity* mtext = ms->addMText({0, 0, 0}, 2.5, longText);
    EXPECT_EQ(mtext->content(), longText);
    for (const Tag& t : mtext->tags()) {
        if (t.code == 1 || t.code == 3) {
            EXPECT_LE(t.value.size(), 250u);
        }
    }
    TextEntity* text = ms->addText({1, 1, 0}, 2, "Página 1");
    text->setContent("Página 2");
    Polyline* lw = ms->addLwPolyline({{0, 0, 0}, {1, 0, 0}}, false);
    lw->setVertices({{0, 0, 0}, {2, 0, 0}, {2, 2, 0}});
    lw->setClosed(true);
    EXPECT_EQ(lw->vertices().size(), 3u);
    EXPECT_TRUE(lw->isClosed());

    const QJsonArray model = inspect(db)["modelspace"].toArray();
    ASSERT_EQ(model.size(), 3);
    EXPECT_EQ(model[0].toObject()["text"].toString().toStdString(), longText);
    EXPECT_EQ(model[1].toObject()["text"].toString(), QString("Página 2"));
    EXPECT_EQ(model[2].toObject()["points"].toArray().size(), 3);
}

TEST_F(DatabaseApi, LightweightPolylineVerticesStandAtItsOwnElevation) {
    BlockRecord* ms = db.modelSpace();
    Polyline* flat = ms->addLwPolyline({{0, 0, 0}, {1, 2, 0}, {3, 4, 0}}, false);
    Polyline* raised = ms->addLwPolyline({{0, 0, 0}, {1, 2, 0}}, false);
    raised->setReal(38, 7.5, "AcDbPolyline");
    EXPECT_EQ(raised->vertices()[1], (Point3{1, 2, 7.5}));
    // A 38 of an application group is not the polyline's elevation.
    std::vector<Tag> grouped(flat->tags().begin(), flat->tags().end());
    const Tag group[] = {tag(102, "{ZV_APP"), tag(38, "9"), tag(102, "}")};
    grouped.insert(grouped.begin() + 2, std::begin(group), std::end(group));
    flat->replaceTags(grouped);
    flat->setXData("APP", std::vector<Tag>{tag(1000, "x"), tag(1040, "8")});
    EXPECT_EQ(flat->vertices(), (std::vector<Point3>{{0, 0, 0}, {1, 2, 0}, {3, 4, 0}}));
    // An elevation after the group is.
    flat->setReal(38, -2, "AcDbPolyline");
    EXPECT_EQ(flat->vertices(), (std::vector<Point3>{{0, 0, -2}, {1, 2, -2}, {3, 4, -2}}));

    const std::unique_ptr<Database> again = reloaded(db);
    const auto* read = dynamic_cast<Polyline*>(again->entityByHandle(flat->handle()));
    ASSERT_NE(read, nullptr);
    EXPECT_EQ(read->vertices(), flat->vertices());
    const auto* readRaised = dynamic_cast<Polyline*>(again->entityByHandle(raised->handle()));
    ASSERT_NE(readRaised, nullptr);
    EXPECT_EQ(readRaised->vertices(), (std::vector<Point3>{{0, 0, 7.5}, {1, 2, 7.5}}));
}

TEST_F(DatabaseApi, OldVersionsAreWrittenInTheirCodePage) {
    db.setVersion("AC1015");
    db.modelSpace()->addText({0, 0, 0}, 1, "Ação Ω");
    const std::string text = DxfWriter::toText(db);
    EXPECT_NE(text.find("A\xE7\xE3o \\U+03A9"), std::string::npos) << "cp1252 bytes and an escape";
    auto again = DxfLoader::load(text);
    const auto entities = again->modelSpace()->entities();
    ASSERT_EQ(entities.size(), 1u);
    EXPECT_EQ(static_cast<TextEntity*>(entities[0])->content(), "Ação Ω");
    const QJsonObject seen = inspect(db);
    // ezdxf leaves the escape as it stands in TEXT
    EXPECT_EQ(seen["modelspace"].toArray()[0].toObject()["text"].toString(),
              QString("Ação \\U+03A9"));
}

// A file save hands the text over in pieces: a drawing of several megabytes, with texts in
// the code page of an old version, is the same file as the text written in one piece.
TEST_F(DatabaseApi, ALargeDrawingIsSavedAsTheSameTextInPieces) {
    db.setVersion("AC1015");
    for (int i = 0; i < 40000; ++i)
        db.modelSpace()->addText({double(i), 0, 0}, 1, "Ação " + std::to_string(i));
    const std::string text = DxfWriter::toText(db);
    ASSERT_GT(text.size(), 4u << 20);
    const QString path = PythonChecker::scratchFolder() + "/large.dxf";
    DxfWriter::saveFile(db, path.toStdString());
    QFile file(path);
    ASSERT_TRUE(file.open(QIODevice::ReadOnly));
    const QByteArray saved = file.readAll();
    EXPECT_EQ(saved.size(), qsizetype(text.size()));
    EXPECT_TRUE(saved == QByteArray::fromRawData(text.data(), qsizetype(text.size())));
}

}  // namespace

// Several codes or applications read in one walk answer as text() and xdataItems() do one
// by one: a group's tags and the extended data are passed over, a code absent gives its
// fallback, and an application named in another case or missing is told apart.
TEST_F(DatabaseApi, TextsAndGroupsReadTogetherAnswerAsOneByOne) {
    BlockRecord* ms = db.modelSpace();
    Polyline* line = ms->addLwPolyline({{0, 0, 0}, {1, 2, 0}}, false);
    line->setLayer("PAGE$0001$A");
    std::vector<Tag> grouped(line->tags().begin(), line->tags().end());
    const Tag group[] = {tag(102, "{ZV_APP"), tag(8, "IN_GROUP"), tag(6, "DASHED"), tag(102, "}")};
    grouped.insert(grouped.begin() + 1, std::begin(group), std::end(group));
    line->replaceTags(grouped);
    line->setXData("FIRST", std::vector<Tag>{tag(1000, "a"), tag(1000, "b")});
    line->setXData("EMPTY", std::vector<Tag>{});
    line->setXData("LAST", std::vector<Tag>{tag(1040, "8")});

    const std::unique_ptr<Database> again = reloaded(db);
    for (const DbObject* object :
         {static_cast<const DbObject*>(line),
          static_cast<const DbObject*>(again->entityByHandle(line->handle()))}) {
        ASSERT_NE(object, nullptr);
        const int codes[] = {8, 6, 1000, 90};
        const std::string_view fallbacks[] = {"0", "BYLAYER", "none", "x"};
        std::string_view values[4];
        object->texts(codes, fallbacks, values);
        for (int k = 0; k < 4; ++k)
            EXPECT_EQ(values[k], object->text(codes[k], fallbacks[k])) << codes[k];
        EXPECT_EQ(values[0], "PAGE$0001$A");
        EXPECT_EQ(values[1], "BYLAYER");

        const std::string_view names[] = {"last", "MISSING", "FIRST", "EMPTY"};
        std::span<const Tag> items[4];
        object->xdataItemsOf(names, items);
        for (int k = 0; k < 4; ++k) {
            const std::span<const Tag> one = object->xdataItems(names[k]);
            EXPECT_EQ(items[k].data(), one.data()) << names[k];
            EXPECT_EQ(items[k].size(), one.size()) << names[k];
        }
        EXPECT_EQ(items[1].data(), nullptr);
        EXPECT_NE(items[3].data(), nullptr);
        EXPECT_EQ(items[2].size(), 2u);
    }
}

TEST_F(DatabaseApi, ExtendedDataIsTheRunFromItsFirstApplicationAndAnEditIsSeenAtOnce) {
    // Codes of 1000 and above count as extended data only in the run at the end and from
    // its first 1001 on; an application's first group answers, its name in any case.
    Entity* line = db.modelSpace()->addLine({0, 0, 0}, {1, 1, 0});
    std::vector<Tag> all(line->tags().begin(), line->tags().end());
    const Tag tail[] = {tag(1001, "EARLY"),  tag(1000, "inside"), tag(62, "3"),
                        tag(1000, "before"), tag(1001, "APP"),    tag(1000, "a"),
                        tag(1001, "Other"),  tag(1001, "app"),    tag(1000, "b"),
                        tag(1070, "2")};
    all.insert(all.end(), std::begin(tail), std::end(tail));
    line->replaceTags(all);
    using Texts = std::vector<std::string_view>;
    const auto values = [](std::span<const Tag> items) {
        Texts out;
        for (const Tag& item : items)
            out.push_back(item.value);
        return out;
    };
    const std::unique_ptr<Database> again = reloaded(db);
    for (Entity* entity : {line, again->modelSpace()->entities().front()}) {
        EXPECT_EQ(entity->color(), 3);
        EXPECT_EQ(entity->xdataApplications(), (Texts{"APP", "Other", "app"}));
        EXPECT_EQ(values(entity->xdataItems("App")), (Texts{"a"}));
        EXPECT_TRUE(entity->hasXData("OTHER"));
        EXPECT_TRUE(entity->xdataItems("OTHER").empty());
        EXPECT_FALSE(entity->hasXData("before"));
        EXPECT_FALSE(entity->hasXData("EARLY"));
        EXPECT_TRUE(entity->xdataItems("EARLY").empty());
        EXPECT_EQ(entity->xdataGroups("APP").size(), 2u);
        const std::string_view names[] = {"app", "NONE", "OTHER", "APP", "AP"};
        std::span<const Tag> items[5];
        entity->xdataItemsOf(names, items);
        EXPECT_EQ(values(items[0]), (Texts{"a"}));
        EXPECT_EQ(items[1].data(), nullptr);
        EXPECT_NE(items[2].data(), nullptr);
        EXPECT_TRUE(items[2].empty());
        EXPECT_EQ(items[3].data(), items[0].data());
        EXPECT_EQ(items[4].data(), nullptr);

        // What was answered before an edit is answered anew after it.
        entity->setXDataTexts("APP", std::vector<std::string_view>{"c", "d"});
        entity->xdataItemsOf(names, items);
        EXPECT_EQ(values(items[0]), (Texts{"c", "d"}));
        EXPECT_EQ(values(entity->xdataItems("app")), (Texts{"c", "d"}));
        EXPECT_TRUE(entity->removeXData("other"));
        EXPECT_FALSE(entity->hasXData("Other"));
        entity->xdataItemsOf(names, items);
        EXPECT_EQ(items[2].data(), nullptr);
        EXPECT_EQ(values(items[0]), (Texts{"c", "d"}));
        EXPECT_EQ(entity->color(), 3);
    }

    // A run of codes of 1000 and above without an application is no extended data.
    Entity* bare = db.modelSpace()->addLine({0, 0, 0}, {2, 2, 0});
    std::vector<Tag> stray(bare->tags().begin(), bare->tags().end());
    stray.push_back(tag(1000, "APP"));
    stray.push_back(tag(1070, "1"));
    bare->replaceTags(stray);
    EXPECT_FALSE(bare->hasXData("APP"));
    EXPECT_TRUE(bare->xdataApplications().empty());
    bare->setXData("APP", std::vector<Tag>{tag(1000, "x")});
    EXPECT_EQ(values(bare->xdataItems("APP")), (Texts{"x"}));
}
