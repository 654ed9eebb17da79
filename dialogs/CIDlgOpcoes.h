#pragma once
// The options of one export format: a row per option key with its label, and an editor
// chosen by the key's suffix (yes/no, orientation, paper, plot style, integer, text).
#include <QDialog>
#include <QString>

#include <utility>
#include <vector>

class CEExportacao;
class QTableWidget;
class QWidget;

class CIDlgOpcoes : public QDialog {
public:
    // Writes every row back into the options of `exportacao` when confirmed.
    CIDlgOpcoes(CEExportacao& exportacao, int tipoOut, QWidget* pai = nullptr);

    void accept() override;

    // The keys a format shows, with the message number of each label.
    static std::vector<std::pair<QString, int>> Chaves(int tipoOut);
    // The value that the editor of a row holds.
    QString Valor(int linha) const;
    // The editor of a key's row (a combo box or a line edit); null for a key not shown.
    QWidget* Editor(const QString& chave) const;
    QTableWidget* Tabela() const { return tabela_; }

private:
    QWidget* CriaEditor(const QString& chave, const QString& valor);

    CEExportacao& exportacao_;
    std::vector<QString> chaves_;
    QTableWidget* tabela_;
};
