#pragma once
// Items and drivers made in the tests.
#include "export/CEExportacao.h"

#include <QString>

#include <initializer_list>
#include <memory>
#include <utility>

namespace zvtest {

using Campos = std::initializer_list<std::pair<const char*, QString>>;

inline CEItemLista* NovoItem(Campos campos) {
    auto* item = new CEItemLista;
    for (const auto& [chave, valor] : campos)
        item->definirCampo(chave, valor);
    return item;
}

// A driver whose read items are made here; the driver destroys them.
class DriverTeste {
public:
    DriverTeste() {
        exp.ItensLidos = std::make_unique<VetorItens>();
        exp.Hoje = QDate(2026, 3, 7);
    }
    CEItemLista* Add(Campos campos) {
        exp.ItensLidos->push_back(NovoItem(campos));
        return exp.ItensLidos->back();
    }
    // The values of one field over the selected items, joined with "|".
    QString Valores(const char* campo) const {
        QStringList valores;
        for (const CEItemLista* item : *exp.Itens)
            valores << item->valorCampo(campo);
        return valores.join('|');
    }
    CEExportacao exp;
};

inline CEPropExport Coluna(const QString& tag, const QString& titulo = QString()) {
    CEPropExport c(tag);
    if (!titulo.isNull()) c.Titulo = titulo;
    return c;
}

}  // namespace zvtest
