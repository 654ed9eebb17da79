// Connections of generated projects: getConexoesTodosFios on a project of about 25,000 and
// of about 100,000 wire segments. A timed run: prints the best of three times for each and
// their ratio, which stays under 5 when the work grows linearly.
#include "drawing/Database.h"
#include "lisp/Interpreter.h"
#include "product/ProductLisp.h"
#include "sample/ProjectGenerator.h"

#include <algorithm>
#include <chrono>
#include <cstdio>

namespace {

struct Figures {
    int segments = 0;
    int wires = 0;
    double seconds = 0;
};

int segmentsFor(int terminals) {
    zvsample::ProjectGenerator generator({1, terminals, 10});
    generator.generate();
    return generator.counts().wirePolylines;
}

Figures run(int segments, double segmentsPerTerminal) {
    const int terminals = static_cast<int>(segments / segmentsPerTerminal);
    zvsample::ProjectGenerator generator({1, terminals, 10});
    auto database = generator.generate();
    zvlisp::Interpreter lisp;
    zvproduct::ProductContext context;
    context.database = [&database] { return database.get(); };
    zvproduct::installProductFunctions(lisp, context);
    Figures figures{generator.counts().wirePolylines, 0, 1e9};
    for (int i = 0; i < 3; ++i) {
        const auto start = std::chrono::steady_clock::now();
        const zvlisp::Value result = lisp.call("getConexoesTodosFios", {});
        const double took =
            std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
        figures.seconds = std::min(figures.seconds, took);
        figures.wires = static_cast<int>(lisp.toVector(result).size());
    }
    std::printf("getConexoesTodosFios: %6d wire segments (%d terminals, %d wires): %.3f s\n",
                figures.segments, terminals, figures.wires, figures.seconds);
    return figures;
}

}  // namespace

int main() {
    const double perTerminal = segmentsFor(2000) / 2000.0;
    const Figures small = run(25'000, perTerminal);
    const Figures large = run(100'000, perTerminal);
    std::printf("ratio %.2f for %.2f times the segments (must stay under 5)\n",
                large.seconds / small.seconds,
                static_cast<double>(large.segments) / small.segments);
    return large.seconds / small.seconds < 5.0 ? 0 : 1;
}
