#include "CICad.h"
#include "CICadInterno.h"

#include "drawing/BlockRecord.h"
#include "drawing/Entity.h"
#include "host/sdk/Document.h"
#include "host/sdk/SystemServices.h"
#include "readers/ZVString.h"

#include <QFileInfo>
#include <QStringList>

using namespace cicad;

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

bool CICad::ExisteGrupo(const QString& grupo) {
    zvsdk::ResultBuffer* grupos = zvInvokeLista("buscaListaGrupos");
    bool existe = false;
    for (const zvsdk::ResultBuffer* no = grupos; no && !existe; no = no->rbnext)
        existe = no->restype == zvsdk::RTSTR && no->rstring == grupo;
    LiberaLista(grupos);
    return existe;
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
