#pragma once
// The attributes of a block reference, in the drawing's order; the list owns them.
#include "CEAtributo.h"

#include <memory>
#include <vector>

namespace zv {

class CEListaAtributos {
public:
    void Adicionar(std::unique_ptr<CEAtributo> atributo) {
        atributos_.push_back(std::move(atributo));
    }
    // Throws std::invalid_argument for an index outside the list.
    CEAtributo& operator[](int indice) const;
    int Quantidade() const { return int(atributos_.size()); }
    bool Vazia() const { return atributos_.empty(); }
    void Limpar() { atributos_.clear(); }

private:
    std::vector<std::unique_ptr<CEAtributo>> atributos_;
};

}  // namespace zv
