#pragma once
// A page group of the project with its printed pages, in order.
#include "CEPaginaPdf.h"

#include <QString>

#include <vector>

struct CEGrupoPaginas {
    QString Nome;
    QString Descricao;
    std::vector<CEPaginaPdf> Paginas;
};
