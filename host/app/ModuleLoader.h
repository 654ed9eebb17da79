#pragma once
// One loadable module: the shared library, its module object and its life.
#include <QString>

namespace zvsdk {
class RxModule;
}

namespace zvhost {

class ModuleLoader {
public:
    explicit ModuleLoader(const QString& path);
    ~ModuleLoader();
    ModuleLoader(const ModuleLoader&) = delete;
    ModuleLoader& operator=(const ModuleLoader&) = delete;

    // Opens the library and creates its module object; false with `error` when it can't.
    bool load(QString* error);
    void initApp();
    // uninitApp, then the module object goes and the library is closed.
    void unload();
    zvsdk::RxModule* module() const { return module_; }

private:
    QString path_;
    void* handle_ = nullptr;
    zvsdk::RxModule* module_ = nullptr;
    bool initialised_ = false;
};

}  // namespace zvhost
