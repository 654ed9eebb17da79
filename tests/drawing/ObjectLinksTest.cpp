// An entity keeps either its parent (an ATTRIB, VERTEX or SEQEND) or its children (a reference,
// a polyline) in one link, and an object keeps its tags in one of three places (a file's list,
// a pattern's values, a list of its own): each way must read, change, copy, erase and write
// as any other.
#include "drawing/Attribute.h"
#include "drawing/AttributeLayout.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/DeepCloner.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "drawing/Polyline.h"

#include "TagLines.h"

#include <gtest/gtest.h>

#include <memory>
#include <optional>
#include <string>
#include <vector>

using namespace zvdb;

namespace {

BlockRecord* blockWithTwoValues(Database& db) {
    BlockRecord* block = db.createBlock("BORNE", {0, 0, 0});
    block->addLine({0, 0, 0}, {5, 0, 0});
    block->addAttributeDefinition("NUM", "Num", "0", {1, 1, 0}, 2.0);
    block->addAttributeDefinition("REG", "Reg", "", {1, 4, 0}, 2.0);
    return block;
}

BlockReference* insert(Database& db, BlockRecord& block, const Point3& at,
                       const std::vector<std::optional<std::string_view>>& values) {
    BlockReference* reference = db.modelSpace()->addBlockReference(block, at, {1, 1, 1}, 0, "0");
    Point3 base;
    const auto layouts = db.attributeLayouts().variableLayouts(db, block, &base);
    reference->placeAttributesFromLayouts(base, at, {1, 1, 1}, 0, layouts, values);
    return reference;
}

// Vertices added one by one, past the room the first ones took.
Polyline* polylineOf(Database& db, int vertices) {
    Entity* made = db.addEntity(*db.modelSpace(), "POLYLINE",
                                {Tag{100, "AcDb2dPolyline"}, Tag{66, "1"}, Tag{70, "0"}}, "0");
    auto* polyline = static_cast<Polyline*>(made);
    for (int i = 0; i < vertices; ++i)
        db.addVertex(*polyline, {double(i), double(2 * i), 0});
    return polyline;
}

void expectVerticesInOrder(const Entity& polyline, int vertices) {
    ASSERT_EQ(polyline.subEntities().size(), std::size_t(vertices));
    for (int i = 0; i < vertices; ++i)
        EXPECT_EQ(polyline.subEntities()[std::size_t(i)]->point(10),
                  (Point3{double(i), double(2 * i), 0}));
}

// An attribute more than the reference was made with, as LISP or a reader may add one.
Attribute* addExtra(Database& db, BlockReference& reference) {
    return db.addAttribute(reference,
                           {Tag{10, "0.0"}, Tag{20, "0.0"}, Tag{30, "0.0"}, Tag{40, "1.0"},
                            Tag{1, "X"}, Tag{100, "AcDbAttribute"}, Tag{2, "EXTRA"}, Tag{70, "0"}},
                           "0");
}

// Each parent with children, each child knowing its parent and carrying none.
void expectFamily(const Entity& parent, std::size_t children, const BlockRecord* block) {
    SCOPED_TRACE(std::string(parent.type()));
    EXPECT_EQ(parent.parent(), nullptr);
    ASSERT_EQ(parent.subEntities().size(), children);
    ASSERT_NE(parent.seqend(), nullptr);
    EXPECT_EQ(parent.block(), block);
    std::vector<const Entity*> family(parent.subEntities().begin(), parent.subEntities().end());
    family.push_back(parent.seqend());
    for (const Entity* child : family) {
        EXPECT_EQ(child->parent(), &parent);
        EXPECT_TRUE(child->subEntities().empty());
        EXPECT_EQ(child->seqend(), nullptr);
        EXPECT_EQ(child->block(), block);
        EXPECT_EQ(child->ownerHandle(), parent.handle());
    }
}

}  // namespace

TEST(EntityLinks, ChildrenKnowTheirParentWhetherMadeLoadedOrCopied) {
    Database db;
    BlockRecord* block = blockWithTwoValues(db);
    BlockReference* reference = insert(db, *block, {10, 0, 0}, {"1", "A"});
    Attribute* extra = addExtra(db, *reference);
    Polyline* polyline = polylineOf(db, 9);
    expectFamily(*reference, 3, db.modelSpace());
    expectFamily(*polyline, 9, db.modelSpace());
    expectVerticesInOrder(*polyline, 9);
    EXPECT_EQ(reference->attribute("REG")->textValue(), "A");
    EXPECT_EQ(reference->subEntities()[2], extra);

    auto loaded = DxfLoader::load(DxfWriter::toText(db));
    const Entity* loadedReference = loaded->entityByHandle(reference->handle());
    const Entity* loadedPolyline = loaded->entityByHandle(polyline->handle());
    ASSERT_NE(loadedReference, nullptr);
    ASSERT_NE(loadedPolyline, nullptr);
    expectFamily(*loadedReference, 3, loaded->modelSpace());
    expectFamily(*loadedPolyline, 9, loaded->modelSpace());
    expectVerticesInOrder(*loadedPolyline, 9);

    Database target;
    DeepCloner cloner(db, target);
    Entity* const sources[] = {reference, polyline};
    const std::vector<Entity*> copies = cloner.cloneEntities(sources, *target.modelSpace());
    ASSERT_EQ(copies.size(), 2u);
    expectFamily(*copies[0], 3, target.modelSpace());
    expectFamily(*copies[1], 9, target.modelSpace());
    expectVerticesInOrder(*copies[1], 9);
}

TEST(EntityLinks, AnErasedParentTakesItsChildrenOutOfTheFile) {
    Database db;
    BlockRecord* block = blockWithTwoValues(db);
    BlockReference* kept = insert(db, *block, {0, 0, 0}, {"1", "A"});
    BlockReference* gone = insert(db, *block, {0, 10, 0}, {"2", "B"});
    std::vector<std::uint64_t> goneHandles{gone->handle(), gone->seqend()->handle()};
    for (const Entity* attribute : gone->subEntities())
        goneHandles.push_back(attribute->handle());
    gone->erase();
    for (const Entity* attribute : gone->subEntities())
        EXPECT_TRUE(attribute->isErased());
    EXPECT_TRUE(gone->seqend()->isErased());
    EXPECT_FALSE(kept->seqend()->isErased());

    auto loaded = DxfLoader::load(DxfWriter::toText(db));
    for (const std::uint64_t handle : goneHandles)
        EXPECT_EQ(loaded->objectByHandle(handle), nullptr) << handle;
    const Entity* again = loaded->entityByHandle(kept->handle());
    ASSERT_NE(again, nullptr);
    expectFamily(*again, 2, loaded->modelSpace());
}

TEST(ObjectTags, EachPlaceTheTagsAreKeptReadsChangesAndWritesAlike) {
    Database db;
    BlockRecord* block = blockWithTwoValues(db);
    insert(db, *block, {0, 0, 0}, {"1", "A"});
    db.modelSpace()->addLine({0, 0, 0}, {1, 1, 0});
    auto loaded = DxfLoader::load(DxfWriter::toText(db));
    Database& file = *loaded;

    // A file object: a value changed where it stands, then a tag more (a list of its own),
    // then all its tags replaced (that list given up for another).
    Entity* line = nullptr;
    for (Entity* entity : file.modelSpace()->entities())
        if (entity->isType("LINE")) line = entity;
    ASSERT_NE(line, nullptr);
    line->setPoint(11, {7, 7, 0}, "AcDbLine");
    line->setColor(3);
    EXPECT_EQ(line->color(), 3);
    std::vector<Tag> replaced(line->tags().begin(), line->tags().end());
    replaced.push_back(Tag{39, "2.5"});
    line->replaceTags(replaced);
    EXPECT_EQ(line->real(39), 2.5);

    // Patterned attributes: a hole's value (still patterned), then a tag the pattern lacks
    // (its tags put together, then its own), then one erased.
    BlockRecord* fileBlock = file.block("BORNE");
    ASSERT_NE(fileBlock, nullptr);
    BlockReference* reference = insert(file, *fileBlock, {20, 0, 0}, {"2", "B"});
    Attribute* number = reference->attribute("NUM");
    Attribute* note = reference->attribute("REG");
    ASSERT_TRUE(number->isPatterned());
    number->setTextValue("22");
    EXPECT_TRUE(number->isPatterned());
    number->setColor(5);
    EXPECT_FALSE(number->isPatterned());
    number->setTextValue("23");
    note->erase();

    const std::string text = DxfWriter::toText(file);
    auto again = DxfLoader::load(text);
    for (const DbObject* object :
         {static_cast<const DbObject*>(line), static_cast<const DbObject*>(reference),
          static_cast<const DbObject*>(number)}) {
        const DbObject* read = again->objectByHandle(object->handle());
        ASSERT_NE(read, nullptr);
        EXPECT_EQ(lines(*read), lines(*object));
    }
    EXPECT_EQ(again->objectByHandle(note->handle()), nullptr);
    auto* readReference = dynamic_cast<BlockReference*>(again->entityByHandle(reference->handle()));
    ASSERT_NE(readReference, nullptr);
    EXPECT_EQ(readReference->attribute("NUM")->textValue(), "23");
    EXPECT_EQ(readReference->attribute("NUM")->color(), 5);
    EXPECT_EQ(readReference->attributes().size(), 1u);
    // The file read back writes as it was written.
    EXPECT_TRUE(DxfWriter::toText(*again) == text);
}
