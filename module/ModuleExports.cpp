// The module's two exported entry points.
#include "CZVListasApp.h"

extern "C" __attribute__((visibility("default"))) zvsdk::RxModule* odrxCreateModuleObject() {
    return CZVListasApp::CriarInstancia();
}

extern "C" __attribute__((visibility("default"))) int odrxGetAPIVersion() {
    return zvsdk::kApiVersion;
}
