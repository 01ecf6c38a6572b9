#pragma once

#include <stdexcept>
#include <string>
#include <string_view>

#include "IC/Alert.h"
#include "IC/EnumValue.h"
#include "IC/Error.h"
#include "IC/ICException.h"
#include "IC/Node.h"
#include "IC/Number.h"
#include "IC/Property.h"

// A node class that writes a text of its own.
class Fan : public IC::Node {
public:
    Fan() : Node(SENSOR_FAN) { path = "ab"; }
    operator std::string() const override { return "Fan, a " + Node::operator std::string(); }
};

inline IC::Number numberOfRefusedKind()
{
    IC::Number number(1u);
    try {
        number.initKind(static_cast<IC::Number::KindType>(12));
    } catch (const std::invalid_argument&) {
    }
    return number;
}

inline IC::PropertyValue valueWithoutObject()
{
    IC::PropertyValue value("text");
    try {
        value.setKind(7);
    } catch (const IC::PropertyValueInvalidKind&) {
    }
    return value;
}

// Calls check(value, text) for every class that has a text, and for every kind.
template <class Check>
void forEveryText(Check check)
{
    using namespace std::string_literals;
    using namespace std::string_view_literals;
    using IC::Error;
    using IC::Number;
    using IC::PropertyValue;

    check(Number(Number::KIND_UNKNOWN), "unknown"sv);
    check(Number(true), "true"sv);
    check(Number(-7), "-7"sv);
    check(Number(3600u), "3600"sv);
    check(Number(18446744073709551615ull), "18446744073709551615"sv);
    check(Number(0.1), "0.1"sv);
    check(Number(Number::KIND_NAN), "not a number"sv);
    check(Number(Number::KIND_INFINITY), "infinity"sv);
    check(Number(IC::Version2 {2, 15}), "2.15"sv);
    check(Number(1234567890L, 250), "2009-02-13T23:31:30Z"sv);
    check(Number(IC::sNodeRef {4, 7}), "CPU:7"sv);
    check(numberOfRefusedKind(), "invalid"sv);

    check(IC::EnumValue(4294967295u), "4294967295"sv);

    check(PropertyValue(PropertyValue::KIND_UNKNOWN), "unknown"sv);
    check(PropertyValue(Number(3600u)), "3600"sv);
    check(PropertyValue("AFB0812", true), "AFB0812"sv);
    check(PropertyValue(""), ""sv);
    check(PropertyValue("\0a\0"s), "\0a\0"sv);
    check(PropertyValue(IC::Buffer {0xde, 0xad, 0xbe, 0xef, 0x01}), "deadbeef 01"sv);
    check(PropertyValue(IC::EnumValue(7u)), "7"sv);
    check(PropertyValue(IC::NumberArray {1u, 0.5}), "{1, 0.5}"sv);
    check(PropertyValue(IC::StringArray {"a\"b", "{}"}), R"({"a\"b", "{}"})"sv);
    check(valueWithoutObject(), "invalid"sv);

    check(Error(5, Number(17u), "no such\0property"s), "5 - 17 - no such\0property"sv);

    ZQ::DateTime time(1234567890, 3);
    check(IC::Alert(time, 2, 1, {"/a", "/b"}, 5, "Fan failed"),
          "Alert 2; 1; 5; Fan failed; 2009-02-13T23:31:30Z; { 2f61 2f62 }"sv);

    const Fan fan;
    check(IC::Node(20), "Node  : 20, status = 0"sv);
    check(fan, "Fan, a Node 6162 : 20, status = 0"sv);
    check(static_cast<const IC::Node&>(fan), "Fan, a Node 6162 : 20, status = 0"sv);
}
