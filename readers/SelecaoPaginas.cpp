#include "readers/SelecaoPaginas.h"

#include "cad/CICad.h"

int SelecionaPaginas(bool comOpcoes, std::optional<QStringList>& paginas) {
    if (!CICad::GetDatabase()) return 2;
    CICad::AvaliaLisp(comOpcoes ? "(setq pblTmpSelPags (zv_seleciona_paginas 1 0))"
                                : "(setq pblTmpSelPags (zv_seleciona_paginas 0))");
    paginas = CICad::GetListaLisp("pblTmpSelPags");
    return 0;
}
