#include "CCCaboDataReader.h"

#include "CEAtributo.h"
#include "module/CIProgress.h"

#include <algorithm>
#include <cmath>
#include <span>
#include <unordered_map>

namespace {

bool Preenchido(const CEItemLista& item, const QString& campo) {
    return !item.valorCampo(campo).isEmpty();
}

}  // namespace

// The crossing window of the host: an entity is selected when its box touches the window
// and its layer is shown. The boxes are read once per run into a grid per layer, so that a
// window costs a few cells instead of a walk of the model space.
struct CCCaboDataReader::Janela {
    static constexpr double kCelula = 20.0;
    static constexpr std::int64_t kMaxCelulas = 256;

    struct Entrada {
        OdDbObjectId id;
        CEPonto minimo, maximo;
    };
    // The cells of a layer in flat arrays: the occupied cells' keys ascending, and the
    // entries of the i-th from inicios[i] to inicios[i + 1] in membros.
    struct Grade {
        QString layer;
        std::vector<std::uint32_t> grandes;  // boxes over too many cells, always tested
        std::vector<std::pair<std::int64_t, std::uint32_t>> pares;  // while being filled
        std::vector<std::int64_t> chaves;
        std::vector<std::uint32_t> inicios, membros;

        void Fecha() {
            std::sort(pares.begin(), pares.end());
            membros.reserve(pares.size());
            for (const auto& [chave, k] : pares) {
                if (chaves.empty() || chaves.back() != chave) {
                    chaves.push_back(chave);
                    inicios.push_back(std::uint32_t(membros.size()));
                }
                membros.push_back(k);
            }
            inicios.push_back(std::uint32_t(membros.size()));
            std::vector<std::pair<std::int64_t, std::uint32_t>>().swap(pares);
        }
        std::span<const std::uint32_t> Membros(std::int64_t chave) const {
            const auto achada = std::lower_bound(chaves.begin(), chaves.end(), chave);
            if (achada == chaves.end() || *achada != chave) return {};
            const size_t i = size_t(achada - chaves.begin());
            return {membros.data() + inicios[i], membros.data() + inicios[i + 1]};
        }
    };

    zvdb::Database* database;
    std::vector<Entrada> entradas;  // drawing order
    std::vector<Grade> grades;
    std::uint64_t versao = 0;
    bool lida = false;
    std::vector<size_t> visiveis;  // the grades of the layers shown
    QHash<QString, size_t> porLayer;
    std::unordered_map<std::string_view, size_t> porGrafia;  // while being filled

    static std::int64_t Coluna(double v) { return std::int64_t(std::floor(v / kCelula)); }
    static std::int64_t Celula(std::int64_t cx, std::int64_t cy) {
        return std::int64_t(std::uint64_t(cx) << 32 ^ (std::uint64_t(cy) & 0xffffffffu));
    }

    // Filled by Acrescenta, in drawing order, then closed by Fecha.
    explicit Janela(zvdb::Database* db) : database(db) {}

    // Only block references are taken: the sides read nothing else the window selects.
    void Acrescenta(const CICad::EntidadeVista& vista) {
        if (!vista.referenciaComCaixa) return;
        const Entrada e{vista.id, vista.minimo, vista.maximo};
        // A page's entities share a layer: each spelling of a name is made an upper-case text
        // once.
        const auto [grafia, nova] = porGrafia.try_emplace(vista.layer, 0);
        if (nova)
            grafia->second =
                GradeDe(QString::fromUtf8(vista.layer.data(), int(vista.layer.size())).toUpper());
        Inclui(grades[grafia->second], std::uint32_t(entradas.size()), e);
        entradas.push_back(e);
    }

    void Fecha() {
        for (Grade& grade : grades)
            grade.Fecha();
        std::unordered_map<std::string_view, size_t>().swap(porGrafia);
    }

    // The grade of a layer by its upper-case name, made when new.
    size_t GradeDe(const QString& layer) {
        auto onde = porLayer.find(layer);
        if (onde == porLayer.end()) {
            onde = porLayer.insert(layer, grades.size());
            grades.emplace_back().layer = layer;
        }
        return *onde;
    }

    void Inclui(Grade& grade, std::uint32_t k, const Entrada& e) {
        const double largura = (e.maximo.x - e.minimo.x) / kCelula + 1;
        const double altura = (e.maximo.y - e.minimo.y) / kCelula + 1;
        if (!std::isfinite(largura * altura) || largura * altura > double(kMaxCelulas)) {
            grade.grandes.push_back(k);
            return;
        }
        for (std::int64_t cx = Coluna(e.minimo.x); cx <= Coluna(e.maximo.x); ++cx)
            for (std::int64_t cy = Coluna(e.minimo.y); cy <= Coluna(e.maximo.y); ++cy)
                grade.pares.emplace_back(Celula(cx, cy), k);
    }

    // Layers are frozen and thawed by page swaps: the shown ones are taken again whenever
    // the drawing changed behind the reader's back.
    void AtualizaVisiveis() {
        const std::uint64_t agora = CICad::VersaoDesenho(database);
        if (lida && agora == versao) return;
        lida = true, versao = agora;
        visiveis.clear();
        for (size_t g = 0; g < grades.size(); ++g)
            if (!CICad::LayerCongelado(grades[g].layer, database)) visiveis.push_back(g);
    }

    // After a page swap of the reader's own only the layers it touched are looked at again,
    // so that a project of thousands of pages is not walked at every swap. The shown layers
    // must have been up to date before the swap.
    void Reavalia(const QStringList& layers) {
        for (const QString& layer : layers) {
            const auto onde = porLayer.constFind(layer.toUpper());
            if (onde == porLayer.constEnd()) continue;
            const auto lugar = std::find(visiveis.begin(), visiveis.end(), *onde);
            const bool mostrado = !CICad::LayerCongelado(grades[*onde].layer, database);
            if (mostrado && lugar == visiveis.end()) visiveis.push_back(*onde);
            if (!mostrado && lugar != visiveis.end()) visiveis.erase(lugar);
        }
        versao = CICad::VersaoDesenho(database);
    }

    std::vector<OdDbObjectId> Seleciona(const CEPonto& a, const CEPonto& b) {
        AtualizaVisiveis();
        std::vector<std::uint32_t> achados;
        for (size_t g : visiveis) {
            const Grade* grade = &grades[g];
            achados.insert(achados.end(), grade->grandes.begin(), grade->grandes.end());
            for (std::int64_t cx = Coluna(a.x); cx <= Coluna(b.x); ++cx)
                for (std::int64_t cy = Coluna(a.y); cy <= Coluna(b.y); ++cy) {
                    const std::span<const std::uint32_t> celula = grade->Membros(Celula(cx, cy));
                    achados.insert(achados.end(), celula.begin(), celula.end());
                }
        }
        std::sort(achados.begin(), achados.end());
        achados.erase(std::unique(achados.begin(), achados.end()), achados.end());
        std::vector<OdDbObjectId> ids;
        for (std::uint32_t k : achados) {
            const Entrada& e = entradas[k];
            if (e.maximo.x >= a.x && e.minimo.x <= b.x && e.maximo.y >= a.y && e.minimo.y <= b.y)
                ids.push_back(e.id);
        }
        return ids;
    }
};

CCCaboDataReader::CCCaboDataReader() = default;

CCCaboDataReader::~CCCaboDataReader() {
    registros_.destruirItens();
    removidos_.destruirItens();
}

void CCCaboDataReader::CarregaCabos(zvdb::Database* database) {
    registros_.destruirItens();
    cabos.clear();
    ligacoes.clear();
    std::unique_ptr<VetorItens> registros(LeDicionarioCabos(database));
    for (CEItemLista* registro : *registros) {
        registros_.push_back(registro);
        cabos.insert(registro->valorCampo("HANDLE"), registro);
    }
}

QString CCCaboDataReader::HandleDoCabo(const OdDbObjectId& condutor) {
    const CEListaXData itens = CICad::GetXData(condutor, "KVR_ZV_CABO");
    return itens.size() >= 2 ? itens[1].texto : QString();
}

QString CCCaboDataReader::NomeDoCabo(const CEItemLista& item) {
    for (const char* campo : {"CABO", "CABLE"}) {
        const QString valor = item.valorCampo(campo);
        if (!valor.isEmpty()) return valor;
    }
    return {};
}

// An item for the core that `condutor` draws, made for `entidade` (the lead itself or a
// blind connection standing for it); null when the lead's cable is not listed.
CEItemLista* CCCaboDataReader::NovoCondutor(const OdDbObjectId& condutor,
                                            const OdDbObjectId& entidade) {
    const CEItemLista* cabo = cabos.value(HandleDoCabo(condutor));
    if (!cabo) return nullptr;
    auto* item = new CEItemLista;
    item->ids.push_back(entidade);
    item->copiarCampos(*cabo);
    const QString nome = Catalogo().DescricaoCabo(ChaveDaEntidade(condutor));
    item->definirCampo("LAYER", CICad::GetLayerEntidade(entidade));
    item->definirCampo("NOME", nome);
    item->definirCampo("NAME", nome);
    return item;
}

CEItemLista* CCCaboDataReader::LeCondutor(const OdDbObjectId& entidade, CETemplate& modelo) {
    const std::vector<CEPonto> vertices = CICad::GetVertices(entidade);
    const auto lados = [&](const QString& inicio, const QString& fim, CEItemLista& item) {
        if (vertices.empty()) return;
        LeLado(inicio, vertices.front(), item, entidade, modelo);
        LeLado(fim, vertices.back(), item, entidade, modelo);
    };
    const CEListaXData cega = CICad::GetXData(entidade, "KVR_ZV_CONEX_BLIND");
    if (cega.empty()) {
        CEItemLista* item = NovoCondutor(entidade, entidade);
        if (item) lados("INI", "FIM", *item);
        return item;
    }
    if (cega.size() < 2 || cega[1].texto.isEmpty()) return nullptr;
    const OdDbObjectId condutor = CICad::IdDoHandle(cega[1].texto, entidade.database());
    const QString chave = HandleDoCabo(condutor) + "#" + cega[1].texto;
    if (CEItemLista* perto = ligacoes.value(chave)) {
        // The far side of a connection met before: this entity ends that item.
        perto->ids.push_back(entidade);
        lados("FIM", "FIM", *perto);
        return nullptr;
    }
    CEItemLista* item = NovoCondutor(condutor, entidade);
    if (!item) return nullptr;
    lados("INI", "INI", *item);
    ligacoes.insert(chave, item);
    return item;
}

void CCCaboDataReader::LeLado(const QString& lado, const CEPonto& ponto, CEItemLista& item,
                              const OdDbObjectId& proprio, CETemplate& modelo) {
    // The window sees what is shown: the lead's page becomes the current one, and stays.
    const QString layer = item.valorCampo("LAYER");
    const QString atual = CICad::GetLayerCorrente();
    if (layer.compare(atual, Qt::CaseInsensitive) != 0) {
        janela_->AtualizaVisiveis();
        CICad::TrocaPagina(layer);
        QStringList tocados;
        for (const QString& pagina : {atual, layer})
            tocados << pagina << CICad::NomeBase(pagina) + "$DE"
                    << CICad::NomeBase(pagina) + "$FORMATO" << CICad::NomeBase(pagina) + "$SELO";
        janela_->Reavalia(tocados);
    }
    const CEPonto a{ponto.x - kRaio, ponto.y - kRaio, 0}, b{ponto.x + kRaio, ponto.y + kRaio, 0};
    for (const OdDbObjectId& id : janela_->Seleciona(a, b)) {
        if (id.isNull() || id == proprio || !CICad::EhReferencia(id)) continue;
        if (CICad::GetNomeBloco(id).startsWith("BLK_CTR_", Qt::CaseInsensitive)) continue;
        std::unique_ptr<CEItemLista> componente(CriaItemBloco(id, modelo));
        if (!componente) continue;
        item.copiarCamposComSufixo(*componente, lado);
        // The component's own fields carry all its connections: LIG tells the one touched.
        if (const zv::CEAtributo* ligacao = ConexaoProxima(id, ponto))
            item.definirCampo("LIG_" + lado, ligacao->GetValor());
    }
}

VetorItens* CCCaboDataReader::LeModelSpace(zvdb::Database* database, CETemplate& modelo,
                                           CIProgress* progresso,
                                           const std::function<bool(const QString&)>& aceita) {
    // One walk fills the window and finds the leads and blind connections, with their
    // places among the entities for the progress count.
    janela_ = std::make_unique<Janela>(database);
    std::vector<std::pair<int, OdDbObjectId>> condutores;
    int n = 0;
    static constexpr std::string_view kAplicacoes[] = {"KVR_ZV_CABO", "KVR_ZV_CONEX_BLIND"};
    CICad::PercorreEntidades(CICad::GetModelSpace(database), kAplicacoes,
                             [&](const CICad::EntidadeVista& vista) {
                                 ++n;
                                 if (vista.comXData) condutores.emplace_back(n, vista.id);
                                 janela_->Acrescenta(vista);
                             });
    janela_->Fecha();
    auto* itens = new VetorItens;
    auto proximo = condutores.cbegin();
    for (int k = 1; k <= n; ++k) {
        if (progresso) progresso->Definir(30 + 70 * k / n, CIProgress::Contagem(k, n));
        if (proximo == condutores.cend() || proximo->first != k) continue;
        const OdDbObjectId id = (proximo++)->second;
        if (!aceita(CICad::GetLayerEntidade(id))) continue;
        if (CEItemLista* item = LeCondutor(id, modelo)) {
            item->definirCampo("ZV_LISTA_TIPO", "CABO");
            PartilhaNomes(*item);
            itens->push_back(item);
        }
    }
    janela_.reset();
    return itens;
}

VetorItens* CCCaboDataReader::LerDados(zvdb::Database* database,
                                       const std::optional<QStringList>& paginas,
                                       CETemplate& modelo, CIProgress& progresso) {
    Q_UNUSED(paginas);
    progresso.Definir(10);
    CarregaCabos(database);
    progresso.Definir(30);
    VetorItens* itens =
        LeModelSpace(database, modelo, &progresso, [](const QString&) { return true; });
    progresso.Definir(100);
    return itens;
}

VetorItens* CCCaboDataReader::LerCabosPaginas(zvdb::Database* database, const QString& paginas,
                                              CETemplate& modelo) {
    CarregaCabos(database);
    const QStringList nomes = paginas.split(';', Qt::SkipEmptyParts);
    const QSet<QString> aceitas(nomes.begin(), nomes.end());
    VetorItens* itens = LeModelSpace(database, modelo, nullptr, [&](const QString& layer) {
        return aceitas.isEmpty() || aceitas.contains(layer);
    });
    FundeLados(*itens, removidos_);
    return itens;
}

// Neighbours are compared after the sort; a join only adds suffixed fields to the item that
// stays, so the item that stays is compared with the next one at once, which gives what a
// walk restarted from the start after each join would give.
void CCCaboDataReader::FundeLados(VetorItens& itens, VetorItens& removidos) {
    itens.ordenar({"CABO", "CABLE", "CABLE", "NOME"});
    VetorItens ficam;
    ficam.reserve(itens.size());
    for (CEItemLista* item : itens) {
        CEItemLista* antes = ficam.empty() ? nullptr : ficam.back();
        if (!antes || NomeDoCabo(*antes) != NomeDoCabo(*item) ||
            antes->valorCampo("NOME") != item->valorCampo("NOME")) {
            ficam.push_back(item);
            continue;
        }
        const QString origem = Preenchido(*item, "HANDLE_INI") ? "_INI" : "_FIM";
        const QString destino = Preenchido(*antes, "HANDLE_INI") ? "_FIM" : "_INI";
        std::vector<std::pair<QString, QString>> campos;
        for (auto it = item->campos.constBegin(); it != item->campos.constEnd(); ++it)
            if (it.key().endsWith(origem))
                campos.emplace_back(it.key().chopped(4) + destino, it.value());
        for (const auto& [chave, valor] : campos)
            antes->definirCampo(chave, valor);
        removidos.push_back(item);
    }
    static_cast<std::vector<CEItemLista*>&>(itens) = std::move(ficam);
}
