#pragma once

#include <cstddef>
#include <iosfwd>
#include <string>
#include <type_traits>

#include "IC/detail/Arguments.h"
#include "IC/detail/Export.h"
#include "ZQ/Types.h"

namespace IC {

struct sNodeRef;

/// One member of an enumeration as a plain unsigned number; it does not know which enumeration.
///
/// A trivially copyable value; one object belongs to one thread at a time. `std::hash` agrees with `==`. A refusal
/// [logs](docs/refusals.md), throws and changes nothing. If logging throws, that exception propagates instead.
/// Otherwise only text conversion throws (std::bad_alloc).
///
///     enum class State { Off, On };
///     IC::EnumValue state(State::On);
///     auto read = static_cast<State>(state);     // State::On
///     unsigned char code = state;                // 1
///     std::cout << state;                        // 1
///
/// `state == 7u` is ambiguous: write `state == EnumValue(7u)`. So is `state = 7`, with a signed number.
class IC_EXPORT EnumValue {
public:
    /// @name Construction
    ///@{

    /// 0, or the value given.
    EnumValue() noexcept : value_(0) { }
    EnumValue(const unsigned char& value) noexcept : value_(value) { }
    EnumValue(const unsigned short& value) noexcept : value_(value) { }
    EnumValue(const unsigned int& value) noexcept : value_(value) { }

    /// The value of an enumerator; a negative one becomes 2^31 or more. An enumeration that converts to one of the
    /// integers above without a cast, such as Node::SensorType, still converts so.
    template <class Enum,
              std::enable_if_t<detail::isEnumeration<Enum> && !detail::isEnumValueInteger<Enum>, int> = 0>
    explicit EnumValue(Enum value) noexcept
        : value_(
            static_cast<ZQ::Uint32>(static_cast<std::underlying_type_t<Enum>>(value)))  // extends the sign
    {
    }

    /// Deleted: an enumeration of 64 bits.
    template <class Enum, std::enable_if_t<detail::isTooLargeEnumeration<Enum>, int> = 0>
    explicit EnumValue(Enum) = delete;

    ///@}
    /// @name Conversions
    ///@{

    /// The value. Throws std::out_of_range if the type cannot hold it; nothing is cut off.
    operator unsigned int() const noexcept { return value_; }
    inline operator unsigned short() const;
    inline operator unsigned char() const;

    /// The enumerator with this value, also a negative one. Throws std::out_of_range if the type of the enumeration
    /// cannot hold it. If that type is not fixed, the value must be in the range of the enumerators.
    template <class Enum, std::enable_if_t<detail::isEnumeration<Enum>, int> = 0>
    explicit operator Enum() const
    {
        return static_cast<Enum>(as<std::underlying_type_t<Enum>>());
    }

    /// Deleted: in C++20 `NodeRef x(value);` would take the value for a sensor type.
    explicit operator sNodeRef() const = delete;

    ///@}
    /// @name Text
    ///@{

    /// The decimal digits, as a fresh std::ostringstream writes them under the global locale.
    operator std::string() const;

    ///@}

private:
    template <class Integer>
    inline Integer as() const;
    [[noreturn, gnu::cold]] unsigned short refuseUint16() const;
    [[noreturn, gnu::cold]] unsigned char refuseUint8() const;

    ZQ::Uint32 value_;
};

/// @name Comparison
/// @relates EnumValue
///@{

/// As unsigned numbers; nothing is refused.
IC_EXPORT bool operator==(const EnumValue& a, const EnumValue& b);
IC_EXPORT bool operator!=(const EnumValue& a, const EnumValue& b);
IC_EXPORT bool operator<(const EnumValue& a, const EnumValue& b);
IC_EXPORT bool operator<=(const EnumValue& a, const EnumValue& b);
IC_EXPORT bool operator>(const EnumValue& a, const EnumValue& b);
IC_EXPORT bool operator>=(const EnumValue& a, const EnumValue& b);

///@}

/// @relates EnumValue
/// Inserts std::string(value) as one text: width and fill apply to the whole. If the conversion throws, nothing is
/// inserted.
IC_EXPORT std::ostream& operator<<(std::ostream& out, const EnumValue& value);

}  // namespace IC

// The interface ends here.
#include "IC/detail/EnumValue-inl.h"
