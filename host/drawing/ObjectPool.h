#pragma once
// Room for the drawing's objects and their small parts. A drawing holds them by the hundred
// thousand, in a few sizes, and lets them all go together: each size keeps the room of
// those that went for those that come and takes new room in large chunks, without a
// header per object. Chunks are never given back (an object may outlive the thread that
// made it, and its room is only reused, never freed).
#include <cstddef>

namespace zvdb::pool {

void* take(std::size_t bytes);
void give(void* room, std::size_t bytes) noexcept;

}  // namespace zvdb::pool
