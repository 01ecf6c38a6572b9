#pragma once

#include <cstdio>
#include <map>
#include <memory>
#include <sstream>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include "IC/Alert.h"
#include "IC/EnumValue.h"
#include "IC/Error.h"
#include "IC/ICException.h"
#include "IC/Node.h"
#include "IC/Number.h"
#include "IC/Property.h"
#include "ZQ/DateTime.h"
#include "support/PropertySamples.h"

// A node with a value in every member, and all members public.
class SampleNode : public IC::Node {
public:
    explicit SampleNode(const IC::PropertyValue& first,
                        const std::string& itsPath = "/a/path/with/memory/of/its/own")
        : Node(SENSOR_FAN)
    {
        status = STATUS_LARGEST;
        description = "a description that needs memory of its own";
        properties.insert({1u, first});
        properties.insert({2u, IC::PropertyValue("a read-only text that needs memory of its own", true)});
        path = itsPath;
        parent = "/the/path/of/the/node/above";
    }

    using Node::description;
    using Node::mutex;
    using Node::parent;
    using Node::path;
    using Node::properties;
    using Node::status;
};

// Subjects of operations.
struct Nothing { };
struct NodeAndValue {
    SampleNode node;
    IC::PropertyValue value;
};
struct TwoNodes {
    SampleNode a;
    SampleNode b;
};

// shown: everything that can be observed of a value, as text.
template <class T, std::enable_if_t<std::is_arithmetic_v<T> || std::is_enum_v<T>, int> = 0>
std::string shown(T value)
{
    if constexpr (std::is_same_v<T, bool>) {
        return value ? "true" : "false";
    } else if constexpr (std::is_floating_point_v<T>) {
        char digits[40];
        std::snprintf(digits, sizeof digits, "%.17g", value);
        return digits;
    } else if constexpr (std::is_enum_v<T>) {
        return std::to_string(+static_cast<std::underlying_type_t<T>>(value));
    } else {
        return std::to_string(value);
    }
}

inline std::string shown(const Nothing&)
{
    return "nothing";
}

inline std::string shown(const std::string& text)
{
    return '"' + text + '"';
}

inline std::string shown(const char* text)
{
    return text;
}

inline std::string shown(const ZQ::DateTime& time)
{
    std::ostringstream out;
    out << time;
    return out.str();
}

inline std::string shown(const IC::Version2& version)
{
    return std::to_string(version.major) + '.' + std::to_string(version.minor);
}

inline std::string shown(const IC::NodeRef& node)
{
    return std::to_string(node.type) + ':' + std::to_string(node.id);
}

inline std::string shown(const IC::Number& number)
{
    std::string text = std::to_string(number.getKind()) + ": " + number.operator std::string();
    if (number.getKind() == IC::Number::KIND_REAL)
        text += " = " + shown(number.operator double());
    try {
        if (number.getKind() == IC::Number::KIND_DATETIME)
            text += " = " + shown(number.operator ZQ::DateTime());
    } catch (const std::out_of_range&) {
        text += " of another scope";
    }
    return text;
}

inline std::string shown(const IC::EnumValue& value)
{
    return "enumerated " + value.operator std::string();
}

inline std::string shown(const IC::PropertyValue& value)
{
    return seen(value);
}

inline std::string shown(const std::map<unsigned int, IC::PropertyValue>& properties)
{
    return seen(properties);
}

template <class T>
std::string shown(const std::vector<T>& elements)
{
    std::string text = "[ ";
    for (const T& element : elements)
        text += shown(element) + ' ';
    return text + ']';
}

inline std::string shown(const IC::Error& error)
{
    return shown(error.getStatus()) + " with " + shown(error.getValue()) + " and "
        + shown(error.getMessage());
}

inline std::string shown(const IC::Alert& alert)
{
    return alert.operator std::string();
}

inline std::string shown(const SampleNode& node)
{
    return shown(node.getSensor()) + ' ' + shown(node.status) + ' ' + shown(node.description) + ' '
        + shown(node.properties) + ' ' + shown(node.path) + ' ' + shown(node.parent);
}

inline std::string shown(const IC::Node& node)
{
    return shown(node.getSensor()) + ' ' + shown(node.getStatus()) + ' ' + shown(node.getDescription()) + ' '
        + shown(node.getProperties()) + ' ' + shown(node.getPath()) + ' ' + shown(node.getParent());
}

inline std::string shown(const NodeAndValue& both)
{
    return shown(both.node) + " and " + shown(both.value);
}

inline std::string shown(const TwoNodes& two)
{
    return shown(two.a) + " and " + shown(two.b);
}

inline std::string shown(const IC::ICException& exception)
{
    return shown(exception.what());
}

inline std::string shown(const IC::PropertyValueInvalidKind& exception)
{
    return shown(exception.what());
}

inline std::string shown(const IC::NodeInvalidSensor& exception)
{
    return shown(exception.what());
}

template <class First, class Second>
std::string shown(const std::pair<First, Second>& two)
{
    return shown(two.first) + " and " + shown(two.second);
}

template <class T>
std::string shown(const std::unique_ptr<T>& object)
{
    return shown(*object);
}

// The mutex of the node in a subject, or null if it has none.
template <class Subject>
ZQ::Mutex* mutexOf(Subject&)
{
    return nullptr;
}

inline ZQ::Mutex* mutexOf(SampleNode& node)
{
    return &node.mutex;
}

inline ZQ::Mutex* mutexOf(NodeAndValue& both)
{
    return &both.node.mutex;
}
