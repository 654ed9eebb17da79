// Generation of a stress project: 100,000 terminals with their wires, contacts, masters,
// cables and pages. A timed run: prints the seconds to build the drawing and to write it,
// the file size, and what the project holds; then the same for 10,000 terminals, to show
// that the time grows linearly.
#include "drawing/Database.h"
#include "drawing/DxfWriter.h"
#include "sample/ProjectGenerator.h"

#include <chrono>
#include <cstdio>
#include <filesystem>
#include <string>

namespace {

double seconds(std::chrono::steady_clock::time_point since) {
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - since).count();
}

void run(int terminals) {
    const std::filesystem::path path = std::filesystem::temp_directory_path() /
                                       ("zv_bench_generate_" + std::to_string(terminals) + ".dxf");
    const auto start = std::chrono::steady_clock::now();
    zvsample::ProjectGenerator generator({1, terminals, 10});
    auto database = generator.generate();
    const double built = seconds(start);
    const auto writing = std::chrono::steady_clock::now();
    zvdb::DxfWriter::saveFile(*database, path.string());
    const double written = seconds(writing);
    const auto size = std::filesystem::file_size(path);
    const zvsample::GeneratedCounts& c = generator.counts();
    std::printf(
        "generate %7d terminals: build %6.2f s, write %6.2f s, total %6.2f s, file %.1f MB "
        "(%d pages, %d wires, %d cables, %d leads, %d masters, %d contacts)\n",
        terminals, built, written, built + written, static_cast<double>(size) / 1e6, c.pages,
        c.wires, c.cables, c.leads, c.masters, c.contacts);
    std::filesystem::remove(path);
}

}  // namespace

int main() {
    run(10'000);
    run(100'000);
    return 0;
}
