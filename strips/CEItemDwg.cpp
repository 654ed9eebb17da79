#include "CEItemDwg.h"

#include <cstddef>

CEItemDwg::~CEItemDwg() = default;

CEItemDwg* CEItemDwg::Ligado(int n) const {
    return n >= 0 && std::size_t(n) < ligados.size() ? ligados[size_t(n)] : nullptr;
}
