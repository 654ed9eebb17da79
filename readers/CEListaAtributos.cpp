#include "CEListaAtributos.h"

#include <stdexcept>

namespace zv {

CEAtributo& CEListaAtributos::operator[](int indice) const {
    if (indice < 0 || indice >= Quantidade())
        throw std::invalid_argument("CEListaAtributos: index out of range");
    return *atributos_[size_t(indice)];
}

}  // namespace zv
