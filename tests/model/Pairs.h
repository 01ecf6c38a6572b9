#pragma once

#include <string>
#include <utility>
#include <vector>

#include "Agreement.h"
#include "IC/Property.h"
#include "Number.h"
#include "PropertyValue.h"

// A value of the library, and the value that the model makes from the same arguments.
namespace agreement {

struct NumberPair {
    IC::Number actual;
    model::Number expected;
};

inline NumberPair pairOf(bool value)
{
    return {IC::Number(value), model::numberOf<unsigned char>(model::FLAG, value ? 1 : 0)};
}
inline NumberPair pairOf(int value)
{
    return {IC::Number(value), model::numberOf(model::INT, value)};
}
inline NumberPair pairOf(unsigned int value)
{
    return {IC::Number(value), model::numberOf(model::UINT32, value)};
}
inline NumberPair pairOf(unsigned long long value)
{
    return {IC::Number(value), model::numberOf(model::UINT64, value)};
}
inline NumberPair pairOf(double value)
{
    return {IC::Number(value), model::numberOf(model::REAL, value)};
}
inline NumberPair pairOf(IC::Version2 value)
{
    return {IC::Number(value), model::numberOfVersion(value.major, value.minor)};
}
inline NumberPair pairOf(IC::sNodeRef value)
{
    return {IC::Number(value), model::numberOfNodeReference(value.type, value.id)};
}
inline NumberPair pairOf(long seconds, unsigned short milliseconds)
{
    return {IC::Number(seconds, milliseconds), model::numberOfDateTime(seconds, milliseconds, 3)};
}
// From the platform's date-time, whose milliseconds are cut to 16 bits and its scope to 8.
inline NumberPair pairOf(long seconds, unsigned int milliseconds, unsigned int scope)
{
    ZQ::DateTime time(seconds, scope);
    time.setMillisecond(milliseconds);
    return {IC::Number(time),
            model::numberOfDateTime(seconds, static_cast<unsigned short>(milliseconds % 65536),
                                    static_cast<unsigned char>(scope % 256))};
}
// For the kinds without content: UNKNOWN, NOT_A_NUMBER, INFINITE.
inline NumberPair pairOfKind(model::NumberKind kind)
{
    return {IC::Number(static_cast<IC::Number::KindType>(kind)), *model::numberOfKind(kind, 0).value};
}

struct ValuePair {
    IC::PropertyValue actual;
    model::PropertyValue expected;
};

inline ValuePair pairOf(const NumberPair& number, bool readOnly)
{
    ValuePair pair {IC::PropertyValue(number.actual, readOnly), model::firstValue(model::NUMBER, readOnly)};
    pair.expected.number = number.expected;
    return pair;
}
inline ValuePair pairOf(const std::string& text, bool readOnly)
{
    ValuePair pair {IC::PropertyValue(text, readOnly), model::firstValue(model::TEXT, readOnly)};
    pair.expected.text = text;
    return pair;
}
inline ValuePair pairOf(const std::vector<unsigned char>& bytes, bool readOnly)
{
    ValuePair pair {IC::PropertyValue(bytes, readOnly), model::firstValue(model::BUFFER, readOnly)};
    pair.expected.buffer = bytes;
    return pair;
}
inline ValuePair pairOf(const IC::EnumValue& value, bool readOnly)
{
    ValuePair pair {IC::PropertyValue(value, readOnly), model::firstValue(model::ENUM_VALUE, readOnly)};
    pair.expected.enumValue = value.operator unsigned int();
    return pair;
}
inline ValuePair pairOf(const std::vector<NumberPair>& numbers, bool readOnly)
{
    IC::NumberArray array;
    model::PropertyValue expected = model::firstValue(model::NUMBER_ARRAY, readOnly);
    for (const NumberPair& number : numbers) {
        array.push_back(number.actual);
        expected.numbers.push_back(number.expected);
    }
    return {IC::PropertyValue(array, readOnly), expected};
}
inline ValuePair pairOf(const std::vector<std::string>& texts, bool readOnly)
{
    ValuePair pair {IC::PropertyValue(texts, readOnly), model::firstValue(model::TEXT_ARRAY, readOnly)};
    pair.expected.texts = texts;
    return pair;
}
inline ValuePair pairOfNothing(bool readOnly)
{
    return {IC::PropertyValue(IC::PropertyValue::KIND_UNKNOWN, readOnly),
            model::firstValue(model::NOTHING, readOnly)};
}

}  // namespace agreement
