#pragma once

#include <version>

// Without std::format this header declares nothing, so that a build may include every header.
#if defined(__cpp_lib_format)

#include <concepts>
#include <format>
#include <string>
#include <string_view>

#include "IC/Alert.h"
#include "IC/EnumValue.h"
#include "IC/Error.h"
#include "IC/Node.h"
#include "IC/Number.h"
#include "IC/Property.h"

namespace IC::detail {

// Private, so that a formatter of ranges does not take the elements for strings and quote them.
template <class Value>
class FormatText : std::formatter<std::string_view> {
    using Base = std::formatter<std::string_view>;

public:
    using Base::parse;

    template <class Context>
    auto format(const Value& value, Context& context) const
    {
        return Base::format(value.operator std::string(), context);
    }
};

}  // namespace IC::detail

namespace std {

///@{
/// Formatters for std::format. Each class formats as its text, with the options of a text: fill, alignment, width and
/// precision. Throws what the text conversion throws.
///
///     std::cout << std::format("speed {:>6}\n", IC::Number(3600u));   // speed   3600
///
/// Optional: no other header includes this one. std::format needs C++20 and a standard library that has it: libstdc++
/// 13 or libc++ 17. Elsewhere this header declares nothing, and the compiler reports std::format itself: "'format' is
/// not a member of 'std'" (g++), "no member named 'format' in namespace 'std'" (clang++). To compile on both, test
/// `defined(__cpp_lib_format)` after including this header; or use IC/fmt.h, which needs neither.
template <>
struct formatter<IC::Number> : IC::detail::FormatText<IC::Number> {
};
template <>
struct formatter<IC::EnumValue> : IC::detail::FormatText<IC::EnumValue> {
};
template <>
struct formatter<IC::PropertyValue> : IC::detail::FormatText<IC::PropertyValue> {
};
template <>
struct formatter<IC::Error> : IC::detail::FormatText<IC::Error> {
};
template <>
struct formatter<IC::Alert> : IC::detail::FormatText<IC::Alert> {
};
///@}

/// Formats a node as the text that its class writes.
template <std::derived_from<IC::Node> T>
struct formatter<T> : IC::detail::FormatText<IC::Node> {
};

}  // namespace std

#endif
