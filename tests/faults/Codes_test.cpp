#include <algorithm>
#include <functional>
#include <memory>
#include <ostream>
#include <set>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "IC/Alert.h"
#include "IC/EnumValue.h"
#include "IC/Error.h"
#include "IC/Node.h"
#include "IC/Number.h"
#include "IC/Property.h"
#include "Trial.h"
#include "ZQ/DateTime.h"
#include "observe/Refusal.h"
#include "support/SensorNames.h"

// Tries every operation that takes a code. Codes of one byte: all. Codes of 32 bits: all up to 65535, and the values
// around each power of two; fewer for an operation whose check another operation shares.

namespace {

using IC::Alert;
using IC::EnumValue;
using IC::Error;
using IC::Node;
using IC::Number;
using IC::PropertyValue;

constexpr unsigned char byte(unsigned int code)
{
    return static_cast<unsigned char>(code);
}

std::set<unsigned int> byteCodes()
{
    std::set<unsigned int> codes;
    for (unsigned int code = 0; code <= 255; ++code)
        codes.insert(code);
    return codes;
}

// All codes of one byte, and each power of two with its neighbours.
std::set<unsigned int> fewWordCodes()
{
    std::set<unsigned int> codes = byteCodes();
    for (int bit = 0; bit < 32; ++bit) {
        const unsigned int power = 1u << bit;
        codes.insert({power - 1, power, power + 1});
    }
    codes.insert(0xFFFFFFFF);
    return codes;
}

std::set<unsigned int> wordCodes()
{
    std::set<unsigned int> codes = fewWordCodes();
    for (unsigned int code = 0; code <= 65535; ++code)
        codes.insert(code);
    return codes;
}

// How a try has to end and what has to be afterwards (see Outcome); for a refusal, the function and the text of its
// records.
struct Expected {
    std::string ended;
    std::string after = "nothing";
    std::string function = {};
    std::string logged = {};
};

struct Row {
    const char* name;
    const char* file;  // the name in its records
    std::set<unsigned int> (*codes)();
    std::function<Operation(unsigned int)> operation;
    std::function<Expected(unsigned int)> expected;
};

void PrintTo(const Row& row, std::ostream* out)
{
    *out << row.name;
}

// The number that a kind code makes, or null if the code is refused. For a date-time the current time is replaced by 0.
const char* firstNumber(unsigned int kind)
{
    const char* const texts[] = {
        "0: unknown", "1: false",        "2: 7",        "3: 0",   "4: 0",
        "5: 0 = 0",   "6: not a number", "7: infinity", "8: 0.0", "9: 0/3 = <0.0/3>"};
    return kind == 2 || kind >= std::size(texts) ? nullptr : texts[kind];
}

Number withoutTimeOfDay(const Number& number)
{
    return number.getKind() == Number::KIND_DATETIME ? Number(0L, 0) : number;
}

// The property value that a kind code makes, or null if the code is refused.
const char* firstProperty(unsigned int kind)
{
    const char* const texts[] = {"0 writable: unknown", "1 writable: unknown", "2 writable: ",
                                 "3 writable: ",        "4 writable: 0",       "5 writable: {}",
                                 "6 writable: {}"};
    return kind >= std::size(texts) ? nullptr : texts[kind];
}

Expected numberOf(unsigned int code, const char* function)
{
    if (const char* const first = firstNumber(code))
        return {std::string("returned ") + first};
    const bool byInitKind = function == std::string("initKind") || code <= 10;
    return {"std::invalid_argument: Invalid kind of number", "nothing", byInitKind ? "initKind" : function,
            (byInitKind ? "initkind: invalid kind of number " : "Number: wrong kind of number: ")
                + std::to_string(code)};
}

Expected numberAfterInitKind(unsigned int code)
{
    if (const char* const first = firstNumber(code))
        return {"returned", first};
    Expected refused = numberOf(code, "initKind");
    refused.after = code == 2 ? "2: 7" : code == 10 ? "10: Unknown:0" : std::to_string(code) + ": invalid";
    return refused;
}

Expected numberAfterSetKind(unsigned int code)
{
    // The new kind reads the bytes of 7u, a date-time reads a long. A node reference has storage of its own.
    const char* const ofLittleEndian[] = {"0: unknown",
                                          "1: true",
                                          "2: 7",
                                          "3: 7",
                                          "4: 7",
                                          "5: 3.45846e-323 = 3.4584595208887258e-323",
                                          "6: not a number",
                                          "7: infinity",
                                          "8: 7.0",
                                          "9: 7/0 of another scope",
                                          "10: Unknown:0"};
    const char* const ofBigEndian[] = {"0: unknown",
                                       "1: false",
                                       "2: 7",
                                       "3: 7",
                                       "4: 30064771072",
                                       "5: 1.4854e-313 = 1.4853970536756906e-313",
                                       "6: not a number",
                                       "7: infinity",
                                       "8: 0.0",
                                       sizeof(long) == 4 ? "9: 7/0 of another scope"
                                                         : "9: 30064771072/0 of another scope",
                                       "10: Unknown:0"};
    const auto& texts = __BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__ ? ofLittleEndian : ofBigEndian;
    if (code < std::size(texts))
        return {"returned", texts[code]};
    return {"std::invalid_argument: Invalid kind", "3: 7", "setKind",
            "setKind: invalid kind " + std::to_string(code)};
}

Expected propertyRefusal(unsigned int code, const std::string& after)
{
    return {"IC::PropertyValueInvalidKind: Invalid kind of property", after, "initKind",
            "PropertyValue:initKind: invalid kind of property: " + std::to_string(code)};
}

Expected propertyOf(unsigned int code)
{
    if (const char* const first = firstProperty(code))
        return {std::string("returned ") + first};
    return propertyRefusal(code, "nothing");
}

Expected propertyAfterSetKind(unsigned int code)
{
    if (code == PropertyValue::KIND_STRING)
        return {"returned", "2 writable: abc"};
    if (const char* const first = firstProperty(code))
        return {"returned", first};
    return propertyRefusal(code, "2 writable: invalid");
}

std::function<Expected(unsigned int)> errorWith(const std::string& content)
{
    return [content](unsigned int code) -> Expected {
        const std::string digits = std::to_string(code);
        if (code <= 16)
            return {"returned " + digits + content};
        return {"std::invalid_argument: Invalid error status", "nothing", "initStatus",
                "initstatus: Invalid error status=" + digits};
    };
}

// An alert whose text has the code between `before` and `after`.
std::function<Expected(unsigned int)> alertWith(const std::string& before, unsigned int largest,
                                                const std::string& after, const std::string& what,
                                                const std::string& subject)
{
    return [=](unsigned int code) -> Expected {
        const std::string digits = std::to_string(code);
        if (code <= largest)
            return {"returned Alert " + before + digits + after, subject};
        return {"std::invalid_argument: Invalid " + what + " type", subject, "init",
                "init: Invalid " + what + " type " + digits};
    };
}

Expected nodeOf(unsigned int code)
{
    const std::string digits = std::to_string(code);
    if (code <= 73)
        return {"returned \"" + digits + ' ' + sensorNames[code] + '"'};
    return {"IC::NodeInvalidSensor: " + digits + " is not a valid sensor. The largest possible sensor is 73",
            "nothing", "Node", "Node: Sensor value out of range: " + digits};
}

std::function<Expected(unsigned int)> narrowed(unsigned int largest, const std::string& type,
                                               const std::string& integer)
{
    return [=](unsigned int value) -> Expected {
        const std::string digits = std::to_string(value);
        if (value <= largest)
            return {"returned " + digits};
        return {"std::out_of_range: The number is too large to convert to " + integer + " integer", "nothing",
                "operator ZQ::" + type, type + ": number out of range: " + digits};
    };
}

std::vector<Row> rows()
{
    const auto time = [] { return ZQ::DateTime(7, 2); };
    const std::string atTime = "; ; <7.0/2>; { }";
    const std::string now = "; ; <1000000000.0/3>; { }";
    const std::string shownTime = "<7.0/2>";
    return {
        {"NumberFromCode", "Number", byteCodes,
         [](unsigned int code) { return on("", [=] { return withoutTimeOfDay(Number(byte(code))); }); },
         [](unsigned int code) { return numberOf(code, "Number"); }},
        {"NumberSetKind", "Number", byteCodes,
         [](unsigned int code) {
             return on(
                 "", [] { return Number(7u); }, [=](Number& number) { number.setKind(byte(code)); });
         },
         numberAfterSetKind},
        {"NumberFromKind", "Number", fewWordCodes,
         [](unsigned int code) {
             return on("", [=] { return withoutTimeOfDay(Number(static_cast<Number::KindType>(code))); });
         },
         [](unsigned int code) { return numberOf(code, "initKind"); }},
        {"NumberInitKind", "Number", wordCodes,
         [](unsigned int code) {
             return on(
                 "", [] { return Number(7u); },
                 [=](Number& number) {
                     number.initKind(static_cast<Number::KindType>(code));
                     number = withoutTimeOfDay(number);
                 });
         },
         numberAfterInitKind},
        {"NodeReference", "Number", wordCodes,
         [](unsigned int code) {
             return on("", [=] { return Number(IC::NodeRef {code, 7}).operator std::string(); });
         },
         [](unsigned int code) -> Expected {
             return {std::string("returned \"") + sensorNames[std::min(code, 74u)] + ":7\""};
         }},
        {"EnumValueToUint8", "EnumValue", fewWordCodes,
         [](unsigned int code) { return on("", [=] { return EnumValue(code).operator unsigned char(); }); },
         narrowed(255, "Uint8", "an 8-bit")},
        {"EnumValueToUint16", "EnumValue", wordCodes,
         [](unsigned int code) { return on("", [=] { return EnumValue(code).operator unsigned short(); }); },
         narrowed(65535, "Uint16", "a 16-bit")},
        {"PropertyFromCode", "Property", byteCodes,
         [](unsigned int code) { return on("", [=] { return PropertyValue(byte(code)); }); }, propertyOf},
        {"PropertySetKind", "Property", byteCodes,
         [](unsigned int code) {
             return on(
                 "", [] { return PropertyValue("abc"); },
                 [=](PropertyValue& value) { value.setKind(byte(code)); });
         },
         propertyAfterSetKind},
        {"PropertyFromKind", "Property", wordCodes,
         [](unsigned int code) {
             return on("", [=] { return PropertyValue(static_cast<PropertyValue::KindType>(code)); });
         },
         [](unsigned int code) { return propertyOf(code & 0xFF); }},
        {"ErrorFromNumber", "Error", byteCodes,
         [](unsigned int code) { return on("", [=] { return Error(Number(5u), byte(code)); }); },
         errorWith(" with 3: 5 and \"\"")},
        {"ErrorFromNumberAndText", "Error", byteCodes,
         [](unsigned int code) { return on("", [=] { return Error(byte(code), Number(5u), "text"); }); },
         errorWith(" with 3: 5 and \"text\"")},
        {"ErrorFromCharacters", "Error", byteCodes,
         [](unsigned int code) { return on("", [=] { return Error("text", byte(code)); }); },
         errorWith(" with 0: unknown and \"text\"")},
        {"ErrorFromString", "Error", byteCodes,
         [](unsigned int code) { return on("", [=] { return Error(std::string("text"), byte(code)); }); },
         errorWith(" with 0: unknown and \"text\"")},
        {"AlertSeverityNow", "Alert", byteCodes,
         [](unsigned int code) { return on("", [=] { return Alert(byte(code), 5, {}, 85, ""); }); },
         alertWith("", 3, "; 5; 85" + now, "severity", "nothing")},
        {"AlertSeverity", "Alert", byteCodes,
         [=](unsigned int code) {
             return on("", time, [=](ZQ::DateTime& t) { return Alert(t, byte(code), 5, {}, 85, ""); });
         },
         alertWith("", 3, "; 5; 85" + atTime, "severity", shownTime)},
        {"AlertClassNow", "Alert", byteCodes,
         [](unsigned int code) { return on("", [=] { return Alert(3, byte(code), {}, 85, ""); }); },
         alertWith("3; ", 5, "; 85" + now, "class", "nothing")},
        {"AlertClass", "Alert", byteCodes,
         [=](unsigned int code) {
             return on("", time, [=](ZQ::DateTime& t) { return Alert(t, 3, byte(code), {}, 85, ""); });
         },
         alertWith("3; ", 5, "; 85" + atTime, "class", shownTime)},
        {"AlertStatusNow", "Alert", fewWordCodes,
         [](unsigned int code) { return on("", [=] { return Alert(3, 5, {}, code, ""); }); },
         alertWith("3; 5; ", 85, now, "status", "nothing")},
        {"AlertStatus", "Alert", wordCodes,
         [=](unsigned int code) {
             return on("", time, [=](ZQ::DateTime& t) { return Alert(t, 3, 5, {}, code, ""); });
         },
         alertWith("3; 5; ", 85, atTime, "status", shownTime)},
        {"NodeSensor", "Node", wordCodes,
         [](unsigned int code) {
             return on("", [=] {
                 const Node node(code);
                 return std::to_string(node.getSensor()) + ' '
                     + IC::pst[std::min<unsigned int>(node.getSensor(), 74)];
             });
         },
         nodeOf},
    };
}

// Whether the records are the log record and the trace record of the refusal, or none if nothing is refused.
bool areOf(const Expected& expected, const std::string& file, const std::vector<observe::Record>& records)
{
    if (expected.logged.empty() || records.size() != 2)
        return expected.logged.empty() && records.empty();
    for (const observe::Record& record : records) {
        if (record.trace != (&record == &records[1]) || record.function != expected.function
            || record.file != file || record.line <= 0 || record.line != records[0].line
            || record.logger != "Vexilon.IC." + file || record.level != 6000 || record.data != nullptr
            || record.a != 0 || record.b != 0 || record.message != expected.logged)
            return false;
    }
    return true;
}

class EveryCode : public testing::TestWithParam<Row> { };

TEST_P(EveryCode, IsAcceptedOrRefusedAsExpected)
{
    const Row& row = GetParam();
    for (const unsigned int code : row.codes()) {
        const Expected expected = row.expected(code);
        const Outcome tried = row.operation(code).run(noFault());
        EXPECT_EQ(tried.ended, expected.ended) << row.name << " with " << code;
        EXPECT_EQ(tried.after, expected.after) << row.name << " with " << code;
        EXPECT_TRUE(areOf(expected, row.file, tried.records))
            << row.name << " with " << code << "\n  expected: " << expected.function << ": "
            << expected.logged << "\n  records:" << listed(tried.records);
        if (HasFailure())
            return;
    }
}

TEST(Codes, AreComplete)
{
    EXPECT_EQ(byteCodes().size(), 256u);
    EXPECT_EQ(wordCodes().size(), 65536u + 2 + 15 * 3 + 1);
}

INSTANTIATE_TEST_SUITE_P(OfOperation, EveryCode, testing::ValuesIn(rows()),
                         [](const auto& row) { return row.param.name; });

}  // namespace
