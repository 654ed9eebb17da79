#pragma once
// The facade: everything the list logic needs of the host, as operations without state.
// Each works on the active document, or on the database handed in.
#include "OdDbObjectId.h"
#include "host/sdk/ResultBuffer.h"

#include <QHash>
#include <QString>
#include <QStringList>

#include <functional>
#include <memory>
#include <optional>
#include <span>
#include <string_view>
#include <vector>

namespace zvsdk {
class ConnectionReceiver;
class Document;
class PolylineReceiver;
}  // namespace zvsdk
namespace zv {
class CEAtributo;
class CEListaAtributos;
}  // namespace zv

// One item of extended data behind its application's name: the group code, its text, and
// for points (1010 and on) the coordinates.
struct CEItemXData {
    int codigo = 0;
    QString texto;
    double x = 0.0, y = 0.0, z = 0.0;
};
using CEListaXData = std::vector<CEItemXData>;

// The value an attribute of a reference takes as it is made, from its tag and default value
// (both trimmed); none keeps the default.
using CEValoresAtributos =
    std::function<std::optional<QString>(const QString& tag, const QString& padrao)>;

// A point of the drawing.
struct CEPonto {
    double x = 0.0, y = 0.0, z = 0.0;
};

// What the readers take of a symbol, gathered in one visit of the entity. The texts are
// the drawing's own (UTF-8), valid until the drawing changes.
struct CESimboloLido {
    struct Atributo {
        std::string_view tag, valor;  // as the drawing holds them, blanks and all
        OdDbObjectId id;
    };
    bool referencia = false;          // a block reference: attributes, block and position
    std::vector<Atributo> atributos;  // in the drawing's order
    std::string_view bloco, layer;
    CEPonto posicao;
    // The first of KVR_ZV, KVR_ZV_WIRE and KVR_ZV_CABO with items (`temChave`), and its
    // first text item (`temTextoChave`): the key text.
    bool temChave = false, temTextoChave = false;
    std::string_view textoChave;
    bool temLayout = false;  // items of KVR_LAYOUT_ESQUEMA
    // The text items (code 1000) of ZV_VINC_ADITIVO, the symbol's own accessories.
    std::vector<std::string_view> vinculos;
    // The local circuit, as GetCircuitoLocal answers it.
    bool temCircuito = false;
    int circuito = 1;
};

// An attribute of a reference as a connection's question takes it: its tag and value as the
// drawing holds them, where its text stands and whether it is invisible.
struct CEAtributoPosto {
    std::string_view tag, valor;
    OdDbObjectId id;
    CEPonto posicao;
    bool invisivel = false;
};

// The rows of the three-language tag table.
enum class CampoTraduzido {
    Relacao = 1,
    Ligacao,
    Fio,
    Cabo,
    Regua,
    Numero,
    PosicaoContato,
    Pino,
    Distancia
};

class CICad {
public:
    // A coordinate through single precision, as insertion points and layouts keep them.
    static double Simples(double valor);

    // ---- databases
    // The override when one is set, else the active document's database, else null.
    static zvdb::Database* GetDatabase();
    static void SetDatabaseOverride(zvdb::Database* database);
    // The open documents that have a database, in document order, each with its drawing's
    // name (the system variable DWGNAME: the file name without its folder).
    static std::vector<std::pair<QString, zvdb::Database*>> GetDesenhosAbertos();
    // A drawing file read as a side database, not opened as a document; null (with a line on
    // the command line) when it can't be read. It lives as long as its last reference.
    static std::shared_ptr<zvdb::Database> AbreDesenhoLateral(const QString& arquivo);
    // The database's drawing name as DWGNAME gives it; empty when no document holds it.
    static QString GetNomeDesenho(zvdb::Database* database = nullptr);

    // ---- layers
    static QStringList GetLayers(zvdb::Database* database = nullptr);
    static QString GetLayerCorrente(zvdb::Database* database = nullptr);
    static QString SetLayerCorrente(const QString& nome, zvdb::Database* database = nullptr);
    static bool ExisteLayer(const QString& nome, zvdb::Database* database = nullptr);
    static void CriaLayer(const QString& nome, zvdb::Database* database = nullptr);
    static void DescongelaLayer(const QString& nome, zvdb::Database* database = nullptr);
    static void LigaLayer(const QString& nome, zvdb::Database* database = nullptr);
    static void DestravaLayer(const QString& nome, zvdb::Database* database = nullptr);
    static void CongelaLayer(const QString& nome);
    static void CongelaTodosLayers();
    static void ApagarEntidadesLayer(const QString& nome);

    // ---- pages
    // The first non-empty piece of a page layer's name, cut at "$".
    static QString NomeBase(const QString& layer);
    // 0 shown, 1 "0" or a missing layer, 2 the page could not be made current.
    static int MostraPagina(const QString& layer, bool zoom);
    static void TrocaPagina(const QString& layer);
    static bool IsPaginaCapa(const QString& layer);
    // True when the product's page groups include `grupo`.
    static bool ExisteGrupo(const QString& grupo);
    static bool IsPaginaIndice(const QString& layer);
    static void MarcaPagina(const QString& layer, const QString& palavra);

    // ---- undo
    // The undo bracket around a batch that changes the drawing: an open undo block is
    // closed and the whole batch becomes one step of the host's Undo. Brackets nest.
    static void AbreDesfazer();
    static void FechaDesfazer();

    // ---- views
    static void ZoomExtents();
    static int Regenera();
    // Runs a host command from its tokens; false when the host does not know it.
    static bool Comando(const QStringList& tokens);
    // The bounds of what shows (model space on layers neither frozen nor off); false when
    // nothing shows.
    static bool ExtensaoVisivel(double& xMin, double& yMin, double& xMax, double& yMax);

    // ---- files: "DADOS\\x.dwg" paths resolved for this platform
    // Backslashes become slashes; a ".dwg" that does not exist is looked for as ".dxf".
    static QString ResolveArquivo(const QString& caminho);
    static bool ExisteArquivo(const QString& caminho);

    // ---- blocks and references
    static bool GetBlocoId(const QString& nome, OdDbObjectId& id,
                           zvdb::Database* database = nullptr);
    static QString GetNomeBloco(const OdDbObjectId& referencia);
    // The same name as the drawing holds it (UTF-8), valid until the reference changes; empty
    // for what is no block reference.
    static std::string_view NomeBlocoUtf8(const OdDbObjectId& referencia);
    static OdDbObjectId CarregaBloco(const QString& nome, const QString& arquivo);
    static bool RecarregaBloco(const QString& arquivo, const QString& nome);
    // RecarregaBloco for each (file, block name) pair in order, the references of all the
    // redefined blocks refreshed in one walk of the drawing; one result per pair.
    static std::vector<bool> RecarregaBlocos(
        const std::vector<std::pair<QString, QString>>& blocos);
    // A reference to the block (loaded from the file when the drawing lacks it) in model
    // space, with its attributes; `valores`, when given, tells each attribute's value.
    static OdDbObjectId InsereBloco(const QString& arquivo, const QString& nome,
                                    const QString& layer, double x, double y, double z,
                                    double rotacao, const CEValoresAtributos& valores = {});
    // The same with the block's definition found and the page's layer made by the caller,
    // who inserts many references of a few blocks on a few pages.
    static OdDbObjectId InsereReferencia(const OdDbObjectId& bloco, std::string_view layer,
                                         double x, double y, double z, double rotacao,
                                         const CEValoresAtributos& valores = {});
    static std::unique_ptr<zv::CEListaAtributos> GetDefinicoesAtributos(const QString& arquivo,
                                                                        const QString& nome);
    // The same without defining the block: from the drawing's block of that name, else read
    // from the file alone. Null when neither is there.
    static std::unique_ptr<zv::CEListaAtributos> LeDefinicoesAtributos(const QString& arquivo,
                                                                       const QString& nome);
    // Those of the block file alone, as the lists define their blocks from it; null when the
    // file does not read. Quiet: the import that follows tells what is wrong with the file.
    static std::unique_ptr<zv::CEListaAtributos> LeDefinicoesDoArquivo(const QString& arquivo);
    static OdDbObjectId GetReferenciaNoLayer(const QString& nome, const QString& layer);
    static QString GetValorSimboloPagina(const QString& tag, const QString& nome,
                                         const QString& layer);
    static bool GetExtensao(const OdDbObjectId& entidade, double& xMax, double& xMin, double& yMax,
                            double& yMin, bool comAtributos);
    static bool GetExtensaoBloco(const OdDbObjectId& bloco, double& xMax, double& xMin,
                                 double& yMax, double& yMin);

    // ---- attributes
    static void GetAtributos(const OdDbObjectId& referencia,
                             std::unique_ptr<zv::CEListaAtributos>& lista, bool comPrompts,
                             bool usarPadroes, const QString& prefixo = QString());
    static void GetAtributosPorId(const OdDbObjectId& id,
                                  std::unique_ptr<zv::CEListaAtributos>& lista, bool comPrompts,
                                  bool usarPadroes, const QString& prefixo = QString());
    // The ids of the reference's attributes in order.
    static std::vector<OdDbObjectId> GetIdsAtributos(const OdDbObjectId& referencia);
    static void GetAtributosConstantes(const OdDbObjectId& referencia,
                                       std::unique_ptr<zv::CEListaAtributos>& lista);
    static std::unique_ptr<zv::CEAtributo> GetAtributo(const QString& tag,
                                                       const OdDbObjectId& referencia,
                                                       bool comPrompt = false);
    static std::unique_ptr<zv::CEAtributo> GetAtributoEntidade(const QString& tag,
                                                               const OdDbObjectId& entidade,
                                                               bool comPrompt = false);
    static std::unique_ptr<zv::CEAtributo> GetAtributoVirtual(const QString& tag,
                                                              const OdDbObjectId& entidade);
    static int GetAtributosVirtuais(const OdDbObjectId& id,
                                    std::unique_ptr<zv::CEListaAtributos>& lista);
    // 0 found, 2 absent.
    static int GetAtributoTraduzido(CampoTraduzido campo, const OdDbObjectId& referencia,
                                    std::unique_ptr<zv::CEAtributo>& atributo,
                                    bool comPrompt = false);
    static QString TagTraduzida(CampoTraduzido campo, int indice);
    // Is the tag one of the wire field's tags ("FIO" too)?
    static bool EhTagFio(const QString& tag);
    static QString GetPromptAtributo(const QString& tag, const OdDbObjectId& bloco,
                                     const QString& padrao, int ocorrencia);
    static QString GetDefaultAtributo(const QString& tag, const OdDbObjectId& bloco);
    static void SetAtributo(const OdDbObjectId& referencia, const QString& tag,
                            const QString& valor);
    // Writes the values of a list back by tag, in order of occurrence.
    static void SetAtributosLista(const OdDbObjectId& referencia,
                                  const zv::CEListaAtributos& lista);
    static void CriarAtributos(const OdDbObjectId& definicao, const OdDbObjectId& referencia,
                               const CEValoresAtributos& valores = {});
    // The attribute's own value and invisibility, written to the drawing.
    static void SetValorAtributo(const OdDbObjectId& atributo, const QString& valor);
    static bool SetInvisivelAtributo(const OdDbObjectId& atributo, bool invisivel);

    // ---- entities, as the readers see them
    // The DXF type: "INSERT", "LWPOLYLINE", "POLYLINE", "XRECORD"...; empty for no object.
    static QString TipoEntidade(const OdDbObjectId& id);
    static bool EhReferencia(const OdDbObjectId& id);
    static bool EhPolilinha(const OdDbObjectId& id);
    static QString GetLayerEntidade(const OdDbObjectId& id);
    // The same name as the drawing holds it (UTF-8), valid until the entity changes; empty for
    // what is no entity.
    static std::string_view NomeLayerUtf8(const OdDbObjectId& id);
    // The vertices of a polyline, in the drawing's coordinates.
    static std::vector<CEPonto> GetVertices(const OdDbObjectId& polilinha);
    // The polyline's vertices appended to `pontos` when it stands on the layer (its name as
    // the drawing holds it), with one look-up of the polyline: how many; 0 when it is no
    // polyline or on another layer.
    static std::size_t AcrescentaVertices(const OdDbObjectId& polilinha, std::string_view layer,
                                          std::vector<CEPonto>& pontos);
    // Grows with every change to the drawing: what was read from it before stays valid while
    // this number stays the same.
    static std::uint64_t VersaoDesenho(zvdb::Database* database = nullptr);
    static CEPonto GetPosicao(const OdDbObjectId& referencia);
    // In radians.
    static double GetRotacao(const OdDbObjectId& referencia);
    // The insertion point of a text or attribute.
    static CEPonto GetPosicaoTexto(const OdDbObjectId& texto);
    // The reference's attributes, in the drawing's order, whose tag `aceita` takes, each
    // looked at once; none for another entity. An element asked for its connections reads
    // these, not its whole symbol.
    static void AtributosPostos(const OdDbObjectId& referencia,
                                const std::function<bool(std::string_view)>& aceita,
                                std::vector<CEAtributoPosto>& atributos);
    static OdDbObjectId GetDono(const OdDbObjectId& id);
    static OdDbObjectId GetModelSpace(zvdb::Database* database = nullptr);
    // Block definitions in table order, layouts included.
    static std::vector<std::pair<QString, OdDbObjectId>> GetBlocos(
        zvdb::Database* database = nullptr);
    // Every block reference of the drawing by block name (upper case), in drawing order,
    // gathered in one walk.
    static QHash<QString, std::vector<OdDbObjectId>> GetReferenciasPorBloco(
        zvdb::Database* database = nullptr);
    // The entities of model space that carry the application's extended data, in drawing
    // order, gathered in one walk.
    static std::vector<OdDbObjectId> GetEntidadesComXData(const QString& aplicacao,
                                                          zvdb::Database* database = nullptr);
    // The same for several applications in one walk: one list per application, as given.
    static std::vector<std::vector<OdDbObjectId>> GetEntidadesComXData(
        std::span<const std::string_view> aplicacoes, zvdb::Database* database = nullptr);
    // The block references of model space that carry the application's extended data, in
    // drawing order, from one walk: each with its block's name as spelt, the first item of
    // its data (code 0 when the data has no items) and the items of each of the `outras`
    // applications, in their order, as GetXData reads them (none when absent).
    struct ReferenciaComXData {
        OdDbObjectId id;
        QString bloco;
        int codigo = 0;
        QString texto;
        std::vector<CEListaXData> outras;
    };
    static std::vector<ReferenciaComXData> GetReferenciasComXData(
        const char* aplicacao, const std::vector<const char*>& outras = {},
        zvdb::Database* database = nullptr);
    // The entries of a dictionary below the named-objects dictionary; nothing when the
    // path does not exist (it is not made).
    static std::vector<std::pair<QString, OdDbObjectId>> GetEntradasDicionario(
        const QStringList& caminho, zvdb::Database* database = nullptr);
    // ---- what a crossing window sees
    // The entities of a block definition (the model space for the drawing), in drawing order.
    static std::vector<OdDbObjectId> GetEntidades(const OdDbObjectId& bloco);
    // The box a crossing window tests: the entity's extents without attributes; false for an
    // entity with no extents.
    static bool GetCaixaSelecao(const OdDbObjectId& entidade, CEPonto& minimo, CEPonto& maximo);
    // What one walk of a block's entities (those GetEntidades gives, in its order) tells of
    // each: whether it has items of extended data of one of `aplicacoes` (as TemXData), and
    // for a block reference with extents its GetCaixaSelecao box and its layer's name as the
    // drawing spells it (valid until the entity changes). A reader that windows the
    // references and walks the entities of some data touches each entity once.
    struct EntidadeVista {
        OdDbObjectId id;
        bool comXData = false;
        bool referenciaComCaixa = false;
        CEPonto minimo, maximo;
        std::string_view layer;
    };
    static void PercorreEntidades(const OdDbObjectId& bloco,
                                  std::span<const std::string_view> aplicacoes,
                                  const std::function<void(const EntidadeVista&)>& visita);
    // Frozen layers are not shown, so no window selects their entities.
    static bool LayerCongelado(const QString& nome, zvdb::Database* database = nullptr);
    // Equal within the drawing's tolerance.
    static bool PontosIguais(const CEPonto& a, const CEPonto& b);

    // ---- extended data, masters, project settings
    static void RegistraApp(const QString& aplicacao, zvdb::Database* database = nullptr);
    static bool TemXData(const OdDbObjectId& id, const QString& aplicacao);
    static bool TemXData(const OdDbObjectId& id, const char* aplicacao);
    // The items behind the application's name; empty when the object has none.
    static CEListaXData GetXData(const OdDbObjectId& id, const QString& aplicacao);
    static CEListaXData GetXData(const OdDbObjectId& id, const char* aplicacao);
    // The texts of those items as the drawing holds them (UTF-8), one per item GetXData
    // gives; valid until the object changes. Empty when the object has none.
    static void TextosXData(const OdDbObjectId& id, const char* aplicacao,
                            std::vector<std::string_view>& textos);
    // The same with each item's code (a point's: its x's) beside its text.
    static void TextosXData(const OdDbObjectId& id, const char* aplicacao,
                            std::vector<std::string_view>& textos, std::vector<int>& codigos);
    // The points (codes 1010 to 1013) of those items, in order, as GetXData reads them.
    static std::vector<CEPonto> PontosXData(const OdDbObjectId& id, const char* aplicacao);
    // Whether the object has items under the application; `texto` takes the first text item,
    // if there is one (`temTexto`).
    static bool TextoXData(const OdDbObjectId& id, const char* aplicacao, QString& texto,
                           bool& temTexto);
    // A symbol's attributes, names, position, key text and local circuit in one visit;
    // false (and `lido` emptied) for what is no entity.
    static bool LeituraSimbolo(const OdDbObjectId& entidade, CESimboloLido& lido);
    // The same in two steps: the extended data first (key text, layout, accessories), false
    // when there is no such object; then the rest, for a symbol whose key is wanted. A reader
    // that drops symbols without a key reads no more of them than their key.
    static bool LeituraChaveSimbolo(const OdDbObjectId& entidade, CESimboloLido& lido);
    static bool CompletaLeituraSimbolo(const OdDbObjectId& entidade, CESimboloLido& lido);
    // The key text alone, as LeituraSimbolo reads it: false when none of the key applications
    // has items.
    static bool TextoChave(const OdDbObjectId& entidade, std::string_view& texto, bool& temTexto);
    // A wire's key text, as TextoChave reads it, and the texts TextosXData gives for
    // "KVR_ZV_WIRE", from one walk of its extended data.
    static bool TextosFio(const OdDbObjectId& fio, std::string_view& chave, bool& temChave,
                          std::vector<std::string_view>& textos);
    // Whether the attribute is invisible.
    static bool AtributoInvisivel(const OdDbObjectId& atributo);
    static void SetXData(const OdDbObjectId& id, const QString& aplicacao,
                         const CEListaXData& itens);
    // Extended data of texts alone (code 1000), given in UTF-8.
    static void SetXDataTextos(const OdDbObjectId& id, std::string_view aplicacao,
                               const std::vector<std::string_view>& textos);
    static void SetXDataTextos(const OdDbObjectId& id, std::string_view aplicacao,
                               std::span<const std::string_view> textos);
    static OdDbObjectId GetSimboloMestre(zvdb::Database* database, const OdDbObjectId& entidade);
    static bool GetCircuitoLocal(const OdDbObjectId& entidade, int& numero);
    static bool GetCircuitoLocalInfo(int numero, QString& a, QString& b, QString& c);
    static OdDbObjectId IdDoHandle(const QString& handle, zvdb::Database* database = nullptr);
    // The same for a handle as a number (0 names nothing).
    static OdDbObjectId IdDoHandleNumero(std::uint64_t handle, zvdb::Database* database = nullptr);

    static int GetOrdemGrupos();
    static void SetOrdemGrupos(int ordem);
    static int GetOrdemPaginas(const QString& grupo);
    static void SetOrdemPaginas(const QString& grupo, int ordem);
    static int GetNumeracaoPaginas();
    static void SetNumeracaoPaginas(int modo);
    static QString GetCfgProjeto();
    static void SetCfgProjeto(const QString& nome);
    static CEListaXData GetPaineisDefinidos();
    static void SetPaineisDefinidos(const CEListaXData& paineis);
    // The "ZV_CABOS" dictionary, made when missing.
    static OdDbObjectId GetDicionarioCabos(zvdb::Database* database = nullptr);
    // The version stamp of "ZV_VERSAO"; empty when there is none.
    static QString GetVersao(zvdb::Database* database = nullptr);

    // ---- command line, messages and log
    // Prints text on the active document's command line, exactly as given.
    static void Imprime(const QString& texto);
    // "\n", message `numero` of section ZVLISTAS, "\n".
    static void ImprimeMensagem(int numero);
    // Appends a dated line with the process id to "LogFile.txt".
    static void Log(const QString& linha);
    static QString ArquivoLog();

    // ---- reading LISP symbols
    // The symbol's raw chain (the caller frees it with LiberaLista); null when missing.
    static zvsdk::ResultBuffer* LeSimboloLisp(const QString& nome);
    // The type of the first node LeSimboloLisp would give (RTNIL for nil, RTLB for a list),
    // RTNONE when the symbol is unbound; no chain is made.
    static short TipoSimboloLisp(const QString& nome);
    static QString GetStringLisp(const QString& nome, const QString& padrao = QString());
    static double GetRealLisp(const QString& nome, double padrao = 0.0);
    static int GetIntLisp(const QString& nome, int padrao = 0);
    static bool GetBoolLisp(const QString& nome, zvsdk::Document* documento);
    static bool GetBoolLisp(const QString& nome);
    static QStringList GetListaLisp(const QString& nome);

    // ---- writing LISP symbols
    static void SetStringLisp(const QString& nome, const QString& texto,
                              zvsdk::Document* documento = nullptr);
    static void SetNilLisp(const QString& nome, zvsdk::Document* documento = nullptr);
    static void SetIntLisp(const QString& nome, int valor);
    static void SetRealLisp(const QString& nome, double valor);
    static void SetListaLisp(const QString& nome, const QStringList& lista);
    // Sets a symbol to a chain the caller built; the caller keeps the chain.
    static void SetChainLisp(const QString& nome, const zvsdk::ResultBuffer* chain);
    // Sets a symbol to an association list of dotted string pairs, in the pairs' order.
    static void SetParesLisp(const QString& nome, const std::vector<zvsdk::StringPair>& pares);

    // ---- calling LISP functions with text arguments (at most nine)
    static void zvInvokeVoid(const QString& funcao, const QStringList& args = {});
    // The raw result chain; the caller frees it with LiberaLista.
    static zvsdk::ResultBuffer* zvInvokeLista(const QString& funcao, const QStringList& args = {});
    // A function without arguments that answers wires and their entries (the connections),
    // its answer given to `receptor` without the chain; false when the host does not answer
    // it so, and the chain of zvInvokeLista is the way.
    static bool zvInvokeConexoes(const QString& funcao, zvsdk::ConnectionReceiver& receptor);
    // Tells the host that zvInvokeConexoes(funcao) comes later, after a read that leaves the
    // drawing as it is; true when the host is working the answer out meanwhile, and the
    // call is best made as late as it can be.
    static bool zvPreparaConexoes(const QString& funcao);
    // A function of one text that answers polyline handles, each given to `receptor` with the
    // vertices the host has of it; false when the host does not answer it so.
    static bool zvInvokePolilinhas(const QString& funcao, const QString& argumento,
                                   zvsdk::PolylineReceiver& receptor);
    static int zvInvokeInt(const QString& funcao, const QStringList& args = {});
    static bool zvInvokeBool(const QString& funcao, const QStringList& args = {});
    static QString zvInvokeString(const QString& funcao, const QStringList& args = {});
    // Calls with a chain built by hand (function name first); the caller frees the result.
    static zvsdk::ResultBuffer* InvokeChain(const zvsdk::ResultBuffer* chamada);
    static void LiberaLista(zvsdk::ResultBuffer* lista);

    // ---- evaluating LISP text
    static bool AvaliaLisp(const QString& texto);

    // ---- result-list helpers, by position from 0
    static const zvsdk::ResultBuffer* NoDaLista(const zvsdk::ResultBuffer* lista, int posicao);
    static QString StringDaLista(const zvsdk::ResultBuffer* lista, int posicao);
    static int IntDaLista(const zvsdk::ResultBuffer* lista, int posicao);
    static double RealDaLista(const zvsdk::ResultBuffer* lista, int posicao);
    // The point at position 1 when that node is a point.
    static bool PontoDaLista(const zvsdk::ResultBuffer* lista, double* x, double* y, double* z);
    // Do the first nodes have these types? One to five codes.
    static bool PadraoDaLista(const zvsdk::ResultBuffer* lista, std::initializer_list<short> tipos);

    // ---- file dialogs: filter in "Desc|*.ext|Desc|*.ext" form; "" when cancelled.
    // `nome` says what is asked, for hosts that answer from a script.
    static QString DialogoArquivo(bool abrir, const QString& filtro, const QString& caminho,
                                  const QString& titulo, const QString& nome = "file");
    static QString ConverteFiltro(const QString& filtro);
    static void MessageBox(const QString& texto, const QString& titulo = QString());
};
