#include "CICad.h"
#include "CICadInterno.h"

#include "drawing/Attribute.h"
#include "drawing/BlockReference.h"
#include "drawing/Entity.h"

#include <array>
#include <span>
#include <string_view>

using namespace cicad;

namespace {

// The applications a symbol's reading looks at, found in one walk of its extended data.
enum Aplicacao { kZv, kZvWire, kZvCabo, kLayout, kCircuito, kVinculos, kAplicacoes };
constexpr std::array<std::string_view, kAplicacoes> kNomes = {
    "KVR_ZV",         "KVR_ZV_WIRE",    "KVR_ZV_CABO", "KVR_LAYOUT_ESQUEMA",
    "KVR_ZV_CIRCLOC", "ZV_VINC_ADITIVO"};

// The items of the first group of each application, as DbObject::xdataItems gives them.
std::array<std::span<const zvdb::Tag>, kAplicacoes> Grupos(const zvdb::DbObject& objeto) {
    std::array<std::span<const zvdb::Tag>, kAplicacoes> grupos{};
    objeto.xdataItemsOf(kNomes, grupos);
    return grupos;
}

// The first of the key applications that has items, and its first text item.
bool Chave(const std::array<std::span<const zvdb::Tag>, kAplicacoes>& grupos,
           std::string_view& texto, bool& temTexto) {
    temTexto = false;
    for (const int a : {kZv, kZvWire, kZvCabo}) {
        if (grupos[a].empty()) continue;
        for (const zvdb::Tag& item : grupos[a])
            if (item.code == 1000) {
                texto = item.value;
                temTexto = true;
                break;
            }
        return true;
    }
    return false;
}

}  // namespace

bool CICad::TextoChave(const OdDbObjectId& entidade, std::string_view& texto, bool& temTexto) {
    temTexto = false;
    zvdb::DbObject* objeto = Objeto(entidade);
    return objeto && Chave(Grupos(*objeto), texto, temTexto);
}

bool CICad::TextosFio(const OdDbObjectId& fio, std::string_view& chave, bool& temChave,
                      std::vector<std::string_view>& textos) {
    textos.clear();
    temChave = false;
    zvdb::DbObject* objeto = Objeto(fio);
    if (!objeto) return false;
    const auto grupos = Grupos(*objeto);
    TextosDosItens(grupos[kZvWire], textos);
    return Chave(grupos, chave, temChave);
}

bool CICad::AtributoInvisivel(const OdDbObjectId& atributo) {
    auto* a = Como<zvdb::Attribute>(atributo);
    return a && a->isInvisible();
}

bool CICad::LeituraSimbolo(const OdDbObjectId& entidade, CESimboloLido& lido) {
    return LeituraChaveSimbolo(entidade, lido) && CompletaLeituraSimbolo(entidade, lido);
}

bool CICad::LeituraChaveSimbolo(const OdDbObjectId& entidade, CESimboloLido& lido) {
    lido.referencia = false;
    lido.atributos.clear();
    lido.vinculos.clear();
    lido.bloco = lido.layer = lido.textoChave = {};
    lido.posicao = {};
    lido.temChave = lido.temTextoChave = lido.temLayout = lido.temCircuito = false;
    lido.circuito = 1;
    zvdb::DbObject* objeto = Objeto(entidade);
    if (!objeto) return false;
    const auto grupos = Grupos(*objeto);
    lido.temChave = Chave(grupos, lido.textoChave, lido.temTextoChave);
    lido.temLayout = !grupos[kLayout].empty();
    for (const zvdb::Tag& item : grupos[kVinculos])
        if (item.code == 1000) lido.vinculos.push_back(item.value);
    if (!grupos[kZv].empty()) {
        // A symbol with its own key data is its own master: its circuit is on it.
        const std::span<const zvdb::Tag> circuito = grupos[kCircuito];
        lido.temCircuito = true;
        lido.circuito = circuito.empty() ? 1 : Q(circuito.front().value).toInt();
    }
    return true;
}

bool CICad::CompletaLeituraSimbolo(const OdDbObjectId& entidade, CESimboloLido& lido) {
    zvdb::DbObject* objeto = Objeto(entidade);
    if (!objeto) return false;
    // Without key data of its own the circuit is its master's.
    if (!lido.temCircuito) lido.temCircuito = GetCircuitoLocal(entidade, lido.circuito);
    auto* entidadeDesenho = Classe<zvdb::Entity>(objeto);
    if (!entidadeDesenho) return true;
    auto* ref = Classe<zvdb::BlockReference>(entidadeDesenho);
    if (!ref) {
        lido.layer = entidadeDesenho->layer();
        return true;
    }
    lido.referencia = true;
    // The layer and block name (layer() and blockName()), and each attribute's tag and value
    // (tag() and textValue()), each pair in one walk.
    static constexpr int kLayerEBloco[] = {8, 2}, kTagEValor[] = {2, 1};
    static constexpr std::string_view kPadraoLayerEBloco[] = {"0", {}}, kSemPadrao[2] = {};
    std::string_view textos[2];
    ref->texts(kLayerEBloco, kPadraoLayerEBloco, textos);
    lido.layer = textos[0];
    lido.bloco = textos[1];
    const zvdb::Point3 p = ref->position();
    lido.posicao = {p.x, p.y, p.z};
    for (zvdb::Entity* sub : ref->subEntities()) {
        if (sub->isErased()) continue;
        if (auto* atributo = Classe<zvdb::Attribute>(sub)) {
            atributo->texts(kTagEValor, kSemPadrao, textos);
            lido.atributos.push_back({textos[0], textos[1], Id(atributo)});
        }
    }
    return true;
}
