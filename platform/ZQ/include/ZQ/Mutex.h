#pragma once

#include <mutex>

#pragma GCC visibility push(default)
#pragma GCC diagnostic push
// Only clang knows a capability; its -Wthread-safety follows it.
#pragma GCC diagnostic ignored "-Wattributes"

namespace ZQ {

// A re-entrant mutex: the thread that holds it may lock it again, and must unlock it as often. Every
// operation may be called from any thread. It is destroyed when no thread holds it, and a child of fork()
// must not use one that another thread of its parent held.
class __attribute__((visibility("default"))) __attribute__((capability("mutex"))) Mutex {
public:
    Mutex() = default;
    Mutex(const Mutex&) = delete;
    Mutex& operator=(const Mutex&) = delete;

    // Waits at most `timeoutMilliseconds`, 0 not at all, 0xFFFFFFFF for ever. Returns whether the calling
    // thread now holds the mutex (once more). Throws std::system_error where the system refuses the lock,
    // such as for a depth of nesting that it cannot count.
    bool lock(unsigned int timeoutMilliseconds)
    {
        if (timeoutMilliseconds != forEver)
            return lockWithin(timeoutMilliseconds);
        mutex_.lock();
        return true;
    }

    // Gives back one lock; throws nothing. The calling thread must hold the mutex.
    void unlock() { mutex_.unlock(); }

private:
    static constexpr unsigned int forEver = 0xFFFFFFFF;

    bool lockWithin(unsigned int timeoutMilliseconds);

    std::recursive_timed_mutex mutex_;
};

}  // namespace ZQ

#pragma GCC diagnostic pop
#pragma GCC visibility pop
