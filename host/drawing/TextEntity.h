#pragma once
// A TEXT or an MTEXT. The text of an MTEXT longer than 250 bytes is kept in chunks (code 3)
// before the last piece (code 1); content() joins them.
#include "Entity.h"

#include <string>

namespace zvdb {

class TextEntity : public Entity {
public:
    using Entity::Entity;

    bool isMText() const { return isType("MTEXT"); }
    std::string content() const;
    void setContent(std::string_view content);
    Point3 position() const { return point(10); }
    void setPosition(const Point3& p);
    double height() const { return real(40, 1.0); }
    double rotation() const { return real(50); }  // degrees (TEXT)
    double widthFactor() const { return real(41, 1.0); }
    std::string_view style() const { return text(7, "Standard"); }
};

}  // namespace zvdb
