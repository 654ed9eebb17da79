// The main window as a user meets it: a project opened shows its pages by group and draws
// the first one; the module's commands run from the menu; the console evaluates LISP; undo
// and redo follow the document; zvdesk --screenshot writes a picture that is not empty.
#include "DeskFixture.h"

#include "desk/LispConsole.h"
#include "desk/PageBrowser.h"
#include "desk/PageView.h"
#include "desk/ProgressWindow.h"

#include "app/HostDocument.h"
#include "drawing/Database.h"
#include "drawing/LayerRecord.h"

#include <QAction>
#include <QFileDialog>
#include <QGuiApplication>
#include <QImage>
#include <QLineEdit>
#include <QMessageBox>
#include <QProcess>
#include <QPushButton>
#include <QScreen>
#include <QTest>
#include <QThread>
#include <QWheelEvent>

namespace {

using zvtest::DeskTest;
using zvtest::ModalAnswer;

// Pixels of an image that are clearly darker than paper.
int inkOf(const QImage& image, const QRect& area) {
    int ink = 0;
    const QRect box = area.intersected(image.rect());
    for (int y = box.top(); y <= box.bottom(); ++y)
        for (int x = box.left(); x <= box.right(); ++x)
            if (qGray(image.pixel(x, y)) < 160) ++ink;
    return ink;
}

// ZV_DESK_SHOTS=FOLDER keeps pictures of the windows for a look by eye: the whole screen
// on a display (run under xvfb-run with QT_QPA_PLATFORM=xcb), else the window itself.
void keepShot(const QString& name, QWidget* window) {
    const QString folder = qEnvironmentVariable("ZV_DESK_SHOTS");
    if (folder.isEmpty()) return;
    // Let the display draw what was shown last.
    for (int i = 0; i < 5; ++i) {
        QApplication::processEvents();
        QThread::msleep(60);
    }
    const QPixmap shot = QGuiApplication::platformName() == "xcb"
                             ? QGuiApplication::primaryScreen()->grabWindow(0)
                             : window->grab();
    shot.save(folder + "/" + name + ".png");
}

class MainWindowTest : public DeskTest {};

TEST_F(MainWindowTest, AProjectOpensWithItsPagesByGroupAndTheFirstPageDrawn) {
    const QString project = copyOfProject("smoke.dxf");
    ASSERT_TRUE(window_->openDrawing(project));
    const QStringList pages = window_->pageBrowser()->pages();
    // Registry order: the cover, the index, power, the control pages, the layout.
    ASSERT_GE(pages.size(), 5);
    EXPECT_EQ(pages.first(), "CAPA$0001$A");
    EXPECT_EQ(pages[1], "INDICE$0001$A");
    EXPECT_TRUE(pages.contains("COMANDO$0001$A"));
    EXPECT_EQ(pages.last(), "LAYOUT$0001$A");
    EXPECT_EQ(window_->pageBrowser()->topLevelItemCount(), 5);
    EXPECT_TRUE(window_->pageBrowser()->label("CAPA$0001$A").contains("[cover]"));
    EXPECT_TRUE(window_->pageBrowser()->label("INDICE$0001$A").contains("[index]"));
    EXPECT_EQ(window_->pageBrowser()->label("COMANDO$0001$A"), "COMANDO$0001$A");
    EXPECT_TRUE(window_->windowTitle().startsWith("smoke.dxf"));
    EXPECT_FALSE(window_->isModified());

    ASSERT_TRUE(window_->showPage("COMANDO$0001$A"));
    QApplication::processEvents();
    const QImage view = window_->pageView()->grab().toImage();
    // A control page has its frame, title block, symbols and wires: much ink.
    EXPECT_GT(inkOf(view, view.rect()), 2000);
    EXPECT_GT(window_->pageView()->entityCount(), 20u);
    // Looking at a page is no change to save.
    EXPECT_FALSE(window_->isModified());
}

TEST_F(MainWindowTest, ShowingAPageThawsItsLayersAsTheProductDoes) {
    ASSERT_TRUE(window_->openDrawing(copyOfProject("thaw.dxf")));
    zvdb::Database& db = *window_->document()->database();
    ASSERT_TRUE(window_->showPage("COMANDO$0002$A"));
    EXPECT_EQ(db.currentLayer(), "COMANDO$0002$A");
    EXPECT_FALSE(db.layer("COMANDO$0002$A")->isFrozen());
    EXPECT_TRUE(db.layer("COMANDO$0001$A")->isFrozen());
    EXPECT_TRUE(db.layer("FORCA$0001$A")->isFrozen());
    EXPECT_EQ(window_->pageView()->page(), "COMANDO$0002$A");
    // A click in the page browser shows the page clicked.
    QTreeWidget* tree = window_->pageBrowser();
    QTreeWidgetItem* force = tree->topLevelItem(2)->child(0);
    tree->setCurrentItem(force);
    EXPECT_EQ(window_->pageView()->page(), "FORCA$0001$A");
    EXPECT_EQ(db.currentLayer(), "FORCA$0001$A");
    EXPECT_TRUE(db.layer("COMANDO$0002$A")->isFrozen());
}

TEST_F(MainWindowTest, TheViewZoomsPansAndFits) {
    ASSERT_TRUE(window_->openDrawing(copyOfProject("zoom.dxf")));
    ASSERT_TRUE(window_->showPage("COMANDO$0001$A"));
    zvdesk::PageView* view = window_->pageView();
    const QRectF fitted = view->window();
    ASSERT_TRUE(fitted.isValid());
    view->zoom(2.0);
    EXPECT_NEAR(view->window().width(), fitted.width() / 2, fitted.width() * 1e-9);
    EXPECT_NEAR(view->window().center().x(), fitted.center().x(), fitted.width() * 1e-3);
    const QRectF zoomed = view->window();
    view->pan(QPointF(100, 0));  // the page follows the mouse to the right
    EXPECT_LT(view->window().left(), zoomed.left());
    EXPECT_DOUBLE_EQ(view->window().width(), zoomed.width());
    // The wheel zooms about the cursor: the point under it stays.
    QWheelEvent wheel(QPointF(10, 10), QPointF(view->mapToGlobal(QPoint(10, 10))), QPoint(),
                      QPoint(0, 120), Qt::NoButton, Qt::NoModifier, Qt::NoScrollPhase, false);
    QApplication::sendEvent(view, &wheel);
    EXPECT_LT(view->window().width(), zoomed.width());
    view->fit();
    EXPECT_EQ(view->window(), fitted);
}

TEST_F(MainWindowTest, TheTwelveCommandsAreInTheMenuAndRunFromIt) {
    ASSERT_TRUE(window_->openDrawing(copyOfProject("list.dxf")));
    for (const QString& name : zvdesk::MainWindow::moduleCommands()) {
        QAction* action = window_->commandAction(name);
        ASSERT_NE(action, nullptr) << name.toStdString();
        EXPECT_TRUE(action->isEnabled()) << name.toStdString();
    }
    EXPECT_EQ(zvdesk::MainWindow::moduleCommands().size(), 12);
    const int before = window_->pageBrowser()->pages().size();
    // The progress window shows while the list runs, the main window's commands are off.
    int progressSeen = 0;
    bool commandsOff = false;
    bool viewHeld = false;
    QTimer watch;
    QObject::connect(&watch, &QTimer::timeout, [&] {
        zvdesk::ProgressWindow* progress = ui_->progressWindow();
        if (progress->isVisible() && ++progressSeen == 1) keepShot("progress", progress);
        if (window_->isBusy() && !window_->commandAction("exportacao")->isEnabled())
            commandsOff = true;
        // The page view keeps its picture while the drawing changes under it.
        if (window_->isBusy()) {
            const QRectF before = window_->pageView()->window();
            window_->pageView()->zoom(3.0);
            if (window_->pageView()->held() && window_->pageView()->window() == before)
                viewHeld = true;
        }
    });
    watch.start(0);
    window_->commandAction("gerarListaBornesGrf")->trigger();
    watch.stop();
    EXPECT_GT(progressSeen, 0);
    EXPECT_TRUE(commandsOff);
    EXPECT_TRUE(viewHeld);
    EXPECT_FALSE(window_->pageView()->held());
    EXPECT_FALSE(window_->isBusy());
    EXPECT_FALSE(ui_->progressWindow()->isVisible());
    // The list's pages are in the browser, the drawing waits to be saved.
    const QStringList pages = window_->pageBrowser()->pages();
    EXPECT_GT(pages.size(), before);
    EXPECT_TRUE(pages.contains("LISTAS$0001$A"));
    EXPECT_TRUE(window_->isModified());
    EXPECT_TRUE(window_->windowTitle().contains("[*]") || window_->isWindowModified());
    EXPECT_TRUE(window_->commandAction("exportacao")->isEnabled());
    // The user is back on the page shown before, as the product leaves them.
    EXPECT_EQ(window_->pageView()->page(), "CAPA$0001$A");
    window_->showPage("LISTAS$0001$A");
    keepShot("terminal-list", window_.get());
}

TEST_F(MainWindowTest, UndoAndRedoFollowTheDocument) {
    ASSERT_TRUE(window_->openDrawing(copyOfProject("undo.dxf")));
    zvhost::HostDocument* document = window_->document();
    EXPECT_FALSE(window_->undoAction()->isEnabled());
    EXPECT_FALSE(window_->redoAction()->isEnabled());
    ASSERT_TRUE(window_->runCommand("gerarListaBornesGrf"));
    ASSERT_TRUE(document->canUndo());
    EXPECT_TRUE(window_->undoAction()->isEnabled());
    EXPECT_FALSE(window_->redoAction()->isEnabled());
    window_->undoAction()->trigger();
    EXPECT_FALSE(window_->pageBrowser()->pages().contains("LISTAS$0001$A"));
    EXPECT_TRUE(window_->redoAction()->isEnabled());
    window_->redoAction()->trigger();
    EXPECT_TRUE(window_->pageBrowser()->pages().contains("LISTAS$0001$A"));
}

TEST_F(MainWindowTest, TheConsoleEvaluatesLispAndShowsWhatThePrints) {
    ASSERT_TRUE(window_->openDrawing(copyOfProject("console.dxf")));
    QLineEdit* input = window_->console()->input();
    QTest::keyClicks(input, "(+ 40 2)");
    QTest::keyClick(input, Qt::Key_Return);
    EXPECT_TRUE(window_->console()->text().contains("_$ (+ 40 2)\n42\n"));
    EXPECT_TRUE(input->text().isEmpty());
    QTest::keyClicks(input, "(princ \"hello\") (getprimeirapagina)");
    QTest::keyClick(input, Qt::Key_Return);
    EXPECT_TRUE(window_->console()->text().contains("hello\"hello\"\n\"CAPA$0001$A\"\n"))
        << window_->console()->text().toStdString();
    // An error is told in the console and the window goes on.
    QTest::keyClicks(input, "(car 5)");
    QTest::keyClick(input, Qt::Key_Return);
    EXPECT_TRUE(window_->console()->text().contains("error", Qt::CaseInsensitive));
    EXPECT_TRUE(input->isEnabled());
    // Up brings back what was typed.
    QTest::keyClick(input, Qt::Key_Up);
    EXPECT_EQ(input->text(), "(car 5)");
    QTest::keyClick(input, Qt::Key_Up);
    QTest::keyClick(input, Qt::Key_Up);
    EXPECT_EQ(input->text(), "(+ 40 2)");
    // What the document prints on its command line (the module's messages) reaches it too.
    window_->document()->printMessage("\nmessage 326\n");
    EXPECT_TRUE(window_->console()->text().endsWith("\nmessage 326\n"));
}

TEST_F(MainWindowTest, AnExportFromTheMenuShowsTheExportDialogAndTheFile) {
    ASSERT_TRUE(window_->openDrawing(copyOfProject("export.dxf")));
    const QString target = path("exported-terminals.csv");
    QFile::remove(target);
    QString asked;
    ModalAnswer answer([&](QWidget* modal) {
        auto* dialog = qobject_cast<QDialog*>(modal);
        ASSERT_NE(dialog, nullptr) << (modal ? modal->metaObject()->className() : "no window");
        asked = dialog->objectName();
        auto* file = dialog->findChild<QLineEdit*>("export:file");
        ASSERT_NE(file, nullptr);
        file->setText(target);
        dialog->accept();
    });
    zvsdk::CommandResult result = zvsdk::CommandResult::Failed;
    window_->commandAction("exportacaoBornes")->trigger();
    EXPECT_EQ(asked, "export") << "the module's export dialog, not a bare file dialog";
    ASSERT_EQ(shown_, QStringList({target}));
    QFile written(target);
    ASSERT_TRUE(written.open(QIODevice::ReadOnly));
    // One row per terminal of the project, and more: a real export.
    EXPECT_GT(written.readAll().count('\n'), 20);
    // Cancelled: nothing written, nothing shown.
    QFile::remove(target);
    ModalAnswer cancel([](QWidget* modal) {
        ASSERT_NE(modal, nullptr);
        static_cast<QDialog*>(modal)->reject();
    });
    window_->runCommand("exportacaoBornes", &result);
    EXPECT_EQ(result, zvsdk::CommandResult::Cancelled);
    EXPECT_FALSE(QFileInfo::exists(target));
    EXPECT_EQ(shown_.size(), 1);
}

TEST_F(MainWindowTest, ScreenshotOfTheMainWindowIsNotEmpty) {
    const QString project = copyOfProject("shot.dxf");
    auto shoot = [&](const QStringList& drawing, const QString& png) {
        QProcess zvdesk;
        QProcessEnvironment env = product_->environment();
        env.insert("QT_QPA_PLATFORM", "offscreen");
        zvdesk.setProcessEnvironment(env);
        zvdesk.start(ZV_BIN_DIR "/zvdesk", QStringList{"--screenshot", png} << drawing);
        EXPECT_TRUE(zvdesk.waitForFinished(120000));
        EXPECT_EQ(zvdesk.exitCode(), 0) << zvdesk.readAllStandardError().toStdString();
        return QImage(png);
    };
    const QImage full = shoot({project}, path("full.png"));
    const QImage empty = shoot({}, path("empty.png"));
    ASSERT_FALSE(full.isNull());
    ASSERT_FALSE(empty.isNull());
    EXPECT_GE(full.width(), 800);
    EXPECT_EQ(full.size(), empty.size());
    // The middle of the window is the page view: the first page drawn there has ink, an
    // empty drawing has none; the page browser at the left lists pages.
    const QRect middle(full.width() * 3 / 10, full.height() / 4, full.width() * 6 / 10,
                       full.height() / 3);
    EXPECT_GT(inkOf(full, middle), 500);
    EXPECT_LT(inkOf(empty, middle), 50);
    const QRect browser(0, full.height() / 6, full.width() / 6, full.height() / 3);
    EXPECT_GT(inkOf(full, browser), inkOf(empty, browser) + 200);
    // A drawing that can't be read writes no picture.
    QProcess bad;
    bad.start(ZV_BIN_DIR "/zvdesk", {"--screenshot", path("bad.png"), path("nothing-here.dxf")});
    ASSERT_TRUE(bad.waitForFinished(60000));
    EXPECT_EQ(bad.exitCode(), 1);
    EXPECT_FALSE(QFileInfo::exists(path("bad.png")));
    EXPECT_TRUE(bad.readAllStandardError().contains("nothing-here.dxf"));
}

}  // namespace
