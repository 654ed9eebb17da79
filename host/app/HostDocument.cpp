#include "HostDocument.h"

#include "plot/PageIndex.h"

#include "Application.h"
#include "DocumentLisp.h"
#include "Interrupts.h"
#include "drawing/Database.h"
#include "drawing/UndoJournal.h"
#include "sdk/LispInterface.h"
#include "sdk/UserInterface.h"

namespace zvhost {

HostDocument::HostDocument(Application& app, const QString& fileName,
                           std::unique_ptr<zvdb::Database> database)
    : app_(app), fileName_(fileName), database_(std::move(database)) {}

HostDocument::~HostDocument() {
    if (database_) database_->beforeShapeChange(nullptr);
}

const HostDocument::View& HostDocument::view() {
    settleView(false);
    return view_;
}

void HostDocument::setView(const View& view) {
    extentsOf_.reset();
    view_ = view;
}

void HostDocument::showExtents() {
    zvdb::Database* db = database();
    if (!db) return;
    // Only the layer states are taken now: a run that zooms at its end and is never looked
    // at does not index the drawing for it.
    // The zoom before is let go first, so that the follower updates its set in place.
    extentsOf_.reset();
    extentsOf_ = hiddenLayers_.now(*db);
    db->beforeShapeChange([this] { settleView(true); });
}

void HostDocument::settleView(bool changing) {
    if (!extentsOf_) return;
    // No shape changed since the zoom, so the drawing is still the zoom's. In the middle of a
    // change (a handle taken, its object not yet in model space) an index made now would
    // pass for the drawing after the change: the bounds are then measured without one.
    zvdb::Database& db = *database();
    zvdb::BoundingBox box;
    if (plotIndex_ && plotIndex_->matches(db))
        box = plotIndex_->boundsOf(plotIndex_->layersExcept(*extentsOf_));
    else if (changing)
        box = zvplot::PageIndex::boundsExcept(db, *extentsOf_);
    else
        box = plotIndex().boundsOf(plotIndex().layersExcept(*extentsOf_));
    extentsOf_.reset();
    if (box.isEmpty()) box = zvdb::BoundingBox{{0, 0, 0}, {1, 1, 0}};
    view_ = {box.min.x, box.min.y, box.max.x, box.max.y};
}

void HostDocument::addCommand(const QString& name, zvsdk::CommandHandler handler) {
    commands_.insert(name.toUpper(), {name, std::move(handler)});
}

void HostDocument::removeCommand(const QString& name) {
    commands_.remove(name.toUpper());
}

bool HostDocument::hasCommand(const QString& name) const {
    return commands_.contains(name.toUpper());
}

QStringList HostDocument::commandNames() const {
    QStringList names;
    for (const Command& command : commands_)
        names << command.name;
    names.sort(Qt::CaseInsensitive);
    return names;
}

void HostDocument::reportCommandResult(zvsdk::CommandResult result) {
    // The worst word wins: running out of memory over a cancel over a failure.
    if (int(result) > int(result_)) result_ = result;
}

bool HostDocument::execute(const QString& name, zvsdk::CommandResult* result) {
    result_ = zvsdk::CommandResult::Succeeded;
    auto* documentLisp = dynamic_cast<DocumentLisp*>(lisp_.get());
    const int errorsBefore = documentLisp ? documentLisp->interpreter().errorsReported() : 0;
    auto it = commands_.constFind(name.toUpper());
    if (it == commands_.constEnd()) {
        if (!app_.hasHostCommand(name)) return false;
        if (!app_.runHostCommand(*this, {name})) reportCommandResult(zvsdk::CommandResult::Failed);
    } else {
        zvsdk::CommandHandler handler = it.value().handler;  // it may remove commands
        try {
            handler();
        } catch (const std::bad_alloc&) {
            // What the command published may be gone with the memory it freed on the way out.
            if (documentLisp) documentLisp->forgetPairs();
            reportCommandResult(zvsdk::CommandResult::OutOfMemory);
        }
    }
    if (documentLisp && documentLisp->interpreter().errorsReported() != errorsBefore)
        reportCommandResult(zvsdk::CommandResult::Failed);
    if (interruptRequested()) reportCommandResult(zvsdk::CommandResult::Cancelled);
    if (result) *result = result_;
    return true;
}

const zvplot::PageIndex& HostDocument::plotIndex() {
    if (!plotIndex_ || !plotIndex_->matches(*database()))
        plotIndex_ = std::make_unique<zvplot::PageIndex>(*database());
    return *plotIndex_;
}

void HostDocument::setUndoEnabled(bool enabled) {
    if (!enabled)
        undo_.reset();
    else if (!undo_)
        undo_ = std::make_unique<zvdb::UndoJournal>();
}

void HostDocument::beginUndoGroup() {
    if (undo_) undo_->beginGroup(*database());
}

void HostDocument::endUndoGroup() {
    if (undo_) undo_->endGroup(*database());
}

bool HostDocument::undo() {
    return undo_ && undo_->undo(*database());
}

bool HostDocument::redo() {
    return undo_ && undo_->redo(*database());
}

bool HostDocument::canUndo() const {
    return undo_ && undo_->canUndo();
}

bool HostDocument::canRedo() const {
    return undo_ && undo_->canRedo();
}

bool HostDocument::hasHostCommand(const QString& name) const {
    return app_.hasHostCommand(name);
}

bool HostDocument::runCommand(const QStringList& tokens) {
    return app_.runHostCommand(*this, tokens);
}

void HostDocument::printMessage(const QString& text) {
    app_.commandLine(text);
}

void HostDocument::setLisp(std::unique_ptr<zvsdk::LispInterface> lisp) {
    lisp_ = std::move(lisp);
}

int HostDocument::pickEntity(const QString& prompt, zvsdk::EntityName* picked) {
    // Picking on screen needs a view; the command-line host has none to pick from.
    std::optional<QString> answer = app_.userInterface()->answer("pick", prompt);
    Q_UNUSED(answer);
    if (picked) *picked = {};
    return zvsdk::RTCAN;
}

}  // namespace zvhost
