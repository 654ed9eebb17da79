#include "Value.h"

#include "Function.h"

#include <algorithm>
#include <vector>

namespace zvlisp {

namespace {

// Blocks of one size for the small objects. The free list is a plain thread-local pointer
// (cheap to reach); the chunks behind it are freed when the thread ends.
constexpr std::size_t kBlock = 48;

struct FreeBlock {
    FreeBlock* next;
};

thread_local FreeBlock* freeBlocks __attribute__((tls_model("initial-exec"))) = nullptr;

constexpr std::size_t kCount = 1024;

struct Chunks {
    std::vector<void*> list;
    std::size_t atLastTrim = 0;
    ~Chunks() {
        for (void* chunk : list)
            ::operator delete(chunk);
        freeBlocks = nullptr;
    }
};

thread_local Chunks chunks;

void refill() {
    char* chunk = static_cast<char*>(::operator new(kBlock* kCount));
    chunks.list.push_back(chunk);
    for (std::size_t i = 0; i < kCount; ++i) {
        auto* block = reinterpret_cast<FreeBlock*>(chunk + i * kBlock);
        block->next = freeBlocks;
        freeBlocks = block;
    }
}

// Objects whose freeing was put off because the structure was too deep to recurse.
thread_local std::vector<Object*> deferred;
thread_local int deferredCount __attribute__((tls_model("initial-exec"))) = 0;

constexpr int kMaxFreeDepth = 500;

void release(Object* object, int depth);

void drop(Value& value, int depth) {
    if (Object* child = value.detach(); child && --child->refs == 0) {
        if (depth < kMaxFreeDepth)
            release(child, depth + 1);
        else {
            deferred.push_back(child);
            ++deferredCount;
        }
    }
}

// Frees an object; down a list's tail by iteration, into its elements by recursion.
void release(Object* object, int depth) {
    while (object) {
        Object* next = nullptr;
        if (object->holds == Object::Holds::CarAndCdr) {
            auto* cell = static_cast<Cons*>(object);
            drop(cell->car, depth);
            if (Object* tail = cell->cdr.detach(); tail && --tail->refs == 0) next = tail;
        } else if (object->holds == Object::Holds::Body) {
            drop(static_cast<UserFunction*>(object)->body, depth);
        }
        delete object;
        object = next;
    }
}

}  // namespace

void* Object::operator new(std::size_t size) {
    if (size > kBlock) return ::operator new(size);
    if (!freeBlocks) refill();
    FreeBlock* block = freeBlocks;
    freeBlocks = block->next;
    return block;
}

void Object::operator delete(void* block, std::size_t size) {
    if (size > kBlock) return ::operator delete(block);
    auto* free = static_cast<FreeBlock*>(block);
    free->next = freeBlocks;
    freeBlocks = free;
}

void freeObject(Object* object) {
    release(object, 0);
    while (deferredCount > 0) {
        Object* next = deferred.back();
        deferred.pop_back();
        --deferredCount;
        release(next, 0);
    }
}

std::size_t poolChunks() {
    return chunks.list.size();
}

std::size_t trimPool() {
    // Cheap unless the pool grew by some megabytes since the last look.
    constexpr std::size_t kGrowth = 64;
    if (chunks.list.size() < chunks.atLastTrim + kGrowth) return 0;
    std::vector<char*> sorted(chunks.list.size());
    std::transform(chunks.list.begin(), chunks.list.end(), sorted.begin(),
                   [](void* c) { return static_cast<char*>(c); });
    std::sort(sorted.begin(), sorted.end());
    auto chunkOf = [&](const void* block) {
        const char* at = static_cast<const char*>(block);
        auto it = std::upper_bound(sorted.begin(), sorted.end(), at);
        return std::size_t(it - sorted.begin()) - 1;  // every free block lies in a chunk
    };
    std::vector<std::uint32_t> freeCount(sorted.size(), 0);
    for (FreeBlock* b = freeBlocks; b; b = b->next)
        ++freeCount[chunkOf(b)];
    // The free list keeps the blocks of chunks still in use, in its order.
    FreeBlock* kept = nullptr;
    FreeBlock** tail = &kept;
    for (FreeBlock* b = freeBlocks; b; b = b->next)
        if (freeCount[chunkOf(b)] != kCount) {
            *tail = b;
            tail = &b->next;
        }
    *tail = nullptr;
    freeBlocks = kept;
    std::size_t released = 0;
    std::vector<void*> left;
    for (std::size_t i = 0; i < sorted.size(); ++i) {
        if (freeCount[i] == kCount) {
            ::operator delete(sorted[i]);
            ++released;
        } else {
            left.push_back(sorted[i]);
        }
    }
    chunks.list = std::move(left);
    chunks.atLastTrim = chunks.list.size();
    return released;
}

bool Value::same(const Value& other) const {
    if (type_ != other.type_) return false;
    switch (type_) {
        case Type::Nil:
            return true;
        case Type::Int:
            return u_.integer == other.u_.integer;
        case Type::Real:
            return u_.real == other.u_.real;
        case Type::Symbol:
            return u_.symbol == other.u_.symbol;
        default:
            return u_.object == other.u_.object;
    }
}

void ListBuilder::add(Value v) {
    Value cell = Value::cons(std::move(v), Value());
    Cons* added = cell.asCons();
    if (last_)
        last_->cdr = std::move(cell);
    else
        head_ = std::move(cell);
    last_ = added;
}

void ListBuilder::setTail(Value v) {
    if (last_)
        last_->cdr = std::move(v);
    else
        head_ = std::move(v);
}

Value ListBuilder::take() {
    last_ = nullptr;
    return std::move(head_);
}

}  // namespace zvlisp
