#include "CEDetalheReguaDwg.h"

#include "readers/CEItemLista.h"

CEDetalheReguaDwg::CEDetalheReguaDwg(std::int32_t quantidade, const CEItemLista* ultimo)
    : quantidade(quantidade), campos(ultimo ? ultimo->campos : QHash<QString, QString>()) {}
