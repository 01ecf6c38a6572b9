#include <memory>
#include <string>
#include <type_traits>
#include <utility>
#include <variant>
#include <vector>

#include <gtest/gtest.h>

#include "IC/visit.h"
#include "observe/Refusal.h"
#include "support/AllocationFailure.h"
#include "support/DateTimes.h"
#include "support/PropertySamples.h"

namespace {

using IC::Number;
using IC::PropertyValue;

template <class... Cases>
struct Overloaded : Cases... {
    using Cases::operator()...;
};
template <class... Cases>
Overloaded(Cases...) -> Overloaded<Cases...>;

std::string digits(unsigned int number)
{
    return std::to_string(number);
}

// Says which case was taken, and with what.
const Overloaded nameOfNumber {
    [](std::monostate) { return std::string("nothing"); },
    [](bool flag) { return std::string(flag ? "bool true" : "bool false"); },
    [](int number) { return "int " + std::to_string(number); },
    [](unsigned int number) { return "unsigned int " + std::to_string(number); },
    [](unsigned long long number) { return "unsigned long long " + std::to_string(number); },
    [](double number) { return "double " + std::to_string(number); },
    [](IC::NotANumber) { return std::string("not a number"); },
    [](IC::Infinity) { return std::string("infinity"); },
    [](const IC::Version2& version) {
        return "version " + digits(version.major) + " and " + digits(version.minor);
    },
    [](const ZQ::DateTime& time) {
        const DateTimeParts parts = partsOf(time);
        return "time " + std::to_string(parts.seconds) + ", " + digits(parts.milliseconds) + ", "
            + digits(parts.scope);
    },
    [](const IC::NodeRef& node) { return "node " + digits(node.type) + ", " + digits(node.id); },
    [](IC::InvalidKind invalid) { return "invalid kind " + digits(invalid.kind); }};

const Overloaded nameOfProperty {
    [](std::monostate) { return std::string("nothing"); },
    [](const Number& number) { return "number " + number.operator std::string(); },
    [](const std::string& text) { return "text " + text; },
    [](const IC::EnumValue& value) { return "enumerated value " + value.operator std::string(); },
    [](const IC::Buffer& bytes) { return std::to_string(bytes.size()) + " bytes"; },
    [](const IC::NumberArray& numbers) { return std::to_string(numbers.size()) + " numbers"; },
    [](const IC::StringArray& texts) { return std::to_string(texts.size()) + " texts"; },
    [](IC::MissingObject missing) { return "missing object of kind " + digits(missing.kind); }};

TEST(VisitProperty, CallsTheCaseOfTheKind)
{
    const char* const expected[] = {
        "nothing", "number 3600",        "text a text that needs memory of its own",
        "5 bytes", "enumerated value 7", "2 numbers",
        "2 texts"};
    const std::vector<PropertyValue> values = samples();
    ASSERT_EQ(values.size(), std::size(expected));
    for (std::size_t i = 0; i < values.size(); ++i)
        EXPECT_EQ(IC::visit(values[i], nameOfProperty), expected[i]);
}

TEST(VisitProperty, AKindWithoutItsObjectHasACaseOfItsOwn)
{
    for (PropertyValue& value : samples()) {
        const unsigned int kind = value.getKind();
        EXPECT_THROW(value.setKind(7), IC::PropertyValueInvalidKind);
        EXPECT_EQ(IC::visit(value, nameOfProperty),
                  kind == 0 ? "nothing" : "missing object of kind " + std::to_string(kind));
    }
}

// Finds the address of the object.
const auto addressOf = [](const auto& object) -> const void* { return &object; };

TEST(VisitProperty, GivesTheHeldObjectItself)
{
    PropertyValue value("AFB0812");
    const std::string& text =
        IC::visit(value,
                  Overloaded {[](const std::string& held) -> const std::string& { return held; },
                              [](const auto&) -> const std::string& { throw "another kind"; }});
    EXPECT_EQ(text, "AFB0812");
    EXPECT_EQ(IC::visit(value, addressOf), &text);
    PropertyValue other(IC::Number(1u));
    value.swap(other);
    EXPECT_EQ(IC::visit(other, addressOf), &text);  // a swap and a move hand the object over
    const PropertyValue moved(std::move(other));
    EXPECT_EQ(IC::visit(moved, addressOf), &text);
}

TEST(VisitNumber, CallsTheCaseOfTheKind)
{
    const struct {
        Number number;
        const char* expected;
    } rows[] = {{Number(Number::KIND_UNKNOWN), "nothing"},
                {true, "bool true"},
                {false, "bool false"},
                {-2147483647 - 1, "int -2147483648"},
                {4294967295u, "unsigned int 4294967295"},
                {18446744073709551615ull, "unsigned long long 18446744073709551615"},
                {-0.5, "double -0.500000"},
                {Number(Number::KIND_NAN), "not a number"},
                {Number(Number::KIND_INFINITY), "infinity"},
                {IC::Version2 {2, 15}, "version 2 and 15"},
                {Number(1234567890, 123), "time 1234567890, 123, 3"},
                {IC::NodeRef {20, 7}, "node 20, 7"}};
    for (const auto& row : rows)
        EXPECT_EQ(IC::visit(row.number, nameOfNumber), row.expected);
}

TEST(VisitNumber, ADateTimeComesWithAnyScope)
{
    for (const unsigned int scope : {0u, 1u, 3u, 4u, 255u}) {
        const Number number(dateTime(-5, 65535, scope));
        EXPECT_EQ(IC::visit(number, nameOfNumber), "time -5, 65535, " + std::to_string(scope));
    }
}

TEST(VisitNumber, AnInvalidKindHasACaseOfItsOwn)
{
    for (const unsigned int kind : {11u, 256u, 4294967295u}) {
        Number number(5u);
        EXPECT_THROW(number.initKind(static_cast<Number::KindType>(kind)), std::invalid_argument);
        EXPECT_EQ(IC::visit(number, nameOfNumber), "invalid kind " + std::to_string(kind));
    }
}

TEST(VisitNumber, RefusedKindsThatExistKeepTheirCase)
{
    Number number(IC::NodeRef {20, 7});
    EXPECT_THROW(number.initKind(Number::KIND_INT), std::invalid_argument);
    EXPECT_EQ(IC::visit(number, nameOfNumber), "int 0");
    EXPECT_THROW(number.initKind(Number::KIND_NODEREF), std::invalid_argument);
    EXPECT_EQ(IC::visit(number, nameOfNumber), "node 20, 7");
}

TEST(VisitNumber, AFlagAboveOneIsTrue)
{
    Number number(IC::Version2 {2, 2});
    number.setKind(Number::KIND_BOOL);
    EXPECT_EQ(IC::visit(number, nameOfNumber), "bool true");
}

TEST(Visit, ReturnsWhatTheVisitorReturns)
{
    static_assert(std::is_same_v<decltype(IC::visit(Number(5u), nameOfNumber)), std::string>);
    int called = 0;
    const auto nothing = [](const auto&) {};
    static_assert(std::is_void_v<decltype(IC::visit(Number(5u), nothing))>);
    const auto count = [&called](const auto&) -> int& { return ++called; };
    EXPECT_EQ(&IC::visit(Number(5u), count), &called);
    EXPECT_EQ(&IC::visit(PropertyValue("text"), count), &called);
    EXPECT_EQ(called, 2);

    const auto make = [](const auto&) {
        return std::make_unique<int>(7);  // neither copied nor assigned
    };
    EXPECT_EQ(*IC::visit(Number(5u), make), 7);
    EXPECT_EQ(*IC::visit(PropertyValue("text"), make), 7);
}

TEST(Visit, PropagatesWhatTheVisitorThrows)
{
    const auto refuse = [](const auto&) { throw 7; };
    EXPECT_THROW(IC::visit(Number(5u), refuse), int);
    EXPECT_THROW(IC::visit(PropertyValue("text"), refuse), int);
}

// Changes itself.
struct Counting {
    void operator()(const Number& number) { numbers += number.operator unsigned int(); }
    void operator()(const std::string&) { }
    template <class Other>
    void operator()(const Other&)
    {
        ++others;
    }

    unsigned int numbers = 0;
    unsigned int others = 0;
};

TEST(Visit, TakesVisitorsOfAllForms)
{
    Counting counting;
    for (const PropertyValue& value : samples())
        IC::visit(value, counting);
    EXPECT_EQ(counting.numbers, 3600u);
    EXPECT_EQ(counting.others, 5u);

    const PropertyValue value("text");
    int called = 0;
    IC::visit(value, [&called](auto) { ++called; });
    IC::visit(value, [&called](auto&&) { ++called; });
    IC::visit(value, [&called](auto...) { ++called; });
    IC::visit(value, [&called](auto&&...) { ++called; });
    IC::visit(value, [&called](const auto&...) mutable { ++called; });
    const auto named = [&called](const auto&) { ++called; };
    IC::visit(value, named);
    IC::visit(value, std::ref(named));
    IC::visit(Number(5u), named);
    EXPECT_EQ(called, 8);
}

// A case for all other types leaves each type that has a case of its own to that case.
TEST(Visit, PrefersTheCaseOfTheTypeToTheCaseOfAll)
{
    const Overloaded isText {[](const std::string&) { return true; }, [](const auto&) { return false; }};
    EXPECT_TRUE(IC::visit(PropertyValue("text"), isText));
    EXPECT_FALSE(IC::visit(PropertyValue(Number(5u)), isText));  // although a Number converts to a text
    EXPECT_FALSE(IC::visit(PropertyValue(IC::EnumValue(5u)), isText));
    const Overloaded isDouble {[](double) { return true; }, [](const auto&) { return false; }};
    EXPECT_TRUE(IC::visit(Number(0.5), isDouble));
    EXPECT_FALSE(IC::visit(Number(5u), isDouble));
    EXPECT_FALSE(IC::visit(Number(true), isDouble));
}

TEST(Visit, LogsNothing)
{
    const auto ignore = [](const auto&) {};
    for (const PropertyValue& value : samples())
        IC::visit(value, ignore);
    IC::visit(Number(1234567890, 123), ignore);  // the text of this number writes a record
    EXPECT_EQ(observe::dateTimesAlive(), 0);
    expectRecords({});
}

TEST(Visit, AllocatesNothing)
{
    constexpr unsigned int count = 100000;
    const PropertyValue value(IC::NumberArray(count, Number(7u)));
    unsigned long long sum = 0;
    const Overloaded add {[&sum](unsigned int number) { sum += number; }, [](const auto&) {}};
    const Overloaded addAll {[&add](const IC::NumberArray& numbers) {
                                 for (const Number& number : numbers)
                                     IC::visit(number, add);
                             },
                             [](const auto&) {}};
    EXPECT_EQ(allocation::countOf([&] { IC::visit(value, addAll); }), 0);
    EXPECT_EQ(sum, 700000u);
}

}  // namespace
