#pragma once

#include <string>

#include <gtest/gtest.h>

#include "support/AllocationFailure.h"
#include "Trial.h"
#include "observe/Refusal.h"

// Tries the operation with the fault and adds a failure, which names `where`, for anything that is wrong then.
// Right is what wrongAfterFault says, or, if `mayGoOn`, that all went as undisturbed. Whether the fault was reached
// and all was right: the next fault is worth a try.
inline bool tryWith(const Fault& fault, const std::string& exception, bool mayGoOn,
                    const Operation& operation, const Outcome& undisturbed, const std::string& where)
{
    const int dateTimes = observe::dateTimesAlive();
    const int buffers = observe::buffersAlive();
    const int locks = observe::locksHeld();
    const long alive = allocation::aliveNow;
    bool struck = false;
    const std::string wrong = [&] {
        const Outcome tried = operation.run(fault);
        struck = tried.struck;
        std::string different = difference(tried, undisturbed);
        if (!struck || (mayGoOn && different.empty()))
            return different;
        return wrongAfterFault(tried, undisturbed, exception);
    }();
    const long aliveAfter = allocation::aliveNow;
    EXPECT_EQ(wrong, "") << where;
    if (!wrong.empty())
        return false;  // and its text is alive
    EXPECT_EQ(aliveAfter, alive) << "allocations alive: " << where;
    EXPECT_EQ(observe::dateTimesAlive(), dateTimes) << where;
    EXPECT_EQ(observe::buffersAlive(), buffers) << where;
    EXPECT_EQ(observe::locksHeld(), locks) << where;
    return struck && aliveAfter == alive;
}
