#pragma once
// A list page: its layer once created, the fields its header and footer print, its rows.
#include "CELinhaLista.h"

#include <QHash>
#include <QString>

#include <vector>

struct CEPaginaLista {
    QString nome;
    QHash<QString, QString> atributos;
    std::vector<CELinhaLista> linhas;
    bool pagina_total = false;
};
