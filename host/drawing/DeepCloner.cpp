#include "DeepCloner.h"

#include "BlockRecord.h"
#include "BlockReference.h"
#include "Database.h"
#include "Dictionary.h"
#include "DxfLoader.h"
#include "LayerRecord.h"
#include "SymbolTable.h"
#include "TagValues.h"

namespace zvdb {

std::uint64_t DeepCloner::translated(std::uint64_t sourceHandle) const {
    const auto it = map_.find(sourceHandle);
    return it == map_.end() ? 0 : it->second;
}

std::vector<Tag> DeepCloner::copiedTags(const DbObject& object, std::uint64_t owner,
                                        std::uint64_t& newHandle) {
    newHandle = target_.allocateHandle();
    map_[object.handle()] = newHandle;
    std::vector<Tag> tags;
    const auto all = object.tags();
    tags.reserve(all.size());
    bool skipping = false;
    bool ownerSet = false;
    for (std::size_t i = 0; i < all.size(); ++i) {
        const Tag& tag = all[i];
        if (tag.code == 102 && tag.value == "{ACAD_REACTORS") skipping = true;
        if (skipping) {
            if (tag.code == 102 && tag.value == "}") skipping = false;
            continue;
        }
        if (i > 0 && i < 3 && (tag.code == 5 || (tag.code == 105 && object.isType("DIMSTYLE")))) {
            tags.push_back(Tag{tag.code, target_.store(TagValues::fromHandle(newHandle))});
        } else if (tag.code == 330 && !ownerSet && i < 8) {
            ownerSet = true;
            tags.push_back(Tag{330, target_.store(TagValues::fromHandle(owner))});
        } else {
            tags.push_back(Tag{tag.code, target_.store(tag.value)});
        }
    }
    return tags;
}

DbObject* DeepCloner::cloneOwned(const DbObject& object, std::uint64_t owner) {
    std::uint64_t handle = 0;
    auto tags = copiedTags(object, owner, handle);
    const bool isEntity = dynamic_cast<const Entity*>(&object) != nullptr;
    DbObject* copy = target_.adopt(DxfLoader::makeOwnedObject(
        target_, std::move(tags),
        isEntity ? DxfLoader::Context::Entity : DxfLoader::Context::Object));
    if (!isEntity) target_.objects_.push_back(copy);
    clones_.push_back(copy);
    if (const DbObject* xdict = object.extensionDictionary()) cloneOwned(*xdict, handle);
    if (const auto* dictionary = dynamic_cast<const Dictionary*>(&object)) {
        for (const auto& entry : dictionary->entries()) {
            const DbObject* child = source_.objectByHandle(entry.handle);
            if (child && child->ownerHandle() == object.handle() && !map_.count(child->handle()))
                cloneOwned(*child, handle);
        }
    }
    return copy;
}

void DeepCloner::bringRecord(std::string_view table, std::string_view name) {
    if (name.empty() || TagValues::sameName(name, "BYLAYER") ||
        TagValues::sameName(name, "BYBLOCK"))
        return;
    SymbolTable* targetTable = target_.table(table);
    SymbolTable* sourceTable = source_.table(table);
    if (!targetTable || !sourceTable || targetTable->find(name)) return;
    const DbObject* record = sourceTable->find(name);
    if (!record) return;
    if (table == "LAYER") {
        const auto* layer = static_cast<const LayerRecord*>(record);
        LayerRecord* copy = target_.createLayer(layer->name());
        copy->setInteger(62, layer->integer(62, 7), "AcDbLayerTableRecord");
        copy->setInteger(70, layer->integer(70), "AcDbLayerTableRecord");
        bringRecord("LTYPE", layer->linetype());
        copy->setText(6, layer->linetype(), "AcDbLayerTableRecord");
        for (std::string_view app : layer->xdataApplications())
            copy->setXData(app, layer->xdata(app));
        return;
    }
    std::uint64_t handle = 0;
    auto tags =
        copiedTags(*record, targetTable->head() ? targetTable->head()->handle() : 0, handle);
    DbObject* copy = target_.adopt(
        DxfLoader::makeOwnedObject(target_, std::move(tags), DxfLoader::Context::Table));
    clones_.push_back(copy);
    targetTable->add(copy);
}

void DeepCloner::bringSymbols(const Entity& entity) {
    bringRecord("LAYER", entity.layer());
    if (entity.has(6)) bringRecord("LTYPE", entity.linetype());
    if (entity.has(7)) bringRecord("STYLE", entity.text(7));
    if (const auto* reference = dynamic_cast<const BlockReference*>(&entity))
        if (const BlockRecord* block = reference->definition()) cloneBlock(*block);
}

Entity* DeepCloner::cloneEntity(const Entity& entity, std::uint64_t owner, BlockRecord* block) {
    bringSymbols(entity);
    auto* copy = static_cast<Entity*>(cloneOwned(entity, owner));
    if (block) block->appendEntity(copy);
    for (const Entity* sub : entity.subEntities()) {
        if (sub->isErased()) continue;
        bringSymbols(*sub);
        copy->addSubEntity(static_cast<Entity*>(cloneOwned(*sub, copy->handle())));
    }
    if (entity.seqend())
        copy->setSeqend(static_cast<Entity*>(cloneOwned(*entity.seqend(), copy->handle())));
    return copy;
}

std::vector<Entity*> DeepCloner::cloneEntities(std::span<Entity* const> entities,
                                               BlockRecord& into) {
    std::vector<Entity*> copies;
    copies.reserve(entities.size());
    for (const Entity* entity : entities) {
        if (entity->isErased()) continue;
        Entity* copy = cloneEntity(*entity, into.handle(), &into);
        // Paper-space flags follow the target block.
        if (copy->inPaperSpace() != into.isPaperSpace())
            copy->setInteger(67, into.isPaperSpace() ? 1 : 0, "AcDbEntity");
        copies.push_back(copy);
    }
    translateReferences();
    return copies;
}

BlockRecord* DeepCloner::cloneBlock(const BlockRecord& block) {
    if (BlockRecord* existing = target_.block(block.name())) return existing;
    BlockRecord* copy = target_.createBlock(block.name(), block.basePoint());
    map_[block.handle()] = copy->handle();
    if (block.blockBegin()) {
        copy->blockBegin()->setInteger(70, block.blockFlags(), "AcDbBlockBegin");
        map_[block.blockBegin()->handle()] = copy->blockBegin()->handle();
    }
    for (const Entity* entity : block.entities())
        cloneEntity(*entity, copy->handle(), copy);
    translateReferences();
    return copy;
}

BlockRecord* DeepCloner::cloneModelSpaceAsBlock(std::string_view name) {
    if (BlockRecord* existing = target_.block(name)) return existing;
    BlockRecord* copy = target_.createBlock(name, source_.header().point("$INSBASE"));
    const BlockRecord* model = source_.modelSpace();
    if (model)
        for (const Entity* entity : model->entities()) {
            Entity* clone = cloneEntity(*entity, copy->handle(), copy);
            if (clone->inPaperSpace()) clone->setInteger(67, 0, "AcDbEntity");
        }
    translateReferences();
    return copy;
}

void DeepCloner::translateReferences() {
    for (DbObject* copy : clones_) {
        const auto tags = copy->tags();
        for (std::size_t i = 3; i < tags.size(); ++i) {
            if (!isPointerCode(tags[i].code)) continue;
            const std::uint64_t old = TagValues::toHandle(tags[i].value);
            if (old == 0) continue;
            std::uint64_t now = translated(old);
            if (now == 0 && tags[i].code == 1005) continue;  // extended data may name anything
            if (now == 0 && copy->ownerHandle() == TagValues::toHandle(tags[i].value) &&
                tags[i].code == 330)
                continue;
            if (now == old) continue;
            copy->editTags()[i].value = target_.store(TagValues::fromHandle(now));
        }
    }
    clones_.clear();
}

}  // namespace zvdb
