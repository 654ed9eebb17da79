#pragma once
// What a list writer makes of each cell of a block it places row after row, worked out once
// for the block instead of once a cell placed. What a cell is depends on its tag and default
// text alone: a cell whose texts are those seen at its place before keeps the answer. Most
// often they are the very texts of the block's definition, told at once by their shared
// memory (kept here, so it cannot be freed and handed to other texts); texts read back from
// a placed reference are compared. Any other texts are worked out anew and kept instead.
#include "readers/CamposItem.h"

#include <QHash>
#include <QString>

#include <cstddef>
#include <cstdint>
#include <vector>

template <typename Papel>
class CECelulasBloco {
public:
    CECelulasBloco() = default;
    // The cells of a block are found by the name kept with them: a copy would find the
    // other's.
    CECelulasBloco(const CECelulasBloco&) = delete;
    CECelulasBloco& operator=(const CECelulasBloco&) = delete;

    // The cells of one placing of the block of that name start here, in their order. A
    // writer places one block many times in a row under the very same name text: that name
    // finds its cells without asking the table again.
    void Inicia(const QString& nome) {
        if (!atual_ || !nome.isSharedWith(nomeAtual_)) {
            atual_ = &porBloco_[nome];
            nomeAtual_ = nome;
        }
        indice_ = 0;
    }
    // What the next cell is: the kept answer when its texts are the ones seen at its place,
    // else `resolve(tag, padrao)`, kept for the next time.
    template <typename Resolve>
    Papel& Proxima(const QString& tag, const QString& padrao, Resolve&& resolve) {
        std::vector<Celula>& celulas = *atual_;
        if (indice_ >= celulas.size()) celulas.resize(indice_ + 1);
        Celula& celula = celulas[indice_++];
        if (!celula.conhecida || !Mesmo(celula.tag, tag) || !Mesmo(celula.padrao, padrao))
            celula = {tag, padrao, resolve(tag, padrao), true};
        return celula.papel;
    }
    void Reinicia() {
        porBloco_.clear();
        atual_ = nullptr;
        nomeAtual_ = QString();
        indice_ = 0;
    }

private:
    // Equal texts of other memory are taken in place of the kept ones: the next placing
    // most often brings the same memory again.
    static bool Mesmo(QString& guardado, const QString& texto) {
        if (guardado.isSharedWith(texto)) return true;
        if (guardado != texto) return false;
        guardado = texto;
        return true;
    }
    struct Celula {
        QString tag;
        QString padrao;
        Papel papel{};
        bool conhecida = false;
    };
    // Each block's cells; the table's entries stay where they are as others are added.
    QHash<QString, std::vector<Celula>> porBloco_;
    std::vector<Celula>* atual_ = nullptr;
    QString nomeAtual_;  // the name atual_ was found by
    std::size_t indice_ = 0;
};

// A field of the items by its name's number, found once. A name that no item had yet is
// looked for again when names were added since.
struct CECampoPorNumero {
    std::uint32_t numero = CamposItem::kSemNome;
    std::size_t nomes = 0;

    static CECampoPorNumero De(const QString& nome) {
        return {CamposItem::numeroSeHouver(nome), CamposItem::quantidadeNomes()};
    }
    // The item's value of the field (empty when it has none), as CamposItem::value gives it.
    QString Valor(const CamposItem& campos, const QString& nome) {
        const QString* valor = Procura(campos, nome);
        return valor ? *valor : QString();
    }
    // The same without a copy: null when the item has no such field; good until the item's
    // fields change.
    const QString* Procura(const CamposItem& campos, const QString& nome) {
        if (numero == CamposItem::kSemNome && nomes != CamposItem::quantidadeNomes())
            *this = De(nome);
        return numero == CamposItem::kSemNome ? nullptr : campos.procura(numero);
    }
};
