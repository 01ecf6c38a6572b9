#include "observe/Platform.h"

#include "Observed.h"

namespace observe {

Observed& observed()
{
    // Never destroyed: static objects of the test program may use it until the end.
    static auto* const only = new Observed;
    return *only;
}

namespace {

// Runs the action under the mutex of the state.
template <class Action>
auto guarded(Action action)
{
    const std::lock_guard<std::mutex> lock(observed().mutex);
    return action(observed());
}

}  // namespace

void count(int Observed::*counter, int change)
{
    guarded([&](Observed& all) { all.*counter += change; });
}

std::pair<long, unsigned int> readClock()
{
    return guarded([](Observed& all) {
        ++all.state.clockReadings;
        return std::make_pair(all.state.clockSeconds, all.state.clockMilliseconds);
    });
}

void reached(Call call)
{
    guarded([&](Observed& all) {
        State& state = all.state;
        const bool counts =
            state.throwingCall == Call::any ? call != Call::dateTime : state.throwingCall == call;
        if (state.callsUntilThrow == 0 || !counts)
            return;
        if (--state.callsUntilThrow == 0) {
            state.thrown = true;
            throw Thrown {state.throwingCall, state.throwingNth};
        }
    });
}

void reset()
{
    guarded([](Observed& all) {
        State fresh;
        fresh.lockCalls.swap(all.state.lockCalls);  // keeps its capacity
        fresh.lockCalls.clear();
        all.state = std::move(fresh);
    });
}

std::vector<Record> records()
{
    return guarded([](Observed& all) { return all.state.records; });
}

void onRecord(std::function<void(const Record&)> action)
{
    guarded([&](Observed& all) { all.state.action = std::move(action); });
}

void onLock(std::function<void(bool)> action)
{
    guarded([&](Observed& all) { all.state.lockAction = std::move(action); });
}

void held(bool lock)
{
    const auto action = guarded([](Observed& all) { return all.state.lockAction; });
    if (action)
        action(lock);
}

std::vector<LockCall> lockCalls()
{
    return guarded([](Observed& all) { return all.state.lockCalls; });
}

int locksHeld()
{
    return guarded([](Observed& all) { return all.locksHeld; });
}

void setLockResult(bool obtained)
{
    guarded([&](Observed& all) { all.state.lockResult = obtained; });
}

void setClock(long seconds, unsigned int milliseconds)
{
    guarded([&](Observed& all) {
        all.state.clockSeconds = seconds;
        all.state.clockMilliseconds = milliseconds;
    });
}

int clockReadings()
{
    return guarded([](Observed& all) { return all.state.clockReadings; });
}

int buffersAlive()
{
    return guarded([](Observed& all) { return all.buffersAlive; });
}

int dateTimesAlive()
{
    return guarded([](Observed& all) { return all.dateTimesAlive; });
}

void throwAt(Call call, int nth)
{
    guarded([&](Observed& all) {
        all.state.throwingCall = call;
        all.state.throwingNth = nth;
        all.state.callsUntilThrow = nth;
        all.state.thrown = false;
    });
}

bool thrown()
{
    return guarded([](Observed& all) { return all.state.thrown; });
}

}  // namespace observe
