#pragma once
// The module object a loadable module hands the host, and its exported entry points.
#include <string>

namespace zvsdk {

// Raised by a change that breaks modules built against an older host.
constexpr int kApiVersion = 1;

class RxModule {
public:
    virtual ~RxModule() = default;
    virtual void initApp() = 0;
    virtual void uninitApp() = 0;
    // Called by the host after uninitApp, when the module is about to be unloaded.
    virtual void deleteModule() = 0;
    // The path of the module's file, set by the host when it loads it.
    void setModuleFileName(const std::string& path) { moduleFileName_ = path; }
    const std::string& moduleFileName() const { return moduleFileName_; }

private:
    std::string moduleFileName_;
};

}  // namespace zvsdk

// Every module exports these two with C linkage.
extern "C" {
using ZvCreateModuleObject = zvsdk::RxModule* (*)();
using ZvGetApiVersion = int (*)();
}
