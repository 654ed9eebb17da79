#pragma once
// Searches and edits on an object's tag list, shared by DbObject and by the builders that
// make an object's final tags before it is adopted (so both place a group the same way).
// Index 0 is the object's type; application groups (102) and extended data (1001 on) are
// passed over by the searches.
#include "Tag.h"

#include <cstddef>
#include <span>
#include <string_view>
#include <vector>

namespace zvdb {

class TagList {
public:
    // Index of the first extended-data tag (1001), or the tag count.
    // "102 {NAME" and "102 }": the tags that open and close an application group.
    static bool opensGroup(const Tag& tag) {
        return tag.code == 102 && !tag.value.empty() && tag.value[0] == '{';
    }
    static bool closesGroup(const Tag& tag) {
        return tag.code == 102 && !tag.value.empty() && tag.value[0] == '}';
    }
    static std::size_t xdataStart(std::span<const Tag> all);
    // Each group of the extended data, the last first: `visit(name, begin, end)` with its
    // items at [begin, end); a false answer ends the walk. One walk from the end, where the
    // extended data lies, and no walk back to its start.
    template <class Visit>
    static void forEachGroupFromEnd(std::span<const Tag> all, Visit&& visit);
    // Index of the first tag with the code, outside application groups and before the
    // extended data, from `from` on; -1 when absent.
    static int indexOf(std::span<const Tag> all, int code, std::size_t from = 1);
    // indexOf for each of the codes, in one walk; -1 for a code that is absent. (A few
    // codes, known where asked: the walk keeps them and the answers at hand.)
    template <std::size_t N>
    static void indexesOf(std::span<const Tag> all, const int (&codes)[N], int (&found)[N]);
    // Index after the last tag of `subclass` (a subclass marker, code 100); the start of the
    // extended data when the subclass is empty or absent.
    static std::size_t subclassEnd(std::span<const Tag> all, std::string_view subclass);

    // Sets the first tag with the code or adds one at the end of `subclass`; the value is
    // taken as it is (it must outlive the list).
    static void setValue(std::vector<Tag>& all, int code, std::string_view value,
                         std::string_view subclass);
    // Sets `code`, `code + 10` and, with `withZ`, `code + 20` from `values` (x, y, z),
    // adding the axes that are missing after the first.
    static void setPoint(std::vector<Tag>& all, int code, const std::string_view (&values)[3],
                         std::string_view subclass, bool withZ = true);
};

template <class Visit>
void TagList::forEachGroupFromEnd(std::span<const Tag> all, Visit&& visit) {
    // As xdataStart: the run of codes 1000 and above at the end, from its first 1001 on.
    std::size_t end = all.size();
    for (std::size_t i = all.size(); i > 1 && all[i - 1].code >= 1000; --i) {
        if (all[i - 1].code != 1001) continue;
        if (!visit(all[i - 1].value, i, end)) return;
        end = i - 1;
    }
}

template <std::size_t N>
void TagList::indexesOf(std::span<const Tag> all, const int (&codes)[N], int (&found)[N]) {
    std::size_t missing = N;
    bool intoXData = false;
    for (std::size_t k = 0; k < N; ++k) {
        found[k] = -1;
        intoXData = intoXData || codes[k] >= 1000;
    }
    // As indexOf: a code below 1000 is looked for before the extended data only, one of
    // 1000 and above anywhere; the extended data's start is looked for only once a tag of
    // 1000 or above is reached.
    std::size_t xdata = all.size();
    bool xdataKnown = false;
    bool inGroup = false;
    for (std::size_t i = 1; i < all.size() && missing > 0; ++i) {
        const Tag& tag = all[i];
        if (!xdataKnown && tag.code >= 1000) {
            xdata = xdataStart(all);
            xdataKnown = true;
            if (!intoXData && i >= xdata) break;
        }
        if (opensGroup(tag)) {
            inGroup = true;
        } else if (closesGroup(tag)) {
            inGroup = false;
        } else if (!inGroup) {
            for (std::size_t k = 0; k < N; ++k)
                if (found[k] < 0 && tag.code == codes[k] && (i < xdata || codes[k] >= 1000)) {
                    found[k] = static_cast<int>(i);
                    --missing;
                }
        }
    }
}

}  // namespace zvdb
