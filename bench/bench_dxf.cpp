// Load and save of a large project drawing: 20,000 attributed terminal references and
// 20,000 wires with extended data on 200 page layers (about 25 MB), by the host and by
// ezdxf in the same run. Prints MB/s of both, the ratio, and the host's peak memory.
#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "drawing/Polyline.h"

#include <benchmark/benchmark.h>
#include <malloc.h>

#include <chrono>
#include <cstdio>
#include <fstream>
#include <memory>
#include <sstream>
#include <string>

using namespace zvdb;

namespace {

std::string g_path;
std::string g_bytes;

std::string numbered(const char* prefix, int number) {
    std::string text(prefix);
    text += std::to_string(number);
    return text;
}

std::string makeProject() {
    Database db;
    for (int i = 0; i < 200; ++i)
        db.createLayer(numbered("PAGE$", i));
    BlockRecord* block = db.createBlock("BORNE_SAK", {0, 0, 0});
    block->addLine({0, 0, 0}, {5, 0, 0});
    block->addCircle({2.5, 2.5, 0}, 1.25);
    const char* tags[] = {"REGUA", "NUMERO", "JUMPER", "DESCRICAO", "LIGACAO"};
    for (int t = 0; t < 5; ++t)
        block->addAttributeDefinition(tags[t], tags[t], "", {0, 4.0 + t * 3, 0}, 2.5);
    const auto definitions = block->attributeDefinitions();
    BlockRecord* model = db.modelSpace();
    for (int i = 0; i < 20000; ++i) {
        const std::string layer = numbered("PAGE$", i % 200);
        BlockReference* ref =
            model->addBlockReference(*block, {i * 7.5, (i % 40) * 12.0, 0}, {1, 1, 1}, 0, layer);
        for (Attribute* definition : definitions)
            ref->addAttributeFromDefinition(*definition)->setTextValue(numbered("X", i));
        const std::string key = numbered("SAK 2.5 ", i);
        const Tag data[] = {Tag{1000, key}, Tag{1000, "KVR"}};
        ref->setXData("KVR_ZV", data);
        Polyline* wire = model->addLwPolyline(
            {{i * 7.5, 0, 0}, {i * 7.5, 50, 0}, {i * 7.5 + 20, 50, 0}, {i * 7.5 + 20, 90, 0}},
            false, layer);
        const std::string name = numbered("W", i);
        const Tag wireData[] = {Tag{1000, name}, Tag{1000, "1.5mm2"}, Tag{1070, "3"},
                                Tag{1040, "1.5"}};
        wire->setXData("KVR_ZV_WIRE", wireData);
    }
    return DxfWriter::toText(db);
}

long peakKilobytes() {
    std::ifstream status("/proc/self/status");
    std::string line;
    while (std::getline(status, line))
        if (line.rfind("VmHWM:", 0) == 0) return std::stol(line.substr(6));
    return 0;
}

long currentKilobytes() {
    std::ifstream status("/proc/self/status");
    std::string line;
    while (std::getline(status, line))
        if (line.rfind("VmRSS:", 0) == 0) return std::stol(line.substr(6));
    return 0;
}

void resetPeak() {
    std::ofstream clear("/proc/self/clear_refs");
    clear << "5";
}

template <typename F>
double bestSeconds(int rounds, F&& run) {
    double best = 1e9;
    for (int i = 0; i < rounds; ++i) {
        const auto start = std::chrono::steady_clock::now();
        run();
        best = std::min(
            best, std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count());
    }
    return best;
}

std::string readFile(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

void BM_LoadDxf(benchmark::State& state) {
    for (auto _ : state)
        benchmark::DoNotOptimize(DxfLoader::loadFile(g_path));
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) *
                            static_cast<int64_t>(g_bytes.size()));
}
BENCHMARK(BM_LoadDxf)->Unit(benchmark::kMillisecond)->Iterations(3);

void BM_SaveDxf(benchmark::State& state) {
    auto db = DxfLoader::load(g_bytes);
    for (auto _ : state)
        DxfWriter::saveFile(*db, g_path + ".out");
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) *
                            static_cast<int64_t>(g_bytes.size()));
}
BENCHMARK(BM_SaveDxf)->Unit(benchmark::kMillisecond)->Iterations(3);

// Seconds for ezdxf to read and to write the file, or negative when ezdxf is missing.
std::pair<double, double> ezdxfSeconds() {
    const std::string script =
        "import time,ezdxf,sys\n"
        "t=time.perf_counter(); d=ezdxf.readfile(sys.argv[1]); r=time.perf_counter()-t\n"
        "t=time.perf_counter(); d.saveas(sys.argv[1]+'.ezdxf'); w=time.perf_counter()-t\n"
        "print(r, w)\n";
    const std::string command = "/usr/bin/python3 -c \"" + script + "\" " + g_path;
    FILE* pipe = popen(command.c_str(), "r");
    if (!pipe) return {-1, -1};
    double read = -1, write = -1;
    if (std::fscanf(pipe, "%lf %lf", &read, &write) != 2) read = write = -1;
    pclose(pipe);
    return {read, write};
}

}  // namespace

int main(int argc, char** argv) {
    g_path = "/tmp/zv_bench_project.dxf";
    {
        const std::string text = makeProject();
        std::ofstream(g_path, std::ios::binary) << text;
    }
    g_bytes = readFile(g_path);
    const double megabytes = static_cast<double>(g_bytes.size()) / 1e6;
    std::printf("project drawing: %.1f MB\n", megabytes);

    // Memory first: freed memory goes back to the system, so the growth is the load's own.
    malloc_trim(0);
    const long before = currentKilobytes();
    const std::size_t heapBefore = mallinfo2().uordblks + mallinfo2().hblkhd;
    resetPeak();
    std::unique_ptr<Database> db;
    double load = bestSeconds(1, [&] { db = DxfLoader::loadFile(g_path); });
    const double peak = static_cast<double>(peakKilobytes() - before) / 1024.0;
    const double held =
        static_cast<double>(mallinfo2().uordblks + mallinfo2().hblkhd - heapBefore) / 1e6;

    benchmark::Initialize(&argc, argv);
    benchmark::RunSpecifiedBenchmarks();

    load = std::min(load,
                    bestSeconds(3, [&] { benchmark::DoNotOptimize(DxfLoader::loadFile(g_path)); }));
    const double save = bestSeconds(3, [&] { DxfWriter::saveFile(*db, g_path + ".out"); });
    std::printf("host:  load %.3f s (%.0f MB/s), save %.3f s (%.0f MB/s)\n", load, megabytes / load,
                save, megabytes / save);
    std::printf(
        "host memory: peak of a load %.0f MB (%.1fx the file), held by the drawing %.0f MB\n", peak,
        peak / megabytes, held);
    const auto [ezRead, ezWrite] = ezdxfSeconds();
    if (ezRead < 0) {
        std::printf("ezdxf: not available (/usr/bin/python3 with python3-ezdxf)\n");
    } else {
        std::printf("ezdxf: load %.3f s (%.1f MB/s), save %.3f s (%.1f MB/s)\n", ezRead,
                    megabytes / ezRead, ezWrite, megabytes / ezWrite);
        std::printf("ratio host/ezdxf: load %.0fx, save %.0fx\n", ezRead / load, ezWrite / save);
    }
    std::remove((g_path + ".out").c_str());
    std::remove((g_path + ".ezdxf").c_str());
    benchmark::Shutdown();
    return 0;
}
