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

// The base is private, because what quotes the texts of a range would quote these, too.
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
/// For programs that format with the library {fmt}; no other header includes this one. Each class formats as its
/// text, with what {fmt} offers for texts: fill, alignment, width and precision. It throws what the text throws.
///
///     fmt::print("speed {:>6}\n", IC::Number(3600u));   // speed   3600
///
/// Link {fmt} yourself. IC/format.h has the same for std::format.
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

/// Formats the text of a node, as its class writes it.
template <class T>
struct formatter<T, char, std::enable_if_t<std::is_base_of_v<IC::Node, T>>> : IC::detail::FmtText<IC::Node> {
};

}  // namespace fmt
