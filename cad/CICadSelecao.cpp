// What a crossing window sees: the entities of a block in order, their boxes, frozen layers.
#include "CICadInterno.h"

#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Entity.h"
#include "drawing/Extents.h"

#include <algorithm>

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

void CICad::PercorreEntidades(const OdDbObjectId& bloco,
                              std::span<const std::string_view> aplicacoes,
                              const std::function<void(const EntidadeVista&)>& visita) {
    auto* registro = Como<zvdb::BlockRecord>(bloco);
    if (!registro) return;
    std::vector<std::span<const zvdb::Tag>> itens(aplicacoes.size());
    registro->forEachEntity([&](zvdb::Entity& entidade) {
        EntidadeVista vista;
        vista.id = Id(&entidade);
        if (!aplicacoes.empty()) {
            entidade.xdataItemsOf(aplicacoes, itens);
            vista.comXData = std::any_of(itens.begin(), itens.end(),
                                         [](const auto& grupo) { return !grupo.empty(); });
        }
        if (Classe<zvdb::BlockReference>(&entidade)) {
            const zvdb::BoundingBox caixa = zvdb::Extents::ofEntity(entidade, false);
            if (!caixa.isEmpty()) {
                vista.referenciaComCaixa = true;
                vista.minimo = {caixa.min.x, caixa.min.y, caixa.min.z};
                vista.maximo = {caixa.max.x, caixa.max.y, caixa.max.z};
                vista.layer = entidade.layer();
            }
        }
        visita(vista);
    });
}

bool CICad::LayerCongelado(const QString& nome, zvdb::Database* database) {
    const zvdb::LayerRecord* layer = Layer(nome, database);
    return layer && layer->isFrozen();
}
