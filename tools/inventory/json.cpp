// The machine as JSON. inventory.schema.json describes the document.
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

Json jsonOf(unsigned int key, const IC::PropertyValue& value)
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
        return {{"code", value.operator unsigned int()},
                {"name", nameOfCode(key, value.operator unsigned int())}};
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
    const auto values = node.getProperties();
    Json properties = Json::object();
    properties.get_ref<Json::object_t&>().reserve(values.size());  // to grow, it would copy what it holds
    for (const auto& [key, value] : values) {
        const KeyInfo* info = infoOf(key);
        Json property {{"number", key}, {"caption", info == nullptr ? "" : info->caption}};
        if (info != nullptr && *info->unit != '\0')
            property["unit"] = info->unit;
        property["kind"] = kindName(value);
        property["readOnly"] = value.readOnly();
        property["value"] = jsonOf(key, value);
        properties[identifierOf(key)] = std::move(property);
    }
    return {{"path", jsonOf(node.getPath())},
            {"parent", jsonOf(node.getParent())},
            {"sensorType", static_cast<unsigned int>(node.getSensor())},
            {"sensorName", IC::pst[node.getSensor()]},
            {"status", static_cast<unsigned int>(node.getStatus())},
            {"description", jsonOf(node.getDescription())},
            {"properties", std::move(properties)}};
}

// In whole seconds.
std::string textOf(const ZQ::DateTime& time)
{
    return std::string(IC::Number(static_cast<long>(time), 0));
}

Json jsonOf(const IC::Alert& alert)
{
    return {{"time", textOf(alert.getTimeStamp())},
            {"severity", static_cast<unsigned int>(alert.getSeverity())},
            {"class", static_cast<unsigned int>(alert.getClass())},
            {"status", static_cast<unsigned int>(alert.getStatus())},
            {"paths", arrayOf(alert.getNodePaths())},
            {"message", jsonOf(alert.getMessage())}};
}

}  // namespace

void writeJson(std::ostream& out, const Nodes& nodes, const std::vector<IC::Alert>& alerts)
{
    Json all = Json::array();
    for (const auto& node : nodes)
        all.push_back(jsonOf(*node));
    Json raised = Json::array();
    for (const IC::Alert& alert : alerts)
        raised.push_back(jsonOf(alert));
    const Json document {{"format", "ic-inventory"},      {"version", 1},
                         {"host", jsonOf(hostOf(nodes))}, {"time", timeOf(nodes)},
                         {"nodes", std::move(all)},       {"alerts", std::move(raised)}};
    out << document.dump(2) << '\n';
}

void writeJsonLine(std::ostream& out, const IC::Alert& alert)
{
    out << jsonOf(alert).dump() << '\n';
}

}  // namespace inventory
