#pragma once

// The end of IC/json.h: how the documents are written and read.

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <initializer_list>
#include <limits>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

namespace IC {

namespace detail {

// The names of the kinds of a number by their codes. The last stands for the codes that are no kind.
constexpr std::array jsonNumberKinds {"unknown", "bool",     "int",     "uint32",   "uint64",  "real",
                                      "nan",     "infinity", "version", "dateTime", "nodeRef", "invalid"};
constexpr unsigned int jsonInvalidKind = 11;

// The names of the kinds of a property value by their codes. A number goes by its own kind, so that "number" is only
// the kind of a missing one.
constexpr std::array jsonPropertyKinds {"nothing",   "number",      "string",     "buffer",
                                        "enumValue", "numberArray", "stringArray"};
constexpr const char* jsonMissing = "missing";

// What a number stores beside its kind: the bytes, as an integer and, behind it, as the fields of a date-time, and the
// node reference.
struct NumberStorage {
    ZQ::Uint64 bits;
    ZQ::Uint16 milliseconds;
    ZQ::Uint8 scope;
    sNodeRef nodeRef;
};

inline bool operator==(const NumberStorage& a, const NumberStorage& b) noexcept
{
    return a.bits == b.bits && a.milliseconds == b.milliseconds && a.scope == b.scope
        && a.nodeRef.type == b.nodeRef.type && a.nodeRef.id == b.nodeRef.id;
}

// Reaches what the public interface refuses to make, or makes only with a record.
struct JsonAccess {
    static NumberStorage storageOf(const Number& number) noexcept
    {
        const auto time = number.load<Number::DateTimeFields>();
        return {number.load<ZQ::Uint64>(), time.milliseconds, time.scope, number.nodeRef_};
    }

    static Number numberOf(Number::KindType kind, const NumberStorage& storage) noexcept
    {
        Number number(Number::Tag(), kind);
        number.storeDateTime(0, storage.milliseconds, storage.scope);
        number.store(storage.bits);  // last: with a long of 32 bits it includes the two fields
        number.nodeRef_ = storage.nodeRef;
        return number;
    }

    // The flag is the first byte, also if that is above 1.
    static ZQ::Uint8 flagOf(const Number& number) noexcept { return number.load<ZQ::Uint8>(); }

    template <class T>
    static void store(Number& number, const T& content) noexcept
    {
        number.store(content);
    }
    static void store(Number& number, const sNodeRef& content) noexcept { number.nodeRef_ = content; }
    static void storeDateTime(Number& number, long seconds, ZQ::Uint16 milliseconds, ZQ::Uint8 scope) noexcept
    {
        // Changes the fields alone: with a long of 32 bits, their unused byte is part of the stored 64 bits.
        auto time = number.load<Number::DateTimeFields>();
        time.seconds = seconds;
        time.milliseconds = milliseconds;
        time.scope = scope;
        number.store(time);
    }

    static PropertyValue withoutObject(PropertyValue::KindType kind, bool readOnly) noexcept
    {
        return {nullptr, static_cast<PropertyValue::KindType>(kind | PropertyValue::without), readOnly};
    }
};

// What follows the first byte of a character of UTF-8: so many bytes, the first of them in this range.
struct Utf8Rest {
    int bytes;
    unsigned char least;
    unsigned char most;
};

// The ranges exclude overlong forms, surrogates and what is above U+10FFFF.
inline Utf8Rest utf8RestAfter(unsigned char first) noexcept
{
    const int bytes = first < 0xE0 ? 1 : first < 0xF0 ? 2 : 3;
    const unsigned char least = first == 0xE0 ? 0xA0 : first == 0xF0 ? 0x90 : 0x80;
    const unsigned char most = first == 0xED ? 0x9F : first == 0xF4 ? 0x8F : 0xBF;
    return {bytes, least, most};
}

// Whether the text is UTF-8, as the library nlohmann/json requires of what it writes as JSON.
inline bool isUtf8(const std::string& text) noexcept
{
    for (auto next = text.begin(); next != text.end();) {
        const auto first = static_cast<unsigned char>(*next++);
        if (first < 0x80)
            continue;
        if (first < 0xC2 || first > 0xF4)
            return false;
        for (Utf8Rest rest = utf8RestAfter(first); rest.bytes > 0; rest = {rest.bytes - 1, 0x80, 0xBF}) {
            if (next == text.end())
                return false;
            const auto byte = static_cast<unsigned char>(*next++);
            if (byte < rest.least || byte > rest.most)
                return false;
        }
    }
    return true;
}

template <class Bytes>
std::string jsonHex(const Bytes& bytes)
{
    std::string digits;
    digits.reserve(2 * bytes.size());
    for (const auto byte : bytes)
        digits += pB(static_cast<unsigned char>(byte));
    return digits;
}

// Names the type that is read.
template <class Value>
struct Wanted {
};

// A value of a document and its place in it. Refuses the value that is not expected. Lives on the stack of the reader,
// because it refers to the place around it.
template <class Json>
class JsonPlace {
public:
    explicit JsonPlace(const Json& json) noexcept : json_(json) { }
    JsonPlace(const JsonPlace& around, std::string_view key, const Json& json) noexcept
        : json_(json),
          around_(&around),
          key_(key)
    {
    }
    JsonPlace(const JsonPlace& around, std::size_t index, const Json& json) noexcept
        : json_(json),
          around_(&around),
          index_(index)
    {
    }
    JsonPlace(const JsonPlace&) = delete;
    JsonPlace& operator=(const JsonPlace&) = delete;
    ~JsonPlace() = default;

    [[noreturn]] void fail(const std::string& sentence) const
    {
        // As a JSON string: a key can have bytes that end or garble the text of an exception.
        const std::string place =
            Json(pointer().to_string()).dump(-1, ' ', false, Json::error_handler_t::replace);
        throw Json::type_error::create(302, "at " + place + ": " + sentence, nullptr);
    }

    const Json& json() const noexcept { return json_; }

    // A member of an object.
    JsonPlace operator[](const char* key) const
    {
        const auto found = object().find(key);
        if (found == json_.end())
            fail(std::string("the key \"") + key + "\" is missing");
        return JsonPlace(*this, key, *found);
    }

    bool has(const char* key) const { return object().find(key) != json_.end(); }

    // Refuses an object that has other keys than these.
    void hasOnly(std::initializer_list<std::string_view> keys) const
    {
        for (auto member = object().begin(); member != json_.end(); ++member)
            if (std::find(keys.begin(), keys.end(), member.key()) == keys.end())
                JsonPlace(*this, member.key(), *member).fail("unknown key");
    }

    // Calls the function with each key of an object and its place.
    template <class Function>
    void forEachMember(Function function) const
    {
        for (auto member = object().begin(); member != json_.end(); ++member)
            function(member.key(), JsonPlace(*this, member.key(), *member));
    }

    // The results of the function for the places of the elements of an array.
    template <class Value, class Function>
    std::vector<Value> elements(Function function) const
    {
        if (!json_.is_array())
            fail("expected an array");
        std::vector<Value> values;
        values.reserve(json_.size());
        for (std::size_t index = 0; index < json_.size(); ++index)
            values.push_back(function(JsonPlace(*this, index, json_[index])));
        return values;
    }

    // An element of an array of this many.
    JsonPlace element(std::size_t index, std::size_t count) const
    {
        if (!json_.is_array() || json_.size() != count)
            fail("expected an array of " + std::to_string(count) + " elements");
        return JsonPlace(*this, index, json_[index]);
    }

    void null() const
    {
        if (!json_.is_null())
            fail("expected null");
    }

    bool flag() const
    {
        if (!json_.is_boolean())
            fail("expected true or false");
        return json_.template get<bool>();
    }

    template <class Integer>
    Integer integer(Integer least = 0, Integer most = std::numeric_limits<Integer>::max()) const
    {
        static_assert(std::is_unsigned_v<Integer>);
        return static_cast<Integer>(integerBetween(least, most));
    }

    template <class Integer>
    Integer signedInteger() const
    {
        static_assert(std::is_signed_v<Integer>);
        if (json_.is_number_integer()) {
            const auto bits = json_.template get<std::uint64_t>();
            const auto value = static_cast<Integer>(bits);
            // Nothing was lost if the bits come back, and the sign was not taken for one of them.
            if (static_cast<std::uint64_t>(value) == bits && (value < 0) == isNegative())
                return value;
        }
        fail("expected an integer from " + std::to_string(std::numeric_limits<Integer>::min()) + " to "
             + std::to_string(std::numeric_limits<Integer>::max()));
    }

    const std::string& string() const
    {
        if (!json_.is_string())
            fail("expected a string");
        return json_.template get_ref<const std::string&>();
    }

    // The bytes of hexadecimal digits.
    template <class Bytes>
    Bytes hex() const
    {
        const std::string& digits = string();
        if (digits.size() % 2 != 0 || digits.find_first_not_of(hexDigits) != std::string::npos)
            fail("expected two lower-case hexadecimal digits for each byte");
        Bytes bytes;
        bytes.reserve(digits.size() / 2);
        for (std::size_t at = 0; at < digits.size(); at += 2)
            bytes.push_back(static_cast<typename Bytes::value_type>(16 * hexDigits.find(digits[at])
                                                                    + hexDigits.find(digits[at + 1])));
        return bytes;
    }

private:
    static constexpr std::string_view hexDigits = "0123456789abcdef";

    const Json& object() const
    {
        if (!json_.is_object())
            fail("expected an object");
        return json_;
    }

    bool isNegative() const { return !json_.is_number_unsigned() && json_.template get<std::int64_t>() < 0; }

    std::uint64_t integerBetween(std::uint64_t least, std::uint64_t most) const
    {
        if (json_.is_number_integer() && !isNegative()) {
            const auto value = json_.template get<std::uint64_t>();
            if (value >= least && value <= most)
                return value;
        }
        fail("expected an integer from " + std::to_string(least) + " to " + std::to_string(most));
    }

    typename Json::json_pointer pointer() const
    {
        if (around_ == nullptr)
            return typename Json::json_pointer();
        return key_.data() != nullptr ? around_->pointer() / std::string(key_) : around_->pointer() / index_;
    }

    const Json& json_;
    const JsonPlace* around_ = nullptr;
    std::string_view key_ {};
    std::size_t index_ = 0;
};

// Texts. One that is no UTF-8 is an object with its bytes.

template <class Json>
Json toJson(const std::string& text)
{
    if (isUtf8(text))
        return Json(text);
    Json json = Json::object();
    json["hex"] = jsonHex(text);
    return json;
}

template <class Json>
std::string readText(const JsonPlace<Json>& place)
{
    if (!place.json().is_object())
        return place.string();
    place.hasOnly({"hex"});
    return place["hex"].template hex<std::string>();
}

template <class Json>
Json toJson(const std::vector<std::string>& texts)
{
    Json json = Json::array();
    for (const std::string& text : texts)
        json.push_back(toJson<Json>(text));
    return json;
}

template <class Json>
std::vector<std::string> readTexts(const JsonPlace<Json>& place)
{
    return place.template elements<std::string>([](const auto& element) { return readText(element); });
}

// Numbers.

// The bits of a real that has the exponent of infinities and NaNs.
constexpr ZQ::Uint64 infiniteBits = 0x7FF0000000000000;
constexpr ZQ::Uint64 negativeInfiniteBits = 0xFFF0000000000000;

template <class Json>
Json realToJson(ZQ::Uint64 bits, ZQ::Real64 real)
{
    if ((bits & infiniteBits) != infiniteBits)
        return Json(real);
    if (bits == infiniteBits)
        return Json("infinity");
    if (bits == negativeInfiniteBits)
        return Json("-infinity");
    std::string digits;
    for (unsigned int shift = 64; shift > 0; shift -= 8)
        digits += pB(static_cast<unsigned char>(bits >> (shift - 8) & 0xFF));
    Json json = Json::object();
    json["bits"] = digits;
    return json;
}

template <class Json>
ZQ::Uint64 readReal(const JsonPlace<Json>& place)
{
    ZQ::Uint64 bits = 0;
    if (place.json().is_number()) {
        const auto real = place.json().template get<ZQ::Real64>();
        std::memcpy(&bits, &real, sizeof bits);
        return bits;
    }
    if (place.json().is_object()) {
        place.hasOnly({"bits"});
        const auto bytes = place["bits"].template hex<Buffer>();
        if (bytes.size() != sizeof bits)
            place["bits"].fail("expected 16 digits");
        for (const unsigned char byte : bytes)
            bits = bits << 8 | byte;
        return bits;
    }
    const std::string& name = place.string();
    if (name != "infinity" && name != "-infinity")
        place.fail(R"(expected "infinity" or "-infinity")");
    return name == "infinity" ? infiniteBits : negativeInfiniteBits;
}

template <class Json>
Json timeToJson(const ZQ::DateTime& time)
{
    Json json = Json::object();
    json["seconds"] = static_cast<long>(time);
    json["milliseconds"] = time.getMillisecond();
    json["scope"] = time.getScope();
    return json;
}

// What visit passes of a number becomes the member "value".
template <class Json>
struct NumberWriter {
    const NumberStorage& storage;
    ZQ::Uint8 flag;

    Json operator()(bool) const { return flag > 1 ? Json(flag) : Json(flag == 1); }
    Json operator()(int value) const { return Json(value); }
    Json operator()(unsigned int value) const { return Json(value); }
    Json operator()(unsigned long long value) const { return Json(value); }
    Json operator()(double value) const { return realToJson<Json>(storage.bits, value); }
    Json operator()(const Version2& value) const { return Json::array({+value.major, +value.minor}); }
    Json operator()(const ZQ::DateTime& value) const { return timeToJson<Json>(value); }
    Json operator()(const NodeRef& value) const
    {
        Json json = Json::object();
        json["type"] = value.type;
        json["id"] = value.id;
        return json;
    }
    Json operator()(std::monostate) const { return Json(nullptr); }
    Json operator()(NotANumber) const { return Json(nullptr); }
    Json operator()(Infinity) const { return Json(nullptr); }
    Json operator()(InvalidKind invalid) const { return Json(static_cast<ZQ::Uint32>(invalid.kind)); }
};

// What setKind and initKind left in the storage, which another setKind can bring back: all but what the kind shows.
inline NumberStorage leftOver(const Number& number)
{
    Number rest = number;
    visit(number, [&rest](const auto& shown) {
        using Shown = std::decay_t<decltype(shown)>;
        if constexpr (std::is_same_v<Shown, ZQ::DateTime>)
            JsonAccess::storeDateTime(rest, 0, 0, 0);
        else if constexpr (std::is_arithmetic_v<
                               Shown> || std::is_same_v<Shown, Version2> || std::is_same_v<Shown, NodeRef>)
            JsonAccess::store(rest, Shown());
    });
    return JsonAccess::storageOf(rest);
}

template <class Json>
Json toJson(const Number& number)
{
    const NumberStorage storage = JsonAccess::storageOf(number);
    Json json = Json::object();
    json["kind"] = jsonNumberKinds[std::min<ZQ::Uint32>(number.getKind(), jsonInvalidKind)];
    json["value"] = visit(number, NumberWriter<Json> {storage, JsonAccess::flagOf(number)});
    if (!(leftOver(number) == NumberStorage {}))
        json["storage"] = Json::array(
            {storage.bits, storage.milliseconds, storage.scope, storage.nodeRef.type, storage.nodeRef.id});
    return json;
}

template <class Json>
NumberStorage readStorage(const JsonPlace<Json>& place)
{
    constexpr std::size_t count = 5;
    return {place.element(0, count).template integer<ZQ::Uint64>(),
            place.element(1, count).template integer<ZQ::Uint16>(),
            place.element(2, count).template integer<ZQ::Uint8>(),
            {place.element(3, count).template integer<ZQ::Uint32>(),
             place.element(4, count).template integer<ZQ::Uint32>()}};
}

// Stores the content of the number's kind.
template <class Json>
void readContent(const JsonPlace<Json>& place, Number& number)
{
    switch (ZQ::Uint32 {number.getKind()}) {
    case Number::KIND_BOOL:
        JsonAccess::store(number,
                          place.json().is_boolean() ? static_cast<ZQ::Uint8>(place.flag())
                                                    : place.template integer<ZQ::Uint8>());
        return;
    case Number::KIND_INT:
        JsonAccess::store(number, place.template signedInteger<int>());
        return;
    case Number::KIND_UINT32:
        JsonAccess::store(number, place.template integer<ZQ::Uint32>());
        return;
    case Number::KIND_UINT64:
        JsonAccess::store(number, place.template integer<ZQ::Uint64>());
        return;
    case Number::KIND_REAL:
        JsonAccess::store(number, readReal(place));
        return;
    case Number::KIND_VERSION:
        JsonAccess::store(number,
                          Version2 {place.element(0, 2).template integer<ZQ::Uint8>(),
                                    place.element(1, 2).template integer<ZQ::Uint8>()});
        return;
    case Number::KIND_DATETIME:
        place.hasOnly({"seconds", "milliseconds", "scope"});
        JsonAccess::storeDateTime(number, place["seconds"].template signedInteger<long>(),
                                  place["milliseconds"].template integer<ZQ::Uint16>(),
                                  place["scope"].template integer<ZQ::Uint8>());
        return;
    case Number::KIND_NODEREF:
        place.hasOnly({"type", "id"});
        JsonAccess::store(number,
                          sNodeRef {place["type"].template integer<ZQ::Uint32>(),
                                    place["id"].template integer<ZQ::Uint32>()});
        return;
    default:  // the kinds without a value
        place.null();
    }
}

// The index of a kind's name.
template <class Json, class Names>
ZQ::Uint32 readKind(const JsonPlace<Json>& place, const Names& names)
{
    const auto name = std::find(names.begin(), names.end(), place.string());
    if (name == names.end())
        place.fail("unknown kind");
    return static_cast<ZQ::Uint32>(name - names.begin());
}

// Reads the members of a number. The caller checks that there are no others.
template <class Json>
Number readNumber(const JsonPlace<Json>& place)
{
    auto kind = readKind(place["kind"], jsonNumberKinds);
    const auto value = place["value"];
    const bool isKind = kind < jsonInvalidKind;
    if (!isKind)
        kind = value.template integer<ZQ::Uint32>(jsonInvalidKind);
    const NumberStorage storage = place.has("storage") ? readStorage(place["storage"]) : NumberStorage {};
    Number number = JsonAccess::numberOf(static_cast<Number::KindType>(kind), storage);
    if (isKind)
        readContent(value, number);
    return number;
}

template <class Json>
Number read(const JsonPlace<Json>& place, Wanted<Number>)
{
    place.hasOnly({"kind", "value", "storage"});
    return readNumber(place);
}

// Enumerated values.

template <class Json>
Json toJson(const EnumValue& value)
{
    return Json(value.operator unsigned int());
}

template <class Json>
EnumValue read(const JsonPlace<Json>& place, Wanted<EnumValue>)
{
    return place.template integer<ZQ::Uint32>();
}

// Property values.

template <class Json>
Json toJson(const PropertyValue& value)
{
    struct Writer {
        Json operator()(std::monostate) const { return of(PropertyValue::KIND_UNKNOWN, nullptr); }
        Json operator()(const Number& number) const { return toJson<Json>(number); }
        Json operator()(const std::string& text) const
        {
            return of(PropertyValue::KIND_STRING, toJson<Json>(text));
        }
        Json operator()(const Buffer& bytes) const { return of(PropertyValue::KIND_BUFFER, jsonHex(bytes)); }
        Json operator()(const EnumValue& enumValue) const
        {
            return of(PropertyValue::KIND_ENUMVALUE, toJson<Json>(enumValue));
        }
        Json operator()(const NumberArray& numbers) const
        {
            Json elements = Json::array();
            for (const Number& number : numbers)
                elements.push_back(toJson<Json>(number));
            return of(PropertyValue::KIND_NUMBERARRAY, std::move(elements));
        }
        Json operator()(const StringArray& texts) const
        {
            return of(PropertyValue::KIND_STRINGARRAY, toJson<Json>(texts));
        }
        Json operator()(MissingObject missing) const
        {
            return of(jsonMissing, jsonPropertyKinds[missing.kind]);
        }

        static Json of(const char* kind, Json content)
        {
            Json json = Json::object();
            json["kind"] = kind;
            json["value"] = std::move(content);
            return json;
        }
        static Json of(PropertyValue::KindType kind, Json content)
        {
            return of(jsonPropertyKinds[kind], std::move(content));
        }
    };
    Json json = visit(value, Writer());
    if (value.readOnly())
        json["readOnly"] = true;
    return json;
}

template <class Json>
PropertyValue read(const JsonPlace<Json>& place, Wanted<PropertyValue>)
{
    const std::string& kind = place["kind"].string();
    const bool readOnly = place.has("readOnly") && place["readOnly"].flag();
    if (std::find(jsonNumberKinds.begin(), jsonNumberKinds.end(), kind) != jsonNumberKinds.end()) {
        place.hasOnly({"kind", "value", "readOnly", "storage"});
        return {readNumber(place), readOnly};
    }
    place.hasOnly({"kind", "value", "readOnly"});
    const auto value = place["value"];
    if (kind == jsonMissing) {
        const ZQ::Uint32 missing = readKind(value, jsonPropertyKinds);
        if (missing == PropertyValue::KIND_UNKNOWN)
            value.fail("unknown kind");
        return JsonAccess::withoutObject(static_cast<PropertyValue::KindType>(missing), readOnly);
    }
    switch (readKind(place["kind"], jsonPropertyKinds)) {
    case PropertyValue::KIND_UNKNOWN:
        value.null();
        return {PropertyValue::KIND_UNKNOWN, readOnly};
    case PropertyValue::KIND_STRING:
        return {readText(value), readOnly};
    case PropertyValue::KIND_BUFFER:
        return {value.template hex<Buffer>(), readOnly};
    case PropertyValue::KIND_ENUMVALUE:
        return {read(value, Wanted<EnumValue>()), readOnly};
    case PropertyValue::KIND_NUMBERARRAY:
        return {value.template elements<Number>(
                    [](const auto& element) { return read(element, Wanted<Number>()); }),
                readOnly};
    case PropertyValue::KIND_STRINGARRAY:
        return {readTexts(value), readOnly};
    default:
        place["kind"].fail("unknown kind");  // "number": a number goes by its own kind
    }
}

using PropertyMap = std::map<unsigned int, PropertyValue>;

template <class Json>
Json toJson(const PropertyMap& properties)
{
    Json json = Json::object();
    for (const auto& [key, value] : properties)
        json[std::to_string(key)] = toJson<Json>(value);
    return json;
}

template <class Json>
PropertyMap read(const JsonPlace<Json>& place, Wanted<PropertyMap>)
{
    PropertyMap properties;
    place.forEachMember([&properties](const std::string& key, const JsonPlace<Json>& value) {
        const auto number = static_cast<unsigned int>(std::strtoul(key.c_str(), nullptr, 10));
        if (std::to_string(number) != key)  // as for "+7", " 7" and 2^32 + 7
            value.fail("expected a property number as the key");
        properties.emplace(number, read(value, Wanted<PropertyValue>()));
    });
    return properties;
}

// Errors, alerts and nodes.

template <class Json>
Json toJson(const Error& error)
{
    Json json = Json::object();
    json["status"] = +error.getStatus();
    json["value"] = toJson<Json>(error.getValue());
    json["message"] = toJson<Json>(error.getMessage());
    return json;
}

template <class Json>
Error read(const JsonPlace<Json>& place, Wanted<Error>)
{
    place.hasOnly({"status", "value", "message"});
    return {place["status"].template integer<ZQ::Uint8>(0, Error::STATUS_READ_ONLY),
            read(place["value"], Wanted<Number>()), readText(place["message"])};
}

template <class Json>
Json toJson(const Alert& alert)
{
    Json json = Json::object();
    json["time"] = timeToJson<Json>(alert.getTimeStamp());
    json["severity"] = +alert.getSeverity();
    json["class"] = +alert.getClass();
    json["status"] = static_cast<ZQ::Uint32>(alert.getStatus());
    json["paths"] = toJson<Json>(alert.getNodePaths());
    json["message"] = toJson<Json>(alert.getMessage());
    return json;
}

template <class Json>
Alert read(const JsonPlace<Json>& place, Wanted<Alert>)
{
    place.hasOnly({"time", "severity", "class", "status", "paths", "message"});
    const auto time = place["time"];
    time.hasOnly({"seconds", "milliseconds", "scope"});
    ZQ::DateTime timeStamp(time["seconds"].template signedInteger<long>(),
                           time["scope"].template integer<ZQ::Uint32>());
    timeStamp.setMillisecond(time["milliseconds"].template integer<ZQ::Uint32>());
    return {timeStamp,
            place["severity"].template integer<ZQ::Uint8>(0, Alert::SEVERITY_LARGEST),
            place["class"].template integer<ZQ::Uint8>(0, Alert::CLASS_LARGEST),
            readTexts(place["paths"]),
            place["status"].template integer<ZQ::Uint32>(0, Node::STATUS_LARGEST),
            readText(place["message"])};
}

template <class Json>
Json toJson(const Node& node)
{
    Json json = Json::object();
    json["sensor"] = static_cast<ZQ::Uint32>(node.getSensor());
    json["status"] = static_cast<ZQ::Uint32>(node.getStatus());
    json["description"] = toJson<Json>(node.getDescription());
    json["path"] = toJson<Json>(node.getPath());
    json["parent"] = toJson<Json>(node.getParent());
    json["properties"] = toJson<Json>(node.getProperties());
    return json;
}

struct StoredContent {
    ZQ::Uint32 sensor;
    ZQ::Uint32 status;
    std::string description;
    std::string path;
    std::string parent;
    PropertyMap properties;
};

template <class Json>
StoredContent read(const JsonPlace<Json>& place, Wanted<StoredContent>)
{
    place.hasOnly({"sensor", "status", "description", "path", "parent", "properties"});
    return {place["sensor"].template integer<ZQ::Uint32>(0, Node::SENSOR_LARGEST),
            place["status"].template integer<ZQ::Uint32>(),
            readText(place["description"]),
            readText(place["path"]),
            readText(place["parent"]),
            read(place["properties"], Wanted<PropertyMap>())};
}

template <class Value>
template <class Json>
void JsonWriter<Value>::to_json(Json& json, const Value& value)
{
    json = toJson<Json>(value);
}

template <class Value>
template <class Json>
Value JsonSerializer<Value>::from_json(const Json& json)
{
    return read(JsonPlace<Json>(json), Wanted<Value>());
}

template <class Value>
template <class Json>
void JsonSerializer<Value>::from_json(const Json& json, Value& value)
{
    value = from_json(json);
}

}  // namespace detail

inline StoredNode::StoredNode(const nlohmann::json& document)
    : StoredNode(
        detail::read(detail::JsonPlace<nlohmann::json>(document), detail::Wanted<detail::StoredContent>()))
{
}

inline StoredNode::StoredNode(detail::StoredContent&& content) : Node(content.sensor)
{
    status = static_cast<StatusType>(content.status);
    description = std::move(content.description);
    path = std::move(content.path);
    parent = std::move(content.parent);
    properties = std::move(content.properties);
}

}  // namespace IC
