#pragma once
// Writes a Database as ASCII DXF at the version it holds: every object's tags as they stand,
// $HANDSEED above all handles, every extended-data application registered, table counts
// brought up to date. Files before R2007 are written in their code page, with \U+XXXX for
// characters it lacks; R2007 and later in UTF-8.
#include <array>
#include <cstdint>
#include <string>
#include <unordered_map>
#include <vector>

#include "Tag.h"
#include "TagPattern.h"

namespace zvsdk {
class AtomicFile;
}

namespace zvdb {

class Database;

class DxfWriter {
public:
    static std::string toText(Database& database);
    // Atomic and checked: a temporary file in the same folder, then a rename. Throws
    // DxfError with "could not save PATH: REASON"; the old file is then untouched.
    static void saveFile(Database& database, const std::string& path);

private:
    explicit DxfWriter(Database& database) : db_(database) {}
    void prepare();
    void write();
    void writeHeader();
    void writeTables();
    void writeBlocks();
    void writeEntities();
    void writeObjects();
    void writeRaw(const std::string& name);
    void writeObject(const class DbObject& object);
    void writeEntity(const class Entity& entity);
    void tag(int code, std::string_view value);
    // A tag's code line, and a value in the file's encoding (without its line end).
    static void appendCode(std::string& out, int code);
    void appendValue(std::string& out, std::string_view value) const;
    // A pattern's tags as text in the file's encoding, made at its first object: each run
    // of fixed tags is one text, and an object's own values go between the runs.
    struct PatternText {
        struct Piece {
            std::uint32_t begin, size;  // the run of text before the value
            TagPattern::Kind value;     // Fixed: the run is the pattern's last
            std::uint8_t hole;
        };
        std::string text;
        std::vector<Piece> pieces;
    };
    const PatternText& patternText(const TagPattern& pattern);
    void writePatterned(const DbObject& object, const TagPattern::Values& values);
    bool writeWhole(const DbObject& object, const TagPattern::Values& values,
                    const PatternText& rendered);
    bool writeSized(const DbObject& object, const TagPattern::Values& values,
                    const PatternText& rendered);
    // The object's text from `at` on; its end, or null when it would pass `end` or a value
    // needs the code page.
    char* putObject(char* at, const char* end, const DbObject& object,
                    const TagPattern::Values& values, const PatternText& rendered) const;
    void writePieces(const DbObject& object, const TagPattern::Values& values,
                     const PatternText& rendered);
    void flush();
    void writeTableHead(const class SymbolTable& table);
    bool isErasedObject(const Tag& pointer) const;

    Database& db_;
    std::string out_;
    // Where a file save streams its text; out_ then holds one chunk at a time.
    zvsdk::AtomicFile* sink_ = nullptr;
    bool legacyEncoding_ = false;
    std::string codePage_;
    std::unordered_map<const TagPattern*, PatternText> patternTexts_;
    struct KnownPattern {
        const TagPattern* pattern = nullptr;
        const PatternText* text = nullptr;
    };
    static constexpr int kKnownBits = 6;
    std::array<KnownPattern, std::size_t(1) << kKnownBits> knownPatterns_{};
};

}  // namespace zvdb
