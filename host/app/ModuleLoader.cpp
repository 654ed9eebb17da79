#include "ModuleLoader.h"

#include "sdk/RxModule.h"

#include <QFileInfo>

#include <dlfcn.h>

namespace zvhost {

ModuleLoader::ModuleLoader(const QString& path) : path_(path) {}

ModuleLoader::~ModuleLoader() {
    unload();
}

bool ModuleLoader::load(QString* error) {
    const QByteArray file = QFileInfo(path_).absoluteFilePath().toLocal8Bit();
    handle_ = dlopen(file.constData(), RTLD_NOW | RTLD_LOCAL);
    if (!handle_) {
        *error = QString::fromLocal8Bit(dlerror());
        return false;
    }
    auto create = reinterpret_cast<ZvCreateModuleObject>(dlsym(handle_, "odrxCreateModuleObject"));
    auto version = reinterpret_cast<ZvGetApiVersion>(dlsym(handle_, "odrxGetAPIVersion"));
    if (!create || !version) {
        *error = QStringLiteral(
                     "%1 is not a module: it does not export odrxCreateModuleObject "
                     "and odrxGetAPIVersion")
                     .arg(path_);
    } else if (version() != zvsdk::kApiVersion) {
        *error = QStringLiteral("%1 was built for host interface %2; this host has %3")
                     .arg(path_)
                     .arg(version())
                     .arg(zvsdk::kApiVersion);
    } else if (!(module_ = create())) {
        *error = QStringLiteral("%1 did not create its module object").arg(path_);
    }
    if (!module_) {
        dlclose(handle_);
        handle_ = nullptr;
        return false;
    }
    module_->setModuleFileName(file.toStdString());
    return true;
}

void ModuleLoader::initApp() {
    if (!module_ || initialised_) return;
    initialised_ = true;
    module_->initApp();
}

void ModuleLoader::unload() {
    if (module_) {
        if (initialised_) module_->uninitApp();
        module_->deleteModule();
        module_ = nullptr;
        initialised_ = false;
    }
    if (handle_) {
        dlclose(handle_);
        handle_ = nullptr;
    }
}

}  // namespace zvhost
