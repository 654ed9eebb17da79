#pragma once
// A persistent reference to a drawing object: its database and handle. Null means none.
#include "host/sdk/ResultBuffer.h"

#include <cstdint>
#include <functional>

class OdDbObjectId {
public:
    OdDbObjectId() = default;
    OdDbObjectId(zvdb::Database* database, std::uint64_t handle)
        : database_(database), handle_(handle) {}
    explicit OdDbObjectId(const zvsdk::EntityName& nome)
        : database_(nome.database), handle_(nome.handle) {}

    bool isNull() const { return database_ == nullptr || handle_ == 0; }
    zvdb::Database* database() const { return database_; }
    std::uint64_t handle() const { return handle_; }
    zvsdk::EntityName entityName() const { return {database_, handle_}; }
    friend bool operator==(const OdDbObjectId&, const OdDbObjectId&) = default;

private:
    zvdb::Database* database_ = nullptr;
    std::uint64_t handle_ = 0;
};

template <>
struct std::hash<OdDbObjectId> {
    size_t operator()(const OdDbObjectId& id) const noexcept {
        return std::hash<std::uint64_t>()(id.handle()) ^ std::hash<const void*>()(id.database());
    }
};
