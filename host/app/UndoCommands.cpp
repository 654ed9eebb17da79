#include "UndoCommands.h"

#include "Application.h"
#include "HostDocument.h"

namespace zvhost {

namespace {

// A step count: none means one; anything but a positive number is refused.
int stepCount(const QStringList& args) {
    if (args.isEmpty()) return 1;
    bool ok = false;
    const int count = args.first().toInt(&ok);
    return ok && count > 0 ? count : 0;
}

bool undoSteps(HostDocument& document, const QStringList& args) {
    const int count = stepCount(args);
    if (count == 0) return false;
    if (!document.undoEnabled()) {
        document.printMessage("\nUndo is off in this session.");
        return false;
    }
    for (int i = 0; i < count; ++i)
        if (!document.undo()) {
            document.printMessage("\nNothing to undo.");
            return i > 0;
        }
    return true;
}

bool redoStep(HostDocument& document, const QStringList&) {
    if (document.redo()) return true;
    document.printMessage("\nNothing to redo.");
    return false;
}

}  // namespace

void registerUndoCommands(Application& app) {
    app.registerHostCommand("UNDO", undoSteps);
    app.registerHostCommand(
        "U", [](HostDocument& document, const QStringList&) { return undoSteps(document, {}); });
    app.registerHostCommand("REDO", redoStep);
}

}  // namespace zvhost
