#include "SinkLock.h"

#include <pthread.h>

#include <new>

namespace VXLog {

std::mutex sinkLock;

namespace {

void lock()
{
    sinkLock.lock();
}

void unlock()
{
    sinkLock.unlock();
}

// The system forgets the handlers when the library is unloaded.
struct ForkHandlers {
    ForkHandlers()
    {
        if (pthread_atfork(lock, unlock, unlock) != 0)
            throw std::bad_alloc();
    }
};

[[gnu::init_priority(101)]] const ForkHandlers forkHandlers;

}  // namespace

}  // namespace VXLog
