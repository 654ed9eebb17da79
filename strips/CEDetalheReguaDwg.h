#pragma once
// One run of a strip's detail band: how many terminals it spans, and the fields of the
// run's last terminal, which the detail block prints.
#include "readers/CamposItem.h"

#include <QString>
#include <QStringList>

#include <cstdint>

class CEItemLista;

class CEDetalheReguaDwg {
public:
    CEDetalheReguaDwg() = default;
    CEDetalheReguaDwg(std::int32_t quantidade, const CEItemLista* ultimo);

    // The names of an item's fields, through its public operations only.
    static QStringList NomesCampos(const CEItemLista& item);

    std::int32_t quantidade = 0;
    // A flat copy: a terminal with both sides read holds a few hundred fields, and a strip
    // drawing makes a run at nearly every terminal.
    CamposItem campos;
};
