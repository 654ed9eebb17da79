// Broken drawing files: each gives a clear error naming the line, or a repair that is
// reported; none crashes. A mutation run feeds the reader many damaged variants.
#include "ReaderOracle.h"

#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/DxfError.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "drawing/Entity.h"
#include "drawing/Polyline.h"
#include "drawing/TextEntity.h"

#include <gtest/gtest.h>

#include <QDir>

#include <cstring>
#include <fstream>
#include <random>
#include <sstream>

using namespace zvdb;

namespace {

// A small drawing with a reference with attributes, a wire with extended data and text.
std::string sample(std::string_view version = "AC1027") {
    Database db;
    db.setVersion(version);
    BlockRecord* block = db.createBlock("B");
    block->addLine({0, 0, 0}, {1, 0, 0});
    block->addAttributeDefinition("TAG", "Tag", "", {0, 0, 0}, 1);
    BlockReference* reference = db.modelSpace()->addBlockReference(*block, {1, 1, 0});
    reference->addAttributeFromDefinition(*block->attributeDefinitions()[0]);
    Entity* wire = db.modelSpace()->addLwPolyline({{0, 0, 0}, {2, 2, 0}}, false);
    const Tag items[] = {Tag{1000, "W1"}, Tag{1040, "2.5"}};
    wire->setXData("KVR_ZV_WIRE", items);
    db.modelSpace()->addText({0, 0, 0}, 1, "Ação");
    return DxfWriter::toText(db);
}

using zvtest::errorOf;

// Replaces the first occurrence of `from` after `after`.
std::string replaced(std::string text, const std::string& from, const std::string& to,
                     const std::string& after = {}) {
    const std::size_t start = after.empty() ? 0 : text.find(after);
    const std::size_t at = text.find(from, start);
    EXPECT_NE(at, std::string::npos) << from;
    return text.replace(at, from.size(), to);
}

int lineOf(const std::string& text, std::size_t offset) {
    return 1 + static_cast<int>(std::count(
                   text.begin(), text.begin() + static_cast<std::ptrdiff_t>(offset), '\n'));
}

TEST(MalformedInput, TruncatedFileNamesWhereItEnds) {
    const std::string text = sample();
    const std::string error = errorOf(text.substr(0, text.size() / 2));
    EXPECT_NE(error.find("line"), std::string::npos) << error;
    EXPECT_NE(error.find("ENDSEC"), std::string::npos) << error;
    EXPECT_NE(errorOf(text.substr(0, text.size() - 4)), "") << "cut inside the final EOF";
}

TEST(MalformedInput, MissingEndsecIsAnError) {
    const std::string text = replaced(sample(), "  0\nENDSEC\n", "", "ENTITIES");
    const std::string error = errorOf(text);
    EXPECT_NE(error.find("expected ENDSEC to close section ENTITIES"), std::string::npos) << error;
}

TEST(MalformedInput, BadGroupCodeNamesItsLine) {
    std::string text = sample();
    const std::size_t at = text.find("\n100\nAcDbLine\n") + 1;
    text.replace(at, 3, "1x0");
    const std::string error = errorOf(text);
    EXPECT_EQ(error,
              "line " + std::to_string(lineOf(text, at)) + ": expected a group code, found '1x0'");
}

TEST(MalformedInput, OddNumberOfLinesIsAnError) {
    std::string text = sample();
    text.resize(text.size() - 4);  // "EOF\n" goes, its group code stays
    const std::string error = errorOf(text);
    EXPECT_NE(error.find("ends after group code 0; its value is missing"), std::string::npos)
        << error;
}

TEST(MalformedInput, DuplicateHandlesAreRenumbered) {
    Database db;
    Entity* first = db.modelSpace()->addPoint({0, 0, 0});
    Entity* second = db.modelSpace()->addPoint({1, 0, 0});
    std::string text = DxfWriter::toText(db);
    const std::string mine = "  5\n" + std::string(second->text(5)) + "\n";
    text = replaced(text, mine, "  5\n" + std::string(first->text(5)) + "\n", "ENTITIES");
    auto again = DxfLoader::load(text);
    const auto points = again->modelSpace()->entities();
    ASSERT_EQ(points.size(), 2u);
    EXPECT_EQ(points[0]->handle(), first->handle());
    EXPECT_GE(points[1]->handle(), db.handleSeed());
    EXPECT_EQ(points[1]->point(10).x, 1.0);
}

TEST(MalformedInput, BlockDefinitionsOutsideTheBlocksSectionAreErrors) {
    std::string text = sample();
    const std::size_t entities = text.find("ENTITIES\n");
    const std::size_t at = text.find("  0\nLWPOLYLINE\n", entities);
    text.insert(at, "  0\nBLOCK\n  2\nB\n");
    EXPECT_EQ(errorOf(text),
              "line " + std::to_string(lineOf(text, at)) + ": BLOCK outside the BLOCKS section");
}

TEST(MalformedInput, EmptyAndForeignFilesAreErrors) {
    EXPECT_EQ(errorOf(""), "the file is empty");
    EXPECT_NE(errorOf("hello\nworld\n").find("line 1: expected a group code"), std::string::npos);
    EXPECT_NE(errorOf("  0\nLINE\n").find("expected 0/SECTION"), std::string::npos);
    std::string binary("AutoCAD Binary DXF\r\n\x1a\0", 22);
    binary += std::string("\x00\x00SECTION\x00\x02\x00HEA", 16);
    EXPECT_NE(errorOf(binary), "");
    // A text with a line break can't be written back as DXF text.
    binary = std::string("AutoCAD Binary DXF\r\n\x1a\0", 22) +
             std::string("\0\0SECTION\0\x02\0HEA\nDER\0", 21);
    EXPECT_EQ(errorOf(binary), "byte 34: a text holds a line break");
}

TEST(MalformedInput, UnregisteredApplicationIsRegisteredOnReading) {
    const std::string text = replaced(sample(), "1001\nKVR_ZV_WIRE\n", "1001\nNOT_IN_APPID\n");
    auto db = DxfLoader::load(text);
    EXPECT_TRUE(db->isApplicationRegistered("NOT_IN_APPID"));
    ASSERT_FALSE(db->warnings().empty());
    EXPECT_NE(db->warnings().back().find("NOT_IN_APPID"), std::string::npos);
    EXPECT_NE(DxfWriter::toText(*db).find("APPID\n  5\n"), std::string::npos);
}

TEST(MalformedInput, MissingHandlesAndSeqendsAreRepaired) {
    Database db;
    Entity* point = db.modelSpace()->addPoint({0, 0, 0});
    BlockRecord* block = db.createBlock("B");
    BlockReference* reference = db.modelSpace()->addBlockReference(*block, {0, 0, 0});
    reference->addAttribute("T", "v", {0, 0, 0}, 1);
    std::string text = DxfWriter::toText(db);
    text = replaced(text, "  5\n" + std::string(point->text(5)) + "\n", "", "ENTITIES");
    text = replaced(text, "  0\nSEQEND\n", "  0\nPOINT\n", "ENTITIES");  // SEQEND lost
    auto again = DxfLoader::load(text);
    const auto entities = again->modelSpace()->entities();
    ASSERT_EQ(entities.size(), 3u);
    EXPECT_NE(entities[0]->handle(), 0u);
    EXPECT_GE(entities[0]->handle(), db.handleSeed()) << "a new handle, above all others";
    ASSERT_NE(entities[1]->seqend(), nullptr);
    EXPECT_EQ(entities[1]->subEntities().size(), 1u);
    EXPECT_EQ(again->warnings().size(), 2u);
}

TEST(MalformedInput, CodePageThatDoesNotMatchTheText) {
    // An R2000 file whose text is UTF-8 is read as UTF-8.
    std::string text = sample("AC1015");
    const std::string cp1252 = "A\xE7\xE3o";
    text = replaced(text, cp1252, "Ação");
    auto db = DxfLoader::load(text);
    EXPECT_EQ(static_cast<TextEntity*>(db->modelSpace()->entities()[2])->content(), "Ação");
    ASSERT_FALSE(db->warnings().empty());
    // An R2007 file with code-page bytes is read in its code page.
    text = replaced(sample("AC1021"), "Ação", cp1252);
    db = DxfLoader::load(text);
    EXPECT_EQ(static_cast<TextEntity*>(db->modelSpace()->entities()[2])->content(), "Ação");
}

// Every damaged variant either reads or fails with DxfError; what reads can be written and
// read again.
void mutate(std::string& text, std::mt19937& random) {
    std::uniform_int_distribution<std::size_t> position(0, text.size() - 1);
    switch (random() % 5) {
        case 0:
            text.erase(position(random), 1 + random() % 40);
            break;
        case 1:
            text[position(random)] = static_cast<char>(random() % 256);
            break;
        case 2:
            text.insert(position(random), "\n  0\n");
            break;
        case 3:
            text.resize(position(random));
            break;
        default: {
            const std::size_t a = position(random), b = position(random);
            std::swap(text[a], text[b]);
        }
    }
}

void feed(const std::string& original, bool binary, int rounds) {
    std::mt19937 random(binary ? 7 : 42);
    int read = 0;
    for (int round = 0; round < rounds; ++round) {
        std::string text = original;
        const int damage = 1 + static_cast<int>(random() % 3);
        for (int i = 0; i < damage && !text.empty(); ++i)
            mutate(text, random);
        if (binary && text.size() < 22) continue;
        try {
            auto db = DxfLoader::load(text);
            ++read;
            auto again = DxfLoader::load(DxfWriter::toText(*db));
            EXPECT_EQ(again->modelSpace() != nullptr, db->modelSpace() != nullptr);
        } catch (const DxfError&) {
        }
    }
    EXPECT_GT(read, 0) << "some damage is harmless (a changed digit, a changed letter)";
}

TEST(MalformedInput, MutatedFilesNeverCrashTheReader) {
    feed(sample(), false, 4000);
}

TEST(MalformedInput, MutatedBinaryFilesNeverCrashTheReader) {
    // A binary file made by hand: header, an empty ENTITIES section and EOF.
    std::string binary("AutoCAD Binary DXF\r\n\x1a\0", 22);
    auto code = [&](int c) {
        binary.append({static_cast<char>(c & 255), static_cast<char>(c >> 8)});
    };
    auto text = [&](const char* s) { binary.append(s, std::strlen(s) + 1); };
    code(0), text("SECTION"), code(2), text("HEADER"), code(9), text("$ACADVER"), code(1),
        text("AC1015"), code(9), text("$INSBASE"), code(10);
    const double zero = 0.0;
    binary.append(reinterpret_cast<const char*>(&zero), 8);
    code(0), text("ENDSEC"), code(0), text("SECTION"), code(2), text("ENTITIES"), code(0),
        text("POINT"), code(5), text("1F"), code(8), text("0"), code(70);
    binary.append("\x01\x00", 2);
    code(0), text("ENDSEC"), code(0), text("EOF");
    auto db = DxfLoader::load(binary);
    ASSERT_EQ(db->modelSpace()->entityCount(), 1u);
    feed(binary, true, 4000);
}

// Inputs that once failed the fuzzer, and the hand-written files of other programs: each
// reads, in ASCII and in binary form, or is refused, and survives a round trip.
TEST(MalformedInput, FuzzerFindingsAndForeignFilesReadOrAreRefused) {
    int inputs = 0;
    for (const char* folder : {"/fuzz/regressions", "/foreign"}) {
        const QDir dir(QString(ZV_TEST_DIR) + folder);
        for (const QString& name : dir.entryList(QDir::Files)) {
            std::ifstream in(dir.filePath(name).toStdString(), std::ios::binary);
            std::stringstream bytes;
            bytes << in.rdbuf();
            EXPECT_EQ(zvtest::readerProblem(bytes.str()), "") << name.toStdString();
            ++inputs;
        }
    }
    EXPECT_GE(inputs, 10);
}

}  // namespace
