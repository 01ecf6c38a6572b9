#pragma once

#include <cstddef>
#include <iosfwd>
#include <string>
#include <type_traits>

#include "ZQ/Types.h"

#pragma GCC visibility push(default)

namespace IC {

/// One member of some enumeration as a plain unsigned number; it does not know which enumeration.
///
/// A plain value, trivially copyable; one object belongs to one thread at a time. Every refusal writes a log
/// record and a trace record (category "Vexilon.IC.EnumValue", level 6000) and then throws; what the platform
/// throws while it writes them comes instead. Refusals apart, only a text may throw, and that std::bad_alloc.
/// Whatever is thrown, nothing has changed.
///
///     IC::EnumValue state(7u);
///     unsigned char code = state;                // 7
///     std::cout << state;                        // 7
///
/// `state == 7u` does not compile, since each side converts to the other: write `state == EnumValue(7u)`. Nor does
/// `state = 7`, with a signed number.
class __attribute__((visibility("default"))) EnumValue {
public:
    ///@{
    /// 0, or the value given.
    EnumValue() noexcept : value_(0) { }
    EnumValue(const unsigned char& value) noexcept : value_(value) { }
    EnumValue(const unsigned short& value) noexcept : value_(value) { }
    EnumValue(const unsigned int& value) noexcept : value_(value) { }
    ///@}

    ///@{
    /// The value at the width asked for; nothing is cut off. What is too large is refused with
    /// std::out_of_range: what is logged, with the value, and below it what the exception says.
    ///
    ///     "Uint16: number out of range: "
    ///       "The number is too large to convert to a 16-bit integer"
    ///     "Uint8: number out of range: "
    ///       "The number is too large to convert to an 8-bit integer"
    operator unsigned int() const noexcept { return value_; }
    operator unsigned short() const
    {
        return value_ <= 0xFFFFu ? static_cast<unsigned short>(value_) : refuseUint16();
    }
    operator unsigned char() const
    {
        return value_ <= 0xFFu ? static_cast<unsigned char>(value_) : refuseUint8();
    }
    ///@}

    /// The decimal digits, as a fresh std::ostringstream writes them under the global locale.
    operator std::string() const;

private:
    [[noreturn, gnu::cold]] unsigned short refuseUint16() const;
    [[noreturn, gnu::cold]] unsigned char refuseUint8() const;

    ZQ::Uint32 value_;
};

static_assert(std::is_trivially_copyable_v<EnumValue>);

///@{
/// Compare the values as unsigned numbers.
bool operator==(const EnumValue& a, const EnumValue& b);
bool operator!=(const EnumValue& a, const EnumValue& b);
bool operator<(const EnumValue& a, const EnumValue& b);
bool operator<=(const EnumValue& a, const EnumValue& b);
bool operator>(const EnumValue& a, const EnumValue& b);
bool operator>=(const EnumValue& a, const EnumValue& b);
///@}

/// Inserts std::string(value) as one text: width and fill apply to the whole of it. Where the text throws,
/// nothing is inserted.
std::ostream& operator<<(std::ostream& out, const EnumValue& value);

}  // namespace IC

namespace std {

/// For std::unordered_set and its like.
template <>
struct __attribute__((visibility("default"))) hash<IC::EnumValue> {
    /// The hash of the value as an unsigned number. It needs no memory.
    std::size_t operator()(const IC::EnumValue& value) const noexcept
    {
        return std::hash<unsigned int>()(value.operator unsigned int());
    }
};

}  // namespace std

#pragma GCC visibility pop
