#pragma once
// The host application: open documents in order, the active one, the reactors told of
// their lives, the loaded modules and the user interface.
#include "sdk/DocumentManager.h"
#include "sdk/SystemServices.h"

#include <QHash>
#include <QStringList>
#include <QTextStream>

#include <functional>
#include <memory>
#include <vector>

namespace zvdb {
class Database;
}

namespace zvhost {

class HostDocument;
class ModuleLoader;

class Application : public zvsdk::SystemServices, public zvsdk::DocumentManager {
public:
    // The command line goes to `out`; the application becomes the host's system services.
    Application(std::unique_ptr<zvsdk::UserInterface> ui, QTextStream& out);
    ~Application() override;
    static Application* instance();

    // SystemServices
    zvsdk::DocumentManager* documentManager() override { return this; }
    zvsdk::UserInterface* userInterface() override { return ui_.get(); }
    QString executableFolder() const override;
    void setExecutableFolder(const QString& folder) { executableFolder_ = folder; }

    // DocumentManager
    int documentCount() const override { return int(documents_.size()); }
    zvsdk::Document* document(int index) const override;
    zvsdk::Document* activeDocument() const override;
    void addReactor(zvsdk::DocumentManagerReactor* reactor) override;
    void removeReactor(zvsdk::DocumentManagerReactor* reactor) override;

    // Opens a document on a database (a new, empty one when null); it becomes active.
    HostDocument* openDocument(const QString& fileName, std::unique_ptr<zvdb::Database> database);
    HostDocument* openDocument(const QString& fileName);
    void closeDocument(HostDocument* document);
    void setActiveDocument(HostDocument* document);
    HostDocument* hostDocument(int index) const { return documents_.at(size_t(index)).get(); }

    // Loads a module file and runs its initApp; false with `error` set when it fails.
    bool loadModule(const QString& path, QString* error);
    // Runs uninitApp of every loaded module, newest first, and unloads them.
    void unloadModules();

    // Host commands reached from their tokens ("_.zoom" "_W" ...).
    using HostCommand = std::function<bool(HostDocument&, const QStringList& args)>;
    void registerHostCommand(const QString& name, HostCommand command);
    bool runHostCommand(HostDocument& document, const QStringList& tokens);
    bool hasHostCommand(const QString& name) const;

    // Called for every new document, before the reactors, so the host's own services
    // (LISP environment, product functions) are there when modules see it.
    void setDocumentSetup(std::function<void(HostDocument&)> setup);

    // The command line: text exactly as given.
    void commandLine(const QString& text);

private:
    std::unique_ptr<zvsdk::UserInterface> ui_;
    QTextStream& out_;
    QString executableFolder_;
    std::vector<std::unique_ptr<HostDocument>> documents_;
    HostDocument* active_ = nullptr;
    std::vector<zvsdk::DocumentManagerReactor*> reactors_;
    std::vector<std::unique_ptr<ModuleLoader>> modules_;
    QHash<QString, HostCommand> hostCommands_;
    std::function<void(HostDocument&)> documentSetup_;
};

}  // namespace zvhost
