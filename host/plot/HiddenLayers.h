#pragma once
// The upper-case names of a drawing's layers that are frozen or off, followed from the
// drawing's log of layer edits: a run that shows its pages one by one asks after every page,
// and reading the whole layer table each time would cost pages times layers.
#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <unordered_map>
#include <unordered_set>

namespace zvdb {
class Database;
class DbObject;
}  // namespace zvdb

namespace zvplot {

class HiddenLayers {
public:
    using Names = std::unordered_set<std::string>;
    // The names as the drawing has them now. A set handed out earlier and still held keeps
    // what it said: the next change makes a copy.
    std::shared_ptr<const Names> now(const zvdb::Database& database);

private:
    void readAll(const zvdb::Database& database);

    std::shared_ptr<Names> names_;
    // The layer records and their upper-case names when the table was last read whole.
    std::unordered_map<const zvdb::DbObject*, std::string> recordNames_;
    const zvdb::Database* database_ = nullptr;
    std::uint64_t epoch_ = 0;
    std::uint64_t tableIndexAt_ = 0;
    std::size_t editsSeen_ = 0;
};

}  // namespace zvplot
