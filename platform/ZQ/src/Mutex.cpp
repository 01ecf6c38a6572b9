#include "ZQ/Mutex.h"

#include <chrono>

namespace ZQ {

bool Mutex::lockWithin(unsigned int timeoutMilliseconds)
{
    if (timeoutMilliseconds == 0)
        return mutex_.try_lock();
    return mutex_.try_lock_for(std::chrono::milliseconds(timeoutMilliseconds));
}

}  // namespace ZQ
