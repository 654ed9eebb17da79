#include "PageRegistry.h"

#include "drawing/Database.h"
#include "drawing/Dictionary.h"
#include "drawing/XRecord.h"

#include <algorithm>
#include <deque>
#include <unordered_map>

namespace zvproduct {

namespace {
const std::string kRegistry[] = {"ZV_PAGINAS"};
}

PageRegistry::PageRegistry(zvdb::Database& database) : database_(database) {
    load();
}

void PageRegistry::load() {
    zvdb::Dictionary* registry = database_.dictionaryAt(kRegistry, false);
    if (!registry) return;
    for (const auto& entry : registry->entries()) {
        zvdb::XRecord* record = registry->getXRecord(entry.name);
        if (!record || record->isErased()) continue;
        PageGroup group;
        group.name = std::string(entry.name);
        for (const zvdb::Tag& tag : record->data()) {
            if (tag.code == 70) group.key = std::atoi(std::string(tag.value).c_str());
            if (tag.code == 1) group.title = std::string(tag.value);
            if (tag.code == 8) group.pages.emplace_back(tag.value);
        }
        groups_.push_back(std::move(group));
    }
}

std::vector<std::string> PageRegistry::pages() const {
    std::vector<std::string> all;
    for (const PageGroup& group : groups_)
        all.insert(all.end(), group.pages.begin(), group.pages.end());
    return all;
}

PageGroup* PageRegistry::group(const std::string& name) {
    auto it = std::find_if(groups_.begin(), groups_.end(),
                           [&](const PageGroup& g) { return g.name == name; });
    return it == groups_.end() ? nullptr : &*it;
}

int PageRegistry::pageIndex(const std::string& layer) const {
    int index = 0;
    for (const PageGroup& group : groups_)
        for (const std::string& page : group.pages) {
            if (page == layer) return index;
            ++index;
        }
    return -1;
}

void PageRegistry::save(const PageGroup& group) {
    zvdb::Dictionary* registry = database_.dictionaryAt(kRegistry, true);
    std::deque<std::string> texts;  // the tags point into these until setData copies them
    std::vector<zvdb::Tag> data;
    auto add = [&](int code, std::string text) {
        texts.push_back(std::move(text));
        data.push_back({static_cast<std::int16_t>(code), texts.back()});
    };
    add(70, std::to_string(group.key));
    add(1, group.title);
    for (const std::string& page : group.pages)
        add(8, page);
    registry->getOrCreateXRecord(group.name)->setData(data);
}

void PageRegistry::appendPage(PageGroup& group, const std::string& page) {
    group.pages.push_back(page);
    zvdb::Dictionary* registry = database_.dictionaryAt(kRegistry, false);
    zvdb::XRecord* record = registry ? registry->getXRecord(group.name) : nullptr;
    if (!record) return save(group);
    const std::size_t end = record->xdataStart();
    std::vector<zvdb::Tag>& tags = record->editTags();
    tags.insert(tags.begin() + static_cast<std::ptrdiff_t>(end),
                zvdb::Tag{8, database_.store(page)});
}

PageGroup& PageRegistry::addGroup(const std::string& name) {
    if (PageGroup* existing = group(name)) return *existing;
    PageGroup group;
    group.name = name;
    group.title = name;
    groups_.push_back(group);
    save(groups_.back());
    return groups_.back();
}

void PageRegistry::removeGroup(const std::string& name) {
    if (zvdb::Dictionary* registry = database_.dictionaryAt(kRegistry, false)) {
        if (zvdb::XRecord* record = registry->getXRecord(name)) {
            registry->remove(name);
            record->erase();
        }
    }
    std::erase_if(groups_, [&](const PageGroup& g) { return g.name == name; });
}

std::string PageRegistry::pageName(const std::string& group, int number) {
    std::string digits = std::to_string(number);
    if (digits.size() < 4) digits.insert(0, 4 - digits.size(), '0');
    return group + "$" + digits + "$A";
}

std::string PageRegistry::groupOf(const std::string& layer) {
    return layer.substr(0, layer.find('$'));
}

}  // namespace zvproduct
