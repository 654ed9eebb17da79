#pragma once
// The pages that criarpagina adds one after the other. A list makes all its pages in a row;
// reading every group's pages again for each new one would cost the square of the page
// count, so the registry read for the first page serves the next ones while nothing but
// these calls has changed the drawing.
#include "PageRegistry.h"

#include <cstdint>
#include <optional>
#include <string>
#include <unordered_map>
#include <unordered_set>
#include <utility>
#include <vector>

namespace zvdb {
class Database;
class DbObject;
}  // namespace zvdb

namespace zvproduct {

class PageAppender {
public:
    struct Page {
        std::string name;
        int running = 0;  // its number across the project, from 1
    };
    // Makes the group's next page layer and registers it (the group too, when new).
    Page append(zvdb::Database& database, const std::string& group);
    // Call when the call that appended is done with the drawing.
    void settle(zvdb::Database& database);
    // The registry changed behind the appender's back.
    void forget() { registry_.reset(); }

    // The number of "GROUP$NNNN$A", 0 when there is none.
    static int pageNumber(const std::string& layer);

private:
    using Fingerprint = std::vector<std::pair<const zvdb::DbObject*, std::size_t>>;
    static Fingerprint fingerprint(zvdb::Database& database);
    bool current(zvdb::Database& database) const;
    void load(zvdb::Database& database);

    std::optional<PageRegistry> registry_;
    zvdb::Database* database_ = nullptr;
    std::uint64_t handleSeed_ = 0;
    std::uint64_t contentId_ = 0;
    std::size_t objectCount_ = 0;
    Fingerprint fingerprint_;
    std::unordered_map<std::string, int> highest_;  // each group's highest page number
    std::unordered_set<std::string> names_;         // every registered page
};

}  // namespace zvproduct
