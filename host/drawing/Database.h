#pragma once
// The drawing database of one document: header variables, tables, blocks with their
// entities, and the objects (dictionaries, Xrecords and everything else), each object found
// by its handle. Handles are unique and stay the same for the life of the database; an
// erased object is no longer found.
//
// A new Database is an empty drawing (AC1027). DxfLoader reads one from a file and
// DxfWriter writes it back; objects we do not know are kept as their tags.
#include "AttributeLayout.h"
#include "Geometry.h"
#include "HandleIndex.h"
#include "HeaderVariables.h"
#include "StringArena.h"
#include "Tag.h"

#include <array>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace zvdb {

class Attribute;
class AttributeLayout;
class AttributeLayouts;
class BlockRecord;
class BlockReference;
class DbObject;
class Dictionary;
class Entity;
class LayerRecord;
class Polyline;
class SymbolTable;
class XRecord;

class Database {
public:
    Database();
    ~Database();
    Database(const Database&) = delete;
    Database& operator=(const Database&) = delete;

    // "AC1027" and so on; new drawings are AC1027.
    std::string_view version() const;
    void setVersion(std::string_view version);
    HeaderVariables& header() { return header_; }
    const HeaderVariables& header() const { return header_; }
    // Repairs made while reading (missing handles, missing SEQENDs...), one line each.
    const std::vector<std::string>& warnings() const { return warnings_; }

    // Objects by handle ----------------------------------------------------------------------
    DbObject* objectByHandle(std::uint64_t handle) const;
    Entity* entityByHandle(std::uint64_t handle) const;
    // The next free handle ($HANDSEED), above every handle in use.
    std::uint64_t handleSeed() const { return nextHandle_; }
    std::size_t objectCount() const { return storage_.size(); }
    // Goes up whenever an object is added, changed or erased: what is worked out from the
    // drawing stays good while the count stays the same. The values come from one sequence
    // for all drawings of the process, so two drawings never show the same count.
    std::uint64_t changeCount() const { return changes_; }
    // Changes whenever swapContents puts other objects in: pointers to objects taken
    // before are then no longer this drawing's.
    std::uint64_t contentId() const { return contentId_; }
    // Goes up with every change but the edits of layer records (their states, colours,
    // names): what is worked out from entities and blocks alone stays good while it stays.
    std::uint64_t shapeCount() const { return shapes_; }
    // The layer records edited or erased since the log last started again, in order, for
    // readers that follow the layers' states without walking the table. The log starts
    // again, under another epoch, when it grows long or the contents are swapped.
    const std::vector<const DbObject*>& layerEdits() const { return layerEdits_; }
    std::uint64_t layerEditsEpoch() const { return layerEditsEpoch_; }
    // Runs `hook` once, just before the next change that moves shapeCount (an object added,
    // edited or erased, contents swapped), on the drawing as it still is; another call
    // replaces it, an empty one takes it back. Work put off until it is needed (the view a
    // zoom asked for) is done there when the drawing would change under it.
    void beforeShapeChange(std::function<void()> hook) { beforeShapeChange_ = std::move(hook); }
    // Runs `settle` once, just before the next change that moves shapeCount or when the
    // drawing goes, whichever comes first: work reading the drawing on another thread ends
    // there, before anything it reads moves. Kept under `owner`, which can take it back.
    void settleBeforeChange(const void* owner, std::function<void()> settle);
    void forgetSettle(const void* owner);
    // Whether an object made since the drawing was read puts its tags together when first
    // asked for them (see DbObject::tags): reading those is not free of changes.
    bool hasPatternedObjects() const { return patternedObjects_ != 0; }
    // Trades the whole content with another database, this object staying where it is:
    // what holds a Database& goes on working and sees the other drawing (undo, reload).
    void swapContents(Database& other);

    // Tables -------------------------------------------------------------------------------
    SymbolTable* table(std::string_view name) const;  // "LAYER", "BLOCK_RECORD"...
    // One of the standard tables, made empty at its usual place when the drawing has none
    // (files from small tools often carry only what they use); null for other names.
    SymbolTable* ensureTable(std::string_view name);
    const std::vector<std::unique_ptr<SymbolTable>>& tables() const { return tables_; }
    LayerRecord* layer(std::string_view name) const;
    std::vector<LayerRecord*> layers() const;
    // The layer of this name, made when missing (colour 7, Continuous).
    LayerRecord* createLayer(std::string_view name);
    BlockRecord* block(std::string_view name) const;
    std::vector<BlockRecord*> blocks() const;
    // A new empty block definition; the existing one when the name is taken.
    BlockRecord* createBlock(std::string_view name, const Point3& basePoint = {});
    BlockRecord* modelSpace() const;
    BlockRecord* paperSpace() const;
    bool isApplicationRegistered(std::string_view application) const;
    // Adds the APPID record when missing; true when it was added.
    bool registerApplication(std::string_view application);
    // A new record at the end of a table: type, name, its subclass marker and further tags.
    // A missing standard table is made first.
    DbObject* createTableRecord(std::string_view tableName, std::string_view name,
                                std::string_view subclass, const std::vector<Tag>& more = {});

    // System variables kept in the header ------------------------------------------------
    std::string_view currentLayer() const;
    // False (and nothing changed) when there is no such layer.
    bool setCurrentLayer(std::string_view name);

    // Objects section -------------------------------------------------------------------------
    Dictionary* namedObjects() const;
    // The named-objects dictionary, made (the first object of the OBJECTS section) when the
    // drawing has none.
    Dictionary* ensureNamedObjects();
    // The dictionary at the path of names below the named-objects dictionary; missing levels
    // (the named-objects dictionary too) are made when `create` is set, else the answer is
    // null.
    Dictionary* dictionaryAt(std::span<const std::string> path, bool create);
    // The Xrecord at the path (the last name is the Xrecord's entry).
    XRecord* xrecordAt(std::span<const std::string> path, bool create);
    // New objects at the end of the OBJECTS section, owned by `owner` (not yet an entry of
    // it: put them in a dictionary with Dictionary::setAt).
    Dictionary* createDictionary(DbObject& owner, bool hardOwner = false);
    XRecord* createXRecord(DbObject& owner);
    DbObject* createObject(std::string_view type, const std::vector<Tag>& body, DbObject& owner);
    std::vector<DbObject*> objects() const;  // in section order, erased left out

    // Building blocks for the typed classes -----------------------------------------------
    // A new entity at the end of `block`: `body` holds the tags after the entity's common
    // ones (its subclass marker first).
    // A reference to `block` at the end of `owner`, without attributes; `attributesFollow`
    // marks it (66) as the first attribute added would.
    BlockReference* addBlockReference(BlockRecord& owner, const BlockRecord& block,
                                      const Point3& position, const Point3& scale,
                                      double rotationDegrees, std::string_view layer,
                                      bool attributesFollow = false);
    Entity* addEntity(BlockRecord& block, std::string_view type, const std::vector<Tag>& body,
                      std::string_view layer);
    // `stored`: the body's values are already held by this database (they are not copied).
    Attribute* addAttribute(BlockReference& reference, const std::vector<Tag>& body,
                            std::string_view layer, bool stored = false);
    // New attributes of `reference` made from definitions of its block, in order: their
    // properties, placed by `placement` (the reference's transform), their heights scaled by
    // `heightScale` and `rotation` degrees added to their own. `values`, when not empty,
    // holds for each definition the text value to give instead of its default. Their tags
    // are made whole before they are adopted.
    std::vector<Attribute*> addAttributesFromDefinitions(
        BlockReference& reference, std::span<const Attribute* const> definitions,
        std::span<const std::optional<std::string_view>> values, const Transform& placement,
        double heightScale, double rotation);
    // The same from the definitions' layouts (of this drawing, found by attributeLayouts()),
    // the attributes made put in `made` when it is given.
    void addAttributesFromLayouts(BlockReference& reference,
                                  std::span<AttributeLayout* const> layouts,
                                  std::span<const std::optional<std::string_view>> values,
                                  const Transform& placement, double heightScale, double rotation,
                                  std::vector<Attribute*>* made);
    // What the definitions of this drawing's blocks give their attributes, worked out once.
    AttributeLayouts& attributeLayouts();
    Entity* addVertex(Polyline& polyline, const Point3& p);
    StringArena& arena() { return arena_; }
    std::string_view store(std::string_view text) { return arena_.store(text); }
    // As store, for short values that come back often (coordinates, colours): a value held
    // already is answered again instead of being copied.
    std::string_view storeShared(std::string_view text);

    // Memory held by tag storage, for the benchmarks.
    std::size_t storageBytes() const;

private:
    friend class BlockRecord;
    friend class DbObject;
    friend class Extents;
    friend class DxfLoader;
    friend class DxfWriter;
    friend class DeepCloner;
    friend class R12Upgrade;
    friend class R14Upgrade;
    struct Blank {};
    explicit Database(Blank);

    struct RawSection {
        std::string name;
        std::vector<Tag> tags;
    };

    DbObject* adopt(std::unique_ptr<DbObject> object);
    std::uint64_t allocateHandle() { return nextHandle_++; }
    void noteHandle(std::uint64_t handle);
    void noteChange();
    void shapeAboutToChange();
    void noteLayerEdit(const DbObject& record);
    void forgetLayout(const DbObject& definition);
    void forgetBlock(BlockRecord& record);
    // The BLOCK and ENDBLK entities of a block record that has none.
    void addBlockEnds(BlockRecord& record, const Point3& basePoint = {});
    void ensureSeqend(Entity& parent);
    // The entity's layer as a number of the pattern texts ("0" for none).
    std::uint32_t layerNumber(const Entity& entity);
    Attribute* addAttributeFromLayout(BlockReference& reference, AttributeLayout& layout,
                                      AttributeLayout::Placement& where,
                                      const std::optional<std::string_view>& value, bool first);
    std::vector<Tag> entityHead(std::string_view type, std::uint64_t handle, std::uint64_t owner,
                                std::string_view layer, bool paperSpace);
    SymbolTable* addTable(std::string_view name, DbObject* head);

    StringArena arena_;
    HeaderVariables header_;
    std::vector<Tag> fileTags_;
    std::vector<std::unique_ptr<DbObject>> storage_;
    HandleIndex byHandle_;
    std::uint64_t nextHandle_ = 1;
    std::vector<std::unique_ptr<SymbolTable>> tables_;
    std::vector<DbObject*> objects_;
    std::vector<RawSection> rawSections_;
    std::vector<std::string> sectionOrder_;
    std::vector<std::string> warnings_;
    std::uint64_t namedObjects_ = 0;
    // The values storeShared handed out lately, by a hash of their text.
    std::vector<std::string_view> shared_;
    // Room where new objects' tags are put together before they get their own.
    std::vector<Tag> scratch_;
    std::unique_ptr<AttributeLayouts> layouts_;
    // Model space as modelSpace() found it last, good while the block table's index stays
    // the same and the record is not erased (references go there by the thousand).
    struct KnownSpace {
        BlockRecord* record = nullptr;
        const SymbolTable* table = nullptr;
        std::uint64_t index = 0;
    };
    mutable KnownSpace modelSpace_;
    // The APPID records registerApplication found or made lately, with the names they were
    // asked by, in turns.
    struct KnownApplication {
        DbObject* record = nullptr;
        std::string name;
        // The record's name tag as it stood then: while it stands so, the name is the same.
        const Tag* nameTag = nullptr;
        std::string_view nameText;
        std::string_view stored;  // `name` as storeShared gave it, once asked for
    };
    // The entry that answers for the application, its record found or made (`made` set
    // then); null for an empty name.
    KnownApplication* knownApplication(std::string_view application, bool& made);
    // The application registered, and its name as the drawing holds it for extended data.
    std::string_view registeredName(std::string_view application);
    // The layer and block of the reference made last, as numbers of the pattern texts: a
    // writer places many references on one page, of a few blocks.
    struct LastReference {
        std::string layer;
        std::uint32_t layerNumber = 0;
    };
    LastReference lastReference_;
    // The names of the blocks referenced lately, by block: a writer takes a few blocks in
    // turns (a symbol and its accessories).
    struct KnownBlockName {
        const BlockRecord* block = nullptr;
        const Tag* nameTag = nullptr;
        std::string_view nameText;
        std::uint32_t number = 0;
    };
    std::array<KnownBlockName, 16> blockNames_{};
    // The block's name as a number of the pattern texts.
    std::uint32_t blockNameNumber(const BlockRecord& block);
    std::array<KnownApplication, 4> knownApplications_{};
    std::size_t nextKnown_ = 0;
    std::uint64_t changes_ = 0;
    std::uint64_t contentId_ = 0;
    std::uint64_t shapes_ = 0;
    std::vector<const DbObject*> layerEdits_;
    std::uint64_t layerEditsEpoch_ = 0;
    std::function<void()> beforeShapeChange_;
    std::vector<std::pair<const void*, std::function<void()>>> settles_;
    std::size_t patternedObjects_ = 0;
    void runSettles();
    // Bounds of block definitions Extents worked out, by block handle and nesting depth;
    // good while the change count is `boundsAt_`.
    struct BoundsKey {
        std::uint64_t handle;
        int depth;
        bool operator==(const BoundsKey&) const = default;
    };
    struct BoundsHash {
        std::size_t operator()(const BoundsKey& k) const {
            return std::hash<std::uint64_t>{}(k.handle * 32 + std::uint64_t(k.depth));
        }
    };
    mutable std::unordered_map<BoundsKey, BoundingBox, BoundsHash> blockBounds_;
    mutable std::uint64_t boundsAt_ = 0;
};

}  // namespace zvdb
