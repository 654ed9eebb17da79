#include "CESimboloDwg.h"

#include "readers/CEItemLista.h"

void CESimboloDwg::Liga(CEItemDwg* borne) {
    ligados.push_back(borne);
}

QString CESimboloDwg::Rotulo() const {
    if (!item) return {};
    for (const char* campo : {"RELACAO", "TAG", "ETIQUETA"}) {
        const QString valor = item->valorCampo(campo);
        if (!valor.isEmpty()) return valor;
    }
    return {};
}
