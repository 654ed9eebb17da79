#pragma once
// The LISP console: what the document prints (the module's messages, LISP output) and a
// line to type expressions into; Up and Down walk the lines typed before.
#include <QWidget>

#include <functional>

class QLineEdit;
class QPlainTextEdit;
class QPushButton;

namespace zvdesk {

class LispConsole : public QWidget {
public:
    explicit LispConsole(QWidget* parent = nullptr);

    // Called with the text typed when the user evaluates it.
    void setEvaluator(std::function<void(const QString&)> evaluator);
    void append(const QString& text);
    QString text() const;
    QLineEdit* input() const { return input_; }
    void setInputEnabled(bool enabled);

protected:
    bool eventFilter(QObject* watched, QEvent* event) override;

private:
    void submit();

    QPlainTextEdit* output_;
    QLineEdit* input_;
    QPushButton* evaluate_;
    std::function<void(const QString&)> evaluator_;
    QStringList history_;
    int historyAt_ = 0;
};

}  // namespace zvdesk
