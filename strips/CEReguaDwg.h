#pragma once
// One strip as drawn on one page: its terminals in drawing order, its detail runs, and the
// point it is drawn at. A long strip is cut into several of these, all of the same name.
#include "CEDetalheReguaDwg.h"

#include <QString>

#include <vector>

class CEBorneDwg;
class CEPaginaDwg;
class CESimboloDwg;

class CEReguaDwg {
public:
    explicit CEReguaDwg(const QString& nome) : nome(nome) {}

    // One entry per terminal, in order: its first symbol, or null; a symbol that stands for
    // several terminals in a row is drawn once, under the first of them.
    std::vector<CESimboloDwg*> Simbolos() const;

    CEPaginaDwg* pagina = nullptr;
    QString nome;
    std::vector<CEBorneDwg*> bornes;
    std::vector<CEDetalheReguaDwg> detalhes;
    double x = 0.0, y = 0.0;
    // The page ends after this strip.
    bool quebra = false;
};
