#pragma once

#include <array>
#include <ostream>
#include <string>

#include <gtest/gtest.h>

#include "IC/EnumValue.h"
#include "IC/Number.h"
#include "IC/Property.h"

// Makes GoogleTest print values with the name of their kind, because the texts of 5 and "5" are equal:
//
//   IC::Number(5u)                     KIND_UINT32 5
//   IC::PropertyValue("5", true)       KIND_STRING "5", read-only
//
// Include this header in all test files of a program or in none: they must agree on how a type is printed.
namespace IC {

inline void PrintTo(const Number& number, std::ostream* out)
{
    static constexpr std::array names {"KIND_UNKNOWN", "KIND_BOOL",     "KIND_INT",    "KIND_UINT32",
                                       "KIND_UINT64",  "KIND_REAL",     "KIND_NAN",    "KIND_INFINITY",
                                       "KIND_VERSION", "KIND_DATETIME", "KIND_NODEREF"};
    const ZQ::Uint32 kind = number.getKind();
    if (kind > Number::KIND_NODEREF)
        *out << "kind " << kind;
    else if (kind == Number::KIND_UNKNOWN || kind == Number::KIND_NAN || kind == Number::KIND_INFINITY)
        *out << names[kind];
    else
        *out << names[kind] << ' ' << number;
}

inline void PrintTo(const EnumValue& value, std::ostream* out)
{
    *out << "EnumValue " << value;
}

inline void PrintTo(const PropertyValue& value, std::ostream* out)
{
    static constexpr std::array names {"KIND_UNKNOWN",   "KIND_NUMBER",      "KIND_STRING",     "KIND_BUFFER",
                                       "KIND_ENUMVALUE", "KIND_NUMBERARRAY", "KIND_STRINGARRAY"};
    const PropertyValue::KindType kind = value.getKind();
    *out << names[kind];
    const std::string text = value;  // "invalid" if the value has no object; a conversion would throw then
    if (kind == PropertyValue::KIND_STRING)
        *out << ' ' << testing::PrintToString(text);
    else if (kind == PropertyValue::KIND_NUMBER && text != "invalid")
        PrintTo(value.operator Number(), &(*out << ' '));
    else if (kind != PropertyValue::KIND_UNKNOWN)
        *out << ' ' << text;
    *out << (value.readOnly() ? ", read-only" : "");
}

}  // namespace IC
