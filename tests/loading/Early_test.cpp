// The library's objects at namespace scope are constructed before those of a program and destroyed after them.

#include <gtest/gtest.h>

#include <cstdio>
#include <cstdlib>
#include <string>

#include "IC/Number.h"
#include "support/EveryCategory.h"

namespace {

// The categories that the library writes, and a name of its table.
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
            std::fputs("the library's objects were destroyed before the program's\n", stderr);
            std::_Exit(1);
        }
    }
    Global(const Global&) = delete;
    Global& operator=(const Global&) = delete;

    std::string seen;
};

const Global global;

TEST(Early, GlobalObjectsCanUseTheLibraryBeforeMain)
{
    EXPECT_EQ(global.seen, everyCategoryExpected + std::string(lanEndPoint));
}

TEST(Early, GlobalObjectsCanUseTheLibraryAfterMain)
{
    EXPECT_EXIT(std::exit(0), testing::ExitedWithCode(0), "");
}

}  // namespace
