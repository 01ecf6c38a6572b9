#include "IC/Property.h"

#include <algorithm>
#include <ostream>
#include <string_view>
#include <type_traits>

#include "detail/Failure.h"
#include "detail/Text.h"

namespace IC {

[[gnu::init_priority(101)]] static const std::string loggerProperty = "Vexilon.IC.Property";

namespace {

constexpr detail::Source here {"Property", loggerProperty};

// The kind, read again for each record.
auto kindOf(const PropertyValue& value)
{
    return [&value]() -> ZQ::Uint32 { return value.getKind(); };
}

constexpr char notANumber[] = "Can't return current value as a Number";

// Not inline: the copy takes a frame that assignment within the capacity does not need.
template <class T>
[[gnu::noinline]] void replaceByCopy(T& target, const T& source)
{
    T copy(source);
    target.swap(copy);
}

template <class T>
void replace(T& target, const T& source)
{
    target = source;
}
// A vector's own assignment may lose the old elements if copying one throws. Within the capacity, copying bytes and
// numbers cannot.
template <class Element>
void replace(std::vector<Element>& target, const std::vector<Element>& source)
{
    if (std::is_trivially_copyable_v<Element> && source.size() <= target.capacity())
        target = source;
    else
        replaceByCopy(target, source);
}

template <class T>
bool isLess(const T& a, const T& b)
{
    return a < b;
}
// Asks only the elements' <, in both directions.
template <class Element>
bool isLess(const std::vector<Element>& a, const std::vector<Element>& b)
{
    return std::lexicographical_compare(a.begin(), a.end(), b.begin(), b.end());
}

template <class T>
void addObject(detail::Text& text, const T& object)
{
    text.append(object);
}

void addObject(detail::Text& text, const Buffer& bytes)
{
    text.write(2 * bytes.size() + bytes.size() / 4, [&bytes](char* out) {
        const unsigned char* byte = bytes.data();
        for (std::size_t groups = bytes.size() / 4; groups > 0; --groups) {
            out = detail::writeHex(detail::writeHex(out, byte[0]), byte[1]);
            out = detail::writeHex(detail::writeHex(out, byte[2]), byte[3]);
            *out++ = ' ';
            byte += 4;
        }
        for (std::size_t rest = bytes.size() % 4; rest > 0; --rest)
            out = detail::writeHex(out, *byte++);
        return out;
    });
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

void addObject(detail::Text& text, const StringArray& texts)
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
    : PropertyValue(new std::string(detail::checked(value)), KIND_STRING, readOnly)
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

// For a value that holds no object yet.
void PropertyValue::copyObject(const PropertyValue& source)
{
    if (source.value_ == nullptr)
        return;
    value_ = visit(kind_, [&source](auto held) -> void* {
        using Type = typename decltype(held)::Type;
        return new Type(source.object<Type>());
    });
}

void PropertyValue::assign(const PropertyValue& source)
{
    if (kind_ != source.kind_ || value_ == nullptr) {
        replaceByCopy(*this, source);
        return;
    }
    visit(kind_, [this, &source](auto held) {
        using Type = typename decltype(held)::Type;
        replace(object<Type>(), source.object<Type>());
    });
    readOnly_ = source.readOnly_;
}

void PropertyValue::initKind(const unsigned char& kind)
{
    if (kind > KIND_STRINGARRAY)
        detail::fail<PropertyValueInvalidKind>(here("initKind"), "Invalid kind of property",
                                               "PropertyValue:initKind: invalid kind of property: ", kind);
    const auto valid = static_cast<KindType>(kind);
    if (valid != KIND_UNKNOWN)
        value_ = visit(valid, [](auto held) -> void* {
            using Type = typename decltype(held)::Type;
            if constexpr (std::is_same_v<Type, Number>)
                return new Number(Number::KIND_UNKNOWN);
            else
                return new Type;
        });
    kind_ = valid;
}

void PropertyValue::freeObject() noexcept
{
    visit(kind_, [this](auto held) { delete &object<typename decltype(held)::Type>(); });
}

void PropertyValue::setKind(const unsigned char& kind)
{
    if (kind == getKind())
        return;
    if (kind > KIND_STRINGARRAY && value_ != nullptr) {
        release();  // a refused code discards the old value; a valid one replaces it below
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
    if (holds(KIND_NUMBER))
        return object<Number>();
    return detail::textOf(*this);
}

void detail::Text::append(const PropertyValue& value)
{
    if (value.kind_ == PropertyValue::KIND_UNKNOWN)
        add("unknown");
    else if (value.value_ == nullptr)
        add("invalid");
    else
        PropertyValue::visit(value.kind_, [this, &value](auto held) {
            addObject(*this, value.object<typename decltype(held)::Type>());
        });
}

bool PropertyValue::equal(const PropertyValue& a, const PropertyValue& b)
{
    if (a.kind_ != b.kind_)
        return false;
    if (a.value_ == nullptr)
        return true;
    return visit(a.kind_, [&a, &b](auto held) {
        using Type = typename decltype(held)::Type;
        return a.object<Type>() == b.object<Type>();
    });
}

// Emits these inline functions, because the library exports them.
[[gnu::used]] static bool (*const comparisons[])(
    const PropertyValue&, const PropertyValue&) = {operator==, operator!=, operator<, operator> };

// For two of one kind.
bool PropertyValue::precedes(const PropertyValue& a, const PropertyValue& b)
{
    if (a.kind_ != b.kind_ || a.value_ == nullptr)
        return false;  // one of them or both have no object
    return visit(a.kind_, [&a, &b](auto held) {
        using Type = typename decltype(held)::Type;
        return isLess(a.object<Type>(), b.object<Type>());
    });
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
    if (value.holds(PropertyValue::KIND_STRING))
        return detail::insertText(out, value.object<std::string>());
    if (value.holds(PropertyValue::KIND_NUMBER))
        return out << value.object<Number>();
    return detail::insert(out, value);
}

std::ostream& operator<<(std::ostream& out, const std::pair<unsigned int, PropertyValue>& property)
{
    return detail::insertText(out << property.first, " = ") << property.second;
}

std::ostream& operator<<(std::ostream& out, const std::map<unsigned int, PropertyValue>& properties)
{
    for (auto property = properties.begin(); property != properties.end();) {
        const auto& [key, value] = *property;
        const bool last = ++property == properties.end();
        detail::insertText(detail::insertText(out, "[") << key, " = ");
        detail::insertText(out << value, last ? "]" : "], ");
    }
    return out;
}

}  // namespace IC
