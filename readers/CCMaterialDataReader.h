#pragma once
// The bill of materials of one drawing: listed symbols, virtual symbols, pin connectors, and
// on demand wires and cables, with their accessories; equal materials grouped into chains
// under one head, then sorted.
#include "CCDataReader.h"

#include <QHash>
#include <QSet>

#include <cstdint>
#include <unordered_set>
#include <vector>

class CCMaterialDataReader : public CCDataReader {
public:
    // Each wire's first polyline is read for its item and copied again as its first end.
    // No route of a wire is asked for.
    CCMaterialDataReader() {
        FiosDasLeituras = true;
        LeRotas = false;
    }
    // Nothing on sides: a material has no connections of its own.
    void LerLadoIni(CEItemLista& item, const OdDbObjectId& entidade, CETemplate& modelo) override;
    void LerLadoFim(CEItemLista& item, const OdDbObjectId& entidade, CETemplate& modelo) override;
    VetorItens* LerDados(zvdb::Database* database, const std::optional<QStringList>& paginas,
                         CETemplate& modelo, CIProgress& progresso) override;

    // Chains the items that are the same material (equal `PBLLSTAGRUPAMENTO` fields and no
    // `*ZV_CHAVE_QUEBRA_PAGINA*` field apart) behind the first of them through `ligado`, and
    // leaves only the heads in the vector. Grouped by a hash of those fields.
    static void Agrupa(VetorItens& itens, CETemplate& modelo);

protected:
    // The sums the list writes into every member of a group: their room is left when the
    // item is made, so that no member's fields move for them then.
    std::size_t FolgaDosCampos(const CamposItem& campos) const override;
    // The next symbol's fields are made in the room the last kept item took: a bill of
    // materials meets the symbols of one block in a row. A reader that keeps terminals,
    // components and wires mixed clears it, as a wrong guess leaves holes in the heap.
    bool PreveCampos = true;

    struct Simbolos {
        bool selecaoPaginas = false, bornes = false, aceOrfaos = false;
        QString fontes;
        int vinculos = 0;
    };
    Simbolos LeSimbolos(CETemplate& modelo) const;
    void LeBlocos(zvdb::Database* database, const std::optional<QStringList>& paginas,
                  CETemplate& modelo, CIProgress& progresso);
    void LeVirtuais(zvdb::Database* database, CETemplate& modelo);
    void LePinos(zvdb::Database* database, CETemplate& modelo);
    void LeFios(zvdb::Database* database, const std::optional<QStringList>& paginas,
                CETemplate& modelo);
    // The accessories of an item, appended to the run's result.
    void AdicionaAcessorios(CEItemLista& item, CETemplate& modelo);
    // Behind each item, its chain's accessories, grouped, in reverse order.
    void IntercalaAcessorios(CETemplate& modelo);

    // Every block reference of the drawing by block name: the symbols' walk and the pins'
    // walk of a read share one gathering, made again when the drawing changed.
    const QHash<QString, std::vector<OdDbObjectId>>& ReferenciasPorBloco(zvdb::Database* database);
    // The gathering is given back when a read ends.
    void LiberaReferencias();

    // A symbol the walk of the blocks keeps, as soon as it is kept.
    virtual void SimboloGuardado(const CEItemLista& item) { Q_UNUSED(item); }
    // A listed item: a bus bar whose RELACAO was seen already is dropped; true if kept.
    bool Adiciona(CEItemLista* item, bool barramento);
    void Guarda(CEItemLista* item);

    Simbolos simbolos_;
    VetorItens resultado_;
    // Handles of the symbols listed already.
    std::unordered_set<std::uint64_t> vistos_;
    QSet<QString> relacoes_;
    QSet<QString> conectores_;

private:
    // Agrupa for items sorted by one grouping field and no page-break field: a material's
    // items are neighbours, and each one is compared with the head before it.
    static void AgrupaVizinhos(VetorItens& itens, const QString& campo);

    struct Referencias {
        zvdb::Database* desenho = nullptr;
        std::uint64_t versao = 0;
        bool lidas = false;
        QHash<QString, std::vector<OdDbObjectId>> porBloco;
    };
    Referencias referencias_;
};
