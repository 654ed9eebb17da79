// What goes wrong in a user's hands: a file that is not a drawing, a DWG file, a folder that
// can't be written, unsaved changes about to go, closing while a command runs. A message
// each time, never a crash, and the drawing that was open stays open and whole.
#include "DeskFixture.h"

#include "desk/LispConsole.h"
#include "desk/PageBrowser.h"
#include "desk/ProgressWindow.h"

#include "app/HostDocument.h"

#include <QAction>
#include <QCloseEvent>
#include <QDialog>
#include <QFileDialog>
#include <QMessageBox>
#include <QPushButton>
#include <QStandardPaths>
#include <QTest>

#include <sys/resource.h>
#include <unistd.h>
#include <csignal>

namespace {

using zvtest::chooseFile;
using zvtest::DeskTest;
using zvtest::ModalAnswer;

QByteArray contentOf(const QString& path) {
    QFile file(path);
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}

void writeBytes(const QString& path, const QByteArray& bytes) {
    QFile file(path);
    ASSERT_TRUE(file.open(QIODevice::WriteOnly));
    file.write(bytes);
}

QAbstractButton* buttonNamed(QWidget* box, const QString& text) {
    for (QAbstractButton* button : box->findChildren<QAbstractButton*>())
        if (button->text().remove('&') == text) return button;
    return nullptr;
}

// Answers the message box that comes up and keeps its text.
class MessageAnswer {
public:
    MessageAnswer()
        : answer_([this](QWidget* modal) {
              auto* box = qobject_cast<QMessageBox*>(modal);
              if (!box) return;
              text_ = box->text();
              box->accept();
          }) {}
    const QString& text() const { return text_; }
    bool seen() const { return answer_.seen(); }

private:
    QString text_;
    ModalAnswer answer_;
};

class BadInputTest : public DeskTest {
protected:
    // The project open, changed by a terminal list and not saved.
    void openChanged(const QString& name) {
        project_ = copyOfProject(name);
        ASSERT_TRUE(window_->openDrawing(project_));
        ASSERT_TRUE(window_->runCommand("gerarListaBornesGrf"));
        ASSERT_TRUE(window_->isModified());
    }
    QString project_;
};

TEST_F(BadInputTest, AFileThatIsNotADrawingIsRefusedAndTheOpenDrawingStays) {
    openChanged("stays.dxf");
    zvhost::HostDocument* before = window_->document();
    const int pages = window_->pageBrowser()->pages().size();
    const QString notes = path("notes.dxf");
    writeBytes(notes, "These are my notes, not a drawing.\n");
    MessageAnswer message;
    EXPECT_FALSE(window_->openDrawing(notes));
    EXPECT_TRUE(message.seen());
    EXPECT_TRUE(message.text().contains("could not be opened"));
    EXPECT_TRUE(message.text().contains("notes.dxf"));
    EXPECT_EQ(window_->document(), before);
    EXPECT_EQ(window_->pageBrowser()->pages().size(), pages);
    EXPECT_TRUE(window_->isModified());
    EXPECT_EQ(contentOf(notes), "These are my notes, not a drawing.\n");
    // A folder and a file that is not there are refused the same way.
    for (const QString& wrong : {path("."), path("missing.dxf")}) {
        QString error;
        EXPECT_FALSE(window_->openDrawing(wrong, &error, true));
        EXPECT_FALSE(error.isEmpty());
        EXPECT_EQ(window_->document(), before);
    }
}

TEST_F(BadInputTest, ADwgFileIsToldAndNothingChanges) {
    window_->newDrawing();
    zvhost::HostDocument* before = window_->document();
    const QString dwg = path("old.dwg");
    QByteArray bytes("AC1032");
    bytes.append(QByteArray(600, '\0'));
    bytes[40] = '\x1f';
    writeBytes(dwg, bytes);
    QString error;
    const bool opened = window_->openDrawing(dwg, &error, true);
    if (opened) {
        // Opened as a drawing by an importer: then it is the document, unchanged on disk.
        EXPECT_NE(window_->document(), before);
    } else {
        EXPECT_TRUE(error.contains("old.dwg"));
        EXPECT_EQ(window_->document(), before);
    }
    EXPECT_EQ(contentOf(dwg), bytes);
}

TEST_F(BadInputTest, SavingWhereNothingCanBeWrittenKeepsTheDrawingOpenAndUnsaved) {
    openChanged("unsaved.dxf");
    // A folder that is not there.
    {
        MessageAnswer message;
        EXPECT_FALSE(window_->saveAs(path("no/such/folder/p.dxf")));
        EXPECT_TRUE(message.text().contains("could not be saved"));
        EXPECT_TRUE(message.text().contains("no/such/folder/p.dxf"));
    }
    EXPECT_TRUE(window_->isModified());
    EXPECT_EQ(window_->document()->fileName(), QFileInfo(project_).absoluteFilePath());
    // A disk that fills up halfway: the old file stays byte for byte.
    const QByteArray old = contentOf(project_);
    rlimit before{};
    getrlimit(RLIMIT_FSIZE, &before);
    auto previous = std::signal(SIGXFSZ, SIG_IGN);
    rlimit limited = before;
    limited.rlim_cur = rlim_t(old.size() / 3);
    ASSERT_EQ(setrlimit(RLIMIT_FSIZE, &limited), 0);
    bool saved = true;
    QString text;
    {
        MessageAnswer message;
        saved = window_->save();
        text = message.text();
    }
    setrlimit(RLIMIT_FSIZE, &before);
    std::signal(SIGXFSZ, previous);
    EXPECT_FALSE(saved);
    EXPECT_TRUE(text.contains("could not be saved"));
    EXPECT_EQ(contentOf(project_), old);
    EXPECT_TRUE(window_->isModified());
    // Once there is room the same drawing saves, with the list's pages in it.
    EXPECT_TRUE(window_->save());
    EXPECT_FALSE(window_->isModified());
    EXPECT_TRUE(contentOf(project_).contains("LISTAS$0001$A"));
}

TEST_F(BadInputTest, ADrawingFromAnotherFormatIsNeverWrittenOverItsOwnFile) {
    // A drawing read from a DWG: Save asks where, proposing the same name as .dxf.
    if (QStandardPaths::findExecutable("node").isEmpty())
        GTEST_SKIP() << "node is not installed: no DWG converter";
    const QString imported = path("imported.dwg");
    QFile::remove(imported);
    QFile::remove(path("imported.dxf"));
    ASSERT_TRUE(QFile::copy(QString(ZV_SOURCE_DIR) + "/tests/drawing/dwg/xdata.dwg", imported));
    const QByteArray original = contentOf(imported);
    // The converter lies beside the programs, not beside the tests.
    qputenv("ZV_DWG_CONVERTER", ZV_BIN_DIR "/dwg");
    QString error;
    const bool opened = window_->openDrawing(imported, &error, true);
    qunsetenv("ZV_DWG_CONVERTER");
    ASSERT_TRUE(opened) << error.toStdString();
    window_->evaluate(
        "(entmake '((0 . \"LINE\") (8 . \"ADDED\") (10 0.0 0.0 0.0)"
        " (11 1.0 1.0 0.0)))");
    ASSERT_TRUE(window_->isModified());
    QString proposed;
    ModalAnswer answer([&](QWidget* modal) {
        auto* dialog = qobject_cast<QFileDialog*>(modal);
        ASSERT_NE(dialog, nullptr);
        EXPECT_EQ(dialog->objectName(), "drawing");
        EXPECT_EQ(dialog->acceptMode(), QFileDialog::AcceptSave);
        proposed = dialog->selectedFiles().value(0);
        chooseFile(dialog, path("imported.dxf"));
    });
    EXPECT_TRUE(window_->save());
    EXPECT_EQ(QFileInfo(proposed).fileName(), "imported.dxf");
    EXPECT_EQ(contentOf(imported), original);
    EXPECT_TRUE(contentOf(path("imported.dxf")).contains("\nADDED\n"));
    EXPECT_EQ(window_->document()->fileName(), QFileInfo(path("imported.dxf")).absoluteFilePath());
    EXPECT_FALSE(window_->isModified());
    // From now on Save writes the .dxf without asking.
    EXPECT_TRUE(window_->save());
}

TEST_F(BadInputTest, AFileNamedDwgThatIsNotOneIsRefusedWithAMessage) {
    const QString disguised = path("disguised.dwg");
    QFile::remove(disguised);
    ASSERT_TRUE(QFile::copy(product_->project(), disguised));
    const QByteArray original = contentOf(disguised);
    QString error;
    EXPECT_FALSE(window_->openDrawing(disguised, &error, true));
    EXPECT_TRUE(error.contains("disguised.dwg")) << error.toStdString();
    EXPECT_EQ(contentOf(disguised), original);
}

TEST_F(BadInputTest, AReadOnlyFolderRefusesTheSaveWithAMessage) {
    if (geteuid() == 0) GTEST_SKIP() << "folder permissions do not bind the superuser";
    openChanged("readonly.dxf");
    const QString folder = path("locked");
    QDir().mkpath(folder);
    QFile::setPermissions(folder, QFile::ReadOwner | QFile::ExeOwner);
    MessageAnswer message;
    EXPECT_FALSE(window_->saveAs(folder + "/p.dxf"));
    QFile::setPermissions(folder, QFile::ReadOwner | QFile::WriteOwner | QFile::ExeOwner);
    EXPECT_TRUE(message.text().contains("could not be saved"));
    EXPECT_TRUE(QDir(folder).isEmpty());
    EXPECT_TRUE(window_->isModified());
}

TEST_F(BadInputTest, UnsavedChangesAreAskedForBeforeTheyGo) {
    openChanged("ask.dxf");
    zvhost::HostDocument* before = window_->document();
    // Cancel: nothing happens.
    ModalAnswer cancel([](QWidget* modal) {
        ASSERT_NE(modal, nullptr);
        EXPECT_EQ(modal->objectName(), "unsavedQuestion");
        EXPECT_TRUE(static_cast<QMessageBox*>(modal)->text().contains("ask.dxf"));
        buttonNamed(modal, "Cancel")->click();
    });
    EXPECT_FALSE(window_->confirmDiscard());
    EXPECT_EQ(window_->document(), before);
    QCloseEvent refused;
    ModalAnswer cancelClose([](QWidget* modal) {
        ASSERT_NE(modal, nullptr);
        buttonNamed(modal, "Cancel")->click();
    });
    QApplication::sendEvent(window_.get(), &refused);
    EXPECT_FALSE(refused.isAccepted());
    EXPECT_TRUE(window_->isModified());
    // Save: the file gets the changes, then it may go.
    ModalAnswer save([](QWidget* modal) {
        ASSERT_NE(modal, nullptr);
        buttonNamed(modal, "Save")->click();
    });
    EXPECT_TRUE(window_->confirmDiscard());
    EXPECT_FALSE(window_->isModified());
    EXPECT_TRUE(contentOf(project_).contains("LISTAS$0001$A"));
    // Nothing unsaved: no question.
    QCloseEvent accepted;
    QApplication::sendEvent(window_.get(), &accepted);
    EXPECT_TRUE(accepted.isAccepted());
}

TEST_F(BadInputTest, ClosingDuringACommandStopsItFirstAndLosesNothing) {
    project_ = copyOfProject("closing.dxf");
    ASSERT_TRUE(window_->openDrawing(project_));
    const QByteArray old = contentOf(project_);
    // The user closes the window as soon as the progress window is up, says yes to
    // stopping, and then cancels the unsaved-changes question that follows.
    QStringList asked;
    bool closed = false;
    QTimer user;
    QObject::connect(&user, &QTimer::timeout, [&] {
        if (closed || !window_->isBusy() || !ui_->progressWindow()->isVisible()) return;
        closed = true;
        ModalAnswer stop([&](QWidget* modal) {
            ASSERT_NE(modal, nullptr);
            asked << modal->objectName();
            buttonNamed(modal, "Yes")->click();
        });
        window_->close();
    });
    user.start(0);
    zvsdk::CommandResult result = zvsdk::CommandResult::Succeeded;
    ASSERT_TRUE(window_->runCommand("gerarListaBornesGrf", &result));
    user.stop();
    ASSERT_TRUE(closed);
    EXPECT_EQ(asked, QStringList({"closeWhileBusy"}));
    EXPECT_TRUE(window_->isVisible());  // still there: the command ran on the window's stack
    EXPECT_FALSE(window_->isBusy());
    // The close comes back once the command has ended; its question is cancelled here.
    ModalAnswer keep([&](QWidget* modal) {
        if (!modal) return;
        asked << modal->objectName();
        buttonNamed(modal, "Cancel")->click();
    });
    QTest::qWait(300);
    if (window_->isModified()) {
        EXPECT_EQ(asked.value(1), "unsavedQuestion");
        EXPECT_TRUE(window_->isVisible());
    }
    EXPECT_NE(window_->document(), nullptr);
    EXPECT_EQ(contentOf(project_), old);
}

}  // namespace
