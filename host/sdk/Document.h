#pragma once
// A document of the host, as a module sees it: its commands, command line, LISP and drawing.
#include "ResultBuffer.h"

#include <QString>
#include <QStringList>

#include <functional>

namespace zvsdk {

class LispInterface;

// A command handler takes nothing and returns 1 whatever happened.
using CommandHandler = std::function<int()>;

// How a command ended. The handler's return says nothing, so a module tells the host here;
// the host keeps the worst it hears during one command and decides by it whether to go on
// and save.
enum class CommandResult { Succeeded, Failed, Cancelled, OutOfMemory };

class Document {
public:
    virtual ~Document() = default;
    // The drawing's full path; empty for a drawing never saved.
    virtual QString fileName() const = 0;
    virtual zvdb::Database* database() = 0;

    virtual void addCommand(const QString& name, CommandHandler handler) = 0;
    virtual void removeCommand(const QString& name) = 0;
    virtual bool hasCommand(const QString& name) const = 0;
    // The host's start-of-command call, made by a handler before it works.
    virtual void startCommand() = 0;
    // The module's word on the running command: a failure it printed, a question the user
    // cancelled, memory that ran out.
    virtual void reportCommandResult(CommandResult result) = 0;
    // Runs a host command from its tokens ("_.zoom", "_W", ...); false when unknown.
    virtual bool runCommand(const QStringList& tokens) = 0;

    // The command line: the text goes out exactly as given.
    virtual void printMessage(const QString& text) = 0;
    virtual LispInterface* lisp() = 0;
    // RTNORM and the picked entity, or RTCAN when the user picked nothing.
    virtual int pickEntity(const QString& prompt, EntityName* picked) = 0;

    // The undo bracket: everything done between begin and end is one step of Undo. Brackets
    // nest; only the outermost one makes a step. A host without undo ignores them.
    virtual void beginUndoGroup() {}
    virtual void endUndoGroup() {}
    // Takes the last step back out / puts the last undone step back; false when there is none.
    virtual bool undo() { return false; }
    virtual bool redo() { return false; }
    virtual bool canUndo() const { return false; }
    virtual bool canRedo() const { return false; }
};

}  // namespace zvsdk
