// Saved machines: the documents of IC/json.h for the nodes.
#include "saving.h"

#include <IC/json.h>

#include <algorithm>
#include <map>
#include <ostream>

#include "values.h"

namespace inventory {

namespace {

using Json = nlohmann::json;

constexpr const char* format = "ic-inventory-machine";
constexpr int formVersion = 1;

[[noreturn]] void refuse(const std::string& why)
{
    throw BadInput("not a saved machine: " + why);
}

// Refuses a document of many levels: each would need memory. That parse() has a callback for this purpose helps
// nothing, because each end of an array or an object then takes time for all the elements around it.
struct DepthCheck : nlohmann::json_sax<Json> {
    bool null() override { return true; }
    bool boolean(bool) override { return true; }
    bool number_integer(number_integer_t) override { return true; }
    bool number_unsigned(number_unsigned_t) override { return true; }
    bool number_float(number_float_t, const string_t&) override { return true; }
    bool string(string_t&) override { return true; }
    bool binary(binary_t&) override { return true; }
    bool key(string_t&) override { return true; }
    bool start_object(std::size_t) override { return descend(); }
    bool end_object() override { return ascend(); }
    bool start_array(std::size_t) override { return descend(); }
    bool end_array() override { return ascend(); }
    bool parse_error(std::size_t, const std::string&, const Json::exception&) override { return false; }

private:
    bool descend()
    {
        constexpr int deepest = 12;
        if (++depth_ > deepest)
            refuse("too many levels");
        return true;
    }
    bool ascend()
    {
        --depth_;
        return true;
    }

    int depth_ = 0;
};

// The kind in the document for a kind in the table of properties.
std::string kindInDocument(const std::string& kind)
{
    static const std::map<std::string, std::string> others {
        {"datetime", "dateTime"}, {"noderef", "nodeRef"},     {"bytes", "buffer"},
        {"enum", "enumValue"},    {"numbers", "numberArray"}, {"strings", "stringArray"}};
    const auto found = others.find(kind);
    return found == others.end() ? kind : found->second;
}

// Whether a member of the object has this text.
bool has(const Json& object, const char* member, const std::string& text)
{
    const auto found = object.find(member);
    return found != object.end() && found->is_string() && found->get_ref<const std::string&>() == text;
}

// A value that this program writes is of the kind that the table names. The document's form allows more: other kinds,
// and times that are no dates.
bool isUsual(const Json& value, const std::string& kind)
{
    if (!value.is_object() || value.contains("storage") || !value.contains("value"))
        return false;
    if (kind == "real" && (has(value, "kind", "nan") || has(value, "kind", "infinity")))
        return true;
    const Json& content = value["value"];
    if (!has(value, "kind", kindInDocument(kind)))
        return false;
    if (kind == "bool")
        return content.is_boolean();
    if (kind == "numbers")
        return content.is_array() && std::all_of(content.begin(), content.end(), [](const Json& element) {
                   return isUsual(element, "uint32") || isUsual(element, "uint64");
               });
    constexpr long long year10000 = 253402300800;
    return kind != "datetime"
        || (content.is_object() && content.value("milliseconds", 1) == 0
            && content.value("seconds", -1LL) >= 0 && content.value("seconds", -1LL) < year10000);
}

// Without the properties that a later version of this program has added.
std::unique_ptr<IC::Node> nodeOf(Json document)
{
    auto node = std::make_unique<IC::StoredNode>(document);
    bool isComplete = true;
    Json& properties = document["properties"];
    for (auto property = properties.begin(); property != properties.end();) {
        const KeyInfo* info = infoOf(count(property.key()).value_or(0));
        if (info == nullptr) {
            property = properties.erase(property);
            isComplete = false;
            continue;
        }
        if (!isUsual(*property, info->kind))
            refuse(std::string(info->identifier) + " of " + node->getPath() + " is no " + info->kind);
        ++property;
    }
    return isComplete ? std::move(node) : std::make_unique<IC::StoredNode>(document);
}

// How deep each node is, by its path.
using Depths = std::map<std::string, unsigned int>;

// The tree has one root, and each node comes after its parent.
void checkPlace(const IC::Node& node, Depths& depths)
{
    constexpr unsigned int deepest = 64;
    const std::string path = node.getPath();
    const std::string parent = node.getParent();
    if (path.size() < 2 || path.front() != '/' || path.back() == '/')
        refuse("'" + path + "' is no path");
    const auto above = depths.find(parent);
    if (parent.empty() ? !depths.empty() : above == depths.end())
        refuse("the parent of " + path + " is missing");
    const unsigned int depth = parent.empty() ? 0 : above->second + 1;
    if (depth > deepest)
        refuse(path + " is too deep");
    if (!depths.insert({path, depth}).second)
        refuse("two nodes have the path " + path);
    if (node.getStatus() > IC::Node::STATUS_LARGEST)
        refuse(path + " has no status");
}

}  // namespace

void writeSaved(std::ostream& out, const Inventory& inventory)
{
    Json nodes = Json::array();
    for (const auto& node : inventory.nodes)
        nodes.push_back(*node);
    out << Json {{"format", format},
                 {"version", formVersion},
                 {"sensors", inventory.hasSensors},
                 {"nodes", std::move(nodes)}}
               .dump()
        << '\n';
}

bool isSaved(const std::string& content)
{
    const auto first = content.find_first_not_of(" \t\r\n");
    return first != std::string::npos && content[first] == '{';
}

Inventory readSaved(const std::string& content)
{
    // No machine comes near; a larger document would need too much memory.
    constexpr std::size_t largest = 16 << 20;
    if (content.size() > largest)
        refuse("too large");
    Inventory inventory;
    try {
        DepthCheck check;
        Json::sax_parse(content, &check);
        Json document = Json::parse(content);
        if (!has(document, "format", format))
            refuse(std::string("its format is not ") + format);
        if (document.at("version") != formVersion)
            refuse("its version is not " + std::to_string(formVersion));
        inventory.hasSensors = document.at("sensors").get<bool>();
        Depths depths;
        for (Json& node : document.at("nodes").get_ref<Json::array_t&>()) {
            inventory.nodes.push_back(nodeOf(std::move(node)));
            checkPlace(*inventory.nodes.back(), depths);
        }
    } catch (const Json::exception& error) {
        refuse(error.what());
    }
    if (inventory.nodes.empty())
        refuse("it has no nodes");
    return inventory;
}

}  // namespace inventory
