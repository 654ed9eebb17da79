#pragma once
// The terminal list as graphic pages: one row a terminal, strips one after the other, and
// the jumper bars between terminals drawn in columns beside the rows.
#include "CCListaPaginada.h"
#include "module/CCDataWriter.h"

#include <QSet>

#include <optional>
#include <vector>

class CCBorneGrfWriter : public CCDataWriter {
public:
    void EscreverItens(VetorItens& itens, CETemplate& modelo) override;

    // The names (in upper case) of the fields the list reads of its items: its row block's
    // cells, its sort and break fields and what its filter reads. None when an unreadable row
    // block, or a function cell or filter that could read any field, leaves them open.
    static std::optional<QSet<QString>> CamposDasLinhas(CETemplate& modelo);

    // The page layout of the items, without touching the drawing.
    static std::vector<CEPaginaLista> Diagrama(VetorItens& itens, CETemplate& modelo);
    // Jumper marks by column on the laid-out rows.
    static void MarcaJumpers(std::vector<CEPaginaLista>& paginas, int colunas);

private:
    void ImportaMarcas(CETemplate& modelo, const QString& grupo);
    void InsereMarcas(const CELinhaLista& linha, const QString& layer);

    double distColunas_ = 0.0;
    int numColunas_ = 0;
    bool visualizarJumper_ = false;
    std::vector<CCListaPaginada::Bloco> marcas_;
    CCListaPaginada::Detalhes detalhes_;
};
