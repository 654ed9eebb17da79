#include "ResultBuffer.h"
#include "NodeChains.h"

#include <algorithm>
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

// `count` of the block's nodes (or its taking new ones) are done with.
void drop(Block* block, std::uint32_t count = 1) {
    if (block->live.fetch_sub(count, std::memory_order_acq_rel) != count) return;
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
    // The thread's block with room for a node.
    static Current& room() {
        Current& to = current;
        if (!to.block || to.next == kNodes) {
            auto* block = new Block;
            blocksInUse.fetch_add(1, std::memory_order_relaxed);
            if (to.block) drop(to.block);
            to.block = block;
            to.next = 0;
        }
        return to;
    }

    static ResultBuffer* place(Current& to) {
        auto* node = new (to.block->storage + to.next * sizeof(ResultBuffer)) ResultBuffer;
        node->place.index_ = ++to.next;
        return node;
    }

    static ResultBuffer* make() {
        Current& to = room();
        to.block->live.fetch_add(1, std::memory_order_relaxed);
        return place(to);
    }

    // A block's worth of nodes at a time, each block counted once.
    static ResultBuffer* makeChain(std::size_t count) {
        ResultBuffer* head = nullptr;
        ResultBuffer** tail = &head;
        while (count > 0) {
            Current& to = room();
            const auto some =
                static_cast<std::uint16_t>(std::min<std::size_t>(count, kNodes - to.next));
            to.block->live.fetch_add(some, std::memory_order_relaxed);
            for (std::uint16_t i = 0; i < some; ++i) {
                *tail = place(to);
                tail = &(*tail)->rbnext;
            }
            count -= some;
        }
        return head;
    }

    // The block a node was made in; null for a node of its own.
    static Block* blockOf(const ResultBuffer* node) {
        const std::uint16_t index = node->place.index_;
        if (index == 0) return nullptr;
        // the storage opens the block
        return reinterpret_cast<Block*>(const_cast<unsigned char*>(
            reinterpret_cast<const unsigned char*>(node) - (index - 1) * sizeof(ResultBuffer)));
    }

    // Neighbours in a chain are mostly neighbours in a block: a run of them is counted off
    // the block at once.
    static void freeChain(ResultBuffer* chain) {
        Block* run = nullptr;
        std::uint32_t inRun = 0;
        while (chain) {
            ResultBuffer* next = chain->rbnext;
            Block* block = blockOf(chain);
            if (!block) {
                delete chain;
            } else {
                chain->~ResultBuffer();
                if (block != run) {
                    if (run) drop(run, inRun);
                    run = block;
                    inRun = 0;
                }
                ++inRun;
            }
            chain = next;
        }
        if (run) drop(run, inRun);
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

ResultBuffer* newChain(std::size_t count) {
    return NodeBlocks::makeChain(count);
}

void releaseChain(ResultBuffer* chain) {
    NodeBlocks::freeChain(chain);
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
