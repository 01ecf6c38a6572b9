#include "ZQ/Mutex.h"

#include <chrono>
#include <thread>

namespace ZQ {

namespace {

// Gives another thread the time to release a mutex.
void pause()
{
#if defined(__x86_64__) || defined(__i386__)
    __builtin_ia32_pause();
#else
    std::this_thread::yield();
#endif
}

}  // namespace

bool Mutex::lockWithin(unsigned int timeoutMilliseconds)
{
    if (timeoutMilliseconds == 0)
        return mutex_.try_lock();
    if (timeoutMilliseconds == forEver) {
        // Most holders release it soon: sleeping and being woken costs both threads more than a few attempts. The
        // pauses grow, because an attempt takes the mutex's cache line from its holder.
        for (int pauses = 4; pauses <= 64; pauses *= 2) {
            for (int i = 0; i < pauses; ++i)
                pause();
            if (mutex_.try_lock())
                return true;
        }
        mutex_.lock();
        return true;
    }
    return mutex_.try_lock_for(std::chrono::milliseconds(timeoutMilliseconds));
}

}  // namespace ZQ
