#pragma once
// The wires' (and cables') connections as the LISP answers give them, in flat arrays: one
// record a wire, its entries side by side in arrays shared by all wires, and the wire
// numbers in an open-addressed index of record places. The numbers and the entries' texts
// lie one after the other in a few large blocks that never move, not in a string each: a
// large answer is a few allocations, freed at once, and a view of a text holds while the
// table lives. A text asked for as a QString is made once, when first asked for.
#include "cad/CICad.h"

#include <QString>
#include <QStringList>
#include <QStringView>

#include <cstdint>
#include <cstring>
#include <memory>
#include <optional>
#include <span>
#include <string_view>
#include <vector>

class TabelaConexoes {
public:
    // The texts of one wire's entries: their element part, or the whole texts.
    class Textos {
    public:
        Textos() = default;
        int size() const { return total_; }
        bool isEmpty() const { return total_ == 0; }
        QStringView vista(int i) const;
        // Whether the entries at i and j have the same text.
        bool MesmoTexto(int i, int j) const { return Iguais(vista(i), vista(j)); }
        // Out of range: the empty text.
        QString value(int i) const;
        QString at(int i) const { return value(i); }
        QString operator[](int i) const { return value(i); }
        // The handle the element's text names, as a number (ZVString::ParaHandle); 0 out of
        // range. No text is made for it.
        std::uint64_t handle(int i) const;
        int indexOf(QStringView texto) const;
        bool contains(QStringView texto) const { return indexOf(texto) >= 0; }
        QStringList ParaLista() const;

    private:
        friend class TabelaConexoes;
        Textos(const TabelaConexoes* tabela, std::uint32_t primeiro, int total, bool inteiros)
            : tabela_(tabela), primeiro_(primeiro), total_(total), inteiros_(inteiros) {}
        const TabelaConexoes* tabela_ = nullptr;
        std::uint32_t primeiro_ = 0;
        int total_ = 0;
        bool inteiros_ = false;
    };

    // Adds the wires of an answer: a list with one element per wire, its number then its
    // entries, each a list of a text and up to three reals; two list ends in a row close a
    // wire. With `detalhes` an entry's element is its text before the first "#" and, when
    // `completas`, its whole text is kept too; without, the element is the whole text and a
    // wire of a number already there keeps that one's whole texts. A number given again
    // takes the place of the one before.
    void Carrega(const zvsdk::ResultBuffer* resposta, bool detalhes, bool completas);
    // The same from the answer of the LISP function `funcao` (without arguments), when the
    // host gives it without its chain (CICad::zvInvokeConexoes); false when it does not,
    // and nothing was added.
    bool CarregaSemCadeia(const QString& funcao, bool detalhes, bool completas);
    // The answer of `funcao` by the first of the two ways the host gives.
    void CarregaDe(const QString& funcao, bool detalhes, bool completas);
    // The same, put off until the table is first looked at when the host works the answer
    // out meanwhile (CICad::zvPreparaConexoes); true then. The drawing is read, not changed,
    // until the look-up: the host waits for its work before any change.
    bool Adia(const QString& funcao, bool detalhes, bool completas);

    // Null when the wire is not there.
    std::optional<Textos> Elementos(const QString& fio) const;
    std::optional<Textos> Completas(const QString& fio) const;
    std::optional<std::span<const CEPonto>> Pontos(const QString& fio) const;
    // A wire's entries in one look-up: elements, whole texts, points, and the elements' handles as
    // numbers for comparing with entities.
    struct Entradas {
        Textos elementos;
        Textos completas;
        std::span<const CEPonto> pontos;
        std::span<const std::uint64_t> handles;
    };
    std::optional<Entradas> DoFio(const QString& fio) const;
    // Code unit by code unit, as QString compares, inline: most texts here are a few units.
    static bool Iguais(QStringView a, QStringView b) {
        return a.size() == b.size() &&
               (a.empty() || std::memcmp(a.data(), b.data(), std::size_t(a.size()) * 2) == 0);
    }
    int Fios() const {
        Completa();
        return int(fios_.size());
    }

private:
    struct Fio {
        const char16_t* numero = nullptr;  // in the blocks
        std::uint32_t tamanhoNumero = 0;
        std::uint32_t primeiro = 0;  // its entries
        std::uint32_t total = 0;
        std::uint32_t primeiraCompleta = 0;  // its whole texts (another wire's: see Carrega)
        std::uint32_t completas = 0;
        bool inteiros = false;  // the element is the whole text
        QStringView Numero() const { return {numero, qsizetype(tamanhoNumero)}; }
    };
    // An entry's text in the blocks; its element is its first `corte` units.
    struct Texto {
        const char16_t* inicio = nullptr;
        std::int32_t tamanho = 0;
        std::int32_t corte = 0;
    };
    // Room for `unidades` code units in the blocks, where the last one ends or in a new one.
    char16_t* Espaco(std::size_t unidades);
    // A copy of the text in the blocks.
    QStringView Guarda(QStringView texto);
    // The same for a UTF-8 text, which is ASCII nearly always.
    QStringView Guarda(std::string_view utf8);
    // The QString of entry k, its whole text or its element, made once.
    QString Feito(std::size_t k, bool inteiro) const;
    const Fio* Procura(QStringView numero) const;
    // Loads what was put off (Adia), in the order it was asked. Looking at the table is no
    // change to it: the answers were asked for already.
    void Completa() const {
        if (!adiadas_.empty()) const_cast<TabelaConexoes*>(this)->CarregaAdiadas();
    }
    void CarregaAdiadas();
    struct Adiada {
        QString funcao;
        bool detalhes, completas;
    };
    std::vector<Adiada> adiadas_;
    void Indexa(std::uint32_t lugar);
    void Reserva(std::size_t fios);
    // Both ways of loading go through these: a wire opened, its entries, the wire closed.
    class Receptor;
    // `unidades`: about how many code units the answer's texts take.
    void ReservaResposta(std::size_t fios, std::size_t entradas, std::size_t unidades);
    // `numero` is in the blocks.
    Fio AbreFio(QStringView numero, bool detalhes) const;
    // Its point is pontos_.back(), the origin until the answer's reals come.
    void Entrada(QStringView texto, bool detalhes, bool completas);
    // The same for a text in the blocks whose element's length and handle are known.
    void Entrada(QStringView texto, int corte, std::uint64_t handle);
    // The entry of a symbol: its handle's digits, then "#CONNECTION#BLOCK" for `inteiro`
    // (ASCII names), written straight into the blocks.
    void EntradaDeSimbolo(std::uint64_t handle, int digitos, bool inteiro, std::string_view conexao,
                          std::string_view bloco);
    void FechaFio(Fio&& fio, bool detalhes, bool completas);

    struct Bloco {
        std::unique_ptr<char16_t[]> dados;
        std::size_t usado = 0, tamanho = 0;
    };
    std::vector<Bloco> blocos_;
    std::size_t proximoBloco_ = 0;  // the size of the next block, when one is needed
    std::vector<Fio> fios_;
    std::vector<Texto> textos_;
    // The QStrings made so far, by entry: of the whole texts and of the elements.
    mutable std::vector<QString> inteirosFeitos_, partesFeitos_;
    std::vector<CEPonto> pontos_;
    std::vector<std::uint64_t> handles_;
    // The numbers' hashes keep most compares off the texts.
    struct Vaga {
        std::uint32_t hash = 0;
        std::uint32_t lugar = 0;  // record place + 1; 0 a free slot
    };
    static std::uint32_t HashDe(QStringView numero);
    static std::size_t Espalha(std::uint32_t hash, std::size_t mascara);
    std::vector<Vaga> indice_;  // a power of two long
};

inline std::uint64_t TabelaConexoes::Textos::handle(int i) const {
    return i < 0 || i >= total_ ? 0 : tabela_->handles_[primeiro_ + std::size_t(i)];
}

inline QStringView TabelaConexoes::Textos::vista(int i) const {
    if (i < 0 || i >= total_) return {};
    const Texto& texto = tabela_->textos_[primeiro_ + std::size_t(i)];
    return {texto.inicio, qsizetype(inteiros_ ? texto.tamanho : texto.corte)};
}
