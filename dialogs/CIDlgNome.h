#pragma once
// Asks for the name of a new export configuration: one text field.
#include <QDialog>

class QLineEdit;
class QPushButton;

class CIDlgNome : public QDialog {
public:
    explicit CIDlgNome(const QString& proposto, QWidget* pai = nullptr);

    // The name typed, trimmed.
    QString Nome() const;
    QLineEdit* Campo() const { return campo_; }
    QPushButton* BotaoOk() const { return ok_; }

private:
    QLineEdit* campo_;
    QPushButton* ok_;
};
