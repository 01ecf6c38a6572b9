#pragma once

#include <cstddef>
#include <iosfwd>
#include <map>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>
#include <vector>

#include "IC/EnumValue.h"
#include "IC/Number.h"
#include "ZQ/Types.h"

namespace IC {
class PropertyValue;
}
namespace std {
template <>
struct hash<IC::PropertyValue>;
}

#pragma GCC visibility push(default)

namespace IC {

///@{
/// What a value holds where it holds more than one.
using Buffer = std::vector<unsigned char>;
using NumberArray = std::vector<Number>;
using StringArray = std::vector<std::string>;
///@}

/// The value of a node's property: a text, a number, an enumerated value, bytes, an array of numbers or of
/// texts, or nothing yet; and a mark that says whether Node::setProperty may replace it.
///
/// A value type: a copy is independent of its source. One object belongs to one thread at a time. Every
/// refusal but one (to EnumValue) writes a log record and a trace record (category "Vexilon.IC.Property",
/// level 6000) and then throws; what the platform throws while it writes them comes instead. Refusals apart,
/// what makes, copies or assigns a value, a container or a text, and a change of kind, may throw
/// std::bad_alloc; moving, swapping, comparing and the other conversions need no memory. A date-time's text
/// throws as in Number. Whatever is thrown, the value is as it was, but for a refused setKind.
///
///     IC::PropertyValue model("DCS8000Z", true); // a read-only text
///     std::string text = model;                  // DCS8000Z
///     IC::PropertyValue speed(IC::Number(3600u));
///     unsigned int rpm = speed;                  // 3600
///     IC::Buffer bytes = IC::PropertyValue(IC::Buffer {0x0a, 0xff});
///
/// Rules that look odd and are meant:
/// - PropertyValue(5) is an empty array of numbers: an integer, as a byte, is a kind code. Write
///   PropertyValue(IC::Number(5)) for the number.
/// - Write `IC::StringArray texts = value;`, never `{value}`: braces make an array of one element.
///   To an existing std::string assign `std::string(value)`; `text = value` does not compile.
/// - `value == Number(5u)` does not compile, since each side converts to the other: write
///   `value == PropertyValue(Number(5u))`. A text compares as it stands: `value == "AFB0812"`.
/// - No operation here looks at the read-only mark; assignment replaces it.
class __attribute__((visibility("default"))) PropertyValue {
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

    ///@{
    /// A value of the kind that the type of `value` names; `readOnly` is its mark.
    PropertyValue(const std::string& value, const bool& readOnly = false)
        : PropertyValue(new std::string(value), KIND_STRING, readOnly)
    {
    }
    PropertyValue(std::string&& value, const bool& readOnly = false)
        : PropertyValue(new std::string(std::move(value)), KIND_STRING, readOnly)
    {
    }
    /// Up to the terminating NUL. Throws std::logic_error for a null pointer.
    PropertyValue(const char* value, const bool& readOnly = false);
    PropertyValue(const Number& value, const bool& readOnly = false)
        : PropertyValue(new Number(value), KIND_NUMBER, readOnly)
    {
    }
    PropertyValue(const EnumValue& value, const bool& readOnly = false)
        : PropertyValue(new EnumValue(value), KIND_ENUMVALUE, readOnly)
    {
    }
    PropertyValue(const Buffer& value, const bool& readOnly = false)
        : PropertyValue(new Buffer(value), KIND_BUFFER, readOnly)
    {
    }
    PropertyValue(Buffer&& value, const bool& readOnly = false)
        : PropertyValue(new Buffer(std::move(value)), KIND_BUFFER, readOnly)
    {
    }
    PropertyValue(const NumberArray& value, const bool& readOnly = false)
        : PropertyValue(new NumberArray(value), KIND_NUMBERARRAY, readOnly)
    {
    }
    PropertyValue(NumberArray&& value, const bool& readOnly = false)
        : PropertyValue(new NumberArray(std::move(value)), KIND_NUMBERARRAY, readOnly)
    {
    }
    PropertyValue(const StringArray& value, const bool& readOnly = false)
        : PropertyValue(new StringArray(value), KIND_STRINGARRAY, readOnly)
    {
    }
    PropertyValue(StringArray&& value, const bool& readOnly = false)
        : PropertyValue(new StringArray(std::move(value)), KIND_STRINGARRAY, readOnly)
    {
    }
    ///@}

    /// The first value of the kind with this code: a Number of kind 0, an EnumValue of 0, or an empty text,
    /// buffer or array. Codes of 7 and above are refused with PropertyValueInvalidKind: what is logged, with the
    /// code, and below it what the exception says.
    ///
    ///     "PropertyValue:initKind: invalid kind of property: "
    ///       "Invalid kind of property"
    PropertyValue(const unsigned char& kind, const bool& readOnly = false);

    /// The same. The code is cut to its low 8 bits first, so 257 is KIND_NUMBER (deliberate).
    PropertyValue(const KindType& kind, const bool& readOnly = false);

private:
    template <class T>
    static constexpr bool notAKind =
        std::disjunction_v<std::is_same<T, bool>, std::is_floating_point<T>,
                           std::conjunction<std::is_enum<T>, std::negation<std::is_same<T, KindType>>>>;

public:
    /// Flags, reals and other enumerations would silently become a kind code. Write Number(value) or
    /// EnumValue(value).
    template <class T, std::enable_if_t<notAKind<T>, int> = 0>
    PropertyValue(T, const bool& = false) = delete;

    ///@{
    /// A copy has the source's mark; assignment replaces the mark by the source's, whatever it was.
    PropertyValue(const PropertyValue& source) : kind_(source.kind_), readOnly_(source.readOnly_)
    {
        if (holds(KIND_NUMBER))
            value_ = new Number(source.object<Number>());
        else
            copyObject(source);
    }
    PropertyValue& operator=(const PropertyValue& source)
    {
        if (bothHold(KIND_NUMBER, *this, source)) {
            object<Number>() = source.object<Number>();
            readOnly_ = source.readOnly_;
        } else if (this != &source) {
            assign(source);
        }
        return *this;
    }
    ///@}

    ///@{
    /// Moves allocate nothing. The source is left with KIND_UNKNOWN and its mark.
    PropertyValue(PropertyValue&& source) noexcept
        : value_(std::exchange(source.value_, nullptr)),
          kind_(std::exchange(source.kind_, KIND_UNKNOWN)),
          readOnly_(source.readOnly_)
    {
    }
    PropertyValue& operator=(PropertyValue&& source) noexcept
    {
        if (this != &source) {
            release();
            value_ = std::exchange(source.value_, nullptr);
            kind_ = std::exchange(source.kind_, KIND_UNKNOWN);
            readOnly_ = source.readOnly_;
        }
        return *this;
    }
    void swap(PropertyValue& other) noexcept
    {
        std::swap(value_, other.value_);
        std::swap(kind_, other.kind_);
        std::swap(readOnly_, other.readOnly_);
    }
    friend void swap(PropertyValue& a, PropertyValue& b) noexcept { a.swap(b); }
    ///@}

    ~PropertyValue() { release(); }

    ///@{
    /// The kind, under two names.
    KindType getKind() const noexcept { return static_cast<KindType>(kind_ & ~without); }
    operator KindType() const noexcept { return getKind(); }
    ///@}

    /// Whether Node::setProperty refuses to replace it.
    bool readOnly() const noexcept { return readOnly_; }

    /// Changes the kind; the value becomes the first value of the new kind, and the mark stays. The same kind
    /// keeps the value. Codes of 7 and above are refused as by the constructor from a kind.
    ///
    /// A refused code still costs the old value (deliberate), whatever the platform throws meanwhile: the kind
    /// stays, without an object. Give such a value another kind, or assign to it. Until then conversions to a
    /// native type refuse it as they refuse another kind, its text is "invalid", and it is neither less nor
    /// greater than any value of its kind. A kind that is not refused leaves all as it was where it finds no
    /// memory.
    void setKind(const unsigned char& kind);

    ///@{
    /// The conversions. A number converts as Number does, refusals included; an enumerated value answers as an
    /// unsigned 32-bit number. Containers are copied. Other kinds are refused with PropertyValueInvalidKind: what
    /// is logged, with the kind, and below it what the exception says.
    ///
    ///     to double, from a number or an enumerated value
    ///       "PropertyValue:Real64: can't return current value as a Real64, kind="
    ///         "Can't return current value as a Number"
    ///     to unsigned long long, from a number or an enumerated value
    ///       "PropertyValue:Uint64: can't return current value as a Uint64, kind="
    ///         "Can't return current value as a Number"
    ///     to unsigned int, from a number or an enumerated value
    ///       "PropertyValue::Uint32: can't return current value as a Uint32, kind="
    ///         "Can't return current value as a Number"
    ///     to bool, from a number
    ///       "PropertyValue::bool: can't return current value as a bool, kind="
    ///         "Can't return current value as a Number"
    ///     to Number, from a number
    ///       "PropertyValue:Number: can't return current value as a Number, kind="
    ///         "Can't return current value as a Number"
    ///     to Version2, from a number
    ///       "PropertyValue:Version2: can't return current value as a Version2, kind="
    ///         "Can't return current value as a Number"
    ///     to EnumValue, from an enumerated value
    ///       nothing is logged (deliberate)
    ///         "Can't return current value as a EnumValue"
    ///     to Buffer, from bytes
    ///       "PropertyValue:Buffer: can't return current value as a Buffer, kind="
    ///         "Can't return current value as a Buffer"
    ///     to NumberArray, from numbers
    ///       "PropertyValue:NumberArray: can't return current value as a NumberArray, kind="
    ///         "Can't return current value as a NumberArray"
    ///     to StringArray, from texts
    ///       "PropertyValue:StringArray: can't return current value as a StringArray, kind="
    ///         "Can't return current value as a StringArray"
    operator double() const
    {
        return detail::likely(holds(KIND_NUMBER)) ? object<Number>().operator double()
            : holds(KIND_ENUMVALUE)               ? object<EnumValue>().operator unsigned int()
                                                  : refuseReal();
    }
    operator unsigned long long() const
    {
        return detail::likely(holds(KIND_NUMBER)) ? object<Number>().operator unsigned long long()
            : holds(KIND_ENUMVALUE)               ? object<EnumValue>().operator unsigned int()
                                                  : refuseUint64();
    }
    operator unsigned int() const
    {
        return detail::likely(holds(KIND_NUMBER)) ? object<Number>().operator unsigned int()
            : holds(KIND_ENUMVALUE)               ? object<EnumValue>().operator unsigned int()
                                                  : refuseUint32();
    }
    operator bool() const
    {
        return detail::likely(holds(KIND_NUMBER)) ? object<Number>().operator bool() : refuseBool();
    }
    operator Number() const { return detail::likely(holds(KIND_NUMBER)) ? object<Number>() : refuseNumber(); }
    operator Version2() const
    {
        return detail::likely(holds(KIND_NUMBER)) ? object<Number>().operator Version2() : refuseVersion();
    }
    operator EnumValue() const { return holds(KIND_ENUMVALUE) ? object<EnumValue>() : refuseEnumValue(); }
    operator Buffer() const { return holds(KIND_BUFFER) ? object<Buffer>() : refuseBuffer(); }
    operator NumberArray() const
    {
        return holds(KIND_NUMBERARRAY) ? object<NumberArray>() : refuseNumberArray();
    }
    operator StringArray() const
    {
        return holds(KIND_STRINGARRAY) ? object<StringArray>() : refuseStringArray();
    }
    ///@}

    /// `int x = value;` would silently be a flag. Write `int x = value.operator IC::Number();`.
    operator int() const = delete;

    /// The text, as a fresh std::ostringstream writes it under the global locale; never refused.
    ///
    ///     nothing      unknown
    ///     text         the text itself
    ///     number       as Number
    ///     enumerated   as EnumValue
    ///     bytes        two hexadecimal digits a byte, and a blank after every fourth byte, also the last
    ///     numbers      {1, 2}
    ///     texts        {"a\"b", ""}: double quotes inside get a backslash, nothing else is escaped
    operator std::string() const { return holds(KIND_STRING) ? object<std::string>() : toText(); }

private:
    friend bool operator==(const PropertyValue& a, const PropertyValue& b);
    friend bool operator<(const PropertyValue& a, const PropertyValue& b);
    friend bool operator>(const PropertyValue& a, const PropertyValue& b);
    friend struct std::hash<PropertyValue>;

    // Takes over the object.
    PropertyValue(void* object, KindType kind, const bool& readOnly) noexcept
        : value_(object),
          kind_(kind),
          readOnly_(readOnly)
    {
    }

    // Marks a kind that a refused setKind left without an object: such a kind is none of those above, so that one
    // comparison tells what is held.
    static constexpr ZQ::Uint32 without = 8;

    bool holds(KindType kind) const noexcept { return kind_ == kind; }

    // The object, for those who have seen that there is one of this type.
    template <class T>
    T& object() noexcept
    {
        return *static_cast<T*>(value_);
    }
    template <class T>
    const T& object() const noexcept
    {
        return *static_cast<const T*>(value_);
    }

    // Whether both have an object of this kind.
    static bool bothHold(KindType kind, const PropertyValue& a, const PropertyValue& b) noexcept
    {
        return a.holds(kind) && b.holds(kind);
    }

    // Leaves the pointer as it is.
    void release() noexcept
    {
        if (holds(KIND_NUMBER))
            delete &object<Number>();
        else if (value_ != nullptr)
            freeObject();
    }

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

///@{
/// Equality never throws. Values of different kinds are unequal; the read-only mark is not compared. Numbers
/// and enumerated values compare as Number and EnumValue do, everything else by its bytes or elements.
[[gnu::visibility("default")]] inline bool operator==(const PropertyValue& a, const PropertyValue& b)
{
    using Value = PropertyValue;
    if (Value::bothHold(Value::KIND_NUMBER, a, b))
        return a.object<Number>() == b.object<Number>();
    if (Value::bothHold(Value::KIND_STRING, a, b))
        return a.object<std::string>() == b.object<std::string>();
    if (Value::bothHold(Value::KIND_BUFFER, a, b))
        return a.object<Buffer>() == b.object<Buffer>();
    return Value::equal(a, b);
}
bool operator!=(const PropertyValue& a, const PropertyValue& b);
///@}

///@{
/// Within one kind: numbers and enumerated values as Number and EnumValue do, refusals included; the others
/// lexicographically, bytes unsigned, numbers in an array by their own <, refusals included. Nothing is
/// neither less nor greater than nothing. Different kinds are refused with PropertyValueInvalidKind: what is
/// logged (for > it begins with ">"), and below it what the exception says.
///
///     "<: cannot compare two different kinds of properties, kind1=2, kind2=1"
///       "Cannot compare two different kinds of properties"
[[gnu::visibility("default")]] inline bool operator<(const PropertyValue& a, const PropertyValue& b)
{
    using Value = PropertyValue;
    if (Value::bothHold(Value::KIND_NUMBER, a, b))
        return a.object<Number>() < b.object<Number>();
    if (Value::bothHold(Value::KIND_STRING, a, b))
        return a.object<std::string>() < b.object<std::string>();
    return Value::less(a, b);
}
[[gnu::visibility("default")]] inline bool operator>(const PropertyValue& a, const PropertyValue& b)
{
    using Value = PropertyValue;
    if (Value::bothHold(Value::KIND_NUMBER, a, b))
        return a.object<Number>() > b.object<Number>();
    if (Value::bothHold(Value::KIND_STRING, a, b))
        return a.object<std::string>() > b.object<std::string>();
    return Value::greater(a, b);
}
///@}

///@{
/// a == b, or else a < b (a > b): equal values are never refused.
bool operator<=(const PropertyValue& a, const PropertyValue& b);
bool operator>=(const PropertyValue& a, const PropertyValue& b);
///@}

/// The byte as two lower-case hexadecimal digits.
std::string pB(unsigned char byte);

/// Inserts std::string(value) as one text: width and fill apply to the whole of it. Where the text throws,
/// nothing is inserted.
std::ostream& operator<<(std::ostream& out, const PropertyValue& value);

/// "7 = " and the value, piece by piece; the number follows the stream's own settings. What was inserted
/// before a piece throws stays, here and for a map.
std::ostream& operator<<(std::ostream& out, const std::pair<unsigned int, PropertyValue>& property);

/// "[1 = abc], [7 = {1, 2}]" in the order of the numbers, piece by piece. An empty map writes nothing.
std::ostream& operator<<(std::ostream& out, const std::map<unsigned int, PropertyValue>& properties);

}  // namespace IC

namespace std {

/// For std::unordered_map and its like. It agrees with ==, so that the read-only mark is left out and numbers,
/// also those in arrays, are hashed as Number's own == compares them. It needs no memory.
template <>
struct __attribute__((visibility("default"))) hash<IC::PropertyValue> {
    /// The hash of the kind and of what == compares.
    std::size_t operator()(const IC::PropertyValue& value) const noexcept
    {
        return IC::detail::combinedHash(value.kind_, contentHash(value));
    }

private:
    static std::size_t contentHash(const IC::PropertyValue& value) noexcept
    {
        using Value = IC::PropertyValue;
        switch (ZQ::Uint32 {value.kind_}) {
        case Value::KIND_NUMBER:
            return std::hash<IC::Number>()(value.object<IC::Number>());
        case Value::KIND_STRING:
            return std::hash<std::string>()(value.object<std::string>());
        case Value::KIND_BUFFER:
            return bytesHash(value.object<IC::Buffer>());
        case Value::KIND_ENUMVALUE:
            return std::hash<IC::EnumValue>()(value.object<IC::EnumValue>());
        case Value::KIND_NUMBERARRAY:
            return elementsHash(value.object<IC::NumberArray>());
        case Value::KIND_STRINGARRAY:
            return elementsHash(value.object<IC::StringArray>());
        default:
            return 0;  // KIND_UNKNOWN, and where a refused setKind left no object
        }
    }

    static std::size_t bytesHash(const IC::Buffer& bytes) noexcept
    {
        const auto* const first = reinterpret_cast<const char*>(bytes.data());
        return std::hash<std::string_view>()(std::string_view(first, bytes.size()));
    }

    template <class Element>
    static std::size_t elementsHash(const std::vector<Element>& elements) noexcept
    {
        std::size_t hash = elements.size();
        for (const Element& element : elements)
            hash = IC::detail::combinedHash(hash, std::hash<Element>()(element));
        return hash;
    }
};

}  // namespace std

#pragma GCC visibility pop
