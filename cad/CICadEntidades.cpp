#include "CICad.h"
#include "CICadInterno.h"

#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Dictionary.h"
#include "drawing/Entity.h"
#include "drawing/Extents.h"
#include "drawing/Polyline.h"

#include <cmath>
#include <unordered_map>

using namespace cicad;

namespace {

// The block's bounds scaled by the reference's factors and moved to its position, without
// its rotation; with `comAtributos` merged with those of every attribute, visible or not.
zvdb::BoundingBox ExtensaoReferencia(const zvdb::BlockReference& ref, bool comAtributos) {
    zvdb::BoundingBox caixa;
    double xMax, xMin, yMax, yMin;
    if (CICad::GetExtensaoBloco(Id(ref.definition()), xMax, xMin, yMax, yMin)) {
        const zvdb::Point3 escala = ref.scale(), posicao = ref.position();
        // A negative factor mirrors: its corners are sorted again by the box.
        for (const double x : {xMin, xMax})
            for (const double y : {yMin, yMax})
                caixa.add(
                    zvdb::Point3{posicao.x + x * escala.x, posicao.y + y * escala.y, posicao.z});
    }
    if (comAtributos)
        for (const zvdb::Attribute* atributo : ref.attributes())
            caixa.add(zvdb::Extents::ofEntity(*atributo, false));
    return caixa;
}

}  // namespace

bool CICad::GetExtensao(const OdDbObjectId& entidade, double& xMax, double& xMin, double& yMax,
                        double& yMin, bool comAtributos) {
    auto* e = Como<zvdb::Entity>(entidade);
    if (!e) return false;
    const std::string_view tipo = e->type();
    if ((tipo == "TEXT" || tipo == "MTEXT") && !comAtributos) return false;
    zvdb::BoundingBox caixa;
    if (auto* ref = Classe<zvdb::BlockReference>(e)) {
        caixa = ExtensaoReferencia(*ref, comAtributos);
    } else if (tipo == "ELLIPSE") {
        const zvdb::Point3 centro = e->point(10);
        const double raio = zvdb::length(e->point(11));
        caixa.add(centro - zvdb::Point3{raio, raio, 0});
        caixa.add(centro + zvdb::Point3{raio, raio, 0});
    } else if (tipo == "LWPOLYLINE" || tipo == "POLYLINE" || tipo == "LINE" || tipo == "CIRCLE" ||
               tipo == "TEXT" || tipo == "MTEXT") {
        caixa = zvdb::Extents::ofEntity(*e, comAtributos);
    }
    if (caixa.isEmpty()) return false;
    xMax = caixa.max.x, xMin = caixa.min.x, yMax = caixa.max.y, yMin = caixa.min.y;
    return true;
}

bool CICad::GetExtensaoBloco(const OdDbObjectId& bloco, double& xMax, double& xMin, double& yMax,
                             double& yMin) {
    auto* b = Como<zvdb::BlockRecord>(bloco);
    if (!b) return false;
    const zvdb::BoundingBox caixa = zvdb::Extents::ofBlock(*b);
    if (caixa.isEmpty()) return false;
    xMax = caixa.max.x, xMin = caixa.min.x, yMax = caixa.max.y, yMin = caixa.min.y;
    return true;
}

// ---- entities, as the readers see them

QString CICad::TipoEntidade(const OdDbObjectId& id) {
    zvdb::DbObject* objeto = Objeto(id);
    return objeto ? Q(objeto->type()) : QString();
}

bool CICad::EhReferencia(const OdDbObjectId& id) {
    return Como<zvdb::BlockReference>(id);
}

bool CICad::EhPolilinha(const OdDbObjectId& id) {
    return Como<zvdb::Polyline>(id);
}

QString CICad::GetLayerEntidade(const OdDbObjectId& id) {
    auto* entidade = Como<zvdb::Entity>(id);
    return entidade ? Q(entidade->layer()) : QString();
}

std::string_view CICad::NomeLayerUtf8(const OdDbObjectId& id) {
    auto* entidade = Como<zvdb::Entity>(id);
    return entidade ? entidade->layer() : std::string_view();
}

std::vector<CEPonto> CICad::GetVertices(const OdDbObjectId& polilinha) {
    std::vector<CEPonto> pontos;
    auto* p = Como<zvdb::Polyline>(polilinha);
    if (!p) return pontos;
    const std::vector<zvdb::Point3> vertices = p->vertices();
    pontos.reserve(vertices.size());
    for (const zvdb::Point3& v : vertices)
        pontos.push_back({v.x, v.y, v.z});
    return pontos;
}

std::size_t CICad::AcrescentaVertices(const OdDbObjectId& polilinha, std::string_view layer,
                                      std::vector<CEPonto>& pontos) {
    auto* p = Como<zvdb::Polyline>(polilinha);
    if (!p || p->layer() != layer) return 0;
    const std::vector<zvdb::Point3> vertices = p->vertices();
    for (const zvdb::Point3& v : vertices)
        pontos.push_back({v.x, v.y, v.z});
    return vertices.size();
}

std::uint64_t CICad::VersaoDesenho(zvdb::Database* database) {
    zvdb::Database* db = Db(database);
    return db ? db->changeCount() : 0;
}

CEPonto CICad::GetPosicao(const OdDbObjectId& referencia) {
    auto* ref = Como<zvdb::BlockReference>(referencia);
    if (!ref) return {};
    const zvdb::Point3 p = ref->position();
    return {p.x, p.y, p.z};
}

double CICad::GetRotacao(const OdDbObjectId& referencia) {
    auto* ref = Como<zvdb::BlockReference>(referencia);
    return ref ? ref->rotation() * M_PI / 180.0 : 0.0;
}

CEPonto CICad::GetPosicaoTexto(const OdDbObjectId& texto) {
    auto* entidade = Como<zvdb::Entity>(texto);
    if (!entidade) return {};
    const zvdb::Point3 p = entidade->point(10);
    return {p.x, p.y, p.z};
}

void CICad::AtributosPostos(const OdDbObjectId& referencia,
                            const std::function<bool(std::string_view)>& aceita,
                            std::vector<CEAtributoPosto>& atributos) {
    atributos.clear();
    auto* ref = Como<zvdb::BlockReference>(referencia);
    if (!ref) return;
    static constexpr int kTagEValor[] = {2, 1};
    static constexpr std::string_view kSemPadrao[2] = {};
    for (zvdb::Entity* sub : ref->subEntities()) {
        if (sub->isErased()) continue;
        auto* atributo = Classe<zvdb::Attribute>(sub);
        if (!atributo) continue;
        std::string_view textos[2];
        atributo->texts(kTagEValor, kSemPadrao, textos);
        if (!aceita(textos[0])) continue;
        const zvdb::Point3 p = atributo->position();
        atributos.push_back(
            {textos[0], textos[1], Id(atributo), {p.x, p.y, p.z}, atributo->isInvisible()});
    }
}

OdDbObjectId CICad::GetDono(const OdDbObjectId& id) {
    zvdb::DbObject* objeto = Objeto(id);
    return objeto ? Id(objeto->owner()) : OdDbObjectId();
}

OdDbObjectId CICad::GetModelSpace(zvdb::Database* database) {
    zvdb::Database* db = Db(database);
    return db ? Id(db->modelSpace()) : OdDbObjectId();
}

std::vector<std::pair<QString, OdDbObjectId>> CICad::GetBlocos(zvdb::Database* database) {
    std::vector<std::pair<QString, OdDbObjectId>> blocos;
    if (zvdb::Database* db = Db(database))
        for (zvdb::BlockRecord* bloco : db->blocks())
            blocos.emplace_back(Q(bloco->name()), Id(bloco));
    return blocos;
}

QHash<QString, std::vector<OdDbObjectId>> CICad::GetReferenciasPorBloco(zvdb::Database* database) {
    QHash<QString, std::vector<OdDbObjectId>> referencias;
    zvdb::Database* db = Db(database);
    if (!db) return referencias;
    // Thousands of references name a few blocks: each name as the drawing spells it is made
    // an upper-case text once, and names that differ only in case share one list.
    std::unordered_map<std::string_view, std::vector<OdDbObjectId>*> porNome;
    for (zvdb::BlockRecord* bloco : db->blocks())
        bloco->forEachEntity([&](zvdb::Entity& entidade) {
            auto* ref = Classe<zvdb::BlockReference>(&entidade);
            if (!ref) return;
            std::vector<OdDbObjectId>*& lista = porNome[ref->blockName()];
            if (!lista) lista = &referencias[Q(ref->blockName()).toUpper()];
            lista->push_back(Id(ref));
        });
    return referencias;
}

std::vector<OdDbObjectId> CICad::GetEntidadesComXData(const QString& aplicacao,
                                                      zvdb::Database* database) {
    const std::string nome = U8(aplicacao);
    const std::string_view nomes[] = {nome};
    return std::move(GetEntidadesComXData(nomes, database).front());
}

std::vector<std::vector<OdDbObjectId>> CICad::GetEntidadesComXData(
    std::span<const std::string_view> aplicacoes, zvdb::Database* database) {
    std::vector<std::vector<OdDbObjectId>> ids(aplicacoes.size());
    zvdb::Database* db = Db(database);
    if (!db || !db->modelSpace() || aplicacoes.empty()) return ids;
    // Each entity's extended data is walked once for all the names; a group found, even an
    // empty one, counts, as it does for one name.
    std::vector<std::span<const zvdb::Tag>> grupos(aplicacoes.size());
    db->modelSpace()->forEachEntity([&](zvdb::Entity& entidade) {
        entidade.xdataItemsOf(aplicacoes, grupos);
        for (std::size_t k = 0; k < grupos.size(); ++k)
            if (grupos[k].data()) ids[k].push_back(Id(&entidade));
    });
    return ids;
}

std::vector<std::pair<QString, OdDbObjectId>> CICad::GetEntradasDicionario(
    const QStringList& caminho, zvdb::Database* database) {
    std::vector<std::pair<QString, OdDbObjectId>> entradas;
    zvdb::Database* db = Db(database);
    std::vector<std::string> nomes;
    for (const QString& nome : caminho)
        nomes.push_back(U8(nome));
    zvdb::Dictionary* dicionario = db ? db->dictionaryAt(nomes, false) : nullptr;
    if (!dicionario) return entradas;
    for (const zvdb::Dictionary::Entry& entrada : dicionario->entries())
        if (zvdb::DbObject* objeto = db->objectByHandle(entrada.handle))
            entradas.emplace_back(Q(entrada.name), Id(objeto));
    return entradas;
}

bool CICad::PontosIguais(const CEPonto& a, const CEPonto& b) {
    constexpr double kTolerancia = 1e-10;
    return std::abs(a.x - b.x) <= kTolerancia && std::abs(a.y - b.y) <= kTolerancia &&
           std::abs(a.z - b.z) <= kTolerancia;
}
