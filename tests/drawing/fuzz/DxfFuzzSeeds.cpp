// Seeds of the DXF fuzzer, made by the project's own generator: small sample projects, the
// product data's block drawings and the files given on the command line, each in its ASCII
// and its binary form.
//   dxf_fuzz_seeds OUTDIR [FILE.dxf ...]
#include "../BinaryDxf.h"

#include "drawing/Database.h"
#include "drawing/DxfError.h"
#include "drawing/DxfWriter.h"
#include "drawing/TagReader.h"
#include "sample/ProductDataWriter.h"
#include "sample/ProjectGenerator.h"

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

namespace fs = std::filesystem;

namespace {

std::string contentOf(const fs::path& path) {
    std::ifstream in(path, std::ios::binary);
    return std::string(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
}

void writeFile(const fs::path& path, const std::string& bytes) {
    std::ofstream out(path, std::ios::binary);
    out << bytes;
    if (!out.flush()) throw zvdb::DxfError("could not write " + path.string());
}

// The file as it is, and its binary form when it is ASCII.
int addSeed(const fs::path& folder, const std::string& name, const std::string& bytes) {
    writeFile(folder / (name + ".dxf"), bytes);
    if (zvdb::TagReader::isBinary(bytes)) return 1;
    writeFile(folder / (name + ".bin.dxf"), zvtest::binaryDxf(bytes));
    return 2;
}

}  // namespace

int main(int argc, char** argv) {
    if (argc < 2) {
        std::fprintf(stderr, "usage: dxf_fuzz_seeds OUTDIR [FILE.dxf ...]\n");
        return 2;
    }
    try {
        const fs::path folder = argv[1];
        fs::create_directories(folder);
        int seeds = 0;
        for (int i = 2; i < argc; ++i)
            seeds += addSeed(folder, fs::path(argv[i]).stem().string(), contentOf(argv[i]));
        // Projects of a page or two: every kind of symbol, wire, cable and page record, in
        // files small enough for the fuzzer to mutate quickly.
        for (std::uint64_t seed = 1; seed <= 3; ++seed) {
            zvsample::GeneratorOptions options;
            options.seed = seed;
            options.terminals = 4 + int(seed) * 2;
            options.pages = 1;
            options.projectNumbers = seed == 2;
            auto database = zvsample::ProjectGenerator(options).generate();
            seeds += addSeed(folder, "project-" + std::to_string(seed),
                             zvdb::DxfWriter::toText(*database));
        }
        // The block drawings, the smallest first: a few of each kind are enough.
        const fs::path blocks = folder / "blocks.tmp";
        std::vector<std::string> files = zvsample::ProductDataWriter(blocks.string()).writeAll();
        std::sort(files.begin(), files.end(), [](const std::string& a, const std::string& b) {
            return fs::file_size(a) < fs::file_size(b);
        });
        for (std::size_t i = 0; i < files.size(); i += std::max<std::size_t>(1, files.size() / 8))
            seeds +=
                addSeed(folder, "block-" + fs::path(files[i]).stem().string(), contentOf(files[i]));
        fs::remove_all(blocks);
        std::printf("%d seeds in %s\n", seeds, folder.c_str());
    } catch (const std::exception& error) {
        std::fprintf(stderr, "dxf_fuzz_seeds: %s\n", error.what());
        return 1;
    }
    return 0;
}
