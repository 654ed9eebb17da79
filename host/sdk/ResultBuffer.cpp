#include "ResultBuffer.h"

#include <atomic>
#include <new>

namespace zvsdk {

// Nodes are made one after the other in blocks of a thousand, each thread in a block of its
// own; a block goes when its last node is freed, whatever thread frees it and in whatever
// order. A node knows its place in the block, so freeing it finds the block's count.
namespace {

constexpr std::uint16_t kNodes = 1024;

struct Block {
    alignas(ResultBuffer) unsigned char storage[kNodes * sizeof(ResultBuffer)];
    // nodes not yet freed, and one while the block takes new nodes
    std::atomic<std::uint32_t> live{1};
};

std::atomic<std::size_t> blocksInUse{0};

void drop(Block* block) {
    if (block->live.fetch_sub(1, std::memory_order_acq_rel) != 1) return;
    delete block;
    blocksInUse.fetch_sub(1, std::memory_order_relaxed);
}

// The block that the thread's new nodes go to.
struct Current {
    Block* block = nullptr;
    std::uint16_t next = 0;
    ~Current() {
        if (block) drop(block);
    }
};

thread_local Current current;

}  // namespace

struct NodeBlocks {
    static ResultBuffer* make() {
        Current& to = current;
        if (!to.block || to.next == kNodes) {
            auto* block = new Block;
            blocksInUse.fetch_add(1, std::memory_order_relaxed);
            if (to.block) drop(to.block);
            to.block = block;
            to.next = 0;
        }
        auto* node = new (to.block->storage + to.next * sizeof(ResultBuffer)) ResultBuffer;
        node->place.index_ = ++to.next;
        to.block->live.fetch_add(1, std::memory_order_relaxed);
        return node;
    }

    static void free(ResultBuffer* node) {
        const std::uint16_t index = node->place.index_;
        if (index == 0) {
            delete node;
            return;
        }
        // the storage opens the block
        auto* block = reinterpret_cast<Block*>(reinterpret_cast<unsigned char*>(node) -
                                               (index - 1) * sizeof(ResultBuffer));
        node->~ResultBuffer();
        drop(block);
    }
};

ResultBuffer* newNode(short type) {
    ResultBuffer* node = NodeBlocks::make();
    node->restype = type;
    return node;
}

ResultBuffer* newString(const QString& text) {
    ResultBuffer* node = newNode(RTSTR);
    node->rstring = text;
    return node;
}

ResultBuffer* newShort(short value) {
    ResultBuffer* node = newNode(RTSHORT);
    node->rint = value;
    return node;
}

ResultBuffer* newLong(std::int32_t value) {
    ResultBuffer* node = newNode(RTLONG);
    node->rlong = value;
    return node;
}

ResultBuffer* newReal(double value) {
    ResultBuffer* node = newNode(RTREAL);
    node->rreal = value;
    return node;
}

ResultBuffer* newEntity(EntityName name) {
    ResultBuffer* node = newNode(RTENAME);
    node->rlname = name;
    return node;
}

ResultBuffer* newPoint(double x, double y, double z, bool threeD) {
    ResultBuffer* node = newNode(threeD ? RT3DPOINT : RTPOINT);
    node->rpoint[0] = x;
    node->rpoint[1] = y;
    node->rpoint[2] = z;
    return node;
}

void releaseChain(ResultBuffer* chain) {
    while (chain) {
        ResultBuffer* next = chain->rbnext;
        NodeBlocks::free(chain);
        chain = next;
    }
}

ResultBuffer* copyChain(const ResultBuffer* chain) {
    ResultBuffer* head = nullptr;
    ResultBuffer** tail = &head;
    for (; chain; chain = chain->rbnext) {
        *tail = NodeBlocks::make();
        **tail = *chain;  // the copy keeps its own place
        (*tail)->rbnext = nullptr;
        tail = &(*tail)->rbnext;
    }
    return head;
}

std::size_t nodeBlocksInUse() {
    return blocksInUse.load(std::memory_order_relaxed);
}

}  // namespace zvsdk
