#pragma once
// The wire reader: one item per stretch of a wire between two elements, the stretches of one
// wire chained by `ligado`; the ferrule variant, which breaks a wire at every element; and
// the wire lengths measured along the routes of the panel layout.
#include "CCDataReader.h"

#include <QSet>

#include <array>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>
#include <span>
#include <unordered_map>
#include <utility>
#include <vector>

class CCFioDataReader : public CCDataReader {
public:
    // A wire's ends are filled by the reader's own walk.
    void LerLadoIni(CEItemLista& item, const OdDbObjectId& entidade, CETemplate& modelo) override;
    void LerLadoFim(CEItemLista& item, const OdDbObjectId& entidade, CETemplate& modelo) override;
    // Reads the wires of the active drawing; the pages come from the template's page picker,
    // never from the pipeline.
    VetorItens* LerDados(zvdb::Database* database, const std::optional<QStringList>& paginas,
                         CETemplate& modelo, CIProgress& progresso) override;

    // The wire stretches of the pages (all without a list; none for an empty list). Template
    // and progress may be null (the exports).
    VetorItens* LeFios(const std::optional<QStringList>& paginas, CETemplate* modelo,
                       CIProgress* progresso);
    // The ferrule stretches; `opcoes` is the export's options, of which PAGINAS (page names
    // cut by ";", empty for all pages) is read.
    VetorItens* LeAnilhas(const QHash<QString, QString>& opcoes, CETemplate* modelo,
                          CIProgress* progresso);
    // The fields of the wire polyline at one end (side "INI" or "FIM"), found at the point of
    // the end's connection text.
    void LeSegmento(const QString& lado, CEItemLista& item, const QString& completo,
                    CETemplate* modelo);
    // The relation texts of the end at `indice` of the wire's connection list.
    void CompoeExtremidade(const QString& sufixo, CEItemLista& item, CETemplate* modelo,
                           int indice);
    // The same for the wire of that number.
    void CompoeExtremidade(const QString& sufixo, CEItemLista& item, CETemplate* modelo,
                           const QString& numero, int indice);
    // REL, LIG and the three relation fields of one end: a pin, a terminal or any other
    // element, in this order of tests.
    void ComporRelacaoFio(const QString& sufixo, CEItemLista& item, CETemplate* modelo,
                          const zv::CEAtributo* ligacao);

    // ---- lengths and routes of the panel layout
    // The route polylines and panel views of model space, once per reader.
    void CarregaLayout();
    // Element relations (masters) and terminals to their own handles, for those that have a
    // layout view.
    void MapeiaLayout(CETemplate* modelo);
    // The point of an element's connection in its layout view: the CPOINT attribute of that
    // connection, else the view's position; false when the element has no view.
    bool PosicaoLayout(const QString& elemento, const QString& conexao, CEPonto& ponto);
    // The length along the wire's routes between the vertices nearest two points, with the
    // allowances, as "%f" text; "-" for an empty key, "0.000000" without a route.
    QString ComprimentoFio(const QString& chave, const CEPonto& inicio, const CEPonto& fim);
    // Where a stretch starts and ends in the wire's connection list; an open stretch ends
    // at -1.
    struct Trecho {
        int inicio = 0, fim = -1;
    };
    // The stretches of one chain, kept in the chain's order as the walks make them: a
    // stretch is looked for at its own place first. An array, not a map: a map costs two
    // allocations a wire, and the walks reuse one array for all wires.
    class Trechos {
    public:
        // A stretch not yet among them, after the others.
        void acrescenta(const CEItemLista* item, Trecho trecho) {
            trechos_.emplace_back(item, trecho);
        }
        Trecho* procura(const CEItemLista* item, std::size_t lugar);
        const Trecho* procura(const CEItemLista* item, std::size_t lugar) const;
        void remove(const CEItemLista* item);
        void clear() { trechos_.clear(); }
        std::size_t tamanho() const { return trechos_.size(); }
        auto begin() const { return trechos_.begin(); }
        auto end() const { return trechos_.end(); }

    private:
        std::vector<std::pair<const CEItemLista*, Trecho>> trechos_;
    };
    // LENGTH and COMPRIMENTO of every stretch of the chain that starts at `primeiro`. Each
    // stretch is measured between the elements it joins: those `trechos` gives, else the
    // k-th and the next of the list for the k-th stretch; an open stretch to the element
    // after its start.
    // `elementos`: a QStringList or the loaded table's TabelaConexoes::Textos. `campoFio`:
    // what CampoFio gives for `primeiro`, when the caller has it already.
    template <class Lista>
    void CalculaComprimentos(CEItemLista* primeiro, const Lista& elementos,
                             const Trechos* trechos = nullptr, const QString* campoFio = nullptr);
    // CAMINHOFIO and PATHWIRE of each item from the routes read for its wire.
    void AplicaCaminhos(VetorItens& itens);
    // Transitions between ducts: pairs of a transition block and its partner.
    const std::vector<std::pair<OdDbObjectId, OdDbObjectId>>& Transicoes() const {
        return transicoes_;
    }

private:
    // The fields read of a list's stretches while the walk makes them and once it has, by
    // their names with the ends' suffixes: a copy of an end keeps no other, a stretch drops
    // its wire's others once the template's filter has seen them, and the walk's own once
    // the wire is done. Unset: every field.
    struct CamposLidos {
        std::function<bool(const QString&)> fica;
        std::vector<char> porNumero;  // by name number: 0 not asked yet, 1 kept, 2 not
        void Retem(CEItemLista& item);
    };
    CamposLidos durante_, depois_;
    // Whether the copy of the wire found at the start (end) of a stretch keeps a field: one
    // that keeps none is not looked for.
    bool segmentoIni_ = true, segmentoFim_ = true;
    // `lista`: the names (in upper case) the list reads of the items; none: all.
    void LimitaCampos(const std::optional<QSet<QString>>& lista);
    // The wire's item from its polyline; null without a key.
    // `lugares`: room for that many fields, given before the first copy.
    CEItemLista* ItemFio(const OdDbObjectId& polilinha, CETemplate* modelo,
                         std::size_t lugares = 0);
    // The answer of getListaFios for the layers, as object ids.
    std::vector<OdDbObjectId> ListaFios(const QStringList& layers);
    // One end of a stretch from the element at `indice` of the lists of the wire `numero`
    // (the item's own number).
    void PreencheExtremidade(const QString& lado, CEItemLista& item,
                             const TabelaConexoes::Textos& elementos, int indice,
                             CETemplate* modelo, const QString& numero);
    void CarregaTransicoes();
    // The entities with each extended data the layout readings look for, from one walk of
    // the drawing; a reading that comes after the drawing changed walks again.
    enum ComXData { kRotas, kPaineis, kEsquemas, kTransicoes, kComXData };
    std::vector<OdDbObjectId> EntidadesCom(ComXData qual);
    // What ComporRelacaoFio does, given the connection's value (empty without one).
    void ComporRelacao(const QString& sufixo, CEItemLista& item, CETemplate* modelo,
                       const QString& lig);
    // The first place of the full text of the entry at `indice` in the wire's list, as
    // PontoDaConexaoCompleta finds it; -1 when it has none.
    int PrimeiroLugar(const QString& numero, int indice);
    // The fields of the wire polyline at the point of the entry at `indice`: what LeSegmento
    // gives for that entry's full text. `numero` is the item's own wire number.
    void LeSegmentoNoIndice(const QString& lado, CEItemLista& item, const QString& numero,
                            int indice, CETemplate* modelo);
    // The value of the connection attribute of the wire's entry at `indice` nearest the
    // entry's point; null when the element has none. Each end is asked twice (its texts and
    // its length): answered once.
    std::optional<QString> Ligacao(const QString& numero, int indice);
    // The same for an element and a point that may not be an entry of the wire's list.
    std::optional<QString> LigacaoProxima(const QString& numero, const QString& elemento,
                                          int indice, const CEPonto& ponto);

    // What a walk knows of the wire under work, emptied for the next wire: a wire's ends ask
    // for the same entries, and nothing is kept for wires done but the arrays' room, which
    // goes when the walk ends.
    struct FioAtual {
        QString numero;
        bool valido = false;
        std::vector<int> primeiros;  // per entry, the first entry of the same full text
        std::vector<std::optional<QString>> ligacoes;
        std::vector<bool> ligacoesLidas;
        // Per entry, its element once found (an entry's two ends and its connection ask).
        std::vector<OdDbObjectId> ids;
        std::vector<bool> idsLidos;
        // The wire's entries and their points, looked up once.
        bool listasLidas = false;
        std::optional<TabelaConexoes::Textos> elementos;
        std::optional<std::span<const CEPonto>> pontos;
        // Its whole texts, looked up once.
        bool completasLidas = false;
        std::optional<TabelaConexoes::Textos> completas;
        // Starts on the wire `outro`: the arrays keep their room for the next wires.
        void Recomeca(const QString& outro);
    };
    // The entries and points of the wire `numero`: in a walk, whose table stays as the walk
    // loaded it, looked up once per wire; each end asks for them several times.
    void Listas(const QString& numero, std::optional<TabelaConexoes::Textos>& elementos,
                std::optional<std::span<const CEPonto>>& pontos);
    FioAtual& Fio(const QString& numero);
    FioAtual fio_;
    // The element of the entry at `indice` of `elementos`, the entries of the wire `numero`;
    // null when it no longer exists. In a walk each entry's is looked up once.
    OdDbObjectId Elemento(const QString& numero, const TabelaConexoes::Textos& elementos,
                          int indice);
    // The relation's separators and order, read once for a walk with its template.
    struct Composicao {
        QString sep, sepLig;
        bool relacaoPrimeiro = true;
    };
    static Composicao LeComposicao(CETemplate* modelo);
    std::optional<Composicao> composicao_;
    CETemplate* modeloComposicao_ = nullptr;
    // A walk's state, set up at its start and dropped at its end.
    class Caminhada;
    // Lengths already measured, by wire key and the two points.
    struct Medida {
        QString chave;
        std::array<double, 6> pontos;
        bool operator==(const Medida& outra) const;
    };
    struct HashMedida {
        size_t operator()(const Medida& m) const;
    };
    std::unordered_map<Medida, QString, HashMedida> comprimentos_;
    // An element's view in the panel layout, and the CPOINT attributes of the view (value
    // and text), in order; a null view when it has none.
    struct VistaLayout {
        OdDbObjectId id;
        std::vector<std::pair<QString, OdDbObjectId>> pontos;
    };
    VistaLayout LeVista(const QString& elemento);
    // By the element's handle as a number, for one walk: texts naming the same handle name
    // the same element, and a text that is no handle names none.
    std::unordered_map<std::uint64_t, VistaLayout> vistas_;
    QHash<QString, QString> rotasLayoutFio_;  // wire key (and key + "$") to route handle
    QSet<QString> fiosComRota_;               // the wire keys that have a route
    QHash<QString, QString> paineisLayout_;   // panel key to view handle
    QHash<QString, QString> layoutPorRelacao_;
    std::vector<std::pair<OdDbObjectId, OdDbObjectId>> transicoes_;
    bool layoutCarregado_ = false, layoutMapeado_ = false, transicoesCarregadas_ = false;
    std::vector<std::vector<OdDbObjectId>> comXData_;
    std::uint64_t versaoComXData_ = 0;
};
