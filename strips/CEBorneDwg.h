#pragma once
// One terminal of a drawn strip, with the state of each jumper track beside it.
#include "CEItemDwg.h"

#include <QString>

#include <cstdint>
#include <vector>

class CEReguaDwg;
class CESimboloDwg;

class CEBorneDwg : public CEItemDwg {
public:
    // Track states.
    enum Estado : std::int32_t { Livre = 0, Inicio = 1, Passa = 2, Fim = 3, Meio = 4 };

    using CEItemDwg::CEItemDwg;

    // The state of track i; free past the end.
    std::int32_t Trilha(int i) const;
    // Sets track i, growing the tracks with free ones as needed.
    void DefineTrilha(int i, std::int32_t estado);
    // The lowest free track, or one past the last.
    int TrilhaLivre() const;
    // The first symbol wired to the terminal, or null.
    CESimboloDwg* PrimeiroSimbolo() const;

    std::vector<std::int32_t> trilhas;
    CEReguaDwg* regua = nullptr;
    // The terminals of the item's jumper links, when they are in the drawing.
    CEBorneDwg* proximo = nullptr;
    CEBorneDwg* anterior = nullptr;
    // The values of the item's side connections (LIG_...), in field order: the symbols wired
    // to the terminal place it by them while the model is built. They stand in one array of
    // the model, from `ligacoesInicio` on, and stay where the item holds them.
    std::uint32_t ligacoesInicio = 0;
    std::uint32_t ligacoesQuantas = 0;
};
