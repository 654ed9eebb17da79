#include "CCBorneDataReader.h"

#include "CEAtributo.h"
#include "TabelaChaves.h"
#include "lists/CETemplate.h"
#include "module/CIProgress.h"

#include <algorithm>

namespace {

constexpr auto& kReguas = CCBorneDataReader::kCamposRegua;
constexpr auto& kNumeros = CCBorneDataReader::kCamposNumero;

// The first non-empty of three names (the languages' words for one field) under the suffix.
template <NomeLiteral a, NomeLiteral b, NomeLiteral c>
QString Primeiro(const CEItemLista& item, const QString& sufixo = QString()) {
    if (const QString* v = item.campos.procura(NumeroCampo<a>(sufixo)); v && !v->isEmpty())
        return *v;
    if (const QString* v = item.campos.procura(NumeroCampo<b>(sufixo)); v && !v->isEmpty())
        return *v;
    if (const QString* v = item.campos.procura(NumeroCampo<c>(sufixo)); v && !v->isEmpty())
        return *v;
    return {};
}

// The name's number under the suffix, kept in `lugar` once asked: the same numbering as
// NumeroCampo's, without its look-up at every side.
template <NomeLiteral nome>
std::uint32_t Lugar(std::uint32_t& lugar, const QString& sufixo) {
    if (lugar == CamposItem::kSemNome) lugar = NumeroCampo<nome>(sufixo);
    return lugar;
}

// Primeiro, with the names' numbers kept in `lugares` (three).
template <NomeLiteral a, NomeLiteral b, NomeLiteral c>
QString PrimeiroEm(const CEItemLista& item, const QString& sufixo, std::uint32_t* lugares) {
    if (const QString* v = item.campos.procura(Lugar<a>(lugares[0], sufixo)); v && !v->isEmpty())
        return *v;
    if (const QString* v = item.campos.procura(Lugar<b>(lugares[1], sufixo)); v && !v->isEmpty())
        return *v;
    if (const QString* v = item.campos.procura(Lugar<c>(lugares[2], sufixo)); v && !v->isEmpty())
        return *v;
    return {};
}

// A blank row: the strip and the number in all three languages, one null object.
CEItemLista* ItemEmBranco(const QString& regua, int numero) {
    auto* item = new CEItemLista;
    for (int i = 0; i < 3; ++i) {
        item->definirCampo(kReguas[i], regua);
        item->definirCampo(kNumeros[i], QString::number(numero));
    }
    item->ids.push_back(OdDbObjectId());
    return item;
}

// The names a side keeps of its copies: those the list reads, and the relation, strip and
// number the side reads back to make its relation. None: all.
std::function<bool(const QString&)> DosLados(std::optional<QSet<QString>> nomes) {
    if (!nomes) return {};
    for (const char* base :
         {"RELACAO", "TAG", "ETIQUETA", "REGUA", "STRIP", "REGLETA", "NUMERO", "NUMBER"})
        for (const char* sufixo : {"_INI", "_FIM"})
            *nomes << QLatin1String(base) + QLatin1String(sufixo);
    return
        [nomes = std::move(*nomes)](const QString& nome) { return nomes.contains(nome.toUpper()); };
}

QString Progresso(int k, int n) {
    return CIProgress::Contagem(k, n);
}

}  // namespace

struct CCBorneDataReader::Lado {
    bool insercao;  // the insertion point's side, else the cut point's
};

QString CCBorneDataReader::Regua(const CEItemLista& item) {
    return Primeiro<"REGUA", "STRIP", "REGLETA">(item);
}

QString CCBorneDataReader::Numero(const CEItemLista& item) {
    return Primeiro<"NUMERO", "NUMBER", "NUMERO">(item);
}

// ---- sides

void CCBorneDataReader::LerLadoIni(CEItemLista& item, const OdDbObjectId& borne,
                                   CETemplate& modelo) {
    LeLado(item, borne, Lado{true}, modelo);
}

void CCBorneDataReader::LerLadoFim(CEItemLista& item, const OdDbObjectId& borne,
                                   CETemplate& modelo) {
    LeLado(item, borne, Lado{false}, modelo);
}

// Asked at every side of every terminal: the field by its number, and no upper-case copy
// of a text that cannot read "S" (upper case never shortens a text), nor of an ASCII letter.
bool CCBorneDataReader::Invertido(const CEItemLista& borne) {
    const QString* valor = borne.campos.procura(NumeroCampo<"INVERTIDO">());
    if (!valor || valor->size() != 1) return false;
    const char16_t c = valor->front().unicode();
    if (c < 0x80) return c == 'S' || c == 's';
    return valor->toUpper() == QLatin1String("S");
}

std::vector<QString> CCBorneDataReader::SufixosDosLados() {
    return {QStringLiteral("_INI"), QStringLiteral("_FIM"), QStringLiteral("_SEGINI"),
            QStringLiteral("_SEGFIM")};
}

QString CCBorneDataReader::SufixoElemento(const CEItemLista& borne, bool insercao) {
    return insercao != Invertido(borne) ? QStringLiteral("_FIM") : QStringLiteral("_INI");
}

QString CCBorneDataReader::SufixoFio(const CEItemLista& borne, bool insercao) {
    return insercao != Invertido(borne) ? QStringLiteral("_SEGFIM") : QStringLiteral("_SEGINI");
}

// The insertion side looks forward first, the cut side backward first, so that the two
// sides take different neighbours on a wire that passes straight through the terminal.
CCBorneDataReader::LadoBorne CCBorneDataReader::AchaLado(CCDataReader& leitor,
                                                         const OdDbObjectId& borne, bool insercao,
                                                         const LadoBorne* oposto) {
    LadoBorne lado;
    if (oposto) {
        lado.ponto = oposto->outro;
        lado.outro = oposto->ponto;
        lado.layer = oposto->layer;
    } else {
        const CEPonto p = CICad::GetPosicao(borne);
        const CEPonto q = leitor.PontoDeCorte(borne);
        lado.ponto = insercao ? p : q;
        lado.outro = insercao ? q : p;
    }
    // The wire at the point and its entries are found once for both directions, the
    // element's handle and its point.
    if (lado.layer.isNull()) lado.layer = leitor.LayerDe(borne);
    const OdDbObjectId fio =
        oposto && oposto->fioOutro ? *oposto->fioOutro : leitor.FioNoPonto(lado.layer, lado.ponto);
    QString numero;
    bool numerado = false;
    const auto entradas = leitor.EntradasDoFio(fio, numero, numerado);
    if (!entradas) return lado;
    const TabelaConexoes::Textos& elementos = entradas->elementos;
    // An entry with an empty text counts as none, as an empty handle would.
    auto vizinho = [&](bool anterior) {
        const int i = CCDataReader::LugarDoVizinho(*entradas, borne, lado.ponto, anterior);
        return i >= 0 && !elementos.vista(i).isEmpty() ? i : -1;
    };
    int i = vizinho(!insercao);
    if (i < 0) i = vizinho(insercao);
    if (i < 0) return lado;
    lado.vizinho = elementos.vista(i);
    // A stale handle in the connection answer: the element is null, the side stays blank.
    // Its handle as the table read it from the text: no text made to read it again.
    lado.elemento = CICad::IdDoHandleNumero(elementos.handle(i), borne.database());
    lado.fio = fio;
    lado.numeroFio = std::move(numero);
    lado.fioNumerado = numerado;
    // The point of the element's first entry on the wire. Equal texts have equal handles:
    // only entries of the same handle have their texts compared.
    const std::span<const std::uint64_t> handles = entradas->handles;
    int j = 0;
    while (j < i && (handles[size_t(j)] != handles[size_t(i)] || !elementos.MesmoTexto(j, i)))
        ++j;
    if (size_t(j) < entradas->pontos.size()) lado.pontoElemento = entradas->pontos[size_t(j)];
    return lado;
}

void CCBorneDataReader::LeLado(CEItemLista& item, const OdDbObjectId& borne, const Lado& lado,
                               CETemplate& modelo) {
    const LadoBorne achado = AchaLado(*this, borne, lado.insercao);
    if (achado.elemento.isNull()) return;
    const QString sufixo = SufixoElemento(item, lado.insercao);
    // A neighbour that is no block reference is read as such (what a copy would not do).
    if (CICad::EhReferencia(achado.elemento))
        CopiaEntidade(sufixo, item, achado.elemento, &modelo);
    else
        LeBloco(sufixo, item, achado.elemento, &modelo);
    CompoeRelacaoBorne(sufixo, item, achado.elemento, achado.pontoElemento, modelo);

    LeFiosLado(*this, item, borne, achado, lado.insercao, &modelo);
}

std::optional<OdDbObjectId> CCBorneDataReader::LeFiosLado(CCDataReader& leitor, CEItemLista& item,
                                                          const OdDbObjectId& borne,
                                                          const LadoBorne& lado, bool insercao,
                                                          CETemplate* modelo) {
    if (!lado.fioNumerado) return std::nullopt;
    // AchaLado found the wire at the side's point already.
    const OdDbObjectId& fioAqui = lado.fio;
    const OdDbObjectId fioOutro =
        leitor.FioNoPonto(lado.layer.isNull() ? leitor.LayerDe(borne) : lado.layer, lado.outro);
    // The cut point's wire is read first on the insertion side, last on the cut side.
    const OdDbObjectId& fioP = insercao ? fioAqui : fioOutro;
    const OdDbObjectId& fioQ = insercao ? fioOutro : fioAqui;
    const QString segP = SufixoFio(item, true);
    const QString segQ = SufixoFio(item, false);
    if (insercao) {
        if (!fioQ.isNull()) leitor.CopiaEntidade(segQ, item, fioQ, modelo);
        if (!fioP.isNull()) leitor.CopiaEntidade(segP, item, fioP, modelo);
    } else {
        if (!fioP.isNull()) leitor.CopiaEntidade(segP, item, fioP, modelo);
        if (!fioQ.isNull()) leitor.CopiaEntidade(segQ, item, fioQ, modelo);
    }
    return fioOutro;
}

void CCBorneDataReader::CompoeRelacaoBorne(const QString& sufixo, CEItemLista& item,
                                           const OdDbObjectId& elemento, const CEPonto& ponto,
                                           CETemplate& modelo) {
    std::uint32_t* lugares = LugaresDoLado(sufixo);
    const QString rel = PrimeiroEm<"RELACAO", "TAG", "ETIQUETA">(item, sufixo, lugares);
    const QString regua = PrimeiroEm<"REGUA", "STRIP", "REGLETA">(item, sufixo, lugares + 3);
    const QString num = PrimeiroEm<"NUMERO", "NUMBER", "NUMERO">(item, sufixo, lugares + 6);
    const zv::CEAtributo* ligacao = ConexaoProxima(elemento, ponto);
    const QString lig = ligacao ? ligacao->GetValor() : QString();
    const Concatenacao& concatenacao = ConcatenacaoDo(modelo);
    const QString& sep = concatenacao.separador;
    const bool relacaoPrimeiro = concatenacao.relacaoPrimeiro;
    auto define = [&](const QString& texto) {
        item.definirCampo(Lugar<"RELACAO">(lugares[0], sufixo), texto);
        item.definirCampo(Lugar<"TAG">(lugares[1], sufixo), texto);
        item.definirCampo(Lugar<"ETIQUETA">(lugares[2], sufixo), texto);
    };
    if (!lig.isEmpty()) define(relacaoPrimeiro ? rel + sep + lig : lig + sep + rel);
    // A terminal as neighbour has no relation of its own: strip and number stand for it.
    if (!regua.isEmpty() && !num.isEmpty() && rel.isEmpty())
        define(relacaoPrimeiro ? regua + sep + num : num + sep + regua);
}

std::uint32_t* CCBorneDataReader::LugaresDoLado(const QString& sufixo) {
    for (auto& [feito, lugares] : lugaresLado_)
        if (feito == sufixo) return lugares.data();
    std::array<std::uint32_t, 9> lugares;
    lugares.fill(CamposItem::kSemNome);
    lugaresLado_.emplace_back(sufixo, lugares);
    return lugaresLado_.back().second.data();
}

const CCBorneDataReader::Concatenacao& CCBorneDataReader::ConcatenacaoDo(CETemplate& modelo) {
    if (concatenacao_.modelo != &modelo) {
        concatenacao_.modelo = &modelo;
        concatenacao_.separador = modelo.LerTexto("*CHAR_SEP_STD_CFG*");
        concatenacao_.relacaoPrimeiro = modelo.LerTexto("*ORDEM_CONCAT_STD*") == "1";
    }
    return concatenacao_;
}

// ---- reading

void CCBorneDataReader::RegistraNumero(const CEItemLista& item) {
    if (duplicado_) return;
    const QString numero = Numero(item);
    const QString jumper = item.valorCampo("JUMPER");
    auto it = jumperPorNumero_.constFind(numero);
    // Only a number whose earlier terminal had a jumper text counts, whatever the strip.
    if (it != jumperPorNumero_.constEnd() && !it.value().isEmpty()) duplicado_ = true;
    jumperPorNumero_.insert(numero, jumper);
}

bool CCBorneDataReader::Aceita(CEItemLista* item, CETemplate& modelo, VetorItens& itens) {
    if (!item) return false;
    if (!modelo.FiltraItem(*item)) {
        delete item;
        return false;
    }
    if (item->valorCampo("ZV_LISTA") != "S") {
        if (!avisouLista_) CICad::ImprimeMensagem(62);
        avisouLista_ = true;
        delete item;
        return false;
    }
    PartilhaNomes(*item);
    CamposPrevistos = size_t(item->campos.size());
    itens.push_back(item);
    RegistraNumero(*item);
    return true;
}

VetorItens* CCBorneDataReader::LerDados(zvdb::Database* database,
                                        const std::optional<QStringList>& paginas,
                                        CETemplate& modelo, CIProgress& progresso) {
    Q_UNUSED(paginas);
    concatenacao_ = {};  // the template's texts are read again for each run
    if (CamposDaLista) FiltraSufixos(DosLados(CamposDaLista(modelo)));
    // Worked out by the host while the blocks and their references are listed below.
    CarregaConexoesFios(true);
    progresso.Definir(10);
    CarregaConexoesCabos(true);
    progresso.Definir(20);

    auto* itens = new VetorItens;
    const bool bor = modelo.LerLogico("PBLCTOBORNE");
    const auto blocos = CICad::GetBlocos(database);
    const auto referencias = CICad::GetReferenciasPorBloco(database);
    const OdDbObjectId modelSpace = CICad::GetModelSpace(database);
    const int n = int(blocos.size()) + 1;  // the count starts at 1: a small overcount
    for (int k = 1; k <= int(blocos.size()); ++k) {
        progresso.Definir(20 + 50 * k / n, Progresso(k, n));
        const QString& nome = blocos[size_t(k - 1)].first;
        if (!nome.startsWith("BORNE") && !(bor && nome.startsWith("BOR-"))) continue;
        for (const OdDbObjectId& ref : referencias.value(nome.toUpper()))
            if (CICad::GetDono(ref) == modelSpace)
                Aceita(CriaItemBloco(ref, modelo), modelo, *itens);
    }
    progresso.Definir(70);

    const auto virtuais = CICad::GetEntradasDicionario({"ESQ_VIRTUAL_ZV"}, database);
    const int v = int(virtuais.size());
    for (int k = 1; k <= v; ++k) {
        progresso.Definir(70 + 20 * k / v, Progresso(k, v));
        const auto& [nome, id] = virtuais[size_t(k - 1)];
        if (nome.startsWith("BORNE")) Aceita(CriaItemVirtual(id), modelo, *itens);
    }
    progresso.Definir(90);
    // The numbers seen were only for the repeat check: the writer that follows needs the
    // memory.
    QHash<QString, QString>().swap(jumperPorNumero_);

    if (modelo.LerLogico("*SEL_REGUA_BORNE_CFG*")) {
        VetorItens escolhidos = SelecionaReguas(*itens);
        // What the selection dropped goes now; nothing else points at it. The kept ones are
        // told by a sorted array of their addresses, not a node each.
        std::vector<const CEItemLista*> ficam(escolhidos.begin(), escolhidos.end());
        std::sort(ficam.begin(), ficam.end());
        for (CEItemLista* item : *itens)
            if (!std::binary_search(ficam.begin(), ficam.end(), item)) delete item;
        static_cast<std::vector<CEItemLista*>&>(*itens) = std::move(escolhidos);
    }
    progresso.Definir(92);
    itens->ordenar(modelo.LerListaTexto("*LISTA_DE_SORT*"));
    progresso.Definir(95);
    if (modelo.LerLogico("*INIC_SEQUENCIAL*")) IniciaSequencial(*itens);
    // The reversal runs before the gaps are filled: a falling list gets no blank rows.
    if (modelo.LerTexto("*ORDEM_CRESCENTE*") != "C") itens->inverter();
    if (modelo.LerLogico("*PREENCHE_FALTANTES*")) PreencheFaltantes(*itens);
    progresso.Definir(97);
    if (!duplicado_)
        LigaJumpers(*itens);
    else if (AvisaNumerosRepetidos)
        CICad::ImprimeMensagem(329);
    if (itens->empty()) CICad::ImprimeMensagem(64);
    progresso.Definir(100);
    return itens;
}

// ---- after reading

VetorItens CCBorneDataReader::SelecionaReguas(const VetorItens& itens) {
    CICad::Log("selecaoBornes1");
    zvsdk::ResultBuffer* lista = CICad::zvInvokeLista("zvSelecionaReguas");
    CICad::Log("selecaoBornes2");
    VetorItens resultado;
    if (lista && lista->restype != zvsdk::RTNIL) {
        CICad::Log("selecaoBornes3");
        // The items of each strip per language, in vector order: what filtering the vector by
        // that strip field gives, without a pass over all items for every strip picked.
        QHash<QString, VetorItens> porRegua[3];
        for (CEItemLista* item : itens)
            for (int i = 0; item && i < 3; ++i)
                porRegua[i][item->valorCampo(kReguas[i])].push_back(item);
        for (const zvsdk::ResultBuffer* no = lista; no; no = no->rbnext) {
            if (no->restype != zvsdk::RTSTR) continue;
            for (const auto& idioma : porRegua)
                resultado.juntarSemRepetir(idioma.value(no->rstring));
        }
        CICad::Log("selecaoBornes4");
    }
    CICad::LiberaLista(lista);
    return resultado;
}

void CCBorneDataReader::IniciaSequencial(VetorItens& itens) {
    VetorItens resultado;
    resultado.reserve(itens.size());
    QString anterior;
    for (CEItemLista* item : itens) {
        const QString regua = item ? Regua(*item) : QString();
        if (item && regua != anterior) {
            // A strip that starts at 5 gets blank rows 1 to 4 in front.
            for (int k = 1; k < ZVString(Numero(*item)).ParaInteiro(); ++k)
                resultado.push_back(ItemEmBranco(regua, k));
            anterior = regua;
        }
        resultado.push_back(item);
    }
    itens = std::move(resultado);
}

void CCBorneDataReader::PreencheFaltantes(VetorItens& itens) {
    if (itens.size() < 2) return;
    VetorItens resultado;
    resultado.reserve(itens.size());
    for (size_t i = 0; i < itens.size(); ++i) {
        resultado.push_back(itens[i]);
        if (i + 1 == itens.size() || !itens[i] || !itens[i + 1]) continue;
        const QString regua = Regua(*itens[i]);
        if (regua != Regua(*itens[i + 1])) continue;
        const int a = ZVString(Numero(*itens[i])).ParaInteiro();
        const int b = ZVString(Numero(*itens[i + 1])).ParaInteiro();
        for (int k = a + 1; k < b; ++k)
            resultado.push_back(ItemEmBranco(regua, k));
    }
    itens = std::move(resultado);
}

namespace {

// The strip and number names of the three languages as texts, made once: every terminal of
// a jumper look-up asks for them.
struct NomesBorne {
    QString reguas[3], numeros[3];
    QString jumper = QStringLiteral("JUMPER");
    NomesBorne() {
        for (int i = 0; i < 3; ++i) {
            reguas[i] = QString::fromLatin1(kReguas[i]);
            numeros[i] = QString::fromLatin1(kNumeros[i]);
        }
    }
};

const NomesBorne& Nomes() {
    static const NomesBorne nomes;
    return nomes;
}

}  // namespace

uint qHash(const CCBorneDataReader::ChaveBorne& chave, uint semente) {
    // The strip's hash seeds the number's.
    return qHash(chave.numero, qHash(chave.regua, semente));
}

namespace {

// The first item of each strip and number, per language, for the jumper look-ups; and each
// item's jumper text, read in the same pass while the item's fields are at hand.
class IndiceBornes {
public:
    explicit IndiceBornes(const VetorItens& itens) {
        for (int i = 0; i < 3; ++i) {
            regua_[i] = CamposItem::numeroSeHouver(Nomes().reguas[i]);
            numero_[i] = CamposItem::numeroSeHouver(Nomes().numeros[i]);
            indice_[i].reserve(itens.size());
        }
        const std::uint32_t jumper = CamposItem::numeroSeHouver(Nomes().jumper);
        jumpers_.reserve(itens.size());
        // The first item of a key keeps it.
        for (CEItemLista* item : itens) {
            jumpers_.push_back(item && jumper != CamposItem::kSemNome ? item->campos.procura(jumper)
                                                                      : nullptr);
            for (int i = 0; item && i < 3; ++i) {
                CEItemLista*& primeiro =
                    indice_[i][{Valor(*item, regua_[i]), Valor(*item, numero_[i])}];
                if (!primeiro) primeiro = item;
            }
        }
    }
    // The jumper text of the k-th item, null when it has none; valid while its fields stay.
    const QString* Jumper(std::size_t k) const { return jumpers_[k]; }
    CEItemLista* Busca(const CEItemLista& de, int idioma, const QString& numero) const {
        return indice_[idioma].value({Valor(de, regua_[idioma]), numero});
    }

private:
    using Chave = CCBorneDataReader::ChaveBorne;
    // The item's value under the name's number; empty when it has none.
    static QString Valor(const CEItemLista& item, std::uint32_t nome) {
        const QString* valor = nome == CamposItem::kSemNome ? nullptr : item.campos.procura(nome);
        return valor ? *valor : QString();
    }
    std::uint32_t regua_[3], numero_[3];
    TabelaChaves<Chave, CEItemLista*> indice_[3];
    std::vector<const QString*> jumpers_;
};

// The items a pass has visited, marked in an array beside their sorted addresses: every
// terminal with a jumper is marked, and a node per mark would cost an allocation and a free.
// An item of none of the list's places (none is expected) is kept apart.
class Visitados {
public:
    explicit Visitados(const VetorItens& itens) : enderecos_(itens.begin(), itens.end()) {
        std::sort(enderecos_.begin(), enderecos_.end());
        marcas_.resize(enderecos_.size());
    }
    // Marks the item; false when it was marked already.
    bool Marca(CEItemLista* item) {
        const auto lugar = std::lower_bound(enderecos_.begin(), enderecos_.end(), item);
        if (lugar == enderecos_.end() || *lugar != item) return fora_.insert(item).second;
        char& marca = marcas_[std::size_t(lugar - enderecos_.begin())];
        return !std::exchange(marca, char(1));
    }

private:
    std::vector<CEItemLista*> enderecos_;
    std::vector<char> marcas_;
    std::unordered_set<CEItemLista*> fora_;
};

// The terminals bridged to `inicio`, followed through their own jumper texts, depth first.
VetorItens ColetaJumper(CEItemLista* inicio, const IndiceBornes& indice, Visitados& visitados) {
    VetorItens cadeia;
    std::vector<CEItemLista*> pilha{inicio};
    while (!pilha.empty()) {
        CEItemLista* item = pilha.back();
        pilha.pop_back();
        cadeia.push_back(item);
        std::vector<CEItemLista*> achados;
        // Empty tokens are dropped: one would match any terminal whose strip and number
        // read empty in some language, i.e. every terminal tagged in another one.
        for (const QString& token : ZVString(item->valorCampo(Nomes().jumper)).Divide(",")) {
            for (int i = 0; i < 3; ++i) {
                CEItemLista* achado = indice.Busca(*item, i, token);
                if (!achado) continue;
                if (visitados.Marca(achado)) achados.push_back(achado);
                break;
            }
        }
        pilha.insert(pilha.end(), achados.rbegin(), achados.rend());
    }
    return cadeia;
}

// Items linked to the chain's members by earlier passes join it.
void EstendeCadeia(VetorItens& cadeia) {
    std::unordered_set<CEItemLista*> membros(cadeia.begin(), cadeia.end());
    const size_t n = cadeia.size();
    for (size_t i = 0; i + 1 < n; ++i) {
        for (CEItemLista* p = cadeia[i]->anterior; p && membros.insert(p).second; p = p->anterior)
            cadeia.push_back(p);
        for (CEItemLista* p = cadeia[i]->proximo; p && membros.insert(p).second; p = p->proximo)
            cadeia.push_back(p);
    }
}

}  // namespace

void CCBorneDataReader::LigaJumpers(VetorItens& itens) {
    const IndiceBornes indice(itens);
    const QStringList ordem =
        VetorItens::camposQueDecidem({"REGUA", "STRIP", "REGLETA", "NUMERO", "NUMBER", "NUMERO"});
    Visitados visitados(itens);
    for (std::size_t k = 0; k < itens.size(); ++k) {
        CEItemLista* item = itens[k];
        if (!item) continue;
        const QString* jumper = indice.Jumper(k);
        if (!jumper || jumper->trimmed().isEmpty()) continue;
        if (!visitados.Marca(item)) continue;
        VetorItens cadeia = ColetaJumper(item, indice, visitados);
        EstendeCadeia(cadeia);
        cadeia.ordenar(ordem);
        for (size_t i = 0; i + 1 < cadeia.size(); ++i) {
            cadeia[i]->proximo = cadeia[i + 1];
            cadeia[i + 1]->anterior = cadeia[i];
        }
    }
}
