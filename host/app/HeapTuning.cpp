#include "HeapTuning.h"

#include <QByteArray>
#include <QtGlobal>

#include <malloc.h>

namespace zvhost {

bool keepFreedHeapBlocks() {
    const QByteArray tunables = qgetenv("GLIBC_TUNABLES");
    if (tunables.contains("glibc.malloc.mmap_threshold") ||
        tunables.contains("glibc.malloc.trim_threshold"))
        return false;
    // Setting either threshold also stops glibc from moving the mapping threshold itself.
    return mallopt(M_MMAP_THRESHOLD, kHeapMappedBlockBytes) == 1 &&
           mallopt(M_TRIM_THRESHOLD, kHeapTrimBytes) == 1;
}

bool shareOneHeap() {
    if (qgetenv("GLIBC_TUNABLES").contains("glibc.malloc.arena_max") ||
        qEnvironmentVariableIsSet("MALLOC_ARENA_MAX"))
        return false;
    return mallopt(M_ARENA_MAX, 1) == 1;
}

}  // namespace zvhost
