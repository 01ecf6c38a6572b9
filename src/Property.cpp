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
        out = detail::writeHex(detail::writeHex(out, byte[0]), byte[1]);
        out = detail::writeHex(detail::writeHex(out, byte[2]), byte[3]) + 1;  // over the blank
        byte += 4;
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

std::string textOf(const StringArray& texts)
{
    detail::Text text;
    addTexts(text, texts);
    return text.take();
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

// Called for what holds no object yet. The header has copied numbers.
void PropertyValue::copyObject(const PropertyValue& source)
{
    if (source.value_ == nullptr)
        return;
    switch (kind_) {
    case KIND_STRING:
        value_ = new std::string(source.object<std::string>());
        break;
    case KIND_BUFFER:
        value_ = new Buffer(source.object<Buffer>());
        break;
    case KIND_ENUMVALUE:
        value_ = new EnumValue(source.object<EnumValue>());
        break;
    case KIND_NUMBERARRAY:
        value_ = new NumberArray(source.object<NumberArray>());
        break;
    default:  // KIND_STRINGARRAY
        value_ = new StringArray(source.object<StringArray>());
        break;
    }
}

// The header has assigned numbers.
void PropertyValue::assign(const PropertyValue& source)
{
    if (kind_ != source.kind_ || value_ == nullptr) {
        PropertyValue copy(source);
        swap(copy);
        return;
    }
    switch (kind_) {
    case KIND_STRING:
        object<std::string>() = source.object<std::string>();
        break;
    case KIND_BUFFER:
        replace(object<Buffer>(), source.object<Buffer>());
        break;
    case KIND_ENUMVALUE:
        object<EnumValue>() = source.object<EnumValue>();
        break;
    case KIND_NUMBERARRAY:
        replace(object<NumberArray>(), source.object<NumberArray>());
        break;
    default:  // KIND_STRINGARRAY
        replace(object<StringArray>(), source.object<StringArray>());
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

// The header has freed numbers.
void PropertyValue::freeObject() noexcept
{
    switch (kind_) {
    case KIND_STRING:
        delete &object<std::string>();
        break;
    case KIND_BUFFER:
        delete &object<Buffer>();
        break;
    case KIND_ENUMVALUE:
        delete &object<EnumValue>();
        break;
    case KIND_NUMBERARRAY:
        delete &object<NumberArray>();
        break;
    default:  // KIND_STRINGARRAY
        delete &object<StringArray>();
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

ZQ::Real64 PropertyValue::refuseReal() const
{
    detail::fail<PropertyValueInvalidKind>(
        here("operator ZQ::Real64"), notANumber,
        "PropertyValue:Real64: can't return current value as a Real64, kind=", kindOf(*this));
}

ZQ::Uint64 PropertyValue::refuseUint64() const
{
    detail::fail<PropertyValueInvalidKind>(
        here("operator ZQ::Uint64"), notANumber,
        "PropertyValue:Uint64: can't return current value as a Uint64, kind=", kindOf(*this));
}

ZQ::Uint32 PropertyValue::refuseUint32() const
{
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
    if (holds(KIND_NUMBER))
        return object<Number>();
    if (holds(KIND_ENUMVALUE))
        return object<EnumValue>();
    if (holds(KIND_BUFFER))
        return textOf(object<Buffer>());
    if (holds(KIND_NUMBERARRAY))
        return detail::textOf(object<NumberArray>());
    return textOf(object<StringArray>());  // the header has answered for texts
}

// The header has compared numbers, texts and bytes.
bool PropertyValue::equal(const PropertyValue& a, const PropertyValue& b)
{
    if (a.kind_ != b.kind_)
        return false;
    if (a.value_ == nullptr)
        return true;
    switch (a.kind_) {
    case KIND_ENUMVALUE:
        return a.object<EnumValue>() == b.object<EnumValue>();
    case KIND_NUMBERARRAY:
        return a.object<NumberArray>() == b.object<NumberArray>();
    default:  // KIND_STRINGARRAY
        return a.object<StringArray>() == b.object<StringArray>();
    }
}

// Inline in the header; a program that looks them up in the library finds them all the same.
[[gnu::used]] static bool (*const comparisons[])(const PropertyValue&,
                                                 const PropertyValue&) = {operator==, operator<, operator> };

bool operator!=(const PropertyValue& a, const PropertyValue& b)
{
    return !(a == b);
}

// For two of a kind. The header has compared numbers and texts.
bool PropertyValue::precedes(const PropertyValue& a, const PropertyValue& b)
{
    if (a.kind_ != b.kind_ || a.value_ == nullptr)
        return false;  // one of them or both have no object
    switch (a.kind_) {
    case KIND_BUFFER:
        return lexicographicallyLess(a.object<Buffer>(), b.object<Buffer>());
    case KIND_ENUMVALUE:
        return a.object<EnumValue>() < b.object<EnumValue>();
    case KIND_NUMBERARRAY:
        return lexicographicallyLess(a.object<NumberArray>(), b.object<NumberArray>());
    default:  // KIND_STRINGARRAY
        return lexicographicallyLess(a.object<StringArray>(), b.object<StringArray>());
    }
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
