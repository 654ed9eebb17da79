#pragma once
// One page of the joined PDF, as its bookmark shows it.
#include <QString>

struct CEPaginaPdf {
    QString Nome;
    QString Titulo;
    QString Descricao;
    int NumPagina = 0;  // from 1
};
