// The pieces under the windows: the command line's device, the page facts of a drawing,
// showing a page, and the window without a module.
#include "DeskFixture.h"

#include "desk/CommandLineDevice.h"
#include "desk/PageBrowser.h"
#include "desk/ProjectPages.h"

#include "app/DrawingFiles.h"
#include "drawing/Database.h"
#include "drawing/LayerRecord.h"
#include "plot/PageIndex.h"

#include <QAction>

namespace {

using zvtest::DeskTest;

TEST(CommandLineDevice, TextArrivesWholeWhateverTheWritesCut) {
    zvdesk::CommandLineDevice device;
    QStringList heard;
    QTextStream out(&device);
    out.setCodec("UTF-8");
    out << "before anyone listens\n";
    out.flush();
    device.setListener([&](const QString& text) { heard << text; });
    ASSERT_EQ(heard, QStringList({"before anyone listens\n"}));
    // "ção" and a four-byte character, cut in the middle of their bytes.
    const QByteArray bytes = QString::fromUtf8("Conexão 😀 ok").toUtf8();
    for (int i = 0; i < bytes.size(); ++i)
        device.write(bytes.constData() + i, 1);
    EXPECT_EQ(heard.mid(1).join(QString()), QString::fromUtf8("Conexão 😀 ok"));
    for (const QString& piece : heard)
        for (const QChar c : piece)
            EXPECT_NE(c, QChar::ReplacementCharacter);
}

class PiecesTest : public DeskTest {};

TEST_F(PiecesTest, ShowingACoverKeepsItsTitleBlockFrozen) {
    QString error;
    auto database = zvhost::readDrawing(copyOfProject("pieces.dxf"), &error);
    ASSERT_TRUE(database) << error.toStdString();
    zvdb::Database& db = *database;
    ASSERT_TRUE(zvdesk::showPage(db, "CAPA$0001$A"));
    EXPECT_EQ(db.currentLayer(), "CAPA$0001$A");
    EXPECT_FALSE(db.layer("CAPA$0001$A")->isFrozen());
    ASSERT_NE(db.layer("CAPA$SELO"), nullptr);
    ASSERT_NE(db.layer("CAPA$FORMATO"), nullptr);
    EXPECT_TRUE(db.layer("CAPA$SELO")->isFrozen());
    EXPECT_FALSE(db.layer("CAPA$FORMATO")->isFrozen());
    EXPECT_FALSE(db.layer("0")->isFrozen());
    ASSERT_TRUE(zvdesk::showPage(db, "COMANDO$0001$A"));
    ASSERT_NE(db.layer("COMANDO$SELO"), nullptr);
    EXPECT_FALSE(db.layer("COMANDO$SELO")->isFrozen());
    EXPECT_TRUE(db.layer("CAPA$0001$A")->isFrozen());
    // Every layer but the page's own ones and "0" is frozen.
    const auto own = zvplot::PageIndex::pageLayers(db, "COMANDO$0001$A");
    for (zvdb::LayerRecord* layer : db.layers()) {
        const std::string name(layer->name());
        const bool shown = name == "0" || std::find(own.begin(), own.end(), name) != own.end();
        EXPECT_EQ(layer->isFrozen(), !shown) << name;
    }
    // No such page, or "0": nothing changes.
    const auto count = db.changeCount();
    EXPECT_FALSE(zvdesk::showPage(db, "NADA$0001$A"));
    EXPECT_FALSE(zvdesk::showPage(db, "0"));
    EXPECT_EQ(db.changeCount(), count);
    EXPECT_EQ(db.currentLayer(), "COMANDO$0001$A");
}

TEST_F(PiecesTest, PagesStripsAndExtentsOfAProject) {
    QString error;
    auto database = zvhost::readDrawing(copyOfProject("facts.dxf"), &error);
    ASSERT_TRUE(database) << error.toStdString();
    const QStringList pages = zvdesk::pageNames(*database);
    ASSERT_FALSE(pages.isEmpty());
    EXPECT_EQ(pages.first(), "CAPA$0001$A");
    bool cover = false;
    EXPECT_TRUE(zvdesk::isCoverOrIndex(*database, "CAPA$0001$A", &cover));
    EXPECT_TRUE(cover);
    EXPECT_TRUE(zvdesk::isCoverOrIndex(*database, "INDICE$0001$A", &cover));
    EXPECT_FALSE(cover);
    EXPECT_FALSE(zvdesk::isCoverOrIndex(*database, "COMANDO$0001$A", &cover));
    QStringList strips = zvdesk::stripNames(*database);
    EXPECT_TRUE(strips.contains("X1"));
    EXPECT_EQ(strips.removeDuplicates(), 0);
    zvplot::PageIndex index(*database);
    const QRectF page = zvdesk::extentsOf(
        index.entitiesOn(zvplot::PageIndex::pageLayers(*database, "COMANDO$0001$A")));
    // An A3 sheet in millimetres, more or less.
    EXPECT_GT(page.width(), 300);
    EXPECT_GT(page.height(), 200);
    EXPECT_TRUE(zvdesk::extentsOf({}).isEmpty());
    // An empty drawing has no pages and no strips.
    zvdb::Database empty;
    EXPECT_TRUE(zvdesk::pageNames(empty).isEmpty());
    EXPECT_TRUE(zvdesk::stripNames(empty).isEmpty());
}

class WithoutModuleTest : public DeskTest {
protected:
    WithoutModuleTest() { loadModule_ = false; }
};

TEST_F(WithoutModuleTest, TheCommandsAreOffAndTheDrawingStillOpens) {
    ASSERT_TRUE(window_->openDrawing(copyOfProject("nomodule.dxf")));
    for (const QString& name : zvdesk::MainWindow::moduleCommands())
        EXPECT_FALSE(window_->commandAction(name)->isEnabled()) << name.toStdString();
    EXPECT_FALSE(window_->runCommand("gerarListaBornesGrf"));
    EXPECT_GT(window_->pageBrowser()->pages().size(), 5);
    EXPECT_FALSE(window_->isModified());
}

}  // namespace
