#include "TextEntity.h"

namespace zvdb {

namespace {

// Chunk length of MTEXT text, cut at a character boundary of UTF-8.
std::size_t chunkEnd(std::string_view text, std::size_t from) {
    std::size_t end = std::min(text.size(), from + 250);
    while (end < text.size() && end > from &&
           (static_cast<unsigned char>(text[end]) & 0xC0) == 0x80)
        --end;
    return end;
}

}  // namespace

std::string TextEntity::content() const {
    if (!isMText()) return std::string(text(1));
    std::string result;
    const auto all = tags();
    const std::size_t end = xdataStart();
    for (std::size_t i = 1; i < end; ++i)
        if (all[i].code == 3) result += all[i].value;
    result += text(1);
    return result;
}

void TextEntity::setContent(std::string_view content) {
    if (!isMText()) {
        setText(1, content, "AcDbText");
        return;
    }
    removeAll(3);
    std::size_t from = 0;
    std::vector<Tag> chunks;
    while (content.size() - from > 250) {
        const std::size_t end = chunkEnd(content, from);
        chunks.push_back(Tag{3, store(content.substr(from, end - from))});
        from = end;
    }
    setText(1, content.substr(from), "AcDbMText");
    const int at = indexOf(1);
    auto& all = editTags();
    all.insert(all.begin() + at, chunks.begin(), chunks.end());
}

void TextEntity::setPosition(const Point3& p) {
    setPoint(10, p, isMText() ? "AcDbMText" : "AcDbText");
}

}  // namespace zvdb
