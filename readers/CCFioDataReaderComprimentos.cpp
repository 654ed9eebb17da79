// The wire reader's lengths: where each end of a wire stands in the panel layout, and the
// length along the wire's route polylines between those places, with the allowances.
#include "CCFioDataReader.h"

#include "CEAtributo.h"
#include "CEListaAtributos.h"

#include <algorithm>
#include <bit>
#include <cmath>
#include <cstdint>
#include <memory>
#include <optional>
#include <unordered_set>

namespace {

// A vertex counts only when it lies strictly closer to the point than this.
constexpr double kDistanciaMaxima = 999.0;

// Chains of up to this many stretches are checked for repeats without a set.
constexpr std::size_t kCadeiaCurta = 16;

double Distancia(const CEPonto& a, const CEPonto& b) {
    return std::sqrt((a.x - b.x) * (a.x - b.x) + (a.y - b.y) * (a.y - b.y) +
                     (a.z - b.z) * (a.z - b.z));
}

// The first text item of the application, as a key.
QString PrimeiroTexto(const OdDbObjectId& id, const QString& aplicacao) {
    const CEListaXData itens = CICad::GetXData(id, aplicacao);
    return itens.empty() ? QString() : itens.front().texto;
}

bool ComecaComAlgum(const QString& nome, std::initializer_list<const char*> prefixos) {
    for (const char* prefixo : prefixos)
        if (nome.startsWith(QLatin1String(prefixo), Qt::CaseInsensitive)) return true;
    return false;
}

// Contacts reach the layout through their master.
bool EhContato(const QString& bloco) {
    return ComecaComAlgum(bloco, {"NA-", "NF-", "NAF-", "BT-"});
}

}  // namespace

// Points are told apart by their bits, as their exact texts would be (-0 is not 0).
bool CCFioDataReader::Medida::operator==(const Medida& outra) const {
    for (size_t i = 0; i < pontos.size(); ++i)
        if (std::bit_cast<std::uint64_t>(pontos[i]) !=
            std::bit_cast<std::uint64_t>(outra.pontos[i]))
            return false;
    return chave == outra.chave;
}

size_t CCFioDataReader::HashMedida::operator()(const Medida& m) const {
    size_t h = qHash(m.chave);
    for (const double v : m.pontos)
        h = h * 1000003u ^ std::hash<std::uint64_t>()(std::bit_cast<std::uint64_t>(v));
    return h;
}

std::vector<OdDbObjectId> CCFioDataReader::EntidadesCom(ComXData qual) {
    // The routes, the panels, the schematic views and the transitions are each read once a
    // run, in turn; one walk finds them all while nothing in the drawing changes.
    static constexpr std::string_view kAplicacoes[kComXData] = {
        "KVR_ZV_WIRE_LAYOUT", "KVR_LAYOUT_PAINEL", "KVR_LAYOUT_ESQUEMA", "KVR_ZV_TRANSITION"};
    const std::uint64_t versao = CICad::VersaoDesenho();
    if (comXData_.empty() || versao != versaoComXData_) {
        comXData_ = CICad::GetEntidadesComXData(kAplicacoes);
        versaoComXData_ = versao;
    }
    return comXData_[qual];
}

void CCFioDataReader::CarregaLayout() {
    if (layoutCarregado_) return;
    layoutCarregado_ = true;
    for (const OdDbObjectId& id : EntidadesCom(kRotas)) {
        if (!CICad::EhPolilinha(id)) continue;
        const QString chave = PrimeiroTexto(id, "KVR_ZV_WIRE_LAYOUT");
        if (chave.isEmpty()) continue;
        // A wire may have a second route; it is kept under the key and "$".
        const QString nome = rotasLayoutFio_.contains(chave) ? chave + "$" : chave;
        rotasLayoutFio_.insert(nome, ZVString::DeHandle(id.handle()));
        // ComprimentoFio looks for a wire's routes under its key and under the key and "$".
        fiosComRota_.insert(nome);
        if (nome.endsWith('$')) fiosComRota_.insert(nome.chopped(1));
    }
    for (const OdDbObjectId& id : EntidadesCom(kPaineis)) {
        if (!CICad::EhReferencia(id)) continue;
        const QString chave = PrimeiroTexto(id, "KVR_LAYOUT_PAINEL");
        if (!chave.isEmpty()) paineisLayout_.insert(chave, ZVString::DeHandle(id.handle()));
    }
}

void CCFioDataReader::MapeiaLayout(CETemplate* modelo) {
    Q_UNUSED(modelo);
    if (layoutMapeado_) return;
    layoutMapeado_ = true;
    // Only the symbols with a layout view can enter the map, so only they are looked at.
    const OdDbObjectId modelSpace = CICad::GetModelSpace();
    for (const OdDbObjectId& ref : EntidadesCom(kEsquemas)) {
        if (!CICad::EhReferencia(ref) || CICad::GetDono(ref) != modelSpace) continue;
        if (ChaveDaEntidade(ref).isEmpty()) continue;  // no item, no entry
        const QString bloco = CICad::GetNomeBloco(ref);
        const bool borne = bloco.startsWith("BORNE", Qt::CaseInsensitive);
        if (!borne && (EhContato(bloco) || bloco.startsWith("BOR-", Qt::CaseInsensitive))) continue;
        CEItemLista campos;
        std::unique_ptr<zv::CEListaAtributos> atributos;
        CICad::GetAtributos(ref, atributos, false, false);
        for (int i = 0; atributos && i < atributos->Quantidade(); ++i)
            campos.definirCampo((*atributos)[i].GetTag(), (*atributos)[i].GetValor());
        CICad::GetAtributosConstantes(ref, atributos);
        for (int i = 0; atributos && i < atributos->Quantidade(); ++i)
            campos.definirCampo((*atributos)[i].GetTag(), (*atributos)[i].GetValor());
        QString chave;
        if (borne) {
            for (int i = 1; i <= 3 && chave.isEmpty(); ++i) {
                const QString regua = CICad::TagTraduzida(CampoTraduzido::Regua, i);
                const QString numero = CICad::TagTraduzida(CampoTraduzido::Numero, i);
                if (campos.temCampo(regua) && campos.temCampo(numero))
                    chave = campos.valorCampo(regua) + kSeparador + campos.valorCampo(numero);
            }
        } else {
            for (int i = 1; i <= 3; ++i)
                chave += campos.valorCampo(CICad::TagTraduzida(CampoTraduzido::Relacao, i));
        }
        if (!chave.isEmpty()) layoutPorRelacao_.insert(chave, ZVString::DeHandle(ref.handle()));
    }
}

CCFioDataReader::VistaLayout CCFioDataReader::LeVista(const QString& elemento) {
    VistaLayout vista;
    OdDbObjectId id = CICad::IdDoHandle(elemento);
    if (!CICad::EhReferencia(id)) return vista;
    if (EhContato(CICad::GetNomeBloco(id))) {
        const std::unique_ptr<zv::CEAtributo> pai = CICad::GetAtributo("PARENT", id);
        const QString mestre = pai ? layoutPorRelacao_.value(pai->GetValor()) : QString();
        if (mestre.isEmpty()) return vista;
        id = CICad::IdDoHandle(mestre);
        if (!CICad::EhReferencia(id)) return vista;
    }
    const CEListaXData esquema = CICad::GetXData(id, "KVR_LAYOUT_ESQUEMA");
    for (size_t indice : {size_t(0), size_t(2)}) {
        if (indice >= esquema.size()) continue;
        const OdDbObjectId candidata = CICad::IdDoHandle(esquema[indice].texto);
        if (CICad::EhReferencia(candidata)) {
            vista.id = candidata;
            break;
        }
    }
    if (vista.id.isNull()) return vista;
    std::unique_ptr<zv::CEListaAtributos> atributos;
    CICad::GetAtributos(vista.id, atributos, false, false);
    for (int i = 0; atributos && i < atributos->Quantidade(); ++i) {
        const zv::CEAtributo& atributo = (*atributos)[i];
        if (atributo.GetTag().toUpper().startsWith("CPOINT"))
            vista.pontos.emplace_back(atributo.GetValor(), atributo.GetId());
    }
    return vista;
}

bool CCFioDataReader::PosicaoLayout(const QString& elemento, const QString& conexao,
                                    CEPonto& ponto) {
    // In a walk each element's view is found once; an element stands at the ends of many
    // stretches.
    VistaLayout lida;
    const VistaLayout* vista = nullptr;
    if (composicao_) {
        const std::uint64_t handle = ZVString(elemento).ParaHandle();
        auto achada = vistas_.find(handle);
        if (achada == vistas_.end()) achada = vistas_.emplace(handle, LeVista(elemento)).first;
        vista = &achada->second;
    } else {
        lida = LeVista(elemento);
        vista = &lida;
    }
    if (vista->id.isNull()) return false;
    for (const auto& [valor, texto] : vista->pontos) {
        if (valor.compare(conexao, Qt::CaseInsensitive) != 0) continue;
        ponto = CICad::GetPosicaoTexto(texto);
        return true;
    }
    ponto = CICad::GetPosicao(vista->id);
    return true;
}

void CCFioDataReader::CarregaTransicoes() {
    if (transicoesCarregadas_) return;
    transicoesCarregadas_ = true;
    for (const OdDbObjectId& id : EntidadesCom(kTransicoes)) {
        if (!CICad::EhReferencia(id)) continue;
        if (PrimeiroTexto(id, "KVR_ZV_REPRESENTACAO") != "-50") continue;
        // A transition whose partner is gone pairs with nothing.
        const OdDbObjectId parceiro = CICad::IdDoHandle(PrimeiroTexto(id, "KVR_ZV_TRANSITION"));
        if (CICad::EhReferencia(parceiro)) transicoes_.emplace_back(id, parceiro);
    }
}

QString CCFioDataReader::ComprimentoFio(const QString& chave, const CEPonto& inicio,
                                        const CEPonto& fim) {
    if (chave.isEmpty()) return "-";
    Medida memoria{chave, {inicio.x, inicio.y, inicio.z, fim.x, fim.y, fim.z}};
    auto achado = comprimentos_.find(memoria);
    if (achado != comprimentos_.end()) return achado->second;
    CarregaLayout();

    struct Vertice {
        double distancia = kDistanciaMaxima;
        int rota = -1, indice = -1;
    } maisPertoInicio, maisPertoFim;
    std::vector<std::vector<CEPonto>> rotas;
    for (const QString& nome : {chave, QString(chave + "$")}) {
        const QString handle = rotasLayoutFio_.value(nome);
        if (!handle.isEmpty()) rotas.push_back(CICad::GetVertices(CICad::IdDoHandle(handle)));
    }
    for (int r = 0; r < int(rotas.size()); ++r)
        for (int v = 0; v < int(rotas[size_t(r)].size()); ++v) {
            const CEPonto& p = rotas[size_t(r)][size_t(v)];
            const double a = Distancia(p, inicio), b = Distancia(p, fim);
            if (a < maisPertoInicio.distancia) maisPertoInicio = {a, r, v};
            if (b < maisPertoFim.distancia) maisPertoFim = {b, r, v};
        }
    double comprimento = 0.0;
    if (maisPertoInicio.rota >= 0 && maisPertoFim.rota >= 0) {
        if (maisPertoInicio.rota == maisPertoFim.rota) {
            const std::vector<CEPonto>& rota = rotas[size_t(maisPertoInicio.rota)];
            const int de = std::min(maisPertoInicio.indice, maisPertoFim.indice);
            const int ate = std::max(maisPertoInicio.indice, maisPertoFim.indice);
            double soma = 0.0;
            for (int v = de; v < ate; ++v)
                soma += Distancia(rota[size_t(v)], rota[size_t(v + 1)]);
            comprimento = soma * (CICad::GetRealLisp("PBLCOMPFIOPORCENTO", 0.0) / 100.0 + 1.0) +
                          CICad::GetRealLisp("PBLCOMPFIOABSOLUTO", 0.0);
        } else {
            // Across a transition between two routes nothing is measured: the length is 0.
            CarregaTransicoes();
        }
    }
    const QString texto = ZVString::DeReal(comprimento);
    comprimentos_.emplace(std::move(memoria), texto);
    return texto;
}

namespace {

// The stretch of `item` in a chain's array, looked for at `lugar` first.
template <class Vetor>
auto ProcuraTrecho(Vetor& trechos, const CEItemLista* item, std::size_t lugar)
    -> decltype(&trechos[0].second) {
    if (lugar < trechos.size() && trechos[lugar].first == item) return &trechos[lugar].second;
    for (auto& par : trechos)
        if (par.first == item) return &par.second;
    return nullptr;
}

}  // namespace

CCFioDataReader::Trecho* CCFioDataReader::Trechos::procura(const CEItemLista* item,
                                                           std::size_t lugar) {
    return ProcuraTrecho(trechos_, item, lugar);
}

const CCFioDataReader::Trecho* CCFioDataReader::Trechos::procura(const CEItemLista* item,
                                                                 std::size_t lugar) const {
    return ProcuraTrecho(trechos_, item, lugar);
}

void CCFioDataReader::Trechos::remove(const CEItemLista* item) {
    std::erase_if(trechos_, [item](const auto& trecho) { return trecho.first == item; });
}

template <class Lista>
void CCFioDataReader::CalculaComprimentos(CEItemLista* primeiro, const Lista& elementos,
                                          const Trechos* trechos, const QString* campoFio) {
    if (!primeiro || elementos.isEmpty()) return;
    // The chain up to its first repeat. Most wires have a few stretches: those are looked
    // for in the chain itself, and only a long chain gets a set.
    std::vector<CEItemLista*> cadeia;
    std::unordered_set<CEItemLista*> vistos;
    for (CEItemLista* item = primeiro; item; item = item->ligado) {
        if (cadeia.size() < kCadeiaCurta) {
            if (std::find(cadeia.begin(), cadeia.end(), item) != cadeia.end()) break;
        } else {
            if (vistos.empty()) vistos.insert(cadeia.begin(), cadeia.end());
            if (!vistos.insert(item).second) break;
        }
        cadeia.push_back(item);
    }
    const QString campo = campoFio ? *campoFio : CampoFio(*primeiro);
    if (campo.isEmpty()) return;
    const QString chave = primeiro->valorCampo(campo);
    const int n = int(elementos.size());
    // Where the k-th stretch of the chain starts and ends; none out of the list.
    auto trechoDe = [&](size_t k) -> std::optional<Trecho> {
        Trecho trecho{int(k), int(k) + 1};
        if (trechos) {
            if (const Trecho* achado = trechos->procura(cadeia[k], k)) trecho = *achado;
            if (trecho.fim < 0) trecho.fim = trecho.inicio + 1;
        }
        if (trecho.inicio < 0 || trecho.inicio >= n || trecho.fim >= n) return std::nullopt;
        return trecho;
    };
    // Most wires have no route: their length is 0 wherever their ends stand in the layout.
    CarregaLayout();
    if (!chave.isEmpty() && !fiosComRota_.contains(chave)) {
        static const QString kZero = ZVString::DeReal(0.0);
        for (size_t k = 0; k < cadeia.size(); ++k) {
            if (!trechoDe(k) || !cadeia[k]->temCampo(campo)) continue;
            cadeia[k]->definirCampo(NumeroCampo<"LENGTH">(), kZero);
            cadeia[k]->definirCampo(NumeroCampo<"COMPRIMENTO">(), kZero);
        }
        return;
    }
    const auto pontos = PontosConexao(chave);
    auto pontoDe = [pontos](int i) {
        return pontos && size_t(i) < pontos->size() ? (*pontos)[size_t(i)] : CEPonto{};
    };
    auto posicao = [this](const QString& elemento, const QString& conexao, const QString& relacao,
                          CEPonto& ponto) {
        if (PosicaoLayout(elemento, conexao, ponto)) return;
        const QString handle = layoutPorRelacao_.value(relacao);
        if (!handle.isEmpty()) PosicaoLayout(handle, conexao, ponto);
    };
    for (size_t k = 0; k < cadeia.size(); ++k) {
        CEItemLista& item = *cadeia[k];
        const std::optional<Trecho> achado = trechoDe(k);
        if (!achado) continue;
        const Trecho trecho = *achado;
        const QString& a1 = elementos[trecho.inicio];
        const QString& a2 = elementos[trecho.fim];
        const QString r1 =
            LigacaoProxima(chave, a1, trecho.inicio, pontoDe(trecho.inicio)).value_or(QString());
        const QString r2 =
            LigacaoProxima(chave, a2, trecho.fim, pontoDe(trecho.fim)).value_or(QString());
        static const QString kRelIni = QStringLiteral("REL_INI"),
                             kRelFim = QStringLiteral("REL_FIM");
        CEPonto inicio, fim;
        posicao(a1, r1, item.valorCampo(kRelIni), inicio);
        posicao(a2, r2, item.valorCampo(kRelFim), fim);
        if (!item.temCampo(campo)) continue;
        const QString comprimento = ComprimentoFio(chave, inicio, fim);
        item.definirCampo(NumeroCampo<"LENGTH">(), comprimento);
        item.definirCampo(NumeroCampo<"COMPRIMENTO">(), comprimento);
    }
}

template void CCFioDataReader::CalculaComprimentos(CEItemLista*, const QStringList&, const Trechos*,
                                                   const QString*);
template void CCFioDataReader::CalculaComprimentos(CEItemLista*, const TabelaConexoes::Textos&,
                                                   const Trechos*, const QString*);

void CCFioDataReader::AplicaCaminhos(VetorItens& itens) {
    for (CEItemLista* item : itens) {
        if (!item) continue;
        const QString campo = CampoFio(*item);
        const QHash<QString, QString>* caminhos =
            campo.isEmpty() ? nullptr : Caminhos(item->valorCampo(campo));
        if (!caminhos || caminhos->isEmpty()) continue;
        const QString caminho = caminhos->value(item->valorCampo("RELACAO_INI") + "-" +
                                                item->valorCampo("RELACAO_FIM"));
        item->definirCampo("CAMINHOFIO", caminho);
        item->definirCampo("PATHWIRE", caminho);
    }
}
