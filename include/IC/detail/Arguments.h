#pragma once

// Which arguments the constructors of EnumValue and PropertyValue take, where the type of the argument decides.

#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include "ZQ/Types.h"

namespace IC {

class EnumValue;
class Number;

namespace detail {

// The enumerations that an EnumValue can hold.
template <class T>
inline constexpr bool isEnumeration = std::is_enum_v<T> && sizeof(T) <= sizeof(ZQ::Uint32);
template <class T>
inline constexpr bool isTooLargeEnumeration = std::is_enum_v<T> && sizeof(T) > sizeof(ZQ::Uint32);

// What the constructors of EnumValue from integers take. The enumerations among them convert without a cast, so the
// explicit constructor must not be the better match for them.
struct EnumValueIntegers {
    void operator()(const unsigned char&);
    void operator()(const unsigned short&);
    void operator()(const unsigned int&);
};
template <class T>
inline constexpr bool isEnumValueInteger = std::is_invocable_v<EnumValueIntegers, T>;

// No object, converts to a byte, and is neither a byte nor a kind of a property value. An int is the code of a kind,
// with a warning.
template <class T, class Kind>
inline constexpr bool isNotAKind = std::disjunction_v<
    std::conjunction<std::is_enum<T>, std::negation<std::is_same<T, Kind>>>,
    std::conjunction<std::negation<std::disjunction<std::is_class<T>, std::is_enum<T>,
                                                    std::is_same<T, unsigned char>, std::is_same<T, int>>>,
                     std::is_convertible<T, unsigned char>>>;

// What the constructors of PropertyValue take, and the integers and reals that an object can convert to beside it. An
// object that converts to one of the latter alone would become the code of a kind.
struct LostNumber { };
template <class Kind>
struct PropertyContents {
    void operator()(const std::string&);
    void operator()(const Number&);
    void operator()(const EnumValue&);
    void operator()(const std::vector<unsigned char>&);
    void operator()(const std::vector<Number>&);
    void operator()(const std::vector<std::string>&);
    void operator()(const char*);
    void operator()(const unsigned char&);
    void operator()(const Kind&);
    // The other types of numbers are promoted to one of these.
    LostNumber operator()(const int&);
    LostNumber operator()(const unsigned int&);
    LostNumber operator()(const long&);
    LostNumber operator()(const unsigned long&);
    LostNumber operator()(const long long&);
    LostNumber operator()(const unsigned long long&);
    LostNumber operator()(const double&);
    LostNumber operator()(const long double&);
};
template <class T, class Kind>
inline constexpr bool isObjectOfNumber =
    std::conjunction_v<std::is_class<std::remove_reference_t<T>>,
                       std::is_invocable_r<LostNumber, PropertyContents<Kind>, T>>;

// Whether a class has a conversion function to a property value. The constructors of the latter are not asked, because
// they ask this.
template <class T, class Value, class = void>
inline constexpr bool hasConversion = std::is_convertible_v<T, const volatile Value&>;
template <class T, class Value>
inline constexpr bool hasConversion<T, Value, std::void_t<decltype(std::declval<T>().operator Value())>> =
    true;

// A read-only mark.
template <class T>
inline constexpr bool isMark =
    std::disjunction_v<std::is_same<std::remove_cv_t<T>, bool>, std::is_same<T, std::vector<bool>::reference>,
                       std::is_same<T, std::vector<bool>::const_reference>>;

}  // namespace detail

}  // namespace IC
