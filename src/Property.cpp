#include "IC/Property.h"

#include <algorithm>
#include <ostream>

#include "IC/ICException.h"
#include "detail/Failure.h"
#include "detail/Text.h"

namespace IC {

[[gnu::init_priority(101)]] static const std::string loggerProperty = "Vexilon.IC.Property";

namespace {

detail::Where here(const char* function, int line = __builtin_LINE())
{
    return {function, "Property", line, loggerProperty};
}

constexpr char notANumber[] = "Can't return current value as a Number";

// The old elements stay until the new ones are complete; not every vector's own assignment sees to that.
template <class Array>
void assign(Array& target, const Array& source)
{
    Array copy(source);
    target.swap(copy);
}

// For buffers and arrays: the elements' < alone decides, asked both ways.
template <class Array>
bool lexicographicallyLess(const Array& a, const Array& b)
{
    return std::lexicographical_compare(a.begin(), a.end(), b.begin(), b.end());
}

template <class Array, class AddElement>
void addArray(detail::Text& text, const Array& array, AddElement addElement)
{
    const char* separator = "{";
    for (const auto& element : array) {
        text.add(separator);
        addElement(element);
        separator = ", ";
    }
    text.add(array.empty() ? "{}" : "}");
}

void addQuoted(detail::Text& text, const std::string& content)
{
    text.add('"');
    for (const char character : content) {
        if (character == '"')
            text.add('\\');
        text.add(character);
    }
    text.add('"');
}

void addBuffer(detail::Text& text, const Buffer& bytes)
{
    for (std::size_t i = 0; i < bytes.size(); ++i) {
        text.addHex(bytes[i]);
        if (i % 4 == 3)
            text.add(' ');
    }
}

void insertProperty(std::ostream& out, unsigned int key, const PropertyValue& value)
{
    out << key << " = " << value;
}

}  // namespace

PropertyValue::PropertyValue(const std::string& value, const bool& readOnly)
    : value_(new std::string(value)),
      kind_(KIND_STRING),
      readOnly_(readOnly)
{
}

PropertyValue::PropertyValue(std::string&& value, const bool& readOnly)
    : value_(new std::string(std::move(value))),
      kind_(KIND_STRING),
      readOnly_(readOnly)
{
}

PropertyValue::PropertyValue(const char* value, const bool& readOnly)
    : value_(new std::string(detail::checked(value))),
      kind_(KIND_STRING),
      readOnly_(readOnly)
{
}

PropertyValue::PropertyValue(const Number& value, const bool& readOnly)
    : value_(new Number(value)),
      kind_(KIND_NUMBER),
      readOnly_(readOnly)
{
}

PropertyValue::PropertyValue(const EnumValue& value, const bool& readOnly)
    : value_(new EnumValue(value)),
      kind_(KIND_ENUMVALUE),
      readOnly_(readOnly)
{
}

PropertyValue::PropertyValue(const Buffer& value, const bool& readOnly)
    : value_(new Buffer(value)),
      kind_(KIND_BUFFER),
      readOnly_(readOnly)
{
}

PropertyValue::PropertyValue(Buffer&& value, const bool& readOnly)
    : value_(new Buffer(std::move(value))),
      kind_(KIND_BUFFER),
      readOnly_(readOnly)
{
}

PropertyValue::PropertyValue(const NumberArray& value, const bool& readOnly)
    : value_(new NumberArray(value)),
      kind_(KIND_NUMBERARRAY),
      readOnly_(readOnly)
{
}

PropertyValue::PropertyValue(NumberArray&& value, const bool& readOnly)
    : value_(new NumberArray(std::move(value))),
      kind_(KIND_NUMBERARRAY),
      readOnly_(readOnly)
{
}

PropertyValue::PropertyValue(const StringArray& value, const bool& readOnly)
    : value_(new StringArray(value)),
      kind_(KIND_STRINGARRAY),
      readOnly_(readOnly)
{
}

PropertyValue::PropertyValue(StringArray&& value, const bool& readOnly)
    : value_(new StringArray(std::move(value))),
      kind_(KIND_STRINGARRAY),
      readOnly_(readOnly)
{
}

PropertyValue::PropertyValue(const unsigned char& kind, const bool& readOnly) : readOnly_(readOnly)
{
    initKind(kind);
}

PropertyValue::PropertyValue(const KindType& kind, const bool& readOnly) : readOnly_(readOnly)
{
    initKind(static_cast<unsigned char>(kind));
}

PropertyValue::PropertyValue(const PropertyValue& source) : kind_(source.kind_), readOnly_(source.readOnly_)
{
    if (source.value_ == nullptr)
        return;
    switch (kind_) {
    case KIND_UNKNOWN:
        break;
    case KIND_NUMBER:
        value_ = new Number(*source.held<Number>(kind_));
        break;
    case KIND_STRING:
        value_ = new std::string(*source.held<std::string>(kind_));
        break;
    case KIND_BUFFER:
        value_ = new Buffer(*source.held<Buffer>(kind_));
        break;
    case KIND_ENUMVALUE:
        value_ = new EnumValue(*source.held<EnumValue>(kind_));
        break;
    case KIND_NUMBERARRAY:
        value_ = new NumberArray(*source.held<NumberArray>(kind_));
        break;
    case KIND_STRINGARRAY:
        value_ = new StringArray(*source.held<StringArray>(kind_));
        break;
    }
}

PropertyValue& PropertyValue::operator=(const PropertyValue& source)
{
    if (this == &source)
        return *this;
    if (kind_ != source.kind_ || value_ == nullptr || source.value_ == nullptr) {
        PropertyValue copy(source);
        swap(copy);
        return *this;
    }
    switch (kind_) {
    case KIND_UNKNOWN:
        break;
    case KIND_NUMBER:
        *static_cast<Number*>(value_) = *source.held<Number>(kind_);
        break;
    case KIND_STRING:
        *static_cast<std::string*>(value_) = *source.held<std::string>(kind_);
        break;
    case KIND_BUFFER:
        assign(*static_cast<Buffer*>(value_), *source.held<Buffer>(kind_));
        break;
    case KIND_ENUMVALUE:
        *static_cast<EnumValue*>(value_) = *source.held<EnumValue>(kind_);
        break;
    case KIND_NUMBERARRAY:
        assign(*static_cast<NumberArray*>(value_), *source.held<NumberArray>(kind_));
        break;
    case KIND_STRINGARRAY:
        assign(*static_cast<StringArray*>(value_), *source.held<StringArray>(kind_));
        break;
    }
    readOnly_ = source.readOnly_;
    return *this;
}

PropertyValue::PropertyValue(PropertyValue&& source) noexcept
    : value_(std::exchange(source.value_, nullptr)),
      kind_(std::exchange(source.kind_, KIND_UNKNOWN)),
      readOnly_(source.readOnly_)
{
}

PropertyValue& PropertyValue::operator=(PropertyValue&& source) noexcept
{
    if (this != &source) {
        PropertyValue moved(std::move(source));
        swap(moved);
    }
    return *this;
}

void PropertyValue::swap(PropertyValue& other) noexcept
{
    std::swap(value_, other.value_);
    std::swap(kind_, other.kind_);
    std::swap(readOnly_, other.readOnly_);
}

void PropertyValue::initKind(const unsigned char& kind)
{
    switch (kind) {
    case KIND_UNKNOWN:
        break;
    case KIND_NUMBER:
        value_ = new Number(Number::KIND_UNKNOWN);
        break;
    case KIND_STRING:
        value_ = new std::string;
        break;
    case KIND_BUFFER:
        value_ = new Buffer;
        break;
    case KIND_ENUMVALUE:
        value_ = new EnumValue;
        break;
    case KIND_NUMBERARRAY:
        value_ = new NumberArray;
        break;
    case KIND_STRINGARRAY:
        value_ = new StringArray;
        break;
    default:
        detail::fail<PropertyValueInvalidKind>(here("initKind"), "Invalid kind of property",
                                               "PropertyValue:initKind: invalid kind of property: ", kind);
    }
    kind_ = static_cast<KindType>(kind);
}

void PropertyValue::freeValue() noexcept
{
    switch (kind_) {
    case KIND_UNKNOWN:
        break;
    case KIND_NUMBER:
        delete static_cast<Number*>(value_);
        break;
    case KIND_STRING:
        delete static_cast<std::string*>(value_);
        break;
    case KIND_BUFFER:
        delete static_cast<Buffer*>(value_);
        break;
    case KIND_ENUMVALUE:
        delete static_cast<EnumValue*>(value_);
        break;
    case KIND_NUMBERARRAY:
        delete static_cast<NumberArray*>(value_);
        break;
    case KIND_STRINGARRAY:
        delete static_cast<StringArray*>(value_);
        break;
    }
    value_ = nullptr;
}

void PropertyValue::setKind(const unsigned char& kind)
{
    if (kind == kind_)
        return;
    if (kind > KIND_STRINGARRAY)
        freeValue();  // a refused code costs the old value; a valid one only once the new value exists
    PropertyValue fresh(kind, readOnly_);
    swap(fresh);
}

ZQ::Real64 PropertyValue::toReal() const
{
    if (const auto* value = held<EnumValue>(KIND_ENUMVALUE))
        return value->operator unsigned int();
    detail::fail<PropertyValueInvalidKind>(
        here("operator ZQ::Real64"), notANumber,
        "PropertyValue:Real64: can't return current value as a Real64, kind=", kind_);
}

ZQ::Uint64 PropertyValue::toUint64() const
{
    if (const auto* value = held<EnumValue>(KIND_ENUMVALUE))
        return value->operator unsigned int();
    detail::fail<PropertyValueInvalidKind>(
        here("operator ZQ::Uint64"), notANumber,
        "PropertyValue:Uint64: can't return current value as a Uint64, kind=", kind_);
}

ZQ::Uint32 PropertyValue::toUint32() const
{
    if (const auto* value = held<EnumValue>(KIND_ENUMVALUE))
        return value->operator unsigned int();
    detail::fail<PropertyValueInvalidKind>(
        here("operator ZQ::Uint32"), notANumber,
        "PropertyValue::Uint32: can't return current value as a Uint32, kind=", kind_);
}

bool PropertyValue::refuseBool() const
{
    detail::fail<PropertyValueInvalidKind>(
        here("operator bool"), notANumber,
        "PropertyValue::bool: can't return current value as a bool, kind=", kind_);
}

Number PropertyValue::refuseNumber() const
{
    detail::fail<PropertyValueInvalidKind>(
        here("operator IC::Number"), notANumber,
        "PropertyValue:Number: can't return current value as a Number, kind=", kind_);
}

Version2 PropertyValue::refuseVersion() const
{
    detail::fail<PropertyValueInvalidKind>(
        here("operator IC::Version2"), notANumber,
        "PropertyValue:Version2: can't return current value as a Version2, kind=", kind_);
}

EnumValue PropertyValue::refuseEnumValue()
{
    throw PropertyValueInvalidKind("Can't return current value as a EnumValue");
}

Buffer PropertyValue::refuseBuffer() const
{
    detail::fail<PropertyValueInvalidKind>(
        here("operator IC::Buffer"), "Can't return current value as a Buffer",
        "PropertyValue:Buffer: can't return current value as a Buffer, kind=", kind_);
}

NumberArray PropertyValue::refuseNumberArray() const
{
    detail::fail<PropertyValueInvalidKind>(
        here("operator IC::NumberArray"), "Can't return current value as a NumberArray",
        "PropertyValue:NumberArray: can't return current value as a NumberArray, kind=", kind_);
}

StringArray PropertyValue::refuseStringArray() const
{
    detail::fail<PropertyValueInvalidKind>(
        here("operator IC::StringArray"), "Can't return current value as a StringArray",
        "PropertyValue:StringArray: can't return current value as a StringArray, kind=", kind_);
}

PropertyValue::operator std::string() const
{
    detail::Text text;
    if (kind_ == KIND_UNKNOWN)
        text.add("unknown");
    else if (value_ == nullptr)
        text.add("invalid");
    else if (const auto* number = held<Number>(KIND_NUMBER))
        append(text, *number);
    else if (const auto* string = held<std::string>(KIND_STRING))
        text.add(*string);
    else if (const auto* bytes = held<Buffer>(KIND_BUFFER))
        addBuffer(text, *bytes);
    else if (const auto* value = held<EnumValue>(KIND_ENUMVALUE))
        append(text, *value);
    else if (const auto* numbers = held<NumberArray>(KIND_NUMBERARRAY))
        addArray(text, *numbers, [&text](const Number& element) { append(text, element); });
    else if (const auto* texts = held<StringArray>(KIND_STRINGARRAY))
        addArray(text, *texts, [&text](const std::string& element) { addQuoted(text, element); });
    return text.take();
}

bool operator==(const PropertyValue& a, const PropertyValue& b)
{
    if (a.kind_ != b.kind_)
        return false;
    if (a.value_ == nullptr || b.value_ == nullptr)
        return a.value_ == b.value_;
    switch (a.kind_) {
    case PropertyValue::KIND_UNKNOWN:
        break;
    case PropertyValue::KIND_NUMBER:
        return *a.held<Number>(a.kind_) == *b.held<Number>(b.kind_);
    case PropertyValue::KIND_STRING:
        return *a.held<std::string>(a.kind_) == *b.held<std::string>(b.kind_);
    case PropertyValue::KIND_BUFFER:
        return *a.held<Buffer>(a.kind_) == *b.held<Buffer>(b.kind_);
    case PropertyValue::KIND_ENUMVALUE:
        return *a.held<EnumValue>(a.kind_) == *b.held<EnumValue>(b.kind_);
    case PropertyValue::KIND_NUMBERARRAY:
        return *a.held<NumberArray>(a.kind_) == *b.held<NumberArray>(b.kind_);
    case PropertyValue::KIND_STRINGARRAY:
        return *a.held<StringArray>(a.kind_) == *b.held<StringArray>(b.kind_);
    }
    return true;
}

bool operator!=(const PropertyValue& a, const PropertyValue& b)
{
    return !(a == b);
}

bool PropertyValue::precedes(const PropertyValue& a, const PropertyValue& b)
{
    if (a.value_ == nullptr || b.value_ == nullptr)
        return false;
    switch (a.kind_) {
    case KIND_UNKNOWN:
        break;
    case KIND_NUMBER:
        return *a.held<Number>(a.kind_) < *b.held<Number>(b.kind_);
    case KIND_STRING:
        return *a.held<std::string>(a.kind_) < *b.held<std::string>(b.kind_);
    case KIND_BUFFER:
        return lexicographicallyLess(*a.held<Buffer>(a.kind_), *b.held<Buffer>(b.kind_));
    case KIND_ENUMVALUE:
        return *a.held<EnumValue>(a.kind_) < *b.held<EnumValue>(b.kind_);
    case KIND_NUMBERARRAY:
        return lexicographicallyLess(*a.held<NumberArray>(a.kind_), *b.held<NumberArray>(b.kind_));
    case KIND_STRINGARRAY:
        return lexicographicallyLess(*a.held<StringArray>(a.kind_), *b.held<StringArray>(b.kind_));
    }
    return false;
}

bool operator<(const PropertyValue& a, const PropertyValue& b)
{
    if (a.kind_ != b.kind_)
        detail::fail<PropertyValueInvalidKind>(
            here("operator<"), "Cannot compare two different kinds of properties",
            "<: cannot compare two different kinds of properties, kind1=", a.kind_, ", kind2=", b.kind_);
    return PropertyValue::precedes(a, b);
}

bool operator>(const PropertyValue& a, const PropertyValue& b)
{
    if (a.kind_ != b.kind_)
        detail::fail<PropertyValueInvalidKind>(
            here("operator>"), "Cannot compare two different kinds of properties",
            ">: cannot compare two different kinds of properties, kind1=", a.kind_, ", kind2=", b.kind_);
    // Numbers have a > of their own: infinity on the left is greater than any kind of number.
    const auto* x = a.held<Number>(PropertyValue::KIND_NUMBER);
    const auto* y = b.held<Number>(PropertyValue::KIND_NUMBER);
    return x != nullptr && y != nullptr ? *x > *y : PropertyValue::precedes(b, a);
}

bool operator<=(const PropertyValue& a, const PropertyValue& b)
{
    return a == b || a < b;
}

bool operator>=(const PropertyValue& a, const PropertyValue& b)
{
    return a == b || a > b;
}

std::string pB(unsigned char byte)
{
    detail::Text text;
    text.addHex(byte);
    return text.take();
}

std::ostream& operator<<(std::ostream& out, const PropertyValue& value)
{
    return out << std::string(value);
}

std::ostream& operator<<(std::ostream& out, const std::pair<unsigned int, PropertyValue>& property)
{
    insertProperty(out, property.first, property.second);
    return out;
}

std::ostream& operator<<(std::ostream& out, const std::map<unsigned int, PropertyValue>& properties)
{
    for (auto property = properties.begin(); property != properties.end();) {
        out << '[';
        insertProperty(out, property->first, property->second);
        out << (++property == properties.end() ? "]" : "], ");
    }
    return out;
}

}  // namespace IC
