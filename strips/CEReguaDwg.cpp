#include "CEReguaDwg.h"

#include "CEBorneDwg.h"

std::vector<CESimboloDwg*> CEReguaDwg::Simbolos() const {
    std::vector<CESimboloDwg*> simbolos;
    simbolos.reserve(bornes.size());
    CESimboloDwg* anterior = nullptr;
    for (const CEBorneDwg* borne : bornes) {
        CESimboloDwg* simbolo = borne->PrimeiroSimbolo();
        simbolos.push_back(simbolo == anterior ? nullptr : simbolo);
        anterior = simbolo;
    }
    return simbolos;
}
