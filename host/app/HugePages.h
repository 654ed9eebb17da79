#pragma once
// Huge pages for the heap of a run on a large drawing.
//
// A large project takes gigabytes of heap in millions of small pieces. With the kernel's
// transparent huge pages the first touch of that memory costs a fraction of what it costs in
// 4 KiB pages (on virtual machines most of all) and the processor misses fewer translations;
// on a small drawing the bigger pages cost more than they save. glibc reads its malloc
// tunables only when a process starts, so the host starts itself again with
// "glibc.malloc.hugetlb=1" added to GLIBC_TUNABLES.
//
// ZV_HUGE_PAGES=1 asks for it on any drawing, ZV_HUGE_PAGES=0 never; unset, drawings of
// kLargeDrawingBytes or more get it.
#include <QString>

namespace zvhost {

inline constexpr qint64 kLargeDrawingBytes = 128LL * 1024 * 1024;

// "always" or "madvise" (the choice in brackets); with "never" asking changes nothing.
bool kernelOffersHugePages();

// Whether a run on the drawing should restart with huge pages: asked for (or the drawing is
// large), not yet in the tunables, and the kernel lets a program ask for them.
bool wantsHugePages(const QString& drawing);

// Replaces the process with the same program and arguments and the tunable set, when
// wantsHugePages(); returns when it does not, or when the restart fails.
void restartWithHugePages(const QString& drawing);

}  // namespace zvhost
