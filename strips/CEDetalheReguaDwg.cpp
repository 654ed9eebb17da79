#include "CEDetalheReguaDwg.h"

#include "readers/CEItemLista.h"

CEDetalheReguaDwg::CEDetalheReguaDwg(std::int32_t quantidade, const CEItemLista* ultimo)
    : quantidade(quantidade) {
    if (ultimo) campos = ultimo->campos;
}

QStringList CEDetalheReguaDwg::NomesCampos(const CEItemLista& item) {
    // Field names hold no blanks: they are attribute tags and catalogue columns.
    return item.textoCampos().split(' ', Qt::SkipEmptyParts);
}
