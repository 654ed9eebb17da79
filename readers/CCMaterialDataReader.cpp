#include "CCMaterialDataReader.h"

#include "CEAtributo.h"
#include "Descarte.h"
#include "lists/CCMaterialGrfWriter.h"
#include "lists/CETemplate.h"
#include "module/CIProgress.h"

#include <array>
#include <cstdint>
#include <optional>
#include <unordered_map>

namespace {

// The facade's default database is this one while a drawing other than the active one
// is read.
class DatabaseLida {
public:
    explicit DatabaseLida(zvdb::Database* database) : anterior_(nullptr) {
        if (database && database != CICad::GetDatabase()) {
            CICad::SetDatabaseOverride(database);
            trocada_ = true;
        }
    }
    ~DatabaseLida() {
        if (trocada_) CICad::SetDatabaseOverride(anterior_);
    }
    DatabaseLida(const DatabaseLida&) = delete;
    DatabaseLida& operator=(const DatabaseLida&) = delete;

private:
    zvdb::Database* anterior_;
    bool trocada_ = false;
};

bool Listado(const CEItemLista& item, CETemplate& modelo) {
    const QString* lista = item.campos.procura(NumeroCampo<"ZV_LISTA">());
    return lista && *lista == QLatin1String("S") && modelo.FiltraItem(item);
}

// The fields that name a wire, in the order they are looked at; FIO, the name the project
// format writes, after the three others. Made once: every wire and segment asks.
const std::array<QString, 4>& CamposNomeFio() {
    static const std::array<QString, 4> campos = {QStringLiteral("CABO"), QStringLiteral("WIRE"),
                                                  QStringLiteral("ALAMBRE"), QStringLiteral("FIO")};
    return campos;
}

// A wire's name.
QString NomeDoFio(const CEItemLista& item) {
    for (const QString& campo : CamposNomeFio())
        if (const QString* valor = item.campo(campo)) {
            const QString nome = valor->trimmed();
            if (!nome.isEmpty()) return nome;
        }
    return {};
}

}  // namespace

void CCMaterialDataReader::LerLadoIni(CEItemLista&, const OdDbObjectId&, CETemplate&) {}

void CCMaterialDataReader::LerLadoFim(CEItemLista&, const OdDbObjectId&, CETemplate&) {}

CCMaterialDataReader::Simbolos CCMaterialDataReader::LeSimbolos(CETemplate& modelo) const {
    Simbolos s;
    s.selecaoPaginas = modelo.LerLogico("*SELECAO_PAG_MATTABLE*");
    s.bornes = modelo.LerLogico("PBLCTOBORNE");
    s.fontes = modelo.LerTexto("PROC_SIMB_BARR");
    s.aceOrfaos = modelo.LerLogico("PBLACEORF");
    s.vinculos = modelo.LerInteiro("*IMP_VINCL*");
    return s;
}

VetorItens* CCMaterialDataReader::LerDados(zvdb::Database* database,
                                           const std::optional<QStringList>& paginas,
                                           CETemplate& modelo, CIProgress& progresso) {
    // A solution project that no file answered for has nothing to read.
    if (!database) return nullptr;
    // The product's LISP side answers for the active drawing only.
    const bool ativa = database == CICad::GetDatabase();
    DatabaseLida lida(database);
    resultado_.clear();
    vistos_.clear();
    relacoes_.clear();
    conectores_.clear();
    // A wire's copies ask for what was read for it just before, and nothing later asks
    // again: a few readings kept are enough (the exports, which read wires' ends all over,
    // keep theirs).
    LimitaEntidadesGuardadas(2048);
    progresso.Definir(10);
    simbolos_ = LeSimbolos(modelo);
    // Accessories are expanded from what each symbol's reading kept.
    GuardaAcessorios = simbolos_.vinculos != 0;
    const QString& f = simbolos_.fontes;
    if (f == "1" || f == "3") {
        LeBlocos(database, paginas, modelo, progresso);
        if (!simbolos_.selecaoPaginas) LeVirtuais(database, modelo);
        LePinos(database, modelo);
    }
    progresso.Definir(70);
    // Wires come from the LISP side, which knows only the active drawing: a drawing read
    // beside it gives its symbols and cables, not its wires.
    if ((f == "2" || f == "3") && ativa) LeFios(database, paginas, modelo);
    progresso.Definir(90);
    if (f == "4" || f == "3") {
        std::unique_ptr<VetorItens> cabos(LeDicionarioCabos(database));
        for (CEItemLista* cabo : *cabos)
            Guarda(cabo);
    }
    // The entities are read: what was kept of them goes while the items are grouped, and the
    // accessories expanded next take its memory.
    LiberaReferencias();
    LiberaLeiturasDeEntidades();
    Descarte::Largar(vistos_);
    Descarte::Largar(relacoes_);
    Descarte::Largar(conectores_);
    Agrupa(resultado_, modelo);
    resultado_.ordenar(modelo.LerListaTexto("*LISTA_DE_SORT*"));
    if (modelo.LerTexto("*ORDEM_CRESCENTE*") != "C") resultado_.inverter();
    if (simbolos_.vinculos == 1) IntercalaAcessorios(modelo);
    progresso.Definir(100);
    auto* itens = new VetorItens(std::move(resultado_));
    resultado_.clear();
    return itens;
}

bool CCMaterialDataReader::Adiciona(CEItemLista* item, bool barramento) {
    if (barramento) {
        const QString relacao = item->valorCampo("RELACAO");
        const bool nova = !relacoes_.contains(relacao);
        relacoes_.insert(relacao);
        if (!nova) return false;
    }
    Guarda(item);
    return true;
}

std::size_t CCMaterialDataReader::FolgaDosCampos(const CamposItem& campos) const {
    return CCMaterialGrfWriter::SomasAusentes(campos);
}

void CCMaterialDataReader::Guarda(CEItemLista* item) {
    // Kept items give back their arrays' spare room from the start, but for the sums: a large
    // list holds millions.
    item->campos.compactar(FolgaDosCampos(item->campos));
    // The symbols of a block come in a row: the next one's fields are made in as much room,
    // and most often need not move here.
    if (PreveCampos) CamposPrevistos = item->campos.todos().capacity();
    resultado_.push_back(item);
}

void CCMaterialDataReader::AdicionaAcessorios(CEItemLista& item, CETemplate& modelo) {
    // Accessories are new items: nothing of them can be in the result yet.
    for (CEItemLista* acessorio : ExpandeAcessorios(item, nullptr, &modelo, {}, QString()))
        Guarda(acessorio);
}

const QHash<QString, std::vector<OdDbObjectId>>& CCMaterialDataReader::ReferenciasPorBloco(
    zvdb::Database* database) {
    const std::uint64_t versao = CICad::VersaoDesenho(database);
    if (!referencias_.lidas || referencias_.desenho != database || referencias_.versao != versao) {
        referencias_.porBloco = CICad::GetReferenciasPorBloco(database);
        referencias_.desenho = database;
        referencias_.versao = versao;
        referencias_.lidas = true;
    }
    return referencias_.porBloco;
}

void CCMaterialDataReader::LiberaReferencias() {
    referencias_ = Referencias{};
}

void CCMaterialDataReader::LeBlocos(zvdb::Database* database,
                                    const std::optional<QStringList>& paginas, CETemplate& modelo,
                                    CIProgress& progresso) {
    const auto blocos = CICad::GetBlocos(database);
    const auto& referencias = ReferenciasPorBloco(database);
    const OdDbObjectId modelSpace = CICad::GetModelSpace(database);
    std::optional<QSet<QString>> layers;
    if (simbolos_.selecaoPaginas && paginas)
        layers = QSet<QString>(paginas->begin(), paginas->end());
    const int n = std::max<int>(1, int(blocos.size()));
    int feitos = 0;
    for (const auto& [nomeBloco, id] : blocos) {
        progresso.Definir(10 + 60 * ++feitos / n);
        const QString nome = nomeBloco.toUpper();
        if (nome.startsWith('*')) continue;
        if (nome.startsWith("BOR-") && !simbolos_.bornes) continue;
        if (nome.startsWith("PIN-")) continue;
        const bool barramento = nome.startsWith("BUS");
        for (const OdDbObjectId& ref : referencias.value(nome)) {
            OdDbObjectId entidade = ref;
            if (simbolos_.selecaoPaginas) {
                entidade = CICad::GetSimboloMestre(database, ref);
                if (entidade.isNull()) continue;
            }
            const std::uint64_t handle = entidade.handle();
            if (vistos_.count(handle)) continue;
            if (CICad::EhReferencia(entidade) && CICad::GetDono(entidade) != modelSpace) continue;
            if (layers && !layers->contains(CICad::GetLayerEntidade(ref))) continue;
            CEItemLista* item = CriaItemBloco(entidade, modelo);
            if (!item) continue;
            if (Listado(*item, modelo)) {
                vistos_.insert(handle);
                if (!Adiciona(item, barramento)) {
                    delete item;
                    continue;
                }
                SimboloGuardado(*item);
                if (simbolos_.vinculos == 2) AdicionaAcessorios(*item, modelo);
            } else {
                if (simbolos_.aceOrfaos && simbolos_.vinculos != 0)
                    AdicionaAcessorios(*item, modelo);
                delete item;
            }
        }
    }
}

void CCMaterialDataReader::LeVirtuais(zvdb::Database* database, CETemplate& modelo) {
    for (const auto& [nome, id] : CICad::GetEntradasDicionario({"ESQ_VIRTUAL_ZV"}, database)) {
        const std::uint64_t handle = id.handle();
        if (vistos_.count(handle)) continue;
        CEItemLista* item = CriaItemVirtual(id);
        if (!item) continue;
        if (!Listado(*item, modelo)) {
            delete item;
            continue;
        }
        vistos_.insert(handle);
        if (!Adiciona(item, item->valorCampo("RELACAO").startsWith("BUS"))) {
            delete item;
            continue;
        }
        if (simbolos_.vinculos == 2) AdicionaAcessorios(*item, modelo);
    }
}

void CCMaterialDataReader::LePinos(zvdb::Database* database, CETemplate& modelo) {
    const auto& referencias = ReferenciasPorBloco(database);
    const OdDbObjectId modelSpace = CICad::GetModelSpace(database);
    for (const auto& [nomeBloco, id] : CICad::GetBlocos(database)) {
        const QString nome = nomeBloco.toUpper();
        if (!nome.startsWith("PIN-")) continue;
        for (const OdDbObjectId& ref : referencias.value(nome)) {
            if (CICad::GetDono(ref) != modelSpace) continue;
            std::unique_ptr<zv::CEAtributo> conector;
            for (const char* tag : {"CONECTOR", "CONNECTOR", "CONECTOR"})
                if ((conector = CICad::GetAtributo(tag, ref))) break;
            const CEListaXData pino = CICad::GetXData(ref, "ZV_PINO");
            if (!conector || pino.size() < 4) continue;
            const QString nomeConector = pino[0].texto;
            if (conectores_.contains(nomeConector)) continue;
            conectores_.insert(nomeConector);
            CEItemLista* item = CriaItemChave(nomeConector, pino[1].texto, pino[2].texto);
            if (Listado(*item, modelo))
                Guarda(item);
            else
                delete item;
        }
    }
}

void CCMaterialDataReader::LeFios(zvdb::Database* database,
                                  const std::optional<QStringList>& paginas, CETemplate& modelo) {
    QString desenho = CICad::GetNomeDesenho(database);
    if (desenho.isEmpty()) desenho = CICad::GetStringLisp("SAVENAME");
    zvsdk::ResultBuffer* chamada = zvsdk::newString("getListaFiosProj");
    zvsdk::ResultBuffer* cauda = chamada->rbnext = zvsdk::newString(desenho);
    if (paginas)
        for (const QString& pagina : *paginas)
            cauda = cauda->rbnext = zvsdk::newString(pagina);
    zvsdk::ResultBuffer* resposta = CICad::InvokeChain(chamada);
    zvsdk::releaseChain(chamada);
    std::vector<OdDbObjectId> fios;
    for (const zvsdk::ResultBuffer* no = resposta; no; no = no->rbnext)
        if (no->restype == zvsdk::RTSTR) {
            const OdDbObjectId id = CICad::IdDoHandle(no->rstring, database);
            if (!id.isNull()) fios.push_back(id);
        }
    CICad::LiberaLista(resposta);
    // Every polyline of each wire by the wire's name: the wires of each page, asked once.
    std::unordered_map<QString, std::vector<OdDbObjectId>> segmentos;
    for (const QString& layer : CICad::GetLayers(database)) {
        zvsdk::ResultBuffer* lista = CICad::zvInvokeLista("getFiosPorLayer", {layer});
        for (const zvsdk::ResultBuffer* no = lista; no; no = no->rbnext) {
            if (no->restype != zvsdk::RTSTR) continue;
            const OdDbObjectId id = CICad::IdDoHandle(no->rstring, database);
            if (!id.isNull()) segmentos[NomeDoFioNoXData(id)].push_back(id);
        }
        CICad::LiberaLista(lista);
    }
    static const QString kIni = QStringLiteral("_INI"), kFim = QStringLiteral("_FIM");
    const std::uint32_t campoLista = NumeroCampo<"WIRE_LISTA">();
    QSet<QString> nomes;
    // Each wire is made and copied in one go: the readings its copies take were made
    // just before, and a wire not kept goes at once.
    for (const OdDbObjectId& fio : fios) {
        std::unique_ptr<CEItemLista> item(CriaItemFio(fio, modelo));
        if (!item) continue;
        const QString* lista = item->campos.procura(campoLista);
        const bool listado = lista && *lista == QLatin1String("S");
        if (!listado || !modelo.FiltraItem(*item)) continue;
        const QString nome = NomeDoFio(*item);
        if (nome.isEmpty() || nomes.contains(nome)) continue;
        nomes.insert(nome);
        const auto achadas = segmentos.find(nome);
        if (achadas == segmentos.end() || achadas->second.empty()) continue;
        const std::vector<OdDbObjectId>& partes = achadas->second;
        // The wire's own fields start every stretch after the first: kept only for those.
        std::optional<CEItemLista> reserva;
        if (partes.size() > 2) reserva = *item;
        CEItemLista* atual = item.get();
        CopiaEntidade(kIni, *atual, partes.front(), &modelo);
        for (size_t s = 1; s < partes.size(); ++s) {
            CopiaEntidade(kFim, *atual, partes[s], &modelo);
            if (s + 1 == partes.size()) break;
            auto* seguinte = new CEItemLista;
            seguinte->campos = reserva->campos;
            seguinte->ids = reserva->ids;
            CopiaEntidade(kIni, *seguinte, partes[s], &modelo);
            atual->ligado = seguinte;
            atual = seguinte;
        }
        Guarda(item.release());
    }
}

void CCMaterialDataReader::Agrupa(VetorItens& itens, CETemplate& modelo) {
    const QStringList quebra = modelo.LerListaTexto("*ZV_CHAVE_QUEBRA_PAGINA*");
    const QStringList grupo = modelo.LerListaTexto("PBLLSTAGRUPAMENTO");
    if (grupo.isEmpty()) return;
    itens.ordenar(grupo + modelo.LerListaTexto("*LISTA_DE_SORT*"));
    if (grupo.size() == 1 && quebra.isEmpty()) return AgrupaVizinhos(itens, grupo.front());
    // The fields that make two items one material, joined with a separator no field holds.
    auto chave = [&](const CEItemLista& item) {
        QString texto;
        for (const QStringList* campos : {&grupo, &quebra})
            for (const QString& campo : *campos) {
                texto += item.valorCampo(campo);
                texto += QChar(0x1F);
            }
        return texto;
    };
    // Per material its head and the last member of its chain, so joining costs no walk.
    struct Grupo {
        CEItemLista* ultimo;
    };
    std::unordered_map<QString, Grupo> grupos;
    VetorItens cabecas;
    cabecas.reserve(itens.size());
    for (CEItemLista* item : itens) {
        if (!item) continue;
        CEItemLista* fim = item;
        while (fim->ligado)
            fim = fim->ligado;
        auto [it, novo] = grupos.try_emplace(chave(*item), Grupo{fim});
        if (novo) {
            cabecas.push_back(item);
        } else {
            it->second.ultimo->ligado = item;
            it->second.ultimo = fim;
        }
    }
    itens = std::move(cabecas);
}

void CCMaterialDataReader::AgrupaVizinhos(VetorItens& itens, const QString& campo) {
    // Sorted by the field first, the items of one value lie side by side.
    const std::uint32_t numero = CamposItem::numeroSeHouver(campo);
    auto valor = [numero](const CEItemLista& item) -> const QString& {
        static const QString kVazio;
        const QString* achado =
            numero == CamposItem::kSemNome ? nullptr : item.campos.procura(numero);
        return achado ? *achado : kVazio;
    };
    VetorItens cabecas;
    cabecas.reserve(itens.size());
    CEItemLista* ultimo = nullptr;
    for (CEItemLista* item : itens) {
        if (!item) continue;
        if (!cabecas.empty() && valor(*item) == valor(*cabecas.back()))
            ultimo->ligado = item;
        else
            cabecas.push_back(item);
        for (ultimo = item; ultimo->ligado;)
            ultimo = ultimo->ligado;
    }
    itens = std::move(cabecas);
}

void CCMaterialDataReader::IntercalaAcessorios(CETemplate& modelo) {
    VetorItens resultado;
    resultado.reserve(resultado_.size());
    for (CEItemLista* item : resultado_) {
        resultado.push_back(item);
        if (!item) continue;
        VetorItens acessorios;
        for (CEItemLista* membro = item; membro; membro = membro->ligado)
            for (CEItemLista* a : ExpandeAcessorios(*membro, nullptr, &modelo, {}, QString()))
                acessorios.push_back(a);
        Agrupa(acessorios, modelo);
        resultado.insert(resultado.end(), acessorios.rbegin(), acessorios.rend());
    }
    resultado_ = std::move(resultado);
}
