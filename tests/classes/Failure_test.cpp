#include <cxxabi.h>

#include <exception>
#include <initializer_list>
#include <new>
#include <set>
#include <stdexcept>
#include <string>
#include <thread>
#include <type_traits>
#include <typeinfo>
#include <utility>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "IC/Alert.h"
#include "IC/EnumValue.h"
#include "IC/Error.h"
#include "IC/ICException.h"
#include "IC/Node.h"
#include "IC/Number.h"
#include "IC/Property.h"
#include "ZQ/DateTime.h"
#include "observe/Refusal.h"
#include "support/AllocationFailure.h"
#include "support/VirtualTable.h"

namespace {

using IC::Alert;
using IC::EnumValue;
using IC::Error;
using IC::ICException;
using IC::Node;
using IC::NodeInvalidSensor;
using IC::Number;
using IC::PropertyValue;
using IC::PropertyValueInvalidKind;
using testing::ElementsAre;

// ICException derives from nothing.
static_assert(std::is_polymorphic_v<ICException>);
static_assert(std::has_virtual_destructor_v<ICException>);
static_assert(!std::is_base_of_v<std::exception, ICException>);
static_assert(std::is_default_constructible_v<ICException>);
static_assert(std::is_constructible_v<ICException, const std::string&>);
static_assert(!std::is_convertible_v<const std::string&, ICException>);
static_assert(std::is_copy_constructible_v<ICException>);
static_assert(std::is_copy_assignable_v<ICException>);
static_assert(std::is_same_v<decltype(std::declval<const ICException&>().what()), std::string>);

// The two other classes derive from ICException, but not publicly. They are constructed from a message only.
template <class Exception>
constexpr bool hidesItsBase()
{
    static_assert(std::is_base_of_v<ICException, Exception>);
    static_assert(!std::is_convertible_v<Exception*, ICException*>);
    static_assert(!std::is_convertible_v<Exception&, ICException&>);
    static_assert(!std::is_base_of_v<std::exception, Exception>);
    static_assert(sizeof(Exception) == sizeof(ICException));
    static_assert(std::is_constructible_v<Exception, const std::string&>);
    static_assert(!std::is_default_constructible_v<Exception>);
    return true;
}
static_assert(hidesItsBase<PropertyValueInvalidKind>());
static_assert(hidesItsBase<NodeInvalidSensor>());
static_assert(std::is_same_v<decltype(std::declval<const PropertyValueInvalidKind&>().what()), std::string>);
static_assert(std::is_same_v<decltype(std::declval<const NodeInvalidSensor&>().what()), std::string>);
static_assert(!std::is_convertible_v<PropertyValueInvalidKind*, NodeInvalidSensor*>);

constexpr unsigned char kindCode(int code)
{
    return static_cast<unsigned char>(code);
}

void refuseProperty()
{
    const PropertyValue value(kindCode(7));
}

void refuseNode()
{
    const Node node(74u);
}

// The name of the handler that catches the operation's exception. The handler for ICException comes first.
template <class Operation>
std::string handlerOf(Operation operation)
{
    try {
        operation();
    } catch (const ICException&) {
        return "ICException";
    } catch (const std::exception&) {
        return "std::exception";
    } catch (const PropertyValueInvalidKind&) {
        return "PropertyValueInvalidKind";
    } catch (const NodeInvalidSensor&) {
        return "NodeInvalidSensor";
    }
    return "none";
}

ICException withoutAMessage()
{
    return {};
}

TEST(ExceptionClasses, ICExceptionIsInitialisedByEmptyBraces)
{
    const ICException exception = {};
    EXPECT_EQ(exception.what(), "");
    EXPECT_EQ(withoutAMessage().what(), "");
}

TEST(ExceptionClasses, ICExceptionWithoutAMessageHasAnEmptyText)
{
    EXPECT_EQ(ICException().what(), "");
}

TEST(ExceptionClasses, WhatReturnsTheMessage)
{
    const std::string message("two\0parts", 9);
    EXPECT_EQ(ICException(message).what(), message);
    EXPECT_EQ(PropertyValueInvalidKind(message).what(), message);
    EXPECT_EQ(NodeInvalidSensor(message).what(), message);
    EXPECT_EQ(PropertyValueInvalidKind("").what(), "");
    EXPECT_EQ(NodeInvalidSensor("").what(), "");
}

TEST(ExceptionClasses, WhatReturnsACopy)
{
    const PropertyValueInvalidKind exception("Invalid kind of property");
    std::string text = exception.what();
    text += ", changed by its owner";
    EXPECT_EQ(exception.what(), "Invalid kind of property");
}

template <class Exception>
void expectCopiesKeepTheMessage()
{
    const Exception original("the message of the original");
    const Exception copy(original);
    EXPECT_EQ(copy.what(), "the message of the original");
    Exception assigned("another message");
    assigned = original;
    EXPECT_EQ(assigned.what(), "the message of the original");
    EXPECT_EQ(original.what(), "the message of the original");

    std::exception_ptr kept;
    try {
        throw original;
    } catch (...) {
        kept = std::current_exception();
    }
    try {
        std::rethrow_exception(kept);
    } catch (const Exception& rethrown) {
        EXPECT_EQ(rethrown.what(), "the message of the original");
    }
}

TEST(ExceptionClasses, CopiesKeepTheMessage)
{
    expectCopiesKeepTheMessage<ICException>();
    expectCopiesKeepTheMessage<PropertyValueInvalidKind>();
    expectCopiesKeepTheMessage<NodeInvalidSensor>();
}

TEST(ExceptionClasses, DerivedClassesCanOverrideWhat)
{
    struct Derived : ICException {
        std::string what() const override { return "derived: " + message; }
    };
    const Derived derived;
    const ICException& exception = derived;
    EXPECT_EQ(exception.what(), "derived: ");
}

TEST(ExceptionClasses, AHandlerOfICExceptionCatchesOnlyICException)
{
    EXPECT_EQ(handlerOf([] { throw ICException("message"); }), "ICException");
    EXPECT_EQ(handlerOf([] { throw PropertyValueInvalidKind("message"); }), "PropertyValueInvalidKind");
    EXPECT_EQ(handlerOf([] { throw NodeInvalidSensor("message"); }), "NodeInvalidSensor");
}

TEST(ExceptionClasses, AHandlerOfICExceptionDoesNotCatchRefusals)
{
    EXPECT_EQ(handlerOf(refuseProperty), "PropertyValueInvalidKind");
    EXPECT_EQ(handlerOf(refuseNode), "NodeInvalidSensor");
    EXPECT_EQ(handlerOf([] { return Number(kindCode(11)); }), "std::exception");
}

#ifdef __GLIBCXX__  // libc++ does not declare these classes of type information
TEST(ExceptionClasses, ICExceptionHasNoBaseClass)
{
    const std::type_info& type = typeid(ICException);
    EXPECT_TRUE(typeid(type) == typeid(abi::__class_type_info));
}

TEST(ExceptionClasses, TheOthersHaveOneBaseThatIsNeitherVirtualNorPublic)
{
    for (const std::type_info* type : {&typeid(PropertyValueInvalidKind), &typeid(NodeInvalidSensor)}) {
        SCOPED_TRACE(type->name());
        const auto* information = dynamic_cast<const abi::__vmi_class_type_info*>(type);
        ASSERT_NE(information, nullptr);
        ASSERT_EQ(information->__base_count, 1u);
        const abi::__base_class_type_info& base = information->__base_info[0];
        EXPECT_TRUE(*base.__base_type == typeid(ICException));
        EXPECT_EQ(base.__offset(), 0);
        EXPECT_FALSE(base.__is_public_p());
        EXPECT_FALSE(base.__is_virtual_p());
    }
}
#endif

TEST(ExceptionClasses, WhatFollowsTheTwoDestructorsInTheVirtualTable)
{
    EXPECT_EQ(slotOf(&ICException::what), 2);
}

TEST(FailurePath, EachSourceFileRecordsItsNameAndCategory)
{
    expectRefusal<std::invalid_argument>([] { return Number(kindCode(11)); },  //
                                         "Number", "Number", "Vexilon.IC.Number",
                                         "Number: wrong kind of number: 11", "Invalid kind of number");
    expectRefusal<std::out_of_range>([] { return static_cast<unsigned char>(EnumValue(256u)); },
                                     "operator ZQ::Uint8", "EnumValue", "Vexilon.IC.EnumValue",
                                     "Uint8: number out of range: 256",
                                     "The number is too large to convert to an 8-bit integer");
    expectRefusal<PropertyValueInvalidKind>(refuseProperty,  //
                                            "initKind", "Property", "Vexilon.IC.Property",
                                            "PropertyValue:initKind: invalid kind of property: 7",
                                            "Invalid kind of property");
    expectRefusal<std::invalid_argument>([] { return Error("text", 17); },  //
                                         "initStatus", "Error", "Vexilon.IC.Error",
                                         "initstatus: Invalid error status=17", "Invalid error status");
    expectRefusal<std::invalid_argument>([] { return Alert(4, 0, {}, 0, ""); },  //
                                         "init", "Alert", "Vexilon.IC.Alert", "init: Invalid severity type 4",
                                         "Invalid severity type");
    expectRefusal<NodeInvalidSensor>(refuseNode,  //
                                     "Node", "Node", "Vexilon.IC.Node", "Node: Sensor value out of range: 74",
                                     "74 is not a valid sensor. The largest possible sensor is 73");
}

// A refusal before main: the categories must be initialised before the program's own static objects.
const std::string categoryBeforeMain = [] {
    try {
        const Number refused(kindCode(11));
    } catch (const std::invalid_argument&) {
        const auto records = observe::records();
        return records.empty() ? std::string("no record") : records.front().logger;
    }
    return std::string("no refusal");
}();

TEST(FailurePath, CategoriesAreReadyDuringStaticInitialisation)
{
    EXPECT_EQ(categoryBeforeMain, "Vexilon.IC.Number");
}

TEST(FailurePath, WritesTheLogRecordThenTheTraceRecordThenThrows)
{
    std::vector<std::string> events;
    observe::onRecord([&](const observe::Record& record) {
        events.emplace_back(record.trace ? "trace" : "log");
        EXPECT_EQ(std::uncaught_exceptions(), 0);
    });
    Number number(3u);
    try {
        number.setKind(11);
    } catch (const std::invalid_argument&) {
        events.emplace_back("caught");
    }
    EXPECT_THAT(events, ElementsAre("log", "trace", "caught"));
}

TEST(FailurePath, UsesOneBufferForBothRecordsAndDestroysIt)
{
    std::vector<int> alive;
    observe::onRecord([&](const observe::Record&) { alive.push_back(observe::buffersAlive()); });
    EXPECT_THROW(Number(kindCode(11)), std::invalid_argument);
    EXPECT_THAT(alive, ElementsAre(1, 1));
    EXPECT_EQ(observe::buffersAlive(), 0);

    observe::throwAt(observe::Call::bufferConstructor, 2);
    EXPECT_THROW(Number(kindCode(11)), std::invalid_argument);
    EXPECT_FALSE(observe::thrown());
}

TEST(FailurePath, RecordsTheLineOfTheRefusal)
{
    Number number(3u);
    const auto refuseConstructor = [] {
        return expectRefusal<std::invalid_argument>([] { return Number(kindCode(11)); }, "Number", "Number",
                                                    "Vexilon.IC.Number", "Number: wrong kind of number: 11",
                                                    "Invalid kind of number");
    };
    const auto refuseSetKind = [&] {
        return expectRefusal<std::invalid_argument>([&] { number.setKind(12); }, "setKind", "Number",
                                                    "Vexilon.IC.Number", "setKind: invalid kind 12",
                                                    "Invalid kind");
    };
    const auto refuseInitKind = [&] {
        return expectRefusal<std::invalid_argument>(
            [&] { number.initKind(Number::KIND_INT); }, "initKind", "Number", "Vexilon.IC.Number",
            "initkind: invalid kind of number 2", "Invalid kind of number");
    };
    const int constructorLine = refuseConstructor();
    const int setKindLine = refuseSetKind();
    const int initKindLine = refuseInitKind();
    EXPECT_EQ(std::set<int>({constructorLine, setKindLine, initKindLine}).size(), 3u);
    EXPECT_EQ(refuseConstructor(), constructorLine);
    EXPECT_EQ(refuseSetKind(), setKindLine);
    EXPECT_EQ(refuseInitKind(), initKindLine);
}

// Runs the operation, which must be refused, and calls `change` between the log record and the trace record. Returns
// the texts of the records.
template <class Operation, class Change>
std::vector<std::string> textsWithChangeBetween(Operation operation, Change change)
{
    observe::reset();
    observe::onRecord([&](const observe::Record& record) {
        if (!record.trace)
            change();
    });
    try {
        static_cast<void>(operation());
        ADD_FAILURE() << "nothing was thrown";
    } catch (const std::logic_error&) {
    } catch (const PropertyValueInvalidKind&) {
    }
    std::vector<std::string> texts;
    for (const observe::Record& record : observe::records())
        texts.push_back(record.message);
    return texts;
}

TEST(FailurePath, TheTraceRecordReadsACodeAgain)
{
    Number number(3u);
    unsigned char code = 11;
    EXPECT_THAT(textsWithChangeBetween([&] { number.setKind(code); }, [&] { code = 200; }),
                ElementsAre("setKind: invalid kind 11", "setKind: invalid kind 200"));
    code = 12;
    EXPECT_THAT(textsWithChangeBetween([&] { return Number(code); }, [&] { code = 201; }),
                ElementsAre("Number: wrong kind of number: 12", "Number: wrong kind of number: 201"));
}

TEST(FailurePath, TheTraceRecordReadsAKindAgain)
{
    Number number(5);
    EXPECT_THAT(textsWithChangeBetween([&] { return static_cast<bool>(number); },
                                       [&] { number.setKind(Number::KIND_VERSION); }),
                ElementsAre("bool: Can't return current value as a Boolean, kind=2",
                            "bool: Can't return current value as a Boolean, kind=8"));

    Number left(1u);
    Number right(1ull);
    const auto change = [&] {
        left.setKind(Number::KIND_VERSION);
        right.setKind(Number::KIND_DATETIME);
    };
    EXPECT_THAT(textsWithChangeBetween([&] { return left < right; }, change),
                ElementsAre("<: cannot compare two different kinds of number, kind1=3, kind2=4",
                            "<: cannot compare two different kinds of number, kind1=8, kind2=9"));

    PropertyValue property("text");
    EXPECT_THAT(textsWithChangeBetween([&] { return static_cast<bool>(property); },
                                       [&] { property.setKind(PropertyValue::KIND_BUFFER); }),
                ElementsAre("PropertyValue::bool: can't return current value as a bool, kind=2",
                            "PropertyValue::bool: can't return current value as a bool, kind=3"));
}

TEST(FailurePath, TheTraceRecordReadsAValueAgain)
{
    Number real(-1.0);
    EXPECT_THAT(
        textsWithChangeBetween([&] { return static_cast<unsigned int>(real); }, [&] { real = Number(-2.5); }),
        ElementsAre("Uint32: number out of range: -1", "Uint32: number out of range: -2.5"));

    real = Number(-1.0);
    EXPECT_THAT(textsWithChangeBetween([&] { return static_cast<unsigned long long>(real); },
                                       [&] { real = Number(-2.5); }),
                ElementsAre("Uint64: number out of range: -1", "Uint64: number out of range: -2.5"));

    Number wide(4294967296ull);
    EXPECT_THAT(
        textsWithChangeBetween([&] { return static_cast<int>(wide); }, [&] { wide = Number(8589934592ull); }),
        ElementsAre("Uint32: number out of range: 4294967296", "Uint32: number out of range: 8589934592"));

    Number narrow(256u);
    EXPECT_THAT(textsWithChangeBetween([&] { return static_cast<IC::Version2>(narrow); },
                                       [&] { narrow = Number(257u); }),
                ElementsAre("Version: Number too large for version: 256",
                            "Version: Number too large for version: 257"));

    EnumValue enumerated(256u);
    EXPECT_THAT(textsWithChangeBetween([&] { return static_cast<unsigned char>(enumerated); },
                                       [&] { enumerated = EnumValue(257u); }),
                ElementsAre("Uint8: number out of range: 256", "Uint8: number out of range: 257"));
}

// A refusal and its number of platform calls: the buffer's constructor, then for each of the two records the literal,
// the value if there is one, str, and the logging call.
const struct {
    const char* name;
    int calls;
    void (*operation)();
} refusals[] = {
    {"Number: a literal alone", 7,
     [] { static_cast<void>(Number(Number::KIND_NAN) < Number(Number::KIND_NAN)); }},
    {"Number: a code", 9, [] { static_cast<void>(Number(kindCode(11))); }},
    {"Number: two codes", 9, [] { static_cast<void>(Number(1u) > Number(1ull)); }},
    {"Number: a 32-bit value", 9, [] { static_cast<void>(static_cast<IC::Version2>(Number(256u))); }},
    {"Number: a 64-bit value", 9, [] { static_cast<void>(static_cast<int>(Number(1ull << 32))); }},
    {"Number: a real", 9, [] { static_cast<void>(static_cast<unsigned int>(Number(-1.0))); }},
    {"EnumValue: a value", 9, [] { static_cast<void>(static_cast<unsigned short>(EnumValue(65536u))); }},
    {"PropertyValue: a code", 9, refuseProperty},
    {"PropertyValue: two codes", 9,
     [] { static_cast<void>(PropertyValue("text") < PropertyValue(Number(1))); }},
    {"Error: a code", 9, [] { static_cast<void>(Error("a text that the error holds already", 17)); }},
    {"Alert: a code", 9,
     [] {
         ZQ::DateTime time(1234567890, 3);
         const Alert alert(time, 0, 0, {"a path", "another path"}, 86, "a message");
     }},
    {"Node: a code", 9, refuseNode},
};

TEST(FailurePath, APlatformExceptionReplacesTheRefusalAndLeaksNothing)
{
    for (const auto& row : refusals) {
        for (int nth = 1; nth <= row.calls; ++nth) {
            SCOPED_TRACE(row.name + (", call " + std::to_string(nth)));
            observe::reset();
            observe::throwAt(observe::Call::any, nth);
            EXPECT_THROW(row.operation(), observe::Thrown);
            EXPECT_TRUE(observe::thrown());
            EXPECT_EQ(observe::buffersAlive(), 0);
            EXPECT_EQ(observe::dateTimesAlive(), 0);
            EXPECT_EQ(observe::locksHeld(), 0);
            // The call in the middle writes the log record, the last call the trace record.
            EXPECT_EQ(observe::records().size(), nth <= (row.calls + 1) / 2 ? 0u : 1u);
        }
    }
}

TEST(FailurePath, MakesNoOtherPlatformCall)
{
    for (const auto& row : refusals) {
        SCOPED_TRACE(row.name);
        observe::reset();
        observe::throwAt(observe::Call::any, row.calls + 1);
        const std::string handler = handlerOf(row.operation);
        EXPECT_NE(handler, "none");
        EXPECT_FALSE(observe::thrown());
        EXPECT_EQ(observe::records().size(), 2u);
    }
}

TEST(FailurePath, EachStepOfThePlatformMayThrow)
{
    const struct {
        const char* name;
        observe::Call call;
        int nth;
        std::size_t records;
    } rows[] = {{"buffer constructor", observe::Call::bufferConstructor, 1, 0},
                {"literal of the log record", observe::Call::insertion, 1, 0},
                {"code of the log record", observe::Call::insertion, 2, 0},
                {"text of the log record", observe::Call::str, 1, 0},
                {"log", observe::Call::log, 1, 0},
                {"literal of the trace record", observe::Call::insertion, 3, 1},
                {"code of the trace record", observe::Call::insertion, 4, 1},
                {"text of the trace record", observe::Call::str, 2, 1},
                {"trace", observe::Call::trace, 1, 1}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.name);
        observe::reset();
        observe::throwAt(row.call, row.nth);
        Number number(3u);
        EXPECT_THROW(number.setKind(11), observe::Thrown);
        EXPECT_TRUE(observe::thrown());
        EXPECT_EQ(observe::records().size(), row.records);
        EXPECT_EQ(observe::buffersAlive(), 0);
        EXPECT_EQ(number.getKind(), Number::KIND_UINT32);
        EXPECT_EQ(static_cast<unsigned int>(number), 3u);
    }
}

TEST(FailurePath, AnExceptionOfTheLoggerPropagates)
{
    observe::onRecord([](const observe::Record&) { throw 42; });
    EXPECT_THROW(Number(kindCode(11)), int);
    EXPECT_EQ(observe::records().size(), 1u);
    EXPECT_EQ(observe::buffersAlive(), 0);
}

// Runs the operation, which is refused, with memory for `allowed` allocations. Returns false when it threw
// std::bad_alloc instead of its own exception.
template <class Operation>
bool refusesWith(long allowed, Operation operation)
{
    return allocation::completesWith(allowed, [&] {
        try {
            operation();
        } catch (const std::bad_alloc&) {
            throw;
        } catch (...) {
        }
    });
}

TEST(FailurePath, BadAllocReplacesTheRefusalWhenMemoryRunsOut)
{
    for (const auto& row : refusals) {
        SCOPED_TRACE(row.name);
        int badAllocations = 0;
        for (long allowed = 0;; ++allowed) {
            ASSERT_LT(allowed, 1000);
            observe::reset();
            const bool completed = refusesWith(allowed, row.operation);
            EXPECT_EQ(observe::buffersAlive(), 0);
            EXPECT_EQ(observe::dateTimesAlive(), 0);
            if (completed)
                break;
            ++badAllocations;
        }
        EXPECT_EQ(observe::records().size(), 2u);
        EXPECT_GT(badAllocations, 0);
    }
}

TEST(FailurePath, AnyThreadMayRefuseAtAnyTime)
{
    constexpr int threads = 4;
    constexpr int refusalsOfAThread = 50;
    std::vector<std::thread> running;
    for (int thread = 0; thread < threads; ++thread) {
        running.emplace_back([thread] {
            for (int refusal = 0; refusal < refusalsOfAThread; ++refusal)
                EXPECT_THROW(Number(kindCode(100 + thread)), std::invalid_argument);
        });
    }
    for (std::thread& thread : running)
        thread.join();

    int records[2][threads] = {};
    for (const observe::Record& record : observe::records()) {
        for (int thread = 0; thread < threads; ++thread) {
            if (record.message == "Number: wrong kind of number: " + std::to_string(100 + thread))
                ++records[record.trace ? 1 : 0][thread];
        }
    }
    EXPECT_EQ(observe::records().size(), 2u * threads * refusalsOfAThread);
    for (const auto& ofOneLevel : records)
        EXPECT_THAT(ofOneLevel, testing::Each(refusalsOfAThread));
    EXPECT_EQ(observe::buffersAlive(), 0);
}

TEST(FailurePath, TheExceptionIsBuiltAfterBothRecords)
{
    const struct {
        const char* name;
        void (*operation)();
    } rows[] = {
        {"Number", [] { static_cast<void>(Number(Number::KIND_INT)); }},
        {"PropertyValue", refuseProperty},
        {"Node", refuseNode},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.name);
        std::size_t records = 0;  // those written before the last allocation failed
        for (long allowed = 0;; ++allowed) {
            ASSERT_LT(allowed, 1000);
            observe::reset();
            if (refusesWith(allowed, row.operation))
                break;
            records = observe::records().size();
        }
        EXPECT_EQ(records, 2u);
    }
}

// The text does not fit into a string's internal buffer, so composing it allocates memory.
TEST(FailurePath, ComposesTheTextOfARefusedSensorAfterTheRecords)
{
    observe::throwAt(observe::Call::bufferConstructor, 1);
    EXPECT_EQ(allocation::countOf([] { EXPECT_THROW(refuseNode(), observe::Thrown); }), 0);
}

}  // namespace
