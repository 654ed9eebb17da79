#pragma once
// The project's page groups and pages as the drawing keeps them: the Xrecords of the
// dictionary ZV_PAGINAS, one per group in group order, each with the group's catalogue key
// (70), its title (1) and one layer name (8) per page in page order.
#include <string>
#include <vector>

namespace zvdb {
class Database;
}

namespace zvproduct {

struct PageGroup {
    std::string name;
    int key = 0;
    std::string title;
    std::vector<std::string> pages;
};

class PageRegistry {
public:
    explicit PageRegistry(zvdb::Database& database);

    const std::vector<PageGroup>& groups() const { return groups_; }
    std::vector<std::string> pages() const;  // all groups, registry order
    PageGroup* group(const std::string& name);
    // Page order across the project: registry position of a layer, -1 for no page.
    int pageIndex(const std::string& layer) const;

    // Writes one group's Xrecord back (made, and appended, when new).
    void save(const PageGroup& group);
    // Adds a page at the end of a group and of its Xrecord, the other pages left as stored.
    void appendPage(PageGroup& group, const std::string& page);
    PageGroup& addGroup(const std::string& name);
    void removeGroup(const std::string& name);

    // "GROUP$NNNN$A": four digits, a fifth past 9999.
    static std::string pageName(const std::string& group, int number);
    static std::string groupOf(const std::string& layer);

private:
    void load();

    zvdb::Database& database_;
    std::vector<PageGroup> groups_;
};

}  // namespace zvproduct
