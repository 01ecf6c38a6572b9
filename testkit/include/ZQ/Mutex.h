#pragma once

#include <condition_variable>
#include <mutex>
#include <thread>

namespace ZQ {

// A re-entrant mutex that tells every call of lock and unlock to observe/Platform.h.
class Mutex {
public:
    Mutex();
    ~Mutex();
    bool lock(unsigned int timeoutMilliseconds);
    void unlock();

private:
    std::mutex guard_;
    std::condition_variable released_;
    std::thread::id owner_;
    int depth_ = 0;
};

}  // namespace ZQ
