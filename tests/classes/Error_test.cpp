#include <cfenv>
#include <functional>
#include <iomanip>
#include <sstream>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "IC/Error.h"
#include "IC/Number.h"
#include "ZQ/DateTime.h"
#include "observe/Refusal.h"
#include "support/AllocationFailure.h"
#include "support/Byte.h"
#include "support/DateTimes.h"
#include "support/GroupingLocale.h"

namespace {

using IC::Error;
using IC::Number;

static_assert(std::is_same_v<std::underlying_type_t<Error::StatusType>, ZQ::Uint8>);
static_assert(std::is_convertible_v<Error::StatusType, unsigned char>);  // unscoped

static_assert(!std::is_default_constructible_v<Error>);
static_assert(std::is_constructible_v<Error, const Number&, unsigned char>);
static_assert(std::is_constructible_v<Error, unsigned char, const Number&, const std::string&>);
static_assert(std::is_constructible_v<Error, const char*, unsigned char>);
static_assert(std::is_constructible_v<Error, const std::string&, unsigned char>);
static_assert(std::is_copy_constructible_v<Error>);
static_assert(std::is_copy_assignable_v<Error>);
static_assert(std::is_convertible_v<const Error&, Error::StatusType>);
static_assert(std::is_convertible_v<const Error&, unsigned char>);
static_assert(std::is_convertible_v<const Error&, Number>);
static_assert(std::is_convertible_v<const Error&, std::string>);

// Only the constructors set the status.
template <class T, class = void>
constexpr bool offersInitStatus = false;
template <class T>
constexpr bool
    offersInitStatus<T, std::void_t<decltype(std::declval<T&>().initStatus(std::declval<unsigned char>()))>> =
        true;
static_assert(!offersInitStatus<Error>);

const Number none(Number::KIND_UNKNOWN);

// The four constructors, as functions of the status.
struct Constructor {
    const char* name;
    std::function<Error(unsigned char)> make;
};

std::vector<Constructor> constructors()
{
    return {
        {"number, status", [](unsigned char status) { return Error(Number(17u), status); }},
        {"status, number, message",
         [](unsigned char status) { return Error(status, Number(17u), std::string("a message")); }},
        {"characters, status", [](unsigned char status) { return Error("a message", status); }},
        {"string, status", [](unsigned char status) { return Error(std::string("a message"), status); }},
    };
}

TEST(ErrorStatus, IsAcceptedUpToSixteen)
{
    for (const Constructor& constructor : constructors()) {
        SCOPED_TRACE(constructor.name);
        for (unsigned int code = 0; code <= 16; ++code) {
            SCOPED_TRACE(code);
            const Error error = constructor.make(byte(code));
            EXPECT_EQ(error.getStatus(), code);
            EXPECT_EQ(error.operator Error::StatusType(), code);
            EXPECT_EQ(error.operator unsigned char(), code);
        }
    }
    EXPECT_TRUE(observe::records().empty());
}

TEST(ErrorStatus, IsRefusedAboveSixteen)
{
    for (const Constructor& constructor : constructors()) {
        SCOPED_TRACE(constructor.name);
        for (unsigned int code = 17; code <= 255; ++code) {
            SCOPED_TRACE(code);
            expectRefusal<std::invalid_argument>(
                [&] { return constructor.make(byte(code)); }, "initStatus", "Error", "Vexilon.IC.Error",
                "initstatus: Invalid error status=" + std::to_string(code), "Invalid error status");
        }
    }
}

TEST(ErrorStatus, NamedCodesHaveTheirValues)
{
    EXPECT_EQ(Error::STATUS_SUCCESS, 0u);
    EXPECT_EQ(Error::STATUS_NO_SUCH_PROPERTY, 5u);
    EXPECT_EQ(Error::STATUS_READ_ONLY, 16u);
}

TEST(ErrorStatus, IsCheckedAfterTheMessagePointer)
{
    const char* const nothing = nullptr;
    EXPECT_THAT([&] { Error(nothing, byte(0)); },
                testing::ThrowsMessage<std::logic_error>("a text is a null pointer"));
    try {
        Error(nothing, byte(17));
        ADD_FAILURE() << "nothing was thrown";
    } catch (const std::invalid_argument& exception) {
        ADD_FAILURE() << "the status was checked before the pointer: " << exception.what();
    } catch (const std::logic_error&) {
        EXPECT_TRUE(observe::records().empty());
    }
}

TEST(ErrorStatus, IsCheckedAfterTheMessageIsCopied)
{
    const std::string message = "a message that needs memory of its own";
    const std::function<void()> constructions[] = {
        [&] { const Error error(17, none, message); },
        [&] { const Error error(message, 17); },
        [&] { const Error error(message.c_str(), 17); },
    };
    for (const auto& construct : constructions) {
        // The allocation of the message fails before the status is checked.
        EXPECT_FALSE(allocation::completesWith(0, construct));
        EXPECT_TRUE(observe::records().empty());
        bool refused = false;
        EXPECT_FALSE(allocation::completesWith(1, [&] {
            try {
                construct();
            } catch (const std::invalid_argument&) {
                refused = true;
            }
        }));
        EXPECT_FALSE(refused);
    }
    // Copying the message is the only allocation before the refusal.
    for (const auto& construct : constructions) {
        observe::throwAt(observe::Call::bufferConstructor, 1);
        EXPECT_EQ(allocation::countOf([&] { EXPECT_THROW(construct(), observe::Thrown); }), 1);
    }
}

TEST(ErrorConstructor, StoresValueAndMessage)
{
    const struct {
        Error error;
        unsigned int status;
        const char* value;
        const char* message;
    } rows[] = {
        {Error(Number(17u), 5), 5, "17", ""},
        {Error(16, Number(0.5), "text"), 16, "0.5", "text"},
        {Error(16, Number(0.5), ""), 16, "0.5", ""},
        {Error("text", 3), 3, "unknown", "text"},
        {Error("", 0), 0, "unknown", ""},
        {Error(std::string("text"), 15), 15, "unknown", "text"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.error.operator std::string());
        EXPECT_EQ(row.error.getStatus(), row.status);
        EXPECT_EQ(row.error.getValue().operator std::string(), row.value);
        EXPECT_EQ(row.error.operator Number().operator std::string(), row.value);
        EXPECT_EQ(row.error.getMessage(), row.message);
    }
    EXPECT_EQ(Error("text", 3).getValue().getKind(), Number::KIND_UNKNOWN);
    EXPECT_EQ(Error(std::string("text"), 3).getValue().getKind(), Number::KIND_UNKNOWN);
}

TEST(ErrorConstructor, KeepsScopeAndMillisecondsOfADateTime)
{
    const Number time(dateTime(1234567890, 250, 1));
    for (const Error& error : {Error(time, 5), Error(5, time, "text")})
        EXPECT_EQ(partsOf(error.getValue().operator ZQ::DateTime()), (DateTimeParts {1234567890, 250, 1}));
}

TEST(ErrorConstructor, KeepsEveryByteOfAStringButEndsCharactersAtTheFirstNul)
{
    const std::string message("a\0b", 3);
    EXPECT_EQ(Error(message, 5).getMessage(), message);
    EXPECT_EQ(Error(5, none, message).getMessage(), message);
    EXPECT_EQ(Error(message.c_str(), 5).getMessage(), "a");
    EXPECT_EQ(Error(message, 5).operator std::string(), std::string("5 - a\0b", 7));
}

TEST(ErrorConstructor, GivesBackAllMemoryWhenItRunsOut)
{
    const std::string message = "a message that needs memory of its own";
    const std::function<void()> constructions[] = {
        [&] { const Error error(5, none, message); },
        [&] { const Error error(message, 5); },
        [&] { const Error error(message.c_str(), 5); },
    };
    for (const auto& construct : constructions)
        EXPECT_LE(allocation::expectAllMemoryGivenBack(construct), 10);
}

TEST(ErrorCopy, IsIndependentAndComplete)
{
    const Error source(16, Number(17u), "a message that needs memory of its own");
    Error copy(source);
    EXPECT_EQ(copy.operator std::string(), "16 - 17 - a message that needs memory of its own");
    copy = Error("another", 5);
    EXPECT_EQ(copy.operator std::string(), "5 - another");
    EXPECT_EQ(source.operator std::string(), "16 - 17 - a message that needs memory of its own");
    copy = source;
    EXPECT_EQ(copy.getStatus(), 16);
    EXPECT_EQ(copy.getValue().operator unsigned int(), 17u);
    EXPECT_EQ(copy.getMessage(), "a message that needs memory of its own");

    std::string message = copy.getMessage();
    message[0] = 'A';
    EXPECT_EQ(copy.getMessage(), "a message that needs memory of its own");
}

TEST(ErrorCopy, AssignmentKeepsTheOldErrorWhenMemoryRunsOut)
{
    const Error source(16, Number(3600u), "a message that needs memory of its own");
    Error target(5, Number(true), "short");
    EXPECT_FALSE(allocation::completesWith(0, [&] { target = source; }));
    EXPECT_EQ(target.operator std::string(), "5 - true - short");
    EXPECT_TRUE(allocation::completesWith(1, [&] { target = source; }));
    EXPECT_EQ(target.operator std::string(), source.operator std::string());
}

TEST(ErrorText, LeavesOutAnUnknownNumberAndAnEmptyMessage)
{
    Number invalid(none);
    EXPECT_THROW(invalid.initKind(static_cast<Number::KindType>(12)), std::invalid_argument);
    observe::reset();
    const struct {
        Error error;
        const char* text;
    } rows[] = {
        {Error("", 0), "0"},
        {Error(none, 5), "5"},
        {Error(16, none, ""), "16"},
        {Error(Number(17u), 5), "5 - 17"},
        {Error("no such property", 5), "5 - no such property"},
        {Error(5, none, "no such property"), "5 - no such property"},
        {Error(5, Number(17u), "no such property"), "5 - 17 - no such property"},
        {Error(16, Number(-7), "a - b - "), "16 - -7 - a - b - "},
        {Error(" - ", 1), "1 -  - "},
        {Error(Number(false), 0), "0 - false"},
        {Error(Number(0u), 0), "0 - 0"},
        {Error(Number(1234567.0), 1), "1 - 1.23457e+06"},
        {Error(Number(Number::KIND_NAN), 2), "2 - not a number"},
        {Error(Number(Number::KIND_INFINITY), 3), "3 - infinity"},
        {Error(Number(IC::Version2 {2, 15}), 4), "4 - 2.15"},
        {Error(Number(1234567890L, 250), 6), "6 - 1234567890/3"},
        {Error(Number(IC::sNodeRef {4, 7}), 7), "7 - CPU:7"},
        {Error(invalid, 8), "8 - invalid"},
        {Error("line\n", 9), "9 - line\n"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.text);
        EXPECT_EQ(row.error.operator std::string(), row.text);
        std::ostringstream out;
        EXPECT_EQ(&(out << row.error), &out);
        EXPECT_EQ(out.str(), row.text);
    }
    EXPECT_TRUE(observe::records().empty());
}

TEST(ErrorText, KeepsAMessageThatBeginsWithNul)
{
    const std::string message("\0a", 2);
    EXPECT_EQ(Error(message, 5).operator std::string(), "5 - " + message);
    EXPECT_EQ(Error(5, Number(17u), message).operator std::string(), "5 - 17 - " + message);
}

TEST(ErrorText, IsCompleteAtEveryLength)
{
    for (std::size_t length = 0; length <= 400; ++length) {
        const std::string message(length, 'm');
        ASSERT_EQ(Error(5, Number(17u), message).operator std::string(),
                  length == 0 ? "5 - 17" : "5 - 17 - " + message)
            << length;
    }
}

TEST(ErrorText, FollowsTheGlobalLocaleLikeANewStream)
{
    const Error error(16, Number(1234567u), "1234567");
    {
        const GlobalGroupingLocale grouping;
        EXPECT_EQ(error.operator std::string(), "16 - 1,234,567 - 1234567");
    }
    {
        const GlobalGroupingLocale grouping(1);
        EXPECT_EQ(error.operator std::string(), "1,6 - 1,2,3,4,5,6,7 - 1234567");
    }
    EXPECT_EQ(error.operator std::string(), "16 - 1234567 - 1234567");
}

TEST(ErrorText, RoundsARealToTheNearestTextInAnyRoundingMode)
{
    const Error third(0, Number(1.0 / 3), "");
    const Error twoThirds(0, Number(2.0 / 3), "");
    const int before = std::fegetround();
    for (const int mode : {FE_UPWARD, FE_DOWNWARD}) {
        ASSERT_EQ(std::fesetround(mode), 0);
        const std::string texts = third.operator std::string() + ", " + twoThirds.operator std::string();
        std::fesetround(before);
        EXPECT_EQ(texts, "0 - 0.333333, 0 - 0.666667");
    }
}

TEST(ErrorText, IsCompleteOrThrowsWhenMemoryRunsOut)
{
    const Error error(16, Number(1234567u), "a message that needs memory of its own");
    allocation::expectTextCompleteOrThrows(error, "16 - 1234567 - a message that needs memory of its own");
    const GlobalGroupingLocale grouping;
    allocation::expectTextCompleteOrThrows(error, "16 - 1,234,567 - a message that needs memory of its own");
}

TEST(ErrorStream, InsertsTheErrorAsOneText)
{
    std::ostringstream out;
    out.imbue(groupingLocale(1));
    out << std::hex << std::showbase << std::setfill('*') << std::setw(12) << Error(Number(255u), 16);
    EXPECT_EQ(out.str(), "****16 - 255");
    EXPECT_EQ(out.width(), 0);

    std::ostringstream left;
    left << std::left << std::setfill('.') << std::setw(4) << Error("", 5) << '|';
    EXPECT_EQ(left.str(), "5...|");
}

TEST(ErrorStream, WritesNulBytes)
{
    std::ostringstream out;
    out << Error(std::string("a\0b", 3), 5);
    EXPECT_EQ(out.str(), std::string("5 - a\0b", 7));
}

}  // namespace
