// A child of fork() can use the library, whatever the other threads of its parent are doing.

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <cstdlib>
#include <sstream>
#include <string>
#include <thread>

#include "IC/ICException.h"
#include "IC/Node.h"
#include "VXLog/RecordSink.h"

namespace {

using IC::Node;
using IC::PropertyValue;

class Fan : public Node {
public:
    Fan() : Node(SENSOR_FAN) { properties.insert({1u, PropertyValue("old")}); }
};

// Makes, changes and prints objects of its own, and writes records. Returns 0, or which checks failed, one bit each.
int useInChild()
{
    Fan fan;
    const bool isSet =
        fan.setProperty(1, PropertyValue("new")).getStatus() == 0;  // through the parent's sink
    int records = 0;
    VXLog::setRecordSink([&records](const VXLog::Record&) { ++records; });
    fan.setProperty(2, PropertyValue("new"));
    bool isRefused = false;
    try {
        const Node none(74);
    } catch (const IC::NodeInvalidSensor&) {
        isRefused = true;
    }
    std::ostringstream text;
    text << fan << ' ' << fan.getProperties();
    VXLog::setRecordSink(nullptr);
    fan.setProperty(1, PropertyValue("newer"));  // through the default sink
    return (isSet ? 0 : 1) + (isRefused ? 0 : 2) + (records == 6 ? 0 : 4)
        + (text.str() == "Node  : 20, status = 0 [1 = new]" ? 0 : 8);
}

TEST(Fork, ChildCanMakeChangePrintAndLog)
{
#if defined(__GLIBCXX__) && !defined(_GLIBCXX_HAVE_ATOMIC_LOCK_POLICY)
    GTEST_SKIP()
        << "this standard library counts references under a global lock, which a child of fork() may find "
           "locked for ever (libstdc++ of GCC 12 for riscv64)";
#endif
    const auto before = VXLog::setRecordSink([](const VXLog::Record&) {});
    std::atomic<bool> isOver {false};
    std::atomic<long> rounds {0};
    // Writes records and allocates nothing: this test is not about the locks of malloc.
    std::thread working([&] {
        const PropertyValue value("short");
        for (Fan fan; !isOver; ++rounds)
            fan.setProperty(2, value);
    });
    while (rounds < 100)
        std::this_thread::yield();
    const char* const wanted = std::getenv("IC_TEST_CHILDREN");
    const int children = wanted != nullptr ? std::atoi(wanted) : 200;
    for (int i = 0; i < children; ++i) {
        const pid_t child = fork();
        ASSERT_GE(child, 0);
        if (child == 0) {
            alarm(60);  // ends a child that waits for a lock for ever
            dup2(open("/dev/null", O_WRONLY), STDERR_FILENO);
            _exit(useInChild());
        }
        int status = 0;
        ASSERT_EQ(waitpid(child, &status, 0), child);
        ASSERT_TRUE(WIFEXITED(status))
            << "child " << i << " was killed: it crashed or waited for a lock for ever";
        ASSERT_EQ(WEXITSTATUS(status), 0);
        // Lets the thread go on, so that each fork meets it at another place.
        for (const long reached = rounds; rounds == reached;)
            std::this_thread::yield();
    }
    isOver = true;
    working.join();
    VXLog::setRecordSink(before);
}

}  // namespace
