#pragma once
// The topographic diagram: the physical view of a project. Every listed symbol that has a
// block of the chosen representation in the catalogue is inserted on new pages of a page
// group, in rows and pages inside a rectangle of the sheet, and tied to its symbol by
// extended data both ways, so that a later run adds only what is new. A symbol's accessories
// (from the catalogue, or added on the symbol) that have a block of the representation are
// laid out as blocks of their own, each tied to its symbol and its place in the list.
#include "readers/CCExportDataReader.h"

#include <QByteArray>
#include <QHash>
#include <QSet>
#include <QString>
#include <QStringList>
#include <QStringView>

#include <array>
#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <string_view>
#include <vector>

class CETemplate;
class CIProgress;

class CCDiagramaTopografico : public CCExportDataReader {
public:
    // The ways a run ends before it draws, thrown as integers and swallowed by the command.
    enum Codigo { SemRepresentacao = 1, SemGrupo = 2, SemCanto = 3 };

    // What the template's LISP symbols ask of the run.
    struct Parametros {
        QString representacao, grupo;
        QString canto1, canto2;
        QStringList ordenacao;
        double margem = 0.0;
        int linhas = 0, colunas = 0;
        bool borne = false;
        QString borneDist;
    };
    // The drawing area: left side, top side, width and height.
    struct Retangulo {
        double esquerda = 0.0, topo = 0.0, largura = 0.0, altura = 0.0;
    };
    // A block's extents, each bound kept as its absolute value.
    struct Extensao {
        double xMin = 0.0, xMax = 0.0, yMin = 0.0, yMax = 0.0;
        double Largura() const;
        double Altura() const;
        double MenorX() const;
    };
    // One terminal as its strip's rows see it.
    struct Borne {
        QString chave;
        double passo = 0.0;
        QString regua;
    };
    using Linha = std::vector<QString>;
    using Pagina = std::vector<Linha>;
    using Extensoes = QHash<QString, Extensao>;

    // A key to sort candidates by, in the order of QString's operator<. Its first eight
    // characters are packed beside it when they are ASCII: most keys then part without their
    // texts being read. It views the text, which must outlive it.
    class ChaveDeOrdem {
    public:
        explicit ChaveDeOrdem(QStringView texto);
        friend bool operator<(const ChaveDeOrdem& a, const ChaveDeOrdem& b);

    private:
        QStringView texto_;
        std::uint64_t prefixo_ = 0;
        bool ascii_ = true;
    };

    // ---- the layout, on candidate keys
    // "x,y,z" or "x,y" (z 0), single precision; false, and zeros, for anything else.
    static bool LeCanto(const QString& texto, CEPonto& canto);
    static Retangulo RetanguloDe(const CEPonto& a, const CEPonto& b);
    static Extensao ExtensaoAbsoluta(double xMin, double xMax, double yMin, double yMax);
    // Blocks in order, cut into rows no wider than the width (a wider block: a row of its
    // own), at most `colunas` a row when that is 1 or more.
    static std::vector<Linha> LinhasBlocos(const std::vector<QString>& chaves,
                                           const Extensoes& extensoes, double largura,
                                           double margem, int colunas);
    // Terminals by their steps; a new strip name takes one more step before it.
    static std::vector<Linha> LinhasBornes(const std::vector<Borne>& bornes, double largura,
                                           double margem);
    // Rows into pages by the rows' heights, at most `linhas` a page when that is 1 or more.
    static std::vector<Pagina> Paginas(const std::vector<Linha>& linhas, const Extensoes& extensoes,
                                       double altura, double margem, int maxLinhas);
    // Insertion points: ordinary rows justified to the full width, centred on their height.
    static QHash<QString, CEPonto> PosicoesBlocos(const std::vector<Pagina>& paginas,
                                                  const Extensoes& extensoes,
                                                  const Retangulo& retangulo, double margem);
    // Terminal rows step by step from the left side, not justified.
    static QHash<QString, CEPonto> PosicoesBornes(const std::vector<Pagina>& paginas,
                                                  const Extensoes& extensoes,
                                                  const QHash<QString, double>& passos,
                                                  const Retangulo& retangulo, double margem);

    // ---- the run
    // Loads the template and draws. A missing representation, group or corner ends it with
    // a Codigo thrown; every other end is told on the command line.
    void Executar(const QString& caminhoModelo);

    // The symbols' parameters, as the template left them.
    static Parametros LeParametros();

    // A terminal's sides are left unread.
    void LerLadoIni(CEItemLista& item, const OdDbObjectId& entidade, CETemplate& modelo) override;
    void LerLadoFim(CEItemLista& item, const OdDbObjectId& entidade, CETemplate& modelo) override;

    // The fields a run reads of its items: the blocks' attribute tags, bare and trimmed, and
    // the names the run itself asks for. Null when a block's tags can't be known without
    // loading it: the items are then read whole.
    static std::optional<std::vector<std::uint32_t>> CamposUsados(
        const Parametros& parametros, const std::vector<std::pair<QString, QString>>& blocos);

private:
    // What a symbol's extended data says of its extra accessories and of the blocks that
    // earlier runs drew for it and for its accessories: read with the symbol, shared by its
    // accessories' candidates.
    struct DadosSimbolo {
        CEListaXData aditivos, ligacoes, ligacoesAce;
    };
    struct Candidato {
        QString chave, norma, bloco;
        OdDbObjectId simbolo;  // the symbol itself, or the one whose accessory it is
        // The drawing's block name and the block's file, made once per block and shared by
        // its candidates.
        QString nome, arquivo;
        // The symbol had no link of this kind (its own block, or its accessories') when
        // the run began: the first link written needs no reading of the old ones.
        bool semLigacoes = false;
        // Null when the symbol's data says none of these.
        std::shared_ptr<const DadosSimbolo> dados;
    };
    // Candidates with their keys, in key order once gathered, each key once.
    using Entrada = std::pair<QString, Candidato>;
    using Candidatos = std::vector<Entrada>;
    // An item read for the layout, with the candidate it was read for and its key; the
    // extents and step of its block and its insertion point, as the layout finds them.
    struct Lido {
        CEItemLista* item = nullptr;
        const Candidato* candidato = nullptr;
        const QString* chave = nullptr;
        Extensao extensao;
        double passo = 0.0;
        CEPonto ponto;
    };
    // A pass's items by the place each was read in (its sequence field); the layout works
    // on those places.
    using Lidos = std::vector<Lido>;
    using LinhaLida = std::vector<std::uint32_t>;
    using PaginaLida = std::vector<LinhaLida>;

    void ColetaCandidatos(Candidatos& candidatos);
    void AdicionaAcessorios(Candidatos& candidatos);
    void ProcuraBlocos(Candidatos& candidatos);
    void MantemComArquivo(Candidatos& candidatos);
    void RenovaBlocos(Candidatos& candidatos);
    void DescartaDesenhados(Candidatos& candidatos);
    // The items of the candidates, in their order; those that give none or are not listed
    // fall out. Terminals (`bornes`) also take their steps.
    VetorItens LeItens(const std::vector<const Entrada*>& entradas, CETemplate& modelo,
                       Lidos& lidos, bool bornes);
    // An accessory's item: its own catalogue fields under its owner's relation, strip,
    // number and page; none when the owner or the accessory is not listed.
    CEItemLista* LeItemAcessorio(const QString& chave, const Candidato& candidato,
                                 CETemplate& modelo);
    // What an accessory takes of the catalogue for its key and standard, worked out once per
    // key: whether it is listed, and its own fields that the run uses, user columns included.
    struct DoCatalogo {
        bool listado = false;
        std::vector<CamposItem::Campo> campos;
    };
    const DoCatalogo& DoCatalogoDe(const Candidato& candidato);
    // Is an accessory's block of this representation, for this place in the symbol's list,
    // still in the drawing?
    bool AcessorioDesenhado(const QString& chave, Candidato& candidato) const;
    // Works out the fields kept of items read (see CamposUsados).
    void PreparaLeitura(const Candidatos& candidatos);
    // Leaves a read item only the fields the run uses.
    void Retem(CEItemLista& item) const;
    // A terminal block's step, as text and as a number, found once per block.
    const std::pair<QString, double>& PassoDe(const Candidato& candidato);
    QHash<QString, std::pair<QString, double>> passosPorBloco_;
    static void LeExtensoes(Lidos& lidos, QHash<QString, Extensao>& porBloco);
    // The pages of each pass, the insertion points left in the items read.
    // Where each of the items was read in its pass, in the items' order.
    static std::vector<std::uint32_t> Lugares(const VetorItens& itens, const Lidos& lidos);
    std::vector<PaginaLida> PaginasComuns(const VetorItens& itens, Lidos& lidos,
                                          const Retangulo& retangulo) const;
    std::vector<PaginaLida> PaginasBornes(const VetorItens& itens, Lidos& lidos,
                                          const Retangulo& retangulo) const;
    // Makes the pages of one pass and inserts its blocks.
    void Desenha(const std::vector<PaginaLida>& paginas, Lidos& lidos);
    // A page of the pass: its layer, whose record is made (when missing) before its first
    // block goes in.
    struct PaginaFeita {
        QString layer;
        QByteArray layerU8;
        bool pronta = false;
    };
    void Insere(Lido& lido, PaginaFeita& pagina);
    // A block that went in, to be named in its symbol's chain when the pass is over: a
    // symbol's chains are then read and written once, however many of its blocks the pass
    // drew.
    struct Ligacao {
        std::uint64_t simbolo = 0;
        const Candidato* candidato = nullptr;
        QStringView lugar;  // an accessory's place ("*0", "#1"); empty for the symbol's block
        std::uint64_t bloco = 0;
    };
    // A pair of a symbol's chain: a representation and a block of it.
    struct Par {
        QByteArray rep, ligado;   // as read, for a pair made before this pass
        QString lugarLido;        // the place an accessory's block of this representation shows
        QStringView lugar;        // the place of a block of this pass
        std::uint64_t bloco = 0;  // a block of this pass (its texts are made when written)
        bool mesmaRep = false;    // of the run's representation
        QStringView Lugar() const { return bloco ? lugar : QStringView(lugarLido); }
    };
    struct Cadeia {
        std::vector<Par> pares;
        bool lida = false;
    };
    void LigaSimbolos();
    // One symbol's links, in the order its blocks went in; `ligadosAntes`: how many symbols
    // earlier passes gave accessories' links (the first of comAcessorioLigado_, in order).
    void LigaSimbolo(const Ligacao* inicio, const Ligacao* fim, Cadeia& propria, Cadeia& acessorios,
                     std::size_t ligadosAntes);
    // The chain as the symbol has it now, less the pairs no link keeps (gone blocks).
    void LeCadeia(const OdDbObjectId& simbolo, bool acessorio, Cadeia& cadeia) const;
    void GravaCadeia(const OdDbObjectId& simbolo, bool acessorio, const Cadeia& cadeia);
    // The texts of the link being written and a chain's handles, room kept from link to link.
    std::vector<std::string_view> textos_;
    std::vector<std::array<char, 16>> digitos_;

    Parametros parametros_;
    QString diretorio_;
    Candidatos candidatos_;
    // Items whose blocks went in, freed a batch at a time on the module's freeing thread.
    struct Inseridos {
        std::vector<CEItemLista*> itens;
        Inseridos() = default;
        Inseridos(Inseridos&&) noexcept = default;
        Inseridos& operator=(Inseridos&&) noexcept = default;
        ~Inseridos();
    };
    Inseridos itensInseridos_;
    void EntregaInseridos();
    // The owners of accessories, read once each: null for one that gives no listed item.
    // An owner that is a candidate itself is its own item among those read; one read first
    // for an accessory is kept here until its own turn (or for good, when it has none).
    struct Dono {
        const CEItemLista* item = nullptr;
        std::shared_ptr<CEItemLista> lido;
    };
    QHash<QString, Dono> donos_;
    QHash<std::pair<QString, QString>, std::shared_ptr<const DoCatalogo>> doCatalogo_;
    // The symbols that have accessories among the candidates.
    QSet<QString> comAcessorios_;
    // By name number, the fields kept of items read; empty: all of them.
    std::vector<char> camposUsados_;
    // Whether items read take their candidate's key (HANDLE) and their place as read: only
    // when a block's attribute or the sort may show them.
    bool escreveChave_ = true, escreveLugar_ = true;
    // The representation key as the links write it, and the blocks' definitions by name,
    // found at their first insertion.
    QByteArray representacaoU8_;
    QHash<QString, OdDbObjectId> definicoes_;
    // The symbols given an accessory's link in this run, by handle in order: their chains
    // are no longer empty.
    std::vector<std::uint64_t> comAcessorioLigado_;
    // The links of the pass being drawn.
    std::vector<Ligacao> ligacoes_;
    CIProgress* progresso_ = nullptr;
    int inseridos_ = 0;
    int paginasCriadas_ = 0;
};
