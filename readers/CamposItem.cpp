#include "CamposItem.h"

#include <QHash>

#include <algorithm>
#include <array>
#include <deque>
#include <iterator>

namespace {

constexpr std::uint32_t kSemNumero = CamposItem::kSemNome;

// Names are never removed: a run of lists meets a few hundred. The lists run on one thread.
struct TabelaNomes {
    std::deque<QString> textos;             // stable addresses: iterators hand out references
    std::vector<const QString*> enderecos;  // of the texts, by number
    QHash<QString, std::uint32_t> numeros;
    // By suffix: the number of each name with the suffix, kSemNumero until first asked.
    QHash<QString, std::vector<std::uint32_t>> comSufixo;
    // The suffixes asked for lately, by where their text lies, as `achados` below; the
    // arrays stay where they are in the hash, which never loses an entry.
    struct SufixoAchado {
        QString sufixo;
        std::vector<std::uint32_t>* numeros = nullptr;
    };
    std::array<SufixoAchado, 16> sufixos;

    std::vector<std::uint32_t>& numerosCom(const QString& sufixo) {
        SufixoAchado& achado =
            sufixos[(reinterpret_cast<std::uintptr_t>(sufixo.constData()) >> 4) % 16];
        if (achado.numeros && achado.sufixo.constData() == sufixo.constData() &&
            achado.sufixo.size() == sufixo.size())
            return *achado.numeros;
        std::vector<std::uint32_t>& numeros = comSufixo[sufixo];
        achado = {sufixo, &numeros};
        return numeros;
    }

    // Names found lately, by where their text lies: callers ask by the same few texts again
    // and again (a column's name for every row). The entry holds the text, so its storage is
    // not freed and written with another name while the entry points to it.
    struct Achado {
        QString nome;
        std::uint32_t numero = kSemNumero;
    };
    std::array<Achado, 64> achados;

    std::uint32_t procura(const QString& nome) {
        Achado& achado = achados[(reinterpret_cast<std::uintptr_t>(nome.constData()) >> 4) % 64];
        if (achado.numero != kSemNumero && achado.nome.constData() == nome.constData() &&
            achado.nome.size() == nome.size())
            return achado.numero;
        // Only names the table holds are kept: an absent one may be added later.
        const std::uint32_t numero = numeros.value(nome, kSemNumero);
        if (numero != kSemNumero) achado = {nome, numero};
        return numero;
    }
};

TabelaNomes& Tabela() {
    static TabelaNomes tabela;
    return tabela;
}

}  // namespace

const QString& CamposItem::nome(std::uint32_t numero) {
    return Tabela().textos[numero];
}

const QString* const* CamposItem::nomes() {
    return Tabela().enderecos.data();
}

std::uint32_t CamposItem::numero(const QString& nome) {
    TabelaNomes& tabela = Tabela();
    if (const std::uint32_t achado = tabela.procura(nome); achado != kSemNumero) return achado;
    const auto novo = std::uint32_t(tabela.textos.size());
    tabela.textos.push_back(nome);
    tabela.enderecos.push_back(&tabela.textos.back());
    tabela.numeros.insert(nome, novo);
    return novo;
}

std::uint32_t CamposItem::numeroSeHouver(const QString& nome) {
    return Tabela().procura(nome);
}

std::size_t CamposItem::quantidadeNomes() {
    return Tabela().textos.size();
}

// The number of the name with the suffix, from the suffix's array, made when first asked.
// CamposItem::numero may grow the name table but not this array.
std::uint32_t CamposItem::numeroNoSufixo(std::vector<std::uint32_t>& numeros, std::uint32_t numero,
                                         const QString& sufixo) {
    if (numero >= numeros.size()) numeros.resize(numero + 1, kSemNumero);
    if (numeros[numero] == kSemNumero) numeros[numero] = CamposItem::numero(nome(numero) + sufixo);
    return numeros[numero];
}

std::uint32_t CamposItem::numeroComSufixoNaoVazio(std::uint32_t numero, const QString& sufixo) {
    return numeroNoSufixo(Tabela().numerosCom(sufixo), numero, sufixo);
}

const QString* CamposItem::procura(std::uint32_t numero) const {
    const std::vector<Campo>& campos = dados();
    const auto it = lugar(campos, numero);
    return it != campos.end() && it->nome == numero ? &it->valor : nullptr;
}

std::vector<CamposItem::Campo>::const_iterator CamposItem::lugar(const std::vector<Campo>& campos,
                                                                 std::uint32_t numero) {
    return std::lower_bound(campos.begin(), campos.end(), numero,
                            [](const Campo& c, std::uint32_t n) { return c.nome < n; });
}

const QString* CamposItem::procura(const QString& chave) const {
    const std::uint32_t n = Tabela().procura(chave);
    return n == kSemNumero ? nullptr : procura(n);
}

QString CamposItem::value(const QString& chave, const QString& padrao) const {
    const QString* valor = procura(chave);
    return valor ? *valor : padrao;
}

QStringList CamposItem::keys() const {
    QStringList nomes;
    nomes.reserve(size());
    for (const Campo& campo : dados())
        nomes << nome(campo.nome);
    return nomes;
}

QStringList CamposItem::values() const {
    QStringList valores;
    valores.reserve(size());
    for (const Campo& campo : dados())
        valores << campo.valor;
    return valores;
}

CamposItem::const_iterator CamposItem::find(const QString& chave) const {
    const std::uint32_t n = Tabela().procura(chave);
    if (n == kSemNumero) return end();
    const std::vector<Campo>& campos = dados();
    const auto it = lugar(campos, n);
    return it != campos.end() && it->nome == n ? const_iterator(&*it) : end();
}

void CamposItem::insert(const QString& chave, const QString& valor) {
    insert(numero(chave), valor);
}

void CamposItem::insert(std::uint32_t n, const QString& valor) {
    proprios(1);
    // Items hold tens of fields: the first steps of the array's growth are skipped.
    if (campos_.capacity() == 0) campos_.reserve(16);
    const auto it = campos_.begin() + (lugar(campos_, n) - campos_.cbegin());
    if (it != campos_.end() && it->nome == n)
        it->valor = valor;
    else
        campos_.insert(it, Campo{n, valor});
}

int CamposItem::remove(const QString& chave) {
    const std::uint32_t n = Tabela().procura(chave);
    if (n == kSemNumero || !procura(n)) return 0;
    proprios();
    campos_.erase(campos_.begin() + (lugar(campos_, n) - campos_.cbegin()));
    return 1;
}

void CamposItem::partilhar() {
    if (!partilhados_)
        partilhados_ = std::make_shared<const std::vector<Campo>>(std::move(campos_));
    campos_ = {};
}

void CamposItem::proprio(std::size_t mais) {
    std::vector<Campo> copia;
    copia.reserve(partilhados_->size() + mais);
    copia.assign(partilhados_->begin(), partilhados_->end());
    partilhados_.reset();
    campos_ = std::move(copia);
}

void CamposItem::compactar(std::size_t folga) {
    if (partilhados_) return;
    const std::size_t tamanho = campos_.size() + folga;
    if (campos_.capacity() == tamanho) return;
    std::vector<Campo> novos;
    novos.reserve(tamanho);
    std::move(campos_.begin(), campos_.end(), std::back_inserter(novos));
    campos_.swap(novos);
}

void CamposItem::juntar(const CamposItem& origem) {
    if (&origem != this) juntarOrdenados(origem.dados());
}

void CamposItem::juntarOrdenados(const std::vector<Campo>& lote) {
    if (lote.empty()) return;
    proprios(lote.size());
    if (campos_.empty()) {
        campos_ = lote;
        return;
    }
    juntarOrdenados(
        lote.size(), [&lote](std::size_t j) { return lote[j].nome; },
        [&lote](std::size_t j) -> const QString& { return lote[j].valor; });
}
