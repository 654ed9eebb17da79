#include "Entity.h"

#include "BlockRecord.h"
#include "Database.h"

namespace zvdb {

BlockRecord* Entity::block() const {
    if (parent_) return parent_->block();
    return dynamic_cast<BlockRecord*>(database().objectByHandle(ownerHandle()));
}

std::vector<Entity*> Entity::liveSubEntities() const {
    std::vector<Entity*> live;
    live.reserve(subs_.size());
    for (Entity* sub : subs_)
        if (!sub->isErased()) live.push_back(sub);
    return live;
}

void Entity::erase() {
    if (isErased()) return;
    DbObject::erase();
    for (Entity* sub : subs_)
        sub->erase();
    if (seqend_) seqend_->erase();
}

void Entity::addSubEntity(Entity* sub) {
    sub->parent_ = this;
    subs_.push_back(sub);
}

void Entity::setSeqend(Entity* seqend) {
    seqend->parent_ = this;
    seqend_ = seqend;
}

}  // namespace zvdb
