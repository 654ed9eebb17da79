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
    // Rows of one block come one after the other with the very text of its name: the
    // definition found for the row before is taken without a look-up.
    if (nome.isEmpty() || !nome.isSharedWith(nome_)) {
        nome_ = nome;
        bloco_ = definicoes_.value(nome);
    }
    if (!Como<zvdb::BlockRecord>(bloco_)) {
        if (!CICad::GetBlocoId(nome, bloco_, db)) bloco_ = CICad::CarregaBloco(nome, arquivo);
        definicoes_.insert(nome, bloco_);
    }
    const bool mesmaLayer = layer.isSharedWith(layer_) || layer == layer_;
    if (!mesmaLayer || (!layer.isEmpty() && !Como<zvdb::LayerRecord>(layerId_))) {
        CICad::CriaLayer(layer, db);
        layer_ = layer;
        layerUtf8_ = U8(layer);
        layerId_ = Id(Layer(layer, db));
    }
    return CICad::InsereReferencia(bloco_, layerUtf8_, x, y, 0, 0, valores);
}

void CEInsercoesBlocos::Reinicia() {
    database_ = nullptr;
    definicoes_.clear();
    nome_ = QString();
    bloco_ = OdDbObjectId();
    layer_ = QString();
    layerUtf8_.clear();
    layerId_ = OdDbObjectId();
}
