#pragma once

#include <cstddef>
#include <iosfwd>
#include <map>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include "IC/EnumValue.h"
#include "IC/ICException.h"
#include "IC/Number.h"
#include "IC/detail/Arguments.h"
#include "IC/detail/Export.h"
#include "ZQ/Types.h"

namespace IC {

namespace detail {
struct JsonAccess;
struct Visit;
}  // namespace detail

/// What a value holds when it holds several elements.
using Buffer = std::vector<unsigned char>;
using NumberArray = std::vector<Number>;
using StringArray = std::vector<std::string>;

/// The value of a node's property: a text, a number, an enumerated value, bytes, an array of numbers or of texts,
/// or nothing; and a read-only mark, which only Node::setProperty checks. Assignment replaces the mark.
///
/// A value type: a copy is independent of its source. One object belongs to one thread at a time. `std::hash` agrees
/// with `==`. A refusal [logs](docs/refusals.md) (except in the conversion to EnumValue and for a null text), throws
/// and changes nothing (except in setKind). If logging throws, that exception propagates instead. Construction,
/// copies, setKind and text may throw std::bad_alloc and then change nothing; moves, swap and comparison allocate
/// nothing. The text of a date-time throws as in Number.
///
///     IC::PropertyValue model("DCS8000Z", true); // a read-only text
///     std::string text = model;                  // DCS8000Z
///     IC::PropertyValue speed(IC::Number(3600u));
///     unsigned int rpm = speed;                  // 3600
///
/// Deliberate:
/// - A byte is a kind code: PropertyValue(std::uint8_t {5}) is an empty array of numbers. So is an int, for which the
///   compiler warns. Write PropertyValue(IC::Number(5)).
/// - `IC::StringArray texts {value}` makes an array of one element: write `IC::StringArray texts = value`.
/// - `value == Number(5u)` and `text = value` are ambiguous: write `value == PropertyValue(Number(5u))` and
///   `text = std::string(value)`. A literal compiles: `value == "AFB0812"`.
class IC_EXPORT PropertyValue {
public:
    /// What a value can hold. Records name a kind by its code.
    enum KindType : ZQ::Uint32 {
        KIND_UNKNOWN = 0,      ///< nothing
        KIND_NUMBER = 1,       ///< a Number
        KIND_STRING = 2,       ///< a std::string
        KIND_BUFFER = 3,       ///< a Buffer
        KIND_ENUMVALUE = 4,    ///< an EnumValue
        KIND_NUMBERARRAY = 5,  ///< a NumberArray
        KIND_STRINGARRAY = 6   ///< a StringArray
    };

    /// @name Construction
    ///@{

    /// The kind follows from the type; `readOnly` is the mark.
    inline PropertyValue(const std::string& value, const bool& readOnly = false);
    inline PropertyValue(std::string&& value, const bool& readOnly = false);
    inline PropertyValue(const Number& value, const bool& readOnly = false);
    inline PropertyValue(const EnumValue& value, const bool& readOnly = false);
    inline PropertyValue(const Buffer& value, const bool& readOnly = false);
    inline PropertyValue(Buffer&& value, const bool& readOnly = false);
    inline PropertyValue(const NumberArray& value, const bool& readOnly = false);
    inline PropertyValue(NumberArray&& value, const bool& readOnly = false);
    inline PropertyValue(const StringArray& value, const bool& readOnly = false);
    inline PropertyValue(StringArray&& value, const bool& readOnly = false);

    /// The text up to its terminating NUL. Throws std::logic_error for a null pointer.
    PropertyValue(const char* value, const bool& readOnly = false);

    /// The default value of the kind with this code: nothing for KIND_UNKNOWN, a Number of kind 0, an EnumValue of 0,
    /// or an empty text or container. Throws PropertyValueInvalidKind for 7 and above. A KindType is cut to its low 8
    /// bits first, so 257 is KIND_NUMBER (deliberate).
    PropertyValue(const unsigned char& kind, const bool& readOnly = false);
    PropertyValue(const KindType& kind, const bool& readOnly = false);

    /// The same for an integer, of which the low 8 bits are the code of a kind. For the number write Number(value).
    template <class T, std::enable_if_t<std::is_same_v<T, int>, int> = 0>
    [[deprecated("an integer is a kind code: write Number(value), or a KindType")]] PropertyValue(
        T kind, const bool& readOnly = false)
        : PropertyValue(static_cast<unsigned char>(kind), readOnly)
    {
    }

    /// Deleted: other integers, flags, reals and other enumerations would become a kind code. Write Number(value) or
    /// EnumValue(value).
    template <class T, std::enable_if_t<detail::isNotAKind<T, KindType>, int> = 0>
    PropertyValue(T, const bool& = false) = delete;

    /// Deleted: the same for an object that converts to a number and to nothing else that a value holds, such as a
    /// std::atomic<unsigned int> or an element of a std::vector<bool>. Write Number(counter.load()) or
    /// Number(bool {element}).
    template <class T,
              std::enable_if_t<
                  detail::isObjectOfNumber<T, KindType> && !detail::hasConversion<T, PropertyValue>, int> = 0>
    PropertyValue(T&&, const bool& = false) = delete;

    /// Deleted: a mark that is no bool, such as a text or a number, would be true. Write true or false.
    template <class T, class Mark, std::enable_if_t<!detail::isMark<Mark>, int> = 0>
    PropertyValue(const T&, const Mark&) = delete;

    /// A copy has the source's mark. A moved-from value has the kind KIND_UNKNOWN and keeps its mark.
    inline PropertyValue(const PropertyValue& source);
    inline PropertyValue(PropertyValue&& source) noexcept;
    inline ~PropertyValue();

    ///@}
    /// @name Assignment
    ///@{

    /// Takes the source's mark, whatever its own was. If copying throws, the old value stays.
    inline PropertyValue& operator=(const PropertyValue& source);
    inline PropertyValue& operator=(PropertyValue&& source) noexcept;

    /// Exchanges the values and the marks.
    inline void swap(PropertyValue& other) noexcept;
    friend void swap(PropertyValue& a, PropertyValue& b) noexcept { a.swap(b); }

    ///@}
    /// @name Kind
    ///@{

    /// The kind, under two names.
    inline KindType getKind() const noexcept;
    inline operator KindType() const noexcept;

    /// Whether Node::setProperty refuses to replace the value.
    inline bool readOnly() const noexcept;

    /// Changes the kind and takes its default value; the mark stays, and the same kind keeps the value. Throws
    /// PropertyValueInvalidKind for 7 and above; the kind then stays without its value (deliberate) until it is
    /// assigned or another kind is set: conversions to native types refuse it, and its text is "invalid".
    void setKind(const unsigned char& kind);

    ///@}
    /// @name Conversions
    /// A number converts as Number does, an enumerated value as an unsigned 32-bit number; containers are copied. A
    /// value of another kind throws PropertyValueInvalidKind; a number that Number refuses throws std::out_of_range.
    ///@{

    /// From a number or an enumerated value.
    inline operator double() const;
    inline operator unsigned long long() const;
    inline operator unsigned int() const;

    /// From a number.
    inline operator bool() const;
    inline operator Number() const;
    inline operator Version2() const;

    /// From an enumerated value. A refusal is not logged (deliberate).
    inline operator EnumValue() const;

    /// From bytes, from an array of numbers, from an array of texts.
    inline operator Buffer() const;
    inline operator NumberArray() const;
    inline operator StringArray() const;

    /// Deleted: `int x = value;` would be a flag, and in C++20 `NodeRef x(value);` would take a number for a sensor
    /// type. Write `int x = value.operator IC::Number();`.
    operator int() const = delete;
    explicit operator sNodeRef() const = delete;

    ///@}
    /// @name Text
    ///@{

    /// As a fresh std::ostringstream writes it under the global locale: nothing is "unknown", a text is itself,
    /// bytes are two hexadecimal digits each with a blank after every fourth, also the last, arrays are `{1, 2}` and
    /// `{"a\"b", ""}`, where only double quotes are escaped. Nothing is refused.
    inline operator std::string() const;

    ///@}

private:
    friend bool operator==(const PropertyValue& a, const PropertyValue& b);
    friend bool operator<(const PropertyValue& a, const PropertyValue& b);
    friend bool operator>(const PropertyValue& a, const PropertyValue& b);
    friend std::ostream& operator<<(std::ostream& out, const PropertyValue& value);
    friend struct std::hash<PropertyValue>;
    friend class detail::Text;
    friend struct detail::JsonAccess;
    friend struct detail::Visit;

    // Owns the object.
    inline PropertyValue(void* object, KindType kind, const bool& readOnly) noexcept;

    // Marks a kind that has no object, left by a refused setKind. No kind of an object has this bit, so one comparison
    // tells what is held; testing the pointer as well costs 2 of the 10 instructions that read a number.
    static constexpr ZQ::Uint32 without = 8;

    inline bool holds(KindType kind) const noexcept;
    static inline bool bothHold(KindType kind, const PropertyValue& a, const PropertyValue& b) noexcept;

    // The object, which must be of this type.
    template <class T>
    inline T& object() noexcept;
    template <class T>
    inline const T& object() const noexcept;

    // Calls the visitor with the type of the object that this kind holds.
    template <class Visitor>
    static inline decltype(auto) visit(KindType kind, const Visitor& visitor);

    inline void release() noexcept;
    void copyObject(const PropertyValue& source);
    void assign(const PropertyValue& source);
    void initKind(const unsigned char& kind);
    void freeObject() noexcept;
    static bool equal(const PropertyValue& a, const PropertyValue& b);
    static bool less(const PropertyValue& a, const PropertyValue& b);
    static bool greater(const PropertyValue& a, const PropertyValue& b);
    static bool precedes(const PropertyValue& a, const PropertyValue& b);
    std::string toText() const;

    [[noreturn, gnu::cold]] ZQ::Real64 refuseReal() const;
    [[noreturn, gnu::cold]] ZQ::Uint64 refuseUint64() const;
    [[noreturn, gnu::cold]] ZQ::Uint32 refuseUint32() const;
    [[noreturn, gnu::cold]] bool refuseBool() const;
    [[noreturn, gnu::cold]] Number refuseNumber() const;
    [[noreturn, gnu::cold]] Version2 refuseVersion() const;
    [[noreturn, gnu::cold]] static EnumValue refuseEnumValue();
    [[noreturn, gnu::cold]] Buffer refuseBuffer() const;
    [[noreturn, gnu::cold]] NumberArray refuseNumberArray() const;
    [[noreturn, gnu::cold]] StringArray refuseStringArray() const;

    void* value_ = nullptr;  // owns the one object of the kind's type
    KindType kind_ = KIND_UNKNOWN;
    bool readOnly_ = false;
    [[maybe_unused]] ZQ::Uint32 reserved_ = 0;
};

/// @name Comparison
/// Numbers and enumerated values compare as Number and EnumValue do, refusals included, everything else by bytes or
/// elements. The mark is not compared.
/// @relates PropertyValue
///@{

/// Never throw. Values of different kinds are unequal.
IC_EXPORT bool operator==(const PropertyValue& a, const PropertyValue& b);
IC_EXPORT bool operator!=(const PropertyValue& a, const PropertyValue& b);

/// Within one kind, lexicographic for texts, bytes (unsigned) and arrays, by the elements' own `<`; a value without
/// content is neither less nor greater. Throw PropertyValueInvalidKind for different kinds. `<=` and `>=` ask `==`
/// first, so equal values are never refused.
IC_EXPORT bool operator<(const PropertyValue& a, const PropertyValue& b);
IC_EXPORT bool operator<=(const PropertyValue& a, const PropertyValue& b);
IC_EXPORT bool operator>(const PropertyValue& a, const PropertyValue& b);
IC_EXPORT bool operator>=(const PropertyValue& a, const PropertyValue& b);

///@}

/// @relates PropertyValue
/// The byte as two lower-case hexadecimal digits.
IC_EXPORT std::string pB(unsigned char byte);

/// @relates PropertyValue
/// Inserts std::string(value) as one text: width and fill apply to the whole. If the conversion throws, nothing is
/// inserted.
IC_EXPORT std::ostream& operator<<(std::ostream& out, const PropertyValue& value);

/// @relates PropertyValue
/// Inserts "7 = " and the value, piece by piece; the number follows the stream's settings. If a piece throws, the
/// pieces before it stay, here and for a map.
IC_EXPORT std::ostream& operator<<(std::ostream& out, const std::pair<unsigned int, PropertyValue>& property);

/// @relates PropertyValue
/// Inserts "[1 = abc], [7 = {1, 2}]" in the order of the numbers, piece by piece; nothing for an empty map.
IC_EXPORT std::ostream& operator<<(std::ostream& out,
                                   const std::map<unsigned int, PropertyValue>& properties);

}  // namespace IC

// The interface ends here.
#include "IC/detail/Property-inl.h"
