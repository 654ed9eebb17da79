#pragma once
// CICad::InsereBloco for a writer that places thousands of references of a few blocks, page
// after page: each block's definition is found (or loaded from its file) once, and the layer
// made once while the calls stay on it. Either is looked for again when it was erased, and
// all of it when the active drawing changes or after Reinicia.
#include "CICad.h"

#include <QHash>
#include <QString>

#include <string>

namespace zvdb {
class Database;
}

class CEInsercoesBlocos {
public:
    OdDbObjectId Insere(const QString& arquivo, const QString& nome, const QString& layer, double x,
                        double y, const CEValoresAtributos& valores = {});
    void Reinicia();

private:
    zvdb::Database* database_ = nullptr;
    QHash<QString, OdDbObjectId> definicoes_;
    // The block asked for last and its definition.
    QString nome_;
    OdDbObjectId bloco_;
    QString layer_;
    std::string layerUtf8_;
    OdDbObjectId layerId_;
};
