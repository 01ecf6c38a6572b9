#pragma once

#include <map>
#include <string>
#include <type_traits>

#include <nlohmann/json.hpp>

#include "IC/Alert.h"
#include "IC/EnumValue.h"
#include "IC/Error.h"
#include "IC/Node.h"
#include "IC/Number.h"
#include "IC/Property.h"
#include "IC/visit.h"

namespace IC {

namespace detail {

// What the library nlohmann/json calls for a class; in IC/detail/json-inl.h.
template <class Value>
struct JsonWriter {
    template <class Json>
    static void to_json(Json& json, const Value& value);
};
template <class Value>
struct JsonSerializer : JsonWriter<Value> {
    template <class Json>
    static Value from_json(const Json& json);
    template <class Json>
    static void from_json(const Json& json, Value& value);
};

struct StoredContent;

}  // namespace detail

// No source of the library can hold the type information of a class that needs nlohmann/json.
#pragma GCC diagnostic push
#if defined(__clang__)
#pragma GCC diagnostic ignored "-Wweak-vtables"
#endif

/// A node that was written as a document and read back, for programs that keep machines: sensor type, status,
/// description, path, parent and properties with their marks.
///
///     const nlohmann::json document = fan;       // any node
///     const IC::StoredNode stored(document);
///     bool same = stored == fan;                 // true: nodes compare by path
///
/// [The page about the form](docs/json.md) describes the document.
class StoredNode : public Node {
public:
    /// Throws nlohmann::json::type_error if the document is not that of a node.
    explicit inline StoredNode(const nlohmann::json& document);

private:
    explicit inline StoredNode(detail::StoredContent&& content);
};

#pragma GCC diagnostic pop

}  // namespace IC

namespace nlohmann {

///@{
/// Reads and writes values with the library nlohmann/json, version 3.11 or later, as JSON, CBOR or another of its
/// formats. [A page describes the form](docs/json.md). Every value comes back with the same kind, mark and content.
///
///     const nlohmann::json document = IC::PropertyValue("AFB0812", true);
///     std::cout << document;                     // {"kind":"string","readOnly":true,"value":"AFB0812"}
///     auto value = document.get<IC::PropertyValue>();
///
/// Reading throws nlohmann::json::type_error if the document does not have the form of the class. Its text names the
/// place as a JSON pointer: `at "/3/value/2": expected a string`. Otherwise reading and writing throw only
/// std::bad_alloc, or what ZQ::DateTime throws. Nothing is logged. If anything throws, the target is unchanged.
///
/// Optional: no other header includes this one. It needs nlohmann/json, which the library does not link.
template <>
struct adl_serializer<IC::Number> : IC::detail::JsonSerializer<IC::Number> {
};
template <>
struct adl_serializer<IC::EnumValue> : IC::detail::JsonSerializer<IC::EnumValue> {
};
template <>
struct adl_serializer<IC::PropertyValue> : IC::detail::JsonSerializer<IC::PropertyValue> {
};
template <>
struct adl_serializer<std::map<unsigned int, IC::PropertyValue>>
    : IC::detail::JsonSerializer<std::map<unsigned int, IC::PropertyValue>> {
};
template <>
struct adl_serializer<IC::Error> : IC::detail::JsonSerializer<IC::Error> {
};
template <>
struct adl_serializer<IC::Alert> : IC::detail::JsonSerializer<IC::Alert> {
};
///@}

/// Writes a node; a derived node gives the document of its base. IC::StoredNode reads it. Status, description and
/// properties are copied one after another by the getters of the node's class, whose exceptions propagate.
template <class T>
struct adl_serializer<T, std::enable_if_t<std::is_base_of_v<IC::Node, T>>>
    : IC::detail::JsonWriter<IC::Node> {
};

}  // namespace nlohmann

// The interface ends here.
#include "IC/detail/json-inl.h"
