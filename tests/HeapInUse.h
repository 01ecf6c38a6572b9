#pragma once

#include <malloc.h>

#include <cstddef>

// How many bytes malloc has handed out. With a sanitizer that has an allocator of its own that is nothing.
inline std::size_t heapInUse()
{
#ifdef __has_feature
#if __has_feature(memory_sanitizer)  // does not know what mallinfo2 writes
    return 0;
#endif
#endif
    return mallinfo2().uordblks;
}
