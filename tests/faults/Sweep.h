#pragma once

#include <string>

#include <gtest/gtest.h>

#include "Trial.h"
#include "observe/Refusal.h"
#include "support/AllocationFailure.h"

// Tries the operation with the fault. Expects `exception` and no change, as wrongAfterFault describes, or the same
// outcome as without the fault, if `mayGoOn` or the fault is not reached. Also expects that nothing stays allocated,
// alive or locked. Failures name `where`. Returns whether the fault was reached and all was right: then the next fault
// is to be tried.
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
        return false;  // `wrong` itself is an allocation that is alive
    const bool allReleased = aliveAfter == alive || allocation::vectorsLeak;
    EXPECT_TRUE(allReleased) << "allocations alive: " << aliveAfter - alive << ": " << where;
    EXPECT_EQ(observe::dateTimesAlive(), dateTimes) << where;
    EXPECT_EQ(observe::buffersAlive(), buffers) << where;
    EXPECT_EQ(observe::locksHeld(), locks) << where;
    return struck && allReleased;
}
