#include "ConsoleUserInterface.h"

#include "Interrupts.h"

#include "sdk/Document.h"
#include "sdk/SystemServices.h"

#include <QCoreApplication>

namespace zvhost {

namespace {
constexpr int kBarWidth = 30;
}

ConsoleUserInterface::ConsoleUserInterface(QTextStream& out, QTextStream& err,
                                           bool progressOnTerminal)
    : out_(out), err_(err), progressOnTerminal_(progressOnTerminal) {}

bool ConsoleUserInterface::addAnswer(const QString& assignment) {
    const int equals = assignment.indexOf('=');
    if (equals <= 0) return false;
    answers_.insert(assignment.left(equals), assignment.mid(equals + 1));
    return true;
}

void ConsoleUserInterface::missing(const QString& name, const QString& what) {
    err_ << "zvhost: no answer for " << what << " '" << name << "' (--answer " << name
         << "=...): cancelled\n";
    err_.flush();
    // A cancelled question cancels the command that asked it.
    if (zvsdk::Document* document = zvsdk::activeDocument())
        document->reportCommandResult(zvsdk::CommandResult::Cancelled);
}

void ConsoleUserInterface::messageBox(const QString& text, const QString& title) {
    err_ << (title.isEmpty() ? QStringLiteral("message") : title) << ": " << text << "\n";
    err_.flush();
}

bool ConsoleUserInterface::askYesNo(const QString& name, const QString& text, bool cancelAnswer) {
    Q_UNUSED(text);
    auto it = answers_.constFind(name);
    if (it == answers_.constEnd()) {
        missing(name, QStringLiteral("question"));
        return cancelAnswer;
    }
    const QString value = it.value().trimmed().toLower();
    return value == "yes" || value == "y" || value == "s" || value == "sim" || value == "1" ||
           value == "true";
}

QString ConsoleUserInterface::fileDialog(const QString& name, bool open, const QString& filter,
                                         const QString& startPath, const QString& title) {
    Q_UNUSED(open);
    Q_UNUSED(filter);
    Q_UNUSED(startPath);
    Q_UNUSED(title);
    auto it = answers_.constFind(name);
    if (it == answers_.constEnd()) {
        missing(name, QStringLiteral("file dialog"));
        return {};
    }
    return it.value();
}

std::optional<QString> ConsoleUserInterface::answer(const QString& name, const QString& prompt) {
    Q_UNUSED(prompt);
    auto it = answers_.constFind(name);
    if (it == answers_.constEnd()) {
        missing(name, QStringLiteral("prompt"));
        return std::nullopt;
    }
    return it.value();
}

std::optional<QString> ConsoleUserInterface::presetAnswer(const QString& name) {
    auto it = answers_.constFind(name);
    if (it == answers_.constEnd()) return std::nullopt;
    return it.value();
}

QStringList ConsoleUserInterface::presetAnswerNames(const QString& prefix) {
    QStringList names;
    for (auto it = answers_.constBegin(); it != answers_.constEnd(); ++it)
        if (it.key().startsWith(prefix)) names << it.key();
    names.sort();
    return names;
}

void ConsoleUserInterface::showFile(const QString& path) {
    out_ << path << "\n";
    out_.flush();
}

void ConsoleUserInterface::showProgress(const QString& title) {
    progressOpen_ = true;
    progressTitle_ = title;
    progressPercent_ = 0;
    progressText_.clear();
    if (progressLog_) err_ << "progress: open " << title << "\n";
    drawProgress();
}

void ConsoleUserInterface::setProgress(int percent, const QString& text) {
    progressPercent_ = qBound(0, percent, 100);
    progressText_ = text;
    if (progressLog_) err_ << "progress: " << progressPercent_ << "% " << text << "\n";
    if (progressOpen_) drawProgress();
}

void ConsoleUserInterface::closeProgress() {
    if (progressLog_ && progressOpen_) err_ << "progress: close\n";
    if (progressOpen_ && progressOnTerminal_) {
        // Wipe the bar so the command line goes on in a clean line.
        out_ << "\r\033[2K";
        out_.flush();
    }
    progressOpen_ = false;
}

void ConsoleUserInterface::processEvents(int maxEvents) {
    if (!QCoreApplication::instance()) return;
    QCoreApplication::processEvents(QEventLoop::AllEvents, maxEvents);
}

void ConsoleUserInterface::drawProgress() {
    if (!progressOnTerminal_) return;
    const int filled = progressPercent_ * kBarWidth / 100;
    const QString& line = progressText_.isEmpty() ? progressTitle_ : progressText_;
    out_ << "\r\033[2K[" << QString(filled, '#') << QString(kBarWidth - filled, '.') << "] "
         << progressPercent_ << "% " << line.left(60);
    out_.flush();
}

// Ctrl+C is the command line's cancel button.
bool ConsoleUserInterface::progressCancelled() {
    return interruptRequested();
}

}  // namespace zvhost
