#include "LispConsole.h"

#include "DeskTexts.h"

#include <QFontDatabase>
#include <QHBoxLayout>
#include <QKeyEvent>
#include <QLineEdit>
#include <QPlainTextEdit>
#include <QPushButton>
#include <QScrollBar>
#include <QVBoxLayout>

namespace zvdesk {

namespace {
constexpr int kMaxBlocks = 20000;  // lines kept on screen
}

LispConsole::LispConsole(QWidget* parent)
    : QWidget(parent),
      output_(new QPlainTextEdit(this)),
      input_(new QLineEdit(this)),
      evaluate_(new QPushButton(words(Text::Evaluate), this)) {
    setObjectName("lispConsole");
    output_->setObjectName("consoleOutput");
    input_->setObjectName("consoleInput");
    output_->setReadOnly(true);
    output_->setMaximumBlockCount(kMaxBlocks);
    const QFont fixed = QFontDatabase::systemFont(QFontDatabase::FixedFont);
    output_->setFont(fixed);
    input_->setFont(fixed);
    input_->setPlaceholderText("(getprimeirapagina)  (princ (getvar \"CLAYER\"))");
    auto* layout = new QVBoxLayout(this);
    layout->setContentsMargins(2, 2, 2, 2);
    layout->addWidget(output_);
    auto* line = new QHBoxLayout;
    line->addWidget(input_);
    line->addWidget(evaluate_);
    layout->addLayout(line);
    connect(input_, &QLineEdit::returnPressed, this, [this] { submit(); });
    connect(evaluate_, &QPushButton::clicked, this, [this] { submit(); });
    input_->installEventFilter(this);
}

void LispConsole::setEvaluator(std::function<void(const QString&)> evaluator) {
    evaluator_ = std::move(evaluator);
}

void LispConsole::append(const QString& text) {
    if (text.isEmpty()) return;
    QTextCursor cursor = output_->textCursor();
    cursor.movePosition(QTextCursor::End);
    cursor.insertText(text);
    output_->verticalScrollBar()->setValue(output_->verticalScrollBar()->maximum());
}

QString LispConsole::text() const {
    return output_->toPlainText();
}

void LispConsole::setInputEnabled(bool enabled) {
    input_->setEnabled(enabled);
    evaluate_->setEnabled(enabled);
}

void LispConsole::submit() {
    const QString text = input_->text();
    if (text.trimmed().isEmpty()) return;
    if (history_.isEmpty() || history_.last() != text) history_ << text;
    historyAt_ = history_.size();
    input_->clear();
    append("\n_$ " + text + "\n");
    if (evaluator_) evaluator_(text);
}

bool LispConsole::eventFilter(QObject* watched, QEvent* event) {
    if (watched == input_ && event->type() == QEvent::KeyPress && !history_.isEmpty()) {
        const int key = static_cast<QKeyEvent*>(event)->key();
        if (key == Qt::Key_Up || key == Qt::Key_Down) {
            historyAt_ =
                std::clamp(historyAt_ + (key == Qt::Key_Up ? -1 : 1), 0, int(history_.size()));
            input_->setText(historyAt_ < history_.size() ? history_[historyAt_] : QString());
            return true;
        }
    }
    return QWidget::eventFilter(watched, event);
}

}  // namespace zvdesk
