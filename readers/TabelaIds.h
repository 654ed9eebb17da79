#pragma once
// Values by drawing object in one array (open addressing, linear probing): readers keep a
// reading for each of tens of thousands of entities, and a node per entry would cost an
// allocation, a free and a cache miss more on each look-up.
#include "cad/OdDbObjectId.h"

#include <bit>
#include <cstddef>
#include <cstdint>
#include <utility>
#include <vector>

template <class V>
class TabelaIds {
public:
    TabelaIds() = default;
    TabelaIds(TabelaIds&& outra) noexcept { *this = std::move(outra); }
    TabelaIds& operator=(TabelaIds&& outra) noexcept {
        entradas_ = std::exchange(outra.entradas_, {});
        n_ = std::exchange(outra.n_, 0);
        desloca_ = std::exchange(outra.desloca_, 64);
        return *this;
    }

    std::size_t size() const { return n_; }
    bool empty() const { return n_ == 0; }
    bool contains(const OdDbObjectId& id) const { return procura(id) != nullptr; }

    // The value kept for the object, or null; valid until the next insertion or removal.
    V* procura(const OdDbObjectId& id) {
        return const_cast<V*>(static_cast<const TabelaIds&>(*this).procura(id));
    }
    const V* procura(const OdDbObjectId& id) const {
        if (n_ == 0) return nullptr;
        for (std::size_t i = Inicio(id);; i = (i + 1) & Mascara()) {
            const Entrada& e = entradas_[i];
            if (!e.ocupada) return nullptr;
            if (e.id == id) return &e.valor;
        }
    }
    // Keeps `valor` for the object, in place of one kept before.
    V& insere(const OdDbObjectId& id, V valor) {
        if (V* achado = procura(id)) return *achado = std::move(valor);
        if ((n_ + 1) * 8 > entradas_.size() * 7) Cresce();
        std::size_t i = Inicio(id);
        while (entradas_[i].ocupada)
            i = (i + 1) & Mascara();
        Entrada& e = entradas_[i];
        e.id = id;
        e.ocupada = true;
        e.valor = std::move(valor);
        ++n_;
        return e.valor;
    }
    // Takes the object's value out of the table; false when it had none.
    bool retira(const OdDbObjectId& id, V& valor) {
        if (n_ == 0) return false;
        std::size_t i = Inicio(id);
        for (;; i = (i + 1) & Mascara()) {
            if (!entradas_[i].ocupada) return false;
            if (entradas_[i].id == id) break;
        }
        valor = std::move(entradas_[i].valor);
        // The entries after it move back into the hole unless that would put them before
        // their first place.
        for (std::size_t j = (i + 1) & Mascara(); entradas_[j].ocupada; j = (j + 1) & Mascara()) {
            const std::size_t k = Inicio(entradas_[j].id);
            if (((j - k) & Mascara()) < ((j - i) & Mascara())) continue;
            entradas_[i] = std::move(entradas_[j]);
            i = j;
        }
        entradas_[i] = Entrada();
        --n_;
        return true;
    }
    // Empties the table and keeps its array for the entries to come.
    void limpa() {
        if (n_ == 0) return;
        for (Entrada& e : entradas_)
            if (e.ocupada) e = Entrada();
        n_ = 0;
    }
    // Empties the table and gives its memory back.
    void libera() {
        std::vector<Entrada>().swap(entradas_);
        n_ = 0;
    }

private:
    struct Entrada {
        OdDbObjectId id;
        bool ocupada = false;
        V valor{};
    };
    std::size_t Mascara() const { return entradas_.size() - 1; }
    std::size_t Inicio(const OdDbObjectId& id) const {
        // Handles run on from one another: the product spreads them over the whole array.
        const std::uint64_t chave =
            id.handle() ^ std::uint64_t(reinterpret_cast<std::uintptr_t>(id.database()));
        return std::size_t((chave * 0x9E3779B97F4A7C15ull) >> desloca_);
    }
    void Cresce() {
        const std::size_t tamanho = entradas_.empty() ? 16 : entradas_.size() * 2;
        std::vector<Entrada> antigas(tamanho);
        antigas.swap(entradas_);
        desloca_ = 64 - unsigned(std::countr_zero(tamanho));
        for (Entrada& e : antigas) {
            if (!e.ocupada) continue;
            std::size_t i = Inicio(e.id);
            while (entradas_[i].ocupada)
                i = (i + 1) & Mascara();
            entradas_[i] = std::move(e);
        }
    }

    std::vector<Entrada> entradas_;  // a power of two of them, or none
    std::size_t n_ = 0;
    unsigned desloca_ = 64;
};
