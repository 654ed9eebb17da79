#include "CCFioDataReader.h"

#include "CEAtributo.h"
#include "NomeCampo.h"
#include "SelecaoPaginas.h"
#include "lists/CCFioGrfWriter.h"
#include "lists/CETemplate.h"
#include "module/CIProgress.h"

#include <algorithm>
#include <functional>
#include <memory>
#include <unordered_set>

namespace {

QString Tag(CampoTraduzido campo, int idioma) {
    return CICad::TagTraduzida(campo, idioma);
}

void Define(CIProgress* progresso, int percentual) {
    if (progresso) progresso->Definir(percentual);
}

// The names of an end under one suffix, made once: each stretch end asks for some twenty.
struct NomesExtremidade {
    NomeCampo conector, rel, lig;
    std::array<NomeCampo, 3> pino, relacao, regua, numero;  // by language
};

const NomesExtremidade& Nomes(const QString& sufixo) {
    static QHash<QString, NomesExtremidade> porSufixo;
    auto achado = porSufixo.constFind(sufixo);
    if (achado != porSufixo.constEnd()) return achado.value();
    NomesExtremidade n{NomeCampo("CONECTOR" + sufixo),
                       NomeCampo("REL" + sufixo),
                       NomeCampo("LIG" + sufixo),
                       {},
                       {},
                       {},
                       {}};
    for (int i = 0; i < 3; ++i) {
        n.pino[size_t(i)] = NomeCampo(Tag(CampoTraduzido::Pino, i + 1) + sufixo);
        n.relacao[size_t(i)] = NomeCampo(Tag(CampoTraduzido::Relacao, i + 1) + sufixo);
        n.regua[size_t(i)] = NomeCampo(Tag(CampoTraduzido::Regua, i + 1) + sufixo);
        n.numero[size_t(i)] = NomeCampo(Tag(CampoTraduzido::Numero, i + 1) + sufixo);
    }
    return porSufixo.insert(sufixo, n).value();
}

// The names (in upper case) read of a list's stretches once they are made: the list's own,
// the wire's number under any language's name and the ends' relations, which the routes
// look up.
QSet<QString> CamposDepois(QSet<QString> nomes) {
    for (int i = 1; i <= 3; ++i)
        nomes << Tag(CampoTraduzido::Fio, i);
    nomes << QStringLiteral("FIO") << QStringLiteral("RELACAO_INI")
          << QStringLiteral("RELACAO_FIM");
    return nomes;
}

// And while the walk makes them: an end's layer, connector, relation, connection, pin, strip
// and number.
QSet<QString> CamposDurante(QSet<QString> nomes) {
    for (const QString& sufixo : {QStringLiteral("_INI"), QStringLiteral("_FIM")}) {
        for (const char* nome : {"LAYER", "CONECTOR", "REL", "LIG"})
            nomes << QLatin1String(nome) + sufixo;
        for (const CampoTraduzido campo : {CampoTraduzido::Pino, CampoTraduzido::Relacao,
                                           CampoTraduzido::Regua, CampoTraduzido::Numero})
            for (int i = 1; i <= 3; ++i)
                nomes << Tag(campo, i) + sufixo;
    }
    return nomes;
}

std::function<bool(const QString&)> Filtro(QSet<QString> nomes) {
    return
        [nomes = std::move(nomes)](const QString& nome) { return nomes.contains(nome.toUpper()); };
}

// A copy of `origem` whose field array has room for `lugares` fields from the start: a
// copy made and then widened would allocate and move its fields twice.
CEItemLista* CopiaComLugar(const CEItemLista& origem, std::size_t lugares) {
    auto* copia = new CEItemLista;
    const std::vector<CamposItem::Campo>& campos = origem.campos.todos();
    copia->campos.reservar(std::max(lugares, campos.size()));
    copia->campos.juntarOrdenados(
        campos.size(), [&campos](std::size_t j) { return campos[j].nome; },
        [&campos](std::size_t j) -> const QString& { return campos[j].valor; });
    copia->ids = origem.ids;
    copia->anterior = origem.anterior;
    copia->proximo = origem.proximo;
    copia->ligado = origem.ligado;
    return copia;
}

bool MesmoPonto(const CEPonto& a, const CEPonto& b) {
    return a.x == b.x && a.y == b.y && a.z == b.z;
}

// Wires of up to this many entries find repeated texts by comparing them all.
constexpr int kEntradasSemIndice = 16;

// The names and values the walks write for every wire and end, made once: a text made from
// a literal at each use costs an allocation.
const QString kIni = QStringLiteral("INI"), kFim = QStringLiteral("FIM"),
              kWireLista = QStringLiteral("WIRE_LISTA"), kSim = QStringLiteral("S"),
              kTipoLista = QStringLiteral("ZV_LISTA_TIPO"), kTipoFio = QStringLiteral("FIO"),
              kAnilha = QStringLiteral("ANILHA"), kHandleIni = QStringLiteral("HANDLE_INI");

}  // namespace

// Sets up a walk over the wires: the composition read once with its template, and no wire
// under work; both dropped when the walk ends, so later calls read afresh.
class CCFioDataReader::Caminhada {
public:
    Caminhada(CCFioDataReader& leitor, CETemplate* modelo) : leitor_(leitor) {
        leitor_.fio_ = FioAtual();
        leitor_.vistas_.clear();
        leitor_.composicao_ = LeComposicao(modelo);
        leitor_.modeloComposicao_ = modelo;
    }
    ~Caminhada() {
        leitor_.fio_ = FioAtual();
        leitor_.vistas_.clear();
        leitor_.composicao_.reset();
        leitor_.modeloComposicao_ = nullptr;
    }
    Caminhada(const Caminhada&) = delete;
    Caminhada& operator=(const Caminhada&) = delete;

private:
    CCFioDataReader& leitor_;
};

void CCFioDataReader::LerLadoIni(CEItemLista& item, const OdDbObjectId& entidade,
                                 CETemplate& modelo) {
    Q_UNUSED(item);
    Q_UNUSED(entidade);
    Q_UNUSED(modelo);
}

void CCFioDataReader::LerLadoFim(CEItemLista& item, const OdDbObjectId& entidade,
                                 CETemplate& modelo) {
    Q_UNUSED(item);
    Q_UNUSED(entidade);
    Q_UNUSED(modelo);
}

VetorItens* CCFioDataReader::LerDados(zvdb::Database* database,
                                      const std::optional<QStringList>& paginas, CETemplate& modelo,
                                      CIProgress& progresso) {
    Q_UNUSED(database);
    Q_UNUSED(paginas);
    std::optional<QStringList> escolhidas;
    if (modelo.LerLogico("*SELECAO_PAG_FIOS*") && CICad::GetDatabase())
        SelecionaPaginas(false, escolhidas);
    auto* itens = new VetorItens;
    progresso.Definir(0);
    // A list holds every stretch at once: each keeps only what is read of it.
    LimitaCampos(CCFioGrfWriter::CamposDasLinhas(modelo));
    const std::unique_ptr<VetorItens> lidos(LeFios(escolhidas, &modelo, &progresso));
    LimitaCampos(std::nullopt);
    itens->juntarSemRepetir(*lidos);
    AplicaCaminhos(*itens);
    progresso.Definir(100);
    return itens;
}

void CCFioDataReader::LimitaCampos(const std::optional<QSet<QString>>& lista) {
    const std::optional<QSet<QString>> depois =
        lista ? std::optional(CamposDepois(*lista)) : std::nullopt;
    depois_ = {depois ? Filtro(*depois) : nullptr, {}};
    const std::optional<QSet<QString>> durante =
        depois ? std::optional(CamposDurante(*depois)) : std::nullopt;
    durante_ = {durante ? Filtro(*durante) : nullptr, {}};
    FiltraSufixos(durante_.fica);
    auto algumCom = [&durante](const char* sufixo) {
        return !durante ||
               std::any_of(durante->begin(), durante->end(), [sufixo](const QString& nome) {
                   return nome.endsWith(QLatin1String(sufixo));
               });
    };
    segmentoIni_ = algumCom("_SEGINI");
    segmentoFim_ = algumCom("_SEGFIM");
    // Without those copies each wire polyline is copied once, into its own item.
    GuardaFios = segmentoIni_ || segmentoFim_;
    // The elements are read for their copies at the ends alone.
    std::function<bool(const QString&)> dasPontas;
    if (depois)
        dasPontas = [fica = durante_.fica](const QString& nome) {
            return fica(nome) || fica(nome + QLatin1String("_INI")) ||
                   fica(nome + QLatin1String("_FIM"));
        };
    LeSoCampos(std::move(dasPontas));
}

void CCFioDataReader::CamposLidos::Retem(CEItemLista& item) {
    if (!fica) return;
    item.campos.reter([this](std::uint32_t numero) {
        if (numero >= porNumero.size()) porNumero.resize(numero + 1, 0);
        char& lido = porNumero[numero];
        if (!lido) lido = fica(CamposItem::nome(numero)) ? 1 : 2;
        return lido == 1;
    });
}

std::vector<OdDbObjectId> CCFioDataReader::ListaFios(const QStringList& layers) {
    // One string argument per layer: a drawing has more layers than the nine of zvInvoke.
    zvsdk::ResultBuffer* chamada = zvsdk::newString("getListaFios");
    zvsdk::ResultBuffer* cauda = chamada;
    for (const QString& layer : layers)
        cauda = cauda->rbnext = zvsdk::newString(layer);
    zvsdk::ResultBuffer* resposta = CICad::InvokeChain(chamada);
    zvsdk::releaseChain(chamada);
    std::vector<OdDbObjectId> fios;
    for (const zvsdk::ResultBuffer* no = resposta; no; no = no->rbnext)
        if (no->restype == zvsdk::RTENAME) fios.emplace_back(no->rlname);
    CICad::LiberaLista(resposta);
    return fios;
}

CEItemLista* CCFioDataReader::ItemFio(const OdDbObjectId& polilinha, CETemplate* modelo,
                                      std::size_t lugares) {
    // The walk that answers this gives the wire's texts to its reading in the copy below.
    if (!FioTemChave(polilinha)) return nullptr;
    auto* item = new CEItemLista;
    item->ids.push_back(polilinha);
    item->campos.reservar(lugares);
    CopiaEntidade(QString(), *item, polilinha, modelo);
    return item;
}

void CCFioDataReader::FioAtual::Recomeca(const QString& outro) {
    numero = outro;
    valido = true;
    primeiros.clear();
    ligacoes.clear();
    ligacoesLidas.clear();
    ids.clear();
    idsLidos.clear();
    listasLidas = false;
    elementos.reset();
    pontos.reset();
    completasLidas = false;
    completas.reset();
}

CCFioDataReader::FioAtual& CCFioDataReader::Fio(const QString& numero) {
    if (!fio_.valido || fio_.numero != numero) fio_.Recomeca(numero);
    return fio_;
}

OdDbObjectId CCFioDataReader::Elemento(const QString& numero,
                                       const TabelaConexoes::Textos& elementos, int indice) {
    if (indice < 0 || indice >= elementos.size()) return CICad::IdDoHandle(QString());
    // The table read each element's handle already: no text is made for it.
    if (!composicao_) return CICad::IdDoHandleNumero(elementos.handle(indice));
    FioAtual& fio = Fio(numero);
    const size_t n = size_t(elementos.size());
    if (fio.ids.size() != n) {
        fio.ids.assign(n, OdDbObjectId());
        fio.idsLidos.assign(n, false);
    }
    const size_t i = size_t(indice);
    if (!fio.idsLidos[i]) {
        fio.ids[i] = CICad::IdDoHandleNumero(elementos.handle(indice));
        fio.idsLidos[i] = true;
    }
    return fio.ids[i];
}

int CCFioDataReader::PrimeiroLugar(const QString& numero, int indice) {
    std::optional<TabelaConexoes::Textos> lidas;
    if (composicao_) {
        FioAtual& fio = Fio(numero);
        if (!fio.completasLidas) {
            fio.completas = ListaConexoesCompletas(numero);
            fio.completasLidas = true;
        }
    } else {
        lidas = ListaConexoesCompletas(numero);
    }
    const std::optional<TabelaConexoes::Textos>& completas = composicao_ ? fio_.completas : lidas;
    if (!completas) return -1;
    const int n = int(completas->size());
    // An entry past the list's end has the empty text.
    if (indice < 0 || indice >= n) return int(completas->indexOf(QString()));
    FioAtual& fio = Fio(numero);
    std::vector<int>& primeiros = fio.primeiros;
    if (primeiros.size() != size_t(n)) {
        primeiros.assign(size_t(n), 0);
        if (n <= kEntradasSemIndice) {
            for (int i = 0; i < n; ++i) {
                int j = 0;
                while (!completas->MesmoTexto(j, i))
                    ++j;
                primeiros[size_t(i)] = j;
            }
        } else {
            // A bus wire holds thousands of entries. A text seen before keeps its first place.
            QHash<QString, int> lugares;
            lugares.reserve(n);
            for (int i = 0; i < n; ++i) {
                const QString texto = (*completas)[i];
                auto achado = lugares.constFind(texto);
                if (achado == lugares.constEnd()) achado = lugares.insert(texto, i);
                primeiros[size_t(i)] = achado.value();
            }
        }
    }
    return primeiros[size_t(indice)];
}

void CCFioDataReader::Listas(const QString& numero,
                             std::optional<TabelaConexoes::Textos>& elementos,
                             std::optional<std::span<const CEPonto>>& pontos) {
    if (!composicao_) {
        elementos = ListaConexoes(numero);
        pontos = PontosConexao(numero);
        return;
    }
    FioAtual& fio = Fio(numero);
    if (!fio.listasLidas) {
        fio.elementos = ListaConexoes(numero);
        fio.pontos = PontosConexao(numero);
        fio.listasLidas = true;
    }
    elementos = fio.elementos;
    pontos = fio.pontos;
}

std::optional<QString> CCFioDataReader::Ligacao(const QString& numero, int indice) {
    std::optional<TabelaConexoes::Textos> elementos;
    std::optional<std::span<const CEPonto>> pontos;
    Listas(numero, elementos, pontos);
    if (!elementos || !pontos || indice < 0 || indice >= elementos->size() ||
        size_t(indice) >= pontos->size())
        return std::nullopt;
    FioAtual& fio = Fio(numero);
    const size_t n = size_t(elementos->size());
    if (fio.ligacoes.size() != n) {
        fio.ligacoes.assign(n, std::nullopt);
        fio.ligacoesLidas.assign(n, false);
    }
    const size_t i = size_t(indice);
    if (!fio.ligacoesLidas[i]) {
        const zv::CEAtributo* atributo =
            ConexaoProxima(Elemento(numero, *elementos, indice), (*pontos)[i]);
        if (atributo) fio.ligacoes[i] = atributo->GetValor();
        fio.ligacoesLidas[i] = true;
    }
    return fio.ligacoes[i];
}

std::optional<QString> CCFioDataReader::LigacaoProxima(const QString& numero,
                                                       const QString& elemento, int indice,
                                                       const CEPonto& ponto) {
    std::optional<TabelaConexoes::Textos> elementos;
    std::optional<std::span<const CEPonto>> pontos;
    Listas(numero, elementos, pontos);
    if (elementos && pontos && indice >= 0 && indice < elementos->size() &&
        size_t(indice) < pontos->size() &&
        TabelaConexoes::Iguais(elementos->vista(indice), elemento) &&
        MesmoPonto((*pontos)[size_t(indice)], ponto))
        return Ligacao(numero, indice);
    const zv::CEAtributo* atributo = ConexaoProxima(CICad::IdDoHandle(elemento), ponto);
    return atributo ? std::optional<QString>(atributo->GetValor()) : std::nullopt;
}

void CCFioDataReader::PreencheExtremidade(const QString& lado, CEItemLista& item,
                                          const TabelaConexoes::Textos& elementos, int indice,
                                          CETemplate* modelo, const QString& numero) {
    static const QString kSufixoIni = QStringLiteral("_INI"), kSufixoFim = QStringLiteral("_FIM");
    const QString& sufixo = lado == kIni ? kSufixoIni : kSufixoFim;
    CopiaEntidade(sufixo, item, Elemento(numero, elementos, indice), modelo);
    // The wire's number comes from the walk: an element's fields copied under the suffix
    // never hold a field of the wire without one, so the item's number stays the wire's.
    if (lado == kIni ? segmentoIni_ : segmentoFim_)
        LeSegmentoNoIndice(lado, item, numero, indice, modelo);
    CompoeExtremidade(sufixo, item, modelo, numero, indice);
}

VetorItens* CCFioDataReader::LeFios(const std::optional<QStringList>& paginas, CETemplate* modelo,
                                    CIProgress* progresso) {
    Define(progresso, 0);
    auto* itens = new VetorItens;
    // An empty page list is no page at all, not every page.
    if (paginas && paginas->isEmpty()) {
        Define(progresso, 100);
        return itens;
    }
    // The connections first: the host's walk of the drawing for them lists the wires too.
    CarregaConexoesFios();
    // With pages the drawing is asked for the wires that have a polyline on them, so a wire
    // whose first polyline lies on another page still enters through one on a chosen page.
    const std::vector<OdDbObjectId> fios = ListaFios(paginas ? *paginas : CICad::GetLayers());
    Define(progresso, 30);
    CarregaLayout();
    MapeiaLayout(modelo);
    Define(progresso, 50);

    const Caminhada caminhada(*this, modelo);
    const QSet<QString> escolhidas =
        paginas ? QSet<QString>(paginas->begin(), paginas->end()) : QSet<QString>();
    QSet<QString> numeros;
    // The most fields a stretch of the wire before had: the next ones are given that room
    // at once, before their first copy, instead of growing at each end they copy (memory
    // taken and left behind at each step is what costs at scale). The spare room goes back
    // once the wire is done.
    int lugares = 0;
    Trechos trechos;
    CEItemLista padrao;
    for (const OdDbObjectId& fio : fios) {
        if (!CICad::EhPolilinha(fio)) continue;
        if (paginas && !escolhidas.contains(CICad::GetLayerEntidade(fio))) continue;
        CEItemLista* item = ItemFio(fio, modelo, size_t(lugares));
        if (!item) continue;
        const QString campo = CampoFio(*item);
        const QString numero = campo.isEmpty() ? QString() : item->valorCampo(campo);
        // The first polyline of a number speaks for all polylines of that number.
        if (numero.isEmpty() || item->valorCampo(kWireLista) != kSim || numeros.contains(numero) ||
            (modelo && !modelo->FiltraItem(*item))) {
            delete item;
            continue;
        }
        item->definirCampo(NumeroCampo<"ZV_LISTA_TIPO">(), kTipoFio);
        numeros.insert(numero);
        // The filter has seen the wire's fields: its stretches start from those read.
        durante_.Retem(*item);

        const TabelaConexoes::Textos elementos =
            ListaConexoes(numero).value_or(TabelaConexoes::Textos());
        trechos.clear();
        if (!elementos.isEmpty()) {
            const int n = int(elementos.size());
            // Later stretches start from the wire's own fields; a wire of two entries has
            // none. The copy goes into the array of the wire before.
            if (n > 2) padrao = *item;
            PreencheExtremidade(kIni, *item, elementos, 0, modelo, numero);
            CEItemLista* atual = item;
            trechos.acrescenta(atual, {0, -1});
            for (int i = 1; i < n; ++i) {
                const OdDbObjectId elemento = Elemento(numero, elementos, i);
                // An element that no longer exists leaves the stretch open.
                if (elemento.isNull()) break;
                // A run of one equipment is one passage: the wire goes in and out of it.
                const bool equipamento = EhEquipamento(elemento);
                if (!elementos.MesmoTexto(i, i - 1) || !equipamento) {
                    PreencheExtremidade(kFim, *atual, elementos, i, modelo, numero);
                    // The stretch under work is always the last one made.
                    trechos.procura(atual, trechos.tamanho() - 1)->fim = i;
                }
                if (i != n - 1 && (!elementos.MesmoTexto(i, i + 1) || !equipamento)) {
                    CEItemLista* novo = CopiaComLugar(padrao, size_t(lugares));
                    PreencheExtremidade(kIni, *novo, elementos, i, modelo, numero);
                    atual->ligado = novo;
                    itens->push_back(novo);
                    atual = novo;
                    trechos.acrescenta(atual, {i, -1});
                }
            }
        }
        CalculaComprimentos(item, elementos, &trechos, &campo);
        lugares = 0;
        for (const auto& trecho : trechos)
            lugares = std::max(lugares, trecho.first->campos.size());
        // The wire's stretches are complete: their spare room goes back now, not after the
        // whole walk, so the room of every stretch read is not held at once.
        for (CEItemLista* trecho = item; trecho; trecho = trecho->ligado) {
            depois_.Retem(*trecho);
            PartilhaNomes(*trecho);
        }
        // The first stretch stands behind the later ones; the writer sorts.
        itens->push_back(item);
    }
    Define(progresso, 100);
    return itens;
}

VetorItens* CCFioDataReader::LeAnilhas(const QHash<QString, QString>& opcoes, CETemplate* modelo,
                                       CIProgress* progresso) {
    Define(progresso, 20);
    CarregaConexoesFios();
    const std::vector<OdDbObjectId> fios = ListaFios(CICad::GetLayers());
    Define(progresso, 40);
    CarregaLayout();
    MapeiaLayout(modelo);
    Define(progresso, 50);

    const Caminhada caminhada(*this, modelo);
    const QStringList paginas = ZVString(opcoes.value("PAGINAS")).Divide(";");
    const QSet<QString> escolhidas(paginas.begin(), paginas.end());
    auto* itens = new VetorItens;
    QSet<QString> numeros;
    Trechos trechos;
    for (const OdDbObjectId& fio : fios) {
        if (!CICad::EhPolilinha(fio)) continue;
        if (!escolhidas.isEmpty() && !escolhidas.contains(CICad::GetLayerEntidade(fio))) continue;
        CEItemLista* item = ItemFio(fio, modelo);
        if (!item) continue;
        const QString campo = CampoFio(*item);
        const QString numero = campo.isEmpty() ? QString() : item->valorCampo(campo);
        if (numero.isEmpty() || item->valorCampo(kWireLista) != kSim || numeros.contains(numero)) {
            delete item;
            continue;
        }
        numeros.insert(numero);
        item->definirCampo(kTipoLista, kAnilha);
        const size_t primeiro = itens->size();
        itens->push_back(item);

        const TabelaConexoes::Textos elementos =
            ListaConexoes(numero).value_or(TabelaConexoes::Textos());
        const int n = int(elementos.size());
        // A ferrule on each conductor end: a stretch between every two elements.
        CEItemLista* atual = item;
        trechos.clear();
        for (int i = 0; n >= 2 && i + 1 < n; ++i) {
            PreencheExtremidade(kIni, *atual, elementos, i, modelo, numero);
            PreencheExtremidade(kFim, *atual, elementos, i + 1, modelo, numero);
            trechos.acrescenta(atual, {i, i + 1});
            if (i + 2 == n) break;
            CEItemLista* novo = ItemFio(fio, modelo);
            if (!novo) break;
            novo->definirCampo(kTipoLista, kAnilha);
            atual->ligado = novo;
            itens->push_back(novo);
            atual = novo;
        }
        // Stretches in a row that start at the same element make one: the first keeps the
        // link of the last. One pass gives what restarting after each merge would.
        size_t destino = primeiro + 1;
        for (size_t k = primeiro + 1; k < itens->size(); ++k) {
            CEItemLista* esta = (*itens)[k];
            CEItemLista* antes = (*itens)[destino - 1];
            if (esta->valorCampo(kHandleIni) == antes->valorCampo(kHandleIni)) {
                antes->ligado = esta->ligado;
                trechos.remove(esta);
                delete esta;
            } else {
                (*itens)[destino++] = esta;
            }
        }
        itens->resize(destino);
        CalculaComprimentos(item, elementos, &trechos, &campo);
    }
    for (CEItemLista* item : *itens)
        PartilhaNomes(*item);
    Define(progresso, 100);
    return itens;
}

void CCFioDataReader::LeSegmento(const QString& lado, CEItemLista& item, const QString& completo,
                                 CETemplate* modelo) {
    const QString campo = CampoFio(item);
    if (campo.isEmpty()) return;
    const QString numero = item.valorCampo(campo);
    const auto completas = ListaConexoesCompletas(numero);
    const int lugar = completas ? int(completas->indexOf(completo)) : -1;
    const auto pontos = PontosConexao(numero);
    const CEPonto ponto = pontos && lugar >= 0 && size_t(lugar) < pontos->size()
                              ? (*pontos)[size_t(lugar)]
                              : CEPonto{};
    // The element's page: its LAYER under the end's suffix.
    const OdDbObjectId fio = FioNoPonto(item.valorCampo("LAYER_" + lado), ponto);
    if (!fio.isNull()) CopiaEntidade("_SEG" + lado, item, fio, modelo);
}

void CCFioDataReader::LeSegmentoNoIndice(const QString& lado, CEItemLista& item,
                                         const QString& numero, int indice, CETemplate* modelo) {
    static const QString kSegIni = QStringLiteral("_SEGINI"), kSegFim = QStringLiteral("_SEGFIM");
    static const NomeCampo kLayerIni(QStringLiteral("LAYER_INI")),
        kLayerFim(QStringLiteral("LAYER_FIM"));
    const bool ini = lado == kIni;
    const int lugar = PrimeiroLugar(numero, indice);
    std::optional<TabelaConexoes::Textos> elementos;
    std::optional<std::span<const CEPonto>> pontos;
    Listas(numero, elementos, pontos);
    const CEPonto ponto = pontos && lugar >= 0 && size_t(lugar) < pontos->size()
                              ? (*pontos)[size_t(lugar)]
                              : CEPonto{};
    const QString* layer = (ini ? kLayerIni : kLayerFim).Em(item);
    const OdDbObjectId fio = FioNoPonto(layer ? *layer : QString(), ponto);
    if (!fio.isNull()) CopiaEntidade(ini ? kSegIni : kSegFim, item, fio, modelo, &numero);
}

void CCFioDataReader::CompoeExtremidade(const QString& sufixo, CEItemLista& item,
                                        CETemplate* modelo, int indice) {
    const QString campo = CampoFio(item);
    if (!campo.isEmpty()) CompoeExtremidade(sufixo, item, modelo, item.valorCampo(campo), indice);
}

void CCFioDataReader::CompoeExtremidade(const QString& sufixo, CEItemLista& item,
                                        CETemplate* modelo, const QString& numero, int indice) {
    ComporRelacao(sufixo, item, modelo, Ligacao(numero, indice).value_or(QString()));
}

CCFioDataReader::Composicao CCFioDataReader::LeComposicao(CETemplate* modelo) {
    Composicao c;
    Separadores(modelo, c.sep, c.sepLig);
    // Without a template (the exports) the relation comes first.
    c.relacaoPrimeiro = !modelo || modelo->LerTexto("*ORDEM_CONCAT_STD*") == "1";
    return c;
}

void CCFioDataReader::ComporRelacaoFio(const QString& s, CEItemLista& item, CETemplate* modelo,
                                       const zv::CEAtributo* ligacao) {
    ComporRelacao(s, item, modelo, ligacao ? ligacao->GetValor() : QString());
}

void CCFioDataReader::ComporRelacao(const QString& s, CEItemLista& item, CETemplate* modelo,
                                    const QString& lig) {
    std::optional<Composicao> lida;
    const Composicao& composicao = composicao_ && modeloComposicao_ == modelo
                                       ? *composicao_
                                       : lida.emplace(LeComposicao(modelo));
    const QString& sep = composicao.sep;
    const QString& sepLig = composicao.sepLig;
    const bool relacaoPrimeiro = composicao.relacaoPrimeiro;
    const NomesExtremidade& nomes = Nomes(s);
    auto campo = [&item](const NomeCampo& nome) {
        const QString* valor = nome.Em(item);
        return valor ? *valor : QString();
    };
    auto tem = [&item](const NomeCampo& nome) { return nome.Em(item) != nullptr; };
    auto define = [&item](const NomeCampo& nome, const QString& valor) {
        nome.Define(item, valor);
    };

    // A pin: its connector and pin, in the template's order.
    const QString conector = campo(nomes.conector);
    for (size_t i = 0; i < 3; ++i) {
        if (conector.isEmpty() || campo(nomes.pino[i]).isEmpty()) continue;
        define(nomes.rel, conector);
        define(nomes.lig, campo(nomes.pino[i]));
        for (size_t j = 0; j < 3; ++j) {
            if (!tem(nomes.pino[j])) continue;
            const QString pino = campo(nomes.pino[j]);
            define(nomes.relacao[j],
                   relacaoPrimeiro ? conector + sep + pino : pino + sep + conector);
        }
        return;
    }

    // Per language, whether it names a terminal: asked again for the text below, and the
    // fields written in between are none of these.
    std::array<bool, 3> ehBorne{};
    for (size_t i = 0; i < 3; ++i)
        ehBorne[i] = tem(nomes.regua[i]) && tem(nomes.numero[i]);
    bool borne = false;
    for (size_t i = 0; i < 3 && !borne; ++i) {
        if (!ehBorne[i]) continue;
        borne = true;
        define(nomes.rel, campo(nomes.regua[i]) + sep + campo(nomes.numero[i]));
    }
    for (size_t i = 0; i < 3 && !borne; ++i) {
        if (!tem(nomes.relacao[i])) continue;
        define(nomes.rel, campo(nomes.relacao[i]));
        break;
    }
    define(nomes.lig, lig);

    // Each language present writes the text: the last one wins.
    QString texto;
    for (size_t i = 0; i < 3; ++i) {
        if (borne) {
            if (!ehBorne[i]) continue;
            const QString regua = campo(nomes.regua[i]);
            const QString numero = campo(nomes.numero[i]);
            texto = relacaoPrimeiro ? regua + sep + numero + sepLig + lig
                                    : lig + sepLig + numero + sep + regua;
        } else if (tem(nomes.relacao[i])) {
            const QString relacao = campo(nomes.relacao[i]);
            texto = relacaoPrimeiro ? relacao + sep + lig : lig + sep + relacao;
        }
    }
    for (size_t i = 0; i < 3; ++i)
        define(nomes.relacao[i], texto);
}
