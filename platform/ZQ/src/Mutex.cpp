#include "ZQ/Mutex.h"

#include <chrono>

namespace ZQ {

namespace {

// Lets the processor wait for a moment, if it can. Not by yielding to other threads: they may keep it for long.
void waitBriefly()
{
#if defined(__x86_64__) || defined(__i386__)
    __builtin_ia32_pause();
#elif defined(__aarch64__)
    asm volatile("yield");
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
                waitBriefly();
            if (mutex_.try_lock())
                return true;
        }
        mutex_.lock();
        return true;
    }
    return mutex_.try_lock_for(std::chrono::milliseconds(timeoutMilliseconds));
}

}  // namespace ZQ
