#pragma once

#include <condition_variable>
#include <mutex>
#include <thread>

namespace ZQ {

// A re-entrant mutex whose calls observe::lockCalls() lists. Thread-safe. No thread may hold it when it is destroyed.
class Mutex {
public:
    Mutex();
    ~Mutex();

    // Waits at most `timeoutMilliseconds`: 0 does not wait, 0xFFFFFFFF waits for ever. Returns false if the time is
    // over; otherwise the calling thread holds the mutex (once more) and the result is what observe::setLockResult
    // has set. Can be made to throw (observe/Platform.h).
    bool lock(unsigned int timeoutMilliseconds);

    // Releases one lock. The calling thread must hold the mutex.
    void unlock();

private:
    std::mutex guard_;
    std::condition_variable released_;
    std::thread::id owner_;
    int depth_ = 0;
};

}  // namespace ZQ
