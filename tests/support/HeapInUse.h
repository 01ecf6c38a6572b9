#pragma once

#include <malloc.h>

#include <cstddef>

// How many bytes malloc has handed out. It stays 0 with a sanitizer that has an allocator of its own; AddressSanitizer
// looks for leaks itself.
inline std::size_t heapInUse()
{
#ifdef __has_feature
#if __has_feature(memory_sanitizer)  // does not know what mallinfo2 writes
    return 0;
#endif
#endif
    const struct mallinfo2 heap = mallinfo2();
    return heap.uordblks + heap.hblkhd;
}
