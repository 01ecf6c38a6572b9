#include <iomanip>
#include <limits>
#include <locale>
#include <sstream>
#include <stdexcept>
#include <string>
#include <type_traits>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "IC/EnumValue.h"
#include "IC/Node.h"
#include "observe/Refusal.h"
#include "support/GroupingLocale.h"

namespace {

using IC::EnumValue;
using testing::IsEmpty;

static_assert(std::is_trivially_copyable_v<EnumValue>);
static_assert(std::is_trivially_destructible_v<EnumValue>);
static_assert(std::is_default_constructible_v<EnumValue>);
static_assert(sizeof(EnumValue) == sizeof(ZQ::Uint32));  // one field

constexpr unsigned int largest = std::numeric_limits<unsigned int>::max();

template <class T>
T to(const EnumValue& value)
{
    return value;
}

std::string text(const EnumValue& value)
{
    return value;
}

template <class T>
void expectConversionRefused(unsigned int number, const std::string& function, const std::string& logged,
                             const std::string& sentence)
{
    const EnumValue value(number);
    expectRefusal<std::out_of_range>([&] { return to<T>(value); }, function, "EnumValue",
                                     "Vexilon.IC.EnumValue", logged, sentence);
    EXPECT_EQ(to<unsigned int>(value), number);
}

TEST(EnumValueConstruction, TheDefaultIsZeroAtEveryWidth)
{
    const EnumValue value;
    EXPECT_EQ(to<unsigned int>(value), 0u);
    EXPECT_EQ(to<unsigned short>(value), 0u);
    EXPECT_EQ(to<unsigned char>(value), 0u);
    EXPECT_EQ(text(value), "0");
    EXPECT_THAT(observe::records(), IsEmpty());
}

TEST(EnumValueConstruction, EveryByteIsUnsigned)
{
    for (unsigned int number = 0; number <= 0xFF; ++number) {
        SCOPED_TRACE(number);
        const EnumValue value(static_cast<unsigned char>(number));
        EXPECT_EQ(to<unsigned int>(value), number);
        EXPECT_EQ(text(value), std::to_string(number));
    }
}

TEST(EnumValueConstruction, SixteenBitsAreUnsigned)
{
    for (const unsigned int number : {0u, 255u, 256u, 32767u, 32768u, 65535u}) {
        SCOPED_TRACE(number);
        EXPECT_EQ(to<unsigned int>(EnumValue(static_cast<unsigned short>(number))), number);
    }
}

TEST(EnumValueConstruction, ThirtyTwoBitsAreKept)
{
    for (const unsigned int number : {0u, 65536u, 2147483647u, 2147483648u, largest}) {
        SCOPED_TRACE(number);
        EXPECT_EQ(to<unsigned int>(EnumValue(number)), number);
    }
}

TEST(EnumValueConstruction, ACopyHasTheValue)
{
    const EnumValue source(7u);
    const EnumValue copy = source;
    EnumValue assigned;
    assigned = source;
    EXPECT_EQ(to<unsigned int>(copy), 7u);
    EXPECT_EQ(to<unsigned int>(assigned), 7u);
}

TEST(EnumValueConversion, AcceptsValuesThatFit)
{
    for (unsigned int number = 0; number <= 0xFFFF; ++number) {
        const EnumValue value(number);
        ASSERT_EQ(to<unsigned short>(value), number);
        if (number <= 0xFF) {
            ASSERT_EQ(to<unsigned char>(value), number);
        }
    }
    EXPECT_THAT(observe::records(), IsEmpty());
}

TEST(EnumValueConversion, To16BitsRefusesLargerValues)
{
    const struct {
        unsigned int number;
        const char* logged;
    } rows[] = {{65536, "Uint16: number out of range: 65536"},
                {65537, "Uint16: number out of range: 65537"},
                {131071, "Uint16: number out of range: 131071"},
                {2147483648, "Uint16: number out of range: 2147483648"},
                {4294901760, "Uint16: number out of range: 4294901760"},
                {largest, "Uint16: number out of range: 4294967295"}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.logged);
        expectConversionRefused<unsigned short>(row.number, "operator ZQ::Uint16", row.logged,
                                                "The number is too large to convert to a 16-bit integer");
    }
}

TEST(EnumValueConversion, To8BitsRefusesLargerValues)
{
    const struct {
        unsigned int number;
        const char* logged;
    } rows[] = {{256, "Uint8: number out of range: 256"},
                {257, "Uint8: number out of range: 257"},
                {65280, "Uint8: number out of range: 65280"},
                {65535, "Uint8: number out of range: 65535"},
                {65536, "Uint8: number out of range: 65536"},
                {2147483648, "Uint8: number out of range: 2147483648"},
                {largest, "Uint8: number out of range: 4294967295"}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.logged);
        expectConversionRefused<unsigned char>(row.number, "operator ZQ::Uint8", row.logged,
                                               "The number is too large to convert to an 8-bit integer");
    }
}

TEST(EnumValueComparison, ComparesUnsignedNumbers)
{
    const unsigned int rising[] = {0, 1, 255, 256, 65535, 65536, 2147483647, 2147483648, largest};
    for (const unsigned int left : rising) {
        for (const unsigned int right : rising) {
            SCOPED_TRACE(std::to_string(left) + " and " + std::to_string(right));
            const EnumValue a(left);
            const EnumValue b(right);
            EXPECT_EQ(a == b, left == right);
            EXPECT_EQ(a != b, left != right);
            EXPECT_EQ(a < b, left < right);
            EXPECT_EQ(a > b, left > right);
            EXPECT_EQ(a <= b, left <= right);
            EXPECT_EQ(a >= b, left >= right);
            EXPECT_EQ((a < b) + (a == b) + (a > b), 1);
        }
    }
    EXPECT_TRUE(EnumValue(largest) > EnumValue(0u));
    EXPECT_THAT(observe::records(), IsEmpty());
}

TEST(EnumValueComparison, IgnoresTheWidthOfTheConstructorsArgument)
{
    EXPECT_TRUE(EnumValue(static_cast<unsigned char>(255)) == EnumValue(255u));
    EXPECT_TRUE(EnumValue(static_cast<unsigned short>(255)) == EnumValue(static_cast<unsigned char>(255)));
    EXPECT_TRUE(EnumValue() == EnumValue(0u));
}

const struct {
    unsigned int number;
    const char* expected;
} textRows[] = {
    {0, "0"}, {7, "7"}, {255, "255"}, {65536, "65536"}, {2147483648, "2147483648"}, {largest, "4294967295"}};

TEST(EnumValueText, IsTheDecimalDigits)
{
    for (const auto& row : textRows) {
        SCOPED_TRACE(row.expected);
        EXPECT_EQ(text(EnumValue(row.number)), row.expected);
        EXPECT_EQ(std::string(EnumValue(row.number)), row.expected);
    }
    EXPECT_EQ(text(EnumValue(static_cast<unsigned char>('A'))), "65");
    EXPECT_THAT(observe::records(), IsEmpty());
}

TEST(EnumValueText, FollowsTheGlobalLocaleLikeANewStream)
{
    for (const auto& row : textRows) {
        for (const char digitsPerGroup : {char {1}, char {3}}) {
            SCOPED_TRACE(row.expected + (" in groups of " + std::to_string(digitsPerGroup)));
            const EnumValue value(row.number);
            {
                const GlobalGroupingLocale locale(digitsPerGroup);
                std::ostringstream fresh;
                fresh << row.number;
                EXPECT_EQ(text(value), fresh.str());
                std::ostringstream out;
                out.imbue(std::locale::classic());
                out << value;
                EXPECT_EQ(out.str(), fresh.str());
            }
            EXPECT_EQ(text(value), row.expected);
        }
    }
    const GlobalGroupingLocale locale;
    EXPECT_EQ(text(EnumValue(largest)), "4,294,967,295");
}

TEST(EnumValueStream, InsertsTheTextWhateverTheStreamsSettings)
{
    for (const auto& row : textRows) {
        SCOPED_TRACE(row.expected);
        std::ostringstream out;
        out.imbue(groupingLocale());
        out << std::hex << std::showbase << std::showpos << std::uppercase;
        const std::ios_base::fmtflags flags = out.flags();
        const EnumValue value(row.number);
        EXPECT_EQ(&(out << value), &out);
        EXPECT_EQ(out.str(), row.expected);
        EXPECT_EQ(out.flags(), flags);
    }
}

TEST(EnumValueStream, AppliesWidthAndFillToTheWholeText)
{
    std::ostringstream out;
    out << std::setfill('*') << std::hex << std::setw(6) << EnumValue(255u);
    EXPECT_EQ(out.width(), 0);
    out << '|' << std::left << std::setw(6) << EnumValue(7u) << '|' << EnumValue(7u);
    out << std::setw(2) << EnumValue(12345u);
    EXPECT_EQ(out.str(), "***255|7*****|712345");
}

enum class State { Off, On };  // of type int
enum class Offset : signed char { Lowest = -128, Below = -1, Highest = 127 };
enum class Step : short { Lowest = -32768, Below = -1, Highest = 32767 };
enum class Byte : unsigned char { Highest = 255 };
enum class Word : unsigned short { Highest = 65535 };
enum class Whole : unsigned int { Highest = 4294967295 };
enum class Answer : bool { No, Yes };
enum class Long : long long { None };
enum Plain { PLAIN_ZERO, PLAIN_SEVEN = 7 };
enum PlainNegative { PLAIN_BELOW = -1, PLAIN_ABOVE = 1 };
enum PlainLong { PLAIN_LONG = 0x100000000 };
enum Code : unsigned short { CODE_FIVE = 5 };  // converts without a cast

static_assert(std::is_constructible_v<EnumValue, State>);
static_assert(!std::is_convertible_v<State, EnumValue>);
static_assert(!std::is_convertible_v<Plain, EnumValue>);
static_assert(std::is_convertible_v<Code, EnumValue>);
static_assert(std::is_constructible_v<State, EnumValue>);
static_assert(!std::is_convertible_v<EnumValue, State>);
static_assert(!std::is_convertible_v<EnumValue, Plain>);
static_assert(!std::is_convertible_v<EnumValue, Code>);
static_assert(std::is_nothrow_constructible_v<EnumValue, State>);

// 64 bits do not fit.
static_assert(!std::is_constructible_v<EnumValue, Long>);
static_assert(!std::is_constructible_v<EnumValue, PlainLong>);
static_assert(!std::is_constructible_v<Long, EnumValue>);
static_assert(!std::is_constructible_v<PlainLong, EnumValue>);

template <class Enum>
void expectThereAndBack(Enum enumerator, unsigned int number)
{
    const EnumValue value(enumerator);
    EXPECT_EQ(to<unsigned int>(value), number);
    EXPECT_EQ(static_cast<Enum>(value), enumerator);
}

TEST(EnumValueEnumeration, EveryEnumeratorComesBack)
{
    expectThereAndBack(State::On, 1);
    expectThereAndBack(Offset::Highest, 127);
    expectThereAndBack(Step::Highest, 32767);
    expectThereAndBack(Byte::Highest, 255);
    expectThereAndBack(Word::Highest, 65535);
    expectThereAndBack(Whole::Highest, 4294967295);
    expectThereAndBack(Answer::Yes, 1);
    expectThereAndBack(PLAIN_SEVEN, 7);
    expectThereAndBack(PLAIN_ABOVE, 1);
    expectThereAndBack(CODE_FIVE, 5);
    expectThereAndBack(IC::Node::SENSOR_FAN, 20);
}

TEST(EnumValueEnumeration, ANegativeEnumeratorIsExtendedTo32Bits)
{
    expectThereAndBack(static_cast<State>(-2147483647 - 1), 2147483648);
    expectThereAndBack(Offset::Lowest, 4294967168);
    expectThereAndBack(Offset::Below, 4294967295);
    expectThereAndBack(Step::Lowest, 4294934528);
    expectThereAndBack(Step::Below, 4294967295);
    expectThereAndBack(PLAIN_BELOW, 4294967295);
}

template <class Enum>
void expectEnumeratorRefused(unsigned int number, const std::string& bits, const std::string& sentence)
{
    SCOPED_TRACE(number);
    const EnumValue value(number);
    expectRefusal<std::out_of_range>(
        [&] { return static_cast<Enum>(value); }, "operator ZQ::Uint" + bits, "EnumValue",
        "Vexilon.IC.EnumValue", "Uint" + bits + ": number out of range: " + std::to_string(number), sentence);
    EXPECT_EQ(to<unsigned int>(value), number);
}

TEST(EnumValueEnumeration, AValueThatItsTypeCannotHoldIsRefused)
{
    const char* const tooLarge8 = "The number is too large to convert to an 8-bit integer";
    const char* const tooLarge16 = "The number is too large to convert to a 16-bit integer";
    expectEnumeratorRefused<Byte>(256, "8", tooLarge8);
    expectEnumeratorRefused<Byte>(4294967295, "8", tooLarge8);
    expectEnumeratorRefused<Offset>(128, "8", tooLarge8);
    expectEnumeratorRefused<Offset>(255, "8", tooLarge8);
    expectEnumeratorRefused<Offset>(4294967167, "8", tooLarge8);
    expectEnumeratorRefused<Answer>(2, "8", tooLarge8);
    expectEnumeratorRefused<Word>(65536, "16", tooLarge16);
    expectEnumeratorRefused<Step>(32768, "16", tooLarge16);
    expectEnumeratorRefused<Step>(65535, "16", tooLarge16);
    expectEnumeratorRefused<Step>(4294934527, "16", tooLarge16);
    expectEnumeratorRefused<Code>(65536, "16", tooLarge16);
}

TEST(EnumValueEnumeration, WhatConvertsWithoutACastStillDoes)
{
    EnumValue value = {IC::Node::SENSOR_FAN};
    EXPECT_EQ(to<unsigned int>(value), 20u);
    value = CODE_FIVE;
    EXPECT_EQ(to<unsigned int>(value), 5u);
    value = IC::Error::STATUS_READ_ONLY;
    EXPECT_EQ(to<unsigned int>(value), 16u);
}

}  // namespace
