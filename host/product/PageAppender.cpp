#include "PageAppender.h"

#include "drawing/Database.h"
#include "drawing/Dictionary.h"
#include "drawing/XRecord.h"

#include <algorithm>
#include <cstdlib>

namespace zvproduct {

namespace {
const std::string kRegistry[] = {"ZV_PAGINAS"};
}

int PageAppender::pageNumber(const std::string& layer) {
    const auto first = layer.find('$');
    if (first == std::string::npos) return 0;
    return std::atoi(layer.c_str() + first + 1);
}

// Each group's Xrecord and its tag count: a page or a group added, removed or rewritten
// by anyone else shows here.
PageAppender::Fingerprint PageAppender::fingerprint(zvdb::Database& database) {
    Fingerprint print;
    zvdb::Dictionary* registry = database.dictionaryAt(kRegistry, false);
    if (!registry) return print;
    for (const auto& entry : registry->entries()) {
        const zvdb::DbObject* record = registry->get(entry.name);
        print.emplace_back(record, record ? record->tags().size() : 0);
    }
    return print;
}

bool PageAppender::current(zvdb::Database& database) const {
    return registry_ && database_ == &database && contentId_ == database.contentId() &&
           handleSeed_ == database.handleSeed() && objectCount_ == database.objectCount() &&
           fingerprint_ == fingerprint(database);
}

void PageAppender::load(zvdb::Database& database) {
    registry_.emplace(database);
    highest_.clear();
    names_.clear();
    for (const PageGroup& group : registry_->groups()) {
        int& highest = highest_[group.name];
        for (const std::string& page : group.pages) {
            highest = std::max(highest, pageNumber(page));
            names_.insert(page);
        }
    }
}

PageAppender::Page PageAppender::append(zvdb::Database& database, const std::string& group) {
    if (!current(database)) load(database);
    PageGroup& entry = registry_->addGroup(group);
    int number = highest_[group];
    std::string name = PageRegistry::pageName(group, number + 1);
    while (database.layer(name))
        name = PageRegistry::pageName(group, ++number + 1);
    database.createLayer(name);
    registry_->appendPage(entry, name);
    highest_[group] = std::max(highest_[group], pageNumber(name));
    // The first registered page of that name gives the running number: the new one unless
    // the registry already named a page so.
    int running = 0;
    if (!names_.insert(name).second) {
        running = registry_->pageIndex(name) + 1;
    } else {
        for (const PageGroup& g : registry_->groups()) {
            running += static_cast<int>(g.pages.size());
            if (&g == &entry) break;
        }
    }
    return {name, running};
}

void PageAppender::settle(zvdb::Database& database) {
    database_ = &database;
    handleSeed_ = database.handleSeed();
    contentId_ = database.contentId();
    objectCount_ = database.objectCount();
    fingerprint_ = fingerprint(database);
}

}  // namespace zvproduct
