#include "VetorItens.h"

#include "Descarte.h"

#include "ZVString.h"

#include <QHash>
#include <QStringView>

#include <algorithm>
#include <bit>
#include <cstdint>
#include <functional>
#include <unordered_set>

QStringList VetorItens::camposQueDecidem(const QStringList& campos) {
    QStringList presentes;
    for (const QString& nome : campos)
        if (!presentes.contains(nome) && CamposItem::numeroSeHouver(nome) != CamposItem::kSemNome)
            presentes << nome;
    return presentes.isEmpty() ? campos : presentes;
}

void VetorItens::juntarSemRepetir(const VetorItens& origem) {
    // Most accessories have none of their own: no set of what is here for nothing.
    if (origem.empty()) return;
    // Readers hand over items made once each: one sorted array of every pointer shows that
    // nothing repeats, and the batch goes in whole without a node per item.
    std::vector<const CEItemLista*> todos;
    todos.reserve(size() + origem.size());
    todos.insert(todos.end(), begin(), end());
    todos.insert(todos.end(), origem.begin(), origem.end());
    std::sort(todos.begin(), todos.end());
    if (std::adjacent_find(todos.begin(), todos.end()) == todos.end()) {
        insert(end(), origem.begin(), origem.end());
        return;
    }
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

namespace {

// The distinct texts of one field, each with its natural form; the forms lie side by side
// in one buffer, so sorting them reads contiguous memory and makes no text per value.
class TextosDistintos {
public:
    // Room for up to `n` distinct texts, given at once: arrays grown step by step ask the
    // allocator again at each doubling, and after a reader's walk each large request sifts
    // through the many small blocks the walk gave back. Room never touched costs nothing.
    explicit TextosDistintos(size_t n) {
        tabela_.assign(std::bit_ceil(std::max<size_t>(16, 2 * n)), kLivre);
        textos_.reserve(n);
        inicios_.reserve(n);
        // A short text with one number takes some twelve units in its natural form.
        naturais_.reserve(12 * n);
    }
    // The number of the text, given a new one when first seen. The text must outlive this.
    std::uint32_t numero(const QString& texto) {
        const size_t mascara = tabela_.size() - 1;
        for (size_t i = qHash(texto) & mascara;; i = (i + 1) & mascara) {
            std::uint32_t& lugar = tabela_[i];
            if (lugar == kLivre) {
                lugar = std::uint32_t(textos_.size());
                textos_.push_back(&texto);
                inicios_.push_back(std::uint32_t(naturais_.size()));
                ZVString::AcrescentaFormaNatural(texto, naturais_);
                return lugar;
            }
            if (*textos_[lugar] == texto) return lugar;
        }
    }
    size_t size() const { return textos_.size(); }
    // The order of two texts: by natural form, then by the raw text ("01" before "1").
    bool antes(std::uint32_t a, std::uint32_t b) const {
        if (const int c = natural(a).compare(natural(b)); c != 0) return c < 0;
        return textos_[a]->compare(*textos_[b]) < 0;
    }
    // The numbers of the texts in their order.
    std::vector<std::uint32_t> emOrdem() const;

private:
    static constexpr std::uint32_t kLivre = ~std::uint32_t(0);
    QStringView natural(std::uint32_t d) const {
        const std::uint32_t fim =
            d + 1 < inicios_.size() ? inicios_[d + 1] : std::uint32_t(naturais_.size());
        return QStringView(naturais_.data() + inicios_[d], qsizetype(fim - inicios_[d]));
    }
    std::vector<std::uint32_t> tabela_;
    std::vector<const QString*> textos_;
    std::vector<std::uint32_t> inicios_;
    std::vector<char16_t> naturais_;
};

// The start of a natural form as a number that orders as the forms do, as far as it goes:
// forms whose numbers differ compare as their numbers, equal numbers tell nothing. The
// form's units go in as four-bit codes: a digit (natural forms are mostly digits, numbers
// being padded to ten) takes one, any other unit below 0xFF three (the code of its side of
// the digits, then the unit), and a unit from 0xFF on ends the number with the highest code.
// Units past the number's 32 codes are left out.
struct Prefixo {
    std::uint64_t alto = 0, baixo = 0;
    bool operator==(const Prefixo&) const = default;
    bool operator<(const Prefixo& outro) const {
        return alto != outro.alto ? alto < outro.alto : baixo < outro.baixo;
    }
    static Prefixo De(QStringView natural) {
        Prefixo prefixo;
        int livres = 32;
        const auto poe = [&](unsigned codigo) {
            if (livres == 0) return;
            --livres;
            std::uint64_t& metade = livres >= 16 ? prefixo.alto : prefixo.baixo;
            metade |= std::uint64_t(codigo) << (4 * (livres % 16));
        };
        for (const QChar letra : natural) {
            if (livres == 0) break;
            const char16_t u = letra.unicode();
            if (u >= u'0' && u <= u'9') {
                poe(1 + unsigned(u - u'0'));
                continue;
            }
            if (u >= 0xFF) {
                poe(15);
                break;
            }
            poe(u < u'0' ? 0 : 11);
            poe(unsigned(u) >> 4);
            poe(unsigned(u) & 15);
        }
        return prefixo;
    }
};

std::vector<std::uint32_t> TextosDistintos::emOrdem() const {
    // Most pairs differ within their prefixes: the sort reads the forms themselves only
    // for those that do not.
    struct Distinta {
        Prefixo prefixo;
        std::uint32_t numero;
    };
    std::vector<Distinta> distintas(size());
    for (std::uint32_t d = 0; d < distintas.size(); ++d)
        distintas[d] = {Prefixo::De(natural(d)), d};
    std::sort(distintas.begin(), distintas.end(), [this](const Distinta& a, const Distinta& b) {
        if (!(a.prefixo == b.prefixo)) return a.prefixo < b.prefixo;
        return antes(a.numero, b.numero);
    });
    std::vector<std::uint32_t> ordem(distintas.size());
    for (size_t d = 0; d < ordem.size(); ++d)
        ordem[d] = distintas[d].numero;
    return ordem;
}

// Ties keep their first order when `estavel`; else they fall where the sort leaves them.
void OrdenaItens(VetorItens& itens, const QStringList& campos, bool estavel) {
    if (campos.isEmpty() || itens.size() < 2) return;
    const size_t k = size_t(campos.size());
    const size_t n = itens.size();
    // Each item's place among the distinct texts of each field, worked out once per text:
    // a comparison is then a few integer compares, however long the texts and however many
    // items tie on the first fields. Two places compare as their texts do, so the sort below
    // makes the very same moves as one comparing the texts.
    std::vector<std::uint32_t> postos(n * k);
    static const QString kVazio;
    // Per field: its number (found once), its distinct texts, and the last text met.
    struct PorCampo {
        std::uint32_t numero;
        TextosDistintos distintas;
        const QString* anterior = nullptr;
        std::uint32_t postoAnterior = 0;
    };
    std::vector<PorCampo> porCampo;
    porCampo.reserve(k);
    for (size_t c = 0; c < k; ++c)
        porCampo.push_back({CamposItem::numeroSeHouver(campos[int(c)]), TextosDistintos(n)});
    // One pass over the items reads all their sort fields where the items hold them, while
    // each item's fields are at hand; a run of items with one text (a strip's terminals)
    // asks the field's table once.
    for (size_t i = 0; i < n; ++i) {
        const CEItemLista* item = itens[i];
        for (size_t c = 0; c < k; ++c) {
            PorCampo& campo = porCampo[c];
            const QString* achado = item && campo.numero != CamposItem::kSemNome
                                        ? item->campos.procura(campo.numero)
                                        : nullptr;
            const QString& valor = achado ? *achado : kVazio;
            if (!campo.anterior || valor != *campo.anterior) {
                campo.postoAnterior = campo.distintas.numero(valor);
                campo.anterior = &valor;
            }
            postos[i * k + c] = campo.postoAnterior;
        }
    }
    // Each field's texts are put in order once; an item's place becomes the rank of its
    // text, so two places compare as their texts do.
    std::vector<std::uint32_t> lugar;
    for (size_t c = 0; c < k; ++c) {
        const TextosDistintos& distintas = porCampo[c].distintas;
        const std::vector<std::uint32_t> ordemDistintas = distintas.emOrdem();
        lugar.resize(distintas.size());
        for (size_t d = 0; d < ordemDistintas.size(); ++d)
            lugar[ordemDistintas[d]] = std::uint32_t(d);
        for (size_t i = 0; i < n; ++i)
            postos[i * k + c] = lugar[postos[i * k + c]];
    }
    std::vector<size_t> ordem(n);
    for (size_t i = 0; i < n; ++i)
        ordem[i] = i;
    std::sort(ordem.begin(), ordem.end(), [&](size_t a, size_t b) {
        const std::uint32_t* pa = &postos[a * k];
        const std::uint32_t* pb = &postos[b * k];
        for (size_t c = 0; c < k; ++c)
            if (pa[c] != pb[c]) return pa[c] < pb[c];
        return estavel && a < b;
    });
    std::vector<CEItemLista*> ordenado(n);
    for (size_t i = 0; i < n; ++i)
        ordenado[i] = itens[ordem[i]];
    std::copy(ordenado.begin(), ordenado.end(), itens.begin());
}

}  // namespace

void VetorItens::ordenar(const QStringList& campos) {
    OrdenaItens(*this, campos, false);
}

void VetorItens::ordenarEstavel(const QStringList& campos) {
    OrdenaItens(*this, campos, true);
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

namespace {

// Items that go together, wherever that happens.
struct ItensADestruir {
    std::vector<CEItemLista*> itens;
    explicit ItensADestruir(std::vector<CEItemLista*>&& v) noexcept : itens(std::move(v)) {}
    ItensADestruir(ItensADestruir&&) noexcept = default;
    ItensADestruir& operator=(ItensADestruir&&) = delete;
    ~ItensADestruir() {
        // In the order the items lie in memory, not the list's: a sorted list visits them
        // all over the heap, and each one's fields were made next to it.
        std::sort(itens.begin(), itens.end(), std::less<CEItemLista*>());
        for (CEItemLista* item : itens)
            delete item;
    }
};

}  // namespace

void VetorItens::destruirItens() {
    // The module's commands go on while another thread frees them; elsewhere they go now.
    Descarte::Descartar(
        ItensADestruir{std::exchange(static_cast<std::vector<CEItemLista*>&>(*this), {})});
}
