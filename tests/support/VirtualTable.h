#pragma once

#include <cstddef>
#include <cstring>

// The place of a virtual member function in the virtual table, counted from 0. A pointer to the function holds the
// distance of its entry from the start of the table (plus one on some processors).
template <class Member>
std::ptrdiff_t slotOf(Member member)
{
    std::ptrdiff_t parts[2];
    static_assert(sizeof parts == sizeof member);
    std::memcpy(parts, &member, sizeof parts);
    return parts[0] / static_cast<std::ptrdiff_t>(sizeof(void*));
}
