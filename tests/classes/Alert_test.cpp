#include <iomanip>
#include <sstream>
#include <stdexcept>
#include <string>
#include <thread>
#include <type_traits>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "IC/Alert.h"
#include "ZQ/DateTime.h"
#include "observe/Refusal.h"
#include "support/AllocationFailure.h"
#include "support/Byte.h"
#include "support/DateTimes.h"
#include "support/GroupingLocale.h"
#include "support/Hexadecimal.h"

namespace {

using IC::Alert;
using Paths = std::vector<std::string>;

static_assert(std::is_same_v<std::underlying_type_t<Alert::SeverityType>, ZQ::Uint8>);
static_assert(std::is_same_v<std::underlying_type_t<Alert::ClassType>, ZQ::Uint8>);
static_assert(std::is_convertible_v<Alert::SeverityType, unsigned char>);  // unscoped
static_assert(std::is_convertible_v<Alert::ClassType, unsigned char>);

static_assert(!std::is_default_constructible_v<Alert>);
static_assert(std::is_constructible_v<Alert, ZQ::DateTime&, unsigned char, unsigned char, Paths, unsigned int,
                                      std::string>);
static_assert(std::is_constructible_v<Alert, unsigned char, unsigned char, Paths, unsigned int, std::string>);
static_assert(std::is_copy_constructible_v<Alert>);
static_assert(std::is_copy_assignable_v<Alert>);
static_assert(std::is_convertible_v<const Alert&, Alert::SeverityType>);
static_assert(std::is_convertible_v<const Alert&, Alert::ClassType>);
static_assert(std::is_convertible_v<const Alert&, IC::Node::StatusType>);
static_assert(std::is_convertible_v<const Alert&, std::string>);

// Only the constructors check and set the codes.
template <class T, class = void>
constexpr bool offersInit = false;
template <class T>
constexpr bool offersInit<T,
                          std::void_t<decltype(std::declval<T&>().init(
                              std::declval<ZQ::DateTime&>(), std::declval<unsigned char>(),
                              std::declval<unsigned char>(), Paths(), 0u, std::string()))>> = true;
static_assert(!offersInit<Alert>);

constexpr DateTimeParts someTimeParts {1234567890, 250, 2};

ZQ::DateTime someTime()
{
    return dateTime(someTimeParts.seconds, someTimeParts.milliseconds, someTimeParts.scope);
}

const std::string someTimeText = "<1234567890.250/2>";

Alert alertOf(unsigned int severity, unsigned int alertClass, unsigned int status,
              const std::string& message = "", const Paths& paths = {})
{
    ZQ::DateTime time = someTime();
    return Alert(time, byte(severity), byte(alertClass), paths, status, message);
}

// Expects the same refusal of both constructors, and that no date-time outlives it.
void expectRefused(unsigned int severity, unsigned int alertClass, unsigned int status,
                   const std::string& logged, const std::string& sentence)
{
    SCOPED_TRACE(logged);
    const int alive = observe::dateTimesAlive();
    expectRefusal<std::invalid_argument>([&] { return alertOf(severity, alertClass, status); }, "init",
                                         "Alert", "Vexilon.IC.Alert", logged, sentence);
    expectRefusal<std::invalid_argument>(
        [&] { return Alert(byte(severity), byte(alertClass), {"/a"}, status, "text"); }, "init", "Alert",
        "Vexilon.IC.Alert", logged, sentence);
    EXPECT_EQ(observe::dateTimesAlive(), alive);
}

TEST(AlertCodes, SmallestAndLargestHaveTheirValues)
{
    EXPECT_EQ(Alert::SEVERITY_SMALLEST, 0u);
    EXPECT_EQ(Alert::SEVERITY_LARGEST, 3u);
    EXPECT_EQ(Alert::CLASS_SMALLEST, 0u);
    EXPECT_EQ(Alert::CLASS_LARGEST, 5u);
}

TEST(AlertSeverity, IsAcceptedUpToThree)
{
    for (unsigned int code = 0; code <= 3; ++code) {
        SCOPED_TRACE(code);
        const Alert alert = alertOf(code, 0, 0);
        EXPECT_EQ(alert.getSeverity(), code);
        EXPECT_EQ(alert.operator Alert::SeverityType(), code);
        EXPECT_EQ(Alert(byte(code), 0, {}, 0, "").getSeverity(), code);
    }
    EXPECT_TRUE(observe::records().empty());
}

TEST(AlertSeverity, IsRefusedAboveThree)
{
    for (unsigned int code = 4; code <= 255; ++code)
        expectRefused(code, 0, 0, "init: Invalid severity type " + std::to_string(code),
                      "Invalid severity type");
}

TEST(AlertClass, IsAcceptedUpToFive)
{
    for (unsigned int code = 0; code <= 5; ++code) {
        SCOPED_TRACE(code);
        const Alert alert = alertOf(0, code, 0);
        EXPECT_EQ(alert.getClass(), code);
        EXPECT_EQ(alert.operator Alert::ClassType(), code);
        EXPECT_EQ(Alert(0, byte(code), {}, 0, "").getClass(), code);
    }
    EXPECT_TRUE(observe::records().empty());
}

TEST(AlertClass, IsRefusedAboveFive)
{
    for (unsigned int code = 6; code <= 255; ++code)
        expectRefused(0, code, 0, "init: Invalid class type " + std::to_string(code), "Invalid class type");
}

TEST(AlertStatus, IsAcceptedUpToEightyFive)
{
    for (unsigned int code = 0; code <= 85; ++code) {
        SCOPED_TRACE(code);
        const Alert alert = alertOf(0, 0, code);
        EXPECT_EQ(alert.getStatus(), code);
        EXPECT_EQ(alert.operator IC::Node::StatusType(), code);
        EXPECT_EQ(Alert(0, 0, {}, code, "").getStatus(), code);
    }
    EXPECT_TRUE(observe::records().empty());
}

TEST(AlertStatus, IsRefusedAboveEightyFive)
{
    for (unsigned int code = 86; code <= 256; ++code)
        expectRefused(0, 0, code, "init: Invalid status type " + std::to_string(code), "Invalid status type");
    // The low eight bits of the first three are valid codes.
    for (const unsigned int code : {341u, 65536u, 2147483648u, 4294967295u})
        expectRefused(0, 0, code, "init: Invalid status type " + std::to_string(code), "Invalid status type");
}

TEST(Alert, AcceptsTheLargestCodesTogether)
{
    const Alert alert = alertOf(3, 5, 85);
    EXPECT_EQ(alert.getSeverity(), 3);
    EXPECT_EQ(alert.getClass(), 5);
    EXPECT_EQ(alert.getStatus(), 85u);
}

TEST(Alert, ReportsOnlyTheFirstOfSeveralInvalidCodes)
{
    expectRefused(9, 9, 99, "init: Invalid severity type 9", "Invalid severity type");
    expectRefused(9, 9, 0, "init: Invalid severity type 9", "Invalid severity type");
    expectRefused(4, 0, 86, "init: Invalid severity type 4", "Invalid severity type");
    expectRefused(3, 9, 99, "init: Invalid class type 9", "Invalid class type");
    expectRefused(3, 5, 99, "init: Invalid status type 99", "Invalid status type");
}

TEST(Alert, CopiesItsArguments)
{
    ZQ::DateTime time = someTime();
    Paths paths = {"/b", "/a", "", "/b"};
    std::string message = "Fan failed";
    const Alert alert(time, 2, 1, paths, 5, message);
    time.setMillisecond(999);
    paths.clear();
    message.clear();
    EXPECT_EQ(partsOf(alert.getTimeStamp()), someTimeParts);
    EXPECT_EQ(alert.getSeverity(), 2);
    EXPECT_EQ(alert.getClass(), 1);
    EXPECT_EQ(alert.getStatus(), 5u);
    EXPECT_EQ(alert.getNodePaths(), (Paths {"/b", "/a", "", "/b"}));
    EXPECT_EQ(alert.getMessage(), "Fan failed");
}

TEST(Alert, KeepsEveryByteOfMessageAndPaths)
{
    const std::string message("\0a\0", 3);
    const Paths paths = {std::string("\0b", 2), std::string("b\0", 2)};
    const Alert alert = alertOf(0, 0, 0, message, paths);
    EXPECT_EQ(alert.getMessage(), message);
    EXPECT_EQ(alert.getNodePaths(), paths);
}

TEST(Alert, DoesNotChangeTheCallersTimeStamp)
{
    ZQ::DateTime time = someTime();
    const Alert alert(time, 0, 0, {}, 0, "");
    EXPECT_EQ(partsOf(time), someTimeParts);
}

TEST(Alert, TakesATimeStampThatCannotChange)
{
    const ZQ::DateTime time = someTime();
    const Alert alert(time, 2, 1, {"/a"}, 5, "Fan failed");
    EXPECT_EQ(partsOf(alert.getTimeStamp()), someTimeParts);
    EXPECT_EQ(alert.getSeverity(), 2);
    EXPECT_EQ(alert.getClass(), 1);
    EXPECT_EQ(alert.getNodePaths(), Paths {"/a"});
    EXPECT_EQ(alert.getStatus(), 5u);
    EXPECT_EQ(alert.getMessage(), "Fan failed");

    observe::setClock(1234567890, 123);
    const Alert now(ZQ::DateTime::now(), 0, 0, {}, 0, "");
    EXPECT_EQ(partsOf(now.getTimeStamp()), (DateTimeParts {1234567890, 123, 3}));
    EXPECT_EQ(observe::clockReadings(), 1);
}

TEST(Alert, RefusesCodesWithATimeStampThatCannotChange)
{
    expectRefusal<std::invalid_argument>([] { return Alert(someTime(), 4, 6, {}, 86, ""); }, "init", "Alert",
                                         "Vexilon.IC.Alert", "init: Invalid severity type 4",
                                         "Invalid severity type");
    expectRefusal<std::invalid_argument>([] { return Alert(someTime(), 3, 6, {}, 86, ""); }, "init", "Alert",
                                         "Vexilon.IC.Alert", "init: Invalid class type 6",
                                         "Invalid class type");
    expectRefusal<std::invalid_argument>([] { return Alert(someTime(), 3, 5, {}, 86, ""); }, "init", "Alert",
                                         "Vexilon.IC.Alert", "init: Invalid status type 86",
                                         "Invalid status type");
}

// Only the other constructor makes a copy of the time stamp.
TEST(Alert, TakesATimeStampThatCanChangeByReference)
{
    ZQ::DateTime time = someTime();
    observe::throwAt(observe::Call::dateTime, 3);  // after the default construction and the assignment
    const Alert alert(time, 2, 1, {}, 5, "");
    EXPECT_FALSE(observe::thrown());
    EXPECT_THROW(Alert(std::as_const(time), 2, 1, {}, 5, ""), observe::Thrown);
}

TEST(Alert, ReturnsCopies)
{
    const Alert alert = alertOf(0, 0, 0, "a message", {"/a"});
    alert.getTimeStamp().setMillisecond(999);
    alert.getNodePaths().clear();
    alert.getMessage().clear();
    EXPECT_EQ(alert.getTimeStamp().getMillisecond(), 250u);
    EXPECT_EQ(alert.getNodePaths(), Paths {"/a"});
    EXPECT_EQ(alert.getMessage(), "a message");
}

TEST(Alert, IsCopiedDeeply)
{
    const int alive = observe::dateTimesAlive();
    {
        const Alert source = alertOf(2, 1, 5, "a message that needs memory of its own", {"/a", "/b"});
        const std::string text =
            "Alert 2; 1; 5; a message that needs memory of its own; " + someTimeText + "; { 2f61 2f62 }";
        Alert copy(source);
        EXPECT_EQ(copy.operator std::string(), text);
        copy = alertOf(0, 0, 0);
        EXPECT_EQ(copy.operator std::string(), "Alert 0; 0; 0; ; " + someTimeText + "; { }");
        EXPECT_EQ(source.operator std::string(), text);
        copy = source;
        EXPECT_EQ(copy.operator std::string(), text);
    }
    EXPECT_EQ(observe::dateTimesAlive(), alive);
}

TEST(Alert, AssignmentKeepsTheOldAlertWhenMemoryRunsOut)
{
    const Alert source = alertOf(3, 5, 85, "a message that needs memory of its own",
                                 {"/a/path/that/needs/memory/of/its/own", "/b"});
    const Alert old(1, 2, {"/c"}, 4, "short");
    for (long allowed = 0;; ++allowed) {
        SCOPED_TRACE("memory for " + std::to_string(allowed) + " allocations");
        ASSERT_LT(allowed, 100);
        Alert target(old);
        if (allocation::completesWith(allowed, [&] { target = source; })) {
            EXPECT_EQ(target.operator std::string(), source.operator std::string());
            EXPECT_GT(allowed, 0);
            break;
        }
        EXPECT_EQ(target.operator std::string(), old.operator std::string());
    }
}

TEST(Alert, GivesBackAllMemoryWhenItRunsOut)
{
    const Paths paths = {"/a/path/that/needs/memory/of/its/own", "/b"};
    const std::string message = "a message that needs memory of its own";
    ZQ::DateTime time = someTime();
    const int alive = observe::dateTimesAlive();
    for (const bool stamped : {false, true}) {
        SCOPED_TRACE(stamped ? "with the caller's time stamp" : "with the clock's");
        allocation::expectAllMemoryGivenBack([&] {
            if (stamped)
                Alert(time, 2, 1, paths, 5, message);
            else
                Alert(2, 1, paths, 5, message);
        });
        EXPECT_EQ(observe::dateTimesAlive(), alive);
    }
}

TEST(AlertClock, IsNotReadWhenTheCallerGivesATimeStamp)
{
    alertOf(0, 0, 0);
    EXPECT_EQ(observe::clockReadings(), 0);
}

TEST(AlertClock, GivesTheTimeStampUnchanged)
{
    observe::setClock(1234567890L, 123);
    const Alert alert(2, 1, {"/a"}, 5, "Fan failed");
    EXPECT_EQ(observe::clockReadings(), 1);
    EXPECT_EQ(partsOf(alert.getTimeStamp()), (DateTimeParts {1234567890, 123, 3}));
    EXPECT_EQ(alert.operator std::string(), "Alert 2; 1; 5; Fan failed; <1234567890.123/3>; { 2f61 }");
    EXPECT_EQ(observe::clockReadings(), 1);
}

TEST(AlertClock, IsReadForEachAlert)
{
    observe::setClock(100, 0);
    const Alert first(0, 0, {}, 0, "");
    observe::setClock(100, 1);
    const Alert second(0, 0, {}, 0, "");
    EXPECT_EQ(observe::clockReadings(), 2);
    EXPECT_EQ(first.getTimeStamp().getMillisecond(), 0u);
    EXPECT_EQ(second.getTimeStamp().getMillisecond(), 1u);
}

TEST(AlertClock, IsReadBeforeTheCodesAreChecked)
{
    std::vector<int> readings;
    observe::onRecord([&](const observe::Record&) { readings.push_back(observe::clockReadings()); });
    EXPECT_THROW(Alert(4, 0, {}, 0, ""), std::invalid_argument);
    EXPECT_THROW(Alert(0, 6, {}, 0, ""), std::invalid_argument);
    EXPECT_THROW(Alert(0, 0, {}, 86, ""), std::invalid_argument);
    EXPECT_EQ(readings, (std::vector<int> {1, 1, 2, 2, 3, 3}));
}

TEST(AlertClock, ExceptionPropagatesBeforeAnyCheck)
{
    observe::throwAt(observe::Call::now, 1);
    EXPECT_THROW(Alert(9, 9, {}, 99, ""), observe::Thrown);
    EXPECT_TRUE(observe::records().empty());
}

TEST(AlertText, ListsEveryPart)
{
    const struct {
        Alert alert;
        std::string text;
    } rows[] = {
        {alertOf(2, 1, 5, "Fan failed", {"/a", "/b"}),
         "Alert 2; 1; 5; Fan failed; " + someTimeText + "; { 2f61 2f62 }"},
        {alertOf(0, 0, 0), "Alert 0; 0; 0; ; " + someTimeText + "; { }"},
        {alertOf(3, 5, 85, "x"), "Alert 3; 5; 85; x; " + someTimeText + "; { }"},
        {alertOf(1, 2, 3, "a; {b}\n", {""}), "Alert 1; 2; 3; a; {b}\n; " + someTimeText + "; {  }"},
        {alertOf(1, 2, 3, "", {"", ""}), "Alert 1; 2; 3; ; " + someTimeText + "; {   }"},
        {alertOf(1, 2, 3, "", {";{} "}), "Alert 1; 2; 3; ; " + someTimeText + "; { 3b7b7d20 }"},
        {alertOf(1, 2, 3, std::string("\0", 1), {std::string("\0\xff", 2)}),
         "Alert 1; 2; 3; " + std::string("\0", 1) + "; " + someTimeText + "; { 00ff }"},
        {alertOf(1, 2, 3, std::string("\0a", 2), {std::string("\0a", 2)}),
         "Alert 1; 2; 3; " + std::string("\0a", 2) + "; " + someTimeText + "; { 0061 }"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.text);
        EXPECT_EQ(row.alert.operator std::string(), row.text);
        std::ostringstream out;
        EXPECT_EQ(&(out << row.alert), &out);
        EXPECT_EQ(out.str(), row.text);
    }
    EXPECT_TRUE(observe::records().empty());
}

TEST(AlertText, FollowsTheGlobalLocaleLikeANewStream)
{
    const Alert alert = alertOf(3, 5, 85, "1234567", {"1234"});
    {
        const GlobalGroupingLocale grouping(1);
        EXPECT_EQ(alert.operator std::string(),
                  "Alert 3; 5; 8,5; 1234567; <1,2,3,4,5,6,7,8,9,0.2,5,0/2>; { 31323334 }");
    }
    EXPECT_EQ(alert.operator std::string(), "Alert 3; 5; 85; 1234567; " + someTimeText + "; { 31323334 }");
}

TEST(AlertText, PropagatesAnExceptionOfTheTimeStamp)
{
    const Alert alert = alertOf(0, 0, 0);
    observe::throwAt(observe::Call::dateTimeText, 1);
    EXPECT_THROW(alert.operator std::string(), observe::Thrown);
    EXPECT_TRUE(observe::thrown());
}

TEST(AlertText, IsCompleteOrThrowsWhenMemoryRunsOut)
{
    const Alert alert = alertOf(3, 5, 85, "a message that needs memory of its own", {"/a/longer/path", "/b"});
    const std::string paths = "; { 2f612f6c6f6e6765722f70617468 2f62 }";
    allocation::expectTextCompleteOrThrows(
        alert, "Alert 3; 5; 85; a message that needs memory of its own; " + someTimeText + paths);
    const GlobalGroupingLocale grouping(1);
    allocation::expectTextCompleteOrThrows(
        alert,
        "Alert 3; 5; 8,5; a message that needs memory of its own; <1,2,3,4,5,6,7,8,9,0.2,5,0/2>" + paths);
}

TEST(AlertStream, InsertsTheAlertAsOneText)
{
    std::ostringstream out;
    out.imbue(groupingLocale(1));
    out << std::hex << std::showbase << std::setfill('*') << std::setw(44) << alertOf(3, 5, 85, "x");
    EXPECT_EQ(out.str(), "**Alert 3; 5; 85; x; <1234567890.250/2>; { }");
    EXPECT_EQ(out.width(), 0);

    std::ostringstream left;
    left << std::left << std::setfill('.') << std::setw(44) << alertOf(3, 5, 85, "x") << '|';
    EXPECT_EQ(left.str(), "Alert 3; 5; 85; x; <1234567890.250/2>; { }..|");
}

TEST(AlertHexstring, HasTwoLowerCaseDigitsForEachByte)
{
    const Alert alert = alertOf(0, 0, 0);
    expectTwoLowerCaseDigitsForEachByte([&](const std::string& bytes) { return alert.hexstring(bytes); });
}

TEST(AlertHexstring, ConvertsAllBytes)
{
    const Alert alert = alertOf(0, 0, 0);
    expectTwoLowerCaseDigitsForAllBytes([&](const std::string& bytes) { return alert.hexstring(bytes); });
}

TEST(AlertHexstring, MayBeCalledBySeveralThreads)
{
    const Alert alert = alertOf(0, 0, 0);
    std::string texts[4];
    std::vector<std::thread> threads;
    for (std::string& text : texts)
        threads.emplace_back([&] { text = alert.hexstring("\x01\xef"); });
    for (std::thread& thread : threads)
        thread.join();
    for (const std::string& text : texts)
        EXPECT_EQ(text, "01ef");
}

}  // namespace
