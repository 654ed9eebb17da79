// Attributes made from block definitions in one pass, the arena that holds their tags, values
// changed where the tags are, and the handle index. An attribute made in one pass must carry,
// tag for tag, what making a bare attribute and setting its properties one at a time makes.
#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "drawing/HandleIndex.h"
#include "drawing/StringArena.h"
#include "drawing/TagList.h"
#include "drawing/TagValues.h"
#include "drawing/UndoJournal.h"
#include "tests/drawing/StepByStepAttribute.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <functional>
#include <memory>
#include <numbers>
#include <optional>
#include <set>
#include <string>
#include <vector>

using namespace zvdb;

namespace {

Tag tag(int code, std::string_view value) {
    return Tag{static_cast<std::int16_t>(code), value};
}

// The tags as "code value" lines, the handle and owner left out (they differ by nature).
std::vector<std::string> withoutIdentity(const DbObject& object) {
    std::vector<std::string> lines;
    for (const Tag& item : object.tags())
        if (item.code != 5 && item.code != 330)
            lines.push_back(std::to_string(item.code) + " " + std::string(item.value));
    return lines;
}

// A block whose definitions cover what the definitions of real blocks carry: an alignment
// point with justification, a linetype and colour, a rotation of their own, an application
// group, a constant and an invisible one.
BlockRecord* richBlock(Database& db) {
    db.createLayer("ATTS");
    BlockRecord* block = db.createBlock("RICO", {2, 1, 0});
    block->addLine({0, 0, 0}, {5, 0, 0});
    block->addAttributeDefinition("PLAIN", "Plain", "p", {1, 2, 0}, 2.5);
    Attribute* aligned = block->addAttributeDefinition("ALIGNED", "Aligned", "", {3, 4, 0}, 1.8);
    aligned->setPoint(11, {6, 4, 0}, "AcDbText");
    aligned->setInteger(72, 1, "AcDbText");
    aligned->setInteger(74, 2, "AcDbAttributeDefinition");
    Attribute* styled =
        block->addAttributeDefinition("STYLED", "Styled", "s", {0, -3, 0}, 3.0, "ATTS");
    styled->setColor(3);
    styled->setLinetype("DASHED");
    styled->setReal(50, 15.0, "AcDbText");
    styled->setInvisible(true);
    // A group in the copied part whose height and point the setters must pass over.
    Attribute* grouped = block->addAttributeDefinition("GROUPED", "", "g", {7, 7, 0}, 1.0);
    auto& tags = grouped->editTags();
    const auto text = std::find(tags.begin(), tags.end(), tag(100, "AcDbText"));
    const Tag group[] = {tag(102, "{ZV_TEST"), tag(40, "9.0"), tag(10, "9.0"), tag(102, "}")};
    tags.insert(text + 1, group, group + 4);
    const Tag item[] = {tag(1000, "kept on the definition")};
    grouped->setXData("KVR_ZV", item);
    Attribute* constant = block->addAttributeDefinition("FIXED", "", "c", {0, 9, 0}, 1.0);
    constant->setInteger(70, 2, "AcDbAttributeDefinition");
    return block;
}

struct Placement {
    Point3 at, scale;
    double degrees;
    bool paper = false;
    Point3 extrusion{0, 0, 1};
};

using Values = std::vector<std::optional<std::string_view>>;

// Two references placed alike, one given its attributes step by step (and then the values,
// set one by one) and one in one pass with the values; every attribute of the two must match.
void expectSameAttributes(Database& target, const BlockRecord& block, const Placement& p,
                          const Values& values = {}) {
    BlockRecord* owner = p.paper ? target.paperSpace() : target.modelSpace();
    ASSERT_NE(owner, nullptr);
    BlockRecord* local = target.block(block.name());
    ASSERT_NE(local, nullptr) << "the reference needs the block in its own drawing";
    BlockReference* slow = owner->addBlockReference(*local, p.at, p.scale, p.degrees, "PAGE");
    BlockReference* fast = owner->addBlockReference(*local, p.at, p.scale, p.degrees, "PAGE");
    if (p.extrusion != Point3{0, 0, 1}) {
        slow->setPoint(210, p.extrusion, "AcDbBlockReference");
        fast->setPoint(210, p.extrusion, "AcDbBlockReference");
    }
    std::vector<const Attribute*> definitions;
    for (Attribute* definition : block.attributeDefinitions())
        if (!definition->isConstant()) definitions.push_back(definition);
    for (std::size_t i = 0; i < definitions.size(); ++i) {
        Attribute* made = madeStepByStep(*slow, *definitions[i]);
        if (i < values.size() && values[i]) made->setTextValue(*values[i]);
    }
    const std::vector<Attribute*> made = fast->addAttributesFromDefinitions(definitions, values);
    ASSERT_EQ(made.size(), definitions.size());
    ASSERT_EQ(slow->attributes().size(), made.size());
    for (std::size_t i = 0; i < made.size(); ++i) {
        EXPECT_EQ(withoutIdentity(*made[i]), withoutIdentity(*slow->attributes()[i]))
            << "attribute " << made[i]->tag();
        EXPECT_EQ(made[i]->ownerHandle(), fast->handle());
        EXPECT_EQ(made[i]->text(330), TagValues::fromHandle(fast->handle()));
        EXPECT_EQ(made[i]->text(5), TagValues::fromHandle(made[i]->handle()));
        EXPECT_EQ(made[i]->parent(), fast);
        EXPECT_EQ(target.objectByHandle(made[i]->handle()), made[i]);
        if (i < values.size() && values[i]) {
            EXPECT_EQ(made[i]->textValue(), *values[i]);
        }
    }
    EXPECT_EQ(withoutIdentity(*fast), withoutIdentity(*slow)) << "the reference gains 66 alike";
    ASSERT_NE(fast->seqend(), nullptr);
    EXPECT_EQ(withoutIdentity(*fast->seqend()), withoutIdentity(*slow->seqend()));
    EXPECT_EQ(fast->seqend()->handle(), made.front()->handle() + 1)
        << "the SEQEND's handle follows its first attribute's, then come the others'";
}

std::vector<const Attribute*> variableDefinitions(const BlockRecord& block) {
    std::vector<const Attribute*> definitions;
    for (Attribute* definition : block.attributeDefinitions())
        if (!definition->isConstant()) definitions.push_back(definition);
    return definitions;
}

TEST(AttributeFromDefinition, MatchesTheStepByStepAttributeForEveryPlacement) {
    Database db;
    db.createLayer("PAGE");
    const BlockRecord* block = richBlock(db);
    const Placement placements[] = {
        {{0, 0, 0}, {1, 1, 1}, 0},                      // as the lists place their rows
        {{12.5, -7.25, 0}, {1, 1, 1}, 30},              // rotated
        {{100, 200, 3}, {2, 0.5, 1}, 0},                // scaled, the height by y
        {{-4, 9, 0}, {-1, 1, 1}, 0},                    // mirrored in x
        {{5, 5, 0}, {1, -2, 1}, 270},                   // mirrored in y and rotated
        {{1, 2, 0}, {1, 1, 1}, 45, true},               // in paper space (67)
        {{1, 2, 0}, {1, 1, 1}, 0, false, {0, 0, -1}}};  // a flipped extrusion
    // Values for some attributes (an empty one too), the others keeping their defaults.
    const Values values = {"-X1", std::nullopt, "", "a value longer than the default one"};
    for (const Placement& p : placements) {
        SCOPED_TRACE(p.degrees);
        expectSameAttributes(db, *block, p);
        expectSameAttributes(db, *block, p, values);
    }
    // Fast and slow written out: the same text apart from handles.
    EXPECT_NO_THROW(DxfLoader::load(DxfWriter::toText(db)));
}

TEST(AttributeFromDefinition, ADefinitionOfAnotherDrawingLendsCopiesOfItsValues) {
    Database target;
    target.createLayer("PAGE");
    target.createLayer("ATTS");
    target.createBlock("RICO", {2, 1, 0});
    std::vector<std::string> expected;
    BlockReference* reference = nullptr;
    {
        auto source = std::make_unique<Database>();
        const BlockRecord* block = richBlock(*source);
        expectSameAttributes(target, *block, {{3, 3, 0}, {1, 1, 1}, 90});
        reference = static_cast<BlockReference*>(target.modelSpace()->entities().back());
        std::set<const char*> lent;
        for (const Attribute* definition : block->attributeDefinitions())
            for (const Tag& item : definition->tags())
                if (!item.value.empty()) lent.insert(item.value.data());
        for (const Attribute* attribute : reference->attributes())
            for (const Tag& item : attribute->tags())
                EXPECT_EQ(lent.count(item.value.data()), 0u)
                    << item.code << " " << item.value << " is the source's, not a copy";
        for (Attribute* attribute : reference->attributes())
            expected.push_back(std::string(attribute->tag()) + "=" +
                               std::string(attribute->textValue()) + "@" +
                               std::string(attribute->layer()));
    }
    // The source drawing is gone: what the attributes show must be the target's own.
    std::vector<std::string> seen;
    for (Attribute* attribute : reference->attributes())
        seen.push_back(std::string(attribute->tag()) + "=" + std::string(attribute->textValue()) +
                       "@" + std::string(attribute->layer()));
    EXPECT_EQ(seen, expected);
    EXPECT_EQ(seen.front(), "PLAIN=p@0");
    EXPECT_EQ(reference->attribute("STYLED")->linetype(), "DASHED");
}

TEST(AttributeFromDefinition, AnAttributeMadeInOnePassTakesLaterEdits) {
    Database db;
    db.createLayer("PAGE");
    const BlockRecord* block = richBlock(db);
    BlockReference* reference =
        db.modelSpace()->addBlockReference(*block, {10, 10, 0}, {1, 1, 1}, 0, "PAGE");
    std::vector<const Attribute*> definitions;
    for (Attribute* definition : block->attributeDefinitions())
        if (!definition->isConstant()) definitions.push_back(definition);
    const std::vector<Attribute*> made = reference->addAttributesFromDefinitions(definitions);
    ASSERT_EQ(made.size(), 4u);
    const std::vector<std::string> neighbour = withoutIdentity(*made[2]);

    // A new value goes where the tag is; the other attributes, whose tags lie next to it,
    // keep theirs.
    const std::uint64_t before = db.changeCount();
    made[1]->setTextValue("-K1");
    EXPECT_NE(db.changeCount(), before);
    EXPECT_EQ(made[1]->textValue(), "-K1");
    made[1]->setPosition({1, 2, 3});
    EXPECT_EQ(made[1]->position(), (Point3{1, 2, 3}));
    made[1]->setInvisible(true);
    EXPECT_TRUE(made[1]->isInvisible());
    EXPECT_EQ(withoutIdentity(*made[2]), neighbour);

    // A tag added moves the attribute to tags of its own, in the usual place.
    made[0]->setLinetype("HIDDEN");
    EXPECT_EQ(made[0]->linetype(), "HIDDEN");
    const auto tags = made[0]->tags();
    const int at = TagList::indexOf(tags, 6);
    ASSERT_GT(at, 0);
    EXPECT_EQ(tags[static_cast<std::size_t>(at) - 1].code, 62) << "after the colour";
    made[0]->setTextValue("changed after the copy");
    EXPECT_EQ(made[0]->textValue(), "changed after the copy");
    EXPECT_EQ(withoutIdentity(*made[2]), neighbour);

    // Erased and written: the file reads back with the edits and without the erased one.
    made[3]->erase();
    auto copy = DxfLoader::load(DxfWriter::toText(db));
    auto* again = dynamic_cast<BlockReference*>(copy->entityByHandle(reference->handle()));
    ASSERT_NE(again, nullptr);
    ASSERT_EQ(again->attributes().size(), 3u);
    EXPECT_EQ(again->attribute("ALIGNED")->textValue(), "-K1");
    EXPECT_TRUE(again->attribute("ALIGNED")->isInvisible());
    EXPECT_EQ(again->attribute("PLAIN")->textValue(), "changed after the copy");
    EXPECT_EQ(again->attribute("PLAIN")->linetype(), "HIDDEN");
    EXPECT_EQ(again->attribute("GROUPED"), nullptr);
}

TEST(AttributeFromDefinition, NoDefinitionsMakeNothingAndOneMatchesTheBatch) {
    Database db;
    const BlockRecord* block = richBlock(db);
    BlockReference* reference = db.modelSpace()->addBlockReference(*block, {0, 0, 0});
    EXPECT_TRUE(reference->addAttributesFromDefinitions({}).empty());
    EXPECT_EQ(reference->seqend(), nullptr);
    EXPECT_FALSE(reference->has(66));
    Attribute* one = reference->addAttributeFromDefinition(*block->attributeDefinitions()[1]);
    ASSERT_NE(one, nullptr);
    EXPECT_EQ(one->tag(), "ALIGNED");
    EXPECT_EQ(reference->integer(66), 1);
    EXPECT_EQ(one->point(11), (Point3{4, 3, 0})) << "moved by the base point";
}

TEST(AttributeFromDefinition, AValueGoesWhereSettingItLaterWouldEvenWithoutAValueTag) {
    Database db;
    db.createLayer("PAGE");
    BlockRecord* block = richBlock(db);
    // A definition without a value of its own: the value given is added as setting it would.
    Attribute* bare = block->addAttributeDefinition("BARE", "", "x", {1, 1, 0}, 1.0);
    std::erase_if(bare->editTags(), [](const Tag& t) { return t.code == 1; });
    ASSERT_FALSE(bare->has(1));
    std::string passing = "given";
    const Values values = {std::nullopt, std::nullopt, std::nullopt, std::nullopt, passing};
    expectSameAttributes(db, *block, {{2, 3, 0}, {1, 1, 1}, 0}, values);
    expectSameAttributes(db, *block, {{2, 3, 0}, {1, 1, 1}, 90, true}, values);
    // The values are the drawing's own copies: the caller's text may go.
    auto* reference = static_cast<BlockReference*>(db.modelSpace()->entities().back());
    passing.assign("changed");
    EXPECT_EQ(reference->attribute("BARE")->textValue(), "given");
    // Fewer values than definitions: the rest keep their defaults.
    BlockReference* few = db.modelSpace()->addBlockReference(*block, {0, 0, 0});
    const Values one = {"only"};
    const auto made = few->addAttributesFromDefinitions(variableDefinitions(*block), one);
    ASSERT_EQ(made.size(), 5u);
    EXPECT_EQ(made[0]->textValue(), "only");
    EXPECT_EQ(made[1]->textValue(), "");
    EXPECT_EQ(made[2]->textValue(), "s");
    EXPECT_FALSE(made[4]->has(1));
}

TEST(AttributeFromDefinition, ADefinitionChangedBetweenReferencesIsReadAgain) {
    Database db;
    db.createLayer("PAGE");
    db.createLayer("OUTRA");
    BlockRecord* block = richBlock(db);
    const Placement plain{{10, 20, 0}, {1, 1, 1}, 0};
    const Placement turned{{10, 20, 0}, {1, 1, 1}, 30};
    expectSameAttributes(db, *block, plain);
    expectSameAttributes(db, *block, turned);
    Attribute* first = block->attributeDefinitions()[0];
    Attribute* styled = block->attributeDefinitions()[2];
    // Each change below alters what the next references' attributes must carry.
    const std::vector<std::function<void()>> changes = {
        [&] {
            first->setPosition({-5, 6.25, 1});
        },
        [&] { first->setReal(40, 7.5, "AcDbText"); },
        [&] { first->setColor(5); },
        [&] { first->setLinetype("HIDDEN"); },
        [&] { first->setReal(50, 45.0, "AcDbText"); },
        [&] { first->setTextValue("new default"); },
        [&] { first->setLayer("OUTRA"); },
        [&] {
            first->setPoint(11, {1, 1, 0}, "AcDbText");
        },
        [&] { styled->setReal(50, 0.0, "AcDbText"); },
        [&] { styled->removeAll(6); },
        [&] { styled->setTag("RENAMED"); },
        [&] { first->setInteger(70, 2, "AcDbAttributeDefinition"); },  // now constant
    };
    for (std::size_t i = 0; i < changes.size(); ++i) {
        SCOPED_TRACE(i);
        changes[i]();
        expectSameAttributes(db, *block, plain);
        expectSameAttributes(db, *block, turned, {"v"});
    }
    EXPECT_EQ(variableDefinitions(*block).front()->tag(), "ALIGNED");
}

TEST(AttributeFromDefinition, EveryPlaceGetsTheTextOfItsOwnCoordinates) {
    // Many places, some repeated and some close together, so that texts of reals given
    // lately are answered again and others take their place.
    Database db;
    db.createLayer("PAGE");
    const BlockRecord* block = richBlock(db);
    std::uint64_t state = 12345;
    const auto next = [&] {
        state = state * 6364136223846793005ull + 1442695040888963407ull;
        return static_cast<double>(state >> 40) / 1024.0 - 8000.0;
    };
    for (int i = 0; i < 300; ++i) {
        const double x = i % 3 == 0 ? 15.0 : next();
        const double y = i % 5 == 0 ? 262.0 - 3.5 * (i % 7) : next() * 1e-7;
        const double degrees = i % 4 == 0 ? next() : 0.0;
        expectSameAttributes(db, *block, {{x, y, 0}, {1, 1, 1}, degrees});
    }
    // Zero and negative zero are told apart as their texts are.
    expectSameAttributes(db, *block, {{0, -0.0, 0}, {-1, 1, 1}, 0});
    expectSameAttributes(db, *block, {{-0.0, 0, 0}, {1, 1, 1}, 0});
}

TEST(AttributeFromDefinition, UndoTakesInsertionBackAndLaterReferencesStillMatch) {
    Database db;
    db.createLayer("PAGE");
    richBlock(db);
    const BlockRecord* block = db.block("RICO");
    UndoJournal journal;
    journal.beginGroup(db);
    BlockReference* reference = db.modelSpace()->addBlockReference(*block, {1, 1, 0});
    const Values values = {"-K7"};
    reference->addAttributesFromDefinitions(variableDefinitions(*block), values);
    const std::uint64_t handle = reference->handle();
    journal.endGroup(db);
    ASSERT_TRUE(journal.undo(db));
    EXPECT_EQ(db.entityByHandle(handle), nullptr);
    // The drawing now holds other objects: its definitions are read anew.
    expectSameAttributes(db, *db.block("RICO"), {{4, 4, 0}, {1, 1, 1}, 15}, values);
    ASSERT_TRUE(journal.redo(db));
    auto* again = dynamic_cast<BlockReference*>(db.entityByHandle(handle));
    ASSERT_NE(again, nullptr);
    ASSERT_EQ(again->attributes().size(), 4u);
    EXPECT_EQ(again->attribute("PLAIN")->textValue(), "-K7");
    expectSameAttributes(db, *db.block("RICO"), {{5, 5, 0}, {1, 1, 1}, 0}, values);
}

TEST(AttributeFromDefinition, APlacementIsReadAsTheReferencesAccessorsReadIt) {
    Database db;
    const BlockRecord* block = richBlock(db);
    // Scales and points inside an application group and in the extended data are not the
    // reference's; a point without z, a scale that does not read, a flipped extrusion are.
    const auto expected = [&](const BlockReference& r) {
        const Point3 s = r.scale();
        return Transform::fromOcs(r.extrusion()) * Transform::translation(r.position()) *
               Transform::rotationZ(r.rotation() * std::numbers::pi / 180.0) *
               Transform::scaling(s.x, s.y, s.z) *
               Transform::translation(block->basePoint() * -1.0);
    };
    const auto same = [](const Transform& a, const Transform& b) {
        return a.linear == b.linear && a.move == b.move;
    };
    BlockReference* plain = db.modelSpace()->addBlockReference(*block, {3, 4, 5}, {2, 3, 4}, 33);
    EXPECT_TRUE(same(plain->transform(), expected(*plain)));
    BlockReference* odd = db.modelSpace()->addBlockReference(*block, {3, 4, 5}, {1, 1, 1}, 0);
    auto& tags = odd->editTags();
    const auto at = std::find(tags.begin(), tags.end(), tag(100, "AcDbBlockReference"));
    const Tag group[] = {tag(102, "{ZV_TEST"), tag(41, "9.0"), tag(10, "99.0"), tag(102, "}")};
    tags.insert(at + 1, group, group + 4);
    std::erase_if(tags, [](const Tag& t) { return t.code == 30 || t.code == 42; });
    tags.push_back(tag(42, "not a number"));
    tags.push_back(tag(50, "12.5"));
    tags.push_back(tag(210, "0.0"));
    tags.push_back(tag(220, "0.0"));
    tags.push_back(tag(230, "-1.0"));
    tags.push_back(tag(1001, "KVR_ZV"));
    tags.push_back(tag(1041, "7.0"));
    tags.push_back(tag(1010, "50.0"));
    EXPECT_EQ(odd->position(), (Point3{3, 4, 0}));
    EXPECT_EQ(odd->scale().y, 1.0);
    EXPECT_EQ(odd->rotation(), 12.5);
    EXPECT_TRUE(same(odd->transform(), expected(*odd)));
    // Its attributes take the same height scale and rotation as one by one.
    const auto definitions = variableDefinitions(*block);
    std::vector<std::vector<std::string>> oneByOne;
    for (const Attribute* definition : definitions)
        oneByOne.push_back(withoutIdentity(*madeStepByStep(*odd, *definition)));
    const auto made = odd->addAttributesFromDefinitions(definitions);
    ASSERT_EQ(made.size(), oneByOne.size());
    for (std::size_t i = 0; i < made.size(); ++i)
        EXPECT_EQ(withoutIdentity(*made[i]), oneByOne[i]);
}

TEST(AttributeFromDefinition, AReferenceJustMadeNeedsNoReadingBackForTheSameAttributes) {
    Database db;
    db.createLayer("PAGE");
    const BlockRecord* block = richBlock(db);
    const auto definitions = variableDefinitions(*block);
    const Values values = {"-K1", std::nullopt, "a value", ""};
    // Reals whose text is long, a rotation of -0 (not written, so read back as 0), scales
    // that are written and one that is not, paper space.
    const Placement placements[] = {{{0.1, 1.0 / 3.0, 0}, {1, 1, 1}, 0},
                                    {{1e-7, -2.5e6, 0}, {1, 1, 1}, -0.0},
                                    {{12.5, -7.25, 0}, {1, 1, 1}, 180.0 / 7.0},
                                    {{-4, 9, 1.5}, {-1, 0.3, 1}, 0},
                                    {{5, 5, 0}, {2, -2, 1}, 270},
                                    {{1, 2, 0}, {1, 1, 1}, 45, true}};
    for (const Placement& p : placements) {
        SCOPED_TRACE(p.degrees);
        BlockRecord* owner = p.paper ? db.paperSpace() : db.modelSpace();
        BlockReference* read = owner->addBlockReference(*block, p.at, p.scale, p.degrees, "PAGE");
        BlockReference* given = owner->addBlockReference(*block, p.at, p.scale, p.degrees, "PAGE");
        const auto slow = read->addAttributesFromDefinitions(definitions, values);
        const auto fast = given->addAttributesFromDefinitions(*block, p.at, p.scale, p.degrees,
                                                              definitions, values);
        ASSERT_EQ(fast.size(), definitions.size());
        ASSERT_EQ(slow.size(), fast.size());
        for (std::size_t i = 0; i < fast.size(); ++i) {
            EXPECT_EQ(withoutIdentity(*fast[i]), withoutIdentity(*slow[i]))
                << "attribute " << fast[i]->tag();
            EXPECT_EQ(fast[i]->parent(), given);
            // And both as the step-by-step way makes them.
            Attribute* reference = madeStepByStep(*read, *definitions[i]);
            if (i < values.size() && values[i]) reference->setTextValue(*values[i]);
            EXPECT_EQ(withoutIdentity(*fast[i]), withoutIdentity(*reference));
        }
        EXPECT_EQ(withoutIdentity(*given->seqend()), withoutIdentity(*read->seqend()));
    }
    // A block whose base point is not the origin moves the attributes by it.
    BlockRecord* moved = db.createBlock("DESLOCADO", {10, -20, 0});
    moved->addAttributeDefinition("TAG", "", "v", {1, 1, 0}, 2.0);
    BlockReference* ref = db.modelSpace()->addBlockReference(*moved, {0, 0, 0}, {1, 1, 1}, 90);
    const auto made = ref->addAttributesFromDefinitions(*moved, {0, 0, 0}, {1, 1, 1}, 90,
                                                        variableDefinitions(*moved), {});
    ASSERT_EQ(made.size(), 1u);
    const Point3 at = made[0]->position();
    EXPECT_NEAR(at.x, -21.0, 1e-9);
    EXPECT_NEAR(at.y, -9.0, 1e-9);
    EXPECT_EQ(made[0]->textValue(), "v");
}

// Names of a table found in any case -------------------------------------------------------

TEST(TableNames, ABlockOrLayerIsFoundByItsNameInAnyCaseAndErasedOnesAreNot) {
    Database db;
    BlockRecord* shortName = db.createBlock("Ab1");
    BlockRecord* longName = db.createBlock("A_Block_Name_Longer_Than_Sixteen_Chars");
    db.createLayer("Página$0001$a");
    EXPECT_EQ(db.block("AB1"), shortName);
    EXPECT_EQ(db.block("ab1"), shortName);
    EXPECT_EQ(db.block("a_block_name_longer_than_sixteen_chars"), longName);
    EXPECT_EQ(db.block("A_BLOCK_NAME_LONGER_THAN_SIXTEEN_CHARX"), nullptr);
    EXPECT_EQ(db.block("Ab"), nullptr);
    EXPECT_NE(db.layer("PáGINA$0001$A"), nullptr) << "capitals of ASCII letters only";
    EXPECT_EQ(db.layer("PÁGINA$0001$A"), nullptr);
    EXPECT_NE(db.block("*model_space"), nullptr);
    shortName->erase();
    EXPECT_EQ(db.block("ab1"), nullptr);
    BlockRecord* again = db.createBlock("AB1");
    EXPECT_NE(again, shortName);
    EXPECT_EQ(db.block("aB1"), again) << "an erased name is free again";
}

// Values changed where a file's tags are -------------------------------------------------

constexpr std::string_view kTwoTexts =
    "0\nSECTION\n2\nHEADER\n9\n$ACADVER\n1\nAC1027\n0\nENDSEC\n"
    "0\nSECTION\n2\nENTITIES\n"
    "0\nTEXT\n5\n100\n330\n1F\n100\nAcDbEntity\n8\n0\n100\nAcDbText\n10\n1.0\n20\n2.0\n30\n0.0\n"
    "40\n2.5\n1\nfirst\n100\nAcDbText\n"
    "0\nTEXT\n5\n101\n330\n1F\n100\nAcDbEntity\n8\n0\n100\nAcDbText\n10\n5.0\n20\n6.0\n30\n0.0\n"
    "40\n2.5\n1\nsecond\n100\nAcDbText\n"
    "0\nENDSEC\n0\nEOF\n";

TEST(ValuesInPlace, AFileObjectTakesNewValuesWithoutDisturbingItsNeighbour) {
    auto db = DxfLoader::load(std::string(kTwoTexts));
    Entity* first = db->entityByHandle(0x100);
    Entity* second = db->entityByHandle(0x101);
    ASSERT_NE(first, nullptr);
    ASSERT_NE(second, nullptr);
    const std::size_t count = first->tags().size();
    first->setText(1, "renamed", "AcDbText");
    first->setPoint(10, {7, 8, 9}, "AcDbText");
    EXPECT_EQ(first->text(1), "renamed");
    EXPECT_EQ(first->point(10), (Point3{7, 8, 9}));
    EXPECT_EQ(first->tags().size(), count);
    EXPECT_EQ(second->text(1), "second");
    EXPECT_EQ(second->point(10), (Point3{5, 6, 0}));
    // A point with an axis missing gains it: the tags become the object's own.
    auto& tags = second->editTags();
    std::erase_if(tags, [](const Tag& t) { return t.code == 30; });
    second->setPoint(10, {1, 1, 1}, "AcDbText");
    EXPECT_EQ(second->point(10), (Point3{1, 1, 1}));
    EXPECT_EQ(second->tags().size(), count);
    const std::string text = DxfWriter::toText(*db);
    EXPECT_NE(text.find("renamed"), std::string::npos);
    EXPECT_EQ(text.find("first"), std::string::npos);
    auto again = DxfLoader::load(text);
    EXPECT_EQ(again->entityByHandle(0x100)->point(10), (Point3{7, 8, 9}));
    EXPECT_EQ(again->entityByHandle(0x101)->text(1), "second");
}

// Tag lists ---------------------------------------------------------------------------------

TEST(TagListSearch, GroupsAndExtendedDataArePassedOver) {
    const std::vector<Tag> all = {
        tag(0, "LINE"),       tag(5, "A"),          tag(102, "{ACAD_REACTORS"),
        tag(8, "in a group"), tag(102, "}"),        tag(100, "AcDbEntity"),
        tag(8, "LAYER"),      tag(100, "AcDbLine"), tag(10, "1.0"),
        tag(20, "2.0"),       tag(1001, "APP"),     tag(1000, "x")};
    EXPECT_EQ(TagList::indexOf(all, 8), 6);
    EXPECT_EQ(TagList::indexOf(all, 8, 7), -1) << "the extended data is not searched";
    EXPECT_EQ(TagList::indexOf(all, 1000), 11) << "unless its code is asked for";
    EXPECT_EQ(TagList::xdataStart(all), 10u);
    EXPECT_EQ(TagList::subclassEnd(all, "AcDbEntity"), 7u);
    EXPECT_EQ(TagList::subclassEnd(all, "AcDbLine"), 10u);
    EXPECT_EQ(TagList::subclassEnd(all, "AcDbNone"), 10u);
}

TEST(TagListSearch, SettersReplaceOrInsertAtTheEndOfTheSubclass) {
    std::vector<Tag> all = {tag(0, "TEXT"),       tag(100, "AcDbEntity"), tag(8, "0"),
                            tag(100, "AcDbText"), tag(10, "1.0"),         tag(100, "AcDbX")};
    TagList::setValue(all, 62, "5", "AcDbEntity");
    ASSERT_EQ(all.size(), 7u);
    EXPECT_EQ(all[3], tag(62, "5"));
    TagList::setValue(all, 8, "NEW", "AcDbEntity");
    EXPECT_EQ(all[2], tag(8, "NEW"));
    const std::string_view point[3] = {"3.0", "4.0", "5.0"};
    TagList::setPoint(all, 10, point, "AcDbText");
    const std::vector<Tag> expected = {tag(0, "TEXT"), tag(100, "AcDbEntity"), tag(8, "NEW"),
                                       tag(62, "5"),   tag(100, "AcDbText"),   tag(10, "3.0"),
                                       tag(20, "4.0"), tag(30, "5.0"),         tag(100, "AcDbX")};
    EXPECT_EQ(all, expected);
    TagList::setPoint(all, 11, point, "AcDbText", false);
    EXPECT_EQ(all[8], tag(11, "3.0"));
    EXPECT_EQ(all[9], tag(21, "4.0"));
    EXPECT_EQ(all[10], tag(100, "AcDbX")) << "no z for a two-axis point";
}

// Storage -----------------------------------------------------------------------------------

TEST(ArenaTags, ListsStayWholeAndApartSmallOrLarge) {
    StringArena arena;
    std::vector<std::string> values;
    std::vector<std::span<Tag>> lists;
    for (int i = 0; i < 3000; ++i) {
        std::vector<Tag> list;
        for (int k = 0; k <= i % 23; ++k)
            list.push_back(tag(k, arena.store(std::to_string(i) + ":" + std::to_string(k))));
        lists.push_back(arena.storeTags(list));
    }
    std::vector<Tag> large(5000, tag(1000, "big"));
    const std::span<Tag> big = arena.storeTags(large);
    EXPECT_TRUE(arena.storeTags({}).empty());
    ASSERT_EQ(big.size(), 5000u);
    EXPECT_EQ(big.back(), tag(1000, "big"));
    for (int i = 0; i < 3000; ++i) {
        const auto& list = lists[static_cast<std::size_t>(i)];
        ASSERT_EQ(list.size(), static_cast<std::size_t>(i % 23 + 1));
        EXPECT_EQ(list.back().value, std::to_string(i) + ":" + std::to_string(i % 23));
        if (i > 0) {
            const auto& previous = lists[static_cast<std::size_t>(i) - 1];
            EXPECT_TRUE(list.data() >= previous.data() + previous.size() ||
                        list.data() + list.size() <= previous.data())
                << "lists do not overlap";
        }
    }
    EXPECT_GE(arena.bytesUsed(), (5000 + 3000) * sizeof(Tag));
}

TEST(ArenaTags, SharedValuesComeBackAsTheSameText) {
    Database db;
    const std::string_view a = db.storeShared("2.5");
    const std::string_view b = db.storeShared(std::string("2.5"));
    EXPECT_EQ(a, "2.5");
    EXPECT_EQ(a.data(), b.data()) << "a value held is answered again";
    const std::string longer(40, 'x');
    EXPECT_EQ(db.storeShared(longer), longer);
    for (int i = 0; i < 20000; ++i) {
        const std::string text = std::to_string(i) + ".0";
        ASSERT_EQ(db.storeShared(text), text);
    }
    EXPECT_EQ(a, "2.5") << "a value pushed out of the cache keeps its text";
    EXPECT_TRUE(db.storeShared("").empty());
}

// Handles -----------------------------------------------------------------------------------

// Objects to index: lines of a drawing of their own.
class FakeObjects {
public:
    FakeObjects() {
        for (int i = 0; i < 100; ++i)
            lines_.push_back(db_.modelSpace()->addLine({0, 0, 0}, {1, 0, 0}));
    }
    DbObject* at(std::size_t i) { return lines_[i]; }

private:
    Database db_;
    std::vector<DbObject*> lines_;
};

TEST(HandleIndexTable, SequentialAndFarHandlesAreFoundAndTheFirstStays) {
    FakeObjects objects;
    HandleIndex index;
    EXPECT_EQ(index.find(1), nullptr);
    EXPECT_FALSE(index.emplace(0, objects.at(0))) << "0 is no handle";
    for (std::uint64_t h = 1; h <= 50; ++h)
        ASSERT_TRUE(index.emplace(h, objects.at(h)));
    EXPECT_FALSE(index.emplace(7, objects.at(99)));
    EXPECT_EQ(index.find(7), objects.at(7)) << "a handle used twice stays with the first";
    const std::uint64_t far[] = {0xFFFFFFFFFFull, 0x7FFFFFFFFFFFFFFFull, 1u << 20};
    for (std::size_t i = 0; i < std::size(far); ++i)
        EXPECT_TRUE(index.emplace(far[i], objects.at(60 + i)));
    for (std::size_t i = 0; i < std::size(far); ++i)
        EXPECT_EQ(index.find(far[i]), objects.at(60 + i));
    EXPECT_EQ(index.find(51), nullptr);
    EXPECT_EQ(index.find(0xFFFFFFFFFEull), nullptr);
    EXPECT_EQ(index.size(), 53u);
    EXPECT_LT(index.bytes(), 4u << 20) << "far handles do not make the table huge";
    // Handles above a far one, reached as the table grows, are still told apart.
    for (std::uint64_t h = 51; h < 90; ++h)
        ASSERT_TRUE(index.emplace(h, objects.at(h)));
    EXPECT_EQ(index.find(89), objects.at(89));
    HandleIndex other;
    other.swap(index);
    EXPECT_EQ(index.size(), 0u);
    EXPECT_EQ(other.find(0xFFFFFFFFFFull), objects.at(60));
}

TEST(HandleIndexTable, TheTableGrowsByPagesWhereHandlesAre) {
    FakeObjects objects;
    HandleIndex index;
    // Either side of a page's end, and one far up the table with no handle in between.
    const std::uint64_t handles[] = {1, 4095, 4096, 4097, 40000};
    for (std::size_t i = 0; i < std::size(handles); ++i)
        ASSERT_TRUE(index.emplace(handles[i], objects.at(i)));
    for (std::size_t i = 0; i < std::size(handles); ++i)
        EXPECT_EQ(index.find(handles[i]), objects.at(i)) << handles[i];
    for (const std::uint64_t absent : {2u, 4094u, 4098u, 8192u, 20000u, 39999u, 40001u, 50000u})
        EXPECT_EQ(index.find(absent), nullptr) << absent;
    EXPECT_FALSE(index.emplace(4096, objects.at(9))) << "the first of a handle stays";
    EXPECT_EQ(index.find(4096), objects.at(2));
    // Three pages of 4096 handles, not a table as long as the highest handle.
    EXPECT_LT(index.bytes(), 40000u * sizeof(void*) / 2);
}

TEST(HandleIndexTable, ADrawingWithAFarHandleFindsEveryObject) {
    std::string text(kTwoTexts);
    text.replace(text.find("5\n101\n"), 6, "5\nFFFFFFFFF0\n");
    auto db = DxfLoader::load(text);
    ASSERT_NE(db->entityByHandle(0x100), nullptr);
    ASSERT_NE(db->entityByHandle(0xFFFFFFFFF0ull), nullptr);
    EXPECT_EQ(db->entityByHandle(0xFFFFFFFFF0ull)->text(1), "second");
    EXPECT_GT(db->handleSeed(), 0xFFFFFFFFF0ull);
    Entity* line = db->modelSpace()->addLine({0, 0, 0}, {1, 1, 0});
    EXPECT_EQ(db->entityByHandle(line->handle()), line);
    EXPECT_NO_THROW(DxfLoader::load(DxfWriter::toText(*db)));
}

}  // namespace
