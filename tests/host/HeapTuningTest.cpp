// The command-line host's heap keeps the large blocks it frees: a block of megabytes comes
// from the heap, not a mapping of its own, and freeing it does not shrink the heap.
#include "app/HeapTuning.h"

#include <QByteArray>
#include <QtGlobal>

#include <gtest/gtest.h>

#include <malloc.h>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <thread>

namespace {

// Keeps the compiler from dropping a block nothing reads.
void Touch(void* block, std::size_t size) {
    std::memset(block, 1, size);
    asm volatile("" : : "r"(block) : "memory");
}

TEST(HeapTuning, AChoiceInTheTunablesStands) {
    qputenv("GLIBC_TUNABLES", "glibc.malloc.trim_threshold=4096");
    EXPECT_FALSE(zvhost::keepFreedHeapBlocks());
    qputenv("GLIBC_TUNABLES", "glibc.malloc.mmap_threshold=4096");
    EXPECT_FALSE(zvhost::keepFreedHeapBlocks());
    qunsetenv("GLIBC_TUNABLES");
}

TEST(HeapTuning, LargeBlocksComeFromTheHeapAndStayInItWhenFreed) {
    qunsetenv("GLIBC_TUNABLES");
    ASSERT_TRUE(zvhost::keepFreedHeapBlocks());
    constexpr std::size_t kSize = 8u << 20;
    const struct mallinfo2 before = mallinfo2();
    void* block = std::malloc(kSize);
    ASSERT_NE(block, nullptr);
    Touch(block, kSize);
    const struct mallinfo2 taken = mallinfo2();
    EXPECT_EQ(taken.hblkhd, before.hblkhd) << "the block has a mapping of its own";
    EXPECT_GE(taken.arena, before.arena + kSize - before.fordblks);
    std::free(block);
    const struct mallinfo2 freed = mallinfo2();
    EXPECT_EQ(freed.arena, taken.arena) << "the heap gave the block's room back";
    EXPECT_GE(freed.fordblks, kSize) << "the room is free for the next request";
}

// Run in a process of its own: a thread's arena, once it has one, stays.
TEST(HeapTuningDeathTest, ABlockAThreadFreesServesTheMainThreadNext) {
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    qunsetenv("GLIBC_TUNABLES");
    qunsetenv("MALLOC_ARENA_MAX");
    auto reused = [] {
        zvhost::keepFreedHeapBlocks();
        if (!zvhost::shareOneHeap()) std::_Exit(2);
        constexpr std::size_t kSize = 4u << 20;
        void* theirs = nullptr;
        std::thread([&theirs] {
            theirs = std::malloc(kSize);
            Touch(theirs, kSize);
            std::free(theirs);
        }).join();
        // Where the thread's block was, give or take the small blocks freed around it; a
        // heap of the thread's own lies elsewhere, mapped apart from the main heap.
        void* mine = std::malloc(kSize);
        const auto apart =
            reinterpret_cast<std::intptr_t>(mine) - reinterpret_cast<std::intptr_t>(theirs);
        std::_Exit(std::abs(apart) < std::intptr_t(kSize) ? 0 : 1);
    };
    EXPECT_EXIT(reused(), testing::ExitedWithCode(0), "");
}

TEST(HeapTuning, AnArenaChoiceInTheEnvironmentStands) {
    qputenv("MALLOC_ARENA_MAX", "4");
    EXPECT_FALSE(zvhost::shareOneHeap());
    qunsetenv("MALLOC_ARENA_MAX");
    qputenv("GLIBC_TUNABLES", "glibc.malloc.arena_max=2");
    EXPECT_FALSE(zvhost::shareOneHeap());
    qunsetenv("GLIBC_TUNABLES");
}

}  // namespace
