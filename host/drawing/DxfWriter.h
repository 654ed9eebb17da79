#pragma once
// Writes a Database as ASCII DXF at the version it holds: every object's tags as they stand,
// $HANDSEED above all handles, every extended-data application registered, table counts
// brought up to date. Files before R2007 are written in their code page, with \U+XXXX for
// characters it lacks; R2007 and later in UTF-8.
#include <string>

#include "Tag.h"

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
    void flush();
    void writeTableHead(const class SymbolTable& table);
    bool isErasedObject(const Tag& pointer) const;

    Database& db_;
    std::string out_;
    // Where a file save streams its text; out_ then holds one chunk at a time.
    zvsdk::AtomicFile* sink_ = nullptr;
    bool legacyEncoding_ = false;
    std::string codePage_;
};

}  // namespace zvdb
