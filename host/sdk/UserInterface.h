#pragma once
// What the host shows a user: message boxes, questions, file dialogs, pickers, progress.
// The command-line host answers from scripted answers; a desktop host shows windows.
#include <QString>
#include <QStringList>

#include <optional>

namespace zvsdk {

class UserInterface {
public:
    virtual ~UserInterface() = default;
    virtual void messageBox(const QString& text, const QString& title) = 0;
    // A yes/no question; `name` is how a script answers it (e.g. "question:89").
    virtual bool askYesNo(const QString& name, const QString& text, bool cancelAnswer) = 0;
    // A file dialog. `filter` is in the host's "Desc ( *.ext );;" form. `name` says what
    // is asked ("template", "export"...). Empty text when the user cancels.
    virtual QString fileDialog(const QString& name, bool open, const QString& filter,
                               const QString& startPath, const QString& title) = 0;
    // A free answer by name (pickers, prompts); nothing when the user cancels.
    virtual std::optional<QString> answer(const QString& name, const QString& prompt) = 0;
    // A setting of a dialog that a script may give or leave out: nothing, and no cancel,
    // when it gives none. Hosts that show their dialogs have none to give.
    virtual std::optional<QString> presetAnswer(const QString& name) {
        Q_UNUSED(name);
        return std::nullopt;
    }
    // The names of the settings given that begin with `prefix`, sorted.
    virtual QStringList presetAnswerNames(const QString& prefix) {
        Q_UNUSED(prefix);
        return {};
    }
    // A file the command made, for the user to see: a desktop host opens it with the
    // system's viewer.
    virtual void showFile(const QString& path) { Q_UNUSED(path); }

    // The progress surface: one bar and one line of text (the title until a text is set).
    virtual void showProgress(const QString& title) = 0;
    virtual void setProgress(int percent, const QString& line) = 0;
    virtual void closeProgress() = 0;
    // Whether the progress surface is shown at all: a quiet host draws nothing, so there is
    // no window that could flicker.
    virtual bool showsProgress() const { return true; }
    // Lets the host handle at most `maxEvents` pending window events.
    virtual void processEvents(int maxEvents) = 0;
    // Whether the user asked to stop the running work (the progress window's cancel
    // button, Ctrl+C); a long run polls it between steps.
    virtual bool progressCancelled() { return false; }
    // Whether this host shows the module's own dialogs as windows; a host that answers from
    // a script does not, and the module fills them from presetAnswer() instead.
    virtual bool showsDialogs() const { return false; }
    // The main window's enable call.
    virtual void enableMainWindow(bool enable) = 0;
};

}  // namespace zvsdk
