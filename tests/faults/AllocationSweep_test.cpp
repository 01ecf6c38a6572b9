#include <iostream>
#include <string>

#include <gtest/gtest.h>

#include "support/AllocationFailure.h"
#include "support/GroupingLocale.h"
#include "Operations.h"
#include "Sweep.h"

// Every allocation of every operation fails in turn, the platform's own included: std::bad_alloc reaches the caller
// and everything is as it was, or all goes as if nothing had failed. What an exception itself is thrown in does not
// count: the compiler's runtime takes it from a store of its own where memory runs out.

namespace {

// Under a locale of its own a try begins with empty caches of digits, which need memory too.
Operation withDigitsGrouped(const Operation& operation)
{
    return {operation.name + ", digits grouped",
            [operation](const Fault& fault) {
                const GlobalGroupingLocale locale;
                return operation.run(fault);
            },
            true};
}

// Fails the first allocation, then the second, until there are no more. How many there were.
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

TEST(AllocationSweep, OneAllocationFails)
{
    sweepAll(true);
}

TEST(AllocationSweep, AnAllocationAndAllAfterItFail)
{
    sweepAll(false);
}

}  // namespace
