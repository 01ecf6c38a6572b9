// Eight threads work on shared nodes: no value is torn, no change is lost, and no reader sees an older value again.
//
// The environment variable IC_TEST_OPERATIONS sets the number of operations; 100000000 is a long run. What the threads
// share besides the nodes is protected by mutexes, which all race detectors understand.

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cstdlib>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "AtOnce.h"
#include "IC/Node.h"
#include "VXLog/RecordSink.h"

namespace {

using IC::Error;
using IC::Node;
using IC::Number;
using IC::PropertyValue;

int operationsPerThread()
{
    const char* const wanted = std::getenv("IC_TEST_OPERATIONS");
    return (wanted != nullptr ? std::atoi(wanted) : OPERATIONS) / threadCount;
}

enum : unsigned int { MIXED = 1, COUNT = 2, READ_ONLY = 3, MISSING = 4, OWN = 10 };

// The values that all threads write to MIXED. Kinds and lengths differ, so that a torn value equals none of them.
const std::vector<PropertyValue>& mixedValues()
{
    static const std::vector<PropertyValue> values {
        PropertyValue("short"),
        PropertyValue(std::string(100, 'a')),
        PropertyValue(std::string(3000, 'b')),
        PropertyValue(Number(4294967295u)),
        PropertyValue(Number(0.1)),
        PropertyValue(IC::Buffer(200, 0xaa)),
        PropertyValue(IC::NumberArray(30, Number(7u))),
        PropertyValue(IC::NumberArray(50, Number(8u))),
        PropertyValue(IC::StringArray(9, std::string(70, 'c'))),
        PropertyValue(IC::EnumValue(7u)),
    };
    return values;
}

bool isWhole(const PropertyValue& value)
{
    const auto& all = mixedValues();
    return std::find(all.begin(), all.end(), value) != all.end();
}

class Provider : public Node {
public:
    Provider() : Node(SENSOR_FAN)
    {
        path = std::string("ab");
        parent = std::string("a");
        description = "a description that needs memory of its own";
        properties.insert({MIXED, mixedValues().front()});
        properties.insert({COUNT, PropertyValue(Number(0u))});
        properties.insert({READ_ONLY, PropertyValue("for ever", true)});
        for (unsigned int number = 0; number < threadCount; ++number)
            properties.insert({OWN + number, PropertyValue(Number(0u))});
    }

    // Adds 1 to COUNT; reading and writing are one change under the lock.
    void increment()
    {
        const Guard guard(mutex);
        PropertyValue value("");
        getProperty(COUNT, value);
        setProperty(COUNT, PropertyValue(Number(value.operator unsigned int() + 1)));
    }

protected:
    class Guard {
    public:
        explicit Guard(ZQ::Mutex& mutex) : mutex_(mutex) { mutex_.lock(0xFFFFFFFF); }
        ~Guard() { mutex_.unlock(); }
        Guard(const Guard&) = delete;
        Guard& operator=(const Guard&) = delete;

    private:
        ZQ::Mutex& mutex_;
    };
};

// Overrides every virtual operation, and calls back into the node while it holds the lock.
class CallingBack : public Provider {
public:
    StatusType getStatus() const override
    {
        const Guard guard(mutex);
        PropertyValue value("");
        Node::getProperty(READ_ONLY, value);
        return std::string(value) == "for ever" ? status : STATUS_LARGEST;
    }

    std::string getDescription() const override
    {
        const Guard guard(mutex);
        return getStatus() == STATUS_INITIAL ? Node::getDescription() : "";
    }

    Error getProperty(unsigned int key, PropertyValue& value) const override
    {
        const Guard guard(mutex);
        return getProperties().count(key) != 0 ? Node::getProperty(key, value) : Error("", 5);
    }

    std::map<unsigned int, PropertyValue> getProperties() const override
    {
        const Guard guard(mutex);
        return getStatus() == STATUS_INITIAL ? Node::getProperties()
                                             : std::map<unsigned int, PropertyValue>();
    }

    Error setProperty(const unsigned int& key, const PropertyValue& value) override
    {
        const Guard guard(mutex);
        Error outcome = Node::setProperty(key, value);
        PropertyValue stored("");
        if (outcome.getStatus() == 0 && Node::getProperty(key, stored).getStatus() == 0 && stored != value)
            return {"another thread changed the property under the lock", 1};
        return outcome;
    }

    operator std::string() const override
    {
        const Guard guard(mutex);
        return getDescription().empty() ? "" : Node::operator std::string();
    }
};

// How often something was wrong. Each thread has its own.
struct Faults {
    long torn = 0;       // a value that no thread has written
    long outcomes = 0;   // an unexpected status
    long backwards = 0;  // a value older than one that was read before
};

// How many records this thread has written: the sink runs on the thread that writes.
thread_local long recordsWritten = 0;

class SharedNodes : public testing::Test {
protected:
    void SetUp() override
    {
        mixedValues();
        before_ = VXLog::setRecordSink([](const VXLog::Record&) { ++recordsWritten; });
    }
    void TearDown() override { VXLog::setRecordSink(before_); }

private:
    VXLog::RecordSink before_;
};

void write(Node& node, int number, int step, Faults& faults)
{
    const auto& values = mixedValues();
    const auto own = OWN + static_cast<unsigned int>(number);
    const auto expect = [&faults](const Error& outcome, unsigned int status) {
        faults.outcomes += outcome.getStatus() == status ? 0 : 1;
    };
    expect(node.setProperty(MIXED, values[static_cast<std::size_t>(number + step) % values.size()]), 0);
    expect(node.setProperty(own, PropertyValue(Number(static_cast<unsigned int>(step)))), 0);
    if (step % 8 == 0) {
        expect(node.setProperty(READ_ONLY, values.front()), 16);
        expect(node.setProperty(MISSING, values.front()), 5);
    }
}

// `seen` holds what this thread has last read of each writer's own property. Writers only count up.
void read(const Node& node, std::array<unsigned int, threadCount>& seen, Faults& faults)
{
    PropertyValue value("");
    faults.outcomes += node.getProperty(MIXED, value).getStatus() == 0 ? 0 : 1;
    faults.torn += isWhole(value) ? 0 : 1;
    const auto all = node.getProperties();
    faults.torn += all.size() == 3 + threadCount && isWhole(all.at(MIXED)) ? 0 : 1;
    for (unsigned int number = 0; number < threadCount; ++number) {
        const unsigned int now = all.at(OWN + number);
        faults.backwards += now >= seen.at(number) ? 0 : 1;
        seen.at(number) = now;
    }
    faults.torn += node.operator std::string() == "Node 6162 : 20, status = 0" ? 0 : 1;
    faults.torn += node.getDescription() == "a description that needs memory of its own" ? 0 : 1;
}

template <class Class>
void workOnSharedNodes()
{
    constexpr int operationsAStep = 8;  // about: 2 or 4 in `write`, 4 in `read`, and 2 increments
    const int steps = std::max(operationsPerThread() / operationsAStep, 10);
    // On the heap, because race detectors do not notice the end of a mutex on the stack.
    const auto allNodes = std::make_unique<std::array<Class, 4>>();
    auto& nodes = *allNodes;
    std::array<Faults, threadCount> faults;
    std::array<long, threadCount> records {};
    runAtOnce([&](int number) {
        const auto self = static_cast<std::size_t>(number);
        std::array<std::array<unsigned int, threadCount>, 4> seen {};
        recordsWritten = 0;
        for (int step = 1; step <= steps; ++step) {
            const std::size_t which = static_cast<std::size_t>(number + step) % nodes.size();
            write(nodes.at(which), number, step, faults.at(self));
            if (number % 2 == 0)
                read(nodes.at(which), seen.at(which), faults.at(self));
            for (int i = 0; i < 2; ++i)
                nodes.at(which).increment();
        }
        records.at(self) = recordsWritten;
    });

    unsigned int increments = 0;
    for (const Class& node : nodes) {
        PropertyValue value("");
        node.getProperty(COUNT, value);
        increments += value.operator unsigned int();
        node.getProperty(MIXED, value);
        EXPECT_TRUE(isWhole(value));
    }
    EXPECT_EQ(increments, static_cast<unsigned int>(2 * threadCount * steps));
    for (int number = 0; number < threadCount; ++number) {
        SCOPED_TRACE("thread " + std::to_string(number));
        for (int step = steps; step > steps - 4; --step) {
            PropertyValue value("");
            nodes.at(static_cast<std::size_t>(number + step) % nodes.size())
                .getProperty(OWN + static_cast<unsigned int>(number), value);
            EXPECT_EQ(value, PropertyValue(Number(static_cast<unsigned int>(step))));
        }
        const Faults& its = faults.at(static_cast<std::size_t>(number));
        EXPECT_EQ(its.torn, 0);
        EXPECT_EQ(its.outcomes, 0);
        EXPECT_EQ(its.backwards, 0);
        // A log record and a trace record for each request and for each refusal.
        EXPECT_EQ(records.at(static_cast<std::size_t>(number)), 2L * (4 * steps + 4 * (steps / 8)));
    }
}

TEST_F(SharedNodes, LoseNoChangeAndTearNoValue)
{
    workOnSharedNodes<Provider>();
}

TEST_F(SharedNodes, LoseNoChangeAndTearNoValueWhenOverridesCallBack)
{
    workOnSharedNodes<CallingBack>();
}

// A node that its last user destroys.
class Shared {
public:
    Shared() : node_(std::make_unique<CallingBack>()) { }

    Node& node() const { return *node_; }

    // Ends one use. Returns whether it was the last: then the node is destroyed.
    bool release()
    {
        const std::lock_guard<std::mutex> lock(mutex_);
        if (--users_ > 0)
            return false;
        node_.reset();
        return true;
    }

private:
    std::mutex mutex_;
    int users_ = threadCount;
    std::unique_ptr<CallingBack> node_;
};

TEST_F(SharedNodes, CanBeDestroyedByTheirLastUser)
{
    constexpr int operationsAVisit = 5;
    std::vector<Shared> nodes(
        static_cast<std::size_t>(std::max(operationsPerThread() / operationsAVisit / 4, 10)));
    std::array<Faults, threadCount> faults;
    std::array<std::size_t, threadCount> last {};
    runAtOnce([&](int number) {
        const auto self = static_cast<std::size_t>(number);
        for (std::size_t i = 0; i < nodes.size(); ++i) {
            Shared& shared = nodes[(i + self) % nodes.size()];
            std::array<unsigned int, threadCount> seen {};
            write(shared.node(), number, 1, faults.at(self));
            read(shared.node(), seen, faults.at(self));
            last.at(self) += shared.release() ? 1 : 0;
        }
    });
    std::size_t gone = 0;
    for (const std::size_t count : last)
        gone += count;
    EXPECT_EQ(gone, nodes.size());
    for (const Faults& its : faults) {
        EXPECT_EQ(its.torn, 0);
        EXPECT_EQ(its.outcomes, 0);
    }
}

}  // namespace
