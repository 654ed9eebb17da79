#pragma once
// The heap of a command-line run keeps the large blocks it frees.
//
// A command frees and takes again blocks of megabytes: tables that grow, indexes made and
// dropped. By default glibc maps each such block on its own and unmaps it when freed, and it
// gives the top of the heap back once more than 128 KiB of it is free; taking the room again
// costs a page fault per 4 KiB, several microseconds each on a virtual machine. A run of the
// command-line host is short and ends with its process, so it keeps what it freed for the
// next request instead.

namespace zvhost {

// Blocks below this size come from the heap rather than a mapping of their own.
inline constexpr int kHeapMappedBlockBytes = 256 << 20;
// The free top of the heap is given back only past this size.
inline constexpr int kHeapTrimBytes = 1 << 30;

// Sets both thresholds, unless GLIBC_TUNABLES already chooses either of them (a choice made
// there stands). Returns whether they were set.
bool keepFreedHeapBlocks();

// Keeps every thread on the main heap (one arena), unless GLIBC_TUNABLES or
// MALLOC_ARENA_MAX chooses: the threads that work for the main thread (an index worked out
// ahead, the freeing of a list's items) give what they free back where the main thread
// takes its next blocks, instead of to a heap of their own while the main thread maps new
// pages. Call it before any thread starts. Returns whether it was set.
bool shareOneHeap();

}  // namespace zvhost
