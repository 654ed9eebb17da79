#include "CEBorneDwg.h"

#include "CESimboloDwg.h"

std::int32_t CEBorneDwg::Trilha(int i) const {
    return i >= 0 && size_t(i) < trilhas.size() ? trilhas[size_t(i)] : Livre;
}

void CEBorneDwg::DefineTrilha(int i, std::int32_t estado) {
    if (i < 0) return;
    if (size_t(i) >= trilhas.size()) trilhas.resize(size_t(i) + 1, Livre);
    trilhas[size_t(i)] = estado;
}

int CEBorneDwg::TrilhaLivre() const {
    for (size_t i = 0; i < trilhas.size(); ++i)
        if (trilhas[i] == Livre) return int(i);
    return int(trilhas.size());
}

CESimboloDwg* CEBorneDwg::PrimeiroSimbolo() const {
    return ligados.empty() ? nullptr : static_cast<CESimboloDwg*>(ligados.front());
}
