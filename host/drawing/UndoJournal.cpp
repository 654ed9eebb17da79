#include "UndoJournal.h"

#include "Database.h"
#include "DxfError.h"
#include "DxfLoader.h"
#include "DxfWriter.h"

namespace zvdb {

void UndoJournal::beginGroup(Database& database) {
    if (depth_++ > 0) return;
    before_ = DxfWriter::toText(database);
    changesAtBegin_ = database.changeCount();
}

void UndoJournal::endGroup(Database& database) {
    if (depth_ == 0 || --depth_ > 0) return;
    std::string before = std::move(before_);
    before_.clear();
    if (database.changeCount() == changesAtBegin_) return;
    undo_.push_back(std::move(before));
    if (undo_.size() > maxSteps_) undo_.pop_front();
    redo_.clear();
}

bool UndoJournal::restore(Database& database, std::string text) {
    try {
        auto earlier = DxfLoader::load(std::move(text));
        database.swapContents(*earlier);
        return true;
    } catch (const DxfError&) {
        return false;
    }
}

bool UndoJournal::undo(Database& database) {
    if (!canUndo()) return false;
    std::string now = DxfWriter::toText(database);
    std::string earlier = std::move(undo_.back());
    undo_.pop_back();
    if (!restore(database, std::move(earlier))) return false;
    redo_.push_back(std::move(now));
    return true;
}

bool UndoJournal::redo(Database& database) {
    if (!canRedo()) return false;
    std::string now = DxfWriter::toText(database);
    std::string later = std::move(redo_.back());
    redo_.pop_back();
    if (!restore(database, std::move(later))) return false;
    undo_.push_back(std::move(now));
    return true;
}

void UndoJournal::clear() {
    undo_.clear();
    redo_.clear();
}

}  // namespace zvdb
