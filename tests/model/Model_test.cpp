// Compares the library with a second, simple implementation of the same rules.

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <ctime>
#include <limits>
#include <type_traits>

#include "Agreement.h"
#include "Pairs.h"
#include "observe/Refusal.h"

namespace {

using agreement::NumberPair;
using agreement::pairOf;
using agreement::pairOfKind;
using agreement::ValuePair;

// Adds the value and its neighbours. Unsigned arithmetic wraps around at the limits.
template <class T>
void addAround(std::vector<T>& values, T value)
{
    const auto bits = static_cast<std::make_unsigned_t<T>>(value);
    for (const T neighbour : {static_cast<T>(bits - 1u), value, static_cast<T>(bits + 1u)})
        if (std::find(values.begin(), values.end(), neighbour) == values.end())
            values.push_back(neighbour);
}

// Zero, the limits and all powers of two, with their neighbours.
template <class T>
std::vector<T> boundaryIntegers()
{
    std::vector<T> values;
    for (const unsigned long long limit : {0ull, 0x7Full, 0xFFull, 0x7FFFull, 0xFFFFull, 0x7FFFFFFFull,
                                           0xFFFFFFFFull, 0x7FFFFFFFFFFFFFFFull, 0xFFFFFFFFFFFFFFFFull})
        addAround(values, static_cast<T>(limit));
    for (unsigned int power = 0; power < std::numeric_limits<T>::digits; ++power)
        addAround(values, static_cast<T>(T {1} << power));
    return values;
}

std::vector<int> boundaryInts()
{
    std::vector<int> values;
    for (const unsigned int value : boundaryIntegers<unsigned int>())
        values.push_back(static_cast<int>(static_cast<long long>(value) - 0x80000000LL));
    values.insert(values.end(), {0, 1, -1, 7, -5});
    return values;
}

// Each value and its negation.
std::vector<double> boundaryReals()
{
    using Limits = std::numeric_limits<double>;
    std::vector<double> values = {0.1,           1e-7, 2.9,  1234567.0,     4294967295.9,
                                  Limits::min(), 1e22, 1e23, Limits::max(), Limits::denorm_min(),
                                  1e308,         2.15};
    for (const double limit :
         {0.0, 1.0, 0x1p7, 0x1p8, 0x1p15, 0x1p16, 0x1p31, 0x1p32, 0x1p53, 0x1p63, 0x1p64})
        for (const double offset : {-1.5, -1.0, -0.5, 0.0, 0.5, 1.0, 1.5}) {
            values.push_back(limit + offset);
            values.push_back(std::nextafter(limit + offset, Limits::infinity()));
            values.push_back(std::nextafter(limit + offset, -Limits::infinity()));
        }
    for (int power = -1074; power<1024; power += power> - 4 && power < 70 ? 1 : 53) {
        values.push_back(std::ldexp(1.0, power));
        values.push_back(std::ldexp(1.0, power) + 1.0);
        values.push_back(std::ldexp(1.0, power) - 1.0);
    }
    values.insert(values.end(), {Limits::infinity(), Limits::quiet_NaN()});
    for (std::size_t i = 0, count = values.size(); i < count; ++i)
        values.push_back(-values[i]);
    return values;
}

std::vector<NumberPair> boundaryNumbers()
{
    std::vector<NumberPair> numbers = {pairOfKind(model::UNKNOWN), pairOfKind(model::NOT_A_NUMBER),
                                       pairOfKind(model::INFINITE), pairOf(false), pairOf(true)};
    for (const int value : boundaryInts())
        numbers.push_back(pairOf(value));
    for (const unsigned int value : boundaryIntegers<unsigned int>())
        numbers.push_back(pairOf(value));
    for (const unsigned long long value : boundaryIntegers<unsigned long long>())
        numbers.push_back(pairOf(value));
    for (const double value : boundaryReals())
        numbers.push_back(pairOf(value));
    for (const unsigned char major : boundaryIntegers<unsigned char>())
        for (const unsigned char minor : IC::Buffer {0, 9, 10, 99, 100, 255})
            numbers.push_back(pairOf(IC::Version2 {major, minor}));
    for (const long seconds : boundaryIntegers<long>())
        numbers.push_back(pairOf(seconds, 250));
    for (const unsigned short milliseconds :
         std::vector<unsigned short> {0, 1, 9, 10, 999, 1000, 65530, 65535})
        numbers.push_back(pairOf(1234567890L, milliseconds));
    for (const unsigned int scope : {0u, 1u, 2u, 3u, 4u, 255u, 256u, 257u, 4294967295u})
        for (const unsigned int milliseconds : {0u, 999u, 65536u, 65541u, 4294967295u})
            numbers.push_back(pairOf(1234567890L, milliseconds, scope));
    for (const unsigned int type : {0u, 1u, 20u, 73u, 74u, 75u, 4294967295u})
        for (const unsigned int id : {0u, 7u, 4294967295u})
            numbers.push_back(pairOf(IC::sNodeRef {type, id}));
    return numbers;
}

// A few numbers of each kind, and some as setKind and a refused initKind leave them.
std::vector<NumberPair> fewNumbers()
{
    using Limits = std::numeric_limits<double>;
    std::vector<NumberPair> numbers = {pairOfKind(model::UNKNOWN),
                                       pairOfKind(model::NOT_A_NUMBER),
                                       pairOfKind(model::INFINITE),
                                       pairOf(false),
                                       pairOf(true),
                                       pairOf(0),
                                       pairOf(-1),
                                       pairOf(2147483647),
                                       pairOf(0u),
                                       pairOf(1u),
                                       pairOf(4294967295u),
                                       pairOf(0ull),
                                       pairOf(1ull),
                                       pairOf(18446744073709551615ull),
                                       pairOf(0.0),
                                       pairOf(-0.0),
                                       pairOf(1.0),
                                       pairOf(-1.0),
                                       pairOf(Limits::infinity()),
                                       pairOf(-Limits::infinity()),
                                       pairOf(Limits::quiet_NaN()),
                                       pairOf(Limits::denorm_min()),
                                       pairOf(IC::Version2 {0, 0}),
                                       pairOf(IC::Version2 {1, 0}),
                                       pairOf(IC::Version2 {0, 1}),
                                       pairOf(IC::Version2 {255, 255}),
                                       pairOf(0L, 0),
                                       pairOf(0L, 1),
                                       pairOf(-1L, 999),
                                       pairOf(1L, 0),
                                       pairOf(1L, 0u, 1u),
                                       pairOf(1L, 0u, 0u),
                                       pairOf(IC::sNodeRef {0, 0}),
                                       pairOf(IC::sNodeRef {4, 7})};
    for (const unsigned char flag : IC::Buffer {0, 1, 2, 255}) {
        NumberPair pair = pairOf(static_cast<unsigned int>(flag));
        pair.actual.setKind(IC::Number::KIND_BOOL);
        model::setKind(pair.expected, model::FLAG);
        numbers.push_back(pair);
    }
    for (const unsigned int kind : {2u, 10u, 11u, 12u, 4294967295u}) {
        NumberPair pair = pairOf(3u);
        EXPECT_THROW(pair.actual.initKind(static_cast<IC::Number::KindType>(kind)), std::invalid_argument);
        model::initKind(pair.expected, kind, 0);
        numbers.push_back(pair);
    }
    return numbers;
}

std::vector<ValuePair> fewValues(bool readOnly = false)
{
    const std::string nul("a\0b", 3);
    std::vector<ValuePair> values = {agreement::pairOfNothing(readOnly)};
    for (const NumberPair& number : fewNumbers())
        values.push_back(pairOf(number, readOnly));
    for (const std::string& text :
         {std::string(), std::string("a"), std::string("ab"), std::string("b"), nul, std::string("\xff"),
          std::string("\x7f"), std::string(5000, 'x'), std::string("a \"quoted\" \\ text")})
        values.push_back(pairOf(text, readOnly));
    for (const IC::Buffer& bytes : {IC::Buffer {}, IC::Buffer {0}, IC::Buffer {1}, IC::Buffer {1, 0},
                                    IC::Buffer {0x80}, IC::Buffer {0x7f, 0xff}, IC::Buffer {1, 2, 3, 4},
                                    IC::Buffer {0xde, 0xad, 0xbe, 0xef, 0x01}, IC::Buffer(1000, 0xa5)})
        values.push_back(pairOf(bytes, readOnly));
    for (const unsigned int value : {0u, 1u, 255u, 256u, 65535u, 65536u, 4294967295u})
        values.push_back(pairOf(IC::EnumValue(value), readOnly));
    for (const std::vector<NumberPair>& numbers : {std::vector<NumberPair> {},
                                                   {pairOf(1u)},
                                                   {pairOf(2u)},
                                                   {pairOf(1u), pairOf(0u)},
                                                   {pairOf(1u), pairOf(5u)},
                                                   {pairOf(1u), pairOf(5ull)},
                                                   {pairOf(1ull)},
                                                   {pairOfKind(model::NOT_A_NUMBER)},
                                                   {pairOfKind(model::INFINITE)},
                                                   {pairOfKind(model::INFINITE), pairOf(1u)},
                                                   {pairOf(-1), pairOf(2)},
                                                   {pairOf(-2), pairOf(1)},
                                                   {pairOf(std::nan("")), pairOf(1.0)},
                                                   {pairOf(std::nan("")), pairOf(2.0)},
                                                   {pairOf(1234567890L, 123), pairOf(0L, 7)}})
        values.push_back(pairOf(numbers, readOnly));
    for (const IC::StringArray& texts :
         {IC::StringArray {}, IC::StringArray {""}, IC::StringArray {"", ""}, IC::StringArray {"a\"b", ""},
          IC::StringArray {"a"}, IC::StringArray {"a", "b"}, IC::StringArray {"\xff\"\\", nul},
          IC::StringArray {std::string(3000, '"')}})
        values.push_back(pairOf(texts, readOnly));
    return values;
}

void expectConversionsAgree(const NumberPair& pair)
{
    for (unsigned int target = 0; target < agreement::targets; ++target)
        EXPECT_EQ(agreement::differenceInConversion(pair.actual, pair.expected, target), "")
            << "the number " << *model::textOf(pair.expected).value << " of kind " << pair.expected.kind;
    EXPECT_EQ(agreement::differenceInContent(pair.actual, pair.expected), "");
}

void expectConversionsAgree(const ValuePair& pair)
{
    for (unsigned int target = 0; target < agreement::propertyTargets; ++target)
        EXPECT_EQ(agreement::differenceInConversion(pair.actual, pair.expected, target), "")
            << "the value " << *model::textOf(pair.expected).value << " of kind " << pair.expected.kind;
    EXPECT_EQ(agreement::differenceInContent(pair.actual, pair.expected), "");
}

template <class Pair>
void expectComparisonsAgree(const Pair& a, const Pair& b)
{
    for (unsigned int comparison = 0; comparison < agreement::comparisons; ++comparison)
        EXPECT_EQ(agreement::differenceInComparison(a.actual, b.actual, a.expected, b.expected, comparison),
                  "")
            << *model::textOf(a.expected).value << " of kind " << a.expected.kind << " and "
            << *model::textOf(b.expected).value << " of kind " << b.expected.kind;
}

// Changes the kind of both values of the pair, and expects them to stay alike.
template <class Pair>
void expectSetKindAgrees(Pair& pair, unsigned char code)
{
    EXPECT_EQ(agreement::difference("setKind", model::setKind(pair.expected, code), agreement::outcomeOf([&] {
                                        pair.actual.setKind(code);
                                        return model::Nothing();
                                    })),
              "");
    EXPECT_EQ(agreement::differenceInContent(pair.actual, pair.expected), "");
}

TEST(ModelOfNumber, ConvertsEveryKindToEveryTypeAtTheBoundaries)
{
    for (const NumberPair& pair : boundaryNumbers())
        expectConversionsAgree(pair);
    for (const NumberPair& pair : fewNumbers())
        expectConversionsAgree(pair);
}

TEST(ModelOfNumber, ReadsTheStorageOfEveryKindAsEveryOther)
{
    for (const NumberPair& pair : boundaryNumbers())
        for (unsigned char kind = 0; kind < model::numberKinds; ++kind) {
            NumberPair read = pair;
            read.actual.setKind(kind);
            ASSERT_TRUE(model::setKind(read.expected, kind).value);
            SCOPED_TRACE("constructed with the kind " + std::to_string(pair.expected.kind));
            expectConversionsAgree(read);
        }
}

TEST(ModelOfNumber, ConvertsEveryVersionToRealTextAndVersion)
{
    for (unsigned int version = 0; version < 65536; ++version) {
        const NumberPair pair = pairOf(IC::Version2 {static_cast<unsigned char>(version / 256),
                                                     static_cast<unsigned char>(version % 256)});
        for (const auto target : {agreement::REAL, agreement::TEXT, agreement::VERSION})
            ASSERT_EQ(agreement::differenceInConversion(pair.actual, pair.expected, target), "");
    }
}

TEST(ModelOfNumber, ConvertsEveryMillisecondToDateTimeAndText)
{
    for (unsigned int milliseconds = 0; milliseconds < 65536; ++milliseconds) {
        const NumberPair pair = pairOf(1234567890L, static_cast<unsigned short>(milliseconds));
        for (const auto target : {agreement::DATE_TIME, agreement::TEXT})
            ASSERT_EQ(agreement::differenceInConversion(pair.actual, pair.expected, target), "");
    }
}

TEST(ModelOfNumber, ComparesPairsOfEveryKind)
{
    const std::vector<NumberPair> numbers = fewNumbers();
    for (const NumberPair& a : numbers)
        for (const NumberPair& b : numbers)
            expectComparisonsAgree(a, b);
}

TEST(ModelOfNumber, ComparesNeighboursAtTheBoundaries)
{
    const std::vector<NumberPair> numbers = boundaryNumbers();
    for (std::size_t i = 0; i < numbers.size(); ++i)
        for (std::size_t j = i; j < std::min(i + 4, numbers.size()); ++j) {
            expectComparisonsAgree(numbers[i], numbers[j]);
            expectComparisonsAgree(numbers[j], numbers[i]);
        }
}

// Compares the number that the operation makes, or its refusal.
template <class Operation>
void expectMadeAlike(const char* name, const model::Outcome<model::Number>& expected, Operation make)
{
    EXPECT_EQ(agreement::differenceInNumbers<IC::Number>(name, expected, make), "");
}

TEST(ModelOfNumber, MakesOrRefusesEveryKindCode)
{
    const auto time = static_cast<unsigned int>(model::DATE_TIME);
    for (unsigned int code = 0; code < 256; ++code) {
        if (code == time)
            continue;
        const auto byte = static_cast<unsigned char>(code);
        expectMadeAlike("from a code", model::numberOfCode(byte, 0), [&] { return IC::Number(byte); });
    }
    for (const unsigned int kind : boundaryIntegers<unsigned int>()) {
        if (kind == time)
            continue;
        const auto asKind = static_cast<IC::Number::KindType>(kind);
        expectMadeAlike("from a kind", model::numberOfKind(kind, 0), [&] { return IC::Number(asKind); });
    }
}

TEST(ModelOfNumber, KindOfDateTimesStartsAtTheCurrentTime)
{
    const std::time_t before = std::time(nullptr);
    const IC::Number number(IC::Number::KIND_DATETIME);
    const auto seconds = static_cast<long>(number.operator ZQ::DateTime());
    EXPECT_LE(before, seconds);
    EXPECT_LE(seconds, std::time(nullptr));
    EXPECT_EQ(agreement::differenceInContent(number, *model::numberOfKind(model::DATE_TIME, seconds).value),
              "");
}

TEST(ModelOfNumber, ChangesTheKindOfEveryNumber)
{
    for (const NumberPair& pair : fewNumbers()) {
        for (unsigned int code = 0; code < 256; ++code) {
            SCOPED_TRACE("the number " + *model::textOf(pair.expected).value + ", the code "
                         + std::to_string(code));
            NumberPair set = pair;
            expectSetKindAgrees(set, static_cast<unsigned char>(code));
            if (code == model::DATE_TIME)
                continue;
            NumberPair begun = pair;
            EXPECT_EQ(agreement::difference(
                          "initKind", model::initKind(begun.expected, code, 0), agreement::outcomeOf([&] {
                              begun.actual.initKind(static_cast<IC::Number::KindType>(code));
                              return model::Nothing();
                          })),
                      "");
            EXPECT_EQ(agreement::differenceInContent(begun.actual, begun.expected), "");
        }
    }
}

TEST(ModelOfEnumValue, NarrowsAndComparesAtTheBoundaries)
{
    const std::vector<unsigned int> values = boundaryIntegers<unsigned int>();
    for (const unsigned int value : values) {
        const IC::EnumValue enumValue(value);
        EXPECT_EQ(agreement::difference("to unsigned int", model::returned(value), agreement::outcomeOf([&] {
                                            return enumValue.operator unsigned int();
                                        })),
                  "");
        EXPECT_EQ(
            agreement::difference("to unsigned short", model::toUint16(value), agreement::outcomeOf([&] {
                                      return static_cast<unsigned int>(enumValue.operator unsigned short());
                                  })),
            "");
        EXPECT_EQ(agreement::difference("to unsigned char", model::toUint8(value), agreement::outcomeOf([&] {
                                            return static_cast<unsigned int>(
                                                enumValue.operator unsigned char());
                                        })),
                  "");
        EXPECT_EQ(std::string(enumValue), std::to_string(value));
        for (const unsigned int other : values) {
            const IC::EnumValue otherValue(other);
            EXPECT_EQ(enumValue == otherValue, value == other);
            EXPECT_EQ(enumValue != otherValue, value != other);
            EXPECT_EQ(enumValue < otherValue, value < other);
            EXPECT_EQ(enumValue <= otherValue, value <= other);
            EXPECT_EQ(enumValue > otherValue, value > other);
            EXPECT_EQ(enumValue >= otherValue, value >= other);
        }
    }
}

TEST(ModelOfPropertyValue, ConvertsEveryKindToEveryType)
{
    for (const bool readOnly : {false, true})
        for (const ValuePair& pair : fewValues(readOnly))
            expectConversionsAgree(pair);
    for (const NumberPair& number : boundaryNumbers())
        expectConversionsAgree(pairOf(number, false));
}

TEST(ModelOfPropertyValue, ComparesPairsOfEveryKind)
{
    const std::vector<ValuePair> writable = fewValues();
    const std::vector<ValuePair> readOnly = fewValues(true);
    for (const ValuePair& a : writable)
        for (const ValuePair& b : readOnly)
            expectComparisonsAgree(a, b);
}

TEST(ModelOfPropertyValue, AssignsEveryKindToEveryOther)
{
    const std::vector<ValuePair> writable = fewValues();
    const std::vector<ValuePair> readOnly = fewValues(true);
    for (const ValuePair& target : writable)
        for (const ValuePair& source : readOnly) {
            IC::PropertyValue assigned = target.actual;
            assigned = source.actual;
            EXPECT_EQ(agreement::differenceInContent(assigned, source.expected), "");
            EXPECT_EQ(agreement::differenceInContent(source.actual, source.expected), "");
        }
}

TEST(ModelOfPropertyValue, ChangesTheKindOfEveryValue)
{
    for (const ValuePair& pair : fewValues(true))
        for (unsigned int code = 0; code < 256; ++code) {
            SCOPED_TRACE("kind " + std::to_string(pair.expected.kind) + ", the code " + std::to_string(code));
            ValuePair set = pair;
            expectSetKindAgrees(set, static_cast<unsigned char>(code));
            if (set.expected.empty && (code == 7 || code == 255))
                expectConversionsAgree(set);
        }
}

TEST(ModelOfPropertyValue, MakesOrRefusesEveryKindCode)
{
    const auto expectAlike = [](unsigned char code, auto make) {
        model::PropertyValue expected;
        const auto outcome = model::makeKind(expected, code, true);
        std::string inContent;
        EXPECT_EQ(agreement::difference("from a kind code", outcome, agreement::outcomeOf([&] {
                                            const IC::PropertyValue value = make();
                                            inContent = agreement::differenceInContent(value, expected);
                                            return model::Nothing();
                                        })),
                  "");
        EXPECT_EQ(inContent, "");
    };
    for (unsigned int code = 0; code < 256; ++code) {
        SCOPED_TRACE(code);
        const auto byte = static_cast<unsigned char>(code);
        expectAlike(byte, [&] { return IC::PropertyValue(byte, true); });
        for (const unsigned int wide : {code, code + 256, code + 0xFFFFFF00u})
            expectAlike(byte, [&] {
                return IC::PropertyValue(static_cast<IC::PropertyValue::KindType>(wide), true);
            });
    }
}

}  // namespace
