#pragma once
// Values by key (texts, or a strip and a number) in two arrays, open addressing with linear
// probing: the strip model and the export reader keep one entry per terminal or symbol of the
// drawing, and a node per entry would cost an allocation and a free each, and a cache miss
// more per look-up. A default value (null, empty) stands for none; entries are never removed.
#include <QHash>

#include <algorithm>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <utility>
#include <vector>

template <class Chave, class V>
class TabelaChaves {
public:
    std::size_t size() const { return entradas_.size(); }
    bool empty() const { return entradas_.empty(); }

    // Room for n entries without a new array.
    void reserve(std::size_t n) {
        entradas_.reserve(n);
        if (n * 2 > lugares_.size()) Refaz(std::bit_ceil(n * 2));
    }
    // The value kept for the key, or a default one.
    V value(const Chave& chave) const {
        if (entradas_.empty()) return V();
        const std::size_t mascara = lugares_.size() - 1;
        for (std::size_t i = std::size_t(qHash(chave)) & mascara;; i = (i + 1) & mascara) {
            const std::uint32_t k = lugares_[i];
            if (k == kLivre) return V();
            if (entradas_[k].first == chave) return entradas_[k].second;
        }
    }
    // The value kept for the key, a default one added when there is none: valid until the
    // next entry is added.
    V& operator[](const Chave& chave) {
        if ((entradas_.size() + 1) * 2 > lugares_.size())
            Refaz(std::max<std::size_t>(16, lugares_.size() * 2));
        const std::size_t mascara = lugares_.size() - 1;
        std::size_t i = std::size_t(qHash(chave)) & mascara;
        for (;; i = (i + 1) & mascara) {
            const std::uint32_t k = lugares_[i];
            if (k == kLivre) break;
            if (entradas_[k].first == chave) return entradas_[k].second;
        }
        lugares_[i] = std::uint32_t(entradas_.size());
        return entradas_.emplace_back(chave, V()).second;
    }

private:
    static constexpr std::uint32_t kLivre = UINT32_MAX;
    void Refaz(std::size_t tamanho) {
        lugares_.assign(tamanho, kLivre);
        const std::size_t mascara = tamanho - 1;
        for (std::size_t k = 0; k < entradas_.size(); ++k) {
            std::size_t i = std::size_t(qHash(entradas_[k].first)) & mascara;
            while (lugares_[i] != kLivre)
                i = (i + 1) & mascara;
            lugares_[i] = std::uint32_t(k);
        }
    }
    // The entries in the order they came; each slot holds an entry's place, or kLivre.
    std::vector<std::pair<Chave, V>> entradas_;
    std::vector<std::uint32_t> lugares_;
};
