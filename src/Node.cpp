#include "IC/Node.h"

#include <utility>

#include "detail/Failure.h"
#include "detail/Text.h"

namespace IC_NODE {

[[gnu::init_priority(101)]] static const std::string loggerNode = "Vexilon.IC.Node";

}  // namespace IC_NODE

namespace IC {

namespace {

constexpr detail::Source here {"Node", IC_NODE::loggerNode};

// The text of the exception for a sensor code, composed after the records are written.
struct SensorRefusal {
    unsigned int sensor;

    operator std::string() const
    {
        return std::to_string(sensor) + " is not a valid sensor. The largest possible sensor is "
            + std::to_string(Node::SENSOR_LARGEST);
    }
};

// The number of an outcome that has none. Copying it costs less than constructing it.
[[gnu::init_priority(101)]] const Number nothing {Number::KIND_UNKNOWN};

Error outcome(Error::StatusType status)
{
    return {nothing, status};
}

}  // namespace

Node::Node() : description("UNKNOWN SENSOR NODE CREATED BY DEFAULT CONSTRUCTOR") { }

Node::Node(unsigned int sensor)
{
    if (sensor > SENSOR_LARGEST)
        detail::fail<NodeInvalidSensor>(here("Node"), SensorRefusal {sensor},
                                        "Node: Sensor value out of range: ", sensor);
    sensor_ = static_cast<SensorType>(sensor);
}

Node::~Node()
{
    const Lock lock(mutex);
    properties.clear();
}

Node::StatusType Node::getStatus() const
{
    const Lock lock(mutex);
    return status;
}

Node::operator StatusType() const
{
    const Lock lock(mutex);
    return status;
}

std::string Node::getDescription() const
{
    const Lock lock(mutex);
    return description;
}

Error Node::getProperty(unsigned int key, PropertyValue& value) const
{
    // The processor loads nothing else while it takes the lock of a node that its caches do not hold.
    __builtin_prefetch(&properties);
    const Lock lock(mutex);
    const auto found = properties.find(key);
    if (found == properties.end())
        return outcome(Error::STATUS_NO_SUCH_PROPERTY);
    value = found->second;
    return outcome(Error::STATUS_SUCCESS);
}

std::map<unsigned int, PropertyValue> Node::getProperties() const
{
    const Lock lock(mutex);
    return properties;
}

Error Node::setProperty(const unsigned int& key, const PropertyValue& value)
{
    detail::record(here("setProperty"), detail::informationLevel, "setProperty: ", key, ' ', value);
    const Lock lock(mutex);
    const auto found = properties.find(key);
    if (found == properties.end()) {
        detail::record(here("setProperty"), detail::failureLevel, "setProperty: ", key, " does not exist");
        return outcome(Error::STATUS_NO_SUCH_PROPERTY);
    }
    if (found->second.readOnly()) {
        detail::record(here("setProperty"), detail::failureLevel, "setProperty: ", key, " read-only");
        return outcome(Error::STATUS_READ_ONLY);
    }
    found->second = value;
    return outcome(Error::STATUS_SUCCESS);
}

std::string Node::hexstring(std::string bytes) const
{
    return detail::hexOf(bytes);
}

Node::operator std::string() const
{
    detail::Text text;
    text.add("Node ");
    text.add(hexstring(path));
    text.add(" : ");
    text.add(static_cast<unsigned int>(sensor_));
    StatusType current = STATUS_INITIAL;
    {
        const Lock lock(mutex);
        current = getStatus();
    }
    text.add(", status = ");
    text.add(static_cast<unsigned int>(current));
    return text.take();
}

bool operator==(const Node& a, const Node& b)
{
    return a.path == b.path;
}

bool operator!=(const Node& a, const Node& b)
{
    return !(a == b);
}

bool operator<(const Node& a, const Node& b)
{
    return a.path < b.path;
}

bool operator<=(const Node& a, const Node& b)
{
    return !(b < a);
}

bool operator>(const Node& a, const Node& b)
{
    return b < a;
}

bool operator>=(const Node& a, const Node& b)
{
    return !(a < b);
}

std::ostream& operator<<(std::ostream& out, const Node& node)
{
    // Through the string, because a derived class may override the conversion.
    return detail::insertText(out, node.operator std::string());
}

}  // namespace IC
