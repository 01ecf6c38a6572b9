#pragma once

#include <cstddef>
#include <cstdlib>
#include <new>
#include <sstream>
#include <string>

#include <gtest/gtest.h>

// Makes memory run out on purpose, and counts allocations. This header defines the global operator new, so exactly one
// source of a program includes it. All counters and limits belong to the calling thread.
//
// The observer of the test kit allocates too. It must not fail in unlock, which no caller expects to throw: there, the
// test first fills the observer's lists, so that they have room.
namespace allocation {

// If copying an element throws, the copy constructor of a vector loses the elements that it has copied.
#if defined(_LIBCPP_VERSION) && _LIBCPP_VERSION < 16000
constexpr bool vectorsLeak = true;
#else
constexpr bool vectorsLeak = false;
#endif

inline thread_local long allowedNow = -1;    // how many more allocations succeed; below 0: all
inline thread_local bool failsOnce = false;  // after one failure, allocations succeed again
inline thread_local bool failedNow = false;
inline thread_local long madeSoFar = 0;
inline thread_local long aliveNow = 0;
inline thread_local std::size_t latestSize = 0;     // in bytes
inline thread_local void (*onRelease)() = nullptr;  // called before each release of memory

// Runs the operation with memory for `allowed` allocations; every later one throws std::bad_alloc. Returns false when
// the operation threw std::bad_alloc. Other exceptions propagate.
template <class Operation>
bool completesWith(long allowed, Operation operation)
{
    struct Limit {
        explicit Limit(long count) { allowedNow = count; }
        ~Limit() { allowedNow = -1; }
    };
    try {
        const Limit limit(allowed);
        operation();
    } catch (const std::bad_alloc&) {
        return false;
    }
    return true;
}

// Makes the n-th allocation from now on (counted from 1) throw std::bad_alloc, and, unless `once`, every later one.
inline void failFrom(long nth, bool once)
{
    failsOnce = once;
    failedNow = false;
    allowedNow = nth - 1;
}

// Ends what failFrom began. Returns whether an allocation failed.
inline bool stopFailing()
{
    allowedNow = -1;
    failsOnce = false;
    return failedNow;
}

// How many allocations the operation makes.
template <class Operation>
long countOf(Operation operation)
{
    const long before = madeSoFar;
    operation();
    return madeSoFar - before;
}

// Runs the operation with memory for no allocation, for one, for two, and so on until it completes. Expects that each
// run releases all that it allocated. Returns how many allocations the operation needs.
template <class Operation>
long expectAllMemoryGivenBack(Operation operation)
{
    const long before = aliveNow;
    long allowed = 0;
    while (!completesWith(allowed, operation) && allowed < 100)
        ++allowed;
    EXPECT_TRUE(aliveNow == before || vectorsLeak) << aliveNow - before << " allocations are not released";
    EXPECT_GT(allowed, 0) << "the operation needs no memory";
    EXPECT_LT(allowed, 100) << "the operation does not complete";
    return allowed;
}

// Expects, for every amount of memory, that the text form is complete or throws std::bad_alloc, and that a stream
// receives the complete text or becomes bad.
template <class Value>
void expectTextCompleteOrThrows(const Value& value, const std::string& whole)
{
    long allowed = 0;
    std::string text;
    while (!completesWith(allowed, [&] { text = value.operator std::string(); }))
        ASSERT_LT(++allowed, 1000);
    EXPECT_EQ(text, whole) << "with memory for " << allowed << " allocations";
    const bool fitsIntoTheString = whole.size() <= std::string().capacity();
    EXPECT_TRUE(allowed > 0 || fitsIntoTheString) << "the text needed no memory";

    for (allowed = 0;; ++allowed) {
        ASSERT_LT(allowed, 1000);
        std::ostringstream out;
        const bool completed = completesWith(allowed, [&] { out << value; });
        EXPECT_TRUE(completed || out.str().empty()) << "with memory for " << allowed << " allocations";
        if (completed && out.good()) {
            EXPECT_EQ(out.str(), whole) << "with memory for " << allowed << " allocations";
            return;
        }
    }
}

}  // namespace allocation

// Out of line: otherwise the compiler sees free() called on memory from operator new, and warns.
[[gnu::noinline]] void* operator new(std::size_t size)
{
    if (allocation::allowedNow == 0) {
        allocation::failedNow = true;
        if (allocation::failsOnce)
            allocation::allowedNow = -1;
        throw std::bad_alloc();
    }
    void* const memory = std::malloc(size == 0 ? 1 : size);
    if (memory == nullptr)
        throw std::bad_alloc();
    if (allocation::allowedNow > 0)
        --allocation::allowedNow;
    ++allocation::madeSoFar;
    ++allocation::aliveNow;
    allocation::latestSize = size;
    return memory;
}

void* operator new(std::size_t size, const std::nothrow_t&) noexcept
{
    try {
        return ::operator new(size);
    } catch (const std::bad_alloc&) {
        return nullptr;
    }
}

void* operator new[](std::size_t size)
{
    return ::operator new(size);
}

void* operator new[](std::size_t size, const std::nothrow_t& none) noexcept
{
    return ::operator new(size, none);
}

[[gnu::noinline]] void operator delete(void* memory) noexcept
{
    if (memory == nullptr)
        return;
    if (allocation::onRelease != nullptr)
        allocation::onRelease();
    --allocation::aliveNow;
    std::free(memory);
}

void operator delete(void* memory, std::size_t) noexcept
{
    ::operator delete(memory);
}

void operator delete(void* memory, const std::nothrow_t&) noexcept
{
    ::operator delete(memory);
}

void operator delete[](void* memory) noexcept
{
    ::operator delete(memory);
}

void operator delete[](void* memory, std::size_t) noexcept
{
    ::operator delete(memory);
}

void operator delete[](void* memory, const std::nothrow_t&) noexcept
{
    ::operator delete(memory);
}
