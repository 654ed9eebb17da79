// The repairs made to the DWG converter's DXF, each on a drawing shaped like the converter's
// output with the defect in it, and facts shaped like its model's. No converter is run.
#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/Dictionary.h"
#include "drawing/DwgRepair.h"
#include "drawing/DxfError.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "drawing/LayerRecord.h"
#include "drawing/TagValues.h"
#include "drawing/XRecord.h"

#include <gtest/gtest.h>

#include <numbers>

using namespace zvdb;

namespace {

// What reading `text` through the repairs gives, with the repairs' counts.
struct Repaired {
    std::unique_ptr<Database> database;
    DwgRepair::Counts counts;
};

Repaired repairAndLoad(const std::string& text, const std::string& facts) {
    DwgRepair repair(facts);
    Repaired result;
    result.database = DxfLoader::load(repair.repairText(text));
    repair.repairDrawing(*result.database);
    result.counts = repair.counts();
    return result;
}

std::string hex(std::uint64_t handle) {
    return TagValues::fromHandle(handle);
}

}  // namespace

TEST(DwgRepairLayers, OffStatesComeFromTheModelWhenEveryLayerCameOutOff) {
    Database db;
    LayerRecord* on = db.createLayer("PAGE_ON");
    LayerRecord* off = db.createLayer("PAGE_OFF");
    on->setColor(3);
    off->setColor(5);
    for (LayerRecord* layer : db.layers())
        layer->setOff(true);
    const std::string facts = R"({"layers": [{"handle": ")" + hex(on->handle()) +
                              R"(", "off": false}, {"handle": ")" + hex(off->handle()) +
                              R"(", "off": true}, {"handle": ")" + hex(db.layer("0")->handle()) +
                              R"(", "off": false}]})";
    const auto result = repairAndLoad(DxfWriter::toText(db), facts);
    EXPECT_FALSE(result.database->layer("PAGE_ON")->isOff());
    EXPECT_TRUE(result.database->layer("PAGE_OFF")->isOff());
    EXPECT_FALSE(result.database->layer("0")->isOff());
    EXPECT_EQ(result.database->layer("PAGE_ON")->color(), 3);
    EXPECT_EQ(result.database->layer("PAGE_OFF")->color(), 5);
    EXPECT_EQ(result.counts.layersOff, 2u);  // PAGE_OFF was right already
}

TEST(DwgRepairPolylines, VertexWidthsArePutBackAfterEachVertex) {
    Database db;
    TagListBuilder body(db.arena());
    body.text(100, "AcDbPolyline").integer(90, 3).integer(70, 0).real(43, 0.0);
    for (const double x : {0.0, 10.0, 20.0})
        body.real(10, x).real(20, x / 2);
    Entity* wide = db.addEntity(*db.modelSpace(), "LWPOLYLINE", body.take(), "0");
    TagListBuilder other(db.arena());
    other.text(100, "AcDbPolyline").integer(90, 2).integer(70, 0);
    other.real(10, 1).real(20, 1).real(10, 2).real(20, 2);
    Entity* mismatched = db.addEntity(*db.modelSpace(), "LWPOLYLINE", other.take(), "0");
    const std::string facts = R"({"polylineWidths": [{"handle": ")" + hex(wide->handle()) +
                              R"(", "widths": [[0.2, 0.1], [0, 0], [0.1, 0.5]]},
        {"handle": ")" + hex(mismatched->handle()) +
                              R"(", "widths": [[1, 1], [1, 1], [1, 1]]}]})";
    const auto result = repairAndLoad(DxfWriter::toText(db), facts);

    const DbObject* read = result.database->objectByHandle(wide->handle());
    ASSERT_TRUE(read);
    std::vector<std::pair<double, double>> widths;
    double x = -1;
    for (const Tag& tag : read->tags()) {
        if (tag.code == 43) {
            ADD_FAILURE() << "a constant width of 0 stays beside vertex widths";
        }
        if (tag.code == 10) x = TagValues::toReal(tag.value);
        if (tag.code == 40) widths.emplace_back(TagValues::toReal(tag.value), 0.0);
        if (tag.code == 41) widths.back().second = TagValues::toReal(tag.value);
        if (tag.code == 40 && widths.size() == 3) {
            EXPECT_EQ(x, 20.0);
        }
    }
    EXPECT_EQ(widths, (std::vector<std::pair<double, double>>{{0.2, 0.1}, {0, 0}, {0.1, 0.5}}));
    // Three widths for two vertices: not the polyline the model knows, left as it was.
    const DbObject* other2 = result.database->objectByHandle(mismatched->handle());
    ASSERT_TRUE(other2);
    EXPECT_EQ(other2->indexOf(40), -1);
    EXPECT_EQ(result.counts.polylineWidths, 1u);
}

TEST(DwgRepairAttributes, AttributesLeftOutComeBackWithTheirHandlesInOrder) {
    Database db;
    db.createBlock("TERMINAL");
    TagListBuilder body(db.arena());
    body.text(100, "AcDbBlockReference").text(2, "TERMINAL").point(10, {100, 50, 0});
    auto* reference =
        static_cast<BlockReference*>(db.addEntity(*db.modelSpace(), "INSERT", body.take(), "PAGE"));
    Attribute* first = reference->addAttribute("TAG", "-K1", {100, 52, 0}, 2.5);
    const std::uint64_t kept = first->handle();
    const std::uint64_t seed = db.handleSeed();
    const std::string facts =
        R"({"attributes": [{"handle": ")" + hex(reference->handle()) +
        R"(", "attributes": [
        {"handle": ")" +
        hex(kept) + R"(", "tag": "TAG", "value": "-K1"},
        {"handle": ")" +
        hex(seed + 10) +
        R"(", "tag": "NUMBER", "value": "13", "layer": "PAGE",
         "color": 1, "position": [101, 48, 0], "alignment": [103, 49, 0], "height": 1.75,
         "rotation": 1.5707963267948966, "widthFactor": 0.8, "oblique": 0, "style": "ISO",
         "halign": 1, "valign": 2, "flags": 1},
        {"handle": ")" +
        hex(seed + 11) +
        R"(", "tag": "DESCRIPTION", "value": "Contactor \u00e7", "layer": "PAGE",
         "position": [90, 40, 0], "height": 2}]}]})";
    const auto result = repairAndLoad(DxfWriter::toText(db), facts);
    EXPECT_EQ(result.counts.attributes, 2u);

    auto* read =
        dynamic_cast<BlockReference*>(result.database->objectByHandle(reference->handle()));
    ASSERT_TRUE(read);
    const std::vector<Attribute*> attributes = read->attributes();
    ASSERT_EQ(attributes.size(), 3u);
    EXPECT_EQ(attributes[0]->handle(), kept);
    EXPECT_EQ(attributes[1]->handle(), seed + 10);
    EXPECT_EQ(attributes[2]->handle(), seed + 11);
    const Attribute& number = *attributes[1];
    EXPECT_EQ(number.tag(), "NUMBER");
    EXPECT_EQ(number.textValue(), "13");
    EXPECT_EQ(number.ownerHandle(), reference->handle());
    EXPECT_EQ(number.layer(), "PAGE");
    EXPECT_EQ(number.color(), 1);
    EXPECT_EQ(number.position(), (Point3{101, 48, 0}));
    EXPECT_EQ(number.point(11), (Point3{103, 49, 0}));
    EXPECT_DOUBLE_EQ(number.height(), 1.75);
    EXPECT_DOUBLE_EQ(number.rotation(), 90.0);  // radians in the model, degrees in DXF
    EXPECT_DOUBLE_EQ(number.real(41), 0.8);
    EXPECT_EQ(number.style(), "ISO");
    EXPECT_EQ(number.integer(72), 1);
    EXPECT_EQ(number.integer(74), 2);
    EXPECT_TRUE(number.isInvisible());
    EXPECT_EQ(attributes[2]->textValue(), "Contactor \xC3\xA7");
    EXPECT_EQ(attributes[2]->style(), "Standard");
    // New objects after the repaired ones get handles above them.
    EXPECT_GT(result.database->handleSeed(), seed + 11);
    // Read back once more from what is written: the same three.
    auto again = DxfLoader::load(DxfWriter::toText(*result.database));
    auto* reread = dynamic_cast<BlockReference*>(again->objectByHandle(reference->handle()));
    ASSERT_TRUE(reread);
    EXPECT_EQ(reread->attributes().size(), 3u);
}

TEST(DwgRepairAttributes, ReferencesThatKeptEveryAttributeAreLeftAsTheyAre) {
    Database db;
    db.createBlock("B");
    TagListBuilder body(db.arena());
    body.text(100, "AcDbBlockReference").text(2, "B").point(10, {0, 0, 0});
    auto* reference =
        static_cast<BlockReference*>(db.addEntity(*db.modelSpace(), "INSERT", body.take(), "0"));
    Attribute* a = reference->addAttribute("A", "1", {0, 0, 0}, 1);
    Attribute* b = reference->addAttribute("B", "2", {0, 1, 0}, 1);
    const std::string text = DxfWriter::toText(db);
    const std::string facts = R"({"attributes": [{"handle": ")" + hex(reference->handle()) +
                              R"(", "attributes": [{"handle": ")" + hex(a->handle()) +
                              R"(", "tag": "A"}, {"handle": ")" + hex(b->handle()) +
                              R"(", "tag": "B"}]}]})";
    DwgRepair repair(facts);
    EXPECT_EQ(repair.repairText(text), text);
    EXPECT_EQ(repair.counts().attributes, 0u);
}

TEST(DwgRepairXRecords, AnglesGoBackToTheValuesTheModelHolds) {
    Database db;
    XRecord* record = db.createXRecord(*db.ensureNamedObjects());
    const std::vector<Tag> data{{1, "route"}, {50, "90.0"}, {40, "2.5"}, {52, "180.0"}};
    record->setData(data);
    XRecord* unknown = db.createXRecord(*db.ensureNamedObjects());
    unknown->setData(std::vector<Tag>{{50, "45.0"}});
    const std::string facts = R"({"xrecordAngles": [{"handle": ")" + hex(record->handle()) +
                              R"(", "angles": [1.5707963267948966, 3.141592653589793]},
        {"handle": ")" + hex(unknown->handle()) +
                              R"(", "angles": [1, 2]}]})";
    const auto result = repairAndLoad(DxfWriter::toText(db), facts);
    auto* read = dynamic_cast<XRecord*>(result.database->objectByHandle(record->handle()));
    ASSERT_TRUE(read);
    const std::vector<Tag> after = read->data();
    ASSERT_EQ(after.size(), 4u);
    EXPECT_EQ(after[0], (Tag{1, "route"}));
    EXPECT_DOUBLE_EQ(TagValues::toReal(after[1].value), std::numbers::pi / 2);
    EXPECT_EQ(after[2], (Tag{40, "2.5"}));
    EXPECT_DOUBLE_EQ(TagValues::toReal(after[3].value), std::numbers::pi);
    // Two angles for an Xrecord that has one: left as it was.
    auto* other = dynamic_cast<XRecord*>(result.database->objectByHandle(unknown->handle()));
    ASSERT_TRUE(other);
    EXPECT_EQ(other->data()[0], (Tag{50, "45.0"}));
    EXPECT_EQ(result.counts.xrecordAngles, 1u);
}

TEST(DwgRepairExtendedData, SixteenBitNumbersAreSignedAndLayerNamesComeBack) {
    Database db;
    LayerRecord* layer = db.createLayer("app_layer");
    db.createLayer("123");
    TagListBuilder body(db.arena());
    body.text(100, "AcDbLine").point(10, {0, 0, 0}).point(11, {1, 0, 0});
    Entity* line = db.addEntity(*db.modelSpace(), "LINE", body.take(), "0");
    const std::string swapped = std::to_string(__builtin_bswap64(layer->handle()));
    const std::vector<Tag> items{{1003, swapped}, {1070, "65535"}, {1070, "32767"},
                                 {1070, "32768"}, {1070, "-5"},    {1003, "123"},
                                 {1071, "65535"}, {1000, "65535"}};
    line->setXData("ZV_APP", items);
    // The layer table's own extended data is mended too.
    layer->setXData("ZV_APP", std::vector<Tag>{{1070, "40000"}});
    const auto result = repairAndLoad(DxfWriter::toText(db), "{}");
    const DbObject* read = result.database->objectByHandle(line->handle());
    ASSERT_TRUE(read);
    const std::vector<Tag> expected{{1003, "app_layer"}, {1070, "-1"},   {1070, "32767"},
                                    {1070, "-32768"},    {1070, "-5"},   {1003, "123"},
                                    {1071, "65535"},     {1000, "65535"}};
    EXPECT_EQ(read->xdata("ZV_APP"), expected);
    EXPECT_EQ(result.database->layer("app_layer")->xdata("ZV_APP"),
              (std::vector<Tag>{{1070, "-25536"}}));
    EXPECT_EQ(result.counts.xdataIntegers, 3u);
    EXPECT_EQ(result.counts.xdataLayers, 1u);
}

TEST(DwgRepairExtendedData, ANumberThatIsNoLayerHandleStays) {
    Database db;
    TagListBuilder body(db.arena());
    body.text(100, "AcDbLine").point(10, {0, 0, 0}).point(11, {1, 0, 0});
    Entity* line = db.addEntity(*db.modelSpace(), "LINE", body.take(), "0");
    line->setXData("ZV_APP", std::vector<Tag>{{1003, "999999999999"}});
    const auto result = repairAndLoad(DxfWriter::toText(db), "{}");
    EXPECT_EQ(result.database->objectByHandle(line->handle())->xdata("ZV_APP"),
              (std::vector<Tag>{{1003, "999999999999"}}));
    EXPECT_EQ(result.counts.xdataLayers, 0u);
}

TEST(DwgRepairFacts, FactsThatAreNotJsonAreRefused) {
    EXPECT_THROW(DwgRepair("not json"), DxfError);
    EXPECT_THROW(DwgRepair("[1, 2]"), DxfError);
    EXPECT_NO_THROW(DwgRepair("{}"));
}

namespace {

// A multi-line text's whole text: its code-3 pieces, then its code-1 one.
std::string wholeText(const DbObject& text) {
    std::string whole, last;
    for (const Tag& tag : text.tags()) {
        if (tag.code == 3) whole += tag.value;
        if (tag.code == 1) last = tag.value;
    }
    return whole + last;
}

}  // namespace

TEST(DwgRepairTexts, ALongTextEndedWithStrayBytesIsWrittenFromTheModel) {
    // 600 bytes with a two-byte character across the first 250-byte boundary.
    std::string text = std::string(249, 'a') + "\xC3\xA7" + std::string(349, 'b');
    Database db;
    TagListBuilder body(db.arena());
    body.text(100, "AcDbMText").point(10, {1, 2, 0}).real(40, 2.5);
    body.text(3, std::string(250, 'a')).text(3, std::string(250, 'b'));
    body.text(1, "TAIL_MARK").text(7, "Standard");
    Entity* mtext = db.addEntity(*db.modelSpace(), "MTEXT", body.take(), "0");
    Entity* intact = db.addEntity(*db.modelSpace(), "MTEXT",
                                  TagListBuilder(db.arena())
                                      .text(100, "AcDbMText")
                                      .point(10, {0, 0, 0})
                                      .text(1, "short")
                                      .take(),
                                  "0");
    // What this converter build may write: a stray line among the groups, a stray value.
    std::string dxf = DxfWriter::toText(db);
    const std::size_t tail = dxf.find("TAIL_MARK");
    ASSERT_NE(tail, std::string::npos);
    const std::size_t codeLine = dxf.rfind("  1\n", tail);
    dxf.replace(tail, 9, "0721Sf`\x01#");
    dxf.insert(codeLine, "S)\x01\x04TS\x17R\x15M\n");
    EXPECT_THROW(DxfLoader::load(dxf), DxfError);

    const std::string facts = R"({"longTexts": [{"handle": ")" + hex(mtext->handle()) +
                              R"(", "text": ")" + text + R"(\nend"}]})";
    const auto result = repairAndLoad(dxf, facts);
    const DbObject* read = result.database->objectByHandle(mtext->handle());
    ASSERT_TRUE(read);
    // A line feed in the model's text is written as the format writes control characters.
    EXPECT_EQ(wholeText(*read), text + "^Jend");
    EXPECT_EQ(read->text(7), "Standard");  // the groups after the text are read again
    for (const Tag& tag : read->tags()) {
        if (tag.code == 3) {
            EXPECT_LE(tag.value.size(), 250u);
        }
    }
    EXPECT_EQ(wholeText(*result.database->objectByHandle(intact->handle())), "short");
    EXPECT_EQ(result.counts.longTexts, 1u);
}

TEST(DwgRepairColors, TrueColorsKeepTheirTwentyFourBitsOfRgb) {
    Database db;
    LayerRecord* layer = db.createLayer("TRUE");
    layer->setInteger(420, -1039035666);  // 0xC21192EE as a signed 32-bit number
    TagListBuilder body(db.arena());
    body.text(100, "AcDbLine").point(10, {0, 0, 0}).point(11, {1, 0, 0});
    Entity* line = db.addEntity(*db.modelSpace(), "LINE", body.take(), "0");
    line->setInteger(420, 0x00FF8000, "AcDbEntity");
    const auto result = repairAndLoad(DxfWriter::toText(db), "{}");
    EXPECT_EQ(result.database->layer("TRUE")->integer(420), 0x1192EE);
    EXPECT_EQ(result.database->objectByHandle(line->handle())->integer(420), 0xFF8000);
    EXPECT_EQ(result.counts.trueColors, 1u);
}
