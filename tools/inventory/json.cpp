// The nodes as JSON.
#include <cmath>
#include <nlohmann/json.hpp>
#include <ostream>

#include "values.h"
#include "writing.h"

namespace inventory {

namespace {

using Json = nlohmann::ordered_json;

// A JSON string if the text is UTF-8; otherwise {"hex": "fffe"}, which keeps every byte. U+FFFD in place of invalid
// bytes would make different texts equal.
Json jsonOf(const std::string& text)
{
    try {
        Json string = text;
        static_cast<void>(string.dump());
        return string;
    } catch (const Json::type_error&) {
        std::string digits;
        for (const char byte : text)
            digits += IC::pB(static_cast<unsigned char>(byte));
        return {{"hex", digits}};
    }
}

// Numbers that JSON cannot express become their texts, or null if the kind says everything.
Json jsonOf(const IC::Number& number)
{
    switch (number.getKind()) {
    case IC::Number::KIND_BOOL:
        return number.operator bool();
    case IC::Number::KIND_INT:
        return number.operator int();
    case IC::Number::KIND_UINT32:
        return number.operator unsigned int();
    case IC::Number::KIND_UINT64:
        return number.operator unsigned long long();
    case IC::Number::KIND_REAL: {
        const double real = number;
        return std::isfinite(real) ? Json(real) : Json(exactText(number));
    }
    case IC::Number::KIND_VERSION:
    case IC::Number::KIND_DATETIME:
        return std::string(number);
    case IC::Number::KIND_NODEREF: {
        const IC::NodeRef reference = number;
        return {{"sensorType", reference.type}, {"id", reference.id}};
    }
    default:
        return nullptr;
    }
}

template <class Elements>
Json arrayOf(const Elements& elements)
{
    Json array = Json::array();
    for (const auto& element : elements)
        array.push_back(jsonOf(element));
    return array;
}

Json jsonOf(const IC::PropertyValue& value)
{
    switch (value.getKind()) {
    case IC::PropertyValue::KIND_NUMBER:
        return jsonOf(IC::Number(value));
    case IC::PropertyValue::KIND_STRING:
        return jsonOf(std::string(value));
    case IC::PropertyValue::KIND_BUFFER: {
        std::string digits;
        for (const unsigned char byte : value.operator IC::Buffer())
            digits += IC::pB(byte);
        return digits;
    }
    case IC::PropertyValue::KIND_ENUMVALUE:
        return value.operator unsigned int();
    case IC::PropertyValue::KIND_NUMBERARRAY:
        return arrayOf(value.operator IC::NumberArray());
    case IC::PropertyValue::KIND_STRINGARRAY:
        return arrayOf(value.operator IC::StringArray());
    default:
        return nullptr;
    }
}

Json jsonOf(const IC::Node& node)
{
    Json properties = Json::array();
    for (const auto& [key, value] : node.getProperties())
        properties.push_back({{"number", key},
                              {"name", nameOf(key)},
                              {"kind", kindName(value)},
                              {"readOnly", value.readOnly()},
                              {"value", jsonOf(value)}});
    return {{"path", jsonOf(node.getPath())},
            {"parent", jsonOf(node.getParent())},
            {"sensorType", static_cast<unsigned int>(node.getSensor())},
            {"sensorName", IC::pst[node.getSensor()]},
            {"status", static_cast<unsigned int>(node.getStatus())},
            {"description", jsonOf(node.getDescription())},
            {"properties", properties}};
}

}  // namespace

void writeJson(std::ostream& out, const Nodes& nodes)
{
    Json all = Json::array();
    for (const auto& node : nodes)
        all.push_back(jsonOf(*node));
    out << Json {{"nodes", all}}.dump(2) << '\n';
}

}  // namespace inventory
