#include "Database.h"

#include "Attribute.h"
#include "AttributeLayout.h"
#include "BlockRecord.h"
#include "BlockReference.h"
#include "Dictionary.h"
#include "DrawingSkeleton.h"
#include "DxfLoader.h"
#include "LayerRecord.h"
#include "Polyline.h"
#include "SymbolTable.h"
#include "TagList.h"
#include "TagValues.h"
#include "XRecord.h"

#include <atomic>
#include <functional>

namespace zvdb {

Database::Database(Blank) : header_(arena_) {}

Database::Database() : Database(Blank{}) {
    DxfLoader::loadInto(*this, DrawingSkeleton::text());
}

Database::~Database() {
    runSettles();
}

std::string_view Database::version() const {
    return header_.text("$ACADVER", "AC1009");
}

void Database::setVersion(std::string_view version) {
    header_.setText("$ACADVER", 1, version);
}

DbObject* Database::objectByHandle(std::uint64_t handle) const {
    if (handle == 0) return nullptr;
    DbObject* object = byHandle_.find(handle);
    return object && !object->isErased() ? object : nullptr;
}

Entity* Database::entityByHandle(std::uint64_t handle) const {
    return dynamic_cast<Entity*>(objectByHandle(handle));
}

void Database::noteHandle(std::uint64_t handle) {
    if (handle >= nextHandle_) nextHandle_ = handle + 1;
}

namespace {

std::atomic<std::uint64_t> changeSequence{0};

std::uint64_t nextChange() {
    return changeSequence.fetch_add(1, std::memory_order_relaxed) + 1;
}

}  // namespace

void Database::noteChange() {
    shapeAboutToChange();
    changes_ = nextChange();
    shapes_ = changes_;
}

void Database::shapeAboutToChange() {
    runSettles();
    if (!beforeShapeChange_) return;
    // Taken out first: what the hook reads must not run it again.
    const std::function<void()> hook = std::move(beforeShapeChange_);
    beforeShapeChange_ = nullptr;
    hook();
}

void Database::settleBeforeChange(const void* owner, std::function<void()> settle) {
    forgetSettle(owner);
    settles_.emplace_back(owner, std::move(settle));
}

void Database::forgetSettle(const void* owner) {
    std::erase_if(settles_, [owner](const auto& entry) { return entry.first == owner; });
}

void Database::runSettles() {
    if (settles_.empty()) return;
    // Taken out first: a settle that changes the drawing must not run again.
    const auto settles = std::move(settles_);
    settles_.clear();
    for (const auto& entry : settles)
        entry.second();
}

void Database::noteLayerEdit(const DbObject& record) {
    changes_ = nextChange();
    // A reader that fell this far behind reads the whole table again.
    constexpr std::size_t kLongLog = 4096;
    if (layerEdits_.size() >= kLongLog) {
        layerEdits_.clear();
        layerEditsEpoch_ = changes_;
    }
    layerEdits_.push_back(&record);
}

void Database::swapContents(Database& other) {
    shapeAboutToChange();
    other.shapeAboutToChange();
    std::swap(arena_, other.arena_);
    shared_.swap(other.shared_);
    header_.swap(other.header_);
    fileTags_.swap(other.fileTags_);
    storage_.swap(other.storage_);
    byHandle_.swap(other.byHandle_);
    std::swap(nextHandle_, other.nextHandle_);
    tables_.swap(other.tables_);
    objects_.swap(other.objects_);
    rawSections_.swap(other.rawSections_);
    sectionOrder_.swap(other.sectionOrder_);
    warnings_.swap(other.warnings_);
    std::swap(namedObjects_, other.namedObjects_);
    layouts_.swap(other.layouts_);
    std::swap(patternedObjects_, other.patternedObjects_);
    modelSpace_ = KnownSpace{};
    other.modelSpace_ = KnownSpace{};
    lastReference_ = LastReference{};
    other.lastReference_ = LastReference{};
    blockNames_ = {};
    other.blockNames_ = {};
    std::swap(knownApplications_, other.knownApplications_);
    std::swap(nextKnown_, other.nextKnown_);
    for (const auto& object : storage_)
        object->database_ = this;
    for (const auto& object : other.storage_)
        object->database_ = &other;
    noteChange();
    other.noteChange();
    contentId_ = changes_;
    other.contentId_ = other.changes_;
    layerEdits_.clear();
    other.layerEdits_.clear();
    layerEditsEpoch_ = changes_;
    other.layerEditsEpoch_ = other.changes_;
}

DbObject* Database::adopt(std::unique_ptr<DbObject> object) {
    DbObject* raw = object.get();
    noteChange();
    if (raw->isPatterned()) ++patternedObjects_;
    storage_.push_back(std::move(object));
    if (raw->handle() != 0) {
        byHandle_.emplace(raw->handle(), raw);
        noteHandle(raw->handle());
    }
    return raw;
}

std::size_t Database::storageBytes() const {
    return arena_.bytesUsed() + fileTags_.capacity() * sizeof(Tag) +
           storage_.size() * (sizeof(Entity) + 48) + byHandle_.bytes();
}

// Tables -----------------------------------------------------------------------------------

SymbolTable* Database::addTable(std::string_view name, DbObject* head) {
    tables_.push_back(std::make_unique<SymbolTable>(name, head));
    return tables_.back().get();
}

SymbolTable* Database::table(std::string_view name) const {
    // Asked for at every name look-up: the length tells most tables apart before the text.
    for (const auto& t : tables_)
        if (t->name().size() == name.size() && TagValues::sameName(t->name(), name)) return t.get();
    return nullptr;
}

LayerRecord* Database::layer(std::string_view name) const {
    SymbolTable* layers = table("LAYER");
    return layers ? dynamic_cast<LayerRecord*>(layers->find(name)) : nullptr;
}

std::vector<LayerRecord*> Database::layers() const {
    std::vector<LayerRecord*> result;
    if (SymbolTable* t = table("LAYER"))
        for (DbObject* record : t->records())
            if (auto* layer = dynamic_cast<LayerRecord*>(record)) result.push_back(layer);
    return result;
}

namespace {
// The order of the TABLES section.
constexpr std::string_view kStandardTables[] = {"VPORT", "LTYPE", "LAYER",    "STYLE",       "VIEW",
                                                "UCS",   "APPID", "DIMSTYLE", "BLOCK_RECORD"};

int tableRank(std::string_view name) {
    for (std::size_t i = 0; i < std::size(kStandardTables); ++i)
        if (TagValues::sameName(kStandardTables[i], name)) return static_cast<int>(i);
    return -1;
}
}  // namespace

SymbolTable* Database::ensureTable(std::string_view name) {
    if (SymbolTable* existing = table(name)) return existing;
    const int rank = tableRank(name);
    if (rank < 0) return nullptr;
    const std::string_view standard = kStandardTables[rank];
    TagListBuilder tags(arena_);
    tags.text(0, "TABLE").text(2, standard).handle(5, allocateHandle()).handle(330, 0);
    tags.text(100, "AcDbSymbolTable").integer(70, 0);
    if (standard == "DIMSTYLE") tags.text(100, "AcDbDimStyleTable").integer(71, 0);
    DbObject* head =
        adopt(DxfLoader::makeOwnedObject(*this, tags.take(), DxfLoader::Context::Object));
    // Before the first table that comes later in the standard order; unknown ones stay last.
    auto at = tables_.begin();
    while (at != tables_.end()) {
        const int other = tableRank((*at)->name());
        if (other < 0 || other > rank) break;
        ++at;
    }
    SymbolTable* made = tables_.insert(at, std::make_unique<SymbolTable>(standard, head))->get();
    // The records that every drawing has and that new layers and entities name.
    if (standard == "LTYPE") {
        for (const char* name : {"ByBlock", "ByLayer", "Continuous"}) {
            TagListBuilder more(arena_);
            more.text(3, name == std::string_view("Continuous") ? "Solid line" : "");
            more.integer(72, 65).integer(73, 0).real(40, 0.0);
            createTableRecord("LTYPE", name, "AcDbLinetypeTableRecord", more.take());
        }
    } else if (standard == "LAYER") {
        TagListBuilder more(arena_);
        more.integer(62, 7).text(6, "Continuous");
        createTableRecord("LAYER", "0", "AcDbLayerTableRecord", more.take());
    }
    return made;
}

DbObject* Database::createTableRecord(std::string_view tableName, std::string_view name,
                                      std::string_view subclass, const std::vector<Tag>& more) {
    SymbolTable* t = ensureTable(tableName);
    if (!t) t = table(tableName);
    if (!t) return nullptr;
    TagListBuilder tags(arena_);
    const std::string_view type = t->name();
    tags.text(0, type).handle(type == "DIMSTYLE" ? 105 : 5, allocateHandle());
    tags.handle(330, t->head() ? t->head()->handle() : 0);
    tags.text(100, "AcDbSymbolTableRecord").text(100, subclass).text(2, name).integer(70, 0);
    tags.append(more);
    DbObject* record =
        adopt(DxfLoader::makeOwnedObject(*this, tags.take(), DxfLoader::Context::Table));
    t->add(record);
    return record;
}

LayerRecord* Database::createLayer(std::string_view name) {
    if (LayerRecord* existing = layer(name)) return existing;
    ensureTable("LTYPE");
    TagListBuilder more(arena_);
    more.integer(62, 7).text(6, "Continuous").integer(370, -3);
    if (LayerRecord* zero = layer("0"); zero && zero->has(390)) more.text(390, zero->text(390));
    return static_cast<LayerRecord*>(
        createTableRecord("LAYER", name, "AcDbLayerTableRecord", more.take()));
}

BlockRecord* Database::block(std::string_view name) const {
    SymbolTable* blocks = table("BLOCK_RECORD");
    return blocks ? dynamic_cast<BlockRecord*>(blocks->find(name)) : nullptr;
}

std::vector<BlockRecord*> Database::blocks() const {
    std::vector<BlockRecord*> result;
    if (SymbolTable* t = table("BLOCK_RECORD"))
        for (DbObject* record : t->records())
            if (auto* block = dynamic_cast<BlockRecord*>(record)) result.push_back(block);
    return result;
}

BlockRecord* Database::modelSpace() const {
    KnownSpace& known = modelSpace_;
    // The table's look-up by name answers the same while its index and the record stand.
    if (known.record && known.table->indexChanges() == known.index && !known.record->isErased())
        return known.record;
    BlockRecord* found = block("*Model_Space");
    known = KnownSpace{};
    if (found) {
        const SymbolTable* blocks = table("BLOCK_RECORD");
        known = KnownSpace{found, blocks, blocks->indexChanges()};
    }
    return found;
}

BlockRecord* Database::paperSpace() const {
    return block("*Paper_Space");
}

BlockRecord* Database::createBlock(std::string_view name, const Point3& basePoint) {
    if (BlockRecord* existing = block(name)) return existing;
    TagListBuilder more(arena_);
    more.integer(280, 1).integer(281, 0);
    auto* record = static_cast<BlockRecord*>(
        createTableRecord("BLOCK_RECORD", name, "AcDbBlockTableRecord", more.take()));
    addBlockEnds(*record, basePoint);
    return record;
}

void Database::addBlockEnds(BlockRecord& record, const Point3& basePoint) {
    const std::string_view name = record.name();
    TagListBuilder begin(arena_);
    begin.text(0, "BLOCK").handle(5, allocateHandle()).handle(330, record.handle());
    begin.text(100, "AcDbEntity").text(8, "0").text(100, "AcDbBlockBegin").text(2, name);
    begin.integer(70, 0).point(10, basePoint).text(3, name).text(1, "");
    auto* blockBegin = static_cast<Entity*>(
        adopt(DxfLoader::makeOwnedObject(*this, begin.take(), DxfLoader::Context::Entity)));
    TagListBuilder end(arena_);
    end.text(0, "ENDBLK").handle(5, allocateHandle()).handle(330, record.handle());
    end.text(100, "AcDbEntity").text(8, "0").text(100, "AcDbBlockEnd");
    auto* blockEnd = static_cast<Entity*>(
        adopt(DxfLoader::makeOwnedObject(*this, end.take(), DxfLoader::Context::Entity)));
    record.setBlockBegin(blockBegin);
    record.setBlockEnd(blockEnd);
}

void Database::forgetBlock(BlockRecord& record) {
    if (SymbolTable* t = table("BLOCK_RECORD")) t->reindex();
    (void)record;
}

bool Database::isApplicationRegistered(std::string_view application) const {
    SymbolTable* appids = table("APPID");
    return appids && appids->find(application);
}

namespace {
// Whether the record's name still stands in the tag where it was found: a new name is a new
// value there, or new tags.
bool stillNamed(const DbObject& record, const Tag* nameTag, std::string_view nameText) {
    const auto tags = record.tags();
    const std::less<const Tag*> before;
    return nameTag && !before(nameTag, tags.data()) && before(nameTag, tags.data() + tags.size()) &&
           nameTag->value.data() == nameText.data() && nameTag->value.size() == nameText.size();
}

// The record's name tag, where text(2) finds it; null when it has none.
const Tag* nameTagOf(const DbObject& record) {
    const int at = record.indexOf(2);
    return at >= 0 ? &record.tags()[static_cast<std::size_t>(at)] : nullptr;
}
}  // namespace

bool Database::registerApplication(std::string_view application) {
    bool made = false;
    knownApplication(application, made);
    return made;
}

Database::KnownApplication* Database::knownApplication(std::string_view application, bool& made) {
    made = false;
    if (application.empty()) return nullptr;
    // Objects given extended data name the same few applications over and over, often in
    // turns (a block and the symbol it is tied to): the names asked lately are compared
    // first, byte for byte, and their records asked whether they still bear them.
    for (KnownApplication& known : knownApplications_) {
        if (!known.record || known.name != application || known.record->isErased()) continue;
        if (stillNamed(*known.record, known.nameTag, known.nameText)) return &known;
        const std::string_view name = known.record->text(2);
        if (name == application || TagValues::sameName(name, application)) return &known;
    }
    SymbolTable* appids = table("APPID");
    DbObject* record = appids ? appids->find(application) : nullptr;
    made = record == nullptr;
    if (made) record = createTableRecord("APPID", application, "AcDbRegAppTableRecord");
    if (!record) {
        made = false;
        return nullptr;
    }
    KnownApplication& known = knownApplications_[nextKnown_];
    const Tag* nameTag = nameTagOf(*record);
    known = KnownApplication{record,
                             std::string(application),
                             nameTag,
                             nameTag ? nameTag->value : std::string_view(),
                             {}};
    nextKnown_ = (nextKnown_ + 1) % knownApplications_.size();
    return &known;
}

std::string_view Database::registeredName(std::string_view application) {
    bool made = false;
    KnownApplication* known = knownApplication(application, made);
    if (!known) return storeShared(application);
    if (known->stored.empty()) known->stored = storeShared(application);
    return known->stored;
}

// System variables -------------------------------------------------------------------------

std::string_view Database::currentLayer() const {
    return header_.text("$CLAYER", "0");
}

bool Database::setCurrentLayer(std::string_view name) {
    LayerRecord* record = layer(name);
    if (!record) return false;
    header_.setText("$CLAYER", 8, record->name());
    return true;
}

// Objects ----------------------------------------------------------------------------------

Dictionary* Database::namedObjects() const {
    return dynamic_cast<Dictionary*>(objectByHandle(namedObjects_));
}

Dictionary* Database::ensureNamedObjects() {
    if (Dictionary* root = namedObjects()) return root;
    TagListBuilder tags(arena_);
    tags.text(0, "DICTIONARY").handle(5, allocateHandle()).handle(330, 0);
    tags.text(100, "AcDbDictionary").integer(281, 1);
    auto* root = static_cast<Dictionary*>(
        adopt(DxfLoader::makeOwnedObject(*this, tags.take(), DxfLoader::Context::Object)));
    objects_.insert(objects_.begin(), root);
    namedObjects_ = root->handle();
    return root;
}

Dictionary* Database::dictionaryAt(std::span<const std::string> path, bool create) {
    Dictionary* current = create ? ensureNamedObjects() : namedObjects();
    for (const std::string& name : path) {
        if (!current) return nullptr;
        current = create ? current->getOrCreateDictionary(name) : current->getDictionary(name);
    }
    return current;
}

XRecord* Database::xrecordAt(std::span<const std::string> path, bool create) {
    if (path.empty()) return nullptr;
    Dictionary* parent = dictionaryAt(path.first(path.size() - 1), create);
    if (!parent) return nullptr;
    return create ? parent->getOrCreateXRecord(path.back()) : parent->getXRecord(path.back());
}

DbObject* Database::createObject(std::string_view type, const std::vector<Tag>& body,
                                 DbObject& owner) {
    TagListBuilder tags(arena_);
    tags.text(0, type).handle(5, allocateHandle()).handle(330, owner.handle()).append(body);
    DbObject* object =
        adopt(DxfLoader::makeOwnedObject(*this, tags.take(), DxfLoader::Context::Object));
    objects_.push_back(object);
    return object;
}

Dictionary* Database::createDictionary(DbObject& owner, bool hardOwner) {
    TagListBuilder body(arena_);
    body.text(100, "AcDbDictionary");
    if (hardOwner) body.integer(280, 1);
    body.integer(281, 1);
    return static_cast<Dictionary*>(createObject("DICTIONARY", body.take(), owner));
}

XRecord* Database::createXRecord(DbObject& owner) {
    TagListBuilder body(arena_);
    body.text(100, "AcDbXrecord").integer(280, 1);
    return static_cast<XRecord*>(createObject("XRECORD", body.take(), owner));
}

std::vector<DbObject*> Database::objects() const {
    std::vector<DbObject*> result;
    result.reserve(objects_.size());
    for (DbObject* object : objects_)
        if (!object->isErased()) result.push_back(object);
    return result;
}

// Entities ---------------------------------------------------------------------------------

namespace {
// A handle as tag text, without a string in between.
std::string_view handleText(StringArena& arena, std::uint64_t handle) {
    char buffer[16];
    std::size_t at = sizeof buffer;
    do {
        buffer[--at] = "0123456789ABCDEF"[handle & 15];
        handle >>= 4;
    } while (handle != 0);
    return arena.store({buffer + at, sizeof buffer - at});
}
}  // namespace

namespace {
// Room for the few tags (rotation, colour, linetype, alignment point) that callers set right
// after making an entity, so that setting them does not double the entity's tag storage.
constexpr std::size_t kSettersSlack = 4;
}  // namespace

std::vector<Tag> Database::entityHead(std::string_view type, std::uint64_t handle,
                                      std::uint64_t owner, std::string_view layer,
                                      bool paperSpace) {
    TagListBuilder tags(arena_);
    tags.text(0, type).handle(5, handle).handle(330, owner).text(100, "AcDbEntity");
    if (paperSpace) tags.integer(67, 1);
    tags.text(8, layer.empty() ? std::string_view("0") : layer);
    return tags.take();
}

Entity* Database::addEntity(BlockRecord& block, std::string_view type, const std::vector<Tag>& body,
                            std::string_view layer) {
    std::vector<Tag> tags =
        entityHead(type, allocateHandle(), block.handle(), layer, block.isPaperSpace());
    tags.reserve(tags.size() + body.size() + kSettersSlack);
    for (const Tag& tag : body)
        tags.push_back(Tag{tag.code, store(tag.value)});
    auto* entity = static_cast<Entity*>(
        adopt(DxfLoader::makeOwnedObject(*this, std::move(tags), DxfLoader::Context::Entity)));
    block.appendEntity(entity);
    return entity;
}

BlockReference* Database::addBlockReference(BlockRecord& owner, const BlockRecord& block,
                                            const Point3& position, const Point3& scale,
                                            double rotationDegrees, std::string_view layer,
                                            bool attributesFollow) {
    // The tags that making an INSERT through its builder gives, kept as a pattern of
    // references alike and the reference's own values: the coordinates' texts are shared
    // with the attributes placed by them.
    AttributeLayouts& layouts = attributeLayouts();
    PatternTexts& texts = layouts.texts();
    const std::uint64_t handle = allocateHandle();
    AttributeLayouts::ReferenceShape shape;
    shape.paperSpace = &owner != modelSpace() && owner.isPaperSpace();
    shape.scaled[0] = scale.x != 1.0;
    shape.scaled[1] = scale.y != 1.0;
    shape.scaled[2] = scale.z != 1.0;
    shape.rotated = rotationDegrees != 0.0;
    shape.attributesFollow = attributesFollow;
    TagPattern::Values* own = layouts.referencePattern(shape).make(arena_);
    std::uint32_t* hole = own->values();
    LastReference& last = lastReference_;
    if (last.layerNumber == 0 || last.layer != layer) {
        last.layer = layer;
        last.layerNumber = texts.shared(layer.empty() ? std::string_view("0") : storeShared(layer));
    }
    *hole++ = last.layerNumber;
    *hole++ = &block.database() != this ? texts.shared(storeShared(block.name()))
                                        : blockNameNumber(block);
    const auto real = [&](double value) { return layouts.realNumber(*this, value); };
    *hole++ = real(position.x);
    *hole++ = real(position.y);
    *hole++ = real(position.z);
    if (shape.scaled[0]) *hole++ = real(scale.x);
    if (shape.scaled[1]) *hole++ = real(scale.y);
    if (shape.scaled[2]) *hole++ = real(scale.z);
    if (shape.rotated) *hole++ = real(rotationDegrees);
    auto reference = std::make_unique<BlockReference>(*this, *own, handle, owner.handle());
    auto* made = static_cast<BlockReference*>(adopt(std::move(reference)));
    owner.appendEntity(made);
    return made;
}

std::uint32_t Database::blockNameNumber(const BlockRecord& block) {
    const auto at = reinterpret_cast<std::uintptr_t>(&block) * 0x9E3779B97F4A7C15ull;
    KnownBlockName& known = blockNames_[at >> 60];
    if (known.block != &block || !stillNamed(block, known.nameTag, known.nameText)) {
        known.block = &block;
        known.nameTag = block.isPatterned() ? nullptr : nameTagOf(block);
        // The tag text(2) reads, read once.
        known.nameText = known.nameTag ? known.nameTag->value : block.name();
        known.number = attributeLayouts().texts().shared(known.nameText);
    }
    return known.number;
}

void Database::ensureSeqend(Entity& parent) {
    if (parent.seqend()) return;
    // A SEQEND is hardly ever changed: its few tags go to the arena.
    const std::vector<Tag> head = entityHead("SEQEND", allocateHandle(), parent.handle(),
                                             parent.layer(), parent.inPaperSpace());
    auto* raw =
        static_cast<Entity*>(adopt(std::make_unique<Entity>(*this, arena_.storeTags(head))));
    parent.setSeqend(raw);
}

Attribute* Database::addAttribute(BlockReference& reference, const std::vector<Tag>& body,
                                  std::string_view layer, bool stored) {
    std::vector<Tag> tags =
        entityHead("ATTRIB", allocateHandle(), reference.handle(), layer, reference.inPaperSpace());
    tags.reserve(tags.size() + 1 + body.size() + kSettersSlack);
    tags.push_back(Tag{100, "AcDbText"});
    for (const Tag& tag : body)
        tags.push_back(Tag{tag.code, stored ? tag.value : store(tag.value)});
    auto* attribute = static_cast<Attribute*>(
        adopt(DxfLoader::makeOwnedObject(*this, std::move(tags), DxfLoader::Context::Entity)));
    reference.addSubEntity(attribute);
    if (reference.integer(66) != 1) reference.setInteger(66, 1, "AcDbBlockReference");
    ensureSeqend(reference);
    return attribute;
}

std::string_view Database::storeShared(std::string_view text) {
    constexpr std::size_t kSlots = 4096;
    if (text.size() > 24) return store(text);
    if (shared_.empty()) shared_.resize(kSlots);
    std::size_t hash = 14695981039346656037ull;
    for (const char c : text)
        hash = (hash ^ static_cast<unsigned char>(c)) * 1099511628211ull;
    std::string_view& slot = shared_[hash % kSlots];
    if (slot != text) slot = store(text);
    return slot;
}

AttributeLayouts& Database::attributeLayouts() {
    if (!layouts_) layouts_ = std::make_unique<AttributeLayouts>();
    return *layouts_;
}

void Database::forgetLayout(const DbObject& definition) {
    if (layouts_) layouts_->forget(definition);
}

std::uint32_t Database::layerNumber(const Entity& entity) {
    // A patterned entity holds its layer as a number already.
    const DbObject& object = entity;
    if (object.patterned_)
        if (const int hole = object.pattern_->pattern->holeOf(8); hole >= 0)
            if (const std::uint32_t number = object.pattern_->values()[hole]; number != 0)
                return number;
    const std::string_view layer = entity.layer();
    return attributeLayouts().texts().shared(layer.empty() ? std::string_view("0") : layer);
}

Attribute* Database::addAttributeFromLayout(BlockReference& reference, AttributeLayout& layout,
                                            AttributeLayout::Placement& where,
                                            const std::optional<std::string_view>& value,
                                            bool first) {
    const std::uint64_t handle = allocateHandle();
    Attribute* attribute = nullptr;
    bool valuePlaced = true;
    if (TagPattern::Values* own = layout.composeValues(*this, where, value)) {
        attribute = static_cast<Attribute*>(
            adopt(std::make_unique<Attribute>(*this, *own, handle, reference.handle())));
    } else {
        if (where.owner.empty()) where.owner = handleText(arena_, reference.handle());
        where.handle = handleText(arena_, handle);
        valuePlaced = layout.compose(*this, scratch_, where, value);
        // The tags go to the arena at their exact size: an attribute's later changes are
        // mostly new values, made in place; one that gains a tag takes a list of its own then.
        attribute = static_cast<Attribute*>(adopt(std::make_unique<Attribute>(
            *this, arena_.storeTags(scratch_), handle, reference.handle())));
    }
    reference.addSubEntity(attribute);
    if (first) {
        if (!reference.flag(66)) reference.setInteger(66, 1, "AcDbBlockReference");
        if (!reference.seqend()) {
            // As ensureSeqend makes it, from values the drawing holds already.
            const std::uint64_t seqend = allocateHandle();
            TagPattern::Values* own =
                attributeLayouts().seqendPattern(where.paperSpace).make(arena_);
            own->values()[0] = layerNumber(reference);
            reference.setSeqend(static_cast<Entity*>(
                adopt(std::make_unique<Entity>(*this, *own, seqend, reference.handle()))));
        }
    }
    if (!valuePlaced) attribute->setTextValue(*value);
    return attribute;
}

std::vector<Attribute*> Database::addAttributesFromDefinitions(
    BlockReference& reference, std::span<const Attribute* const> definitions,
    std::span<const std::optional<std::string_view>> values, const Transform& placement,
    double heightScale, double rotation) {
    std::vector<Attribute*> made;
    if (definitions.empty()) return made;
    made.reserve(definitions.size());
    AttributeLayout::Placement where{placement, heightScale, rotation, reference.inPaperSpace(),
                                     {},        {}};
    AttributeLayouts& layouts = attributeLayouts();
    for (std::size_t i = 0; i < definitions.size(); ++i) {
        const std::optional<std::string_view> value =
            i < values.size() ? values[i] : std::optional<std::string_view>();
        made.push_back(addAttributeFromLayout(reference, layouts.layout(*this, *definitions[i]),
                                              where, value, i == 0));
    }
    return made;
}

void Database::addAttributesFromLayouts(BlockReference& reference,
                                        std::span<AttributeLayout* const> layouts,
                                        std::span<const std::optional<std::string_view>> values,
                                        const Transform& placement, double heightScale,
                                        double rotation, std::vector<Attribute*>* made) {
    if (layouts.empty()) return;
    if (made) made->reserve(made->size() + layouts.size());
    // The reference's list of attributes at its size at once.
    reference.reserveSubEntities(layouts.size());
    AttributeLayout::Placement where{placement, heightScale, rotation, reference.inPaperSpace(),
                                     {},        {}};
    for (std::size_t i = 0; i < layouts.size(); ++i) {
        const std::optional<std::string_view> value =
            i < values.size() ? values[i] : std::optional<std::string_view>();
        Attribute* attribute = addAttributeFromLayout(reference, *layouts[i], where, value, i == 0);
        if (made) made->push_back(attribute);
    }
}

Entity* Database::addVertex(Polyline& polyline, const Point3& p) {
    std::vector<Tag> tags = entityHead("VERTEX", allocateHandle(), polyline.handle(),
                                       polyline.layer(), polyline.inPaperSpace());
    TagListBuilder body(arena_);
    body.text(100, "AcDbVertex").text(100, "AcDb2dVertex").point(10, p).integer(70, 0);
    for (const Tag& tag : body.take())
        tags.push_back(tag);
    auto* vertex = static_cast<Entity*>(
        adopt(DxfLoader::makeOwnedObject(*this, tags, DxfLoader::Context::Entity)));
    polyline.addSubEntity(vertex);
    ensureSeqend(polyline);
    return vertex;
}

}  // namespace zvdb
