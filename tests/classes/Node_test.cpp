#include <algorithm>
#include <atomic>
#include <csignal>
#include <cstddef>
#include <functional>
#include <iomanip>
#include <map>
#include <memory>
#include <optional>
#include <sstream>
#include <string>
#include <thread>
#include <type_traits>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "IC/ICException.h"
#include "IC/Node.h"
#include "observe/Refusal.h"
#include "support/AllocationFailure.h"
#include "support/GroupingLocale.h"
#include "support/Hexadecimal.h"
#include "support/PropertySamples.h"
#include "support/VirtualTable.h"

namespace {

using allocation::completesWith;
using IC::Error;
using IC::Node;
using IC::NodeInvalidSensor;
using IC::Number;
using IC::PropertyValue;
using PropertyMap = std::map<unsigned int, PropertyValue>;

static_assert(std::is_same_v<std::underlying_type_t<Node::SensorType>, ZQ::Uint32>);
static_assert(std::is_same_v<std::underlying_type_t<Node::StatusType>, ZQ::Uint32>);
static_assert(std::is_convertible_v<Node::SensorType, unsigned int>);  // unscoped
static_assert(std::is_convertible_v<Node::StatusType, unsigned int>);

static_assert(std::is_default_constructible_v<Node>);
static_assert(std::is_constructible_v<Node, unsigned int>);
static_assert(!std::is_copy_constructible_v<Node>);
static_assert(!std::is_move_constructible_v<Node>);
static_assert(!std::is_copy_assignable_v<Node>);
static_assert(!std::is_move_assignable_v<Node>);
static_assert(std::is_polymorphic_v<Node>);
static_assert(!std::is_abstract_v<Node>);
static_assert(std::has_virtual_destructor_v<Node>);
static_assert(std::is_convertible_v<const Node&, Node::SensorType>);
static_assert(std::is_convertible_v<const Node&, Node::StatusType>);
static_assert(std::is_convertible_v<const Node&, std::string>);

static_assert(std::is_same_v<decltype(&Node::getStatus), Node::StatusType (Node::*)() const>);
static_assert(std::is_same_v<decltype(&Node::getDescription), std::string (Node::*)() const>);
static_assert(
    std::is_same_v<decltype(&Node::getProperty), Error (Node::*)(unsigned int, PropertyValue&) const>);
static_assert(std::is_same_v<decltype(&Node::getProperties), PropertyMap (Node::*)() const>);
static_assert(
    std::is_same_v<decltype(&Node::setProperty), Error (Node::*)(const unsigned int&, const PropertyValue&)>);
static_assert(std::is_same_v<decltype(&Node::hexstring), std::string (Node::*)(std::string) const>);
static_assert(std::is_same_v<decltype(std::declval<const Node&>().getSensor()), Node::SensorType>);
static_assert(std::is_same_v<decltype(std::declval<const Node&>().getPath()), std::string>);
static_assert(std::is_same_v<decltype(std::declval<const Node&>().getParent()), std::string>);

// A node class as an agent derives it, with the protected members made public for the tests.
class Probe : public Node {
public:
    Probe() = default;
    explicit Probe(unsigned int sensor, const std::string& itsPath = "") : Node(sensor) { path = itsPath; }

    using Node::description;
    using Node::mutex;
    using Node::parent;
    using Node::path;
    using Node::properties;
    using Node::status;
};

static_assert(std::is_same_v<decltype(Probe::mutex), ZQ::Mutex>);
static_assert(std::is_same_v<decltype(Probe::status), Node::StatusType>);
static_assert(std::is_same_v<decltype(Probe::description), std::string>);
static_assert(std::is_same_v<decltype(Probe::properties), PropertyMap>);
static_assert(std::is_same_v<decltype(Probe::path), std::string>);
static_assert(std::is_same_v<decltype(Probe::parent), std::string>);

// A node with a writable property 1 and a read-only property 2.
class FilledProbe : public Probe {
public:
    FilledProbe() : Probe(20, "ab")
    {
        status = static_cast<StatusType>(5);
        description = "a description that needs memory of its own";
        parent = "/";
        properties.insert({1u, PropertyValue("a text that needs memory of its own")});
        properties.insert({2u, PropertyValue(Number(3600u), true)});
    }
};

const std::string filledProperties =
    "1: 2 writable: a text that needs memory of its own; 2: 1 read-only: 3600; ";

// Expects an outcome with this status, no value and no message, as every property operation returns.
void expectOutcome(const Error& outcome, unsigned int status)
{
    EXPECT_EQ(outcome.getStatus(), status);
    EXPECT_EQ(outcome.getValue().getKind(), Number::KIND_UNKNOWN);
    EXPECT_EQ(outcome.getMessage(), "");
}

int expectPair(const std::vector<observe::Record>& records, std::size_t first, int level,
               const std::string& message)
{
    return expectRecordPair(records, first, "setProperty", "Node", "Vexilon.IC.Node", level, message);
}

// Expects all lock calls so far to be on this mutex, and the mutex to be held this often after each of them.
void expectLockDepths(const ZQ::Mutex& mutex, const std::vector<int>& depths)
{
    const std::vector<observe::LockCall> calls = observe::lockCalls();
    ASSERT_EQ(calls.size(), depths.size());
    int depth = 0;
    for (std::size_t i = 0; i < calls.size(); ++i) {
        SCOPED_TRACE("lock call " + std::to_string(i));
        EXPECT_EQ(calls[i].mutex, &mutex);
        EXPECT_EQ(calls[i].lock, depths[i] > depth);
        EXPECT_EQ(calls[i].depth, depths[i]);
        if (calls[i].lock) {
            EXPECT_EQ(calls[i].timeoutMilliseconds, 0xFFFFFFFFu);
        }
        depth = depths[i];
    }
}

// Expects that every lock was released and that another thread obtains the mutex. Resets the observer.
void expectFree(const Probe& node)
{
    EXPECT_EQ(observe::locksHeld(), 0);
    EXPECT_EQ(observe::buffersAlive(), 0);
    int balance = 0;
    for (const observe::LockCall& call : observe::lockCalls())
        balance += call.lock ? 1 : -1;
    EXPECT_EQ(balance, 0);
    observe::reset();
    bool obtained = false;
    std::thread other([&] {
        obtained = node.mutex.lock(1000);
        if (obtained)
            node.mutex.unlock();
    });
    other.join();
    EXPECT_TRUE(obtained);
    observe::reset();
}

// Fills the observer's list of lock calls, so that the list does not need memory in unlock.
void makeRoomForLockCalls(const Node& node)
{
    for (int i = 0; i < 17; ++i)
        static_cast<void>(node.getStatus());
}

struct Operation {
    const char* name;
    std::function<void(Probe&)> run;
    std::vector<int> depths;  // how often the mutex is held after each call of lock and unlock
};

// Every operation that takes the lock, for a FilledProbe.
std::vector<Operation> lockingOperations()
{
    static const PropertyValue value("another text that needs memory of its own");
    return {
        {"getStatus", [](Probe& node) { static_cast<void>(node.getStatus()); }, {1, 0}},
        {"operator StatusType",
         [](Probe& node) { static_cast<void>(node.operator Node::StatusType()); },
         {1, 0}},
        {"getDescription", [](Probe& node) { static_cast<void>(node.getDescription()); }, {1, 0}},
        {"getProperty",
         [](Probe& node) {
             PropertyValue out(PropertyValue::KIND_UNKNOWN);
             static_cast<void>(node.getProperty(1, out));
         },
         {1, 0}},
        {"getProperty of a missing one",
         [](Probe& node) {
             PropertyValue out(PropertyValue::KIND_UNKNOWN);
             static_cast<void>(node.getProperty(3, out));
         },
         {1, 0}},
        {"getProperties", [](Probe& node) { static_cast<void>(node.getProperties()); }, {1, 0}},
        {"setProperty", [](Probe& node) { static_cast<void>(node.setProperty(1, value)); }, {1, 0}},
        {"setProperty of a read-only one",
         [](Probe& node) { static_cast<void>(node.setProperty(2, value)); },
         {1, 0}},
        {"setProperty of a missing one",
         [](Probe& node) { static_cast<void>(node.setProperty(3, value)); },
         {1, 0}},
        {"operator std::string",
         [](Probe& node) { static_cast<void>(node.operator std::string()); },
         {1, 2, 1, 0}},
        {"operator<<",
         [](Probe& node) {
             std::ostringstream out;
             out << node;
         },
         {1, 2, 1, 0}},
    };
}

TEST(NodeConstructor, WithoutASensorMakesAnUnknownNode)
{
    const Node node;
    EXPECT_EQ(node.getSensor(), 0u);
    EXPECT_EQ(node.operator Node::SensorType(), 0u);
    EXPECT_EQ(node.getStatus(), 0u);
    EXPECT_EQ(node.getDescription(), "UNKNOWN SENSOR NODE CREATED BY DEFAULT CONSTRUCTOR");
    EXPECT_EQ(node.getDescription().size(), 50u);
    EXPECT_EQ(node.getPath(), "");
    EXPECT_EQ(node.getParent(), "");
    EXPECT_TRUE(node.getProperties().empty());
    EXPECT_TRUE(observe::records().empty());
}

TEST(NodeConstructor, WithASensorUpTo73MakesANodeWithoutDescription)
{
    for (unsigned int sensor = 0; sensor <= 73; ++sensor) {
        SCOPED_TRACE(sensor);
        const Node node(sensor);
        EXPECT_EQ(node.getSensor(), sensor);
        EXPECT_EQ(node.operator Node::SensorType(), sensor);
        EXPECT_EQ(node.getStatus(), 0u);
        EXPECT_EQ(node.getDescription(), "");
        EXPECT_EQ(node.getPath(), "");
        EXPECT_EQ(node.getParent(), "");
        EXPECT_TRUE(node.getProperties().empty());
    }
    EXPECT_TRUE(observe::records().empty());
}

TEST(NodeConstructor, RefusesASensorAbove73)
{
    for (const unsigned int sensor : {74u, 75u, 255u, 256u, 329u, 65536u, 2147483648u, 4294967295u}) {
        SCOPED_TRACE(sensor);
        const std::string code = std::to_string(sensor);
        expectRefusal<NodeInvalidSensor>([&] { const Node node(sensor); }, "Node", "Node", "Vexilon.IC.Node",
                                         "Node: Sensor value out of range: " + code,
                                         code + " is not a valid sensor. The largest possible sensor is 73");
    }
    EXPECT_TRUE(observe::lockCalls().empty());
}

TEST(NodeConstructor, TheRefusalTextDoesNotDependOnTheLocale)
{
    const GlobalGroupingLocale grouping(1);
    try {
        const Node node(1234567);
        ADD_FAILURE() << "nothing was thrown";
    } catch (const NodeInvalidSensor& exception) {
        EXPECT_EQ(exception.what(), "1234567 is not a valid sensor. The largest possible sensor is 73");
    }
}

TEST(NodeConstructor, TakesNoLock)
{
    std::optional<Node> unknown(std::in_place);
    std::optional<Node> fan(std::in_place, 20u);
    EXPECT_TRUE(observe::lockCalls().empty());
}

TEST(NodeConstructor, GivesBackAllMemoryWhenItRunsOut)
{
    makeRoomForLockCalls(Node());  // the destructor of the node locks
    EXPECT_LT(allocation::expectAllMemoryGivenBack([] { const Node node; }), 20);
}

TEST(NodeIdentity, IsReadWithoutTheLock)
{
    const FilledProbe node;
    EXPECT_EQ(node.getSensor(), 20u);
    EXPECT_EQ(node.operator Node::SensorType(), 20u);
    EXPECT_EQ(node.getPath(), "ab");
    EXPECT_EQ(node.getParent(), "/");
    EXPECT_EQ(node.hexstring("ab"), "6162");
    EXPECT_TRUE(observe::lockCalls().empty());
    EXPECT_TRUE(observe::records().empty());
}

TEST(NodeIdentity, IsReturnedAsACopy)
{
    const FilledProbe node;
    node.getPath().clear();
    node.getParent().clear();
    EXPECT_EQ(node.getPath(), "ab");
    EXPECT_EQ(node.getParent(), "/");
}

TEST(NodeComparison, ComparesThePathsByUnsignedBytesThenByLength)
{
    const struct {
        std::string a;
        std::string b;
        int order;  // of a against b
    } rows[] = {
        {"", "", 0},
        {"ab", "ab", 0},
        {"", "a", -1},
        {"a", "ab", -1},
        {"b", "ab", 1},
        {"B", "a", -1},
        {"\x80", "\x7f", 1},
        {"a\x80", "a\x7f", 1},
        {"a\x80", "a\x7f longer", 1},
        {"\xff", "\x01", 1},
        {"", std::string("\0", 1), -1},
        {std::string("a\0b", 3), std::string("a\0c", 3), -1},
        {std::string("a\0b", 3), std::string("a\0b", 3), 0},
        {std::string("a\0", 2), "a", 1},
    };
    for (const auto& row : rows) {
        const Probe a(20, row.a);
        const Probe b(20, row.b);
        SCOPED_TRACE(a.hexstring(row.a) + " and " + b.hexstring(row.b));
        EXPECT_EQ(a == b, row.order == 0);
        EXPECT_EQ(a != b, row.order != 0);
        EXPECT_EQ(a < b, row.order < 0);
        EXPECT_EQ(a <= b, row.order <= 0);
        EXPECT_EQ(a > b, row.order > 0);
        EXPECT_EQ(a >= b, row.order >= 0);
        EXPECT_EQ(b == a, row.order == 0);
        EXPECT_EQ(b != a, row.order != 0);
        EXPECT_EQ(b<a, row.order> 0);
        EXPECT_EQ(b <= a, row.order >= 0);
        EXPECT_EQ(b > a, row.order < 0);
        EXPECT_EQ(b >= a, row.order <= 0);
    }
}

TEST(NodeComparison, ComparesTheWholePath)
{
    const Probe a(20, "/chassis/board/fan1");
    const Probe b(20, "/chassis/board/fan2");
    EXPECT_TRUE(a < b);
    EXPECT_FALSE(a > b);
    EXPECT_FALSE(a == b);
}

TEST(NodeComparison, IgnoresAllButThePath)
{
    Probe fan(20, "same");
    Probe disk(11, "same");
    disk.status = static_cast<Node::StatusType>(9);
    disk.description = "a disk";
    disk.parent = "/";
    disk.properties.insert({1u, PropertyValue("text")});
    EXPECT_TRUE(fan == disk);
    EXPECT_FALSE(fan != disk);
    EXPECT_FALSE(fan < disk);
    EXPECT_FALSE(disk < fan);
    EXPECT_TRUE(fan <= disk);
    EXPECT_TRUE(fan >= disk);
    EXPECT_FALSE(fan > disk);
}

TEST(NodeComparison, TakesNoLock)
{
    const Probe a(20, "a");
    const Probe b(20, "b");
    const bool results[] = {a == b, a != b, a<b, a <= b, a> b, a >= b};
    const bool expected[] = {false, true, true, true, false, false};
    EXPECT_TRUE(std::equal(std::begin(results), std::end(results), std::begin(expected)));
    EXPECT_TRUE(observe::lockCalls().empty());
}

TEST(NodeDestructor, LocksOnce)
{
    std::optional<FilledProbe> node(std::in_place);
    const ZQ::Mutex* const mutex = &node->mutex;
    node.reset();
    expectLockDepths(*mutex, {1, 0});
    EXPECT_TRUE(observe::records().empty());
}

TEST(NodeDestructor, LocksWithoutPropertiesToo)
{
    std::optional<Probe> node(std::in_place, 20u);
    const ZQ::Mutex* const mutex = &node->mutex;
    node.reset();
    expectLockDepths(*mutex, {1, 0});
}

TEST(NodeDestructor, LocksWhenCalledThroughTheBaseClass)
{
    std::unique_ptr<Node> node = std::make_unique<FilledProbe>();
    node.reset();
    const auto calls = observe::lockCalls();
    ASSERT_EQ(calls.size(), 2u);
    EXPECT_TRUE(calls[0].lock);
    EXPECT_EQ(calls[0].timeoutMilliseconds, 0xFFFFFFFFu);
    EXPECT_FALSE(calls[1].lock);
}

int releasedUnderTheLock = 0;
int releasedWithoutTheLock = 0;

TEST(NodeDestructor, DestroysThePropertiesUnderTheLock)
{
    std::optional<Probe> node(std::in_place, 20u);
    node->properties.insert({1u, PropertyValue("a text that needs memory of its own")});
    node->properties.insert({2u, PropertyValue(Number(3600u))});
    makeRoomForLockCalls(*node);
    releasedUnderTheLock = 0;
    releasedWithoutTheLock = 0;
    allocation::onRelease = [] {
        ++(observe::locksHeld() == 1 ? releasedUnderTheLock : releasedWithoutTheLock);
    };
    node.reset();
    allocation::onRelease = nullptr;
    EXPECT_GE(releasedUnderTheLock, 5);    // two entries, two objects, and the characters of the text
    EXPECT_EQ(releasedWithoutTheLock, 0);  // no other member of this node owns memory
}

TEST(NodeDestructor, ContinuesWhenLockReturnsFalse)
{
    const long before = allocation::aliveNow;
    {
        std::optional<FilledProbe> node(std::in_place);
        observe::setLockResult(false);
        node.reset();
        EXPECT_EQ(observe::lockCalls().size(), 2u);
        EXPECT_EQ(observe::locksHeld(), 0);
        observe::reset();
    }
    EXPECT_EQ(allocation::aliveNow, before);
}

TEST(NodeDestructor, EndsTheProgramIfTheLockThrows)
{
    EXPECT_EXIT(
        {
            observe::throwAt(observe::Call::lock, 1);
            const FilledProbe node;
        },
        testing::KilledBySignal(SIGABRT), "observe::Thrown");
}

TEST(NodeStatus, IsReadByGetterAndConversion)
{
    Probe node(20);
    for (const unsigned int code : {0u, 5u, 85u, 86u, 4294967295u}) {
        node.status = static_cast<Node::StatusType>(code);
        EXPECT_EQ(node.getStatus(), code);
        EXPECT_EQ(node.operator Node::StatusType(), code);
    }
}

TEST(NodeDescription, IsReturnedAsACopy)
{
    const FilledProbe node;
    std::string copy = node.getDescription();
    EXPECT_EQ(copy, "a description that needs memory of its own");
    copy.clear();
    EXPECT_EQ(node.getDescription(), "a description that needs memory of its own");
}

TEST(NodeGetProperty, CopiesAStoredValueWithItsMark)
{
    Probe node(20);
    for (const bool mark : {false, true}) {
        node.properties.clear();
        for (const PropertyValue& stored : samples(mark))
            node.properties.emplace(stored.getKind(), stored);
        for (const PropertyValue& old : otherSamples(!mark)) {
            for (unsigned int key = 0; key < node.properties.size(); ++key) {
                SCOPED_TRACE(seen(old) + " becomes " + std::to_string(key));
                PropertyValue value(old);
                expectOutcome(node.getProperty(key, value), 0);
                EXPECT_EQ(seen(value), seen(node.properties.at(key)));
            }
        }
    }
    EXPECT_TRUE(observe::records().empty());
}

TEST(NodeGetProperty, DoesNotChangeTheValueForAMissingKey)
{
    const FilledProbe node;
    for (const unsigned int key : {0u, 3u, 4294967295u}) {
        for (const bool mark : {false, true}) {
            for (const PropertyValue& old : samples(mark)) {
                SCOPED_TRACE(seen(old));
                PropertyValue value(old);
                expectOutcome(node.getProperty(key, value), 5);
                EXPECT_EQ(seen(value), seen(old));
            }
        }
    }
    EXPECT_EQ(seen(node.properties), filledProperties);
    EXPECT_TRUE(observe::records().empty());
}

TEST(NodeGetProperty, ReturnsAnIndependentCopy)
{
    const FilledProbe node;
    PropertyValue value(PropertyValue::KIND_UNKNOWN);
    expectOutcome(node.getProperty(1, value), 0);
    value = PropertyValue("changed");
    EXPECT_EQ(seen(node.properties), filledProperties);
}

TEST(NodeGetProperty, DoesNotChangeTheValueWhenMemoryRunsOut)
{
    const FilledProbe node;
    for (const PropertyValue& old : otherSamples(true)) {
        SCOPED_TRACE(seen(old));
        for (long allowed = 0;; ++allowed) {
            ASSERT_LT(allowed, 100);
            PropertyValue value(old);
            observe::reset();
            makeRoomForLockCalls(node);
            if (completesWith(allowed, [&] { static_cast<void>(node.getProperty(1, value)); })) {
                EXPECT_EQ(seen(value), "2 writable: a text that needs memory of its own");
                break;
            }
            EXPECT_EQ(seen(value), seen(old));
        }
        expectFree(node);
    }
}

TEST(NodeGetProperties, CopiesTheMapWithTheReadOnlyMarks)
{
    const FilledProbe node;
    PropertyMap copy = node.getProperties();
    EXPECT_EQ(seen(copy), filledProperties);
    copy.at(1) = PropertyValue("changed");
    copy.erase(2);
    EXPECT_EQ(seen(node.properties), filledProperties);
    EXPECT_TRUE(observe::records().empty());
}

TEST(NodeGetProperties, ReturnsAnEmptyMapForNoProperties)
{
    EXPECT_TRUE(Node(20).getProperties().empty());
}

TEST(NodeGetProperties, GivesBackAllMemoryWhenItRunsOut)
{
    const FilledProbe node;
    makeRoomForLockCalls(node);
    const long allowed =
        allocation::expectAllMemoryGivenBack([&] { static_cast<void>(node.getProperties()); });
    EXPECT_EQ(allowed, 5);  // two entries, two objects, and the characters of the text
    expectFree(node);
}

TEST(NodeSetProperty, ReplacesAWritableValueBetweenAllKinds)
{
    for (const bool mark : {false, true}) {
        for (const PropertyValue& old : samples(false)) {
            for (const PropertyValue& value : otherSamples(mark)) {
                SCOPED_TRACE(seen(old) + " becomes " + seen(value));
                observe::reset();
                Probe node(20);
                node.properties.emplace(7u, old);
                expectOutcome(node.setProperty(7, value), 0);
                EXPECT_EQ(seen(node.properties), "7: " + seen(value) + "; ");
                PropertyValue back(PropertyValue::KIND_UNKNOWN);
                expectOutcome(node.getProperty(7, back), 0);
                EXPECT_EQ(seen(back), seen(value));

                const auto records = observe::records();
                EXPECT_EQ(records.size(), 2u);
                expectPair(records, 0, 3000, "setProperty: 7 " + value.operator std::string());
            }
        }
    }
}

TEST(NodeSetProperty, RefusesAReadOnlyValue)
{
    for (const bool mark : {false, true}) {
        for (const PropertyValue& old : samples(true)) {
            for (const PropertyValue& value : otherSamples(mark)) {
                SCOPED_TRACE(seen(old) + " stays, not " + seen(value));
                observe::reset();
                Probe node(20);
                node.properties.emplace(7u, old);
                expectOutcome(node.setProperty(7, value), 16);
                EXPECT_EQ(seen(node.properties), "7: " + seen(old) + "; ");

                const auto records = observe::records();
                EXPECT_EQ(records.size(), 4u);
                expectPair(records, 0, 3000, "setProperty: 7 " + value.operator std::string());
                expectPair(records, 2, 6000, "setProperty: 7 read-only");
            }
        }
    }
}

TEST(NodeSetProperty, RefusesAMissingKeyAndAddsNothing)
{
    FilledProbe node;
    for (const unsigned int key : {0u, 3u, 7u, 4294967295u}) {
        SCOPED_TRACE(key);
        observe::reset();
        expectOutcome(node.setProperty(key, PropertyValue("abc", true)), 5);
        EXPECT_EQ(seen(node.properties), filledProperties);

        const auto records = observe::records();
        EXPECT_EQ(records.size(), 4u);
        expectPair(records, 0, 3000, "setProperty: " + std::to_string(key) + " abc");
        expectPair(records, 2, 6000, "setProperty: " + std::to_string(key) + " does not exist");
    }
}

TEST(NodeSetProperty, RecordsTheTextOfTheValue)
{
    const struct {
        PropertyValue value;
        const char* message;
    } rows[] = {
        {PropertyValue(""), "setProperty: 4294967295 "},
        {PropertyValue("two words"), "setProperty: 4294967295 two words"},
        {PropertyValue(PropertyValue::KIND_UNKNOWN), "setProperty: 4294967295 unknown"},
        {PropertyValue(Number(-7)), "setProperty: 4294967295 -7"},
        {PropertyValue(IC::Buffer {1, 2, 3, 4}), "setProperty: 4294967295 01020304 "},
        {PropertyValue(IC::EnumValue(7u)), "setProperty: 4294967295 7"},
        {PropertyValue(IC::NumberArray {Number(1u), Number(2u)}), "setProperty: 4294967295 {1, 2}"},
        {PropertyValue(IC::StringArray {"a\"b", ""}), "setProperty: 4294967295 {\"a\\\"b\", \"\"}"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.message);
        observe::reset();
        Probe node(20);
        node.properties.insert({4294967295u, PropertyValue("")});
        expectOutcome(node.setProperty(4294967295u, row.value), 0);
        const auto records = observe::records();
        EXPECT_EQ(records.size(), 2u);
        expectPair(records, 0, 3000, row.message);
    }
}

TEST(NodeSetProperty, TakesTheReadOnlyMarkOfTheNewValue)
{
    FilledProbe node;
    expectOutcome(node.setProperty(1, PropertyValue("last", true)), 0);
    expectOutcome(node.setProperty(1, PropertyValue("too late", false)), 16);
    EXPECT_EQ(seen(node.properties), "1: 2 read-only: last; 2: 1 read-only: 3600; ");
}

TEST(NodeSetProperty, AcceptsAReferenceToAStoredValue)
{
    FilledProbe node;
    expectOutcome(node.setProperty(1, node.properties.at(1)), 0);
    expectOutcome(node.setProperty(1, node.properties.at(2)), 0);
    EXPECT_EQ(seen(node.properties), "1: 1 read-only: 3600; 2: 1 read-only: 3600; ");
}

TEST(NodeSetProperty, RecordsTheRequestBeforeTheLockAndTheRefusalUnderIt)
{
    const struct {
        unsigned int key;
        std::vector<int> locksHeld;  // at each record
    } rows[] = {{1, {0, 0}}, {2, {0, 0, 1, 1}}, {3, {0, 0, 1, 1}}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.key);
        FilledProbe node;
        observe::reset();
        std::vector<int> held;
        observe::onRecord([&](const observe::Record&) { held.push_back(observe::locksHeld()); });
        static_cast<void>(node.setProperty(row.key, PropertyValue("abc")));
        EXPECT_EQ(held, row.locksHeld);
        const auto calls = observe::lockCalls();
        ASSERT_EQ(calls.size(), 2u);
        EXPECT_EQ(calls[0].records, 2u);
        EXPECT_EQ(calls[1].records, row.locksHeld.size());
    }
}

TEST(NodeSetProperty, KeepsTheOldValueWhenMemoryRunsOut)
{
    const auto values = otherSamples(true);
    for (const PropertyValue& old : samples(false)) {
        for (const PropertyValue& value : values) {
            SCOPED_TRACE(seen(old) + " becomes " + seen(value));
            Probe node(20);
            for (long allowed = 0;; ++allowed) {
                ASSERT_LT(allowed, 1000);
                node.properties.clear();
                node.properties.emplace(7u, old);
                observe::reset();
                makeRoomForLockCalls(node);
                if (completesWith(allowed, [&] { static_cast<void>(node.setProperty(7, value)); })) {
                    EXPECT_EQ(seen(node.properties), "7: " + seen(value) + "; ");
                    EXPECT_GT(allowed, 0);
                    break;
                }
                ASSERT_EQ(seen(node.properties), "7: " + seen(old) + "; ") << "at allocation " << allowed;
                ASSERT_EQ(observe::locksHeld(), 0) << "at allocation " << allowed;
            }
            expectFree(node);
        }
    }
}

TEST(NodeLock, IsTakenByEachOperationOnGuardedState)
{
    for (const Operation& operation : lockingOperations()) {
        SCOPED_TRACE(operation.name);
        FilledProbe node;
        const FilledProbe other;
        observe::reset();
        operation.run(node);
        expectLockDepths(node.mutex, operation.depths);
        expectFree(node);
    }
}

TEST(NodeLock, IsReleasedEvenWhenLockReturnsFalse)
{
    for (const Operation& operation : lockingOperations()) {
        SCOPED_TRACE(operation.name);
        FilledProbe node;
        observe::reset();
        observe::setLockResult(false);
        operation.run(node);
        expectLockDepths(node.mutex, operation.depths);
        expectFree(node);
    }
}

TEST(NodeLock, ThatReturnsFalseChangesNoResult)
{
    FilledProbe node;
    observe::setLockResult(false);
    EXPECT_EQ(node.getStatus(), 5u);
    EXPECT_EQ(node.operator Node::StatusType(), 5u);
    EXPECT_EQ(node.getDescription(), "a description that needs memory of its own");
    EXPECT_EQ(seen(node.getProperties()), filledProperties);
    PropertyValue value(PropertyValue::KIND_UNKNOWN);
    expectOutcome(node.getProperty(1, value), 0);
    EXPECT_EQ(seen(value), "2 writable: a text that needs memory of its own");
    expectOutcome(node.getProperty(3, value), 5);
    expectOutcome(node.setProperty(2, PropertyValue("abc")), 16);
    expectOutcome(node.setProperty(3, PropertyValue("abc")), 5);
    EXPECT_EQ(node.operator std::string(), "Node 6162 : 20, status = 5");
    const auto records = observe::records();
    EXPECT_EQ(records.size(), 8u);  // nothing about the lock

    expectOutcome(node.setProperty(1, PropertyValue("abc")), 0);
    EXPECT_EQ(seen(node.properties), "1: 2 writable: abc; 2: 1 read-only: 3600; ");
}

TEST(NodeLock, IsReleasedWhereverThePlatformThrows)
{
    for (const Operation& operation : lockingOperations()) {
        SCOPED_TRACE(operation.name);
        for (int nth = 1;; ++nth) {
            SCOPED_TRACE("platform call " + std::to_string(nth));
            ASSERT_LT(nth, 1000);
            FilledProbe node;
            observe::reset();
            observe::throwAt(observe::Call::any, nth);
            bool caught = false;
            try {
                operation.run(node);
            } catch (const observe::Thrown&) {
                caught = true;
            }
            const bool reached = observe::thrown();
            expectFree(node);
            EXPECT_EQ(caught, reached);
            if (!reached) {
                EXPECT_GT(nth, 1);
                break;
            }
            EXPECT_EQ(seen(node.properties), filledProperties);
        }
    }
}

TEST(NodeLock, IsReleasedWhereverMemoryRunsOut)
{
    for (const Operation& operation : lockingOperations()) {
        SCOPED_TRACE(operation.name);
        for (long allowed = 0;; ++allowed) {
            SCOPED_TRACE("memory for " + std::to_string(allowed) + " allocations");
            ASSERT_LT(allowed, 1000);
            FilledProbe node;
            observe::reset();
            makeRoomForLockCalls(node);
            const bool completed = completesWith(allowed, [&] { operation.run(node); });
            expectFree(node);
            if (completed)
                break;
            EXPECT_EQ(seen(node.properties), filledProperties);
        }
    }
}

TEST(NodeLock, IsReleasedWhenTheLoggerThrowsUnderIt)
{
    // The first log and trace record report the request; the second ones are written under the lock.
    for (const unsigned int key : {2u, 3u}) {
        for (const observe::Call call :
             {observe::Call::bufferConstructor, observe::Call::log, observe::Call::trace}) {
            FilledProbe node;
            observe::reset();
            observe::throwAt(call, 2);
            EXPECT_THROW(node.setProperty(key, PropertyValue("abc")), observe::Thrown);
            expectLockDepths(node.mutex, {1, 0});
            expectFree(node);
            EXPECT_EQ(seen(node.properties), filledProperties);
        }
    }
}

// The test changes the node at each lock and unlock; the operation must see what was there in between.
TEST(NodeLock, IsHeldWhileAValueIsRead)
{
    Probe node(20);
    const auto fill = [&node](unsigned int code, const std::string& text) {
        node.status = static_cast<Node::StatusType>(code);
        node.description = text;
        node.properties.insert_or_assign(1u, PropertyValue(text));
    };
    const auto within = [&](auto operation) {
        fill(1, "before");
        observe::onLock([&](bool lock) { lock ? fill(2, "within") : fill(3, "after"); });
        auto result = operation();
        observe::onLock(nullptr);
        return result;
    };
    EXPECT_EQ(within([&] { return node.getStatus(); }), 2u);
    EXPECT_EQ(within([&] { return node.operator Node::StatusType(); }), 2u);
    EXPECT_EQ(within([&] { return node.getDescription(); }), "within");
    EXPECT_EQ(within([&] { return seen(node.getProperties()); }), "1: 2 writable: within; ");
    EXPECT_EQ(within([&] {
                  PropertyValue value("");
                  static_cast<void>(node.getProperty(1, value));
                  return seen(value);
              }),
              "2 writable: within");
}

TEST(NodeLock, IsHeldWhileAKeyIsLookedUp)
{
    Probe node(20);
    observe::onLock([&](bool lock) {
        node.properties.clear();
        if (lock)
            node.properties.emplace(1u, PropertyValue("within"));
    });
    PropertyValue value("");
    EXPECT_EQ(node.getProperty(1, value).getStatus(), Error::STATUS_SUCCESS);
    EXPECT_EQ(node.setProperty(1, PropertyValue("changed")).getStatus(), Error::STATUS_SUCCESS);
    observe::onLock([&](bool lock) {
        node.properties.clear();
        if (!lock)
            node.properties.emplace(1u, PropertyValue("after"));
    });
    EXPECT_EQ(node.getProperty(1, value).getStatus(), Error::STATUS_NO_SUCH_PROPERTY);
    EXPECT_EQ(node.setProperty(1, value).getStatus(), Error::STATUS_NO_SUCH_PROPERTY);
    EXPECT_EQ(seen(node.properties), "1: 2 writable: after; ");
}

TEST(NodeLock, IsHeldWhileAValueIsChanged)
{
    Probe node(20);
    node.properties.emplace(1u, PropertyValue("old"));
    std::string atUnlock;
    observe::onLock([&](bool lock) {
        if (!lock)
            atUnlock = seen(node.properties);
    });
    static_cast<void>(node.setProperty(1, PropertyValue("new")));
    observe::onLock(nullptr);
    EXPECT_EQ(atUnlock, "1: 2 writable: new; ");
}

TEST(NodeText, ListsPathInHexadecimalSensorAndStatus)
{
    EXPECT_EQ(Node().operator std::string(), "Node  : 0, status = 0");
    const struct {
        unsigned int sensor;
        std::string path;
        unsigned int status;
        const char* text;
    } rows[] = {
        {20, "ab", 0, "Node 6162 : 20, status = 0"},
        {0, "", 85, "Node  : 0, status = 85"},
        {73, "/fan 1", 4294967295u, "Node 2f66616e2031 : 73, status = 4294967295"},
        {1, std::string("\0\x7f\xff", 3), 1, "Node 007fff : 1, status = 1"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.text);
        Probe node(row.sensor, row.path);
        node.status = static_cast<Node::StatusType>(row.status);
        node.description = "no part of the text";
        node.parent = "/";
        node.properties.insert({1u, PropertyValue("no part of the text")});
        EXPECT_EQ(node.operator std::string(), row.text);
        std::ostringstream out;
        EXPECT_EQ(&(out << node), &out);
        EXPECT_EQ(out.str(), row.text);
    }
    EXPECT_TRUE(observe::records().empty());
}

TEST(NodeText, FollowsTheGlobalLocaleLikeANewStream)
{
    Probe node(20, "1234");
    node.status = static_cast<Node::StatusType>(1234567);
    {
        const GlobalGroupingLocale grouping;
        EXPECT_EQ(node.operator std::string(), "Node 31323334 : 20, status = 1,234,567");
    }
    {
        const GlobalGroupingLocale grouping(1);
        EXPECT_EQ(node.operator std::string(), "Node 31323334 : 2,0, status = 1,2,3,4,5,6,7");
    }
    EXPECT_EQ(node.operator std::string(), "Node 31323334 : 20, status = 1234567");
}

TEST(NodeText, IsCompleteOrThrowsWhenMemoryRunsOut)
{
    Probe node(20, "/a/longer/path");
    node.status = static_cast<Node::StatusType>(1234567);
    makeRoomForLockCalls(node);
    allocation::expectTextCompleteOrThrows(node, "Node 2f612f6c6f6e6765722f70617468 : 20, status = 1234567");
}

TEST(NodeText, AllocatesItsResultAfterTheUnlock)
{
    long atLastUnlock = 0;  // declared before the node, because the node's destructor unlocks
    const Probe node(20, "a path");
    makeRoomForLockCalls(node);
    observe::onLock([&](bool lock) {
        if (!lock)
            atLastUnlock = allocation::madeSoFar;
    });
    const std::string text = node.operator std::string();
    EXPECT_GT(allocation::madeSoFar, atLastUnlock);
}

TEST(NodeStream, InsertsTheNodeAsOneText)
{
    std::ostringstream out;
    out.imbue(groupingLocale(1));
    out << std::hex << std::showbase << std::setfill('*') << std::setw(30) << Probe(20, "ab");
    EXPECT_EQ(out.str(), "****Node 6162 : 20, status = 0");
    EXPECT_EQ(out.width(), 0);

    std::ostringstream left;
    left << std::left << std::setfill('.') << std::setw(28) << Probe(20, "ab") << '|';
    EXPECT_EQ(left.str(), "Node 6162 : 20, status = 0..|");
}

TEST(NodeHexstring, HasTwoLowerCaseDigitsForEachByte)
{
    const Node node;
    expectTwoLowerCaseDigitsForEachByte([&](const std::string& bytes) { return node.hexstring(bytes); });
}

TEST(NodeHexstring, ConvertsAllBytes)
{
    const Node node;
    expectTwoLowerCaseDigitsForAllBytes([&](const std::string& bytes) { return node.hexstring(bytes); });
}

// Overrides each virtual function except the text.
class Overriding : public Probe {
public:
    Overriding() : Probe(20, "ab") { }

    StatusType getStatus() const override
    {
        locksHeldInside = observe::locksHeld();
        if (throws)
            throw std::string("from getStatus");
        return static_cast<StatusType>(42);
    }
    std::string getDescription() const override { return "described anew"; }
    Error getProperty(unsigned int, PropertyValue&) const override { return Error("get", 1); }
    PropertyMap getProperties() const override { return {{9u, PropertyValue("nine")}}; }
    Error setProperty(const unsigned int&, const PropertyValue&) override { return Error("set", 2); }

    bool throws = false;
    mutable int locksHeldInside = -1;
};

class OverridingText : public Probe {
public:
    OverridingText() : Probe(20, "ab") { }
    operator std::string() const override { return "a node of another kind"; }
};

TEST(NodeVirtual, CallsReachTheDerivedClass)
{
    Overriding overriding;
    Node& node = overriding;
    PropertyValue value("");
    EXPECT_EQ(node.getStatus(), 42u);
    EXPECT_EQ(node.getDescription(), "described anew");
    EXPECT_EQ(node.getProperty(1, value).getMessage(), "get");
    EXPECT_EQ(seen(node.getProperties()), "9: 2 writable: nine; ");
    EXPECT_EQ(node.setProperty(1, value).getMessage(), "set");
}

TEST(NodeVirtual, TextCallsTheOverriddenStatusUnderTheLock)
{
    const Overriding node;
    EXPECT_EQ(node.operator std::string(), "Node 6162 : 20, status = 42");
    EXPECT_EQ(node.locksHeldInside, 1);
    expectLockDepths(node.mutex, {1, 0});  // the override does not lock
}

TEST(NodeVirtual, TextReleasesTheLockWhenTheOverriddenStatusThrows)
{
    Overriding node;
    node.throws = true;
    EXPECT_THROW(node.operator std::string(), std::string);
    expectLockDepths(node.mutex, {1, 0});
    expectFree(node);
}

TEST(NodeVirtual, StatusConversionDoesNotCallTheOverriddenStatus)
{
    Overriding node;
    node.status = static_cast<Node::StatusType>(7);
    EXPECT_EQ(node.operator Node::StatusType(), 7u);
    EXPECT_EQ(static_cast<const Node&>(node).operator Node::StatusType(), 7u);
    EXPECT_EQ(node.locksHeldInside, -1);
}

TEST(NodeVirtual, StreamWritesTheOverriddenText)
{
    const OverridingText overriding;
    const Node& node = overriding;
    std::ostringstream out;
    out << std::setfill('*') << std::setw(24) << node;
    EXPECT_EQ(out.str(), "**a node of another kind");
    EXPECT_TRUE(observe::lockCalls().empty());
}

TEST(NodeVirtual, FunctionsFollowTheTwoDestructorsInTheVirtualTable)
{
    EXPECT_EQ(slotOf(&Node::getStatus), 2);
    EXPECT_EQ(slotOf(&Node::getDescription), 3);
    EXPECT_EQ(slotOf(&Node::getProperty), 4);
    EXPECT_EQ(slotOf(&Node::getProperties), 5);
    EXPECT_EQ(slotOf(&Node::setProperty), 6);
    EXPECT_EQ(slotOf(&Node::operator std::string), 7);
}

TEST(NodeThreads, CanShareOneNode)
{
    constexpr int rounds = 100;
    FilledProbe node;
    node.properties.at(1) = PropertyValue(std::string(64, 'a'));
    std::atomic<int> torn {0};
    std::atomic<int> failed {0};
    const auto whole = [](const PropertyValue& value) {
        const std::string text = value;
        return text.size() == 64 && (text[0] == 'a' || text[0] == 'b')
            && text.find_first_not_of(text[0]) == std::string::npos;
    };
    const auto write = [&](char letter) {
        for (int i = 0; i < rounds; ++i) {
            failed += node.setProperty(1, PropertyValue(std::string(64, letter))).getStatus() == 0 ? 0 : 1;
            failed += node.setProperty(2, PropertyValue("abc")).getStatus() == 16 ? 0 : 1;
            failed += node.setProperty(3, PropertyValue("abc")).getStatus() == 5 ? 0 : 1;
        }
    };
    const auto read = [&] {
        for (int i = 0; i < rounds; ++i) {
            PropertyValue value("");
            failed += node.getProperty(1, value).getStatus() == 0 ? 0 : 1;
            torn += whole(value) ? 0 : 1;
            torn += whole(node.getProperties().at(1)) ? 0 : 1;
            torn += node.operator std::string() == "Node 6162 : 20, status = 5" ? 0 : 1;
            torn += node.getDescription() == "a description that needs memory of its own" ? 0 : 1;
            torn += node.getStatus() == 5 && node.operator Node::StatusType() == 5 ? 0 : 1;
        }
    };
    std::vector<std::thread> threads;
    threads.emplace_back(write, 'a');
    threads.emplace_back(write, 'b');
    threads.emplace_back(read);
    threads.emplace_back(read);
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_EQ(torn, 0);
    EXPECT_EQ(failed, 0);
    EXPECT_EQ(observe::records().size(), 2u * rounds * (2 + 4 + 4));
    expectFree(node);
}

TEST(NodeSensor, CodesHaveTheirValues)
{
    const Node::SensorType codes[] = {Node::SENSOR_UNKNOWN,
                                      Node::SENSOR_CHASSIS,
                                      Node::SENSOR_BIOS,
                                      Node::SENSOR_FIRMWARE,
                                      Node::SENSOR_CPU,
                                      Node::SENSOR_USB_CONTROLLER,
                                      Node::SENSOR_USB_PORT,
                                      Node::SENSOR_SERIAL_PORT,
                                      Node::SENSOR_PARALLEL_PORT,
                                      Node::SENSOR_VIDEO,
                                      Node::SENSOR_FLOPPY_DRIVE,
                                      Node::SENSOR_HARD_DRIVE,
                                      Node::SENSOR_NETWORK_PORT,
                                      Node::SENSOR_BMC,
                                      Node::SENSOR_TOLK,
                                      Node::SENSOR_SMBIOS,
                                      Node::SENSOR_VPD,
                                      Node::SENSOR_OS,
                                      Node::SENSOR_RAM,
                                      Node::SENSOR_DIMM,
                                      Node::SENSOR_FAN,
                                      Node::SENSOR_VOLTAGE_SENSOR,
                                      Node::SENSOR_TEMPERATURE_SENSOR,
                                      Node::SENSOR_INTRUSION,
                                      Node::SENSOR_PFA,
                                      Node::SENSOR_POWER_SUPPLY,
                                      Node::SENSOR_BLUE_LIGHT,
                                      Node::SENSOR_FRONT_PANEL,
                                      Node::SENSOR_BACK_PANEL,
                                      Node::SENSOR_NETWORK_IP_CONFIGURATION,
                                      Node::SENSOR_SYSTEM,
                                      Node::SENSOR_CACHE,
                                      Node::SENSOR_MEMORY_ARRAY,
                                      Node::SENSOR_MEMORY_DEVICE,
                                      Node::SENSOR_IPMI,
                                      Node::SENSOR_LOG,
                                      Node::SENSOR_GLIMTRACE,
                                      Node::SENSOR_SERVICE_PROCESSOR,
                                      Node::SENSOR_OS_HW,
                                      Node::SENSOR_OS_SW,
                                      Node::SENSOR_COMPUTER,
                                      Node::SENSOR_PLANAR,
                                      Node::SENSOR_CPU_CORE,
                                      Node::SENSOR_APPLICATION,
                                      Node::SENSOR_DRIVER,
                                      Node::SENSOR_PARTITION,
                                      Node::SENSOR_USER,
                                      Node::SENSOR_LOG_ENTRY,
                                      Node::SENSOR_PFA_SENSOR,
                                      Node::SENSOR_NETWORK_CONTROLLER,
                                      Node::SENSOR_DISK_CONTROLLER,
                                      Node::SENSOR_GROUP,
                                      Node::SENSOR_PELLION_ALERT_CONFIG,
                                      Node::SENSOR_DIAGNOSTICS,
                                      Node::SENSOR_SMBIOS_DATA,
                                      Node::SENSOR_SMBIOS_TABLE,
                                      Node::SENSOR_NETWORK_TEAMING,
                                      Node::SENSOR_SCALABLE_PARTITION,
                                      Node::SENSOR_SCALABLE_SYSTEM,
                                      Node::SENSOR_ROOT,
                                      Node::SENSOR_MODULAR_CHASSIS,
                                      Node::SENSOR_SLOT_GROUP,
                                      Node::SENSOR_SLOT,
                                      Node::SENSOR_CMM,
                                      Node::SENSOR_IO_MODULE,
                                      Node::SENSOR_COOLING_DOMAIN,
                                      Node::SENSOR_POWER_DOMAIN,
                                      Node::SENSOR_CHASSIS_MID_PLANE_CARD,
                                      Node::SENSOR_MODULAR_GROUP,
                                      Node::SENSOR_ALERT_INDICATION,
                                      Node::SENSOR_CONNECTOR,
                                      Node::SENSOR_BMC_USER,
                                      Node::SENSOR_DRIVE_SLOT_SENSOR,
                                      Node::SENSOR_LAN_END_POINT};
    unsigned int code = 0;
    for (const Node::SensorType sensor : codes)
        EXPECT_EQ(sensor, code++);
    EXPECT_EQ(code, 74u);
    EXPECT_EQ(Node::SENSOR_LARGEST, 73u);
}

TEST(NodeStatusCodes, InitialAndLargestHaveTheirValues)
{
    EXPECT_EQ(Node::STATUS_INITIAL, 0u);
    EXPECT_EQ(Node::STATUS_LARGEST, 85u);
}

}  // namespace
