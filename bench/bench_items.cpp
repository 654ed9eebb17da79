// Sorting 100,000 items of 30 fields by three keys, and merging two 100,000-item vectors.
#include "readers/VetorItens.h"

#include <benchmark/benchmark.h>

#include <random>

namespace {

constexpr int kItens = 100000;
constexpr int kCampos = 30;

// Terminal-like items: strip names and numbers in natural order, pages, free fields.
VetorItens CriaItens(unsigned semente) {
    std::mt19937 gerador(semente);
    VetorItens itens;
    itens.reserve(kItens);
    for (int i = 0; i < kItens; ++i) {
        auto* item = new CEItemLista;
        item->definirCampo("REGUA", "X" + QString::number(gerador() % 200));
        item->definirCampo("NUMERO", QString::number(gerador() % 500));
        item->definirCampo("PAGINA", QString::number(gerador() % 5000).rightJustified(4, '0'));
        for (int c = 3; c < kCampos; ++c)
            item->definirCampo("CAMPO" + QString::number(c), "valor " + QString::number(gerador()));
        itens.push_back(item);
    }
    return itens;
}

void OrdenarTresChaves(benchmark::State& estado) {
    VetorItens itens = CriaItens(1);
    std::mt19937 gerador(2);
    for (auto _ : estado) {
        estado.PauseTiming();
        std::shuffle(itens.begin(), itens.end(), gerador);
        estado.ResumeTiming();
        itens.ordenar({"REGUA", "NUMERO", "PAGINA"});
    }
    estado.SetItemsProcessed(estado.iterations() * kItens);
    itens.destruirItens();
}

void JuntarSemRepetir(benchmark::State& estado) {
    VetorItens a = CriaItens(3);
    VetorItens b = CriaItens(4);
    // Half of the source is already in the destination.
    VetorItens origem(b.begin(), b.begin() + kItens / 2);
    origem.insert(origem.end(), a.begin(), a.begin() + kItens / 2);
    for (auto _ : estado) {
        VetorItens destino = a;
        destino.juntarSemRepetir(origem);
        benchmark::DoNotOptimize(destino.data());
    }
    estado.SetItemsProcessed(estado.iterations() * 2 * kItens);
    a.destruirItens();
    b.destruirItens();
}

}  // namespace

BENCHMARK(OrdenarTresChaves)->Unit(benchmark::kMillisecond);
BENCHMARK(JuntarSemRepetir)->Unit(benchmark::kMillisecond);
BENCHMARK_MAIN();
