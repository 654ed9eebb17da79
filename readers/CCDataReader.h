#pragma once
// The base of every reader: the project's connectivity as the product's LISP side answers
// it, kept in maps for one run, with point and neighbour queries on it; and the building of
// items from drawing entities, their attributes, extended data and catalogue data.
#include "CEAtributo.h"
#include "TabelaChaves.h"
#include "TabelaConexoes.h"
#include "TabelaIds.h"
#include "VetorItens.h"
#include "cad/CICad.h"
#include "catalogue/CECacheCatalogo.h"

#include <QHash>
#include <QStringList>

#include <algorithm>
#include <array>
#include <functional>
#include <memory>
#include <optional>
#include <span>
#include <unordered_map>
#include <utility>
#include <vector>

namespace zvdb {
class Database;
}
namespace zv {
class CEAtributo;
class CEListaAtributos;
}  // namespace zv
class CETemplate;
class CIProgress;

class CCDataReader {
public:
    // Field separator of extended-data texts and catalogue rows.
    static const QChar kSeparador;

    CCDataReader();
    virtual ~CCDataReader();
    CCDataReader(const CCDataReader&) = delete;
    CCDataReader& operator=(const CCDataReader&) = delete;

    // What the item knows of one side of the entity, and of the other.
    virtual void LerLadoIni(CEItemLista& item, const OdDbObjectId& entidade,
                            CETemplate& modelo) = 0;
    virtual void LerLadoFim(CEItemLista& item, const OdDbObjectId& entidade,
                            CETemplate& modelo) = 0;
    // The items of a database, of all pages or only those named; null when there is nothing.
    virtual VetorItens* LerDados(zvdb::Database* database,
                                 const std::optional<QStringList>& paginas, CETemplate& modelo,
                                 CIProgress& progresso) = 0;

    // Gives back what the reads kept to answer faster (connections, entities read, indexes,
    // routes): once the items are made, the writer that follows needs the memory. A later
    // read loads them again.
    virtual void LiberaLeituras();
    // The same but for what expanding accessories asks (each symbol's own accessories, the
    // catalogue's, the units' fields): a reader done with the entities before it expands
    // accessories gives the rest back then.
    void LiberaLeiturasDeEntidades();

    // ---- connections
    // With `adiante`, a reader that reads on for a while before it first looks at the
    // connections lets the host work them out meanwhile (TabelaConexoes::Adia).
    void CarregaConexoesFios(bool adiante = false);
    void CarregaConexoesCabos(bool adiante = false);
    // Views into the loaded table: they hold until the reads are freed.
    std::optional<TabelaConexoes::Textos> ListaConexoes(const QString& fio) const;
    std::optional<TabelaConexoes::Textos> ListaConexoesCompletas(const QString& fio) const;
    std::optional<std::span<const CEPonto>> PontosConexao(const QString& fio) const;
    CEPonto PontoDaConexao(const QString& fio, const QString& elemento) const;
    CEPonto PontoDaConexaoCompleta(const QString& fio, const QString& texto) const;
    // The wire of the layer under the point; null when there is none.
    OdDbObjectId FioNoPonto(const QString& layer, const CEPonto& ponto);
    QString NumeroDoFio(const OdDbObjectId& entidade) const;
    bool EhFioNumerado(const OdDbObjectId& entidade) const;
    // The handle of the element next to the entity along the wire through the point.
    QString VizinhoNaConexao(const OdDbObjectId& entidade, const CEPonto& ponto, bool anterior);
    // The same along `fio`, the wire already found at the point (null: none).
    QString VizinhoNoFio(const OdDbObjectId& fio, const OdDbObjectId& entidade,
                         const CEPonto& ponto, bool anterior) const;
    // The entries of the wire's connections (none when it has none) and the place among them
    // of the element VizinhoNoFio gives (-1 when it gives none): a terminal's side reads the
    // element's handle and point there, without texts made for them.
    std::optional<TabelaConexoes::Entradas> EntradasDoFio(const OdDbObjectId& fio) const;
    // The same, with the wire's number and whether its own field holds it (NumeroDoFio and
    // EhFioNumerado; untouched when `fio` is null). The number is not kept for later
    // questions: each wire at a terminal's point is asked for once.
    std::optional<TabelaConexoes::Entradas> EntradasDoFio(const OdDbObjectId& fio, QString& numero,
                                                          bool& numerado) const;
    static int LugarDoVizinho(const TabelaConexoes::Entradas& c, const OdDbObjectId& entidade,
                              const CEPonto& ponto, bool anterior);
    CEPonto PontoDeCorte(const OdDbObjectId& referencia) const;
    std::unique_ptr<zv::CEAtributo> AtributoConexaoProximo(const OdDbObjectId& elemento,
                                                           const CEPonto& ponto) const;
    // The same, kept by the reader: valid until the next question of this kind. Every side
    // of a list asks, and most only read the value.
    const zv::CEAtributo* ConexaoProxima(const OdDbObjectId& elemento, const CEPonto& ponto) const;
    VetorItens* LeDicionarioCabos(zvdb::Database* database);
    bool EhEquipamento(const OdDbObjectId& id) const;

    // ---- items from entities
    QString ChaveDaEntidade(const OdDbObjectId& entidade) const;
    QString NormaDaEntidade(const OdDbObjectId& entidade) const;
    void LeColunasUsuario(const QString& sufixo, CEItemLista& item, const QStringList& colunas);
    void LeBloco(const QString& sufixo, CEItemLista& item, const OdDbObjectId& referencia,
                 CETemplate* modelo);
    void LeFio(const QString& sufixo, CEItemLista& item, const OdDbObjectId& polilinha,
               CETemplate* modelo);
    void LeEntidade(const QString& sufixo, CEItemLista& item, const OdDbObjectId& id,
                    CETemplate* modelo);
    // What LeEntidade gives, from the entity's fields read once for the run: an element or a
    // wire stands at the ends of many wires and sides, and its copies share their texts.
    // `numeroFio`: the item's own wire number when the caller knows it; a wire's copy then
    // reads the routes of that number without looking for it among the item's fields.
    void CopiaEntidade(const QString& sufixo, CEItemLista& item, const OdDbObjectId& id,
                       CETemplate* modelo, const QString* numeroFio = nullptr);
    // The entities CopiaEntidade keeps read, and the elements' connection attributes, are
    // bounded: past `n` (at least 1) kept since the
    // last turn, those not asked for again since the turn before go, and a later copy reads
    // them again. A list's neighbours are asked for close together, so few are read twice.
    void LimitaEntidadesGuardadas(std::size_t n) { limiteLidas_ = std::max<std::size_t>(n, 1); }
    // Whether CopiaEntidade keeps the entity's reading for the next copy.
    bool LeituraGuardada(const OdDbObjectId& id) const {
        return entidadesLidas_.contains(id) || entidadesAntigas_.contains(id);
    }
    // Whether wires' and terminals' readings are kept (see GuardaFios, GuardaBornes).
    bool GuardaLeiturasDeFios() const { return GuardaFios; }
    bool GuardaLeiturasDeBornes() const { return GuardaBornes; }
    CEItemLista* CriaItemBloco(const OdDbObjectId& referencia, CETemplate& modelo);
    CEItemLista* CriaItemFio(const OdDbObjectId& polilinha, CETemplate& modelo);
    CEItemLista* CriaItemVirtual(const OdDbObjectId& registro);
    CEItemLista* CriaItemEntidade(const OdDbObjectId& entidade, CETemplate& modelo);
    CEItemLista* CriaItemChave(const QString& relacao, const QString& chave, const QString& norma);

    // ---- accessories
    // The owner's accessories from the catalogue and the symbol's own ZV_VINC_ADITIVO, each
    // unit an item marked "ACE"; with a template and PBLACERECUR, accessories of
    // accessories too, stopped by the keys in `caminho` (callers pass an empty list).
    VetorItens ExpandeAcessorios(CEItemLista& dono, const zv::CEListaAtributos* atributos,
                                 CETemplate* modelo, QStringList caminho, const QString& norma);

    // ---- routes of the manual wire layout
    // Reads the routes of a wire once: from the first stored route record of the key that
    // has segments, a map from "first end-second end" to the route text. A key without a
    // record stores nothing and is looked up again next time.
    void LeRotasFio(const QString& chave, CETemplate* modelo);
    // The routes read for the key; null when there are none.
    const QHash<QString, QString>* Caminhos(const QString& chave) const;
    // An element's end as the lists show it: strip and number, or relation, with the
    // connection; empty when the element has neither.
    QString RotuloElemento(const QString& handle, const QString& conexao, CETemplate* modelo);
    // The two relation separators: of the template, or of the export settings without one.
    static void Separadores(CETemplate* modelo, QString& primeiro, QString& segundo);
    // The name of the item's wire number field: the first present of the three languages'
    // (CABO, WIRE, ALAMBRE), else FIO, the name this edition's drawings write; empty when the
    // item has none.
    static QString CampoFio(const CEItemLista& item, const QString& sufixo = QString());

    // The position text of the project's grid, or "??".
    QString Posicao(const OdDbObjectId& entidade) const;
    // The entity's layer name; the texts are made once per name and shared by the items.
    const QString& LayerDe(const OdDbObjectId& entidade) const;
    // LAYER, GRUPO and PAGINA under the suffix.
    void LeLayer(const QString& sufixo, CEItemLista& item, const QString& layer);
    // The text of a catalogue type number.
    QString TextoTipo(const QString& tipo);

protected:
    // The symbols an item is made of are kept for CopiaEntidade: set by the readers that
    // read them again as neighbours of other symbols (the export reader's sides).
    bool GuardaSimbolos = false;
    // By name number, the only fields a symbol's reading writes (none past the end); null:
    // every field. For a reader that keeps a few fields of many symbols.
    const std::vector<char>* CamposLidos = nullptr;
    // Without CamposLidos, the same told by the names' texts, each name asked once: for a
    // reader that knows the names it keeps before they are numbered. Setting it forgets the
    // readings kept. Unset: every field.
    void LeSoCampos(std::function<bool(const QString& nome)> quer);
    // The fields of one symbol's reading, as its reader tells them by the symbol's block and
    // key (CamposDaLeitura).
    class CamposDoSimbolo {
    public:
        virtual ~CamposDoSimbolo() = default;
        // Whether the reading writes the field of the name's number.
        virtual bool Quer(std::uint32_t nome) = 0;
        // Whether the item read so is to be read again whole: what the reading wrote may tell
        // the reader that the symbol is not of the kind it cut for.
        virtual bool Inteiro(const CEItemLista& item) = 0;
    };
    // Asked by CriaItemBloco of a block reference read for its item alone (not from a kept
    // reading), once its block and key are read: the fields the reading writes; null, those
    // CamposLidos or LeSoCampos tell. The names left out are numbered all the same.
    virtual CamposDoSimbolo* CamposDaLeitura(std::string_view bloco, const QString& chave) {
        Q_UNUSED(bloco);
        Q_UNUSED(chave);
        return nullptr;
    }
    // Which names, under a suffix, a copy under that suffix writes; unset: every name. For a
    // reader whose items are asked for few of their neighbours' fields (the strip drawing's
    // terminals); set it before the read with FiltraSufixos.
    void FiltraSufixos(std::function<bool(const QString& nome)> fica);
    // The suffixes a reader's sides copy their neighbours and wires under. While FiltraSufixos
    // is set, a reading made for such a copy leaves blank the values no copy under them keeps
    // that cost a look-up or a call (their names stay, in a full reading's order); a copy under
    // another suffix reads the entity again in full.
    void CopiasDosLados(std::vector<QString> sufixos);
    // The whole texts of the wires' entries ("HANDLE#CONNECTION#BLOCK") are kept for the
    // readers that ask for them; one that never does leaves them to the answer.
    bool GuardaCompletas = true;
    // The wires' readings are kept for CopiaEntidade too; a reader that copies each wire once
    // (the terminals' sides, read after every symbol) reads them apart and keeps none.
    bool GuardaFios = true;
    // The same for terminals (blocks BORNE... and BOR-...): a reader that reads every terminal
    // as an item before any side seldom meets one again as a neighbour.
    bool GuardaBornes = true;
    // A wire's reading looks up the routes of its number, for Caminhos: a reader that never
    // asks for them (the bill of materials) clears it.
    bool LeRotas = true;
    // A wire's name as the bill of materials takes it from its KVR_ZV_WIRE fields (from the
    // third item on), read where the drawing holds them: the first not blank, once trimmed, of
    // CABO, WIRE, ALAMBRE and FIO, a field given twice counting with its last value.
    QString NomeDoFioNoXData(const OdDbObjectId& fio) const;
    // CriaItemFio takes the wire's fields from its kept reading: set by a reader that copies
    // the same polylines again as the ends of its items (the bill of materials).
    bool FiosDasLeituras = false;
    // What ExpandeAcessorios reads of a symbol (its key text and its own accessories) is kept
    // from the symbol's reading: set by a reader that expands the symbols' accessories after
    // reading them all, when their drawing objects are long out of the cache.
    bool GuardaAcessorios = false;
    // Room for this many fields given to an item CriaItemBloco makes, before its first
    // merge: a reader whose items are alike (a strip's terminals, each read with its two
    // sides) sets the size of the last one, so that an item's fields move once, not at each
    // doubling of its array.
    std::size_t CamposPrevistos = 0;
    // Room an item's fields leave, once made, for what the list adds to every member; none
    // unless the reader knows its list.
    virtual std::size_t FolgaDosCampos(const CamposItem& campos) const {
        Q_UNUSED(campos);
        return 0;
    }
    CECacheCatalogo& Catalogo() { return catalogo_; }
    // An item kept for the list shares its field names with the items kept before it.
    void PartilhaNomes(CEItemLista& item) { item.partilharNomes(); }
    double Tolerancia() const { return tolerancia_; }
    // Whether the polyline has a key, as ChaveDaEntidade tells it, from the walk of its
    // extended data that its reading makes: a reading of it that follows (with the drawing
    // unchanged) takes that walk's texts instead of walking it again.
    bool FioTemChave(const OdDbObjectId& polilinha);
    // For the start side of the item CriaItemBloco makes: the reference's block name,
    // insertion point and layer from the reading it has just made of it; false when the
    // reading was found kept (or the item is of another entity).
    bool LidaAgora(const OdDbObjectId& referencia, std::string_view& bloco, CEPonto& posicao,
                   const QString*& layer) const;

private:
    void CarregaConexoes(const QString& funcao, bool detalhes, bool adiante);
    bool FioSobPonto(std::span<const CEPonto> vertices, const CEPonto& ponto) const;
    // The wires of a layer with their vertices, read once, and a grid of their segments that
    // answers the wire-at-point question from the few wires near the point.
    struct FiosDoLayer;
    const FiosDoLayer& IndiceFios(const QString& layer);
    const FiosDoLayer& LeIndiceFios(const QString& layer);
    // The grid of the wires read into the index.
    FiosDoLayer& FechaIndiceFios(FiosDoLayer& f);
    class ReceptorFios;
    // The index asked for last and its layer: a terminal's sides ask for one layer in turn.
    QString layerIndice_;
    const FiosDoLayer* indiceAtual_ = nullptr;
    void LeCircuitoLocal(const QString& sufixo, CEItemLista& item, const OdDbObjectId& entidade);
    // The wire's fields without the look-up of its routes; false when the polyline is no
    // complete wire (the reading stops there).
    bool LeCamposFio(const QString& s, CEItemLista& item, const OdDbObjectId& polilinha);
    // The same fields into `lote_`, in the order they are written; `campos`: the item's so
    // far, for its QTD.
    bool LoteFio(const QString& s, const CamposItem& campos, const OdDbObjectId& polilinha);
    // The routes of the wire number the item holds without a suffix.
    void LeRotasDoItem(const CEItemLista& item, CETemplate* modelo);
    // The key text's two parts; false when no key application is there.
    bool ChaveENorma(const OdDbObjectId& entidade, QString& chave, QString& norma) const;
    // The symbol read so far (its extended data) into `simbolo_`, with a key of its own.
    bool LeChaveDoSimbolo(const OdDbObjectId& referencia);
    // LeBloco's work on the symbol read into `simbolo_`.
    void LeSimboloLido(const QString& s, CEItemLista& item, const OdDbObjectId& referencia);
    // The same without a suffix, for the fields CamposDaLeitura tells.
    void LeSimboloCortado(CEItemLista& item, const OdDbObjectId& referencia);
    // While LeSimboloCortado reads: what CamposDaLeitura told.
    CamposDoSimbolo* camposDaLeitura_ = nullptr;

    // Local circuits by number: the LISP side is asked once per circuit and run.
    struct Circuito {
        bool ok = false;
        QString circuito, painel;
    };
    QHash<int, Circuito> circuitos_;
    // The circuit of a number as GetCircuitoLocal found it (`tem`); empty texts without one.
    const Circuito& CircuitoDe(bool tem, int numero);
    TabelaConexoes conexoes_;
    // Per layer, the handles of its wires as getFiosPorLayer answers them.
    QHash<QString, std::vector<std::uint64_t>> fiosPorLayer_;
    std::unordered_map<QString, std::unique_ptr<FiosDoLayer>> indicesFios_;
    std::uint64_t versaoIndices_ = 0;  // the drawing's version the indexes were read at
    // Route records in store order, read on the first lookup; routes by wire key.
    struct Rota {
        QString chave, dados;
    };
    std::vector<Rota> rotas_;
    QHash<QString, std::vector<std::size_t>> rotasPorChave_;  // record places by wire key
    bool rotasLidas_ = false;
    QHash<QString, QHash<QString, QString>> caminhos_;
    // The names of an entity's fields, shared by the entities that have the same ones (the
    // symbols of one kind), and the same names under each suffix asked for: renamed and put
    // in order once, not at each copy.
    struct FormaCampos {
        std::vector<std::uint32_t> nomes;  // ascending
        struct ComSufixo {
            QString sufixo;
            std::uint32_t qtd;  // QTD under the suffix
            // Ascending, with where each one's value stands; the same with the entity's QTD
            // of "1" (its value after the others), made when first asked.
            std::vector<std::uint32_t> nomes, lugares, nomesQtd, lugaresQtd;
            bool qtdFica = true;  // whether the filter keeps QTD under the suffix
        };
        std::vector<ComSufixo> sufixos;
        // `fica`: the names under a suffix that the copies keep; null: all of them.
        ComSufixo& Com(const QString& sufixo, const std::function<bool(const QString&)>* fica);
    };
    struct HashNomes {
        size_t operator()(const std::vector<std::uint32_t>& nomes) const;
    };
    std::unordered_map<std::vector<std::uint32_t>, std::unique_ptr<FormaCampos>, HashNomes> formas_;
    std::function<bool(const QString&)> ficaComSufixo_;
    // The fields of entities read for CopiaEntidade: their names' shape and the values in
    // its order. `qtdPadrao`: the entity gave no QTD, so the copy puts "1" only where the
    // item has none, as a reading would; `rotas`: a complete wire, after which a reading
    // looks up the routes of the item's wire.
    struct EntidadeLida {
        FormaCampos* forma = nullptr;
        std::vector<QString> valores;  // and "1" after them when qtdPadrao
        bool qtdPadrao = false;
        bool rotas = false;
        bool fio = false;    // a polyline's reading
        bool borne = false;  // a terminal's
        bool lados = false;  // made for the sides' copies: see CopiasDosLados
    };
    // Those asked for since the last turn, and those of the turn before, which move back when
    // asked for again and go at the next turn.
    mutable TabelaIds<EntidadeLida> entidadesLidas_, entidadesAntigas_;
    // Unbounded unless the reader sets a bound: the other lists ask in orders that would read
    // many again.
    std::size_t limiteLidas_ = SIZE_MAX;
    // What LeSoCampos set, and its answers by name number: 0 not asked yet, 1 written, 2 not.
    std::function<bool(const QString&)> querNome_;
    std::vector<char> queridos_;
    bool Quer(std::uint32_t nome);
    // The entity's kept reading, read now when none is kept; a wire's or terminal's reading
    // that is not to be kept waits in `avulsa_` for the copy that asked, which takes its values.
    const EntidadeLida& EntidadeGuardada(const OdDbObjectId& id, CETemplate* modelo);
    EntidadeLida avulsa_;
    // The suffix of the copy a reading is made for, while it is made: a wire's reading that
    // only this copy takes leaves out the position (a call of the LISP side) when the copy
    // drops it.
    const QString* copiaAvulsa_ = nullptr;
    bool PosicaoDescartada() const;
    // PosicaoDescartada's answers by suffix: every wire of a side asks, under a few suffixes.
    mutable std::vector<std::pair<QString, bool>> posicoesDescartadas_;
    // What CopiasDosLados set, and by name number without suffix whether a copy under one of
    // those suffixes keeps it: 0 not asked yet, 1 kept, 2 not.
    std::vector<QString> sufixosLados_;
    std::vector<char> valeNosLados_;
    // Whether the copy being made is one of the sides' under the filter.
    bool CopiaDosLados() const;
    // While a reading for the sides is made, whether the value of the name (without suffix) is
    // worked out; always outside one.
    bool lendoLados_ = false;
    bool Vale(std::uint32_t nome) {
        if (!lendoLados_) return true;
        const char vale = nome < valeNosLados_.size() ? valeNosLados_[nome] : 0;
        return vale ? vale == 1 : ValeNosLados(nome);
    }
    bool ValeNosLados(std::uint32_t nome);
    // The entity read apart into the form CopiaEntidade keeps.
    EntidadeLida LeEntidadeGuardada(const OdDbObjectId& id, CETemplate* modelo);
    // The item each reading is made in and the names it gave: their arrays serve the next.
    CEItemLista leitura_;
    std::vector<std::uint32_t> nomesLidos_;
    // Per wire polyline: its number as NumeroDoFio gives it, and whether its own field holds
    // one; every terminal side and neighbour asks for the wires at its points.
    struct NumeroFio {
        QString numero;
        bool proprio = false;
    };
    mutable TabelaIds<NumeroFio> numerosFios_;
    mutable std::vector<std::string_view> textosNumero_;  // the wire's items being searched
    std::optional<QString> NumeroNoCampoFio(const OdDbObjectId& entidade) const;
    QString NumeroNoCabo(const OdDbObjectId& entidade) const;
    // The items of a core's KVR_ZV_CABO being searched, and their codes.
    mutable std::vector<std::string_view> textosCabo_;
    mutable std::vector<int> codigosCabo_;
    std::optional<QString> NumeroDoRegistroCabo(const OdDbObjectId& registro) const;
    // Per element, its connection attributes with the places of their texts.
    struct LigacaoGuardada {
        CEPonto posicao;
        zv::CEAtributo atributo;
    };
    // Bounded in two turns as the entities kept read are.
    mutable TabelaIds<std::vector<LigacaoGuardada>> ligacoesPorElemento_, ligacoesAntigas_;
    // The last cut point asked for: both sides of a terminal ask for it.
    mutable OdDbObjectId corteDe_;
    mutable CEPonto corte_;
    CEPonto LePontoDeCorte(const OdDbObjectId& referencia) const;
    // The drawing's version the entity caches above were read at.
    mutable std::uint64_t versaoLidas_ = 0;
    // Empties the caches of entities when the drawing changed since they were read.
    void ConfereVersao() const;
    const NumeroFio& NumeroDoFioGuardado(const OdDbObjectId& entidade) const;
    // The same read from the drawing, and not kept.
    NumeroFio LeNumeroFio(const OdDbObjectId& entidade) const;
    // Catalogue column texts split into the number of the name and the value; a text that
    // is no column has kSemColuna.
    static constexpr std::uint32_t kSemColuna = ~std::uint32_t(0);
    QHash<QString, std::pair<std::uint32_t, QString>> colunasDivididas_;
    // A column text split, once for the run, whoever meets it first.
    const std::pair<std::uint32_t, QString>& ColunaDividida(const QString& coluna);
    // What the catalogue says of a symbol's key and standard: every symbol of a key asks
    // the same, so one look-up serves them all.
    struct CatalogoComp {
        QStringList colunas;
        // The columns split into name numbers and values, in the columns' order.
        std::vector<std::pair<std::uint32_t, QString>> campos;
        QString lista, descricao, tipo, material;
    };
    struct HashPar {
        size_t operator()(const std::pair<QString, QString>& p) const {
            return qHash(p.first, qHash(p.second));
        }
    };
    std::unordered_map<std::pair<QString, QString>, CatalogoComp, HashPar> catalogoComp_;
    const CatalogoComp& DadosCatalogoComp(const QString& chave, const QString& norma);
    struct HashTexto {
        using is_transparent = void;
        size_t operator()(std::string_view t) const { return std::hash<std::string_view>{}(t); }
    };
    template <class Valor>
    using PorTexto = std::unordered_map<std::string, Valor, HashTexto, std::equal_to<>>;
    // The constant attributes of a block definition by the block's name, as name numbers and
    // values; read again when the drawing changed.
    struct ConstantesBloco {
        const void* desenho = nullptr;
        std::uint64_t versao = 0;
        std::vector<std::pair<std::uint32_t, QString>> campos;
    };
    PorTexto<ConstantesBloco> constantes_;
    const ConstantesBloco& ConstantesDoBloco(const OdDbObjectId& referencia,
                                             std::string_view bloco);
    // The connection attributes of the last symbol LeBloco read: its neighbour's connection
    // attributes are asked right after.
    struct LigacaoLida {
        QString tag, valor;
        OdDbObjectId id;
    };
    mutable OdDbObjectId atributosDe_;
    mutable std::uint64_t atributosVersao_ = 0;
    mutable std::vector<LigacaoLida> ligacoesLidas_;
    // An element's connection attributes, read for them alone, and their tags' texts (the
    // tag table's own may move as it grows).
    mutable std::vector<CEAtributoPosto> atributosLigacoes_;
    mutable std::vector<QString> tagsLigacoes_;
    // Per layer name, its group and page (empty unless the name has three parts); per catalogue
    // type, its text: items repeat a few of each.
    mutable QHash<QString, std::pair<QString, QString>> gruposPaginas_;
    // The group and page of a page's layer (GROUP$PAGE$SHEET); both empty for other layers.
    const std::pair<QString, QString>& GrupoPagina(const QString& layer) const;
    QHash<QString, QString> textosTipo_;
    // A layer's name with its group and page, by the name as the drawing holds it.
    struct LayerLido {
        QString nome, grupo, pagina;
    };
    mutable PorTexto<LayerLido> layers_;
    // The entry LayerDoNome gave last.
    mutable const std::pair<const std::string, LayerLido>* ultimoLayer_ = nullptr;
    // Per cable record, by its handle's text as the core holds it: its CABO or CABLE
    // attribute, shared by its cores.
    mutable PorTexto<std::optional<QString>> numerosCabos_;
    const LayerLido& LayerDoNome(std::string_view nome) const;
    // The entity LayerDe was asked for last, its layer's name and the drawing's version then.
    mutable OdDbObjectId layerDe_;
    mutable const QString* layerDoUltimo_ = nullptr;
    mutable std::uint64_t layerVersao_ = 0;
    // Posicao of an entity of that layer.
    QString PosicaoNoLayer(const OdDbObjectId& entidade, const LayerLido& layer) const;
    // The position text at a point of the entity's page.
    QString PosicaoNoPonto(const OdDbObjectId& entidade, const QString& grupo,
                           const QString& pagina, const CEPonto& p) const;
    // The call of the position function, made once and filled again for each question.
    struct LiberaChamada {
        void operator()(zvsdk::ResultBuffer* chamada) const { zvsdk::releaseChain(chamada); }
    };
    mutable std::unique_ptr<zvsdk::ResultBuffer, LiberaChamada> chamadaPosicao_;

    // ---- the reading of a symbol
    // The key text's two parts, by the text as the drawing holds it, with what the catalogue
    // says of them once asked.
    struct ChaveLida {
        QString chave, norma;
        mutable const CatalogoComp* catalogo = nullptr;
        // As a wire's key: its catalogue columns split, and its list and description.
        mutable std::optional<std::vector<std::pair<std::uint32_t, QString>>> colunasFio;
        mutable std::optional<std::pair<QString, QString>> listaDescricaoFio;
        // Forgets what the catalogue said: its readings are given back.
        void Esquece() const {
            catalogo = nullptr;
            colunasFio.reset();
            listaDescricaoFio.reset();
        }
    };
    mutable PorTexto<ChaveLida> chaves_;
    const ChaveLida semChave_;  // of an entity without a key text
    const ChaveLida& ChaveDoTexto(std::string_view texto) const;
    // An attribute tag as the drawing holds it: its field's number without suffix (kSemNome
    // until first written so), its trimmed text and whether it is a connection's.
    struct TagLida {
        std::uint32_t numero;
        bool ligacao;
        QString texto;
    };
    // By the drawing's text: every attribute of every symbol read asks both, and a node
    // map would cost a few cache misses more per attribute.
    template <class Valor>
    using TabelaTextos = TabelaChaves<std::string, Valor, std::string_view>;
    mutable TabelaTextos<TagLida> tags_;
    TagLida& TagDoTexto(std::string_view tag) const;
    // Attribute values, trimmed, by their text in the drawing: symbols repeat theirs, and
    // their items share one text.
    mutable TabelaTextos<QString> valores_;
    const QString& ValorDoTexto(std::string_view valor) const;
    // A wire's catalogue columns under the suffix (into `lote_`), and its list and
    // description, asked of the catalogue once per key.
    void PoeColunasFio(const QString& s, const ChaveLida& chave);
    const std::pair<QString, QString>& ListaDescricaoFioDe(const ChaveLida& chave);
    std::vector<std::string_view> textosFio_;  // the items of the wire being read
    // The polyline FioTemChave walked last and the drawing's version then, with the key
    // text it found (as CICad::TextosFio gives it); none once a reading took them.
    struct TextosGuardados {
        OdDbObjectId fio;
        std::uint64_t versao = 0;
        std::string_view chave;
        bool temTexto = false, tem = false;
    };
    TextosGuardados textosGuardados_;
    // The numbers of wires' field names by the names as the drawing holds them.
    PorTexto<std::uint32_t> nomesFio_;
    std::uint32_t NumeroDoNomeFio(std::string_view nome);
    // The last symbol read, and the fields of one reading before they join the item (in
    // order of writing: a later one of the same name wins).
    CESimboloLido simbolo_;
    // The reference whose key part `simbolo_` holds, read by CriaItemBloco to tell whether
    // it makes an item: the kept reading made for its copy completes that part.
    OdDbObjectId chaveLidaDe_;
    // The reference whose whole reading `simbolo_` holds while its start side is read.
    OdDbObjectId lidaAgora_;
    std::vector<CamposItem::Campo> lote_;
    std::vector<std::uint64_t> ordemLote_;
    // OrdenaLote's answer by the batch's names in order of writing: the symbols (and wires) of a
    // kind write the same names, and their order is sorted out once; with the kept form of a batch
    // of those names once LeEntidadeGuardada found it (null before, and for a batch whose QTD
    // was its mark).
    struct OrdemLote {
        std::vector<std::uint64_t> ordem;
        FormaCampos* forma = nullptr;
    };
    std::vector<std::uint32_t> nomesLote_;
    std::unordered_map<std::vector<std::uint32_t>, OrdemLote, HashNomes> ordensLote_;
    // The entry of the last batch, whose names `nomesLote_` still holds: a block's symbols
    // come in a row and write the same names.
    OrdemLote* ultimaOrdem_ = nullptr;
    void JuntaLote(CEItemLista& item);
    // The places in `lote_` of the fields JuntaLote joins, sorted by name (the name in the
    // high half): the entry of the batch's names, valid until the next call.
    OrdemLote& OrdenaLote();
    // The batch's fields in name order into `nomes` and `valores`, as LeEntidadeGuardada keeps
    // them, but for a QTD of `marca`: whether the batch has no QTD but that.
    bool TiraLote(const std::vector<std::uint64_t>& ordem, std::uint32_t qtd, const QString& marca,
                  std::vector<std::uint32_t>& nomes, std::vector<QString>& valores);
    // The fields of the symbol read into `simbolo_` under the suffix, into `lote_`; `campos`:
    // the item's so far, for its QTD.
    void FazLote(const QString& s, const CamposItem& campos, const OdDbObjectId& referencia);
    // The numbers of the fields every batch writes after the symbol's own, under the last
    // few suffixes: the callers pass the same few in turn.
    struct NomesDoLote {
        QString sufixo;
        bool feitos = false;
        std::uint32_t handle = 0, painel = 0, local = 0, circuito = 0, lista = 0, chave = 0,
                      descricao = 0, tpDescri = 0, posicao = 0, layer = 0, grupo = 0, pagina = 0,
                      tipo = 0, qtd = 0, material = 0;
    };
    std::array<NomesDoLote, 4> nomesDoLote_;
    std::size_t proximoNomesDoLote_ = 0;
    const NomesDoLote& NomesDoLoteCom(const QString& s);

    // Per symbol read while GuardaAcessorios is set, what ChaveENorma gives of it (`temChave`:
    // what it answers) and the texts of its ZV_VINC_ADITIVO; kept while the drawing is the
    // same, apart from the registration of that application.
    struct AcessoriosLidos {
        bool temChave = false;
        QString chave, norma;
        QStringList vinculos;
    };
    // A reading without pairs, as told apart: texts equal but one null are two.
    struct SemVinculos {
        QString chave, norma;
        bool temChave;
        bool operator==(const SemVinculos& outra) const {
            return temChave == outra.temChave && chave == outra.chave && norma == outra.norma &&
                   chave.isNull() == outra.chave.isNull() && norma.isNull() == outra.norma.isNull();
        }
    };
    struct HashSemVinculos {
        size_t operator()(const SemVinculos& l) const {
            return qHash(l.chave, qHash(l.norma)) ^ size_t(l.temChave);
        }
    };
    // Each distinct reading once, and per symbol the number of its own: most symbols read
    // alike (a key and standard, no pairs of their own), and a large drawing has hundreds of
    // thousands of them.
    struct LeiturasAcessorios {
        TabelaIds<std::uint32_t> porSimbolo;
        std::vector<AcessoriosLidos> distintas;
        std::unordered_map<SemVinculos, std::uint32_t, HashSemVinculos> semVinculos;
        // The number of the reading, kept when new.
        std::uint32_t numero(AcessoriosLidos&& lidos);
        void limpa();
    };
    LeiturasAcessorios acessoriosLidos_;
    const void* desenhoAcessorios_ = nullptr;
    std::uint64_t versaoAcessorios_ = 0;
    void GuardaAcessoriosDe(const OdDbObjectId& referencia, const ChaveLida& chave);
    // The symbol's kept reading, or null; valid until the next one is kept.
    const AcessoriosLidos* AcessoriosGuardados(const OdDbObjectId& id) const;
    // ZV_VINC_ADITIVO is registered once per drawing and version.
    void RegistraAppVinculos(zvdb::Database* database);
    const void* appVinculosEm_ = nullptr;
    std::uint64_t appVinculosVersao_ = ~std::uint64_t(0);

    // The drawing and its version where KVR_ZV_WIRE was last registered.
    const void* appFioEm_ = nullptr;
    std::uint64_t appFioVersao_ = 0;
    // Per owner key, its catalogue accessories as keys and quantities: every owner of a key
    // asks, and the catalogue's texts are split once.
    QHash<QString, std::vector<std::pair<QString, int>>> acessoriosCatalogo_;
    const std::vector<std::pair<QString, int>>& AcessoriosDoCatalogo(const QString& chave);
    // The fields of a unit with nothing of its owner's, for its quantity: shared by the
    // unit's items, which copy them only if changed.
    struct UnidadeAcessorio {
        QString qtd;
        CamposItem campos;
    };
    // Per accessory key and standard: the fields of a unit, and its user columns.
    struct BaseAcessorio {
        CEItemLista item, colunas;
        std::vector<UnidadeAcessorio> unidades;
    };
    // The unit of the base with nothing of its owner's: the base's fields, the quantity and
    // the user columns, joined once per quantity.
    const UnidadeAcessorio& UnidadeDaBase(BaseAcessorio& base, const QString& qtd);
    // A new item sharing the unit's fields.
    static CEItemLista* NovoItemDaUnidade(const UnidadeAcessorio& unidade);
    std::unordered_map<std::pair<QString, QString>, BaseAcessorio, HashPar> basesAcessorio_;
    CECacheCatalogo catalogo_;
    double tolerancia_;
};
