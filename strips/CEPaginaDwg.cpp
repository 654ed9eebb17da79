#include "CEPaginaDwg.h"

int CEPaginaDwg::Quantidade() const {
    return int(reguas.size());
}
