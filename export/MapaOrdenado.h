#pragma once
// A text-to-text map that remembers the order in which keys first arrived. Options and
// configuration values are written back in that order, so a saved file does not reshuffle
// from one run to the next.
#include <QHash>
#include <QString>

#include <utility>
#include <vector>

class MapaOrdenado {
public:
    using Par = std::pair<QString, QString>;

    bool contem(const QString& chave) const { return indice_.contains(chave); }
    // Empty text when the key is missing.
    QString valor(const QString& chave) const {
        const auto it = indice_.constFind(chave);
        return it == indice_.constEnd() ? QString() : pares_[it.value()].second;
    }
    void definir(const QString& chave, const QString& valor) {
        const auto it = indice_.constFind(chave);
        if (it != indice_.constEnd()) {
            pares_[it.value()].second = valor;
            return;
        }
        indice_.insert(chave, pares_.size());
        pares_.emplace_back(chave, valor);
    }
    void limpar() {
        pares_.clear();
        indice_.clear();
    }
    size_t tamanho() const { return pares_.size(); }
    const std::vector<Par>& pares() const { return pares_; }
    auto begin() const { return pares_.begin(); }
    auto end() const { return pares_.end(); }

private:
    std::vector<Par> pares_;
    QHash<QString, size_t> indice_;
};
