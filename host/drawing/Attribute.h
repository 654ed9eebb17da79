#pragma once
// An ATTRIB (a value of a block reference) or an ATTDEF (its definition in a block).
#include "Entity.h"

namespace zvdb {

class Attribute : public Entity {
public:
    using Entity::Entity;

    bool isDefinition() const { return isType("ATTDEF"); }
    std::string_view tag() const { return text(2); }
    void setTag(std::string_view tag) { setText(2, tag); }
    // The value of an ATTRIB, the default value of an ATTDEF.
    std::string_view textValue() const { return text(1); }
    void setTextValue(std::string_view value) { setText(1, value, "AcDbText"); }
    std::string_view prompt() const { return text(3); }
    int flags() const { return static_cast<int>(integer(70)); }
    bool isInvisible() const { return (flags() & 1) != 0; }
    bool isConstant() const { return (flags() & 2) != 0; }
    void setInvisible(bool invisible);
    Point3 position() const { return point(10); }
    void setPosition(const Point3& p) { setPoint(10, p, "AcDbText"); }
    double height() const { return real(40, 1.0); }
    double rotation() const { return real(50); }  // degrees
    std::string_view style() const { return text(7, "Standard"); }
};

}  // namespace zvdb
