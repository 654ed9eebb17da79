#pragma once
// Bounds of entities and block definitions in the drawing's coordinates.
#include "Geometry.h"

namespace zvdb {

class BlockRecord;
class Entity;

class Extents {
public:
    // The world bounds of an entity; an empty box for kinds without bounds. A block
    // reference gives its block's bounds under its transform, and its attributes' when
    // `withAttributes` is set. Text bounds are estimated from height and length.
    static BoundingBox ofEntity(const Entity& entity, bool withAttributes);
    // The bounds of a block's entities in the block's coordinates, without attributes.
    static BoundingBox ofBlock(const BlockRecord& block);

private:
    static BoundingBox ofEntity(const Entity& entity, bool withAttributes, int depth);
    static BoundingBox ofBlock(const BlockRecord& block, int depth);
    static BoundingBox ofText(const Entity& text);
    static BoundingBox ofArc(const Entity& arc);
};

}  // namespace zvdb
