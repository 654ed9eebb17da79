#include "CCDataReader.h"

#include "CEAtributo.h"
#include "CEListaAtributos.h"
#include "Descarte.h"
#include "cad/CELayoutRotasFios.h"
#include "host/sdk/LispInterface.h"
#include "lists/CETemplate.h"
#include "settings/CIMensagens.h"

#include <algorithm>
#include <cctype>
#include <cmath>
#include <initializer_list>
#include <span>
#include <tuple>
#include <utility>

using zvsdk::ResultBuffer;

const QChar CCDataReader::kSeparador = QChar(0x0C);

namespace {

constexpr double kToleranciaElemento = 3.0;
constexpr double kForaDoSegmento = 666.0;

double Distancia(const CEPonto& a, const CEPonto& b) {
    return std::sqrt((a.x - b.x) * (a.x - b.x) + (a.y - b.y) * (a.y - b.y) +
                     (a.z - b.z) * (a.z - b.z));
}

// Distance of P to the segment's line in the plane; beyond the segment's ends it is pushed
// out of any tolerance.
double DistanciaAoSegmento(const CEPonto& p, const CEPonto& a, const CEPonto& b) {
    double d;
    if (b.x == a.x) {
        d = std::abs(p.x - a.x);
    } else {
        const double m = (b.y - a.y) / (b.x - a.x);
        d = std::abs(p.x * m - p.y + a.y - m * a.x) / std::sqrt(m * m + 1);
    }
    const double l = Distancia(a, b);
    if (l + d < Distancia(p, a) || l + d < Distancia(p, b)) d += kForaDoSegmento;
    return d;
}

// A terminal's block name: BORNE... or BOR-..., in any case.
bool EhBlocoDeBorne(std::string_view nome) {
    const auto comeca = [nome](std::string_view prefixo) {
        return nome.size() >= prefixo.size() &&
               std::equal(prefixo.begin(), prefixo.end(), nome.begin(), [](char a, char b) {
                   return a == std::toupper(static_cast<unsigned char>(b));
               });
    };
    return comeca("BORNE") || comeca("BOR-");
}

}  // namespace

CCDataReader::CCDataReader() : tolerancia_(CICad::GetRealLisp("*ESPESSURA_BARRAMENTO*", 0.1)) {}

CCDataReader::~CCDataReader() = default;

namespace {

// Takes the containers' contents out, leaving each as a new one.
template <class... T>
std::tuple<T...> Retira(T&... conteudos) {
    return std::tuple<T...>(std::exchange(conteudos, T{})...);
}

}  // namespace

void CCDataReader::LiberaLeituras() {
    LiberaLeiturasDeEntidades();
    Descarte::Descartar(Retira(basesAcessorio_, acessoriosLidos_, acessoriosCatalogo_));
    desenhoAcessorios_ = appVinculosEm_ = nullptr;
    appVinculosVersao_ = ~std::uint64_t(0);
}

void CCDataReader::LiberaLeiturasDeEntidades() {
    // Items share the texts of these; they keep theirs.
    auto leituras = Retira(
        circuitos_, conexoes_, fiosPorLayer_, indicesFios_, rotas_, rotasPorChave_, caminhos_,
        entidadesLidas_, entidadesAntigas_, avulsa_, leitura_, nomesLidos_, formas_, numerosFios_,
        numerosCabos_, ligacoesPorElemento_, ligacoesAntigas_, layers_, gruposPaginas_, textosTipo_,
        colunasDivididas_, catalogoComp_, constantes_, ligacoesLidas_, chaves_, textosFio_, tags_,
        valores_, lote_, ordemLote_, nomesFio_, textosNumero_, nomesLote_, ordensLote_);
    versaoIndices_ = 0;
    indiceAtual_ = nullptr;
    layerDoUltimo_ = nullptr;
    ultimoLayer_ = nullptr;
    ultimaOrdem_ = nullptr;
    rotasLidas_ = false;
    corteDe_ = OdDbObjectId();
    versaoLidas_ = 0;
    atributosDe_ = OdDbObjectId();
    // It points into the catalogue answers just taken.
    semChave_.Esquece();
    // The module's commands go on while another thread frees them; elsewhere they go now.
    Descarte::Descartar(std::move(leituras));
}

// ---- connections

void CCDataReader::CarregaConexoesFios(bool adiante) {
    CarregaConexoes("getConexoesTodosFios", true, adiante);
}

void CCDataReader::CarregaConexoesCabos(bool adiante) {
    CarregaConexoes("getConexoesTodosCabos", false, adiante);
}

void CCDataReader::CarregaConexoes(const QString& funcao, bool detalhes, bool adiante) {
    // The whole drawing's answer, without a chain of nodes when the host can; when the host
    // can work it out while the reader reads on, it is taken at the first look-up.
    if (adiante && conexoes_.Adia(funcao, detalhes, GuardaCompletas)) return;
    conexoes_.CarregaDe(funcao, detalhes, GuardaCompletas);
}

std::optional<TabelaConexoes::Textos> CCDataReader::ListaConexoes(const QString& fio) const {
    return conexoes_.Elementos(fio);
}

std::optional<TabelaConexoes::Textos> CCDataReader::ListaConexoesCompletas(
    const QString& fio) const {
    return conexoes_.Completas(fio);
}

std::optional<std::span<const CEPonto>> CCDataReader::PontosConexao(const QString& fio) const {
    return conexoes_.Pontos(fio);
}

CEPonto CCDataReader::PontoDaConexao(const QString& fio, const QString& elemento) const {
    const auto c = conexoes_.DoFio(fio);
    if (!c) return {};
    const std::span<const CEPonto> pontos = c->pontos;
    const int i = c->elementos.indexOf(elemento);
    return i >= 0 && size_t(i) < pontos.size() ? pontos[size_t(i)] : CEPonto{};
}

CEPonto CCDataReader::PontoDaConexaoCompleta(const QString& fio, const QString& texto) const {
    const auto c = conexoes_.DoFio(fio);
    if (!c) return {};
    const std::span<const CEPonto> pontos = c->pontos;
    const int i = c->completas.indexOf(texto);
    return i >= 0 && size_t(i) < pontos.size() ? pontos[size_t(i)] : CEPonto{};
}

bool CCDataReader::FioSobPonto(std::span<const CEPonto> vertices, const CEPonto& ponto) const {
    for (size_t i = 0; i + 1 < vertices.size(); ++i) {
        const CEPonto& a = vertices[i];
        const CEPonto& b = vertices[i + 1];
        if (Distancia(ponto, a) < tolerancia_ || Distancia(ponto, b) < tolerancia_) return true;
        if (DistanciaAoSegmento(ponto, a, b) < tolerancia_) return true;
    }
    return false;
}

// A point passes a segment only within the tolerance of the segment's box (a z that differs
// between its ends widens the box by that much), so each segment goes into the grid cells
// its widened box meets; a segment with coordinates that are not finite is tried always.
// The wires' vertices lie in one array and the cells' wires in another, each cell's from
// its start to the next one's: a layer's index is a few arrays, not an array per wire and
// per cell.
struct CCDataReader::FiosDoLayer {
    std::vector<OdDbObjectId> fios;  // in the answer's order
    std::vector<CEPonto> pontos;
    std::vector<std::uint32_t> inicios{0};  // the w-th wire's vertices from inicios[w]
    std::vector<std::uint32_t> sempre;      // wires tried at every point
    bool semGrade = false;                  // no grid: every wire is tried
    double x0 = 0, y0 = 0, passo = 1;
    std::size_t nx = 0, ny = 0;
    std::vector<std::uint32_t> iniciosCelulas;  // nx * ny + 1 when there is a grid
    std::vector<std::uint32_t> membros;         // each cell's wires, ascending
    // The first vertex of each polyline of the layer in the answer, of one vertex or more, by
    // handle ascending (the first of a repeated one first): a wire's position reads it here,
    // in the few arrays of its page, not in a table of every wire read.
    std::vector<std::pair<OdDbObjectId, CEPonto>> primeiros;

    // The polyline whose vertices were appended from `antes` on: a wire of two or more.
    void Fecha(const OdDbObjectId& fio, std::size_t antes) {
        if (pontos.size() > antes) primeiros.emplace_back(fio, pontos[antes]);
        if (pontos.size() < antes + 2) {
            pontos.resize(antes);
            return;
        }
        fios.push_back(fio);
        inicios.push_back(std::uint32_t(pontos.size()));
    }

    std::size_t Celula(double v, double origem, std::size_t n) const {
        const double c = std::floor((v - origem) / passo);
        if (!(c > 0)) return 0;
        return c >= double(n - 1) ? n - 1 : std::size_t(c);
    }
    std::span<const CEPonto> Vertices(std::size_t w) const {
        return {pontos.data() + inicios[w], pontos.data() + inicios[w + 1]};
    }
    std::span<const std::uint32_t> Membros(std::size_t celula) const {
        return {membros.data() + iniciosCelulas[celula],
                membros.data() + iniciosCelulas[celula + 1]};
    }
    const CEPonto* Primeiro(const OdDbObjectId& fio) const {
        auto it = std::lower_bound(
            primeiros.begin(), primeiros.end(), fio.handle(),
            [](const auto& par, std::uint64_t handle) { return par.first.handle() < handle; });
        for (; it != primeiros.end() && it->first.handle() == fio.handle(); ++it)
            if (it->first == fio) return &it->second;
        return nullptr;
    }
};

// Takes a layer's wires with their vertices, as the host hands them over, into its index,
// and their handles for a later reading of the layer.
class CCDataReader::ReceptorFios final : public zvsdk::PolylineReceiver {
public:
    ReceptorFios(FiosDoLayer& fios, std::vector<std::uint64_t>& handles)
        : fios_(fios), handles_(handles) {}
    void polyline(std::uint64_t handle, const double* xyz, std::size_t n) override {
        handles_.push_back(handle);
        const std::size_t antes = fios_.pontos.size();
        for (std::size_t i = 0; i < n; ++i)
            fios_.pontos.push_back({xyz[3 * i], xyz[3 * i + 1], xyz[3 * i + 2]});
        fios_.Fecha(CICad::IdDoHandleNumero(handle), antes);
    }

private:
    FiosDoLayer& fios_;
    std::vector<std::uint64_t>& handles_;
};

const CCDataReader::FiosDoLayer& CCDataReader::IndiceFios(const QString& layer) {
    if (indiceAtual_ && versaoIndices_ == CICad::VersaoDesenho() && layer == layerIndice_)
        return *indiceAtual_;
    const FiosDoLayer& indice = LeIndiceFios(layer);
    indiceAtual_ = &indice;
    layerIndice_ = layer;
    return indice;
}

const CCDataReader::FiosDoLayer& CCDataReader::LeIndiceFios(const QString& layer) {
    const std::uint64_t versao = CICad::VersaoDesenho();
    if (versao != versaoIndices_) {
        indicesFios_.clear();
        versaoIndices_ = versao;
    }
    std::unique_ptr<FiosDoLayer>& indice = indicesFios_[layer];
    if (indice) return *indice;
    indice = std::make_unique<FiosDoLayer>();
    FiosDoLayer& f = *indice;
    auto it = fiosPorLayer_.constFind(layer);
    if (it == fiosPorLayer_.constEnd()) {
        // The host hands the wires over with the vertices it read of them, if it can.
        std::vector<std::uint64_t> handles;
        ReceptorFios receptor(f, handles);
        if (CICad::zvInvokePolilinhas("getFiosPorLayer", layer, receptor)) {
            fiosPorLayer_.insert(layer, std::move(handles));
            return FechaIndiceFios(f);
        }
        // The answer's handles as numbers: each opens its wire without a text kept for it.
        ResultBuffer* resposta = CICad::zvInvokeLista("getFiosPorLayer", {layer});
        for (const ResultBuffer* no = resposta; no; no = no->rbnext)
            if (no->restype == zvsdk::RTSTR) handles.push_back(ZVString(no->rstring).ParaHandle());
        CICad::LiberaLista(resposta);
        it = fiosPorLayer_.insert(layer, std::move(handles));
    }
    // The layer's name as the drawing holds it: each wire's is compared without a copy.
    const QByteArray nomeLayer = layer.toUtf8();
    const std::string_view nome(nomeLayer.constData(), std::size_t(nomeLayer.size()));
    for (const std::uint64_t handle : *it) {
        const OdDbObjectId fio = CICad::IdDoHandleNumero(handle);
        const std::size_t antes = f.pontos.size();
        CICad::AcrescentaVertices(fio, nome, f.pontos);
        f.Fecha(fio, antes);
    }
    return FechaIndiceFios(f);
}

CCDataReader::FiosDoLayer& CCDataReader::FechaIndiceFios(FiosDoLayer& f) {
    // The answer gives them in handle order, most often.
    const auto porHandle = [](const auto& a, const auto& b) {
        return a.first.handle() < b.first.handle();
    };
    if (!std::is_sorted(f.primeiros.begin(), f.primeiros.end(), porHandle))
        std::stable_sort(f.primeiros.begin(), f.primeiros.end(), porHandle);
    // Widened boxes of the segments; the grid spans the finite ones.
    struct Caixa {
        double x1, y1, x2, y2;
        std::uint32_t fio;
    };
    std::vector<Caixa> caixas;
    const double tol = tolerancia_;
    if (!std::isfinite(tol)) {
        f.semGrade = true;
        return f;
    }
    double minX = HUGE_VAL, minY = HUGE_VAL, maxX = -HUGE_VAL, maxY = -HUGE_VAL;
    for (std::uint32_t w = 0; w < f.fios.size(); ++w) {
        const std::span<const CEPonto> v = f.Vertices(w);
        bool sempre = false;
        for (size_t i = 0; i + 1 < v.size(); ++i) {
            const CEPonto& a = v[i];
            const CEPonto& b = v[i + 1];
            const double folga = std::abs(tol) + std::abs(b.z - a.z);
            const Caixa c{std::min(a.x, b.x) - folga, std::min(a.y, b.y) - folga,
                          std::max(a.x, b.x) + folga, std::max(a.y, b.y) + folga, w};
            if (!std::isfinite(c.x1) || !std::isfinite(c.y1) || !std::isfinite(c.x2) ||
                !std::isfinite(c.y2)) {
                sempre = true;
                continue;
            }
            caixas.push_back(c);
            minX = std::min(minX, c.x1);
            minY = std::min(minY, c.y1);
            maxX = std::max(maxX, c.x2);
            maxY = std::max(maxY, c.y2);
        }
        if (sempre) f.sempre.push_back(w);
    }
    if (caixas.empty()) return f;
    // About one cell per segment, square cells.
    const double largura = std::max(maxX - minX, 1e-9), altura = std::max(maxY - minY, 1e-9);
    const double lado = std::max(1.0, std::ceil(std::sqrt(double(caixas.size()))));
    f.passo = std::max(largura, altura) / lado;
    if (!(f.passo > 0) || !std::isfinite(f.passo)) {
        f.semGrade = true;
        return f;
    }
    f.x0 = minX;
    f.y0 = minY;
    f.nx = std::min<std::size_t>(std::size_t(largura / f.passo) + 1, 1024);
    f.ny = std::min<std::size_t>(std::size_t(altura / f.passo) + 1, 1024);
    // Two walks over the boxes: the first counts each cell's wires, the second puts them
    // in place. A wire enters a cell once, however many of its segments meet the cell.
    const std::size_t nCelulas = f.nx * f.ny;
    // Each box's range of cells, worked out once for both walks.
    struct Celulas {
        std::uint32_t i1, i2, j1, j2, fio;
    };
    std::vector<Celulas> faixas;
    faixas.reserve(caixas.size());
    for (const Caixa& c : caixas)
        faixas.push_back({std::uint32_t(f.Celula(c.x1, f.x0, f.nx)),
                          std::uint32_t(f.Celula(c.x2, f.x0, f.nx)),
                          std::uint32_t(f.Celula(c.y1, f.y0, f.ny)),
                          std::uint32_t(f.Celula(c.y2, f.y0, f.ny)), c.fio});
    static constexpr std::uint32_t kNenhum = ~std::uint32_t(0);
    std::vector<std::uint32_t> ultimo(nCelulas, kNenhum);
    auto cadaCelula = [&f, &faixas, &ultimo](auto&& faz) {
        std::fill(ultimo.begin(), ultimo.end(), kNenhum);
        for (const Celulas& c : faixas) {
            for (std::size_t j = c.j1; j <= c.j2; ++j)
                for (std::size_t i = c.i1; i <= c.i2; ++i) {
                    const std::size_t celula = j * f.nx + i;
                    if (ultimo[celula] == c.fio) continue;
                    ultimo[celula] = c.fio;
                    faz(celula, c.fio);
                }
        }
    };
    f.iniciosCelulas.assign(nCelulas + 1, 0);
    cadaCelula([&f](std::size_t celula, std::uint32_t) { ++f.iniciosCelulas[celula + 1]; });
    for (std::size_t k = 0; k < nCelulas; ++k)
        f.iniciosCelulas[k + 1] += f.iniciosCelulas[k];
    f.membros.resize(f.iniciosCelulas[nCelulas]);
    std::vector<std::uint32_t> proximo(f.iniciosCelulas.begin(), f.iniciosCelulas.end() - 1);
    cadaCelula([&f, &proximo](std::size_t celula, std::uint32_t fio) {
        f.membros[proximo[celula]++] = fio;
    });
    return f;
}

OdDbObjectId CCDataReader::FioNoPonto(const QString& layer, const CEPonto& ponto) {
    const FiosDoLayer& f = IndiceFios(layer);
    // The first wire in the answer's order wins, even when a later one is closer.
    if (f.semGrade || !std::isfinite(ponto.x) || !std::isfinite(ponto.y)) {
        for (size_t w = 0; w < f.fios.size(); ++w)
            if (FioSobPonto(f.Vertices(w), ponto)) return f.fios[w];
        return {};
    }
    const bool dentro = !f.iniciosCelulas.empty() && ponto.x >= f.x0 && ponto.y >= f.y0 &&
                        ponto.x <= f.x0 + f.passo * double(f.nx) &&
                        ponto.y <= f.y0 + f.passo * double(f.ny);
    const std::span<const std::uint32_t> celula =
        dentro ? f.Membros(f.Celula(ponto.y, f.y0, f.ny) * f.nx + f.Celula(ponto.x, f.x0, f.nx))
               : std::span<const std::uint32_t>();
    // Both lists ascend: walk them as one, in the answer's order.
    size_t i = 0, k = 0;
    while (i < celula.size() || k < f.sempre.size()) {
        std::uint32_t w;
        if (k >= f.sempre.size() || (i < celula.size() && celula[i] < f.sempre[k])) {
            w = celula[i++];
        } else {
            w = f.sempre[k++];
            if (i < celula.size() && celula[i] == w) ++i;
        }
        if (FioSobPonto(f.Vertices(w), ponto)) return f.fios[w];
    }
    return {};
}

namespace {

// The name and value of a field text "NAME<sep>VALUE" as ZVString::DivideEmDois splits it
// (empty parts are skipped); false when it holds no part or more than two.
bool DivideCampo(std::string_view texto, std::string_view& nome, std::string_view& valor) {
    const char sep = char(CCDataReader::kSeparador.unicode());
    std::string_view partes[2];
    int n = 0;
    for (std::size_t i = 0; i < texto.size();) {
        if (texto[i] == sep) {
            ++i;
            continue;
        }
        const std::size_t fim = std::min(texto.find(sep, i), texto.size());
        if (n == 2) return false;
        partes[n++] = texto.substr(i, fim - i);
        i = fim;
    }
    nome = partes[0];
    valor = partes[1];
    return n > 0;
}

// Whether the name, in upper case as Qt makes it, is one of the words (plain upper-case
// ASCII); a name in ASCII is compared without a text made for it.
bool NomeEntre(std::string_view nome, std::initializer_list<std::string_view> palavras) {
    if (std::any_of(nome.begin(), nome.end(), [](char c) { return c & 0x80; })) {
        const QString maiusculo = QString::fromUtf8(nome.data(), int(nome.size())).toUpper();
        return std::any_of(palavras.begin(), palavras.end(), [&maiusculo](std::string_view p) {
            return maiusculo == QLatin1String(p.data(), int(p.size()));
        });
    }
    const auto igual = [nome](std::string_view palavra) {
        return nome.size() == palavra.size() &&
               std::equal(nome.begin(), nome.end(), palavra.begin(), [](char a, char b) {
                   return (a >= 'a' && a <= 'z' ? char(a - 'a' + 'A') : a) == b;
               });
    };
    return std::any_of(palavras.begin(), palavras.end(), igual);
}

// Whether the field's name is one of the wire number's.
bool EhNomeDoNumero(std::string_view nome) {
    return NomeEntre(nome, {"CABO", "FIO", "WIRE", "ALAMBRE"});
}

// Whether the attribute's name is one of the cable number's.
bool EhNomeDoCabo(std::string_view nome) {
    return NomeEntre(nome, {"CABO", "CABLE"});
}

}  // namespace

// The number in a wire's own field of KVR_ZV_WIRE, from its third item on. Every wire at a
// side's point is asked: its texts are read where the drawing holds them.
std::optional<QString> CCDataReader::NumeroNoCampoFio(const OdDbObjectId& entidade) const {
    CICad::TextosXData(entidade, "KVR_ZV_WIRE", textosNumero_);
    for (size_t i = 2; i < textosNumero_.size(); ++i) {
        std::string_view nome, valor;
        if (DivideCampo(textosNumero_[i], nome, valor) && EhNomeDoNumero(nome))
            return QString::fromUtf8(valor.data(), int(valor.size()));
    }
    return std::nullopt;
}

QString CCDataReader::NomeDoFioNoXData(const OdDbObjectId& fio) const {
    static constexpr std::array<std::string_view, 4> kNomes = {"CABO", "WIRE", "ALAMBRE", "FIO"};
    std::array<std::string_view, 4> valores;
    CICad::TextosXData(fio, "KVR_ZV_WIRE", textosNumero_);
    for (size_t i = 2; i < textosNumero_.size(); ++i) {
        std::string_view nome, valor;
        if (!DivideCampo(textosNumero_[i], nome, valor)) continue;
        for (size_t k = 0; k < kNomes.size(); ++k)
            if (nome == kNomes[k]) valores[k] = valor;
    }
    for (const std::string_view valor : valores) {
        if (valor.empty()) continue;
        const QString nome = QString::fromUtf8(valor.data(), int(valor.size())).trimmed();
        if (!nome.isEmpty()) return nome;
    }
    return {};
}

// The value of the record's first virtual attribute named CABO or CABLE in any case; none
// without one. Its texts are read where the drawing holds them, split as
// CICad::GetAtributosVirtuais splits them: an empty field between two separators reads " ",
// and only texts of three fields count. (Items other than texts never split in three.)
std::optional<QString> CCDataReader::NumeroDoRegistroCabo(const OdDbObjectId& registro) const {
    const char sep = char(kSeparador.unicode());
    CICad::TextosXData(registro, "KVR_ZV_ATT_VIRTUAL", textosNumero_);
    for (const std::string_view texto : textosNumero_) {
        std::string_view campos[3];
        int n = 0;
        for (std::size_t i = 0; n <= 3;) {
            const std::size_t fim = std::min(texto.find(sep, i), texto.size());
            const std::string_view campo = texto.substr(i, fim - i);
            const bool borda = i == 0 || fim == texto.size();
            if (!campo.empty() || !borda) {
                if (n < 3) campos[n] = campo.empty() ? std::string_view(" ") : campo;
                ++n;
            }
            if (fim == texto.size()) break;
            i = fim + 1;
        }
        if (n == 3 && EhNomeDoCabo(campos[0]))
            return QString::fromUtf8(campos[1].data(), int(campos[1].size()));
    }
    return std::nullopt;
}

// A cable core's number: the cable's own number (a CABO or CABLE attribute of its record)
// and the core, from KVR_ZV_CABO; empty when there is none. Every wire without a number of
// its own is asked: its texts are read where the drawing holds them.
QString CCDataReader::NumeroNoCabo(const OdDbObjectId& entidade) const {
    CICad::TextosXData(entidade, "KVR_ZV_CABO", textosCabo_, codigosCabo_);
    const auto ehTexto = [this](std::size_t i) { return codigosCabo_[i] == 1000; };
    if (textosCabo_.size() < 2 || !ehTexto(0) || !ehTexto(1)) return {};
    // The core is the first part of the first text, when it has one or two parts.
    std::string_view nucleo, resto;
    if (!DivideCampo(textosCabo_[0], nucleo, resto)) nucleo = {};
    for (size_t i = 2; i < textosCabo_.size(); ++i) {
        if (!ehTexto(i)) continue;
        const std::string_view registro = textosCabo_[i];
        auto guardado = numerosCabos_.find(registro);
        if (guardado == numerosCabos_.end()) {
            const QString handle = QString::fromUtf8(registro.data(), int(registro.size()));
            guardado =
                numerosCabos_
                    .emplace(std::string(registro), NumeroDoRegistroCabo(CICad::IdDoHandle(handle)))
                    .first;
        }
        if (guardado->second)
            return *guardado->second + kSeparador +
                   QString::fromUtf8(nucleo.data(), int(nucleo.size()));
    }
    return {};
}

void CCDataReader::ConfereVersao() const {
    const std::uint64_t versao = CICad::VersaoDesenho();
    if (versao == versaoLidas_) return;
    numerosFios_.libera();
    numerosCabos_.clear();
    corteDe_ = OdDbObjectId();
    ligacoesPorElemento_.libera();
    ligacoesAntigas_.libera();
    entidadesLidas_.libera();
    entidadesAntigas_.libera();
    versaoLidas_ = versao;
}

CCDataReader::NumeroFio CCDataReader::LeNumeroFio(const OdDbObjectId& entidade) const {
    NumeroFio numero;
    if (std::optional<QString> proprio = NumeroNoCampoFio(entidade)) {
        numero.numero = *proprio;
        numero.proprio = true;
    } else {
        numero.numero = NumeroNoCabo(entidade);
    }
    return numero;
}

const CCDataReader::NumeroFio& CCDataReader::NumeroDoFioGuardado(
    const OdDbObjectId& entidade) const {
    ConfereVersao();
    if (const NumeroFio* achado = numerosFios_.procura(entidade)) return *achado;
    return numerosFios_.insere(entidade, LeNumeroFio(entidade));
}

QString CCDataReader::NumeroDoFio(const OdDbObjectId& entidade) const {
    return NumeroDoFioGuardado(entidade).numero;
}

bool CCDataReader::EhFioNumerado(const OdDbObjectId& entidade) const {
    return NumeroDoFioGuardado(entidade).proprio;
}

QString CCDataReader::VizinhoNaConexao(const OdDbObjectId& entidade, const CEPonto& ponto,
                                       bool anterior) {
    return VizinhoNoFio(FioNoPonto(LayerDe(entidade), ponto), entidade, ponto, anterior);
}

QString CCDataReader::VizinhoNoFio(const OdDbObjectId& fio, const OdDbObjectId& entidade,
                                   const CEPonto& ponto, bool anterior) const {
    const auto c = EntradasDoFio(fio);
    if (!c) return {};
    const int i = LugarDoVizinho(*c, entidade, ponto, anterior);
    return i < 0 ? QString() : c->elementos.value(i);
}

std::optional<TabelaConexoes::Entradas> CCDataReader::EntradasDoFio(const OdDbObjectId& fio) const {
    if (fio.isNull()) return std::nullopt;
    return conexoes_.DoFio(NumeroDoFio(fio));
}

std::optional<TabelaConexoes::Entradas> CCDataReader::EntradasDoFio(const OdDbObjectId& fio,
                                                                    QString& numero,
                                                                    bool& numerado) const {
    if (fio.isNull()) return std::nullopt;
    // A terminal's side asks for the wire at its point once: its number is read, not kept,
    // unless another question kept it before.
    ConfereVersao();
    const NumeroFio* guardado = numerosFios_.procura(fio);
    NumeroFio lido = guardado ? *guardado : LeNumeroFio(fio);
    numero = std::move(lido.numero);
    numerado = lido.proprio;
    return conexoes_.DoFio(numero);
}

int CCDataReader::LugarDoVizinho(const TabelaConexoes::Entradas& c, const OdDbObjectId& entidade,
                                 const CEPonto& ponto, bool anterior) {
    const TabelaConexoes::Textos& elementos = c.elementos;
    const std::span<const CEPonto> pontos = c.pontos;
    if (elementos.size() < 2 || pontos.size() < 2) return -1;
    auto ehEntidade = [&](int i) { return c.handles[size_t(i)] == entidade.handle(); };
    bool seguinte = false;
    for (int i = 0; i < elementos.size() && size_t(i) < pontos.size(); ++i) {
        const bool aqui =
            ehEntidade(i) && Distancia(pontos[size_t(i)], ponto) < kToleranciaElemento;
        if (anterior) {
            if (aqui && i > 0 && !ehEntidade(i - 1)) return i - 1;
            continue;
        }
        if (seguinte && !ehEntidade(i)) return i;
        seguinte = aqui;
    }
    return -1;
}

CEPonto CCDataReader::PontoDeCorte(const OdDbObjectId& referencia) const {
    ConfereVersao();
    if (!corteDe_.isNull() && corteDe_ == referencia) return corte_;
    corte_ = LePontoDeCorte(referencia);
    corteDe_ = referencia;
    return corte_;
}

CEPonto CCDataReader::LePontoDeCorte(const OdDbObjectId& referencia) const {
    const std::vector<CEPonto> pontos = CICad::PontosXData(referencia, "KVR_ZV_PTS_CORTE");
    if (pontos.size() >= 2)
        return CICad::PontosIguais(pontos[1], CICad::GetPosicao(referencia)) ? pontos[0]
                                                                             : pontos[1];
    const CEListaXData chave = CICad::GetXData(referencia, "KVR_ZV");
    if (chave.size() >= 3) return {chave[2].x, chave[2].y, chave[2].z};
    return {};
}

std::unique_ptr<zv::CEAtributo> CCDataReader::AtributoConexaoProximo(const OdDbObjectId& elemento,
                                                                     const CEPonto& ponto) const {
    const zv::CEAtributo* atributo = ConexaoProxima(elemento, ponto);
    return atributo ? std::make_unique<zv::CEAtributo>(*atributo) : nullptr;
}

const zv::CEAtributo* CCDataReader::ConexaoProxima(const OdDbObjectId& elemento,
                                                   const CEPonto& ponto) const {
    // An element is asked at each of its connections: its connection attributes and their
    // places are read once.
    ConfereVersao();
    const std::vector<LigacaoGuardada>* achado = ligacoesPorElemento_.procura(elemento);
    if (!achado) {
        std::vector<LigacaoGuardada> ligacoes;
        // One kept at the turn before comes back as it was.
        if (!ligacoesAntigas_.retira(elemento, ligacoes)) {
            if (atributosDe_ == elemento &&
                atributosVersao_ == CICad::VersaoDesenho(elemento.database())) {
                for (const LigacaoLida& lida : ligacoesLidas_)
                    ligacoes.push_back({CICad::GetPosicaoTexto(lida.id),
                                        zv::CEAtributo(lida.tag, QString(), lida.valor, lida.id,
                                                       CICad::AtributoInvisivel(lida.id))});
            } else {
                // The connection attributes as the drawing holds them, with their tags and
                // values trimmed as an attribute list gives them: the rest of the symbol is
                // not read, and no texts are made for the other attributes.
                tagsLigacoes_.clear();
                CICad::AtributosPostos(
                    elemento,
                    [this](std::string_view texto) {
                        const TagLida& tag = TagDoTexto(texto);
                        if (tag.ligacao) tagsLigacoes_.push_back(tag.texto);
                        return tag.ligacao;
                    },
                    atributosLigacoes_);
                for (std::size_t i = 0; i < atributosLigacoes_.size(); ++i) {
                    const CEAtributoPosto& atributo = atributosLigacoes_[i];
                    ligacoes.push_back(
                        {atributo.posicao,
                         zv::CEAtributo(tagsLigacoes_[i], QString(), ValorDoTexto(atributo.valor),
                                        atributo.id, atributo.invisivel)});
                }
            }
        }
        atributosDe_ = OdDbObjectId();
        if (ligacoesPorElemento_.size() >= limiteLidas_) {
            // The turn, as for the entities kept read.
            std::swap(ligacoesAntigas_, ligacoesPorElemento_);
            ligacoesPorElemento_.limpa();
        }
        achado = &ligacoesPorElemento_.insere(elemento, std::move(ligacoes));
    }
    const LigacaoGuardada* melhor = nullptr;
    double menor = 0.0;
    for (const LigacaoGuardada& ligacao : *achado) {
        const double d = Distancia(ligacao.posicao, ponto);
        if (!melhor || d < menor) melhor = &ligacao, menor = d;
    }
    return melhor ? &melhor->atributo : nullptr;
}

VetorItens* CCDataReader::LeDicionarioCabos(zvdb::Database* database) {
    auto* itens = new VetorItens;
    for (const auto& [nome, id] : CICad::GetEntradasDicionario({"ZV_CABOS"}, database)) {
        if (nome.trimmed().isEmpty()) continue;
        CEItemLista* item = CriaItemVirtual(id);
        if (!item) continue;
        if (item->valorCampo("ZV_LISTA") == "S")
            itens->push_back(item);
        else
            delete item;
    }
    return itens;
}

bool CCDataReader::EhEquipamento(const OdDbObjectId& id) const {
    // Asked at every entry of every wire: the application's name is passed as it stands,
    // not made into a text first. TextoXData answers whether it has items, as TemXData.
    QString texto;
    bool temTexto = false;
    return !id.isNull() && CICad::TextoXData(id, "KVR_ZV_EQUIPO", texto, temTexto);
}

// ---- items from entities

QString CCDataReader::ChaveDaEntidade(const OdDbObjectId& entidade) const {
    QString chave, norma;
    return ChaveENorma(entidade, chave, norma) ? chave : QString();
}

QString CCDataReader::NormaDaEntidade(const OdDbObjectId& entidade) const {
    QString chave, norma;
    return ChaveENorma(entidade, chave, norma) ? norma : QString();
}

void CCDataReader::LeColunasUsuario(const QString& sufixo, CEItemLista& item,
                                    const QStringList& colunas) {
    // Items of one catalogue key repeat its columns: each text is split once, and the items
    // share the value texts.
    for (const QString& coluna : colunas) {
        const auto& [numero, valor] = ColunaDividida(coluna);
        if (numero != kSemColuna)
            item.definirCampo(CamposItem::numeroComSufixo(numero, sufixo), valor);
    }
}

const std::pair<std::uint32_t, QString>& CCDataReader::ColunaDividida(const QString& coluna) {
    auto it = colunasDivididas_.constFind(coluna);
    if (it == colunasDivididas_.constEnd()) {
        QString nome, valor;
        const bool divide = ZVString(coluna).DivideEmDois(kSeparador, nome, valor);
        it = colunasDivididas_.insert(
            coluna, {divide && !nome.isEmpty() ? CamposItem::numero(nome) : kSemColuna, valor});
    }
    return *it;
}

void CCDataReader::LeLayer(const QString& sufixo, CEItemLista& item, const QString& layer) {
    item.definirCampo(NumeroCampo<"LAYER">(sufixo), layer);
    const std::pair<QString, QString>& partes = GrupoPagina(layer);
    item.definirCampo(NumeroCampo<"GRUPO">(sufixo), partes.first);
    item.definirCampo(NumeroCampo<"PAGINA">(sufixo), partes.second);
}

const std::pair<QString, QString>& CCDataReader::GrupoPagina(const QString& layer) const {
    auto it = gruposPaginas_.constFind(layer);
    if (it == gruposPaginas_.constEnd()) {
        const QStringList partes = ZVString(layer).Divide("$");
        it = gruposPaginas_.insert(layer, partes.size() == 3 ? std::pair(partes[0], partes[1])
                                                             : std::pair(QString(), QString()));
    }
    return *it;
}

QString CCDataReader::TextoTipo(const QString& tipo) {
    auto it = textosTipo_.constFind(tipo);
    if (it != textosTipo_.constEnd()) return *it;
    bool ok = false;
    const int n = tipo.trimmed().toInt(&ok);
    return textosTipo_
        .insert(tipo, CIMensagens::Mensagem("ZVLISTAS", ok && n >= 2 && n <= 26 ? 299 + n : 300))
        .value();
}

QString CCDataReader::Posicao(const OdDbObjectId& entidade) const {
    return PosicaoNoLayer(entidade, LayerDoNome(CICad::NomeLayerUtf8(entidade)));
}

QString CCDataReader::PosicaoNoLayer(const OdDbObjectId& entidade, const LayerLido& layer) const {
    // Parts are never empty: a page's layer has a group exactly when it has three.
    if (layer.grupo.isEmpty()) return "??";
    CEPonto p;
    if (CICad::EhPolilinha(entidade)) {
        // the index of its layer read it already, unless the drawing changed since
        const CEPonto* lido = nullptr;
        if (!indicesFios_.empty() && versaoIndices_ == CICad::VersaoDesenho()) {
            const auto indice = indicesFios_.find(layer.nome);
            if (indice != indicesFios_.end() && indice->second)
                lido = indice->second->Primeiro(entidade);
        }
        if (lido) {
            p = *lido;
        } else {
            const std::vector<CEPonto> vertices = CICad::GetVertices(entidade);
            if (vertices.empty()) return "??";
            p = vertices.front();
        }
    } else if (CICad::EhReferencia(entidade)) {
        p = CICad::GetPosicao(entidade);
    } else {
        return "??";
    }
    return PosicaoNoPonto(entidade, layer.grupo, layer.pagina, p);
}

void CCDataReader::LeCircuitoLocal(const QString& sufixo, CEItemLista& item,
                                   const OdDbObjectId& entidade) {
    int numero = 1;
    const bool tem = CICad::GetCircuitoLocal(entidade, numero);
    const Circuito& circuito = CircuitoDe(tem, numero);
    // PAINEL and LOCAL hold the same value: templates use either name.
    item.definirCampo(NumeroCampo<"PAINEL">(sufixo), circuito.painel);
    item.definirCampo(NumeroCampo<"LOCAL">(sufixo), circuito.painel);
    item.definirCampo(NumeroCampo<"CIRCUITO">(sufixo), circuito.circuito);
}

void CCDataReader::LeFio(const QString& s, CEItemLista& item, const OdDbObjectId& polilinha,
                         CETemplate* modelo) {
    if (LeCamposFio(s, item, polilinha) && LeRotas) LeRotasDoItem(item, modelo);
}

void CCDataReader::LeRotasDoItem(const CEItemLista& item, CETemplate* modelo) {
    const QString campoFio = CampoFio(item);
    if (!campoFio.isEmpty()) LeRotasFio(item.valorCampo(campoFio), modelo);
}

bool CCDataReader::LeCamposFio(const QString& s, CEItemLista& item, const OdDbObjectId& polilinha) {
    const bool completo = LoteFio(s, item.campos, polilinha);
    JuntaLote(item);
    return completo;
}

bool CCDataReader::LoteFio(const QString& s, const CamposItem& campos,
                           const OdDbObjectId& polilinha) {
    if (appFioEm_ != polilinha.database() ||
        appFioVersao_ != CICad::VersaoDesenho(polilinha.database())) {
        CICad::RegistraApp("KVR_ZV_WIRE", polilinha.database());
        appFioEm_ = polilinha.database();
        appFioVersao_ = CICad::VersaoDesenho(polilinha.database());
    }
    lote_.clear();
    // The key and the wire's own texts come from one walk of its extended data, the one
    // FioTemChave made when it asked for this polyline just before.
    std::string_view textoChave;
    bool temTextoChave = false, temChave = false;
    TextosGuardados& guardados = textosGuardados_;
    if (guardados.fio == polilinha && !polilinha.isNull() &&
        guardados.versao == CICad::VersaoDesenho(polilinha.database())) {
        textoChave = guardados.chave;
        temTextoChave = guardados.temTexto;
        temChave = guardados.tem;
    } else {
        temChave = CICad::TextosFio(polilinha, textoChave, temTextoChave, textosFio_);
    }
    guardados.fio = OdDbObjectId();
    // Wires repeat their key texts: each is split and looked up once for the run.
    const ChaveLida& daChave = temChave && temTextoChave ? ChaveDoTexto(textoChave) : semChave_;
    PoeColunasFio(s, daChave);
    const ChaveLida* chave = &semChave_;
    if (!textosFio_.empty()) {
        // The key text is most often the wire's first text itself: not looked up again.
        const std::string_view primeiro = textosFio_[0];
        const bool mesmo = &daChave != &semChave_ && primeiro.data() == textoChave.data() &&
                           primeiro.size() == textoChave.size();
        chave = mesmo ? &daChave : &ChaveDoTexto(primeiro);
        // Without key, standard and its second item the polyline is no complete wire.
        if (chave->chave.isEmpty() || chave->norma.isEmpty() || textosFio_.size() < 2 ||
            textosFio_[1].empty())
            return false;
        lote_.push_back({NumeroCampo<"ZV_KEY">(s), chave->chave});
        // Each wire has a number of its own: its field texts are split as they come, where
        // the drawing holds them; the names repeat and are numbered once.
        for (size_t i = 2; i < textosFio_.size(); ++i) {
            std::string_view nome, valor;
            if (!DivideCampo(textosFio_[i], nome, valor)) continue;
            const std::uint32_t numero =
                s.isEmpty()
                    ? NumeroDoNomeFio(nome)
                    : CamposItem::numero(QString::fromUtf8(nome.data(), int(nome.size())) + s);
            lote_.push_back({numero, Vale(numero)
                                         ? QString::fromUtf8(valor.data(), int(valor.size()))
                                         : QString()});
        }
    }
    const auto& [lista, descricao] = ListaDescricaoFioDe(*chave);
    lote_.push_back({NumeroCampo<"WIRE_LISTA">(s), lista});
    lote_.push_back({NumeroCampo<"DESCRICAO">(s), descricao});
    lote_.push_back({NumeroCampo<"TP_DESCRI">(s), descricao});
    const std::uint32_t posicao = NumeroCampo<"POSICAO">(s);
    const bool semPosicao = (!GuardaFios && PosicaoDescartada()) || !Vale(posicao);
    const std::uint32_t nomeLayer = NumeroCampo<"LAYER">(s), grupo = NumeroCampo<"GRUPO">(s),
                        pagina = NumeroCampo<"PAGINA">(s);
    // The layer's name is looked up only when a value asks for it.
    static const LayerLido kSemLayer;
    const bool comLayer = !semPosicao || Vale(nomeLayer) || Vale(grupo) || Vale(pagina);
    const LayerLido& layer = comLayer ? LayerDoNome(CICad::NomeLayerUtf8(polilinha)) : kSemLayer;
    lote_.push_back({posicao, semPosicao ? QString() : PosicaoNoLayer(polilinha, layer)});
    lote_.push_back({nomeLayer, Vale(nomeLayer) ? layer.nome : QString()});
    lote_.push_back({grupo, Vale(grupo) ? layer.grupo : QString()});
    lote_.push_back({pagina, Vale(pagina) ? layer.pagina : QString()});
    // QTD as the item has it so far: the last written here, or the item's own.
    const std::uint32_t qtd = NumeroCampo<"QTD">(s);
    const QString* valorQtd = nullptr;
    for (auto it = lote_.rbegin(); it != lote_.rend() && !valorQtd; ++it)
        if (it->nome == qtd) valorQtd = &it->valor;
    if (!valorQtd) valorQtd = campos.procura(qtd);
    if (!valorQtd || valorQtd->isEmpty()) lote_.push_back({qtd, QStringLiteral("1")});
    lote_.push_back({NumeroCampo<"SAP_MATERIAL">(s), QString()});
    return true;
}

bool CCDataReader::FioTemChave(const OdDbObjectId& polilinha) {
    TextosGuardados& guardados = textosGuardados_;
    guardados.tem = CICad::TextosFio(polilinha, guardados.chave, guardados.temTexto, textosFio_);
    guardados.fio = polilinha;
    guardados.versao = CICad::VersaoDesenho(polilinha.database());
    return guardados.tem && guardados.temTexto && !ChaveDoTexto(guardados.chave).chave.isEmpty();
}

std::uint32_t CCDataReader::NumeroDoNomeFio(std::string_view nome) {
    auto it = nomesFio_.find(nome);
    if (it != nomesFio_.end()) return it->second;
    // a drawing that makes up names keeps this bounded
    if (nomesFio_.size() >= (std::size_t(1) << 16)) nomesFio_.clear();
    const std::uint32_t numero =
        CamposItem::numero(QString::fromUtf8(nome.data(), int(nome.size())));
    nomesFio_.emplace(std::string(nome), numero);
    return numero;
}

void CCDataReader::LeEntidade(const QString& sufixo, CEItemLista& item, const OdDbObjectId& id,
                              CETemplate* modelo) {
    if (CICad::EhReferencia(id))
        LeBloco(sufixo, item, id, modelo);
    else if (CICad::EhPolilinha(id))
        LeFio(sufixo, item, id, modelo);
}

size_t CCDataReader::HashNomes::operator()(const std::vector<std::uint32_t>& nomes) const {
    size_t h = nomes.size();
    for (const std::uint32_t nome : nomes)
        h = h * 1000003u ^ nome;
    return h;
}

void CCDataReader::LeSoCampos(std::function<bool(const QString& nome)> quer) {
    querNome_ = std::move(quer);
    queridos_.clear();
    entidadesLidas_.libera();
    entidadesAntigas_.libera();
    avulsa_ = EntidadeLida();
}

bool CCDataReader::Quer(std::uint32_t nome) {
    if (!querNome_) return true;
    if (nome >= queridos_.size()) queridos_.resize(nome + 1, 0);
    char& querido = queridos_[nome];
    if (!querido) querido = querNome_(CamposItem::nome(nome)) ? 1 : 2;
    return querido == 1;
}

void CCDataReader::FiltraSufixos(std::function<bool(const QString& nome)> fica) {
    ficaComSufixo_ = std::move(fica);
    // The names under each suffix were put in order for the filter before.
    for (auto& [nomes, forma] : formas_)
        forma->sufixos.clear();
    posicoesDescartadas_.clear();
    // What the sides keep is the filter's: readings made for them under another may lack it.
    valeNosLados_.clear();
    if (!sufixosLados_.empty()) {
        entidadesLidas_.libera();
        entidadesAntigas_.libera();
    }
}

void CCDataReader::CopiasDosLados(std::vector<QString> sufixos) {
    sufixosLados_ = std::move(sufixos);
    valeNosLados_.clear();
    entidadesLidas_.libera();
    entidadesAntigas_.libera();
}

bool CCDataReader::CopiaDosLados() const {
    if (!copiaAvulsa_ || !ficaComSufixo_) return false;
    return std::any_of(sufixosLados_.begin(), sufixosLados_.end(), [this](const QString& s) {
        return s.isSharedWith(*copiaAvulsa_) || s == *copiaAvulsa_;
    });
}

bool CCDataReader::ValeNosLados(std::uint32_t nome) {
    if (nome >= valeNosLados_.size()) valeNosLados_.resize(size_t(nome) + 1, 0);
    char& vale = valeNosLados_[nome];
    if (!vale) {
        // QTD always: whether the reading has one decides where a copy puts its "1".
        const QString& texto = CamposItem::nome(nome);
        const bool algum = texto == QLatin1String("QTD") ||
                           std::any_of(sufixosLados_.begin(), sufixosLados_.end(),
                                       [&](const QString& s) { return ficaComSufixo_(texto + s); });
        vale = algum ? 1 : 2;
    }
    return vale == 1;
}

CCDataReader::FormaCampos::ComSufixo& CCDataReader::FormaCampos::Com(
    const QString& sufixo, const std::function<bool(const QString&)>* fica) {
    // The callers pass the same few texts again and again: the same text is known at once.
    for (ComSufixo& feito : sufixos)
        if (feito.sufixo.isSharedWith(sufixo)) return feito;
    for (ComSufixo& feito : sufixos)
        if (feito.sufixo == sufixo) return feito;
    // The names under the suffix enter the name table in the order of the plain names, as
    // when each copy renamed its own fields.
    ComSufixo novo{sufixo, NumeroCampo<"QTD">(sufixo), {}, {}, {}, {}};
    // Every name is numbered, kept or not, so that the names' order stays that of a full copy.
    const bool filtra = fica && *fica && !sufixo.isEmpty();
    if (filtra) novo.qtdFica = (*fica)(CamposItem::nome(novo.qtd));
    std::vector<std::pair<std::uint32_t, std::uint32_t>> pares;
    pares.reserve(nomes.size());
    for (size_t i = 0; i < nomes.size(); ++i) {
        const std::uint32_t nome = CamposItem::numeroComSufixo(nomes[i], sufixo);
        if (!filtra || (*fica)(CamposItem::nome(nome))) pares.emplace_back(nome, std::uint32_t(i));
    }
    std::sort(pares.begin(), pares.end());
    novo.nomes.reserve(pares.size());
    novo.lugares.reserve(pares.size());
    for (const auto& [nome, lugar] : pares) {
        novo.nomes.push_back(nome);
        novo.lugares.push_back(lugar);
    }
    sufixos.push_back(std::move(novo));
    return sufixos.back();
}

CCDataReader::EntidadeLida CCDataReader::LeEntidadeGuardada(const OdDbObjectId& id,
                                                            CETemplate* modelo) {
    Q_UNUSED(modelo);
    // A QTD of the entity's own replaces this mark; without one the mark stays.
    static const QString kMarca = QStringLiteral("\x01");
    const std::uint32_t qtd = NumeroCampo<"QTD">();
    CEItemLista& lido = leitura_;
    lido.campos.clear();
    EntidadeLida lida;
    std::vector<std::uint32_t>& nomes = nomesLidos_;
    nomes.clear();
    bool marcada = false;
    FormaCampos** formaDaOrdem = nullptr;
    if (CICad::EhReferencia(id)) {
        // The symbol's fields go from the batch into the kept form, with no item between.
        lido.definirCampo(qtd, kMarca);
        if (chaveLidaDe_ == id) {
            CICad::CompletaLeituraSimbolo(id, simbolo_);
            chaveLidaDe_ = OdDbObjectId();
        } else {
            CICad::LeituraSimbolo(id, simbolo_);
        }
        FazLote(QString(), lido.campos, id);
        lida.borne = EhBlocoDeBorne(simbolo_.bloco);
        OrdemLote& ordem = OrdenaLote();
        marcada = TiraLote(ordem.ordem, qtd, kMarca, nomes, lida.valores);
        lida.qtdPadrao = marcada;
        // Unless its QTD was the mark, the batch keeps every name: the form is the order's.
        if (nomes.size() == ordem.ordem.size()) formaDaOrdem = &ordem.forma;
    } else if (CICad::EhPolilinha(id)) {
        // A wire's fields take the symbols' way, from the batch into the kept form.
        lido.definirCampo(qtd, kMarca);
        const bool completa = lida.rotas = LoteFio(QString(), lido.campos, id);
        lida.fio = true;
        OrdemLote& ordem = OrdenaLote();
        marcada = TiraLote(ordem.ordem, qtd, kMarca, nomes, lida.valores);
        lida.qtdPadrao = marcada && completa;
        if (nomes.size() == ordem.ordem.size()) formaDaOrdem = &ordem.forma;
    }
    if (lida.qtdPadrao) lida.valores.push_back(QStringLiteral("1"));
    if (formaDaOrdem && *formaDaOrdem) {
        lida.forma = *formaDaOrdem;
        return lida;
    }
    auto forma = formas_.find(nomes);
    if (forma == formas_.end())
        forma = formas_.emplace(nomes, std::make_unique<FormaCampos>(FormaCampos{nomes, {}})).first;
    lida.forma = forma->second.get();
    if (formaDaOrdem) *formaDaOrdem = lida.forma;
    return lida;
}

bool CCDataReader::TiraLote(const std::vector<std::uint64_t>& ordem, std::uint32_t qtd,
                            const QString& marca, std::vector<std::uint32_t>& nomes,
                            std::vector<QString>& valores) {
    // As the batch joined to an item holding the mark alone, and that item's fields taken
    // out: the mark stays unless the batch has a QTD.
    const std::size_t n = ordem.size();
    valores.reserve(n + 1);
    bool temQtd = false, marcada = false;
    for (std::size_t j = 0; j < n; ++j) {
        const std::uint32_t nome = std::uint32_t(ordem[j] >> 32);
        QString& valor = lote_[std::uint32_t(ordem[j])].valor;
        if (nome == qtd) {
            temQtd = true;
            if (valor == marca) {
                marcada = true;
                continue;
            }
        }
        nomes.push_back(nome);
        valores.push_back(std::move(valor));
    }
    lote_.clear();
    return marcada || !temQtd;
}

const CCDataReader::EntidadeLida& CCDataReader::EntidadeGuardada(const OdDbObjectId& id,
                                                                 CETemplate* modelo) {
    // A reading made for the sides serves none but their copies.
    const bool lados = !sufixosLados_.empty() && CopiaDosLados();
    const auto le = [&] {
        lendoLados_ = lados;
        EntidadeLida lida = LeEntidadeGuardada(id, modelo);
        lendoLados_ = false;
        lida.lados = lados;
        return lida;
    };
    if (const EntidadeLida* achado = entidadesLidas_.procura(id)) {
        if (lados || !achado->lados) return *achado;
        avulsa_ = le();
        return avulsa_;
    }
    EntidadeLida lida;
    if (!entidadesAntigas_.retira(id, lida) || (lida.lados && !lados)) {
        lida = le();
        if ((lida.fio && !GuardaFios) || (lida.borne && !GuardaBornes)) {
            avulsa_ = std::move(lida);
            return avulsa_;
        }
    }
    if (entidadesLidas_.size() >= limiteLidas_) {
        // The turn: what was not asked for again since the last one goes.
        // The arrays are kept: each turn fills as many again.
        std::swap(entidadesAntigas_, entidadesLidas_);
        entidadesLidas_.limpa();
    }
    return entidadesLidas_.insere(id, std::move(lida));
}

bool CCDataReader::PosicaoDescartada() const {
    // Only a wire's reading that serves one copy, under a suffix whose filter drops it.
    if (!copiaAvulsa_ || GuardaFios || !ficaComSufixo_ || copiaAvulsa_->isEmpty()) return false;
    for (const auto& [sufixo, descartada] : posicoesDescartadas_)
        if (sufixo.isSharedWith(*copiaAvulsa_) || sufixo == *copiaAvulsa_) return descartada;
    const bool descartada =
        !ficaComSufixo_(CamposItem::nome(NumeroCampo<"POSICAO">(*copiaAvulsa_)));
    posicoesDescartadas_.emplace_back(*copiaAvulsa_, descartada);
    return descartada;
}

void CCDataReader::CopiaEntidade(const QString& sufixo, CEItemLista& item, const OdDbObjectId& id,
                                 CETemplate* modelo, const QString* numeroFio) {
    ConfereVersao();
    copiaAvulsa_ = &sufixo;
    const EntidadeLida& lida = EntidadeGuardada(id, modelo);
    copiaAvulsa_ = nullptr;
    const bool rotas = lida.rotas && LeRotas;
    FormaCampos::ComSufixo& com = lida.forma->Com(sufixo, &ficaComSufixo_);
    const std::uint32_t qtd = com.qtd;
    const QString* qtdAtual = com.qtdFica ? item.campos.procura(qtd) : nullptr;
    const bool poeQtd = com.qtdFica && lida.qtdPadrao && (!qtdAtual || qtdAtual->isEmpty());
    if (poeQtd && com.nomesQtd.empty()) {
        // The batch holds no QTD: the "1" joins it in its place, so the item's fields move
        // once.
        const auto lugar = std::lower_bound(com.nomes.begin(), com.nomes.end(), qtd);
        com.nomesQtd.assign(com.nomes.begin(), lugar);
        com.nomesQtd.push_back(qtd);
        com.nomesQtd.insert(com.nomesQtd.end(), lugar, com.nomes.end());
        const auto n = lugar - com.nomes.begin();
        com.lugaresQtd.assign(com.lugares.begin(), com.lugares.begin() + n);
        // The "1" stands after all the reading's values, kept by the copy or not.
        com.lugaresQtd.push_back(std::uint32_t(lida.forma->nomes.size()));
        com.lugaresQtd.insert(com.lugaresQtd.end(), com.lugares.begin() + n, com.lugares.end());
    }
    const std::vector<std::uint32_t>& nomes = poeQtd ? com.nomesQtd : com.nomes;
    const std::vector<std::uint32_t>& lugares = poeQtd ? com.lugaresQtd : com.lugares;
    const auto nome = [&nomes](size_t j) { return nomes[j]; };
    if (&lida == &avulsa_) {
        // A reading kept for no other copy gives its values up: no count is raised, nor the
        // values' texts visited.
        std::vector<QString>& soltos = avulsa_.valores;
        item.campos.juntarOrdenados(nomes.size(), nome, [&lugares, &soltos](size_t j) -> QString&& {
            return std::move(soltos[lugares[j]]);
        });
    } else {
        const std::vector<QString>& valores = lida.valores;
        item.campos.juntarOrdenados(
            nomes.size(), nome,
            [&lugares, &valores](size_t j) -> const QString& { return valores[lugares[j]]; });
    }
    if (rotas && numeroFio)
        LeRotasFio(*numeroFio, modelo);
    else if (rotas)
        LeRotasDoItem(item, modelo);
}

CEItemLista* CCDataReader::CriaItemBloco(const OdDbObjectId& referencia, CETemplate& modelo) {
    // A symbol read here is read once: its key is told by the first part of the reading,
    // which a kept reading made for the copy completes.
    const bool copia = GuardaSimbolos && CICad::EhReferencia(referencia);
    if (!LeChaveDoSimbolo(referencia)) return nullptr;
    auto* item = new CEItemLista;
    item->ids.push_back(referencia);
    if (CamposPrevistos) item->campos.reservar(CamposPrevistos);
    bool lida = true;
    if (copia) {
        chaveLidaDe_ = referencia;
        CopiaEntidade(QString(), *item, referencia, &modelo);
        // Found kept, the reading was not made: the part read serves nothing else.
        lida = chaveLidaDe_.isNull();
        chaveLidaDe_ = OdDbObjectId();
    } else {
        CICad::CompletaLeituraSimbolo(referencia, simbolo_);
        LeSimboloCortado(*item, referencia);
    }
    if (lida) lidaAgora_ = referencia;
    LerLadoIni(*item, referencia, modelo);
    lidaAgora_ = OdDbObjectId();
    LerLadoFim(*item, referencia, modelo);
    return item;
}

CEItemLista* CCDataReader::CriaItemFio(const OdDbObjectId& polilinha, CETemplate& modelo) {
    if (GuardaAcessorios) {
        // What the accessories ask of the wire comes in the same walk as its key.
        if (!LeChaveDoSimbolo(polilinha)) return nullptr;
        GuardaAcessoriosDe(polilinha, ChaveDoTexto(simbolo_.textoChave));
    } else if (ChaveDaEntidade(polilinha).isEmpty()) {
        return nullptr;
    }
    auto* item = new CEItemLista;
    item->ids.push_back(polilinha);
    if (FiosDasLeituras && GuardaFios && CICad::EhPolilinha(polilinha))
        CopiaEntidade(QString(), *item, polilinha, &modelo);
    else
        LeFio(QString(), *item, polilinha, &modelo);
    LerLadoIni(*item, polilinha, modelo);
    LerLadoFim(*item, polilinha, modelo);
    return item;
}

CEItemLista* CCDataReader::CriaItemVirtual(const OdDbObjectId& registro) {
    QString chave, norma;
    if (!ChaveENorma(registro, chave, norma) || chave.isEmpty()) return nullptr;
    const bool cabo = CICad::TemXData(registro, "KVR_ZV_CABO");
    auto* item = new CEItemLista;
    item->ids.push_back(registro);
    LeColunasUsuario(QString(), *item,
                     cabo ? catalogo_.ColunasCabo(chave) : catalogo_.ColunasComp(chave));
    std::unique_ptr<zv::CEListaAtributos> atributos;
    CICad::GetAtributosVirtuais(registro, atributos);
    for (int i = 0; atributos && i < atributos->Quantidade(); ++i)
        item->definirCampo((*atributos)[i].GetTag(), (*atributos)[i].GetValor());
    item->definirCampo("ZV_KEY", chave);
    item->definirCampo("HANDLE", ZVString::DeHandle(registro.handle()));
    item->definirCampo(
        "ZV_LISTA", cabo ? catalogo_.ListaCabo(chave, norma) : catalogo_.ListaComp(chave, norma));
    LeCircuitoLocal(QString(), *item, registro);
    const QString descricao =
        cabo ? catalogo_.DescricaoCabo(chave) : catalogo_.DescricaoComp(chave);
    item->definirCampo("DESCRICAO", descricao);
    item->definirCampo("TP_DESCRI", descricao);
    return item;
}

CEItemLista* CCDataReader::CriaItemEntidade(const OdDbObjectId& entidade, CETemplate& modelo) {
    if (CICad::EhReferencia(entidade)) return CriaItemBloco(entidade, modelo);
    if (CICad::TipoEntidade(entidade) == "XRECORD") return CriaItemVirtual(entidade);
    if (CICad::EhPolilinha(entidade)) return CriaItemFio(entidade, modelo);
    return nullptr;
}

CEItemLista* CCDataReader::CriaItemChave(const QString& relacao, const QString& chave,
                                         const QString& norma) {
    auto* item = new CEItemLista;
    for (int i = 1; i <= 3; ++i)
        item->definirCampo(CICad::TagTraduzida(CampoTraduzido::Relacao, i), relacao);
    item->definirCampo("ZV_KEY", chave);
    item->definirCampo("ZV_LISTA", catalogo_.ListaComp(chave, norma));
    const QString descricao = catalogo_.DescricaoComp(chave);
    item->definirCampo("DESCRICAO", descricao);
    item->definirCampo("TP_DESCRI", descricao);
    LeColunasUsuario(QString(), *item, catalogo_.ColunasComp(chave));
    return item;
}

void CCDataReader::LeRotasFio(const QString& chave, CETemplate* modelo) {
    if (caminhos_.contains(chave)) return;
    if (!rotasLidas_) {
        rotasLidas_ = true;
        for (const auto& [id, campos] :
             ZVData::CESerializable::CarregarClasse("CELayoutRotasFios")) {
            CELayoutRotasFios rota;
            if (!rota.Carregar(campos)) continue;
            rotasPorChave_[rota.strKeyFio].push_back(rotas_.size());
            rotas_.push_back({rota.strKeyFio, rota.strRotaData});
        }
    }
    // Only the records of this key, in store order: a project routes thousands of wires.
    for (const std::size_t lugar : rotasPorChave_.value(chave)) {
        const Rota& rota = rotas_[lugar];
        const QStringList segmentos = rota.dados.split('$', Qt::SkipEmptyParts);
        if (segmentos.isEmpty()) continue;
        QHash<QString, QString> mapa;
        for (const QString& segmento : segmentos) {
            const QStringList partes = segmento.split('-');
            if (partes.size() < 3) continue;
            const QStringList ini = partes[0].split(':'), fim = partes[1].split(':');
            const QString chaveRota =
                RotuloElemento(ini[0], ini.size() == 2 ? ini[1] : QString(), modelo) + "-" +
                RotuloElemento(fim[0], fim.size() == 2 ? fim[1] : QString(), modelo);
            mapa.insert(chaveRota, partes.mid(2).join('-'));
        }
        caminhos_.insert(chave, mapa);
        return;
    }
}

const QHash<QString, QString>* CCDataReader::Caminhos(const QString& chave) const {
    auto it = caminhos_.constFind(chave);
    return it == caminhos_.constEnd() ? nullptr : &it.value();
}

void CCDataReader::Separadores(CETemplate* modelo, QString& primeiro, QString& segundo) {
    primeiro =
        modelo ? modelo->LerTexto("*CHAR_SEP_STD_CFG*") : CICad::GetStringLisp("*EXPORT_CHAR_SEP*");
    segundo = modelo ? modelo->LerTexto("*CHAR_SEP_LIG_CFG*")
                     : CICad::GetStringLisp("*EXPORT_CHAR_SEP_LIG*");
    if (primeiro.isEmpty()) primeiro = ":";
}

QString CCDataReader::CampoFio(const CEItemLista& item, const QString& sufixo) {
    // Asked for every stretch end: the names are looked up by their numbers.
    static const std::array<std::uint32_t, 4> kNomes{
        CamposItem::numero(CICad::TagTraduzida(CampoTraduzido::Fio, 1)),
        CamposItem::numero(CICad::TagTraduzida(CampoTraduzido::Fio, 2)),
        CamposItem::numero(CICad::TagTraduzida(CampoTraduzido::Fio, 3)),
        CamposItem::numero(QStringLiteral("FIO"))};
    for (const std::uint32_t nome : kNomes) {
        const std::uint32_t numero = CamposItem::numeroComSufixo(nome, sufixo);
        if (item.campos.procura(numero)) return CamposItem::nome(numero);
    }
    return QString();
}

QString CCDataReader::RotuloElemento(const QString& handle, const QString& conexao,
                                     CETemplate* modelo) {
    const OdDbObjectId elemento = CICad::IdDoHandle(handle);
    auto texto = [&elemento](CampoTraduzido campo) {
        std::unique_ptr<zv::CEAtributo> atributo;
        if (elemento.isNull() || CICad::GetAtributoTraduzido(campo, elemento, atributo) != 0 ||
            !atributo)
            return QString();
        return atributo->GetValor();
    };
    QString primeiro, segundo;
    Separadores(modelo, primeiro, segundo);
    const QString relacao = texto(CampoTraduzido::Relacao);
    const QString regua = texto(CampoTraduzido::Regua), numero = texto(CampoTraduzido::Numero);
    if (!regua.isEmpty() && !numero.isEmpty()) return regua + primeiro + numero + segundo + conexao;
    if (relacao.isEmpty()) return QString();
    return conexao.isEmpty() ? relacao : relacao + primeiro + conexao;
}
