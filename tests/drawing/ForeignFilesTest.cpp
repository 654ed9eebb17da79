// DXF files as other programs and small tools write them, from the hand-written corpus in
// tests/drawing/foreign: comments, bytes after the end, a handle used twice, R13/R14 and R12
// files, files that carry only part of a drawing. Each one opens and keeps every entity,
// block and layer through a save, or is refused with a message that names its line.
#include "BinaryDxf.h"
#include "PythonChecker.h"
#include "ZvhostRun.h"

#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/Dictionary.h"
#include "drawing/DxfError.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "drawing/Entity.h"
#include "drawing/LayerRecord.h"
#include "drawing/SymbolTable.h"
#include "drawing/TagValues.h"

#include "ReaderOracle.h"

#include <gtest/gtest.h>

#include <QFile>

#include <fstream>
#include <map>
#include <set>
#include <sstream>

using namespace zvdb;
using zvtest::PythonChecker;

namespace {

std::string corpusText(const std::string& name) {
    std::ifstream in(std::string(ZV_TEST_DIR) + "/foreign/" + name, std::ios::binary);
    std::stringstream text;
    text << in.rdbuf();
    EXPECT_FALSE(text.str().empty()) << name;
    return text.str();
}

using zvtest::errorOf;

int lineOf(const std::string& text, std::size_t offset) {
    return 1 + static_cast<int>(std::count(
                   text.begin(), text.begin() + static_cast<std::ptrdiff_t>(offset), '\n'));
}

// Types of a block's entities, in order.
std::vector<std::string> typesIn(const BlockRecord* block) {
    std::vector<std::string> types;
    if (block)
        for (const Entity* entity : block->entities())
            types.emplace_back(entity->type());
    return types;
}

std::set<std::string> layerNames(const Database& db) {
    std::set<std::string> names;
    for (const LayerRecord* layer : db.layers())
        names.emplace(layer->name());
    return names;
}

std::string writeScratch(const QString& folder, const std::string& name, const std::string& text) {
    const std::string path = folder.toStdString() + "/" + name;
    std::ofstream(path, std::ios::binary) << text;
    return path;
}

// A 999 group in binary form (two-byte group code) after the sentinel and before every
// 0/ENDSEC: comments where a binary file may hold them.
std::string withBinaryComments(std::string binary) {
    const std::string comment = std::string("\xe7\x03", 2) + "a comment" + '\0';
    binary.insert(22, comment);
    const std::string endsec = std::string("\0\0ENDSEC\0", 9);
    for (std::size_t at = binary.find(endsec); at != std::string::npos;
         at = binary.find(endsec, at + comment.size() + endsec.size()))
        binary.insert(at, comment);
    return binary;
}

class ForeignFiles : public ::testing::Test {
protected:
    void SetUp() override { folder_ = PythonChecker::scratchFolder(); }

    // zvhost opens the file and saves it; the saved file holds what the original held.
    void roundTrip(const std::string& name, const std::string& text) {
        SCOPED_TRACE(name);
        const std::string input = writeScratch(folder_, name, text);
        const QString output = folder_ + "/saved-" + QString::fromStdString(name);
        const zvtest::HostRun run = zvtest::runZvhost(
            {"--no-module", "--quiet", QString::fromStdString(input), "-o", output});
        ASSERT_EQ(run.status, 0) << run.err.toStdString();
        const QString missing = PythonChecker::missing();
        ASSERT_TRUE(missing.isEmpty()) << missing.toStdString();
        QString report;
        EXPECT_EQ(
            PythonChecker::run("content_dxf.py", {QString::fromStdString(input), output}, &report),
            0)
            << report.toStdString();
    }

    QString folder_;
};

TEST_F(ForeignFiles, CommentsAreSkippedWhereverTheyStand) {
    const std::string commented = corpusText("comments.dxf");
    auto plain = DxfLoader::load(corpusText("r2000_small.dxf"));
    auto db = DxfLoader::load(commented);
    EXPECT_EQ(typesIn(db->modelSpace()), typesIn(plain->modelSpace()));
    EXPECT_EQ(typesIn(db->block("MARK")), std::vector<std::string>{"CIRCLE"});
    EXPECT_EQ(layerNames(*db), layerNames(*plain));
    ASSERT_NE(db->namedObjects(), nullptr);
    EXPECT_NE(db->namedObjects()->getXRecord("ZV_TESTE"), nullptr);
    // The comment inside the LINE is gone, the LINE's own groups stay.
    EXPECT_EQ(db->entityByHandle(0x50)->point(11).x, 10.0);
    // A fault after comments still names its own line.
    std::string broken = commented;
    const std::size_t at = broken.find("  0\nBLOCK\n");
    broken.replace(at, 10, "  0\nENDBLK\n");
    EXPECT_EQ(errorOf(broken),
              "line " + std::to_string(lineOf(broken, at)) + ": ENDBLK without BLOCK");
    // Binary files may carry them too.
    auto binary = DxfLoader::load(withBinaryComments(zvtest::binaryDxf(commented)));
    EXPECT_EQ(typesIn(binary->modelSpace()), typesIn(plain->modelSpace()));
    roundTrip("comments.dxf", commented);
}

TEST_F(ForeignFiles, WhatFollowsTheEndOfFileIsIgnored) {
    const std::string text = corpusText("after_eof.dxf");
    ASSERT_NE(text.find("EOF\njunk"), std::string::npos);
    auto db = DxfLoader::load(text);
    EXPECT_EQ(db->modelSpace()->entityCount(), 3u);
    auto binary = DxfLoader::load(zvtest::binaryDxf(text) + std::string("\x07\x00garbage\xff", 10));
    EXPECT_EQ(binary->modelSpace()->entityCount(), 3u);
    roundTrip("after_eof.dxf", text);
    // Something cut short before the end is still refused.
    EXPECT_NE(errorOf(text.substr(0, text.find("  0\nENDSEC\n  0\nSECTION\n  2\nOBJECTS"))), "");
}

TEST_F(ForeignFiles, AHandleUsedTwiceGoesToTheFirstObjectAndTheSecondGetsANewOne) {
    const std::string text = corpusText("duplicate_handles.dxf");
    auto db = DxfLoader::load(text);
    const auto entities = db->modelSpace()->entities();
    ASSERT_EQ(typesIn(db->modelSpace()), (std::vector<std::string>{"LINE", "LINE", "INSERT"}));
    EXPECT_EQ(entities[0]->handle(), 0x50u);
    EXPECT_EQ(db->objectByHandle(0x50), entities[0]);
    EXPECT_EQ(entities[1]->point(10).y, 5.0) << "the second LINE is kept";
    EXPECT_GE(entities[1]->handle(), 0x200u) << "above $HANDSEED";
    EXPECT_EQ(db->objectByHandle(entities[1]->handle()), entities[1]);
    EXPECT_EQ(TagValues::toHandle(entities[1]->text(5)), entities[1]->handle());
    EXPECT_EQ(db->entityByHandle(0x42)->type(), "CIRCLE");
    EXPECT_NE(entities[2]->handle(), 0x42u);
    ASSERT_FALSE(db->warnings().empty());
    EXPECT_EQ(db->warnings().back(),
              "2 objects had handles already in use; new handles were given");

    // The attributes and SEQEND of a renumbered reference follow it.
    Database made;
    BlockRecord* block = made.createBlock("B");
    Entity* point = made.modelSpace()->addPoint({0, 0, 0});
    BlockReference* reference = made.modelSpace()->addBlockReference(*block, {1, 1, 0});
    reference->addAttribute("T", "v", {0, 0, 0}, 1);
    const std::string mine = TagValues::fromHandle(reference->handle());
    const std::string taken = TagValues::fromHandle(point->handle());
    std::string twice = DxfWriter::toText(made);
    for (const std::string group : {"  5\n", "330\n"})
        for (std::size_t at = twice.find(group + mine + "\n"); at != std::string::npos;
             at = twice.find(group + mine + "\n", at))
            twice.replace(at, group.size() + mine.size(), group + taken);
    auto again = DxfLoader::load(twice);
    auto* copy = dynamic_cast<BlockReference*>(again->modelSpace()->entities()[1]);
    ASSERT_NE(copy, nullptr);
    EXPECT_NE(copy->handle(), point->handle());
    ASSERT_EQ(copy->attributes().size(), 1u);
    EXPECT_EQ(copy->attributes()[0]->ownerHandle(), copy->handle());
    ASSERT_NE(copy->seqend(), nullptr);
    EXPECT_EQ(copy->seqend()->ownerHandle(), copy->handle());

    // zvhost says so once, with the count, and saves every object.
    const std::string input = writeScratch(folder_, "twice.dxf", text);
    const zvtest::HostRun run = zvtest::runZvhost(
        {"--no-module", "--quiet", QString::fromStdString(input), "-o", folder_ + "/out.dxf"});
    EXPECT_EQ(run.status, 0);
    EXPECT_EQ(run.err, QString::fromStdString(input) +
                           ": 2 objects had handles already in use; new handles were given\n");
    roundTrip("duplicate_handles.dxf", text);
}

// R13 and R14 files are read as they are and become R2000 drawings without losing or
// doubling anything.
TEST_F(ForeignFiles, R13AndR14FilesKeepEveryEntityOnceAndTheirArrowBlocks) {
    const std::vector<std::string> r14Model = {"LWPOLYLINE", "LWPOLYLINE", "LWPOLYLINE", "POLYLINE",
                                               "LINE",       "DIMENSION",  "INSERT"};
    const std::vector<std::string> r13Model = {"POLYLINE", "POLYLINE",  "POLYLINE",
                                               "LINE",     "DIMENSION", "INSERT"};
    for (const auto& [name, model] : std::map<std::string, std::vector<std::string>>{
             {"r13.dxf", r13Model}, {"r14.dxf", r14Model}}) {
        const std::string text = corpusText(name);
        for (const bool binary : {false, true}) {
            SCOPED_TRACE(name + (binary ? " binary" : " ascii"));
            auto db = DxfLoader::load(binary ? zvtest::binaryDxf(text) : text);
            EXPECT_EQ(db->version(), "AC1015");
            EXPECT_EQ(typesIn(db->modelSpace()), model);
            EXPECT_EQ(db->modelSpace()->name(), "*Model_Space");
            ASSERT_NE(db->paperSpace(), nullptr);
            EXPECT_TRUE(db->paperSpace()->entities().empty());
            EXPECT_EQ(typesIn(db->block("_CLOSEDFILLED")), std::vector<std::string>{"SOLID"});
            EXPECT_EQ(typesIn(db->block("_OPEN90")), (std::vector<std::string>{"LINE", "LINE"}));
            EXPECT_EQ(typesIn(db->block("*D1")),
                      (std::vector<std::string>{"LINE", "INSERT", "INSERT", "MTEXT"}));
            ASSERT_NE(db->block("EMPTY_UNUSED"), nullptr);
            EXPECT_EQ(db->blocks().size(), 7u);
            EXPECT_EQ(layerNames(*db), (std::set<std::string>{"0", "WIRES", "DIMS"}));
            // Handles stay: the wire's extended data still points at the terminal.
            const Entity* wire = db->entityByHandle(0x70);
            ASSERT_NE(wire, nullptr);
            EXPECT_EQ(wire->xdata("KVR_ZV").back().value, "79");
            EXPECT_EQ(db->entityByHandle(0x79)->type(), "INSERT");
            // Objects stay, and the drawing has the layouts R2000 requires.
            ASSERT_NE(db->namedObjects(), nullptr);
            EXPECT_NE(db->namedObjects()->getXRecord("ZV_TESTE"), nullptr);
            Dictionary* layouts = db->namedObjects()->getDictionary("ACAD_LAYOUT");
            ASSERT_NE(layouts, nullptr);
            ASSERT_NE(layouts->get("Model"), nullptr);
            EXPECT_EQ(db->modelSpace()->handleAt(340), layouts->get("Model")->handle());
            EXPECT_EQ(layouts->get("Model")->handleAt(330), layouts->handle());
        }
        roundTrip(name, text);
        roundTrip("bin-" + name, zvtest::binaryDxf(text));
    }
}

TEST_F(ForeignFiles, R12EmptyBlocksThatNothingUsesAreKept) {
    const std::string text = corpusText("r12_empty_blocks.dxf");
    for (const bool binary : {false, true}) {
        auto db = DxfLoader::load(binary ? zvtest::binaryDxf(text) : text);
        for (const char* name : {"VAZIO", "OUTRO_VAZIO", "*U1", "NO3", "XREFISH"}) {
            const BlockRecord* block = db->block(name);
            ASSERT_NE(block, nullptr) << name;
            EXPECT_EQ(block->entityCount(), 0u) << name;
            EXPECT_NE(block->blockBegin(), nullptr) << name;
        }
        EXPECT_EQ(db->block("OUTRO_VAZIO")->basePoint().x, 5.0);
        EXPECT_EQ(db->block("XREFISH")->blockFlags(), 4);
        EXPECT_EQ(typesIn(db->block("USADO")), std::vector<std::string>{"CIRCLE"});
    }
    roundTrip("r12_empty_blocks.dxf", text);
    roundTrip("bin-r12_empty_blocks.dxf", zvtest::binaryDxf(text));
}

// Registering the missing applications once made the loader read freed memory: with some
// hundred objects after the extended data the reader crashed.
TEST_F(ForeignFiles, ExtendedDataOfApplicationsMissingFromAppidIsRegistered) {
    const std::string text = corpusText("appids_unregistered.dxf");
    auto db = DxfLoader::load(text);
    for (int i = 1; i <= 16; ++i) {
        char name[16];
        std::snprintf(name, sizeof name, "APP_%02d", i);
        EXPECT_TRUE(db->isApplicationRegistered(name)) << name;
    }
    EXPECT_EQ(db->warnings().size(), 17u) << "one per application, one for the model space";
    // The same file with 40 applications and 300 points after them.
    std::string big = text;
    std::string applications, points;
    for (int i = 17; i <= 40; ++i)
        applications += "1001\nAPP_" + std::to_string(i) + "\n1000\nv\n";
    for (int i = 0; i < 300; ++i)
        points += "  0\nPOINT\n  5\n" + TagValues::fromHandle(0x100 + i) +
                  "\n100\nAcDbEntity\n  8\n0\n100\nAcDbPoint\n 10\n1.0\n 20\n2.0\n 30\n0.0\n";
    big.insert(big.find("  0\nENDSEC\n  0\nEOF"), applications + points);
    db = DxfLoader::load(big);
    EXPECT_EQ(db->modelSpace()->entityCount(), 301u);
    EXPECT_TRUE(db->isApplicationRegistered("APP_40"));
    EXPECT_EQ(db->table("APPID")->size(), 41u);
    roundTrip("appids_unregistered.dxf", big);
}

// A file with a header and nothing else (as small tools write it) opens as a drawing that
// can take layers, blocks and dictionaries, and is saved with its sections in order.
TEST_F(ForeignFiles, AHeaderAloneMakesAWholeDrawing) {
    auto db = DxfLoader::load(corpusText("header_only.dxf"));
    ASSERT_NE(db->modelSpace(), nullptr);
    EXPECT_EQ(db->namedObjects(), nullptr);
    EXPECT_EQ(db->table("LAYER"), nullptr);
    LayerRecord* layer = db->createLayer("PAGE$0001$A");
    ASSERT_NE(layer, nullptr);
    EXPECT_EQ(layerNames(*db), (std::set<std::string>{"0", "PAGE$0001$A"}));
    EXPECT_TRUE(db->setCurrentLayer("PAGE$0001$A"));
    EXPECT_TRUE(db->registerApplication("KVR_ZV"));
    const std::string path[] = {"ZV_PAGINAS", "GRUPO"};
    ASSERT_NE(db->xrecordAt(path, true), nullptr);
    ASSERT_NE(db->namedObjects(), nullptr);
    EXPECT_EQ(db->objects().front(), db->namedObjects()) << "first in the OBJECTS section";
    BlockRecord* block = db->createBlock("B");
    block->addLine({0, 0, 0}, {1, 1, 0});
    db->modelSpace()->addBlockReference(*block, {2, 2, 0}, {1, 1, 1}, 0, "PAGE$0001$A");
    // Tables in their standard order, sections in theirs.
    std::vector<std::string> tables;
    for (const auto& table : db->tables())
        tables.emplace_back(table->name());
    EXPECT_EQ(tables, (std::vector<std::string>{"LTYPE", "LAYER", "APPID", "BLOCK_RECORD"}));
    const std::string written = DxfWriter::toText(*db);
    std::vector<std::size_t> at;
    for (const char* name : {"HEADER", "CLASSES", "TABLES", "BLOCKS", "ENTITIES", "OBJECTS"})
        at.push_back(written.find("SECTION\n  2\n" + std::string(name) + "\n"));
    EXPECT_TRUE(std::is_sorted(at.begin(), at.end())) << written.substr(0, 400);
    EXPECT_EQ(at.front(), 4u);
    auto again = DxfLoader::load(written);
    EXPECT_EQ(typesIn(again->modelSpace()), std::vector<std::string>{"INSERT"});
    EXPECT_NE(again->xrecordAt(path, false), nullptr);
    const std::string output = writeScratch(folder_, "built.dxf", written);
    QString report;
    EXPECT_EQ(PythonChecker::run("inspect_dxf.py", {QString::fromStdString(output)}, &report), 0)
        << report.toStdString();
    roundTrip("header_only.dxf", corpusText("header_only.dxf"));
    // Entities alone: the sections the file lacks go before and after them.
    std::string entitiesOnly = corpusText("r2000_small.dxf");
    const std::size_t from = entitiesOnly.find("  0\nSECTION\n  2\nENTITIES");
    const std::size_t to = entitiesOnly.find("  0\nINSERT\n");  // its block is not there
    entitiesOnly = "  0\nSECTION\n  2\nHEADER\n  9\n$ACADVER\n  1\nAC1015\n  0\nENDSEC\n" +
                   entitiesOnly.substr(from, to - from) + "  0\nENDSEC\n  0\nEOF\n";
    const std::string saved = DxfWriter::toText(*DxfLoader::load(entitiesOnly));
    EXPECT_LT(saved.find("TABLES"), saved.find("ENTITIES"));
    EXPECT_LT(saved.find("BLOCKS"), saved.find("ENTITIES"));
    roundTrip("entities_only.dxf", entitiesOnly);
}

TEST_F(ForeignFiles, AFileThatCannotBeReadIsRefusedNamingTheLine) {
    std::string text = corpusText("r14.dxf");
    const std::string endOfArrow = "  0\nENDBLK\n  5\n52\n";
    const std::size_t at = text.find(endOfArrow);
    text.replace(at, endOfArrow.size(), "  0\nBLOCK\n  5\n52\n");
    const std::string input = writeScratch(folder_, "bad-r14.dxf", text);
    const QString output = folder_ + "/not-written.dxf";
    const zvtest::HostRun run =
        zvtest::runZvhost({"--no-module", "--quiet", QString::fromStdString(input), "-o", output});
    EXPECT_EQ(run.status, 1);
    EXPECT_TRUE(run.err.contains(QString::fromStdString(input) + ": line " +
                                 QString::number(lineOf(text, at)) + ": BLOCK inside block"))
        << run.err.toStdString();
    EXPECT_FALSE(QFile::exists(output));
}

}  // namespace
