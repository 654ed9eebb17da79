// The filter of a list run: one item of 30 fields published as `reg`, then
//   (and (= (cdr (assoc "REGUA" reg)) "X1") (wcmatch (cdr (assoc "NUMERO" reg)) "#*"))
// evaluated through the module's bridge, as the template filter does it for every item.
// A run calls this once per item, so it must reach 200,000 evaluations per second.
#include "app/Application.h"
#include "app/ConsoleUserInterface.h"
#include "app/DocumentLisp.h"
#include "app/HostDocument.h"
#include "cad/CICad.h"
#include "readers/CEItemLista.h"

#include <benchmark/benchmark.h>

#include <QString>
#include <QTextStream>

namespace {

const QString kFilter =
    "(and (= (cdr (assoc \"REGUA\" reg)) \"X1\") (wcmatch (cdr (assoc \"NUMERO\" reg)) \"#*\"))";

struct Host {
    QString console;
    QTextStream out{&console};
    QTextStream err{&console};
    zvhost::Application app{std::make_unique<zvhost::ConsoleUserInterface>(out, err, false), out};
    zvhost::HostDocument* document = app.openDocument("bench.dxf");
};

CEItemLista item30() {
    CEItemLista item;
    item.definirCampo("REGUA", "X1");
    item.definirCampo("NUMERO", "12");
    for (int i = 0; item.campos.size() < 30; ++i)
        item.definirCampo("CAMPO" + QString::number(i), "valor " + QString::number(i));
    item.ids.push_back(OdDbObjectId(nullptr, 0x2A));
    return item;
}

// paraLisp, the filter through lispEvaluate, the answer read back: what a run does.
void BM_FilterThroughBridge(benchmark::State& state) {
    Host host;
    const CEItemLista item = item30();
    const QString text = "(progn (setq INVOKELISP_LISTAS_TMP " + kFilter + " ) (princ))";
    int passed = 0;
    for (auto _ : state) {
        item.paraLisp();
        CICad::AvaliaLisp(text);
        zvsdk::ResultBuffer* answer = CICad::LeSimboloLisp("INVOKELISP_LISTAS_TMP");
        passed += answer && answer->restype == zvsdk::RTT;
        CICad::LiberaLista(answer);
    }
    CEItemLista::limparLisp();
    if (passed != int(state.iterations())) state.SkipWithError("the filter did not pass");
    state.counters["evaluations/s"] =
        benchmark::Counter(double(state.iterations()), benchmark::Counter::kIsRate);
}
BENCHMARK(BM_FilterThroughBridge)->Iterations(100000)->Unit(benchmark::kMicrosecond);

// The evaluation alone, `reg` published once.
void BM_FilterEvaluationOnly(benchmark::State& state) {
    Host host;
    item30().paraLisp();
    auto* lisp = dynamic_cast<zvhost::DocumentLisp*>(host.document->lisp());
    zvlisp::Interpreter& in = lisp->interpreter();
    const zvlisp::Value form = in.read(kFilter);
    int passed = 0;
    for (auto _ : state)
        passed += !in.eval(form).isNil();
    if (passed != int(state.iterations())) state.SkipWithError("the filter did not pass");
    state.counters["evaluations/s"] =
        benchmark::Counter(double(state.iterations()), benchmark::Counter::kIsRate);
}
BENCHMARK(BM_FilterEvaluationOnly)->Iterations(100000)->Unit(benchmark::kMicrosecond);

// A user function called in a loop: calls, bindings and integer arithmetic.
void BM_RecursiveFunction(benchmark::State& state) {
    zvlisp::Interpreter in;
    in.evaluate("(defun fib (n) (if (< n 2) n (+ (fib (- n 1)) (fib (- n 2)))))");
    const zvlisp::Value form = in.read("(fib 20)");
    for (auto _ : state)
        benchmark::DoNotOptimize(in.eval(form).asInt());
    state.counters["calls/s"] =
        benchmark::Counter(21891.0 * double(state.iterations()), benchmark::Counter::kIsRate);
}
BENCHMARK(BM_RecursiveFunction)->Unit(benchmark::kMillisecond);

}  // namespace

namespace {
// Publication alone: the item's fields handed to the host as string pairs, `reg` built
// from them.
void BM_PublishOnly(benchmark::State& state) {
    Host host;
    const CEItemLista item = item30();
    for (auto _ : state)
        item.paraLisp();
    state.counters["items/s"] =
        benchmark::Counter(double(state.iterations()), benchmark::Counter::kIsRate);
}
BENCHMARK(BM_PublishOnly)->Iterations(100000)->Unit(benchmark::kMicrosecond);
// A chain built once and converted to `reg` each time: what publication costs on a host
// that takes chains only.
void BM_PutSymbolOnly(benchmark::State& state) {
    Host host;
    zvsdk::ResultBuffer* chain = zvsdk::newNode(zvsdk::RTLB);
    zvsdk::ResultBuffer* tail = chain;
    const CEItemLista item = item30();
    for (auto it = item.campos.constBegin(); it != item.campos.constEnd(); ++it) {
        tail = tail->rbnext = zvsdk::newNode(zvsdk::RTLB);
        tail = tail->rbnext = zvsdk::newString(it.key());
        tail = tail->rbnext = zvsdk::newNode(zvsdk::RTDOTE);
        tail = tail->rbnext = zvsdk::newString(it.value());
        tail = tail->rbnext = zvsdk::newNode(zvsdk::RTLE);
    }
    tail->rbnext = zvsdk::newNode(zvsdk::RTLE);
    for (auto _ : state)
        host.document->lisp()->lispPutSymbol("reg", chain);
    zvsdk::releaseChain(chain);
    state.counters["items/s"] =
        benchmark::Counter(double(state.iterations()), benchmark::Counter::kIsRate);
}
BENCHMARK(BM_PutSymbolOnly)->Iterations(100000)->Unit(benchmark::kMicrosecond);
}  // namespace

BENCHMARK_MAIN();
