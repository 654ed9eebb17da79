#include "DxfLoader.h"

#include "Attribute.h"
#include "BlockRecord.h"
#include "BlockReference.h"
#include "Dictionary.h"
#include "DxfError.h"
#include "LayerRecord.h"
#include "Polyline.h"
#include "R12Upgrade.h"
#include "R14Upgrade.h"
#include "SymbolTable.h"
#include "TagReader.h"
#include "TagValues.h"
#include "TextCodec.h"
#include "TextEntity.h"
#include "XRecord.h"

#include <algorithm>
#include <fstream>
#include <iostream>
#include <sstream>
#include <unordered_set>

namespace zvdb {

namespace {

constexpr std::string_view kDuplicateNote = " already in use; new handles were given";

bool isTag(const Tag& tag, int code, std::string_view value) {
    return tag.code == code && tag.value == value;
}

template <typename T>
std::unique_ptr<DbObject> make(Database& database, std::span<const Tag> tags) {
    return std::make_unique<T>(database, tags);
}

}  // namespace

// Construction ------------------------------------------------------------------------------

std::unique_ptr<DbObject> DxfLoader::makeObject(Database& database, std::span<const Tag> tags,
                                                Context context) {
    const std::string_view type = tags.empty() ? std::string_view() : tags[0].value;
    switch (context) {
        case Context::Table:
            if (type == "LAYER") return make<LayerRecord>(database, tags);
            if (type == "BLOCK_RECORD") return make<BlockRecord>(database, tags);
            return make<DbObject>(database, tags);
        case Context::Entity:
            if (type == "INSERT") return make<BlockReference>(database, tags);
            if (type == "ATTRIB" || type == "ATTDEF") return make<Attribute>(database, tags);
            if (type == "LWPOLYLINE" || type == "POLYLINE") return make<Polyline>(database, tags);
            if (type == "TEXT" || type == "MTEXT") return make<TextEntity>(database, tags);
            return make<Entity>(database, tags);
        case Context::Object:
            if (type == "DICTIONARY" || type == "ACDBDICTIONARYWDFLT")
                return make<Dictionary>(database, tags);
            if (type == "XRECORD") return make<XRecord>(database, tags);
            return make<DbObject>(database, tags);
    }
    return make<DbObject>(database, tags);
}

std::unique_ptr<DbObject> DxfLoader::makeOwnedObject(Database& database, std::vector<Tag> tags,
                                                     Context context) {
    auto object = makeObject(database, std::span<const Tag>(tags.data(), 1), context);
    object->takeTags(std::move(tags));
    return object;
}

std::unique_ptr<Database> DxfLoader::load(std::string bytes) {
    std::unique_ptr<Database> database(new Database(Database::Blank{}));
    loadInto(*database, std::move(bytes));
    if (database->version() < "AC1012") return R12Upgrade::upgrade(*database);
    if (database->version() < "AC1015") R14Upgrade::upgrade(*database);
    return database;
}

std::unique_ptr<Database> DxfLoader::loadFile(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    if (!in) throw DxfError(path + ": cannot be opened");
    in.seekg(0, std::ios::end);
    const auto size = in.tellg();
    in.seekg(0);
    std::string bytes(static_cast<std::size_t>(size), '\0');
    if (!in.read(bytes.data(), size)) throw DxfError(path + ": cannot be read");
    auto database = load(std::move(bytes));
    // Renumbered objects change what other programs see: the user hears of it once per file.
    for (const std::string& warning : database->warnings())
        if (warning.ends_with(kDuplicateNote)) std::cerr << path << ": " << warning << "\n";
    return database;
}

void DxfLoader::loadInto(Database& database, std::string bytes) {
    DxfLoader loader(database);
    loader.run(std::move(bytes));
}

void DxfLoader::run(std::string bytes) {
    if (bytes.empty()) throw DxfError("the file is empty");
    text_ = db_.arena_.adopt(std::move(bytes));
    binary_ = TagReader::isBinary(text_);
    db_.fileTags_ = binary_ ? TagReader::readBinary(text_, db_.arena_, &comments_)
                            : TagReader::readAscii(text_, &comments_);
    if (db_.fileTags_.empty()) throw DxfError("line 1: the file holds no DXF data");
    std::size_t objects = 0;
    for (const Tag& tag : db_.fileTags_)
        objects += tag.code == 0 ? 1 : 0;
    db_.byHandle_.reserve(objects);
    // Room for as many again: a command that adds objects (a list, a strip drawing) does not
    // copy the whole array to a larger one, and room not written takes no memory.
    db_.storage_.reserve(2 * objects);
    // Objects made while reading (a missing block record) take handles above all of the file's.
    // ($HANDSEED, a code 5 of the header, is the next free handle, not one in use.)
    const auto& tags = db_.fileTags_;
    for (std::size_t i = 1; i < tags.size(); ++i)
        if ((tags[i].code == 5 || tags[i].code == 105) && tags[i - 1].code != 9)
            db_.noteHandle(TagValues::toHandle(tags[i].value));
    fixEncoding();
    readSections();
    finish();
}

std::string DxfLoader::where(std::size_t tagIndex) const {
    // Comments were left out of the tags but count in the file.
    const auto before = static_cast<std::size_t>(
        std::upper_bound(comments_.begin(), comments_.end(), tagIndex) - comments_.begin());
    const std::size_t place = tagIndex + before;
    if (binary_) return "tag " + std::to_string(place + 1);
    return "line " + std::to_string(2 * place + 1);
}

std::string DxfLoader::where(const DbObject& object) const {
    const Tag* first = object.tags().data();
    const auto& all = db_.fileTags_;
    if (first >= all.data() && first < all.data() + all.size())
        return where(static_cast<std::size_t>(first - all.data()));
    return "a new object";
}

// Encoding ----------------------------------------------------------------------------------

void DxfLoader::fixEncoding() {
    auto& tags = db_.fileTags_;
    std::string_view version = "AC1009", codePage = "ANSI_1252";
    for (std::size_t i = 0; i + 1 < tags.size() && i < 4000; ++i) {
        if (isTag(tags[i], 9, "$ACADVER")) version = tags[i + 1].value;
        if (isTag(tags[i], 9, "$DWGCODEPAGE")) codePage = tags[i + 1].value;
        if (isTag(tags[i], 0, "ENDSEC")) break;
    }
    const bool unicode = version >= "AC1021";
    if (!binary_ && TextCodec::isAscii(text_)) return;
    bool anyHigh = false, allUtf8 = true;
    for (const Tag& tag : tags) {
        if (!isTextCode(tag.code) || TextCodec::isAscii(tag.value)) continue;
        anyHigh = true;
        if (!TextCodec::isValidUtf8(tag.value)) allUtf8 = false;
    }
    if (!anyHigh) return;
    const bool utf8 = allUtf8;
    if (!unicode && utf8) {
        db_.warnings_.push_back("the code page says " + std::string(codePage) +
                                " but the text is UTF-8; read as UTF-8");
    } else if (unicode && !utf8) {
        db_.warnings_.push_back("the text is not UTF-8 as " + std::string(version) +
                                " requires; read in code page " + std::string(codePage));
    }
    if (!utf8) {
        for (Tag& tag : tags)
            if (isTextCode(tag.code) && !TextCodec::isAscii(tag.value))
                tag.value = db_.store(TextCodec::toUtf8(tag.value, codePage));
    }
    if (unicode) return;
    std::string decoded;
    for (Tag& tag : tags)
        if (isTextCode(tag.code) && TextCodec::decodeEscapes(tag.value, decoded))
            tag.value = db_.store(decoded);
}

// Sections ----------------------------------------------------------------------------------

std::size_t DxfLoader::sectionEnd(std::size_t begin, std::string_view name) const {
    const auto& tags = db_.fileTags_;
    for (std::size_t i = begin; i < tags.size(); ++i) {
        if (tags[i].code != 0) continue;
        if (tags[i].value == "ENDSEC") return i;
        if (tags[i].value == "SECTION" || tags[i].value == "EOF")
            throw DxfError(where(i) + ": expected ENDSEC to close section " + std::string(name) +
                           ", found " + std::string(tags[i].value));
    }
    throw DxfError(where(tags.size()) + ": the file ends inside section " + std::string(name) +
                   " (ENDSEC expected)");
}

namespace {
// The standard sections in their order; others come after them.
constexpr std::string_view kSections[] = {"HEADER", "CLASSES",  "TABLES",
                                          "BLOCKS", "ENTITIES", "OBJECTS"};

std::size_t sectionRank(std::string_view name) {
    return static_cast<std::size_t>(std::find(std::begin(kSections), std::end(kSections), name) -
                                    std::begin(kSections));
}
}  // namespace

void DxfLoader::readSections() {
    const auto& tags = db_.fileTags_;
    struct Section {
        std::string_view name;
        std::size_t begin, end;
    };
    std::vector<Section> sections;
    std::size_t i = 0;
    bool sawEof = false;
    while (i < tags.size()) {
        if (isTag(tags[i], 0, "EOF")) {
            sawEof = true;
            break;
        }
        if (!isTag(tags[i], 0, "SECTION"))
            throw DxfError(where(i) + ": expected 0/SECTION, found " +
                           std::to_string(tags[i].code) + "/" +
                           std::string(tags[i].value.substr(0, 40)));
        if (i + 1 >= tags.size() || tags[i + 1].code != 2)
            throw DxfError(where(i + 1) + ": expected the section name (group code 2)");
        const std::string_view name = tags[i + 1].value;
        const std::size_t begin = i + 2, end = sectionEnd(begin, name);
        sections.push_back({name, begin, end});
        i = end + 1;
    }
    if (!sawEof) db_.warnings_.push_back("the file has no EOF after its last section");
    // Tables before the blocks and entities that name them, whatever order the file has.
    std::stable_sort(sections.begin(), sections.end(), [](const Section& a, const Section& b) {
        return sectionRank(a.name) < sectionRank(b.name);
    });
    for (const auto& [name, begin, end] : sections) {
        db_.sectionOrder_.emplace_back(name);
        if (name == "HEADER")
            readHeader(begin, end);
        else if (name == "TABLES")
            readTables(begin, end);
        else if (name == "BLOCKS")
            readBlocks(begin, end);
        else if (name == "ENTITIES")
            readEntities(begin, end);
        else if (name == "OBJECTS")
            readObjects(begin, end);
        else
            db_.rawSections_.push_back(
                {std::string(name), std::vector<Tag>(tags.begin() + begin, tags.begin() + end)});
    }
}

void DxfLoader::readHeader(std::size_t begin, std::size_t end) {
    const auto& tags = db_.fileTags_;
    std::string_view name;
    std::vector<Tag> values;
    for (std::size_t i = begin; i <= end; ++i) {
        if (i == end || tags[i].code == 9) {
            if (!name.empty()) db_.header_.setValues(name, std::move(values));
            values.clear();
            if (i < end) name = tags[i].value;
            continue;
        }
        if (name.empty())
            throw DxfError(where(i) + ": expected a header variable name (group code 9)");
        values.push_back(tags[i]);
    }
}

std::size_t DxfLoader::nextObject(std::size_t from, std::size_t end) const {
    const auto& tags = db_.fileTags_;
    std::size_t i = from + 1;
    while (i < end && tags[i].code != 0)
        ++i;
    return i;
}

DbObject* DxfLoader::adopt(std::size_t begin, std::size_t end, Context context) {
    const auto& tags = db_.fileTags_;
    auto object = makeObject(db_, std::span<const Tag>(tags.data() + begin, end - begin), context);
    const std::uint64_t handle = object->handle();
    // A handle used twice stays with the first object; the later one gets a new handle
    // once every handle of the file is known, as CAD programs recover such files.
    const bool duplicate = handle != 0 && db_.byHandle_.contains(handle);
    if (duplicate) object->handle_ = 0;
    DbObject* raw = db_.adopt(std::move(object));
    if (duplicate)
        duplicates_.push_back({raw, handle});
    else if (handle == 0 && modern())
        withoutHandle_.push_back(raw);
    return raw;
}

void DxfLoader::readTables(std::size_t begin, std::size_t end) {
    const auto& tags = db_.fileTags_;
    SymbolTable* current = nullptr;
    for (std::size_t i = begin; i < end;) {
        if (tags[i].code != 0)
            throw DxfError(where(i) + ": expected 0/TABLE, found group code " +
                           std::to_string(tags[i].code));
        const std::size_t next = nextObject(i, end);
        if (tags[i].value == "TABLE") {
            if (i + 1 >= next || tags[i + 1].code != 2)
                throw DxfError(where(i + 1) + ": expected the table name (group code 2)");
            DbObject* head = adopt(i, next, Context::Object);
            // A table given twice (or made before it was read) takes the records of both.
            current = db_.table(tags[i + 1].value);
            if (!current) current = db_.addTable(tags[i + 1].value, head);
        } else if (tags[i].value == "ENDTAB") {
            current = nullptr;
        } else {
            if (!current)
                throw DxfError(where(i) + ": table record " + std::string(tags[i].value) +
                               " outside a TABLE");
            if (tags[i].value != current->name())
                throw DxfError(where(i) + ": a " + std::string(tags[i].value) +
                               " record in table " + std::string(current->name()));
            current->add(adopt(i, next, Context::Table));
        }
        i = next;
    }
}

BlockRecord* DxfLoader::syntheticBlock(std::string_view name, bool withEnds) {
    if (BlockRecord* existing = db_.block(name)) return existing;
    if (modern()) {
        // A record in a written table, and the BLOCK and ENDBLK that the file did not give.
        BlockRecord* record = withEnds ? db_.createBlock(name)
                                       : dynamic_cast<BlockRecord*>(db_.createTableRecord(
                                             "BLOCK_RECORD", name, "AcDbBlockTableRecord"));
        db_.warnings_.push_back("block " + std::string(name) +
                                " had no BLOCK_RECORD; one was added");
        return record;
    }
    SymbolTable* records = db_.table("BLOCK_RECORD");
    if (!records) {
        // R12 files have no block records; they are kept in memory only.
        records = db_.addTable("BLOCK_RECORD", nullptr);
        db_.tables_.back()->setWritten(false);
    }
    TagListBuilder tags(db_.arena_);
    tags.text(0, "BLOCK_RECORD")
        .text(100, "AcDbSymbolTableRecord")
        .text(100, "AcDbBlockTableRecord")
        .text(2, name);
    auto* record =
        static_cast<BlockRecord*>(db_.adopt(makeOwnedObject(db_, tags.take(), Context::Table)));
    records->add(record);
    return record;
}

BlockRecord* DxfLoader::blockFor(Entity& blockBegin) {
    if (auto* record = dynamic_cast<BlockRecord*>(db_.objectByHandle(blockBegin.ownerHandle())))
        return record;
    const std::string_view name = blockBegin.text(2);
    if (BlockRecord* record = db_.block(name)) return record;
    return syntheticBlock(name, false);
}

void DxfLoader::closeOpenParent() {
    if (openParent_ && !openParent_->seqend()) {
        db_.ensureSeqend(*openParent_);
        ++repairedSeqends_;
    }
    openParent_ = nullptr;
}

void DxfLoader::placeEntity(Entity* entity, BlockRecord* block) {
    const std::string_view type = entity->type();
    const bool child = (type == "ATTRIB" && openParent_ && openParent_->isType("INSERT")) ||
                       (type == "VERTEX" && openParent_ && openParent_->isType("POLYLINE"));
    if (child) {
        openParent_->addSubEntity(entity);
        return;
    }
    if (type == "SEQEND" && openParent_) {
        openParent_->setSeqend(entity);
        openParent_ = nullptr;
        return;
    }
    closeOpenParent();
    if (!block) block = db_.modelSpace();
    if (!block) block = syntheticBlock("*Model_Space");
    block->appendEntity(entity);
    if (type == "POLYLINE" || (type == "INSERT" && entity->integer(66) == 1)) openParent_ = entity;
}

void DxfLoader::readBlocks(std::size_t begin, std::size_t end) {
    const auto& tags = db_.fileTags_;
    BlockRecord* block = nullptr;
    for (std::size_t i = begin; i < end;) {
        if (tags[i].code != 0)
            throw DxfError(where(i) + ": expected an entity (group code 0), found group code " +
                           std::to_string(tags[i].code));
        const std::size_t next = nextObject(i, end);
        auto* entity = static_cast<Entity*>(adopt(i, next, Context::Entity));
        if (entity->isType("BLOCK")) {
            if (block)
                throw DxfError(where(i) + ": BLOCK inside block " + std::string(block->name()) +
                               " (ENDBLK expected)");
            block = blockFor(*entity);
            block->setBlockBegin(entity);
        } else if (entity->isType("ENDBLK")) {
            if (!block) throw DxfError(where(i) + ": ENDBLK without BLOCK");
            closeOpenParent();
            block->setBlockEnd(entity);
            block = nullptr;
        } else {
            if (!block)
                throw DxfError(where(i) + ": entity " + std::string(entity->type()) +
                               " outside a block (BLOCK expected)");
            placeEntity(entity, block);
        }
        i = next;
    }
    if (block)
        throw DxfError(where(end) + ": block " + std::string(block->name()) + " has no ENDBLK");
}

void DxfLoader::readEntities(std::size_t begin, std::size_t end) {
    const auto& tags = db_.fileTags_;
    BlockRecord* model = db_.modelSpace();
    BlockRecord* paper = db_.paperSpace();
    for (std::size_t i = begin; i < end;) {
        if (tags[i].code != 0)
            throw DxfError(where(i) + ": expected an entity (group code 0), found group code " +
                           std::to_string(tags[i].code));
        const std::size_t next = nextObject(i, end);
        auto* entity = static_cast<Entity*>(adopt(i, next, Context::Entity));
        if (entity->isType("BLOCK") || entity->isType("ENDBLK"))
            throw DxfError(where(i) + ": " + std::string(entity->type()) +
                           " outside the BLOCKS section");
        // The ENTITIES section holds model and paper space only, whatever an owner says.
        BlockRecord* block = dynamic_cast<BlockRecord*>(db_.objectByHandle(entity->ownerHandle()));
        const bool wrongOwner = block && !block->isLayout();
        if (wrongOwner) block = nullptr;
        if (!block) {
            if (entity->inPaperSpace()) {
                if (!paper) paper = syntheticBlock("*Paper_Space");
                block = paper;
            } else {
                if (!model) model = syntheticBlock("*Model_Space");
                block = model;
            }
        }
        if (wrongOwner) entity->setOwner(block->handle());
        placeEntity(entity, block);
        i = next;
    }
    closeOpenParent();
}

void DxfLoader::readObjects(std::size_t begin, std::size_t end) {
    const auto& tags = db_.fileTags_;
    for (std::size_t i = begin; i < end;) {
        if (tags[i].code != 0)
            throw DxfError(where(i) + ": expected an object (group code 0), found group code " +
                           std::to_string(tags[i].code));
        const std::size_t next = nextObject(i, end);
        DbObject* object = adopt(i, next, Context::Object);
        if (db_.objects_.empty() && object->isType("DICTIONARY"))
            db_.namedObjects_ = object->handle();
        db_.objects_.push_back(object);
        i = next;
    }
}

// Repairs after reading ---------------------------------------------------------------------

void DxfLoader::finish() {
    const std::uint64_t seed = TagValues::toHandle(db_.header_.text("$HANDSEED"));
    if (seed > db_.nextHandle_) db_.nextHandle_ = seed;
    if (!withoutHandle_.empty()) {
        for (DbObject* object : withoutHandle_) {
            object->setHandle(db_.allocateHandle());
            db_.byHandle_.emplace(object->handle(), object);
        }
        db_.warnings_.push_back(std::to_string(withoutHandle_.size()) +
                                " objects had no handle; new handles were given");
    }
    renumberDuplicates();
    // Every drawing has a model space, even a file with no ENTITIES section, and every
    // block record of a modern file its BLOCK and ENDBLK.
    if (!db_.modelSpace()) syntheticBlock("*Model_Space");
    if (modern())
        for (BlockRecord* block : db_.blocks())
            if (!block->blockBegin()) db_.addBlockEnds(*block);
    completeSectionOrder();
    if (repairedSeqends_)
        db_.warnings_.push_back(std::to_string(repairedSeqends_) +
                                " missing SEQEND entities were added");
    // Every extended-data application must be registered. Registering adds objects to the
    // storage, so the names are gathered first.
    std::vector<std::string> missing;
    if (db_.table("APPID")) {
        std::unordered_set<std::string_view> checked;
        for (const auto& object : db_.storage_) {
            if (object->isType("XRECORD")) continue;
            for (const Tag& tag : object->tags()) {
                if (tag.code != 1001 || !checked.insert(tag.value).second) continue;
                if (!db_.isApplicationRegistered(tag.value)) missing.emplace_back(tag.value);
            }
        }
    }
    for (const std::string& app : missing) {
        db_.registerApplication(app);
        db_.warnings_.push_back("extended-data application " + app +
                                " was not in the APPID table; it was added");
    }
}

void DxfLoader::completeSectionOrder() {
    // A section that comes twice is read twice but written once, with all it holds; the
    // standard sections the file lacks are written at their place.
    auto& order = db_.sectionOrder_;
    std::unordered_set<std::string> seen;
    std::erase_if(order, [&](const std::string& name) { return !seen.insert(name).second; });
    for (std::size_t k = 0; k < std::size(kSections); ++k) {
        if (std::find(order.begin(), order.end(), kSections[k]) != order.end()) continue;
        const auto at = std::find_if(order.begin(), order.end(), [&](const std::string& name) {
            return sectionRank(name) > k;
        });
        order.insert(at, std::string(kSections[k]));
    }
}

void DxfLoader::renumberDuplicates() {
    if (duplicates_.empty()) return;
    for (const Duplicate& duplicate : duplicates_) {
        DbObject* object = duplicate.object;
        object->setHandle(db_.allocateHandle());
        db_.byHandle_.emplace(object->handle(), object);
        // Attributes, vertices and the SEQEND that followed it are its own.
        auto* entity = dynamic_cast<Entity*>(object);
        if (!entity) continue;
        const auto subs = entity->subEntities();
        std::vector<Entity*> children(subs.begin(), subs.end());
        if (entity->seqend()) children.push_back(entity->seqend());
        for (Entity* child : children)
            if (child->ownerHandle() == duplicate.handle) child->setOwner(object->handle());
    }
    db_.warnings_.push_back(
        std::to_string(duplicates_.size()) +
        (duplicates_.size() == 1 ? " object had a handle" : " objects had handles") +
        std::string(kDuplicateNote));
}

}  // namespace zvdb
