// When the system refuses memory, operations throw std::bad_alloc and leave the old state.

#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <new>
#include <string>

#include "IC/Node.h"
#include "observe/Platform.h"

namespace {

using IC::PropertyValue;

class Provider : public IC::Node {
public:
    Provider() : Node(20) { properties.insert({7u, PropertyValue("the old text")}); }

    using Node::properties;
};

// Limits the process to the memory that it has now and `more` bytes.
void limitMemory(std::size_t more)
{
    std::FILE* const file = std::fopen("/proc/self/statm", "r");
    unsigned long pages = 0;
    if (file == nullptr || std::fscanf(file, "%lu", &pages) != 1)
        _exit(100);
    std::fclose(file);
    const rlimit limit {pages * static_cast<unsigned long>(sysconf(_SC_PAGESIZE)) + more, RLIM_INFINITY};
    if (setrlimit(RLIMIT_AS, &limit) != 0)
        _exit(101);
}

template <class Operation>
bool runsOut(Operation operation)
{
    try {
        operation();
    } catch (const std::bad_alloc&) {
        return true;
    }
    return false;
}

// Returns the number of the first check that fails, or 0.
int useWithLittleMemory()
{
    constexpr std::size_t mebibyte = 1 << 20;
    const PropertyValue huge(std::string(48 * mebibyte, 'x'));
    const PropertyValue bytes(IC::Buffer(48 * mebibyte));
    const PropertyValue numbers(IC::NumberArray(2 * mebibyte, IC::Number(7u)));
    const PropertyValue texts(IC::StringArray(mebibyte, std::string(40, 'x')));
    Provider node;
    Provider full;
    full.properties.insert({8u, huge});
    PropertyValue old("the old text", true);
    limitMemory(24 * mebibyte);

    int number = 0;
    for (const PropertyValue* value : {&huge, &bytes, &numbers, &texts}) {
        ++number;
        if (!runsOut([&] { old = *value; }) || std::string(old) != "the old text" || !old.readOnly())
            return number;
        if (!runsOut([&] { const PropertyValue copy(*value); }))
            return 10 + number;
        if (!runsOut([&] { node.setProperty(7, *value); })
            || std::string(node.properties.at(7)) != "the old text")
            return 20 + number;
    }
    if (!runsOut([&] { static_cast<void>(bytes.operator std::string()); }))
        return 31;
    if (!runsOut([&] { full.getProperty(8, old); }) || std::string(old) != "the old text")
        return 32;
    if (!runsOut([&] { static_cast<void>(full.getProperties()); }))
        return 33;
    if (observe::locksHeld() != 0 || observe::buffersAlive() != 0)
        return 34;
    old = PropertyValue("a new text");  // small values still fit
    return std::string(old) == "a new text" ? 0 : 35;
}

TEST(MemoryLimit, KeepsTheOldValueWhenMemoryRunsOut)
{
    const pid_t child = fork();
    ASSERT_GE(child, 0);
    if (child == 0)
        _exit(useWithLittleMemory());
    int status = 0;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    ASSERT_TRUE(WIFEXITED(status)) << status;
    EXPECT_EQ(WEXITSTATUS(status), 0);
}

}  // namespace
