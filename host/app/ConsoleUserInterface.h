#pragma once
// The command-line host's user interface: answers come from a script (--answer NAME=VALUE);
// a question with no scripted answer gets what a cancelling user would give, and a line on
// stderr says which answer was missing. Message boxes are lines on stderr. Progress is one
// line on the terminal, and silent when stdout is no terminal or when asked to be quiet.
#include "sdk/UserInterface.h"

#include <QHash>
#include <QTextStream>

#include <chrono>

namespace zvhost {

class ConsoleUserInterface : public zvsdk::UserInterface {
public:
    ConsoleUserInterface(QTextStream& out, QTextStream& err, bool progressOnTerminal);

    // "NAME=VALUE"; false when the text has no "=".
    bool addAnswer(const QString& assignment);
    void setAnswer(const QString& name, const QString& value) { answers_.insert(name, value); }

    void messageBox(const QString& text, const QString& title) override;
    bool askYesNo(const QString& name, const QString& text, bool cancelAnswer) override;
    QString fileDialog(const QString& name, bool open, const QString& filter,
                       const QString& startPath, const QString& title) override;
    std::optional<QString> answer(const QString& name, const QString& prompt) override;
    std::optional<QString> presetAnswer(const QString& name) override;
    QStringList presetAnswerNames(const QString& prefix) override;
    // Never opens a viewer: prints the path on stdout.
    void showFile(const QString& path) override;

    void showProgress(const QString& title) override;
    void setProgress(int percent, const QString& text) override;
    void closeProgress() override;
    void processEvents(int maxEvents) override;
    bool progressCancelled() override;
    bool showsProgress() const override { return progressOnTerminal_ || progressLog_; }
    void enableMainWindow(bool enable) override { mainWindowEnabled_ = enable; }
    bool mainWindowEnabled() const { return mainWindowEnabled_; }
    // Every progress step as a line on stderr, for logs and scripts.
    void setProgressLog(bool on) { progressLog_ = on; }

private:
    void missing(const QString& name, const QString& what);
    void drawProgress();

    QTextStream& out_;
    QTextStream& err_;
    bool progressOnTerminal_;
    QHash<QString, QString> answers_;
    bool progressOpen_ = false;
    QString progressTitle_;
    QString progressText_;
    int progressPercent_ = 0;
    bool mainWindowEnabled_ = true;
    bool progressLog_ = false;
};

}  // namespace zvhost
