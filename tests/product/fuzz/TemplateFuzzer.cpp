// libFuzzer target of the template reader: any bytes as a list template, loaded by
// ZVCarregaTemplate into a document's LISP with the product functions, bounded work and no
// files written (see TemplateFuzzing.h). Built only with clang; ./zv fuzz runs it over the
// product's templates.
#include "../TemplateFuzzing.h"

#include <cstddef>
#include <cstdint>
#include <cstdlib>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static TemplateFuzzing fuzzing(ZV_SOURCE_DIR "/data/templates");
    if (!fuzzing.ready()) std::abort();
    const QByteArray bytes(reinterpret_cast<const char*>(data), int(size));
    if (!fuzzing.run(bytes).stillWorks) std::abort();
    return 0;
}
