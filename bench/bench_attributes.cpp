// Inserting block references with their attributes, as the list writers do (one reference a
// row, its attributes made from the block's definitions, then their values set), made in one
// pass against the step-by-step way (a bare attribute, then its properties set one by one),
// and in one pass with the values given as the attributes are made.
// Each way runs in a child process of its own, so that its processor time and the memory it
// adds are its alone. Usage: bench_attributes [references], 100,000 by default.
#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "tests/drawing/StepByStepAttribute.h"

#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

using namespace zvdb;

namespace {

double cpuSeconds() {
    rusage use{};
    getrusage(RUSAGE_SELF, &use);
    const auto seconds = [](const timeval& t) {
        return double(t.tv_sec) + double(t.tv_usec) / 1e6;
    };
    return seconds(use.ru_utime) + seconds(use.ru_stime);
}

long peakKb() {
    rusage use{};
    getrusage(RUSAGE_SELF, &use);
    return use.ru_maxrss;
}

enum class Way { StepByStep, OnePass, WithValues };

void run(Way way, int references) {
    Database db;
    db.createLayer("LISTAS$0001$A");
    BlockRecord* row = db.createBlock("BLK_DET");
    const char* tags[] = {"VARIAVEL_NUMERO", "VARIAVEL_ORIGEM", "VARIAVEL_DESTINO",
                          "VARIAVEL_CABO",   "VARIAVEL_SECAO",  "FUNCAO_COR"};
    double x = 0;
    for (const char* tag : tags)
        row->addAttributeDefinition(tag, "", "CAMPO", {x += 20, -3.5, 0}, 2.0);
    std::vector<const Attribute*> definitions;
    for (Attribute* definition : row->attributeDefinitions())
        definitions.push_back(definition);
    const long before = peakKb();
    const double start = cpuSeconds();
    for (int i = 0; i < references; ++i) {
        BlockReference* reference = db.modelSpace()->addBlockReference(
            *row, {15, 262.0 - 3.5 * (i % 70), 0}, {1, 1, 1}, 0, "LISTAS$0001$A");
        const std::string value = std::to_string(i);
        if (way == Way::WithValues) {
            const std::vector<std::optional<std::string_view>> values(definitions.size(), value);
            reference->addAttributesFromDefinitions(definitions, values);
            continue;
        }
        if (way == Way::OnePass) {
            reference->addAttributesFromDefinitions(definitions);
        } else {
            for (const Attribute* definition : definitions)
                madeStepByStep(*reference, *definition, true);
        }
        for (Attribute* attribute : reference->attributes())
            attribute->setTextValue(value);
    }
    const double cpu = cpuSeconds() - start;
    const char* name = way == Way::StepByStep ? "step by step"
                       : way == Way::OnePass  ? "one pass"
                                              : "with values";
    std::printf("%-13s %9d %10zu %9.3f %9.2f %10.1f\n", name, references,
                std::size_t(references) * definitions.size(), cpu,
                1e6 * cpu / (double(references) * double(definitions.size())),
                double(peakKb() - before) / 1024.0);
    std::fflush(stdout);
}

}  // namespace

int main(int argc, char** argv) {
    const int references = argc > 1 ? std::atoi(argv[1]) : 100000;
    std::printf("%-13s %9s %10s %9s %9s %10s\n", "way", "refs", "attributes", "cpu s", "us/attr",
                "added MB");
    std::fflush(stdout);
    for (const Way way : {Way::StepByStep, Way::OnePass, Way::WithValues}) {
        const pid_t child = fork();
        if (child == 0) {
            run(way, references);
            std::_Exit(0);
        }
        int status = 0;
        waitpid(child, &status, 0);
        if (!WIFEXITED(status) || WEXITSTATUS(status) != 0) return 1;
    }
    return 0;
}
