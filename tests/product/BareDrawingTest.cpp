// The page services on drawings that lack parts: a header alone, no OBJECTS section (no
// named-objects dictionary), an R12 file. They make what they need and never reach into a
// missing table or dictionary; in zvhost and with the module's terminal list too.
#include "ProductFixture.h"
#include "ProductFolder.h"
#include "QtPrinters.h"

#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "drawing/LayerRecord.h"
#include "drawing/SymbolTable.h"

#include <QDir>
#include <QFile>
#include <QTemporaryDir>

namespace zvproduct::testing {
namespace {

QByteArray fileBytes(const QString& path) {
    QFile file(path);
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}

const QString kHeaderOnly = QStringLiteral(ZV_SOURCE_DIR "/tests/drawing/foreign/header_only.dxf");

// The text of a drawing without its OBJECTS section.
std::string withoutObjects(const std::string& text) {
    const std::size_t from = text.find("  0\nSECTION\n  2\nOBJECTS\n");
    const std::size_t to = text.find("  0\nENDSEC\n", from) + 11;
    EXPECT_NE(from, std::string::npos);
    return text.substr(0, from) + text.substr(to);
}

class BareDrawing : public ProductFixture {
protected:
    void open(const std::string& text) { database = zvdb::DxfLoader::load(text); }
    void roundTrip() { open(zvdb::DxfWriter::toText(*database)); }
};

TEST_F(BareDrawing, AHeaderAloneTakesNewPagesAndLosesGroups) {
    open(fileBytes(kHeaderOnly).toStdString());
    EXPECT_EQ(show("(list (buscaListaGrupos) (buscalistapaginas) (getprimeirapagina))"),
              "(nil nil nil)");
    EXPECT_EQ(show("(apagargrupo \"COMANDO\")"), "nil");
    EXPECT_EQ(show("(criarpagina \"LISTAS\" 0)"), "\"LISTAS$0001$A\"");
    EXPECT_EQ(show("(criarpagina \"LISTAS\" 0)"), "\"LISTAS$0002$A\"");
    EXPECT_EQ(database->currentLayer(), "LISTAS$0002$A");
    ASSERT_NE(database->layer("LISTAS$SELO"), nullptr);
    ASSERT_NE(database->layer("0"), nullptr) << "a made layer table has layer 0";
    EXPECT_EQ(show("(Descongela_as_layers_da_pagina \"LISTAS$0001$A\")"), "T");
    run("(atualizarpaginas)");
    run("(AtualizaModemacro)");
    EXPECT_EQ(show("*ZV_MODEMACRO*"), "\"ZV LISTAS$0002$A (2)\"");
    roundTrip();
    EXPECT_EQ(show("(buscalistapaginas T)"), "((\"LISTAS\" \"LISTAS$0001$A\" \"LISTAS$0002$A\"))");
    EXPECT_EQ(show("(apagargrupo \"LISTAS\")"), "nil");
    EXPECT_EQ(database->layer("LISTAS$0001$A"), nullptr);
    EXPECT_EQ(database->currentLayer(), "0");
    EXPECT_EQ(show("(buscaListaGrupos)"), "nil");
}

TEST_F(BareDrawing, NoObjectsSectionMakesTheNamedObjectsDictionary) {
    addGroup("ESQ", 4, {"ESQ$0001$A", "ESQ$0002$A"});
    terminal("ESQ$0001$A", {10, 10, 0}, "X1", "1");
    open(withoutObjects(zvdb::DxfWriter::toText(*database)));
    ASSERT_EQ(database->namedObjects(), nullptr);
    EXPECT_EQ(show("(list (buscaListaGrupos) (getprimeirapagina))"), "(nil nil)");
    EXPECT_EQ(show("(apagargrupo \"ESQ\")"), "nil");
    // Without the registry the group's pages are unknown: their layers stay, and a new page
    // takes the next free name.
    EXPECT_NE(database->layer("ESQ$0001$A"), nullptr);
    EXPECT_EQ(database->modelSpace()->entities().size(), 1u);
    EXPECT_EQ(show("(criarpagina \"ESQ\" 0)"), "\"ESQ$0003$A\"");
    ASSERT_NE(database->namedObjects(), nullptr);
    roundTrip();
    EXPECT_EQ(show("(buscalistapaginas T)"), "((\"ESQ\" \"ESQ$0003$A\"))");
}

TEST_F(BareDrawing, AnR12DrawingGetsItsPagesAfterTheUpgrade) {
    open(
        "  0\nSECTION\n  2\nENTITIES\n  0\nLINE\n  8\nFIOS\n 10\n0\n 20\n0\n 11\n1\n 21\n1\n"
        "  0\nENDSEC\n  0\nEOF\n");
    EXPECT_EQ(show("(criarpagina \"COMANDO\" 0)"), "\"COMANDO$0001$A\"");
    roundTrip();
    EXPECT_EQ(show("(buscalistapaginas)"), "(\"COMANDO$0001$A\")");
    EXPECT_EQ(database->modelSpace()->entities().front()->layer(), "FIOS");
}

class BareDrawingInHost : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(QFileInfo::exists(ZV_BIN_DIR "/zvhost")) << "build the zvhost target first";
    }
    zvtest::HostRun zvhost(const QStringList& arguments) { return product.zvhost(arguments); }
    zvtest::ProductFolder product;
};

TEST_F(BareDrawingInHost, PageCommandsOnAHeaderAlone) {
    const QString saved = product.path("saved.dxf");
    zvtest::HostRun run = zvhost(
        {"--no-module", kHeaderOnly, "--eval", "(princ (criarpagina \"LISTAS\" 0))", "-o", saved});
    ASSERT_EQ(run.status, 0) << run.err.toStdString();
    EXPECT_EQ(run.out, "LISTAS$0001$A");
    run = zvhost({"--no-module", saved, "--eval", "(prin1 (buscalistapaginas T))"});
    EXPECT_EQ(run.out, "((\"LISTAS\" \"LISTAS$0001$A\"))") << run.err.toStdString();
    run = zvhost({"--no-module", kHeaderOnly, "--eval", "(apagargrupo \"COMANDO\")", "-o",
                  product.path("erased.dxf")});
    EXPECT_EQ(run.status, 0) << run.err.toStdString();
    EXPECT_EQ(run.err, "");
    EXPECT_TRUE(zvdb::DxfLoader::loadFile(product.path("erased.dxf").toStdString())->modelSpace());
}

// The terminal list of a generated project whose OBJECTS section was taken out: the list's
// pages are registered in a new named-objects dictionary.
TEST_F(BareDrawingInHost, TerminalListOfAProjectWithoutObjects) {
    const QString problem = product.prepare({"--seed", "3", "--terminals", "30"});
    ASSERT_TRUE(problem.isEmpty()) << problem.toStdString();
    const QString project = product.project();
    const QString bare = product.path("bare.dxf");
    QFile out(bare);
    ASSERT_TRUE(out.open(QIODevice::WriteOnly));
    out.write(QByteArray::fromStdString(withoutObjects(fileBytes(project).toStdString())));
    out.close();
    const QString listed = product.path("listed.dxf");
    const zvtest::HostRun run = zvhost(product.terminalList(bare, listed));
    ASSERT_EQ(run.status, 0) << run.err.toStdString();
    EXPECT_TRUE(run.out.contains("List created.")) << run.out.toStdString();
    const auto db = zvdb::DxfLoader::loadFile(listed.toStdString());
    ASSERT_NE(db->layer("LISTAS$0001$A"), nullptr);
    int rows = 0;
    for (zvdb::Entity* entity : db->modelSpace()->entities())
        rows += entity->layer().starts_with("LISTAS$0") && entity->isType("INSERT");
    EXPECT_GT(rows, 30);
    const zvtest::HostRun pages = zvhost(
        {"--no-module", listed, "--eval", "(prin1 (assoc \"LISTAS\" (buscalistapaginas T)))"});
    EXPECT_TRUE(pages.out.startsWith("(\"LISTAS\" \"LISTAS$0001$A\"")) << pages.out.toStdString();
}

}  // namespace
}  // namespace zvproduct::testing
