#include "Locks.h"

#include <pthread.h>

#include <new>

namespace VXLog {

std::mutex sinkLock;
std::mutex composersLock;

namespace {

// Clang's analysis of locks, for which libc++ 22 annotates std::mutex, expects a function to release what it acquires.
#if defined(__clang__)
#pragma clang diagnostic ignored "-Wthread-safety-analysis"
#endif

void lockAll()
{
    composersLock.lock();
    sinkLock.lock();
}

void unlockAll()
{
    sinkLock.unlock();
    composersLock.unlock();
}

// The C library removes the handlers when this library is unloaded.
struct ForkHandlers {
    ForkHandlers()
    {
        if (pthread_atfork(lockAll, unlockAll, unlockAll) != 0)
            throw std::bad_alloc();
    }
};

[[gnu::init_priority(101)]] const ForkHandlers forkHandlers;

}  // namespace

}  // namespace VXLog
