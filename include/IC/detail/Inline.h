#pragma once

// Shared by the inline bodies.

#include <cstddef>

namespace IC::detail {

// Tells the compiler that the condition usually holds.
constexpr bool likely(bool condition) noexcept
{
    return __builtin_expect(static_cast<long>(condition), 1L) != 0;
}

// Joins a hash with the next one. The factor is odd, so multiplying loses no bit of the first.
constexpr std::size_t combinedHash(std::size_t before, std::size_t next) noexcept
{
    return before * static_cast<std::size_t>(0x9E3779B97F4A7C15ull) + next;
}

}  // namespace IC::detail
