// Attributes and SEQENDs made in numbers keep only their own values beside a pattern shared
// with their kind: whatever reads them (the tags, the writer, a later change) must find what
// whole tags would hold, and the file must be the same text either way.
#include "drawing/Attribute.h"
#include "drawing/AttributeLayout.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "drawing/PatternTexts.h"
#include "drawing/SymbolTable.h"
#include "drawing/TagPattern.h"
#include "drawing/TagValues.h"
#include "drawing/UndoJournal.h"
#include "tests/drawing/StepByStepAttribute.h"

#include <gtest/gtest.h>

#include <memory>
#include <optional>
#include <string>
#include <vector>

using namespace zvdb;

namespace {

std::vector<std::string> lines(const DbObject& object) {
    std::vector<std::string> all;
    for (const Tag& item : object.tags())
        all.push_back(std::to_string(item.code) + " " + std::string(item.value));
    return all;
}

// A block with what real definitions carry: a plain one, an aligned one, a rotated
// invisible one on a layer of its own with colour and linetype, a constant one, and a
// multi-line one (an MTEXT part after the text).
BlockRecord* sampleBlock(Database& db) {
    db.createLayer("PAGE");
    db.createLayer("ATTS");
    BlockRecord* block = db.createBlock("AMOSTRA", {1, 2, 0});
    block->addLine({0, 0, 0}, {10, 0, 0});
    block->addAttributeDefinition("TAG", "Tag", "-K?", {1, 3, 0}, 2.5);
    Attribute* aligned = block->addAttributeDefinition("ALINHADO", "", "", {2, 4, 0}, 1.8);
    aligned->setPoint(11, {8, 4, 0}, "AcDbText");
    aligned->setInteger(72, 2, "AcDbText");
    aligned->setInteger(74, 1, "AcDbAttributeDefinition");
    Attribute* hidden = block->addAttributeDefinition("OCULTO", "", "h", {0, -2, 0}, 3.0, "ATTS");
    hidden->setInvisible(true);
    hidden->setColor(1);
    hidden->setLinetype("DASHED");
    hidden->setReal(50, 90.0, "AcDbText");
    Attribute* fixed = block->addAttributeDefinition("FIXO", "", "c", {0, 9, 0}, 1.0);
    fixed->setInteger(70, 2, "AcDbAttributeDefinition");
    Attribute* multi = block->addAttributeDefinition("LINHAS", "", "a", {0, 12, 0}, 1.0);
    multi->setText(101, "Embedded Object", "AcDbAttributeDefinition");
    return block;
}

struct Made {
    BlockReference* reference;
    std::vector<Attribute*> attributes;
};

// A reference made as the list writers make theirs: the block's layouts, values given.
Made insert(Database& db, BlockRecord& block, const Point3& at, const Point3& scale, double degrees,
            bool paper, const std::vector<std::optional<std::string_view>>& values) {
    BlockRecord* owner = paper ? db.paperSpace() : db.modelSpace();
    BlockReference* reference = owner->addBlockReference(block, at, scale, degrees, "PAGE");
    Point3 base;
    const auto layouts = db.attributeLayouts().variableLayouts(db, block, &base);
    return {reference,
            reference->addAttributesFromLayouts(base, at, scale, degrees, layouts, values)};
}

void fill(Database& db, BlockRecord& block) {
    insert(db, block, {0, 0, 0}, {1, 1, 1}, 0, false, {"-X1", std::nullopt, "", "l"});
    insert(db, block, {12.5, -7.25, 0}, {1, 1, 1}, 30, false, {});
    insert(db, block, {100, 200, 3}, {2, 0.5, 1}, 0, false, {"a", "b", "c", "d"});
    insert(db, block, {-4, 9, 0}, {-1, 1, 1}, 270, false, {std::nullopt, "x"});
    insert(db, block, {1, 2, 0}, {1, 1, 1}, 45, true, {"paper"});
}

// Every object's tags put together, as any reader of them would.
void expandAll(Database& db) {
    for (BlockRecord* owner : {db.modelSpace(), db.paperSpace()})
        for (Entity* entity : owner->entities()) {
            (void)entity->tags();
            for (Entity* sub : entity->subEntities())
                (void)sub->tags();
            if (entity->seqend()) (void)entity->seqend()->tags();
        }
}

std::size_t patternedCount(Database& db) {
    std::size_t count = 0;
    for (BlockRecord* owner : {db.modelSpace(), db.paperSpace()})
        for (Entity* entity : owner->entities()) {
            for (Entity* sub : entity->subEntities())
                count += sub->isPatterned() ? 1 : 0;
            if (entity->seqend()) count += entity->seqend()->isPatterned() ? 1 : 0;
        }
    return count;
}

}  // namespace

TEST(PatternedObjects, TheWriterGivesTheSameTextAsTheWholeTags) {
    Database db;
    BlockRecord* block = sampleBlock(db);
    fill(db, *block);
    // 5 references of 4 variable definitions each, and their SEQENDs.
    EXPECT_EQ(patternedCount(db), 25u);
    const std::string patterned = DxfWriter::toText(db);
    EXPECT_EQ(patternedCount(db), 25u) << "writing puts no tags together";
    expandAll(db);
    EXPECT_EQ(patternedCount(db), 0u);
    EXPECT_EQ(DxfWriter::toText(db), patterned);
}

TEST(PatternedObjects, ValuesAndExtendedDataOfEveryLengthAreWrittenWhole) {
    // The writer copies short runs and values by words of its own and long ones at once:
    // each length up to well past a word goes out as the whole tags write it.
    Database db;
    BlockRecord* block = sampleBlock(db);
    std::vector<std::string> values;
    // And values that make an object longer than the room it is first put in.
    std::vector<std::size_t> lengths;
    for (std::size_t n = 0; n <= 40; ++n)
        lengths.push_back(n);
    for (const std::size_t n : {900, 1000, 1023, 1024, 1100, 5000})
        lengths.push_back(n);
    for (const std::size_t n : lengths) {
        std::string value;
        for (std::size_t i = 0; i < n; ++i)
            value += char('a' + (n + i) % 26);
        values.push_back(value);
    }
    for (std::size_t n = 0; n < values.size(); ++n) {
        const std::string_view value = values[n];
        const Made made = insert(db, *block, {double(n), 0.5 * double(n), 0}, {1, 1, 1}, 0, false,
                                 {value, value, value, value});
        const std::string_view texts[] = {value, "x"};
        made.reference->setXDataTexts("ZV_LENGTHS", texts);
    }
    const std::string patterned = DxfWriter::toText(db);
    for (const std::string& value : values)
        EXPECT_NE(patterned.find("\n  1\n" + value + "\n"), std::string::npos) << value;
    EXPECT_GT(patternedCount(db), values.size());
    expandAll(db);
    EXPECT_EQ(patternedCount(db), 0u);
    EXPECT_EQ(DxfWriter::toText(db), patterned);
}

TEST(PatternedObjects, TheWriterGivesTheSameTextAsTheWholeTagsInEitherEncoding) {
    // An older file writes texts outside ASCII in its code page: fixed tags (a tag name) and
    // values given or taken from the definition, in the pattern's text and beside it.
    for (const std::string version : {"AC1015", "AC1024"}) {
        Database db;
        db.setVersion(version);
        BlockRecord* block = sampleBlock(db);
        block->addAttributeDefinition("AÇÃO", "", "padrão", {0, 15, 0}, 1.0, "ATTS");
        fill(db, *block);
        const Made made =
            insert(db, *block, {5, 5, 0}, {1, 1, 1}, 0, false, {"ação", "Ω", "", "ü", "€"});
        made.attributes[1]->setXData("ZV_PATTERN_TEST", std::vector<Tag>{{1000, "café"}});
        const std::string patterned = DxfWriter::toText(db);
        EXPECT_GT(patternedCount(db), 25u);
        expandAll(db);
        EXPECT_EQ(patternedCount(db), 0u);
        EXPECT_EQ(DxfWriter::toText(db), patterned) << version;
        const bool legacy = version == "AC1015";
        EXPECT_EQ(patterned.find("ação") != std::string::npos, !legacy) << version;
        EXPECT_EQ(patterned.find("a\xE7\xE3o") != std::string::npos, legacy) << version;
        EXPECT_EQ(patterned.find("A\xC7\xC3O") != std::string::npos, legacy) << version;
    }
}

TEST(PatternedObjects, TagsAreThoseOfTheStepByStepAttribute) {
    Database db;
    BlockRecord* block = sampleBlock(db);
    const std::vector<std::optional<std::string_view>> values = {"v1", std::nullopt, "v3", "v4"};
    // Scaled, flat (the elevations and heights are the patterns' own), raised, at a zero
    // that may come out negative, below zero; whether each is flat (-1: either).
    struct Placement {
        Point3 at, scale;
        int flat;
    };
    const Placement placements[] = {{{3, 4, 0}, {1, 2, 1}, 0},
                                    {{3, 4, 0}, {1, 1, 1}, 1},
                                    {{3, 4, 0.5}, {1, 1, 1}, 0},
                                    {{3, 4, -0.0}, {1, 1, 1}, -1},
                                    {{3, 4, -2}, {1, 1, 1}, 0}};
    for (const auto& [at, scale, flat] : placements)
        for (const bool paper : {false, true})
            for (const double degrees : {0.0, 30.0}) {
                SCOPED_TRACE(::testing::Message()
                             << degrees << " at " << at.z << " scale " << scale.y);
                const Made fast = insert(db, *block, at, scale, degrees, paper, values);
                BlockRecord* owner = paper ? db.paperSpace() : db.modelSpace();
                BlockReference* slow = owner->addBlockReference(*block, at, scale, degrees, "PAGE");
                std::size_t i = 0;
                for (Attribute* definition : block->attributeDefinitions()) {
                    if (definition->isConstant()) continue;
                    Attribute* made = madeStepByStep(*slow, *definition);
                    if (values[i]) made->setTextValue(*values[i]);
                    ++i;
                }
                ASSERT_EQ(fast.attributes.size(), 4u);
                // A flat reference's attributes keep neither elevation nor height of their own:
                // the aligned one's position, alignment point, height, value (and rotation).
                const std::size_t aligned = 8 + (degrees != 0 ? 1 : 0);
                if (flat >= 0) {
                    EXPECT_EQ(fast.attributes[1]->patternValues()->pattern->holeCount(),
                              flat ? aligned - 3 : aligned);
                }
                for (std::size_t k = 0; k < fast.attributes.size(); ++k) {
                    Attribute* mine = fast.attributes[k];
                    // Type, handle and owner are answered without the tags.
                    EXPECT_EQ(mine->type(), "ATTRIB");
                    EXPECT_TRUE(mine->isPatterned());
                    std::vector<std::string> expected = lines(*slow->attributes()[k]);
                    expected[1] = "5 " + TagValues::fromHandle(mine->handle());
                    expected[2] = "330 " + TagValues::fromHandle(fast.reference->handle());
                    EXPECT_EQ(lines(*mine), expected);
                    EXPECT_FALSE(mine->isPatterned());
                }
                std::vector<std::string> seqend = lines(*slow->seqend());
                seqend[1] = "5 " + TagValues::fromHandle(fast.reference->seqend()->handle());
                seqend[2] = "330 " + TagValues::fromHandle(fast.reference->handle());
                EXPECT_EQ(lines(*fast.reference->seqend()), seqend);
                EXPECT_EQ(fast.attributes[3]->text(101), "Embedded Object") << "multi-line part";
            }
}

TEST(PatternedObjects, ChangesAfterMakingAreWrittenAndReadBack) {
    Database db;
    BlockRecord* block = sampleBlock(db);
    EXPECT_FALSE(db.hasPatternedObjects());
    const Made made = insert(db, *block, {10, 10, 0}, {1, 1, 1}, 0, false, {"A", "B", "C", "D"});
    EXPECT_TRUE(db.hasPatternedObjects()) << "another thread may not read the drawing now";
    const Made other = insert(db, *block, {10, 20, 0}, {1, 1, 1}, 0, false, {"E", "F", "G", "H"});
    made.attributes[0]->setTextValue("-K9");
    made.attributes[1]->setPosition({7, 8, 0});
    const Tag item[] = {Tag{1000, "tied"}};
    made.attributes[2]->setXData("ZV_PATTERN_TEST", item);
    made.attributes[3]->erase();
    other.reference->seqend()->setLayer("ATTS");
    // The untouched ones stay patterned.
    EXPECT_TRUE(other.attributes[0]->isPatterned());

    auto copy = DxfLoader::load(DxfWriter::toText(db));
    EXPECT_FALSE(copy->hasPatternedObjects()) << "a drawing read from its file holds none";
    EXPECT_NE(copy->table("APPID")->find("ZV_PATTERN_TEST"), nullptr)
        << "extended data on a patterned object is registered";
    auto* again = dynamic_cast<BlockReference*>(copy->entityByHandle(made.reference->handle()));
    ASSERT_NE(again, nullptr);
    ASSERT_EQ(again->attributes().size(), 3u);
    EXPECT_EQ(again->attribute("TAG")->textValue(), "-K9");
    EXPECT_EQ(again->attribute("ALINHADO")->position(), (Point3{7, 8, 0}));
    EXPECT_EQ(again->attribute("OCULTO")->xdata("ZV_PATTERN_TEST").at(0).value, "tied");
    EXPECT_EQ(again->attribute("LINHAS"), nullptr);
    auto* second = dynamic_cast<BlockReference*>(copy->entityByHandle(other.reference->handle()));
    ASSERT_NE(second, nullptr);
    EXPECT_EQ(second->attribute("LINHAS")->textValue(), "H");
    EXPECT_EQ(second->seqend()->layer(), "ATTS");
}

TEST(PatternedObjects, ADefinitionChangedLaterLeavesEarlierAttributesAsTheyWere) {
    Database db;
    BlockRecord* block = sampleBlock(db);
    const Made before = insert(db, *block, {0, 0, 0}, {1, 1, 1}, 0, false, {});
    Attribute* first = block->attributeDefinitions()[0];
    first->setTextValue("new default");
    first->setReal(40, 9.0, "AcDbText");
    const Made after = insert(db, *block, {0, 5, 0}, {1, 1, 1}, 0, false, {});
    // A definition added and one erased change what new references take.
    block->addAttributeDefinition("NOVO", "", "n", {0, 0, 0}, 1.0);
    block->attributeDefinitions()[1]->erase();
    const Made last = insert(db, *block, {0, 10, 0}, {1, 1, 1}, 0, false, {});

    const std::string text = DxfWriter::toText(db);
    auto copy = DxfLoader::load(text);
    const auto attribute = [&](const Made& made, std::string_view tag) {
        auto* reference =
            dynamic_cast<BlockReference*>(copy->entityByHandle(made.reference->handle()));
        return reference ? reference->attribute(tag) : nullptr;
    };
    ASSERT_NE(attribute(before, "TAG"), nullptr);
    EXPECT_EQ(attribute(before, "TAG")->textValue(), "-K?");
    EXPECT_EQ(attribute(before, "TAG")->height(), 2.5);
    EXPECT_EQ(attribute(after, "TAG")->textValue(), "new default");
    EXPECT_EQ(attribute(after, "TAG")->height(), 9.0);
    EXPECT_NE(attribute(after, "ALINHADO"), nullptr);
    EXPECT_EQ(attribute(last, "ALINHADO"), nullptr);
    ASSERT_NE(attribute(last, "NOVO"), nullptr);
    EXPECT_EQ(attribute(last, "NOVO")->textValue(), "n");
    expandAll(db);
    EXPECT_EQ(DxfWriter::toText(db), text);
}

TEST(PatternedObjects, UndoAndASwappedDrawingKeepThem) {
    Database db;
    BlockRecord* block = sampleBlock(db);
    UndoJournal journal;
    journal.beginGroup(db);
    fill(db, *block);
    journal.endGroup(db);
    const std::string filled = DxfWriter::toText(db);
    ASSERT_TRUE(journal.undo(db));
    EXPECT_EQ(patternedCount(db), 0u);
    EXPECT_EQ(db.modelSpace()->entityCount(), 0u);
    ASSERT_TRUE(journal.redo(db));
    EXPECT_EQ(DxfWriter::toText(db), filled);

    // Patterns go with the objects made from them when a drawing takes another's content.
    auto other = std::make_unique<Database>();
    BlockRecord* otherBlock = sampleBlock(*other);
    fill(*other, *otherBlock);
    const std::string expected = DxfWriter::toText(*other);
    db.swapContents(*other);
    other.reset();
    EXPECT_EQ(DxfWriter::toText(db), expected);
}

TEST(TagPatterns, HolesAndIdentityAreFilledInOrder) {
    Database db;
    std::vector<Tag> tags = {Tag{0, "SEQEND"}, Tag{5, TagPattern::handleHole()},
                             Tag{330, TagPattern::ownerHole()}, Tag{8, TagPattern::hole(1)},
                             Tag{62, TagPattern::hole(0)}};
    PatternTexts texts;
    const TagPattern pattern(tags, texts);
    EXPECT_EQ(pattern.holeCount(), 2u);
    EXPECT_EQ(pattern.type(), "SEQEND");
    EXPECT_FALSE(pattern.takesXData());
    TagPattern::Values* values = pattern.make(db.arena());
    EXPECT_EQ(values->values()[0], 0u) << "holes start empty";
    values->values()[0] = texts.shared(db.store("3"));
    values->values()[1] = texts.add(db.store("LAYER"));
    std::vector<std::string> visited;
    pattern.forEach(*values, 0x2AF, 0x1F, [&](int code, std::string_view value) {
        visited.push_back(std::to_string(code) + " " + std::string(value));
    });
    EXPECT_EQ(visited,
              (std::vector<std::string>{"0 SEQEND", "5 2AF", "330 1F", "8 LAYER", "62 3"}));
    const std::vector<Tag> whole = pattern.expand(*values, 0x2AF, 0x1F, db.arena());
    ASSERT_EQ(whole.size(), 5u);
    EXPECT_EQ(whole[1].value, "2AF");
    EXPECT_EQ(whole[4].value, "3");
    // Values are read without putting the tags together; the handle is not one of them.
    std::string_view found;
    EXPECT_EQ(pattern.find(*values, 8, found), TagPattern::Lookup::Found);
    EXPECT_EQ(found, "LAYER");
    EXPECT_EQ(pattern.find(*values, 40, found), TagPattern::Lookup::Absent);
    EXPECT_EQ(pattern.find(*values, 5, found), TagPattern::Lookup::Unknown);
    EXPECT_TRUE(values->xdata().empty());
    const Tag group[] = {Tag{1001, "APP"}};
    EXPECT_THROW(values->setXData(group), std::logic_error) << "no room for extended data";
    // Extended data is no part of a pattern, and holes are counted.
    EXPECT_THROW(TagPattern(std::vector<Tag>{Tag{0, "X"}, Tag{1001, "APP"}}, texts),
                 std::logic_error);
    EXPECT_THROW(TagPattern::hole(TagPattern::kMaxHoles), std::logic_error);
}

TEST(PatternedObjects, AReferenceMadeForItsAttributesIsMarkedAsTheFirstAttributeWouldMarkIt) {
    Database db;
    BlockRecord* block = sampleBlock(db);
    for (const bool paper : {false, true})
        for (const double degrees : {0.0, 12.5}) {
            BlockRecord* owner = paper ? db.paperSpace() : db.modelSpace();
            const Point3 at{4, -2, 0}, scale{1, 3, 1};
            const auto layouts = db.attributeLayouts().variableLayouts(db, *block);
            BlockReference* later = owner->addBlockReference(*block, at, scale, degrees, "PAGE");
            later->addAttributesFromLayouts(block->basePoint(), at, scale, degrees, layouts, {});
            BlockReference* marked =
                db.addBlockReference(*owner, *block, at, scale, degrees, "PAGE", true);
            EXPECT_EQ(marked->integer(66), 1);
            marked->addAttributesFromLayouts(block->basePoint(), at, scale, degrees, layouts, {});
            std::vector<std::string> expected = lines(*later);
            expected[1] = "5 " + TagValues::fromHandle(marked->handle());
            EXPECT_EQ(lines(*marked), expected);
            EXPECT_EQ(marked->attributes().size(), 4u);
            EXPECT_EQ(marked->tags().back(), (Tag{66, "1"})) << "at the end of its subclass";
        }
}

TEST(PatternedObjects, ABlockWhoseBasePointMovesPlacesLaterAttributesByTheNewOne) {
    Database db;
    BlockRecord* block = sampleBlock(db);
    const Made before = insert(db, *block, {10, 0, 0}, {1, 1, 1}, 0, false, {});
    block->setBasePoint({-3, 7, 0});
    const Made after = insert(db, *block, {10, 0, 0}, {1, 1, 1}, 0, false, {});
    BlockReference* slow = db.modelSpace()->addBlockReference(*block, {10, 0, 0});
    const Attribute* first = block->attributeDefinitions()[0];
    const Attribute* expected = madeStepByStep(*slow, *first);
    EXPECT_EQ(after.attributes[0]->position(), expected->position());
    EXPECT_EQ(after.attributes[0]->position(), (Point3{14, -4, 0}));
    EXPECT_EQ(before.attributes[0]->position(), (Point3{10, 1, 0})) << "made by the old one";
}

TEST(ExtendedDataOnFileObjects, AGroupReplacedInPlaceTakesItsRoomOnceAndItsOwnItems) {
    Database made;
    BlockRecord* block = made.createBlock("SIMBOLO");
    BlockReference* symbol = made.modelSpace()->addBlockReference(*block, {1, 2, 0});
    const Tag first[] = {Tag{1000, "A1"}, Tag{1000, "A2"}};
    const Tag second[] = {Tag{1000, "B1"}};
    symbol->setXData("ZV_A", first);
    symbol->setXData("ZV_B", second);
    auto loaded = DxfLoader::load(DxfWriter::toText(made));
    DbObject* read = loaded->objectByHandle(symbol->handle());
    ASSERT_NE(read, nullptr);
    const std::size_t before = read->tags().size();

    const Tag longer[] = {Tag{1000, "C1"}, Tag{1070, "7"}, Tag{1000, "C3"}, Tag{1000, "C4"}};
    read->setXData("ZV_A", longer);
    EXPECT_EQ(read->tags().size(), before + 2);
    EXPECT_EQ(read->editTags().capacity(), read->tags().size()) << "copied at its new size";
    EXPECT_EQ(read->xdataApplications(), (std::vector<std::string_view>{"ZV_A", "ZV_B"}));
    ASSERT_EQ(read->xdata("ZV_A").size(), 4u);
    EXPECT_EQ(read->xdata("ZV_A")[1], (Tag{1070, "7"}));

    // Its own items given back, shorter: no stale view of the list it changes.
    read->setXData("ZV_B", read->xdataItems("ZV_A").first(2));
    EXPECT_EQ(read->xdata("ZV_B"), (std::vector<Tag>{Tag{1000, "C1"}, Tag{1070, "7"}}));
    EXPECT_EQ(read->xdata("ZV_A").size(), 4u);
    auto again = DxfLoader::load(DxfWriter::toText(*loaded));
    EXPECT_EQ(again->objectByHandle(symbol->handle())->xdata("ZV_B").size(), 2u);
}

TEST(ExtendedDataOnFileObjects, AnApplicationIsRegisteredOnceAndAgainAfterItsRecordGoes) {
    Database db;
    EXPECT_TRUE(db.registerApplication("ZV_APP"));
    EXPECT_FALSE(db.registerApplication("zv_app")) << "names are compared without case";
    EXPECT_TRUE(db.registerApplication("ZV_OTHER"));
    EXPECT_FALSE(db.registerApplication("ZV_APP"));
    db.table("APPID")->find("ZV_APP")->erase();
    db.table("APPID")->reindex();
    EXPECT_FALSE(db.isApplicationRegistered("ZV_APP"));
    EXPECT_TRUE(db.registerApplication("ZV_APP"));
    EXPECT_TRUE(db.isApplicationRegistered("ZV_APP"));
    // A drawing that takes another's content answers from its own table.
    Database other;
    db.swapContents(other);
    EXPECT_TRUE(db.registerApplication("ZV_APP"));
    EXPECT_FALSE(other.registerApplication("ZV_OTHER"));
}

TEST(ExtendedDataOnFileObjects,
     ApplicationsAskedInTurnsAreRegisteredOnceWhateverTheirRecordsBecome) {
    Database db;
    EXPECT_TRUE(db.registerApplication("ZV_A"));
    EXPECT_TRUE(db.registerApplication("ZV_B"));
    for (int i = 0; i < 3; ++i) {
        EXPECT_FALSE(db.registerApplication("ZV_A"));
        EXPECT_FALSE(db.registerApplication("ZV_B"));
        EXPECT_FALSE(db.registerApplication("zv_b"));
    }
    // A record renamed no longer answers for the name it was asked by.
    db.table("APPID")->find("ZV_B")->setText(2, "ZV_C");
    db.table("APPID")->reindex();
    EXPECT_TRUE(db.registerApplication("ZV_B"));
    EXPECT_TRUE(db.isApplicationRegistered("ZV_B"));
    EXPECT_FALSE(db.registerApplication("zv_b"));
    EXPECT_FALSE(db.registerApplication("ZV_C"));
    // Nor does one erased, though it was asked a moment ago.
    EXPECT_FALSE(db.registerApplication("ZV_A"));
    db.table("APPID")->find("ZV_A")->erase();
    db.table("APPID")->reindex();
    EXPECT_TRUE(db.registerApplication("ZV_A"));
    EXPECT_TRUE(db.isApplicationRegistered("ZV_A"));
}

namespace {

// The tags a new reference has when made whole, one by one.
std::vector<std::string> wholeReference(const BlockReference& reference, const BlockRecord& owner,
                                        const Point3& at, const Point3& scale, double degrees) {
    std::vector<std::string> all = {"0 INSERT", "5 " + TagValues::fromHandle(reference.handle()),
                                    "330 " + TagValues::fromHandle(owner.handle()),
                                    "100 AcDbEntity"};
    if (owner.isPaperSpace()) all.push_back("67 1");
    all.push_back("8 PAGE");
    all.push_back("100 AcDbBlockReference");
    all.push_back("2 AMOSTRA");
    all.push_back("10 " + TagValues::fromReal(at.x));
    all.push_back("20 " + TagValues::fromReal(at.y));
    all.push_back("30 " + TagValues::fromReal(at.z));
    if (scale.x != 1.0) all.push_back("41 " + TagValues::fromReal(scale.x));
    if (scale.y != 1.0) all.push_back("42 " + TagValues::fromReal(scale.y));
    if (scale.z != 1.0) all.push_back("43 " + TagValues::fromReal(scale.z));
    if (degrees != 0.0) all.push_back("50 " + TagValues::fromReal(degrees));
    all.push_back("66 1");
    return all;
}

}  // namespace

TEST(PatternedReferences, ReadEditedSavedAndLoadedTheyEqualTheirWholeTags) {
    Database db;
    BlockRecord* block = sampleBlock(db);
    struct Case {
        bool paper;
        Point3 at, scale;
        double degrees;
    };
    const Case cases[] = {{false, {3, 4, 0}, {1, 1, 1}, 0},
                          {false, {-1.5, 2.25, 1}, {2, 0.5, 3}, 30},
                          {true, {7, 8, 0}, {1, 1, 1}, 90}};
    std::vector<BlockReference*> made;
    for (const Case& c : cases) {
        BlockRecord* owner = c.paper ? db.paperSpace() : db.modelSpace();
        BlockReference* reference =
            db.addBlockReference(*owner, *block, c.at, c.scale, c.degrees, "PAGE", true);
        const auto layouts = db.attributeLayouts().variableLayouts(db, *block);
        const std::vector<std::optional<std::string_view>> values = {"v"};
        reference->addAttributesFromLayouts(block->basePoint(), c.at, c.scale, c.degrees, layouts,
                                            values);
        ASSERT_TRUE(reference->isPatterned());
        // What the writers and the attributes ask of it is answered from its values.
        EXPECT_EQ(reference->blockName(), "AMOSTRA");
        EXPECT_EQ(reference->layer(), "PAGE");
        EXPECT_EQ(reference->integer(66), 1);
        EXPECT_EQ(reference->inPaperSpace(), c.paper);
        EXPECT_EQ(reference->rotation(), c.degrees);
        EXPECT_EQ(reference->real(41, 1.0), c.scale.x);
        EXPECT_EQ(reference->color(), 256) << "absent: the fallback";
        EXPECT_EQ(reference->attribute("TAG")->textValue(), "v");
        EXPECT_TRUE(reference->isPatterned());
        EXPECT_TRUE(reference->attributes()[0]->isPatterned());
        made.push_back(reference);
    }

    // Extended data stays beside the values: a group, a second one, the first replaced.
    const Tag link[] = {Tag{1000, "2A"}};
    const Tag other[] = {Tag{1000, "x"}, Tag{1070, "3"}};
    const Tag again[] = {Tag{1000, "2B"}};
    made[0]->setXData("ZV_LINK_TEST", link);
    made[1]->setXData("ZV_LINK_TEST", link);
    made[1]->setXData("ZV_OTHER_TEST", other);
    made[1]->setXData("ZV_LINK_TEST", again);
    // A value given later to a hole keeps the object patterned; a tag it lacks does not.
    made[0]->attributes()[0]->setTextValue("changed");
    made[1]->setRotation(45);
    made[2]->setColor(3);
    EXPECT_TRUE(made[0]->isPatterned());
    EXPECT_TRUE(made[1]->isPatterned());
    EXPECT_TRUE(made[0]->attributes()[0]->isPatterned());
    EXPECT_FALSE(made[2]->isPatterned());
    EXPECT_EQ(made[2]->editTags().capacity(), made[2]->tags().size())
        << "put together with room for the one tag, not doubled for it";
    // The application's record gone, saving names it again from the values.
    db.table("APPID")->find("ZV_OTHER_TEST")->erase();
    db.table("APPID")->reindex();

    const std::string patterned = DxfWriter::toText(db);
    EXPECT_TRUE(made[1]->isPatterned()) << "writing puts no tags together";
    std::vector<std::vector<std::string>> expected;
    for (std::size_t i = 0; i < made.size(); ++i) {
        const Case& c = cases[i];
        BlockRecord* owner = c.paper ? db.paperSpace() : db.modelSpace();
        std::vector<std::string> whole =
            wholeReference(*made[i], *owner, c.at, c.scale, i == 1 ? 45.0 : c.degrees);
        if (i == 0) whole.insert(whole.end(), {"1001 ZV_LINK_TEST", "1000 2A"});
        if (i == 1)
            whole.insert(whole.end(), {"1001 ZV_LINK_TEST", "1000 2B", "1001 ZV_OTHER_TEST",
                                       "1000 x", "1070 3"});
        if (i == 2) whole.insert(whole.begin() + 6, "62 3");
        EXPECT_EQ(lines(*made[i]), whole) << i;
        expected.push_back(whole);
    }
    EXPECT_EQ(made[0]->attributes()[0]->textValue(), "changed");
    expandAll(db);
    EXPECT_FALSE(made[1]->isPatterned());
    EXPECT_EQ(DxfWriter::toText(db), patterned) << "the same file either way";

    auto copy = DxfLoader::load(patterned);
    EXPECT_NE(copy->table("APPID")->find("ZV_OTHER_TEST"), nullptr);
    for (std::size_t i = 0; i < made.size(); ++i) {
        auto* read = dynamic_cast<BlockReference*>(copy->entityByHandle(made[i]->handle()));
        ASSERT_NE(read, nullptr);
        EXPECT_EQ(lines(*read), expected[i]);
        EXPECT_EQ(read->attributes().size(), 4u);
    }
    auto* first = dynamic_cast<BlockReference*>(copy->entityByHandle(made[0]->handle()));
    EXPECT_EQ(first->attribute("TAG")->textValue(), "changed");
    EXPECT_EQ(first->xdata("ZV_LINK_TEST").at(0).value, "2A");
}

TEST(PatternTexts, SharedViewsKeepOneNumberAndOwnValuesGetTheirs) {
    Database db;
    PatternTexts texts;
    EXPECT_EQ(texts[0], "");
    EXPECT_EQ(texts.add({}), 0u) << "the empty value is number 0";
    const std::string_view kept = db.store("12.5");
    const std::uint32_t number = texts.shared(kept);
    EXPECT_EQ(texts.shared(kept), number);
    EXPECT_EQ(texts[number], "12.5");
    // The same text elsewhere is another value to the table, and numbers never move.
    const std::uint32_t elsewhere = texts.shared(db.store("12.5"));
    EXPECT_NE(elsewhere, number);
    std::vector<std::uint32_t> numbers;
    std::vector<std::string> values;
    for (int i = 0; i < 10000; ++i) {
        values.push_back(std::to_string(i) + "v");
        numbers.push_back(texts.add(db.store(values.back())));
    }
    for (std::size_t i = 0; i < numbers.size(); ++i)
        ASSERT_EQ(texts[numbers[i]], values[i]);
    EXPECT_EQ(texts[number], "12.5");
    EXPECT_EQ(texts.size(), 10003u);
}
