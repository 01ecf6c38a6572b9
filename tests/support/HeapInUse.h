#pragma once

#include <malloc.h>

#include <cstddef>

// How many bytes allocated by malloc are in use. Always 0 under a sanitizer that replaces malloc; AddressSanitizer
// finds leaks itself.
inline std::size_t heapInUse()
{
#ifdef __has_feature
#if __has_feature(memory_sanitizer)  // does not know that mallinfo2 initialises its result
    return 0;
#endif
#endif
    const struct mallinfo2 heap = mallinfo2();
    return heap.uordblks + heap.hblkhd;
}
