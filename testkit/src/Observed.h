#pragma once

#include <mutex>
#include <utility>

#include "observe/Platform.h"

namespace observe {

// Everything that reset() resets.
struct State {
    std::vector<Record> records;
    std::function<void(const Record&)> action;
    std::function<void(bool)> lockAction;
    std::vector<LockCall> lockCalls;
    bool lockResult = true;
    long clockSeconds = 1000000000;
    unsigned int clockMilliseconds = 0;
    int clockReadings = 0;
    Call throwingCall = Call::any;
    int throwingNth = 0;
    int callsUntilThrow = 0;
    bool thrown = false;
};

struct Observed {
    // The platform's lock and unlock do not allocate. Nor do these, for the first 64 calls after reset().
    Observed() { state.lockCalls.reserve(64); }

    std::mutex mutex;
    State state;
    // Not reset: what they count may outlive a test.
    int locksHeld = 0;
    int buffersAlive = 0;
    int dateTimesAlive = 0;
};

Observed& observed();

// Adds to one of the three counts.
void count(int Observed::*counter, int change);

// Returns seconds and milliseconds of the clock, and counts the reading.
std::pair<long, unsigned int> readClock();

// Calls the action that onLock has set.
void held(bool lock);

// Throws if throwAt asks for it. Every call that can be made to throw begins with this.
void reached(Call call);

}  // namespace observe
