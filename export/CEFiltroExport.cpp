#include "CEFiltroExport.h"

bool CEFiltroExport::Aceita(const QString& v) const {
    switch (Operador) {
        case Igual:
            return v == Valor;
        case Diferente:
            return v != Valor;
        case Contem:
            return v.contains(Valor, Qt::CaseSensitive);
        case NaoContem:
            return !v.contains(Valor, Qt::CaseSensitive);
        case ComecaCom:
            return v.startsWith(Valor, Qt::CaseSensitive);
        case NaoComecaCom:
            return !v.startsWith(Valor, Qt::CaseSensitive);
        case TerminaCom:
            return v.endsWith(Valor, Qt::CaseSensitive);
        case NaoTerminaCom:
            return !v.endsWith(Valor, Qt::CaseSensitive);
        default:
            return false;
    }
}
