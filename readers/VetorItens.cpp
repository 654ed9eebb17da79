#include "VetorItens.h"

#include <QHash>

#include <algorithm>
#include <unordered_set>

void VetorItens::juntarSemRepetir(const VetorItens& origem) {
    std::unordered_set<const CEItemLista*> presentes(begin(), end());
    for (CEItemLista* item : origem)
        if (presentes.insert(item).second) push_back(item);
}

void VetorItens::inserirEm(CEItemLista* item, size_t indice) {
    insert(begin() + std::ptrdiff_t(std::min(indice, size())), item);
}

void VetorItens::inserirVariosEm(const VetorItens& origem, size_t indice) {
    const auto posicao = begin() + std::ptrdiff_t(std::min(indice, size()));
    insert(posicao, origem.rbegin(), origem.rend());
}

void VetorItens::removerEm(size_t indice) {
    if (indice < size()) erase(begin() + std::ptrdiff_t(indice));
}

namespace {

QString Campo(const CEItemLista* item, const QString& campo) {
    return item ? item->valorCampo(campo) : QString();
}

// One field's sort key: its natural form, then its raw text for ties such as "01" and "1".
struct Chave {
    QString natural;
    QString bruto;
};

int CompararChaves(const Chave& a, const Chave& b) {
    if (const int c = a.natural.compare(b.natural); c != 0) return c;
    return a.bruto.compare(b.bruto);
}

}  // namespace

int VetorItens::compararItens(const CEItemLista* a, const CEItemLista* b,
                              const QStringList& campos) {
    for (const QString& campo : campos) {
        const QString va = Campo(a, campo);
        const QString vb = Campo(b, campo);
        const int c =
            CompararChaves({ZVString::FormaNatural(va), va}, {ZVString::FormaNatural(vb), vb});
        if (c != 0) return c;
    }
    return 0;
}

void VetorItens::ordenar(const QStringList& campos) {
    if (campos.isEmpty() || size() < 2) return;
    // Each field's texts become ranks: the distinct texts are put in order once (a text's
    // natural form is worked out once however many items share it), so that comparing two
    // items compares numbers. Equal ranks are equal keys, so every comparison answers as
    // comparing the keys would, and the order comes out the same.
    const size_t k = size_t(campos.size());
    std::vector<unsigned> postos(size() * k);
    for (size_t c = 0; c < k; ++c) {
        QHash<QString, unsigned> distintos;
        std::vector<Chave> chaves;
        for (size_t i = 0; i < size(); ++i) {
            QString valor = Campo((*this)[i], campos[int(c)]);
            auto achado = distintos.constFind(valor);
            if (achado == distintos.constEnd()) {
                achado = distintos.insert(valor, unsigned(chaves.size()));
                chaves.push_back({ZVString::FormaNatural(valor), std::move(valor)});
            }
            postos[i * k + c] = achado.value();
        }
        std::vector<unsigned> ordemChaves(chaves.size());
        for (unsigned j = 0; j < ordemChaves.size(); ++j)
            ordemChaves[j] = j;
        std::sort(ordemChaves.begin(), ordemChaves.end(),
                  [&](unsigned a, unsigned b) { return CompararChaves(chaves[a], chaves[b]) < 0; });
        std::vector<unsigned> posto(chaves.size());
        for (unsigned j = 0; j < ordemChaves.size(); ++j)
            posto[ordemChaves[j]] = j;
        for (size_t i = 0; i < size(); ++i)
            postos[i * k + c] = posto[postos[i * k + c]];
    }
    std::vector<size_t> ordem(size());
    for (size_t i = 0; i < ordem.size(); ++i)
        ordem[i] = i;
    std::sort(ordem.begin(), ordem.end(), [&](size_t a, size_t b) {
        for (size_t c = 0; c < k; ++c)
            if (postos[a * k + c] != postos[b * k + c])
                return postos[a * k + c] < postos[b * k + c];
        return false;
    });
    std::vector<CEItemLista*> ordenado(size());
    for (size_t i = 0; i < ordem.size(); ++i)
        ordenado[i] = (*this)[ordem[i]];
    std::copy(ordenado.begin(), ordenado.end(), begin());
}

void VetorItens::inverter() {
    std::reverse(begin(), end());
}

VetorItens VetorItens::filtrar(const std::vector<std::pair<QString, QString>>& pares) const {
    VetorItens resultado;
    for (CEItemLista* item : *this) {
        const bool passa = std::all_of(pares.begin(), pares.end(), [item](const auto& par) {
            return item && item->valorCampo(par.first) == par.second;
        });
        if (passa) resultado.push_back(item);
    }
    return resultado;
}

void VetorItens::destruirItens() {
    for (CEItemLista* item : *this)
        delete item;
    clear();
}
