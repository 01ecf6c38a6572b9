#pragma once

#include <pthread.h>
#include <sched.h>

#include <array>
#include <cstddef>
#include <mutex>
#include <new>

namespace VXLog {

// The locks of this library, with what they guard: copies of a T, each under a lock of its own, so that threads that run
// at the same time seldom wait for each other. A thread holds at most one of them at a time, or all of one Striped, and
// under them only this library's code runs. fork() acquires those of every Striped and releases them in parent and child,
// so a child finds them free.
template <class T>
class Striped {
public:
    static constexpr std::size_t count = 16;

    // Calls `use` with the copy of the processor that the thread runs on. The processor decides, not the thread: a
    // variable of the thread could fail to be allocated in a library that is loaded later.
    template <class Use>
    decltype(auto) withOwn(const Use& use)
    {
        return withLocked(own(), use);
    }

    // Calls `use` with one copy after the other, first that of the processor, until it returns true.
    template <class Use>
    bool withAny(const Use& use)
    {
        const std::size_t first = own();
        for (std::size_t i = 0; i < count; ++i)
            if (withLocked((first + i) % count, use))
                return true;
        return false;
    }

    // Acquire and release all locks, for std::lock_guard and fork(). Clang's analysis of locks, for which libc++ 22
    // annotates std::mutex, expects a function to release what it acquires.
#if defined(__clang__)
#pragma clang diagnostic push
#pragma clang diagnostic ignored "-Wthread-safety-analysis"
#endif
    void lock()
    {
        for (Stripe& stripe : stripes_)
            stripe.lock.lock();
    }
    void unlock()
    {
        for (Stripe& stripe : stripes_)
            stripe.lock.unlock();
    }
#if defined(__clang__)
#pragma clang diagnostic pop
#endif

    // A copy, for a thread that has acquired all locks.
    T& at(std::size_t index)
    {
        return stripes_.at(index).content;
    }

private:
    struct alignas(64) Stripe {  // a line of the processor's cache
        std::mutex lock;
        T content;
    };

    template <class Use>
    decltype(auto) withLocked(std::size_t index, const Use& use)
    {
        Stripe& stripe = stripes_.at(index);
        const std::lock_guard<std::mutex> lock(stripe.lock);
        return use(stripe.content);
    }

    static std::size_t own()
    {
        const int processor = sched_getcpu();
        return processor < 0 ? 0 : static_cast<std::size_t>(processor) % count;
    }

    std::array<Stripe, count> stripes_ {};
};

// Makes fork() acquire and release the locks. The C library removes the handlers when this library is unloaded.
template <auto& striped>
struct ForkHandlers {
    ForkHandlers()
    {
        const auto release = [] { striped.unlock(); };
        if (pthread_atfork([] { striped.lock(); }, release, release) != 0)
            throw std::bad_alloc();
    }
};

}  // namespace VXLog
