#pragma once

// The end of IC/Property.h: inline bodies and std::hash.

#include <string_view>

#include "IC/detail/Inline.h"

namespace IC {

namespace detail {

// Names the type of the object that a kind holds.
template <class T>
struct Held {
    using Type = T;
};

}  // namespace detail

inline PropertyValue::PropertyValue(const std::string& value, const bool& readOnly)
    : PropertyValue(new std::string(value), KIND_STRING, readOnly)
{
}

inline PropertyValue::PropertyValue(std::string&& value, const bool& readOnly)
    : PropertyValue(new std::string(std::move(value)), KIND_STRING, readOnly)
{
}

inline PropertyValue::PropertyValue(const Number& value, const bool& readOnly)
    : PropertyValue(new Number(value), KIND_NUMBER, readOnly)
{
}

inline PropertyValue::PropertyValue(const EnumValue& value, const bool& readOnly)
    : PropertyValue(new EnumValue(value), KIND_ENUMVALUE, readOnly)
{
}

inline PropertyValue::PropertyValue(const Buffer& value, const bool& readOnly)
    : PropertyValue(new Buffer(value), KIND_BUFFER, readOnly)
{
}

inline PropertyValue::PropertyValue(Buffer&& value, const bool& readOnly)
    : PropertyValue(new Buffer(std::move(value)), KIND_BUFFER, readOnly)
{
}

inline PropertyValue::PropertyValue(const NumberArray& value, const bool& readOnly)
    : PropertyValue(new NumberArray(value), KIND_NUMBERARRAY, readOnly)
{
}

inline PropertyValue::PropertyValue(NumberArray&& value, const bool& readOnly)
    : PropertyValue(new NumberArray(std::move(value)), KIND_NUMBERARRAY, readOnly)
{
}

inline PropertyValue::PropertyValue(const StringArray& value, const bool& readOnly)
    : PropertyValue(new StringArray(value), KIND_STRINGARRAY, readOnly)
{
}

inline PropertyValue::PropertyValue(StringArray&& value, const bool& readOnly)
    : PropertyValue(new StringArray(std::move(value)), KIND_STRINGARRAY, readOnly)
{
}

inline PropertyValue::PropertyValue(const PropertyValue& source)
    : kind_(source.kind_),
      readOnly_(source.readOnly_)
{
    if (holds(KIND_NUMBER))
        value_ = new Number(source.object<Number>());
    else
        copyObject(source);
}

inline PropertyValue::PropertyValue(PropertyValue&& source) noexcept
    : value_(std::exchange(source.value_, nullptr)),
      kind_(std::exchange(source.kind_, KIND_UNKNOWN)),
      readOnly_(source.readOnly_)
{
}

inline PropertyValue::~PropertyValue()
{
    release();
}

inline PropertyValue& PropertyValue::operator=(const PropertyValue& source)
{
    if (bothHold(KIND_NUMBER, *this, source)) {
        object<Number>() = source.object<Number>();
        if (readOnly_ != source.readOnly_)  // a store would take the line from the cache of another processor
            readOnly_ = source.readOnly_;
    } else if (this != &source) {
        assign(source);
    }
    return *this;
}

inline PropertyValue& PropertyValue::operator=(PropertyValue&& source) noexcept
{
    if (this != &source) {
        release();
        value_ = std::exchange(source.value_, nullptr);
        kind_ = std::exchange(source.kind_, KIND_UNKNOWN);
        readOnly_ = source.readOnly_;
    }
    return *this;
}

inline void PropertyValue::swap(PropertyValue& other) noexcept
{
    std::swap(value_, other.value_);
    std::swap(kind_, other.kind_);
    std::swap(readOnly_, other.readOnly_);
}

inline PropertyValue::KindType PropertyValue::getKind() const noexcept
{
    return static_cast<KindType>(kind_ & ~without);
}

inline PropertyValue::operator KindType() const noexcept
{
    return getKind();
}

inline bool PropertyValue::readOnly() const noexcept
{
    return readOnly_;
}

inline PropertyValue::operator double() const
{
    return detail::likely(holds(KIND_NUMBER)) ? object<Number>().operator double()
        : holds(KIND_ENUMVALUE)               ? object<EnumValue>().operator unsigned int()
                                              : refuseReal();
}

inline PropertyValue::operator unsigned long long() const
{
    return detail::likely(holds(KIND_NUMBER)) ? object<Number>().operator unsigned long long()
        : holds(KIND_ENUMVALUE)               ? object<EnumValue>().operator unsigned int()
                                              : refuseUint64();
}

inline PropertyValue::operator unsigned int() const
{
    return detail::likely(holds(KIND_NUMBER)) ? object<Number>().operator unsigned int()
        : holds(KIND_ENUMVALUE)               ? object<EnumValue>().operator unsigned int()
                                              : refuseUint32();
}

inline PropertyValue::operator bool() const
{
    return detail::likely(holds(KIND_NUMBER)) ? object<Number>().operator bool() : refuseBool();
}

inline PropertyValue::operator Number() const
{
    return detail::likely(holds(KIND_NUMBER)) ? object<Number>() : refuseNumber();
}

inline PropertyValue::operator Version2() const
{
    return detail::likely(holds(KIND_NUMBER)) ? object<Number>().operator Version2() : refuseVersion();
}

inline PropertyValue::operator EnumValue() const
{
    return holds(KIND_ENUMVALUE) ? object<EnumValue>() : refuseEnumValue();
}

inline PropertyValue::operator Buffer() const
{
    return holds(KIND_BUFFER) ? object<Buffer>() : refuseBuffer();
}

inline PropertyValue::operator NumberArray() const
{
    return holds(KIND_NUMBERARRAY) ? object<NumberArray>() : refuseNumberArray();
}

inline PropertyValue::operator StringArray() const
{
    return holds(KIND_STRINGARRAY) ? object<StringArray>() : refuseStringArray();
}

inline PropertyValue::operator std::string() const
{
    return holds(KIND_STRING) ? object<std::string>() : toText();
}

inline PropertyValue::PropertyValue(void* object, KindType kind, const bool& readOnly) noexcept
    : value_(object),
      kind_(kind),
      readOnly_(readOnly)
{
}

inline bool PropertyValue::holds(KindType kind) const noexcept
{
    return kind_ == kind;
}

inline bool PropertyValue::bothHold(KindType kind, const PropertyValue& a, const PropertyValue& b) noexcept
{
    return a.holds(kind) && b.holds(kind);
}

template <class T>
inline T& PropertyValue::object() noexcept
{
    return *static_cast<T*>(value_);
}

template <class T>
inline const T& PropertyValue::object() const noexcept
{
    return *static_cast<const T*>(value_);
}

template <class Visitor>
inline decltype(auto) PropertyValue::visit(KindType kind, const Visitor& visitor)
{
    if (kind == KIND_STRING)  // the most frequent here: inline bodies handle numbers
        return visitor(detail::Held<std::string>());
    switch (static_cast<ZQ::Uint32>(kind)) {
    case KIND_NUMBER:
        return visitor(detail::Held<Number>());
    case KIND_BUFFER:
        return visitor(detail::Held<Buffer>());
    case KIND_ENUMVALUE:
        return visitor(detail::Held<EnumValue>());
    case KIND_NUMBERARRAY:
        return visitor(detail::Held<NumberArray>());
    default:  // KIND_STRINGARRAY
        return visitor(detail::Held<StringArray>());
    }
}

// Leaves value_ dangling.
inline void PropertyValue::release() noexcept
{
    if (holds(KIND_NUMBER))
        delete &object<Number>();
    else if (value_ != nullptr)
        freeObject();
}

inline bool operator==(const PropertyValue& a, const PropertyValue& b)
{
    using Value = PropertyValue;
    if (a.kind_ != b.kind_)
        return false;
    if (Value::bothHold(Value::KIND_NUMBER, a, b))
        return a.object<Number>() == b.object<Number>();
    if (Value::bothHold(Value::KIND_STRING, a, b))
        return a.object<std::string>() == b.object<std::string>();
    if (Value::bothHold(Value::KIND_BUFFER, a, b))
        return a.object<Buffer>() == b.object<Buffer>();
    return Value::equal(a, b);
}

inline bool operator!=(const PropertyValue& a, const PropertyValue& b)
{
    return !(a == b);
}

inline bool operator<(const PropertyValue& a, const PropertyValue& b)
{
    using Value = PropertyValue;
    if (Value::bothHold(Value::KIND_NUMBER, a, b))
        return a.object<Number>() < b.object<Number>();
    if (Value::bothHold(Value::KIND_STRING, a, b))
        return a.object<std::string>() < b.object<std::string>();
    if (Value::bothHold(Value::KIND_BUFFER, a, b))
        return a.object<Buffer>() < b.object<Buffer>();
    return Value::less(a, b);
}

inline bool operator>(const PropertyValue& a, const PropertyValue& b)
{
    using Value = PropertyValue;
    if (Value::bothHold(Value::KIND_NUMBER, a, b))
        return a.object<Number>() > b.object<Number>();
    if (Value::bothHold(Value::KIND_STRING, a, b))
        return a.object<std::string>() > b.object<std::string>();
    if (Value::bothHold(Value::KIND_BUFFER, a, b))
        return a.object<Buffer>() > b.object<Buffer>();
    return Value::greater(a, b);
}

}  // namespace IC

// Agrees with ==: the mark is left out, and numbers, also in arrays, are hashed as Number's own == compares them.
template <>
struct IC_EXPORT std::hash<IC::PropertyValue> {
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
