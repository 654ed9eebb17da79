// The export writers and the driver's steps on terminal-like items: 20,000 (the bench
// project's size) and 100,000. Each writer makes its whole file; the CSV run is the
// reference that the workbook is held to (goal: the XLSX export within twice its time).
#include "export/CCCsvWriter.h"
#include "export/CCHtmlWriter.h"
#include "export/CCXlsxWriter.h"
#include "export/CCXmlWriter.h"
#include "export/CEExportacao.h"

#include <QTemporaryDir>

#include <benchmark/benchmark.h>

#include <random>

namespace {

constexpr int kCampos = 30;

VetorItens CriaItens(int quantos) {
    std::mt19937 gerador(7);
    VetorItens itens;
    itens.reserve(size_t(quantos));
    for (int i = 0; i < quantos; ++i) {
        auto* item = new CEItemLista;
        item->definirCampo("ZV_LISTA_TIPO", "BORNE");
        item->definirCampo("REGUA", "X" + QString::number(gerador() % 200));
        item->definirCampo("NUMERO", QString::number(gerador() % 500));
        item->definirCampo("DESCRICAO", "Borne de passagem 2,5 mm2 cinza");
        item->definirCampo("RELACAO_INI", "K" + QString::number(gerador() % 900) + ":13");
        item->definirCampo("RELACAO_FIM", "-X" + QString::number(gerador() % 90) + ":" +
                                              QString::number(gerador() % 40));
        item->definirCampo("ZV_KEY", QString::number(7000 + gerador() % 50));
        item->definirCampo("HANDLE", QString::number(0x2A0 + i, 16).toUpper());
        for (int c = 8; c < kCampos; ++c)
            item->definirCampo("CAMPO" + QString::number(c), "valor " + QString::number(gerador()));
        itens.push_back(item);
    }
    return itens;
}

std::vector<CEPropExport> Colunas() {
    std::vector<CEPropExport> colunas;
    for (const char* tag : {"REGUA", "NUMERO", "DESCRICAO", "RELACAO_INI", "RELACAO_FIM", "ZV_KEY"})
        colunas.emplace_back(tag);
    colunas[1].Tamanho = "4";
    colunas[1].Preenche = "0";
    colunas[1].Direita = true;
    return colunas;
}

template <typename Writer>
void Escreve(benchmark::State& estado, const char* nome) {
    const int quantos = int(estado.range(0));
    VetorItens itens = CriaItens(quantos);
    const std::vector<CEPropExport> colunas = Colunas();
    QTemporaryDir pasta;
    CEExportacao exp;
    Writer writer(&exp);
    for (auto _ : estado)
        if (!writer.Escreve(itens, colunas, pasta.filePath(nome))) estado.SkipWithError("write");
    estado.SetItemsProcessed(estado.iterations() * quantos);
    itens.destruirItens();
}

void Csv(benchmark::State& e) {
    Escreve<CCCsvWriter>(e, "b.csv");
}
void Xlsx(benchmark::State& e) {
    Escreve<CCXlsxWriter>(e, "b.xlsx");
}
void Html(benchmark::State& e) {
    Escreve<CCHtmlWriter>(e, "b.html");
}
void Xml(benchmark::State& e) {
    Escreve<CCXmlWriter>(e, "b.xml");
}

// Selection, a filter, the sort by strip and number, and the numbering, on fresh copies.
void Passos(benchmark::State& estado) {
    const int quantos = int(estado.range(0));
    for (auto _ : estado) {
        estado.PauseTiming();
        CEExportacao exp;
        exp.ItensLidos = std::make_unique<VetorItens>(CriaItens(quantos));
        exp.TipoIn = CEExportacao::Bornes;
        exp.Colunas = Colunas();
        exp.Filtros = {{"REGUA", CEFiltroExport::Diferente, "X0"}};
        exp.SetOpcao("FLT_NOME_ORDENAR_POR", "REGUA;NUMERO");
        estado.ResumeTiming();
        exp.Seleciona();
        exp.Ordena();
        benchmark::DoNotOptimize(exp.Agrupa());
        estado.PauseTiming();
        exp.Itens.reset();
        exp.ItensLidos->destruirItens();
        estado.ResumeTiming();
    }
    estado.SetItemsProcessed(estado.iterations() * quantos);
}

}  // namespace

BENCHMARK(Csv)->Arg(20000)->Arg(100000)->Unit(benchmark::kMillisecond);
BENCHMARK(Xlsx)->Arg(20000)->Arg(100000)->Unit(benchmark::kMillisecond);
BENCHMARK(Html)->Arg(20000)->Unit(benchmark::kMillisecond);
BENCHMARK(Xml)->Arg(20000)->Unit(benchmark::kMillisecond);
BENCHMARK(Passos)->Arg(20000)->Arg(100000)->Unit(benchmark::kMillisecond);

BENCHMARK_MAIN();
