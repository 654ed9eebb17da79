#pragma once
// A cross reference between two pages: a box on one, the place it points to on the other.
#include <QRectF>

struct CELink {
    int PaginaOrigem = 0;   // from 1
    int PaginaDestino = 0;  // from 1
    QRectF RetOrigem;       // in drawing units
    QRectF RetDestino;
};
