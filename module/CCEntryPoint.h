#pragma once
// Reusable plug-in base: keeps a command table and puts its commands on every open
// document and on every later one.
#include "host/sdk/Document.h"
#include "host/sdk/DocumentManager.h"
#include "host/sdk/RxModule.h"

#include <QHash>
#include <QString>
#include <QStringList>

class CCEntryPoint : public zvsdk::RxModule, public zvsdk::DocumentManagerReactor {
public:
    using Handler = int (*)();

    void initApp() override;
    void uninitApp() override;

    // Registering a name a second time replaces its handler and keeps its place.
    void RegistrarComando(const QString& nome, Handler handler);
    const QStringList& NomesComandos() const { return ordem_; }
    Handler HandlerDe(const QString& nome) const { return tabela_.value(nome, nullptr); }

    void documentCreated(zvsdk::Document* documento) override;
    void documentToBeDestroyed(zvsdk::Document* documento) override;

protected:
    virtual void RegistrarComandos() = 0;
    virtual void AposDescarregar() = 0;
    virtual void AoCriarDocumento(zvsdk::Document* documento) = 0;
    virtual void AoDestruirDocumento(zvsdk::Document* documento) = 0;

private:
    void AdicionarComandos(zvsdk::Document* documento);
    void RemoverComandos(zvsdk::Document* documento);

    QHash<QString, Handler> tabela_;
    QStringList ordem_;
};
