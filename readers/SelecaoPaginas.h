#pragma once
// Page pickers seen from the readers: the LISP picker answers through `pblTmpSelPags`.
#include <QStringList>

#include <optional>

// Asks the user for pages of the active drawing. Returns 2 with no active drawing (the list is
// left alone), else 0 with the pages answered; a cancelled picker gives an empty list (no page).
int SelecionaPaginas(bool comOpcoes, std::optional<QStringList>& paginas);
