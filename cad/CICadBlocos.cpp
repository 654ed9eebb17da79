#include "CETextosUtf8.h"
#include "CICad.h"
#include "CICadInterno.h"
#include "app/DrawingFiles.h"

#include "drawing/Attribute.h"
#include "drawing/AttributeLayout.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/DeepCloner.h"
#include "drawing/Entity.h"
#include "drawing/SmallBuffer.h"
#include "readers/CEAtributo.h"
#include "readers/CEListaAtributos.h"
#include "settings/CIMensagens.h"

#include <QFileInfo>
#include <QRandomGenerator>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <exception>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

using namespace cicad;

namespace {

// A file's text for the command line: doubled separators reduced to one.
QString CaminhoParaMensagem(QString caminho) {
    return caminho.replace("\\\\", "\\").replace("//", "/");
}

// Reads a drawing file (DXF, or DWG through the host's converter) into a side database;
// null, with a line on the command line that names the file, when it can't be read.
std::unique_ptr<zvdb::Database> LeDesenho(const QString& caminho) {
    const QString arquivo = CICad::ResolveArquivo(caminho);
    if (!QFileInfo(arquivo).isFile()) return nullptr;
    QString erro;
    auto lado = zvhost::readDrawing(arquivo, &erro);
    if (!lado) CICad::Imprime("\n" + erro + "\n");
    return lado;
}

void RejeitaBloco(const QString& mensagem, const QString& nome, const QString& arquivo) {
    CICad::Imprime("\n" + mensagem + nome + " = " + CaminhoParaMensagem(arquivo) + "\n");
}

// The block's attribute definitions that take a value, with their ids when `comIds`.
std::unique_ptr<zv::CEListaAtributos> DefinicoesDe(const zvdb::BlockRecord* bloco, bool comIds) {
    if (!bloco) return nullptr;
    auto lista = std::make_unique<zv::CEListaAtributos>();
    for (zvdb::Attribute* definicao : bloco->attributeDefinitions()) {
        if (definicao->isConstant()) continue;
        lista->Adicionar(std::make_unique<zv::CEAtributo>(
            Q(definicao->tag()), Q(definicao->prompt()), Q(definicao->textValue()),
            comIds ? Id(definicao) : OdDbObjectId(), definicao->isInvisible()));
    }
    return lista;
}

// Product block files hold one layer and no nested references.
bool ConfereBloco(zvdb::Database& lado, const QString& nome, const QString& arquivo) {
    if (lado.layers().size() >= 2) {
        RejeitaBloco(CIMensagens::Mensagem("ZVINC", 17), nome, arquivo);
        return false;
    }
    zvdb::BlockRecord* modelo = lado.modelSpace();
    const std::vector<zvdb::Entity*> entidades =
        modelo ? modelo->entities() : std::vector<zvdb::Entity*>();
    for (zvdb::Entity* entidade : entidades)
        if (entidade->isType("INSERT")) {
            RejeitaBloco(CIMensagens::Mensagem("ZVINC", 18), nome, arquivo);
            return false;
        }
    return true;
}

// Defines `nome` in `db` from a side database, its entities moved to the origin.
zvdb::BlockRecord* InsereComoBloco(zvdb::Database& db, const zvdb::Database& lado,
                                   const QString& nome) {
    zvdb::DeepCloner clonador(lado, db);
    zvdb::BlockRecord* bloco = clonador.cloneModelSpaceAsBlock(U8(nome));
    if (!bloco) return nullptr;
    const zvdb::Point3 origem = bloco->basePoint();
    if (origem != zvdb::Point3{})
        for (zvdb::Entity* entidade : bloco->entities())
            entidade->moveBy(zvdb::Point3{} - origem);
    bloco->setBasePoint({});
    return bloco;
}

// A definition's tag and default value as the values are asked for with them (trimmed), made
// once per layout instead of once per reference.
struct TextosDefinicao {
    QString tag, padrao;
};

// Goes up when the table of texts below starts again: what was found there went with it.
std::uint64_t geracaoTextos = 0;

const TextosDefinicao& Textos(const zvdb::AttributeLayout& leitura) {
    // By the layout's serial, which no other layout shares: drawings that come and go leave
    // theirs behind, so the table starts again when it grows large.
    static std::unordered_map<std::uint64_t, TextosDefinicao> porLeitura;
    const auto conhecido = porLeitura.find(leitura.serial());
    if (conhecido != porLeitura.end()) return conhecido->second;
    if (porLeitura.size() >= 4096) {
        porLeitura.clear();
        ++geracaoTextos;
    }
    return porLeitura[leitura.serial()] = {Q(leitura.tag()).trimmed(),
                                           Q(leitura.defaultValue()).trimmed()};
}

// The texts of the layouts the last reference took, in order: the next one is most often
// of the same block, and takes them without a look-up each. Good while the table above has
// not started again.
const TextosDefinicao* const* TextosDe(std::span<zvdb::AttributeLayout* const> leituras) {
    static std::vector<std::uint64_t> seriais;
    static std::vector<const TextosDefinicao*> textos;
    static std::uint64_t geracao = 0;
    bool iguais = geracao == geracaoTextos && seriais.size() == leituras.size();
    for (std::size_t i = 0; iguais && i < leituras.size(); ++i)
        iguais = seriais[i] == leituras[i]->serial();
    while (!iguais) {
        const std::uint64_t antes = geracaoTextos;
        seriais.clear();
        textos.clear();
        for (const zvdb::AttributeLayout* leitura : leituras) {
            textos.push_back(&Textos(*leitura));
            seriais.push_back(leitura->serial());
        }
        geracao = geracaoTextos;
        iguais = geracao == antes;  // else a text found first went with the table
    }
    return textos.data();
}

// What a new reference takes: its block's variable layouts and the value given for each
// (none: the default), in UTF-8. For the few attributes of a row or a symbol everything
// stays on the stack.
class NovosAtributos {
public:
    std::span<zvdb::AttributeLayout* const> leituras;
    std::span<const std::optional<std::string_view>> dados;
    zvdb::Point3 base;

    void Le(std::span<zvdb::AttributeLayout* const> variaveis, const CEValoresAtributos& valores) {
        // A copy: asking for the values must not leave the layouts in the air.
        std::copy(variaveis.begin(), variaveis.end(), leituras_.prepare(variaveis.size()));
        leituras = leituras_.span();
        if (!valores) return;
        std::optional<std::string_view>* lidos = dados_.prepare(leituras.size());
        // Copied: a value asked for may place another reference.
        zvdb::SmallBuffer<const TextosDefinicao*, kNaPilha> textos(leituras.size());
        std::copy_n(TextosDe(leituras), leituras.size(), textos.data());
        const std::uint64_t geracao = geracaoTextos;
        for (std::size_t i = 0; i < leituras.size(); ++i) {
            const TextosDefinicao& textosDef =
                geracao == geracaoTextos ? *textos[i] : Textos(*leituras[i]);
            const std::optional<QString> valor = valores(textosDef.tag, textosDef.padrao);
            lidos[i] =
                valor ? std::optional<std::string_view>(textos_.Guarda(*valor)) : std::nullopt;
        }
        dados = {lidos, leituras.size()};
    }
    void Esquece() {
        leituras = {};
        dados = {};
    }

private:
    static constexpr std::size_t kNaPilha = 16;
    zvdb::SmallBuffer<zvdb::AttributeLayout*, kNaPilha> leituras_;
    zvdb::SmallBuffer<std::optional<std::string_view>, kNaPilha> dados_;
    CETextosUtf8 textos_;
};

}  // namespace

// ---- blocks and references

bool CICad::GetBlocoId(const QString& nome, OdDbObjectId& id, zvdb::Database* database) {
    zvdb::Database* db = Db(database);
    zvdb::BlockRecord* bloco = db && !nome.isEmpty() ? db->block(U8(nome)) : nullptr;
    if (bloco) id = Id(bloco);
    return bloco != nullptr;
}

QString CICad::GetNomeBloco(const OdDbObjectId& referencia) {
    auto* ref = Como<zvdb::BlockReference>(referencia);
    return ref ? Q(ref->blockName()) : QString();
}

std::string_view CICad::NomeBlocoUtf8(const OdDbObjectId& referencia) {
    auto* ref = Como<zvdb::BlockReference>(referencia);
    return ref ? ref->blockName() : std::string_view();
}

OdDbObjectId CICad::CarregaBloco(const QString& nome, const QString& arquivo) {
    zvdb::Database* db = GetDatabase();
    if (!db || !ExisteArquivo(arquivo)) return {};
    std::unique_ptr<zvdb::Database> lado = LeDesenho(arquivo);
    if (!lado || !ConfereBloco(*lado, nome, arquivo)) return {};
    return Id(InsereComoBloco(*db, *lado, nome));
}

bool CICad::RecarregaBloco(const QString& arquivo, const QString& nome) {
    return RecarregaBlocos({{arquivo, nome}}).front();
}

std::vector<bool> CICad::RecarregaBlocos(const std::vector<std::pair<QString, QString>>& blocos) {
    std::vector<bool> resultados(blocos.size(), false);
    zvdb::Database* db = GetDatabase();
    if (!db) return resultados;
    // The blocks redefined here, by name: their references take the new attributes after.
    std::unordered_map<std::string, OdDbObjectId> redefinidos;
    for (size_t i = 0; i < blocos.size(); ++i) {
        const auto& [arquivo, nome] = blocos[i];
        std::unique_ptr<zvdb::Database> lado =
            ExisteArquivo(arquivo) ? LeDesenho(arquivo) : nullptr;
        if (!lado || !ConfereBloco(*lado, nome, arquivo)) continue;
        zvdb::BlockRecord* existente = db->block(U8(nome));
        if (!existente) {
            resultados[i] = InsereComoBloco(*db, *lado, nome) != nullptr;
            continue;
        }
        QString temporario;
        do {
            temporario = "ZV_TMP_" + QString::number(QRandomGenerator::global()->bounded(1 << 30));
        } while (db->block(U8(temporario)));
        zvdb::BlockRecord* novo = InsereComoBloco(*db, *lado, temporario);
        if (!novo) continue;
        existente->setBasePoint({});
        for (zvdb::Entity* entidade : existente->entities())
            entidade->erase();
        const std::vector<zvdb::Entity*> fontes = novo->entities();
        zvdb::DeepCloner(*db, *db).cloneEntities(fontes, *existente);
        novo->erase();
        redefinidos[std::string(existente->name())] = Id(existente);
        resultados[i] = true;
    }
    if (redefinidos.empty()) return resultados;
    // Every reference: those of model and paper space and those nested in other blocks,
    // found in one walk however many blocks were redefined.
    for (zvdb::BlockRecord* dono : db->blocks()) {
        if (dono->isErased()) continue;
        for (zvdb::Entity* entidade : dono->entities()) {
            auto* ref = Classe<zvdb::BlockReference>(entidade);
            if (!ref) continue;
            const auto definicao = redefinidos.find(std::string(ref->blockName()));
            if (definicao == redefinidos.end()) continue;
            std::unique_ptr<zv::CEListaAtributos> valores;
            GetAtributos(Id(ref), valores, true, false);
            for (zvdb::Attribute* atributo : ref->attributes())
                atributo->erase();
            CriarAtributos(definicao->second, Id(ref));
            if (valores) SetAtributosLista(Id(ref), *valores);
        }
    }
    return resultados;
}

OdDbObjectId CICad::InsereBloco(const QString& arquivo, const QString& nome, const QString& layer,
                                double x, double y, double z, double rotacao,
                                const CEValoresAtributos& valores) {
    zvdb::Database* db = GetDatabase();
    if (!db) return {};
    OdDbObjectId bloco;
    if (!GetBlocoId(nome, bloco, db)) bloco = CarregaBloco(nome, arquivo);
    CriaLayer(layer, db);
    return InsereReferencia(bloco, U8(layer), x, y, z, rotacao, valores);
}

OdDbObjectId CICad::InsereReferencia(const OdDbObjectId& bloco, std::string_view layer, double x,
                                     double y, double z, double rotacao,
                                     const CEValoresAtributos& valores) {
    zvdb::Database* db = GetDatabase();
    if (!db) return {};
    auto* definicao = Como<zvdb::BlockRecord>(bloco);
    zvdb::BlockRecord* modelo = db->modelSpace();
    if (!definicao || !modelo) return {};
    // Insertion points and rotations go through single precision on purpose.
    const zvdb::Point3 ponto{Simples(x), Simples(y), Simples(z)};
    const double graus = Simples(rotacao) * 180.0 / M_PI;
    // The block's variable definitions and the values given for them come first: the
    // reference is then made marked for its attributes, and each attribute with its value,
    // placed from the values just given, instead of being found and set again.
    NovosAtributos novos;
    try {
        zvdb::Point3 base;
        novos.Le(db->attributeLayouts().variableLayouts(*db, *definicao, &base), valores);
        novos.base = base;
    } catch (const std::exception& erro) {
        Log("CICAd::CriarAtributos: " + QString::fromUtf8(erro.what()));
        novos.Esquece();
    }
    zvdb::BlockReference* ref = db->addBlockReference(*modelo, *definicao, ponto, {1, 1, 1}, graus,
                                                      layer, !novos.leituras.empty());
    try {
        ref->placeAttributesFromLayouts(novos.base, ponto, {1, 1, 1}, graus, novos.leituras,
                                        novos.dados);
    } catch (const std::exception& erro) {
        Log("CICAd::CriarAtributos: " + QString::fromUtf8(erro.what()));
    }
    return Id(ref);
}

std::unique_ptr<zv::CEListaAtributos> CICad::GetDefinicoesAtributos(const QString& arquivo,
                                                                    const QString& nome) {
    OdDbObjectId id;
    if (!GetBlocoId(nome, id)) id = CarregaBloco(nome, arquivo);
    return DefinicoesDe(Como<zvdb::BlockRecord>(id), true);
}

std::unique_ptr<zv::CEListaAtributos> CICad::LeDefinicoesAtributos(const QString& arquivo,
                                                                   const QString& nome) {
    OdDbObjectId id;
    if (GetBlocoId(nome, id)) return DefinicoesDe(Como<zvdb::BlockRecord>(id), true);
    return LeDefinicoesDoArquivo(arquivo);
}

std::unique_ptr<zv::CEListaAtributos> CICad::LeDefinicoesDoArquivo(const QString& arquivo) {
    const QString caminho = ResolveArquivo(arquivo);
    if (!QFileInfo(caminho).isFile()) return nullptr;
    // Quietly: the insertion that follows tells the user what is wrong with the file.
    QString erro;
    const std::unique_ptr<zvdb::Database> lado = zvhost::readDrawing(caminho, &erro);
    // The side drawing goes with this call: its definitions have no id to give.
    return lado ? DefinicoesDe(lado->modelSpace(), false) : nullptr;
}

OdDbObjectId CICad::GetReferenciaNoLayer(const QString& nome, const QString& layer) {
    zvdb::Database* db = GetDatabase();
    if (!db || !db->modelSpace()) return {};
    const std::string camada = U8(layer);
    for (zvdb::Entity* entidade : db->modelSpace()->entities()) {
        auto* ref = Classe<zvdb::BlockReference>(entidade);
        if (ref && ref->layer() == camada &&
            Q(ref->blockName()).compare(nome, Qt::CaseInsensitive) == 0)
            return Id(ref);
    }
    return {};
}

QString CICad::GetValorSimboloPagina(const QString& tag, const QString& nome,
                                     const QString& layer) {
    for (const QString& forma : QStringList{nome, nome + "_C", nome + "_I"}) {
        const OdDbObjectId ref = GetReferenciaNoLayer(forma, layer);
        if (ref.isNull()) continue;
        if (std::unique_ptr<zv::CEAtributo> atributo = GetAtributo(tag, ref))
            return atributo->GetValor();
    }
    return {};
}
