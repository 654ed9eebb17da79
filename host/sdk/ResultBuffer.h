#pragma once
// The host's result buffer: one node of a linked chain of typed values. LISP values cross
// between the host and a module as such chains.
#include <QString>

#include <cstddef>
#include <cstdint>

namespace zvdb {
class Database;
}

namespace zvsdk {

// Type codes of result buffer nodes and the host's status answers.
enum ResultCode : short {
    RTNONE = 5000,
    RTREAL = 5001,
    RTPOINT = 5002,
    RTSHORT = 5003,
    RTSTR = 5005,
    RTENAME = 5006,
    RT3DPOINT = 5009,
    RTLONG = 5010,
    RTLB = 5016,
    RTLE = 5017,
    RTDOTE = 5018,
    RTNIL = 5019,
    RTT = 5021,
    RTNORM = 5100,
    RTERROR = -5001,
    RTCAN = -5002,
};

// An entity name: a drawing object, stable for the life of its database.
struct EntityName {
    zvdb::Database* database = nullptr;
    std::uint64_t handle = 0;
    bool isNull() const { return database == nullptr || handle == 0; }
    friend bool operator==(const EntityName&, const EntityName&) = default;
};

// Where a node was made: its place in a block of nodes (see newNode), 0 for a node of its
// own. A copy of a node is a node of its own, and assigning to a node keeps its place.
class NodePlace {
public:
    NodePlace() = default;
    NodePlace(const NodePlace&) {}
    NodePlace& operator=(const NodePlace&) { return *this; }

private:
    friend struct NodeBlocks;
    std::uint16_t index_ = 0;
};

// The value is by type: a real (5001), a point (5002, 5009), a short (5003), a long (5010)
// or an entity name (5006) share their storage; a string (5005) has its own.
struct ResultBuffer {
    ResultBuffer() : rpoint{0.0, 0.0, 0.0} {}

    ResultBuffer* rbnext = nullptr;
    short restype = RTNONE;
    NodePlace place;
    union {
        double rpoint[3];
        double rreal;
        short rint;
        std::int32_t rlong;
        EntityName rlname;
    };
    QString rstring;
};

// One element of an association list of strings; the texts stay the caller's.
struct StringPair {
    const QString* key;
    const QString* value;
};

// Builds a node; the chain's owner frees it with releaseChain. Nodes are made in blocks:
// a chain of the whole drawing has a million of them.
ResultBuffer* newNode(short type);
ResultBuffer* newString(const QString& text);
ResultBuffer* newShort(short value);
ResultBuffer* newLong(std::int32_t value);
ResultBuffer* newReal(double value);
ResultBuffer* newEntity(EntityName name);
ResultBuffer* newPoint(double x, double y, double z, bool threeD = false);
// Frees a whole chain; null is fine.
void releaseChain(ResultBuffer* chain);
// A deep copy of a chain.
ResultBuffer* copyChain(const ResultBuffer* chain);
// Blocks of nodes that hold nodes not yet freed, or take new nodes (one per thread that made
// nodes): for tests.
std::size_t nodeBlocksInUse();

}  // namespace zvsdk
