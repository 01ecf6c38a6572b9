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
    // A lock is obtained and given back without memory; so it is here, but for the calls after these.
    Observed() { state.lockCalls.reserve(64); }

    std::mutex mutex;
    State state;
    // Not reset: these live as long as the objects that they count.
    int locksHeld = 0;
    int buffersAlive = 0;
    int dateTimesAlive = 0;
};

Observed& observed();

// Adds to one of the three counts.
void count(int Observed::*counter, int change);

// Seconds and milliseconds of the clock; the reading is counted.
std::pair<long, unsigned int> readClock();

// Calls what onLock has set.
void held(bool lock);

// To be called at the start of each call that can be made to throw.
void reached(Call call);

}  // namespace observe
