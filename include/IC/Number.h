#pragma once

#include <cstddef>
#include <cstring>
#include <functional>
#include <iosfwd>
#include <string>
#include <type_traits>
#include <vector>

#include "ZQ/DateTime.h"
#include "ZQ/Types.h"

// Some systems define these as macros; inside this header they are names.
#pragma push_macro("major")
#pragma push_macro("minor")
#undef major
#undef minor

namespace IC {
class Number;
}
namespace IC::detail {
class Text;
void append(Text& text, const Number& number);
void append(Text& text, const std::vector<Number>& numbers);

// Puts what happens in the other case out of the way.
constexpr bool likely(bool condition) noexcept
{
    return __builtin_expect(static_cast<long>(condition), 1L) != 0;
}

// The hash of what came before and of what comes next. The factor is odd, so that nothing of the former is lost.
constexpr std::size_t combinedHash(std::size_t before, std::size_t next) noexcept
{
    return before * static_cast<std::size_t>(0x9E3779B97F4A7C15u) + next;
}
}  // namespace IC::detail

namespace std {
template <>
struct hash<IC::Number>;
}

#pragma GCC visibility push(default)

namespace IC {

/// The display names of the sensor types, indexed by Node::SensorType. Entry 74, "invalid", is no sensor type.
/// Programs hold a copy of the table, so its size never changes. It is filled before the program's own objects
/// are built, and then any thread may read it.
extern const std::string pst[75];

/// A version of two numbers; its text is "2.15".
struct Version2 {
    ZQ::Uint8 major;  ///< before the dot
    ZQ::Uint8 minor;  ///< behind it
};

/// A reference to a node: its sensor type (an index into `pst`) and its number.
struct sNodeRef {
    ZQ::Uint32 type;  ///< an index into `pst`
    ZQ::Uint32 id;    ///< which of that type
};

/// The same under another name.
using NodeRef = sNodeRef;

/// One number of one of eleven kinds, which gives itself back only as what it is.
///
/// A plain value, trivially copyable; one object belongs to one thread at a time. It has no default
/// constructor. Every refusal writes a log record and a trace record (category "Vexilon.IC.Number", level
/// 6000) and then throws; what the platform throws while it writes them comes instead. Refusals apart, only
/// two things throw: a text, std::bad_alloc; and what takes, gives or prints a date-time, what the platform
/// throws. Whatever is thrown, nothing has changed, but for a refused initKind.
///
///     IC::Number speed(3600u);
///     unsigned int rpm = speed;                  // 3600
///     std::cout << speed;                        // 3600
///
/// Rules that look odd and are meant:
/// - unsigned char is a kind code: Number(static_cast<unsigned char>(3)) is the kind KIND_UINT32 with 0.
///   unsigned short and char widen to int and give a signed number.
/// - On 64-bit Linux std::uint64_t is unsigned long and does not compile; write ZQ::Uint64{value}.
/// - A signed number converts to int and to nothing else; a real of -1 or less converts to no integer.
/// - Two signed numbers are always equal and never ordered; so are two node references.
/// - `number < 5u` does not compile, since each side converts to the other: write `number < Number(5u)`. Nor do
///   `x += number`, a conversion to long or float, and `text = number` for an existing std::string: name the
///   type, as in `text = std::string(number)`.
class __attribute__((visibility("default"))) Number {
public:
    /// What a number can be. Records name a kind by its code.
    enum KindType : ZQ::Uint32 {
        KIND_UNKNOWN = 0,   ///< no value
        KIND_BOOL = 1,      ///< a flag
        KIND_INT = 2,       ///< a signed 32-bit integer
        KIND_UINT32 = 3,    ///< an unsigned 32-bit integer
        KIND_UINT64 = 4,    ///< an unsigned 64-bit integer
        KIND_REAL = 5,      ///< a 64-bit real, NaN and infinities included
        KIND_NAN = 6,       ///< no value: "not a number"
        KIND_INFINITY = 7,  ///< no value: positive infinity
        KIND_VERSION = 8,   ///< a Version2
        KIND_DATETIME = 9,  ///< seconds, milliseconds and scope
        KIND_NODEREF = 10   ///< an sNodeRef
    };

    ///@{
    /// A number of the kind that the type of `value` names.
    Number(const bool& value) noexcept : Number(Tag(), KIND_BOOL) { store(static_cast<ZQ::Uint8>(value)); }
    Number(const int& value) noexcept : Number(Tag(), KIND_INT) { store(value); }
    Number(const unsigned int& value) noexcept : Number(Tag(), KIND_UINT32) { store(value); }
    Number(const unsigned long long& value) noexcept : Number(Tag(), KIND_UINT64) { store(value); }
    /// The kind is KIND_REAL for a NaN and for infinities too.
    Number(const double& value) noexcept : Number(Tag(), KIND_REAL) { store(value); }
    Number(const Version2& value) noexcept : Number(Tag(), KIND_VERSION) { store(value); }
    Number(const sNodeRef& value) noexcept : Number(Tag(), KIND_NODEREF) { nodeRef_ = value; }
    ///@}

    /// A date-time of scope 3. Seconds since the epoch.
    Number(long seconds, unsigned short milliseconds) noexcept : Number(Tag(), KIND_DATETIME)
    {
        storeDateTime(seconds, milliseconds, defaultScope);
    }

    /// A date-time; the scope is cut to 8 bits and the milliseconds to 16.
    Number(const ZQ::DateTime& value);

    /// A number of the kind with this code, with the content that initKind gives. Codes of 11 and above are
    /// refused with std::invalid_argument: what is logged, with the code, and below it what the exception says;
    /// 2 and 10 are refused by initKind.
    ///
    ///     "Number: wrong kind of number: "
    ///       "Invalid kind of number"
    Number(const unsigned char& code);

    /// The same; every refusal is initKind's.
    Number(const KindType& kind) : Number(Tag(), kind)
    {
        if (kind != KIND_UNKNOWN)
            initKind(kind);
    }

    ///@{
    /// A pointer would silently become a flag, and an enumeration of one byte (such as Error::StatusType) a kind
    /// code. Write Number(static_cast<unsigned int>(value)).
    template <class T>
    Number(T*) = delete;
    Number(std::nullptr_t) = delete;
    template <class T, std::enable_if_t<std::is_enum_v<T> && sizeof(T) == 1, int> = 0>
    Number(T) = delete;
    ///@}

    ///@{
    /// The kind, under two names.
    KindType getKind() const noexcept { return kind_; }
    operator KindType() const noexcept { return kind_; }
    ///@}

    /// Stores the kind and gives the value that kind's first content: 0, 0.0, version 0.0, or the current time
    /// in whole seconds with scope 3. For the kinds 0, 1, 6 and 7 the flag byte is cleared and the rest is kept.
    /// The kinds 2, 10, and 11 and above are refused with std::invalid_argument:
    ///
    ///     "initkind: invalid kind of number ", and the kind
    ///       "Invalid kind of number"
    ///
    /// The refused kind stays stored (deliberate), whatever the platform throws. A kind of 11 or more then
    /// behaves like KIND_UNKNOWN in conversions and comparisons, and its text is "invalid".
    void initKind(const KindType& kind);

    /// Replaces the kind and keeps the bytes of the value as they lie in storage: a reinterpretation, no
    /// conversion. All kinds from 0 to 10 are taken. A flag byte above 1 made this way converts to true, 1 and
    /// 1.0, and prints "true". Codes of 11 and above are refused with std::invalid_argument, and nothing changes:
    ///
    ///     "setKind: invalid kind ", and the code
    ///       "Invalid kind"
    void setKind(const unsigned char& code);

    ///@{
    /// The conversions. Each takes the kinds in its row and refuses the others with std::out_of_range. A real
    /// is cut toward zero and refused where the target cannot hold it; nothing is saturated.
    ///
    ///     to                  takes
    ///     bool                flag; uint32, uint64 and real, whether not 0 (NaN is true)
    ///     int                 flag, int; and what unsigned int takes, with the 32 bits taken as signed; its
    ///                         refusals are those of unsigned int
    ///     unsigned int        flag, uint32; uint64 below 2^32; reals above -1 and below 2^32
    ///     unsigned long long  flag, uint32, uint64; reals above -1 and below 2^64
    ///     double              flag, uint32, uint64, real, NaN, infinity; a version as major.minor (2.15)
    ///     Version2            version; uint32 and uint64 up to 255, as the major number
    ///     ZQ::DateTime        date-time of scope 1 to 3
    ///     sNodeRef            node reference
    ///
    /// A real NaN passes both range checks: it gives 0 for the 32-bit integers and 2^63 for the 64-bit one.
    ///
    /// The refusals: what is logged, and below it what the exception says.
    ///
    ///     another kind, which is logged behind the text
    ///       "bool: Can't return current value as a Boolean, kind="
    ///         "Can't return current value as a Boolean"
    ///       "Uint32: Can't return current value as a 32-bit integer, kind="
    ///         "Can't return current value as a 32-bit integer"
    ///       "Uint64: Can't return current value as a 64-bit integer, kind="
    ///         "Can't return current value as a 64-bit integer"
    ///       "Real: Can't return current value as a Real, kind="
    ///         "Can't return current value as a Real"
    ///       "Version: Can't return current value as a Version, kind="
    ///         "Can't return current value as a Version"
    ///       "DateTime: Can't return current value as a DateTime, kind="
    ///         "Can't return current value as a DateTime"
    ///       "NodeRef: Can't return current value as a pair, kind="
    ///         "Can't return current value as pair"
    ///     too large, or below 0; the value is logged behind the text
    ///       "Uint32: number out of range: "
    ///         "The number is too large to convert to a 32-bit integer"
    ///         "A negative number cannot convert to an unsigned 32-bit integer"
    ///       "Uint64: number out of range: "
    ///         "The number is too large to convert to a 64-bit integer"
    ///         "A negative number cannot convert to an unsigned 64-bit integer"
    ///       "Version: Number too large for version: "
    ///         "The number is too large to convert to a version"
    operator bool() const { return detail::likely(kind_ == KIND_BOOL) ? load<ZQ::Uint8>() != 0 : toBool(); }
    operator int() const
    {
        return detail::likely(kind_ == KIND_INT) ? load<int>() : static_cast<int>(toUint32("operator int"));
    }
    operator unsigned int() const
    {
        return detail::likely(kind_ == KIND_UINT32) ? load<ZQ::Uint32>() : toUint32("operator ZQ::Uint32");
    }
    operator unsigned long long() const
    {
        return detail::likely(kind_ == KIND_UINT64) ? load<ZQ::Uint64>() : toUint64();
    }
    operator double() const { return detail::likely(kind_ == KIND_REAL) ? load<ZQ::Real64>() : toReal(); }
    operator Version2() const { return kind_ == KIND_VERSION ? load<Version2>() : toVersion(); }
    operator ZQ::DateTime() const;
    operator sNodeRef() const { return kind_ == KIND_NODEREF ? nodeRef_ : refuseNodeRef(); }
    ///@}

    /// The text, as a fresh std::ostringstream writes it under the global locale: "unknown", "true", decimal
    /// digits, a real with six significant digits, "not a number", "infinity", "2.15", a date-time,
    /// "CPU:7" for a node reference (a sensor type above 74 takes the name of entry 74), "invalid".
    ///
    /// Milliseconds that are a multiple of 10 do not appear in the text of a date-time. Others print as
    /// ".Conversion failed remainder>0", after the records "string: conversion failed, remainder not zero,
    /// remainder=" and the last digit (deliberate). Nothing is refused.
    operator std::string() const;

private:
    // Comparisons, hash and text read the value as its kind says.
    friend bool operator==(const Number& a, const Number& b);
    friend bool operator<(const Number& a, const Number& b);
    friend bool operator>(const Number& a, const Number& b);
    friend struct std::hash<Number>;
    friend void detail::append(detail::Text& text, const Number& number);
    friend void detail::append(detail::Text& text, const std::vector<Number>& numbers);

    struct Tag { };

    struct DateTimeFields {
        long seconds;
        ZQ::Uint16 milliseconds;
        ZQ::Uint8 scope;
    };
    static constexpr ZQ::Uint8 defaultScope = 3;

    // Every byte of the value is defined, also those that the kind does not use.
    Number(Tag, KindType kind) noexcept : kind_(kind), value_ {}, nodeRef_ {0, 0} { }

    template <class T>
    T load() const noexcept
    {
        T content;
        std::memcpy(&content, value_, sizeof content);
        return content;
    }

    // The content as a record reads it, anew each time.
    template <class T>
    auto reading() const noexcept
    {
        return [this] { return load<T>(); };
    }

    template <class T>
    void store(const T& content) noexcept
    {
        std::memcpy(value_, &content, sizeof content);
    }

    // Field by field: a struct copied whole would bring its undefined padding along.
    void storeDateTime(long seconds, ZQ::Uint16 milliseconds, ZQ::Uint8 scope) noexcept
    {
        std::memcpy(value_ + offsetof(DateTimeFields, seconds), &seconds, sizeof seconds);
        std::memcpy(value_ + offsetof(DateTimeFields, milliseconds), &milliseconds, sizeof milliseconds);
        std::memcpy(value_ + offsetof(DateTimeFields, scope), &scope, sizeof scope);
    }

    bool toBool() const;
    ZQ::Uint32 toUint32(const char* function) const;
    ZQ::Uint64 toUint64() const;
    ZQ::Real64 toReal() const;
    Version2 toVersion() const;
    [[noreturn, gnu::cold]] sNodeRef refuseNodeRef() const;

    static bool equal(const Number& a, const Number& b);
    static bool less(const Number& a, const Number& b);
    static bool greater(const Number& a, const Number& b);
    static bool precedes(const Number& a, const Number& b);
    // Whether both are of this kind, for the kinds that are compared most.
    static bool both(KindType kind, const Number& a, const Number& b)
    {
        return a.kind_ == kind && b.kind_ == kind;
    }

    KindType kind_;
    // The kind's content at its start. Bytes, because setKind lets one kind's be read as another's.
    alignas(ZQ::Uint64) alignas(DateTimeFields) unsigned char value_[sizeof(DateTimeFields)];
    sNodeRef nodeRef_;
};

static_assert(std::is_trivially_copyable_v<Number>);
static_assert(std::is_trivially_copyable_v<Version2>);
static_assert(std::is_trivially_copyable_v<sNodeRef>);

///@{
/// Equality never throws. Numbers of different kinds are unequal. Signed numbers are all equal, and so are
/// node references, and the kinds without a value. Date-times are equal whatever their scope; a real NaN
/// equals nothing.
[[gnu::visibility("default")]] inline bool operator==(const Number& a, const Number& b)
{
    if (Number::both(Number::KIND_UINT32, a, b))
        return a.load<ZQ::Uint32>() == b.load<ZQ::Uint32>();
    if (Number::both(Number::KIND_REAL, a, b))
        return std::equal_to<>()(a.load<ZQ::Real64>(), b.load<ZQ::Real64>());
    return Number::equal(a, b);
}
bool operator!=(const Number& a, const Number& b);
///@}

///@{
/// Less-than and greater-than, within one kind. Kinds without a value, signed numbers and node references are
/// neither less nor greater. KIND_INFINITY on the left is never less, and greater than every other kind but
/// KIND_NAN; on the right of another kind it is refused.
///
/// The refusals, with std::invalid_argument: what is logged (for > it begins with ">"), and below it what the
/// exception says.
///
///     one of the kinds is KIND_NAN
///       "<: invalid operation when kind is NaN"
///         "Invalid operation when kind is NaN"
///     the kinds differ
///       "<: cannot compare two different kinds of number, kind1=3, kind2=4"
///         "Cannot compare two different kinds of number"
[[gnu::visibility("default")]] inline bool operator<(const Number& a, const Number& b)
{
    if (Number::both(Number::KIND_UINT32, a, b))
        return a.load<ZQ::Uint32>() < b.load<ZQ::Uint32>();
    if (Number::both(Number::KIND_REAL, a, b))
        return a.load<ZQ::Real64>() < b.load<ZQ::Real64>();
    return Number::less(a, b);
}
[[gnu::visibility("default")]] inline bool operator>(const Number& a, const Number& b)
{
    if (Number::both(Number::KIND_UINT32, a, b))
        return a.load<ZQ::Uint32>() > b.load<ZQ::Uint32>();
    if (Number::both(Number::KIND_REAL, a, b))
        return a.load<ZQ::Real64>() > b.load<ZQ::Real64>();
    return Number::greater(a, b);
}
///@}

///@{
/// a == b, or else a < b (a > b): equal numbers are never refused.
bool operator<=(const Number& a, const Number& b);
bool operator>=(const Number& a, const Number& b);
///@}

/// Inserts std::string(number) as one text: width and fill apply to the whole of it. Where the text throws,
/// nothing is inserted.
std::ostream& operator<<(std::ostream& out, const Number& number);

}  // namespace IC

namespace std {

/// For std::unordered_set and its like. It agrees with ==, so that signed numbers all have one hash, node
/// references have one, and a date-time's scope is left out. It needs no memory.
template <>
struct __attribute__((visibility("default"))) hash<IC::Number> {
    /// The hash of the kind and of what == compares.
    std::size_t operator()(const IC::Number& number) const noexcept
    {
        return IC::detail::combinedHash(number.kind_, contentHash(number));
    }

private:
    static std::size_t hashOf(ZQ::Uint64 integer) noexcept
    {
        return static_cast<std::size_t>(integer ^ integer >> 32);  // a hash may have but 32 bits
    }
    static std::size_t hashOf(const IC::Version2& version) noexcept
    {
        return version.major * 256u + version.minor;
    }
    static std::size_t hashOf(const IC::Number::DateTimeFields& time) noexcept
    {
        return IC::detail::combinedHash(std::hash<long>()(time.seconds), time.milliseconds);
    }

    static std::size_t contentHash(const IC::Number& number) noexcept
    {
        using IC::Number;
        switch (ZQ::Uint32 {number.kind_}) {
        case Number::KIND_BOOL:
            return number.load<ZQ::Uint8>();
        case Number::KIND_UINT32:
            return number.load<ZQ::Uint32>();
        case Number::KIND_UINT64:
            return hashOf(number.load<ZQ::Uint64>());
        case Number::KIND_REAL:
            return std::hash<ZQ::Real64>()(number.load<ZQ::Real64>());
        case Number::KIND_VERSION:
            return hashOf(number.load<IC::Version2>());
        case Number::KIND_DATETIME:
            return hashOf(number.load<Number::DateTimeFields>());
        default:
            return 0;  // two of such a kind are equal
        }
    }
};

}  // namespace std

#pragma GCC visibility pop

#pragma pop_macro("major")
#pragma pop_macro("minor")
