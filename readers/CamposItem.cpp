#include "CamposItem.h"

#include <QHash>

#include <algorithm>
#include <deque>
#include <limits>

namespace {

constexpr std::uint32_t kSemNumero = std::numeric_limits<std::uint32_t>::max();

// Names are never removed: a run of lists meets a few hundred. The lists run on one thread.
struct TabelaNomes {
    std::deque<QString> textos;  // stable addresses: iterators hand out references
    QHash<QString, std::uint32_t> numeros;

    std::uint32_t procura(const QString& nome) const { return numeros.value(nome, kSemNumero); }
};

TabelaNomes& Tabela() {
    static TabelaNomes tabela;
    return tabela;
}

}  // namespace

const QString& CamposItem::nome(std::uint32_t numero) {
    return Tabela().textos[numero];
}

std::uint32_t CamposItem::numero(const QString& nome) {
    TabelaNomes& tabela = Tabela();
    auto it = tabela.numeros.constFind(nome);
    if (it != tabela.numeros.constEnd()) return it.value();
    const auto novo = std::uint32_t(tabela.textos.size());
    tabela.textos.push_back(nome);
    tabela.numeros.insert(nome, novo);
    return novo;
}

std::vector<CamposItem::Campo>::const_iterator CamposItem::lugar(std::uint32_t numero) const {
    return std::lower_bound(campos_.begin(), campos_.end(), numero,
                            [](const Campo& c, std::uint32_t n) { return c.nome < n; });
}

const QString* CamposItem::procura(const QString& chave) const {
    const std::uint32_t n = Tabela().procura(chave);
    if (n == kSemNumero) return nullptr;
    const auto it = lugar(n);
    return it != campos_.end() && it->nome == n ? &it->valor : nullptr;
}

QString CamposItem::value(const QString& chave, const QString& padrao) const {
    const QString* valor = procura(chave);
    return valor ? *valor : padrao;
}

QStringList CamposItem::keys() const {
    QStringList nomes;
    nomes.reserve(size());
    for (const Campo& campo : campos_)
        nomes << nome(campo.nome);
    return nomes;
}

QStringList CamposItem::values() const {
    QStringList valores;
    valores.reserve(size());
    for (const Campo& campo : campos_)
        valores << campo.valor;
    return valores;
}

CamposItem::const_iterator CamposItem::find(const QString& chave) const {
    const std::uint32_t n = Tabela().procura(chave);
    if (n == kSemNumero) return end();
    const auto it = lugar(n);
    return it != campos_.end() && it->nome == n ? const_iterator(&*it) : end();
}

void CamposItem::insert(const QString& chave, const QString& valor) {
    const std::uint32_t n = numero(chave);
    // Items hold tens of fields: the first steps of the array's growth are skipped.
    if (campos_.capacity() == 0) campos_.reserve(16);
    const auto it = campos_.begin() + (lugar(n) - campos_.cbegin());
    if (it != campos_.end() && it->nome == n)
        it->valor = valor;
    else
        campos_.insert(it, Campo{n, valor});
}

int CamposItem::remove(const QString& chave) {
    const std::uint32_t n = Tabela().procura(chave);
    if (n == kSemNumero) return 0;
    const auto it = campos_.begin() + (lugar(n) - campos_.cbegin());
    if (it == campos_.end() || it->nome != n) return 0;
    campos_.erase(it);
    return 1;
}

void CamposItem::juntar(const CamposItem& origem) {
    if (&origem == this) return;
    if (campos_.empty()) {
        campos_ = origem.campos_;
        return;
    }
    // Both arrays are sorted: one merge, the source winning on equal names.
    std::vector<Campo> juntos;
    juntos.reserve(campos_.size() + origem.campos_.size());
    auto a = campos_.begin();
    auto b = origem.campos_.begin();
    while (a != campos_.end() || b != origem.campos_.end()) {
        if (b == origem.campos_.end() || (a != campos_.end() && a->nome < b->nome)) {
            juntos.push_back(std::move(*a++));
        } else {
            if (a != campos_.end() && a->nome == b->nome) ++a;
            juntos.push_back(*b++);
        }
    }
    campos_ = std::move(juntos);
}
