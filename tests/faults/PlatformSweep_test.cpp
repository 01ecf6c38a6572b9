#include <iostream>
#include <string>

#include <gtest/gtest.h>

#include "Operations.h"
#include "Sweep.h"

// Every call of the platform in every operation throws in turn, except unlock, which a destructor calls. The caller
// gets that exception, everything is as before, no lock stays held, and no buffer or date-time stays alive.

namespace {

const struct {
    const char* name;
    observe::Call call;
} calls[] = {{"construction of a buffer", observe::Call::bufferConstructor},
             {"insertion into a buffer", observe::Call::insertion},
             {"str", observe::Call::str},
             {"log record", observe::Call::log},
             {"trace record", observe::Call::trace},
             {"reading of the clock", observe::Call::now},
             {"text of a date-time", observe::Call::dateTimeText},
             {"construction or change of a date-time", observe::Call::dateTime},
             {"lock", observe::Call::lock}};

// Makes the first call throw, then the second, until there are no more. Returns how many there were.
long sweep(const Operation& operation, const Outcome& undisturbed, observe::Call call,
           const std::string& name)
{
    for (int nth = 1;; ++nth) {
        const Fault fault {[=] { observe::throwAt(call, nth); },
                           [] {
                               const bool struck = observe::thrown();
                               observe::throwAt(observe::Call::any, 0);
                               return struck;
                           }};
        const std::string thrown =
            "observe::Thrown: call " + std::to_string(static_cast<int>(call)) + ", " + std::to_string(nth);
        const std::string context = operation.name + ": " + name + " " + std::to_string(nth) + " throws";
        if (!tryWith(fault, thrown, false, operation, undisturbed, context))
            return nth - 1;
    }
}

TEST(PlatformSweep, EachCallThrowsInTurn)
{
    const auto all = operations();
    long points = 0;
    for (const auto& row : calls) {
        long ofCall = 0;
        for (const Operation& operation : all)
            ofCall += sweep(operation, operation.run(noFault()), row.call, row.name);
        std::cout << ofCall << " times: " << row.name << " throws\n";
        EXPECT_GT(ofCall, 0) << row.name;
        points += ofCall;
    }
    EXPECT_GE(points, 11000);
}

TEST(PlatformSweep, ResultOfLockIsIgnored)
{
    long locks = 0;
    for (const Operation& operation : operations()) {
        const Fault fault {[] { observe::setLockResult(false); },
                           [&locks] {
                               for (const observe::LockCall& call : observe::lockCalls())
                                   locks += call.lock ? 1 : 0;
                               observe::setLockResult(true);
                               return false;
                           }};
        tryWith(fault, "", false, operation, operation.run(noFault()),
                operation.name + ": lock returns false");
    }
    std::cout << locks << " locks returned false\n";
    EXPECT_GE(locks, 280);
}

}  // namespace
