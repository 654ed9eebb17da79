#pragma once
// The cable reader: one item per lead (a drawn core of a cable) with the components at its
// two ends, found by a small crossing window around each end point. A lead that leaves its
// page goes on through a blind connection; the two sides of one core are joined afterwards.
#include "CCDataReader.h"

#include <QHash>

#include <functional>
#include <memory>

class CCCaboDataReader : public CCDataReader {
public:
    // Half the side of the window around a lead's end: single precision 0.3, widened.
    static constexpr double kRaio = double(0.3f);

    CCCaboDataReader();
    ~CCCaboDataReader() override;

    void LerLadoIni(CEItemLista&, const OdDbObjectId&, CETemplate&) override {}
    void LerLadoFim(CEItemLista&, const OdDbObjectId&, CETemplate&) override {}
    VetorItens* LerDados(zvdb::Database* database, const std::optional<QStringList>& paginas,
                         CETemplate& modelo, CIProgress& progresso) override;
    // The exports' entry: the leads of the pages named in `paginas` (joined by ";", all pages
    // when empty), their sides joined.
    VetorItens* LerCabosPaginas(zvdb::Database* database, const QString& paginas,
                                CETemplate& modelo);

    // Joins the leads of one core: sorted by cable and name, a neighbour with the same cable
    // and name gives its side to the item before it and leaves the vector. The items that
    // leave are appended to `removidos` (they are not destroyed).
    static void FundeLados(VetorItens& itens, VetorItens& removidos);
    // The first of CABO, CABLE present and not empty.
    static QString NomeDoCabo(const CEItemLista& item);

    // Items joined away by the last read; the reader owns them.
    const VetorItens& Removidos() const { return removidos_; }

private:
    struct Janela;
    void CarregaCabos(zvdb::Database* database);
    // Walks the model space; `aceita` decides by the entity's layer.
    VetorItens* LeModelSpace(zvdb::Database* database, CETemplate& modelo, CIProgress* progresso,
                             const std::function<bool(const QString&)>& aceita);
    CEItemLista* LeCondutor(const OdDbObjectId& entidade, CETemplate& modelo);
    CEItemLista* NovoCondutor(const OdDbObjectId& condutor, const OdDbObjectId& entidade);
    void LeLado(const QString& lado, const CEPonto& ponto, CEItemLista& item,
                const OdDbObjectId& proprio, CETemplate& modelo);
    // The cable record's handle named in a lead's extended data; empty when none.
    static QString HandleDoCabo(const OdDbObjectId& condutor);

    QHash<QString, CEItemLista*> cabos;
    QHash<QString, CEItemLista*> ligacoes;
    VetorItens registros_;  // the cable records, owned
    VetorItens removidos_;  // joined away, owned
    std::unique_ptr<Janela> janela_;
};
