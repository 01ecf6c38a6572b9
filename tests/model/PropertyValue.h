#pragma once

#include <algorithm>
#include <map>
#include <string>
#include <utility>
#include <vector>

#include "Number.h"
#include "Outcome.h"

namespace model {

enum PropertyKind : unsigned int {
    NOTHING = 0,
    NUMBER = 1,
    TEXT = 2,
    BUFFER = 3,
    ENUM_VALUE = 4,
    NUMBER_ARRAY = 5,
    TEXT_ARRAY = 6
};
constexpr unsigned int propertyKinds = 7;

inline Record enumValueRecord(std::string function, std::string text)
{
    return {std::move(function), "EnumValue", "Vexilon.IC.EnumValue", 6000, std::move(text)};
}

inline Outcome<unsigned int> toUint16(unsigned int enumValue)
{
    if (enumValue <= 65535)
        return returned(enumValue);
    return refused<unsigned int>(
        enumValueRecord("operator ZQ::Uint16", "Uint16: number out of range: " + std::to_string(enumValue)),
        "std::out_of_range", "The number is too large to convert to a 16-bit integer");
}

inline Outcome<unsigned int> toUint8(unsigned int enumValue)
{
    if (enumValue <= 255)
        return returned(enumValue);
    return refused<unsigned int>(
        enumValueRecord("operator ZQ::Uint8", "Uint8: number out of range: " + std::to_string(enumValue)),
        "std::out_of_range", "The number is too large to convert to an 8-bit integer");
}

// Every kind has its own member; the kind says which of them is valid.
struct PropertyValue {
    unsigned int kind = NOTHING;
    bool readOnly = false;
    bool empty = false;  // has no object, as a refused setKind leaves it
    Number number;
    std::string text;
    std::vector<unsigned char> buffer;
    unsigned int enumValue = 0;
    std::vector<Number> numbers;
    std::vector<std::string> texts;

    bool holds(PropertyKind wanted) const { return kind == wanted && !empty; }
};

inline Record propertyRecord(std::string function, std::string text)
{
    return {std::move(function), "Property", "Vexilon.IC.Property", 6000, std::move(text)};
}

inline PropertyValue firstValue(unsigned int kind, bool readOnly)
{
    PropertyValue value;
    value.kind = kind;
    value.readOnly = readOnly;
    return value;
}

inline Outcome<Nothing> refusedPropertyKind(unsigned char code)
{
    return refused<Nothing>(
        propertyRecord("initKind",
                       "PropertyValue:initKind: invalid kind of property: " + std::to_string(code)),
        "IC::PropertyValueInvalidKind", "Invalid kind of property");
}

// Makes the value of a kind code. The caller has cut a wider code to one byte.
inline Outcome<Nothing> makeKind(PropertyValue& value, unsigned char code, bool readOnly)
{
    if (code > 6)
        return refusedPropertyKind(code);
    value = firstValue(code, readOnly);
    return returned(Nothing());
}

// A refused code destroys the content and keeps the kind.
inline Outcome<Nothing> setKind(PropertyValue& value, unsigned char code)
{
    if (code == value.kind)
        return returned(Nothing());
    if (code > 6) {
        value.empty = value.kind != NOTHING;
        return refusedPropertyKind(code);
    }
    value = firstValue(code, value.readOnly);
    return returned(Nothing());
}

template <class T>
Outcome<T> refusedConversion(const PropertyValue& value, const std::string& function, const std::string& text,
                             const std::string& target)
{
    return refused<T>(propertyRecord(function, text + std::to_string(value.kind)),
                      "IC::PropertyValueInvalidKind", "Can't return current value as a " + target);
}

inline Outcome<double> toReal(const PropertyValue& value)
{
    if (value.holds(NUMBER))
        return toReal(value.number);
    if (value.holds(ENUM_VALUE))
        return returned(static_cast<double>(value.enumValue));
    return refusedConversion<double>(
        value, "operator ZQ::Real64",
        "PropertyValue:Real64: can't return current value as a Real64, kind=", "Number");
}

inline Outcome<unsigned long long> toUint64(const PropertyValue& value)
{
    if (value.holds(NUMBER))
        return toUint64(value.number);
    if (value.holds(ENUM_VALUE))
        return returned<unsigned long long>(value.enumValue);
    return refusedConversion<unsigned long long>(
        value, "operator ZQ::Uint64",
        "PropertyValue:Uint64: can't return current value as a Uint64, kind=", "Number");
}

inline Outcome<unsigned int> toUint32(const PropertyValue& value)
{
    if (value.holds(NUMBER))
        return toUint32(value.number);
    if (value.holds(ENUM_VALUE))
        return returned(value.enumValue);
    return refusedConversion<unsigned int>(
        value, "operator ZQ::Uint32",
        "PropertyValue::Uint32: can't return current value as a Uint32, kind=", "Number");
}

inline Outcome<bool> toBool(const PropertyValue& value)
{
    if (value.holds(NUMBER))
        return toBool(value.number);
    return refusedConversion<bool>(
        value, "operator bool", "PropertyValue::bool: can't return current value as a bool, kind=", "Number");
}

inline Outcome<Number> toNumber(const PropertyValue& value)
{
    if (value.holds(NUMBER))
        return returned(value.number);
    return refusedConversion<Number>(
        value, "operator IC::Number",
        "PropertyValue:Number: can't return current value as a Number, kind=", "Number");
}

inline Outcome<Version> toVersion(const PropertyValue& value)
{
    if (value.holds(NUMBER))
        return toVersion(value.number);
    return refusedConversion<Version>(
        value, "operator IC::Version2",
        "PropertyValue:Version2: can't return current value as a Version2, kind=", "Number");
}

// A refusal writes no record.
inline Outcome<unsigned int> toEnumValue(const PropertyValue& value)
{
    if (value.holds(ENUM_VALUE))
        return returned(value.enumValue);
    Outcome<unsigned int> outcome;
    outcome.exception = "IC::PropertyValueInvalidKind";
    outcome.sentence = "Can't return current value as a EnumValue";
    return outcome;
}

inline Outcome<std::vector<unsigned char>> toBuffer(const PropertyValue& value)
{
    if (value.holds(BUFFER))
        return returned(value.buffer);
    return refusedConversion<std::vector<unsigned char>>(
        value, "operator IC::Buffer",
        "PropertyValue:Buffer: can't return current value as a Buffer, kind=", "Buffer");
}

inline Outcome<std::vector<Number>> toNumberArray(const PropertyValue& value)
{
    if (value.holds(NUMBER_ARRAY))
        return returned(value.numbers);
    return refusedConversion<std::vector<Number>>(
        value, "operator IC::NumberArray",
        "PropertyValue:NumberArray: can't return current value as a NumberArray, kind=", "NumberArray");
}

inline Outcome<std::vector<std::string>> toTextArray(const PropertyValue& value)
{
    if (value.holds(TEXT_ARRAY))
        return returned(value.texts);
    return refusedConversion<std::vector<std::string>>(
        value, "operator IC::StringArray",
        "PropertyValue:StringArray: can't return current value as a StringArray, kind=", "StringArray");
}

inline std::string hexadecimal(unsigned char byte)
{
    const std::string digits = "0123456789abcdef";
    return {digits[byte / 16], digits[byte % 16]};
}

inline Outcome<std::string> textOf(const PropertyValue& value)
{
    if (value.empty)
        return returned<std::string>("invalid");
    std::ostringstream out;
    Outcome<std::string> outcome;
    switch (value.kind) {
    case NOTHING:
        out << "unknown";
        break;
    case NUMBER:
        write(out, outcome.records, value.number);
        break;
    case TEXT:
        out << value.text;
        break;
    case BUFFER:
        for (std::size_t i = 0; i < value.buffer.size(); ++i)
            out << hexadecimal(value.buffer[i]) << (i % 4 == 3 ? " " : "");
        break;
    case ENUM_VALUE:
        out << value.enumValue;
        break;
    case NUMBER_ARRAY:
        out << "{";
        for (std::size_t i = 0; i < value.numbers.size(); ++i) {
            out << (i == 0 ? "" : ", ");
            write(out, outcome.records, value.numbers[i]);
        }
        out << "}";
        break;
    case TEXT_ARRAY:
        out << "{";
        for (std::size_t i = 0; i < value.texts.size(); ++i) {
            out << (i == 0 ? "\"" : ", \"");
            for (const char character : value.texts[i]) {
                if (character == '"')
                    out << '\\';
                out << character;
            }
            out << "\"";
        }
        out << "}";
        break;
    default:
        out << "invalid";
    }
    outcome.value = out.str();
    return outcome;
}

inline bool equal(const PropertyValue& a, const PropertyValue& b)
{
    if (a.kind != b.kind)
        return false;
    switch (a.kind) {
    case NUMBER:
        return equal(a.number, b.number);
    case TEXT:
        return a.text == b.text;
    case BUFFER:
        return a.buffer == b.buffer;
    case ENUM_VALUE:
        return a.enumValue == b.enumValue;
    case NUMBER_ARRAY:
        if (a.numbers.size() != b.numbers.size())
            return false;
        for (std::size_t i = 0; i < a.numbers.size(); ++i)
            if (!equal(a.numbers[i], b.numbers[i]))
                return false;
        return true;
    case TEXT_ARRAY:
        return a.texts == b.texts;
    default:
        return true;
    }
}

// The order of texts and buffers, by their bytes as unsigned numbers.
template <class Bytes>
bool precedesByBytes(const Bytes& a, const Bytes& b)
{
    for (std::size_t i = 0; i < std::min(a.size(), b.size()); ++i) {
        const auto left = static_cast<unsigned char>(a[i]);
        const auto right = static_cast<unsigned char>(b[i]);
        if (left != right)
            return left < right;
    }
    return a.size() < b.size();
}

inline Outcome<bool> precedes(const std::vector<Number>& a, const std::vector<Number>& b)
{
    for (std::size_t i = 0; i < std::min(a.size(), b.size()); ++i) {
        const Outcome<bool> isLess = less(a[i], b[i]);
        if (!isLess.value || *isLess.value)
            return isLess;
        const Outcome<bool> isGreater = less(b[i], a[i]);
        if (!isGreater.value)
            return isGreater;
        if (*isGreater.value)
            return returned(false);
    }
    return returned(a.size() < b.size());
}

inline bool precedes(const std::vector<std::string>& a, const std::vector<std::string>& b)
{
    for (std::size_t i = 0; i < std::min(a.size(), b.size()); ++i)
        if (a[i] != b[i])
            return precedesByBytes(a[i], b[i]);
    return a.size() < b.size();
}

// Whether a comes before b; both are of the same kind, which is not NUMBER.
inline Outcome<bool> precedes(const PropertyValue& a, const PropertyValue& b)
{
    if (a.empty || b.empty)
        return returned(false);
    switch (a.kind) {
    case TEXT:
        return returned(precedesByBytes(a.text, b.text));
    case BUFFER:
        return returned(precedesByBytes(a.buffer, b.buffer));
    case ENUM_VALUE:
        return returned(a.enumValue < b.enumValue);
    case NUMBER_ARRAY:
        return precedes(a.numbers, b.numbers);
    case TEXT_ARRAY:
        return returned(precedes(a.texts, b.texts));
    default:
        return returned(false);
    }
}

inline Outcome<bool> refusedPropertyKinds(const std::string& sign, const PropertyValue& a,
                                          const PropertyValue& b)
{
    return refused<bool>(propertyRecord("operator" + sign,
                                        sign + ": cannot compare two different kinds of properties, kind1="
                                            + std::to_string(a.kind) + ", kind2=" + std::to_string(b.kind)),
                         "IC::PropertyValueInvalidKind", "Cannot compare two different kinds of properties");
}

inline Outcome<bool> less(const PropertyValue& a, const PropertyValue& b)
{
    if (a.kind != b.kind)
        return refusedPropertyKinds("<", a, b);
    if (a.holds(NUMBER) && b.holds(NUMBER))
        return less(a.number, b.number);
    return precedes(a, b);
}

inline Outcome<bool> greater(const PropertyValue& a, const PropertyValue& b)
{
    if (a.kind != b.kind)
        return refusedPropertyKinds(">", a, b);
    if (a.holds(NUMBER) && b.holds(NUMBER))
        return greater(a.number, b.number);
    return precedes(b, a);
}

// For numbers and property values. The comparison of equal values is never refused.
template <class Value>
Outcome<bool> lessOrEqual(const Value& a, const Value& b)
{
    return equal(a, b) ? returned(true) : less(a, b);
}

template <class Value>
Outcome<bool> greaterOrEqual(const Value& a, const Value& b)
{
    return equal(a, b) ? returned(true) : greater(a, b);
}

inline std::string textOf(const std::map<unsigned int, PropertyValue>& properties)
{
    std::ostringstream out;
    for (auto property = properties.begin(); property != properties.end(); ++property)
        out << (property == properties.begin() ? "[" : ", [") << property->first << " = "
            << *textOf(property->second).value << "]";
    return out.str();
}

}  // namespace model
