#include "HiddenLayers.h"

#include "drawing/Database.h"
#include "drawing/LayerRecord.h"
#include "drawing/SymbolTable.h"
#include "drawing/TagValues.h"

namespace zvplot {

namespace {

bool hidden(const zvdb::LayerRecord& record) {
    return record.isFrozen() || record.isOff();
}

std::uint64_t tableIndex(const zvdb::Database& database) {
    const zvdb::SymbolTable* table = database.table("LAYER");
    return table ? table->indexChanges() : 0;
}

}  // namespace

std::shared_ptr<const HiddenLayers::Names> HiddenLayers::now(const zvdb::Database& database) {
    const std::vector<const zvdb::DbObject*>& edits = database.layerEdits();
    // A reader that fell behind the log, another drawing or a table indexed again (a record
    // added, renamed or erased) reads the whole table.
    if (!names_ || database_ != &database || epoch_ != database.layerEditsEpoch() ||
        tableIndexAt_ != tableIndex(database) || editsSeen_ > edits.size()) {
        readAll(database);
        return names_;
    }
    if (editsSeen_ == edits.size()) return names_;
    if (names_.use_count() > 1) names_ = std::make_shared<Names>(*names_);
    for (; editsSeen_ < edits.size(); ++editsSeen_) {
        auto known = recordNames_.find(edits[editsSeen_]);
        if (known == recordNames_.end()) {
            readAll(database);
            return names_;
        }
        const auto* record = static_cast<const zvdb::LayerRecord*>(known->first);
        if (!record->isErased() && hidden(*record))
            names_->insert(known->second);
        else
            names_->erase(known->second);
    }
    return names_;
}

void HiddenLayers::readAll(const zvdb::Database& database) {
    names_ = std::make_shared<Names>();
    recordNames_.clear();
    for (const zvdb::LayerRecord* record : database.layers()) {
        std::string name = zvdb::TagValues::upperName(record->name());
        if (hidden(*record)) names_->insert(name);
        recordNames_.emplace(record, std::move(name));
    }
    database_ = &database;
    epoch_ = database.layerEditsEpoch();
    tableIndexAt_ = tableIndex(database);
    editsSeen_ = database.layerEdits().size();
}

}  // namespace zvplot
