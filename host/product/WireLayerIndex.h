#pragma once
// The wire and lead polylines of each layer, gathered in one pass and kept while the drawing
// gains no object: the readers ask for every page in turn, and each answer is then a look-up.
// Erased polylines, and polylines moved to another layer, are left out of the answers.
#include <cstdint>
#include <string>
#include <unordered_map>
#include <vector>

namespace zvdb {
class Database;
}

namespace zvproduct {

class WireLayerIndex {
public:
    // Handle order.
    std::vector<std::uint64_t> polylinesOn(zvdb::Database& database, const std::string& layer);

private:
    void rebuild(zvdb::Database& database);

    const zvdb::Database* database_ = nullptr;
    std::uint64_t handleSeed_ = 0;
    std::size_t objectCount_ = 0;
    std::unordered_map<std::string, std::vector<std::uint64_t>> byLayer_;
};

}  // namespace zvproduct
