#include "Application.h"

#include "DocumentLisp.h"
#include "DocumentSetup.h"
#include "HostDocument.h"
#include "ModuleLoader.h"
#include "PlotCommands.h"
#include "UndoCommands.h"
#include "ViewCommands.h"
#include "drawing/Database.h"
#include "sdk/UserInterface.h"

#include <QCoreApplication>

#include <algorithm>

namespace zvhost {

namespace {
Application* theApplication = nullptr;
}

Application::Application(std::unique_ptr<zvsdk::UserInterface> ui, QTextStream& out)
    : ui_(std::move(ui)), out_(out) {
    theApplication = this;
    registerViewCommands(*this);
    registerUndoCommands(*this);
    registerPlotCommands(*this);
}

Application::~Application() {
    unloadModules();
    while (!documents_.empty())
        closeDocument(documents_.back().get());
    if (theApplication == this) theApplication = nullptr;
}

Application* Application::instance() {
    return theApplication;
}

QString Application::executableFolder() const {
    if (!executableFolder_.isEmpty()) return executableFolder_;
    return QCoreApplication::instance() ? QCoreApplication::applicationDirPath() : QString();
}

zvsdk::Document* Application::document(int index) const {
    if (index < 0 || index >= documentCount()) return nullptr;
    return documents_[size_t(index)].get();
}

zvsdk::Document* Application::activeDocument() const {
    return active_;
}

void Application::addReactor(zvsdk::DocumentManagerReactor* reactor) {
    if (std::find(reactors_.begin(), reactors_.end(), reactor) == reactors_.end())
        reactors_.push_back(reactor);
}

void Application::removeReactor(zvsdk::DocumentManagerReactor* reactor) {
    reactors_.erase(std::remove(reactors_.begin(), reactors_.end(), reactor), reactors_.end());
}

HostDocument* Application::openDocument(const QString& fileName) {
    return openDocument(fileName, nullptr);
}

HostDocument* Application::openDocument(const QString& fileName,
                                        std::unique_ptr<zvdb::Database> database) {
    if (!database) database = std::make_unique<zvdb::Database>();
    documents_.push_back(std::make_unique<HostDocument>(*this, fileName, std::move(database)));
    HostDocument* document = documents_.back().get();
    setUpDocument(*document);
    if (documentSetup_) documentSetup_(*document);
    // A reactor may remove itself while it is told: walk a copy.
    const auto reactors = reactors_;
    for (auto* reactor : reactors)
        reactor->documentCreated(document);
    setActiveDocument(document);
    return document;
}

void Application::closeDocument(HostDocument* document) {
    const auto reactors = reactors_;
    for (auto* reactor : reactors)
        reactor->documentToBeDestroyed(document);
    auto it = std::find_if(documents_.begin(), documents_.end(),
                           [document](const auto& d) { return d.get() == document; });
    if (it == documents_.end()) return;
    documents_.erase(it);
    if (active_ == document)
        setActiveDocument(documents_.empty() ? nullptr : documents_.back().get());
}

void Application::setActiveDocument(HostDocument* document) {
    active_ = document;
    if (!document) return;
    const auto reactors = reactors_;
    for (auto* reactor : reactors)
        reactor->documentActivated(document);
}

bool Application::loadModule(const QString& path, QString* error) {
    auto module = std::make_unique<ModuleLoader>(path);
    if (!module->load(error)) return false;
    modules_.push_back(std::move(module));
    modules_.back()->initApp();
    return true;
}

void Application::unloadModules() {
    for (const auto& document : documents_)
        if (auto* lisp = dynamic_cast<DocumentLisp*>(document->lisp())) lisp->forgetPairs();
    while (!modules_.empty()) {
        modules_.back()->unload();
        modules_.pop_back();
    }
}

void Application::registerHostCommand(const QString& name, HostCommand command) {
    hostCommands_.insert(name.toUpper(), std::move(command));
}

namespace {

// "_." and "_" only say: the command's global, built-in name.
QString globalName(const QString& token) {
    QString name = token.toUpper();
    while (name.startsWith('_') || name.startsWith('.'))
        name.remove(0, 1);
    return name;
}

}  // namespace

bool Application::hasHostCommand(const QString& name) const {
    return hostCommands_.contains(globalName(name));
}

bool Application::runHostCommand(HostDocument& document, const QStringList& tokens) {
    if (tokens.isEmpty()) return false;
    const QString name = globalName(tokens.first());
    auto it = hostCommands_.constFind(name);
    if (it == hostCommands_.constEnd()) return false;
    return it.value()(document, tokens.mid(1));
}

void Application::setDocumentSetup(std::function<void(HostDocument&)> setup) {
    documentSetup_ = std::move(setup);
}

void Application::commandLine(const QString& text) {
    out_ << text;
    out_.flush();
}

}  // namespace zvhost

namespace zvsdk {

SystemServices* systemServices() {
    return zvhost::Application::instance();
}

Document* activeDocument() {
    auto* app = zvhost::Application::instance();
    return app ? app->activeDocument() : nullptr;
}

}  // namespace zvsdk
