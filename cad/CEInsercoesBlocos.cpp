#include "CEInsercoesBlocos.h"

#include "CICadInterno.h"
#include "drawing/BlockRecord.h"
#include "drawing/LayerRecord.h"

using namespace cicad;

OdDbObjectId CEInsercoesBlocos::Insere(const QString& arquivo, const QString& nome,
                                       const QString& layer, double x, double y,
                                       const CEValoresAtributos& valores) {
    zvdb::Database* db = CICad::GetDatabase();
    if (!db) return {};
    if (db != database_) {
        Reinicia();
        database_ = db;
    }
    OdDbObjectId& bloco = definicoes_[nome];
    if (!Como<zvdb::BlockRecord>(bloco) && !CICad::GetBlocoId(nome, bloco, db))
        bloco = CICad::CarregaBloco(nome, arquivo);
    if (layer != layer_ || (!layer.isEmpty() && !Como<zvdb::LayerRecord>(layerId_))) {
        CICad::CriaLayer(layer, db);
        layer_ = layer;
        layerUtf8_ = U8(layer);
        layerId_ = Id(Layer(layer, db));
    }
    return CICad::InsereReferencia(bloco, layerUtf8_, x, y, 0, 0, valores);
}

void CEInsercoesBlocos::Reinicia() {
    database_ = nullptr;
    definicoes_.clear();
    layer_ = QString();
    layerUtf8_.clear();
    layerId_ = OdDbObjectId();
}
