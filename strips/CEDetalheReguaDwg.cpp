#include "CEDetalheReguaDwg.h"

#include "readers/CEItemLista.h"

CEDetalheReguaDwg::CEDetalheReguaDwg(std::int32_t quantidade, const CEItemLista* ultimo)
    : quantidade(quantidade) {
    if (!ultimo) return;
    for (const QString& nome : NomesCampos(*ultimo))
        campos.insert(nome, ultimo->valorCampo(nome));
}

QStringList CEDetalheReguaDwg::NomesCampos(const CEItemLista& item) {
    // Field names hold no blanks: they are attribute tags and catalogue columns.
    return item.textoCampos().split(' ', Qt::SkipEmptyParts);
}
