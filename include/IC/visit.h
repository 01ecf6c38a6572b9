#pragma once

#include <variant>

#include "IC/Number.h"
#include "IC/Property.h"

namespace IC {

/// What a visitor gets for the kinds without a value: Number::KIND_NAN and Number::KIND_INFINITY. For KIND_UNKNOWN it
/// gets std::monostate.
struct NotANumber { };
struct Infinity { };

/// What a visitor gets for a number whose kind code is 11 or more, left by a refused Number::initKind.
struct InvalidKind {
    Number::KindType kind;  ///< the code
};

/// What a visitor gets for a kind whose object is missing, left by a refused PropertyValue::setKind.
struct MissingObject {
    PropertyValue::KindType kind;  ///< 1 to 6
};

///@{

/// Calls the visitor with what the value holds and returns its result. The visitor has a case for each type:
///
/// - of a PropertyValue: std::monostate for nothing, Number, std::string, EnumValue, Buffer, NumberArray, StringArray,
///   and MissingObject;
/// - of a Number: bool, int, unsigned int, unsigned long long, double, Version2, ZQ::DateTime with any scope, NodeRef,
///   std::monostate for KIND_UNKNOWN, NotANumber, Infinity, and InvalidKind.
///
/// It does not compile if a case is missing or if two cases return different types. A case takes exactly its type, by
/// value or by const reference: a conversion does not count. `const auto&` is a case for all types. The visitor's class
/// must not be final. A set of lambdas becomes a visitor as for std::visit:
///
///     template <class... Cases>
///     struct Overloaded : Cases... {
///         using Cases::operator()...;
///     };
///     template <class... Cases>
///     Overloaded(Cases...) -> Overloaded<Cases...>;
///
///     const auto length = IC::visit(
///         value, Overloaded {[](const std::string& text) { return text.size(); },
///                            [](const IC::Buffer& bytes) { return bytes.size(); },
///                            [](const auto&) { return std::size_t {0}; }});
///
/// Copies, allocates and logs nothing, and throws only what the visitor throws, or ZQ::DateTime for a date-time. The
/// object of a PropertyValue is passed by reference, which is valid until the value is changed or destroyed. What a
/// Number holds exists only during the call.
///
/// Optional: no other header includes this one.
template <class Visitor>
inline decltype(auto) visit(const PropertyValue& value, Visitor&& visitor);
template <class Visitor>
inline decltype(auto) visit(const Number& number, Visitor&& visitor);

///@}

}  // namespace IC

// The interface ends here.
#include "IC/detail/visit-inl.h"
