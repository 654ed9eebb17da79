// libFuzzer target of the settings file reader and its save (see ConfereRegistro.h for what
// must hold). Built only with clang (see tests/settings/CMakeLists.txt):
//   build-clang/tests/settings_fuzz -max_total_time=600 WORKDIR tests/settings/fuzz/corpus
#include "ConfereRegistro.h"

#include <QDir>
#include <QTemporaryDir>

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>

namespace {
QTemporaryDir* pasta = nullptr;
}

extern "C" int LLVMFuzzerInitialize(int*, char***) {
    // A folder in memory when there is one: every input writes and saves the file.
    const QString base = QDir("/dev/shm").exists() ? QStringLiteral("/dev/shm") : QDir::tempPath();
    pasta = new QTemporaryDir(base + "/zv-settings-fuzz-XXXXXX");
    if (!pasta->isValid() || !QDir().mkpath(pasta->path() + "/FV")) std::abort();
    qputenv("ZV_DATA_DIR", pasta->path().toUtf8());
    std::atexit([] { delete pasta; });
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const QString falha =
        ConfereRegistro(QByteArray(reinterpret_cast<const char*>(data), int(size)));
    if (!falha.isEmpty()) {
        std::fprintf(stderr, "settings file: %s\n", falha.toUtf8().constData());
        std::abort();
    }
    return 0;
}
