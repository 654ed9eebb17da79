#include "CEDetalheReguaDwg.h"

#include "readers/CEItemLista.h"

QStringList CEDetalheReguaDwg::NomesCampos(const CEItemLista& item) {
    // Field names hold no blanks: they are attribute tags and catalogue columns.
    return item.textoCampos().split(' ', Qt::SkipEmptyParts);
}
