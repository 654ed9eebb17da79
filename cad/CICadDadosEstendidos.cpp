#include "CETextosUtf8.h"
#include "CICad.h"
#include "CICadInterno.h"

#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Dictionary.h"
#include "drawing/Entity.h"
#include "drawing/SmallBuffer.h"
#include "host/sdk/Document.h"
#include "host/sdk/LispInterface.h"
#include "readers/ZVString.h"

#include <span>
#include <string_view>
#include <unordered_map>

using namespace cicad;

namespace {

// The model-space POINT on "ZV_FREEZE" that carries the application; made when asked.
zvdb::Entity* PontoConfiguracao(const QString& aplicacao, bool criar) {
    zvdb::Database* db = CICad::GetDatabase();
    if (!db || !db->modelSpace()) return nullptr;
    const std::string app = U8(aplicacao);
    zvdb::Entity* primeiro = nullptr;
    for (zvdb::Entity* entidade : db->modelSpace()->entities()) {
        if (!entidade->isType("POINT") || entidade->layer() != "ZV_FREEZE") continue;
        if (entidade->hasXData(app)) return entidade;
        if (!primeiro) primeiro = entidade;
    }
    if (!criar) return nullptr;
    if (primeiro) return primeiro;
    db->createLayer("ZV_FREEZE");
    return db->modelSpace()->addPoint({}, "ZV_FREEZE");
}

QString TextoConfiguracao(const QString& aplicacao) {
    zvdb::Entity* ponto = PontoConfiguracao(aplicacao, false);
    if (!ponto) return {};
    const std::vector<zvdb::Tag> itens = ponto->xdata(U8(aplicacao));
    return itens.empty() ? QString() : Q(itens.front().value);
}

void GravaTextoConfiguracao(const QString& aplicacao, const QString& valor) {
    zvdb::Entity* ponto = PontoConfiguracao(aplicacao, true);
    if (!ponto) return;
    const std::string texto = U8(valor);
    const zvdb::Tag item{1000, ponto->database().store(texto)};
    ponto->setXData(U8(aplicacao), std::span<const zvdb::Tag>(&item, 1));
}

CEItemXData ItemXData(std::span<const zvdb::Tag> itens, std::size_t& i) {
    CEItemXData item;
    item.codigo = itens[i].code;
    item.texto = Q(itens[i].value);
    if (item.codigo >= 1010 && item.codigo <= 1013) {
        item.x = item.texto.toDouble();
        for (std::size_t j = i + 1; j < itens.size() && j <= i + 2; ++j) {
            if (itens[j].code == item.codigo + 10) item.y = Q(itens[j].value).toDouble();
            if (itens[j].code == item.codigo + 20) item.z = Q(itens[j].value).toDouble();
        }
        PassaPonto(itens, i);
    }
    return item;
}

CEListaXData ConverteXData(std::span<const zvdb::Tag> itens) {
    CEListaXData lista;
    lista.reserve(itens.size());
    for (std::size_t i = 0; i < itens.size(); ++i)
        lista.push_back(ItemXData(itens, i));
    return lista;
}

// The items as tags over texts of their own: the drawing stores each value when the tags
// are set, so they are not put in its storage here too. A few items stay on the stack.
class TagsXData {
public:
    explicit TagsXData(const CEListaXData& itens) {
        std::size_t n = 0;
        for (const CEItemXData& item : itens)
            n += item.codigo >= 1010 && item.codigo <= 1013 ? 3 : 1;
        tags_.prepare(n);
        for (const CEItemXData& item : itens) {
            if (item.codigo >= 1010 && item.codigo <= 1013) {
                Poe(item.codigo, QByteArray::number(item.x, 'g', 17).toStdString());
                Poe(item.codigo + 10, QByteArray::number(item.y, 'g', 17).toStdString());
                Poe(item.codigo + 20, QByteArray::number(item.z, 'g', 17).toStdString());
            } else {
                tags_[n_++] = {std::int16_t(item.codigo), textos_.Guarda(item.texto)};
            }
        }
    }
    std::span<const zvdb::Tag> Tags() const { return tags_.span().first(n_); }
    // The application's name, kept with the items.
    std::string_view Nome(const QString& aplicacao) { return textos_.Guarda(aplicacao); }

private:
    void Poe(int codigo, std::string texto) {
        tags_[n_++] = {std::int16_t(codigo), textos_.Guarda(std::move(texto))};
    }

    CETextosUtf8 textos_;
    zvdb::SmallBuffer<zvdb::Tag, 8> tags_;
    std::size_t n_ = 0;
};

// The handle in an extended-data item (text or handle group).
OdDbObjectId IdDoItem(zvdb::Database& db, const CEListaXData& itens, size_t indice) {
    if (indice >= itens.size()) return {};
    const std::uint64_t handle = ZVString(itens[indice].texto).ParaHandle();
    zvdb::DbObject* objeto = handle ? db.objectByHandle(handle) : nullptr;
    return objeto && !objeto->isErased() ? Id(objeto) : OdDbObjectId();
}

}  // namespace

void cicad::PassaPonto(std::span<const zvdb::Tag> itens, std::size_t& i) {
    const int codigo = itens[i].code;
    if (codigo < 1010 || codigo > 1013) return;
    while (i + 1 < itens.size() &&
           (itens[i + 1].code == codigo + 10 || itens[i + 1].code == codigo + 20))
        ++i;
}

void cicad::TextosDosItens(std::span<const zvdb::Tag> itens, std::vector<std::string_view>& textos,
                           std::vector<int>* codigos) {
    textos.clear();
    if (codigos) codigos->clear();
    for (std::size_t i = 0; i < itens.size(); ++i) {
        textos.push_back(itens[i].value);
        if (codigos) codigos->push_back(itens[i].code);
        PassaPonto(itens, i);
    }
}

// ---- extended data, masters, project settings

void CICad::RegistraApp(const QString& aplicacao, zvdb::Database* database) {
    if (zvdb::Database* db = Db(database)) db->registerApplication(U8(aplicacao));
}

bool CICad::TemXData(const OdDbObjectId& id, const QString& aplicacao) {
    return TemXData(id, U8(aplicacao).c_str());
}

bool CICad::TemXData(const OdDbObjectId& id, const char* aplicacao) {
    zvdb::DbObject* objeto = Objeto(id);
    return objeto && !objeto->xdataItems(aplicacao).empty();
}

CEListaXData CICad::GetXData(const OdDbObjectId& id, const QString& aplicacao) {
    return GetXData(id, U8(aplicacao).c_str());
}

std::vector<CICad::ReferenciaComXData> CICad::GetReferenciasComXData(
    const char* aplicacao, const std::vector<const char*>& outras, zvdb::Database* database) {
    std::vector<ReferenciaComXData> referencias;
    zvdb::Database* db = Db(database);
    if (!db || !db->modelSpace()) return referencias;
    std::vector<std::string_view> nomes{aplicacao};
    nomes.insert(nomes.end(), outras.begin(), outras.end());
    std::vector<std::span<const zvdb::Tag>> grupos(nomes.size());
    // Thousands of references name a few blocks: each name is made a QString once.
    std::unordered_map<std::string_view, QString> nomesBlocos;
    db->modelSpace()->forEachEntity([&](zvdb::Entity& entidade) {
        auto* ref = Classe<zvdb::BlockReference>(&entidade);
        if (!ref) return;
        ref->xdataItemsOf(nomes, grupos);
        if (!grupos.front().data()) return;
        const auto [nome, novo] = nomesBlocos.try_emplace(ref->blockName());
        if (novo) nome->second = Q(nome->first);
        ReferenciaComXData achada{Id(ref), nome->second, 0, QString(), {}};
        if (!grupos.front().empty()) {
            achada.codigo = grupos.front().front().code;
            achada.texto = Q(grupos.front().front().value);
        }
        achada.outras.reserve(outras.size());
        for (std::size_t k = 1; k < grupos.size(); ++k)
            achada.outras.push_back(ConverteXData(grupos[k]));
        referencias.push_back(std::move(achada));
    });
    return referencias;
}

CEListaXData CICad::GetXData(const OdDbObjectId& id, const char* aplicacao) {
    zvdb::DbObject* objeto = Objeto(id);
    return objeto ? ConverteXData(objeto->xdataItems(aplicacao)) : CEListaXData();
}

void CICad::TextosXData(const OdDbObjectId& id, const char* aplicacao,
                        std::vector<std::string_view>& textos) {
    zvdb::DbObject* objeto = Objeto(id);
    TextosDosItens(objeto ? objeto->xdataItems(aplicacao) : std::span<const zvdb::Tag>(), textos);
}

void CICad::TextosXData(const OdDbObjectId& id, const char* aplicacao,
                        std::vector<std::string_view>& textos, std::vector<int>& codigos) {
    zvdb::DbObject* objeto = Objeto(id);
    TextosDosItens(objeto ? objeto->xdataItems(aplicacao) : std::span<const zvdb::Tag>(), textos,
                   &codigos);
}

bool CICad::TextoXData(const OdDbObjectId& id, const char* aplicacao, QString& texto,
                       bool& temTexto) {
    zvdb::DbObject* objeto = Objeto(id);
    const std::span<const zvdb::Tag> itens =
        objeto ? objeto->xdataItems(aplicacao) : std::span<const zvdb::Tag>();
    temTexto = false;
    if (itens.empty()) return false;
    for (const zvdb::Tag& item : itens)
        if (item.code == 1000) {
            texto = Q(item.value);
            temTexto = true;
            break;
        }
    return true;
}

void CICad::SetXData(const OdDbObjectId& id, const QString& aplicacao, const CEListaXData& itens) {
    zvdb::DbObject* objeto = Objeto(id);
    if (!objeto) return;
    TagsXData tags(itens);
    objeto->setXData(tags.Nome(aplicacao), tags.Tags());
}

void CICad::SetXDataTextos(const OdDbObjectId& id, std::string_view aplicacao,
                           const std::vector<std::string_view>& textos) {
    SetXDataTextos(id, aplicacao, std::span<const std::string_view>(textos));
}

void CICad::SetXDataTextos(const OdDbObjectId& id, std::string_view aplicacao,
                           std::span<const std::string_view> textos) {
    zvdb::DbObject* objeto = Objeto(id);
    if (!objeto) return;
    objeto->setXDataTexts(aplicacao, textos);
}

OdDbObjectId CICad::IdDoHandle(const QString& handle, zvdb::Database* database) {
    return IdDoHandleNumero(ZVString(handle).ParaHandle(), database);
}

OdDbObjectId CICad::IdDoHandleNumero(std::uint64_t handle, zvdb::Database* database) {
    zvdb::Database* db = Db(database);
    zvdb::DbObject* objeto = db && handle ? db->objectByHandle(handle) : nullptr;
    return objeto && !objeto->isErased() ? Id(objeto) : OdDbObjectId();
}

OdDbObjectId CICad::GetSimboloMestre(zvdb::Database* database, const OdDbObjectId& entidade) {
    zvdb::Database* db = Db(database);
    zvdb::DbObject* objeto = Objeto(entidade);
    if (!db || !objeto) return {};
    struct Regra {
        const char* aplicacao;
        size_t minimo;
        size_t indice;  // -1: the entity itself
    };
    static const Regra kRegras[] = {{"KVR_ZV", 1, size_t(-1)},  {"KVR_LAYOUT_PAINEL", 1, 0},
                                    {"KVR_ZV_UNIFILAR", 1, 0},  {"KVR_ZV_REPRESENTACAO", 2, 1},
                                    {"KVR_ZV_ANILHAFIO", 1, 0}, {"KVR_ZV_ANILHACABO", 1, 0}};
    for (const Regra& regra : kRegras) {
        const CEListaXData itens = ConverteXData(objeto->xdata(regra.aplicacao));
        if (itens.size() < regra.minimo) continue;
        const OdDbObjectId mestre =
            regra.indice == size_t(-1) ? entidade : IdDoItem(*db, itens, regra.indice);
        return Objeto(mestre) ? mestre : OdDbObjectId();
    }
    return {};
}

bool CICad::GetCircuitoLocal(const OdDbObjectId& entidade, int& numero) {
    if (entidade.isNull()) return false;
    const OdDbObjectId mestre = GetSimboloMestre(entidade.database(), entidade);
    if (mestre.isNull()) return false;
    const CEListaXData itens = GetXData(mestre, "KVR_ZV_CIRCLOC");
    numero = itens.empty() ? 1 : itens.front().texto.toInt();
    return true;
}

bool CICad::GetCircuitoLocalInfo(int numero, QString& a, QString& b, QString& c) {
    zvsdk::ResultBuffer* chamada = zvsdk::newString("zvGetCircuitoLocalInfo");
    chamada->rbnext = zvsdk::newShort(static_cast<short>(numero));
    zvsdk::ResultBuffer* resultado = InvokeChain(chamada);
    zvsdk::releaseChain(chamada);
    const bool lista = resultado && resultado->restype == zvsdk::RTLB;
    if (lista) {
        a = StringDaLista(resultado, 1);
        b = StringDaLista(resultado, 2);
        c = StringDaLista(resultado, 3);
    }
    zvsdk::releaseChain(resultado);
    return lista;
}

int CICad::GetOrdemGrupos() {
    return Protegido("CICad::GetOrdemGrupos",
                     [] { return TextoConfiguracao("ZV_ORDEM_GRU").toInt(); });
}

void CICad::SetOrdemGrupos(int ordem) {
    Protegido("CICad::SetOrdemGrupos", [&] {
        GravaTextoConfiguracao("ZV_ORDEM_GRU", QString::number(ordem));
        return 0;
    });
}

int CICad::GetOrdemPaginas(const QString& grupo) {
    return Protegido("CICad::GetOrdemPaginas",
                     [&] { return TextoConfiguracao("ZV_ORDEM_PAG_" + grupo).toInt(); });
}

void CICad::SetOrdemPaginas(const QString& grupo, int ordem) {
    Protegido("CICad::SetOrdemPaginas", [&] {
        GravaTextoConfiguracao("ZV_ORDEM_PAG_" + grupo, QString::number(ordem));
        return 0;
    });
}

int CICad::GetNumeracaoPaginas() {
    return Protegido("CICad::GetNumeracaoPaginas", [] {
        const QString guardado = TextoConfiguracao("ZV_NUM_PAG");
        if (!guardado.isEmpty()) return guardado.toInt();
        return GetStringLisp("*NUMERAR_POR_PROJ*", "0") == "S" ? 1 : 0;
    });
}

void CICad::SetNumeracaoPaginas(int modo) {
    Protegido("CICad::SetNumeracaoPaginas", [&] {
        GravaTextoConfiguracao("ZV_NUM_PAG", QString::number(modo));
        return 0;
    });
}

QString CICad::GetCfgProjeto() {
    return Protegido("CICad::GetCfgProjeto", [] {
        const QString guardado = TextoConfiguracao("KVR_ZV_CFG");
        return guardado.isEmpty() ? GetStringLisp("CFG_NOME") + ".cfg" : guardado;
    });
}

void CICad::SetCfgProjeto(const QString& nome) {
    Protegido("CICad::SetCfgProjeto", [&] {
        GravaTextoConfiguracao("KVR_ZV_CFG", nome);
        return 0;
    });
}

CEListaXData CICad::GetPaineisDefinidos() {
    return Protegido("CICad::GetPaineisDefinidos", [] {
        zvdb::Entity* ponto = PontoConfiguracao("KVR_ZV_PAINEL", false);
        return ponto ? ConverteXData(ponto->xdata("KVR_ZV_PAINEL")) : CEListaXData();
    });
}

void CICad::SetPaineisDefinidos(const CEListaXData& paineis) {
    Protegido("CICad::SetPaineisDefinidos", [&] {
        if (zvdb::Entity* ponto = PontoConfiguracao("KVR_ZV_PAINEL", true))
            ponto->setXData("KVR_ZV_PAINEL", TagsXData(paineis).Tags());
        return 0;
    });
}

OdDbObjectId CICad::GetDicionarioCabos(zvdb::Database* database) {
    zvdb::Database* db = Db(database);
    if (!db) return {};
    db->registerApplication("ZV_CABOS");
    const std::string caminho[] = {"ZV_CABOS"};
    return Id(db->dictionaryAt(caminho, true));
}

QString CICad::GetVersao(zvdb::Database* database) {
    zvdb::Database* db = Db(database);
    zvdb::Dictionary* nomeados = db ? db->namedObjects() : nullptr;
    zvdb::DbObject* entrada = nomeados ? nomeados->get("ZV_VERSAO") : nullptr;
    if (!entrada) return {};
    std::vector<QString> textos;
    for (const zvdb::Tag& item : entrada->xdata("ZV_VERSAO"))
        if (item.code == 1000) textos.push_back(Q(item.value));
    return textos.size() >= 2 ? textos[1] : QString();
}
