#include <algorithm>
#include <array>
#include <cfenv>
#include <cmath>
#include <cstddef>
#include <cstring>
#include <ctime>
#include <iomanip>
#include <limits>
#include <locale>
#include <new>
#include <sstream>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "IC/Number.h"
#include "ZQ/DateTime.h"
#include "observe/Refusal.h"
#include "support/AllocationFailure.h"
#include "support/Byte.h"
#include "support/DateTimes.h"
#include "support/GroupingLocale.h"
#include "support/SensorNames.h"

// What programs that were compiled with an older header call, for these kinds too.
namespace older {
ZQ::Uint32 toUint32(const IC::Number* number, const char* function) asm("_ZNK2IC6Number8toUint32EPKc");
ZQ::Uint64 toUint64(const IC::Number* number) asm("_ZNK2IC6Number8toUint64Ev");
ZQ::Real64 toReal(const IC::Number* number) asm("_ZNK2IC6Number6toRealEv");
bool equal(const IC::Number& a, const IC::Number& b) asm("_ZN2IC6Number5equalERKS0_S2_");
}  // namespace older

namespace {

using IC::Number;
using IC::sNodeRef;
using IC::Version2;
using testing::ElementsAre;
using testing::IsEmpty;

static_assert(std::is_same_v<std::underlying_type_t<Number::KindType>, ZQ::Uint32>);
static_assert(Number::KIND_UNKNOWN == 0);
static_assert(Number::KIND_BOOL == 1);
static_assert(Number::KIND_INT == 2);
static_assert(Number::KIND_UINT32 == 3);
static_assert(Number::KIND_UINT64 == 4);
static_assert(Number::KIND_REAL == 5);
static_assert(Number::KIND_NAN == 6);
static_assert(Number::KIND_INFINITY == 7);
static_assert(Number::KIND_VERSION == 8);
static_assert(Number::KIND_DATETIME == 9);
static_assert(Number::KIND_NODEREF == 10);

static_assert(!std::is_default_constructible_v<Number>);
static_assert(std::is_trivially_copyable_v<Number>);
static_assert(std::is_trivially_destructible_v<Number>);
static_assert(std::is_copy_assignable_v<Number>);

// A pointer would silently be converted to a flag.
static_assert(!std::is_constructible_v<Number, const char*>);
static_assert(!std::is_constructible_v<Number, char*>);
static_assert(!std::is_constructible_v<Number, int*>);
static_assert(!std::is_constructible_v<Number, void*>);
static_assert(!std::is_constructible_v<Number, const Number*>);
static_assert(!std::is_constructible_v<Number, void (*)()>);
static_assert(!std::is_constructible_v<Number, const char (&)[5]>);
static_assert(!std::is_constructible_v<Number, std::nullptr_t>);

static_assert(std::is_aggregate_v<Version2> && std::is_trivially_copyable_v<Version2>);
static_assert(sizeof(Version2) == 2 && offsetof(Version2, major) == 0 && offsetof(Version2, minor) == 1);
static_assert(std::is_same_v<decltype(Version2::major), ZQ::Uint8>);
static_assert(std::is_same_v<decltype(Version2::minor), ZQ::Uint8>);
static_assert(std::is_aggregate_v<sNodeRef> && std::is_trivially_copyable_v<sNodeRef>);
static_assert(sizeof(sNodeRef) == 8 && offsetof(sNodeRef, type) == 0 && offsetof(sNodeRef, id) == 4);
static_assert(std::is_same_v<decltype(sNodeRef::type), ZQ::Uint32>);
static_assert(std::is_same_v<decltype(sNodeRef::id), ZQ::Uint32>);
static_assert(std::is_same_v<IC::NodeRef, sNodeRef>);

static_assert(std::is_same_v<decltype(IC::pst), const std::string[75]>);

// setKind keeps the bytes in storage, so the value that they mean in the new kind depends on the byte order.
constexpr bool littleEndian = __BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__;
static_assert(littleEndian || __BYTE_ORDER__ == __ORDER_BIG_ENDIAN__);

constexpr double infinity = std::numeric_limits<double>::infinity();
constexpr double notANumber = std::numeric_limits<double>::quiet_NaN();
constexpr double smallest = std::numeric_limits<double>::denorm_min();
constexpr double largest = std::numeric_limits<double>::max();
constexpr long longSmallest = std::numeric_limits<long>::min();
constexpr long longLargest = std::numeric_limits<long>::max();
constexpr bool longHas64Bits = sizeof(long) == sizeof(ZQ::Uint64);
static_assert(longHas64Bits || sizeof(long) == sizeof(ZQ::Uint32));
constexpr int intSmallest = std::numeric_limits<int>::min();
constexpr int intLargest = std::numeric_limits<int>::max();

double below(double value)
{
    return std::nextafter(value, -infinity);
}

double above(double value)
{
    return std::nextafter(value, infinity);
}

constexpr Number::KindType kind(ZQ::Uint32 code)
{
    return static_cast<Number::KindType>(code);
}

template <class T>
T to(const Number& number)
{
    return number;
}

std::string text(const Number& number)
{
    return number;
}

std::pair<unsigned int, unsigned int> parts(const Version2& version)
{
    return {version.major, version.minor};
}

std::pair<ZQ::Uint32, ZQ::Uint32> parts(const sNodeRef& reference)
{
    return {reference.type, reference.id};
}

std::pair<unsigned int, unsigned int> version(unsigned int major, unsigned int minor)
{
    return {major, minor};
}

// The number with another kind code.
Number withKind(Number number, unsigned int code)
{
    number.setKind(byte(code));
    return number;
}

// The number after a refused initKind, which stores the kind code all the same.
Number withRefusedKind(Number number, ZQ::Uint32 code)
{
    EXPECT_THROW(number.initKind(kind(code)), std::invalid_argument);
    return number;
}

// Valid and invalid kind codes. A refused initKind can store the invalid ones.
constexpr ZQ::Uint32 kindCodes[] = {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 255, 256, 4294967295};

// A number of any kind code. Its content is in the range of every conversion that accepts the kind.
Number ofKind(ZQ::Uint32 code)
{
    // Not a date-time for KIND_UINT64: with a 32-bit long, its milliseconds make the 64-bit integer too large.
    const Number number = code == Number::KIND_UINT64 ? Number(5ull) : Number(5L, 250);
    return code <= 10 ? withKind(number, code) : withRefusedKind(number, code);
}

using Bytes = std::array<unsigned char, sizeof(Number)>;

// The bytes of the number; the padding between kind and content is undefined and given as 0.
Bytes bytesOf(const Number& number)
{
    Bytes bytes;
    std::memcpy(bytes.data(), &number, sizeof number);
    std::fill(bytes.begin() + sizeof(Number::KindType), bytes.begin() + alignof(Number),
              static_cast<ZQ::Uint8>(0));
    return bytes;
}

template <class Exception, class Operation>
void expectNumberRefusal(Operation operation, const std::string& function, const std::string& logged,
                         const std::string& sentence)
{
    expectRefusal<Exception>(operation, function, "Number", "Vexilon.IC.Number", logged, sentence);
}

template <class T>
void expectConversionRefused(const Number& number, const std::string& function, const std::string& logged,
                             const std::string& sentence)
{
    const Bytes before = bytesOf(number);
    expectNumberRefusal<std::out_of_range>([&] { return to<T>(number); }, function, logged, sentence);
    EXPECT_EQ(bytesOf(number), before);
}

// ---- Construction and kinds

TEST(NumberConstruction, TheTypeDecidesTheKind)
{
    EXPECT_EQ(Number(true).getKind(), Number::KIND_BOOL);
    EXPECT_EQ(Number(-5).getKind(), Number::KIND_INT);
    EXPECT_EQ(Number(5u).getKind(), Number::KIND_UINT32);
    EXPECT_EQ(Number(5ull).getKind(), Number::KIND_UINT64);
    EXPECT_EQ(Number(5.0).getKind(), Number::KIND_REAL);
    EXPECT_EQ(Number(Version2 {2, 15}).getKind(), Number::KIND_VERSION);
    EXPECT_EQ(Number(5L, 250).getKind(), Number::KIND_DATETIME);
    EXPECT_EQ(Number(ZQ::DateTime(5, 1)).getKind(), Number::KIND_DATETIME);
    EXPECT_EQ(Number(sNodeRef {4, 7}).getKind(), Number::KIND_NODEREF);
    EXPECT_THAT(observe::records(), IsEmpty());
}

TEST(NumberConstruction, NarrowerTypesWidenToIntAndDouble)
{
    const short narrow = -5;
    const unsigned short narrowUnsigned = 65535;
    EXPECT_EQ(Number(narrow).getKind(), Number::KIND_INT);
    EXPECT_EQ(Number(narrowUnsigned).getKind(), Number::KIND_INT);
    EXPECT_EQ(to<int>(Number(narrowUnsigned)), 65535);
    EXPECT_EQ(Number('a').getKind(), Number::KIND_INT);
    EXPECT_EQ(Number(0.5f).getKind(), Number::KIND_REAL);
}

TEST(NumberConstruction, NaNAndInfinityAreReals)
{
    EXPECT_EQ(Number(notANumber).getKind(), Number::KIND_REAL);
    EXPECT_EQ(Number(infinity).getKind(), Number::KIND_REAL);
    EXPECT_EQ(Number(-infinity).getKind(), Number::KIND_REAL);
}

TEST(NumberConstruction, TheKindConversionEqualsGetKind)
{
    for (const ZQ::Uint32 code : kindCodes) {
        SCOPED_TRACE(code);
        const Number number = ofKind(code);
        EXPECT_EQ(number.getKind(), code);
        const Number::KindType converted = number;
        EXPECT_EQ(converted, number.getKind());
    }
}

TEST(NumberConstruction, SecondsAndMillisecondsGetScopeThree)
{
    // Only with a 64-bit long is this past 32 bits.
    constexpr auto past32Bits = static_cast<long>(2147483648);
    const DateTimeParts rows[] = {{1234567890, 250, 3},   {0, 0, 3},          {-1, 999, 3},
                                  {2147483647, 1, 3},     {past32Bits, 1, 3}, {longLargest, 65535, 3},
                                  {longSmallest, 1000, 3}};
    for (const DateTimeParts& row : rows) {
        SCOPED_TRACE(row.seconds);
        const Number number(row.seconds, static_cast<unsigned short>(row.milliseconds));
        EXPECT_EQ(partsOf(to<ZQ::DateTime>(number)), row);
    }
}

TEST(NumberConstruction, ADateTimeKeepsEightBitsOfScopeAndSixteenOfMilliseconds)
{
    const struct {
        DateTimeParts given;
        DateTimeParts kept;
    } rows[] = {{{1234567890, 250, 1}, {1234567890, 250, 1}},
                {{1234567890, 999, 2}, {1234567890, 999, 2}},
                {{-5, 0, 3}, {-5, 0, 3}},
                {{5, 65535, 257}, {5, 65535, 1}},
                {{5, 65536, 258}, {5, 0, 2}},
                {{5, 65786, 0xFFFFFF03}, {5, 250, 3}},
                {{longLargest, 7, 3}, {longLargest, 7, 3}},
                {{longSmallest, 7, 3}, {longSmallest, 7, 3}}};
    for (const auto& row : rows) {
        std::ostringstream name;
        name << row.given;
        SCOPED_TRACE(name.str());
        const Number number(dateTime(row.given.seconds, row.given.milliseconds, row.given.scope));
        EXPECT_EQ(partsOf(to<ZQ::DateTime>(number)), row.kept);
    }
    EXPECT_EQ(text(Number(dateTime(5, 0, 256))), "5/0");
    EXPECT_EQ(text(Number(dateTime(5, 0, 511))), "5/255");
}

// Expects what initKind stores for the kinds that it accepts, except KIND_DATETIME.
void expectInitialContent(const Number& number)
{
    switch (number.getKind()) {
    case Number::KIND_UNKNOWN:
        EXPECT_EQ(text(number), "unknown");
        break;
    case Number::KIND_BOOL:
        EXPECT_EQ(to<bool>(number), false);
        break;
    case Number::KIND_UINT32:
        EXPECT_EQ(to<unsigned int>(number), 0u);
        break;
    case Number::KIND_UINT64:
        EXPECT_EQ(to<unsigned long long>(number), 0u);
        break;
    case Number::KIND_REAL:
        EXPECT_EQ(to<double>(number), 0.0);
        EXPECT_FALSE(std::signbit(to<double>(number)));
        break;
    case Number::KIND_NAN:
        EXPECT_EQ(text(number), "not a number");
        break;
    case Number::KIND_INFINITY:
        EXPECT_EQ(text(number), "infinity");
        break;
    case Number::KIND_VERSION:
        EXPECT_EQ(parts(to<Version2>(number)), version(0, 0));
        break;
    default:
        ADD_FAILURE() << "kind " << number.getKind() << " has no initial content";
    }
}

constexpr unsigned int kindsWithZeroContent[] = {0, 1, 3, 4, 5, 6, 7, 8};

TEST(NumberConstruction, AKindCodeGivesTheInitialContentOfTheKind)
{
    for (const unsigned int code : kindsWithZeroContent) {
        SCOPED_TRACE(code);
        const Number fromCode(byte(code));
        EXPECT_EQ(fromCode.getKind(), code);
        expectInitialContent(fromCode);
        const Number fromKind(kind(code));
        EXPECT_EQ(fromKind.getKind(), code);
        expectInitialContent(fromKind);
    }
    EXPECT_THAT(observe::records(), IsEmpty());
}

void expectNow(const Number& number, std::time_t before)
{
    EXPECT_EQ(number.getKind(), Number::KIND_DATETIME);
    const DateTimeParts now = partsOf(to<ZQ::DateTime>(number));
    EXPECT_GE(now.seconds, before);
    EXPECT_LE(now.seconds, std::time(nullptr));
    EXPECT_EQ(now.milliseconds, 0u);
    EXPECT_EQ(now.scope, 3u);
}

TEST(NumberConstruction, TheInitialDateTimeIsTheSystemTimeInWholeSeconds)
{
    const std::time_t before = std::time(nullptr);
    expectNow(Number(byte(9)), before);
    expectNow(Number(Number::KIND_DATETIME), before);
    Number number(dateTime(5, 250, 1));
    number.initKind(Number::KIND_DATETIME);
    expectNow(number, before);
    EXPECT_EQ(observe::clockReadings(), 0);
}

TEST(NumberConstruction, AKindCodeOfElevenOrMoreIsRefused)
{
    for (unsigned int code = 11; code <= 255; ++code) {
        SCOPED_TRACE(code);
        expectNumberRefusal<std::invalid_argument>([&] { return Number(byte(code)); }, "Number",
                                                   "Number: wrong kind of number: " + std::to_string(code),
                                                   "Invalid kind of number");
    }
}

TEST(NumberConstruction, TheCodesOfIntAndNodeReferenceAreRefusedByInitKind)
{
    expectNumberRefusal<std::invalid_argument>([] { return Number(byte(2)); }, "initKind",
                                               "initkind: invalid kind of number 2",
                                               "Invalid kind of number");
    expectNumberRefusal<std::invalid_argument>([] { return Number(byte(10)); }, "initKind",
                                               "initkind: invalid kind of number 10",
                                               "Invalid kind of number");
}

const struct {
    ZQ::Uint32 code;
    const char* logged;
} kindsRefusedByInitKind[] = {{2, "initkind: invalid kind of number 2"},
                              {10, "initkind: invalid kind of number 10"},
                              {11, "initkind: invalid kind of number 11"},
                              {12, "initkind: invalid kind of number 12"},
                              {256, "initkind: invalid kind of number 256"},
                              {259, "initkind: invalid kind of number 259"},
                              {4294967295, "initkind: invalid kind of number 4294967295"}};

TEST(NumberConstruction, InvalidKindsAreRefusedByInitKind)
{
    for (const auto& row : kindsRefusedByInitKind) {
        SCOPED_TRACE(row.code);
        expectNumberRefusal<std::invalid_argument>([&] { return Number(kind(row.code)); }, "initKind",
                                                   row.logged, "Invalid kind of number");
    }
}

TEST(NumberConstruction, TheNodeReferenceIsZeroForOtherKinds)
{
    const std::pair<const char*, Number> rows[] = {
        {"flag", Number(true)},          {"int", Number(-1)},
        {"uint32", Number(4294967295u)}, {"uint64", Number(18446744073709551615ull)},
        {"real", Number(-0.1)},          {"version", Number(Version2 {255, 255})},
        {"seconds", Number(-1L, 999)},   {"date-time", Number(dateTime(-1, 999, 2))},
        {"code", Number(byte(9))},       {"kind", Number(Number::KIND_REAL)}};
    for (const auto& [name, number] : rows) {
        SCOPED_TRACE(name);
        EXPECT_EQ(parts(to<sNodeRef>(withKind(number, 10))), parts(sNodeRef {0, 0}));
    }
}

// One number from each constructor, constructed in storage that was filled before.
std::vector<Number> builtOver(unsigned char filling)
{
    alignas(Number) unsigned char storage[sizeof(Number)];
    std::vector<Number> numbers;
    const auto build = [&](const auto&... arguments) {
        std::memset(storage, filling, sizeof storage);
        numbers.push_back(*::new (storage) Number(arguments...));
    };
    build(true);
    build(-5);
    build(5u);
    build(5ull);
    build(0.1);
    build(Version2 {2, 15});
    build(5L, static_cast<unsigned short>(250));
    build(dateTime(5, 250, 2));
    build(sNodeRef {4, 7});
    for (const unsigned int code : kindsWithZeroContent) {
        build(byte(code));
        build(kind(code));
    }
    return numbers;
}

TEST(NumberConstruction, EveryByteOfTheValueIsDefined)
{
    const std::vector<Number> overZeros = builtOver(0x00);
    const std::vector<Number> overOnes = builtOver(0xFF);
    ASSERT_EQ(overZeros.size(), overOnes.size());
    for (std::size_t i = 0; i < overZeros.size(); ++i) {
        for (unsigned int code = 0; code <= 10; ++code) {
            SCOPED_TRACE("constructor " + std::to_string(i) + ", read as kind " + std::to_string(code));
            const Number a = withKind(overZeros[i], code);
            const Number b = withKind(overOnes[i], code);
            EXPECT_EQ(text(a), text(b));
            if (code == Number::KIND_REAL)
                EXPECT_TRUE(a == b || (std::isnan(to<double>(a)) && std::isnan(to<double>(b))));
            else
                EXPECT_TRUE(a == b);
        }
    }
}

TEST(NumberConstruction, ACopyKeepsContentAndNodeReference)
{
    const Number source(sNodeRef {4, 7});
    const Number copy = source;
    EXPECT_EQ(parts(to<sNodeRef>(copy)), parts(sNodeRef {4, 7}));
    Number assigned(5L, 250);
    assigned = source;
    EXPECT_EQ(assigned.getKind(), Number::KIND_NODEREF);
    EXPECT_EQ(parts(to<sNodeRef>(assigned)), parts(sNodeRef {4, 7}));
    assigned = Number(dateTime(5, 250, 2));
    EXPECT_EQ(partsOf(to<ZQ::DateTime>(assigned)), (DateTimeParts {5, 250, 2}));
    EXPECT_EQ(parts(to<sNodeRef>(withKind(assigned, 10))), parts(sNodeRef {0, 0}));
}

// ---- initKind

TEST(NumberInitKind, GivesTheInitialContentWhateverTheOldContent)
{
    for (const unsigned int code : kindsWithZeroContent) {
        for (const Number& old : {Number(18446744073709551615ull), Number(-1L, 999), Number(-0.1)}) {
            SCOPED_TRACE(code);
            Number number = old;
            number.initKind(kind(code));
            EXPECT_EQ(number.getKind(), code);
            expectInitialContent(number);
        }
    }
    EXPECT_THAT(observe::records(), IsEmpty());
}

TEST(NumberInitKind, UnknownBoolNaNAndInfinityClearOnlyTheFlagByte)
{
    for (const unsigned int code : {0u, 1u, 6u, 7u}) {
        SCOPED_TRACE(code);
        Number number(0x0102030405060708ull);
        number.initKind(kind(code));
        number.setKind(Number::KIND_UINT64);
        EXPECT_EQ(to<unsigned long long>(number), littleEndian ? 0x0102030405060700u : 0x0002030405060708u);

        number = Number(dateTime(5, 250, 2));
        number.initKind(kind(code));
        number.setKind(Number::KIND_DATETIME);
        EXPECT_EQ(partsOf(to<ZQ::DateTime>(number)), (DateTimeParts {littleEndian ? 0 : 5, 250, 2}));
    }
}

TEST(NumberInitKind, KeepsTheNodeReference)
{
    for (const unsigned int code : {0u, 1u, 3u, 4u, 5u, 6u, 7u, 8u, 9u}) {
        SCOPED_TRACE(code);
        Number number(sNodeRef {4, 7});
        number.initKind(kind(code));
        EXPECT_EQ(parts(to<sNodeRef>(withKind(number, 10))), parts(sNodeRef {4, 7}));
    }
}

TEST(NumberInitKind, StoresARefusedKindAndKeepsTheContent)
{
    for (const auto& row : kindsRefusedByInitKind) {
        SCOPED_TRACE(row.code);
        Number number(7u);
        observe::onRecord([&](const observe::Record&) { EXPECT_EQ(number.getKind(), row.code); });
        expectNumberRefusal<std::invalid_argument>([&] { number.initKind(kind(row.code)); }, "initKind",
                                                   row.logged, "Invalid kind of number");
        observe::onRecord(nullptr);
        EXPECT_EQ(number.getKind(), row.code);
        EXPECT_EQ(to<unsigned int>(withKind(number, 3)), 7u);
        EXPECT_EQ(parts(to<sNodeRef>(withKind(number, 10))), parts(sNodeRef {0, 0}));
    }
    EXPECT_EQ(to<int>(withRefusedKind(Number(7u), 2)), 7);
    EXPECT_EQ(parts(to<sNodeRef>(withRefusedKind(withKind(Number(sNodeRef {4, 7}), 3), 10))),
              parts(sNodeRef {4, 7}));
}

TEST(NumberInitKind, StoresARefusedKindEvenIfThePlatformThrows)
{
    Number number(7u);
    observe::throwAt(observe::Call::log, 1);
    EXPECT_THROW(number.initKind(kind(12)), observe::Thrown);
    EXPECT_EQ(number.getKind(), 12u);
}

// ---- setKind

TEST(NumberSetKind, AcceptsEveryKindAndKeepsTheBytes)
{
    for (unsigned int from = 0; from <= 10; ++from) {
        for (unsigned int code = 0; code <= 10; ++code) {
            SCOPED_TRACE("from kind " + std::to_string(from) + " to " + std::to_string(code));
            const Number before = ofKind(from);
            Number number = before;
            const Bytes bytes = bytesOf(number);  // not of `before`: a copy need not copy padding
            number.setKind(byte(code));
            EXPECT_EQ(number.getKind(), code);
            number.setKind(byte(from));
            EXPECT_EQ(bytesOf(number), bytes);
        }
    }
    EXPECT_THAT(observe::records(), IsEmpty());
}

TEST(NumberSetKind, RefusesCodesOfElevenOrMoreAndChangesNothing)
{
    for (unsigned int code = 11; code <= 255; ++code) {
        SCOPED_TRACE(code);
        Number number(dateTime(5, 250, 2));
        const Bytes before = bytesOf(number);
        expectNumberRefusal<std::invalid_argument>([&] { number.setKind(byte(code)); }, "setKind",
                                                   "setKind: invalid kind " + std::to_string(code),
                                                   "Invalid kind");
        EXPECT_EQ(bytesOf(number), before);
        EXPECT_EQ(number.getKind(), Number::KIND_DATETIME);
        EXPECT_EQ(partsOf(to<ZQ::DateTime>(number)), (DateTimeParts {5, 250, 2}));
    }
}

TEST(NumberSetKind, KeepsTheNodeReference)
{
    Number number(sNodeRef {4, 7});
    number.setKind(Number::KIND_UINT32);
    number.setKind(Number::KIND_NODEREF);
    EXPECT_EQ(parts(to<sNodeRef>(number)), parts(sNodeRef {4, 7}));

    number = Number(7u);
    number.setKind(Number::KIND_NODEREF);
    EXPECT_EQ(parts(to<sNodeRef>(number)), parts(sNodeRef {0, 0}));
    EXPECT_EQ(text(number), "Unknown:0");
}

TEST(NumberSetKind, ReadsAnUnsignedIntegerAsSigned)
{
    EXPECT_EQ(to<int>(withKind(Number(7u), 2)), 7);
    EXPECT_EQ(to<int>(withKind(Number(3000000000u), 2)), -1294967296);
    EXPECT_EQ(to<int>(withKind(Number(4294967295u), 2)), -1);
    EXPECT_EQ(to<unsigned int>(withKind(Number(-1), 3)), 4294967295u);
}

TEST(NumberSetKind, ReadsTheFirstByteOfStorageAsTheFlag)
{
    const struct {
        Number number;
        const char* name;
        bool flagOnLittleEndian;
        bool flagOnBigEndian;
    } rows[] = {{Number(7u), "7", true, false},
                {Number(0u), "0", false, false},
                {Number(0x00000001u), "lowest byte", true, false},
                {Number(0x00000100u), "second byte", false, false},
                {Number(0x01000000u), "highest byte", false, true},
                {Number(0xFFFFFF00u), "all but the lowest byte", false, true},
                {Number(0x0000000000000001ull), "lowest byte of 64 bits", true, false},
                {Number(0x0100000000000000ull), "highest byte of 64 bits", false, true},
                {Number(Version2 {1, 0}), "major", true, true},
                {Number(Version2 {0, 1}), "minor", false, false}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.name);
        EXPECT_EQ(to<bool>(withKind(row.number, 1)),
                  littleEndian ? row.flagOnLittleEndian : row.flagOnBigEndian);
    }
}

TEST(NumberSetKind, ReadsTheFirstTwoBytesOfStorageAsAVersion)
{
    EXPECT_EQ(parts(to<Version2>(withKind(Number(0x01020304u), 8))),
              littleEndian ? version(4, 3) : version(1, 2));
    EXPECT_EQ(parts(to<Version2>(withKind(Number(true), 8))), version(1, 0));
}

TEST(NumberSetKind, ReadsARealAsItsBits)
{
    EXPECT_EQ(to<unsigned long long>(withKind(Number(1.0), 4)), 0x3FF0000000000000u);
    EXPECT_EQ(to<unsigned long long>(withKind(Number(-0.0), 4)), 0x8000000000000000u);
    EXPECT_EQ(to<double>(withKind(Number(0x4000000000000000ull), 5)), 2.0);
    EXPECT_EQ(to<double>(withKind(Number(0xFFF0000000000000ull), 5)), -infinity);
}

TEST(NumberSetKind, ReadsTheFirstFourBytesOfStorageAsA32BitInteger)
{
    const Number number(0x0000000100000002ull);
    EXPECT_EQ(to<unsigned int>(withKind(number, 3)), littleEndian ? 2u : 1u);
    EXPECT_EQ(to<int>(withKind(number, 2)), littleEndian ? 2 : 1);
}

TEST(NumberSetKind, ReadsTheSecondsOfADateTimeAsAnInteger)
{
    const Number later(0x12345678L, 250);
    const Number earlier(-1L, 250);
    const auto as64Bits = [](const Number& number) { return to<unsigned long long>(withKind(number, 4)); };
    if (longHas64Bits) {
        EXPECT_EQ(as64Bits(later), 0x12345678u);
        EXPECT_EQ(as64Bits(earlier), 0xFFFFFFFFFFFFFFFFu);
        EXPECT_EQ(to<unsigned int>(withKind(later, 3)), littleEndian ? 0x12345678u : 0u);
    } else {
        // The milliseconds (00FA) and the scope (03) follow the four bytes of the seconds.
        EXPECT_EQ(as64Bits(later), littleEndian ? 0x000300FA12345678u : 0x1234567800FA0300u);
        EXPECT_EQ(as64Bits(earlier), littleEndian ? 0x000300FAFFFFFFFFu : 0xFFFFFFFF00FA0300u);
        EXPECT_EQ(to<unsigned int>(withKind(later, 3)), 0x12345678u);
    }
    EXPECT_EQ(to<unsigned int>(withKind(earlier, 3)), 0xFFFFFFFFu);
}

TEST(NumberSetKind, EveryNonZeroFlagByteIsTrueAndOne)
{
    for (unsigned int flag = 0; flag <= 255; ++flag) {
        SCOPED_TRACE(flag);
        const Number number = withKind(Number(Version2 {byte(flag), 0}), 1);
        const bool set = flag != 0;
        EXPECT_EQ(to<bool>(number), set);
        EXPECT_EQ(to<int>(number), set ? 1 : 0);
        EXPECT_EQ(to<unsigned int>(number), set ? 1u : 0u);
        EXPECT_EQ(to<unsigned long long>(number), set ? 1u : 0u);
        EXPECT_EQ(to<double>(number), set ? 1.0 : 0.0);
        EXPECT_EQ(text(number), set ? "true" : "false");
    }
}

// ---- Conversions

struct Conversion {
    const char* function;
    const char* logged;
    const char* sentence;
    std::vector<ZQ::Uint32> takes;
    void (*refuse)(const Number&, const std::string& function, const std::string& logged,
                   const std::string& sentence);
    void (*convert)(const Number&);
};

template <class T>
Conversion conversion(const char* function, const char* logged, const char* sentence,
                      std::vector<ZQ::Uint32> takes)
{
    return {
        function, logged, sentence, std::move(takes), expectConversionRefused<T>, [](const Number& number) {
            static_cast<void>(to<T>(number));
        }};
}

TEST(NumberConversion, AcceptsItsKindsAndRefusesTheOthers)
{
    const Conversion conversions[] = {
        conversion<bool>("operator bool", "bool: Can't return current value as a Boolean, kind=",
                         "Can't return current value as a Boolean", {1, 3, 4, 5}),
        conversion<int>("operator int", "Uint32: Can't return current value as a 32-bit integer, kind=",
                        "Can't return current value as a 32-bit integer", {1, 2, 3, 4, 5}),
        conversion<unsigned int>("operator ZQ::Uint32",
                                 "Uint32: Can't return current value as a 32-bit integer, kind=",
                                 "Can't return current value as a 32-bit integer", {1, 3, 4, 5}),
        conversion<unsigned long long>("operator ZQ::Uint64",
                                       "Uint64: Can't return current value as a 64-bit integer, kind=",
                                       "Can't return current value as a 64-bit integer", {1, 3, 4, 5}),
        conversion<double>("operator ZQ::Real64", "Real: Can't return current value as a Real, kind=",
                           "Can't return current value as a Real", {1, 3, 4, 5, 6, 7, 8}),
        conversion<Version2>("operator IC::Version2",
                             "Version: Can't return current value as a Version, kind=",
                             "Can't return current value as a Version", {3, 4, 8}),
        conversion<ZQ::DateTime>("operator ZQ::DateTime",
                                 "DateTime: Can't return current value as a DateTime, kind=",
                                 "Can't return current value as a DateTime", {9}),
        conversion<sNodeRef>("operator IC::NodeRef", "NodeRef: Can't return current value as a pair, kind=",
                             "Can't return current value as pair", {10})};
    for (const Conversion& conversion : conversions) {
        for (const ZQ::Uint32 code : kindCodes) {
            SCOPED_TRACE(conversion.function + (" of kind " + std::to_string(code)));
            const Number number = ofKind(code);
            observe::reset();
            const auto& takes = conversion.takes;
            if (std::find(takes.begin(), takes.end(), code) != takes.end()) {
                EXPECT_NO_THROW(conversion.convert(number));
                EXPECT_THAT(observe::records(), IsEmpty());
            } else {
                conversion.refuse(number, conversion.function, conversion.logged + std::to_string(code),
                                  conversion.sentence);
            }
            EXPECT_EQ(observe::dateTimesAlive(), 0);
        }
    }
}

TEST(NumberConversion, ASignedNumberConvertsToIntOnly)
{
    const Number number(-5);
    EXPECT_EQ(to<int>(number), -5);
    expectConversionRefused<unsigned int>(number, "operator ZQ::Uint32",
                                          "Uint32: Can't return current value as a 32-bit integer, kind=2",
                                          "Can't return current value as a 32-bit integer");
    expectConversionRefused<unsigned long long>(
        number, "operator ZQ::Uint64", "Uint64: Can't return current value as a 64-bit integer, kind=2",
        "Can't return current value as a 64-bit integer");
    expectConversionRefused<double>(number, "operator ZQ::Real64",
                                    "Real: Can't return current value as a Real, kind=2",
                                    "Can't return current value as a Real");
    expectConversionRefused<bool>(number, "operator bool",
                                  "bool: Can't return current value as a Boolean, kind=2",
                                  "Can't return current value as a Boolean");
}

TEST(NumberToBool, IsFalseOnlyForZero)
{
    const struct {
        const char* name;
        Number number;
        bool expected;
    } rows[] = {{"false", Number(false), false},
                {"true", Number(true), true},
                {"uint32 0", Number(0u), false},
                {"uint32 1", Number(1u), true},
                {"uint32 highest bit", Number(0x80000000u), true},
                {"uint32 largest", Number(4294967295u), true},
                {"uint64 0", Number(0ull), false},
                {"uint64 1", Number(1ull), true},
                {"uint64 2^32", Number(4294967296ull), true},
                {"uint64 highest bit", Number(0x8000000000000000ull), true},
                {"real 0", Number(0.0), false},
                {"real -0", Number(-0.0), false},
                {"real 0.5", Number(0.5), true},
                {"real -1", Number(-1.0), true},
                {"real smallest", Number(smallest), true},
                {"real -smallest", Number(-smallest), true},
                {"real 2^64", Number(0x1p64), true},
                {"real infinity", Number(infinity), true},
                {"real -infinity", Number(-infinity), true},
                {"real NaN", Number(notANumber), true}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.name);
        EXPECT_EQ(to<bool>(row.number), row.expected);
    }
    EXPECT_THAT(observe::records(), IsEmpty());
}

// Numbers that both 32-bit conversions accept, with the result of the unsigned one.
const struct {
    const char* name;
    Number number;
    unsigned int expected;
} numbersOf32Bits[] = {{"false", Number(false), 0},
                       {"true", Number(true), 1},
                       {"uint32 0", Number(0u), 0},
                       {"uint32 7", Number(7u), 7},
                       {"uint32 2^31-1", Number(2147483647u), 2147483647},
                       {"uint32 2^31", Number(2147483648u), 2147483648},
                       {"uint32 3000000000", Number(3000000000u), 3000000000},
                       {"uint32 largest", Number(4294967295u), 4294967295},
                       {"uint64 0", Number(0ull), 0},
                       {"uint64 2^31-1", Number(2147483647ull), 2147483647},
                       {"uint64 2^31", Number(2147483648ull), 2147483648},
                       {"uint64 3000000000", Number(3000000000ull), 3000000000},
                       {"uint64 2^32-1", Number(4294967295ull), 4294967295},
                       {"real 0", Number(0.0), 0},
                       {"real -0", Number(-0.0), 0},
                       {"real smallest", Number(smallest), 0},
                       {"real -smallest", Number(-smallest), 0},
                       {"real 0.5", Number(0.5), 0},
                       {"real -0.5", Number(-0.5), 0},
                       {"real just above -1", Number(above(-1.0)), 0},
                       {"real just below 1", Number(below(1.0)), 0},
                       {"real 1", Number(1.0), 1},
                       {"real 2.9", Number(2.9), 2},
                       {"real 2^31 - 0.5", Number(2147483647.5), 2147483647},
                       {"real 2^31", Number(2147483648.0), 2147483648},
                       {"real 3000000000", Number(3000000000.0), 3000000000},
                       {"real 4294967295", Number(4294967295.0), 4294967295},
                       {"real 4294967295.9", Number(4294967295.9), 4294967295},
                       {"real just below 2^32", Number(below(0x1p32)), 4294967295},
                       {"real NaN", Number(notANumber), 0},
                       {"real -NaN", Number(-notANumber), 0}};

const char* const tooLargeFor32Bits = "The number is too large to convert to a 32-bit integer";
const char* const negativeFor32Bits = "A negative number cannot convert to an unsigned 32-bit integer";

const struct {
    const char* name;
    Number number;
    const char* logged;
    const char* sentence;
} numbersBeyond32Bits[] = {
    {"uint64 2^32", Number(4294967296ull), "Uint32: number out of range: 4294967296", tooLargeFor32Bits},
    {"uint64 2^32 + 5", Number(4294967301ull), "Uint32: number out of range: 4294967301", tooLargeFor32Bits},
    {"uint64 2^63", Number(9223372036854775808ull), "Uint32: number out of range: 9223372036854775808",
     tooLargeFor32Bits},
    {"uint64 largest", Number(18446744073709551615ull), "Uint32: number out of range: 18446744073709551615",
     tooLargeFor32Bits},
    {"real 2^32", Number(0x1p32), "Uint32: number out of range: 4.29497e+09", tooLargeFor32Bits},
    {"real just above 2^32", Number(above(0x1p32)), "Uint32: number out of range: 4.29497e+09",
     tooLargeFor32Bits},
    {"real 1e10", Number(1e10), "Uint32: number out of range: 1e+10", tooLargeFor32Bits},
    {"real 2^64", Number(0x1p64), "Uint32: number out of range: 1.84467e+19", tooLargeFor32Bits},
    {"real largest", Number(largest), "Uint32: number out of range: 1.79769e+308", tooLargeFor32Bits},
    {"real infinity", Number(infinity), "Uint32: number out of range: inf", tooLargeFor32Bits},
    {"real -1", Number(-1.0), "Uint32: number out of range: -1", negativeFor32Bits},
    {"real just below -1", Number(below(-1.0)), "Uint32: number out of range: -1", negativeFor32Bits},
    {"real -1.5", Number(-1.5), "Uint32: number out of range: -1.5", negativeFor32Bits},
    {"real -2^31", Number(-2147483648.0), "Uint32: number out of range: -2.14748e+09", negativeFor32Bits},
    {"real -largest", Number(-largest), "Uint32: number out of range: -1.79769e+308", negativeFor32Bits},
    {"real -infinity", Number(-infinity), "Uint32: number out of range: -inf", negativeFor32Bits}};

TEST(NumberToUint32, IsTheValueBelowTwoToThe32)
{
    for (const auto& row : numbersOf32Bits) {
        SCOPED_TRACE(row.name);
        EXPECT_EQ(to<unsigned int>(row.number), row.expected);
    }
    EXPECT_THAT(observe::records(), IsEmpty());
}

TEST(NumberToUint32, RefusesWhatIsTooLargeOrNegative)
{
    for (const auto& row : numbersBeyond32Bits) {
        SCOPED_TRACE(row.name);
        expectConversionRefused<unsigned int>(row.number, "operator ZQ::Uint32", row.logged, row.sentence);
    }
}

TEST(NumberToInt, ReturnsASignedValueUnchanged)
{
    for (const int value : {0, 7, -5, -1, intSmallest, intLargest}) {
        SCOPED_TRACE(value);
        EXPECT_EQ(to<int>(Number(value)), value);
    }
    EXPECT_THAT(observe::records(), IsEmpty());
}

TEST(NumberToInt, ReadsThe32BitsOfAnUnsignedValueOrRealAsSigned)
{
    EXPECT_EQ(to<int>(Number(2147483647u)), 2147483647);
    EXPECT_EQ(to<int>(Number(2147483648u)), intSmallest);
    EXPECT_EQ(to<int>(Number(3000000000u)), -1294967296);
    EXPECT_EQ(to<int>(Number(3000000000ull)), -1294967296);
    EXPECT_EQ(to<int>(Number(3000000000.0)), -1294967296);
    EXPECT_EQ(to<int>(Number(4294967295u)), -1);
    EXPECT_EQ(to<int>(Number(4294967295ull)), -1);
    EXPECT_EQ(to<int>(Number(4294967295.9)), -1);
    for (const auto& row : numbersOf32Bits) {
        SCOPED_TRACE(row.name);
        const long long value = row.expected;
        EXPECT_EQ(to<int>(row.number), value <= 2147483647 ? value : value - 4294967296);
    }
    EXPECT_THAT(observe::records(), IsEmpty());
}

TEST(NumberToInt, RefusesWhatTheUnsignedConversionRefuses)
{
    for (const auto& row : numbersBeyond32Bits) {
        SCOPED_TRACE(row.name);
        expectConversionRefused<int>(row.number, "operator int", row.logged, row.sentence);
    }
}

TEST(NumberToUint64, IsTheValueBelowTwoToThe64)
{
    const struct {
        const char* name;
        Number number;
        unsigned long long expected;
    } rows[] = {{"false", Number(false), 0},
                {"true", Number(true), 1},
                {"uint32 0", Number(0u), 0},
                {"uint32 2^31", Number(2147483648u), 2147483648},
                {"uint32 largest", Number(4294967295u), 4294967295},
                {"uint64 0", Number(0ull), 0},
                {"uint64 2^32", Number(4294967296ull), 4294967296},
                {"uint64 2^63", Number(9223372036854775808ull), 9223372036854775808u},
                {"uint64 largest", Number(18446744073709551615ull), 18446744073709551615u},
                {"real 0", Number(0.0), 0},
                {"real -0", Number(-0.0), 0},
                {"real smallest", Number(smallest), 0},
                {"real -0.5", Number(-0.5), 0},
                {"real just above -1", Number(above(-1.0)), 0},
                {"real just below 1", Number(below(1.0)), 0},
                {"real 2.9", Number(2.9), 2},
                {"real just below 2^32", Number(below(0x1p32)), 4294967295},
                {"real 2^32", Number(0x1p32), 4294967296},
                {"real 2^53 - 0.5", Number(below(0x1p53)), 9007199254740991},
                {"real just below 2^63", Number(below(0x1p63)), 9223372036854774784},
                {"real 2^63", Number(0x1p63), 9223372036854775808u},
                {"real just above 2^63", Number(above(0x1p63)), 9223372036854777856u},
                {"real just below 2^64", Number(18446744073709549568.0), 18446744073709549568u},
                {"real NaN", Number(notANumber), 9223372036854775808u},
                {"real -NaN", Number(-notANumber), 9223372036854775808u}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.name);
        EXPECT_EQ(to<unsigned long long>(row.number), row.expected);
    }
    EXPECT_EQ(below(0x1p64), 18446744073709549568.0);
    EXPECT_THAT(observe::records(), IsEmpty());
}

TEST(NumberToUint64, RefusesWhatIsTooLargeOrNegative)
{
    const char* const tooLarge = "The number is too large to convert to a 64-bit integer";
    const char* const negative = "A negative number cannot convert to an unsigned 64-bit integer";
    const struct {
        const char* name;
        double real;
        const char* logged;
        const char* sentence;
    } rows[] = {{"2^64", 18446744073709551616.0, "Uint64: number out of range: 1.84467e+19", tooLarge},
                {"just above 2^64", above(0x1p64), "Uint64: number out of range: 1.84467e+19", tooLarge},
                {"largest", largest, "Uint64: number out of range: 1.79769e+308", tooLarge},
                {"infinity", infinity, "Uint64: number out of range: inf", tooLarge},
                {"-1", -1.0, "Uint64: number out of range: -1", negative},
                {"just below -1", below(-1.0), "Uint64: number out of range: -1", negative},
                {"-2.75", -2.75, "Uint64: number out of range: -2.75", negative},
                {"-2^63", -0x1p63, "Uint64: number out of range: -9.22337e+18", negative},
                {"-largest", -largest, "Uint64: number out of range: -1.79769e+308", negative},
                {"-infinity", -infinity, "Uint64: number out of range: -inf", negative}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.name);
        expectConversionRefused<unsigned long long>(Number(row.real), "operator ZQ::Uint64", row.logged,
                                                    row.sentence);
    }
}

TEST(NumberToReal, IsTheValueRoundedToTheNearestReal)
{
    const struct {
        const char* name;
        Number number;
        double expected;
    } rows[] = {{"false", Number(false), 0.0},
                {"true", Number(true), 1.0},
                {"uint32 0", Number(0u), 0.0},
                {"uint32 2^31", Number(2147483648u), 2147483648.0},
                {"uint32 largest", Number(4294967295u), 4294967295.0},
                {"uint64 0", Number(0ull), 0.0},
                {"uint64 2^53", Number(9007199254740992ull), 9007199254740992.0},
                {"uint64 2^53 + 1, to even", Number(9007199254740993ull), 9007199254740992.0},
                {"uint64 2^53 + 3, to even", Number(9007199254740995ull), 9007199254740996.0},
                {"uint64 2^63 - 1", Number(9223372036854775807ull), 9223372036854775808.0},
                {"uint64 2^63", Number(9223372036854775808ull), 9223372036854775808.0},
                {"uint64 2^63 + 1024, to even", Number(9223372036854776832ull), 9223372036854775808.0},
                {"uint64 2^63 + 1025", Number(9223372036854776833ull), 9223372036854777856.0},
                {"uint64 largest", Number(18446744073709551615ull), 18446744073709551616.0},
                {"real 0.1", Number(0.1), 0.1},
                {"real -1.5", Number(-1.5), -1.5},
                {"real smallest", Number(smallest), smallest},
                {"real largest", Number(largest), largest},
                {"real infinity", Number(infinity), infinity},
                {"real -infinity", Number(-infinity), -infinity},
                {"infinity", Number(Number::KIND_INFINITY), infinity}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.name);
        EXPECT_EQ(to<double>(row.number), row.expected);
    }
    EXPECT_TRUE(std::signbit(to<double>(Number(-0.0))));
    EXPECT_TRUE(std::isnan(to<double>(Number(notANumber))));
    EXPECT_THAT(observe::records(), IsEmpty());
}

TEST(NumberToReal, NotANumberIsAQuietNaN)
{
    const double real = to<double>(Number(Number::KIND_NAN));
    EXPECT_TRUE(std::isnan(real));
    ZQ::Uint64 bits = 0;
    std::memcpy(&bits, &real, sizeof bits);
    EXPECT_NE(bits & 0x0008000000000000u, 0u);  // set in every quiet NaN, clear in a signalling one
}

TEST(NumberToReal, AVersionIsItsMajorNumberWithTheMinorOneAsDecimals)
{
    const struct {
        Version2 version;
        double expected;
    } rows[] = {{{0, 0}, 0.0},    {{2, 0}, 2.0},     {{2, 5}, 2.5},         {{2, 9}, 2.9},
                {{2, 10}, 2.1},   {{2, 15}, 2.15},   {{2, 99}, 2.99},       {{2, 100}, 2.1},
                {{2, 150}, 2.15}, {{2, 255}, 2.255}, {{255, 255}, 255.255}, {{255, 9}, 255.9},
                {{0, 1}, 0.1}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.expected);
        EXPECT_DOUBLE_EQ(to<double>(Number(row.version)), row.expected);
    }
    // volatile rounds each step to a double: the x87 calculates with more digits.
    for (unsigned int major = 0; major <= 255; ++major) {
        for (unsigned int minor = 0; minor <= 255; ++minor) {
            const double divisor = minor <= 9 ? 10.0 : minor <= 99 ? 100.0 : 1000.0;
            const volatile double decimals = minor / divisor;
            const volatile double sum = major + decimals;
            const double expected = sum;
            ASSERT_EQ(to<double>(Number(Version2 {byte(major), byte(minor)})), expected)
                << major << '.' << minor;
        }
    }
}

// The x87 calculates with more digits than a double has. These results come from a quotient and a sum that are each
// rounded to a double.
TEST(NumberToReal, AVersionIsRoundedToADoubleAtEachStep)
{
    EXPECT_EQ(to<double>(Number(Version2 {1, 14})), 0x1.23d70a3d70a3ep+0);
    EXPECT_EQ(to<double>(Number(Version2 {1, 36})), 0x1.5c28f5c28f5c2p+0);
    EXPECT_EQ(to<double>(Number(Version2 {2, 15})) - 2.0, 0x1.333333333333p-3);
}

TEST(NumberToReal, AnIntegerIsRoundedToADoubleBeforeFurtherUse)
{
    EXPECT_EQ(static_cast<ZQ::Uint64>(to<double>(Number(9007199254740993ull))), 9007199254740992ull);
    EXPECT_EQ(static_cast<ZQ::Uint64>(to<double>(Number(9223372036854776833ull))), 9223372036854777856ull);
}

TEST(NumberToVersion, GivesBackEveryVersion)
{
    for (unsigned int major = 0; major <= 255; ++major) {
        for (unsigned int minor = 0; minor <= 255; ++minor) {
            ASSERT_EQ(parts(to<Version2>(Number(Version2 {byte(major), byte(minor)}))),
                      version(major, minor));
        }
    }
}

TEST(NumberToVersion, AcceptsIntegersUpTo255AsTheMajorNumber)
{
    for (unsigned int value = 0; value <= 255; ++value) {
        SCOPED_TRACE(value);
        EXPECT_EQ(parts(to<Version2>(Number(value))), version(value, 0));
        EXPECT_EQ(parts(to<Version2>(Number(static_cast<unsigned long long>(value)))), version(value, 0));
    }
    EXPECT_THAT(observe::records(), IsEmpty());
}

TEST(NumberToVersion, RefusesLargerIntegers)
{
    const std::pair<Number, const char*> rows[] = {
        {Number(256u), "Version: Number too large for version: 256"},
        {Number(65536u), "Version: Number too large for version: 65536"},
        {Number(4294967295u), "Version: Number too large for version: 4294967295"},
        {Number(256ull), "Version: Number too large for version: 256"},
        {Number(4294967295ull), "Version: Number too large for version: 4294967295"},
        {Number(4294967296ull), "Version: Number too large for version: 4294967296"},
        {Number(4294967301ull), "Version: Number too large for version: 4294967301"},
        {Number(18446744073709551615ull), "Version: Number too large for version: 18446744073709551615"}};
    for (const auto& [number, logged] : rows) {
        SCOPED_TRACE(logged);
        expectConversionRefused<Version2>(number, "operator IC::Version2", logged,
                                          "The number is too large to convert to a version");
    }
}

TEST(NumberToDateTime, AcceptsTheScopesOneToThree)
{
    for (unsigned int scope = 0; scope <= 255; ++scope) {
        SCOPED_TRACE(scope);
        const Number number(dateTime(1234567890, 250, scope));
        if (scope >= 1 && scope <= 3)
            EXPECT_EQ(partsOf(to<ZQ::DateTime>(number)), (DateTimeParts {1234567890, 250, scope}));
        else
            expectConversionRefused<ZQ::DateTime>(
                number, "operator ZQ::DateTime", "DateTime: Can't return current value as a DateTime, kind=9",
                "Can't return current value as a DateTime");
    }
    EXPECT_EQ(observe::dateTimesAlive(), 0);
}

TEST(NumberToDateTime, GivesBackEveryMillisecondValue)
{
    for (unsigned int milliseconds = 0; milliseconds <= 65535; ++milliseconds) {
        const Number number(-1L, static_cast<unsigned short>(milliseconds));
        const ZQ::DateTime time = number;
        ASSERT_EQ(partsOf(time), (DateTimeParts {-1, milliseconds, 3}));
        ASSERT_TRUE(Number(time) == number) << milliseconds;
    }
}

TEST(NumberToNodeRef, GivesBackTypeAndId)
{
    for (const sNodeRef& reference : {sNodeRef {0, 0}, sNodeRef {4, 7}, sNodeRef {74, 1}, sNodeRef {75, 1},
                                      sNodeRef {4294967295, 4294967295}}) {
        SCOPED_TRACE(reference.type);
        EXPECT_EQ(parts(to<sNodeRef>(Number(reference))), parts(reference));
    }
}

TEST(NumberConversion, IsTheSameInProgramsThatWereCompiledWithAnOlderHeader)
{
    const Number numbers[] = {Number(true), Number(7u), Number(7ull), Number(7.5)};
    for (const Number& number : numbers) {
        EXPECT_EQ(older::toUint32(&number, "operator int"), number.operator unsigned int()) << number;
        EXPECT_EQ(older::toUint64(&number), number.operator unsigned long long()) << number;
        EXPECT_EQ(older::toReal(&number), number.operator double()) << number;
    }
}

TEST(NumberComparison, IsTheSameInProgramsThatWereCompiledWithAnOlderHeader)
{
    EXPECT_FALSE(older::equal(Number(7u), Number(7ull)));
    EXPECT_TRUE(older::equal(Number(7ull), Number(7ull)));
}

TEST(NumberConversion, NeedsNoMemory)
{
    const Number numbers[] = {Number(true),           Number(5),   Number(5u),
                              Number(5ull),           Number(5.0), Number(Version2 {2, 15}),
                              Number(sNodeRef {4, 7})};
    const long allocations = allocation::countOf([&] {
        static_cast<void>(to<bool>(numbers[0]));
        static_cast<void>(to<int>(numbers[1]));
        static_cast<void>(to<unsigned int>(numbers[2]));
        static_cast<void>(to<unsigned long long>(numbers[3]));
        static_cast<void>(to<unsigned int>(numbers[4]));
        static_cast<void>(to<double>(numbers[4]));
        static_cast<void>(to<double>(numbers[5]));
        static_cast<void>(to<Version2>(numbers[5]));
        static_cast<void>(to<sNodeRef>(numbers[6]));
    });
    EXPECT_EQ(allocations, 0);
}

// ---- Comparison

void expectEqual(const Number& a, const Number& b)
{
    EXPECT_TRUE(a == b);
    EXPECT_FALSE(a != b);
    EXPECT_FALSE(a < b);
    EXPECT_FALSE(a > b);
    EXPECT_TRUE(a <= b);
    EXPECT_TRUE(a >= b);
}

void expectLess(const Number& smaller, const Number& larger)
{
    EXPECT_FALSE(smaller == larger);
    EXPECT_FALSE(larger == smaller);
    EXPECT_TRUE(smaller != larger);
    EXPECT_TRUE(smaller < larger);
    EXPECT_FALSE(larger < smaller);
    EXPECT_FALSE(smaller > larger);
    EXPECT_TRUE(larger > smaller);
    EXPECT_TRUE(smaller <= larger);
    EXPECT_FALSE(larger <= smaller);
    EXPECT_FALSE(smaller >= larger);
    EXPECT_TRUE(larger >= smaller);
}

void expectUnordered(const Number& a, const Number& b)
{
    EXPECT_FALSE(a == b);
    EXPECT_TRUE(a != b);
    EXPECT_FALSE(a < b);
    EXPECT_FALSE(a > b);
    EXPECT_FALSE(a <= b);
    EXPECT_FALSE(a >= b);
}

// Expects each number to be less than all that follow it.
void expectRising(const std::vector<Number>& numbers)
{
    for (std::size_t i = 0; i < numbers.size(); ++i) {
        expectEqual(numbers[i], Number(numbers[i]));
        for (std::size_t j = i + 1; j < numbers.size(); ++j) {
            SCOPED_TRACE(text(numbers[i]) + " and " + text(numbers[j]));
            expectLess(numbers[i], numbers[j]);
        }
    }
}

TEST(NumberComparison, FlagsCompareTheirBytes)
{
    expectRising({Number(false), Number(true)});
    const auto flag = [](unsigned int content) { return withKind(Number(Version2 {byte(content), 0}), 1); };
    expectRising({flag(0), flag(1), flag(2), flag(127), flag(128), flag(255)});
}

TEST(NumberComparison, UnsignedIntegersCompareTheirValues)
{
    expectRising({Number(0u), Number(1u), Number(2147483647u), Number(2147483648u), Number(4294967295u)});
    expectRising({Number(0ull), Number(1ull), Number(4294967295ull), Number(4294967296ull),
                  Number(4294967297ull), Number(9223372036854775807ull), Number(9223372036854775808ull),
                  Number(18446744073709551615ull)});
}

TEST(NumberComparison, RealsCompareTheirValues)
{
    expectRising({Number(-infinity), Number(-largest), Number(-1.5), Number(-1.0), Number(-smallest),
                  Number(0.0), Number(smallest), Number(1.0), Number(above(1.0)), Number(largest),
                  Number(infinity)});
    expectEqual(Number(0.0), Number(-0.0));
    expectEqual(Number(-0.0), Number(0.0));
}

TEST(NumberComparison, ARealNaNIsNeitherEqualNorOrdered)
{
    expectUnordered(Number(notANumber), Number(notANumber));
    for (const double real : {-infinity, -1.0, 0.0, 1.0, infinity}) {
        SCOPED_TRACE(real);
        expectUnordered(Number(notANumber), Number(real));
        expectUnordered(Number(real), Number(notANumber));
    }
    const Number number(notANumber);
    expectUnordered(number, number);
    EXPECT_THAT(observe::records(), IsEmpty());
}

TEST(NumberComparison, VersionsCompareMajorThenMinor)
{
    expectRising({Number(Version2 {0, 0}), Number(Version2 {0, 1}), Number(Version2 {0, 255}),
                  Number(Version2 {1, 0}), Number(Version2 {1, 2}), Number(Version2 {1, 127}),
                  Number(Version2 {1, 128}), Number(Version2 {2, 1}), Number(Version2 {127, 255}),
                  Number(Version2 {128, 0}), Number(Version2 {255, 255})});
}

TEST(NumberComparison, DateTimesCompareSecondsThenMilliseconds)
{
    std::vector<Number> rising = {
        Number(-2147483647L, 0), Number(-1L, 0),    Number(-1L, 999),  Number(0L, 0), Number(0L, 1),
        Number(5L, 32767),       Number(5L, 32768), Number(5L, 65535), Number(6L, 0), Number(2147483647L, 0)};
    if (longHas64Bits) {
        rising.insert(rising.begin(), Number(static_cast<long>(-2147483649), 0));
        rising.push_back(Number(static_cast<long>(2147483648), 0));
    }
    rising.insert(rising.begin(), Number(longSmallest, 0));
    rising.push_back(Number(longLargest, 65535));
    expectRising(rising);
}

TEST(NumberComparison, DateTimesIgnoreTheScope)
{
    expectEqual(Number(dateTime(5, 250, 1)), Number(dateTime(5, 250, 2)));
    expectEqual(Number(dateTime(5, 250, 0)), Number(5L, 250));
    expectLess(Number(dateTime(5, 250, 3)), Number(dateTime(5, 251, 1)));
}

TEST(NumberComparison, IntsNodeReferencesUnknownAndInfinityAreAlwaysEqual)
{
    expectEqual(Number(3), Number(9));
    expectEqual(Number(9), Number(3));
    expectEqual(Number(intSmallest), Number(intLargest));
    expectEqual(Number(sNodeRef {4, 7}), Number(sNodeRef {20, 1}));
    expectEqual(Number(sNodeRef {20, 1}), Number(sNodeRef {4, 7}));
    expectEqual(withKind(Number(1u), 0), withKind(Number(2u), 0));
    expectEqual(withKind(Number(1u), 7), withKind(Number(2u), 7));
    expectEqual(withKind(Number(2u), 7), withKind(Number(1u), 7));
    EXPECT_THAT(observe::records(), IsEmpty());
}

TEST(NumberComparison, ARefusedKindComparesLikeKindUnknown)
{
    for (const ZQ::Uint32 code : {11u, 12u, 255u, 4294967295u}) {
        SCOPED_TRACE(code);
        const Number one = withRefusedKind(Number(1u), code);
        const Number two = withRefusedKind(Number(2u), code);
        observe::reset();
        expectEqual(one, two);
        expectEqual(two, one);
        EXPECT_THAT(observe::records(), IsEmpty());
    }
}

TEST(NumberComparison, NotANumberIsEqualToItselfButNotOrdered)
{
    const Number a = withKind(Number(1u), 6);
    const Number b = withKind(Number(2u), 6);
    EXPECT_TRUE(a == b);
    EXPECT_FALSE(a != b);
    EXPECT_TRUE(a <= b);
    EXPECT_TRUE(a >= b);
    EXPECT_THAT(observe::records(), IsEmpty());
    expectNumberRefusal<std::invalid_argument>([&] { return a < b; }, "operator<",
                                               "<: invalid operation when kind is NaN",
                                               "Invalid operation when kind is NaN");
    expectNumberRefusal<std::invalid_argument>([&] { return a > b; }, "operator>",
                                               ">: invalid operation when kind is NaN",
                                               "Invalid operation when kind is NaN");
}

TEST(NumberComparison, InfinityOnTheLeftIsGreaterThanEveryOtherKind)
{
    const Number endless(Number::KIND_INFINITY);
    const Number five(5u);
    EXPECT_TRUE(endless > five);
    EXPECT_FALSE(endless < five);
    EXPECT_TRUE(endless >= five);
    EXPECT_FALSE(endless <= five);
    EXPECT_FALSE(endless > endless);
    EXPECT_FALSE(endless < endless);
    EXPECT_TRUE(endless == endless);
    EXPECT_TRUE(endless > Number(infinity));
    EXPECT_THAT(observe::records(), IsEmpty());
    expectNumberRefusal<std::invalid_argument>(
        [&] { return five < endless; }, "operator<",
        "<: cannot compare two different kinds of number, kind1=3, kind2=7",
        "Cannot compare two different kinds of number");
    expectNumberRefusal<std::invalid_argument>(
        [&] { return five > endless; }, "operator>",
        ">: cannot compare two different kinds of number, kind1=3, kind2=7",
        "Cannot compare two different kinds of number");
}

TEST(NumberComparison, EqualityOfDifferentKindsIsFalse)
{
    EXPECT_FALSE(Number(1u) == Number(1ull));
    for (const ZQ::Uint32 left : kindCodes) {
        for (const ZQ::Uint32 right : kindCodes) {
            SCOPED_TRACE("kinds " + std::to_string(left) + " and " + std::to_string(right));
            const Number a = ofKind(left);
            const Number b = ofKind(right);
            observe::reset();
            EXPECT_EQ(a == b, left == right);
            EXPECT_EQ(a != b, left != right);
            EXPECT_THAT(observe::records(), IsEmpty());
        }
    }
}

// Expects the result or the refusal of a < b or a > b, where a and b differ at most in their kind.
template <class Operation>
void expectOrderingByKind(const Number& a, const Number& b, char sign, Operation operation)
{
    const ZQ::Uint32 left = a.getKind();
    const ZQ::Uint32 right = b.getKind();
    const std::string function = std::string("operator") + sign;
    const Bytes bytesOfA = bytesOf(a);
    const Bytes bytesOfB = bytesOf(b);
    observe::reset();
    if (left == Number::KIND_NAN || right == Number::KIND_NAN) {
        expectNumberRefusal<std::invalid_argument>(operation, function,
                                                   sign + std::string(": invalid operation when kind is NaN"),
                                                   "Invalid operation when kind is NaN");
    } else if (left == Number::KIND_INFINITY) {
        EXPECT_EQ(operation(), sign == '>' && right != Number::KIND_INFINITY);
        EXPECT_THAT(observe::records(), IsEmpty());
    } else if (left != right) {
        expectNumberRefusal<std::invalid_argument>(
            operation, function,
            sign + std::string(": cannot compare two different kinds of number, kind1=")
                + std::to_string(left) + ", kind2=" + std::to_string(right),
            "Cannot compare two different kinds of number");
    } else {
        EXPECT_FALSE(operation());
        EXPECT_THAT(observe::records(), IsEmpty());
    }
    EXPECT_EQ(bytesOf(a), bytesOfA);
    EXPECT_EQ(bytesOf(b), bytesOfB);
}

TEST(NumberComparison, OrderingRefusesNotANumberAndDifferentKinds)
{
    for (const ZQ::Uint32 left : kindCodes) {
        for (const ZQ::Uint32 right : kindCodes) {
            SCOPED_TRACE("kinds " + std::to_string(left) + " and " + std::to_string(right));
            const Number a = ofKind(left);
            const Number b = ofKind(right);
            expectOrderingByKind(a, b, '<', [&] { return a < b; });
            expectOrderingByKind(a, b, '>', [&] { return a > b; });
        }
    }
}

TEST(NumberComparison, OrEqualTestsEqualityBeforeTheOrdering)
{
    for (const ZQ::Uint32 left : kindCodes) {
        for (const ZQ::Uint32 right : kindCodes) {
            SCOPED_TRACE("kinds " + std::to_string(left) + " and " + std::to_string(right));
            const Number a = ofKind(left);
            const Number b = ofKind(right);
            if (left == right) {
                observe::reset();
                EXPECT_TRUE(a <= b);
                EXPECT_TRUE(a >= b);
                EXPECT_THAT(observe::records(), IsEmpty());
            } else {
                expectOrderingByKind(a, b, '<', [&] { return a <= b; });
                expectOrderingByKind(a, b, '>', [&] { return a >= b; });
            }
        }
    }
}

// ---- Text form

const struct TextRow {
    Number number;
    const char* expected;
} textRows[] = {{Number(Number::KIND_UNKNOWN), "unknown"},
                {Number(true), "true"},
                {Number(false), "false"},
                {Number(0), "0"},
                {Number(-7), "-7"},
                {Number(7), "7"},
                {Number(intSmallest), "-2147483648"},
                {Number(intLargest), "2147483647"},
                {Number(0u), "0"},
                {Number(2147483648u), "2147483648"},
                {Number(4294967295u), "4294967295"},
                {Number(0ull), "0"},
                {Number(4294967296ull), "4294967296"},
                {Number(9223372036854775808ull), "9223372036854775808"},
                {Number(18446744073709551615ull), "18446744073709551615"},
                {Number(0.0), "0"},
                {Number(-0.0), "-0"},
                {Number(2.0), "2"},
                {Number(0.5), "0.5"},
                {Number(-0.5), "-0.5"},
                {Number(0.1), "0.1"},
                {Number(1e-7), "1e-07"},
                {Number(0.0001), "0.0001"},
                {Number(0.00001), "1e-05"},
                {Number(3.14159265), "3.14159"},
                {Number(100000.0), "100000"},
                {Number(999999.0), "999999"},
                {Number(999999.5), "1e+06"},
                {Number(999999.75), "1e+06"},
                {Number(9.9999997), "10"},
                {Number(123456.5), "123456"},
                {Number(123457.5), "123458"},
                {Number(123456.55), "123457"},
                {Number(1000000.0), "1e+06"},
                {Number(1234567.0), "1.23457e+06"},
                {Number(-1234567.0), "-1.23457e+06"},
                {Number(1e100), "1e+100"},
                {Number(largest), "1.79769e+308"},
                {Number(smallest), "4.94066e-324"},
                {Number(infinity), "inf"},
                {Number(-infinity), "-inf"},
                {Number(notANumber), "nan"},
                {Number(-notANumber), "-nan"},
                {Number(Number::KIND_NAN), "not a number"},
                {Number(Number::KIND_INFINITY), "infinity"},
                {Number(Version2 {0, 0}), "0.0"},
                {Number(Version2 {1, 2}), "1.2"},
                {Number(Version2 {2, 5}), "2.5"},
                {Number(Version2 {2, 15}), "2.15"},
                {Number(Version2 {255, 255}), "255.255"},
                {Number(1234567890L, 0), "1234567890/3"},
                {Number(1234567890L, 250), "1234567890/3"},
                {Number(-1L, 990), "-1/3"},
                {Number(longLargest, 0), longHas64Bits ? "9223372036854775807/3" : "2147483647/3"},
                {Number(sNodeRef {0, 0}), "Unknown:0"},
                {Number(sNodeRef {4, 7}), "CPU:7"},
                {Number(sNodeRef {25, 4294967295}), "Power Supply:4294967295"},
                {Number(sNodeRef {73, 1}), "LAN End Point:1"},
                {Number(sNodeRef {74, 1}), "invalid:1"},
                {Number(sNodeRef {75, 1}), "invalid:1"},
                {Number(sNodeRef {4294967295, 1}), "invalid:1"}};

TEST(NumberText, HasTheFormOfTheKind)
{
    for (const TextRow& row : textRows) {
        SCOPED_TRACE(row.expected);
        const Bytes before = bytesOf(row.number);
        EXPECT_EQ(text(row.number), row.expected);
        EXPECT_EQ(std::string(row.number), row.expected);
        EXPECT_EQ(bytesOf(row.number), before);
    }
    EXPECT_THAT(observe::records(), IsEmpty());
    EXPECT_EQ(observe::dateTimesAlive(), 0);
}

TEST(NumberText, OfARefusedKindIsInvalid)
{
    for (const ZQ::Uint32 code : {11u, 12u, 255u, 256u, 4294967295u}) {
        SCOPED_TRACE(code);
        EXPECT_EQ(text(withRefusedKind(Number(7u), code)), "invalid");
    }
}

TEST(NumberText, OfEveryVersionIsMajorPointMinor)
{
    for (unsigned int major = 0; major <= 255; ++major) {
        for (unsigned int minor = 0; minor <= 255; ++minor) {
            ASSERT_EQ(text(Number(Version2 {byte(major), byte(minor)})),
                      std::to_string(major) + '.' + std::to_string(minor));
        }
    }
}

TEST(NumberText, OfADateTimeShowsAnyScope)
{
    for (unsigned int scope = 0; scope <= 255; ++scope) {
        SCOPED_TRACE(scope);
        EXPECT_EQ(text(Number(dateTime(5, 0, scope))), "5/" + std::to_string(scope));
    }
}

TEST(NumberText, OfAnIntegerHasEveryDigitAtEveryLength)
{
    const auto expectText = [](ZQ::Uint64 integer) {
        EXPECT_EQ(std::string(Number(integer)), std::to_string(integer));
        const auto cut = static_cast<unsigned int>(integer & 0xFFFFFFFF);
        EXPECT_EQ(std::string(Number(cut)), std::to_string(cut));
        const int half = static_cast<int>(cut / 2);
        EXPECT_EQ(std::string(Number(half)), std::to_string(half));
        EXPECT_EQ(std::string(Number(-half)), std::to_string(-half));
    };
    for (ZQ::Uint64 integer = 0; integer < 20000; ++integer)
        expectText(integer);
    ZQ::Uint64 digits = 0;
    ZQ::Uint64 power = 1;
    for (unsigned int length = 1; length <= 20; ++length) {
        expectText(power - 1);
        expectText(power);
        expectText(power + 1);
        expectText(power * 9 / 7);
        digits = digits * 10 + length % 10;
        expectText(digits);
        power = length < 20 ? power * 10 : power;
    }
}

TEST(NumberText, OfASmallRealHasSixSignificantDigits)
{
    EXPECT_EQ(std::string(Number(0.000123456)), "0.000123456");
    EXPECT_EQ(std::string(Number(0.0123456)), "0.0123456");
    EXPECT_EQ(std::string(Number(0.0001)), "0.0001");
}

TEST(NumberText, OfARealHasSixSignificantDigitsInEveryDecade)
{
    const struct {
        double first, among, last;
        const char* texts[3];
    } decades[] = {{1e6, 1234567, 9999994, {"1e+06", "1.23457e+06", "9.99999e+06"}},
                   {100000, 123456.7, 999999.4, {"100000", "123457", "999999"}},
                   {10000, 12345.67, 99999.94, {"10000", "12345.7", "99999.9"}},
                   {1000, 1234.567, 9999.994, {"1000", "1234.57", "9999.99"}},
                   {100, 123.4567, 999.9994, {"100", "123.457", "999.999"}},
                   {10, 12.34567, 99.99994, {"10", "12.3457", "99.9999"}},
                   {1, 1.234567, 9.999994, {"1", "1.23457", "9.99999"}},
                   {0.1, 0.1234567, 0.9999994, {"0.1", "0.123457", "0.999999"}},
                   {0.01, 0.01234567, 0.09999994, {"0.01", "0.0123457", "0.0999999"}},
                   {0.001, 0.001234567, 0.009999994, {"0.001", "0.00123457", "0.00999999"}},
                   {0.0001, 0.0001234567, 0.0009999994, {"0.0001", "0.000123457", "0.000999999"}},
                   {1e-5, 0.00001234567, 0.00009999994, {"1e-05", "1.23457e-05", "9.99999e-05"}}};
    for (const auto& [first, among, last, texts] : decades) {
        EXPECT_EQ(std::string(Number(first)), texts[0]);
        EXPECT_EQ(std::string(Number(among)), texts[1]);
        EXPECT_EQ(std::string(Number(-among)), std::string("-") + texts[1]);
        EXPECT_EQ(std::string(Number(last)), texts[2]);
    }
    for (int exponent = 6; exponent <= 307; ++exponent) {
        const std::string power = (exponent < 10 ? "0" : "") + std::to_string(exponent);
        for (const char* digits : {"1e-", "1e+", "1.23457e-", "1.23457e+", "-9.99999e-", "-9.99999e+"}) {
            const std::string text = digits + power;
            EXPECT_EQ(std::string(Number(std::stod(text))), text);
        }
    }
    // These are rounded up to the next decade.
    EXPECT_EQ(std::string(Number(999999.6)), "1e+06");
    EXPECT_EQ(std::string(Number(99.99996)), "100");
    EXPECT_EQ(std::string(Number(0.00999999996)), "0.01");
    EXPECT_EQ(std::string(Number(0.0000999999996)), "0.0001");
}

TEST(NumberText, AfterSetKindReadsTheBytesAsTheNewKind)
{
    Number number(0x0000000700000009ull);
    number.setKind(Number::KIND_UINT32);
    EXPECT_EQ(std::string(number), littleEndian ? "9" : "7");
}

TEST(NumberText, OfADateTimeReportsALastMillisecondDigitThatIsNotZero)
{
    for (unsigned int digit = 1; digit <= 9; ++digit) {
        SCOPED_TRACE(digit);
        observe::reset();
        const Number number(dateTime(1234567890, 120 + digit, 0));
        const Bytes before = bytesOf(number);
        EXPECT_EQ(text(number), "1234567890/0.Conversion failed remainder>0");
        const auto records = observe::records();
        ASSERT_EQ(records.size(), 2u);
        expectRecordPair(records, 0, "operator std::string", "Number", "Vexilon.IC.Number", 6000,
                         "string: conversion failed, remainder not zero, remainder=" + std::to_string(digit));
        EXPECT_EQ(bytesOf(number), before);
    }
}

TEST(NumberText, OfADateTimeDependsOnTheLastDigitOfEveryMillisecondValue)
{
    for (unsigned int milliseconds = 0; milliseconds <= 65535; ++milliseconds) {
        observe::reset();
        const std::string actual = text(Number(-5L, static_cast<unsigned short>(milliseconds)));
        std::vector<std::string> logged;
        for (const observe::Record& record : observe::records())
            logged.push_back(record.message);
        if (milliseconds % 10 == 0) {
            ASSERT_EQ(actual, "-5/3") << milliseconds;
            ASSERT_THAT(logged, IsEmpty()) << milliseconds;
        } else {
            ASSERT_EQ(actual, "-5/3.Conversion failed remainder>0") << milliseconds;
            const std::string message = "string: conversion failed, remainder not zero, remainder="
                + std::to_string(milliseconds % 10);
            ASSERT_THAT(logged, ElementsAre(message, message)) << milliseconds;
        }
    }
}

TEST(NumberText, OfADateTimeWritesItsRecordsBeforeItCallsThePlatformsText)
{
    const Number number(5L, 123);
    std::vector<int> alive;
    observe::onRecord([&](const observe::Record&) { alive.push_back(observe::dateTimesAlive()); });
    observe::throwAt(observe::Call::dateTimeText, 1);
    EXPECT_THROW(text(number), observe::Thrown);
    EXPECT_EQ(observe::records().size(), 2u);
    EXPECT_THAT(alive, ElementsAre(1, 1));
    EXPECT_EQ(observe::dateTimesAlive(), 0);
}

TEST(NumberText, OfADateTimePropagatesPlatformExceptions)
{
    const Number number(5L, 123);
    // The buffer's constructor, then for each of the two records the literal, the digit, str and the logging call, then
    // the date-time's own text.
    for (int nth = 1; nth <= 10; ++nth) {
        SCOPED_TRACE(nth);
        observe::reset();
        observe::throwAt(observe::Call::any, nth);
        EXPECT_THROW(text(number), observe::Thrown);
        EXPECT_TRUE(observe::thrown());
        EXPECT_EQ(observe::buffersAlive(), 0);
        EXPECT_EQ(observe::dateTimesAlive(), 0);
    }
    observe::reset();
    observe::throwAt(observe::Call::any, 11);
    EXPECT_EQ(text(number), "5/3.Conversion failed remainder>0");
    EXPECT_FALSE(observe::thrown());
}

TEST(NumberText, OfANodeReferenceHasTheNameOfItsType)
{
    for (ZQ::Uint32 type = 0; type <= 74; ++type) {
        SCOPED_TRACE(type);
        EXPECT_EQ(text(Number(sNodeRef {type, 12})), IC::pst[type] + ":12");
    }
}

TEST(NumberText, IsCompleteOrThrowsWhenMemoryRunsOut)
{
    allocation::expectTextCompleteOrThrows(Number(18446744073709551615ull), "18446744073709551615");
    allocation::expectTextCompleteOrThrows(Number(sNodeRef {25, 4294967295}), "Power Supply:4294967295");
    allocation::expectTextCompleteOrThrows(Number(longLargest, 0),
                                           longHas64Bits ? "9223372036854775807/3" : "2147483647/3");
    allocation::expectTextCompleteOrThrows(Number(longLargest, 1),
                                           longHas64Bits
                                               ? "9223372036854775807/3.Conversion failed remainder>0"
                                               : "2147483647/3.Conversion failed remainder>0");
    EXPECT_EQ(observe::buffersAlive(), 0);
    EXPECT_EQ(observe::dateTimesAlive(), 0);
}

struct DecimalComma : std::numpunct<char> {
    char do_decimal_point() const override { return ','; }
    char do_thousands_sep() const override { return '.'; }
    std::string do_grouping() const override { return "\3"; }
};

std::locale decimalComma()
{
    return std::locale(std::locale::classic(), new DecimalComma);
}

TEST(NumberText, FollowsTheGlobalLocaleLikeANewStream)
{
    const TextRow rows[] = {{Number(-1234567), "-1.234.567"},
                            {Number(123), "123"},
                            {Number(1234567u), "1.234.567"},
                            {withKind(Number(0x000004D2000004D2ull), 3), "1.234"},  // 4 of the 8 bytes
                            {Number(18446744073709551615ull), "18.446.744.073.709.551.615"},
                            {Number(0.5), "0,5"},
                            {Number(1234.5), "1.234,5"},
                            {Number(-123456.0), "-123.456"},
                            {Number(1234567.0), "1,23457e+06"},
                            {Number(infinity), "inf"},
                            {Number(-infinity), "-inf"},
                            {Number(notANumber), "nan"},
                            {Number(Version2 {255, 15}), "255.15"},
                            {Number(sNodeRef {4, 1234567}), "CPU:1.234.567"},
                            {Number(Number::KIND_UNKNOWN), "unknown"},
                            {Number(true), "true"},
                            {Number(Number::KIND_NAN), "not a number"},
                            {Number(Number::KIND_INFINITY), "infinity"},
                            {Number(1234567890L, 0), "1234567890/3"}};
    for (const TextRow& row : rows) {
        SCOPED_TRACE(row.expected);
        const std::string before = text(row.number);
        {
            const GlobalLocale locale(decimalComma());
            EXPECT_EQ(text(row.number), row.expected);
            std::ostringstream out;
            out.imbue(std::locale::classic());
            out << row.number;
            EXPECT_EQ(out.str(), row.expected);
        }
        EXPECT_EQ(text(row.number), before);
    }
}

TEST(NumberText, IsCompleteOrThrowsUnderAnotherLocaleWhenMemoryRunsOut)
{
    {
        const GlobalLocale locale(decimalComma());
        allocation::expectTextCompleteOrThrows(Number(18446744073709551615ull), "18.446.744.073.709.551.615");
        allocation::expectTextCompleteOrThrows(Number(sNodeRef {25, 4294967295}),
                                               "Power Supply:4.294.967.295");
    }
    // Its name is composed anew each time that it is asked for.
    const GlobalLocale severalNames(std::locale(std::locale::classic(), "C.UTF-8", std::locale::collate));
    allocation::expectTextCompleteOrThrows(Number(18446744073709551615ull), "18446744073709551615");
}

TEST(NumberText, ReleasesTheGlobalLocale)
{
    bool isDestroyed = false;
    {
        const GlobalLocale locale(std::locale(std::locale::classic(), new ObservedDigits(isDestroyed)));
        EXPECT_EQ(text(Number(7u)), "7");
        EXPECT_EQ(text(Number(Version2 {2, 15})), "2.15");
    }
    EXPECT_TRUE(isDestroyed);
}

TEST(NumberText, EqualsTheOutputOfANewStream)
{
    for (const bool comma : {false, true}) {
        SCOPED_TRACE(comma ? "decimal comma" : "classic");
        const GlobalLocale locale(comma ? decimalComma() : std::locale::classic());
        for (const double real : {0.0, -0.0, 0.1, 999.5, 999.9999, 99999.95, 123456.7, 1e15, 1e-5, 2.5e-310,
                                  largest, infinity, notANumber}) {
            std::ostringstream fresh;
            fresh << real;
            EXPECT_EQ(text(Number(real)), fresh.str());
        }
        for (const unsigned long long integer :
             {0ull, 999ull, 1000ull, 123456789ull, 18446744073709551615ull}) {
            std::ostringstream fresh;
            fresh << integer;
            EXPECT_EQ(text(Number(integer)), fresh.str());
        }
        for (const int integer : {0, -1, -999, -1000, intSmallest, intLargest}) {
            std::ostringstream fresh;
            fresh << integer;
            EXPECT_EQ(text(Number(integer)), fresh.str());
        }
    }
}

// A number facet of a program's own.
class Bracketed : public std::num_put<char> {
private:
    iter_type do_put(iter_type out, std::ios_base&, char, long value) const override
    {
        return put(out, std::to_string(value));
    }
    iter_type do_put(iter_type out, std::ios_base&, char, unsigned long value) const override
    {
        return put(out, std::to_string(value));
    }
    iter_type do_put(iter_type out, std::ios_base&, char, unsigned long long value) const override
    {
        return put(out, std::to_string(value));
    }
    iter_type do_put(iter_type out, std::ios_base&, char, double value) const override
    {
        return put(out, std::to_string(value));
    }

    static iter_type put(iter_type out, const std::string& digits)
    {
        const std::string text = '<' + digits + '>';
        return std::copy(text.begin(), text.end(), out);
    }
};

// Sets the thread's rounding mode for the lifetime of the object.
class RoundingMode {
public:
    explicit RoundingMode(int mode) : before_(std::fegetround()) { EXPECT_EQ(std::fesetround(mode), 0); }
    ~RoundingMode() { std::fesetround(before_); }
    RoundingMode(const RoundingMode&) = delete;
    RoundingMode& operator=(const RoundingMode&) = delete;

private:
    int before_;
};

TEST(NumberText, OfARealFollowsTheRoundingModeOnlyUnderAnotherLocaleThanTheClassicOne)
{
    const struct {
        double real;
        const char* classic;
        const char* downward;
        const char* upward;
    } rows[] = {{1.0 / 3, "0.333333", "0,333333", "0,333334"},
                {2.0 / 3, "0.666667", "0,666666", "0,666667"},
                {-2.0 / 3, "-0.666667", "-0,666667", "-0,666666"},
                {1234567.0, "1.23457e+06", "1,23456e+06", "1,23457e+06"},
                {1e22 / 3, "3.33333e+21", "3,33333e+21", "3,33334e+21"}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.classic);
        for (const bool isUpward : {false, true}) {
            const RoundingMode mode(isUpward ? FE_UPWARD : FE_DOWNWARD);
            EXPECT_EQ(std::string(Number(row.real)), row.classic);
            const GlobalLocale locale(decimalComma());
            EXPECT_EQ(std::string(Number(row.real)), isUpward ? row.upward : row.downward);
        }
    }
}

TEST(NumberText, TakesALocaleThatEqualsTheClassicOneForIt)
{
    // Not copies of the classic locale: the first with the GNU library, which returns one for "C", and the second with
    // libc++, whose version 14 gives the first another name.
    const std::locale combined(std::locale::classic(), "C", std::locale::collate);
    const std::locale classic = combined == std::locale::classic() ? combined : std::locale("C");
    ASSERT_EQ(classic, std::locale::classic());
    const GlobalLocale locale(classic);
    const RoundingMode mode(FE_UPWARD);
    EXPECT_EQ(std::string(Number(1.0 / 3)), "0.333333");
}

TEST(NumberText, UsesTheNumberFacetOfTheGlobalLocale)
{
    const TextRow rows[] = {{Number(-7), "<-7>"},
                            {Number(intSmallest), "<-2147483648>"},
                            {Number(7), "<7>"},
                            {Number(7u), "<7>"},
                            {Number(18446744073709551615ull), "<18446744073709551615>"},
                            {Number(-0.5), "<-0.500000>"},
                            {Number(Version2 {2, 15}), "<2>.<15>"},
                            {Number(sNodeRef {4, 7}), "CPU:<7>"}};
    const GlobalLocale locale(std::locale(std::locale::classic(), new Bracketed));
    for (const TextRow& row : rows)
        EXPECT_EQ(text(row.number), row.expected);
}

TEST(NumberStream, InsertsTheTextWhateverTheStreamsSettings)
{
    for (const TextRow& row : textRows) {
        SCOPED_TRACE(row.expected);
        std::ostringstream out;
        out.imbue(decimalComma());
        out << std::hex << std::showbase << std::showpos << std::uppercase << std::scientific
            << std::setprecision(2);
        const std::ios_base::fmtflags flags = out.flags();
        EXPECT_EQ(&(out << row.number), &out);
        EXPECT_EQ(out.str(), row.expected);
        EXPECT_EQ(out.flags(), flags);
        EXPECT_EQ(out.precision(), 2);
    }
}

TEST(NumberStream, AppliesWidthAndFillToTheWholeText)
{
    std::ostringstream out;
    out << std::setfill('*') << std::setw(8) << Number(Version2 {2, 15});
    EXPECT_EQ(out.width(), 0);
    out << '|' << std::left << std::setw(8) << Number(sNodeRef {4, 7});
    out << '|' << std::internal << std::setw(8) << Number(-7);
    out << '|' << std::right << std::hex << std::setw(8) << Number(255u);
    out << '|' << std::setw(3) << Number(1234567u) << Number(true) << '|';
    EXPECT_EQ(out.str(), "****2.15|CPU:7***|******-7|*****255|1234567true|");
}

TEST(NumberStream, LeavesAFailedStreamUnchanged)
{
    std::ostringstream out;
    out.setstate(std::ios_base::failbit);
    out << Number(7u);
    EXPECT_EQ(out.rdstate(), std::ios_base::failbit);
    EXPECT_EQ(out.str(), "");
}

// ---- The table of sensor names

// Read before main: the table must be initialised before the program's own static objects.
const std::string nameBeforeMain = IC::pst[73];
const std::string textBeforeMain = text(Number(sNodeRef {52, 1}));

TEST(SensorNames, AreReadyDuringStaticInitialisation)
{
    EXPECT_EQ(nameBeforeMain, "LAN End Point");
    EXPECT_EQ(textBeforeMain, "Pellion Alert Config:1");
}

TEST(SensorNames, EqualTheExpectedNames)
{
    EXPECT_THAT(IC::pst, testing::ElementsAreArray(sensorNames));
}

}  // namespace
