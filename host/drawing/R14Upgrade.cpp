#include "R14Upgrade.h"

#include "BlockRecord.h"
#include "Database.h"
#include "Dictionary.h"
#include "Entity.h"
#include "SymbolTable.h"
#include "TagValues.h"

namespace zvdb {

void R14Upgrade::upgrade(Database& database) {
    const std::string from(database.version());
    R14Upgrade job(database);
    database.setVersion("AC1015");
    if (BlockRecord* model = database.modelSpace()) job.renameSpace(*model, "*Model_Space");
    BlockRecord* paper = database.paperSpace();
    if (!paper) paper = database.createBlock("*Paper_Space");
    job.renameSpace(*paper, "*Paper_Space");
    database.ensureNamedObjects();
    job.addLayouts();
    job.declareLayoutClass();
    database.warnings_.push_back("the " + from + " drawing was converted to R2000 (AC1015)");
}

void R14Upgrade::renameSpace(BlockRecord& space, std::string_view name) {
    if (space.name() == name) return;
    space.setText(2, name, "AcDbBlockTableRecord");
    if (Entity* begin = space.blockBegin()) {
        begin->setText(2, name, "AcDbBlockBegin");
        if (begin->has(3)) begin->setText(3, name, "AcDbBlockBegin");
    }
    if (SymbolTable* records = db_.table("BLOCK_RECORD")) records->reindex();
}

// Layouts as a new R2000 drawing has them, taken from the empty drawing and tied to this
// drawing's spaces.
void R14Upgrade::addLayouts() {
    Dictionary* root = db_.namedObjects();
    if (root->get("ACAD_LAYOUT")) return;
    Dictionary* layouts = root->getOrCreateDictionary("ACAD_LAYOUT");
    const Database blank;
    const Dictionary* blankLayouts = blank.namedObjects()->getDictionary("ACAD_LAYOUT");
    const struct {
        const char* name;
        BlockRecord* space;
    } wanted[] = {{"Layout1", db_.paperSpace()}, {"Model", db_.modelSpace()}};
    for (const auto& [name, space] : wanted) {
        const DbObject* model = blankLayouts ? blankLayouts->get(name) : nullptr;
        if (!model || !space) continue;
        // The layout's own tags: no handle, reactors or owner (made anew), and its last
        // pointer, the space's block record, set to this drawing's.
        std::vector<Tag> body;
        const auto tags = model->tags();
        bool inGroup = false, sawOwner = false;
        for (std::size_t i = 1; i < tags.size(); ++i) {
            const Tag& tag = tags[i];
            if (tag.code == 102) {
                inGroup = !inGroup && tag.value.starts_with("{");
                continue;
            }
            if (inGroup || tag.code == 5) continue;
            if (tag.code == 330 && !sawOwner) {
                sawOwner = true;
                continue;
            }
            body.push_back(tag);
        }
        for (auto it = body.rbegin(); it != body.rend(); ++it)
            if (it->code == 330) {
                it->value = db_.store(TagValues::fromHandle(space->handle()));
                break;
            }
        DbObject* layout = db_.createObject("LAYOUT", body, *layouts);
        layout->addReactor(layouts->handle());
        layouts->setAt(name, *layout);
        space->setText(340, TagValues::fromHandle(layout->handle()), "AcDbBlockTableRecord");
    }
}

// R2000 readers look the LAYOUT object up in the CLASSES section.
void R14Upgrade::declareLayoutClass() {
    Database::RawSection* classes = nullptr;
    for (auto& section : db_.rawSections_)
        if (section.name == "CLASSES") classes = &section;
    if (!classes) {
        db_.rawSections_.push_back({"CLASSES", {}});
        classes = &db_.rawSections_.back();
    }
    for (std::size_t i = 0; i + 1 < classes->tags.size(); ++i)
        if (classes->tags[i].code == 0 && classes->tags[i + 1].code == 1 &&
            classes->tags[i + 1].value == "LAYOUT")
            return;
    TagListBuilder entry(db_.arena());
    entry.text(0, "CLASS").text(1, "LAYOUT").text(2, "AcDbLayout").text(3, "ObjectDBX Classes");
    entry.integer(90, 0).integer(280, 0).integer(281, 0);
    for (const Tag& tag : entry.take())
        classes->tags.push_back(tag);
}

}  // namespace zvdb
