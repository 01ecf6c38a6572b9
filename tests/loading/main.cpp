#include <cstdio>
#include <string>

#include "Check.h"
#include "IC/Number.h"
#include "support/EveryCategory.h"

namespace {

// The categories that the library writes, and names of its table.
std::string seen()
{
    std::size_t length = 0;
    for (const std::string& name : IC::pst)
        length += name.size();
    return everyCategory() + std::to_string(length) + ' ' + IC::pst[0] + ' ' + IC::pst[74] + ' '
        + std::string(IC::Number(IC::NodeRef {73, 1})) + ' ' + std::string(IC::Number(0.5));
}

void say(const char* name, const char* when)
{
    const std::string expected =
        std::string(everyCategoryExpected) + "705 Unknown invalid LAN End Point:1 0.5";
    const std::string all = seen();
    std::printf("%s %s: %s\n", name, when, all == expected ? "right" : all.c_str());
    std::fflush(stdout);
}

}  // namespace

Check::Check(const char* name) : name_(name)
{
    say(name_, "begins");
}

Check::~Check()
{
    say(name_, "ends");
}

static const Check third("third");

int main()
{
    const Check inMain("main");
}
