// What placing block references in numbers leans on: the placement of a reference worked out
// directly, model space remembered between look-ups, the numbers of the reals' texts, the
// flags a pattern fixes, extended data of texts, and the pooled room of the objects.
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

#include "TagLines.h"

#include <gtest/gtest.h>

#include <bit>
#include <cmath>
#include <cstdint>
#include <limits>
#include <memory>
#include <numbers>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

using namespace zvdb;

namespace {

// The placement as the product of its steps, the way a reference's transform is defined.
Transform composed(const Point3& base, const Point3& position, const Point3& scale,
                   double degrees) {
    return Transform::fromOcs({0, 0, 1}) * Transform::translation(position) *
           Transform::rotationZ(degrees * std::numbers::pi / 180.0) *
           Transform::scaling(scale.x, scale.y, scale.z) * Transform::translation(base * -1.0);
}

std::vector<std::uint64_t> bits(const Transform& t) {
    std::vector<std::uint64_t> all;
    for (const double entry : t.linear)
        all.push_back(std::bit_cast<std::uint64_t>(entry));
    for (const double entry : {t.move.x, t.move.y, t.move.z})
        all.push_back(std::bit_cast<std::uint64_t>(entry));
    return all;
}

}  // namespace

TEST(ReferencePlacement, IsTheProductOfItsStepsBitForBit) {
    const double values[] = {0.0, -0.0, 1.0, -1.0, 2.5, -7.25, 1e-300, 123456.789, -0.1};
    const double scales[] = {1.0, -1.0, 0.5, 0.0, -0.0, 3.0};
    const double degrees[] = {0.0, -0.0, 30.0, 90.0, 180.0, 270.0, -45.0, 12.5};
    for (const double a : values)
        for (const double b : values)
            for (const double s : scales)
                for (const double r : degrees) {
                    const Point3 base{a, -b, b}, position{b, a, -a}, scale{s, 1.0 / 3, s};
                    EXPECT_EQ(bits(BlockReference::transformOf(base, position, scale, r)),
                              bits(composed(base, position, scale, r)))
                        << a << " " << b << " " << s << " " << r;
                }
}

TEST(ReferencePlacement, ValuesOutOfRangeTakeTheProductToo) {
    const double huge = std::numeric_limits<double>::max();
    const double infinite = std::numeric_limits<double>::infinity();
    const struct {
        Point3 base, position, scale;
    } cases[] = {{{0, 0, 0}, {infinite, 0, 0}, {1, 1, 1}},
                 {{1, 2, 3}, {4, 5, 6}, {huge, huge, 1}},
                 {{huge, 0, 0}, {-huge, 0, 0}, {4, 1, 1}},
                 {{0, std::nan(""), 0}, {1, 1, 1}, {1, 1, 1}},
                 {{infinite, -infinite, 0}, {1, 2, 3}, {1, 1, 1}},
                 {{1, 2, 3}, {0, -infinite, 0}, {1, 1, 1}}};
    for (const auto& c : cases)
        for (const double degrees : {0.0, 30.0}) {
            const auto made =
                bits(BlockReference::transformOf(c.base, c.position, c.scale, degrees));
            EXPECT_EQ(made, bits(composed(c.base, c.position, c.scale, degrees)));
        }
    // Another extrusion goes through the product whatever the values.
    const Point3 down{0, 0, -1};
    const Transform turned = BlockReference::transformOf({1, 2, 0}, {3, 4, 0}, {1, 1, 1}, 0, down);
    EXPECT_EQ(turned.apply({1, 2, 0}).x, -3.0);
}

TEST(ModelSpace, IsFoundAgainAfterItsRecordIsRenamedErasedOrSwapped) {
    Database db;
    BlockRecord* first = db.modelSpace();
    ASSERT_NE(first, nullptr);
    EXPECT_EQ(db.modelSpace(), first);
    // Another record takes the name: the table's index says so.
    BlockRecord* other = db.createBlock("OUTRO");
    first->setText(2, "*Model_Space_Old");
    other->setText(2, "*Model_Space");
    db.table("BLOCK_RECORD")->reindex();
    EXPECT_EQ(db.modelSpace(), other);
    EXPECT_TRUE(db.modelSpace()->isModelSpace());
    // Erased, it is no longer found.
    other->erase();
    EXPECT_EQ(db.modelSpace(), nullptr);

    Database a, b;
    BlockRecord* ofA = a.modelSpace();
    a.swapContents(b);
    ASSERT_NE(a.modelSpace(), nullptr);
    EXPECT_NE(a.modelSpace(), ofA) << "the record went with the other content";
    EXPECT_EQ(&a.modelSpace()->database(), &a);
    EXPECT_EQ(b.modelSpace(), ofA);
}

TEST(ModelSpace, ReferencesPlacedThereAreNotInPaperSpace) {
    Database db;
    BlockRecord* block = db.createBlock("BLOCO");
    block->addAttributeDefinition("TAG", "", "v", {1, 1, 0}, 2.0);
    const auto layouts = db.attributeLayouts().variableLayouts(db, *block);
    for (BlockRecord* owner : {db.modelSpace(), db.paperSpace(), db.modelSpace()}) {
        BlockReference* reference =
            db.addBlockReference(*owner, *block, {1, 2, 0}, {1, 1, 1}, 0, "0", true);
        reference->placeAttributesFromLayouts({}, {1, 2, 0}, {1, 1, 1}, 0, layouts, {});
        const bool paper = owner == db.paperSpace();
        EXPECT_EQ(reference->inPaperSpace(), paper);
        ASSERT_EQ(reference->attributes().size(), 1u);
        EXPECT_EQ(reference->attributes()[0]->inPaperSpace(), paper);
        EXPECT_EQ(reference->seqend()->inPaperSpace(), paper);
    }
}

TEST(TagPatterns, FlagsFixedForAllAreKnownAndOthersAreNot) {
    PatternTexts texts;
    const std::vector<Tag> fixed = {Tag{0, "INSERT"}, Tag{5, TagPattern::handleHole()},
                                    Tag{67, "1"}, Tag{66, "1"}};
    const std::vector<Tag> none = {Tag{0, "INSERT"}, Tag{8, TagPattern::hole(0)}};
    const std::vector<Tag> own = {Tag{0, "INSERT"}, Tag{67, TagPattern::hole(0)}, Tag{66, "0"}};
    const std::vector<Tag> grouped = {Tag{0, "INSERT"}, Tag{102, "{ACAD_REACTORS"}, Tag{330, "1F"},
                                      Tag{102, "}"}, Tag{67, "1"}};
    EXPECT_EQ(TagPattern(fixed, texts).paperSpaceFlag(), 1);
    EXPECT_EQ(TagPattern(fixed, texts).attributesFollowFlag(), 1);
    EXPECT_EQ(TagPattern(none, texts).paperSpaceFlag(), 0);
    EXPECT_EQ(TagPattern(none, texts).attributesFollowFlag(), 0);
    EXPECT_EQ(TagPattern(own, texts).paperSpaceFlag(), -1);
    EXPECT_EQ(TagPattern(own, texts).attributesFollowFlag(), 0);
    EXPECT_EQ(TagPattern(grouped, texts).paperSpaceFlag(), -1);
}

TEST(RealTexts, NumbersNameTheSameTextsAsTheViews) {
    Database db;
    AttributeLayouts& layouts = db.attributeLayouts();
    for (int round = 0; round < 2; ++round)
        for (int i = 0; i < 3000; ++i) {
            const double value = i * 0.25 - 100;
            const std::uint32_t number = layouts.realNumber(db, value);
            ASSERT_NE(number, 0u);
            EXPECT_EQ(layouts.texts()[number], layouts.real(db, value)) << value;
        }
}

TEST(ExtendedDataTexts, AreTheGroupOfTextItems) {
    Database db;
    BlockRecord* block = db.createBlock("BLOCO");
    block->addAttributeDefinition("TAG", "", "v", {1, 1, 0}, 2.0);
    const auto layouts = db.attributeLayouts().variableLayouts(db, *block);
    const auto make = [&] {
        BlockReference* reference =
            db.addBlockReference(*db.modelSpace(), *block, {1, 2, 0}, {1, 1, 1}, 0, "0", true);
        reference->placeAttributesFromLayouts({}, {1, 2, 0}, {1, 1, 1}, 0, layouts, {});
        return reference;
    };
    BlockReference* asTexts = make();
    BlockReference* asTags = make();
    ASSERT_TRUE(asTexts->isPatterned());
    const std::string_view first[] = {"1", "1A2B", "\xc3\xa7"};
    const Tag firstTags[] = {Tag{1000, "1"}, Tag{1000, "1A2B"}, Tag{1000, "\xc3\xa7"}};
    const std::string_view second[] = {"X"};
    const Tag secondTags[] = {Tag{1000, "X"}};
    const std::string_view replaced[] = {"R1", "R2", "R3", "R4"};
    const Tag replacedTags[] = {Tag{1000, "R1"}, Tag{1000, "R2"}, Tag{1000, "R3"}, Tag{1000, "R4"}};
    asTexts->setXDataTexts("ZV_A", first);
    asTexts->setXDataTexts("ZV_B", second);
    asTexts->setXDataTexts("ZV_A", replaced);
    asTags->setXData("ZV_A", firstTags);
    asTags->setXData("ZV_B", secondTags);
    asTags->setXData("ZV_A", replacedTags);
    EXPECT_TRUE(asTexts->isPatterned()) << "the groups stay beside the values";
    std::vector<std::string> expected = lines(*asTags);
    expected[1] = "5 " + TagValues::fromHandle(asTexts->handle());
    EXPECT_EQ(lines(*asTexts), expected);
    EXPECT_EQ(asTexts->xdataApplications(), (std::vector<std::string_view>{"ZV_A", "ZV_B"}));
    EXPECT_EQ(asTexts->xdata("ZV_A").size(), 4u);
    // Read back from the file, and replaced there too (the tags of a file object).
    auto loaded = DxfLoader::load(DxfWriter::toText(db));
    DbObject* read = loaded->objectByHandle(asTexts->handle());
    ASSERT_NE(read, nullptr);
    EXPECT_EQ(read->xdata("ZV_A"), asTags->xdata("ZV_A"));
    read->setXDataTexts("ZV_B", first);
    EXPECT_EQ(read->xdata("ZV_B"), (std::vector<Tag>(std::begin(firstTags), std::end(firstTags))));
    EXPECT_EQ(read->xdataApplications(), (std::vector<std::string_view>{"ZV_A", "ZV_B"}));
    EXPECT_TRUE(loaded->isApplicationRegistered("ZV_B"));
    // More items than fit on the stack.
    std::vector<std::string> many;
    for (int i = 0; i < 40; ++i)
        many.push_back("item" + std::to_string(i));
    const std::vector<std::string_view> views(many.begin(), many.end());
    read->setXDataTexts("ZV_A", views);
    ASSERT_EQ(read->xdata("ZV_A").size(), 40u);
    EXPECT_EQ(read->xdata("ZV_A")[39], (Tag{1000, "item39"}));
    EXPECT_EQ(read->xdata("ZV_B").size(), 3u);
}

namespace {

// Five hundred references with an attribute each; what they hold, line by line.
std::vector<std::string> fillAndRead(Database& db) {
    BlockRecord* block = db.createBlock("BLOCO");
    block->addAttributeDefinition("TAG", "", "v", {1, 1, 0}, 2.0);
    for (int i = 0; i < 500; ++i) {
        BlockReference* reference = db.modelSpace()->addBlockReference(*block, {1.0 * i, 0, 0});
        reference->addAttributeFromDefinition(*block->attributeDefinitions()[0]);
    }
    std::vector<std::string> all;
    for (Entity* entity : db.modelSpace()->entities()) {
        for (const std::string& line : lines(*entity))
            all.push_back(line);
        for (Entity* sub : entity->subEntities())
            for (const std::string& line : lines(*sub))
                all.push_back(line);
    }
    return all;
}

}  // namespace

TEST(PooledObjects, ADrawingMadeOnAThreadThatEndsIsReadAndFreedOnAnother) {
    std::unique_ptr<Database> made;
    std::vector<std::string> onThread;
    std::thread([&] {
        made = std::make_unique<Database>();
        onThread = fillAndRead(*made);
    }).join();
    // Read and changed here, after its thread is gone.
    ASSERT_EQ(made->modelSpace()->entities().size(), 500u);
    made->modelSpace()->entities()[7]->setText(8, "OUTRA");
    EXPECT_EQ(made->modelSpace()->entities()[7]->layer(), "OUTRA");
    EXPECT_EQ(made->modelSpace()->entities()[8]->layer(), "0");
    made.reset();
    // The room given back here is taken again by this thread's objects.
    Database again;
    EXPECT_EQ(fillAndRead(again), onThread);
}
