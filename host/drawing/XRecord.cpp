#include "XRecord.h"

namespace zvdb {

std::size_t XRecord::dataStart() const {
    const auto all = tags();
    for (std::size_t i = 1; i < all.size(); ++i) {
        if (all[i].code == 100 && all[i].value == "AcDbXrecord") {
            return i + 1 < all.size() && all[i + 1].code == 280 ? i + 2 : i + 1;
        }
    }
    return headerEnd();
}

std::vector<Tag> XRecord::data() const {
    const auto all = tags();
    return std::vector<Tag>(all.begin() + static_cast<std::ptrdiff_t>(dataStart()),
                            all.begin() + static_cast<std::ptrdiff_t>(xdataStart()));
}

void XRecord::setData(std::span<const Tag> data) {
    const std::size_t start = dataStart();
    std::vector<Tag> stored;
    stored.reserve(data.size());
    for (const Tag& tag : data)
        stored.push_back(Tag{tag.code, store(tag.value)});
    // The extended data behind the data stays.
    const std::size_t end = xdataStart();
    auto& all = editTags();
    all.erase(all.begin() + static_cast<std::ptrdiff_t>(start),
              all.begin() + static_cast<std::ptrdiff_t>(end));
    all.insert(all.begin() + static_cast<std::ptrdiff_t>(start), stored.begin(), stored.end());
}

}  // namespace zvdb
