#pragma once
// One export column in detail: its field (or expression, or literal text), heading, width,
// fill and flags.
#include "export/CEPropExport.h"

#include <QDialog>

class QCheckBox;
class QComboBox;
class QLineEdit;
class QPushButton;

class CIDlgPropDetail : public QDialog {
public:
    // Edits `coluna` when the dialog is confirmed; a cancel leaves it as it was.
    explicit CIDlgPropDetail(CEPropExport& coluna, QWidget* pai = nullptr);

    void accept() override;

    QLineEdit* Nome() const { return nome_; }
    QLineEdit* Titulo() const { return titulo_; }
    QLineEdit* Largura() const { return largura_; }
    QLineEdit* Preenche() const { return preenche_; }
    QCheckBox* Agrupa() const { return agrupa_; }
    QCheckBox* Literal() const { return literal_; }
    QCheckBox* Concatena() const { return concatena_; }
    // Entry 0 pads on the right (text to the left), entry 1 on the left.
    QComboBox* Alinhamento() const { return alinhamento_; }
    QPushButton* BotaoOk() const { return ok_; }

private:
    CEPropExport& coluna_;
    QLineEdit* nome_;
    QLineEdit* titulo_;
    QLineEdit* largura_;
    QLineEdit* preenche_;
    QCheckBox* agrupa_;
    QCheckBox* literal_;
    QCheckBox* concatena_;
    QComboBox* alinhamento_;
    QPushButton* ok_;
};
