#pragma once

#include <map>
#include <string>
#include <vector>

#include "IC/Property.h"

// One value of each kind, in the order of the kind codes. The long texts do not fit into a string's internal buffer,
// so a copy allocates memory for them.
inline std::vector<IC::PropertyValue> samples(bool readOnly = false)
{
    using IC::PropertyValue;
    return {
        PropertyValue(PropertyValue::KIND_UNKNOWN, readOnly),
        PropertyValue(IC::Number(3600u), readOnly),
        PropertyValue("a text that needs memory of its own", readOnly),
        PropertyValue(IC::Buffer {0xde, 0xad, 0xbe, 0xef, 0x01}, readOnly),
        PropertyValue(IC::EnumValue(7u), readOnly),
        PropertyValue(IC::NumberArray {IC::Number(1u), IC::Number(2u)}, readOnly),
        PropertyValue(IC::StringArray {"short", "an element that needs memory of its own"}, readOnly),
    };
}

// The same kinds with other contents of other lengths.
inline std::vector<IC::PropertyValue> otherSamples(bool readOnly = false)
{
    using IC::PropertyValue;
    return {
        PropertyValue(PropertyValue::KIND_UNKNOWN, readOnly),
        PropertyValue(IC::Number(true), readOnly),
        PropertyValue("another text, and a longer one, that needs more memory of its own", readOnly),
        PropertyValue(IC::Buffer {0, 1, 2, 3, 4, 5, 6, 7}, readOnly),
        PropertyValue(IC::EnumValue(4294967295u), readOnly),
        PropertyValue(IC::NumberArray {IC::Number(0.5), IC::Number(-7), IC::Number(8u)}, readOnly),
        PropertyValue(IC::StringArray {"an only element, and a longer one, that needs more memory",
                                       "a last element that needs memory of its own", ""},
                      readOnly),
    };
}

// The kind, the mark and the text of a value: "2 writable: abc".
inline std::string seen(const IC::PropertyValue& value)
{
    return std::to_string(static_cast<unsigned int>(value.getKind()))
        + (value.readOnly() ? " read-only: " : " writable: ") + value.operator std::string();
}

// The same for each property: "1: 2 writable: abc; 7: 4 read-only: 5; ".
inline std::string seen(const std::map<unsigned int, IC::PropertyValue>& properties)
{
    std::string all;
    for (const auto& [key, value] : properties)
        all += std::to_string(key) + ": " + seen(value) + "; ";
    return all;
}
