#include "R12Upgrade.h"

#include "BlockRecord.h"
#include "Database.h"
#include "DxfLoader.h"
#include "Entity.h"
#include "SymbolTable.h"
#include "TagValues.h"

#include <set>

namespace zvdb {

namespace {

// Group codes that belong to the common entity part (AcDbEntity).
bool isCommonCode(int code) {
    return code == 8 || code == 6 || code == 62 || code == 67 || code == 48 || code == 60 ||
           code == 370 || code == 420 || code == 430 || code == 440 || code == 284;
}

struct Subclasses {
    const char* first;
    const char* second = nullptr;
    std::set<int> secondCodes = {};  // codes that go to the second subclass
};

Subclasses subclassesOf(std::string_view type, long long flags) {
    if (type == "LINE") return {"AcDbLine"};
    if (type == "POINT") return {"AcDbPoint"};
    if (type == "CIRCLE") return {"AcDbCircle"};
    if (type == "ARC") return {"AcDbCircle", "AcDbArc", {50, 51}};
    if (type == "TEXT") return {"AcDbText", "AcDbText", {73}};
    if (type == "ATTDEF") return {"AcDbText", "AcDbAttributeDefinition", {2, 3, 70, 73, 74}};
    if (type == "ATTRIB") return {"AcDbText", "AcDbAttribute", {2, 70, 73, 74}};
    if (type == "INSERT") return {"AcDbBlockReference"};
    if (type == "SOLID" || type == "TRACE") return {"AcDbTrace"};
    if (type == "3DFACE") return {"AcDbFace"};
    if (type == "SHAPE") return {"AcDbShape"};
    if (type == "VIEWPORT") return {"AcDbViewport"};
    if (type == "DIMENSION") return {"AcDbDimension"};
    if (type == "POLYLINE") {
        if (flags & 8) return {"AcDb3dPolyline"};
        if (flags & 16) return {"AcDbPolygonMesh"};
        if (flags & 64) return {"AcDbPolyFaceMesh"};
        return {"AcDb2dPolyline"};
    }
    if (type == "VERTEX") {
        const char* kind = (flags & 32)    ? "AcDb3dPolylineVertex"
                           : (flags & 64)  ? "AcDbPolygonMeshVertex"
                           : (flags & 128) ? "AcDbPolyFaceMeshVertex"
                                           : "AcDb2dVertex";
        return {"AcDbVertex", kind, {10, 20, 30, 40, 41, 42, 50, 70, 71, 72, 73, 74}};
    }
    return {nullptr};
}

const char* recordSubclass(std::string_view table) {
    if (table == "VPORT") return "AcDbViewportTableRecord";
    if (table == "LTYPE") return "AcDbLinetypeTableRecord";
    if (table == "LAYER") return "AcDbLayerTableRecord";
    if (table == "STYLE") return "AcDbTextStyleTableRecord";
    if (table == "VIEW") return "AcDbViewTableRecord";
    if (table == "UCS") return "AcDbUCSTableRecord";
    if (table == "APPID") return "AcDbRegAppTableRecord";
    if (table == "DIMSTYLE") return "AcDbDimStyleTableRecord";
    return nullptr;
}

}  // namespace

std::unique_ptr<Database> R12Upgrade::upgrade(const Database& old) {
    auto fresh = std::make_unique<Database>();
    fresh->setVersion("AC1015");
    R12Upgrade job(old, *fresh);
    job.copyHeader();
    job.copyTables();
    job.copyBlocks();
    job.copyEntities();
    job.translateHandles();
    fresh->warnings_ = old.warnings_;
    fresh->warnings_.push_back("the R12 drawing was converted to R2000 (AC1015)");
    return fresh;
}

void R12Upgrade::copyHeader() {
    for (const auto& variable : old_.header().variables()) {
        if (variable.name == "$ACADVER" || variable.name == "$HANDSEED" ||
            variable.name == "$HANDLING")
            continue;
        fresh_.header().setValues(variable.name, variable.values);
    }
}

void R12Upgrade::copyTables() {
    for (const auto& table : old_.tables()) {
        const char* subclass = recordSubclass(table->name());
        SymbolTable* target = fresh_.table(table->name());
        if (!subclass || !target) continue;
        for (const DbObject* record : table->records()) {
            std::vector<Tag> more;
            for (const Tag& tag : record->tags().subspan(1)) {
                if (tag.code == 2 || tag.code == 70 || tag.code == 5 || tag.code == 105) continue;
                more.push_back(tag);
            }
            DbObject* existing = target->find(record->text(2));
            if (existing) {
                for (const Tag& tag : more)
                    existing->setText(tag.code, tag.value, subclass);
                existing->setInteger(70, record->integer(70), subclass);
                continue;
            }
            DbObject* copy =
                fresh_.createTableRecord(table->name(), record->text(2), subclass, more);
            copy->setInteger(70, record->integer(70), subclass);
            handles_[record->handle()] = copy->handle();
        }
    }
}

Entity* R12Upgrade::convert(const Entity& entity, std::uint64_t owner, bool paperSpace) {
    const std::string_view type = entity.type();
    const Subclasses subclasses = subclassesOf(type, entity.integer(70));
    const auto all = entity.tags();
    const std::size_t xdata = entity.xdataStart();
    TagListBuilder tags(fresh_.arena());
    const std::uint64_t handle = fresh_.allocateHandle();
    tags.text(0, type).handle(5, handle).handle(330, owner).text(100, "AcDbEntity");
    if (paperSpace) tags.integer(67, 1);
    bool hasLayer = false;
    for (std::size_t i = 1; i < xdata; ++i) {
        if (!isCommonCode(all[i].code) || all[i].code == 67) continue;
        hasLayer = hasLayer || all[i].code == 8;
        tags.text(all[i].code, all[i].value);
    }
    if (!hasLayer) tags.text(8, "0");
    if (subclasses.first) tags.text(100, subclasses.first);
    auto rest = [&](bool second) {
        for (std::size_t i = 1; i < xdata; ++i) {
            const int code = all[i].code;
            if (isCommonCode(code) || code == 5) continue;
            if (subclasses.second && (subclasses.secondCodes.count(code) > 0) != second) continue;
            tags.text(code, all[i].value);
        }
    };
    rest(false);
    if (subclasses.second) {
        tags.text(100, subclasses.second);
        rest(true);
    }
    for (std::size_t i = xdata; i < all.size(); ++i)
        tags.text(all[i].code, all[i].value);
    auto* copy = static_cast<Entity*>(
        fresh_.adopt(DxfLoader::makeOwnedObject(fresh_, tags.take(), DxfLoader::Context::Entity)));
    if (entity.handle()) handles_[entity.handle()] = handle;
    converted_.push_back(copy);
    return copy;
}

void R12Upgrade::place(const Entity& entity, BlockRecord& block) {
    const bool paper = block.isPaperSpace();
    Entity* copy = convert(entity, block.handle(), paper);
    block.appendEntity(copy);
    for (const Entity* sub : entity.subEntities())
        copy->addSubEntity(convert(*sub, copy->handle(), paper));
    if (entity.seqend()) copy->setSeqend(convert(*entity.seqend(), copy->handle(), paper));
}

void R12Upgrade::copyBlocks() {
    for (const BlockRecord* block : old_.blocks()) {
        if (!block->blockBegin()) continue;
        const std::string_view name = block->name();
        if (TagValues::sameName(name, "$MODEL_SPACE") || TagValues::sameName(name, "$PAPER_SPACE"))
            continue;
        BlockRecord* copy = fresh_.createBlock(name, block->basePoint());
        copy->blockBegin()->setInteger(70, block->blockFlags(), "AcDbBlockBegin");
        if (block->blockBegin()->has(1))
            copy->blockBegin()->setText(1, block->blockBegin()->text(1), "AcDbBlockBegin");
        for (const Entity* entity : block->allEntities())
            place(*entity, *copy);
    }
}

void R12Upgrade::copyEntities() {
    if (const BlockRecord* model = old_.modelSpace())
        for (const Entity* entity : model->allEntities())
            place(*entity, entity->inPaperSpace() ? *fresh_.paperSpace() : *fresh_.modelSpace());
    if (const BlockRecord* paper = old_.paperSpace())
        for (const Entity* entity : paper->allEntities())
            place(*entity, *fresh_.paperSpace());
}

void R12Upgrade::translateHandles() {
    // Handles that extended data names keep pointing at the same objects.
    for (DbObject* object : converted_) {
        const auto tags = object->tags();
        for (std::size_t i = object->xdataStart(); i < tags.size(); ++i) {
            if (tags[i].code != 1005) continue;
            const auto it = handles_.find(TagValues::toHandle(tags[i].value));
            if (it != handles_.end())
                object->editTags()[i].value = fresh_.store(TagValues::fromHandle(it->second));
        }
    }
}

}  // namespace zvdb
