#include "ProgressWindow.h"

#include "DeskTexts.h"

#include <QLabel>
#include <QProgressBar>
#include <QPushButton>
#include <QVBoxLayout>

namespace zvdesk {

ProgressWindow::ProgressWindow(QWidget* parent)
    : QDialog(parent),
      line_(new QLabel(this)),
      bar_(new QProgressBar(this)),
      cancelButton_(new QPushButton(words(Text::Cancel), this)) {
    setObjectName("progressWindow");
    setWindowModality(Qt::NonModal);
    auto* layout = new QVBoxLayout(this);
    line_->setMinimumWidth(420);
    line_->setWordWrap(true);
    bar_->setRange(0, 100);
    layout->addWidget(line_);
    layout->addWidget(bar_);
    auto* buttons = new QHBoxLayout;
    buttons->addStretch();
    buttons->addWidget(cancelButton_);
    layout->addLayout(buttons);
    connect(cancelButton_, &QPushButton::clicked, this, [this] { cancel(); });
}

void ProgressWindow::start(const QString& title) {
    cancelled_ = false;
    cancelButton_->setEnabled(true);
    setWindowTitle(title.isEmpty() ? words(Text::Progress) : title);
    line_->setText(title);
    bar_->setValue(0);
    show();
    raise();
}

void ProgressWindow::step(int percent, const QString& line) {
    bar_->setValue(qBound(0, percent, 100));
    if (!line.isEmpty()) line_->setText(line);
}

void ProgressWindow::finish() {
    hide();
}

void ProgressWindow::cancel() {
    cancelled_ = true;
    cancelButton_->setEnabled(false);
}

void ProgressWindow::reject() {
    cancel();
}

int ProgressWindow::percent() const {
    return bar_->value();
}

QString ProgressWindow::line() const {
    return line_->text();
}

}  // namespace zvdesk
