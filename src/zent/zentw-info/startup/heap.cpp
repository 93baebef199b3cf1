#include "heap.h"

#include <malloc.h>

void zent::boundHeap()
{
    // By default the C library raises both limits with every large block that is freed, to 32 and 64 MiB, and keeps
    // that much; setting them turns this off.
    constexpr int kOwnMappingFrom = 128 * 1024;
    constexpr int kMostKept = 256 * 1024;
    mallopt(M_MMAP_THRESHOLD, kOwnMappingFrom);
    mallopt(M_TRIM_THRESHOLD, kMostKept);
    // Qt's threads for the buses and for HTTP allocate too little to be worth a heap of their own each.
    mallopt(M_ARENA_MAX, 1);
}
