// libFuzzer target of the export configuration file's reader and writer. What must hold:
// a text is refused exactly when a line is longer than the limit, and then the list is
// left as it was; what was read writes out as a text that, when no line of it grew past
// the limit, reads back with the same configurations and writes out the same again.
//   build-fuzz/tests/exportcfg_fuzz -max_total_time=600 WORKDIR tests/export/fuzz/corpus
#include "export/CEExportConfigs.h"

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>

namespace {

void Falha(const char* porque) {
    std::fprintf(stderr, "export configuration file: %s\n", porque);
    std::abort();
}

QStringList Nomes(const CEExportConfigs& c) {
    QStringList nomes;
    for (const auto& config : c.Configs)
        nomes << config->Nome;
    return nomes;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const QByteArray bytes(reinterpret_cast<const char*>(data), int(size));
    CEExportConfigs configs;
    configs.ObtemSecao("antes", "BORNES");
    const bool lido = configs.LeTexto(bytes);
    if (lido != (CEExportConfigs::LinhaMaisLonga(bytes) <= CEExportConfigs::kMaxLinha))
        Falha("a text was refused or taken against its line lengths");
    if (!lido) {
        if (configs.Configs.size() != 1 || !configs.Config("antes"))
            Falha("a refused text changed the list");
        return 0;
    }
    const QByteArray escrito = configs.Texto();
    if (CEExportConfigs::LinhaMaisLonga(escrito) > CEExportConfigs::kMaxLinha) return 0;
    CEExportConfigs volta;
    if (!volta.LeTexto(escrito)) Falha("a written text does not read back");
    if (Nomes(volta) != Nomes(configs)) Falha("configurations changed in a round trip");
    CEExportConfigs terceira;
    if (!terceira.LeTexto(volta.Texto()) || Nomes(terceira) != Nomes(volta))
        Falha("a second round trip changed the configurations");
    return 0;
}
