#pragma once
// The filters of an export and its sort: filter rows (field, operator, value) edited in
// place, the fields to sort by moved between two lists, and the direction.
#include "export/CEFiltroExport.h"

#include <QDialog>

#include <vector>

class CEExportacao;
class QComboBox;
class QLineEdit;
class QListWidget;
class QTreeWidget;

class CIFiltro : public QDialog {
public:
    // Writes the filters and the two sort options of `exportacao` when confirmed.
    explicit CIFiltro(CEExportacao& exportacao, QWidget* pai = nullptr);

    void accept() override;

    // The edit area as a new row, over the selected row, or the selected row removed.
    void Adiciona();
    void Altera();
    void Remove();
    // Moves the selected field into the sort, or out of it.
    void ParaOrdem();
    void DaOrdem();

    QTreeWidget* Lista() const { return lista_; }
    QComboBox* Campo() const { return campo_; }
    QComboBox* Operador() const { return operador_; }
    QLineEdit* Valor() const { return valor_; }
    QListWidget* Disponiveis() const { return disponiveis_; }
    QListWidget* Ordenar() const { return ordenar_; }
    // Entry 0 ascending ("C"), 1 descending ("D").
    QComboBox* Ordem() const { return ordem_; }
    const std::vector<CEFiltroExport>& Linhas() const { return linhas_; }

    static constexpr const char* kArquivo = "EXPORTFILTRO.DAT";
    static constexpr int kLinhasArquivo = 7;

private:
    void Preenche(int atual);
    void MostraLinha();
    CEFiltroExport DaEdicao() const;

    CEExportacao& exportacao_;
    std::vector<CEFiltroExport> linhas_;
    QTreeWidget* lista_;
    QComboBox* campo_;
    QComboBox* operador_;
    QLineEdit* valor_;
    QListWidget* disponiveis_;
    QListWidget* ordenar_;
    QComboBox* ordem_;
};
