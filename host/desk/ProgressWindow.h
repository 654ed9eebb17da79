#pragma once
// The progress window of a long run: one bar, one line of text and a cancel button. It
// stays above the main window while the run goes on and never blocks it.
#include <QDialog>

class QLabel;
class QProgressBar;
class QPushButton;

namespace zvdesk {

class ProgressWindow : public QDialog {
public:
    explicit ProgressWindow(QWidget* parent);

    void start(const QString& title);
    void step(int percent, const QString& line);
    void finish();
    bool cancelled() const { return cancelled_; }
    // Asks the run to stop, as the cancel button does.
    void cancel();
    int percent() const;
    QString line() const;

protected:
    void reject() override;  // Escape and the close box cancel too

private:
    QLabel* line_;
    QProgressBar* bar_;
    QPushButton* cancelButton_;
    bool cancelled_ = false;
};

}  // namespace zvdesk
