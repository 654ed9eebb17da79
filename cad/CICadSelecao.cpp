// What a crossing window sees: the entities of a block in order, their boxes, frozen layers.
#include "CICadInterno.h"

#include "drawing/BlockRecord.h"
#include "drawing/Entity.h"
#include "drawing/Extents.h"

using namespace cicad;

std::vector<OdDbObjectId> CICad::GetEntidades(const OdDbObjectId& bloco) {
    std::vector<OdDbObjectId> ids;
    auto* registro = Como<zvdb::BlockRecord>(bloco);
    if (!registro) return ids;
    for (zvdb::Entity* entidade : registro->entities())
        if (!entidade->isErased()) ids.push_back(Id(entidade));
    return ids;
}

bool CICad::GetCaixaSelecao(const OdDbObjectId& entidade, CEPonto& minimo, CEPonto& maximo) {
    auto* e = Como<zvdb::Entity>(entidade);
    if (!e) return false;
    const zvdb::BoundingBox caixa = zvdb::Extents::ofEntity(*e, false);
    if (caixa.isEmpty()) return false;
    minimo = {caixa.min.x, caixa.min.y, caixa.min.z};
    maximo = {caixa.max.x, caixa.max.y, caixa.max.z};
    return true;
}

bool CICad::LayerCongelado(const QString& nome, zvdb::Database* database) {
    const zvdb::LayerRecord* layer = Layer(nome, database);
    return layer && layer->isFrozen();
}
