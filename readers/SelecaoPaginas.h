#pragma once
// Page pickers seen from the readers: the LISP picker answers through `pblTmpSelPags`.
#include "module/CESelecao.h"

#include <QStringList>

#include <optional>

// Asks the user for pages of the active drawing. Returns 2 with no active drawing (the list is
// left alone), else 0 with the pages answered; a cancelled picker gives an empty list (no page).
int SelecionaPaginas(bool comOpcoes, std::optional<QStringList>& paginas);

// Asks for pages of the solution's projects ("PROJECT#PAGE") and makes one entry per project,
// in the order of its first page: an open drawing is taken as it is, any other is read from
// the file the solution names (a null database when none does). Runs only while no drawing
// is active: otherwise false and an empty selection.
bool SelecionaPaginasSolucao(CESelecao& selecao);
// The entries of a solution picker's answer, appended to `selecao`; a page name keeps all
// that stands behind the first "#".
void MontaSelecaoSolucao(const QStringList& resposta, CESelecao& selecao);

// The material list's selection: by `*SELECAO_PAG_MATTABLE*` (ask for pages) and whether a
// solution is loaded, as the table of the material driver says.
CESelecao SelecaoMateriais();
