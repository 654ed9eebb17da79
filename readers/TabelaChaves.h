#pragma once
// Values by key (texts, or a strip and a number) in two arrays, open addressing with linear
// probing: the strip model and the export reader keep one entry per terminal or symbol of the
// drawing, and a node per entry would cost an allocation and a free each, and a cache miss
// more per look-up. A default value (null, empty) stands for none; entries are never removed
// one by one.
//
// Texts as the drawing holds them are kept as std::string and asked for by their view
// (TabelaChaves<std::string, V, std::string_view>): the readers meet the same few thousand
// attribute texts again and again, and no key is made to ask.
#include <QHash>

#include <algorithm>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace tabela_chaves {
template <class T>
std::size_t Hash(const T& chave) {
    return std::size_t(qHash(chave));
}
// Attribute tags and values are short: eight bytes at a time, each step mixed by a multiply,
// and the low bits (the slot) taken from the high ones at the end.
inline std::size_t Hash(std::string_view texto) {
    std::uint64_t h = 0x9E3779B97F4A7C15ull ^ texto.size();
    const char* p = texto.data();
    std::size_t resto = texto.size();
    for (; resto >= 8; p += 8, resto -= 8) {
        std::uint64_t palavra;
        std::memcpy(&palavra, p, 8);
        h = (h ^ palavra) * 0xBF58476D1CE4E5B9ull;
        h ^= h >> 31;
    }
    std::uint64_t cauda = 0;
    for (std::size_t i = 0; i < resto; ++i)
        cauda |= std::uint64_t(static_cast<unsigned char>(p[i])) << (8 * i);
    h = (h ^ cauda) * 0x94D049BB133111EBull;
    return std::size_t(h ^ (h >> 32));
}
inline std::size_t Hash(const std::string& texto) {
    return Hash(std::string_view(texto));
}
}  // namespace tabela_chaves

template <class Chave, class V, class Busca = Chave>
class TabelaChaves {
public:
    std::size_t size() const { return entradas_.size(); }
    bool empty() const { return entradas_.empty(); }

    // Room for n entries without a new array.
    void reserve(std::size_t n) {
        entradas_.reserve(n);
        if (n * 2 > lugares_.size()) Refaz(std::bit_ceil(n * 2));
    }
    // Forgets every entry; the arrays keep their room.
    void clear() {
        entradas_.clear();
        std::fill(lugares_.begin(), lugares_.end(), kLivre);
    }
    // The value kept for the key, or a default one.
    V value(const Busca& chave) const {
        if (entradas_.empty()) return V();
        const std::size_t mascara = lugares_.size() - 1;
        for (std::size_t i = tabela_chaves::Hash(chave) & mascara;; i = (i + 1) & mascara) {
            const std::uint32_t k = lugares_[i];
            if (k == kLivre) return V();
            if (entradas_[k].first == chave) return entradas_[k].second;
        }
    }
    // The value kept for the key, `faz()` added when there is none: valid until the next
    // entry is added.
    template <class Faz>
    V& obtem(const Busca& chave, Faz&& faz) {
        if ((entradas_.size() + 1) * 2 > lugares_.size())
            Refaz(std::max<std::size_t>(16, lugares_.size() * 2));
        const std::size_t mascara = lugares_.size() - 1;
        std::size_t i = tabela_chaves::Hash(chave) & mascara;
        for (;; i = (i + 1) & mascara) {
            const std::uint32_t k = lugares_[i];
            if (k == kLivre) break;
            if (entradas_[k].first == chave) return entradas_[k].second;
        }
        // Made before the slot is taken: `faz` may not look at this table.
        V novo = faz();
        lugares_[i] = std::uint32_t(entradas_.size());
        return entradas_.emplace_back(Chave(chave), std::move(novo)).second;
    }
    // The value kept for the key, a default one added when there is none: valid until the
    // next entry is added.
    V& operator[](const Busca& chave) {
        return obtem(chave, [] { return V(); });
    }

private:
    static constexpr std::uint32_t kLivre = UINT32_MAX;
    void Refaz(std::size_t tamanho) {
        lugares_.assign(tamanho, kLivre);
        const std::size_t mascara = tamanho - 1;
        for (std::size_t k = 0; k < entradas_.size(); ++k) {
            std::size_t i = tabela_chaves::Hash(entradas_[k].first) & mascara;
            while (lugares_[i] != kLivre)
                i = (i + 1) & mascara;
            lugares_[i] = std::uint32_t(k);
        }
    }
    // The entries in the order they came; each slot holds an entry's place, or kLivre.
    std::vector<std::pair<Chave, V>> entradas_;
    std::vector<std::uint32_t> lugares_;
};
