#pragma once
// The host's result buffer: one node of a linked chain of typed values. LISP values cross
// between the host and a module as such chains.
#include <QString>

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

struct ResultBuffer {
    ResultBuffer* rbnext = nullptr;
    short restype = RTNONE;
    double rreal = 0.0;
    double rpoint[3] = {0.0, 0.0, 0.0};
    short rint = 0;
    std::int32_t rlong = 0;
    QString rstring;
    EntityName rlname;
};

// One element of an association list of strings; the texts stay the caller's.
struct StringPair {
    const QString* key;
    const QString* value;
};

// Builds a node; the chain's owner frees it with releaseChain.
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

}  // namespace zvsdk
