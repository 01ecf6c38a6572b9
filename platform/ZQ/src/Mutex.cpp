#include "ZQ/Mutex.h"

#include <chrono>

namespace ZQ {

namespace {

constexpr unsigned int forEver = 0xFFFFFFFF;

}  // namespace

Mutex::Mutex() = default;
Mutex::~Mutex() = default;

bool Mutex::lock(unsigned int timeoutMilliseconds)
{
    if (timeoutMilliseconds == 0)
        return mutex_.try_lock();
    if (timeoutMilliseconds != forEver)
        return mutex_.try_lock_for(std::chrono::milliseconds(timeoutMilliseconds));
    mutex_.lock();
    return true;
}

void Mutex::unlock()
{
    mutex_.unlock();
}

}  // namespace ZQ
