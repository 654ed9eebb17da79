#include "BlockReference.h"

#include "Attribute.h"
#include "BlockRecord.h"
#include "Database.h"
#include "TagValues.h"

#include <cmath>
#include <numbers>

namespace zvdb {

BlockRecord* BlockReference::definition() const {
    return database().block(blockName());
}

void BlockReference::setScale(const Point3& scale) {
    setReal(41, scale.x, "AcDbBlockReference");
    setReal(42, scale.y, "AcDbBlockReference");
    setReal(43, scale.z, "AcDbBlockReference");
}

Transform BlockReference::transform() const {
    const BlockRecord* block = definition();
    const Point3 base = block ? block->basePoint() : Point3{};
    const Point3 s = scale();
    return Transform::fromOcs(extrusion()) * Transform::translation(position()) *
           Transform::rotationZ(rotation() * std::numbers::pi / 180.0) *
           Transform::scaling(s.x, s.y, s.z) * Transform::translation(base * -1.0);
}

std::vector<Attribute*> BlockReference::attributes() const {
    std::vector<Attribute*> result;
    for (Entity* sub : subEntities())
        if (!sub->isErased())
            if (auto* attribute = dynamic_cast<Attribute*>(sub)) result.push_back(attribute);
    return result;
}

Attribute* BlockReference::attribute(std::string_view tag) const {
    for (Entity* sub : subEntities()) {
        auto* attribute = dynamic_cast<Attribute*>(sub);
        if (attribute && !attribute->isErased() && TagValues::sameName(attribute->tag(), tag))
            return attribute;
    }
    return nullptr;
}

Attribute* BlockReference::addAttribute(std::string_view tag, std::string_view value,
                                        const Point3& position, double height) {
    TagListBuilder body(database().arena());
    body.point(10, position).real(40, height).text(1, value);
    body.text(100, "AcDbAttribute").text(2, tag).integer(70, 0);
    return database().addAttribute(*this, body.take(), layer());
}

Attribute* BlockReference::addAttributeFromDefinition(const Attribute& definition) {
    const Transform t = transform();
    std::vector<Tag> body;
    const auto all = definition.tags();
    const std::size_t end = definition.xdataStart();
    bool started = false;
    for (std::size_t i = 1; i < end; ++i) {
        const Tag& tag = all[i];
        if (tag.code == 100 && tag.value == "AcDbText") started = true;
        if (!started) continue;
        if (tag.code == 100 && tag.value == "AcDbText") continue;
        if (tag.code == 100 && tag.value == "AcDbAttributeDefinition") {
            body.push_back(Tag{100, "AcDbAttribute"});
            continue;
        }
        if (tag.code == 3) continue;  // the prompt belongs to the definition
        body.push_back(tag);
    }
    // A definition of the same drawing lends its values as they are; the marker put in is a
    // literal, which lives as long as any drawing.
    Attribute* attribute = database().addAttribute(*this, body, definition.layer(),
                                                   &definition.database() == &database());
    attribute->setPosition(t.apply(definition.position()));
    if (definition.has(11)) attribute->setPoint(11, t.apply(definition.point(11)), "AcDbText");
    const double s = scale().y;
    attribute->setReal(40, definition.height() * std::abs(s), "AcDbText");
    if (rotation() != 0.0 || definition.rotation() != 0.0)
        attribute->setReal(50, definition.rotation() + rotation(), "AcDbText");
    attribute->setColor(definition.color());
    if (definition.has(6)) attribute->setLinetype(definition.linetype());
    return attribute;
}

}  // namespace zvdb
