#include <cstddef>
#include <functional>
#include <limits>
#include <set>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <unordered_map>
#include <unordered_set>
#include <vector>

#include <gtest/gtest.h>

#include "IC/EnumValue.h"
#include "IC/ICException.h"
#include "IC/Number.h"
#include "IC/Property.h"
#include "observe/Refusal.h"
#include "support/AllocationFailure.h"
#include "support/DateTimes.h"
#include "support/PropertySamples.h"

namespace {

using IC::EnumValue;
using IC::Number;
using IC::PropertyValue;

static_assert(std::is_nothrow_invocable_r_v<std::size_t, std::hash<Number>, const Number&>);
static_assert(std::is_nothrow_invocable_r_v<std::size_t, std::hash<EnumValue>, const EnumValue&>);
static_assert(std::is_nothrow_invocable_r_v<std::size_t, std::hash<PropertyValue>, const PropertyValue&>);
static_assert(std::is_nothrow_default_constructible_v<std::hash<PropertyValue>>);
static_assert(std::is_copy_assignable_v<std::hash<PropertyValue>>);

template <class Value>
std::size_t hashOf(const Value& value)
{
    return std::hash<Value>()(value);
}

// The number with another kind and the same bytes.
Number readAs(Number::KindType kind, Number number)
{
    number.setKind(static_cast<unsigned char>(kind));
    return number;
}

// The number after a refused initKind, which stores the kind all the same.
Number ofRefusedKind(unsigned int kind, Number number)
{
    EXPECT_THROW(number.initKind(static_cast<Number::KindType>(kind)), std::invalid_argument);
    return number;
}

// The value after a refused setKind, which destroys the value's object.
PropertyValue withoutObject(PropertyValue value)
{
    EXPECT_THROW(value.setKind(7), IC::PropertyValueInvalidKind);
    return value;
}

IC::Buffer bytesOf(const std::string& text)
{
    IC::Buffer bytes;
    for (const char byte : text)
        bytes.push_back(static_cast<unsigned char>(byte));
    return bytes;
}

constexpr unsigned int largestUint32 = std::numeric_limits<unsigned int>::max();
constexpr unsigned long long largestUint64 = std::numeric_limits<unsigned long long>::max();

// Numbers of every kind: limits and special values, and equal numbers that differ in bytes that their kind ignores.
std::vector<Number> manyNumbers()
{
    using Limits = std::numeric_limits<double>;
    constexpr unsigned int sameBytes = 0x02020202;
    std::vector<Number> numbers = {true, false};
    for (const unsigned int bytes : {0u, 0x01010101u, sameBytes, largestUint32})
        numbers.push_back(readAs(Number::KIND_BOOL, bytes));
    for (const int value : {0, 1, -1, std::numeric_limits<int>::min(), std::numeric_limits<int>::max()})
        numbers.emplace_back(value);
    for (unsigned int power = 1; power != 0; power *= 2)
        numbers.insert(numbers.end(), {Number(power), Number(power - 1)});
    numbers.emplace_back(largestUint32);
    numbers.push_back(readAs(Number::KIND_UINT32, 0x0202020202020202ull));
    numbers.emplace_back(sameBytes);
    for (unsigned long long power = 1; power != 0; power *= 2)
        numbers.insert(numbers.end(), {Number(power), Number(power - 1)});
    numbers.emplace_back(largestUint64);
    numbers.push_back(readAs(Number::KIND_UINT64, 0.5));
    for (const double value :
         {0.0, 1.0, 0.5, 0.1, 3600.0, Limits::min(), Limits::denorm_min(), Limits::max(), 0x1p53, 0x1p64,
          Limits::infinity(), Limits::quiet_NaN(), Limits::signaling_NaN()})
        numbers.insert(numbers.end(), {Number(value), Number(-value)});
    numbers.push_back(readAs(Number::KIND_REAL, 0ull));
    for (const Number::KindType kind : {Number::KIND_UNKNOWN, Number::KIND_NAN, Number::KIND_INFINITY})
        numbers.insert(numbers.end(), {Number(kind), readAs(kind, 7u), readAs(kind, -1.5)});
    for (const IC::Version2 version :
         std::vector<IC::Version2> {{0, 0}, {0, 1}, {1, 0}, {1, 1}, {1, 2}, {2, 1}, {2, 2}, {255, 255}})
        numbers.emplace_back(version);
    numbers.push_back(readAs(Number::KIND_VERSION, sameBytes));
    for (const long seconds : {0L, 1L, -1L, 1234567890L, std::numeric_limits<long>::min()})
        for (const unsigned short milliseconds : std::vector<unsigned short> {0, 1, 999, 65535})
            numbers.emplace_back(seconds, milliseconds);
    for (const unsigned int scope : {0u, 1u, 2u, 3u, 255u})
        numbers.emplace_back(dateTime(1234567890, 999, scope));
    for (const IC::sNodeRef nodeRef :
         std::vector<IC::sNodeRef> {{0, 0}, {4, 7}, {7, 4}, {largestUint32, largestUint32}})
        numbers.emplace_back(nodeRef);
    for (const unsigned int kind : {11u, 12u, 255u, 256u, largestUint32})
        numbers.insert(numbers.end(), {ofRefusedKind(kind, 7u), ofRefusedKind(kind, -1.5)});
    return numbers;
}

std::vector<EnumValue> manyEnumValues()
{
    std::vector<EnumValue> values = {EnumValue(), EnumValue(static_cast<unsigned char>(255)),
                                     EnumValue(static_cast<unsigned short>(65535)), EnumValue(largestUint32)};
    for (unsigned int power = 1; power != 0; power *= 2)
        values.insert(values.end(), {EnumValue(power), EnumValue(power - 1)});
    return values;
}

// Values of every kind, writable and read-only, with and without their object.
std::vector<PropertyValue> manyValues()
{
    std::vector<PropertyValue> values;
    for (const Number& number : manyNumbers()) {
        values.emplace_back(number);
        values.emplace_back(IC::NumberArray {number});
    }
    for (const EnumValue& value : manyEnumValues())
        values.emplace_back(value);
    for (const bool mark : {false, true}) {
        for (const PropertyValue& value : samples(mark)) {
            values.push_back(value);
            values.push_back(withoutObject(value));
        }
        for (const PropertyValue& value : otherSamples(mark)) {
            values.push_back(value);
            values.push_back(withoutObject(value));
        }
        for (const std::string& text : {std::string(), std::string(1, '\0'), std::string("\0a", 2),
                                        std::string("a\0b", 3), std::string("a"), std::string("\xff")}) {
            values.emplace_back(text, mark);
            values.emplace_back(bytesOf(text), mark);
            values.emplace_back(IC::StringArray {text}, mark);
            values.emplace_back(IC::StringArray {text, text}, mark);
            values.emplace_back(IC::StringArray {text, ""}, mark);
        }
        values.emplace_back(PropertyValue::KIND_NUMBERARRAY, mark);
        values.emplace_back(PropertyValue::KIND_STRINGARRAY, mark);
        values.emplace_back(IC::NumberArray {0.0, 1, IC::sNodeRef {1, 2}, Number::KIND_NAN}, mark);
        values.emplace_back(IC::NumberArray {-0.0, 2, IC::sNodeRef {3, 4}, Number::KIND_NAN}, mark);
        values.emplace_back(IC::NumberArray {1u, 2u}, mark);
        values.emplace_back(IC::NumberArray {2u, 1u}, mark);
    }
    return values;
}

// Counts the pairs of equal values and expects that the two have the same hash.
template <class Value>
std::size_t equalPairs(const std::vector<Value>& values)
{
    std::vector<std::size_t> hashes;
    for (const Value& value : values)
        hashes.push_back(hashOf(value));
    std::size_t count = 0;
    for (std::size_t i = 0; i < values.size(); ++i) {
        for (std::size_t j = 0; j < values.size(); ++j) {
            if (i == j || !(values[i] == values[j]))
                continue;
            ++count;
            EXPECT_EQ(hashes[i], hashes[j]) << values[i].operator std::string() << " at " << i << " equals "
                                            << values[j].operator std::string() << " at " << j;
        }
    }
    return count;
}

// The number of different hashes among values of which no two are equal.
template <class Value>
std::size_t hashesOf(const std::vector<Value>& values)
{
    std::set<std::size_t> hashes;
    for (const Value& value : values)
        hashes.insert(hashOf(value));
    return hashes.size();
}

// Expects that at least 99 % of the hashes are different, for the numbers and for properties that hold them.
void expectSpread(const std::vector<Number>& numbers)
{
    const std::vector<PropertyValue> values(numbers.begin(), numbers.end());
    EXPECT_GE(hashesOf(numbers), numbers.size() - numbers.size() / 100);
    EXPECT_GE(hashesOf(values), values.size() - values.size() / 100);
}
void expectSpread(const std::vector<PropertyValue>& values)
{
    EXPECT_GE(hashesOf(values), values.size() - values.size() / 100);
}

}  // namespace

TEST(Hash, IsEqualForEqualNumbers)
{
    EXPECT_GE(equalPairs(manyNumbers()), 100u);
}

TEST(Hash, IsEqualForEqualEnumValues)
{
    EXPECT_GE(equalPairs(manyEnumValues()), 8u);
}

TEST(Hash, IsEqualForEqualProperties)
{
    const std::vector<PropertyValue> values = manyValues();
    EXPECT_GE(values.size(), 500u);
    EXPECT_GE(equalPairs(values), 400u);
}

TEST(Hash, IgnoresWhatEqualityIgnores)
{
    EXPECT_EQ(hashOf(Number(1)), hashOf(Number(2)));
    EXPECT_EQ(hashOf(Number(IC::sNodeRef {4, 7})), hashOf(Number(IC::sNodeRef {5, 8})));
    EXPECT_EQ(hashOf(Number(0.0)), hashOf(Number(-0.0)));
    EXPECT_EQ(hashOf(Number(dateTime(1234567890, 250, 1))), hashOf(Number(dateTime(1234567890, 250, 2))));
    EXPECT_EQ(hashOf(PropertyValue("text", true)), hashOf(PropertyValue("text", false)));
    EXPECT_EQ(hashOf(PropertyValue(IC::NumberArray {1, 0.0})),
              hashOf(PropertyValue(IC::NumberArray {2, -0.0})));
}

// A NaN equals nothing, not even itself: a set stores it, but does not find it again.
TEST(Hash, OfANaNDependsOnItsBytes)
{
    const Number nan(std::numeric_limits<double>::quiet_NaN());
    EXPECT_EQ(hashOf(nan), hashOf(Number(nan)));
    std::unordered_set<Number> set = {nan};
    EXPECT_EQ(set.count(nan), 0u);
    set.insert(nan);
    EXPECT_EQ(set.size(), 2u);
}

TEST(Hash, OfAMovedFromPropertyIsThatOfKindUnknown)
{
    PropertyValue value("a text that needs memory of its own");
    const PropertyValue taken(std::move(value));
    EXPECT_EQ(hashOf(value), hashOf(PropertyValue(PropertyValue::KIND_UNKNOWN)));
    EXPECT_NE(hashOf(value), hashOf(taken));
}

TEST(Hash, AllocatesNothingAndWritesNoRecord)
{
    const std::vector<PropertyValue> values = manyValues();
    const std::size_t records = observe::records().size();
    std::size_t all = 0;
    EXPECT_EQ(allocation::countOf([&] {
                  for (const PropertyValue& value : values)
                      all ^= hashOf(value);
              }),
              0);
    EXPECT_NE(all, 0u);
    EXPECT_EQ(observe::records().size(), records);
}

TEST(Hash, DiffersBetweenKinds)
{
    const std::vector<Number> numbers = {Number::KIND_UNKNOWN,
                                         false,
                                         0,
                                         0u,
                                         0ull,
                                         0.0,
                                         Number::KIND_NAN,
                                         Number::KIND_INFINITY,
                                         IC::Version2 {0, 0},
                                         Number(0L, 0),
                                         IC::sNodeRef {0, 0},
                                         ofRefusedKind(11, 0u)};
    EXPECT_EQ(hashesOf(numbers), numbers.size());
    const std::vector<PropertyValue> values = {
        PropertyValue::KIND_UNKNOWN,    PropertyValue::KIND_NUMBER,    PropertyValue::KIND_STRING,
        PropertyValue::KIND_BUFFER,     PropertyValue::KIND_ENUMVALUE, PropertyValue::KIND_NUMBERARRAY,
        PropertyValue::KIND_STRINGARRAY};
    EXPECT_EQ(hashesOf(values), values.size());
}

TEST(Hash, SpreadsNumbersOfOneKind)
{
    std::vector<Number> flags;
    for (unsigned int byte = 0; byte < 256; ++byte)
        flags.push_back(readAs(Number::KIND_BOOL, byte * 0x01010101u));
    expectSpread(flags);

    std::vector<Number> uint32s;
    std::vector<Number> uint64s;
    std::vector<Number> highHalves;
    std::vector<Number> reals;
    std::vector<Number> wholeReals;
    for (unsigned int i = 0; i < 1000; ++i) {
        uint32s.emplace_back(i * 4294967u);
        uint64s.emplace_back(ZQ::Uint64 {i} * 7);
        highHalves.emplace_back(ZQ::Uint64 {i} << 32);
        reals.emplace_back(i * 0.1 - 50.0);
        wholeReals.emplace_back(static_cast<double>(i));
    }
    for (const auto& numbers : {uint32s, uint64s, highHalves, reals, wholeReals})
        expectSpread(numbers);

    std::vector<Number> versions;
    for (int major = 0; major < 256; ++major)
        for (int minor = 0; minor < 256; ++minor)
            versions.emplace_back(
                IC::Version2 {static_cast<ZQ::Uint8>(major), static_cast<ZQ::Uint8>(minor)});
    expectSpread(versions);

    std::vector<Number> dateTimes;
    for (long seconds = 1234567890; seconds < 1234567990; ++seconds)
        for (unsigned short milliseconds = 0; milliseconds < 1000; milliseconds += 50)
            dateTimes.emplace_back(seconds, milliseconds);
    expectSpread(dateTimes);
}

TEST(Hash, SpreadsPropertiesOfOneKind)
{
    std::vector<PropertyValue> texts;
    std::vector<PropertyValue> buffers;
    std::vector<PropertyValue> enumValues;
    std::vector<PropertyValue> numbers;
    std::vector<PropertyValue> lists;
    for (unsigned int i = 0; i < 1000; ++i) {
        const std::string text = "/chassis/fan" + std::to_string(i);
        texts.emplace_back(text);
        buffers.emplace_back(IC::Buffer {static_cast<unsigned char>(i), static_cast<unsigned char>(i >> 8)});
        enumValues.emplace_back(EnumValue(i));
        numbers.emplace_back(IC::NumberArray {i % 32, i / 32});
        lists.emplace_back(IC::StringArray {text, "AFB0812"});
    }
    for (const auto& values : {texts, buffers, enumValues, numbers, lists})
        expectSpread(values);
}

// Arrays of equal elements differ in their length only.
TEST(Hash, SpreadsArraysByTheirLength)
{
    std::vector<PropertyValue> arrays;
    for (std::size_t length = 0; length < 200; ++length) {
        arrays.emplace_back(IC::NumberArray(length, Number(Number::KIND_UNKNOWN)));
        arrays.emplace_back(IC::StringArray(length));
        arrays.emplace_back(IC::Buffer(length));
    }
    expectSpread(arrays);
}

TEST(Hash, OfAnEnumValueIsThatOfItsNumber)
{
    EXPECT_EQ(hashOf(EnumValue(7u)), std::hash<unsigned int>()(7));
    EXPECT_EQ(hashOf(EnumValue(static_cast<unsigned char>(7))), hashOf(EnumValue(7u)));
}

TEST(Hash, AllowsNumbersAsKeys)
{
    std::unordered_map<Number, std::string> names = {
        {0.0, "zero"}, {7, "signed"}, {IC::Version2 {2, 15}, "version"}};
    EXPECT_EQ(names.at(-0.0), "zero");
    EXPECT_EQ(names.at(-8), "signed");
    EXPECT_EQ(names.at(IC::Version2 {2, 15}), "version");
    EXPECT_EQ(names.count(IC::Version2 {15, 2}), 0u);
    EXPECT_EQ(names.count(7u), 0u);
    names[3600u] = "speed";
    EXPECT_EQ(names.size(), 4u);
}

TEST(Hash, AllowsEnumValuesAsKeys)
{
    std::unordered_set<EnumValue> states;
    for (unsigned int i = 0; i < 1000; ++i)
        states.insert(EnumValue(i % 10));
    EXPECT_EQ(states.size(), 10u);
    EXPECT_EQ(states.count(EnumValue(9u)), 1u);
    EXPECT_EQ(states.count(EnumValue(10u)), 0u);
}

TEST(Hash, AllowsPropertiesAsKeys)
{
    std::unordered_map<PropertyValue, std::size_t> places;
    const std::vector<PropertyValue> values = samples();
    for (std::size_t i = 0; i < values.size(); ++i)
        places.emplace(values[i], i);
    EXPECT_EQ(places.size(), values.size());
    const std::vector<PropertyValue> readOnly = samples(true);
    for (std::size_t i = 0; i < readOnly.size(); ++i)
        EXPECT_EQ(places.at(readOnly[i]), i);
    for (const PropertyValue& other : otherSamples())
        EXPECT_EQ(places.count(other), other.getKind() == PropertyValue::KIND_UNKNOWN ? 1u : 0u);
}
