#pragma once
// An LWPOLYLINE (vertices in its own tags) or a 2-D POLYLINE (vertices as VERTEX entities).
#include "Entity.h"

namespace zvdb {

class Polyline : public Entity {
public:
    using Entity::Entity;

    bool isLightweight() const { return isType("LWPOLYLINE"); }
    // Vertices in the entity's own coordinates (elevation as z for LWPOLYLINE).
    std::vector<Point3> vertices() const;
    // Replaces the vertices (bulges and widths are dropped).
    void setVertices(const std::vector<Point3>& points);
    bool isClosed() const { return (integer(70) & 1) != 0; }
    void setClosed(bool closed);
};

}  // namespace zvdb
