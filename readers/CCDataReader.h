#pragma once
// A reader turns what lies in a drawing into list items.
#include "VetorItens.h"

#include <QStringList>

#include <optional>

namespace zvdb {
class Database;
}
class CETemplate;
class CIProgress;
class OdDbObjectId;

class CCDataReader {
public:
    virtual ~CCDataReader() = default;
    // The element next to a terminal at its start and at its end.
    virtual void LerLadoIni(CEItemLista& item, const OdDbObjectId& id) = 0;
    virtual void LerLadoFim(CEItemLista& item, const OdDbObjectId& id) = 0;
    // The items of a database, of all pages or only those named; null when there is nothing.
    // The caller owns the vector and its items.
    virtual VetorItens* LerDados(zvdb::Database* database,
                                 const std::optional<QStringList>& paginas, CETemplate& modelo,
                                 CIProgress& progresso) = 0;
};
