#include "TagList.h"

namespace zvdb {

std::size_t TagList::xdataStart(std::span<const Tag> all) {
    // Extended data is the run of codes 1000 and above at the end, opened by a 1001; an
    // Xrecord's own data stays below 1000, so the rule holds for it too.
    std::size_t start = all.size();
    while (start > 1 && all[start - 1].code >= 1000)
        --start;
    while (start < all.size() && all[start].code != 1001)
        ++start;
    return start;
}

int TagList::indexOf(std::span<const Tag> all, int code, std::size_t from) {
    if (all.size() < 2) return -1;
    // The extended data's start is looked for only when a tag of 1000 or above is reached:
    // below the first such tag there is no extended data.
    const Tag* const first = all.data();
    const Tag* end = first + all.size();
    bool endKnown = code >= 1000;
    bool inGroup = false;
    for (const Tag* tag = first + 1; tag < end; ++tag) {
        // Most tags are none of the codes that ask for a look (the one searched, a group's
        // bracket, extended data): passed over on the code alone.
        const int at = tag->code;
        if (at != code && at != 102 && at < 1000) continue;
        if (!endKnown && at >= 1000) {
            end = first + xdataStart(all);
            endKnown = true;
            if (tag >= end) break;
        }
        if (opensGroup(*tag)) {
            inGroup = true;
        } else if (closesGroup(*tag)) {
            inGroup = false;
        } else if (!inGroup && at == code && static_cast<std::size_t>(tag - first) >= from) {
            return static_cast<int>(tag - first);
        }
    }
    return -1;
}

std::size_t TagList::subclassEnd(std::span<const Tag> all, std::string_view subclass) {
    const std::size_t end = xdataStart(all);
    if (subclass.empty()) return end;
    for (std::size_t i = 1; i < end; ++i) {
        if (all[i].code == 100 && all[i].value == subclass) {
            std::size_t k = i + 1;
            while (k < end && all[k].code != 100)
                ++k;
            return k;
        }
    }
    return end;
}

void TagList::setValue(std::vector<Tag>& all, int code, std::string_view value,
                       std::string_view subclass) {
    const int i = indexOf(all, code);
    if (i >= 0) {
        all[static_cast<std::size_t>(i)].value = value;
        return;
    }
    const std::size_t at = subclassEnd(all, subclass);
    all.insert(all.begin() + static_cast<std::ptrdiff_t>(at),
               Tag{static_cast<std::int16_t>(code), value});
}

void TagList::setPoint(std::vector<Tag>& all, int code, const std::string_view (&values)[3],
                       std::string_view subclass, bool withZ) {
    const int i = indexOf(all, code);
    if (i < 0) {
        const auto at = all.begin() + static_cast<std::ptrdiff_t>(subclassEnd(all, subclass));
        const Tag added[3] = {Tag{static_cast<std::int16_t>(code), values[0]},
                              Tag{static_cast<std::int16_t>(code + 10), values[1]},
                              Tag{static_cast<std::int16_t>(code + 20), values[2]}};
        all.insert(at, added, added + (withZ ? 3 : 2));
        return;
    }
    std::size_t k = static_cast<std::size_t>(i);
    all[k].value = values[0];
    for (int axis = 1; axis < (withZ ? 3 : 2); ++axis) {
        const auto axisCode = static_cast<std::int16_t>(code + 10 * axis);
        if (k + 1 < all.size() && all[k + 1].code == axisCode) {
            all[++k].value = values[axis];
        } else {
            all.insert(all.begin() + static_cast<std::ptrdiff_t>(++k), Tag{axisCode, values[axis]});
        }
    }
}

}  // namespace zvdb
