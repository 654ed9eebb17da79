#pragma once
// A field name and its number, found once. The name enters the name table only when an item
// gets the field, as naming the field there would, so the order of an item's fields does not
// change; a question about a name no item has yet numbers nothing, and is not asked again
// while the name table does not grow.
#include "CEItemLista.h"
#include "CamposItem.h"

#include <cstddef>
#include <cstdint>
#include <utility>

class NomeCampo {
public:
    NomeCampo() = default;
    explicit NomeCampo(QString texto) : texto_(std::move(texto)) {}

    // The number, entering the name table when new.
    std::uint32_t ParaDefinir() const {
        if (numero_ == CamposItem::kSemNome) numero_ = CamposItem::numero(texto_);
        return numero_;
    }
    // CamposItem::kSemNome while no item has the field.
    std::uint32_t ParaBuscar() const {
        if (numero_ == CamposItem::kSemNome) {
            const std::size_t nomes = CamposItem::quantidadeNomes();
            if (nomes == conferido_) return numero_;
            numero_ = CamposItem::numeroSeHouver(texto_);
            conferido_ = nomes;
        }
        return numero_;
    }
    const QString* Em(const CEItemLista& item) const {
        const std::uint32_t numero = ParaBuscar();
        return numero == CamposItem::kSemNome ? nullptr : item.campos.procura(numero);
    }
    void Define(CEItemLista& item, const QString& valor) const {
        item.definirCampo(ParaDefinir(), valor);
    }

private:
    QString texto_;
    mutable std::uint32_t numero_ = CamposItem::kSemNome;
    mutable std::size_t conferido_ = ~std::size_t(0);
};
