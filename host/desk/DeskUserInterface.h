#pragma once
// The desktop host's user interface: every question of a command is a window. Message
// boxes, yes/no questions, the template and export file dialogs, input prompts, the page
// and strip pickers and the progress window with its cancel button, in the user's language.
#include "sdk/UserInterface.h"

#include <QPointer>

#include <functional>

class QWidget;

namespace zvdesk {

class ProgressWindow;

class DeskUserInterface : public zvsdk::UserInterface {
public:
    DeskUserInterface();
    ~DeskUserInterface() override;

    // The window the dialogs belong to.
    void setParentWindow(QWidget* window);
    // How a written file is shown; the system's viewer unless set (tests catch it here).
    void setFileOpener(std::function<void(const QString&)> opener);
    // Told when the module enables or disables the main window.
    void setEnableListener(std::function<void(bool)> listener);

    void messageBox(const QString& text, const QString& title) override;
    bool askYesNo(const QString& name, const QString& text, bool cancelAnswer) override;
    QString fileDialog(const QString& name, bool open, const QString& filter,
                       const QString& startPath, const QString& title) override;
    std::optional<QString> answer(const QString& name, const QString& prompt) override;
    void showFile(const QString& path) override;

    void showProgress(const QString& title) override;
    void setProgress(int percent, const QString& line) override;
    void closeProgress() override;
    void processEvents(int maxEvents) override;
    bool progressCancelled() override;
    bool showsDialogs() const override { return true; }
    void enableMainWindow(bool enable) override;

    // The run's stop request from outside the progress window (closing the main window).
    void requestCancel() { cancelRequested_ = true; }
    void clearCancel() { cancelRequested_ = false; }
    ProgressWindow* progressWindow();
    bool mainWindowEnabled() const { return mainWindowEnabled_; }

    // "Desc ( *.a *.b );;Other ( *.c );;" as file-dialog filters.
    static QStringList dialogFilters(const QString& filter);

private:
    void cancelledQuestion();

    QPointer<QWidget> parent_;
    QPointer<ProgressWindow> progress_;
    std::function<void(const QString&)> fileOpener_;
    std::function<void(bool)> enableListener_;
    bool cancelRequested_ = false;
    bool mainWindowEnabled_ = true;
};

}  // namespace zvdesk
