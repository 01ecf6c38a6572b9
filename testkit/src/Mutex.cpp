#include "ZQ/Mutex.h"

#include <chrono>

#include "Observed.h"

namespace ZQ {

namespace {

constexpr unsigned int forEver = 0xFFFFFFFF;

// Lists the call. Returns what lock() has to return.
bool note(observe::LockCall call)
{
    observe::Observed& all = observe::observed();
    const std::lock_guard<std::mutex> lock(all.mutex);
    call.records = all.state.records.size();
    all.state.lockCalls.push_back(call);
    all.locksHeld += call.lock ? 1 : -1;
    return all.state.lockResult;
}

}  // namespace

Mutex::Mutex() = default;
Mutex::~Mutex() = default;

bool Mutex::lock(unsigned int timeoutMilliseconds)
{
    observe::reached(observe::Call::lock);
    std::unique_lock<std::mutex> guard(guard_);
    const auto free = [this] { return depth_ == 0 || owner_ == std::this_thread::get_id(); };
    if (timeoutMilliseconds == forEver)
        released_.wait(guard, free);
    else if (!released_.wait_for(guard, std::chrono::milliseconds(timeoutMilliseconds), free))
        return false;
    owner_ = std::this_thread::get_id();
    ++depth_;
    const bool result = note({this, true, timeoutMilliseconds, depth_, 0});
    observe::held(true);
    return result;
}

void Mutex::unlock()
{
    const std::lock_guard<std::mutex> guard(guard_);
    observe::held(false);
    --depth_;
    note({this, false, 0, depth_, 0});
    released_.notify_one();  // under the guard: the thread that wakes may destroy this mutex
}

}  // namespace ZQ
