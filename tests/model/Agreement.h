#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <iterator>
#include <stdexcept>
#include <string>
#include <typeinfo>
#include <utility>
#include <vector>

#include "IC/ICException.h"
#include "IC/Property.h"
#include "Number.h"
#include "Outcome.h"
#include "PropertyValue.h"

// Runs operations on a value of the library and on the model's, and describes the difference in value, exception and
// records. An empty text means that they agree.
namespace agreement {

// A call of the logger. `plain` means that `data`, `a` and `b` are null, 0 and 0, as in every record of the library.
struct LoggerCall {
    bool trace;
    int line;
    bool plain;
    model::Record record;
};

// Returns the calls of the logger since the last call of this function. Defined for the test kit in
// ObservedRecords.cpp and for the stand-in in StandInRecords.cpp; a program is linked with one of them.
std::vector<LoggerCall> takeLoggerCalls();

// Combines each log record with the trace record after it. Anything else becomes a record that the model never expects.
inline std::vector<model::Record> inPairs(std::vector<LoggerCall> calls)
{
    std::vector<model::Record> records;
    for (std::size_t i = 0; i < calls.size(); i += 2) {
        const bool pair = i + 1 < calls.size() && !calls[i].trace && calls[i + 1].trace
            && calls[i].line == calls[i + 1].line && calls[i].line > 0 && calls[i].plain && calls[i + 1].plain
            && calls[i].record == calls[i + 1].record;
        if (!pair)
            calls[i].record = {"no pair of records", {}, {}, 0, calls[i].record.text};
        records.push_back(std::move(calls[i].record));
    }
    return records;
}

// Converts the library's values to those of the model.
template <class T>
const T& asModel(const T& value)
{
    return value;
}
inline model::Version asModel(const IC::Version2& value)
{
    return {value.major, value.minor};
}
inline model::NodeReference asModel(const IC::sNodeRef& value)
{
    return {value.type, value.id};
}
inline model::DateTime asModel(const ZQ::DateTime& value)
{
    return {static_cast<long>(value), value.getMillisecond(), value.getScope()};
}
inline unsigned int asModel(const IC::EnumValue& value)
{
    return value;
}

// Runs the library's operation and returns how it ended.
template <class Operation>
auto outcomeOf(Operation operation)
{
    using T = std::decay_t<decltype(asModel(operation()))>;
    model::Outcome<T> outcome;
    const auto failed = [&](const char* exception, const std::string& sentence) {
        outcome.exception = exception;
        outcome.sentence = sentence;
    };
    takeLoggerCalls();
    try {
        outcome.value.emplace(asModel(operation()));
    } catch (const IC::PropertyValueInvalidKind& exception) {
        failed("IC::PropertyValueInvalidKind", exception.what());
    } catch (const std::exception& exception) {
        failed(typeid(exception) == typeid(std::out_of_range)           ? "std::out_of_range"
                   : typeid(exception) == typeid(std::invalid_argument) ? "std::invalid_argument"
                                                                        : typeid(exception).name(),
               exception.what());
    }
    outcome.records = inPairs(takeLoggerCalls());
    return outcome;
}

inline std::string shown(double value)
{
    std::uint64_t bits = 0;
    std::memcpy(&bits, &value, sizeof bits);
    return model::plain(value) + " of bits " + std::to_string(bits);
}
inline std::string shown(bool value)
{
    return value ? "true" : "false";
}
inline std::string shown(int value)
{
    return std::to_string(value);
}
inline std::string shown(unsigned int value)
{
    return std::to_string(value);
}
inline std::string shown(unsigned long long value)
{
    return std::to_string(value);
}
inline std::string shown(const std::string& value)
{
    return '"' + value + '"';
}
inline std::string shown(const std::vector<std::string>& value)
{
    std::string all;
    for (const std::string& text : value)
        all += shown(text) + ' ';
    return all;
}
inline std::string shown(const std::vector<unsigned char>& value)
{
    std::string all;
    for (const unsigned char byte : value)
        all += model::hexadecimal(byte);
    return all;
}
inline std::string shown(const model::Version& value)
{
    return std::to_string(value.major) + '.' + std::to_string(value.minor);
}
inline std::string shown(const model::NodeReference& value)
{
    return std::to_string(value.type) + ':' + std::to_string(value.id);
}
inline std::string shown(const model::DateTime& value)
{
    return std::to_string(value.seconds) + " s, " + std::to_string(value.milliseconds) + " ms, scope "
        + std::to_string(value.scope);
}
inline std::string shown(model::Nothing)
{
    return "nothing";
}
inline std::string shown(const std::vector<model::Record>& records)
{
    std::string all;
    for (const model::Record& record : records)
        all += '[' + record.category + ' ' + record.file + ' ' + record.function + ' '
            + std::to_string(record.level) + ": " + record.text + ']';
    return all;
}

template <class T>
std::string shown(const model::Outcome<T>& outcome)
{
    return (outcome.value ? shown(*outcome.value) : outcome.exception + " \"" + outcome.sentence + '"')
        + " with the records " + shown(outcome.records);
}

template <class T>
bool same(const T& a, const T& b)
{
    return a == b;
}
// Compares the bits, so that NaNs and the signs of zeros have to agree too.
inline bool same(double a, double b)
{
    return std::memcmp(&a, &b, sizeof a) == 0;
}

// Returns what the operation should have done and what it did, or an empty text if both are the same.
template <class T>
std::string difference(const char* operation, const model::Outcome<T>& expected,
                       const model::Outcome<T>& actual)
{
    const bool values = expected.value && actual.value ? same(*expected.value, *actual.value)
                                                       : !expected.value && !actual.value;
    if (values && expected.exception == actual.exception && expected.sentence == actual.sentence
        && expected.records == actual.records)
        return {};
    return std::string(operation) + ": expected " + shown(expected) + ", but was " + shown(actual);
}

// The conversions of a number; the text is one of them.
enum Target { BOOL, INT, UINT32, UINT64, REAL, VERSION, DATE_TIME, NODE_REFERENCE, TEXT };
constexpr unsigned int targets = 9;

inline std::string differenceInConversion(const IC::Number& number, const model::Number& expected,
                                          unsigned int target)
{
    switch (target) {
    case BOOL:
        return difference("to bool", model::toBool(expected),
                          outcomeOf([&] { return number.operator bool(); }));
    case INT:
        return difference("to int", model::toInt(expected), outcomeOf([&] { return number.operator int(); }));
    case UINT32:
        return difference("to unsigned int", model::toUint32(expected),
                          outcomeOf([&] { return number.operator unsigned int(); }));
    case UINT64:
        return difference("to unsigned long long", model::toUint64(expected),
                          outcomeOf([&] { return number.operator unsigned long long(); }));
    case REAL:
        return difference("to double", model::toReal(expected),
                          outcomeOf([&] { return number.operator double(); }));
    case VERSION:
        return difference("to Version2", model::toVersion(expected),
                          outcomeOf([&] { return number.operator IC::Version2(); }));
    case DATE_TIME:
        return difference("to DateTime", model::toDateTime(expected),
                          outcomeOf([&] { return number.operator ZQ::DateTime(); }));
    case NODE_REFERENCE:
        return difference("to sNodeRef", model::toNodeReference(expected),
                          outcomeOf([&] { return number.operator IC::sNodeRef(); }));
    default:
        return difference("text", model::textOf(expected),
                          outcomeOf([&] { return number.operator std::string(); }));
    }
}

// Compares kind, content and node reference. Reads the content as KIND_UINT64 and KIND_NODEREF, which are not refused.
inline std::string differenceInContent(const IC::Number& number, const model::Number& expected)
{
    if (number.getKind() != expected.kind)
        return "kind " + std::to_string(number.getKind()) + " instead of " + std::to_string(expected.kind);
    IC::Number bits = number;
    bits.setKind(IC::Number::KIND_UINT64);
    if (bits.operator unsigned long long() != expected.read<unsigned long long>())
        return "content " + std::to_string(bits.operator unsigned long long()) + " instead of "
            + std::to_string(expected.read<unsigned long long>());
    IC::Number reference = number;
    reference.setKind(IC::Number::KIND_NODEREF);
    const auto nodeReference = asModel(reference.operator IC::sNodeRef());
    if (!(nodeReference == expected.nodeReference))
        return "node reference " + shown(nodeReference) + " instead of " + shown(expected.nodeReference);
    if (expected.kind == model::DATE_TIME && model::toDateTime(expected).value)
        return differenceInConversion(number, expected, DATE_TIME);
    return {};
}

inline std::string differenceInContent(const IC::NumberArray& numbers,
                                       const std::vector<model::Number>& expected)
{
    if (numbers.size() != expected.size())
        return std::to_string(numbers.size()) + " numbers instead of " + std::to_string(expected.size());
    for (std::size_t i = 0; i < numbers.size(); ++i) {
        const std::string found = differenceInContent(numbers[i], expected[i]);
        if (!found.empty())
            return "number " + std::to_string(i) + ": " + found;
    }
    return {};
}

// The conversions of a property value; the text is one of them.
enum PropertyTarget {
    PROPERTY_BOOL,
    PROPERTY_UINT32,
    PROPERTY_UINT64,
    PROPERTY_REAL,
    PROPERTY_VERSION,
    PROPERTY_NUMBER,
    PROPERTY_ENUM_VALUE,
    PROPERTY_BUFFER,
    PROPERTY_NUMBER_ARRAY,
    PROPERTY_TEXT_ARRAY,
    PROPERTY_TEXT
};
constexpr unsigned int propertyTargets = 11;

// For results that have no operator== in the model, numbers and arrays of numbers: compares how the operation ended,
// then the content of its result.
template <class Value, class Expected, class Operation>
std::string differenceInNumbers(const char* name, const model::Outcome<Expected>& expected,
                                Operation operation)
{
    std::string inContent;
    const auto actual = outcomeOf([&] {
        const Value value = operation();
        inContent = expected.value ? differenceInContent(value, *expected.value) : "was not refused";
        return model::Nothing();
    });
    model::Outcome<model::Nothing> ending;
    if (expected.value)
        ending.value.emplace();
    ending.exception = expected.exception;
    ending.sentence = expected.sentence;
    ending.records = expected.records;
    const std::string found = difference(name, ending, actual);
    return found.empty() ? inContent : found;
}

inline std::string differenceInConversion(const IC::PropertyValue& value,
                                          const model::PropertyValue& expected, unsigned int target)
{
    switch (target) {
    case PROPERTY_BOOL:
        return difference("property to bool", model::toBool(expected),
                          outcomeOf([&] { return value.operator bool(); }));
    case PROPERTY_UINT32:
        return difference("property to unsigned int", model::toUint32(expected),
                          outcomeOf([&] { return value.operator unsigned int(); }));
    case PROPERTY_UINT64:
        return difference("property to unsigned long long", model::toUint64(expected),
                          outcomeOf([&] { return value.operator unsigned long long(); }));
    case PROPERTY_REAL:
        return difference("property to double", model::toReal(expected),
                          outcomeOf([&] { return value.operator double(); }));
    case PROPERTY_VERSION:
        return difference("property to Version2", model::toVersion(expected),
                          outcomeOf([&] { return value.operator IC::Version2(); }));
    case PROPERTY_NUMBER:
        return differenceInNumbers<IC::Number>("property to Number", model::toNumber(expected),
                                               [&] { return value.operator IC::Number(); });
    case PROPERTY_ENUM_VALUE:
        return difference("property to EnumValue", model::toEnumValue(expected),
                          outcomeOf([&] { return value.operator IC::EnumValue(); }));
    case PROPERTY_BUFFER:
        return difference("property to Buffer", model::toBuffer(expected),
                          outcomeOf([&] { return value.operator IC::Buffer(); }));
    case PROPERTY_NUMBER_ARRAY:
        return differenceInNumbers<IC::NumberArray>("property to NumberArray", model::toNumberArray(expected),
                                                    [&] { return value.operator IC::NumberArray(); });
    case PROPERTY_TEXT_ARRAY:
        return difference("property to StringArray", model::toTextArray(expected),
                          outcomeOf([&] { return value.operator IC::StringArray(); }));
    default:
        return difference("property's text", model::textOf(expected),
                          outcomeOf([&] { return value.operator std::string(); }));
    }
}

// Compares the kind, the read-only mark and the content.
inline std::string differenceInContent(const IC::PropertyValue& value, const model::PropertyValue& expected)
{
    // For each kind, the conversion that returns the whole content.
    constexpr PropertyTarget content[model::propertyKinds] = {
        PROPERTY_TEXT,       PROPERTY_NUMBER,       PROPERTY_TEXT,      PROPERTY_BUFFER,
        PROPERTY_ENUM_VALUE, PROPERTY_NUMBER_ARRAY, PROPERTY_TEXT_ARRAY};
    if (value.getKind() != expected.kind)
        return "kind " + std::to_string(value.getKind()) + " instead of " + std::to_string(expected.kind);
    if (value.readOnly() != expected.readOnly)
        return "read-only is " + shown(value.readOnly()) + " instead of " + shown(expected.readOnly);
    return differenceInConversion(value, expected, expected.empty ? PROPERTY_TEXT : content[expected.kind]);
}

enum Comparison { EQUAL, UNEQUAL, LESS, LESS_OR_EQUAL, GREATER, GREATER_OR_EQUAL };
constexpr unsigned int comparisons = 6;

// Compares two numbers, or two property values.
template <class Value, class Expected>
std::string differenceInComparison(const Value& a, const Value& b, const Expected& expectedA,
                                   const Expected& expectedB, unsigned int comparison)
{
    switch (comparison) {
    case EQUAL:
        return difference("==", model::returned(model::equal(expectedA, expectedB)),
                          outcomeOf([&] { return a == b; }));
    case UNEQUAL:
        return difference("!=", model::returned(!model::equal(expectedA, expectedB)),
                          outcomeOf([&] { return a != b; }));
    case LESS:
        return difference("<", model::less(expectedA, expectedB), outcomeOf([&] { return a < b; }));
    case LESS_OR_EQUAL:
        return difference("<=", model::lessOrEqual(expectedA, expectedB), outcomeOf([&] { return a <= b; }));
    case GREATER:
        return difference(">", model::greater(expectedA, expectedB), outcomeOf([&] { return a > b; }));
    default:
        return difference(">=", model::greaterOrEqual(expectedA, expectedB),
                          outcomeOf([&] { return a >= b; }));
    }
}

}  // namespace agreement
