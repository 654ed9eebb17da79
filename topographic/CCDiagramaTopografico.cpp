#include "CCDiagramaTopografico.h"

#include "cad/CICad.h"
#include "host/sdk/SystemServices.h"
#include "host/sdk/UserInterface.h"
#include "lists/CETemplateLisp.h"
#include "module/CIProgress.h"
#include "module/ZVResultado.h"
#include "readers/CEAtributo.h"
#include "readers/CEListaAtributos.h"
#include "readers/CamposItem.h"
#include "readers/Descarte.h"
#include "readers/ZVString.h"
#include "settings/CIMensagens.h"

#include <QFile>
#include <QSet>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <iterator>
#include <memory>

namespace {

constexpr int kMsgModelo = 88;
constexpr int kMsgGrupoExiste = 89;
constexpr int kMsgSemRepresentacao = 970;
constexpr int kMsgSemGrupo = 971;
constexpr int kMsgCanto = 972;
constexpr int kMsgRetangulo = 973;
constexpr int kMsgArquivoBloco = 974;
constexpr int kMsgNadaADesenhar = 975;
constexpr int kMsgDesenhado = 976;
constexpr int kMsgJaDesenhados = 977;
// Items freed per hand-over to the freeing thread once their blocks are in.
constexpr std::size_t kLoteInseridos = 4096;

const char* const kAppSimbolo = "KVR_ZV";
const char* const kAppRepresentacao = "KVR_ZV_REPRESENTACAO";
const char* const kAppRepresentacaoEsq = "KVR_ZV_REPRESENTACAO_ESQ";
const char* const kAppRepresentacaoAce = "KVR_ZV_REPRESENTACAO_ACE";
const char* const kAppRepresentacaoAceEsq = "KVR_ZV_REPRESENTACAO_ACE_ESQ";
const char* const kAppAditivo = "ZV_VINC_ADITIVO";
const CEListaXData kSemDados;
const char* const kPassoPadrao = "15";
// The item's place as read, which the sort keeps among items that sort alike.
const char* const kCampoSequencia = "ZV_TOPO_SEQUENCIA";

// Every item carries its candidate's key under this name.
const QString kHandle = QStringLiteral("HANDLE");

// Whether an item read is on the lists.
bool Listado(const CEItemLista& item) {
    static const std::uint32_t kLista = CamposItem::numero(QStringLiteral("ZV_LISTA"));
    const QString* valor = item.campos.procura(kLista);
    return valor && *valor == QLatin1String("S");
}

// The symbol's handle in an accessory's key: what follows its last "_".
QStringView SimboloDoAcessorio(const QString& chave) {
    return QStringView(chave).mid(chave.lastIndexOf('_') + 1);
}

// Anonymous blocks and connector pins, by the block's name in upper case. A name that
// starts with ASCII needs no upper-case copy to tell.
bool NuncaDesenhado(const QString& bloco) {
    const QLatin1String pino("PIN-");
    if (bloco.startsWith('*')) return true;
    for (int i = 0; i < std::min(bloco.size(), pino.size()); ++i)
        if (bloco[i].unicode() >= 0x80) return bloco.toUpper().startsWith(pino);
    return bloco.startsWith(pino, Qt::CaseInsensitive);
}

// The catalogue type of terminal blocks.
const char* const kTipoBorne = "5";

QString Mensagem(int numero) {
    return CIMensagens::Mensagem("ZVLISTAS", numero);
}

// A message with a text of the run behind it, on a line of its own.
void ImprimeCom(int numero, const QString& texto) {
    CICad::Imprime("\n" + Mensagem(numero) + texto + "\n");
}

bool PerguntaSimNao(int numero) {
    zvsdk::SystemServices* servicos = zvsdk::systemServices();
    if (!servicos || !servicos->userInterface()) return false;
    return servicos->userInterface()->askYesNo("question:" + QString::number(numero),
                                               Mensagem(numero), false);
}

QString CriaPagina(const QString& grupo) {
    zvsdk::ResultBuffer* chamada = zvsdk::newString("criarpagina");
    chamada->rbnext = zvsdk::newString(grupo);
    chamada->rbnext->rbnext = zvsdk::newShort(0);
    CICad::LiberaLista(CICad::InvokeChain(chamada));
    zvsdk::releaseChain(chamada);
    // Whatever layer criarpagina left current is the page.
    return CICad::GetLayerCorrente();
}

// The strip of a terminal, in the first language that names one.
QString ReguaDe(const CEItemLista& item) {
    static const std::uint32_t kNomes[] = {CamposItem::numero(QStringLiteral("REGUA")),
                                           CamposItem::numero(QStringLiteral("STRIP")),
                                           CamposItem::numero(QStringLiteral("REGLETA"))};
    for (const std::uint32_t campo : kNomes)
        if (const QString* valor = item.campos.procura(campo); valor && !valor->isEmpty())
            return *valor;
    return QString();
}

// The pairs of a representation chain: key and handle, one after the other.
std::vector<std::pair<QString, QString>> Pares(const CEListaXData& cadeia) {
    std::vector<std::pair<QString, QString>> pares;
    for (size_t i = 0; i + 1 < cadeia.size(); i += 2)
        pares.emplace_back(cadeia[i].texto, cadeia[i + 1].texto);
    return pares;
}

// Keeps the entries for which `fica` says so, asked in order, the kept ones in order.
template <class Entradas, class Fica>
void Filtra(Entradas& entradas, Fica fica) {
    auto destino = entradas.begin();
    for (auto it = entradas.begin(); it != entradas.end(); ++it)
        if (fica(*it)) {
            if (destino != it) *destino = std::move(*it);
            ++destino;
        }
    entradas.erase(destino, entradas.end());
}

// In key order; of entries with one key the first gathered stays. The places are sorted and
// each entry, large beside its key, moves once.
template <class Entradas>
void OrdenaPorChave(Entradas& entradas) {
    struct Lugar {
        CCDiagramaTopografico::ChaveDeOrdem chave;
        std::size_t indice;
    };
    std::vector<Lugar> ordem;
    ordem.reserve(entradas.size());
    for (std::size_t i = 0; i < entradas.size(); ++i)
        ordem.push_back({CCDiagramaTopografico::ChaveDeOrdem(entradas[i].first), i});
    std::stable_sort(ordem.begin(), ordem.end(),
                     [](const Lugar& a, const Lugar& b) { return a.chave < b.chave; });
    Entradas ordenadas;
    ordenadas.reserve(entradas.size());
    for (const Lugar& lugar : ordem)
        if (ordenadas.empty() || ordenadas.back().first != entradas[lugar.indice].first)
            ordenadas.push_back(std::move(entradas[lugar.indice]));
    entradas = std::move(ordenadas);
}

// What an accessory takes of its owner: tag, strip and number in every language, and the
// page. The names are looked up once: a project has thousands of accessories.
const std::vector<std::uint32_t>& NomesDoDono() {
    static const std::vector<std::uint32_t> nomes = [] {
        QStringList textos;
        for (CampoTraduzido campo :
             {CampoTraduzido::Relacao, CampoTraduzido::Regua, CampoTraduzido::Numero})
            for (int idioma = 1; idioma <= 3; ++idioma)
                textos << CICad::TagTraduzida(campo, idioma);
        textos << "PAGINA"
               << "GRUPO"
               << "LAYER"
               << "POSICAO";
        std::vector<std::uint32_t> numeros;
        for (const QString& texto : textos)
            numeros.push_back(CamposItem::numero(texto));
        return numeros;
    }();
    return nomes;
}

std::string_view Vista(const QByteArray& texto) {
    return {texto.constData(), std::size_t(texto.size())};
}

// A key's handle and place (hexadecimal digits and marks) as the links write them: ASCII
// goes byte for byte into `espaco`, anything else through `reserva`.
std::string_view Ascii(QStringView texto, std::array<char, 24>& espaco, QByteArray& reserva) {
    bool ascii = texto.size() <= qsizetype(espaco.size());
    for (qsizetype i = 0; ascii && i < texto.size(); ++i) {
        ascii = texto[i].unicode() < 0x80;
        espaco[std::size_t(i)] = char(texto[i].unicode());
    }
    if (ascii) return {espaco.data(), std::size_t(texto.size())};
    reserva = texto.toUtf8();
    return Vista(reserva);
}

// A handle's text as the drawing writes it: upper-case hexadecimal digits without leading
// zeros, in `digitos`.
std::string_view TextoHandle(std::uint64_t handle, std::array<char, 16>& digitos) {
    int n = 0;
    do {
        digitos[15 - n++] = "0123456789ABCDEF"[handle & 15];
        handle >>= 4;
    } while (handle != 0);
    return {digitos.data() + 16 - n, std::size_t(n)};
}

// The entries of a pass's pages, to size what is kept per key.
int Quantidade(const std::vector<CCDiagramaTopografico::Pagina>& paginas) {
    size_t n = 0;
    for (const CCDiagramaTopografico::Pagina& pagina : paginas)
        for (const CCDiagramaTopografico::Linha& linha : pagina)
            n += linha.size();
    return int(n);
}

}  // namespace

CCDiagramaTopografico::ChaveDeOrdem::ChaveDeOrdem(QStringView texto) : texto_(texto) {
    for (qsizetype i = 0; i < 8; ++i) {
        const char16_t c = i < texto.size() ? texto[i].unicode() : u'\0';
        if (i < texto.size() && (c == 0 || c >= 0x80)) {
            ascii_ = false;
            break;
        }
        prefixo_ = prefixo_ << 8 | c;
    }
}

bool operator<(const CCDiagramaTopografico::ChaveDeOrdem& a,
               const CCDiagramaTopografico::ChaveDeOrdem& b) {
    if (a.ascii_ && b.ascii_ && a.prefixo_ != b.prefixo_) return a.prefixo_ < b.prefixo_;
    return a.texto_ < b.texto_;
}

// ---- extents and the rectangle

double CCDiagramaTopografico::Extensao::Largura() const {
    return std::max(xMin, xMax) - std::min(xMin, xMax);
}

double CCDiagramaTopografico::Extensao::Altura() const {
    return std::max(yMin, yMax) - std::min(yMin, yMax);
}

double CCDiagramaTopografico::Extensao::MenorX() const {
    return std::min(xMin, xMax);
}

CCDiagramaTopografico::Extensao CCDiagramaTopografico::ExtensaoAbsoluta(double xMin, double xMax,
                                                                        double yMin, double yMax) {
    // Stored as absolute values: an extent that crosses an axis reads narrower than it is,
    // and the layouts made so far rely on that reading.
    return {std::abs(xMin), std::abs(xMax), std::abs(yMin), std::abs(yMax)};
}

bool CCDiagramaTopografico::LeCanto(const QString& texto, CEPonto& canto) {
    canto = {};
    QStringList partes = texto.split(',');
    if (partes.size() == 2) partes << "0";
    if (partes.size() != 3) return false;
    double valores[3];
    for (int i = 0; i < 3; ++i) {
        bool ok = false;
        valores[i] = partes[i].trimmed().toDouble(&ok);
        if (!ok || !std::isfinite(valores[i])) return false;
    }
    canto = {CICad::Simples(valores[0]), CICad::Simples(valores[1]), CICad::Simples(valores[2])};
    return true;
}

CCDiagramaTopografico::Retangulo CCDiagramaTopografico::RetanguloDe(const CEPonto& a,
                                                                    const CEPonto& b) {
    return {std::min(a.x, b.x), std::max(a.y, b.y), std::abs(a.x - b.x), std::abs(a.y - b.y)};
}

// ---- rows and pages

// The layout works on any key: the candidates' keys, or the places of the items read, with
// what a key's block measures given by `extensao` (and `passo`), and each point handed to
// `poe`.
namespace {

using D = CCDiagramaTopografico;

template <class Chave, class ExtensaoDe>
std::vector<std::vector<Chave>> LinhasDeBlocos(const std::vector<Chave>& chaves,
                                               const ExtensaoDe& extensao, double largura,
                                               double margem, int colunas) {
    std::vector<std::vector<Chave>> linhas;
    size_t i = 0;
    while (i < chaves.size()) {
        std::vector<Chave> linha;
        double t = 0.0;
        do {
            const double w = extensao(chaves[i]).Largura() + margem;
            t += w;
            // A block wider than the rectangle gets a row of its own and sticks out.
            if (!(t < largura || (linha.empty() && w >= largura))) break;
            linha.push_back(chaves[i++]);
        } while (t < largura && i < chaves.size() &&
                 (colunas < 1 || linha.size() < size_t(colunas)));
        if (linha.empty()) linha.push_back(chaves[i++]);  // a negative margin: still progress
        linhas.push_back(std::move(linha));
    }
    return linhas;
}

// `Borne` has a key, a step and a strip name.
template <class Borne, class Chave = decltype(Borne::chave)>
std::vector<std::vector<Chave>> LinhasDeBornes(const std::vector<Borne>& bornes, double largura,
                                               double margem) {
    std::vector<std::vector<Chave>> linhas;
    QString ultimaRegua;
    size_t i = 0;
    while (i < bornes.size()) {
        std::vector<Chave> linha;
        double t = 0.0;
        while (t < largura && i < bornes.size()) {
            const Borne& borne = bornes[i];
            const double d = borne.passo;
            t += d;
            if (ultimaRegua.isEmpty()) ultimaRegua = borne.regua;
            // A new strip: the terminal stands twice, and so one step further on.
            if (borne.regua != ultimaRegua) {
                ultimaRegua = borne.regua;
                linha.push_back(borne.chave);
            }
            if (t + margem < largura || (linha.empty() && d >= largura)) {
                linha.push_back(borne.chave);
                ++i;
            } else if (d <= 0.0) {
                break;  // a step that doesn't grow the row would try forever
            }
        }
        // Nothing fitted and nothing grew: the terminal goes alone rather than never.
        if (linha.empty()) linha.push_back(bornes[i++].chave);
        linhas.push_back(std::move(linha));
    }
    return linhas;
}

template <class Chave, class ExtensaoDe>
std::vector<std::vector<std::vector<Chave>>> PaginasDe(std::vector<std::vector<Chave>> linhas,
                                                       const ExtensaoDe& extensao, double altura,
                                                       double margem, int maxLinhas) {
    std::vector<std::vector<std::vector<Chave>>> paginas;
    if (linhas.empty()) return paginas;
    paginas.emplace_back();
    double u = 0.0;
    for (std::vector<Chave>& linha : linhas) {
        double h = 0.0;
        for (const Chave& chave : linha)
            h = std::max(h, extensao(chave).Altura());
        std::vector<std::vector<Chave>>& atual = paginas.back();
        if ((u + h > altura && !atual.empty()) ||
            (maxLinhas > 0 && atual.size() >= size_t(maxLinhas))) {
            paginas.emplace_back();
            u = 0.0;
        }
        paginas.back().push_back(std::move(linha));
        u += h + margem;
    }
    return paginas;
}

template <class Chave, class ExtensaoDe, class Poe>
void PosicoesDeBlocos(const std::vector<std::vector<std::vector<Chave>>>& paginas,
                      const ExtensaoDe& extensao, const D::Retangulo& retangulo, double margem,
                      const Poe& poe) {
    for (const auto& pagina : paginas) {
        double y = retangulo.topo;
        for (const std::vector<Chave>& linha : pagina) {
            double soma = 0.0, h = 0.0;
            for (const Chave& chave : linha) {
                const D::Extensao e = extensao(chave);
                if (e.xMin >= 0 && e.xMax >= 0) soma += e.Largura();
                h = std::max(h, e.Altura());
            }
            // The row fills the whole width, with equal gaps between its blocks.
            const double folga = retangulo.largura - soma;
            const double n = double(linha.size());
            double c = retangulo.esquerda;
            for (const Chave& chave : linha) {
                const D::Extensao e = extensao(chave);
                poe(chave, CEPonto{c - e.MenorX(), (h - e.Altura()) * 0.5 + y - h, 0.0});
                if (linha.size() > 1) c += e.Largura() + folga / (n - 1);
            }
            y -= h + margem;
        }
    }
}

template <class Chave, class ExtensaoDe, class PassoDe, class Poe>
void PosicoesDeBornes(const std::vector<std::vector<std::vector<Chave>>>& paginas,
                      const ExtensaoDe& extensao, const PassoDe& passo,
                      const D::Retangulo& retangulo, double margem, const Poe& poe) {
    for (const auto& pagina : paginas) {
        double y = retangulo.topo;
        for (const std::vector<Chave>& linha : pagina) {
            double h = 0.0;
            for (const Chave& chave : linha)
                h = std::max(h, extensao(chave).Altura());
            double c = retangulo.esquerda;
            for (const Chave& chave : linha) {
                const double d = passo(chave);
                // A doubled entry gives two points: the later, further one stays.
                poe(chave, CEPonto{c - d, (h - extensao(chave).Altura()) * 0.5 + y - h, 0.0});
                c += d;
            }
            y -= h + margem;
        }
    }
}

// A key's block as the table of extents has it (nothing for a key it lacks).
struct ExtensaoNaTabela {
    const D::Extensoes& extensoes;
    D::Extensao operator()(const QString& chave) const { return extensoes.value(chave); }
};

}  // namespace

std::vector<CCDiagramaTopografico::Linha> CCDiagramaTopografico::LinhasBlocos(
    const std::vector<QString>& chaves, const Extensoes& extensoes, double largura, double margem,
    int colunas) {
    return LinhasDeBlocos(chaves, ExtensaoNaTabela{extensoes}, largura, margem, colunas);
}

std::vector<CCDiagramaTopografico::Linha> CCDiagramaTopografico::LinhasBornes(
    const std::vector<Borne>& bornes, double largura, double margem) {
    return LinhasDeBornes(bornes, largura, margem);
}

std::vector<CCDiagramaTopografico::Pagina> CCDiagramaTopografico::Paginas(
    const std::vector<Linha>& linhas, const Extensoes& extensoes, double altura, double margem,
    int maxLinhas) {
    return PaginasDe(linhas, ExtensaoNaTabela{extensoes}, altura, margem, maxLinhas);
}

QHash<QString, CEPonto> CCDiagramaTopografico::PosicoesBlocos(const std::vector<Pagina>& paginas,
                                                              const Extensoes& extensoes,
                                                              const Retangulo& retangulo,
                                                              double margem) {
    QHash<QString, CEPonto> posicoes;
    posicoes.reserve(Quantidade(paginas));
    PosicoesDeBlocos(
        paginas, ExtensaoNaTabela{extensoes}, retangulo, margem,
        [&posicoes](const QString& chave, const CEPonto& ponto) { posicoes[chave] = ponto; });
    return posicoes;
}

QHash<QString, CEPonto> CCDiagramaTopografico::PosicoesBornes(const std::vector<Pagina>& paginas,
                                                              const Extensoes& extensoes,
                                                              const QHash<QString, double>& passos,
                                                              const Retangulo& retangulo,
                                                              double margem) {
    QHash<QString, CEPonto> posicoes;
    posicoes.reserve(Quantidade(paginas));
    PosicoesDeBornes(
        paginas, ExtensaoNaTabela{extensoes},
        [&passos](const QString& chave) { return passos.value(chave); }, retangulo, margem,
        [&posicoes](const QString& chave, const CEPonto& ponto) { posicoes[chave] = ponto; });
    return posicoes;
}

// ---- the run

CCDiagramaTopografico::Parametros CCDiagramaTopografico::LeParametros() {
    Parametros p;
    p.representacao = CICad::GetStringLisp("PBLREPTOPOGRAFICO");
    p.grupo = CICad::GetStringLisp("PBLTOPO_GRUPO");
    p.canto1 = CICad::GetStringLisp("PBLTOPO_PTLIM1");
    p.canto2 = CICad::GetStringLisp("PBLTOPO_PTLIM2");
    p.ordenacao = CICad::GetListaLisp("PBLTOPO_ORDENACAO");
    p.margem = CICad::GetRealLisp("PBLTOPO_MARGEM", 0.0);
    p.linhas = int(std::trunc(std::clamp(CICad::GetRealLisp("PBLTOPO_LINHAS", 0.0), -1e9, 1e9)));
    p.colunas = int(std::trunc(std::clamp(CICad::GetRealLisp("PBLTOPO_COLUNAS", 0.0), -1e9, 1e9)));
    p.borne = CICad::GetBoolLisp("PBLTOPO_BORNE");
    p.borneDist = CICad::GetStringLisp("PBLTOPO_BORNEDIST");
    return p;
}

void CCDiagramaTopografico::Executar(const QString& caminhoModelo) {
    inseridos_ = paginasCriadas_ = 0;
    CETemplateLisp modelo(caminhoModelo);
    if (!modelo.Carregar()) {
        CICad::ImprimeMensagem(kMsgModelo);
        ZVResultado::Falhou();
        return;
    }
    parametros_ = LeParametros();
    const Parametros& p = parametros_;
    representacaoU8_ = p.representacao.toUtf8();
    if (p.representacao.isEmpty() || p.representacao == "-1") {
        CICad::ImprimeMensagem(kMsgSemRepresentacao);
        throw int(SemRepresentacao);
    }
    if (p.grupo.isEmpty() || p.grupo == "-1") {
        CICad::ImprimeMensagem(kMsgSemGrupo);
        throw int(SemGrupo);
    }
    CEPonto a, b;
    if (!LeCanto(p.canto1, a) || !LeCanto(p.canto2, b)) {
        ImprimeCom(kMsgCanto, "\"" + p.canto1 + "\" \"" + p.canto2 + "\"");
        throw int(SemCanto);
    }
    const Retangulo retangulo = RetanguloDe(a, b);
    if (!(retangulo.largura > 0.0) || !(retangulo.altura > 0.0)) {
        ImprimeCom(kMsgRetangulo, "\"" + p.canto1 + "\" \"" + p.canto2 + "\"");
        ZVResultado::Falhou();
        return;
    }
    if (CICad::ExisteGrupo(p.grupo) && PerguntaSimNao(kMsgGrupoExiste))
        CICad::zvInvokeVoid("apagargrupo", {p.grupo});
    diretorio_ = CICad::GetStringLisp("*DIRETORIO_REDE*");

    CIProgress progresso;
    progresso_ = &progresso;
    // Nothing of the run outlives it: the window, and the items by key.
    struct Fim {
        CCDiagramaTopografico& d;
        ~Fim() {
            d.progresso_ = nullptr;
            d.camposUsados_.clear();
            d.CamposLidos = nullptr;
            d.definicoes_.clear();
            d.passosPorBloco_.clear();
            d.textos_ = {};
            d.digitos_ = {};
            d.comAcessorioLigado_.clear();
        }
    } fim{*this};
    progresso.Mostrar();
    progresso.Definir(0);

    Candidatos candidatos;
    ColetaCandidatos(candidatos);
    AdicionaAcessorios(candidatos);
    progresso.Definir(10);
    ProcuraBlocos(candidatos);
    MantemComArquivo(candidatos);
    RenovaBlocos(candidatos);
    progresso.Definir(20);
    if (candidatos.empty()) {
        CICad::ImprimeMensagem(kMsgNadaADesenhar);
        ZVResultado::Falhou();
        progresso.Fechar();
        return;
    }
    const size_t antes = candidatos.size();
    DescartaDesenhados(candidatos);
    const bool algumDesenhado = candidatos.size() < antes;
    candidatos_ = std::move(candidatos);
    comAcessorios_.clear();
    for (const auto& [chave, candidato] : candidatos_)
        if (chave.contains('_')) comAcessorios_.insert(SimboloDoAcessorio(chave).toString());

    // Terminals apart when asked; a handle that is no object joins neither list.
    // The catalogue is asked once per key.
    std::vector<const Entrada*> comuns, bornes;
    QHash<QString, bool> ehBorne;
    for (const Entrada& entrada : candidatos_) {
        const Candidato& candidato = entrada.second;
        if (p.borne) {
            if (candidato.simbolo.isNull()) continue;
            auto tipo = ehBorne.constFind(candidato.chave);
            if (tipo == ehBorne.constEnd())
                tipo = ehBorne.insert(candidato.chave,
                                      Catalogo().TipoComp(candidato.chave).trimmed() == kTipoBorne);
            (*tipo ? bornes : comuns).push_back(&entrada);
        } else {
            comuns.push_back(&entrada);
        }
    }
    // Each symbol followed by its accessories, so that an accessory that sorts like its
    // symbol stands right after it. The symbol's handle is cut out once per key.
    const auto porSimbolo = [](std::vector<const Entrada*>& entradas) {
        // The candidates come in key order, so the symbols are in order already and so are
        // the accessories of one symbol: only the accessories are sorted, by their symbol's
        // handle, and each group joins the symbols behind its own.
        struct Ordem {
            ChaveDeOrdem simbolo;
            const Entrada* entrada;
        };
        std::vector<Ordem> simbolos, acessorios;
        for (const Entrada* entrada : entradas) {
            const int corte = entrada->first.lastIndexOf('_');
            (corte < 0 ? simbolos : acessorios)
                .push_back({ChaveDeOrdem(QStringView(entrada->first).mid(corte + 1)), entrada});
        }
        const auto porHandle = [](const Ordem& a, const Ordem& b) { return a.simbolo < b.simbolo; };
        std::stable_sort(acessorios.begin(), acessorios.end(), porHandle);
        std::vector<Ordem> ordem;
        ordem.reserve(entradas.size());
        std::merge(simbolos.begin(), simbolos.end(), acessorios.begin(), acessorios.end(),
                   std::back_inserter(ordem), porHandle);
        for (size_t i = 0; i < ordem.size(); ++i)
            entradas[i] = ordem[i].entrada;
    };
    porSimbolo(comuns);
    porSimbolo(bornes);
    PreparaLeitura(candidatos_);
    // Each symbol is read once (an accessory's owner is kept in donos_) and never again as a
    // neighbour: its reading need not be kept.
    GuardaSimbolos = false;
    Lidos lidosComuns, lidosBornes;
    VetorItens itensComuns = LeItens(comuns, modelo, lidosComuns, false);
    VetorItens itensBornes = LeItens(bornes, modelo, lidosBornes, true);
    Descarte::Largar(passosPorBloco_);
    // Everything is read: what the reading kept goes before the drawing grows.
    LiberaLeituras();
    Descarte::Largar(donos_);
    Descarte::Largar(doCatalogo_);
    Descarte::Largar(comAcessorios_);
    progresso.Definir(40);
    struct Destroi {
        VetorItens& a;
        VetorItens& b;
        ~Destroi() {
            a.destruirItens();
            b.destruirItens();
        }
    } destroi{itensComuns, itensBornes};
    if (itensComuns.empty() && itensBornes.empty()) {
        // A run over a diagram that is up to date draws nothing, and that is no failure.
        if (algumDesenhado) {
            CICad::ImprimeMensagem(kMsgJaDesenhados);
        } else {
            CICad::ImprimeMensagem(kMsgNadaADesenhar);
            ZVResultado::Falhou();
        }
        progresso.Fechar();
        return;
    }
    // Items that sort alike keep the order above.
    itensComuns.ordenarEstavel(p.ordenacao);
    itensBornes.ordenarEstavel(p.ordenacao);
    {
        QHash<QString, Extensao> porBloco;
        LeExtensoes(lidosComuns, porBloco);
        LeExtensoes(lidosBornes, porBloco);
    }
    progresso.Definir(50);

    CICad::RegistraApp(kAppRepresentacao);
    CICad::RegistraApp(kAppRepresentacaoEsq);
    CICad::RegistraApp(kAppRepresentacaoAce);
    CICad::RegistraApp(kAppRepresentacaoAceEsq);

    // Both passes are laid out first: the readings of the sort go before the drawing grows.
    std::vector<PaginaLida> paginasComuns = PaginasComuns(itensComuns, lidosComuns, retangulo);
    std::vector<PaginaLida> paginasBornes = PaginasBornes(itensBornes, lidosBornes, retangulo);
    // From here each item is given back as its block goes in; those left go at the end, with
    // the readings that hold them.
    struct Restantes {
        Lidos comuns, bornes;
        Restantes(Lidos&& c, Lidos&& b) noexcept : comuns(std::move(c)), bornes(std::move(b)) {}
        Restantes(Restantes&&) noexcept = default;
        ~Restantes() {
            for (Lidos* lidos : {&comuns, &bornes})
                for (Lido& lido : *lidos)
                    delete lido.item;
        }
    };
    struct Entrega {
        Lidos& comuns;
        Lidos& bornes;
        ~Entrega() {
            Descarte::Descartar(Restantes{std::exchange(comuns, {}), std::exchange(bornes, {})});
        }
    } entrega{lidosComuns, lidosBornes};
    itensComuns.clear();
    itensBornes.clear();
    if (!paginasComuns.empty()) Desenha(paginasComuns, lidosComuns);
    Descarte::Largar(paginasComuns);
    progresso.Definir(75);
    if (!paginasBornes.empty()) Desenha(paginasBornes, lidosBornes);
    EntregaInseridos();
    Descarte::Largar(paginasBornes);
    CICad::zvInvokeVoid("atualizaTopografico");
    progresso.Definir(100);
    progresso.Fechar();
    ImprimeCom(kMsgDesenhado,
               QString::number(inseridos_) + " / " + QString::number(paginasCriadas_));
}

// ---- candidates

void CCDiagramaTopografico::ColetaCandidatos(Candidatos& candidatos) {
    zvdb::Database* db = CICad::GetDatabase();
    const auto dadosDe = [](CEListaXData aditivos, CEListaXData ligacoes,
                            CEListaXData ligacoesAce) -> std::shared_ptr<const DadosSimbolo> {
        if (aditivos.empty() && ligacoes.empty() && ligacoesAce.empty()) return nullptr;
        return std::make_shared<const DadosSimbolo>(
            DadosSimbolo{std::move(aditivos), std::move(ligacoes), std::move(ligacoesAce)});
    };
    // The key and standard are the first two parts of the text.
    const auto adiciona = [&candidatos](const OdDbObjectId& id, const QString& texto,
                                        std::shared_ptr<const DadosSimbolo> dados) {
        const int corte = texto.indexOf(CCDataReader::kSeparador);
        const int fim = corte < 0 ? -1 : texto.indexOf(CCDataReader::kSeparador, corte + 1);
        candidatos.emplace_back(
            ZVString::DeHandle(id.handle()),
            Candidato{corte < 0 ? texto : texto.left(corte),
                      corte < 0 ? QString() : texto.mid(corte + 1, fim < 0 ? -1 : fim - corte - 1),
                      QString(), id, QString(), QString(), false, std::move(dados)});
    };
    // Symbols carry the key application: one walk of model space finds them all, with their
    // block names and texts.
    for (CICad::ReferenciaComXData& ref : CICad::GetReferenciasComXData(
             kAppSimbolo, {kAppAditivo, kAppRepresentacaoEsq, kAppRepresentacaoAceEsq}, db)) {
        if (NuncaDesenhado(ref.bloco)) continue;
        if (ref.codigo != 1000) continue;
        adiciona(
            ref.id, ref.texto,
            dadosDe(std::move(ref.outras[0]), std::move(ref.outras[1]), std::move(ref.outras[2])));
    }
    for (const auto& [nome, id] : CICad::GetEntradasDicionario({"ESQ_VIRTUAL_ZV"}, db)) {
        if (CICad::TipoEntidade(id) != "XRECORD") continue;
        const CEListaXData dados = CICad::GetXData(id, kAppSimbolo);
        if (dados.empty() || dados.front().codigo != 1000) continue;
        adiciona(
            id, dados.front().texto,
            dadosDe(CICad::GetXData(id, kAppAditivo), CICad::GetXData(id, kAppRepresentacaoEsq),
                    CICad::GetXData(id, kAppRepresentacaoAceEsq)));
    }
    OrdenaPorChave(candidatos);
}

void CCDiagramaTopografico::AdicionaAcessorios(Candidatos& candidatos) {
    std::vector<std::pair<QString, Candidato>> novos;
    // A catalogue key's accessories are cut out once, with their places' marks ("*0_"), and
    // shared by the symbols of that key: a project has few keys and many symbols.
    QHash<QString, std::vector<std::pair<QString, QString>>> porChave;
    for (const auto& [chave, simbolo] : candidatos) {
        auto doCatalogo = porChave.constFind(simbolo.chave);
        if (doCatalogo == porChave.constEnd()) {
            std::vector<std::pair<QString, QString>> cortados;
            const QStringList acessorios = Catalogo().AcessoriosDe(simbolo.chave);
            for (int i = 0; i < acessorios.size(); ++i)
                if (QString acessorio = acessorios[i].section('#', 0, 0); !acessorio.isEmpty())
                    cortados.emplace_back("*" + QString::number(i) + "_", std::move(acessorio));
            doCatalogo = porChave.insert(simbolo.chave, std::move(cortados));
        }
        for (const auto& [lugar, acessorio] : *doCatalogo)
            novos.push_back({lugar + chave,
                             {acessorio, simbolo.norma, QString(), simbolo.simbolo, QString(),
                              QString(), false, simbolo.dados}});
        const CEListaXData& aditivos = simbolo.dados ? simbolo.dados->aditivos : kSemDados;
        int indice = 0;
        for (size_t i = 0; i + 1 < aditivos.size(); i += 2) {
            const int quantidade = ZVString(aditivos[i].texto).ParaInteiro();
            for (int n = 0; n < quantidade && n < 1000; ++n)
                novos.push_back({"#" + QString::number(indice++) + "_" + chave,
                                 {aditivos[i + 1].texto, simbolo.norma, QString(), simbolo.simbolo,
                                  QString(), QString(), false, simbolo.dados}});
        }
    }
    // A symbol's key never has a "_": the new keys join without meeting the old ones.
    OrdenaPorChave(novos);
    const auto meio = candidatos.insert(candidatos.end(), std::make_move_iterator(novos.begin()),
                                        std::make_move_iterator(novos.end()));
    std::inplace_merge(candidatos.begin(), meio, candidatos.end(),
                       [](const Entrada& a, const Entrada& b) { return a.first < b.first; });
}

void CCDiagramaTopografico::ProcuraBlocos(Candidatos& candidatos) {
    // Each key and standard is asked once; the names of a block are made once and shared by
    // every candidate of it.
    struct Bloco {
        QString bloco, nome, arquivo;
    };
    QHash<std::pair<QString, QString>, Bloco> porChave;
    QHash<std::pair<QString, QString>, std::pair<QString, QString>> nomes;
    for (auto& [chave, candidato] : candidatos) {
        const std::pair<QString, QString> chaveNorma{candidato.chave, candidato.norma};
        auto achado = porChave.constFind(chaveNorma);
        if (achado == porChave.constEnd()) {
            Bloco bloco;
            bloco.bloco = Catalogo().BlocoRepresentacao(candidato.chave, candidato.norma,
                                                        parametros_.representacao);
            if (!bloco.bloco.isEmpty()) {
                const std::pair<QString, QString> blocoNorma{bloco.bloco, candidato.norma};
                auto nome = nomes.constFind(blocoNorma);
                if (nome == nomes.constEnd())
                    nome = nomes.insert(blocoNorma, {bloco.bloco + "_" + candidato.norma,
                                                     diretorio_ + "DADOS\\" + candidato.norma +
                                                         "\\BLOCOS\\" + bloco.bloco + ".dwg"});
                bloco.nome = nome->first;
                bloco.arquivo = nome->second;
            }
            achado = porChave.insert(chaveNorma, bloco);
        }
        candidato.bloco = achado->bloco;
        candidato.nome = achado->nome;
        candidato.arquivo = achado->arquivo;
    }
}

void CCDiagramaTopografico::MantemComArquivo(Candidatos& candidatos) {
    QHash<QString, bool> legiveis;
    Filtra(candidatos, [&](const Entrada& entrada) {
        bool fica = !entrada.second.bloco.isEmpty();
        if (fica) {
            const QString& arquivo = entrada.second.arquivo;
            auto achado = legiveis.constFind(arquivo);
            if (achado == legiveis.constEnd()) {
                QFile f(CICad::ResolveArquivo(arquivo));
                const bool legivel = f.open(QIODevice::ReadOnly);
                if (!legivel) ImprimeCom(kMsgArquivoBloco, arquivo);
                achado = legiveis.insert(arquivo, legivel);
            }
            fica = achado.value();
        }
        return fica;
    });
}

void CCDiagramaTopografico::RenovaBlocos(Candidatos& candidatos) {
    // Each distinct block once, in candidate order; a redefinition also refreshes the blocks
    // already on earlier pages. A file the facade refuses, and whose block the drawing lacks,
    // can't be inserted: its candidates go.
    std::vector<std::pair<QString, QString>> blocos;
    QHash<QString, int> indices;
    for (const auto& [chave, candidato] : candidatos) {
        const QString& nome = candidato.nome;
        if (indices.contains(nome)) continue;
        indices.insert(nome, int(blocos.size()));
        blocos.emplace_back(candidato.arquivo, nome);
    }
    const std::vector<bool> recarregados = CICad::RecarregaBlocos(blocos);
    QSet<QString> prontos;
    for (size_t i = 0; i < blocos.size(); ++i) {
        OdDbObjectId id;
        if (recarregados[i] || CICad::GetBlocoId(blocos[i].second, id))
            prontos.insert(blocos[i].second);
    }
    Filtra(candidatos,
           [&](const Entrada& entrada) { return prontos.contains(entrada.second.nome); });
}

void CCDiagramaTopografico::DescartaDesenhados(Candidatos& candidatos) {
    const QString& representacao = parametros_.representacao;
    Filtra(candidatos, [&](Entrada& entrada) {
        if (entrada.first.contains('_')) return !AcessorioDesenhado(entrada.first, entrada.second);
        const Candidato& candidato = entrada.second;
        const auto pares = Pares(candidato.dados ? candidato.dados->ligacoes : kSemDados);
        entrada.second.semLigacoes = pares.empty();
        for (const auto& [rep, handle] : pares)
            if (rep == representacao && !CICad::IdDoHandle(handle).isNull()) return false;
        return true;
    });
}

bool CCDiagramaTopografico::AcessorioDesenhado(const QString& chave, Candidato& candidato) const {
    // The symbol's chain names its accessories' blocks; each block says which place of the
    // symbol's list it shows and with which key (a changed catalogue draws the new one).
    const int corte = chave.indexOf('_');
    const QStringView lugar = corte < 0 ? QStringView(chave) : QStringView(chave).left(corte);
    const QStringView simbolo = SimboloDoAcessorio(chave);
    const auto pares = Pares(candidato.dados ? candidato.dados->ligacoesAce : kSemDados);
    candidato.semLigacoes = pares.empty();
    for (const auto& [rep, handle] : pares) {
        if (rep != parametros_.representacao) continue;
        const OdDbObjectId bloco = CICad::IdDoHandle(handle);
        if (bloco.isNull()) continue;
        const CEListaXData link = CICad::GetXData(bloco, kAppRepresentacaoAce);
        if (link.size() >= 4 && link[0].texto == rep && QStringView(link[1].texto) == simbolo &&
            QStringView(link[2].texto) == lugar && link[3].texto == candidato.chave)
            return true;
    }
    return false;
}

VetorItens CCDiagramaTopografico::LeItens(const std::vector<const Entrada*>& entradas,
                                          CETemplate& modelo, Lidos& lidos, bool bornes) {
    // A terminal takes its step, under the name PBLTOPO_BORNEDIST gives, as it is read.
    const QString& tag = parametros_.borneDist;
    const bool comPasso = bornes && !tag.isEmpty();
    const std::uint32_t nomePasso = comPasso ? CamposItem::numero(tag) : 0;
    const std::size_t novos =
        std::size_t(escreveChave_) + std::size_t(escreveLugar_) + std::size_t(comPasso);
    VetorItens itens;
    lidos.reserve(entradas.size());
    for (const Entrada* entrada : entradas) {
        const QString& chave = entrada->first;
        const Candidato& candidato = entrada->second;
        if (candidato.simbolo.isNull()) continue;
        std::unique_ptr<CEItemLista> item;
        if (chave.contains('_')) {
            item.reset(LeItemAcessorio(chave, candidato, modelo));
        } else if (const auto dono = donos_.find(chave); dono != donos_.end()) {
            // Read already for its accessories: that reading becomes its item, where its
            // accessories still to come find it.
            if (dono->lido) {
                item = std::make_unique<CEItemLista>(std::move(*dono->lido));
                dono->lido.reset();
                dono->item = item.get();
            }
        } else {
            item.reset(CriaItemEntidade(candidato.simbolo, modelo));
            if (item && !Listado(*item)) item.reset();
            if (item) Retem(*item);
            // Its accessories come next and take their owner's fields from this same read.
            if (comAcessorios_.contains(chave)) donos_.insert(chave, {item.get(), nullptr});
        }
        if (!item) continue;
        if (novos) item->campos.reservar(std::size_t(item->campos.size()) + novos);
        if (escreveChave_) item->definirCampo(CamposItem::numero(kHandle), chave);
        if (escreveLugar_)
            item->definirCampo(CamposItem::numero(QString::fromLatin1(kCampoSequencia)),
                               QString::number(itens.size()));
        double passo = 0.0;
        if (bornes) {
            const auto& [texto, valor] = PassoDe(candidato);
            if (comPasso) item->definirCampo(nomePasso, texto);
            passo = valor;
        }
        lidos.push_back({item.get(), &candidato, &chave, {}, passo, {}});
        itens.push_back(item.release());
    }
    return itens;
}

CEItemLista* CCDiagramaTopografico::LeItemAcessorio(const QString& chave,
                                                    const Candidato& candidato,
                                                    CETemplate& modelo) {
    // An accessory the lists leave out needs no reading of its owner.
    const DoCatalogo& proprio = DoCatalogoDe(candidato);
    if (!proprio.listado) return nullptr;
    const QString simbolo = SimboloDoAcessorio(chave).toString();
    auto dono = donos_.constFind(simbolo);
    if (dono == donos_.constEnd()) {
        std::shared_ptr<CEItemLista> lido(CriaItemEntidade(candidato.simbolo, modelo));
        if (lido && !Listado(*lido)) lido.reset();
        if (lido) Retem(*lido);
        dono = donos_.insert(simbolo, {lido.get(), lido});
    }
    // The accessory of a symbol that is not on the lists is not in the panel either.
    if (!dono->item) return nullptr;
    const CEItemLista& origem = *dono->item;
    auto item = std::make_unique<CEItemLista>();
    item->ids = origem.ids;
    item->campos.reservar(NomesDoDono().size() + 1 + proprio.campos.size());
    // It sits with its owner: the owner's tag, strip, number and page, in every language,
    // and its quantity unless a column of its own says one.
    static const std::vector<std::uint32_t> kNomesDoDono = [] {
        std::vector<std::uint32_t> nomes = NomesDoDono();
        std::sort(nomes.begin(), nomes.end());
        return nomes;
    }();
    for (const std::uint32_t nome : kNomesDoDono)
        if (const QString* valor = origem.campos.procura(nome)) item->definirCampo(nome, *valor);
    static const std::uint32_t kQtd = CamposItem::numero("QTD");
    static const QString kUm("1");
    const QString* qtd = origem.campos.procura(kQtd);
    item->definirCampo(kQtd, qtd && !qtd->isEmpty() ? *qtd : kUm);
    // Everything else is the accessory's own.
    item->campos.juntarOrdenados(proprio.campos);
    return item.release();
}

const CCDiagramaTopografico::DoCatalogo& CCDiagramaTopografico::DoCatalogoDe(
    const Candidato& candidato) {
    const std::pair<QString, QString> chaveNorma{candidato.chave, candidato.norma};
    auto achado = doCatalogo_.constFind(chaveNorma);
    if (achado != doCatalogo_.constEnd()) return **achado;
    static const std::uint32_t kTipo = CamposItem::numero("ZV_LISTA_TIPO"),
                               kLista = CamposItem::numero("ZV_LISTA"),
                               kChave = CamposItem::numero("ZV_KEY"),
                               kDescricao = CamposItem::numero("DESCRICAO"),
                               kTpDescri = CamposItem::numero("TP_DESCRI");
    static const QString kAce("ACE");
    CEItemLista proprio;
    proprio.definirCampo(kTipo, kAce);
    proprio.definirCampo(kLista, Catalogo().ListaComp(candidato.chave, candidato.norma));
    proprio.definirCampo(kChave, candidato.chave);
    const QString descricao = Catalogo().DescricaoComp(candidato.chave);
    proprio.definirCampo(kDescricao, descricao);
    proprio.definirCampo(kTpDescri, descricao);
    // The columns come last and may say any of these again.
    LeColunasUsuario(QString(), proprio, Catalogo().ColunasComp(candidato.chave));
    auto feito = std::make_shared<DoCatalogo>();
    const QString* listado = proprio.campos.procura(kLista);
    feito->listado = listado && *listado == QLatin1String("S");
    Retem(proprio);
    feito->campos = proprio.campos.todos();
    return **doCatalogo_.insert(chaveNorma, std::move(feito));
}

// ---- what is read of items

// The diagram never loads the project's connections, and without them a terminal's side
// finds no element: looking costs the wires' index of every page and gives nothing.
void CCDiagramaTopografico::LerLadoIni(CEItemLista&, const OdDbObjectId&, CETemplate&) {}

void CCDiagramaTopografico::LerLadoFim(CEItemLista&, const OdDbObjectId&, CETemplate&) {}

std::optional<std::vector<std::uint32_t>> CCDiagramaTopografico::CamposUsados(
    const Parametros& parametros, const std::vector<std::pair<QString, QString>>& blocos) {
    std::vector<std::uint32_t> campos = NomesDoDono();
    const auto poe = [&campos](const QString& nome) {
        if (!nome.isEmpty()) campos.push_back(CamposItem::numero(nome));
    };
    for (const char* nome : {"ZV_LISTA", "QTD", "REGUA", "STRIP", "REGLETA"})
        poe(QString::fromLatin1(nome));
    poe(parametros.borneDist);
    for (const QString& nome : parametros.ordenacao)
        poe(nome);
    for (const auto& [arquivo, nome] : blocos) {
        // A block the drawing lacks would be loaded here, before its turn.
        OdDbObjectId id;
        if (!CICad::GetBlocoId(nome, id)) return std::nullopt;
        const auto definicoes = CICad::GetDefinicoesAtributos(arquivo, nome);
        for (int i = 0; definicoes && i < definicoes->Quantidade(); ++i) {
            const QString tag = (*definicoes)[i].GetTag();
            poe(tag);
            poe(tag.trimmed());
        }
    }
    std::sort(campos.begin(), campos.end());
    campos.erase(std::unique(campos.begin(), campos.end()), campos.end());
    return campos;
}

void CCDiagramaTopografico::PreparaLeitura(const Candidatos& candidatos) {
    camposUsados_.clear();
    CamposLidos = nullptr;
    std::vector<std::pair<QString, QString>> blocos;
    QSet<QString> vistos;
    for (const auto& [chave, candidato] : candidatos)
        if (!vistos.contains(candidato.nome)) {
            vistos.insert(candidato.nome);
            blocos.emplace_back(candidato.arquivo, candidato.nome);
        }
    const auto campos = CamposUsados(parametros_, blocos);
    escreveChave_ = escreveLugar_ = true;
    if (!campos) return;
    camposUsados_.assign(campos->empty() ? 0 : campos->back() + 1, 0);
    for (const std::uint32_t campo : *campos)
        camposUsados_[campo] = 1;
    // The symbols' readings write only these: nothing to trim afterwards.
    if (!camposUsados_.empty()) CamposLidos = &camposUsados_;
    // An item's key and its place as read go in for a block or a sort that shows them.
    const auto usado = [this](const QString& nome) {
        const std::uint32_t numero = CamposItem::numero(nome);
        return camposUsados_.empty() || (numero < camposUsados_.size() && camposUsados_[numero]);
    };
    escreveChave_ = usado(kHandle);
    escreveLugar_ = usado(QString::fromLatin1(kCampoSequencia));
}

void CCDiagramaTopografico::Retem(CEItemLista& item) const {
    if (camposUsados_.empty()) return;
    const std::vector<char>& usados = camposUsados_;
    item.campos.reter(
        [&usados](std::uint32_t nome) { return nome < usados.size() && usados[nome]; });
}

const std::pair<QString, double>& CCDiagramaTopografico::PassoDe(const Candidato& candidato) {
    // The step is the default text of the block's attribute named by PBLTOPO_BORNEDIST.
    const QString& nome = candidato.nome;
    auto achado = passosPorBloco_.constFind(nome);
    if (achado == passosPorBloco_.constEnd()) {
        const QString& tag = parametros_.borneDist;
        QString passo;
        const auto definicoes = CICad::GetDefinicoesAtributos(candidato.arquivo, nome);
        for (int i = 0; definicoes && !tag.isEmpty() && i < definicoes->Quantidade(); ++i)
            if ((*definicoes)[i].GetTag() == tag) {
                passo = (*definicoes)[i].GetValor();
                break;
            }
        if (passo.isEmpty()) passo = QString(kPassoPadrao);
        achado = passosPorBloco_.insert(nome, {passo, CETemplateLisp::TextoParaReal(passo)});
    }
    return *achado;
}

void CCDiagramaTopografico::LeExtensoes(Lidos& lidos, QHash<QString, Extensao>& porBloco) {
    // Once per block, for the candidates that have an item: only those are laid out.
    for (Lido& lido : lidos) {
        const QString& nome = lido.candidato->nome;
        auto achado = porBloco.constFind(nome);
        if (achado == porBloco.constEnd()) {
            Extensao extensao;
            OdDbObjectId bloco;
            double xMax = 0, xMin = 0, yMax = 0, yMin = 0;
            if (CICad::GetBlocoId(nome, bloco) &&
                CICad::GetExtensaoBloco(bloco, xMax, xMin, yMax, yMin))
                extensao = ExtensaoAbsoluta(xMin, xMax, yMin, yMax);
            achado = porBloco.insert(nome, extensao);
        }
        lido.extensao = achado.value();
    }
}

// ---- the passes' layout

std::vector<std::uint32_t> CCDiagramaTopografico::Lugares(const VetorItens& itens,
                                                          const Lidos& lidos) {
    // By the items' addresses, found without reading the items.
    using Endereco = std::pair<std::uintptr_t, std::uint32_t>;
    std::vector<Endereco> porEndereco;
    porEndereco.reserve(lidos.size());
    for (std::size_t i = 0; i < lidos.size(); ++i)
        porEndereco.emplace_back(reinterpret_cast<std::uintptr_t>(lidos[i].item), std::uint32_t(i));
    std::sort(porEndereco.begin(), porEndereco.end());
    std::vector<std::uint32_t> lugares;
    lugares.reserve(itens.size());
    for (const CEItemLista* item : itens) {
        const Endereco procurado{reinterpret_cast<std::uintptr_t>(item), 0};
        const auto achado = std::lower_bound(porEndereco.begin(), porEndereco.end(), procurado);
        if (achado != porEndereco.end() && achado->first == procurado.first)
            lugares.push_back(achado->second);
    }
    return lugares;
}

std::vector<CCDiagramaTopografico::PaginaLida> CCDiagramaTopografico::PaginasComuns(
    const VetorItens& itens, Lidos& lidos, const Retangulo& retangulo) const {
    const Parametros& p = parametros_;
    const auto extensao = [&lidos](std::uint32_t lugar) { return lidos[lugar].extensao; };
    auto paginas = PaginasDe(
        LinhasDeBlocos(Lugares(itens, lidos), extensao, retangulo.largura, p.margem, p.colunas),
        extensao, retangulo.altura, p.margem, p.linhas);
    PosicoesDeBlocos(
        paginas, extensao, retangulo, p.margem,
        [&lidos](std::uint32_t lugar, const CEPonto& ponto) { lidos[lugar].ponto = ponto; });
    return paginas;
}

std::vector<CCDiagramaTopografico::PaginaLida> CCDiagramaTopografico::PaginasBornes(
    const VetorItens& itens, Lidos& lidos, const Retangulo& retangulo) const {
    struct BorneLido {
        std::uint32_t chave;
        double passo;
        QString regua;
    };
    std::vector<BorneLido> bornes;
    bornes.reserve(itens.size());
    for (const std::uint32_t lugar : Lugares(itens, lidos))
        bornes.push_back({lugar, lidos[lugar].passo, ReguaDe(*lidos[lugar].item)});
    const Parametros& p = parametros_;
    const auto extensao = [&lidos](std::uint32_t lugar) { return lidos[lugar].extensao; };
    auto paginas = PaginasDe(LinhasDeBornes(bornes, retangulo.largura, p.margem), extensao,
                             retangulo.altura, p.margem, p.linhas);
    PosicoesDeBornes(
        paginas, extensao, [&lidos](std::uint32_t lugar) { return lidos[lugar].passo; }, retangulo,
        p.margem,
        [&lidos](std::uint32_t lugar, const CEPonto& ponto) { lidos[lugar].ponto = ponto; });
    return paginas;
}

// ---- pages and insertion

void CCDiagramaTopografico::Desenha(const std::vector<PaginaLida>& paginas, Lidos& lidos) {
    // Every page first, so that no page change happens while blocks go in.
    std::vector<PaginaFeita> feitas(paginas.size());
    for (PaginaFeita& feita : feitas) {
        feita.layer = CriaPagina(parametros_.grupo);
        feita.layerU8 = feita.layer.toUtf8();
    }
    paginasCriadas_ += int(paginas.size());
    // A terminal that starts a strip stands twice, its two entries side by side in the pass
    // (in one row, or ending one row and starting the next): it goes in once, at its later
    // entry, where its point was left. Every other item stands once.
    const std::uint32_t* anterior = nullptr;
    size_t paginaAnterior = 0;
    for (size_t i = 0; i < paginas.size(); ++i) {
        for (const LinhaLida& linha : paginas[i])
            for (const std::uint32_t& lugar : linha) {
                if (anterior && *anterior != lugar)
                    Insere(lidos[*anterior], feitas[paginaAnterior]);
                anterior = &lugar;
                paginaAnterior = i;
            }
        if (progresso_) progresso_->Definir(progresso_->Percentual());
    }
    if (anterior) Insere(lidos[*anterior], feitas[paginaAnterior]);
    LigaSimbolos();
}

void CCDiagramaTopografico::Insere(Lido& lido, PaginaFeita& pagina) {
    CEItemLista* item = lido.item;
    const Candidato* candidato = lido.candidato;
    if (!item || !candidato) return;
    const QString& chave = *lido.chave;
    const CEPonto& ponto = lido.ponto;
    // Every attribute takes the item's field of its tag (blank when the item has none).
    const auto valores = [item](const QString& tag, const QString&) -> std::optional<QString> {
        const QString* valor = item->campo(tag);
        return valor ? *valor : QString();
    };
    // The definition is looked up (or loaded) at the block's first insertion, and the page's
    // layer made at the page's first, as each insertion on its own would do.
    OdDbObjectId& definicao = definicoes_[candidato->nome];
    if (definicao.isNull() && !CICad::GetBlocoId(candidato->nome, definicao))
        definicao = CICad::CarregaBloco(candidato->nome, candidato->arquivo);
    if (!pagina.pronta) {
        CICad::CriaLayer(pagina.layer);
        pagina.pronta = true;
    }
    const OdDbObjectId ref = CICad::InsereReferencia(definicao, Vista(pagina.layerU8), ponto.x,
                                                     ponto.y, 0.0, 0.0, valores);
    if (ref.isNull()) return;  // left out; the run goes on
    ++inseridos_;
    // The block names its symbol; an accessory's block also its place and catalogue key.
    // The item's handle field is its candidate's key.
    const int corte = chave.indexOf('_');
    const bool acessorio = corte >= 0;
    const QStringView prefixo = acessorio ? QStringView(chave).left(corte) : QStringView();
    std::array<char, 24> handleA, prefixoA, chaveA;
    QByteArray handleU8, prefixoU8, chaveU8;
    std::vector<std::string_view>& link = textos_;
    link.clear();
    link.push_back(Vista(representacaoU8_));
    link.push_back(Ascii(QStringView(chave).mid(corte + 1), handleA, handleU8));
    if (acessorio) {
        link.push_back(Ascii(prefixo, prefixoA, prefixoU8));
        link.push_back(Ascii(candidato->chave, chaveA, chaveU8));
    }
    CICad::SetXDataTextos(ref, acessorio ? kAppRepresentacaoAce : kAppRepresentacao, link);
    // The symbol names the block when the pass is over (the key outlives the pass); a block
    // whose symbol is gone stays unlinked, and the next run adds it again.
    if (!candidato->simbolo.isNull())
        ligacoes_.push_back({candidato->simbolo.handle(), candidato, prefixo, ref.handle()});
    // Each item goes in once: it gives its room to the blocks that follow, a batch at a time.
    lido.item = nullptr;
    itensInseridos_.itens.push_back(item);
    if (itensInseridos_.itens.size() >= kLoteInseridos) EntregaInseridos();
}

CCDiagramaTopografico::Inseridos::~Inseridos() {
    for (CEItemLista* item : itens)
        delete item;
}

void CCDiagramaTopografico::EntregaInseridos() {
    Descarte::Descartar(std::exchange(itensInseridos_, {}));
}

void CCDiagramaTopografico::LigaSimbolos() {
    // By symbol; a symbol's links stay in the order its blocks went in.
    std::stable_sort(ligacoes_.begin(), ligacoes_.end(),
                     [](const Ligacao& a, const Ligacao& b) { return a.simbolo < b.simbolo; });
    Cadeia propria, acessorios;
    // Each symbol comes once a pass: those of earlier passes are looked up, this pass's join
    // them, in order, when it is over.
    const std::size_t antes = comAcessorioLigado_.size();
    for (size_t i = 0, fim = 0; i < ligacoes_.size(); i = fim) {
        fim = i + 1;
        while (fim < ligacoes_.size() && ligacoes_[fim].simbolo == ligacoes_[i].simbolo)
            ++fim;
        LigaSimbolo(ligacoes_.data() + i, ligacoes_.data() + fim, propria, acessorios, antes);
    }
    std::inplace_merge(comAcessorioLigado_.begin(),
                       comAcessorioLigado_.begin() + std::ptrdiff_t(antes),
                       comAcessorioLigado_.end());
    ligacoes_.clear();
}

void CCDiagramaTopografico::LigaSimbolo(const Ligacao* inicio, const Ligacao* fim, Cadeia& propria,
                                        Cadeia& acessorios, std::size_t ligadosAntes) {
    const OdDbObjectId& simbolo = inicio->candidato->simbolo;
    for (Cadeia* cadeia : {&propria, &acessorios}) {
        cadeia->pares.clear();
        cadeia->lida = false;
    }
    // A chain that the symbol lacks is added after its others: the one linked first first.
    Cadeia* ordem[2] = {nullptr, nullptr};
    for (const Ligacao* ligacao = inicio; ligacao != fim; ++ligacao) {
        const bool acessorio = !ligacao->lugar.isEmpty();
        Cadeia& cadeia = acessorio ? acessorios : propria;
        if (!cadeia.lida) {
            // A symbol's own block is linked once a run; its accessories' blocks share one
            // chain, empty at the start when the run found it so and no pass linked it yet.
            bool semLigacoes = ligacao->candidato->semLigacoes;
            if (acessorio && semLigacoes) {
                const auto fimAntes = comAcessorioLigado_.begin() + std::ptrdiff_t(ligadosAntes);
                semLigacoes =
                    !std::binary_search(comAcessorioLigado_.begin(), fimAntes, ligacao->simbolo);
                if (semLigacoes) comAcessorioLigado_.push_back(ligacao->simbolo);
            }
            if (!semLigacoes) LeCadeia(simbolo, acessorio, cadeia);
            cadeia.lida = true;
            *(ordem[0] ? &ordem[1] : &ordem[0]) = &cadeia;
        }
        // At most one block per representation, and for accessories one per place in the
        // symbol's list: the old block of the same one goes.
        std::vector<Par>& pares = cadeia.pares;
        pares.erase(std::remove_if(pares.begin(), pares.end(),
                                   [&](const Par& par) {
                                       return par.mesmaRep &&
                                              (!acessorio || par.Lugar() == ligacao->lugar);
                                   }),
                    pares.end());
        Par novo;
        novo.lugar = ligacao->lugar;
        novo.bloco = ligacao->bloco;
        novo.mesmaRep = true;
        pares.push_back(std::move(novo));
    }
    for (const Cadeia* cadeia : ordem)
        if (cadeia) GravaCadeia(simbolo, cadeia == &acessorios, *cadeia);
}

void CCDiagramaTopografico::LeCadeia(const OdDbObjectId& simbolo, bool acessorio,
                                     Cadeia& cadeia) const {
    static const QString kEsq(kAppRepresentacaoEsq), kAceEsq(kAppRepresentacaoAceEsq);
    for (const auto& [rep, ligado] : Pares(CICad::GetXData(simbolo, acessorio ? kAceEsq : kEsq))) {
        // A stale pair goes, and so does an accessory's block that says no place.
        const OdDbObjectId id = CICad::IdDoHandle(ligado);
        if (id.isNull()) continue;
        Par par;
        par.mesmaRep = rep == parametros_.representacao;
        if (par.mesmaRep && acessorio) {
            const CEListaXData link = CICad::GetXData(id, kAppRepresentacaoAce);
            if (link.size() < 3) continue;
            par.lugarLido = link[2].texto;
        }
        par.rep = rep.toUtf8();
        par.ligado = ligado.toUtf8();
        cadeia.pares.push_back(std::move(par));
    }
}

void CCDiagramaTopografico::GravaCadeia(const OdDbObjectId& simbolo, bool acessorio,
                                        const Cadeia& cadeia) {
    std::vector<std::array<char, 16>>& digitos = digitos_;
    digitos.resize(cadeia.pares.size());
    std::vector<std::string_view>& textos = textos_;
    textos.clear();
    for (size_t i = 0; i < cadeia.pares.size(); ++i) {
        const Par& par = cadeia.pares[i];
        textos.push_back(par.bloco ? Vista(representacaoU8_) : Vista(par.rep));
        textos.push_back(par.bloco ? TextoHandle(par.bloco, digitos[i]) : Vista(par.ligado));
    }
    CICad::SetXDataTextos(simbolo, acessorio ? kAppRepresentacaoAceEsq : kAppRepresentacaoEsq,
                          textos);
}
