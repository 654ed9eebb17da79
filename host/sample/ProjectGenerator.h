#pragma once
// Writes a complete sample project of a control panel into a new drawing: a cover and an
// index, a power page, control pages with component masters, contacts, equipments, pins,
// terminals on strips, wires, ferrules and cables, virtual objects, a panel layout with wire
// routes, the page registry, the settings point and the version stamp. The format is told in
// docs/project-format.md. The same options give the same drawing, handle for handle.
#include <cstdint>
#include <memory>

namespace zvdb {
class Database;
}

namespace zvsample {

struct GeneratorOptions {
    std::uint64_t seed = 1;
    int terminals = 120;  // all terminals: drawn, BOR- and virtual ones
    int pages = 10;       // at least; more when the terminals need them
    // Terminal numbers run on through the project instead of starting again on each strip,
    // so that no number stands twice and the terminal list links the jumpers.
    bool projectNumbers = false;
};

// What a generated project holds.
struct GeneratedCounts {
    int terminals = 0;         // drawn and virtual
    int virtualTerminals = 0;  // in ESQ_VIRTUAL_ZV
    int borTerminals = 0;      // drawn with a BOR- block
    int wires = 0;             // distinct wire numbers
    int wirePolylines = 0;
    int cables = 0;
    int leads = 0;
    int blindConnections = 0;
    int pages = 0;
    int masters = 0;
    int contacts = 0;
    int routes = 0;  // CELayoutRotasFios records
};

class ProjectGenerator {
public:
    // Pages are placed on the grid of a control page: this many terminal columns at most.
    static constexpr int kColumnsPerPage = 24;

    explicit ProjectGenerator(const GeneratorOptions& options);
    ~ProjectGenerator();
    ProjectGenerator(const ProjectGenerator&) = delete;
    ProjectGenerator& operator=(const ProjectGenerator&) = delete;

    std::unique_ptr<zvdb::Database> generate();
    const GeneratedCounts& counts() const;

private:
    class Impl;
    std::unique_ptr<Impl> impl_;
};

}  // namespace zvsample
