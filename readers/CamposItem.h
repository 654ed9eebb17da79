#pragma once
// The text fields of one list item, stored flat: a large list holds millions of fields under
// a few hundred names, so each name is kept once for the whole program and a field is its
// name's number next to its value, in one array sorted by that number; items alike may read
// one shared array until one of them changes. The interface is the part of a hash of texts
// that the readers use.
#include <QString>
#include <QStringList>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <utility>
#include <vector>

class CamposItem {
public:
    struct Campo {
        std::uint32_t nome;
        QString valor;
    };

    class const_iterator {
    public:
        const_iterator() = default;
        explicit const_iterator(const Campo* campo) : campo_(campo) {}
        const QString& key() const { return CamposItem::nome(campo_->nome); }
        const QString& value() const { return campo_->valor; }
        const QString& operator*() const { return campo_->valor; }
        const_iterator& operator++() {
            ++campo_;
            return *this;
        }
        const_iterator operator++(int) {
            const_iterator antes = *this;
            ++campo_;
            return antes;
        }
        bool operator==(const const_iterator& outro) const = default;

    private:
        const Campo* campo_ = nullptr;
    };
    using iterator = const_iterator;

    int size() const { return int(dados().size()); }
    int count() const { return size(); }
    bool isEmpty() const { return dados().empty(); }
    bool empty() const { return dados().empty(); }
    bool contains(const QString& chave) const { return procura(chave) != nullptr; }
    QString value(const QString& chave, const QString& padrao = QString()) const;
    QString operator[](const QString& chave) const { return value(chave); }
    QStringList keys() const;
    QStringList values() const;
    // The stored value or null; the pointer lives until the next change of the fields.
    const QString* procura(const QString& chave) const;
    void insert(const QString& chave, const QString& valor);
    void insert(std::uint32_t numero, const QString& valor);
    int remove(const QString& chave);
    void clear() {
        partilhados_.reset();
        campos_.clear();
    }
    // Hands the fields over and leaves none: a reading made apart gives its values up
    // without a copy.
    std::vector<Campo> retirar() {
        proprios();
        return std::exchange(campos_, {});
    }
    // Takes an array back, emptied, for its room: readings made one after another in one
    // item allocate once.
    void reaproveitar(std::vector<Campo>&& campos) {
        partilhados_.reset();
        campos_ = std::move(campos);
        campos_.clear();
    }
    // From now on the fields are read-only and shared by this item's copies: many items alike
    // (an accessory's units) cost one array. Any change copies them first, into that item
    // alone.
    void partilhar();
    // Whether both read one shared array.
    bool partilhaCom(const CamposItem& outro) const {
        return partilhados_ && partilhados_ == outro.partilhados_;
    }
    bool partilhado() const { return partilhados_ != nullptr; }
    // Each field of `origem` under the same name, replacing what was there.
    void juntar(const CamposItem& origem);
    // The fields of `lote`, sorted by name number without repeats, replacing what was there.
    void juntarOrdenados(const std::vector<Campo>& lote);
    // The same for a batch of `n` fields given by the name and the value of the j-th: a
    // batch kept apart (names in one place, values in another) is merged without a copy.
    template <class Nome, class Valor>
    void juntarOrdenados(std::size_t n, Nome nome, Valor valor);
    // The value under a name number, or null; valid until the next change of the fields.
    const QString* procura(std::uint32_t numero) const;
    // The fields in name-number order.
    const std::vector<Campo>& todos() const { return dados(); }
    // Room for `n` fields: an item filled in a few merges moves its fields once. Shared
    // fields are copied with that room, as a change follows.
    void reservar(std::size_t n) {
        proprios(n > dados().size() ? n - dados().size() : 0);
        campos_.reserve(n);
    }
    // Gives back the spare room of the array once the item is complete; shared fields keep
    // theirs.
    void compactar() {
        if (!partilhados_) campos_.shrink_to_fit();
    }
    // The same, leaving room for `folga` fields more: for those every item is known to get.
    void compactar(std::size_t folga);
    // Keeps the fields whose name number `fica` accepts, in their order; the room of the
    // others stays until compactar (an item still being filled would take it again).
    template <class Fica>
    void reter(Fica fica) {
        proprios();
        std::erase_if(campos_, [&fica](const Campo& campo) { return !fica(campo.nome); });
    }

    const_iterator begin() const { return const_iterator(dados().data()); }
    const_iterator end() const { return const_iterator(dados().data() + dados().size()); }
    const_iterator constBegin() const { return begin(); }
    const_iterator constEnd() const { return end(); }
    const_iterator find(const QString& chave) const;
    const_iterator constFind(const QString& chave) const { return find(chave); }

    // The program-wide name table. A name's text, by its number.
    static const QString& nome(std::uint32_t numero);
    // All the names' texts, indexed by number: valid until a name is added.
    static const QString* const* nomes();
    // The number of a name, added when new.
    static std::uint32_t numero(const QString& nome);
    // The number of a name the table holds, or kSemNome; nothing is added.
    static constexpr std::uint32_t kSemNome = ~std::uint32_t(0);
    static std::uint32_t numeroSeHouver(const QString& nome);
    // How many names the table holds: a name absent stays so while this stays the same.
    static std::size_t quantidadeNomes();
    // The number of the name followed by the suffix: readers copy the fields of one entity
    // under a few suffixes into many items, and the joined names are made once.
    static std::uint32_t numeroComSufixo(std::uint32_t numero, const QString& sufixo) {
        // Most callers pass none: answered here, without a call.
        return sufixo.isEmpty() ? numero : numeroComSufixoNaoVazio(numero, sufixo);
    }

private:
    // Where the name number is, or would go, in the fields.
    static std::vector<Campo>::const_iterator lugar(const std::vector<Campo>& campos,
                                                    std::uint32_t numero);
    // numeroComSufixo for a suffix that is not empty.
    static std::uint32_t numeroComSufixoNaoVazio(std::uint32_t numero, const QString& sufixo);
    static std::uint32_t numeroNoSufixo(std::vector<std::uint32_t>& numeros, std::uint32_t numero,
                                        const QString& sufixo);

    const std::vector<Campo>& dados() const { return partilhados_ ? *partilhados_ : campos_; }
    // Shared fields become this item's own, with room for `mais` more.
    void proprios(std::size_t mais = 0) {
        if (partilhados_) proprio(mais);
    }
    void proprio(std::size_t mais);

    std::vector<Campo> campos_;
    // Set, the fields are these, and campos_ is empty.
    std::shared_ptr<const std::vector<Campo>> partilhados_;
};

template <class Nome, class Valor>
void CamposItem::juntarOrdenados(std::size_t n, Nome nome, Valor valor) {
    if (n == 0) return;
    proprios(n);
    if (campos_.empty() || campos_.back().nome < nome(0)) {
        // The batch's names all come after the fields there are (a first merge, or fields of
        // names numbered later, as a suffix's are): appended, each value made in its place.
        // The room grows as a resize would make it.
        const std::size_t tamanho = campos_.size();
        if (campos_.capacity() < tamanho + n) campos_.reserve(tamanho + std::max(tamanho, n));
        for (std::size_t j = 0; j < n; ++j)
            campos_.emplace_back(nome(j), valor(j));
        return;
    }
    // Both are sorted: one merge in place from the back, the batch winning on equal names,
    // after counting the names both hold from the batch's first name on (the fields before
    // it stay where they are).
    const std::uint32_t primeiro = nome(0);
    std::size_t repetidos = 0;
    std::size_t a = std::size_t(
        std::lower_bound(campos_.begin(), campos_.end(), primeiro,
                         [](const Campo& c, std::uint32_t numero) { return c.nome < numero; }) -
        campos_.begin());
    for (std::size_t b = 0; a < campos_.size() && b < n;) {
        const std::uint32_t na = campos_[a].nome, nb = nome(b);
        if (na < nb)
            ++a;
        else if (nb < na)
            ++b;
        else
            ++repetidos, ++a, ++b;
    }
    std::ptrdiff_t i = std::ptrdiff_t(campos_.size()) - 1;
    std::ptrdiff_t j = std::ptrdiff_t(n) - 1;
    campos_.resize(campos_.size() + n - repetidos);
    std::ptrdiff_t k = std::ptrdiff_t(campos_.size()) - 1;
    while (j >= 0) {
        const std::uint32_t nj = nome(std::size_t(j));
        if (i >= 0 && campos_[std::size_t(i)].nome > nj) {
            campos_[std::size_t(k--)] = std::move(campos_[std::size_t(i--)]);
        } else {
            if (i >= 0 && campos_[std::size_t(i)].nome == nj) --i;
            Campo& destino = campos_[std::size_t(k--)];
            destino.nome = nj;
            destino.valor = valor(std::size_t(j--));
        }
    }
}

// A field name written in the code, as a template argument: NumeroCampo<"LAYER">(sufixo) is
// the number of "LAYER" plus the suffix, with the name looked up once for the program and the
// joined names made once per suffix.
template <std::size_t N>
struct NomeLiteral {
    char texto[N];
    constexpr NomeLiteral(const char (&nome)[N]) { std::copy_n(nome, N, texto); }
};

template <NomeLiteral nome>
std::uint32_t NumeroCampo(const QString& sufixo = QString()) {
    static const std::uint32_t numero = CamposItem::numero(QString::fromLatin1(nome.texto));
    return CamposItem::numeroComSufixo(numero, sufixo);
}
