#pragma once
// The desktop's main window: one drawing open at a time, its pages by group at the left,
// the page shown in the middle, the LISP console below, the module's commands in a menu
// and a tool bar, open and save, undo and redo.
#include "sdk/Document.h"

#include <QHash>
#include <QMainWindow>
#include <QStringList>

class QAction;
class QLabel;
class QMenu;
class QToolBar;

namespace zvhost {
class Application;
class HostDocument;
}  // namespace zvhost

namespace zvdesk {

class DeskUserInterface;
class LispConsole;
class PageBrowser;
class PageView;

class MainWindow : public QMainWindow {
public:
    MainWindow(zvhost::Application& app, DeskUserInterface& ui);
    ~MainWindow() override;

    // The module's commands in their table order, each with its words.
    static const QStringList& moduleCommands();

    // LISP files loaded into every drawing opened, after the user's configuration.
    void setLoadFiles(const QStringList& files) { loadFiles_ = files; }
    // A new, empty, unnamed drawing.
    void newDrawing();
    // Opens a drawing in place of the one open; false (and a message, the open drawing
    // untouched) when it can't be read. `quiet` leaves the message to the caller.
    bool openDrawing(const QString& path, QString* error = nullptr, bool quiet = false);
    // Saves to the drawing's file, or to `path`; false (and a message) when it can't.
    bool save();
    bool saveAs(const QString& path);
    // Asks before the unsaved changes of the drawing are lost: true when it may go.
    bool confirmDiscard();

    // Runs a command of the document as from the menu; false when there is no such command.
    bool runCommand(const QString& name, zvsdk::CommandResult* result = nullptr);
    // Evaluates LISP typed in the console and prints each value.
    void evaluate(const QString& text);
    bool showPage(const QString& page);
    void undo();
    void redo();
    // Draws the window into a PNG file; false when the file can't be written.
    bool screenshot(const QString& path);

    zvhost::HostDocument* document() const { return document_; }
    bool isModified() const;
    bool isBusy() const { return busy_; }
    PageBrowser* pageBrowser() const { return browser_; }
    PageView* pageView() const { return view_; }
    LispConsole* console() const { return console_; }
    QAction* commandAction(const QString& name) const { return commandActions_.value(name); }
    QAction* undoAction() const { return undo_; }
    QAction* redoAction() const { return redo_; }
    QAction* saveAction() const { return save_; }
    // Prints on the console, as the command line does.
    void print(const QString& text);

protected:
    void closeEvent(QCloseEvent* event) override;

private:
    void buildActions();
    void setDocument(zvhost::HostDocument* document);
    void loadIntoDocument();
    void syncFromDrawing(const QString& wanted);
    void setBusy(bool busy);
    void updateActions();
    void updateTitle();
    void markClean();
    void openFromDialog();
    bool saveFromDialog();
    void message(const QString& title, const QString& text);

    zvhost::Application& app_;
    DeskUserInterface& ui_;
    zvhost::HostDocument* document_ = nullptr;
    PageBrowser* browser_;
    PageView* view_;
    LispConsole* console_;
    QLabel* status_;
    QMenu* commandsMenu_ = nullptr;
    QMenu* otherMenu_ = nullptr;
    QToolBar* commandsBar_ = nullptr;
    QHash<QString, QAction*> commandActions_;
    QList<QAction*> fileActions_;
    QAction* save_ = nullptr;
    QAction* undo_ = nullptr;
    QAction* redo_ = nullptr;
    QStringList loadFiles_;
    quint64 cleanCount_ = 0;
    bool busy_ = false;
    bool closeAfterCommand_ = false;
    bool moduleEnabled_ = true;
};

}  // namespace zvdesk
