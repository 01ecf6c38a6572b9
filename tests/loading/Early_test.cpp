// The library's objects at namespace scope are ready before those of a program and go after them.

#include <gtest/gtest.h>

#include <cstdio>
#include <cstdlib>
#include <string>

#include "support/EveryCategory.h"
#include "IC/Number.h"

namespace {

// What the library says and a name of its table.
std::string used()
{
    return everyCategory() + std::string(IC::Number(IC::NodeRef {73, 1}));
}

constexpr char lanEndPoint[] = "LAN End Point:1";

struct Global {
    Global() : seen(used()) { }
    ~Global()
    {
        if (used() != everyCategoryExpected + std::string(lanEndPoint)) {
            std::fputs("the library's objects were gone before the program's\n", stderr);
            std::_Exit(1);
        }
    }
    Global(const Global&) = delete;
    Global& operator=(const Global&) = delete;

    std::string seen;
};

const Global global;

TEST(Early, ObjectsOfTheProgramMayRefuseAndPrintBeforeMain)
{
    EXPECT_EQ(global.seen, everyCategoryExpected + std::string(lanEndPoint));
}

TEST(Early, ObjectsOfTheProgramMayRefuseAndPrintAfterMain)
{
    EXPECT_EXIT(std::exit(0), testing::ExitedWithCode(0), "");
}

}  // namespace
