// libFuzzer entry: any bytes through the reader and the evaluator, sandboxed as in the
// robustness test. Built only with clang: cmake --build . --target lisp_fuzzer, then
// tests/lisp_fuzzer -max_total_time=60
#include "../LispFuzzing.h"

#include <cstddef>
#include <cstdint>
#include <cstdlib>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const QByteArray bytes(reinterpret_cast<const char*>(data), int(size));
    if (!LispFuzzing::run(bytes).stillWorks) std::abort();
    return 0;
}
