#pragma once
// One run of a strip's detail band: how many terminals it spans, and the run's last
// terminal, whose fields the detail block prints.
#include <QString>
#include <QStringList>

#include <cstdint>

class CEItemLista;

class CEDetalheReguaDwg {
public:
    CEDetalheReguaDwg() = default;
    CEDetalheReguaDwg(std::int32_t quantidade, CEItemLista* ultimo)
        : quantidade(quantidade), ultimo(ultimo) {}

    // The names of an item's fields, through its public operations only.
    static QStringList NomesCampos(const CEItemLista& item);

    std::int32_t quantidade = 0;
    // Not owned, and not copied: a terminal with both sides read holds a few hundred fields,
    // and a strip drawing makes a run at nearly every terminal.
    CEItemLista* ultimo = nullptr;
};
