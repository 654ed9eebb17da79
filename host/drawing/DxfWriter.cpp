#include "DxfWriter.h"

#include "BlockRecord.h"
#include "Database.h"
#include "Dictionary.h"
#include "DxfError.h"
#include "Entity.h"
#include "SymbolTable.h"
#include "TagValues.h"
#include "TextCodec.h"

#include "sdk/AtomicFile.h"

#include <bit>
#include <cstring>
#include <span>
#include <unordered_set>

namespace zvdb {

namespace {
// A file save hands the text over in chunks of this size, so the whole text never stands
// in memory beside the drawing.
constexpr std::size_t kChunk = 1 << 20;
}  // namespace

std::string DxfWriter::toText(Database& database) {
    DxfWriter writer(database);
    writer.prepare();
    writer.write();
    return std::move(writer.out_);
}

void DxfWriter::saveFile(Database& database, const std::string& path) {
    zvsdk::AtomicFile file(QString::fromStdString(path));
    if (!file.open()) throw DxfError(file.errorString().toStdString());
    DxfWriter writer(database);
    writer.sink_ = &file;
    writer.prepare();
    writer.write();
    writer.flush();
    // On failure the temporary file goes with `file` and the old file stays as it was.
    if (!file.commit()) throw DxfError(file.errorString().toStdString());
}

void DxfWriter::prepare() {
    // Register every application that extended data names.
    std::unordered_set<std::string> seen;
    std::vector<std::string> apps;
    for (const auto& object : db_.storage_) {
        if (object->isErased()) continue;
        // A patterned object keeps at most the group beside its values.
        if (object->isPatterned()) {
            for (const Tag& item : object->patternedXData())
                if (item.code == 1001 && seen.insert(std::string(item.value)).second)
                    apps.emplace_back(item.value);
            continue;
        }
        const auto tags = object->tags();
        for (std::size_t i = 1; i < tags.size(); ++i) {
            if (tags[i].code != 1001 || object->isType("XRECORD")) continue;
            if (seen.insert(std::string(tags[i].value)).second) apps.emplace_back(tags[i].value);
        }
    }
    for (const std::string& app : apps)
        db_.registerApplication(app);
    db_.header_.setText("$HANDSEED", 5, TagValues::fromHandle(db_.handleSeed()));
    legacyEncoding_ = db_.version() < "AC1021";
    codePage_ = std::string(db_.header_.text("$DWGCODEPAGE", "ANSI_1252"));
}

namespace {

// A group code's line (right-aligned in three) in `buffer`; its length.
[[gnu::always_inline]] inline std::size_t codeLine(char (&buffer)[16], int code) {
    int n = 0;
    char digits[16];
    int c = code < 0 ? -code : code;
    do {
        digits[n++] = static_cast<char>('0' + c % 10);
        c /= 10;
    } while (c);
    if (code < 0) digits[n++] = '-';
    int len = 0;
    for (int pad = n; pad < 3; ++pad)
        buffer[len++] = ' ';
    while (n)
        buffer[len++] = digits[--n];
    buffer[len++] = '\n';
    return static_cast<std::size_t>(len);
}

// The same line at `at`; its end.
char* putCode(char* at, int code) {
    char buffer[16];
    const std::size_t len = codeLine(buffer, code);
    std::memcpy(at, buffer, len);
    return at + len;
}

}  // namespace

// Inlined: the writer calls these for every tag of the drawing.
[[gnu::always_inline]] inline void DxfWriter::appendCode(std::string& out, int code) {
    char buffer[16];
    out.append(buffer, codeLine(buffer, code));
}

[[gnu::always_inline]] inline void DxfWriter::appendValue(std::string& out,
                                                          std::string_view value) const {
    if (legacyEncoding_ && !TextCodec::isAscii(value)) {
        out += TextCodec::fromUtf8(value, codePage_);
    } else {
        out.append(value);
    }
}

void DxfWriter::tag(int code, std::string_view value) {
    appendCode(out_, code);
    appendValue(out_, value);
    out_ += '\n';
    if (sink_ && out_.size() >= kChunk) flush();
}

const DxfWriter::PatternText& DxfWriter::patternText(const TagPattern& pattern) {
    // A reference's objects go through a few patterns by turns: those are answered here
    // without a look-up in the map (whose texts stay where they are).
    const auto at = reinterpret_cast<std::uintptr_t>(&pattern) * 0x9E3779B97F4A7C15ull;
    KnownPattern& known = knownPatterns_[at >> (64 - kKnownBits)];
    if (known.pattern == &pattern) return *known.text;
    PatternText& rendered = patternTexts_[&pattern];
    known = {&pattern, &rendered};
    if (!rendered.pieces.empty()) return rendered;
    std::size_t begin = 0;
    pattern.forEachItem(
        [&](int code, TagPattern::Kind kind, std::uint8_t hole, std::string_view value) {
            appendCode(rendered.text, code);
            if (kind == TagPattern::Kind::Fixed) {
                appendValue(rendered.text, value);
                rendered.text += '\n';
                return;
            }
            const std::size_t end = rendered.text.size();
            rendered.pieces.push_back({static_cast<std::uint32_t>(begin),
                                       static_cast<std::uint32_t>(end - begin), kind, hole});
            begin = end;
        });
    rendered.pieces.push_back({static_cast<std::uint32_t>(begin),
                               static_cast<std::uint32_t>(rendered.text.size() - begin),
                               TagPattern::Kind::Fixed, 0});
    return rendered;
}

// The objects a command made are mostly patterned: their fixed tags go out as the runs of
// text made once per pattern, and only their own values are written one by one.
void DxfWriter::writePatterned(const DbObject& object, const TagPattern::Values& values) {
    const TagPattern& pattern = *values.pattern;
    const PatternText& rendered = patternText(pattern);
    if (!writeWhole(object, values, rendered)) {
        writePieces(object, values, rendered);
        for (const Tag& item : values.xdata())
            tag(item.code, item.value);
    }
    if (sink_ && out_.size() >= kChunk) flush();
}

namespace {

// n bytes, sizeof(Word) <= n <= 2 * sizeof(Word), as a first and a last word that overlap.
template <class Word>
[[gnu::always_inline]] inline void putWords(char* at, const char* from, std::size_t n) {
    Word head, tail;
    std::memcpy(&head, from, sizeof(Word));
    std::memcpy(&tail, from + n - sizeof(Word), sizeof(Word));
    std::memcpy(at, &head, sizeof(Word));
    std::memcpy(at + n - sizeof(Word), &tail, sizeof(Word));
}

// The text at `at`; its end. An empty value may have no memory at all. The runs and values
// of a patterned object are mostly a few bytes: those are copied in two overlapping words,
// without a call.
[[gnu::always_inline]] inline char* putText(char* at, std::string_view text) {
    const std::size_t n = text.size();
    const char* from = text.data();
    if (n > 16) {
        std::memcpy(at, from, n);
    } else if (n >= 8) {
        putWords<std::uint64_t>(at, from, n);
    } else if (n >= 4) {
        putWords<std::uint32_t>(at, from, n);
    } else if (n > 0) {
        at[0] = from[0];
        at[n / 2] = from[n / 2];
        at[n - 1] = from[n - 1];
    }
    return at + n;
}

// Upper-case hexadecimal as TagPattern::hexText gives it, at `at`; its end.
char* putHex(char* at, std::uint64_t value) {
    const int digits = value == 0 ? 1 : (std::bit_width(value) + 3) / 4;
    for (int i = digits - 1; i >= 0; --i, value >>= 4)
        at[i] = "0123456789ABCDEF"[value & 15];
    return at + digits;
}

}  // namespace

// An object's text goes first to a room on the stack, in one pass over its runs and values,
// then to the file's text in one append: no growth of the text by its size worked out
// beforehand (which fills it with zeros first). An object too long for the room takes that
// way all the same. False, with nothing written, when a value needs the code page.
bool DxfWriter::writeWhole(const DbObject& object, const TagPattern::Values& values,
                           const PatternText& rendered) {
    char room[4096];
    if (const char* end = putObject(room, room + sizeof room, object, values, rendered)) {
        out_.append(room, static_cast<std::size_t>(end - room));
        return true;
    }
    return writeSized(object, values, rendered);
}

namespace {
// A handle takes at most sixteen digits; a code at most six characters and its line end.
constexpr std::size_t kHexDigits = 16;
constexpr std::size_t kCodeLine = 7;
}  // namespace

char* DxfWriter::putObject(char* at, const char* end, const DbObject& object,
                           const TagPattern::Values& values, const PatternText& rendered) const {
    const TagPattern& pattern = *values.pattern;
    const char* text = rendered.text.data();
    for (const PatternText::Piece& piece : rendered.pieces) {
        std::string_view own;
        if (piece.value == TagPattern::Kind::Hole) {
            own = pattern.holeValue(values, piece.hole);
            if (legacyEncoding_ && !TextCodec::isAscii(own)) return nullptr;
        }
        if (static_cast<std::size_t>(end - at) < piece.size + own.size() + kHexDigits + 1)
            return nullptr;
        at = putText(at, {text + piece.begin, piece.size});
        switch (piece.value) {
            case TagPattern::Kind::Fixed:
                continue;
            case TagPattern::Kind::Hole:
                at = putText(at, own);
                break;
            case TagPattern::Kind::Handle:
                at = putHex(at, object.handle());
                break;
            case TagPattern::Kind::Owner:
                at = putHex(at, object.ownerHandle());
                break;
        }
        *at++ = '\n';
    }
    for (const Tag& item : values.xdata()) {
        if (legacyEncoding_ && !TextCodec::isAscii(item.value)) return nullptr;
        if (static_cast<std::size_t>(end - at) < kCodeLine + item.value.size() + 1) return nullptr;
        at = putText(putCode(at, item.code), item.value);
        *at++ = '\n';
    }
    return at;
}

// The same straight into the file's text, its size known beforehand: one growth of the text
// and plain copies. A value is looked up again as it is copied rather than kept: the look-up
// is a few loads, cheaper than an array of views made for every object.
bool DxfWriter::writeSized(const DbObject& object, const TagPattern::Values& values,
                           const PatternText& rendered) {
    const TagPattern& pattern = *values.pattern;
    std::size_t size = rendered.text.size() + rendered.pieces.size();
    for (const PatternText::Piece& piece : rendered.pieces) {
        if (piece.value == TagPattern::Kind::Hole) {
            const std::string_view own = pattern.holeValue(values, piece.hole);
            if (legacyEncoding_ && !TextCodec::isAscii(own)) return false;
            size += own.size();
        } else if (piece.value != TagPattern::Kind::Fixed) {
            size += kHexDigits;
        }
    }
    for (const Tag& item : values.xdata()) {
        if (legacyEncoding_ && !TextCodec::isAscii(item.value)) return false;
        size += kCodeLine + item.value.size() + 1;
    }
    // putObject asks for room for a handle and a line end more than a run and its value
    // take: that much more, so that the exact size passes its checks.
    size += kHexDigits + 1;
    const std::size_t start = out_.size();
    out_.resize(start + size);
    char* const begin = out_.data() + start;
    const char* end = putObject(begin, begin + size, object, values, rendered);
    out_.resize(static_cast<std::size_t>(end - out_.data()));
    return true;
}

void DxfWriter::writePieces(const DbObject& object, const TagPattern::Values& values,
                            const PatternText& rendered) {
    const TagPattern& pattern = *values.pattern;
    for (const PatternText::Piece& piece : rendered.pieces) {
        out_.append(rendered.text, piece.begin, piece.size);
        switch (piece.value) {
            case TagPattern::Kind::Fixed:
                continue;
            case TagPattern::Kind::Hole:
                appendValue(out_, pattern.holeValue(values, piece.hole));
                break;
            case TagPattern::Kind::Handle:
            case TagPattern::Kind::Owner: {
                char buffer[20];
                const bool handle = piece.value == TagPattern::Kind::Handle;
                out_.append(
                    TagPattern::hexText(handle ? object.handle() : object.ownerHandle(), buffer));
                break;
            }
        }
        out_ += '\n';
    }
}

void DxfWriter::flush() {
    if (!sink_) return;
    // The first failed write ends the save: nothing after it could reach the disk.
    if (!sink_->write(out_)) throw DxfError(sink_->errorString().toStdString());
    out_.clear();
}

void DxfWriter::write() {
    out_.reserve(sink_ ? kChunk + 64 * 1024 : db_.arena_.bytesUsed() + 1024 * 1024);
    std::vector<std::string> order = db_.sectionOrder_;
    for (const char* name : {"HEADER", "CLASSES", "TABLES", "BLOCKS", "ENTITIES", "OBJECTS"}) {
        bool present = false;
        for (const std::string& s : order)
            present = present || s == name;
        const bool needed =
            std::string_view(name) != "CLASSES" && std::string_view(name) != "OBJECTS";
        if (!present && (needed || db_.version() >= "AC1015")) order.push_back(name);
    }
    for (const std::string& name : order) {
        if (name == "HEADER")
            writeHeader();
        else if (name == "TABLES")
            writeTables();
        else if (name == "BLOCKS")
            writeBlocks();
        else if (name == "ENTITIES")
            writeEntities();
        else if (name == "OBJECTS")
            writeObjects();
        else
            writeRaw(name);
    }
    tag(0, "EOF");
}

void DxfWriter::writeHeader() {
    tag(0, "SECTION");
    tag(2, "HEADER");
    for (const auto& variable : db_.header_.variables()) {
        tag(9, variable.name);
        for (const Tag& value : variable.values)
            tag(value.code, value.value);
    }
    tag(0, "ENDSEC");
}

void DxfWriter::writeRaw(const std::string& name) {
    tag(0, "SECTION");
    tag(2, name);
    for (const auto& section : db_.rawSections_)
        if (section.name == name)
            for (const Tag& t : section.tags)
                tag(t.code, t.value);
    tag(0, "ENDSEC");
}

void DxfWriter::writeObject(const DbObject& object) {
    if (object.isErased()) return;
    if (const TagPattern::Values* values = object.patternValues()) {
        writePatterned(object, *values);
        return;
    }
    const auto tags = object.tags();
    const bool dictionary = dynamic_cast<const Dictionary*>(&object) != nullptr;
    for (std::size_t i = 0; i < tags.size(); ++i) {
        // An entry whose object was erased is left out with its name.
        if (dictionary && tags[i].code == 3 && i + 1 < tags.size() && isErasedObject(tags[i + 1])) {
            ++i;
            continue;
        }
        if (tags[i].code != kRemovedTag) tag(tags[i].code, tags[i].value);
    }
}

// The head's record count is written as the table stands; the head itself is left as it
// is, so that saving is no edit of the drawing.
void DxfWriter::writeTableHead(const SymbolTable& table) {
    const DbObject& head = *table.head();
    if (head.isErased()) return;
    const std::string count = TagValues::fromInteger(static_cast<long long>(table.size()));
    const int at = head.indexOf(70);
    int i = 0;
    head.forEachTag([&](int code, std::string_view value) {
        if (code != kRemovedTag) tag(code, i == at ? std::string_view(count) : value);
        ++i;
    });
}

bool DxfWriter::isErasedObject(const Tag& pointer) const {
    if (pointer.code != 350 && pointer.code != 360) return false;
    const DbObject* object = db_.byHandle_.find(TagValues::toHandle(pointer.value));
    return object && object->isErased();
}

void DxfWriter::writeEntity(const Entity& entity) {
    if (entity.isErased()) return;
    writeObject(entity);
    for (const Entity* sub : entity.subEntities())
        writeObject(*sub);
    if (entity.seqend()) writeObject(*entity.seqend());
}

void DxfWriter::writeTables() {
    tag(0, "SECTION");
    tag(2, "TABLES");
    for (const auto& table : db_.tables_) {
        if (!table->isWritten()) continue;
        if (table->head())
            writeTableHead(*table);
        else {
            tag(0, "TABLE");
            tag(2, table->name());
        }
        for (const DbObject* record : table->records())
            writeObject(*record);
        tag(0, "ENDTAB");
    }
    tag(0, "ENDSEC");
}

void DxfWriter::writeBlocks() {
    tag(0, "SECTION");
    tag(2, "BLOCKS");
    for (const BlockRecord* block : db_.blocks()) {
        if (!block->blockBegin()) continue;
        writeObject(*block->blockBegin());
        if (!block->isLayout() || (block->isPaperSpace() && block != db_.paperSpace()))
            for (const Entity* entity : block->allEntities())
                writeEntity(*entity);
        if (block->blockEnd()) writeObject(*block->blockEnd());
    }
    tag(0, "ENDSEC");
}

void DxfWriter::writeEntities() {
    tag(0, "SECTION");
    tag(2, "ENTITIES");
    for (const BlockRecord* block : {db_.modelSpace(), db_.paperSpace()})
        if (block)
            for (const Entity* entity : block->allEntities())
                writeEntity(*entity);
    tag(0, "ENDSEC");
}

void DxfWriter::writeObjects() {
    tag(0, "SECTION");
    tag(2, "OBJECTS");
    for (const DbObject* object : db_.objects_)
        writeObject(*object);
    tag(0, "ENDSEC");
}

}  // namespace zvdb
