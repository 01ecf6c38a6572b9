#include <cmath>
#include <limits>
#include <set>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <vector>

#include <gtest/gtest.h>

#include "IC/Alert.h"
#include "IC/EnumValue.h"
#include "IC/ICException.h"
#include "IC/Number.h"
#include "IC/Property.h"
#include "ZQ/DateTime.h"
#include "observe/Refusal.h"
#include "support/AllocationFailure.h"
#include "support/DateTimes.h"
#include "support/PropertySamples.h"

namespace {

using IC::EnumValue;
using IC::Number;
using IC::PropertyValue;
using IC::PropertyValueInvalidKind;

// A property converts to these types.
static_assert(std::is_convertible_v<const PropertyValue&, double>);
static_assert(std::is_convertible_v<const PropertyValue&, unsigned long long>);
static_assert(std::is_convertible_v<const PropertyValue&, unsigned int>);
static_assert(std::is_convertible_v<const PropertyValue&, bool>);
static_assert(std::is_convertible_v<const PropertyValue&, Number>);
static_assert(std::is_convertible_v<const PropertyValue&, IC::Version2>);
static_assert(std::is_convertible_v<const PropertyValue&, EnumValue>);
static_assert(std::is_convertible_v<const PropertyValue&, IC::Buffer>);
static_assert(std::is_convertible_v<const PropertyValue&, IC::NumberArray>);
static_assert(std::is_convertible_v<const PropertyValue&, IC::StringArray>);
static_assert(std::is_convertible_v<const PropertyValue&, std::string>);
static_assert(std::is_convertible_v<const PropertyValue&, PropertyValue::KindType>);

// A conversion to int would silently go through bool.
static_assert(!std::is_convertible_v<const PropertyValue&, int>);
static_assert(!std::is_constructible_v<int, const PropertyValue&>);
static_assert(!std::is_constructible_v<int, PropertyValue>);

static_assert(!std::is_convertible_v<const PropertyValue&, unsigned char>);
static_assert(!std::is_convertible_v<const PropertyValue&, unsigned short>);
static_assert(!std::is_convertible_v<const PropertyValue&, IC::sNodeRef>);
static_assert(!std::is_convertible_v<const PropertyValue&, ZQ::DateTime>);

struct Conversion {
    std::set<unsigned int> accepted;
    const char* function;
    const char* logged;  // followed by the kind
    const char* sentence;
};

// Expects a refusal of every other kind, writable or read-only.
template <class Target>
void expectOtherKindsRefused(const Conversion& conversion)
{
    for (const bool mark : {false, true}) {
        for (const PropertyValue& value : samples(mark)) {
            const unsigned int kind = value.getKind();
            if (conversion.accepted.count(kind) != 0)
                continue;
            const std::string before = seen(value);
            SCOPED_TRACE(before);
            expectRefusal<PropertyValueInvalidKind>(
                [&] { return value.operator Target(); }, conversion.function, "Property",
                "Vexilon.IC.Property", conversion.logged + std::to_string(kind), conversion.sentence);
            EXPECT_EQ(seen(value), before);
        }
    }
}

TEST(PropertyConversion, ToRealRefusesOtherKinds)
{
    expectOtherKindsRefused<double>({{1, 4},
                                     "operator ZQ::Real64",
                                     "PropertyValue:Real64: can't return current value as a Real64, kind=",
                                     "Can't return current value as a Number"});
}

TEST(PropertyConversion, ToUint64RefusesOtherKinds)
{
    expectOtherKindsRefused<unsigned long long>(
        {{1, 4},
         "operator ZQ::Uint64",
         "PropertyValue:Uint64: can't return current value as a Uint64, kind=",
         "Can't return current value as a Number"});
}

TEST(PropertyConversion, ToUint32RefusesOtherKinds)
{
    expectOtherKindsRefused<unsigned int>(
        {{1, 4},
         "operator ZQ::Uint32",
         "PropertyValue::Uint32: can't return current value as a Uint32, kind=",
         "Can't return current value as a Number"});
}

TEST(PropertyConversion, ToBoolRefusesOtherKinds)
{
    expectOtherKindsRefused<bool>({{1},
                                   "operator bool",
                                   "PropertyValue::bool: can't return current value as a bool, kind=",
                                   "Can't return current value as a Number"});
}

TEST(PropertyConversion, ToNumberRefusesOtherKinds)
{
    expectOtherKindsRefused<Number>({{1},
                                     "operator IC::Number",
                                     "PropertyValue:Number: can't return current value as a Number, kind=",
                                     "Can't return current value as a Number"});
}

TEST(PropertyConversion, ToVersionRefusesOtherKinds)
{
    expectOtherKindsRefused<IC::Version2>(
        {{1},
         "operator IC::Version2",
         "PropertyValue:Version2: can't return current value as a Version2, kind=",
         "Can't return current value as a Number"});
}

TEST(PropertyConversion, ToBufferRefusesOtherKinds)
{
    expectOtherKindsRefused<IC::Buffer>(
        {{3},
         "operator IC::Buffer",
         "PropertyValue:Buffer: can't return current value as a Buffer, kind=",
         "Can't return current value as a Buffer"});
}

TEST(PropertyConversion, ToNumberArrayRefusesOtherKinds)
{
    expectOtherKindsRefused<IC::NumberArray>(
        {{5},
         "operator IC::NumberArray",
         "PropertyValue:NumberArray: can't return current value as a NumberArray, kind=",
         "Can't return current value as a NumberArray"});
}

TEST(PropertyConversion, ToStringArrayRefusesOtherKinds)
{
    expectOtherKindsRefused<IC::StringArray>(
        {{6},
         "operator IC::StringArray",
         "PropertyValue:StringArray: can't return current value as a StringArray, kind=",
         "Can't return current value as a StringArray"});
}

TEST(PropertyConversion, ToEnumValueRefusesOtherKindsWithoutARecord)
{
    for (const bool mark : {false, true}) {
        for (const PropertyValue& value : samples(mark)) {
            if (value.getKind() == PropertyValue::KIND_ENUMVALUE)
                continue;
            const std::string before = seen(value);
            SCOPED_TRACE(before);
            try {
                static_cast<void>(value.operator EnumValue());
                ADD_FAILURE() << "nothing was thrown";
            } catch (const PropertyValueInvalidKind& exception) {
                EXPECT_EQ(exception.what(), "Can't return current value as a EnumValue");
                observe::report("operator IC::EnumValue", "Property", 0, "",
                                std::string(typeid(exception).name()).append("|").append(exception.what()));
            }
            EXPECT_EQ(seen(value), before);
        }
    }
    EXPECT_TRUE(observe::records().empty());
}

TEST(PropertyConversion, OfANumberIsThatOfTheNumber)
{
    const double real = PropertyValue(Number(2.75), true);
    EXPECT_EQ(real, 2.75);
    EXPECT_EQ(PropertyValue(Number(true)).operator double(), 1.0);
    EXPECT_TRUE(std::isnan(PropertyValue(Number(Number::KIND_NAN)).operator double()));
    EXPECT_EQ(PropertyValue(Number(Number::KIND_INFINITY)).operator double(),
              std::numeric_limits<double>::infinity());
    EXPECT_EQ(PropertyValue(Number(IC::Version2 {2, 5})).operator double(), 2.5);

    const unsigned long long uint64 = PropertyValue(Number(18446744073709551615ull));
    EXPECT_EQ(uint64, 18446744073709551615ull);
    EXPECT_EQ(PropertyValue(Number(18446744073709549568.0)).operator unsigned long long(),
              18446744073709549568ull);
    EXPECT_EQ(PropertyValue(Number(7u)).operator unsigned long long(), 7ull);

    const unsigned int uint32 = PropertyValue(Number(4294967295.9));
    EXPECT_EQ(uint32, 4294967295u);
    EXPECT_EQ(PropertyValue(Number(3600u)).operator unsigned int(), 3600u);
    EXPECT_EQ(PropertyValue(Number(4294967295ull)).operator unsigned int(), 4294967295u);

    const bool flag = PropertyValue(Number(true));
    EXPECT_TRUE(flag);
    EXPECT_FALSE(PropertyValue(Number(false)).operator bool());
    EXPECT_FALSE(PropertyValue(Number(0u)).operator bool());
    EXPECT_TRUE(PropertyValue(Number(0.5)).operator bool());

    const IC::Version2 version = PropertyValue(Number(IC::Version2 {2, 15}));
    EXPECT_EQ(version.major, 2);
    EXPECT_EQ(version.minor, 15);
    const IC::Version2 whole = PropertyValue(Number(255ull));
    EXPECT_EQ(whole.major, 255);
    EXPECT_EQ(whole.minor, 0);
    EXPECT_TRUE(observe::records().empty());
}

TEST(PropertyConversion, OfANumberIsRefusedByTheNumber)
{
    const auto refused = [](auto operation, const char* function, const char* logged, const char* sentence) {
        SCOPED_TRACE(logged);
        expectRefusal<std::out_of_range>(operation, function, "Number", "Vexilon.IC.Number", logged,
                                         sentence);
    };
    const PropertyValue negativeInteger(Number(-5));
    const PropertyValue negativeReal(Number(-1.0));
    const PropertyValue large(Number(4294967296ull));
    const PropertyValue nothing(PropertyValue::KIND_NUMBER);
    refused([&] { return negativeInteger.operator double(); }, "operator ZQ::Real64",
            "Real: Can't return current value as a Real, kind=2", "Can't return current value as a Real");
    refused([&] { return negativeInteger.operator bool(); }, "operator bool",
            "bool: Can't return current value as a Boolean, kind=2",
            "Can't return current value as a Boolean");
    refused([&] { return nothing.operator unsigned int(); }, "operator ZQ::Uint32",
            "Uint32: Can't return current value as a 32-bit integer, kind=0",
            "Can't return current value as a 32-bit integer");
    refused([&] { return nothing.operator unsigned long long(); }, "operator ZQ::Uint64",
            "Uint64: Can't return current value as a 64-bit integer, kind=0",
            "Can't return current value as a 64-bit integer");
    refused([&] { return large.operator unsigned int(); }, "operator ZQ::Uint32",
            "Uint32: number out of range: 4294967296",
            "The number is too large to convert to a 32-bit integer");
    refused([&] { return negativeReal.operator unsigned int(); }, "operator ZQ::Uint32",
            "Uint32: number out of range: -1",
            "A negative number cannot convert to an unsigned 32-bit integer");
    refused([&] { return negativeReal.operator unsigned long long(); }, "operator ZQ::Uint64",
            "Uint64: number out of range: -1",
            "A negative number cannot convert to an unsigned 64-bit integer");
    refused([&] { return large.operator IC::Version2(); }, "operator IC::Version2",
            "Version: Number too large for version: 4294967296",
            "The number is too large to convert to a version");
    refused([&] { return negativeReal.operator IC::Version2(); }, "operator IC::Version2",
            "Version: Can't return current value as a Version, kind=5",
            "Can't return current value as a Version");
    EXPECT_EQ(seen(negativeReal), "1 writable: -1");
    EXPECT_EQ(seen(large), "1 writable: 4294967296");
}

TEST(PropertyConversion, ToNumberKeepsAllParts)
{
    const PropertyValue value {Number(dateTime(1234567890, 250, 2))};
    const Number number = value;
    EXPECT_EQ(number.getKind(), Number::KIND_DATETIME);
    EXPECT_EQ(partsOf(number.operator ZQ::DateTime()), (DateTimeParts {1234567890, 250, 2}));

    const Number reference = PropertyValue(Number(IC::sNodeRef {4, 7}));
    EXPECT_EQ(reference.operator IC::sNodeRef().type, 4u);
    EXPECT_EQ(reference.operator IC::sNodeRef().id, 7u);
    EXPECT_EQ(PropertyValue(Number(-5)).operator Number().operator int(), -5);
}

TEST(PropertyConversion, OfAnEnumValueIsItsUnsignedValue)
{
    for (const unsigned int stored : {0u, 7u, 65536u, 2147483648u, 4294967295u}) {
        SCOPED_TRACE(stored);
        const PropertyValue value(EnumValue(stored), true);
        EXPECT_EQ(value.operator unsigned int(), stored);
        EXPECT_EQ(value.operator unsigned long long(), stored);
        EXPECT_EQ(value.operator double(), stored);
        EXPECT_EQ(value.operator EnumValue().operator unsigned int(), stored);
    }
    const PropertyValue largest(EnumValue(4294967295u));
    EXPECT_EQ(largest.operator double(), 4294967295.0);
    EXPECT_EQ(largest.operator unsigned long long(), 4294967295ull);
    const EnumValue copy = largest;
    EXPECT_TRUE(copy == EnumValue(4294967295u));
    EXPECT_TRUE(observe::records().empty());
}

TEST(PropertyConversion, ToAContainerReturnsACopy)
{
    const PropertyValue bytes(IC::Buffer {0, 0x80, 0xff});
    IC::Buffer buffer = bytes;
    EXPECT_EQ(buffer, (IC::Buffer {0, 0x80, 0xff}));
    buffer.clear();
    EXPECT_EQ(seen(bytes), "3 writable: 0080ff");

    const PropertyValue numbers(IC::NumberArray {Number(1u), Number(true)}, true);
    IC::NumberArray array = numbers;
    ASSERT_EQ(array.size(), 2u);
    EXPECT_TRUE(array[0] == Number(1u));
    EXPECT_TRUE(array[1] == Number(true));
    array.pop_back();
    EXPECT_EQ(seen(numbers), "5 read-only: {1, true}");

    const PropertyValue texts(IC::StringArray {"a", std::string("b\0c", 3)});
    IC::StringArray strings = texts;
    EXPECT_EQ(strings, (IC::StringArray {"a", std::string("b\0c", 3)}));
    strings[0] = "changed";
    EXPECT_EQ(texts.operator IC::StringArray(), (IC::StringArray {"a", std::string("b\0c", 3)}));
}

TEST(PropertyConversion, ToAContainerReturnsEmptyContainers)
{
    EXPECT_TRUE(PropertyValue(IC::Buffer()).operator IC::Buffer().empty());
    EXPECT_TRUE(PropertyValue(PropertyValue::KIND_BUFFER).operator IC::Buffer().empty());
    EXPECT_TRUE(PropertyValue(IC::NumberArray()).operator IC::NumberArray().empty());
    EXPECT_TRUE(PropertyValue(IC::StringArray()).operator IC::StringArray().empty());
    EXPECT_TRUE(observe::records().empty());
}

TEST(PropertyConversion, ToUint32DoesNotParseTexts)
{
    const PropertyValue value("12");
    expectRefusal<PropertyValueInvalidKind>(
        [&] { return value.operator unsigned int(); }, "operator ZQ::Uint32", "Property",
        "Vexilon.IC.Property", "PropertyValue::Uint32: can't return current value as a Uint32, kind=2",
        "Can't return current value as a Number");
    EXPECT_EQ(seen(value), "2 writable: 12");
}

TEST(PropertyConversion, ToTextIsNeverRefused)
{
    const char* const expected[] = {"unknown",
                                    "3600",
                                    "a text that needs memory of its own",
                                    "deadbeef 01",
                                    "7",
                                    "{1, 2}",
                                    "{\"short\", \"an element that needs memory of its own\"}"};
    for (const PropertyValue& value : samples()) {
        const std::string text = value;
        EXPECT_EQ(text, expected[value.getKind()]);
    }
    EXPECT_TRUE(observe::records().empty());
}

TEST(PropertyConversion, ToANativeTypeAllocatesNothing)
{
    const PropertyValue number(Number(7u));
    const PropertyValue enumerated(EnumValue(7u));
    unsigned long long sum = 0;
    EXPECT_EQ(allocation::countOf([&] {
                  sum += number.operator unsigned int() + number.operator unsigned long long();
                  sum += static_cast<unsigned int>(number.operator double())
                      + (number.operator bool() ? 1u : 0u);
                  sum += number.operator Number().operator unsigned int();
                  sum += number.operator IC::Version2().major;
                  sum += enumerated.operator unsigned int() + enumerated.operator unsigned long long();
                  sum += static_cast<unsigned int>(enumerated.operator double());
                  sum += enumerated.operator EnumValue().operator unsigned int();
              }),
              0);
    EXPECT_EQ(sum, 64u);
}

TEST(PropertyConversion, AfterARefusedSetKindIsRefusedAsForAnotherKind)
{
    auto values = samples();
    for (PropertyValue& value : values)
        EXPECT_THROW(value.setKind(7), PropertyValueInvalidKind);
    expectRefusal<PropertyValueInvalidKind>(
        [&] { return values[1].operator double(); }, "operator ZQ::Real64", "Property", "Vexilon.IC.Property",
        "PropertyValue:Real64: can't return current value as a Real64, kind=1",
        "Can't return current value as a Number");
    EXPECT_THROW(values[1].operator unsigned long long(), PropertyValueInvalidKind);
    EXPECT_THROW(values[1].operator unsigned int(), PropertyValueInvalidKind);
    EXPECT_THROW(values[1].operator bool(), PropertyValueInvalidKind);
    EXPECT_THROW(values[1].operator Number(), PropertyValueInvalidKind);
    EXPECT_THROW(values[1].operator IC::Version2(), PropertyValueInvalidKind);
    EXPECT_THROW(values[3].operator IC::Buffer(), PropertyValueInvalidKind);
    EXPECT_THROW(values[4].operator double(), PropertyValueInvalidKind);
    EXPECT_THROW(values[4].operator unsigned long long(), PropertyValueInvalidKind);
    EXPECT_THROW(values[4].operator unsigned int(), PropertyValueInvalidKind);
    EXPECT_THROW(values[4].operator EnumValue(), PropertyValueInvalidKind);
    EXPECT_THROW(values[5].operator IC::NumberArray(), PropertyValueInvalidKind);
    EXPECT_THROW(values[6].operator IC::StringArray(), PropertyValueInvalidKind);
    const char* const expected[] = {"unknown", "invalid", "invalid", "invalid",
                                    "invalid", "invalid", "invalid"};
    for (const PropertyValue& value : values)
        EXPECT_EQ(value.operator std::string(), expected[value.getKind()]);
}

// The compilers warn with -Wextra.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wmissing-field-initializers"
template <class Value>
IC::NodeRef inBraces(const Value& value)
{
    return IC::NodeRef {value};
}
#pragma GCC diagnostic pop

template <class Value>
void expectFirstField(const Value& value, unsigned int type)
{
    const IC::NodeRef reference = inBraces(value);
    EXPECT_EQ(reference.type, type);
    EXPECT_EQ(reference.id, 0u);
}

TEST(NodeReferenceInBraces, TakesTheValueForItsFirstField)
{
    expectFirstField(Number(7u), 7);
    expectFirstField(EnumValue(7u), 7);
    expectFirstField(PropertyValue(Number(7u)), 7);
    expectFirstField(IC::Alert(2, 1, {}, 5, "Fan failed"), 5);  // the status
    const Number number(IC::NodeRef {20, 7});
    EXPECT_THROW(inBraces(number), std::out_of_range);
    const IC::NodeRef reference = number;
    EXPECT_EQ(reference.id, 7u);
}

}  // namespace
