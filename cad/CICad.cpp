#include "CICad.h"

#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/DeepCloner.h"
#include "drawing/Dictionary.h"
#include "drawing/DxfError.h"
#include "drawing/DxfLoader.h"
#include "drawing/Entity.h"
#include "drawing/Extents.h"
#include "drawing/LayerRecord.h"
#include "drawing/Polyline.h"
#include "drawing/TextEntity.h"
#include "drawing/XRecord.h"
#include "host/sdk/Document.h"
#include "host/sdk/LispInterface.h"
#include "host/sdk/SystemServices.h"
#include "host/sdk/UserInterface.h"
#include "readers/CEAtributo.h"
#include "readers/CEListaAtributos.h"
#include "readers/ZVString.h"
#include "settings/CIMensagens.h"
#include "settings/CIRegistro.h"

#include <QDateTime>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QRandomGenerator>

#include <cmath>
#include <exception>

#include <unistd.h>

using zvsdk::ResultBuffer;

namespace {

zvsdk::LispInterface* LispDe(zvsdk::Document* documento) {
    if (!documento) documento = zvsdk::activeDocument();
    return documento ? documento->lisp() : nullptr;
}

// The symbol's chain, or null when it is missing or the read failed.
ResultBuffer* LeSimbolo(const QString& nome, zvsdk::Document* documento = nullptr) {
    zvsdk::LispInterface* lisp = LispDe(documento);
    if (!lisp) return nullptr;
    ResultBuffer* valor = nullptr;
    if (lisp->lispGetSymbol(nome, &valor) != zvsdk::RTNORM) {
        zvsdk::releaseChain(valor);
        return nullptr;
    }
    return valor;
}

void GravaSimbolo(const QString& nome, const ResultBuffer* valor,
                  zvsdk::Document* documento = nullptr) {
    if (zvsdk::LispInterface* lisp = LispDe(documento)) lisp->lispPutSymbol(nome, valor);
}

ResultBuffer* Chamada(const QString& funcao, const QStringList& args) {
    ResultBuffer* cabeca = zvsdk::newString(funcao);
    ResultBuffer* cauda = cabeca;
    for (const QString& arg : args.mid(0, 9))
        cauda = cauda->rbnext = zvsdk::newString(arg);
    return cabeca;
}

}  // namespace

void CICad::Imprime(const QString& texto) {
    if (zvsdk::Document* documento = zvsdk::activeDocument()) documento->printMessage(texto);
}

void CICad::ImprimeMensagem(int numero) {
    Imprime("\n" + CIMensagens::Mensagem("ZVLISTAS", numero) + "\n");
}

QString CICad::ArquivoLog() {
    QString pasta = CIRegistro::PastaTemporaria();
    if (!pasta.isEmpty() && !pasta.endsWith('/') && !pasta.endsWith('\\')) pasta += '/';
    return pasta + "LogFile.txt";
}

void CICad::Log(const QString& linha) {
    // Opened, written, flushed and closed for every line, so none is lost if the host dies.
    QFile arquivo(ArquivoLog());
    if (!arquivo.open(QIODevice::Append | QIODevice::Text)) return;
    const QDateTime agora = QDateTime::currentDateTime();
    const QString texto = ZVString::Data(agora.date()) + " " + ZVString::Hora(agora.time()) +
                          " - PID" + QString::number(getpid()) + " - " + linha + "\n";
    arquivo.write(texto.toUtf8());
    arquivo.flush();
}

ResultBuffer* CICad::LeSimboloLisp(const QString& nome) {
    return LeSimbolo(nome);
}

QString CICad::GetStringLisp(const QString& nome, const QString& padrao) {
    ResultBuffer* valor = LeSimbolo(nome);
    if (!valor) return padrao;
    // Any other type, nil included, reads as empty: callers test for emptiness.
    const QString texto = valor->restype == zvsdk::RTSTR ? valor->rstring : QString();
    zvsdk::releaseChain(valor);
    return texto;
}

double CICad::GetRealLisp(const QString& nome, double padrao) {
    ResultBuffer* valor = LeSimbolo(nome);
    double resultado = padrao;
    if (valor && valor->restype == zvsdk::RTREAL) resultado = valor->rreal;
    if (valor && valor->restype == zvsdk::RTSHORT) resultado = valor->rint;
    zvsdk::releaseChain(valor);
    return resultado;
}

int CICad::GetIntLisp(const QString& nome, int padrao) {
    ResultBuffer* valor = LeSimbolo(nome);
    // Only 16-bit integers count; a 32-bit value gives the default.
    const int resultado = valor && valor->restype == zvsdk::RTSHORT ? valor->rint : padrao;
    zvsdk::releaseChain(valor);
    return resultado;
}

bool CICad::GetBoolLisp(const QString& nome, zvsdk::Document* documento) {
    if (!documento) return false;
    ResultBuffer* valor = LeSimbolo(nome, documento);
    const bool resultado = valor && valor->restype != zvsdk::RTNIL;
    zvsdk::releaseChain(valor);
    return resultado;
}

bool CICad::GetBoolLisp(const QString& nome) {
    return GetBoolLisp(nome, zvsdk::activeDocument());
}

QStringList CICad::GetListaLisp(const QString& nome) {
    ResultBuffer* valor = LeSimbolo(nome);
    QStringList lista;
    for (const ResultBuffer* no = valor; no; no = no->rbnext)
        if (no->restype == zvsdk::RTSTR) lista << no->rstring;
    zvsdk::releaseChain(valor);
    return lista;
}

void CICad::SetStringLisp(const QString& nome, const QString& texto, zvsdk::Document* documento) {
    ResultBuffer* valor = zvsdk::newString(texto);
    GravaSimbolo(nome, valor, documento);
    zvsdk::releaseChain(valor);
}

void CICad::SetNilLisp(const QString& nome, zvsdk::Document* documento) {
    ResultBuffer* valor = zvsdk::newNode(zvsdk::RTNIL);
    GravaSimbolo(nome, valor, documento);
    zvsdk::releaseChain(valor);
}

void CICad::SetIntLisp(const QString& nome, int valor) {
    ResultBuffer* no = zvsdk::newShort(static_cast<short>(valor));
    GravaSimbolo(nome, no);
    zvsdk::releaseChain(no);
}

void CICad::SetRealLisp(const QString& nome, double valor) {
    ResultBuffer* no = zvsdk::newReal(valor);
    GravaSimbolo(nome, no);
    zvsdk::releaseChain(no);
}

void CICad::SetListaLisp(const QString& nome, const QStringList& lista) {
    ResultBuffer* cabeca = zvsdk::newNode(zvsdk::RTLB);
    ResultBuffer* cauda = cabeca;
    for (const QString& texto : lista)
        cauda = cauda->rbnext = zvsdk::newString(texto);
    cauda->rbnext = zvsdk::newNode(zvsdk::RTLE);
    GravaSimbolo(nome, cabeca);
    zvsdk::releaseChain(cabeca);
}

void CICad::SetChainLisp(const QString& nome, const ResultBuffer* chain) {
    GravaSimbolo(nome, chain);
}

void CICad::SetParesLisp(const QString& nome, const std::vector<zvsdk::StringPair>& pares) {
    if (zvsdk::LispInterface* lisp = LispDe(nullptr))
        lisp->lispPutStringPairs(nome, pares.data(), int(pares.size()));
}

ResultBuffer* CICad::InvokeChain(const ResultBuffer* chamada) {
    zvsdk::LispInterface* lisp = LispDe(nullptr);
    return lisp ? lisp->lispInvoke(chamada) : nullptr;
}

void CICad::LiberaLista(ResultBuffer* lista) {
    zvsdk::releaseChain(lista);
}

ResultBuffer* CICad::zvInvokeLista(const QString& funcao, const QStringList& args) {
    if (!zvsdk::activeDocument()) return nullptr;
    ResultBuffer* chamada = Chamada(funcao, args);
    ResultBuffer* resultado = InvokeChain(chamada);
    zvsdk::releaseChain(chamada);
    return resultado;
}

void CICad::zvInvokeVoid(const QString& funcao, const QStringList& args) {
    zvsdk::releaseChain(zvInvokeLista(funcao, args));
}

int CICad::zvInvokeInt(const QString& funcao, const QStringList& args) {
    ResultBuffer* resultado = zvInvokeLista(funcao, args);
    int valor = 0;
    if (resultado && resultado->restype == zvsdk::RTSHORT) valor = resultado->rint;
    if (resultado && resultado->restype == zvsdk::RTLONG) valor = resultado->rlong;
    zvsdk::releaseChain(resultado);
    return valor;
}

bool CICad::zvInvokeBool(const QString& funcao, const QStringList& args) {
    ResultBuffer* resultado = zvInvokeLista(funcao, args);
    const bool valor = resultado && resultado->restype != zvsdk::RTNIL;
    zvsdk::releaseChain(resultado);
    return valor;
}

QString CICad::zvInvokeString(const QString& funcao, const QStringList& args) {
    ResultBuffer* resultado = zvInvokeLista(funcao, args);
    const QString valor =
        resultado && resultado->restype == zvsdk::RTSTR ? resultado->rstring : QString();
    zvsdk::releaseChain(resultado);
    return valor;
}

bool CICad::AvaliaLisp(const QString& texto) {
    zvsdk::LispInterface* lisp = LispDe(nullptr);
    return lisp && lisp->lispEvaluate(texto);
}

const ResultBuffer* CICad::NoDaLista(const ResultBuffer* lista, int posicao) {
    for (; lista && posicao > 0; --posicao)
        lista = lista->rbnext;
    return posicao == 0 ? lista : nullptr;
}

QString CICad::StringDaLista(const ResultBuffer* lista, int posicao) {
    const ResultBuffer* no = NoDaLista(lista, posicao);
    return no ? no->rstring : QString();
}

int CICad::IntDaLista(const ResultBuffer* lista, int posicao) {
    const ResultBuffer* no = NoDaLista(lista, posicao);
    if (no && no->restype == zvsdk::RTLONG) return no->rlong;
    if (no && no->restype == zvsdk::RTSHORT) return no->rint;
    return 0;
}

double CICad::RealDaLista(const ResultBuffer* lista, int posicao) {
    const ResultBuffer* no = NoDaLista(lista, posicao);
    if (no && no->restype == zvsdk::RTREAL) return no->rreal;
    if (no && no->restype == zvsdk::RTLONG) return no->rlong;
    if (no && no->restype == zvsdk::RTSHORT) return no->rint;
    return 0.0;
}

bool CICad::PontoDaLista(const ResultBuffer* lista, double* x, double* y, double* z) {
    const ResultBuffer* no = NoDaLista(lista, 1);
    if (!no || (no->restype != zvsdk::RTPOINT && no->restype != zvsdk::RT3DPOINT)) return false;
    *x = no->rpoint[0];
    *y = no->rpoint[1];
    *z = no->rpoint[2];
    return true;
}

bool CICad::PadraoDaLista(const ResultBuffer* lista, std::initializer_list<short> tipos) {
    for (short tipo : tipos) {
        if (!lista || lista->restype != tipo) return false;
        lista = lista->rbnext;
    }
    return true;
}

QString CICad::ConverteFiltro(const QString& filtro) {
    const QStringList partes = filtro.split('|');
    QString resultado;
    for (int i = 0; i + 1 < partes.size(); i += 2) {
        const QString& descricao = partes[i];
        if (descricao.contains('(') && descricao.contains(')'))
            resultado += descricao + ";;";
        else
            resultado += descricao + "( " + partes[i + 1] + " );;";
    }
    return resultado;
}

QString CICad::DialogoArquivo(bool abrir, const QString& filtro, const QString& caminho,
                              const QString& titulo, const QString& nome) {
    Log(QString(abrir ? "OPEN" : "SAVE") + " file dialog, filter=" + filtro + ", path=" + caminho);
    zvsdk::SystemServices* servicos = zvsdk::systemServices();
    QString resultado;
    if (servicos && servicos->userInterface())
        resultado = servicos->userInterface()->fileDialog(nome, abrir, ConverteFiltro(filtro),
                                                          caminho, titulo);
    Log("File dialog result: " + resultado);
    resultado.replace('/', '\\');
    return resultado;
}

void CICad::MessageBox(const QString& texto, const QString& titulo) {
    zvsdk::SystemServices* servicos = zvsdk::systemServices();
    if (servicos && servicos->userInterface()) servicos->userInterface()->messageBox(texto, titulo);
}

// ---------------------------------------------------------------------------------------
// The drawing side of the facade.

namespace {

zvdb::Database* databaseOverride = nullptr;

std::string U8(const QString& texto) {
    return texto.toStdString();
}
QString Q(std::string_view texto) {
    return QString::fromUtf8(texto.data(), int(texto.size()));
}

zvdb::Database* Db(zvdb::Database* database) {
    return database ? database : CICad::GetDatabase();
}

zvdb::DbObject* Objeto(const OdDbObjectId& id) {
    if (id.isNull()) return nullptr;
    zvdb::DbObject* objeto = id.database()->objectByHandle(id.handle());
    return objeto && !objeto->isErased() ? objeto : nullptr;
}

template <class T>
T* Como(const OdDbObjectId& id) {
    return dynamic_cast<T*>(Objeto(id));
}

OdDbObjectId Id(const zvdb::DbObject* objeto) {
    return objeto ? OdDbObjectId(&objeto->database(), objeto->handle()) : OdDbObjectId();
}

zvdb::LayerRecord* Layer(const QString& nome, zvdb::Database* database) {
    zvdb::Database* db = Db(database);
    return db && !nome.isEmpty() ? db->layer(U8(nome)) : nullptr;
}

bool MesmaTag(std::string_view a, const QString& b) {
    return Q(a).compare(b, Qt::CaseInsensitive) == 0;
}

// A file's text for the command line: doubled separators reduced to one.
QString CaminhoParaMensagem(QString caminho) {
    return caminho.replace("\\\\", "\\").replace("//", "/");
}

// Reads a drawing file into a side database; null (with a line on the command line for a
// file that is not a readable DXF) when it can't be read.
std::unique_ptr<zvdb::Database> LeDesenho(const QString& caminho) {
    const QString arquivo = CICad::ResolveArquivo(caminho);
    QFile f(arquivo);
    if (!f.open(QIODevice::ReadOnly)) return nullptr;
    const QByteArray inicio = f.peek(6);
    if (inicio.startsWith("AC10") || inicio.startsWith("AC1.")) {
        CICad::Imprime("\n" + arquivo +
                       ": a DWG drawing; this edition reads DXF drawings only. Save it as DXF.\n");
        return nullptr;
    }
    try {
        return zvdb::DxfLoader::loadFile(arquivo.toStdString());
    } catch (const std::exception& erro) {
        CICad::Imprime("\n" + arquivo + ": " + QString::fromUtf8(erro.what()) + "\n");
        return nullptr;
    }
}

void RejeitaBloco(const QString& mensagem, const QString& nome, const QString& arquivo) {
    CICad::Imprime("\n" + mensagem + nome + " = " + CaminhoParaMensagem(arquivo) + "\n");
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

// The project-settings operations log what goes wrong and answer nothing.
template <class F>
auto Protegido(const char* nome, F&& f) -> decltype(f()) {
    try {
        return f();
    } catch (const std::exception& erro) {
        CICad::Log(QString(nome) + ": " + QString::fromUtf8(erro.what()));
    } catch (...) {
        CICad::Log(nome);
    }
    return decltype(f())();
}

CEItemXData ItemXData(const std::vector<zvdb::Tag>& itens, std::size_t& i) {
    CEItemXData item;
    item.codigo = itens[i].code;
    item.texto = Q(itens[i].value);
    if (item.codigo >= 1010 && item.codigo <= 1013) {
        item.x = item.texto.toDouble();
        for (std::size_t j = i + 1; j < itens.size() && j <= i + 2; ++j) {
            if (itens[j].code == item.codigo + 10) item.y = Q(itens[j].value).toDouble();
            if (itens[j].code == item.codigo + 20) item.z = Q(itens[j].value).toDouble();
        }
        while (i + 1 < itens.size() &&
               (itens[i + 1].code == item.codigo + 10 || itens[i + 1].code == item.codigo + 20))
            ++i;
    }
    return item;
}

CEListaXData ConverteXData(const std::vector<zvdb::Tag>& itens) {
    CEListaXData lista;
    for (std::size_t i = 0; i < itens.size(); ++i)
        lista.push_back(ItemXData(itens, i));
    return lista;
}

std::vector<zvdb::Tag> TagsXData(zvdb::Database& db, const CEListaXData& itens) {
    std::vector<zvdb::Tag> tags;
    auto num = [&db](double v) { return db.store(QByteArray::number(v, 'g', 17).toStdString()); };
    for (const CEItemXData& item : itens) {
        if (item.codigo >= 1010 && item.codigo <= 1013) {
            tags.push_back({std::int16_t(item.codigo), num(item.x)});
            tags.push_back({std::int16_t(item.codigo + 10), num(item.y)});
            tags.push_back({std::int16_t(item.codigo + 20), num(item.z)});
        } else {
            tags.push_back({std::int16_t(item.codigo), db.store(U8(item.texto))});
        }
    }
    return tags;
}

// The handle in an extended-data item (text or handle group).
OdDbObjectId IdDoItem(zvdb::Database& db, const CEListaXData& itens, size_t indice) {
    if (indice >= itens.size()) return {};
    const std::uint64_t handle = ZVString(itens[indice].texto).ParaHandle();
    zvdb::DbObject* objeto = handle ? db.objectByHandle(handle) : nullptr;
    return objeto && !objeto->isErased() ? Id(objeto) : OdDbObjectId();
}

// Virtual attributes: "TAG\fVALUE\fFLAG", an empty field between two separators read as
// one blank.
bool LeAtributoVirtual(QString registro, QString& tag, QString& valor, bool& invisivel) {
    const QString duplo = QString(QChar(0x0C)) + QChar(0x0C);
    const QString preenchido = QString(QChar(0x0C)) + " " + QChar(0x0C);
    while (registro.contains(duplo))
        registro.replace(duplo, preenchido);
    const QStringList campos = ZVString(registro).Divide(QString(QChar(0x0C)));
    if (campos.size() != 3) return false;
    tag = campos[0];
    valor = campos[1];
    invisivel = campos[2].toUpper() == "S";
    return true;
}

}  // namespace

double CICad::Simples(double valor) {
    // Through memory: GCC 12 drops float round trips of vectorised pairs at -O2 and above.
    volatile float simples = static_cast<float>(valor);
    return simples;
}

zvdb::Database* CICad::GetDatabase() {
    if (databaseOverride) return databaseOverride;
    zvsdk::Document* documento = zvsdk::activeDocument();
    return documento ? documento->database() : nullptr;
}

void CICad::SetDatabaseOverride(zvdb::Database* database) {
    databaseOverride = database;
}

// ---- layers

QStringList CICad::GetLayers(zvdb::Database* database) {
    QStringList nomes;
    if (zvdb::Database* db = Db(database))
        for (zvdb::LayerRecord* layer : db->layers())
            nomes << Q(layer->name());
    return nomes;
}

QString CICad::GetLayerCorrente(zvdb::Database* database) {
    zvdb::Database* db = Db(database);
    return db ? Q(db->currentLayer()) : QString();
}

QString CICad::SetLayerCorrente(const QString& nome, zvdb::Database* database) {
    zvdb::Database* db = Db(database);
    if (!db) return {};
    DescongelaLayer(nome, db);
    db->setCurrentLayer(U8(nome));
    return Q(db->currentLayer());
}

bool CICad::ExisteLayer(const QString& nome, zvdb::Database* database) {
    return Layer(nome, database) != nullptr;
}

void CICad::CriaLayer(const QString& nome, zvdb::Database* database) {
    zvdb::Database* db = Db(database);
    if (db && !nome.isEmpty() && !db->layer(U8(nome))) db->createLayer(U8(nome));
}

void CICad::DescongelaLayer(const QString& nome, zvdb::Database* database) {
    if (zvdb::LayerRecord* layer = Layer(nome, database); layer && layer->isFrozen())
        layer->setFrozen(false);
}

void CICad::LigaLayer(const QString& nome, zvdb::Database* database) {
    if (zvdb::LayerRecord* layer = Layer(nome, database); layer && layer->isOff())
        layer->setOff(false);
}

void CICad::DestravaLayer(const QString& nome, zvdb::Database* database) {
    if (zvdb::LayerRecord* layer = Layer(nome, database); layer && layer->isLocked())
        layer->setLocked(false);
}

void CICad::CongelaLayer(const QString& nome) {
    if (zvdb::LayerRecord* layer = Layer(nome, nullptr); layer && !layer->isFrozen())
        layer->setFrozen(true);
}

void CICad::CongelaTodosLayers() {
    zvdb::Database* db = GetDatabase();
    if (!db) return;
    for (zvdb::LayerRecord* layer : db->layers())
        if (layer->name() != "0" && !layer->isFrozen()) layer->setFrozen(true);
}

void CICad::ApagarEntidadesLayer(const QString& nome) {
    Protegido("CICad::ApagarEntidadesLayer", [&] {
        zvdb::Database* db = GetDatabase();
        if (!db || !db->modelSpace()) return 0;
        const std::string layer = U8(nome);
        for (zvdb::Entity* entidade : db->modelSpace()->entities())
            if (entidade->layer() == layer) entidade->erase();
        return 0;
    });
}

// ---- pages

QString CICad::NomeBase(const QString& layer) {
    const QStringList partes = ZVString(layer).Divide("$");
    return partes.isEmpty() ? QString() : partes.first();
}

int CICad::MostraPagina(const QString& layer, bool zoom) {
    if (layer == "0" || !ExisteLayer(layer)) return 1;
    const QString base = NomeBase(layer);
    SetLayerCorrente("0");
    CongelaTodosLayers();
    DescongelaLayer(layer);
    DescongelaLayer(base + "$DE");
    DescongelaLayer(base + "$FORMATO");
    if (!IsPaginaCapa(layer) && !IsPaginaIndice(layer)) DescongelaLayer(base + "$SELO");
    if (SetLayerCorrente(layer).compare(layer, Qt::CaseInsensitive) != 0) return 2;
    if (zoom) ZoomExtents();
    return 0;
}

void CICad::TrocaPagina(const QString& layer) {
    if (!ExisteLayer(layer)) return;
    const QString atual = GetLayerCorrente();
    const QString baseAtual = NomeBase(atual);
    SetLayerCorrente("0");
    for (const QString& nome :
         QStringList{atual, baseAtual + "$DE", baseAtual + "$FORMATO", baseAtual + "$SELO"})
        if (nome != "0") CongelaLayer(nome);
    const QString base = NomeBase(layer);
    DescongelaLayer(layer);
    DescongelaLayer(base + "$DE");
    DescongelaLayer(base + "$FORMATO");
    if (!IsPaginaCapa(layer) && !IsPaginaIndice(layer)) DescongelaLayer(base + "$SELO");
    if (SetLayerCorrente(layer).compare(layer, Qt::CaseInsensitive) == 0) ZoomExtents();
}

bool CICad::IsPaginaCapa(const QString& layer) {
    zvdb::LayerRecord* registro = Layer(layer, nullptr);
    return registro && !registro->xdata("KVR_ZV_CAPA").empty();
}

bool CICad::IsPaginaIndice(const QString& layer) {
    zvdb::LayerRecord* registro = Layer(layer, nullptr);
    return registro && !registro->xdata("KVR_ZV_INDICE").empty();
}

void CICad::MarcaPagina(const QString& layer, const QString& palavra) {
    zvdb::LayerRecord* registro = Layer(layer, nullptr);
    if (!registro) return;
    const QString aplicacao = palavra == "CAPA"     ? "KVR_ZV_CAPA"
                              : palavra == "INDICE" ? "KVR_ZV_INDICE"
                                                    : QString();
    if (aplicacao.isEmpty()) return;  // no application to write under
    const zvdb::Tag item{1000, registro->database().store(U8(palavra))};
    registro->setXData(U8(aplicacao), std::span<const zvdb::Tag>(&item, 1));
}

// ---- views

bool CICad::Comando(const QStringList& tokens) {
    zvsdk::Document* documento = zvsdk::activeDocument();
    return documento && documento->runCommand(tokens);
}

void CICad::ZoomExtents() {
    Comando({"_.zoom", "_E"});
}

int CICad::Regenera() {
    Comando({"_.regen"});
    return 2;
}

// ---- files

QString CICad::ResolveArquivo(const QString& caminho) {
    QString arquivo = caminho;
    arquivo.replace('\\', '/');
    if (arquivo.endsWith(".dwg", Qt::CaseInsensitive) && !QFileInfo::exists(arquivo)) {
        const QString dxf = arquivo.left(arquivo.size() - 4) + ".dxf";
        if (QFileInfo::exists(dxf)) return dxf;
    }
    return arquivo;
}

bool CICad::ExisteArquivo(const QString& caminho) {
    return !caminho.isEmpty() && QFileInfo::exists(ResolveArquivo(caminho));
}

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

OdDbObjectId CICad::CarregaBloco(const QString& nome, const QString& arquivo) {
    zvdb::Database* db = GetDatabase();
    if (!db || !ExisteArquivo(arquivo)) return {};
    std::unique_ptr<zvdb::Database> lado = LeDesenho(arquivo);
    if (!lado || !ConfereBloco(*lado, nome, arquivo)) return {};
    return Id(InsereComoBloco(*db, *lado, nome));
}

bool CICad::RecarregaBloco(const QString& arquivo, const QString& nome) {
    zvdb::Database* db = GetDatabase();
    if (!db) return false;
    std::unique_ptr<zvdb::Database> lado = ExisteArquivo(arquivo) ? LeDesenho(arquivo) : nullptr;
    if (!lado || !ConfereBloco(*lado, nome, arquivo)) return false;
    zvdb::BlockRecord* existente = db->block(U8(nome));
    if (!existente) return InsereComoBloco(*db, *lado, nome) != nullptr;
    QString temporario;
    do {
        temporario = "ZV_TMP_" + QString::number(QRandomGenerator::global()->bounded(1 << 30));
    } while (db->block(U8(temporario)));
    zvdb::BlockRecord* novo = InsereComoBloco(*db, *lado, temporario);
    if (!novo) return false;
    existente->setBasePoint({});
    for (zvdb::Entity* entidade : existente->entities())
        entidade->erase();
    const std::vector<zvdb::Entity*> fontes = novo->entities();
    zvdb::DeepCloner(*db, *db).cloneEntities(fontes, *existente);
    novo->erase();
    const OdDbObjectId definicao = Id(existente);
    for (zvdb::BlockRecord* dono : {db->modelSpace(), db->paperSpace()}) {
        if (!dono) continue;
        for (zvdb::Entity* entidade : dono->entities()) {
            auto* ref = dynamic_cast<zvdb::BlockReference*>(entidade);
            if (!ref || ref->blockName() != existente->name()) continue;
            std::unique_ptr<zv::CEListaAtributos> valores;
            GetAtributos(Id(ref), valores, true, false);
            for (zvdb::Attribute* atributo : ref->attributes())
                atributo->erase();
            CriarAtributos(definicao, Id(ref));
            if (valores) SetAtributosLista(Id(ref), *valores);
        }
    }
    return true;
}

OdDbObjectId CICad::InsereBloco(const QString& arquivo, const QString& nome, const QString& layer,
                                double x, double y, double z, double rotacao) {
    zvdb::Database* db = GetDatabase();
    if (!db) return {};
    OdDbObjectId bloco;
    if (!GetBlocoId(nome, bloco, db)) bloco = CarregaBloco(nome, arquivo);
    CriaLayer(layer, db);
    auto* definicao = Como<zvdb::BlockRecord>(bloco);
    zvdb::BlockRecord* modelo = db->modelSpace();
    if (!definicao || !modelo) return {};
    // Insertion points and rotations go through single precision on purpose.
    const zvdb::Point3 ponto{Simples(x), Simples(y), Simples(z)};
    const double graus = Simples(rotacao) * 180.0 / M_PI;
    zvdb::BlockReference* ref =
        modelo->addBlockReference(*definicao, ponto, {1, 1, 1}, graus, U8(layer));
    CriarAtributos(bloco, Id(ref));
    return Id(ref);
}

std::unique_ptr<zv::CEListaAtributos> CICad::GetDefinicoesAtributos(const QString& arquivo,
                                                                    const QString& nome) {
    OdDbObjectId id;
    if (!GetBlocoId(nome, id)) id = CarregaBloco(nome, arquivo);
    auto* bloco = Como<zvdb::BlockRecord>(id);
    if (!bloco) return nullptr;
    auto lista = std::make_unique<zv::CEListaAtributos>();
    for (zvdb::Attribute* definicao : bloco->attributeDefinitions()) {
        if (definicao->isConstant()) continue;
        lista->Adicionar(std::make_unique<zv::CEAtributo>(
            Q(definicao->tag()), Q(definicao->prompt()), Q(definicao->textValue()), Id(definicao),
            definicao->isInvisible()));
    }
    return lista;
}

OdDbObjectId CICad::GetReferenciaNoLayer(const QString& nome, const QString& layer) {
    zvdb::Database* db = GetDatabase();
    if (!db || !db->modelSpace()) return {};
    const std::string camada = U8(layer);
    for (zvdb::Entity* entidade : db->modelSpace()->entities()) {
        auto* ref = dynamic_cast<zvdb::BlockReference*>(entidade);
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

bool CICad::GetExtensao(const OdDbObjectId& entidade, double& xMax, double& xMin, double& yMax,
                        double& yMin, bool comAtributos) {
    auto* e = Como<zvdb::Entity>(entidade);
    if (!e) return false;
    const std::string_view tipo = e->type();
    if ((tipo == "TEXT" || tipo == "MTEXT") && !comAtributos) return false;
    zvdb::BoundingBox caixa;
    if (tipo == "ELLIPSE") {
        const zvdb::Point3 centro = e->point(10);
        const double raio = zvdb::length(e->point(11));
        caixa.add(centro - zvdb::Point3{raio, raio, 0});
        caixa.add(centro + zvdb::Point3{raio, raio, 0});
    } else if (tipo == "INSERT" || tipo == "LWPOLYLINE" || tipo == "POLYLINE" || tipo == "LINE" ||
               tipo == "CIRCLE" || tipo == "TEXT" || tipo == "MTEXT") {
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

// ---- attributes

void CICad::GetAtributos(const OdDbObjectId& referencia,
                         std::unique_ptr<zv::CEListaAtributos>& lista, bool comPrompts,
                         bool usarPadroes, const QString& prefixo) {
    lista.reset();
    auto* ref = Como<zvdb::BlockReference>(referencia);
    if (!ref) return;
    const OdDbObjectId bloco = Id(ref->definition());
    lista = std::make_unique<zv::CEListaAtributos>();
    for (zvdb::Attribute* atributo : ref->attributes()) {
        QString tag = Q(atributo->tag());
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
    for (const CEItemXData& item : GetXData(entidade, "KVR_ZV_ATT_VIRTUAL")) {
        QString t, valor;
        bool invisivel = false;
        if (item.codigo == 1000 && LeAtributoVirtual(item.texto, t, valor, invisivel) && t == tag)
            return std::make_unique<zv::CEAtributo>(t, QString(), valor, OdDbObjectId(), invisivel);
    }
    return nullptr;
}

int CICad::GetAtributosVirtuais(const OdDbObjectId& id,
                                std::unique_ptr<zv::CEListaAtributos>& lista) {
    if (id.isNull()) return 1;
    lista = std::make_unique<zv::CEListaAtributos>();
    for (const CEItemXData& item : GetXData(id, "KVR_ZV_ATT_VIRTUAL")) {
        QString tag, valor;
        bool invisivel = false;
        if (item.codigo == 1000 && LeAtributoVirtual(item.texto, tag, valor, invisivel))
            lista->Adicionar(
                std::make_unique<zv::CEAtributo>(tag, QString(), valor, OdDbObjectId(), invisivel));
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
    if (indice < 1 || indice > 3) indice = 1;
    return kTags[int(campo) - 1][indice - 1];
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

void CICad::CriarAtributos(const OdDbObjectId& definicao, const OdDbObjectId& referencia) {
    try {
        auto* bloco = Como<zvdb::BlockRecord>(definicao);
        auto* ref = Como<zvdb::BlockReference>(referencia);
        if (!bloco || !ref) return;
        for (zvdb::Attribute* def : bloco->attributeDefinitions())
            if (!def->isConstant()) ref->addAttributeFromDefinition(*def);
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

std::vector<CEPonto> CICad::GetVertices(const OdDbObjectId& polilinha) {
    std::vector<CEPonto> pontos;
    if (auto* p = Como<zvdb::Polyline>(polilinha))
        for (const zvdb::Point3& v : p->vertices())
            pontos.push_back({v.x, v.y, v.z});
    return pontos;
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
    for (zvdb::BlockRecord* bloco : db->blocks())
        bloco->forEachEntity([&referencias](zvdb::Entity& entidade) {
            if (auto* ref = dynamic_cast<zvdb::BlockReference*>(&entidade))
                referencias[Q(ref->blockName()).toUpper()].push_back(Id(ref));
        });
    return referencias;
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

// ---- extended data, masters, project settings

void CICad::RegistraApp(const QString& aplicacao, zvdb::Database* database) {
    if (zvdb::Database* db = Db(database)) db->registerApplication(U8(aplicacao));
}

bool CICad::TemXData(const OdDbObjectId& id, const QString& aplicacao) {
    zvdb::DbObject* objeto = Objeto(id);
    return objeto && !objeto->xdata(U8(aplicacao)).empty();
}

CEListaXData CICad::GetXData(const OdDbObjectId& id, const QString& aplicacao) {
    zvdb::DbObject* objeto = Objeto(id);
    return objeto ? ConverteXData(objeto->xdata(U8(aplicacao))) : CEListaXData();
}

void CICad::SetXData(const OdDbObjectId& id, const QString& aplicacao, const CEListaXData& itens) {
    zvdb::DbObject* objeto = Objeto(id);
    if (!objeto) return;
    const std::vector<zvdb::Tag> tags = TagsXData(objeto->database(), itens);
    objeto->setXData(U8(aplicacao), tags);
}

OdDbObjectId CICad::IdDoHandle(const QString& handle, zvdb::Database* database) {
    zvdb::Database* db = Db(database);
    const std::uint64_t h = ZVString(handle).ParaHandle();
    zvdb::DbObject* objeto = db && h ? db->objectByHandle(h) : nullptr;
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
            ponto->setXData("KVR_ZV_PAINEL", TagsXData(ponto->database(), paineis));
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
