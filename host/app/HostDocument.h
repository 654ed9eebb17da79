#pragma once
// One open drawing of the host: its commands, command line, LISP environment and database.
#include "plot/HiddenLayers.h"
#include "sdk/Document.h"

#include <QHash>

#include <memory>
#include <optional>
#include <string>
#include <unordered_set>
#include <vector>

namespace zvdb {
class UndoJournal;
}

namespace zvplot {
class PageIndex;
}

namespace zvhost {

class Application;

class HostDocument : public zvsdk::Document {
public:
    HostDocument(Application& app, const QString& fileName,
                 std::unique_ptr<zvdb::Database> database);
    ~HostDocument() override;

    QString fileName() const override { return fileName_; }
    void setFileName(const QString& fileName) { fileName_ = fileName; }
    zvdb::Database* database() override { return database_.get(); }

    void addCommand(const QString& name, zvsdk::CommandHandler handler) override;
    void removeCommand(const QString& name) override;
    bool hasCommand(const QString& name) const override;
    QStringList commandNames() const;
    void startCommand() override { ++commandsStarted_; }
    int commandsStarted() const { return commandsStarted_; }
    bool runCommand(const QStringList& tokens) override;
    // A command of the host itself (ZOOM, -PRINT...) by this name.
    bool hasHostCommand(const QString& name) const;
    void reportCommandResult(zvsdk::CommandResult result) override;
    // Runs a command by name as a user typing it; false when no such command exists.
    // `result` gets how it ended: the worst the module reported, a LISP error that reached
    // the command line, a question left unanswered, or an interrupt.
    bool execute(const QString& name, zvsdk::CommandResult* result = nullptr);

    void printMessage(const QString& text) override;
    zvsdk::LispInterface* lisp() override { return lisp_.get(); }
    void setLisp(std::unique_ptr<zvsdk::LispInterface> lisp);
    int pickEntity(const QString& prompt, zvsdk::EntityName* picked) override;

    // The part of the drawing the document shows, in drawing units.
    struct View {
        double minX = 0.0, minY = 0.0, maxX = 1.0, maxY = 1.0;
    };
    const View& view();
    // Model space by layer for plotting, made again when entities were added or erased.
    const zvplot::PageIndex& plotIndex();
    void setView(const View& view);
    // The view of what shows now (the layers neither frozen nor off). It is measured when
    // first read, or just before the drawing's shapes change, whichever comes first: a
    // program that shows page after page and reads none of them measures none.
    void showExtents();

    // Undo is kept only where a user can ask for it (the desktop); a host that runs its
    // commands once and exits leaves it off and pays nothing for the brackets.
    void setUndoEnabled(bool enabled);
    bool undoEnabled() const { return undo_ != nullptr; }
    void beginUndoGroup() override;
    void endUndoGroup() override;
    bool undo() override;
    bool redo() override;
    bool canUndo() const override;
    bool canRedo() const override;

private:
    Application& app_;
    QString fileName_;
    std::unique_ptr<zvdb::Database> database_;
    std::unique_ptr<zvsdk::LispInterface> lisp_;
    // Command names compare without regard to case, as users type them; the name is kept
    // as it was registered.
    struct Command {
        QString name;
        zvsdk::CommandHandler handler;
    };
    QHash<QString, Command> commands_;
    int commandsStarted_ = 0;
    zvsdk::CommandResult result_ = zvsdk::CommandResult::Succeeded;
    // Puts the extents showExtents asked for into view_; `changing` when a change of the
    // drawing is about to happen.
    void settleView(bool changing);

    View view_;
    // The layers hidden when extents were asked for and not yet measured (upper-case names):
    // nothing is measured until the view is read or a shape is about to change.
    std::shared_ptr<const zvplot::HiddenLayers::Names> extentsOf_;
    zvplot::HiddenLayers hiddenLayers_;
    std::unique_ptr<zvplot::PageIndex> plotIndex_;
    std::unique_ptr<zvdb::UndoJournal> undo_;
};

}  // namespace zvhost
