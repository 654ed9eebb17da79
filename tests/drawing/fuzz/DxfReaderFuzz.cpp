// libFuzzer target of the DXF reader, ASCII and binary: any input either reads or throws
// DxfError, and what reads can be written and read again. An ASCII input whose tags split is
// read a second time in its binary form, so every mutation reaches both readers. Built only
// with clang (see tests/drawing/CMakeLists); ./zv fuzz runs it over the seeds.
#include "BinaryDxf.h"

#include "drawing/Database.h"
#include "drawing/DxfError.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "drawing/TagReader.h"

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string>

namespace {

void readAndWrite(std::string bytes) {
    try {
        auto database = zvdb::DxfLoader::load(std::move(bytes));
        const std::string written = zvdb::DxfWriter::toText(*database);
        auto again = zvdb::DxfLoader::load(written);
        if (!again->modelSpace()) std::abort();
    } catch (const zvdb::DxfError&) {
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    std::string bytes(reinterpret_cast<const char*>(data), size);
    std::string binary;
    if (!zvdb::TagReader::isBinary(bytes)) {
        try {
            binary = zvfuzz::toBinaryDxf(zvdb::TagReader::readAscii(bytes));
        } catch (const zvdb::DxfError&) {
        }
    }
    readAndWrite(std::move(bytes));
    if (!binary.empty()) readAndWrite(std::move(binary));
    return 0;
}
