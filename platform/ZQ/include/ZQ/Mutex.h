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
        if (timeoutMilliseconds != forEver)
            return lockWithin(timeoutMilliseconds);
        if (!attempts) {
            mutex_.lock();
            return true;
        }
        return mutex_.try_lock() || lockWithin(timeoutMilliseconds);
    }

    // Releases one lock; throws nothing. The calling thread must hold the mutex.
    void unlock() { mutex_.unlock(); }

private:
    static constexpr unsigned int forEver = 0xFFFFFFFF;
    // Whether a thread tries the mutex before it waits. ThreadSanitizer learns the order in which threads acquire
    // several mutexes only from waiting.
#if defined(__SANITIZE_THREAD__)
    static constexpr bool attempts = false;
#elif defined(__has_feature)
    static constexpr bool attempts = !__has_feature(thread_sanitizer);
#else
    static constexpr bool attempts = true;
#endif

    bool lockWithin(unsigned int timeoutMilliseconds);

    std::recursive_timed_mutex mutex_;
};

}  // namespace ZQ

#pragma GCC diagnostic pop
#pragma GCC visibility pop
