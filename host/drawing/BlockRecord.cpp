#include "BlockRecord.h"

#include "Attribute.h"
#include "BlockReference.h"
#include "Database.h"
#include "Polyline.h"
#include "TagValues.h"
#include "TextEntity.h"

namespace zvdb {

namespace {
bool startsWithName(std::string_view name, std::string_view prefix) {
    return name.size() >= prefix.size() &&
           TagValues::sameName(name.substr(0, prefix.size()), prefix);
}
}  // namespace

bool BlockRecord::isModelSpace() const {
    return TagValues::sameName(name(), "*Model_Space");
}

bool BlockRecord::isPaperSpace() const {
    return startsWithName(name(), "*Paper_Space");
}

int BlockRecord::blockFlags() const {
    return begin_ ? static_cast<int>(begin_->integer(70)) : 0;
}

Point3 BlockRecord::basePoint() const {
    return begin_ ? begin_->point(10) : Point3{};
}

void BlockRecord::setBasePoint(const Point3& p) {
    if (begin_) begin_->setPoint(10, p, "AcDbBlockBegin");
}

std::vector<Entity*> BlockRecord::entities() const {
    std::vector<Entity*> live;
    live.reserve(entities_.size());
    for (Entity* entity : entities_)
        if (!entity->isErased()) live.push_back(entity);
    return live;
}

void BlockRecord::forEachEntity(const std::function<void(Entity&)>& visit) const {
    for (Entity* entity : entities_)
        if (!entity->isErased()) visit(*entity);
}

std::size_t BlockRecord::entityCount() const {
    std::size_t count = 0;
    for (Entity* entity : entities_)
        count += entity->isErased() ? 0 : 1;
    return count;
}

std::vector<Attribute*> BlockRecord::attributeDefinitions() const {
    std::vector<Attribute*> result;
    for (Entity* entity : entities_)
        if (!entity->isErased() && entity->isType("ATTDEF"))
            result.push_back(static_cast<Attribute*>(entity));
    return result;
}

void BlockRecord::appendEntity(Entity* entity) {
    entities_.push_back(entity);
}

Entity* BlockRecord::addLine(const Point3& start, const Point3& end, std::string_view layer) {
    TagListBuilder body(database().arena());
    body.text(100, "AcDbLine").point(10, start).point(11, end);
    return database().addEntity(*this, "LINE", body.take(), layer);
}

Entity* BlockRecord::addCircle(const Point3& center, double radius, std::string_view layer) {
    TagListBuilder body(database().arena());
    body.text(100, "AcDbCircle").point(10, center).real(40, radius);
    return database().addEntity(*this, "CIRCLE", body.take(), layer);
}

Entity* BlockRecord::addArc(const Point3& center, double radius, double startDegrees,
                            double endDegrees, std::string_view layer) {
    TagListBuilder body(database().arena());
    body.text(100, "AcDbCircle").point(10, center).real(40, radius);
    body.text(100, "AcDbArc").real(50, startDegrees).real(51, endDegrees);
    return database().addEntity(*this, "ARC", body.take(), layer);
}

Entity* BlockRecord::addPoint(const Point3& p, std::string_view layer) {
    TagListBuilder body(database().arena());
    body.text(100, "AcDbPoint").point(10, p);
    return database().addEntity(*this, "POINT", body.take(), layer);
}

Polyline* BlockRecord::addLwPolyline(const std::vector<Point3>& points, bool closed,
                                     std::string_view layer) {
    TagListBuilder body(database().arena());
    body.text(100, "AcDbPolyline").integer(90, static_cast<long long>(points.size()));
    body.integer(70, closed ? 1 : 0).real(43, 0.0);
    for (const Point3& p : points)
        body.point(10, p, false);
    return static_cast<Polyline*>(database().addEntity(*this, "LWPOLYLINE", body.take(), layer));
}

TextEntity* BlockRecord::addText(const Point3& position, double height, std::string_view text,
                                 std::string_view layer) {
    TagListBuilder body(database().arena());
    body.text(100, "AcDbText").point(10, position).real(40, height).text(1, text);
    body.text(100, "AcDbText");
    return static_cast<TextEntity*>(database().addEntity(*this, "TEXT", body.take(), layer));
}

TextEntity* BlockRecord::addMText(const Point3& position, double height, std::string_view text,
                                  std::string_view layer) {
    TagListBuilder body(database().arena());
    body.text(100, "AcDbMText").point(10, position).real(40, height).integer(71, 1).text(1, "");
    auto* mtext =
        static_cast<TextEntity*>(database().addEntity(*this, "MTEXT", body.take(), layer));
    mtext->setContent(text);
    return mtext;
}

Attribute* BlockRecord::addAttributeDefinition(std::string_view tag, std::string_view prompt,
                                               std::string_view defaultValue,
                                               const Point3& position, double height,
                                               std::string_view layer) {
    TagListBuilder body(database().arena());
    body.text(100, "AcDbText").point(10, position).real(40, height).text(1, defaultValue);
    body.text(100, "AcDbAttributeDefinition").text(3, prompt).text(2, tag).integer(70, 0);
    return static_cast<Attribute*>(database().addEntity(*this, "ATTDEF", body.take(), layer));
}

BlockReference* BlockRecord::addBlockReference(const BlockRecord& block, const Point3& position,
                                               const Point3& scale, double rotationDegrees,
                                               std::string_view layer) {
    return database().addBlockReference(*this, block, position, scale, rotationDegrees, layer);
}

void BlockRecord::erase() {
    if (isErased()) return;
    DbObject::erase();
    for (Entity* entity : entities_)
        entity->erase();
    if (begin_) begin_->erase();
    if (end_) end_->erase();
    database().forgetBlock(*this);
}

}  // namespace zvdb
