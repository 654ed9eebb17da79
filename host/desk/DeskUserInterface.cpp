#include "DeskUserInterface.h"

#include "DeskTexts.h"
#include "PickerDialog.h"
#include "ProgressWindow.h"
#include "ProjectPages.h"

#include "sdk/Document.h"
#include "sdk/SystemServices.h"

#include <QApplication>
#include <QDesktopServices>
#include <QFileDialog>
#include <QFileInfo>
#include <QInputDialog>
#include <QMessageBox>
#include <QPushButton>
#include <QUrl>

namespace zvdesk {

DeskUserInterface::DeskUserInterface() = default;

DeskUserInterface::~DeskUserInterface() {
    delete progress_.data();
}

void DeskUserInterface::setParentWindow(QWidget* window) {
    parent_ = window;
}

void DeskUserInterface::setFileOpener(std::function<void(const QString&)> opener) {
    fileOpener_ = std::move(opener);
}

void DeskUserInterface::setEnableListener(std::function<void(bool)> listener) {
    enableListener_ = std::move(listener);
}

void DeskUserInterface::cancelledQuestion() {
    // A question the user turned away cancels the command that asked it.
    if (zvsdk::Document* document = zvsdk::activeDocument())
        document->reportCommandResult(zvsdk::CommandResult::Cancelled);
}

void DeskUserInterface::messageBox(const QString& text, const QString& title) {
    QMessageBox box(QMessageBox::Information, title.isEmpty() ? QStringLiteral("ZVListas") : title,
                    text, QMessageBox::NoButton, parent_);
    box.setObjectName("messageBox");
    box.addButton(words(Text::Ok), QMessageBox::AcceptRole);
    box.exec();
}

bool DeskUserInterface::askYesNo(const QString& name, const QString& text, bool cancelAnswer) {
    QMessageBox box(QMessageBox::Question, QStringLiteral("ZVListas"), text, QMessageBox::NoButton,
                    parent_);
    box.setObjectName(name);
    QPushButton* yes = box.addButton(words(Text::Yes), QMessageBox::YesRole);
    QPushButton* no = box.addButton(words(Text::No), QMessageBox::NoRole);
    // Escape and the close box press a button of their own: neither is a "no".
    QPushButton* cancel = box.addButton(words(Text::Cancel), QMessageBox::RejectRole);
    cancel->hide();
    box.setEscapeButton(cancel);
    box.setDefaultButton(yes);
    box.exec();
    if (box.clickedButton() == yes) return true;
    if (box.clickedButton() == no) return false;
    // Escape or the close box: what a cancelling user gives.
    cancelledQuestion();
    return cancelAnswer;
}

QStringList DeskUserInterface::dialogFilters(const QString& filter) {
    QStringList filters;
    for (QString part : filter.split(QStringLiteral(";;"), Qt::SkipEmptyParts)) {
        part = part.trimmed();
        const int open = part.indexOf('(');
        const int close = part.lastIndexOf(')');
        if (open < 0 || close < open) {
            if (!part.isEmpty()) filters << part;
            continue;
        }
        const QString patterns = part.mid(open + 1, close - open - 1).simplified();
        filters << part.left(open).trimmed() + " (" + patterns + ")";
    }
    return filters;
}

QString DeskUserInterface::fileDialog(const QString& name, bool open, const QString& filter,
                                      const QString& startPath, const QString& title) {
    QFileDialog dialog(parent_, title);
    dialog.setObjectName(name);
    dialog.setOption(QFileDialog::DontUseNativeDialog);
    dialog.setAcceptMode(open ? QFileDialog::AcceptOpen : QFileDialog::AcceptSave);
    dialog.setFileMode(open ? QFileDialog::ExistingFile : QFileDialog::AnyFile);
    QStringList filters = dialogFilters(filter);
    filters << words(Text::AllFiles);
    dialog.setNameFilters(filters);
    // The module passes Windows-style paths.
    QString start = startPath;
    start.replace(QLatin1String("\\\\"), QLatin1String("/")).replace('\\', '/');
    const QFileInfo info(start);
    if (!start.isEmpty()) {
        if (info.isDir()) {
            dialog.setDirectory(info.absoluteFilePath());
        } else {
            dialog.setDirectory(info.absolutePath());
            dialog.selectFile(info.fileName());
        }
    }
    dialog.setLabelText(QFileDialog::Accept, open ? words(Text::Open).remove('&').remove("...")
                                                  : words(Text::Save).remove('&'));
    dialog.setLabelText(QFileDialog::Reject, words(Text::Cancel));
    if (dialog.exec() != QDialog::Accepted || dialog.selectedFiles().isEmpty()) return {};
    return dialog.selectedFiles().first();
}

std::optional<QString> DeskUserInterface::answer(const QString& name, const QString& prompt) {
    zvsdk::Document* document = zvsdk::activeDocument();
    zvdb::Database* database = document ? document->database() : nullptr;
    if (name == QLatin1String("pages") || name == QLatin1String("strips")) {
        const bool pages = name == QLatin1String("pages");
        QStringList names;
        if (database) names = pages ? pageNames(*database) : stripNames(*database);
        PickerDialog picker(parent_, words(pages ? Text::PickPages : Text::PickStrips),
                            pages && !names.isEmpty() ? words(Text::PickPages) : prompt, names);
        picker.setObjectName(name);
        if (picker.exec() != QDialog::Accepted) return std::nullopt;
        return picker.chosen().join(pages ? ';' : ',');
    }
    if (name == QLatin1String("pick")) return std::nullopt;  // no picking on the page view
    // A file to write ("export:file"): the save dialog, not a line to type a path into.
    if (name.endsWith(QLatin1String(":file"))) {
        const QString file = fileDialog(name, false, QString(), QString(), prompt);
        if (file.isEmpty()) return std::nullopt;
        return file;
    }
    QInputDialog dialog(parent_);
    dialog.setObjectName(name);
    dialog.setWindowTitle(words(Text::Input));
    dialog.setLabelText(prompt);
    dialog.setOkButtonText(words(Text::Ok));
    dialog.setCancelButtonText(words(Text::Cancel));
    if (dialog.exec() != QDialog::Accepted) return std::nullopt;
    return dialog.textValue();
}

void DeskUserInterface::showFile(const QString& path) {
    if (fileOpener_) {
        fileOpener_(path);
        return;
    }
    QDesktopServices::openUrl(QUrl::fromLocalFile(QFileInfo(path).absoluteFilePath()));
}

ProgressWindow* DeskUserInterface::progressWindow() {
    if (!progress_) progress_ = new ProgressWindow(parent_);
    return progress_;
}

void DeskUserInterface::showProgress(const QString& title) {
    progressWindow()->start(title);
    QApplication::processEvents();
}

void DeskUserInterface::setProgress(int percent, const QString& line) {
    progressWindow()->step(percent, line);
}

void DeskUserInterface::closeProgress() {
    if (progress_) progress_->finish();
}

void DeskUserInterface::processEvents(int maxEvents) {
    Q_UNUSED(maxEvents);
    // The events pending now; what they post waits for the next step.
    QApplication::processEvents(QEventLoop::AllEvents);
}

bool DeskUserInterface::progressCancelled() {
    return cancelRequested_ || (progress_ && progress_->cancelled());
}

void DeskUserInterface::enableMainWindow(bool enable) {
    mainWindowEnabled_ = enable;
    if (enableListener_) enableListener_(enable);
}

}  // namespace zvdesk
