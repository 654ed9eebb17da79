#pragma once
// The columns of an export: a row per column, checked when it is written, in the order of
// the file; rows move up and down, go, get edited in detail or are added.
#include "JanelaDialogo.h"
#include "export/CEPropExport.h"

#include <QDialog>

#include <vector>

class QListWidget;
class QPushButton;

class CISelProps : public QDialog {
public:
    // Rebuilds `colunas` from the rows when the dialog is confirmed; a cancel leaves them.
    explicit CISelProps(std::vector<CEPropExport>& colunas, QWidget* pai = nullptr);

    void accept() override;

    // The selected row moves; nothing at the ends.
    void Sobe();
    void Desce();
    void Remove();
    // Opens CIDlgPropDetail for the selected row, or for a new column that goes to the end.
    void Edita();
    void Adiciona();

    QListWidget* Lista() const { return lista_; }
    const std::vector<CEPropExport>& Linhas() const { return linhas_; }
    // How the detail dialog is shown (tests answer it).
    JanelaDialogo::Mostrador MostraDialogo;

    static constexpr const char* kArquivo = "EXPORTSELPROPS.DAT";

private:
    void Preenche(int atual);
    void LeMarcas();
    // Only one column groups: the others lose the flag.
    void UnicoGrupo(size_t grupo);

    std::vector<CEPropExport>& colunas_;
    std::vector<CEPropExport> linhas_;
    QListWidget* lista_;
};
