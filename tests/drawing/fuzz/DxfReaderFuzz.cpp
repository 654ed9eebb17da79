// libFuzzer target of the DXF reader, ASCII and binary: see ReaderOracle.h for what every
// input must do. Built only with clang (see tests/drawing/CMakeLists):
//   build-fuzz/tests/dxf_fuzz -max_total_time=600 NEW_FOLDER tests/drawing/fuzz/corpus
//       tests/drawing/foreign
// An input that fails goes, made small, to tests/drawing/fuzz/regressions.
#include "../ReaderOracle.h"

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string problem =
        zvtest::readerProblem(std::string(reinterpret_cast<const char*>(data), size));
    if (problem.empty()) return 0;
    std::fprintf(stderr, "%s\n", problem.c_str());
    std::abort();
}
