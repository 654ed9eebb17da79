#include "MainWindow.h"

#include "DeskTexts.h"
#include "DeskUserInterface.h"
#include "LispConsole.h"
#include "PageBrowser.h"
#include "PageView.h"
#include "ProjectPages.h"

#include "app/Application.h"
#include "app/DocumentLisp.h"
#include "app/DrawingFiles.h"
#include "app/HostDocument.h"
#include "app/LispListener.h"
#include "drawing/Database.h"
#include "lisp/Printer.h"

#include <QAction>
#include <QApplication>
#include <QCloseEvent>
#include <QDockWidget>
#include <QFileDialog>
#include <QFileInfo>
#include <QLabel>
#include <QMenuBar>
#include <QMessageBox>
#include <QPushButton>
#include <QStatusBar>
#include <QTimer>
#include <QToolBar>

#include <exception>

namespace zvdesk {

namespace {

struct ModuleCommand {
    const char* name;
    Text label;
};

// The module's command table, in its order.
const ModuleCommand kCommands[] = {
    {"gerarListaBornesGrf", Text::CmdTerminalList},
    {"gerarListaBornesDwg", Text::CmdStripDrawing},
    {"gerarListaFiosGrf", Text::CmdWireList},
    {"gerarListaMateriaisGrf", Text::CmdMaterialList},
    {"gerarListaCabosGrf", Text::CmdCableList},
    {"exportacao", Text::CmdExport},
    {"exportacaoFios", Text::CmdExportWires},
    {"exportacaoAnilhas", Text::CmdExportFerrules},
    {"exportacaoBornes", Text::CmdExportTerminals},
    {"exportacaoMateriais", Text::CmdExportMaterials},
    {"exportacaoCabos", Text::CmdExportCables},
    {"diagramaTopografico", Text::CmdTopographic},
};

QString plain(Text text) {
    return words(text).remove('&');
}

}  // namespace

const QStringList& MainWindow::moduleCommands() {
    static const QStringList names = [] {
        QStringList list;
        for (const ModuleCommand& command : kCommands)
            list << QString::fromLatin1(command.name);
        return list;
    }();
    return names;
}

MainWindow::MainWindow(zvhost::Application& app, DeskUserInterface& ui)
    : app_(app),
      ui_(ui),
      browser_(new PageBrowser(this)),
      view_(new PageView(this)),
      console_(new LispConsole(this)),
      status_(new QLabel(this)) {
    setObjectName("mainWindow");
    setCentralWidget(view_);
    auto* pagesDock = new QDockWidget(words(Text::Pages), this);
    pagesDock->setObjectName("pagesDock");
    pagesDock->setWidget(browser_);
    pagesDock->setFeatures(QDockWidget::DockWidgetMovable | QDockWidget::DockWidgetFloatable);
    addDockWidget(Qt::LeftDockWidgetArea, pagesDock);
    auto* consoleDock = new QDockWidget(words(Text::Console), this);
    consoleDock->setObjectName("consoleDock");
    consoleDock->setWidget(console_);
    consoleDock->setFeatures(QDockWidget::DockWidgetMovable | QDockWidget::DockWidgetFloatable);
    addDockWidget(Qt::BottomDockWidgetArea, consoleDock);
    resizeDocks({pagesDock}, {300}, Qt::Horizontal);
    resizeDocks({consoleDock}, {170}, Qt::Vertical);
    statusBar()->addWidget(status_, 1);
    status_->setText(words(Text::Ready));
    buildActions();
    browser_->setPageListener([this](const QString& page) { showPage(page); });
    console_->setEvaluator([this](const QString& text) { evaluate(text); });
    ui_.setParentWindow(this);
    ui_.setEnableListener([this](bool enable) {
        moduleEnabled_ = enable;
        updateActions();
    });
    resize(1280, 820);
}

MainWindow::~MainWindow() {
    ui_.setEnableListener({});
    ui_.setParentWindow(nullptr);
}

void MainWindow::buildActions() {
    QMenu* file = menuBar()->addMenu(words(Text::FileMenu));
    QAction* open = file->addAction(words(Text::Open), this, [this] { openFromDialog(); });
    open->setShortcut(QKeySequence::Open);
    open->setObjectName("openAction");
    save_ = file->addAction(words(Text::Save), this, [this] { save(); });
    save_->setShortcut(QKeySequence::Save);
    save_->setObjectName("saveAction");
    QAction* saveAs = file->addAction(words(Text::SaveAs), this, [this] { saveFromDialog(); });
    saveAs->setShortcut(QKeySequence::SaveAs);
    file->addSeparator();
    QAction* quit = file->addAction(words(Text::Quit), this, [this] { close(); });
    quit->setShortcut(QKeySequence::Quit);
    fileActions_ = {open, save_, saveAs};

    QMenu* edit = menuBar()->addMenu(words(Text::EditMenu));
    undo_ = edit->addAction(words(Text::Undo), this, [this] { undo(); });
    undo_->setShortcut(QKeySequence::Undo);
    undo_->setObjectName("undoAction");
    redo_ = edit->addAction(words(Text::Redo), this, [this] { redo(); });
    redo_->setShortcut(QKeySequence::Redo);
    redo_->setObjectName("redoAction");

    QMenu* view = menuBar()->addMenu(words(Text::ViewMenu));
    QAction* fit = view->addAction(words(Text::Fit), this, [this] { view_->fit(); });
    fit->setShortcut(Qt::Key_Home);
    QAction* in = view->addAction(words(Text::ZoomIn), this, [this] { view_->zoom(1.5); });
    in->setShortcut(QKeySequence::ZoomIn);
    QAction* out = view->addAction(words(Text::ZoomOut), this, [this] { view_->zoom(1 / 1.5); });
    out->setShortcut(QKeySequence::ZoomOut);

    commandsMenu_ = menuBar()->addMenu(words(Text::CommandsMenu));
    QToolBar* main = addToolBar(words(Text::FileMenu).remove('&'));
    main->setObjectName("mainToolBar");
    main->addAction(open);
    main->addAction(save_);
    main->addSeparator();
    main->addAction(undo_);
    main->addAction(redo_);
    main->addSeparator();
    main->addAction(fit);
    main->addAction(in);
    main->addAction(out);
    for (QAction* action : {open, save_, undo_, redo_, fit, in, out})
        action->setIconText(action->text().remove('&').remove("..."));
    addToolBarBreak();
    commandsBar_ = addToolBar(plain(Text::CommandsMenu));
    commandsBar_->setObjectName("commandsToolBar");
    commandsBar_->setToolButtonStyle(Qt::ToolButtonTextOnly);
    int index = 0;
    for (const ModuleCommand& command : kCommands) {
        const QString name = QString::fromLatin1(command.name);
        QAction* action = commandsMenu_->addAction(words(command.label), this,
                                                   [this, name] { runCommand(name); });
        action->setObjectName(name);
        action->setToolTip(name);
        action->setStatusTip(name);
        commandActions_.insert(name, action);
        commandsBar_->addAction(action);
        // Lists, then exports, then the diagram.
        if (++index == 5 || index == 11) {
            commandsMenu_->addSeparator();
            commandsBar_->addSeparator();
        }
    }
    QMenu* help = menuBar()->addMenu(words(Text::HelpMenu));
    help->addAction(words(Text::About), this, [this] {
        QMessageBox box(QMessageBox::Information, "ZVListas", "ZVListas, open edition: zvdesk",
                        QMessageBox::NoButton, this);
        box.addButton(words(Text::Ok), QMessageBox::AcceptRole);
        box.exec();
    });
    updateActions();
}

void MainWindow::print(const QString& text) {
    console_->append(text);
}

void MainWindow::message(const QString& title, const QString& text) {
    ui_.messageBox(text, title);
}

bool MainWindow::isModified() const {
    return document_ && document_->database() &&
           document_->database()->changeCount() != cleanCount_;
}

void MainWindow::markClean() {
    cleanCount_ = document_ && document_->database() ? document_->database()->changeCount() : 0;
    updateTitle();
}

void MainWindow::updateTitle() {
    const QString name = document_ && !document_->fileName().isEmpty()
                             ? QFileInfo(document_->fileName()).fileName()
                             : words(Text::Untitled);
    setWindowTitle(name + "[*] - zvdesk");
    setWindowModified(isModified());
}

void MainWindow::updateActions() {
    const bool free = !busy_ && moduleEnabled_;
    for (QAction* action : fileActions_)
        action->setEnabled(!busy_);
    undo_->setEnabled(free && document_ && document_->canUndo());
    redo_->setEnabled(free && document_ && document_->canRedo());
    for (auto it = commandActions_.constBegin(); it != commandActions_.constEnd(); ++it)
        it.value()->setEnabled(free && document_ && document_->hasCommand(it.key()));
    // Commands that other modules add to the document go into the menu too.
    if (document_) {
        for (const QString& name : document_->commandNames()) {
            if (commandActions_.contains(name)) continue;
            if (!otherMenu_) otherMenu_ = commandsMenu_->addMenu(words(Text::OtherCommands));
            QAction* action = otherMenu_->addAction(name, this, [this, name] { runCommand(name); });
            action->setObjectName(name);
            commandActions_.insert(name, action);
            action->setEnabled(free);
        }
    }
    browser_->setEnabled(!busy_);
    console_->setInputEnabled(!busy_);
    updateTitle();
}

void MainWindow::setBusy(bool busy) {
    busy_ = busy;
    // Let go only after the drawing settled: syncFromDrawing() reads it again.
    if (busy) view_->hold(true);
    updateActions();
}

void MainWindow::setDocument(zvhost::HostDocument* document) {
    zvhost::HostDocument* old = document_;
    document_ = document;
    // A user at the desktop can take a command back: each command is one step.
    if (document) document->setUndoEnabled(true);
    view_->setDocument(document);
    // The old document goes only when the view no longer shows it.
    if (old) app_.closeDocument(old);
    loadIntoDocument();
    markClean();
    browser_->load(document ? document->database() : nullptr);
    syncFromDrawing({});
    markClean();
}

void MainWindow::loadIntoDocument() {
    zvsdk::LispInterface* lisp = document_ ? document_->lisp() : nullptr;
    if (!lisp) return;
    for (const QString& file : loadFiles_)
        lisp->lispEvaluate("(load " + zvlisp::Printer::quoted(QFileInfo(file).absoluteFilePath()) +
                           ")");
}

void MainWindow::newDrawing() {
    setDocument(app_.openDocument(QString(), nullptr));
}

bool MainWindow::openDrawing(const QString& path, QString* error, bool quiet) {
    QString why;
    std::unique_ptr<zvdb::Database> database;
    const QFileInfo info(path);
    if (info.isDir())
        why = path + ": is a directory, not a drawing";
    else if (!info.exists())
        why = path + ": no such file";
    else
        database = zvhost::readDrawing(path, &why);
    if (!database) {
        if (error) *error = why;
        if (!quiet) message(words(Text::CannotOpen), words(Text::CannotOpen) + ":\n" + why);
        return false;
    }
    for (const std::string& warning : database->warnings())
        print(QString::fromStdString(warning) + "\n");
    setDocument(app_.openDocument(info.absoluteFilePath(), std::move(database)));
    status_->setText(info.absoluteFilePath());
    return true;
}

bool MainWindow::save() {
    if (!document_) return false;
    // Drawings are written as DXF: a drawing read from another format is not written over
    // its own file but saved under a name the user gives.
    const QString file = document_->fileName();
    if (file.isEmpty() || QFileInfo(file).suffix().toLower() != QLatin1String("dxf"))
        return saveFromDialog();
    return saveAs(file);
}

bool MainWindow::saveAs(const QString& path) {
    if (!document_ || !document_->database() || busy_) return false;
    QString error;
    if (!zvhost::writeDrawing(*document_->database(), path, &error)) {
        message(words(Text::CannotSave), words(Text::CannotSave) + ":\n" + error);
        return false;
    }
    document_->setFileName(QFileInfo(path).absoluteFilePath());
    markClean();
    status_->setText(words(Text::Saved).arg(QFileInfo(path).absoluteFilePath()));
    return true;
}

bool MainWindow::saveFromDialog() {
    if (!document_) return false;
    QString start = document_->fileName();
    if (!start.isEmpty()) {
        const QFileInfo info(start);
        start = info.absolutePath() + "/" + info.completeBaseName() + ".dxf";
    }
    QString path = ui_.fileDialog("drawing", false, words(Text::Drawings), start,
                                  plain(Text::SaveAs).remove("..."));
    if (path.isEmpty()) return false;
    if (QFileInfo(path).suffix().isEmpty()) path += ".dxf";
    return saveAs(path);
}

void MainWindow::openFromDialog() {
    if (busy_ || !confirmDiscard()) return;
    const QString start = document_ ? document_->fileName() : QString();
    const QString path =
        ui_.fileDialog("drawing", true, words(Text::Drawings), start, plain(Text::Open));
    if (!path.isEmpty()) openDrawing(path);
}

bool MainWindow::confirmDiscard() {
    if (!isModified()) return true;
    const QString name = document_->fileName().isEmpty()
                             ? words(Text::Untitled)
                             : QFileInfo(document_->fileName()).fileName();
    QMessageBox box(QMessageBox::Warning, words(Text::UnsavedTitle),
                    words(Text::UnsavedText).arg(name), QMessageBox::NoButton, this);
    box.setObjectName("unsavedQuestion");
    QPushButton* saveButton = box.addButton(plain(Text::Save), QMessageBox::AcceptRole);
    QPushButton* discard = box.addButton(plain(Text::Discard), QMessageBox::DestructiveRole);
    QPushButton* cancel = box.addButton(words(Text::Cancel), QMessageBox::RejectRole);
    box.setDefaultButton(saveButton);
    box.setEscapeButton(cancel);
    box.exec();
    if (box.clickedButton() == discard) return true;
    if (box.clickedButton() == saveButton) return save();
    return false;
}

bool MainWindow::showPage(const QString& page) {
    if (!document_ || !document_->database()) return false;
    const bool clean = !isModified();
    if (!zvdesk::showPage(*document_->database(), page.toStdString())) return false;
    // Looking at another page changes no content: it does not make the drawing unsaved.
    if (clean) markClean();
    view_->setPage(page);
    browser_->select(page);
    status_->setText(browser_->label(page));
    return true;
}

void MainWindow::syncFromDrawing(const QString& wanted) {
    if (!document_ || !document_->database()) return;
    view_->hold(false);
    zvdb::Database& database = *document_->database();
    browser_->load(&database);
    const QStringList pages = browser_->pages();
    // The page the run left current (the user's page again), else the one asked for, else
    // the first.
    const QString current =
        QString::fromUtf8(database.currentLayer().data(), int(database.currentLayer().size()));
    QString page = pages.contains(current) ? current : wanted;
    if (!pages.contains(page) || !database.layer(page.toStdString())) page = browser_->firstPage();
    if (page.isEmpty()) {
        view_->setPage({});
    } else if (page == view_->page()) {
        view_->refresh();
        browser_->select(page);
    } else {
        const bool clean = !isModified();
        showPage(page);
        if (!clean) updateTitle();
    }
    updateActions();
}

bool MainWindow::runCommand(const QString& name, zvsdk::CommandResult* result) {
    if (!document_ || busy_) return false;
    zvsdk::CommandResult ended = zvsdk::CommandResult::Succeeded;
    const QString page = view_->page();
    ui_.clearCancel();
    setBusy(true);
    status_->setText(name + "...");
    bool known = false;
    try {
        known = document_->execute(name, &ended);
    } catch (const std::exception& e) {
        print("\n" + name + ": " + QString::fromLocal8Bit(e.what()) + "\n");
        ended = zvsdk::CommandResult::Failed;
        known = true;
    }
    setBusy(false);
    ui_.closeProgress();
    if (result) *result = ended;
    const Text said = ended == zvsdk::CommandResult::Succeeded   ? Text::CommandDone
                      : ended == zvsdk::CommandResult::Cancelled ? Text::CommandCancelled
                      : ended == zvsdk::CommandResult::Failed    ? Text::CommandFailed
                                                                 : Text::CommandOutOfMemory;
    status_->setText(words(said).arg(name));
    syncFromDrawing(page);
    if (closeAfterCommand_) {
        closeAfterCommand_ = false;
        QTimer::singleShot(0, this, [this] { close(); });
    }
    return known;
}

void MainWindow::evaluate(const QString& text) {
    auto* lisp = document_ ? dynamic_cast<zvhost::DocumentLisp*>(document_->lisp()) : nullptr;
    if (!lisp || busy_) return;
    zvlisp::Interpreter& interpreter = lisp->interpreter();
    const QString page = view_->page();
    ui_.clearCancel();
    setBusy(true);
    // One typed line is one step of Undo.
    document_->beginUndoGroup();
    try {
        zvhost::evaluateTyped(
            interpreter, text, [this](const QString& line) { print(line); }, true);
    } catch (const std::bad_alloc&) {
        print("\nout of memory\n");
    }
    document_->endUndoGroup();
    setBusy(false);
    ui_.closeProgress();
    syncFromDrawing(page);
}

void MainWindow::undo() {
    if (!document_ || busy_ || !document_->undo()) return;
    syncFromDrawing(view_->page());
}

void MainWindow::redo() {
    if (!document_ || busy_ || !document_->redo()) return;
    syncFromDrawing(view_->page());
}

bool MainWindow::screenshot(const QString& path) {
    QApplication::processEvents();
    return grab().save(path, "PNG");
}

void MainWindow::closeEvent(QCloseEvent* event) {
    if (busy_) {
        // The run is on the stack below this event: it must end before anything goes.
        event->ignore();
        QMessageBox box(QMessageBox::Question, "zvdesk", words(Text::CommandRunning),
                        QMessageBox::NoButton, this);
        box.setObjectName("closeWhileBusy");
        QPushButton* yes = box.addButton(words(Text::Yes), QMessageBox::YesRole);
        box.addButton(words(Text::No), QMessageBox::NoRole);
        box.exec();
        if (box.clickedButton() == yes) {
            closeAfterCommand_ = true;
            ui_.requestCancel();
        }
        return;
    }
    if (!confirmDiscard()) {
        event->ignore();
        return;
    }
    event->accept();
}

}  // namespace zvdesk
