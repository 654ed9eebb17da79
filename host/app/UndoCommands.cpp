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

// The options start-up files and routines give: BEgin and End bracket a group of their own,
// the others (Auto, Control, Mark, Back) have nothing to set in this host.
bool undoOption(HostDocument& document, const QString& option) {
    if (option == "BE" || option == "BEGIN")
        document.beginUndoGroup();
    else if (option == "E" || option == "END")
        document.endUndoGroup();
    return true;
}

bool undoSteps(HostDocument& document, const QStringList& args) {
    const QString option = args.value(0).toUpper().remove('_');
    static const QStringList kOptions = {"BE", "BEGIN",   "E", "END",  "A", "AUTO",
                                         "C",  "CONTROL", "M", "MARK", "B", "BACK"};
    if (kOptions.contains(option)) return undoOption(document, option);
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
