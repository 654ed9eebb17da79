#pragma once
// The cable list: the wire list's pages with the two sides of each core joined first, a
// first-row block that opens each cable on each page, and, as the template says, blank rows
// instead of a new page when the cable changes.
#include "CCFioGrfWriter.h"
#include "readers/VetorItens.h"

class CCCaboGrfWriter : public CCFioGrfWriter {
public:
    ~CCCaboGrfWriter() override;

    void EscreverItens(VetorItens& itens, CETemplate& modelo) override;
    void EscrevePagina(const CEPaginaLista& pagina) override;
    // True when `*QUEBRA_POR_CFG*` is exactly "L".
    bool QuebraComBranco(CETemplate& modelo) override;

private:
    // The items joined into others: out of the list, freed with the writer.
    VetorItens juntados_;
};
