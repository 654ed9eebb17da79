#pragma once
// The way attributes were made before the one-pass builder: the reference the tests compare
// the builder with, and the bench times it against.
#include "drawing/Attribute.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"

#include <cmath>
#include <vector>

namespace zvdb {

// An attribute made the step-by-step way: a bare attribute with the definition's tags after
// its text subclass, then its position, alignment point, height, rotation, colour and
// linetype set one by one through the object's setters. `stored`: the definition's values
// are held by the reference's database (not copied again).
inline Attribute* madeStepByStep(BlockReference& reference, const Attribute& definition,
                                 bool stored = false) {
    const Transform t = reference.transform();
    std::vector<Tag> body;
    const auto all = definition.tags();
    bool started = false;
    for (std::size_t i = 1; i < definition.xdataStart(); ++i) {
        const Tag& item = all[i];
        const bool marker = item.code == 100 && item.value == "AcDbText";
        started = started || marker;
        if (!started || marker || item.code == 3) continue;
        if (item.code == 100 && item.value == "AcDbAttributeDefinition")
            body.push_back(Tag{100, "AcDbAttribute"});
        else
            body.push_back(item);
    }
    Attribute* attribute =
        reference.database().addAttribute(reference, body, definition.layer(), stored);
    attribute->setPosition(t.apply(definition.position()));
    if (definition.has(11)) attribute->setPoint(11, t.apply(definition.point(11)), "AcDbText");
    attribute->setReal(40, definition.height() * std::abs(reference.scale().y), "AcDbText");
    if (reference.rotation() != 0.0 || definition.rotation() != 0.0)
        attribute->setReal(50, definition.rotation() + reference.rotation(), "AcDbText");
    attribute->setColor(definition.color());
    if (definition.has(6)) attribute->setLinetype(definition.linetype());
    return attribute;
}

}  // namespace zvdb
