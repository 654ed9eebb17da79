#include "CEModeloReguas.h"

#include "lists/CETemplate.h"
#include "readers/CCBorneDataReader.h"
#include "readers/VetorItens.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <iterator>
#include <limits>
#include <unordered_set>
#include <utility>

namespace {

// The numbers of the names, each looked up once for a pass over the strips; a name no item
// has stays kSemNome, and every item holds it empty.
std::vector<std::uint32_t> Numeros(const QStringList& campos) {
    std::vector<std::uint32_t> numeros;
    numeros.reserve(size_t(campos.size()));
    for (const QString& campo : campos)
        numeros.push_back(CamposItem::numeroSeHouver(campo));
    return numeros;
}

// Whether the items differ in one of the fields; a field an item lacks reads as empty.
bool Difere(const CEItemLista* a, const CEItemLista* b, const std::vector<std::uint32_t>& campos) {
    static const QString kVazio;
    for (const std::uint32_t campo : campos) {
        if (campo == CamposItem::kSemNome) continue;
        const QString* va = a->campos.procura(campo);
        const QString* vb = b->campos.procura(campo);
        if ((va ? *va : kVazio) != (vb ? *vb : kVazio)) return true;
    }
    return false;
}

// The first value that is not empty among the fields, where the item holds it; an empty
// text when none: what CCBorneDataReader::Regua and Numero give, without a copy.
template <NomeLiteral a, NomeLiteral b, NomeLiteral c>
const QString& PrimeiroDe(const CEItemLista& item) {
    static const QString kVazio;
    static const std::uint32_t numeros[] = {NumeroCampo<a>(), NumeroCampo<b>(), NumeroCampo<c>()};
    for (const std::uint32_t numero : numeros)
        if (const QString* valor = item.campos.procura(numero); valor && !valor->isEmpty())
            return *valor;
    return kVazio;
}

// A terminal's strip and number, in the three languages; Spanish shares the Portuguese
// number field.
const QString& ReguaDe(const CEItemLista& item) {
    return PrimeiroDe<"REGUA", "STRIP", "REGLETA">(item);
}
const QString& NumeroDe(const CEItemLista& item) {
    return PrimeiroDe<"NUMERO", "NUMBER", "NUMERO">(item);
}

// The fields of items met one after another, each item's values read once: a pass over a
// strip compares each terminal with the one before it, and reads each terminal once instead
// of twice.
class Vizinhos {
public:
    explicit Vizinhos(const std::vector<std::uint32_t>& campos) : campos_(campos) {
        antes_.resize(campos.size());
        agora_.resize(campos.size());
    }
    // Reads the item's fields, forgetting the one before.
    void Primeiro(const CEItemLista* item) { Le(item, antes_); }
    // Reads the item's fields; whether one of them differs from the item read before. The
    // item becomes the one before.
    bool Difere(const CEItemLista* item) {
        Le(item, agora_);
        std::swap(antes_, agora_);
        for (size_t i = 0; i < campos_.size(); ++i)
            if (*antes_[i] != *agora_[i]) return true;
        return false;
    }

private:
    void Le(const CEItemLista* item, std::vector<const QString*>& valores) const {
        static const QString kVazio;
        for (size_t i = 0; i < campos_.size(); ++i) {
            const QString* valor =
                campos_[i] == CamposItem::kSemNome ? nullptr : item->campos.procura(campos_[i]);
            valores[i] = valor ? valor : &kVazio;
        }
    }
    const std::vector<std::uint32_t>& campos_;
    std::vector<const QString*> antes_, agora_;
};

// Does the terminal have a symbol of this label?
bool TemRotulo(const CEBorneDwg* borne, const QString& rotulo) {
    for (const CEItemDwg* ligado : borne->ligados)
        if (static_cast<const CESimboloDwg*>(ligado)->Rotulo() == rotulo) return true;
    return false;
}

// A label that a symbol of `a` and a symbol of `b` share; empty when none.
QString RotuloComum(const CEBorneDwg* a, const CEBorneDwg* b) {
    for (const CEItemDwg* ligado : a->ligados) {
        const QString rotulo = static_cast<const CESimboloDwg*>(ligado)->Rotulo();
        if (!rotulo.isEmpty() && TemRotulo(b, rotulo)) return rotulo;
    }
    return {};
}

// The connection prefixes a field name may start with: a symbol's connection tags in the
// three languages, then a terminal's side connections.
constexpr const char* kPrefixos[] = {"LIGACAO_", "CONNECTION_", "CONEXION_", "LIG_"};
constexpr int kLigacoesDoBorne = 3;
constexpr int kSemPrefixo = -1;

// Which of the prefixes a field name starts with, by the name's number; each name is looked
// at once, as symbols and terminals hold the same few hundred names.
int PrefixoDoNome(std::uint32_t numero) {
    constexpr std::int8_t kNaoVisto = -2;
    static std::vector<std::int8_t> prefixos;
    if (numero >= prefixos.size()) prefixos.resize(size_t(numero) + 1, kNaoVisto);
    std::int8_t& prefixo = prefixos[numero];
    if (prefixo == kNaoVisto) {
        prefixo = kSemPrefixo;
        const QString& nome = CamposItem::nome(numero);
        for (int i = 0; i < int(std::size(kPrefixos)); ++i)
            if (nome.startsWith(QLatin1String(kPrefixos[i]))) {
                prefixo = std::int8_t(i);
                break;
            }
    }
    return prefixo;
}

// Appends the item's values under the names, ascending: a terminal holds many fields and
// few side connections, so each name is looked for from where the one before stood. The
// values stay in the item: a copy would touch each text's own memory, away from the item's.
void LeLigacoes(const CEItemLista& item, const std::vector<std::uint32_t>& nomes,
                std::vector<const QString*>& valores) {
    const std::vector<CamposItem::Campo>& campos = item.campos.todos();
    auto lugar = campos.begin();
    for (const std::uint32_t nome : nomes) {
        lugar = std::lower_bound(
            lugar, campos.end(), nome,
            [](const CamposItem::Campo& c, std::uint32_t n) { return c.nome < n; });
        if (lugar == campos.end()) break;
        if (lugar->nome == nome) valores.push_back(&lugar->valor);
    }
}

}  // namespace

struct CEModeloReguas::Rascunho {
    // The names of a symbol's connections, ascending.
    std::vector<std::uint32_t> nomesSimbolo;
    // One symbol's connections as found, by language; then by suffix; then its terminals.
    std::vector<std::pair<int, const CamposItem::Campo*>> achados;
    std::vector<std::pair<QStringRef, const QString*>> ligacoes;
    std::vector<CEBorneDwg*> ordem;
};

CEModeloReguas::Parametros CEModeloReguas::Parametros::DoModelo(CETemplate& modelo) {
    Parametros p;
    p.bornesPorRegua = modelo.LerInteiro("*BORNE_PAGINA_GRX*");
    p.chavesQuebra = modelo.LerListaTexto("*ZV_CHAVE_QUEBRA_PAGINA*");
    p.reguasPorPagina = modelo.LerInteiro("*REGUAS_POR_PAGINA_GRX*");
    p.distanciaReguas = modelo.LerReal("*DIST_ENTRE_REGUAS_GRX*");
    modelo.LerPonto("*PONTO_REF_GRX*", p.refX, p.refY);
    // A text of names cut by ";", or a list of such texts.
    for (const QString& texto : modelo.LerListaTexto("*ZV_CAMPOS_QUEBRA_DETALHE*"))
        p.camposDetalhe += ZVString(texto).Divide(";");
    return p;
}

bool CEModeloReguas::LeCampoDoSimbolo(const QString& nome) {
    for (const char* campo : {"ZV_LISTA_TIPO", "HANDLE", "RELACAO", "TAG", "ETIQUETA"})
        if (nome == QLatin1String(campo)) return true;
    return std::any_of(
        std::begin(kPrefixos), std::begin(kPrefixos) + kLigacoesDoBorne,
        [&nome](const char* prefixo) { return nome.startsWith(QLatin1String(prefixo)); });
}

CEBorneDwg* CEModeloReguas::Borne(const QString& regua, const QString& numero) const {
    return bornesPorChave.value(ChaveDoItem{regua, numero});
}

CESimboloDwg* CEModeloReguas::Simbolo(const QString& handle) const {
    return simbolosPorHandle.value(TextoDoItem{handle});
}

void CEModeloReguas::Monta(const VetorItens& itens, const Parametros& p) {
    Constroi(itens);
    CalculaTrilhas();
    CortaReguas(p.bornesPorRegua, p.chavesQuebra);
    Pagina(p.reguasPorPagina);
    CalculaPontos(p.distanciaReguas, p.refX, p.refY);
    CalculaDetalhes(p.camposDetalhe);
}

void CEModeloReguas::Constroi(const VetorItens& itens) {
    static const QString kComp = QStringLiteral("COMP"), kBorne = QStringLiteral("BORNE"),
                         kSemValor;
    const std::uint32_t tipoCampo = NumeroCampo<"ZV_LISTA_TIPO">();
    VetorItens componentes, terminais;
    for (CEItemLista* item : itens) {
        if (!item) continue;
        const QString* tipo = item->campos.procura(tipoCampo);
        if (!tipo) continue;
        if (*tipo == kComp)
            componentes.push_back(item);
        else if (*tipo == kBorne)
            terminais.push_back(item);
    }
    componentes.ordenar(VetorItens::camposQueDecidem({"RELACAO", "TAG", "ETIQUETA"}));
    simbolosPorHandle.reserve(componentes.size());
    for (CEItemLista* item : componentes) {
        CESimboloDwg& simbolo = simbolos.emplace_back(item);
        // The first symbol of a handle keeps it.
        const QString* handle = item->campos.procura(NumeroCampo<"HANDLE">());
        CESimboloDwg*& primeiro = simbolosPorHandle[TextoDoItem{handle ? *handle : kSemValor}];
        if (!primeiro) primeiro = &simbolo;
    }
    // By strip, then number, in the three languages; Spanish shares the Portuguese number
    // field, which a second time would never decide a comparison.
    terminais.ordenar(
        VetorItens::camposQueDecidem({"REGUA", "STRIP", "REGLETA", "NUMERO", "NUMBER"}));
    // The names of side connections: each terminal's values are read as it is built; and
    // those of a symbol's connections, read as the strips are put in order.
    std::vector<std::uint32_t> nomesLigacao;
    Rascunho rascunho;
    for (std::uint32_t nome = 0; nome < CamposItem::quantidadeNomes(); ++nome) {
        const int prefixo = PrefixoDoNome(nome);
        if (prefixo == kLigacoesDoBorne)
            nomesLigacao.push_back(nome);
        else if (prefixo != kSemPrefixo)
            rascunho.nomesSimbolo.push_back(nome);
    }
    TabelaChaves<QString, CEReguaDwg*> reguaPorNome;
    CEReguaDwg* ultima = nullptr;
    bornesPorChave.reserve(terminais.size());
    for (CEItemLista* item : terminais) {
        const QString& nome = ReguaDe(*item);
        // The first of a strip and number wins.
        CEBorneDwg*& doNumero = bornesPorChave[ChaveDoItem{nome, NumeroDe(*item)}];
        if (doNumero) continue;
        CEBorneDwg* const borne = &bornes.emplace_back(item);
        doNumero = borne;
        // Sorted by strip, a terminal mostly stands on the strip of the one before.
        if (!ultima || ultima->nome != nome) {
            CEReguaDwg*& regua = reguaPorNome[nome];
            if (!regua) {
                reguas.push_back(std::make_unique<CEReguaDwg>(nome));
                regua = reguas.back().get();
            }
            ultima = regua;
        }
        CEReguaDwg* regua = ultima;
        regua->bornes.push_back(borne);
        borne->regua = regua;
        const std::pair<std::uint32_t, std::uint32_t> lados[] = {
            {NumeroCampo<"REL_INI">(), NumeroCampo<"HANDLE_INI">()},
            {NumeroCampo<"REL_FIM">(), NumeroCampo<"HANDLE_FIM">()}};
        // The symbols of both sides first: the terminal's array is made once, to measure.
        CESimboloDwg* doLado[2] = {nullptr, nullptr};
        int nLados = 0;
        for (const auto& [rel, handle] : lados) {
            const QString* relacao = item->campos.procura(rel);
            if (!relacao || relacao->isEmpty()) continue;
            const QString* deQuem = item->campos.procura(handle);
            if (CESimboloDwg* simbolo = Simbolo(deQuem ? *deQuem : kSemValor))
                doLado[nLados++] = simbolo;
        }
        borne->ligados.reserve(size_t(nLados));
        for (int i = 0; i < nLados; ++i) {
            borne->ligados.push_back(doLado[i]);
            doLado[i]->Liga(borne);
        }
        borne->ligacoesInicio = std::uint32_t(ligacoes_.size());
        LeLigacoes(*item, nomesLigacao, ligacoes_);
        borne->ligacoesQuantas = std::uint32_t(ligacoes_.size()) - borne->ligacoesInicio;
    }
    // Jumper links by strip and number, so a duplicate's link lands on the terminal kept. A
    // link mostly goes to the terminal made just before or after, whose item is its own: that
    // one is asked first, without reading the linked item's fields.
    auto busca = [this](const CEItemLista* ligado, CEBorneDwg* vizinho) -> CEBorneDwg* {
        if (!ligado) return nullptr;
        if (vizinho && vizinho->item == ligado) return vizinho;
        return Borne(ReguaDe(*ligado), NumeroDe(*ligado));
    };
    CEBorneDwg* antes = nullptr;
    for (auto borne = bornes.begin(); borne != bornes.end(); ++borne) {
        const auto seguinte = std::next(borne);
        borne->proximo =
            busca(borne->item->proximo, seguinte != bornes.end() ? &*seguinte : nullptr);
        borne->anterior = busca(borne->item->anterior, antes);
        antes = &*borne;
    }
    for (const auto& regua : reguas)
        OrdenaPorSimbolos(*regua, rascunho);
}

void CEModeloReguas::BornesDoSimbolo(const CESimboloDwg& simbolo, Rascunho& rascunho) const {
    // The symbol's connections by suffix: LIGACAO_1, CONNECTION_2... A symbol holds many
    // fields and few connections: each name is looked for from where the one before stood,
    // and found with its language.
    std::vector<std::pair<int, const CamposItem::Campo*>>& achados = rascunho.achados;
    achados.clear();
    const std::vector<CamposItem::Campo>& campos = simbolo.item->campos.todos();
    auto lugar = campos.begin();
    for (const std::uint32_t nome : rascunho.nomesSimbolo) {
        lugar = std::lower_bound(
            lugar, campos.end(), nome,
            [](const CamposItem::Campo& c, std::uint32_t n) { return c.nome < n; });
        if (lugar == campos.end()) break;
        if (lugar->nome == nome) achados.emplace_back(PrefixoDoNome(nome), &*lugar);
    }
    // A suffix given in two languages keeps the first language's value; the connections go
    // in the order of their suffixes. A symbol has few: small arrays do, with the suffixes
    // read in place in the names.
    std::vector<std::pair<QStringRef, const QString*>>& ligacoes = rascunho.ligacoes;
    ligacoes.clear();
    for (int p = 0; p < kLigacoesDoBorne; ++p)
        for (const auto& [idioma, campo] : achados) {
            if (idioma != p) continue;
            const QStringRef sufixo =
                CamposItem::nome(campo->nome).midRef(int(qstrlen(kPrefixos[p])));
            const bool visto = std::any_of(ligacoes.begin(), ligacoes.end(),
                                           [&sufixo](const auto& l) { return l.first == sufixo; });
            if (!visto) ligacoes.emplace_back(sufixo, &campo->valor);
        }
    std::sort(ligacoes.begin(), ligacoes.end(),
              [](const auto& a, const auto& b) { return a.first < b.first; });
    // Each connection takes the first terminal wired to the symbol, in the symbol's own
    // order, that has the connection's value on a side and is not taken yet.
    std::vector<CEBorneDwg*>& ordem = rascunho.ordem;
    ordem.clear();
    for (const auto& ligacao : ligacoes) {
        const QString& valor = *ligacao.second;
        for (CEItemDwg* ligado : simbolo.ligados) {
            auto* borne = static_cast<CEBorneDwg*>(ligado);
            if (std::find(ordem.begin(), ordem.end(), borne) != ordem.end()) continue;
            const auto seus = ligacoes_.begin() + std::ptrdiff_t(borne->ligacoesInicio);
            if (std::none_of(seus, seus + std::ptrdiff_t(borne->ligacoesQuantas),
                             [&valor](const QString* seu) { return *seu == valor; }))
                continue;
            ordem.push_back(borne);
            break;
        }
    }
}

namespace {

// A flag for each of some objects, found by address in one sorted array, with no node per
// object.
template <class T>
class Marcas {
public:
    explicit Marcas(std::vector<const T*> objetos) : objetos_(std::move(objetos)) {
        std::sort(objetos_.begin(), objetos_.end());
        objetos_.erase(std::unique(objetos_.begin(), objetos_.end()), objetos_.end());
        marcado_.assign(objetos_.size(), 0);
    }
    // True the first time one of the objects is marked.
    bool Marca(const T* objeto) {
        const auto it = std::lower_bound(objetos_.begin(), objetos_.end(), objeto);
        return !std::exchange(marcado_[size_t(it - objetos_.begin())], char(1));
    }

private:
    std::vector<const T*> objetos_;
    std::vector<char> marcado_;
};

}  // namespace

void CEModeloReguas::OrdenaPorSimbolos(CEReguaDwg& regua, Rascunho& rascunho) {
    std::vector<CEBorneDwg*> ordem;
    ordem.reserve(regua.bornes.size());
    // Which of the strip's terminals are placed, and which symbols wired to it placed theirs.
    Marcas<CEBorneDwg> colocados({regua.bornes.begin(), regua.bornes.end()});
    std::vector<const CEItemDwg*> ligados;
    for (const CEBorneDwg* borne : regua.bornes)
        ligados.insert(ligados.end(), borne->ligados.begin(), borne->ligados.end());
    Marcas<CEItemDwg> tratados(std::move(ligados));
    for (CEBorneDwg* borne : regua.bornes) {
        for (CEItemDwg* ligado : borne->ligados) {
            if (!tratados.Marca(ligado)) continue;
            auto* simbolo = static_cast<CESimboloDwg*>(ligado);
            BornesDoSimbolo(*simbolo, rascunho);
            for (CEBorneDwg* irmao : rascunho.ordem)
                if (irmao->regua == &regua && colocados.Marca(irmao)) ordem.push_back(irmao);
        }
        // A terminal its symbols did not place keeps its turn: none is lost.
        if (colocados.Marca(borne)) ordem.push_back(borne);
    }
    regua.bornes = std::move(ordem);
}

void CEModeloReguas::CalculaTrilhas() {
    std::unordered_set<const CEBorneDwg*> feitos;
    for (const auto& regua : reguas) {
        const std::vector<CEBorneDwg*>& lista = regua->bornes;
        for (size_t k = 0; k < lista.size(); ++k) {
            CEBorneDwg* inicio = lista[k];
            if (!inicio->proximo || feitos.count(inicio->proximo)) continue;
            const int trilha = inicio->TrilhaLivre();
            inicio->DefineTrilha(trilha, CEBorneDwg::Inicio);
            feitos.insert(inicio);
            // A chain that leaves the strip runs on to its end, and no end is drawn.
            const CEBorneDwg* seguinte = inicio->proximo;
            for (size_t m = k + 1; m < lista.size(); ++m) {
                CEBorneDwg* borne = lista[m];
                if (borne != seguinte) {
                    borne->DefineTrilha(trilha, CEBorneDwg::Passa);
                    continue;
                }
                feitos.insert(borne);
                if (!borne->proximo) {
                    borne->DefineTrilha(trilha, CEBorneDwg::Fim);
                    break;
                }
                borne->DefineTrilha(trilha, CEBorneDwg::Meio);
                seguinte = borne->proximo;
            }
        }
    }
}

size_t CEModeloReguas::Corte(const CEReguaDwg& regua, int limite,
                             const std::vector<std::uint32_t>& chaves, bool& quebra) const {
    const auto& lista = regua.bornes;
    const size_t n = lista.size();
    quebra = false;
    if (n < 2) return n;
    // Without a limit the strip is cut only where a break field changes.
    const size_t ultimoQueCabe = limite > 0 ? size_t(limite) - 1 : n - 1;
    size_t corte = ultimoQueCabe + 1;  // the piece is [0, corte)
    Vizinhos vizinhos(chaves);
    vizinhos.Primeiro(lista[0]->item);
    for (size_t i = 1; i <= std::min(ultimoQueCabe, n - 1); ++i)
        if (vizinhos.Difere(lista[i]->item)) {
            corte = i;
            quebra = true;
            break;
        }
    if (corte >= n) return n;
    // A symbol is not parted: its terminals go whole to the next piece, unless it starts
    // this one; then the piece runs to the symbol's end.
    const QString rotulo = RotuloComum(lista[corte - 1], lista[corte]);
    if (rotulo.isEmpty()) return corte;
    for (size_t j = corte - 1; j-- > 0;)
        if (!TemRotulo(lista[j], rotulo)) return j + 1;
    for (size_t f = corte + 1; f < n; ++f)
        if (!TemRotulo(lista[f], rotulo)) return f;
    return n;
}

void CEModeloReguas::CortaReguas(int limite, const QStringList& chavesQuebra) {
    const std::vector<std::uint32_t> chaves = Numeros(chavesQuebra);
    std::vector<std::unique_ptr<CEReguaDwg>> novas;
    novas.reserve(reguas.size());
    auto anexa = [&](std::unique_ptr<CEReguaDwg> regua) {
        if (!novas.empty() && !novas.back()->quebra && !novas.back()->bornes.empty() &&
            !regua->bornes.empty() &&
            Difere(novas.back()->bornes.back()->item, regua->bornes.front()->item, chaves))
            novas.back()->quebra = true;
        novas.push_back(std::move(regua));
    };
    for (auto& original : reguas) {
        std::unique_ptr<CEReguaDwg> regua = std::move(original);
        for (;;) {
            bool quebra = false;
            const size_t corte = Corte(*regua, limite, chaves, quebra);
            if (corte >= regua->bornes.size()) {
                anexa(std::move(regua));
                break;
            }
            auto resto = std::make_unique<CEReguaDwg>(regua->nome);
            resto->bornes.assign(regua->bornes.begin() + std::ptrdiff_t(corte),
                                 regua->bornes.end());
            regua->bornes.resize(corte);
            regua->quebra = quebra;
            for (CEBorneDwg* borne : resto->bornes)
                borne->regua = resto.get();
            anexa(std::move(regua));
            regua = std::move(resto);
        }
    }
    reguas = std::move(novas);
}

void CEModeloReguas::Pagina(int reguasPorPagina) {
    const int porPagina = std::max(reguasPorPagina, 1);
    paginas.clear();
    CEPaginaDwg* pagina = nullptr;
    for (const auto& regua : reguas) {
        if (!pagina) {
            paginas.push_back(std::make_unique<CEPaginaDwg>());
            pagina = paginas.back().get();
        }
        pagina->reguas.push_back(regua.get());
        regua->pagina = pagina;
        if (pagina->Quantidade() >= porPagina || regua->quebra) pagina = nullptr;
    }
}

void CEModeloReguas::CalculaPontos(double distancia, double refX, double refY) {
    for (const auto& pagina : paginas) {
        const int n = pagina->Quantidade();
        for (int i = 0; i < n; ++i) {
            CEReguaDwg* regua = pagina->reguas[size_t(i)];
            // A lone strip stands one distance up, where the upper of two would.
            const int fator = n == 1 ? 1 : n - 1 - i;
            regua->x = refX;
            regua->y = fator * distancia + refY;
        }
    }
}

void CEModeloReguas::CalculaDetalhes(const QStringList& camposDetalhe) {
    const std::vector<std::uint32_t> campos = Numeros(camposDetalhe);
    Vizinhos vizinhos(campos);
    for (const auto& regua : reguas) {
        regua->detalhes.clear();
        const auto& lista = regua->bornes;
        if (!lista.empty()) vizinhos.Primeiro(lista.front()->item);
        std::int32_t desde = 0;
        for (size_t i = 1; i <= lista.size(); ++i) {
            if (i < lista.size() && !vizinhos.Difere(lista[i]->item)) continue;
            regua->detalhes.emplace_back(std::int32_t(i) - desde, lista[i - 1]->item);
            desde = std::int32_t(i);
        }
    }
}

std::vector<CESimboloDwg*> CEModeloReguas::SimbolosSemBorne() {
    std::vector<CESimboloDwg*> sem;
    for (CESimboloDwg& simbolo : simbolos)
        if (simbolo.ligados.empty()) sem.push_back(&simbolo);
    return sem;
}
