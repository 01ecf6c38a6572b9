#pragma once

#include <string>
#include <type_traits>

#include <fmt/format.h>

#include "IC/Alert.h"
#include "IC/EnumValue.h"
#include "IC/Error.h"
#include "IC/Node.h"
#include "IC/Number.h"
#include "IC/Property.h"

namespace IC::detail {

// Private, so that a formatter of ranges does not take the elements for strings and quote them.
template <class Value>
class FmtText : fmt::formatter<fmt::string_view> {
    using Base = fmt::formatter<fmt::string_view>;

public:
    using Base::parse;

    template <class Context>
    auto format(const Value& value, Context& context) const
    {
        return Base::format(value.operator std::string(), context);
    }
};

}  // namespace IC::detail

namespace fmt {

///@{
/// Formatters for the library {fmt}. Each class formats as its text, with the options of a text: fill, alignment, width
/// and precision. Throws what the text conversion throws.
///
///     fmt::print("speed {:>6}\n", IC::Number(3600u));   // speed   3600
///
/// Optional: no other header includes this one. Link {fmt} yourself. IC/format.h is the same for std::format.
template <>
struct formatter<IC::Number> : IC::detail::FmtText<IC::Number> {
};
template <>
struct formatter<IC::EnumValue> : IC::detail::FmtText<IC::EnumValue> {
};
template <>
struct formatter<IC::PropertyValue> : IC::detail::FmtText<IC::PropertyValue> {
};
template <>
struct formatter<IC::Error> : IC::detail::FmtText<IC::Error> {
};
template <>
struct formatter<IC::Alert> : IC::detail::FmtText<IC::Alert> {
};
///@}

/// Formats a node as the text that its class writes.
template <class T>
struct formatter<T, char, std::enable_if_t<std::is_base_of_v<IC::Node, T>>> : IC::detail::FmtText<IC::Node> {
};

}  // namespace fmt
