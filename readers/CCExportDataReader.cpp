#include "CCExportDataReader.h"

#include "CCBorneDataReader.h"
#include "CCCaboDataReader.h"
#include "CCFioDataReader.h"
#include "CEAtributo.h"
#include "Descarte.h"
#include "NomeCampo.h"
#include "catalogue/CEConexaoCatalogo.h"
#include "export/CEExportacao.h"
#include "lists/CETemplate.h"
#include "module/CIProgress.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <memory>
#include <string_view>
#include <utility>

namespace {

constexpr const char* kRelacoes[3] = {"RELACAO", "TAG", "ETIQUETA"};
constexpr const char* kReguas[3] = {"REGUA", "STRIP", "REGLETA"};
constexpr const char* kNumeros[3] = {"NUMERO", "NUMBER", "NUMERO"};

QString Primeiro(const CEItemLista& item, std::array<NomeCampo, 3>& nomes) {
    for (NomeCampo& nome : nomes) {
        const std::uint32_t numero = nome.ParaBuscar();
        if (numero == CamposItem::kSemNome) continue;
        const QString* valor = item.campos.procura(numero);
        if (valor && !valor->isEmpty()) return *valor;
    }
    return {};
}

// Whether the block name, as the drawing holds it, starts with the upper-case ASCII prefix in
// any case: no text is made for the name, asked at every terminal's side and neighbour.
bool ComecaCom(std::string_view nome, std::string_view prefixo) {
    if (nome.size() < prefixo.size()) return false;
    for (size_t i = 0; i < prefixo.size(); ++i) {
        const char c = nome[i];
        if ((c >= 'a' && c <= 'z' ? char(c - 'a' + 'A') : c) != prefixo[i]) return false;
    }
    return true;
}

// A terminal's reference.
bool EhBorne(const OdDbObjectId& id) {
    return CCExportDataReader::EhNomeDeBorne(CICad::NomeBlocoUtf8(id));
}

// The exports read without a template: the readers they borrow ask it for separators,
// order and sources, which the export's own LISP settings answer; no item is filtered out
// here (the export has its own filters) and the reader's order is kept.
class ModeloExportacao : public CETemplate {
public:
    ModeloExportacao() : CETemplate(QString()) {}
    bool Carregar() override { return true; }
    int LerInteiro(const QString&) override { return 0; }
    double LerReal(const QString&) override { return 0.0; }
    QString LerTexto(const QString& simbolo) override {
        if (simbolo == "*CHAR_SEP_STD_CFG*") return CICad::GetStringLisp("*EXPORT_CHAR_SEP*");
        if (simbolo == "*CHAR_SEP_LIG_CFG*") return CICad::GetStringLisp("*EXPORT_CHAR_SEP_LIG*");
        if (simbolo == "*ORDEM_CONCAT_STD*") return CICad::GetStringLisp("*EXPORT_ORDEM_REL*");
        if (simbolo == "*ORDEM_CRESCENTE*") return QStringLiteral("C");
        if (simbolo == "PROC_SIMB_BARR") return QStringLiteral("1");
        return {};
    }
    QStringList LerListaTexto(const QString&) override { return {}; }
    bool LerLogico(const QString& simbolo) override { return simbolo == "PBLCTOBORNE"; }
    void LerPonto(const QString&, double& x, double& y) override { x = y = 0.0; }
    bool FiltraItem(const CEItemLista&) override { return true; }
};

void Junta(VetorItens& destino, VetorItens* origem) {
    if (!origem) return;
    destino.insert(destino.end(), origem->begin(), origem->end());
    delete origem;
}

}  // namespace

bool CCExportDataReader::EhNomeDeBorne(std::string_view nome) {
    return ComecaCom(nome, "BORNE") || ComecaCom(nome, "BOR-");
}

void CCExportDataReader::LiberaLeituras() {
    CCDataReader::LiberaLeituras();
    Descarte::Largar(relacoesComponentes_);
}

QString CCExportDataReader::PaginasOpcao() const {
    return Exportacao ? Exportacao->GetOpcao("PAGINAS") : QString();
}

// The names an end's relation reads and writes under one suffix, made once: every terminal
// side and wire end composes one.
struct CCExportDataReader::NomesRelacao {
    NomeCampo rel, lig, handle;
    std::array<NomeCampo, 3> relacoes, reguas, numeros;
};

CCExportDataReader::NomesRelacao& CCExportDataReader::Nomes(const QString& sufixo) {
    static QHash<QString, NomesRelacao> porSufixo;
    auto achado = porSufixo.find(sufixo);
    if (achado != porSufixo.end()) return achado.value();
    NomesRelacao n{NomeCampo("REL" + sufixo),
                   NomeCampo("LIG" + sufixo),
                   NomeCampo("HANDLE" + sufixo),
                   {},
                   {},
                   {}};
    for (size_t i = 0; i < 3; ++i) {
        n.relacoes[i] = NomeCampo(kRelacoes[i] + sufixo);
        n.reguas[i] = NomeCampo(kReguas[i] + sufixo);
        n.numeros[i] = NomeCampo(kNumeros[i] + sufixo);
    }
    return porSufixo.insert(sufixo, n).value();
}

VetorItens* CCExportDataReader::Le(zvdb::Database* database, CETemplate* modelo, bool flag,
                                   const std::optional<QStringList>& paginas) {
    Q_UNUSED(flag);
    Q_UNUSED(paginas);
    if (!database) return nullptr;
    // The composition kept for the read is dropped when it ends, so later calls read afresh.
    struct Leitura {
        CCExportDataReader& leitor;
        explicit Leitura(CCExportDataReader& l) : leitor(l) { Limpa(); }
        ~Leitura() { Limpa(); }
        void Limpa() {
            leitor.lendo_ = false;
            leitor.composicao_.reset();
            leitor.modeloComposicao_ = nullptr;
        }
        Leitura(const Leitura&) = delete;
        Leitura& operator=(const Leitura&) = delete;
    } leitura(*this);
    lendo_ = true;
    ModeloExportacao padrao;
    CETemplate& usado = modelo ? *modelo : padrao;
    auto* itens = new VetorItens;
    const int tipo = CICad::GetIntLisp("EXPORTA", 4);
    // The connections are the expensive question to the LISP side. The terminal, wire and
    // ferrule readers ask it for themselves, so this reader asks only when its own hooks
    // or the component kinds need them; a reader built on this one finds them loaded.
    const bool componentes = tipo == 3 || tipo == 4 || tipo == 5 || tipo == 7;
    const bool fios = tipo == 2 || tipo == 4 || tipo == 5 || tipo == 7;
    // The walk of the components reads no connection: the host works them out meanwhile.
    if (componentes || fios) CarregaConexoesFios(componentes);
    if (tipo == 1) LeBornes(database, usado, *itens);
    if (componentes) {
        CarregaConexoesCabos(true);
        LeComponentes(database, usado, *itens);
    }
    if (fios) {
        std::optional<QStringList> escolhidas;
        const QString texto = PaginasOpcao();
        if (!texto.isEmpty()) escolhidas = texto.split(';', Qt::SkipEmptyParts);
        LeFiosExportacao(escolhidas, modelo, *itens);
    }
    if (tipo == 8) {
        CCFioDataReader fios;
        QHash<QString, QString> opcoes;
        opcoes.insert("PAGINAS", PaginasOpcao());
        Junta(*itens, fios.LeAnilhas(opcoes, modelo, nullptr));
    }
    if ((tipo == 6 || tipo == 7) && Exportacao) {
        CCCaboDataReader cabos;
        Junta(*itens, cabos.LerCabosPaginas(database, PaginasOpcao(), usado));
    }
    return itens;
}

void CCExportDataReader::LeBornes(zvdb::Database* database, CETemplate& modelo, VetorItens& itens) {
    CCBorneDataReader bornes;
    bornes.AvisaNumerosRepetidos = false;
    CIProgress progresso;
    std::unique_ptr<VetorItens> lidos(bornes.LerDados(database, std::nullopt, modelo, progresso));
    if (!lidos) return;
    for (CEItemLista* item : *lidos) {
        if (!item) continue;
        item->definirCampo("ZV_LISTA_TIPO", "BORNE");
        PartilhaNomes(*item);
        itens.push_back(item);
        for (CEItemLista* acessorio : ExpandeAcessorios(*item, nullptr, nullptr, {}, QString()))
            itens.push_back(acessorio);
    }
}

void CCExportDataReader::LeComponentes(zvdb::Database* database, CETemplate& modelo,
                                       VetorItens& itens) {
    resultado_.clear();
    vistos_.clear();
    relacoes_.clear();
    conectores_.clear();
    simbolos_ = Simbolos{};
    simbolos_.bornes = true;
    // Accessories are read with their owner and follow it.
    simbolos_.vinculos = lerAcessorios_ ? 2 : 0;
    CIProgress progresso;
    ReservaVistos(database);
    bornesLidos_.Limpa();
    ladosVistos_ = false;
    ladosAdiados_ = true;
    LeBlocos(database, std::nullopt, modelo, progresso);
    LeVirtuais(database, modelo);
    LePinos(database, modelo);
    LiberaReferencias();
    ladosAdiados_ = false;
    // The handles seen were for this walk only: a node each, freed on the freeing thread.
    Descarte::Largar(vistos_);
    // The terminals, each with what the walk read of its reference.
    std::vector<std::pair<CEItemLista*, const BornesLidos::Referencia*>> bornes;
    static const QString kBorne = QStringLiteral("BORNE"), kComp = QStringLiteral("COMP");
    const std::uint32_t tipoCampo = NumeroCampo<"ZV_LISTA_TIPO">();
    const std::uint32_t handleCampo = NumeroCampo<"HANDLE">();
    std::array<NomeCampo, 3>& relacoes = Nomes(QString()).relacoes;
    // At most a relation per item: the table is not made again as it grows.
    relacoesComponentes_.reserve(relacoesComponentes_.size() + resultado_.size());
    for (std::size_t lugar = 0; lugar < resultado_.size(); ++lugar) {
        CEItemLista* item = resultado_[lugar];
        if (!item) continue;
        const QString* tipo = item->campos.procura(tipoCampo);
        if (!tipo || tipo->isEmpty()) {
            // A terminal takes its kind with its sides below, where its array grows once
            // for both.
            if (const BornesLidos::Referencia* referencia = nullptr;
                BorneLido(lugar, *item, referencia)) {
                bornes.emplace_back(item, referencia);
                itens.push_back(item);
                continue;
            }
            // An array made to measure when its item was kept grows by exactly the kind, its
            // fields moved once, not to twice its size and back.
            if (!tipo) item->campos.reservar(size_t(item->campos.size()) + 1);
            item->definirCampo(tipoCampo, kComp);
            // A component is complete with its kind: the room the kind's field grew goes.
            PartilhaNomes(*item);
            tipo = item->campos.procura(tipoCampo);
        }
        if (*tipo == kComp) {
            const QString relacao = Primeiro(*item, relacoes);
            const QString* handle = item->campos.procura(handleCampo);
            // The first component of a relation keeps it.
            if (!relacao.isEmpty() && handle && !handle->isEmpty()) {
                QString& dono = relacoesComponentes_[relacao];
                if (dono.isEmpty()) dono = *handle;
            }
            ComponenteLido(*item);
        }
        itens.push_back(item);
    }
    // Its items are all handed on: the array's room goes too.
    resultado_ = VetorItens();
    // Terminals read alike hold about as many fields once their sides are read: room for as
    // many as the terminal before held moves a terminal's fields once, not at each doubling.
    size_t medida = 0;
    for (const auto& [borne, referencia] : bornes) {
        borne->campos.reservar(std::max(medida, size_t(borne->campos.size()) + 1));
        borne->definirCampo(tipoCampo, kBorne);
        AoLigar(*borne, borne->ids.front(), &modelo, true, true, referencia);
        AoLigar(*borne, borne->ids.front(), &modelo, false, true, referencia);
        medida = size_t(borne->campos.size());
        // The sides were the terminal's last fields: the room their growth left goes, with
        // what the reader does not keep.
        LadosLidos(*borne);
        PartilhaNomes(*borne);
    }
    bornesLidos_.Libera();
}

void CCExportDataReader::ReservaVistos(zvdb::Database* database) {
    // Room for every symbol the walk may list, so that the set of handles seen grows
    // without rehashing its nodes: the references of the blocks it looks at.
    std::size_t referencias = 0;
    const auto& porBloco = ReferenciasPorBloco(database);
    for (auto it = porBloco.constBegin(); it != porBloco.constEnd(); ++it)
        if (!it.key().startsWith('*') && !it.key().startsWith(QLatin1String("PIN-")))
            referencias += it.value().size();
    vistos_.reserve(referencias);
}

void CCExportDataReader::LeFiosExportacao(const std::optional<QStringList>& paginas,
                                          CETemplate* modelo, VetorItens& itens) {
    CCFioDataReader fios;
    std::unique_ptr<VetorItens> lidos(fios.LeFios(paginas, modelo, nullptr));
    if (!lidos) return;
    fios.AplicaCaminhos(*lidos);
    for (CEItemLista* item : *lidos) {
        if (!item) continue;
        // Both ends are taken before the hooks write: an end's fields may land on the other.
        const OdDbObjectId inicio = CICad::IdDoHandle(item->valorCampo("HANDLE_INI"));
        const OdDbObjectId fim = CICad::IdDoHandle(item->valorCampo("HANDLE_FIM"));
        AoLigarInicio(*item, inicio, modelo);
        AoLigarFim(*item, fim, modelo);
        itens.push_back(item);
    }
}

void CCExportDataReader::LerLadoIni(CEItemLista& item, const OdDbObjectId& entidade,
                                    CETemplate& modelo) {
    if (!ladosAdiados_) return AoLigarInicio(item, entidade, &modelo);
    // The reference was just read: its block name, and what its sides ask of it, are at
    // hand now, not when the sides are read after the walk.
    ladosVistos_ = true;
    if (entidade.isNull()) return;
    BornesLidos::Referencia referencia;
    std::string_view bloco;
    const QString* layer = nullptr;
    if (LidaAgora(entidade, bloco, referencia.insercao, layer)) {
        if (!EhNomeDeBorne(bloco)) return;
        referencia.layer = *layer;
    } else {
        if (!EhBorne(entidade)) return;
        referencia.insercao = CICad::GetPosicao(entidade);
        referencia.layer = LayerDe(entidade);
    }
    referencia.corte = PontoDeCorte(entidade);
    referencia.equipamento = CICad::TemXData(entidade, "KVR_ZV_EQUIPO");
    bornesLidos_.Anota(resultado_.size(), item, entidade, std::move(referencia));
}

bool CCExportDataReader::BorneLido(std::size_t lugar, const CEItemLista& item,
                                   const BornesLidos::Referencia*& referencia) {
    referencia = nullptr;
    if (item.ids.empty()) return false;
    // A reader whose hooks told nothing asks the block name. Else only a block reference
    // the walk read can be a terminal.
    if (!ladosVistos_) return EhBorne(item.ids.front());
    referencia = bornesLidos_.Eh(lugar, item);
    return referencia != nullptr;
}

void CCExportDataReader::LerLadoFim(CEItemLista& item, const OdDbObjectId& entidade,
                                    CETemplate& modelo) {
    if (!ladosAdiados_) AoLigarFim(item, entidade, &modelo);
}

void CCExportDataReader::AoLigarInicio(CEItemLista& item, const OdDbObjectId& entidade,
                                       CETemplate* modelo) {
    AoLigar(item, entidade, modelo, true);
}

void CCExportDataReader::AoLigarFim(CEItemLista& item, const OdDbObjectId& entidade,
                                    CETemplate* modelo) {
    AoLigar(item, entidade, modelo, false);
}

QString CCExportDataReader::VizinhoPorLigacao(const QString& fio, const QString& proprio,
                                              const QString& ligacao, bool anteriorPrimeiro) const {
    const auto completas = ListaConexoesCompletas(fio);
    if (!completas) return {};
    const auto handle = [&](qsizetype i) { return completas->at(i).section('#', 0, 0); };
    for (qsizetype i = 0; i < completas->size(); ++i) {
        if (handle(i) != proprio || completas->at(i).section('#', 1, 1) != ligacao) continue;
        const qsizetype antes = i - 1, depois = i + 1;
        for (const qsizetype j :
             anteriorPrimeiro ? std::array{antes, depois} : std::array{depois, antes})
            if (j >= 0 && j < completas->size() && handle(j) != proprio) return handle(j);
        return {};
    }
    return {};
}

// An end of a wire that stands on a terminal, or a side of the terminal itself: the
// element wired there under the first suffix, the wire at the terminal's other point under
// the second, and the relation of the end composed.
void CCExportDataReader::AoLigar(CEItemLista& item, const OdDbObjectId& entidade,
                                 CETemplate* modelo, bool inicio, bool borne,
                                 const BornesLidos::Referencia* referencia) {
    // What the first side of a terminal left for its second side counts for the very next
    // call only.
    const PrimeiroLado primeiro = std::exchange(primeiroLado_, PrimeiroLado{});
    if (entidade.isNull() || !(borne || EhBorne(entidade))) return;
    // An inverted wire keeps its ends; any other wire has them the other way round.
    const bool invertido = CCBorneDataReader::Invertido(item);
    static const QString kIni = QStringLiteral("_INI"), kFim = QStringLiteral("_FIM"),
                         kSegIni = QStringLiteral("_SEGINI"), kSegFim = QStringLiteral("_SEGFIM"),
                         kEquipo = QStringLiteral("KVR_ZV_EQUIPO");
    const QString& sufixo = inicio == invertido ? kIni : kFim;
    const QString& segundo = inicio == invertido ? kSegFim : kSegIni;
    const bool doBorne = !item.ids.empty() && item.ids.front() == entidade;
    // The terminal's own handle: a terminal's side asks for it only at an equipment.
    std::optional<QString> handleProprio;
    const auto proprio = [&]() -> const QString& {
        if (!handleProprio) handleProprio = ZVString::DeHandle(entidade.handle());
        return *handleProprio;
    };

    CEPonto ponto, outro;
    QString fio, conectado;
    std::optional<CCBorneDataReader::LadoBorne> lado;
    // The second side of a terminal finds its points and kind where the first left them.
    const bool segundoLado = doBorne && !inicio && primeiro.De(item, entidade);
    bool equipamento = false;
    if (doBorne) {
        // The terminal's own side: the insertion point for the first hook, the cut point
        // for the second, looked at as the terminal list does. The first side takes the
        // points and layer the walk read, as the second side takes them from the first.
        std::optional<CCBorneDataReader::LadoBorne> lido;
        if (!segundoLado && referencia) {
            lido.emplace();
            lido->ponto = inicio ? referencia->corte : referencia->insercao;
            lido->outro = inicio ? referencia->insercao : referencia->corte;
            lido->layer = referencia->layer;
        }
        lado = CCBorneDataReader::AchaLado(*this, entidade, inicio,
                                           segundoLado ? &*primeiro.lado
                                           : lido      ? &*lido
                                                       : nullptr);
        equipamento = segundoLado  ? primeiro.equipamento
                      : referencia ? referencia->equipamento
                                   : CICad::TemXData(entidade, kEquipo);
        if (inicio) primeiroLado_ = PrimeiroLado{&item, entidade, lado, equipamento, false};
        if (lado->vizinho.isEmpty()) return;
        ponto = lado->ponto;
        outro = lado->outro;
        fio = lado->numeroFio;
        conectado = lado->vizinho.toString();
    } else {
        // The terminal is met where this wire touches it, which may be its cut point.
        const QString campo = CampoFio(item);
        fio = campo.isEmpty() ? QString() : item.valorCampo(campo);
        const auto elementos = ListaConexoes(fio);
        const CEPonto p = CICad::GetPosicao(entidade);
        const CEPonto q = PontoDeCorte(entidade);
        ponto = elementos && elementos->contains(proprio()) ? PontoDaConexao(fio, proprio()) : p;
        const auto distancia = [](const CEPonto& a, const CEPonto& b) {
            return std::hypot(a.x - b.x, a.y - b.y, a.z - b.z);
        };
        outro = distancia(ponto, p) <= distancia(ponto, q) ? q : p;
        conectado = VizinhoNaConexao(entidade, ponto, true);
        if (conectado.isEmpty()) conectado = VizinhoNaConexao(entidade, ponto, false);
        equipamento = CICad::TemXData(entidade, kEquipo);
    }
    // An equipment's points may lie closer together than a wire's catch: its connection
    // name tells which of its entries on the wire this end is.
    if (equipamento) {
        const zv::CEAtributo* propria = ConexaoProxima(entidade, ponto);
        if (propria && !propria->GetValor().isEmpty()) {
            const QString achado =
                VizinhoPorLigacao(fio, proprio(), propria->GetValor(), doBorne ? !inicio : true);
            if (!achado.isEmpty()) conectado = achado;
        }
    }
    // A terminal's side found the element of its neighbour's handle already, in the drawing
    // the handle is looked up in.
    const bool elementoAchado = lado && !lado->elemento.isNull() &&
                                TabelaConexoes::Iguais(conectado, lado->vizinho) &&
                                lado->elemento.database() == CICad::GetDatabase();
    const OdDbObjectId objeto = elementoAchado ? lado->elemento : CICad::IdDoHandle(conectado);
    if (doBorne && objeto.isNull()) return;
    QString ligacao;
    NomesRelacao*& guardados = &sufixo == &kIni ? nomesIni_ : nomesFim_;
    if (!guardados) guardados = &Nomes(sufixo);
    NomesRelacao& nomes = *guardados;
    if (!objeto.isNull()) {
        // The relation the wire reader composed for this end is no field of the object:
        // a terminal, which has no relation, is told by its strip and number instead.
        for (NomeCampo& nome : nomes.relacoes)
            item.definirCampo(nome.ParaDefinir(), QString());
        CopiaAtributos(sufixo, item, conectado, objeto);
        // After the copy: an element it read for the first time lends its attributes to
        // the connection's question. A terminal's side found the element's point already.
        const bool mesmoVizinho = lado && TabelaConexoes::Iguais(conectado, lado->vizinho);
        const zv::CEAtributo* atributo = ConexaoProxima(
            objeto, mesmoVizinho ? lado->pontoElemento : PontoDaConexao(fio, conectado));
        if (atributo) ligacao = atributo->GetValor();
    }
    // The wire at the terminal's other point; a terminal's side reads the wires of both its
    // points, as the terminal list does, the other one under the second suffix.
    if (lado) {
        // Both sides read the same two wires under the same suffixes: when the first side
        // read them, the second finds them on the item.
        const bool lidos = segundoLado && primeiro.fiosLidos;
        if (!lidos) {
            const std::optional<OdDbObjectId> outro =
                CCBorneDataReader::LeFiosLado(*this, item, entidade, *lado, inicio, modelo);
            // The second side's point is the first side's other point.
            if (inicio && primeiroLado_.lado) primeiroLado_.lado->fioOutro = outro;
        }
        if (inicio && lado->fioNumerado) primeiroLado_.fiosLidos = true;
    } else {
        const OdDbObjectId fioOutro = FioNoPonto(CICad::GetLayerEntidade(entidade), outro);
        if (!fioOutro.isNull())
            CopiaAtributos(segundo, item, ZVString::DeHandle(fioOutro.handle()));
    }
    // The terminal's side names the element by the handle its fields came from.
    CompoeRelacao(nomes, item, modelo, ligacao, doBorne ? QString() : proprio());
}

void CCExportDataReader::CopiaAtributos(const QString& sufixo, CEItemLista& item,
                                        const QString& handle) {
    CopiaAtributos(sufixo, item, handle, CICad::IdDoHandle(handle));
}

void CCExportDataReader::CopiaAtributos(const QString& sufixo, CEItemLista& item,
                                        const QString& handle, const OdDbObjectId& id) {
    QString alvo = handle;
    if (id.isNull()) return;
    const std::string_view nome = CICad::NomeBlocoUtf8(id);
    // A contact or a terminal speaks for its component, when the reader listed it.
    static constexpr std::string_view kContatos[] = {"NA-", "NF-", "BT-", "NAF-", "BOR-"};
    for (const std::string_view prefixo : kContatos) {
        if (!ComecaCom(nome, prefixo)) continue;
        for (int idioma = 1; idioma <= 3; ++idioma) {
            const std::unique_ptr<zv::CEAtributo> relacao =
                CICad::GetAtributo(CICad::TagTraduzida(CampoTraduzido::Relacao, idioma), id);
            if (!relacao || relacao->GetValor().isEmpty()) continue;
            const QString dono = relacoesComponentes_.value(relacao->GetValor());
            if (!dono.isEmpty()) alvo = dono;
            break;
        }
        break;
    }
    const OdDbObjectId final = alvo == handle ? id : CICad::IdDoHandle(alvo);
    if (!final.isNull()) CopiaEntidade(sufixo, item, final, nullptr);
}

CCExportDataReader::Composicao CCExportDataReader::LeComposicao(CETemplate* modelo) {
    Composicao c;
    if (modelo) {
        c.sep = modelo->LerTexto("*CHAR_SEP_STD_CFG*");
        c.relacaoPrimeiro = modelo->LerTexto("*ORDEM_CONCAT_STD*") == "1";
    } else {
        c.sep = CICad::GetStringLisp("*EXPORT_CHAR_SEP*");
        c.relacaoPrimeiro = CICad::GetStringLisp("*EXPORT_ORDEM_REL*") == "1";
    }
    return c;
}

void CCExportDataReader::CompoeRelacao(const QString& sufixo, CEItemLista& item, CETemplate* modelo,
                                       const QString& ligacao, const QString& handle) {
    CompoeRelacao(Nomes(sufixo), item, modelo, ligacao, handle);
}

void CCExportDataReader::CompoeRelacao(NomesRelacao& nomes, CEItemLista& item, CETemplate* modelo,
                                       const QString& ligacao, const QString& handle) {
    const QString r = Primeiro(item, nomes.relacoes);
    const QString a = Primeiro(item, nomes.reguas);
    const QString n = Primeiro(item, nomes.numeros);
    const QString& g = ligacao;
    // Within a read the separator and order are read once for its template.
    if (lendo_ && (!composicao_ || modeloComposicao_ != modelo)) {
        composicao_ = LeComposicao(modelo);
        modeloComposicao_ = modelo;
    }
    const Composicao composicao = lendo_ ? *composicao_ : LeComposicao(modelo);
    const QString& sep = composicao.sep;
    const bool relacaoPrimeiro = composicao.relacaoPrimeiro;
    // Strip before number is both REL of a terminal and, in that order, its relation: the
    // text is made once.
    const QString reguaNumero = r.isEmpty() ? a + sep + n : QString();
    item.definirCampo(nomes.rel.ParaDefinir(), r.isEmpty() ? reguaNumero : r);
    item.definirCampo(nomes.lig.ParaDefinir(), g);
    if (!handle.isEmpty()) item.definirCampo(nomes.handle.ParaDefinir(), handle);
    // A terminal has no relation of its own: strip and number stand for it, over the one
    // with the connection.
    std::optional<QString> relacao;
    if (!a.isEmpty() && !n.isEmpty() && r.isEmpty())
        relacao = relacaoPrimeiro ? reguaNumero : n + sep + a;
    else if (!g.isEmpty())
        relacao = relacaoPrimeiro ? r + sep + g : g + sep + r;
    if (!relacao) return;
    for (NomeCampo& campo : nomes.relacoes)
        item.definirCampo(campo.ParaDefinir(), *relacao);
}

QString CCExportDataReader::PromptCampo(const QString& tag, bool web) {
    CEConexaoCatalogo* catalogo = CEConexaoCatalogo::ObterCatalogo();
    if (!catalogo) return tag;
    QString campo = tag;
    campo.replace('\'', "''");
    const QString sql =
        web ? QString("SELECT WDIC_PROMP FROM BDWDIC WHERE WDIC_FIELD='" + campo + "'")
            : QString("SELECT DIC_PROMPT FROM BDDIC WHERE DIC_FIELD='" + campo + "'");
    const CERegistrosCatalogo resposta = catalogo->Consultar(sql);
    const QString texto = resposta.Valor(0, 0).trimmed();
    return texto.isEmpty() ? tag : texto;
}
