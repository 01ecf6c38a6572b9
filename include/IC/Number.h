#pragma once

#include <cstddef>
#include <cstring>
#include <iosfwd>
#include <string>
#include <type_traits>

#include "IC/detail/Export.h"
#include "IC/detail/Inline.h"
#include "ZQ/DateTime.h"
#include "ZQ/Types.h"

// Some systems define these as macros; inside this header they are names.
#pragma push_macro("major")
#pragma push_macro("minor")
#undef major
#undef minor

namespace IC {

namespace detail {
class Text;
struct JsonAccess;
struct Visit;
}  // namespace detail

/// A version of two numbers. As a Number it prints as "2.15".
struct IC_EXPORT Version2 {
    ZQ::Uint8 major;  ///< before the dot
    ZQ::Uint8 minor;  ///< after the dot
};

/// A reference to a node. As a Number it prints as "CPU:7".
struct IC_EXPORT sNodeRef {
    ZQ::Uint32 type;  ///< a Node::SensorType, the index into `pst`
    ZQ::Uint32 id;    ///< which node of that type
};

/// The same under another name.
using NodeRef = sNodeRef;

/// One number of one of eleven kinds. The kind decides which native types it converts to.
///
/// A trivially copyable value; one object belongs to one thread at a time. `std::hash` agrees with `==`.
/// A refusal [logs](docs/refusals.md), throws and changes nothing, except in initKind. If logging throws, that
/// exception propagates instead. Otherwise only text conversion (std::bad_alloc) and date-time operations throw.
///
///     IC::Number speed(3600u);
///     unsigned int rpm = speed;                  // 3600
///     std::cout << speed;                        // 3600
///
/// Deliberate:
/// - unsigned char is a kind code: Number(static_cast<unsigned char>(3)) is 0 of kind KIND_UINT32. unsigned
///   short and char widen to int and make a signed number, which converts only to int.
/// - Two signed numbers are always equal, and neither is less; the same holds for two node references.
/// - On 64-bit Linux std::uint64_t is unsigned long and does not compile; write ZQ::Uint64{value}.
/// - `number < 5u`, `x += number` and `text = number` are ambiguous: name the type, `number < Number(5u)`.
class IC_EXPORT Number {
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

    /// @name Construction
    ///@{

    /// The kind follows from the type; a double is KIND_REAL, also NaN and infinities.
    inline Number(const bool& value) noexcept;
    inline Number(const int& value) noexcept;
    inline Number(const unsigned int& value) noexcept;
    inline Number(const unsigned long long& value) noexcept;
    inline Number(const double& value) noexcept;
    inline Number(const Version2& value) noexcept;
    inline Number(const sNodeRef& value) noexcept;

    /// A date-time of scope 3. Seconds since the epoch.
    inline Number(long seconds, unsigned short milliseconds) noexcept;

    /// A date-time; the scope is cut to 8 bits and the milliseconds to 16.
    Number(const ZQ::DateTime& value);

    /// A number of the kind with this code and its initial content, see initKind. Throws std::invalid_argument
    /// for 2, and for 10 and above.
    Number(const unsigned char& code);
    inline Number(const KindType& kind);

    /// Deleted: a pointer would become a flag, and an enumeration of one byte (such as Error::StatusType) a kind
    /// code. Write Number(static_cast<unsigned int>(value)).
    template <class T>
    Number(T*) = delete;
    Number(std::nullptr_t) = delete;
    template <class T, std::enable_if_t<std::is_enum_v<T> && sizeof(T) == 1, int> = 0>
    Number(T) = delete;

    ///@}
    /// @name Kind
    ///@{

    /// The kind, under two names.
    inline KindType getKind() const noexcept;
    inline operator KindType() const noexcept;

    /// Stores the kind and its initial content: 0, 0.0, version 0.0, or the current time in whole seconds with
    /// scope 3. The kinds 0, 1, 6 and 7 clear the flag byte and keep the rest. Throws std::invalid_argument for 2,
    /// and for 10 and above; that kind stays stored (deliberate). A kind of 11 or more then behaves like
    /// KIND_UNKNOWN in conversions and comparisons, and its text is "invalid".
    void initKind(const KindType& kind);

    /// Replaces the kind (0 to 10) and keeps the bytes of the value: a reinterpretation, no conversion. A flag
    /// byte above 1 converts to true, 1 and 1.0 and prints "true". Throws std::invalid_argument for 11 and above.
    void setKind(const unsigned char& code);

    ///@}
    /// @name Conversions
    /// Each throws std::out_of_range for a kind that it does not name and for a value outside the range named; nothing
    /// is saturated. A real is cut toward zero; a real NaN gives 0 as a 32-bit integer and 2^63 as a 64-bit one.
    ///@{

    /// From a flag; from an unsigned integer or a real, true unless it is 0 (a NaN is true).
    inline operator bool() const;

    /// From a signed integer; from what unsigned int takes, where 2^31 and above become negative.
    inline operator int() const;

    /// From a flag, an unsigned integer below 2^32, a real above -1 and below 2^32.
    inline operator unsigned int() const;

    /// From a flag, an unsigned integer, a real above -1 and below 2^64.
    inline operator unsigned long long() const;

    /// From a flag, an unsigned integer, a real, NaN, infinity; from a version as major.minor (2.15).
    inline operator double() const;

    /// From a version; from an unsigned integer up to 255, as the major number.
    inline operator Version2() const;

    /// From a date-time of scope 1 to 3.
    operator ZQ::DateTime() const;

    /// From a node reference.
    inline operator sNodeRef() const;

    ///@}
    /// @name Text
    ///@{

    /// As a fresh std::ostringstream writes it under the global locale: "unknown", "true", digits, a real with six
    /// significant digits, "not a number", "infinity", "2.15", a date-time, "CPU:7", "invalid". A sensor type above
    /// 74 takes the name of entry 74. Milliseconds never show; if they are no multiple of 10, the text ends with
    /// ".Conversion failed remainder>0" and a record is written (deliberate). Nothing is refused. Under the classic
    /// locale a real is rounded to the nearest text, also where a stream would follow std::fesetround.
    operator std::string() const;

    ///@}

private:
    friend bool operator==(const Number& a, const Number& b);
    friend bool operator<(const Number& a, const Number& b);
    friend bool operator>(const Number& a, const Number& b);
    friend struct std::hash<Number>;
    friend std::ostream& operator<<(std::ostream& out, const Number& number);
    friend class detail::Text;
    friend struct detail::JsonAccess;
    friend struct detail::Visit;

    struct Tag { };

    struct DateTimeFields {
        long seconds;
        ZQ::Uint16 milliseconds;
        ZQ::Uint8 scope;
        ZQ::Uint8 unused[sizeof(long) - 3];  // 0; padding would be undefined
    };
    static_assert(sizeof(DateTimeFields) == 2 * sizeof(long));
    static constexpr ZQ::Uint8 defaultScope = 3;

    inline Number(Tag, KindType kind) noexcept;

    template <class T>
    inline T load() const noexcept;
    inline ZQ::DateTime loadDateTime() const;
    template <class T>
    inline void store(const T& content) noexcept;
    inline void storeDateTime(long seconds, ZQ::Uint16 milliseconds, ZQ::Uint8 scope) noexcept;

    // What an integer or a real can hold of any content, without a refusal; false for other content.
    inline bool get(ZQ::Uint32& out) const noexcept;
    inline bool get(ZQ::Uint64& out) const noexcept;
    inline bool get(ZQ::Real64& out) const noexcept;
    template <class Integer>
    inline bool getReal(Integer& out, ZQ::Real64 limit) const noexcept;

    // The other conversions. They accept what `get` accepts too: programs that were compiled before `get` call them.
    bool toBool() const;
    inline int toInt() const;
    ZQ::Uint32 toUint32(const char* function) const;
    ZQ::Uint64 toUint64() const;
    ZQ::Real64 toReal() const;
    Version2 toVersion() const;
    [[noreturn, gnu::cold]] sNodeRef refuseNodeRef() const;

    static inline bool both(KindType kind, const Number& a, const Number& b) noexcept;
    static bool equal(const Number& a, const Number& b);
    static bool less(const Number& a, const Number& b);
    static bool greater(const Number& a, const Number& b);
    static bool precedes(const Number& a, const Number& b);

    // Appends the text. A template over an internal type, so the library does not export it.
    template <class Text>
    void write(Text& text) const;

    KindType kind_;
    // The kind's content, from the first byte on. setKind lets one kind's bytes be read as another's.
    alignas(ZQ::Uint64) alignas(DateTimeFields) unsigned char value_[sizeof(DateTimeFields)];
    sNodeRef nodeRef_;
};

/// @name Comparison
/// @relates Number
///@{

/// Never throw. Numbers of different kinds are unequal; signed integers, node references and kinds without a value
/// equal all of their kind; date-times compare without their scope; a real NaN equals nothing.
IC_EXPORT bool operator==(const Number& a, const Number& b);
IC_EXPORT bool operator!=(const Number& a, const Number& b);

/// Within one kind; neither of two signed integers, node references or unknowns is less. Throw std::invalid_argument
/// for KIND_NAN on either side and for different kinds, with one exception: KIND_INFINITY on the left is greater than
/// any other kind, and never less. `<=` and `>=` ask `==` first, so equal numbers are never refused.
IC_EXPORT bool operator<(const Number& a, const Number& b);
IC_EXPORT bool operator<=(const Number& a, const Number& b);
IC_EXPORT bool operator>(const Number& a, const Number& b);
IC_EXPORT bool operator>=(const Number& a, const Number& b);

///@}

/// @relates Number
/// Inserts std::string(number) as one text: width and fill apply to the whole. If the conversion throws, nothing is
/// inserted.
IC_EXPORT std::ostream& operator<<(std::ostream& out, const Number& number);

/// The display names of the sensor types, indexed by Node::SensorType; entry 74, "invalid", is no sensor type.
/// Initialised before the program's own objects at namespace scope; then any thread may read it. Programs hold a copy
/// of the table, so its size never changes.
IC_EXPORT extern const std::string pst[75];

}  // namespace IC

// The interface ends here.
#include "IC/detail/Number-inl.h"

#pragma pop_macro("major")
#pragma pop_macro("minor")
