// libFuzzer target of the DXF reader: any input either reads or throws DxfError, and what
// reads can be written and read again. Built only with clang (see tests/drawing/CMakeLists):
//   build-clang/tests/dxf_fuzz -max_total_time=600 tests/drawing/fuzz/corpus
#include "drawing/Database.h"
#include "drawing/DxfError.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    std::string bytes(reinterpret_cast<const char*>(data), size);
    try {
        auto database = zvdb::DxfLoader::load(std::move(bytes));
        const std::string written = zvdb::DxfWriter::toText(*database);
        auto again = zvdb::DxfLoader::load(written);
        if (!again->modelSpace()) std::abort();
    } catch (const zvdb::DxfError&) {
    }
    return 0;
}
