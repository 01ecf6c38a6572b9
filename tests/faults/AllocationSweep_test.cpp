#include <iostream>
#include <string>

#include <gtest/gtest.h>

#include "Operations.h"
#include "Sweep.h"
#include "support/AllocationFailure.h"
#include "support/GroupingLocale.h"

// Every allocation of every operation fails in turn, those of the platform included. Either std::bad_alloc reaches the
// caller and everything is as before, or the operation succeeds as if nothing had failed. The memory of the exception
// objects does not count: if malloc fails, the C++ runtime takes it from its emergency pool.

namespace {

// A new locale starts with empty caches for digits, and filling these caches allocates too.
Operation withDigitsGrouped(const Operation& operation)
{
    return {operation.name + ", digits grouped",
            [operation](const Fault& fault) {
                const GlobalGroupingLocale locale;
                return operation.run(fault);
            },
            true};
}

// Makes the first allocation fail, then the second, until there are no more. Returns how many there were.
long sweep(const Operation& operation, bool once)
{
    const Outcome undisturbed = operation.run(noFault());
    for (long nth = 1;; ++nth) {
        const std::string where = operation.name + ": allocation " + std::to_string(nth)
            + (once ? " fails once" : " and all after it fail");
        const Fault fault {[=] { allocation::failFrom(nth, once); },
                           [] { return allocation::stopFailing(); }};
        if (!tryWith(fault, "std::bad_alloc: std::bad_alloc", true, operation, undisturbed, where))
            return nth - 1;
    }
}

void sweepAll(bool once)
{
    long points = 0;
    for (const Operation& operation : operations()) {
        points += sweep(operation, once);
        if (operation.writesText)
            points += sweep(withDigitsGrouped(operation), once);
    }
    std::cout << points << " allocations failed in turn\n";
    EXPECT_GE(points, 15000);
}

TEST(AllocationSweep, EveryAllocationMayFailOnce)
{
    sweepAll(true);
}

TEST(AllocationSweep, EveryAllocationAndAllAfterItMayFail)
{
    sweepAll(false);
}

}  // namespace
