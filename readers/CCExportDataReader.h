#pragma once
// The reader of the exports: in one pass every kind of item the export asked for
// (terminals, components, accessories, wires, ferrules, cables), each marked with its kind
// in ZV_LISTA_TIPO; a wire's item also learns what stands at its two ends.
#include "BornesLidos.h"
#include "CCBorneDataReader.h"
#include "CCMaterialDataReader.h"
#include "TabelaChaves.h"

#include <cstddef>
#include <optional>
#include <string_view>

class CEExportacao;

class CCExportDataReader : public CCMaterialDataReader {
public:
    CCExportDataReader() {
        GuardaSimbolos = true;
        PreveCampos = false;
        CopiasDosLados(CCBorneDataReader::SufixosDosLados());
    }
    // A terminal's two sides are the hooks on the terminal itself: what is wired at its
    // insertion point, and at its cut point.
    void LerLadoIni(CEItemLista& item, const OdDbObjectId& entidade, CETemplate& modelo) override;
    void LerLadoFim(CEItemLista& item, const OdDbObjectId& entidade, CETemplate& modelo) override;
    // The first and the second end of a wire stretch, with the entity standing there.
    virtual void AoLigarInicio(CEItemLista& item, const OdDbObjectId& entidade, CETemplate* modelo);
    virtual void AoLigarFim(CEItemLista& item, const OdDbObjectId& entidade, CETemplate* modelo);
    // The items of the kinds that the LISP variable EXPORTA asks for (4 when unset). The
    // template is null for the exports; `paginas` is not used: the pages of wires, ferrules
    // and cables come from the export's PAGINAS option. Null without a database.
    virtual VetorItens* Le(zvdb::Database* database, CETemplate* modelo, bool flag,
                           const std::optional<QStringList>& paginas);

    // With the readings go the components' relations: once every read is made, no side
    // asks for them.
    void LiberaLeituras() override;

    // The exports add no field to the items they read.
    std::size_t FolgaDosCampos(const CamposItem& campos) const override {
        Q_UNUSED(campos);
        return 0;
    }

    // Whether a block, by its name as the drawing holds it, is a terminal's: BORNE... or
    // BOR-..., in any case.
    static bool EhNomeDeBorne(std::string_view nome);

    // The export this reader reads for; null for the topographic diagram.
    CEExportacao* Exportacao = nullptr;

    // The heading of a field from the catalogue's dictionary (the web one with `web`); the
    // tag itself when the catalogue has none.
    QString PromptCampo(const QString& tag, bool web);

    // The fields of the entity at `handle` under the suffix: for a contact or terminal
    // symbol, those of the component that owns it, when the reader knows it.
    void CopiaAtributos(const QString& sufixo, CEItemLista& item, const QString& handle);
    // REL, LIG, HANDLE and the three relation fields of one end under the suffix.
    void CompoeRelacao(const QString& sufixo, CEItemLista& item, CETemplate* modelo,
                       const QString& ligacao, const QString& handle);

protected:
    // Terminals, each followed by its accessories.
    void LeBornes(zvdb::Database* database, CETemplate& modelo, VetorItens& itens);
    // Components, terminals and accessories as the material reader finds them.
    void LeComponentes(zvdb::Database* database, CETemplate& modelo, VetorItens& itens);
    // Room in the set of handles seen for every reference the components' walk looks at.
    void ReservaVistos(zvdb::Database* database);
    // The wire stretches with both ends told by the hooks.
    void LeFiosExportacao(const std::optional<QStringList>& paginas, CETemplate* modelo,
                          VetorItens& itens);

    // A component the walk made, with its kind and relation taken: the sides read the
    // drawing's objects, not this item, so a reader that keeps few of its fields may drop
    // the others here, before the sides take the room.
    virtual void ComponenteLido(CEItemLista& item) { Q_UNUSED(item); }
    // The same for a terminal with both its sides read, its last fields; the room of what
    // it drops goes after.
    virtual void LadosLidos(CEItemLista& borne) { Q_UNUSED(borne); }

    // Component relations to the handle whose fields stand for the component.
    TabelaChaves<QString, QString> relacoesComponentes_;
    // Whether the components' accessories follow them; a reader that keeps only components
    // and terminals leaves them unread.
    bool lerAcessorios_ = true;

private:
    // The names an end's relation reads and writes under one suffix.
    struct NomesRelacao;
    static NomesRelacao& Nomes(const QString& sufixo);
    void CompoeRelacao(NomesRelacao& nomes, CEItemLista& item, CETemplate* modelo,
                       const QString& ligacao, const QString& handle);
    // `borne`: the entity is known to be a terminal; `referencia`, what the walk read of it
    // then, when it did.
    // CopiaAtributos with the entity of the handle found already.
    void CopiaAtributos(const QString& sufixo, CEItemLista& item, const QString& handle,
                        const OdDbObjectId& id);
    void AoLigar(CEItemLista& item, const OdDbObjectId& entidade, CETemplate* modelo, bool inicio,
                 bool borne = false, const BornesLidos::Referencia* referencia = nullptr);
    // The element next to an equipment's own entry of the connection (its handle and
    // connection name) in the wire's full connection list; empty when there is none.
    QString VizinhoPorLigacao(const QString& fio, const QString& proprio, const QString& ligacao,
                              bool anteriorPrimeiro) const;
    // While components are read the sides wait: a contact names its component only once
    // every component is known.
    bool ladosAdiados_ = false;
    // The terminals the walk read, told by the first hook while the reference is at hand.
    BornesLidos bornesLidos_;
    // Whether the walk's hooks ran at all (a reader may have hooks of its own).
    bool ladosVistos_ = false;
    // Whether the item at that place of the result is a terminal, with what the walk read of
    // its reference when it did; asked in ascending places.
    bool BorneLido(std::size_t lugar, const CEItemLista& item,
                   const BornesLidos::Referencia*& referencia);
    // What the first side of a terminal found for its second side: its points, whether it
    // is an equipment, and whether it read the wires of both points.
    struct PrimeiroLado {
        const CEItemLista* item = nullptr;
        OdDbObjectId borne;
        std::optional<CCBorneDataReader::LadoBorne> lado;
        bool equipamento = false;
        bool fiosLidos = false;
        bool De(const CEItemLista& i, const OdDbObjectId& b) const {
            return lado && item == &i && borne == b;
        }
    };
    PrimeiroLado primeiroLado_;
    // The names of the two suffixes of an end, found once per reader (Nomes keeps them for
    // the run).
    NomesRelacao* nomesIni_ = nullptr;
    NomesRelacao* nomesFim_ = nullptr;
    QString PaginasOpcao() const;
    // The relation's separator and order, of the template or of the export settings.
    struct Composicao {
        QString sep;
        bool relacaoPrimeiro = false;
    };
    static Composicao LeComposicao(CETemplate* modelo);
    // While a read runs, the composition of the template last asked for: every end asks.
    bool lendo_ = false;
    std::optional<Composicao> composicao_;
    CETemplate* modeloComposicao_ = nullptr;
};
