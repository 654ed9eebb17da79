#pragma once
// The terminals a walk over the drawing's symbols read, each told while its reference was at
// hand, for the pass over the items the walk kept: the kept ones stand in the order they
// were read, and a symbol the walk dropped leaves a record that no kept item answers.
#include "CEItemLista.h"
#include "cad/CICad.h"

#include <QString>

#include <cstddef>
#include <utility>
#include <vector>

class BornesLidos {
public:
    // What the sides of a terminal ask of its reference, read while it is at hand: the
    // insertion and cut points, its layer as the reader names it, and whether it is an
    // equipment.
    struct Referencia {
        CEPonto insercao, corte;
        QString layer;
        bool equipamento = false;
    };

    void Limpa() {
        lidos_.clear();
        proximo_ = 0;
    }
    // A terminal read, that takes place `lugar` among the kept items if it is kept.
    void Anota(std::size_t lugar, const CEItemLista& item, const OdDbObjectId& id,
               Referencia referencia) {
        lidos_.push_back({lugar, &item, id, std::move(referencia)});
    }
    // The record of the item kept at `lugar` when it was read as a terminal, else null;
    // asked in ascending places, valid until the next record is added. A record at this
    // place may be of a dropped symbol whose item stood at the same address; it was of
    // another entity then, or of the same one, which tells the same.
    const Referencia* Eh(std::size_t lugar, const CEItemLista& item) {
        if (item.ids.empty()) return nullptr;
        while (proximo_ < lidos_.size() && lidos_[proximo_].lugar < lugar)
            ++proximo_;
        for (std::size_t k = proximo_; k < lidos_.size() && lidos_[k].lugar == lugar; ++k)
            if (lidos_[k].item == &item && lidos_[k].id == item.ids.front())
                return &lidos_[k].referencia;
        return nullptr;
    }
    // Gives back the records' room.
    void Libera() {
        std::vector<Lido>().swap(lidos_);
        proximo_ = 0;
    }

private:
    struct Lido {
        std::size_t lugar;
        const CEItemLista* item;
        OdDbObjectId id;
        Referencia referencia;
    };
    std::vector<Lido> lidos_;
    std::size_t proximo_ = 0;
};
