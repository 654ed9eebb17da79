#include "CCEntryPoint.h"

#include "catalogue/CEConexaoCatalogo.h"
#include "host/sdk/SystemServices.h"

namespace {

zvsdk::DocumentManager* gerenciadorDocumentos() {
    zvsdk::SystemServices* servicos = zvsdk::systemServices();
    return servicos ? servicos->documentManager() : nullptr;
}

}  // namespace

void CCEntryPoint::initApp() {
    tabela_.clear();
    ordem_.clear();
    RegistrarComandos();
    zvsdk::DocumentManager* gerenciador = gerenciadorDocumentos();
    if (!gerenciador) return;
    gerenciador->addReactor(this);
    for (int i = 0; i < gerenciador->documentCount(); ++i) {
        AdicionarComandos(gerenciador->document(i));
        AoCriarDocumento(gerenciador->document(i));
    }
}

void CCEntryPoint::uninitApp() {
    if (zvsdk::DocumentManager* gerenciador = gerenciadorDocumentos()) {
        for (int i = 0; i < gerenciador->documentCount(); ++i) {
            RemoverComandos(gerenciador->document(i));
            AoDestruirDocumento(gerenciador->document(i));
        }
        gerenciador->removeReactor(this);
    }
    AposDescarregar();
    CEConexaoCatalogo::LiberarCatalogo();
}

void CCEntryPoint::RegistrarComando(const QString& nome, Handler handler) {
    if (!tabela_.contains(nome)) ordem_ << nome;
    tabela_.insert(nome, handler);
}

void CCEntryPoint::documentCreated(zvsdk::Document* documento) {
    AdicionarComandos(documento);
    AoCriarDocumento(documento);
}

void CCEntryPoint::documentToBeDestroyed(zvsdk::Document* documento) {
    RemoverComandos(documento);
    AoDestruirDocumento(documento);
}

void CCEntryPoint::AdicionarComandos(zvsdk::Document* documento) {
    if (!documento) return;
    for (const QString& nome : ordem_)
        documento->addCommand(nome, tabela_.value(nome));
}

void CCEntryPoint::RemoverComandos(zvsdk::Document* documento) {
    if (!documento) return;
    for (const QString& nome : ordem_)
        documento->removeCommand(nome);
}
