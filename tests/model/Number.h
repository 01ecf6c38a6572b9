#pragma once

#include <array>
#include <cmath>
#include <cstring>
#include <limits>
#include <string>
#include <utility>

#include "Outcome.h"
#include "ZQ/DateTime.h"
#include "support/SensorNames.h"

namespace model {

enum NumberKind : unsigned int {
    UNKNOWN = 0,
    FLAG = 1,
    INT = 2,
    UINT32 = 3,
    UINT64 = 4,
    REAL = 5,
    NOT_A_NUMBER = 6,
    INFINITE = 7,
    VERSION = 8,
    DATE_TIME = 9,
    NODE_REFERENCE = 10
};
constexpr unsigned int numberKinds = 11;

struct Version {
    unsigned char major = 0;
    unsigned char minor = 0;
};

struct DateTime {
    long seconds = 0;
    unsigned int milliseconds = 0;
    unsigned int scope = 0;
};

struct NodeReference {
    unsigned int type = 0;
    unsigned int id = 0;
};

inline bool operator==(const Version& a, const Version& b)
{
    return a.major == b.major && a.minor == b.minor;
}

inline bool operator==(const DateTime& a, const DateTime& b)
{
    return a.seconds == b.seconds && a.milliseconds == b.milliseconds && a.scope == b.scope;
}

inline bool operator==(const NodeReference& a, const NodeReference& b)
{
    return a.type == b.type && a.id == b.id;
}

// The kind, the storage that all kinds except the node reference share, and the node reference.
struct Number {
    unsigned int kind = UNKNOWN;
    std::array<unsigned char, 16> storage {};
    NodeReference nodeReference;

    // The fields of a date-time stand one after another. Every other content begins at the start of the storage.
    static constexpr std::size_t atMilliseconds = sizeof(long);
    static constexpr std::size_t atScope = sizeof(long) + sizeof(unsigned short);

    template <class T>
    T read(std::size_t place = 0) const
    {
        T content;
        std::memcpy(&content, storage.data() + place, sizeof content);
        return content;
    }

    template <class T>
    void write(T content, std::size_t place = 0)
    {
        std::memcpy(storage.data() + place, &content, sizeof content);
    }

    bool flag() const { return read<unsigned char>() != 0; }
    DateTime dateTime() const
    {
        return {read<long>(), read<unsigned short>(atMilliseconds), read<unsigned char>(atScope)};
    }
};

template <class T>
Number numberOf(unsigned int kind, T content)
{
    Number number;
    number.kind = kind;
    number.write(content);
    return number;
}

inline Number numberOfVersion(unsigned char major, unsigned char minor)
{
    Number number;
    number.kind = VERSION;
    number.write(major, 0);
    number.write(minor, 1);
    return number;
}

inline Number numberOfDateTime(long seconds, unsigned short milliseconds, unsigned char scope)
{
    Number number;
    number.kind = DATE_TIME;
    number.write(seconds);
    number.write(milliseconds, Number::atMilliseconds);
    number.write(scope, Number::atScope);
    return number;
}

inline Number numberOfNodeReference(unsigned int type, unsigned int id)
{
    Number number;
    number.kind = NODE_REFERENCE;
    number.nodeReference = {type, id};
    return number;
}

inline Record numberRecord(std::string function, std::string text)
{
    return {std::move(function), "Number", "Vexilon.IC.Number", 6000, std::move(text)};
}

// A kind is stored even if it is refused. A date-time begins at `now`.
inline Outcome<Nothing> initKind(Number& number, unsigned int kind, long now)
{
    number.kind = kind;
    switch (kind) {
    case UNKNOWN:
    case FLAG:
    case NOT_A_NUMBER:
    case INFINITE:
        number.write<unsigned char>(0);
        break;
    case UINT32:
        number.write(0u);
        break;
    case UINT64:
        number.write(0ull);
        break;
    case REAL:
        number.write(0.0);
        break;
    case VERSION:
        number.write<unsigned char>(0, 0);
        number.write<unsigned char>(0, 1);
        break;
    case DATE_TIME:
        number.write(now);
        number.write<unsigned short>(0, Number::atMilliseconds);
        number.write<unsigned char>(3, Number::atScope);
        break;
    default:
        return refused<Nothing>(
            numberRecord("initKind", "initkind: invalid kind of number " + std::to_string(kind)),
            "std::invalid_argument", "Invalid kind of number");
    }
    return returned(Nothing());
}

inline Outcome<Nothing> setKind(Number& number, unsigned char code)
{
    if (code > 10)
        return refused<Nothing>(numberRecord("setKind", "setKind: invalid kind " + std::to_string(code)),
                                "std::invalid_argument", "Invalid kind");
    number.kind = code;
    return returned(Nothing());
}

inline Outcome<Number> numberOfKind(unsigned int kind, long now)
{
    Number number;
    const Outcome<Nothing> outcome = initKind(number, kind, now);
    return outcome.value ? returned(number)
                         : refused<Number>(outcome.records.front(), outcome.exception, outcome.sentence);
}

inline Outcome<Number> numberOfCode(unsigned char code, long now)
{
    if (code >= 11)
        return refused<Number>(
            numberRecord("Number", "Number: wrong kind of number: " + std::to_string(code)),
            "std::invalid_argument", "Invalid kind of number");
    return numberOfKind(code, now);
}

// The refusal of every conversion except the one to a node reference, which has a text of its own.
template <class T>
Outcome<T> refusedKind(const Number& number, const std::string& function, const std::string& target,
                       const std::string& description)
{
    const std::string sentence = "Can't return current value as a " + description;
    return refused<T>(
        numberRecord(function, target + ": " + sentence + ", kind=" + std::to_string(number.kind)),
        "std::out_of_range", sentence);
}

template <class T, class Value>
Outcome<T> refusedRange(const std::string& function, const std::string& start, Value value,
                        const std::string& sentence)
{
    return refused<T>(numberRecord(function, start + plain(value)), "std::out_of_range", sentence);
}

inline Outcome<bool> toBool(const Number& number)
{
    switch (number.kind) {
    case FLAG:
        return returned(number.flag());
    case UINT32:
        return returned(number.read<unsigned int>() != 0);
    case UINT64:
        return returned(number.read<unsigned long long>() != 0);
    case REAL:
        return returned(std::fpclassify(number.read<double>()) != FP_ZERO);
    default:
        return refusedKind<bool>(number, "operator bool", "bool", "Boolean");
    }
}

// Both 32-bit conversions, which differ in their names. The one to int also converts the kind INT.
inline Outcome<unsigned int> to32Bits(const Number& number, const char* function)
{
    const char* const start = "Uint32: number out of range: ";
    const char* const tooLarge = "The number is too large to convert to a 32-bit integer";
    const char* const negative = "A negative number cannot convert to an unsigned 32-bit integer";
    switch (number.kind) {
    case FLAG:
        return returned(number.flag() ? 1u : 0u);
    case UINT32:
        return returned(number.read<unsigned int>());
    case UINT64: {
        const auto value = number.read<unsigned long long>();
        if (value / 0x100000000ull != 0)
            return refusedRange<unsigned int>(function, start, value, tooLarge);
        return returned(static_cast<unsigned int>(value));
    }
    case REAL: {
        const auto real = number.read<double>();
        double integral = 0.0;
        static_cast<void>(std::modf(real, &integral));
        if (integral > 4294967295.0)
            return refusedRange<unsigned int>(function, start, real, tooLarge);
        if (integral < 0.0)
            return refusedRange<unsigned int>(function, start, real, negative);
        return returned(std::isnan(real) ? 0u : static_cast<unsigned int>(integral));
    }
    default:
        return refusedKind<unsigned int>(number, function, "Uint32", "32-bit integer");
    }
}

inline Outcome<unsigned int> toUint32(const Number& number)
{
    return to32Bits(number, "operator ZQ::Uint32");
}

inline Outcome<int> toInt(const Number& number)
{
    if (number.kind == INT)
        return returned(number.read<int>());
    const Outcome<unsigned int> bits = to32Bits(number, "operator int");
    if (!bits.value)
        return refused<int>(bits.records.front(), bits.exception, bits.sentence);
    const long long value = *bits.value;
    return returned(static_cast<int>(value < 0x80000000LL ? value : value - 0x100000000LL));
}

inline Outcome<unsigned long long> toUint64(const Number& number)
{
    using Target = unsigned long long;
    const char* const function = "operator ZQ::Uint64";
    const char* const start = "Uint64: number out of range: ";
    switch (number.kind) {
    case FLAG:
        return returned<Target>(number.flag() ? 1 : 0);
    case UINT32:
        return returned<Target>(number.read<unsigned int>());
    case UINT64:
        return returned(number.read<Target>());
    case REAL: {
        const auto real = number.read<double>();
        double integral = 0.0;
        static_cast<void>(std::modf(real, &integral));
        if (integral >= std::ldexp(1.0, 64))
            return refusedRange<Target>(function, start, real,
                                        "The number is too large to convert to a 64-bit integer");
        if (integral < 0.0)
            return refusedRange<Target>(function, start, real,
                                        "A negative number cannot convert to an unsigned 64-bit integer");
        if (std::isnan(real))
            return returned<Target>(9223372036854775808ull);
        // In two halves, so that neither comes near the limit of its type.
        const double upper = std::floor(integral / 4294967296.0);
        const double lower = integral - upper * 4294967296.0;
        return returned(static_cast<Target>(upper) * 4294967296ull + static_cast<Target>(lower));
    }
    default:
        return refusedKind<Target>(number, function, "Uint64", "64-bit integer");
    }
}

inline Outcome<double> toReal(const Number& number)
{
    switch (number.kind) {
    case FLAG:
        return returned(number.flag() ? 1.0 : 0.0);
    case UINT32:
        return returned(static_cast<double>(number.read<unsigned int>()));
    case UINT64: {
        // Each half is exact, so only the sum is rounded.
        const auto value = number.read<unsigned long long>();
        const auto upper = static_cast<unsigned int>(value / 0x100000000ull);
        const auto lower = static_cast<unsigned int>(value % 0x100000000ull);
        return returned(static_cast<double>(upper) * 4294967296.0 + static_cast<double>(lower));
    }
    case REAL:
        return returned(number.read<double>());
    case NOT_A_NUMBER:
        return returned(std::numeric_limits<double>::quiet_NaN());
    case INFINITE:
        return returned(std::numeric_limits<double>::infinity());
    case VERSION: {
        const double major = number.read<unsigned char>(0);
        const double minor = number.read<unsigned char>(1);
        // volatile rounds each step to a double: x87 processors calculate with more digits.
        const volatile double decimals = minor / (minor <= 9.0 ? 10.0 : minor <= 99.0 ? 100.0 : 1000.0);
        const volatile double sum = major + decimals;
        return returned(static_cast<double>(sum));
    }
    default:
        return refusedKind<double>(number, "operator ZQ::Real64", "Real", "Real");
    }
}

inline Outcome<Version> toVersion(const Number& number)
{
    const char* const function = "operator IC::Version2";
    const auto major = [&](unsigned long long value) {
        if (value > 255)
            return refusedRange<Version>(function, "Version: Number too large for version: ", value,
                                         "The number is too large to convert to a version");
        return returned(Version {static_cast<unsigned char>(value), 0});
    };
    switch (number.kind) {
    case VERSION:
        return returned(Version {number.read<unsigned char>(0), number.read<unsigned char>(1)});
    case UINT32:
        return major(number.read<unsigned int>());
    case UINT64:
        return major(number.read<unsigned long long>());
    default:
        return refusedKind<Version>(number, function, "Version", "Version");
    }
}

inline Outcome<DateTime> toDateTime(const Number& number)
{
    const DateTime time = number.dateTime();
    if (number.kind == DATE_TIME && (time.scope == 1 || time.scope == 2 || time.scope == 3))
        return returned(time);
    return refusedKind<DateTime>(number, "operator ZQ::DateTime", "DateTime", "DateTime");
}

inline Outcome<NodeReference> toNodeReference(const Number& number)
{
    if (number.kind == NODE_REFERENCE)
        return returned(number.nodeReference);
    return refused<NodeReference>(
        numberRecord("operator IC::NodeRef",
                     "NodeRef: Can't return current value as a pair, kind=" + std::to_string(number.kind)),
        "std::out_of_range", "Can't return current value as pair");
}

// Adds a record if the number is a date-time whose milliseconds are not a multiple of ten.
inline void write(std::ostream& out, std::vector<Record>& records, const Number& number)
{
    switch (number.kind) {
    case UNKNOWN:
        out << "unknown";
        break;
    case FLAG:
        out << (number.flag() ? "true" : "false");
        break;
    case INT:
        out << number.read<int>();
        break;
    case UINT32:
        out << number.read<unsigned int>();
        break;
    case UINT64:
        out << number.read<unsigned long long>();
        break;
    case REAL:
        out << number.read<double>();
        break;
    case NOT_A_NUMBER:
        out << "not a number";
        break;
    case INFINITE:
        out << "infinity";
        break;
    case VERSION:
        out << static_cast<unsigned int>(number.read<unsigned char>(0)) << "."
            << static_cast<unsigned int>(number.read<unsigned char>(1));
        break;
    case DATE_TIME: {
        const DateTime time = number.dateTime();
        const unsigned int remainder = time.milliseconds % 10;
        out << std::string(ZQ::DateTime(time.seconds, time.scope));
        if (remainder != 0) {
            records.push_back(numberRecord("operator std::string",
                                           "string: conversion failed, remainder not zero, remainder="
                                               + std::to_string(remainder)));
            out << "."
                << "Conversion failed remainder>0";
        }
        break;
    }
    case NODE_REFERENCE: {
        const unsigned int type = number.nodeReference.type;
        out << sensorNames[type <= 73 ? type : 74] << ":" << number.nodeReference.id;
        break;
    }
    default:
        out << "invalid";
    }
}

// Never throws.
inline Outcome<std::string> textOf(const Number& number)
{
    std::ostringstream out;
    Outcome<std::string> outcome;
    write(out, outcome.records, number);
    outcome.value = out.str();
    return outcome;
}

inline bool equal(const Number& a, const Number& b)
{
    if (a.kind != b.kind)
        return false;
    switch (a.kind) {
    case FLAG:
        return a.read<unsigned char>() == b.read<unsigned char>();
    case UINT32:
        return a.read<unsigned int>() == b.read<unsigned int>();
    case UINT64:
        return a.read<unsigned long long>() == b.read<unsigned long long>();
    case REAL:
        return a.read<double>() <= b.read<double>() && a.read<double>() >= b.read<double>();
    case VERSION:
        return a.read<unsigned char>(0) == b.read<unsigned char>(0)
            && a.read<unsigned char>(1) == b.read<unsigned char>(1);
    case DATE_TIME:
        return a.dateTime().seconds == b.dateTime().seconds
            && a.dateTime().milliseconds == b.dateTime().milliseconds;
    default:
        return true;
    }
}

// Whether a comes before b; both are of the same kind.
inline bool precedes(const Number& a, const Number& b)
{
    switch (a.kind) {
    case FLAG:
        return a.read<unsigned char>() < b.read<unsigned char>();
    case UINT32:
        return a.read<unsigned int>() < b.read<unsigned int>();
    case UINT64:
        return a.read<unsigned long long>() < b.read<unsigned long long>();
    case REAL:
        return a.read<double>() < b.read<double>();
    case VERSION:
        if (a.read<unsigned char>(0) != b.read<unsigned char>(0))
            return a.read<unsigned char>(0) < b.read<unsigned char>(0);
        return a.read<unsigned char>(1) < b.read<unsigned char>(1);
    case DATE_TIME:
        if (a.dateTime().seconds != b.dateTime().seconds)
            return a.dateTime().seconds < b.dateTime().seconds;
        return a.dateTime().milliseconds < b.dateTime().milliseconds;
    default:
        return false;
    }
}

inline Outcome<bool> refusedOrder(const std::string& sign, const std::string& text,
                                  const std::string& sentence)
{
    return refused<bool>(numberRecord("operator" + sign, sign + ": " + text), "std::invalid_argument",
                         sentence);
}

inline Outcome<bool> refusedNotANumber(const std::string& sign)
{
    return refusedOrder(sign, "invalid operation when kind is NaN", "Invalid operation when kind is NaN");
}

inline Outcome<bool> refusedKinds(const std::string& sign, const Number& a, const Number& b)
{
    return refusedOrder(sign,
                        "cannot compare two different kinds of number, kind1=" + std::to_string(a.kind)
                            + ", kind2=" + std::to_string(b.kind),
                        "Cannot compare two different kinds of number");
}

inline Outcome<bool> less(const Number& a, const Number& b)
{
    if (a.kind == NOT_A_NUMBER || b.kind == NOT_A_NUMBER)
        return refusedNotANumber("<");
    if (a.kind == INFINITE)
        return returned(false);
    if (a.kind != b.kind)
        return refusedKinds("<", a, b);
    return returned(precedes(a, b));
}

inline Outcome<bool> greater(const Number& a, const Number& b)
{
    if (a.kind == NOT_A_NUMBER || b.kind == NOT_A_NUMBER)
        return refusedNotANumber(">");
    if (a.kind == INFINITE)
        return returned(b.kind != INFINITE);
    if (a.kind != b.kind)
        return refusedKinds(">", a, b);
    return returned(precedes(b, a));
}

}  // namespace model
