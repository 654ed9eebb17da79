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
    const Attribute* const one[1] = {&definition};
    return addAttributesFromDefinitions(one).front();
}

std::vector<Attribute*> BlockReference::addAttributesFromDefinitions(
    std::span<const Attribute* const> definitions,
    std::span<const std::optional<std::string_view>> values) {
    if (definitions.empty()) return {};
    return database().addAttributesFromDefinitions(*this, definitions, values, transform(),
                                                   std::abs(scale().y), rotation());
}

}  // namespace zvdb
