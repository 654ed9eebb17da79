#pragma once
// Undo and redo of a drawing in whole steps. A step is what happens between the outermost
// begin and end of a group: the drawing's text before it is kept, and taking the step back
// swaps that text in (the text of the drawing as it was then goes on the redo side). A whole
// list run is then one step, however many objects it adds, changes or erases; the cost is
// one text of the drawing per step, paid once when the step opens.
#include <cstddef>
#include <cstdint>
#include <deque>
#include <string>

namespace zvdb {

class Database;

class UndoJournal {
public:
    // `maxSteps` steps are kept; the oldest go first.
    explicit UndoJournal(std::size_t maxSteps = 20) : maxSteps_(maxSteps) {}

    // Groups nest; only the outermost one makes a step, and only when the drawing changed.
    void beginGroup(Database& database);
    void endGroup(Database& database);
    bool inGroup() const { return depth_ > 0; }

    // False, the drawing untouched, when there is nothing to take back or put back, while a
    // group is open, or when the kept text no longer reads (the step is then dropped).
    bool undo(Database& database);
    bool redo(Database& database);
    bool canUndo() const { return depth_ == 0 && !undo_.empty(); }
    bool canRedo() const { return depth_ == 0 && !redo_.empty(); }
    std::size_t undoSteps() const { return undo_.size(); }
    std::size_t redoSteps() const { return redo_.size(); }
    void clear();

private:
    static bool restore(Database& database, std::string text);

    std::size_t maxSteps_;
    int depth_ = 0;
    std::string before_;
    std::uint64_t changesAtBegin_ = 0;
    std::deque<std::string> undo_;
    std::deque<std::string> redo_;
};

}  // namespace zvdb
