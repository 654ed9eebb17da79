#pragma once
// The terminals a walk over the drawing's symbols read, each told while its reference was at
// hand, for the pass over the items the walk kept: the kept ones stand in the order they
// were read, and a symbol the walk dropped leaves a record that no kept item answers.
#include "CEItemLista.h"

#include <cstddef>
#include <vector>

class BornesLidos {
public:
    void Limpa() {
        lidos_.clear();
        proximo_ = 0;
    }
    // A terminal read, that takes place `lugar` among the kept items if it is kept.
    void Anota(std::size_t lugar, const CEItemLista& item, const OdDbObjectId& id) {
        lidos_.push_back({lugar, &item, id});
    }
    // Whether the item kept at `lugar` was read as a terminal; asked in ascending places.
    // A record at this place may be of a dropped symbol whose item stood at the same
    // address; it was of another entity then, or of the same one, which tells the same.
    bool Eh(std::size_t lugar, const CEItemLista& item) {
        if (item.ids.empty()) return false;
        while (proximo_ < lidos_.size() && lidos_[proximo_].lugar < lugar)
            ++proximo_;
        for (std::size_t k = proximo_; k < lidos_.size() && lidos_[k].lugar == lugar; ++k)
            if (lidos_[k].item == &item && lidos_[k].id == item.ids.front()) return true;
        return false;
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
    };
    std::vector<Lido> lidos_;
    std::size_t proximo_ = 0;
};
