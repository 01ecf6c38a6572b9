// What a child of fork() can do with the library while its parent has other threads.

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <cstdlib>
#include <functional>
#include <sstream>
#include <string>
#include <thread>

#include "IC/ICException.h"
#include "IC/Node.h"
#include "VXLog/RecordSink.h"
#include "support/GroupingLocale.h"

namespace {

using IC::Node;
using IC::Number;
using IC::PropertyValue;

class Fan : public Node {
public:
    Fan() : Node(SENSOR_FAN)
    {
        properties.insert({1u, PropertyValue("old")});
        properties.insert({3u, PropertyValue(Number(1234567u))});
    }
};

// One bit, set if the check failed.
int failure(int bit, bool isRight)
{
    return isRight ? 0 : 1 << bit;
}

// Makes, copies, compares, converts and reads objects of its own: nothing that makes a text or a record. Returns 0, or
// which checks failed, one bit each.
int useWithoutTexts()
{
    const Fan fan;
    PropertyValue value("");
    const bool isRead = fan.getProperty(3, value) == IC::Error::STATUS_SUCCESS;
    const auto properties = fan.getProperties();
    const unsigned int number = value;
    const PropertyValue text("old");
    const std::string content = text;
    return failure(0, isRead) + failure(1, properties.at(3) == value) + failure(2, number == 1234567)
        + failure(3, properties.at(1) == text) + failure(4, content == "old")
        + failure(5, std::hash<PropertyValue>()(text) == std::hash<PropertyValue>()(properties.at(1)));
}

// Does everything: also changes, prints and writes records. `text` is what a fan must print as. Returns as above.
int useAll(const std::string& text)
{
    Fan fan;
    const bool isSet =
        fan.setProperty(1, PropertyValue("new")).getStatus() == 0;  // through the parent's sink
    int records = 0;
    VXLog::setRecordSink([&records](const VXLog::Record&) { ++records; });
    fan.setProperty(2, PropertyValue(Number(1234567u)));
    bool isRefused = false;
    try {
        const Node none(74);
    } catch (const IC::NodeInvalidSensor&) {
        isRefused = true;
    }
    std::ostringstream out;
    out << fan << ' ' << fan.getProperties();
    VXLog::setRecordSink(nullptr);
    fan.setProperty(1, PropertyValue("newer"));  // through the default sink
    return failure(0, isSet) + failure(1, isRefused) + failure(2, records == 6)
        + failure(3, out.str() == text);
}

class Fork : public testing::Test {
protected:
    void SetUp() override
    {
#if defined(__GLIBCXX__) && !defined(_GLIBCXX_HAVE_ATOMIC_LOCK_POLICY)
        GTEST_SKIP() << "this standard library counts references under a global lock, which a child of "
                        "fork() may find locked for ever (libstdc++ of GCC 12 for riscv64)";
#endif
    }

    // Forks while another thread repeats `inParent`, which allocates nothing: these tests are not about the locks of
    // malloc. Each child must end with 0, the result of `inChild`.
    static void expectChildrenEnd(const std::function<void()>& inParent, const std::function<int()>& inChild)
    {
        const auto before = VXLog::setRecordSink([](const VXLog::Record&) {});
        std::atomic<bool> isOver {false};
        std::atomic<long> rounds {0};
        std::thread working([&] {
            for (; !isOver; ++rounds)
                inParent();
        });
        while (rounds < 100)
            std::this_thread::yield();
        const char* const wanted = std::getenv("IC_TEST_CHILDREN");
        const int children = wanted != nullptr ? std::atoi(wanted) : 200;
        for (int i = 0; i < children && !HasFailure(); ++i) {
            expectChildEnds(i, inChild);
            // Lets the thread go on, so that each fork meets it at another place.
            for (const long reached = rounds; rounds == reached;)
                std::this_thread::yield();
        }
        isOver = true;
        working.join();
        VXLog::setRecordSink(before);
    }

private:
    static void expectChildEnds(int number, const std::function<int()>& inChild)
    {
        const pid_t child = fork();
        ASSERT_GE(child, 0);
        if (child == 0) {
            alarm(60);  // ends a child that waits for a lock for ever
            dup2(open("/dev/null", O_WRONLY), STDERR_FILENO);
            _exit(inChild());
        }
        int status = 0;
        ASSERT_EQ(waitpid(child, &status, 0), child);
        ASSERT_TRUE(WIFEXITED(status))
            << "child " << number << " was killed: it crashed or waited for a lock for ever";
        ASSERT_EQ(WEXITSTATUS(status), 0) << "child " << number;
    }
};

TEST_F(Fork, ChildCanDoEverythingInTheClassicLocale)
{
    Fan fan;
    const PropertyValue number(Number(1234567u));
    expectChildrenEnd([&] { fan.setProperty(2, number); },  // its records contain the text of the number
                      [] { return useAll("Node  : 20, status = 0 [1 = new], [3 = 1234567]"); });
}

TEST_F(Fork, ChildCanDoEverythingInAnotherLocaleIfNoThreadMakesTextsOrRecords)
{
    const GlobalGroupingLocale grouping;
    const Fan fan;
    const PropertyValue wanted(Number(1234567u));
    PropertyValue value(Number(0u));
    expectChildrenEnd(
        [&] { EXPECT_TRUE(fan.getProperty(3, value) == IC::Error::STATUS_SUCCESS && value == wanted); },
        [] { return useAll("Node  : 20, status = 0 [1 = new], [3 = 1,234,567]"); });
}

TEST_F(Fork, ChildCanDoWhatMakesNoTextOrRecordInAnotherLocale)
{
    const GlobalGroupingLocale grouping;
    Fan fan;
    const PropertyValue number(Number(1234567u));
    expectChildrenEnd([&] { fan.setProperty(2, number); }, useWithoutTexts);
}

}  // namespace
