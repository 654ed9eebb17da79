#include "CICad.h"
#include "CICadInterno.h"

#include "drawing/Attribute.h"
#include "drawing/AttributeLayout.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "readers/CEAtributo.h"
#include "readers/CEListaAtributos.h"
#include "readers/ZVString.h"

#include <QHash>

#include <array>
#include <exception>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

using namespace cicad;

namespace {

bool MesmaTag(std::string_view a, const QString& b) {
    return Q(a).compare(b, Qt::CaseInsensitive) == 0;
}

// Virtual attributes: "TAG\fVALUE\fFLAG", an empty field between two separators read as
// one blank.
QStringList CamposAtributoVirtual(QString registro) {
    const QString duplo = QString(QChar(0x0C)) + QChar(0x0C);
    const QString preenchido = QString(QChar(0x0C)) + " " + QChar(0x0C);
    while (registro.contains(duplo))
        registro.replace(duplo, preenchido);
    return ZVString(registro).Divide(QString(QChar(0x0C)));
}

std::unique_ptr<zv::CEAtributo> AtributoVirtual(const QStringList& campos) {
    const bool invisivel = campos.size() > 2 && campos[2].toUpper() == "S";
    return std::make_unique<zv::CEAtributo>(campos.value(0), QString(), campos.value(1),
                                            OdDbObjectId(), invisivel);
}

struct HashTag {
    using is_transparent = void;
    size_t operator()(std::string_view t) const { return std::hash<std::string_view>{}(t); }
};

// The symbols of a drawing repeat a few tag names: each is made a text once, and the
// attributes share it.
QString TextoDaTag(std::string_view tag) {
    static std::unordered_map<std::string, QString, HashTag, std::equal_to<>> tags;
    auto it = tags.find(tag);
    if (it != tags.end()) return it->second;
    // a drawing that makes up names keeps this bounded
    if (tags.size() >= 4096) tags.clear();
    return tags.emplace(std::string(tag), Q(tag)).first->second;
}

}  // namespace

// ---- attributes

void CICad::GetAtributos(const OdDbObjectId& referencia,
                         std::unique_ptr<zv::CEListaAtributos>& lista, bool comPrompts,
                         bool usarPadroes, const QString& prefixo) {
    lista.reset();
    auto* ref = Como<zvdb::BlockReference>(referencia);
    if (!ref) return;
    // The definition is looked up by name: only when prompts or defaults are asked for.
    const OdDbObjectId bloco = comPrompts || usarPadroes ? Id(ref->definition()) : OdDbObjectId();
    lista = std::make_unique<zv::CEListaAtributos>();
    for (zvdb::Attribute* atributo : ref->attributes()) {
        QString tag = TextoDaTag(atributo->tag());
        if (!prefixo.isEmpty() && !tag.startsWith(prefixo)) continue;
        QString prompt;
        if (comPrompts) {
            int ocorrencia = 0;
            for (int i = 0; i < lista->Quantidade(); ++i)
                if ((*lista)[i].GetTag().compare(tag.trimmed(), Qt::CaseInsensitive) == 0)
                    ++ocorrencia;
            prompt = GetPromptAtributo(tag, bloco, QString(), ocorrencia);
            if (prompt.isEmpty()) prompt = tag;
        }
        tag = tag.trimmed();
        prompt = prompt.trimmed();
        QString valor = Q(atributo->textValue()).trimmed();
        if (valor.isEmpty() && usarPadroes) valor = GetDefaultAtributo(tag, bloco).trimmed();
        lista->Adicionar(std::make_unique<zv::CEAtributo>(tag, prompt, valor, Id(atributo),
                                                          atributo->isInvisible()));
    }
}

void CICad::GetAtributosPorId(const OdDbObjectId& id, std::unique_ptr<zv::CEListaAtributos>& lista,
                              bool comPrompts, bool usarPadroes, const QString& prefixo) {
    GetAtributos(id, lista, comPrompts, usarPadroes, prefixo);
}

std::vector<OdDbObjectId> CICad::GetIdsAtributos(const OdDbObjectId& referencia) {
    // Straight from the reference's own list, in one array: no list of attributes between.
    std::vector<OdDbObjectId> ids;
    auto* ref = Como<zvdb::BlockReference>(referencia);
    if (!ref) return ids;
    ids.reserve(ref->subEntities().size());
    for (zvdb::Entity* sub : ref->subEntities())
        if (!sub->isErased())
            if (auto* atributo = Classe<zvdb::Attribute>(sub)) ids.push_back(Id(atributo));
    return ids;
}

void CICad::GetAtributosConstantes(const OdDbObjectId& referencia,
                                   std::unique_ptr<zv::CEListaAtributos>& lista) {
    lista.reset();
    auto* ref = Como<zvdb::BlockReference>(referencia);
    zvdb::BlockRecord* bloco = ref ? ref->definition() : nullptr;
    if (!bloco) return;
    lista = std::make_unique<zv::CEListaAtributos>();
    for (zvdb::Attribute* definicao : bloco->attributeDefinitions())
        if (definicao->isConstant())
            lista->Adicionar(std::make_unique<zv::CEAtributo>(
                Q(definicao->tag()), QString(), Q(definicao->textValue()), Id(definicao),
                definicao->isInvisible()));
}

std::unique_ptr<zv::CEAtributo> CICad::GetAtributo(const QString& tag,
                                                   const OdDbObjectId& referencia, bool comPrompt) {
    auto* ref = Como<zvdb::BlockReference>(referencia);
    if (!ref) return nullptr;
    for (zvdb::Attribute* atributo : ref->attributes()) {
        if (!MesmaTag(atributo->tag(), tag)) continue;
        QString prompt;
        if (comPrompt) prompt = GetPromptAtributo(tag, Id(ref->definition()), tag, 0);
        return std::make_unique<zv::CEAtributo>(Q(atributo->tag()), prompt,
                                                Q(atributo->textValue()).trimmed(), Id(atributo),
                                                atributo->isInvisible());
    }
    return nullptr;
}

std::unique_ptr<zv::CEAtributo> CICad::GetAtributoEntidade(const QString& tag,
                                                           const OdDbObjectId& entidade,
                                                           bool comPrompt) {
    if (Como<zvdb::BlockReference>(entidade)) return GetAtributo(tag, entidade, comPrompt);
    return GetAtributoVirtual(tag, entidade);
}

std::unique_ptr<zv::CEAtributo> CICad::GetAtributoVirtual(const QString& tag,
                                                          const OdDbObjectId& entidade) {
    // Asked by tag, a record answers with its first field alone: "CABO\f101" has no flag.
    for (const CEItemXData& item : GetXData(entidade, "KVR_ZV_ATT_VIRTUAL")) {
        if (item.codigo != 1000) continue;
        const QStringList campos = CamposAtributoVirtual(item.texto);
        if (!campos.isEmpty() && campos[0] == tag) return AtributoVirtual(campos);
    }
    return nullptr;
}

int CICad::GetAtributosVirtuais(const OdDbObjectId& id,
                                std::unique_ptr<zv::CEListaAtributos>& lista) {
    if (id.isNull()) return 1;
    lista = std::make_unique<zv::CEListaAtributos>();
    // Listed, only records of exactly three fields count.
    for (const CEItemXData& item : GetXData(id, "KVR_ZV_ATT_VIRTUAL")) {
        if (item.codigo != 1000) continue;
        const QStringList campos = CamposAtributoVirtual(item.texto);
        if (campos.size() == 3) lista->Adicionar(AtributoVirtual(campos));
    }
    return 0;
}

QString CICad::TagTraduzida(CampoTraduzido campo, int indice) {
    static const char* const kTags[9][3] = {{"RELACAO", "TAG", "ETIQUETA"},
                                            {"LIGACAO", "CONNECTION", "CONEXION"},
                                            {"CABO", "WIRE", "ALAMBRE"},
                                            {"CABO", "CABLE", "CABLE"},
                                            {"REGUA", "STRIP", "REGLETA"},
                                            {"NUMERO", "NUMBER", "NUMERO"},
                                            {"POSICAO_CTT", "POSITION_CTT", "POSICION_CTT"},
                                            {"ID_PINO", "ID_PIN", "ID_PIN"},
                                            {"DISTANCIA", "DISTANCE", "DISTANCIA"}};
    // Made once: readers ask for these names for every field they compose.
    static const auto kTextos = [] {
        std::array<std::array<QString, 3>, 9> textos;
        for (size_t c = 0; c < 9; ++c)
            for (size_t i = 0; i < 3; ++i)
                textos[c][i] = QString::fromLatin1(kTags[c][i]);
        return textos;
    }();
    if (indice < 1 || indice > 3) indice = 1;
    return kTextos[size_t(int(campo) - 1)][size_t(indice - 1)];
}

bool CICad::EhTagFio(const QString& tag) {
    const QString maiuscula = tag.toUpper();
    if (maiuscula == "FIO") return true;
    for (int i = 1; i <= 3; ++i)
        if (maiuscula == TagTraduzida(CampoTraduzido::Fio, i)) return true;
    return false;
}

int CICad::GetAtributoTraduzido(CampoTraduzido campo, const OdDbObjectId& referencia,
                                std::unique_ptr<zv::CEAtributo>& atributo, bool comPrompt) {
    for (int i = 1; i <= 3; ++i) {
        atributo = GetAtributo(TagTraduzida(campo, i), referencia, comPrompt);
        if (atributo) return 0;
    }
    return 2;
}

QString CICad::GetPromptAtributo(const QString& tag, const OdDbObjectId& bloco,
                                 const QString& padrao, int ocorrencia) {
    auto* b = Como<zvdb::BlockRecord>(bloco);
    if (!b) return padrao;
    for (zvdb::Attribute* definicao : b->attributeDefinitions())
        if (!definicao->isConstant() && MesmaTag(definicao->tag(), tag) && ocorrencia-- == 0)
            return Q(definicao->prompt());
    return padrao;
}

QString CICad::GetDefaultAtributo(const QString& tag, const OdDbObjectId& bloco) {
    auto* b = Como<zvdb::BlockRecord>(bloco);
    if (!b) return {};
    for (zvdb::Attribute* definicao : b->attributeDefinitions())
        if (!definicao->isConstant() && MesmaTag(definicao->tag(), tag))
            return Q(definicao->textValue());
    return {};
}

void CICad::SetAtributo(const OdDbObjectId& referencia, const QString& tag, const QString& valor) {
    auto* ref = Como<zvdb::BlockReference>(referencia);
    if (!ref) return;
    for (zvdb::Attribute* atributo : ref->attributes()) {
        if (!MesmaTag(atributo->tag(), tag)) continue;
        if (Q(atributo->textValue()) != valor) atributo->setTextValue(U8(valor));
        return;
    }
}

void CICad::SetAtributosLista(const OdDbObjectId& referencia, const zv::CEListaAtributos& lista) {
    auto* ref = Como<zvdb::BlockReference>(referencia);
    if (!ref) return;
    // The n-th attribute of a tag takes the n-th saved value of that tag.
    QHash<QString, int> vistos;
    for (zvdb::Attribute* atributo : ref->attributes()) {
        const QString tag = Q(atributo->tag()).trimmed().toUpper();
        int ocorrencia = vistos.value(tag, 0);
        vistos.insert(tag, ocorrencia + 1);
        for (int i = 0; i < lista.Quantidade(); ++i) {
            if (lista[i].GetTag().toUpper() != tag || ocorrencia-- != 0) continue;
            atributo->setTextValue(U8(lista[i].GetValor()));
            break;
        }
    }
}

namespace {

// A definition's tag and default value as the values are asked for with them (trimmed), made
// once per layout instead of once per reference.
struct TextosDefinicao {
    std::uint64_t serie = 0;
    QString tag, padrao;
};

const TextosDefinicao& Textos(const zvdb::AttributeLayout& leitura) {
    static std::unordered_map<const zvdb::AttributeLayout*, TextosDefinicao> porLeitura;
    // layouts of drawings closed since stay behind: drawings that come and go keep this bounded
    if (porLeitura.size() >= 4096 && !porLeitura.count(&leitura)) porLeitura.clear();
    TextosDefinicao& textos = porLeitura[&leitura];
    if (textos.serie != leitura.serial())
        textos = {leitura.serial(), Q(leitura.tag()).trimmed(),
                  Q(leitura.defaultValue()).trimmed()};
    return textos;
}

}  // namespace

void cicad::PreparaAtributos(zvdb::Database& db, const zvdb::BlockRecord& bloco,
                             const CEValoresAtributos& valores, AtributosNovos& novos) {
    // What each definition gives is read once for the drawing, not once a reference.
    zvdb::AttributeLayouts& leituras = db.attributeLayouts();
    // The values are asked for before the attributes are made, so that each is made with
    // its value instead of being found and set again.
    const std::vector<zvdb::Attribute*> todas = bloco.attributeDefinitions();
    novos.textos.reserve(todas.size());  // `dados` holds views of them
    for (zvdb::Attribute* def : todas) {
        const zvdb::AttributeLayout& leitura = leituras.layout(db, *def);
        if (leitura.isConstant()) continue;
        novos.definicoes.push_back(def);
        if (!valores) continue;
        const TextosDefinicao& textos = Textos(leitura);
        std::optional<QString> valor = valores(textos.tag, textos.padrao);
        novos.dados.emplace_back();
        if (!valor) continue;
        novos.textos.push_back(U8(*valor));
        novos.dados.back() = novos.textos.back();
    }
}

void CICad::CriarAtributos(const OdDbObjectId& definicao, const OdDbObjectId& referencia,
                           const CEValoresAtributos& valores) {
    try {
        auto* bloco = Como<zvdb::BlockRecord>(definicao);
        auto* ref = Como<zvdb::BlockReference>(referencia);
        if (!bloco || !ref) return;
        AtributosNovos novos;
        PreparaAtributos(ref->database(), *bloco, valores, novos);
        ref->addAttributesFromDefinitions(novos.definicoes, novos.dados);
    } catch (const std::exception& erro) {
        Log("CICAd::CriarAtributos: " + QString::fromUtf8(erro.what()));
    }
}

void CICad::SetValorAtributo(const OdDbObjectId& atributo, const QString& valor) {
    if (auto* a = Como<zvdb::Attribute>(atributo)) a->setTextValue(U8(valor));
}

bool CICad::SetInvisivelAtributo(const OdDbObjectId& atributo, bool invisivel) {
    auto* a = Como<zvdb::Attribute>(atributo);
    if (!a) return false;
    if (a->isInvisible() != invisivel) a->setInvisible(invisivel);
    return true;
}
