#include <fstream>
#include <functional>
#include <limits>
#include <map>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "IC/json.h"
#include "observe/Platform.h"
#include "support/AllocationFailure.h"
#include "support/Cbor.h"

namespace {

using namespace std::string_literals;
using IC::Number;
using IC::PropertyValue;
using nlohmann::json;
using Properties = std::map<unsigned int, PropertyValue>;

// What each header offers: writing every class, reading all but the nodes into an object or as a result.
template <class Value>
constexpr bool isWritten = std::is_constructible_v<json, const Value&>;
static_assert(isWritten<Number> && isWritten<IC::EnumValue> && isWritten<PropertyValue>);
static_assert(isWritten<IC::Error> && isWritten<IC::Alert> && isWritten<Properties> && isWritten<IC::Node>);
static_assert(std::is_base_of_v<IC::Node, IC::StoredNode>);
static_assert(std::is_constructible_v<IC::StoredNode, const json&>);
static_assert(!std::is_convertible_v<const json&, IC::StoredNode>);

Number ofKind(Number number, Number::KindType kind)
{
    number.setKind(static_cast<unsigned char>(kind));
    return number;
}

// As a refused initKind leaves it.
Number ofInvalidKind(Number number, ZQ::Uint32 code)
{
    EXPECT_THROW(number.initKind(static_cast<Number::KindType>(code)), std::invalid_argument);
    return number;
}

// As a refused setKind leaves it.
PropertyValue withoutObject(PropertyValue value)
{
    EXPECT_THROW(value.setKind(7), IC::PropertyValueInvalidKind);
    return value;
}

Number ofTime(long seconds, unsigned int milliseconds, unsigned int scope)
{
    ZQ::DateTime time(seconds, scope);
    time.setMillisecond(milliseconds);
    return time;
}

Number ofRealBits(ZQ::Uint64 bits)
{
    return ofKind(bits, Number::KIND_REAL);
}

// Every byte that a kind can show.
std::string shown(const Number& number)
{
    const auto as = [&number](Number::KindType kind) { return json(ofKind(number, kind)).dump(); };
    return std::to_string(number.getKind()) + as(Number::KIND_UINT64) + as(Number::KIND_DATETIME)
        + as(Number::KIND_NODEREF);
}

struct NumberRow {
    Number number;
    const char* document;
};

const std::vector<NumberRow>& numberRows()
{
    using Limits = std::numeric_limits<double>;
    static const std::vector<NumberRow> rows = {
        {Number::KIND_UNKNOWN, R"({"kind":"unknown","value":null})"},
        {false, R"({"kind":"bool","value":false})"},
        {true, R"({"kind":"bool","value":true})"},
        {ofKind(IC::Version2 {2, 0}, Number::KIND_BOOL), R"({"kind":"bool","value":2})"},
        {ofKind(IC::Version2 {255, 0}, Number::KIND_BOOL), R"({"kind":"bool","value":255})"},
        {0, R"({"kind":"int","value":0})"},
        {-5, R"({"kind":"int","value":-5})"},
        {std::numeric_limits<int>::min(), R"({"kind":"int","value":-2147483648})"},
        {std::numeric_limits<int>::max(), R"({"kind":"int","value":2147483647})"},
        {3600u, R"({"kind":"uint32","value":3600})"},
        {4294967295u, R"({"kind":"uint32","value":4294967295})"},
        {0ull, R"({"kind":"uint64","value":0})"},
        {9007199254740993ull, R"({"kind":"uint64","value":9007199254740993})"},
        {18446744073709551615ull, R"({"kind":"uint64","value":18446744073709551615})"},
        {0.0, R"({"kind":"real","value":0.0})"},
        {-0.0, R"({"kind":"real","value":-0.0})"},
        {0.1, R"({"kind":"real","value":0.1})"},
        {3600.0, R"({"kind":"real","value":3600.0})"},
        {Limits::max(), R"({"kind":"real","value":1.7976931348623157e+308})"},
        {Limits::denorm_min(), R"({"kind":"real","value":5e-324})"},
        {Limits::infinity(), R"({"kind":"real","value":"infinity"})"},
        {-Limits::infinity(), R"({"kind":"real","value":"-infinity"})"},
        {ofRealBits(0x7FF8000000000000), R"({"kind":"real","value":{"bits":"7ff8000000000000"}})"},
        {ofRealBits(0x7FF0000000000001), R"({"kind":"real","value":{"bits":"7ff0000000000001"}})"},
        {ofRealBits(0xFFFFFFFFFFFFFFFF), R"({"kind":"real","value":{"bits":"ffffffffffffffff"}})"},
        {Number::KIND_NAN, R"({"kind":"nan","value":null})"},
        {Number::KIND_INFINITY, R"({"kind":"infinity","value":null})"},
        {IC::Version2 {2, 15}, R"({"kind":"version","value":[2,15]})"},
        {IC::Version2 {255, 255}, R"({"kind":"version","value":[255,255]})"},
        {Number(1234567890L, 250),
         R"({"kind":"dateTime","value":{"milliseconds":250,"scope":3,"seconds":1234567890}})"},
        {ofTime(-1, 65535, 0),
         R"({"kind":"dateTime","value":{"milliseconds":65535,"scope":0,"seconds":-1}})"},
        {ofTime(0, 0, 255), R"({"kind":"dateTime","value":{"milliseconds":0,"scope":255,"seconds":0}})"},
        {IC::NodeRef {20, 7}, R"({"kind":"nodeRef","value":{"id":7,"type":20}})"},
        {IC::NodeRef {4294967295u, 4294967295u},
         R"({"kind":"nodeRef","value":{"id":4294967295,"type":4294967295}})"},
        {ofInvalidKind(0u, 11), R"({"kind":"invalid","value":11})"},
        {ofInvalidKind(0u, 4294967295u), R"({"kind":"invalid","value":4294967295})"},
        // What another setKind can bring back.
        {ofKind(IC::NodeRef {20, 7}, Number::KIND_UNKNOWN),
         R"({"kind":"unknown","storage":[0,0,0,20,7],"value":null})"},
        {ofKind(IC::NodeRef {0, 7}, Number::KIND_UNKNOWN),
         R"({"kind":"unknown","storage":[0,0,0,0,7],"value":null})"},
        {ofKind(9ull, Number::KIND_NODEREF),
         R"({"kind":"nodeRef","storage":[9,0,0,0,0],"value":{"id":0,"type":0}})"},
        {ofInvalidKind(5ull, 12), R"({"kind":"invalid","storage":[5,0,0,0,0],"value":12})"},
    };
    return rows;
}

struct ValueRow {
    PropertyValue value;
    const char* document;
};

const std::vector<ValueRow>& valueRows()
{
    static const std::vector<ValueRow> rows = {
        {PropertyValue::KIND_UNKNOWN, R"({"kind":"nothing","value":null})"},
        {{PropertyValue::KIND_UNKNOWN, true}, R"({"kind":"nothing","readOnly":true,"value":null})"},
        {Number(3600u), R"({"kind":"uint32","value":3600})"},
        {{Number(Number::KIND_UNKNOWN), true}, R"({"kind":"unknown","readOnly":true,"value":null})"},
        {{ofInvalidKind(5ull, 12), true},
         R"({"kind":"invalid","readOnly":true,"storage":[5,0,0,0,0],"value":12})"},
        {"", R"({"kind":"string","value":""})"},
        {{"AFB0812", true}, R"({"kind":"string","readOnly":true,"value":"AFB0812"})"},
        {"\0\"\\/\x1f\x7f"s,
         R"({"kind":"string","value":"\u0000\"\\/\u001f)"
         "\x7f"
         R"("})"},
        {"\xff", R"({"kind":"string","value":{"hex":"ff"}})"},
        {IC::Buffer {}, R"({"kind":"buffer","value":""})"},
        {IC::Buffer {0x00, 0x0A, 0xFF}, R"({"kind":"buffer","value":"000aff"})"},
        {IC::EnumValue(4294967295u), R"({"kind":"enumValue","value":4294967295})"},
        {IC::NumberArray {}, R"({"kind":"numberArray","value":[]})"},
        {IC::NumberArray {1u, 0.5},
         R"({"kind":"numberArray","value":[{"kind":"uint32","value":1},{"kind":"real","value":0.5}]})"},
        {IC::StringArray {}, R"({"kind":"stringArray","value":[]})"},
        {IC::StringArray {"", "a", "\x80"}, R"({"kind":"stringArray","value":["","a",{"hex":"80"}]})"},
        {withoutObject(Number(1u)), R"({"kind":"missing","value":"number"})"},
        {withoutObject("a"), R"({"kind":"missing","value":"string"})"},
        {withoutObject(IC::Buffer {1}), R"({"kind":"missing","value":"buffer"})"},
        {withoutObject(IC::EnumValue(1u)), R"({"kind":"missing","value":"enumValue"})"},
        {withoutObject(IC::NumberArray {1u}), R"({"kind":"missing","value":"numberArray"})"},
        {withoutObject({IC::StringArray {"a"}, true}),
         R"({"kind":"missing","readOnly":true,"value":"stringArray"})"},
    };
    return rows;
}

Properties someProperties()
{
    return {{0u, PropertyValue("first", true)}, {7u, Number(7u)}, {4294967295u, IC::EnumValue(1u)}};
}
constexpr char somePropertiesDocument[] =
    R"({"0":{"kind":"string","readOnly":true,"value":"first"},"4294967295":{"kind":"enumValue","value":1},)"
    R"("7":{"kind":"uint32","value":7}})";

IC::Alert someAlert()
{
    ZQ::DateTime time(-1, 4294967295u);
    time.setMillisecond(4294967295u);
    return {time, 3, 5, {"/fan/1", "\xff"}, 85, "Fan failed"};
}
constexpr char someAlertDocument[] =
    R"({"class":5,"message":"Fan failed","paths":["/fan/1",{"hex":"ff"}],"severity":3,"status":85,)"
    R"("time":{"milliseconds":4294967295,"scope":4294967295,"seconds":-1}})";

// A node class whose getters differ from the members.
class Fan : public IC::Node {
public:
    explicit Fan(unsigned int sensor = SENSOR_FAN) : Node(sensor)
    {
        status = static_cast<StatusType>(4294967295u);
        description = "a\xff";
        properties = someProperties();
        path = "/chassis/fan1";
        parent = "/chassis";
    }
    std::string getDescription() const override { return "a fan"; }
    operator std::string() const override { return "Fan"; }
};
const std::string fanDocument =
    R"({"description":"a fan","parent":"/chassis","path":"/chassis/fan1","properties":)"
    + std::string(somePropertiesDocument) + R"(,"sensor":20,"status":4294967295})";

TEST(Json, HasADocumentForEveryKindOfNumber)
{
    for (const auto& [number, document] : numberRows()) {
        SCOPED_TRACE(document);
        EXPECT_EQ(json(number).dump(), document);
    }
}

TEST(Json, NumbersComeBackWithEveryByteThatAKindShows)
{
    for (const auto& [number, document] : numberRows()) {
        SCOPED_TRACE(document);
        EXPECT_EQ(shown(json::parse(document).get<Number>()), shown(number));
        EXPECT_EQ(shown(json::from_cbor(cborOf(number)).get<Number>()), shown(number));
    }
}

// setKind and initKind change the kind alone, so that any of the other bytes may be left.
TEST(Json, NumbersComeBackWithWhatOtherKindsLeft)
{
    for (unsigned char kind = 0; kind <= Number::KIND_NODEREF; ++kind)
        for (const auto& [left, document] : numberRows()) {
            SCOPED_TRACE(std::to_string(kind) + " after " + document);
            Number number = left;
            number.setKind(kind);
            EXPECT_EQ(shown(json::parse(json(number).dump()).get<Number>()), shown(number));
        }
}

TEST(Json, HasADocumentForEveryKindOfPropertyValue)
{
    for (const auto& [value, document] : valueRows()) {
        SCOPED_TRACE(document);
        EXPECT_EQ(json(value).dump(), document);
    }
}

TEST(Json, PropertyValuesComeBackWithKindMarkAndContent)
{
    for (const auto& [value, document] : valueRows()) {
        SCOPED_TRACE(document);
        const auto parsed = json::parse(document).get<PropertyValue>();
        EXPECT_EQ(parsed.getKind(), value.getKind());
        EXPECT_EQ(parsed.readOnly(), value.readOnly());
        EXPECT_EQ(parsed.operator std::string(), value.operator std::string());
        EXPECT_TRUE(parsed == value);
        const auto packed = json::from_cbor(cborOf(value)).get<PropertyValue>();
        EXPECT_EQ(packed.readOnly(), value.readOnly());
        EXPECT_TRUE(packed == value);
    }
}

TEST(Json, EveryPropertyValueHoldsEveryNumber)
{
    for (const auto& [number, document] : numberRows()) {
        SCOPED_TRACE(document);
        EXPECT_EQ(json(PropertyValue(number)).dump(), document);
        const auto value = json::parse(document).get<PropertyValue>();
        EXPECT_EQ(shown(value.operator Number()), shown(number));
        const auto array = json(PropertyValue(IC::NumberArray {number})).get<PropertyValue>();
        EXPECT_EQ(shown(array.operator IC::NumberArray().at(0)), shown(number));
    }
}

TEST(Json, TextsThatAreNoUtf8AreHexadecimal)
{
    const struct {
        std::string text;
        bool isUtf8;
    } rows[] = {{"\x7f", true},
                {"\x80", false},
                {"\xc1\xbf", false},  // overlong
                {"\xc2\x80", true},
                {"\xc2", false},
                {"\xc2\x7f", false},
                {"\xc2\xc0", false},
                {"\xdf\xbf", true},
                {"\xe0\x9f\xbf", false},  // overlong
                {"\xe0\xa0\x80", true},
                {"\xe1\x80\x80", true},
                {"\xe1\x80", false},
                {"\xe1\x80\x7f", false},
                {"\xe1\xbf\xbf", true},
                {"\xed\x9f\xbf", true},
                {"\xed\xa0\x80", false},  // a surrogate
                {"\xef\xbf\xbf", true},
                {"\xf0\x8f\xbf\xbf", false},  // overlong
                {"\xf0\x90\x80\x80", true},
                {"\xf0\x90\x80", false},
                {"\xf1\x80\x80\x80", true},
                {"\xf4\x8f\xbf\xbf", true},
                {"\xf4\x90\x80\x80", false},  // above U+10FFFF
                {"\xf5\x80\x80\x80", false},
                {"a\xc3\xa4z", true},
                {"a\xff", false}};
    for (const auto& [text, isUtf8] : rows) {
        SCOPED_TRACE(testing::PrintToString(text));
        const json document = PropertyValue(text);
        EXPECT_EQ(document["value"].is_string(), isUtf8);
        EXPECT_EQ(json::parse(document.dump()).get<PropertyValue>().operator std::string(), text);
    }
}

TEST(Json, WritesAndReadsEnumValues)
{
    EXPECT_EQ(json(IC::EnumValue(7u)).dump(), "7");
    EXPECT_EQ(json(4294967295u).get<IC::EnumValue>(), IC::EnumValue(4294967295u));
}

TEST(Json, WritesAndReadsPropertyMaps)
{
    EXPECT_EQ(json(Properties()).dump(), "{}");
    EXPECT_EQ(json(someProperties()).dump(), somePropertiesDocument);
    EXPECT_EQ(json::parse("{}").get<Properties>(), Properties());
    const auto back = json::parse(somePropertiesDocument).get<Properties>();
    EXPECT_EQ(back, someProperties());
    EXPECT_TRUE(back.at(0).readOnly());
    EXPECT_FALSE(back.at(7).readOnly());
}

TEST(Json, WritesAndReadsErrors)
{
    const IC::Error error(16, Number(17u), "no such\xffproperty");
    const std::string document = R"({"message":{"hex":"6e6f2073756368ff70726f7065727479"},"status":16,)"
                                 R"("value":{"kind":"uint32","value":17}})";
    EXPECT_EQ(json(error).dump(), document);
    const auto back = json::parse(document).get<IC::Error>();
    EXPECT_EQ(back.getStatus(), IC::Error::STATUS_READ_ONLY);
    EXPECT_EQ(back.getMessage(), "no such\xffproperty");
    EXPECT_EQ(shown(back.getValue()), shown(17u));
    EXPECT_EQ(json(IC::Error("", 0)).dump(),
              R"({"message":"","status":0,"value":{"kind":"unknown","value":null}})");
}

TEST(Json, WritesAndReadsAlerts)
{
    EXPECT_EQ(json(someAlert()).dump(), someAlertDocument);
    const auto back = json::parse(someAlertDocument).get<IC::Alert>();
    EXPECT_EQ(static_cast<long>(back.getTimeStamp()), -1);
    EXPECT_EQ(back.getTimeStamp().getMillisecond(), 4294967295u);
    EXPECT_EQ(back.getTimeStamp().getScope(), 4294967295u);
    EXPECT_EQ(back.getSeverity(), 3);
    EXPECT_EQ(back.getClass(), 5);
    EXPECT_EQ(back.getStatus(), 85);
    EXPECT_THAT(back.getNodePaths(), testing::ElementsAre("/fan/1", "\xff"));
    EXPECT_EQ(back.getMessage(), "Fan failed");
}

TEST(Json, ADerivedNodeGivesTheDocumentOfItsBase)
{
    const Fan fan;
    EXPECT_EQ(json(fan).dump(), fanDocument);
    EXPECT_EQ(json(static_cast<const IC::Node&>(fan)).dump(), fanDocument);
    EXPECT_EQ(json(IC::Node()).dump(),
              R"({"description":"UNKNOWN SENSOR NODE CREATED BY DEFAULT CONSTRUCTOR","parent":"","path":"",)"
              R"("properties":{},"sensor":0,"status":0})");
}

struct OwnFan : Fan {
    [[maybe_unused]] friend void to_json(json& document, const OwnFan& /*fan*/) { document = "own"; }
};
struct OwnValue : PropertyValue {
    using PropertyValue::PropertyValue;
    friend void to_json(json& document, const OwnValue& /*value*/) { document = "own"; }
};

// Unlike that of a class that derives from another value.
TEST(Json, ToJsonOfAnOwnNodeClassIsNotCalled)
{
    EXPECT_EQ(json(OwnFan()).dump(), fanDocument);
    EXPECT_EQ(json(OwnValue("a")).dump(), R"("own")");
}

TEST(Json, AStoredNodeHasWhatTheNodeHad)
{
    const Fan fan;
    const IC::StoredNode stored(json::parse(fanDocument));
    EXPECT_EQ(json(stored).dump(), fanDocument);
    EXPECT_EQ(stored, fan);
    EXPECT_EQ(stored.getSensor(), IC::Node::SENSOR_FAN);
    EXPECT_EQ(stored.getStatus(), 4294967295u);
    EXPECT_EQ(stored.getDescription(), "a fan");
    EXPECT_EQ(stored.getPath(), "/chassis/fan1");
    EXPECT_EQ(stored.getParent(), "/chassis");
    EXPECT_EQ(stored.getProperties(), someProperties());
    EXPECT_EQ(stored.operator std::string(), fan.Node::operator std::string());
    for (unsigned int sensor = 0; sensor <= IC::Node::SENSOR_LARGEST; ++sensor)
        EXPECT_EQ(IC::StoredNode(json(IC::Node(sensor))).getSensor(), sensor);
}

TEST(Json, ReadsIntoAnObjectOfEachClass)
{
    Number number(true);
    json(7u).get<unsigned int>();
    json(Number(7u)).get_to(number);
    EXPECT_EQ(number, Number(7u));
    PropertyValue value("");
    json(PropertyValue("a", true)).get_to(value);
    EXPECT_TRUE(value == "a" && value.readOnly());
    IC::EnumValue enumValue;
    json(IC::EnumValue(7u)).get_to(enumValue);
    EXPECT_EQ(enumValue, IC::EnumValue(7u));
    Properties properties;
    json(someProperties()).get_to(properties);
    EXPECT_EQ(properties, someProperties());
    IC::Error error("", 0);
    json(IC::Error("a", 5)).get_to(error);
    EXPECT_EQ(error.operator std::string(), "5 - a");
    IC::Alert alert(0, 0, {}, 0, "");
    json(someAlert()).get_to(alert);
    EXPECT_EQ(alert.operator std::string(), someAlert().operator std::string());
}

TEST(Json, ContainersAndOrderedDocumentsFollow)
{
    const std::vector<Number> numbers = {1u, 0.5};
    EXPECT_EQ(json(numbers).get<std::vector<Number>>(), numbers);
    const std::map<std::string, PropertyValue> named = {{"speed", Number(3600u)}};
    EXPECT_EQ((json(named).get<std::map<std::string, PropertyValue>>()), named);

    const nlohmann::ordered_json ordered = PropertyValue("AFB0812", true);
    EXPECT_EQ(ordered.dump(), R"({"kind":"string","value":"AFB0812","readOnly":true})");
    EXPECT_TRUE(ordered.get<PropertyValue>().readOnly());
    EXPECT_EQ(nlohmann::ordered_json(Properties {{9u, "a"}, {10u, "b"}}).dump(),
              R"({"9":{"kind":"string","value":"a"},"10":{"kind":"string","value":"b"}})");
}

TEST(Json, ReadsWhatOtherProgramsWriteForTheSameValue)
{
    const struct {
        const char* document;
        Number number;
    } rows[] = {
        {R"({"kind":"real","value":3600})", 3600.0},
        {R"({"kind":"real","value":-7})", -7.0},
        {R"({"kind":"real","value":-0})", 0.0},  // the JSON library's integer has no sign
        {R"({"kind":"int","value":-0})", 0},
        {R"({"kind":"uint32","value":-0})", 0u},
        {R"({"kind":"real","value":9223372036854776000})", 0x1p63},
        {R"({"kind":"real","value":{"bits":"3ff0000000000000"}})", 1.0},
        {R"({"kind":"bool","value":0})", false},
        {R"({"kind":"bool","value":1})", true},
        {R"({"kind":"uint64","value":5,"storage":[5,0,0,0,0]})", 5ull},
    };
    for (const auto& [document, number] : rows) {
        SCOPED_TRACE(document);
        EXPECT_EQ(shown(json::parse(document).get<Number>()), shown(number));
    }
    EXPECT_EQ(json::parse(R"({"kind":"string","readOnly":false,"value":{"hex":"61"}})").get<PropertyValue>(),
              PropertyValue("a"));
}

TEST(Json, CborAndMessagePackAreByteExact)
{
    const json value = PropertyValue(IC::NumberArray {-5, 0.5, 18446744073709551615ull}, true);
    const std::string cbor = "\xa3"
                             "dkind"
                             "knumberArray"
                             "hreadOnly"
                             "\xf5"
                             "evalue"
                             "\x83"
                             "\xa2"
                             "dkind"
                             "cint"
                             "evalue"
                             "\x24"
                             "\xa2"
                             "dkind"
                             "dreal"
                             "evalue"
                             "\xfa\x3f\x00\x00\x00"
                             "\xa2"
                             "dkind"
                             "fuint64"
                             "evalue"
                             "\x1b\xff\xff\xff\xff\xff\xff\xff\xff"s;
    std::string written;
    json::to_cbor(value, written);
    EXPECT_EQ(written, cbor);

    const Fan fan;
    const std::string bytes = cborOf(fan);
    EXPECT_EQ(cborOf(IC::StoredNode(json::from_cbor(bytes))), bytes);
    std::string packed;
    json::to_msgpack(fan, packed);
    std::string again;
    json::to_msgpack(IC::StoredNode(json::from_msgpack(packed)), again);
    EXPECT_EQ(again, packed);
    std::string binary;
    json::to_bson(fan, binary);
    again.clear();
    json::to_bson(IC::StoredNode(json::from_bson(binary)), again);
    EXPECT_EQ(again, binary);
}

TEST(Json, ATextInCborNeedNotBeUtf8)
{
    EXPECT_EQ(json::from_cbor("\xa2"
                              "dkind"
                              "fstring"
                              "evalue"
                              "\x61\xff"s)
                  .get<PropertyValue>(),
              "\xff");
}

// The exception's text without the prefix that the JSON library gives it, or what was read.
template <class Value>
std::string refusal(const json& document)
{
    try {
        return "read as " + json(document.get<Value>()).dump();
    } catch (const json::type_error& error) {
        const std::string prefix = "[json.exception.type_error.302] ";
        const std::string what = error.what();
        return what.rfind(prefix, 0) == 0 ? what.substr(prefix.size()) : what;
    }
}

template <>
std::string refusal<IC::StoredNode>(const json& document)
{
    try {
        return "read as " + json(IC::StoredNode(document)).dump();
    } catch (const json::type_error& error) {
        return std::string(error.what()).substr(32);
    }
}

struct Refused {
    const char* document;
    const char* text;
};

template <class Value>
void expectRefusals(const std::vector<Refused>& rows)
{
    for (const auto& [document, text] : rows) {
        SCOPED_TRACE(document);
        observe::reset();
        EXPECT_EQ(refusal<Value>(json::parse(document)), text);
        EXPECT_THAT(observe::records(), testing::IsEmpty());
    }
}

TEST(Json, RefusesNumbersWithTheirPlace)
{
    expectRefusals<Number>({
        {"7", R"(at "": expected an object)"},
        {"null", R"(at "": expected an object)"},
        {R"([{"kind":"int"}])", R"(at "": expected an object)"},
        {"{}", R"(at "": the key "kind" is missing)"},
        {R"({"kind":"int"})", R"(at "": the key "value" is missing)"},
        {R"({"kind":5,"value":5})", R"(at "/kind": expected a string)"},
        {R"({"kind":"uint33","value":5})", R"(at "/kind": unknown kind)"},
        {R"({"kind":"string","value":"a"})", R"(at "/kind": unknown kind)"},
        {R"({"kind":"int","value":5,"colour":1})", R"(at "/colour": unknown key)"},
        {R"({"kind":"int","value":5,"a/b~c":1})", R"(at "/a~1b~0c": unknown key)"},
        {R"({"kind":"int","value":5,"":1})", R"(at "/": unknown key)"},
        {R"({"kind":"int","value":5,"a\u0000b\"\n":1})", R"(at "/a\u0000b\"\n": unknown key)"},
        {R"({"kind":"int","value":5,"readOnly":true})", R"(at "/readOnly": unknown key)"},
        {R"({"kind":"unknown","value":0})", R"(at "/value": expected null)"},
        {R"({"kind":"nan","value":"nan"})", R"(at "/value": expected null)"},
        {R"({"kind":"infinity","value":false})", R"(at "/value": expected null)"},
        {R"({"kind":"bool","value":"true"})", R"(at "/value": expected an integer from 0 to 255)"},
        {R"({"kind":"bool","value":256})", R"(at "/value": expected an integer from 0 to 255)"},
        {R"({"kind":"bool","value":-1})", R"(at "/value": expected an integer from 0 to 255)"},
        {R"({"kind":"int","value":2147483648})",
         R"(at "/value": expected an integer from -2147483648 to 2147483647)"},
        {R"({"kind":"int","value":-2147483649})",
         R"(at "/value": expected an integer from -2147483648 to 2147483647)"},
        {R"({"kind":"int","value":4294967301})",
         R"(at "/value": expected an integer from -2147483648 to 2147483647)"},
        {R"({"kind":"int","value":18446744073709551615})",
         R"(at "/value": expected an integer from -2147483648 to 2147483647)"},
        {R"({"kind":"int","value":5.0})",
         R"(at "/value": expected an integer from -2147483648 to 2147483647)"},
        {R"({"kind":"uint32","value":4294967296})",
         R"(at "/value": expected an integer from 0 to 4294967295)"},
        {R"({"kind":"uint32","value":-1})", R"(at "/value": expected an integer from 0 to 4294967295)"},
        {R"({"kind":"uint64","value":-1})",
         R"(at "/value": expected an integer from 0 to 18446744073709551615)"},
        {R"({"kind":"uint64","value":18446744073709551616})",
         R"(at "/value": expected an integer from 0 to 18446744073709551615)"},
        {R"({"kind":"real","value":null})", R"(at "/value": expected a string)"},
        {R"({"kind":"real","value":"Infinity"})", R"(at "/value": expected "infinity" or "-infinity")"},
        {R"({"kind":"real","value":{}})", R"(at "/value": the key "bits" is missing)"},
        {R"({"kind":"real","value":{"bits":"7ff8000000000000","a":1}})", R"(at "/value/a": unknown key)"},
        {R"({"kind":"real","value":{"bits":5}})", R"(at "/value/bits": expected a string)"},
        {R"({"kind":"real","value":{"bits":"7ff80000000000"}})", R"(at "/value/bits": expected 16 digits)"},
        {R"({"kind":"real","value":{"bits":"7FF8000000000000"}})",
         R"(at "/value/bits": expected two lower-case hexadecimal digits for each byte)"},
        {R"({"kind":"version","value":2.15})", R"(at "/value": expected an array of 2 elements)"},
        {R"({"kind":"version","value":{"major":2,"minor":15}})",
         R"(at "/value": expected an array of 2 elements)"},
        {R"({"kind":"version","value":[2]})", R"(at "/value": expected an array of 2 elements)"},
        {R"({"kind":"version","value":[2,15,0]})", R"(at "/value": expected an array of 2 elements)"},
        {R"({"kind":"version","value":[256,0]})", R"(at "/value/0": expected an integer from 0 to 255)"},
        {R"({"kind":"version","value":[2,"15"]})", R"(at "/value/1": expected an integer from 0 to 255)"},
        {R"({"kind":"dateTime","value":1234567890})", R"(at "/value": expected an object)"},
        {R"({"kind":"dateTime","value":{"seconds":0,"scope":3}})",
         R"(at "/value": the key "milliseconds" is missing)"},
        {R"({"kind":"dateTime","value":{"seconds":0,"milliseconds":0,"scope":3,"zone":0}})",
         R"(at "/value/zone": unknown key)"},
        {R"({"kind":"dateTime","value":{"seconds":0,"milliseconds":65536,"scope":3}})",
         R"(at "/value/milliseconds": expected an integer from 0 to 65535)"},
        {R"({"kind":"dateTime","value":{"seconds":0,"milliseconds":0,"scope":256}})",
         R"(at "/value/scope": expected an integer from 0 to 255)"},
        {R"({"kind":"nodeRef","value":{"type":20}})", R"(at "/value": the key "id" is missing)"},
        {R"({"kind":"nodeRef","value":{"type":20,"id":4294967296}})",
         R"(at "/value/id": expected an integer from 0 to 4294967295)"},
        {R"({"kind":"nodeRef","value":{"type":20,"id":7,"name":""}})", R"(at "/value/name": unknown key)"},
        {R"({"kind":"invalid","value":10})", R"(at "/value": expected an integer from 11 to 4294967295)"},
        {R"({"kind":"invalid","value":4294967296})",
         R"(at "/value": expected an integer from 11 to 4294967295)"},
        {R"({"kind":"int","value":5,"storage":5})", R"(at "/storage": expected an array of 5 elements)"},
        {R"({"kind":"int","value":5,"storage":[0,0,0,0]})",
         R"(at "/storage": expected an array of 5 elements)"},
        {R"({"kind":"int","value":5,"storage":[0,65536,0,0,0]})",
         R"(at "/storage/1": expected an integer from 0 to 65535)"},
        {R"({"kind":"int","value":5,"storage":[0,0,0,0,null]})",
         R"(at "/storage/4": expected an integer from 0 to 4294967295)"},
    });
    const std::string seconds = std::to_string(std::numeric_limits<long>::min()) + " to "
        + std::to_string(std::numeric_limits<long>::max());
    EXPECT_EQ(
        refusal<Number>(json::parse(
            R"({"kind":"dateTime","value":{"seconds":9223372036854775808,"milliseconds":0,"scope":3}})")),
        R"(at "/value/seconds": expected an integer from )" + seconds);
    EXPECT_EQ(refusal<Number>(
                  json::parse(R"({"kind":"dateTime","value":{"seconds":0.5,"milliseconds":0,"scope":3}})")),
              R"(at "/value/seconds": expected an integer from )" + seconds);
}

TEST(Json, RefusesPropertyValuesWithTheirPlace)
{
    expectRefusals<PropertyValue>({
        {R"("AFB0812")", R"(at "": expected an object)"},
        {"{}", R"(at "": the key "kind" is missing)"},
        {R"({"kind":"number","value":5})", R"(at "/kind": unknown kind)"},
        {R"({"kind":"text","value":"a"})", R"(at "/kind": unknown kind)"},
        {R"({"kind":null,"value":"a"})", R"(at "/kind": expected a string)"},
        {R"({"kind":"string"})", R"(at "": the key "value" is missing)"},
        {R"({"kind":"string","value":"a","readOnly":1})", R"(at "/readOnly": expected true or false)"},
        {R"({"kind":"string","value":"a","readonly":true})", R"(at "/readonly": unknown key)"},
        {R"({"kind":"string","value":"a","storage":[0,0,0,0,0]})", R"(at "/storage": unknown key)"},
        {R"({"kind":"int","value":5,"mark":true})", R"(at "/mark": unknown key)"},
        {R"({"kind":"nothing","value":0})", R"(at "/value": expected null)"},
        {R"({"kind":"string","value":5})", R"(at "/value": expected a string)"},
        {R"({"kind":"string","value":{}})", R"(at "/value": the key "hex" is missing)"},
        {R"({"kind":"string","value":{"hex":"6"}})",
         R"(at "/value/hex": expected two lower-case hexadecimal digits for each byte)"},
        {R"({"kind":"string","value":{"hex":"6g"}})",
         R"(at "/value/hex": expected two lower-case hexadecimal digits for each byte)"},
        {R"({"kind":"string","value":{"hex":"61","base64":"YQ"}})", R"(at "/value/base64": unknown key)"},
        {R"({"kind":"buffer","value":[1,2]})", R"(at "/value": expected a string)"},
        {R"({"kind":"buffer","value":"012"})",
         R"(at "/value": expected two lower-case hexadecimal digits for each byte)"},
        {R"({"kind":"enumValue","value":-1})", R"(at "/value": expected an integer from 0 to 4294967295)"},
        {R"({"kind":"numberArray","value":{}})", R"(at "/value": expected an array)"},
        {R"({"kind":"numberArray","value":[{"kind":"int","value":5},5]})",
         R"(at "/value/1": expected an object)"},
        {R"({"kind":"numberArray","value":[{"kind":"int","value":5,"readOnly":true}]})",
         R"(at "/value/0/readOnly": unknown key)"},
        {R"({"kind":"stringArray","value":["a","b",7]})", R"(at "/value/2": expected a string)"},
        {R"({"kind":"missing","value":1})", R"(at "/value": expected a string)"},
        {R"({"kind":"missing","value":"nothing"})", R"(at "/value": unknown kind)"},
        {R"({"kind":"missing","value":"int"})", R"(at "/value": unknown kind)"},
    });
}

TEST(Json, RefusesOtherClassesWithTheirPlace)
{
    expectRefusals<IC::EnumValue>({
        {"4294967296", R"(at "": expected an integer from 0 to 4294967295)"},
        {R"("7")", R"(at "": expected an integer from 0 to 4294967295)"},
    });
    expectRefusals<Properties>({
        {"[]", R"(at "": expected an object)"},
        {R"({"":{}})", R"(at "/": expected a property number as the key)"},
        {R"({"-1":{}})", R"(at "/-1": expected a property number as the key)"},
        {R"({"01":{}})", R"(at "/01": expected a property number as the key)"},
        {R"({"1 ":{}})", R"(at "/1 ": expected a property number as the key)"},
        {R"({"1é":{}})", R"(at "/1é": expected a property number as the key)"},
        {R"({"4294967296":{}})", R"(at "/4294967296": expected a property number as the key)"},
        {R"({"18446744073709551616":{}})",
         R"(at "/18446744073709551616": expected a property number as the key)"},
        {R"({"1":{"kind":"int","value":5},"3":{"kind":"stringArray","value":["a","b",7]}})",
         R"(at "/3/value/2": expected a string)"},
    });
    expectRefusals<IC::Error>({
        {"5", R"(at "": expected an object)"},
        {R"({"status":17,"value":{"kind":"unknown","value":null},"message":""})",
         R"(at "/status": expected an integer from 0 to 16)"},
        {R"({"status":5,"value":5,"message":""})", R"(at "/value": expected an object)"},
        {R"({"status":5,"value":{"kind":"unknown","value":null}})", R"(at "": the key "message" is missing)"},
        {R"({"status":5,"value":{"kind":"unknown","value":null},"message":"","text":""})",
         R"(at "/text": unknown key)"},
    });
    // Each row replaces one member of an alert.
    for (const auto& [patch, text] :
         std::vector<Refused> {{R"({"severity":4})", R"(at "/severity": expected an integer from 0 to 3)"},
                               {R"({"class":6})", R"(at "/class": expected an integer from 0 to 5)"},
                               {R"({"status":86})", R"(at "/status": expected an integer from 0 to 85)"},
                               {R"({"paths":"/fan/1"})", R"(at "/paths": expected an array)"},
                               {R"({"paths":["/fan/1",2]})", R"(at "/paths/1": expected a string)"},
                               {R"({"message":null})", R"(at "": the key "message" is missing)"},
                               {R"({"time":{"zone":3}})", R"(at "/time/zone": unknown key)"},
                               {R"({"time":{"scope":4294967296}})",
                                R"(at "/time/scope": expected an integer from 0 to 4294967295)"},
                               {R"({"time":{"milliseconds":-1}})",
                                R"(at "/time/milliseconds": expected an integer from 0 to 4294967295)"},
                               {R"({"level":1})", R"(at "/level": unknown key)"}}) {
        SCOPED_TRACE(patch);
        observe::reset();
        json document = someAlert();
        document.merge_patch(json::parse(patch));
        EXPECT_EQ(refusal<IC::Alert>(document), text);
        EXPECT_THAT(observe::records(), testing::IsEmpty());
    }
    for (const auto& [patch, text] : std::vector<Refused> {
             {R"({"sensor":74})", R"(at "/sensor": expected an integer from 0 to 73)"},
             {R"({"status":4294967296})", R"(at "/status": expected an integer from 0 to 4294967295)"},
             {R"({"description":1})", R"(at "/description": expected a string)"},
             {R"({"path":[]})", R"(at "/path": expected a string)"},
             {R"({"parent":null})", R"(at "": the key "parent" is missing)"},
             {R"({"properties":{"7":{"value":-1}}})",
              R"(at "/properties/7/value": expected an integer from 0 to 4294967295)"},
             {R"({"children":[]})", R"(at "/children": unknown key)"}}) {
        SCOPED_TRACE(patch);
        observe::reset();
        json document = json::parse(fanDocument);
        document.merge_patch(json::parse(patch));
        EXPECT_EQ(refusal<IC::StoredNode>(document), text);
        EXPECT_THAT(observe::records(), testing::IsEmpty());
    }
}

// CBOR may have a key that is not UTF-8.
TEST(Json, ThePlaceOfAnyKeyIsUtf8)
{
    EXPECT_EQ(refusal<Properties>(json {{"a\xff", 1}}),
              "at \"/a\uFFFD\": expected a property number as the key");
}

TEST(Json, InAVectorThePlaceIsRelativeToTheElement)
{
    EXPECT_EQ(refusal<std::vector<PropertyValue>>(
                  json::parse(R"([{"kind":"int","value":5},{"kind":"int","value":null}])")),
              R"(at "/value": expected an integer from -2147483648 to 2147483647)");
}

TEST(Json, RefusesADeepDocument)
{
    const std::size_t depth = 100000;
    const std::string deep = std::string(depth, '[') + std::string(depth, ']');
    const json document = json::parse(deep);
    EXPECT_EQ(refusal<Number>(document), R"(at "": expected an object)");
    EXPECT_EQ(refusal<IC::EnumValue>(document), R"(at "": expected an integer from 0 to 4294967295)");
    EXPECT_EQ(refusal<PropertyValue>(document), R"(at "": expected an object)");
    EXPECT_EQ(refusal<Properties>(document), R"(at "": expected an object)");
    EXPECT_EQ(refusal<IC::Error>(document), R"(at "": expected an object)");
    EXPECT_EQ(refusal<IC::Alert>(document), R"(at "": expected an object)");
    EXPECT_EQ(refusal<IC::StoredNode>(document), R"(at "": expected an object)");
    EXPECT_EQ(refusal<Number>(json::parse(R"({"kind":"real","value":)" + deep + "}")),
              R"(at "/value": expected a string)");
    EXPECT_EQ(refusal<PropertyValue>(json::parse(R"({"kind":"numberArray","value":)" + deep + "}")),
              R"(at "/value/0": expected an object)");
    EXPECT_EQ(refusal<PropertyValue>(json::parse(R"({"kind":"stringArray","value":)" + deep + "}")),
              R"(at "/value/0": expected a string)");
    EXPECT_EQ(refusal<Properties>(json::parse(R"({"1":)" + deep + "}")), R"(at "/1": expected an object)");
}

TEST(Json, ARefusalLeavesTheTargetUnchanged)
{
    Properties properties = someProperties();
    EXPECT_THROW(
        json::parse(R"({"0":{"kind":"int","value":5},"1":{"kind":"int","value":null}})").get_to(properties),
        json::type_error);
    EXPECT_EQ(properties, someProperties());
    PropertyValue value("a", true);
    EXPECT_THROW(json::parse(R"({"kind":"stringArray","value":["b",7]})").get_to(value), json::type_error);
    EXPECT_TRUE(value == "a" && value.readOnly());
    IC::Error error("a", 5);
    EXPECT_THROW(json::parse(R"({"status":6,"value":{"kind":"int","value":5},"message":7})").get_to(error),
                 json::type_error);
    EXPECT_EQ(error.operator std::string(), "5 - a");
}

TEST(Json, LogsNothingForAnyValue)
{
    const std::vector<NumberRow>& numbers = numberRows();  // making these is refused and logged
    const std::vector<ValueRow>& values = valueRows();
    observe::reset();
    for (const NumberRow& row : numbers)
        static_cast<void>(json(row.number).get<Number>());
    for (const ValueRow& row : values)
        static_cast<void>(json(row.value).get<PropertyValue>());
    static_cast<void>(json(someAlert()).get<IC::Alert>());
    static_cast<void>(IC::StoredNode(json(Fan())));
    EXPECT_THAT(observe::records(), testing::IsEmpty());
}

// Every allocation of the operation fails in turn, one alone: without any memory, the destructor of nlohmann::json
// terminates, because it allocates. `state` describes what must be the same after each failure.
template <class Operation, class State>
void expectUnchangedWithoutMemory(Operation operation, State state)
{
    const std::string before = state();
    long failures = 0;
    for (;; ++failures) {
        ASSERT_LT(failures, 1000);
        observe::reset();
        const long alive = allocation::aliveNow;
        bool threw = false;
        allocation::failFrom(failures + 1, true);
        try {
            operation();
        } catch (const std::bad_alloc&) {
            threw = true;
        }
        if (!allocation::stopFailing())
            break;
        EXPECT_TRUE(threw);
        EXPECT_EQ(allocation::aliveNow, alive);
        EXPECT_EQ(state(), before) << "allocation " << failures + 1;
    }
    EXPECT_GE(failures, 3);
    EXPECT_NE(state(), before);
}

TEST(Json, WithoutMemoryTheTargetIsUnchanged)
{
    const Fan fan;
    for (int i = 0; i < 10; ++i)
        static_cast<void>(json(fan));  // the observer's list of lock calls keeps this capacity
    json document = "before";
    const auto textOfDocument = [&document] { return document.dump(); };
    expectUnchangedWithoutMemory([&] { document = fan; }, textOfDocument);
    document = "before";
    expectUnchangedWithoutMemory([&] { document = someAlert(); }, textOfDocument);

    const json alertDocument = someAlert();
    IC::Alert alert(0, 0, {}, 0, "before");
    expectUnchangedWithoutMemory([&] { alertDocument.get_to(alert); },
                                 [&alert] { return alert.operator std::string(); });
    const json propertiesDocument = someProperties();
    Properties properties = {{1u, "before"}};
    expectUnchangedWithoutMemory([&] { propertiesDocument.get_to(properties); },
                                 [&properties] { return json(properties).dump(); });
}

TEST(Json, WhatTheClockLibraryThrowsLeavesTheTargetUnchanged)
{
    const json document = someAlert();
    IC::Alert alert(0, 0, {}, 0, "before");
    const std::string before = alert;
    int nth = 1;
    for (;; ++nth) {
        observe::reset();
        observe::throwAt(observe::Call::dateTime, nth);
        try {
            document.get_to(alert);
        } catch (const observe::Thrown&) {
        }
        const bool thrown = observe::thrown();
        observe::reset();
        if (!thrown)
            break;
        EXPECT_EQ(alert.operator std::string(), before) << nth;
    }
    EXPECT_GT(nth, 3);
    EXPECT_NE(alert.operator std::string(), before);
}

// The page shows one document a line. Each belongs to one of the classes and is written as it was read.
TEST(Json, ReadsEveryDocumentOfThePage)
{
    std::ifstream page(IC_JSON_PAGE);
    ASSERT_TRUE(page) << IC_JSON_PAGE;
    std::map<std::string, int> read;
    bool inside = false;
    for (std::string line; std::getline(page, line);) {
        if (line.rfind("```", 0) == 0) {
            inside = line == "```json";
        } else if (inside) {
            SCOPED_TRACE(line);
            const auto document = nlohmann::ordered_json::parse(line);
            const auto expectSame = [&](const std::string& kind, const nlohmann::ordered_json& again) {
                ++read[kind];
                EXPECT_EQ(again.dump(), document.dump());
            };
            if (document.contains("kind"))
                expectSame("value", document.get<PropertyValue>());
            else if (document.contains("severity"))
                expectSame("alert", document.get<IC::Alert>());
            else if (document.contains("sensor"))
                expectSame("node", IC::StoredNode(json::parse(line)));
            else if (document.contains("message"))
                expectSame("error", document.get<IC::Error>());
            else
                expectSame("map", document.get<Properties>());
        }
    }
    EXPECT_EQ(read["value"], 24);
    EXPECT_EQ(read["alert"], 1);
    EXPECT_EQ(read["error"], 1);
    EXPECT_EQ(read["map"], 1);
    EXPECT_EQ(read["node"], 1);
}

}  // namespace
