#include "ObjectPool.h"

#include <mutex>
#include <new>
#include <vector>

namespace zvdb::pool {

namespace {

constexpr std::size_t kGrain = 8;
constexpr std::size_t kSizes = 32;  // up to 256 bytes; larger ones go to the heap
constexpr std::size_t kChunk = 64 * 1024;

struct FreeRoom {
    FreeRoom* next;
};

// Each thread takes and gives back through its own lists, without a lock; room given back
// on another thread than the one that took it is simply reused there.
struct Lists {
    FreeRoom* free[kSizes] = {};
    char* cursor = nullptr;
    std::size_t left = 0;
};

thread_local Lists lists __attribute__((tls_model("initial-exec")));

// Every chunk stays reachable, for the life of the program. Apart from take, which stays
// short for the many calls that only unlink a free room.
[[gnu::noinline]] char* newChunk() {
    static std::mutex guard;
    static std::vector<char*>* chunks = new std::vector<char*>();
    char* chunk = static_cast<char*>(::operator new(kChunk));
    const std::lock_guard<std::mutex> lock(guard);
    chunks->push_back(chunk);
    return chunk;
}

}  // namespace

void* take(std::size_t bytes) {
    const std::size_t size = (bytes + kGrain - 1) / kGrain;
    if (size == 0 || size > kSizes) return ::operator new(bytes);
    Lists& own = lists;
    if (FreeRoom* room = own.free[size - 1]) {
        own.free[size - 1] = room->next;
        return room;
    }
    const std::size_t rounded = size * kGrain;
    if (own.left < rounded) {
        own.cursor = newChunk();
        own.left = kChunk;
    }
    void* room = own.cursor;
    own.cursor += rounded;
    own.left -= rounded;
    return room;
}

void give(void* room, std::size_t bytes) noexcept {
    if (!room) return;
    const std::size_t size = (bytes + kGrain - 1) / kGrain;
    if (size == 0 || size > kSizes) {
        ::operator delete(room);
        return;
    }
    Lists& own = lists;
    auto* freed = static_cast<FreeRoom*>(room);
    freed->next = own.free[size - 1];
    own.free[size - 1] = freed;
}

}  // namespace zvdb::pool
