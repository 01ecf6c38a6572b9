#include <iomanip>
#include <limits>
#include <map>
#include <sstream>
#include <stdexcept>
#include <streambuf>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include <gtest/gtest.h>
#include <pthread.h>

#include "IC/EnumValue.h"
#include "IC/ICException.h"
#include "IC/Number.h"
#include "IC/Property.h"
#include "observe/Refusal.h"
#include "support/AllocationFailure.h"
#include "support/GroupingLocale.h"
#include "support/Hexadecimal.h"
#include "support/PropertySamples.h"

// What programs that were compiled with an older header call, also for different kinds.
namespace older {
bool equal(const IC::PropertyValue& a,
           const IC::PropertyValue& b) asm("_ZN2IC13PropertyValue5equalERKS0_S2_");
}  // namespace older

namespace {

using IC::Buffer;
using IC::EnumValue;
using IC::Number;
using IC::NumberArray;
using IC::PropertyValue;
using IC::PropertyValueInvalidKind;
using IC::StringArray;
using PropertyMap = std::map<unsigned int, PropertyValue>;

static_assert(std::is_same_v<decltype(IC::pB(0)), std::string>);

enum Order { equal, less, greater, unordered };

// Expects this order of all six operators, in both directions.
void expectOrder(const PropertyValue& a, const PropertyValue& b, Order order)
{
    SCOPED_TRACE(seen(a) + " and " + seen(b));
    EXPECT_EQ(a == b, order == equal);
    EXPECT_EQ(a != b, order != equal);
    EXPECT_EQ(a < b, order == less);
    EXPECT_EQ(a > b, order == greater);
    EXPECT_EQ(a <= b, order == equal || order == less);
    EXPECT_EQ(a >= b, order == equal || order == greater);
    EXPECT_EQ(b == a, order == equal);
    EXPECT_EQ(b != a, order != equal);
    EXPECT_EQ(b < a, order == greater);
    EXPECT_EQ(b > a, order == less);
    EXPECT_EQ(b <= a, order == equal || order == greater);
    EXPECT_EQ(b >= a, order == equal || order == less);
    EXPECT_TRUE(observe::records().empty());
}

template <class Operation>
void expectNumbersRefused(Operation operation, const char* function, const char* logged, const char* sentence)
{
    expectRefusal<std::invalid_argument>(operation, function, "Number", "Vexilon.IC.Number", logged,
                                         sentence);
}

PropertyValue number(const Number& value)
{
    return PropertyValue(value);
}

PropertyValue numbers(const NumberArray& values)
{
    return PropertyValue(values);
}

PropertyValue text(const std::string& value)
{
    return PropertyValue(value);
}

PropertyValue texts(const StringArray& values)
{
    return PropertyValue(values);
}

PropertyValue bytes(const Buffer& values)
{
    return PropertyValue(values);
}

const double nan = std::numeric_limits<double>::quiet_NaN();

TEST(PropertyComparison, OfKindUnknownIsEqual)
{
    expectOrder(PropertyValue(PropertyValue::KIND_UNKNOWN), PropertyValue(PropertyValue::KIND_UNKNOWN),
                equal);
}

TEST(PropertyComparison, IsTheSameInProgramsThatWereCompiledWithAnOlderHeader)
{
    EXPECT_FALSE(older::equal(PropertyValue("7"), PropertyValue(Number(7u))));
    EXPECT_TRUE(older::equal(PropertyValue(EnumValue(7u)), PropertyValue(EnumValue(7u))));
}

TEST(PropertyComparison, OfNumbersIsThatOfTheNumbers)
{
    expectOrder(number(Number(5u)), number(Number(5u)), equal);
    expectOrder(number(Number(5u)), number(Number(6u)), less);
    expectOrder(number(Number(4294967295u)), number(Number(0u)), greater);
    expectOrder(number(Number(3)), number(Number(9)), equal);  // all signed numbers compare equal
    expectOrder(number(Number(0.5)), number(Number(-0.5)), greater);
    expectOrder(number(Number(nan)), number(Number(nan)), unordered);
    expectOrder(number(Number(false)), number(Number(true)), less);
    expectOrder(number(Number(IC::Version2 {1, 200})), number(Number(IC::Version2 {2, 0})), less);
    expectOrder(number(Number(Number::KIND_INFINITY)), number(Number(Number::KIND_INFINITY)), equal);
}

TEST(PropertyComparison, OfNumbersIsRefusedByTheNumbers)
{
    const PropertyValue uint32(Number(1u));
    const PropertyValue uint64(Number(1ull));
    EXPECT_FALSE(uint32 == uint64);
    EXPECT_TRUE(uint32 != uint64);
    EXPECT_TRUE(observe::records().empty());
    const char* const lessKinds = "<: cannot compare two different kinds of number, kind1=3, kind2=4";
    const char* const greaterKinds = ">: cannot compare two different kinds of number, kind1=3, kind2=4";
    const char* const sentence = "Cannot compare two different kinds of number";
    expectNumbersRefused([&] { return uint32 < uint64; }, "operator<", lessKinds, sentence);
    expectNumbersRefused([&] { return uint32 <= uint64; }, "operator<", lessKinds, sentence);
    expectNumbersRefused([&] { return uint32 > uint64; }, "operator>", greaterKinds, sentence);
    expectNumbersRefused([&] { return uint32 >= uint64; }, "operator>", greaterKinds, sentence);

    const PropertyValue notANumber {Number(Number::KIND_NAN)};
    expectNumbersRefused([&] { return notANumber < notANumber; }, "operator<",
                         "<: invalid operation when kind is NaN", "Invalid operation when kind is NaN");
    expectNumbersRefused([&] { return notANumber > notANumber; }, "operator>",
                         ">: invalid operation when kind is NaN", "Invalid operation when kind is NaN");
    EXPECT_TRUE(notANumber <= notANumber);
    EXPECT_TRUE(notANumber >= notANumber);
}

TEST(PropertyComparison, OfInfinityDependsOnItsSideAsForNumbers)
{
    const PropertyValue infinity {Number(Number::KIND_INFINITY)};
    const PropertyValue five(Number(5u));
    EXPECT_TRUE(infinity > five);
    EXPECT_TRUE(infinity >= five);
    EXPECT_FALSE(infinity < five);
    EXPECT_FALSE(infinity <= five);
    EXPECT_TRUE(observe::records().empty());
    expectNumbersRefused([&] { return five < infinity; }, "operator<",
                         "<: cannot compare two different kinds of number, kind1=3, kind2=7",
                         "Cannot compare two different kinds of number");
    expectNumbersRefused([&] { return five > infinity; }, "operator>",
                         ">: cannot compare two different kinds of number, kind1=3, kind2=7",
                         "Cannot compare two different kinds of number");
}

TEST(PropertyComparison, OfTextsIsByUnsignedBytesThenByLength)
{
    expectOrder(text(""), text(""), equal);
    expectOrder(text("abc"), text("abc"), equal);
    expectOrder(text(""), text("a"), less);
    expectOrder(text("a"), text("ab"), less);
    expectOrder(text("b"), text("ab"), greater);
    expectOrder(text("B"), text("a"), less);
    expectOrder(text("\x80"), text("\x7f"), greater);
    expectOrder(text(std::string("a\0b", 3)), text(std::string("a\0c", 3)), less);
    expectOrder(text(std::string("a\0", 2)), text("a"), greater);
}

TEST(PropertyComparison, OfBuffersIsByUnsignedBytesThenByLength)
{
    expectOrder(bytes({}), bytes({}), equal);
    expectOrder(bytes({}), bytes({0}), less);
    expectOrder(bytes({1}), bytes({1}), equal);
    expectOrder(bytes({1}), bytes({1, 0}), less);
    expectOrder(bytes({0x80}), bytes({0x7f, 0xff}), greater);
    expectOrder(bytes({1, 2, 3}), bytes({1, 2, 4}), less);
    expectOrder(bytes({0, 1}), bytes({0, 0, 9}), greater);
}

TEST(PropertyComparison, OfEnumValuesIsByTheUnsignedValue)
{
    expectOrder(PropertyValue(EnumValue(0u)), PropertyValue(EnumValue(0u)), equal);
    expectOrder(PropertyValue(EnumValue(0u)), PropertyValue(EnumValue(4294967295u)), less);
    expectOrder(PropertyValue(EnumValue(8u)), PropertyValue(EnumValue(7u)), greater);
}

TEST(PropertyComparison, OfNumberArraysIsLexicographic)
{
    const Number one(1u);
    const Number two(2u);
    expectOrder(numbers({}), numbers({}), equal);
    expectOrder(numbers({}), numbers({one}), less);
    expectOrder(numbers({one, two}), numbers({one, two}), equal);
    expectOrder(numbers({one}), numbers({one, Number(0u)}), less);
    expectOrder(numbers({two}), numbers({one, Number(5u)}), greater);
    expectOrder(numbers({one, two}), numbers({one, one, two}), greater);
    // All signed numbers compare equal, so the length decides.
    expectOrder(numbers({Number(1), Number(9)}), numbers({Number(2), Number(3)}), equal);
    expectOrder(numbers({Number(9)}), numbers({Number(1), Number(1)}), less);
    // A real NaN equals nothing and is neither less nor greater, so the next element decides.
    expectOrder(numbers({Number(nan)}), numbers({Number(nan)}), unordered);
    expectOrder(numbers({Number(nan), Number(1.0)}), numbers({Number(nan), Number(2.0)}), less);
}

TEST(PropertyComparison, OfNumberArraysUsesOnlyLessThanForElements)
{
    const PropertyValue infinity = numbers({Number(Number::KIND_INFINITY)});
    const PropertyValue five = numbers({Number(5u)});
    const char* const logged = "<: cannot compare two different kinds of number, kind1=3, kind2=7";
    const char* const sentence = "Cannot compare two different kinds of number";
    // Where a < b is false for two elements, the comparison asks for b < a. So all of these reach five < infinity, which
    // is refused.
    expectNumbersRefused([&] { return infinity < five; }, "operator<", logged, sentence);
    expectNumbersRefused([&] { return infinity > five; }, "operator<", logged, sentence);
    expectNumbersRefused([&] { return five < infinity; }, "operator<", logged, sentence);
    expectNumbersRefused([&] { return five > infinity; }, "operator<", logged, sentence);

    // a > b asks for b < a.
    const PropertyValue flag = numbers({Number(true)});
    expectNumbersRefused([&] { return five < flag; }, "operator<",
                         "<: cannot compare two different kinds of number, kind1=3, kind2=1", sentence);
    expectNumbersRefused([&] { return five <= flag; }, "operator<",
                         "<: cannot compare two different kinds of number, kind1=3, kind2=1", sentence);
    expectNumbersRefused([&] { return five > flag; }, "operator<",
                         "<: cannot compare two different kinds of number, kind1=1, kind2=3", sentence);
    expectNumbersRefused([&] { return five >= flag; }, "operator<",
                         "<: cannot compare two different kinds of number, kind1=1, kind2=3", sentence);
    EXPECT_FALSE(five == flag);
}

TEST(PropertyComparison, OfNumberArraysRefusesNotANumberOnlyWhenItIsReached)
{
    const Number notANumber(Number::KIND_NAN);
    const PropertyValue array = numbers({notANumber});
    expectNumbersRefused([&] { return array < array; }, "operator<", "<: invalid operation when kind is NaN",
                         "Invalid operation when kind is NaN");
    expectNumbersRefused([&] { return array > array; }, "operator<", "<: invalid operation when kind is NaN",
                         "Invalid operation when kind is NaN");
    observe::reset();
    EXPECT_TRUE(array == array);
    EXPECT_TRUE(array <= array);
    EXPECT_TRUE(array >= array);
    expectOrder(numbers({}), array, less);
    expectOrder(numbers({Number(1u), notANumber}), numbers({Number(2u), notANumber}), less);
}

TEST(PropertyComparison, OfStringArraysIsLexicographic)
{
    expectOrder(texts({}), texts({}), equal);
    expectOrder(texts({}), texts({""}), less);
    expectOrder(texts({"a", "b"}), texts({"a", "b"}), equal);
    expectOrder(texts({"a", "b"}), texts({"a", "c"}), less);
    expectOrder(texts({"a"}), texts({"a", ""}), less);
    expectOrder(texts({"b"}), texts({"a", "z"}), greater);
    expectOrder(texts({"\x80"}), texts({"\x7f", ""}), greater);
    expectOrder(texts({std::string("a\0b", 3)}), texts({std::string("a\0c", 3)}), less);
}

TEST(PropertyComparison, IgnoresTheReadOnlyMark)
{
    const auto writable = samples(false);
    const auto readOnly = samples(true);
    for (unsigned int kind = 0; kind < writable.size(); ++kind)
        expectOrder(writable[kind], readOnly[kind], equal);
}

TEST(PropertyComparison, OfDifferentKindsIsUnequalAndNotOrdered)
{
    for (const PropertyValue& a : samples(false)) {
        for (const PropertyValue& b : samples(true)) {
            if (a.getKind() == b.getKind())
                continue;
            SCOPED_TRACE(seen(a) + " and " + seen(b));
            observe::reset();
            EXPECT_FALSE(a == b);
            EXPECT_TRUE(a != b);
            EXPECT_TRUE(observe::records().empty());
            const auto refused = [&](auto operation, const std::string& sign) {
                expectRefusal<PropertyValueInvalidKind>(
                    operation, "operator" + sign, "Property", "Vexilon.IC.Property",
                    sign + ": cannot compare two different kinds of properties, kind1="
                        + std::to_string(static_cast<unsigned int>(a.getKind()))
                        + ", kind2=" + std::to_string(static_cast<unsigned int>(b.getKind())),
                    "Cannot compare two different kinds of properties");
            };
            refused([&] { return a < b; }, "<");
            refused([&] { return a <= b; }, "<");
            refused([&] { return a > b; }, ">");
            refused([&] { return a >= b; }, ">");
        }
    }
}

TEST(PropertyComparison, OfDifferentKindsIsUnequalEvenIfTheContentsLookAlike)
{
    const PropertyValue alike[][2] = {
        {number(Number(3u)), PropertyValue(EnumValue(Number::KIND_UINT32))},
        {bytes({}), numbers({})},
        {bytes({}), texts({})},
        {numbers({}), texts({})},
        {text("{}"), texts({})},
        {bytes({}), PropertyValue(PropertyValue::KIND_UNKNOWN)},
    };
    for (const auto& [a, b] : alike) {
        SCOPED_TRACE(seen(a) + " and " + seen(b));
        EXPECT_FALSE(a == b);
        EXPECT_FALSE(b == a);
        EXPECT_TRUE(a != b);
    }
}

TEST(PropertyComparison, OfATextAndANumberNamesBothKinds)
{
    expectRefusal<PropertyValueInvalidKind>(
        [] { return PropertyValue("5") < PropertyValue(Number(5u)); }, "operator<", "Property",
        "Vexilon.IC.Property", "<: cannot compare two different kinds of properties, kind1=2, kind2=1",
        "Cannot compare two different kinds of properties");
}

TEST(PropertyComparison, AfterARefusedSetKindIsUnequalAndNotOrdered)
{
    for (const PropertyValue& original : samples()) {
        if (original.getKind() == PropertyValue::KIND_UNKNOWN)
            continue;
        SCOPED_TRACE(seen(original));
        PropertyValue invalid(original);
        EXPECT_THROW(invalid.setKind(7), PropertyValueInvalidKind);
        observe::reset();
        EXPECT_FALSE(invalid == original);
        EXPECT_FALSE(original == invalid);
        EXPECT_FALSE(invalid < original);
        EXPECT_FALSE(invalid > original);
        EXPECT_FALSE(original < invalid);
        EXPECT_FALSE(original > invalid);
        EXPECT_TRUE(invalid == PropertyValue(invalid));
        EXPECT_FALSE(invalid < PropertyValue(invalid));
        EXPECT_FALSE(invalid > PropertyValue(invalid));
        EXPECT_TRUE(observe::records().empty());
    }
}

TEST(PropertyComparison, AllocatesNothing)
{
    const auto values = samples();
    const auto others = samples(true);
    int equals = 0;
    int lesser = 0;
    EXPECT_EQ(allocation::countOf([&] {
                  for (unsigned int kind = 0; kind < values.size(); ++kind) {
                      equals += values[kind] == others[kind] ? 1 : 0;
                      lesser += values[kind] < others[kind] || values[kind] > others[kind] ? 1 : 0;
                  }
              }),
              0);
    EXPECT_EQ(equals, 7);
    EXPECT_EQ(lesser, 0);
}

TEST(PropertyText, HasTheFormOfItsKind)
{
    const struct {
        PropertyValue value;
        const char* text;
    } rows[] = {
        {PropertyValue(PropertyValue::KIND_UNKNOWN), "unknown"},
        {number(Number(Number::KIND_UNKNOWN)), "unknown"},
        {number(Number(true)), "true"},
        {number(Number(-7)), "-7"},
        {number(Number(1234567.0)), "1.23457e+06"},
        {number(Number(IC::Version2 {2, 5})), "2.5"},
        {number(Number(IC::sNodeRef {4, 7})), "CPU:7"},
        {number(Number(1234567890L, 250)), "1234567890/3"},
        {text(""), ""},
        {text("plain \"quoted\" \\ text"), "plain \"quoted\" \\ text"},
        {bytes({}), ""},
        {bytes({0x0a}), "0a"},
        {bytes({0xde, 0xad, 0xbe}), "deadbe"},
        {bytes({0xde, 0xad, 0xbe, 0xef}), "deadbeef "},
        {bytes({0xde, 0xad, 0xbe, 0xef, 0x01}), "deadbeef 01"},
        {bytes({0, 1, 2, 3, 4, 5, 6, 0xff}), "00010203 040506ff "},
        {PropertyValue(EnumValue(0u)), "0"},
        {PropertyValue(EnumValue(4294967295u)), "4294967295"},
        {numbers({}), "{}"},
        {numbers({Number(1u)}), "{1}"},
        {numbers({Number(1u), Number(-2), Number(0.5), Number(Number::KIND_NAN)}),
         "{1, -2, 0.5, not a number}"},
        {texts({}), "{}"},
        {texts({""}), "{\"\"}"},
        {texts({"a\"b", ""}), "{\"a\\\"b\", \"\"}"},
        {texts({"\"\"", "\\", "a, {b}\n"}), "{\"\\\"\\\"\", \"\\\", \"a, {b}\n\"}"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.text);
        EXPECT_EQ(row.value.operator std::string(), row.text);
        std::ostringstream out;
        EXPECT_EQ(&(out << row.value), &out);
        EXPECT_EQ(out.str(), row.text);
    }
    EXPECT_TRUE(observe::records().empty());
}

TEST(PropertyText, KeepsEveryByteOfATextAndOfTextElements)
{
    std::string all;
    for (int byte = 0; byte < 256; ++byte)
        all += static_cast<char>(byte);
    EXPECT_EQ(text(all).operator std::string(), all);

    std::string escaped = all;
    escaped.insert(0x22, 1, '\\');  // before the one double quote
    EXPECT_EQ(texts({all}).operator std::string(), "{\"" + escaped + "\"}");
}

TEST(PropertyText, OfNumbersMixes32BitNumbersAndOtherKinds)
{
    const PropertyValue mixed = numbers({Number(1u), Number(4294967295u), Number(12345ull), Number(true),
                                         Number(77777777u), Number(-1), Number(0u)});
    EXPECT_EQ(mixed.operator std::string(), "{1, 4294967295, 12345, true, 77777777, -1, 0}");
    EXPECT_EQ(numbers({Number(2.5), Number(100u), Number(99u)}).operator std::string(), "{2.5, 100, 99}");
}

TEST(PropertyText, OfManyUint32NumbersIsComplete)
{
    NumberArray numbers;
    std::string expected;
    for (unsigned int i = 0; i < 3000; ++i) {
        const unsigned int number = i * i * 477;  // of one to ten digits
        numbers.emplace_back(number);
        expected += (expected.empty() ? "{" : ", ") + std::to_string(number);
        if (i % 3 == 0) {
            SCOPED_TRACE(i);
            EXPECT_EQ(PropertyValue(numbers).operator std::string(), expected + "}");
        }
    }
}

TEST(PropertyText, OfManyIntNumbersIsComplete)
{
    NumberArray all;
    std::string expected = "{";
    for (int i = 0; i < 1000; ++i) {
        all.push_back(Number(i));
        expected.append(i == 0 ? "" : ", ").append(std::to_string(i));
    }
    EXPECT_EQ(numbers(all).operator std::string(), expected.append("}"));
}

TEST(PropertyText, OfTheLongestNumbersIsCompleteAtEveryPosition)
{
    const std::pair<Number, std::string> rows[] = {
        {Number(4294967295u), "4294967295"},
        {Number(18446744073709551615ull), "18446744073709551615"},
        {Number(-2147483647 - 1), "-2147483648"},
        {Number(-1.23457e-308), "-1.23457e-308"},
        {Number(-123456.4), "-123456"},
        {Number(IC::sNodeRef {73, 4294967295}), "LAN End Point:4294967295"}};
    for (const auto& [longest, text] : rows) {
        // Each short number before the long ones moves them against the end of the room, which all together exceed.
        for (std::size_t before = 0; before < 26; ++before) {
            NumberArray numbers(before, Number(1));
            numbers.insert(numbers.end(), 100, longest);
            std::string expected;
            for (std::size_t i = 0; i < numbers.size(); ++i)
                expected.append(i == 0 ? "{" : ", ").append(i < before ? "1" : text);
            ASSERT_EQ(PropertyValue(numbers).operator std::string(), expected + '}');
        }
    }
}

TEST(PropertyText, OfABufferHasABlankAfterEveryFourthByte)
{
    Buffer values;
    std::string whole;
    for (unsigned int length = 1; length <= 1024; ++length) {
        values.push_back(0xa5);
        whole += "a5";
        if (length % 4 == 0)
            whole += ' ';
        ASSERT_EQ(bytes(values).operator std::string(), whole) << "of " << length << " bytes";
    }
}

TEST(PropertyText, OfANumberArrayWritesTheRecordsOfItsElements)
{
    EXPECT_EQ(numbers({Number(5u), Number(1234567890L, 123)}).operator std::string(),
              "{5, 1234567890/3.Conversion failed remainder>0}");
    const auto records = observe::records();
    ASSERT_EQ(records.size(), 2u);
    expectRecordPair(records, 0, "operator std::string", "Number", "Vexilon.IC.Number", 6000,
                     "string: conversion failed, remainder not zero, remainder=3");
}

TEST(PropertyText, FollowsTheGlobalLocaleLikeANewStream)
{
    const GlobalGroupingLocale grouping;
    EXPECT_EQ(number(Number(1234567u)).operator std::string(), "1,234,567");
    EXPECT_EQ(number(Number(-1234567)).operator std::string(), "-1,234,567");
    EXPECT_EQ(number(Number(12345.0)).operator std::string(), "12,345");
    EXPECT_EQ(PropertyValue(EnumValue(4294967295u)).operator std::string(), "4,294,967,295");
    EXPECT_EQ(numbers({Number(1000ull), Number(999u)}).operator std::string(), "{1,000, 999}");
    EXPECT_EQ(numbers({Number(1000u), Number(1000000u)}).operator std::string(), "{1,000, 1,000,000}");
    EXPECT_EQ(number(Number(IC::sNodeRef {4, 1234})).operator std::string(), "CPU:1,234");
    EXPECT_EQ(text("1234567").operator std::string(), "1234567");
    EXPECT_EQ(texts({"1234567"}).operator std::string(), "{\"1234567\"}");
    EXPECT_EQ(bytes({0x12, 0x34, 0x56, 0x78, 0x90}).operator std::string(), "12345678 90");
}

TEST(PropertyText, UsesTheGlobalLocaleOfItsStart)
{
    const PropertyValue value(NumberArray {Number(5L, 1), Number(1234567u)});
    const GlobalLocale restored(std::locale::classic());
    observe::onRecord([](const observe::Record&) { std::locale::global(groupingLocale()); });
    EXPECT_EQ(value.operator std::string(), "{5/3.Conversion failed remainder>0, 1234567}");
}

TEST(PropertyText, IsCompleteOrThrowsWhenMemoryRunsOut)
{
    const std::string longText(100, 'x');
    const auto check = [&] {
        for (const PropertyValue& value :
             {text(longText), texts({longText, "a\"b", longText}), bytes(Buffer(50, 7)),
              numbers(NumberArray(40, Number(123456u))), number(Number(IC::sNodeRef {29, 4294967295u}))}) {
            const std::string whole = value;
            SCOPED_TRACE(whole);
            allocation::expectTextCompleteOrThrows(value, whole);
        }
    };
    check();
    const GlobalGroupingLocale grouping;
    check();
}

TEST(PropertyStream, InsertsTheValueAsOneText)
{
    const struct {
        PropertyValue value;
        const char* text;
    } rows[] = {
        {PropertyValue(PropertyValue::KIND_UNKNOWN), "*****unknown"},
        {number(Number(3600u)), "********3600"},
        {text("abc"), "*********abc"},
        {text(""), "************"},
        {bytes({1, 2, 3, 4}), "***01020304 "},
        {PropertyValue(EnumValue(255u)), "*********255"},
        {numbers({Number(1u), Number(2u)}), "******{1, 2}"},
        {texts({"a", "b"}), "**{\"a\", \"b\"}"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.text);
        std::ostringstream out;
        out.imbue(groupingLocale(1));
        out << std::hex << std::showbase << std::uppercase << std::setfill('*') << std::setw(12) << row.value;
        EXPECT_EQ(out.str(), row.text);
        EXPECT_EQ(out.width(), 0);
    }
}

TEST(PropertyStream, AlignsTheWholeText)
{
    std::ostringstream out;
    out << std::left << std::setfill('.') << std::setw(6) << text("abc") << '|';
    EXPECT_EQ(out.str(), "abc...|");
}

TEST(PropertyStream, WritesNothingToAFailedStream)
{
    std::ostringstream out;
    out.setstate(std::ios_base::failbit);
    out << text("abc");
    EXPECT_EQ(out.str(), "");
}

TEST(PropertyStream, WritesNulBytes)
{
    std::ostringstream out;
    out << PropertyValue(std::string("a\0b", 3));
    EXPECT_EQ(out.str(), std::string("a\0b", 3));
}

using Pair = std::pair<unsigned int, PropertyValue>;

TEST(PropertyStream, WritesAPropertyWithItsKey)
{
    std::ostringstream out;
    EXPECT_EQ(&(out << Pair(7, text("abc"))), &out);
    out << '|' << Pair(0, text("")) << '|' << Pair(4294967295u, numbers({Number(1u), Number(2u)}));
    EXPECT_EQ(out.str(), "7 = abc|0 = |4294967295 = {1, 2}");
}

TEST(PropertyStream, WritesTheKeyWithTheStreamsSettings)
{
    std::ostringstream out;
    out << std::hex << std::showbase << Pair(255, number(Number(255u)));
    EXPECT_EQ(out.str(), "0xff = 255");

    std::ostringstream grouping;
    grouping.imbue(groupingLocale());
    grouping << Pair(1234, number(Number(1234u)));
    EXPECT_EQ(grouping.str(), "1,234 = 1234");

    std::ostringstream plain;
    plain.imbue(std::locale::classic());
    const GlobalGroupingLocale global;
    plain << Pair(1234, number(Number(1234u)));
    EXPECT_EQ(plain.str(), "1234 = 1,234");
}

TEST(PropertyStream, AppliesAWidthToTheKey)
{
    std::ostringstream out;
    out << std::setfill('0') << std::setw(4) << Pair(7, text("x")) << '|' << Pair(8, text("y"));
    EXPECT_EQ(out.str(), "0007 = x|8 = y");
}

TEST(PropertyStream, WritesAMapInTheOrderOfItsKeys)
{
    const PropertyMap map {{7, numbers({Number(1u), Number(2u)})}, {1, text("abc")}};
    std::ostringstream out;
    EXPECT_EQ(&(out << map), &out);
    EXPECT_EQ(out.str(), "[1 = abc], [7 = {1, 2}]");

    std::ostringstream three;
    three << PropertyMap {
        {3, text("c")}, {4294967295u, PropertyValue(PropertyValue::KIND_UNKNOWN)}, {0, text("")}};
    EXPECT_EQ(three.str(), "[0 = ], [3 = c], [4294967295 = unknown]");
}

TEST(PropertyStream, WritesAMapOfOneProperty)
{
    std::ostringstream out;
    out << PropertyMap {{3, text("x")}};
    EXPECT_EQ(out.str(), "[3 = x]");
}

TEST(PropertyStream, WritesNothingForAnEmptyMap)
{
    std::ostringstream out;
    EXPECT_EQ(&(out << PropertyMap()), &out);
    EXPECT_EQ(out.str(), "");
    EXPECT_TRUE(out.good());
}

TEST(PropertyStream, AppliesAWidthToTheOpeningBracketOfAMap)
{
    std::ostringstream out;
    out << std::setfill('.') << std::setw(3) << PropertyMap {{3, text("x")}, {4, text("y")}};
    EXPECT_EQ(out.str(), "..[3 = x], [4 = y]");
}

TEST(PropertyStream, WritesTheKeysOfAMapWithTheStreamsSettings)
{
    std::ostringstream out;
    out << std::hex << PropertyMap {{10, number(Number(10u))}, {255, PropertyValue(EnumValue(255u))}};
    EXPECT_EQ(out.str(), "[a = 10], [ff = 255]");
}

TEST(PropertyStream, WritesAMapWithoutTheReadOnlyMarks)
{
    std::ostringstream out;
    out << PropertyMap {{1, PropertyValue("a", true)}, {2, PropertyValue("b", false)}};
    EXPECT_EQ(out.str(), "[1 = a], [2 = b]");
}

// Takes so many characters and fails from then on.
class Narrow : public std::streambuf {
public:
    explicit Narrow(std::size_t room) : room_(room) { }

    std::string taken;
    int flushes = 0;

protected:
    int_type overflow(int_type character) override
    {
        if (taken.size() == room_)
            return traits_type::eof();
        taken += traits_type::to_char_type(character);
        return character;
    }
    int sync() override
    {
        ++flushes;
        return 0;
    }

private:
    std::size_t room_;
};

TEST(PropertyStream, WritesAsMuchOfAMapAsTheStreamTakes)
{
    const PropertyMap map {{1, text("abc")}, {22, numbers({Number(1u), Number(-2)})}, {300, text("")}};
    const std::string whole = "[1 = abc], [22 = {1, -2}], [300 = ]";
    Narrow full(0);
    std::ostream refusing(&full);
    refusing << "]";  // libc++ sets failbit, too
    for (std::size_t room = 0; room < whole.size(); ++room) {
        SCOPED_TRACE(room);
        Narrow narrow(room);
        std::ostream out(&narrow);
        out << map;
        EXPECT_EQ(narrow.taken, whole.substr(0, room));
        // Each piece after the one that the stream could not take fails, too. The last piece is "]".
        const bool last = room == whole.size() - 1;
        EXPECT_EQ(out.rdstate(), last ? refusing.rdstate() : std::ios_base::badbit | std::ios_base::failbit);
    }
    Narrow wide(whole.size());
    std::ostream out(&wide);
    out << map;
    EXPECT_EQ(wide.taken, whole);
    EXPECT_TRUE(out.good());
}

TEST(PropertyStream, WritesAMapInFivePiecesForEachProperty)
{
    Narrow narrow(100);
    std::ostream out(&narrow);
    out << std::unitbuf << PropertyMap {{1, text("abc")}, {2, text("d")}};
    EXPECT_EQ(narrow.taken, "[1 = abc], [2 = d]");
    EXPECT_EQ(narrow.flushes, 10);
}

// Takes a whole text, some of it or nothing, or throws. Lists the calls.
class Listing : public std::streambuf {
public:
    struct Thrown { };
    enum class Answer { all, some, none, exception };

    explicit Listing(Answer answer) : answer_(answer) { }

    std::string calls;

protected:
    int_type overflow(int_type character) override
    {
        const char text = traits_type::to_char_type(character);
        return xsputn(&text, 1) == 1 ? character : traits_type::eof();
    }
    std::streamsize xsputn(const char* characters, std::streamsize count) override
    {
        calls += '<' + std::string(characters, static_cast<std::size_t>(count)) + '>';
        if (answer_ == Answer::exception)
            throw Thrown();
        return answer_ == Answer::all ? count : answer_ == Answer::some ? count / 2 : 0;
    }
    int sync() override
    {
        calls += "flush ";
        return 0;
    }

private:
    Answer answer_;
};

// What inserting a text or a value does to a stream.
template <class Inserted>
std::string effect(const Inserted& inserted, Listing::Answer answer, std::ios_base::iostate exceptions,
                   std::ios_base::iostate state, bool isPadded, bool isTied, bool isFlushed)
{
    Listing buffer(answer);
    std::ostream out(&buffer);
    std::ostream tied(&buffer);
    if (isTied)
        out.tie(&tied);
    if (isFlushed)
        out << std::unitbuf;
    if (isPadded)
        out << std::setw(9);
    out.clear(state);
    std::string thrown;
    try {
        out.exceptions(exceptions);
        out << inserted;
    } catch (const Listing::Thrown&) {
        thrown = "its own exception";
    } catch (const std::ios_base::failure&) {
        thrown = "failure";
    }
    return buffer.calls + ", state " + std::to_string(out.rdstate()) + ", width "
        + std::to_string(out.width()) + ", exception " + thrown;
}

TEST(PropertyStream, DoesToAStreamWhatItsOwnInsertionDoes)
{
    constexpr auto good = std::ios_base::goodbit;
    EXPECT_EQ(effect(text("abc"), Listing::Answer::all, good, good, false, false, true),
              "<abc>flush , state 0, width 0, exception ");
    using Answer = Listing::Answer;
    for (const Answer answer : {Answer::all, Answer::some, Answer::none, Answer::exception})
        for (const auto exceptions : {good, std::ios_base::badbit, std::ios_base::failbit})
            for (const auto state : {good, std::ios_base::eofbit, std::ios_base::failbit})
                for (const bool isPadded : {false, true})
                    for (const bool isTied : {false, true})
                        for (const bool isFlushed : {false, true})
                            for (const PropertyValue& value : {text("abc"), text(""), number(Number(7u)),
                                                               number(Number(0.5)), numbers({Number(1u)})})
                                ASSERT_EQ(
                                    effect(value, answer, exceptions, state, isPadded, isTied, isFlushed),
                                    effect(std::string(value), answer, exceptions, state, isPadded, isTied,
                                           isFlushed));
}

// Cancels the thread that writes to it.
class Cancelling : public std::streambuf {
protected:
    std::streamsize xsputn(const char*, std::streamsize) override
    {
        pthread_cancel(pthread_self());
        pthread_testcancel();
        return 0;
    }
};

// Not inline: g++'s AddressSanitizer reports a cancelled thread whose outermost function has objects.
[[gnu::noinline]] void insertCancelling()
{
    Cancelling cancelling;
    std::ostream out(&cancelling);
    out << text("abc");
}

TEST(PropertyStream, LetsAStreamCancelTheThread)
{
#ifdef _LIBCPP_VERSION
    GTEST_SKIP() << "the unwinder of libc++ cannot unwind a cancelled thread: glibc begins that with GCC's";
#endif
    const auto run = [](void*) -> void* {
        insertCancelling();
        return nullptr;
    };
    pthread_t thread {};
    ASSERT_EQ(pthread_create(&thread, nullptr, run, nullptr), 0);
    void* result = nullptr;
    ASSERT_EQ(pthread_join(thread, &result), 0);
    EXPECT_EQ(result, PTHREAD_CANCELED);
}

TEST(PropertyStream, KeepsThePiecesBeforeAValueThatThrows)
{
    const Number dateTime(5L, 123);
    const PropertyMap map {{1, text("abc")}, {4, numbers({Number(7u), dateTime})}};
    for (int nth = 1; nth <= 10;
         ++nth) {  // what the text of such a date-time calls: NumberText.OfADateTime...
        SCOPED_TRACE(nth);
        observe::reset();
        observe::throwAt(observe::Call::any, nth);
        std::ostringstream out;
        EXPECT_THROW(out << map, observe::Thrown);
        EXPECT_EQ(out.str(), "[1 = abc], [4 = ");
        EXPECT_TRUE(out.good());

        observe::reset();
        observe::throwAt(observe::Call::any, nth);
        std::ostringstream pair;
        EXPECT_THROW(pair << *map.rbegin(), observe::Thrown);
        EXPECT_EQ(pair.str(), "4 = ");
    }
    observe::reset();
    observe::throwAt(observe::Call::any, 11);
    std::ostringstream out;
    out << map;
    EXPECT_EQ(out.str(), "[1 = abc], [4 = {7, 5/3.Conversion failed remainder>0}]");
}

TEST(PropertyStream, AllocatesNothingForAShortTextOrAHeldOne)
{
    std::vector<PropertyValue> values = samples();
    values.push_back(numbers(NumberArray(15, Number(4294967295u))));
    values.push_back(text(std::string(1000, 'x')));
    for (const PropertyValue& value : values) {
        Narrow narrow(1000);
        narrow.taken.reserve(1000);
        std::ostream out(&narrow);
        EXPECT_EQ(allocation::countOf([&] { out << value; }), 0) << narrow.taken;
        EXPECT_EQ(narrow.taken, std::string(value));
    }
}

TEST(PropertyByteText, IsTwoLowerCaseHexadecimalDigits)
{
    const struct {
        unsigned char byte;
        const char* text;
    } rows[] = {{0, "00"},    {1, "01"},    {0x09, "09"}, {0x0a, "0a"}, {0x0f, "0f"}, {0x10, "10"},
                {0x7f, "7f"}, {0x80, "80"}, {0x9a, "9a"}, {0xa9, "a9"}, {0xf0, "f0"}, {0xff, "ff"}};
    for (const auto& row : rows)
        EXPECT_EQ(IC::pB(row.byte), row.text);
    const GlobalGroupingLocale grouping(1);
    for (const auto& row : rows)
        EXPECT_EQ(IC::pB(row.byte), row.text);
}

TEST(PropertyByteText, ConvertsAllBytes)
{
    expectTwoLowerCaseDigitsForAllBytes([](const std::string& bytes) {
        std::string digits;
        for (const char byte : bytes)
            digits += IC::pB(static_cast<unsigned char>(byte));
        return digits;
    });
}

}  // namespace
