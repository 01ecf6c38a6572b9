#include "IC/Property.h"

#include <algorithm>
#include <ostream>
#include <string_view>

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

// For a record, which reads it anew each time.
auto kindOf(const PropertyValue& value)
{
    return [&value]() -> ZQ::Uint32 { return value.getKind(); };
}

constexpr char notANumber[] = "Can't return current value as a Number";

// The old elements stay until the new ones are complete; not every vector's own assignment sees to that.
template <class Array>
void replace(Array& target, const Array& source)
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

std::string textOf(const Buffer& bytes)
{
    std::string text(2 * bytes.size() + bytes.size() / 4, ' ');
    char* out = text.data();
    const unsigned char* byte = bytes.data();
    for (std::size_t groups = bytes.size() / 4; groups > 0; --groups) {
        for (int i = 0; i < 4; ++i)
            out = detail::writeHex(out, *byte++);
        ++out;  // over the blank
    }
    for (std::size_t rest = bytes.size() % 4; rest > 0; --rest)
        out = detail::writeHex(out, *byte++);
    return text;
}

void addQuoted(detail::Text& text, std::string_view content)
{
    text.add('"');
    for (auto quote = content.find('"'); quote != std::string_view::npos; quote = content.find('"')) {
        text.add(content.substr(0, quote));
        text.add("\\\"");
        content.remove_prefix(quote + 1);
    }
    text.add(content);
    text.add('"');
}

void addTexts(detail::Text& text, const StringArray& texts)
{
    std::size_t length = 2;
    for (const std::string& content : texts)
        length += content.size() + 4;
    text.reserve(length);
    const char* separator = "{";
    for (const std::string& content : texts) {
        text.add(separator);
        addQuoted(text, content);
        separator = ", ";
    }
    text.add(texts.empty() ? "{}" : "}");
}

}  // namespace

PropertyValue::PropertyValue(const char* value, const bool& readOnly)
    : value_(new std::string(detail::checked(value))),
      kind_(KIND_STRING),
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

// Called for what holds no object yet.
void PropertyValue::copyObject(const PropertyValue& source)
{
    switch (kind_) {
    case KIND_UNKNOWN:
    case KIND_NUMBER:
        break;  // not here: nothing to copy, or copied in the header
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

void PropertyValue::assign(const PropertyValue& source)
{
    if (kind_ != source.kind_) {
        PropertyValue copy(source);
        swap(copy);
        return;
    }
    switch (kind_) {
    case KIND_UNKNOWN:
    case KIND_NUMBER:
        break;  // not here: nothing to assign, or assigned in the header
    case KIND_STRING:
        *held<std::string>(kind_) = *source.held<std::string>(kind_);
        break;
    case KIND_BUFFER:
        replace(*held<Buffer>(kind_), *source.held<Buffer>(kind_));
        break;
    case KIND_ENUMVALUE:
        *held<EnumValue>(kind_) = *source.held<EnumValue>(kind_);
        break;
    case KIND_NUMBERARRAY:
        replace(*held<NumberArray>(kind_), *source.held<NumberArray>(kind_));
        break;
    case KIND_STRINGARRAY:
        replace(*held<StringArray>(kind_), *source.held<StringArray>(kind_));
        break;
    }
    readOnly_ = source.readOnly_;
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

void PropertyValue::freeObject() noexcept
{
    switch (kind_) {
    case KIND_UNKNOWN:
    case KIND_NUMBER:
        break;  // not here: nothing to free, or freed in the header
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
}

void PropertyValue::setKind(const unsigned char& kind)
{
    if (kind == getKind())
        return;
    if (kind > KIND_STRINGARRAY && value_ != nullptr) {
        release();  // a refused code costs the old value; a valid one only once the new value exists
        value_ = nullptr;
        kind_ = static_cast<KindType>(kind_ | without);
    }
    PropertyValue fresh(kind, readOnly_);
    swap(fresh);
}

ZQ::Real64 PropertyValue::toReal() const
{
    if (const auto* value = held<EnumValue>(KIND_ENUMVALUE))
        return value->operator unsigned int();
    detail::fail<PropertyValueInvalidKind>(
        here("operator ZQ::Real64"), notANumber,
        "PropertyValue:Real64: can't return current value as a Real64, kind=", kindOf(*this));
}

ZQ::Uint64 PropertyValue::toUint64() const
{
    if (const auto* value = held<EnumValue>(KIND_ENUMVALUE))
        return value->operator unsigned int();
    detail::fail<PropertyValueInvalidKind>(
        here("operator ZQ::Uint64"), notANumber,
        "PropertyValue:Uint64: can't return current value as a Uint64, kind=", kindOf(*this));
}

ZQ::Uint32 PropertyValue::toUint32() const
{
    if (const auto* value = held<EnumValue>(KIND_ENUMVALUE))
        return value->operator unsigned int();
    detail::fail<PropertyValueInvalidKind>(
        here("operator ZQ::Uint32"), notANumber,
        "PropertyValue::Uint32: can't return current value as a Uint32, kind=", kindOf(*this));
}

bool PropertyValue::refuseBool() const
{
    detail::fail<PropertyValueInvalidKind>(
        here("operator bool"), notANumber,
        "PropertyValue::bool: can't return current value as a bool, kind=", kindOf(*this));
}

Number PropertyValue::refuseNumber() const
{
    detail::fail<PropertyValueInvalidKind>(
        here("operator IC::Number"), notANumber,
        "PropertyValue:Number: can't return current value as a Number, kind=", kindOf(*this));
}

Version2 PropertyValue::refuseVersion() const
{
    detail::fail<PropertyValueInvalidKind>(
        here("operator IC::Version2"), notANumber,
        "PropertyValue:Version2: can't return current value as a Version2, kind=", kindOf(*this));
}

EnumValue PropertyValue::refuseEnumValue()
{
    throw PropertyValueInvalidKind("Can't return current value as a EnumValue");
}

Buffer PropertyValue::refuseBuffer() const
{
    detail::fail<PropertyValueInvalidKind>(
        here("operator IC::Buffer"), "Can't return current value as a Buffer",
        "PropertyValue:Buffer: can't return current value as a Buffer, kind=", kindOf(*this));
}

NumberArray PropertyValue::refuseNumberArray() const
{
    detail::fail<PropertyValueInvalidKind>(
        here("operator IC::NumberArray"), "Can't return current value as a NumberArray",
        "PropertyValue:NumberArray: can't return current value as a NumberArray, kind=", kindOf(*this));
}

StringArray PropertyValue::refuseStringArray() const
{
    detail::fail<PropertyValueInvalidKind>(
        here("operator IC::StringArray"), "Can't return current value as a StringArray",
        "PropertyValue:StringArray: can't return current value as a StringArray, kind=", kindOf(*this));
}

std::string PropertyValue::toText() const
{
    if (kind_ == KIND_UNKNOWN)
        return "unknown";
    if (value_ == nullptr)
        return "invalid";
    if (const auto* bytes = held<Buffer>(KIND_BUFFER))
        return textOf(*bytes);
    detail::Text text;
    if (const auto* number = held<Number>(KIND_NUMBER))
        append(text, *number);
    else if (const auto* value = held<EnumValue>(KIND_ENUMVALUE))
        append(text, *value);
    else if (const auto* numbers = held<NumberArray>(KIND_NUMBERARRAY))
        append(text, *numbers);
    else if (const auto* texts = held<StringArray>(KIND_STRINGARRAY))
        addTexts(text, *texts);
    return text.take();
}

// The header has compared numbers, texts and bytes.
bool PropertyValue::equal(const PropertyValue& a, const PropertyValue& b)
{
    if (a.kind_ != b.kind_)
        return false;
    switch (a.kind_) {
    case KIND_UNKNOWN:
    case KIND_NUMBER:
    case KIND_STRING:
    case KIND_BUFFER:
        break;
    case KIND_ENUMVALUE:
        return *a.held<EnumValue>(a.kind_) == *b.held<EnumValue>(b.kind_);
    case KIND_NUMBERARRAY:
        return *a.held<NumberArray>(a.kind_) == *b.held<NumberArray>(b.kind_);
    case KIND_STRINGARRAY:
        return *a.held<StringArray>(a.kind_) == *b.held<StringArray>(b.kind_);
    }
    return true;
}

// Inline in the header; a program that looks them up in the library finds them all the same.
[[gnu::used]] static bool (*const comparisons[])(const PropertyValue&,
                                                 const PropertyValue&) = {operator==, operator<, operator> };

bool operator!=(const PropertyValue& a, const PropertyValue& b)
{
    return !(a == b);
}

bool PropertyValue::precedes(const PropertyValue& a, const PropertyValue& b)
{
    if (a.kind_ != b.kind_)
        return false;  // one of them has no object
    switch (a.kind_) {
    case KIND_UNKNOWN:
    case KIND_NUMBER:
    case KIND_STRING:
        break;
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

bool PropertyValue::less(const PropertyValue& a, const PropertyValue& b)
{
    if (a.getKind() != b.getKind())
        detail::fail<PropertyValueInvalidKind>(
            here("operator<"), "Cannot compare two different kinds of properties",
            "<: cannot compare two different kinds of properties, kind1=", kindOf(a), ", kind2=", kindOf(b));
    return precedes(a, b);
}

bool PropertyValue::greater(const PropertyValue& a, const PropertyValue& b)
{
    if (a.getKind() != b.getKind())
        detail::fail<PropertyValueInvalidKind>(
            here("operator>"), "Cannot compare two different kinds of properties",
            ">: cannot compare two different kinds of properties, kind1=", kindOf(a), ", kind2=", kindOf(b));
    return precedes(b, a);
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
    std::string digits(2, '0');
    detail::writeHex(digits.data(), byte);
    return digits;
}

std::ostream& operator<<(std::ostream& out, const PropertyValue& value)
{
    return out << std::string(value);
}

std::ostream& operator<<(std::ostream& out, const std::pair<unsigned int, PropertyValue>& property)
{
    return out << property.first << " = " << property.second;
}

// What stands between two numbers is one piece: inserting costs more than joining.
std::ostream& operator<<(std::ostream& out, const std::map<unsigned int, PropertyValue>& properties)
{
    if (!properties.empty())
        out << '[';
    for (auto property = properties.begin(); property != properties.end();) {
        const auto& [key, value] = *property;
        const char* const end = ++property == properties.end() ? "]" : "], [";
        out << key << " = " + std::string(value) + end;
    }
    return out;
}

}  // namespace IC
