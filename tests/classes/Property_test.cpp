#include <atomic>
#include <bitset>
#include <cstddef>
#include <functional>
#include <stdexcept>
#include <string>
#include <type_traits>
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
#include "support/Byte.h"
#include "support/DateTimes.h"
#include "support/PropertySamples.h"

namespace {

using allocation::completesWith;
using allocation::countOf;
using IC::EnumValue;
using IC::Number;
using IC::PropertyValue;
using IC::PropertyValueInvalidKind;

static_assert(std::is_same_v<IC::Buffer, std::vector<unsigned char>>);
static_assert(std::is_same_v<IC::NumberArray, std::vector<IC::Number>>);
static_assert(std::is_same_v<IC::StringArray, std::vector<std::string>>);

static_assert(std::is_same_v<std::underlying_type_t<PropertyValue::KindType>, ZQ::Uint32>);
static_assert(std::is_convertible_v<PropertyValue::KindType, unsigned int>);  // unscoped
static_assert(PropertyValue::KIND_UNKNOWN == 0);
static_assert(PropertyValue::KIND_NUMBER == 1);
static_assert(PropertyValue::KIND_STRING == 2);
static_assert(PropertyValue::KIND_BUFFER == 3);
static_assert(PropertyValue::KIND_ENUMVALUE == 4);
static_assert(PropertyValue::KIND_NUMBERARRAY == 5);
static_assert(PropertyValue::KIND_STRINGARRAY == 6);

static_assert(std::is_trivially_copyable_v<EnumValue>);

static_assert(!std::is_default_constructible_v<PropertyValue>);
static_assert(std::is_copy_constructible_v<PropertyValue>);
static_assert(std::is_copy_assignable_v<PropertyValue>);
static_assert(std::is_nothrow_move_constructible_v<PropertyValue>);
static_assert(std::is_nothrow_move_assignable_v<PropertyValue>);
static_assert(std::is_nothrow_swappable_v<PropertyValue>);
static_assert(noexcept(std::declval<PropertyValue&>().swap(std::declval<PropertyValue&>())));
static_assert(std::is_nothrow_destructible_v<PropertyValue>);

template <class Type>
struct Convertible {
    operator Type() const;
};

// Each constructor takes the value, and optionally the read-only mark.
template <class Value>
constexpr bool makesProperty =
    std::is_constructible_v<PropertyValue, Value>&& std::is_constructible_v<PropertyValue, Value, bool>;
static_assert(makesProperty<const std::string&>);
static_assert(makesProperty<const char*>);
static_assert(makesProperty<const Number&>);
static_assert(makesProperty<const EnumValue&>);
static_assert(makesProperty<const IC::Buffer&>);
static_assert(makesProperty<const IC::NumberArray&>);
static_assert(makesProperty<const IC::StringArray&>);
static_assert(makesProperty<const unsigned char&>);
static_assert(makesProperty<const PropertyValue::KindType&>);

// As arguments, these would silently be converted to a kind code.
static_assert(!std::is_constructible_v<PropertyValue, bool>);
static_assert(!std::is_constructible_v<PropertyValue, bool, bool>);
static_assert(!std::is_constructible_v<PropertyValue, float>);
static_assert(!std::is_constructible_v<PropertyValue, double>);
static_assert(!std::is_constructible_v<PropertyValue, double, bool>);
static_assert(!std::is_constructible_v<PropertyValue, long double>);
static_assert(!std::is_constructible_v<PropertyValue, Number::KindType>);
static_assert(!std::is_constructible_v<PropertyValue, IC::Error::StatusType>);
static_assert(!std::is_constructible_v<PropertyValue, IC::Alert::SeverityType>);
static_assert(!std::is_constructible_v<PropertyValue, IC::Alert::ClassType>);
static_assert(!std::is_constructible_v<PropertyValue, IC::Node::SensorType>);
static_assert(!std::is_constructible_v<PropertyValue, IC::Node::StatusType, bool>);
template <class... Integer>
constexpr bool noneMakesProperty = (!std::is_constructible_v<PropertyValue, Integer> && ...)
    && (!std::is_constructible_v<PropertyValue, Integer, bool> && ...);
static_assert(noneMakesProperty<char, signed char, wchar_t, char16_t, char32_t, short, unsigned short,
                                unsigned int, long, unsigned long, long long, unsigned long long>);
static_assert(noneMakesProperty<const unsigned int&, unsigned int&>);
static_assert(!std::is_assignable_v<PropertyValue&, unsigned int>);
static_assert(makesProperty<int>);  // deprecated
static_assert(noneMakesProperty<std::vector<bool>::reference, std::bitset<8>::reference, std::true_type,
                                std::integral_constant<int, 5>, std::atomic<unsigned int>&,
                                const std::atomic<long long>&, std::reference_wrapper<unsigned int>,
                                std::reference_wrapper<const double>>);

// An object that converts to what a constructor takes, or to a property value, may convert to a number too.
template <class... Types>
struct ConvertsTo : Convertible<Types>... {
};
static_assert(makesProperty<ConvertsTo<std::string>>);
static_assert(makesProperty<ConvertsTo<const char*>>);
static_assert(makesProperty<ConvertsTo<Number>>);
static_assert(makesProperty<ConvertsTo<EnumValue>>);
static_assert(makesProperty<ConvertsTo<IC::StringArray>>);
static_assert(makesProperty<ConvertsTo<PropertyValue::KindType>>);
static_assert(makesProperty<std::reference_wrapper<unsigned char>>);
static_assert(std::is_convertible_v<ConvertsTo<PropertyValue>, PropertyValue>);
static_assert(std::is_convertible_v<ConvertsTo<PropertyValue, unsigned int>, PropertyValue>);
static_assert(std::is_convertible_v<ConvertsTo<const PropertyValue&, unsigned int>, PropertyValue>);
static_assert(makesProperty<IC::NodeRef>);
static_assert(makesProperty<IC::Version2>);
struct OwnText : std::string {
    operator unsigned int() const { return 0; }
};
struct OwnNumber : Number { };
static_assert(makesProperty<OwnText>);
static_assert(makesProperty<OwnNumber>);

// As the mark, these would silently be true or false.
template <class Mark>
constexpr bool isMark = std::is_constructible_v<PropertyValue, const char*, Mark>;
template <class Mark>
constexpr bool isMarkOfAny = isMark<Mark> || std::is_constructible_v<PropertyValue, const std::string&, Mark> || std::is_constructible_v<PropertyValue, const Number&, Mark> || std::is_constructible_v<PropertyValue, const EnumValue&, Mark> || std::is_constructible_v<PropertyValue, IC::Buffer, Mark> || std::is_constructible_v<PropertyValue, IC::NumberArray, Mark> || std::is_constructible_v<PropertyValue, IC::StringArray, Mark> || std::is_constructible_v<PropertyValue, unsigned char, Mark> || std::is_constructible_v<PropertyValue, PropertyValue::KindType, Mark> || std::is_constructible_v<PropertyValue, int, Mark>;
static_assert(!isMarkOfAny<const char*>);
static_assert(!isMarkOfAny<const char (&)[10]>);
static_assert(!isMarkOfAny<std::nullptr_t>);
static_assert(!isMarkOfAny<int>);
static_assert(!isMarkOfAny<unsigned char>);
static_assert(!isMarkOfAny<double>);
static_assert(!isMarkOfAny<PropertyValue::KindType>);
static_assert(!isMarkOfAny<IC::Error::StatusType>);
static_assert(!isMarkOfAny<Number>);
static_assert(!isMarkOfAny<PropertyValue>);
static_assert(isMark<bool> && isMark<bool&> && isMark<const bool&>);
static_assert(isMark<std::vector<bool>::reference> && isMark<const std::vector<bool>::reference&>);

// The functions that replace the object are private.
template <class T, class = void>
constexpr bool offersInitKind = false;
template <class T>
constexpr bool
    offersInitKind<T, std::void_t<decltype(std::declval<T&>().initKind(std::declval<unsigned char>()))>> =
        true;
template <class T, class = void>
constexpr bool offersFreeValue = false;
template <class T>
constexpr bool offersFreeValue<T, std::void_t<decltype(std::declval<T&>().freeValue())>> = true;
template <class T, class = void>
constexpr bool offersFreeValueIfNotSameKind = false;
template <class T>
constexpr bool
    offersFreeValueIfNotSameKind<T, std::void_t<decltype(std::declval<T&>().freeValueIfNotSameKind(1u))>> =
        true;
static_assert(!offersInitKind<PropertyValue>);
static_assert(!offersFreeValue<PropertyValue>);
static_assert(!offersFreeValueIfNotSameKind<PropertyValue>);

constexpr unsigned int kinds = 7;

template <class Operation>
void expectInvalidKind(Operation operation, unsigned int code)
{
    expectRefusal<PropertyValueInvalidKind>(operation, "initKind", "Property", "Vexilon.IC.Property",
                                            "PropertyValue:initKind: invalid kind of property: "
                                                + std::to_string(code),
                                            "Invalid kind of property");
}

std::string between(const PropertyValue& from, const PropertyValue& to)
{
    return "from " + seen(from) + " to " + seen(to);
}

// A date-time whose scope and milliseconds are not the defaults.
Number unusualDateTime()
{
    return Number(dateTime(1234567890, 250, 1));
}

void expectUnusualDateTime(const PropertyValue& value)
{
    EXPECT_EQ(partsOf(value.operator Number().operator ZQ::DateTime()), (DateTimeParts {1234567890, 250, 1}));
}

TEST(PropertyConstructor, MakesAWritableValueOfTheArgumentsKind)
{
    const IC::Version2 version {2, 15};
    const struct {
        PropertyValue value;
        const char* seen;
    } rows[] = {
        {PropertyValue(std::string("abc")), "2 writable: abc"},
        {PropertyValue("abc"), "2 writable: abc"},
        {PropertyValue(Number(3600u)), "1 writable: 3600"},
        {PropertyValue(Number(version)), "1 writable: 2.15"},
        {PropertyValue(EnumValue(4294967295u)), "4 writable: 4294967295"},
        {PropertyValue(IC::Buffer {0x0a, 0xff}), "3 writable: 0aff"},
        {PropertyValue(IC::NumberArray {Number(1u), Number(true)}), "5 writable: {1, true}"},
        {PropertyValue(IC::StringArray {"a", ""}), "6 writable: {\"a\", \"\"}"},
        {PropertyValue(byte(2)), "2 writable: "},
        {PropertyValue(PropertyValue::KIND_ENUMVALUE), "4 writable: 0"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.seen);
        EXPECT_EQ(seen(row.value), row.seen);
        EXPECT_EQ(row.value.operator PropertyValue::KindType(), row.value.getKind());
    }
}

TEST(PropertyConstructor, TakesTheReadOnlyMarkAsItsLastArgument)
{
    const std::string text = "abc";
    const Number number(3600u);
    const EnumValue enumerated(7u);
    const IC::Buffer bytes {0x0a, 0xff};
    const IC::NumberArray numbers {Number(1u)};
    const IC::StringArray texts {"a"};
    for (const bool mark : {false, true}) {
        SCOPED_TRACE(mark);
        const std::string name = mark ? " read-only: " : " writable: ";
        EXPECT_EQ(seen(PropertyValue(text, mark)), "2" + name + "abc");
        EXPECT_EQ(seen(PropertyValue("abc", mark)), "2" + name + "abc");
        EXPECT_EQ(seen(PropertyValue(number, mark)), "1" + name + "3600");
        EXPECT_EQ(seen(PropertyValue(enumerated, mark)), "4" + name + "7");
        EXPECT_EQ(seen(PropertyValue(bytes, mark)), "3" + name + "0aff");
        EXPECT_EQ(seen(PropertyValue(numbers, mark)), "5" + name + "{1}");
        EXPECT_EQ(seen(PropertyValue(texts, mark)), "6" + name + "{\"a\"}");
        EXPECT_EQ(seen(PropertyValue(byte(3), mark)), "3" + name);
        EXPECT_EQ(seen(PropertyValue(PropertyValue::KIND_UNKNOWN, mark)), "0" + name + "unknown");
    }
}

TEST(PropertyConstructor, CopiesItsArgument)
{
    std::string text = "a text that needs memory of its own";
    IC::Buffer bytes {0x0a, 0xff};
    IC::NumberArray numbers {Number(1u)};
    IC::StringArray texts {"a"};
    const PropertyValue fromText(text);
    const PropertyValue fromBytes(bytes);
    const PropertyValue fromNumbers(numbers);
    const PropertyValue fromTexts(texts);
    text[0] = 'A';
    bytes[0] = 0;
    numbers.clear();
    texts[0] = "b";
    EXPECT_EQ(seen(fromText), "2 writable: a text that needs memory of its own");
    EXPECT_EQ(seen(fromBytes), "3 writable: 0aff");
    EXPECT_EQ(seen(fromNumbers), "5 writable: {1}");
    EXPECT_EQ(seen(fromTexts), "6 writable: {\"a\"}");
}

TEST(PropertyConstructor, AcceptsTemporaries)
{
    EXPECT_EQ(seen(PropertyValue(std::string("a text that needs memory of its own"), true)),
              "2 read-only: a text that needs memory of its own");
    EXPECT_EQ(seen(PropertyValue(IC::Buffer {1, 2, 3, 4, 5}, true)), "3 read-only: 01020304 05");
    EXPECT_EQ(seen(PropertyValue(IC::NumberArray {Number(1u), Number(2u)}, true)), "5 read-only: {1, 2}");
    EXPECT_EQ(seen(PropertyValue(IC::StringArray {"a", "b"}, true)), "6 read-only: {\"a\", \"b\"}");
}

TEST(PropertyConstructor, ReusesTheMemoryOfTemporaries)
{
    std::string text = "a text that needs memory of its own";
    IC::Buffer bytes(5, 1);
    IC::NumberArray numbers(3, Number(1u));
    IC::StringArray texts(3, text);
    EXPECT_EQ(countOf([&] { const PropertyValue value(std::move(text)); }), 1);
    EXPECT_EQ(countOf([&] { const PropertyValue value(std::move(bytes)); }), 1);
    EXPECT_EQ(countOf([&] { const PropertyValue value(std::move(numbers)); }), 1);
    EXPECT_EQ(countOf([&] { const PropertyValue value(std::move(texts)); }), 1);
}

TEST(PropertyConstructor, KeepsEveryByteOfAStringButEndsCharactersAtTheFirstNul)
{
    const std::string text("a\0b", 3);
    EXPECT_EQ(PropertyValue(text).operator std::string(), text);
    EXPECT_EQ(PropertyValue(text.c_str()).operator std::string(), "a");
}

TEST(PropertyConstructor, AcceptsEmptyTexts)
{
    EXPECT_EQ(seen(PropertyValue("")), "2 writable: ");
    EXPECT_EQ(seen(PropertyValue(std::string())), "2 writable: ");
}

TEST(PropertyConstructor, ThrowsForANullPointer)
{
    const char* const none = nullptr;
    for (const bool readOnly : {false, true}) {
        EXPECT_THAT([&] { PropertyValue(none, readOnly); },
                    testing::ThrowsMessage<std::logic_error>("a text is a null pointer"));
    }
    EXPECT_TRUE(observe::records().empty());
}

TEST(PropertyConstructor, KeepsAllPartsOfANumber)
{
    expectUnusualDateTime(PropertyValue(unusualDateTime()));
    EXPECT_EQ(seen(PropertyValue(Number(IC::sNodeRef {4, 7}))), "1 writable: CPU:7");
}

#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wdeprecated-declarations"
TEST(PropertyConstructor, TakesAnIntAsAKindCode)
{
    EXPECT_EQ(seen(PropertyValue(5)), "5 writable: {}");
    EXPECT_EQ(seen(PropertyValue(2, true)), "2 read-only: ");
    EXPECT_EQ(seen(PropertyValue(258)), "2 writable: ");  // the low 8 bits
    const PropertyValue assigned = 3;
    EXPECT_EQ(seen(assigned), "3 writable: ");
    expectRefusal<PropertyValueInvalidKind>(
        [] { return PropertyValue(7); }, "initKind", "Property", "Vexilon.IC.Property",
        "PropertyValue:initKind: invalid kind of property: 7", "Invalid kind of property");
}
#pragma GCC diagnostic pop

TEST(PropertyConstructor, TakesTheMarkFromAVectorOfFlags)
{
    std::vector<bool> marks {true, false};
    const std::vector<bool>& constant = marks;
    EXPECT_EQ(seen(PropertyValue("abc", marks[0])), "2 read-only: abc");
    EXPECT_EQ(seen(PropertyValue("abc", marks[1])), "2 writable: abc");
    EXPECT_EQ(seen(PropertyValue("abc", constant[0])), "2 read-only: abc");
}

TEST(PropertyConstructor, TakesTheMarkFromABitField)
{
    struct Flags {
        bool readOnly : 1;
    };
    const Flags flags {true};
    EXPECT_EQ(seen(PropertyValue("abc", flags.readOnly)), "2 read-only: abc");
}

// Keeps the compiler from removing the allocations of an unused value.
void use(const PropertyValue& value)
{
    asm volatile("" : : "r"(&value) : "memory");
}

TEST(PropertyConstructor, GivesBackAllMemoryWhenItRunsOut)
{
    const std::string text = "a text that needs memory of its own";
    const IC::Buffer bytes(5, 1);
    const IC::NumberArray numbers(3, Number(1u));
    const IC::StringArray texts(3, text);
    std::vector<std::function<void()>> constructions = {
        [&] { use(PropertyValue(text)); },       [&] { use(PropertyValue(text.c_str())); },
        [&] { use(PropertyValue(Number(1u))); }, [&] { use(PropertyValue(EnumValue(1u))); },
        [&] { use(PropertyValue(bytes)); },      [&] { use(PropertyValue(numbers)); },
        [&] { use(PropertyValue(texts)); },      [&] { use(PropertyValue(IC::StringArray(2, text))); },
    };
    const auto sources = samples();
    for (unsigned int code = 1; code < kinds; ++code) {
        constructions.push_back([code] { use(PropertyValue(byte(code))); });
        constructions.push_back([&sources, code] { use(PropertyValue(sources[code])); });
    }
    for (std::size_t row = 0; row < constructions.size(); ++row) {
        SCOPED_TRACE(row);
        allocation::expectAllMemoryGivenBack(constructions[row]);
    }
}

TEST(PropertyKind, HasAnInitialValueForEachKind)
{
    const struct {
        unsigned int code;
        const char* seen;
    } rows[] = {{0, "0 writable: unknown"}, {1, "1 writable: unknown"}, {2, "2 writable: "},
                {3, "3 writable: "},        {4, "4 writable: 0"},       {5, "5 writable: {}"},
                {6, "6 writable: {}"}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.seen);
        EXPECT_EQ(seen(PropertyValue(byte(row.code))), row.seen);
        EXPECT_EQ(seen(PropertyValue(static_cast<PropertyValue::KindType>(row.code))), row.seen);
        PropertyValue changed(byte(row.code == 4 ? 2 : 4));
        changed.setKind(byte(row.code));
        EXPECT_EQ(seen(changed), row.seen);
    }
    EXPECT_EQ(PropertyValue(PropertyValue::KIND_NUMBER).operator Number().getKind(), Number::KIND_UNKNOWN);
    EXPECT_TRUE(observe::records().empty());
}

TEST(PropertyKind, AllocatesAnInitialValueOfItsType)
{
    const struct {
        PropertyValue::KindType kind;
        std::size_t bytes;
    } rows[] = {{PropertyValue::KIND_NUMBER, sizeof(Number)},
                {PropertyValue::KIND_STRING, sizeof(std::string)},
                {PropertyValue::KIND_BUFFER, sizeof(IC::Buffer)},
                {PropertyValue::KIND_ENUMVALUE, sizeof(EnumValue)},
                {PropertyValue::KIND_NUMBERARRAY, sizeof(IC::NumberArray)},
                {PropertyValue::KIND_STRINGARRAY, sizeof(IC::StringArray)}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.kind);
        allocation::latestSize = 0;
        const PropertyValue value(row.kind);
        EXPECT_EQ(allocation::latestSize, row.bytes);
    }
}

TEST(PropertyKind, RefusesEveryCodeAboveSix)
{
    for (unsigned int code = kinds; code <= 255; ++code) {
        SCOPED_TRACE(code);
        expectInvalidKind([&] { return PropertyValue(byte(code)); }, code);
        expectInvalidKind([&] { return PropertyValue(byte(code), true); }, code);
    }
}

TEST(PropertyKind, UsesOnlyTheLowEightBits)
{
    for (const unsigned int high : {0u, 0x100u, 0xFFFFFF00u}) {
        for (unsigned int low = 0; low <= 255; ++low) {
            const auto kind = static_cast<PropertyValue::KindType>(high | low);
            SCOPED_TRACE(high | low);
            if (low < kinds)
                EXPECT_EQ(PropertyValue(kind).getKind(), low);
            else
                expectInvalidKind([&] { return PropertyValue(kind); }, low);
        }
    }
}

TEST(PropertyKind, ChangeToTheSameKindKeepsTheValue)
{
    for (const bool mark : {false, true}) {
        for (const PropertyValue& original : samples(mark)) {
            PropertyValue value(original);
            value.setKind(byte(value.getKind()));
            EXPECT_EQ(seen(value), seen(original));
        }
    }
    PropertyValue text("abc");
    text.setKind(2);
    EXPECT_EQ(seen(text), "2 writable: abc");
}

TEST(PropertyKind, ChangeGivesTheInitialValueOfTheNewKindAndKeepsTheMark)
{
    for (const bool mark : {false, true}) {
        for (const PropertyValue& original : samples(mark)) {
            for (unsigned int code = 0; code < kinds; ++code) {
                if (code == original.getKind())
                    continue;
                SCOPED_TRACE(seen(original) + " to " + std::to_string(code));
                PropertyValue value(original);
                value.setKind(byte(code));
                EXPECT_EQ(seen(value), seen(PropertyValue(byte(code), mark)));
            }
        }
    }
    EXPECT_TRUE(observe::records().empty());
}

TEST(PropertyKind, ChangeKeepsTheOldValueWhenMemoryRunsOut)
{
    for (const bool mark : {false, true}) {
        for (const PropertyValue& original : samples(mark)) {
            for (unsigned int code = 0; code < kinds; ++code) {
                SCOPED_TRACE(seen(original) + " to " + std::to_string(code));
                for (long allowed = 0;; ++allowed) {
                    ASSERT_LT(allowed, 100);
                    PropertyValue value(original);
                    if (completesWith(allowed, [&] { value.setKind(byte(code)); })) {
                        EXPECT_EQ(allowed > 0, code != 0 && code != original.getKind());
                        EXPECT_EQ(value.getKind(), code);
                        break;
                    }
                    EXPECT_EQ(seen(value), seen(original));
                }
            }
        }
    }
}

TEST(PropertyKind, RefusedChangeKeepsKindAndMarkAndAllowsAnotherChange)
{
    for (const bool mark : {false, true}) {
        for (const PropertyValue& original : samples(mark)) {
            for (const unsigned int refused : {7u, 8u, 128u, 255u}) {
                SCOPED_TRACE(seen(original) + " to " + std::to_string(refused));
                PropertyValue value(original);
                expectInvalidKind([&] { value.setKind(byte(refused)); }, refused);
                EXPECT_EQ(value.getKind(), original.getKind());
                EXPECT_EQ(value.readOnly(), mark);

                const unsigned int next = original.getKind() == 6 ? 5 : original.getKind() + 1;
                value.setKind(byte(next));
                EXPECT_EQ(seen(value), seen(PropertyValue(byte(next), mark)));
            }
        }
    }
}

TEST(PropertyKind, RefusedChangeLeavesAValueThatCanBeDestroyed)
{
    for (unsigned int refused = kinds; refused <= 255; ++refused) {
        PropertyValue value("a text that needs memory of its own");
        expectInvalidKind([&] { value.setKind(byte(refused)); }, refused);
    }
}

TEST(PropertyKind, RefusedChangeCanBeRefusedAgain)
{
    for (const PropertyValue& original : samples()) {
        SCOPED_TRACE(seen(original));
        PropertyValue value(original);
        expectInvalidKind([&] { value.setKind(7); }, 7);
        expectInvalidKind([&] { value.setKind(255); }, 255);
        EXPECT_EQ(value.getKind(), original.getKind());
    }
}

TEST(PropertyKind, RefusedChangeLeavesAValueThatCanBeAssigned)
{
    for (const PropertyValue& original : samples()) {
        for (const PropertyValue& source : otherSamples(true)) {
            SCOPED_TRACE(between(source, original));
            PropertyValue value(original);
            expectInvalidKind([&] { value.setKind(7); }, 7);
            value = source;
            EXPECT_EQ(seen(value), seen(source));
        }
    }
}

TEST(PropertyKind, RefusedChangeLeavesAValueThatCanBeCopiedMovedAndSwapped)
{
    for (const PropertyValue& original : samples(true)) {
        SCOPED_TRACE(seen(original));
        PropertyValue value(original);
        EXPECT_THROW(value.setKind(7), PropertyValueInvalidKind);
        const std::string left = seen(value);

        EXPECT_EQ(seen(PropertyValue(value)), left);
        for (const PropertyValue& old : otherSamples()) {
            PropertyValue target(old);
            target = value;  // also where the target has the same kind
            EXPECT_EQ(seen(target), left);
        }
        PropertyValue other("other");
        other.swap(value);
        EXPECT_EQ(seen(other), left);
        EXPECT_EQ(seen(value), "2 writable: other");
        const PropertyValue moved(std::move(other));
        EXPECT_EQ(seen(moved), left);
    }
}

TEST(PropertyKind, RefusedChangeOfKindUnknownChangesNothing)
{
    PropertyValue value(PropertyValue::KIND_UNKNOWN, true);
    expectInvalidKind([&] { value.setKind(7); }, 7);
    EXPECT_EQ(seen(value), "0 read-only: unknown");
}

TEST(PropertyCopy, HasTheKindValueAndMarkOfTheSource)
{
    for (const bool mark : {false, true}) {
        for (const PropertyValue& source : samples(mark)) {
            const PropertyValue copy(source);
            EXPECT_EQ(seen(copy), seen(source));
            EXPECT_TRUE(copy == source);
        }
    }
    const PropertyValue source(unusualDateTime());
    expectUnusualDateTime(PropertyValue(source));
}

TEST(PropertyCopy, IsIndependentOfItsSource)
{
    const auto others = otherSamples();
    for (PropertyValue& source : std::vector<PropertyValue>(samples())) {
        const std::string before = seen(source);
        SCOPED_TRACE(before);
        PropertyValue copy(source);
        source = others[source.getKind()];
        EXPECT_EQ(seen(copy), before);
        source.setKind(byte(source.getKind() == 2 ? 3 : 2));
        EXPECT_EQ(seen(copy), before);
        copy = PropertyValue("changed", true);
        EXPECT_EQ(source.readOnly(), false);
        EXPECT_NE(seen(source), seen(copy));
    }
}

TEST(PropertyCopy, OfANumberArrayIsIndependent)
{
    PropertyValue first(IC::NumberArray {Number(1u), Number(2u)});
    const PropertyValue second(first);
    first = PropertyValue(IC::NumberArray {Number(3u)});
    EXPECT_EQ(seen(first), "5 writable: {3}");
    EXPECT_EQ(seen(second), "5 writable: {1, 2}");
}

TEST(PropertyCopy, AllocatesOnceForEachObjectThatItOwns)
{
    // One for the object of the kind, one for its characters or elements, and one for each long element.
    const long expected[] = {0, 1, 2, 2, 1, 2, 3};
    for (const PropertyValue& source : samples()) {
        SCOPED_TRACE(seen(source));
        EXPECT_EQ(countOf([&] { const PropertyValue copy(source); }), expected[source.getKind()]);
    }
}

TEST(PropertyAssignment, CopiesKindValueAndMark)
{
    for (const bool targetMark : {false, true}) {
        for (const bool sourceMark : {false, true}) {
            for (const PropertyValue& old : samples(targetMark)) {
                for (const PropertyValue& source : otherSamples(sourceMark)) {
                    SCOPED_TRACE(between(source, old));
                    const std::string before = seen(source);
                    PropertyValue target(old);
                    EXPECT_EQ(&(target = source), &target);
                    EXPECT_EQ(seen(target), before);
                    EXPECT_EQ(seen(source), before);
                }
            }
        }
    }
    EXPECT_TRUE(observe::records().empty());
}

TEST(PropertyAssignment, IsADeepCopy)
{
    for (const PropertyValue& old : samples()) {
        for (PropertyValue& source : std::vector<PropertyValue>(otherSamples(true))) {
            SCOPED_TRACE(between(source, old));
            const std::string before = seen(source);
            PropertyValue target(old);
            target = source;
            source = PropertyValue("a changed text that needs memory of its own");
            EXPECT_EQ(seen(target), before);
        }
    }
}

TEST(PropertyAssignment, KeepsAllPartsOfANumber)
{
    const PropertyValue source(unusualDateTime());
    const PropertyValue nodeRef(Number(IC::sNodeRef {4, 7}));
    for (const PropertyValue& old : samples()) {
        SCOPED_TRACE(seen(old));
        PropertyValue target(old);
        target = source;
        expectUnusualDateTime(target);
        target = nodeRef;
        EXPECT_EQ(seen(target), "1 writable: CPU:7");
    }
}

TEST(PropertyAssignment, ToItselfChangesNothing)
{
    for (const bool mark : {false, true}) {
        for (PropertyValue& value : std::vector<PropertyValue>(samples(mark))) {
            const std::string before = seen(value);
            const PropertyValue& itself = value;
            EXPECT_EQ(&(value = itself), &value);
            EXPECT_EQ(seen(value), before);
        }
    }
}

TEST(PropertyAssignment, ToItselfAllocatesNothingAndMoveToItselfKeepsTheValue)
{
    for (PropertyValue& value : std::vector<PropertyValue>(samples(true))) {
        const std::string before = seen(value);
        PropertyValue& itself = value;
        EXPECT_EQ(countOf([&] { value = itself; }), 0);
        EXPECT_EQ(seen(value), before);
        value = std::move(itself);
        EXPECT_EQ(seen(value), before);
    }
}

TEST(PropertyAssignment, OfBytesAndNumbersUsesTheRoomThatIsThere)
{
    const auto expectInPlace = [](PropertyValue longer, const PropertyValue& shorter) {
        EXPECT_EQ(allocation::countOf([&] { longer = shorter; }), 0);
        EXPECT_EQ(longer, shorter);
        EXPECT_TRUE(longer.readOnly());
    };
    expectInPlace(PropertyValue(IC::Buffer(64, 1)), PropertyValue(IC::Buffer(64, 2), true));
    expectInPlace(PropertyValue(IC::Buffer(64, 1)), PropertyValue(IC::Buffer(), true));
    expectInPlace(PropertyValue(IC::NumberArray(100, Number(1u))),
                  PropertyValue(IC::NumberArray(99, Number(-0.5)), true));
}

TEST(PropertyAssignment, KeepsTheOldValueWhenMemoryRunsOut)
{
    const auto sources = otherSamples(true);
    for (const PropertyValue& old : samples(false)) {
        for (const PropertyValue& source : sources) {
            SCOPED_TRACE(between(source, old));
            for (long allowed = 0;; ++allowed) {
                ASSERT_LT(allowed, 100);
                PropertyValue target(old);
                if (completesWith(allowed, [&] { target = source; })) {
                    EXPECT_EQ(seen(target), seen(source));
                    if (source.getKind() != old.getKind()) {
                        EXPECT_EQ(allowed > 0, source.getKind() != 0);
                    }
                    break;
                }
                EXPECT_EQ(seen(target), seen(old)) << "with memory for " << allowed << " allocations";
            }
        }
    }
}

TEST(PropertyAssignment, KeepsEveryElementWhenMemoryForALongerOneRunsOut)
{
    // The target's array has room for two elements, but its elements have no room for the longer texts.
    const std::string longer = "an element that needs memory of its own";
    const PropertyValue source(IC::StringArray {longer, longer}, true);
    PropertyValue target(IC::StringArray {"a", "b", "c"});
    const std::string before = seen(target);
    for (long allowed = 0;; ++allowed) {
        ASSERT_LT(allowed, 100);
        if (completesWith(allowed, [&] { target = source; }))
            break;
        EXPECT_EQ(seen(target), before) << "with memory for " << allowed << " allocations";
    }
    EXPECT_EQ(seen(target), seen(source));
}

TEST(PropertyAssignment, GivesBackAllMemory)
{
    const auto sources = otherSamples(true);
    for (const PropertyValue& old : samples(false)) {
        for (const PropertyValue& source : sources) {
            SCOPED_TRACE(between(source, old));
            const long before = allocation::aliveNow;
            for (long allowed = 0; allowed < 20; ++allowed) {
                PropertyValue target(old);
                completesWith(allowed, [&] { target = source; });
            }
            EXPECT_TRUE(allocation::aliveNow == before || allocation::vectorsLeak);
        }
    }
}

TEST(PropertyMove, TransfersTheValueWithoutAllocationAndLeavesKindUnknown)
{
    for (const bool mark : {false, true}) {
        for (const PropertyValue& original : samples(mark)) {
            SCOPED_TRACE(seen(original));
            PropertyValue source(original);
            const long before = allocation::madeSoFar;
            const PropertyValue target(std::move(source));
            EXPECT_EQ(allocation::madeSoFar, before);
            EXPECT_EQ(seen(target), seen(original));
            EXPECT_EQ(source.getKind(), PropertyValue::KIND_UNKNOWN);
            EXPECT_EQ(source.operator std::string(), "unknown");
        }
    }
}

TEST(PropertyMove, AssignmentWorksBetweenAllKinds)
{
    for (const bool targetMark : {false, true}) {
        for (const bool sourceMark : {false, true}) {
            for (const PropertyValue& old : samples(targetMark)) {
                for (const PropertyValue& original : otherSamples(sourceMark)) {
                    SCOPED_TRACE(between(original, old));
                    PropertyValue target(old);
                    PropertyValue source(original);
                    EXPECT_EQ(countOf([&] { target = std::move(source); }), 0);
                    EXPECT_EQ(seen(target), seen(original));
                    EXPECT_EQ(source.getKind(), PropertyValue::KIND_UNKNOWN);
                    EXPECT_EQ(source.operator std::string(), "unknown");
                }
            }
        }
    }
}

TEST(PropertyMove, LeavesAValueThatCanBeUsedAgain)
{
    for (const PropertyValue& original : samples()) {
        SCOPED_TRACE(seen(original));
        PropertyValue source(original);
        const PropertyValue target(std::move(source));
        source = PropertyValue("again", true);
        EXPECT_EQ(seen(source), "2 read-only: again");
        const PropertyValue next(std::move(source));
        source.setKind(6);
        EXPECT_EQ(source.getKind(), PropertyValue::KIND_STRINGARRAY);
        EXPECT_EQ(source.operator std::string(), "{}");
    }
}

TEST(PropertySwap, ExchangesEverythingAndAllocatesNothing)
{
    for (const PropertyValue& first : samples(false)) {
        for (const PropertyValue& second : otherSamples(true)) {
            SCOPED_TRACE(between(first, second));
            PropertyValue a(first);
            PropertyValue b(second);
            EXPECT_EQ(countOf([&] { a.swap(b); }), 0);
            EXPECT_EQ(seen(a), seen(second));
            EXPECT_EQ(seen(b), seen(first));
            EXPECT_EQ(countOf([&] {
                          using std::swap;
                          swap(a, b);
                      }),
                      0);
            EXPECT_EQ(seen(a), seen(first));
            EXPECT_EQ(seen(b), seen(second));
        }
    }
}

TEST(PropertySwap, WithItselfChangesNothing)
{
    for (PropertyValue& value : std::vector<PropertyValue>(samples(true))) {
        const std::string before = seen(value);
        value.swap(value);
        EXPECT_EQ(seen(value), before);
    }
}

}  // namespace
