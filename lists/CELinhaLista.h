#pragma once
// A row placed on a list page: the item it prints (null leaves the place empty), its
// insertion point, and the jumper marks beside it.
#include "readers/CEItemLista.h"

#include <memory>
#include <vector>

struct CELinhaLista {
    CEItemLista* item = nullptr;
    double x = 0.0;
    double y = 0.0;
    std::vector<int> marcas;
    std::vector<int> marcas_extra;
    // Rows the writer makes itself (blank rows, totals) own their item.
    std::shared_ptr<CEItemLista> proprio;
};
