#pragma once

#include <mutex>

#pragma GCC visibility push(default)
#pragma GCC diagnostic push
// Only clang knows the attribute `capability`, which its -Wthread-safety checks.
#pragma GCC diagnostic ignored "-Wattributes"

namespace ZQ {

// A re-entrant mutex: the thread that holds it may lock it again, and must unlock it as many times.
//
// Thread-safe. No thread may hold it when it is destroyed. A child of fork() must not use a mutex that another
// thread of its parent held.
class __attribute__((visibility("default"))) __attribute__((capability("mutex"))) Mutex {
public:
    Mutex() = default;
    Mutex(const Mutex&) = delete;
    Mutex& operator=(const Mutex&) = delete;

    // Waits at most `timeoutMilliseconds`: 0 does not wait, 0xFFFFFFFF waits for ever. Returns whether the calling
    // thread has acquired the mutex (once more). Throws std::system_error if the system refuses the lock, for
    // example because it is nested too deeply.
    bool lock(unsigned int timeoutMilliseconds)
    {
        return (timeoutMilliseconds == forEver && mutex_.try_lock()) || lockWithin(timeoutMilliseconds);
    }

    // Releases one lock; throws nothing. The calling thread must hold the mutex.
    void unlock() { mutex_.unlock(); }

private:
    static constexpr unsigned int forEver = 0xFFFFFFFF;

    bool lockWithin(unsigned int timeoutMilliseconds);

    std::recursive_timed_mutex mutex_;
};

}  // namespace ZQ

#pragma GCC diagnostic pop
#pragma GCC visibility pop
