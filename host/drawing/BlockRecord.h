#pragma once
// A BLOCK_RECORD: one block of the drawing (model space, a paper space layout or a block
// definition) with its BLOCK and ENDBLK entities and its entities in order.
#include "DbObject.h"

#include <functional>

namespace zvdb {

class Attribute;
class BlockReference;
class Entity;
class Polyline;
class TextEntity;

class BlockRecord : public DbObject {
public:
    using DbObject::DbObject;

    std::string_view name() const { return text(2); }
    bool isModelSpace() const;
    bool isPaperSpace() const;
    bool isLayout() const { return isModelSpace() || isPaperSpace(); }
    // Anonymous (*U, *D...), external reference and similar flags of the BLOCK entity.
    int blockFlags() const;
    Entity* blockBegin() const { return begin_; }
    Entity* blockEnd() const { return end_; }
    Point3 basePoint() const;
    void setBasePoint(const Point3& p);

    // Entities in order, erased ones left out.
    std::vector<Entity*> entities() const;
    void forEachEntity(const std::function<void(Entity&)>& visit) const;
    std::size_t entityCount() const;
    // How many entities the block has had, erased ones too: it grows with every one added.
    std::size_t entitiesMade() const { return entities_.size(); }
    // The ATTDEFs of the block in order.
    std::vector<Attribute*> attributeDefinitions() const;

    // New entities at the end of the block, on `layer`.
    Entity* addLine(const Point3& start, const Point3& end, std::string_view layer = "0");
    Entity* addCircle(const Point3& center, double radius, std::string_view layer = "0");
    Entity* addArc(const Point3& center, double radius, double startDegrees, double endDegrees,
                   std::string_view layer = "0");
    Entity* addPoint(const Point3& p, std::string_view layer = "0");
    Polyline* addLwPolyline(const std::vector<Point3>& points, bool closed,
                            std::string_view layer = "0");
    TextEntity* addText(const Point3& position, double height, std::string_view text,
                        std::string_view layer = "0");
    TextEntity* addMText(const Point3& position, double height, std::string_view text,
                         std::string_view layer = "0");
    Attribute* addAttributeDefinition(std::string_view tag, std::string_view prompt,
                                      std::string_view defaultValue, const Point3& position,
                                      double height, std::string_view layer = "0");
    // A reference to `block`, without attributes (add them with BlockReference).
    BlockReference* addBlockReference(const BlockRecord& block, const Point3& position,
                                      const Point3& scale = {1, 1, 1}, double rotationDegrees = 0,
                                      std::string_view layer = "0");

    // Erases the block, its entities and its BLOCK/ENDBLK.
    void erase() override;

protected:
    friend class Database;
    friend class DxfLoader;
    friend class DxfWriter;
    friend class DeepCloner;
    friend class R12Upgrade;
    void setBlockBegin(Entity* begin) { begin_ = begin; }
    void setBlockEnd(Entity* end) { end_ = end; }
    void appendEntity(Entity* entity);
    const std::vector<Entity*>& allEntities() const { return entities_; }

private:
    Entity* begin_ = nullptr;
    Entity* end_ = nullptr;
    std::vector<Entity*> entities_;
    std::size_t erasedSeen_ = 0;
};

}  // namespace zvdb
