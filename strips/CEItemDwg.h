#pragma once
// Something drawn in a strip drawing, with what it is wired to: a terminal holds the symbols
// wired to its sides, a symbol the terminals it is wired to.
#include <vector>

class CEItemLista;

class CEItemDwg {
public:
    explicit CEItemDwg(CEItemLista* item) : item(item) {}
    virtual ~CEItemDwg();
    CEItemDwg(const CEItemDwg&) = delete;
    CEItemDwg& operator=(const CEItemDwg&) = delete;

    // The n-th connected object; null past the end.
    virtual CEItemDwg* Ligado(int n) const;

    // Not owned: the items belong to the run's vector.
    CEItemLista* item;
    std::vector<CEItemDwg*> ligados;
};
