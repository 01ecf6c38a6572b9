// The node classes of the inventory, the numbers of their properties and what their status means.
#pragma once

#include <hwloc.h>

#include <cstring>
#include <map>
#include <memory>
#include <string>
#include <type_traits>
#include <vector>

#include "IC/Node.h"

namespace inventory {

using Nodes = std::vector<std::unique_ptr<IC::Node>>;

// The numbers of the properties, from 1. A number never changes its meaning: a new property is appended. The table of
// the properties, in nodes.cpp, says what each holds.
enum Key : unsigned int {
    KEY_NONE = 0,
    KEY_SELF = 1,
    KEY_PARENT,
    KEY_NAME,
    KEY_LABEL,
    KEY_INDEX,
    KEY_USABLE,
    KEY_SUBTYPE,
    KEY_OTHER_FACTS,
    KEY_READ_AT,
    KEY_SOURCE_VERSION,
    KEY_MAKER,
    KEY_MODEL,
    KEY_REVISION,
    KEY_VERSION,
    KEY_RELEASED,
    KEY_SERIAL_NUMBER,
    KEY_ASSET_TAG,
    KEY_PART_NUMBER,
    KEY_UUID,
    KEY_LOCATION,
    KEY_CHASSIS_TYPE,
    KEY_CPUS,
    KEY_CORES,
    KEY_THREADS,
    KEY_CPU_SET,
    KEY_FREQUENCY,
    KEY_CAPACITY,
    KEY_SIZE,
    KEY_LEVEL,
    KEY_CACHE_KIND,
    KEY_LINE_SIZE,
    KEY_WAYS,
    KEY_INCLUSIVE,
    KEY_PAGE_SIZES,
    KEY_PAGE_COUNTS,
    KEY_PCI_ADDRESS,
    KEY_PCI_CLASS,
    KEY_PCI_DEVICE,
    KEY_LINK_SPEED,
    KEY_SECTOR_SIZE,
    KEY_DEVICE_NUMBER,
    KEY_ADDRESS,
    KEY_PORT,
    KEY_PORT_STATE,
    KEY_PORT_LID,
    KEY_PORT_GID,
    KEY_NODE_GUID,
    KEY_READING,
    KEY_UNIT,
    KEY_LOWER_LIMIT,
    KEY_LOWER_CRITICAL,
    KEY_UPPER_LIMIT,
    KEY_UPPER_CRITICAL,
    KEY_ALARM,
    KEY_FAULT,
    KEY_CHIP,
    KEY_HOST_NAME,
    KEY_VIEWS,
    KEY_UNUSABLE_THREADS,
    KEY_UNUSABLE_CORES,
    KEY_UNUSABLE_CPUS,
    KEY_UNUSABLE_MEMORY_ARRAYS,
    KEY_CPU_MAKER,
    KEY_CPU_MODEL,
    KEY_AVERAGE,
    KEY_LOWEST,
    KEY_HIGHEST,
    KEY_AVERAGE_LOWEST,
    KEY_AVERAGE_HIGHEST,
    KEY_AVERAGE_INTERVAL,
    KEY_EMERGENCY_LIMIT,
    KEY_CAP,
    KEY_RATED_MINIMUM,
    KEY_RATED_MAXIMUM,
    KEY_LOWER_LIMIT_HYSTERESIS,
    KEY_LOWER_CRITICAL_HYSTERESIS,
    KEY_UPPER_LIMIT_HYSTERESIS,
    KEY_UPPER_CRITICAL_HYSTERESIS,
    KEY_EMERGENCY_HYSTERESIS,
    KEY_CAP_HYSTERESIS,
    KEY_MIN_ALARM,
    KEY_LCRIT_ALARM,
    KEY_MAX_ALARM,
    KEY_CRIT_ALARM,
    KEY_EMERGENCY_ALARM,
    KEY_CAP_ALARM,
    KEY_BEEP,
    KEY_OFFSET,
    KEY_SENSOR_KIND,
    KEY_FAN_DIVISOR,
    KEY_FAN_PULSES,
    KEY_BANK,
    KEY_MEMORY_TYPE,
    KEY_MEMORY_DETAIL,
    KEY_FORM_FACTOR,
    KEY_SPEED,
    KEY_CONFIGURED_SPEED,
    KEY_RANK,
    KEY_DATA_WIDTH,
    KEY_TOTAL_WIDTH,
    KEY_CONFIGURED_VOLTAGE,
    KEY_SYSTEM_MEMORY,
    KEY_MEMORY_SLOTS,
    KEY_ERROR_CORRECTION,
    KEY_END,  // behind the last number
    KEY_LAST = KEY_END - 1
};

// The status of a node; above 0 something is wrong.
// clang-format off
enum Status : unsigned int {
    STATUS_FINE, STATUS_NOT_USABLE, STATUS_PARTLY_USABLE, STATUS_SIZE_UNKNOWN, STATUS_OUTSIDE_LIMITS,
    STATUS_ALARM, STATUS_FAULT, STATUS_UNREAD
};
// clang-format on

// What is the same for each property with this number.
struct KeyInfo {
    Key key;
    const char* identifier;  // in JSON: ^[a-z][A-Za-z0-9]*$
    const char*
        kind;  // what kindName() says of its values; a value of the kind "real" may also be NaN or infinite
    const char* caption;
    const char* unit;  // of the number that the property holds, "" if there is none
};
// Null if no property has this number.
const KeyInfo* infoOf(unsigned int key);
// The caption and, if there is one, the unit: "size in bytes". "" if no property has this number.
std::string nameOf(unsigned int key);

// In JSON: "cacheKind"; "property99" if no property has this number.
std::string identifierOf(unsigned int key);
// The name of a code that a property holds: "data" for the cache kind 1. "" if the code has none.
std::string nameOfCode(unsigned int key, unsigned int code);

// What the nodes know of the machine: the name of its host and when it was read, "" if they do not know.
std::string hostOf(const Nodes& nodes);
std::string timeOf(const Nodes& nodes);

// The data from which a node is built.
struct Site {
    IC::Node::SensorType sensor = IC::Node::SENSOR_UNKNOWN;
    std::string path;
    std::string parent;
    IC::NodeRef self {};  // the references to this node and to its parent
    IC::NodeRef above {};
};

// A site of which hwloc knows more. Valid while the topology is loaded.
struct Subject : Site {
    hwloc_topology_t topology = nullptr;
    hwloc_obj_t object = nullptr;
    std::vector<hwloc_obj_t>
        views;  // the operating system's devices that are this device, seen by its drivers
};

// The properties that all nodes have, and those that hwloc gives for any object: name, number, threads, whether
// the system may use it, facts.
class Component : public IC::Node {
public:
    using Facts = std::map<unsigned int, IC::PropertyValue>;

    explicit Component(const Site& site);
    explicit Component(const Subject& subject);

protected:
    template <class T>
    void put(Key key, const T& value, bool readOnly = true)
    {
        // PropertyValue would take a bare number as the code of a kind.
        static_assert(!std::is_arithmetic_v<T> && !std::is_enum_v<T>, "write IC::Number or IC::EnumValue");
        properties.insert_or_assign(key, IC::PropertyValue(value, readOnly));
    }
    void become(Status newStatus) { status = static_cast<StatusType>(newStatus); }
    void addFacts(const hwloc_info_s* facts, unsigned int number, bool ofMachine = false);
    void addFacts(hwloc_obj_t object, bool ofMachine = false);
    // Sets the description: the pieces, without empty ones, separated by commas.
    void describe(const std::vector<std::string>& pieces);

    std::string words(Key key) const;  // the property's text, "" if there is none
    std::string product() const;       // maker and model
    std::string size() const;

private:
    void addOther(const std::string& fact);
    void addViews(const Subject& subject);
    void addThreads(const Subject& subject);
};

class Machine : public Component {
public:
    explicit Machine(const Subject& subject);
    void learn(const Facts& facts);  // adds what another source than hwloc knows

private:
    void conclude();
};

class MemoryModule : public Component {
public:
    explicit MemoryModule(const Subject& subject);
    MemoryModule(const Site& site, const Facts& facts);
    // True if the facts say, without the size, that there is a module and not only a slot.
    static bool isModule(const Facts& facts);
    // Adds what another source than hwloc knows. If it knows that the slot is empty, nothing is wrong with the slot.
    void learn(const Facts& facts, bool isPresent);

private:
    void conclude(bool isPresent);
};

// clang-format off
struct MachinePart : Component { explicit MachinePart(const Subject& subject); };  // chassis, planar, BIOS, system
struct Processor : Component { explicit Processor(const Subject& subject); };      // also a die, a group of cores
struct Core : Component { explicit Core(const Subject& subject); };
struct Cache : Component { explicit Cache(const Subject& subject); };
struct MemoryArray : Component { explicit MemoryArray(const Subject& subject); };
struct PciDevice : Component { explicit PciDevice(const Subject& subject); };
struct Slot : Component { Slot(const Site& site, const std::string& name); };
struct Device : Component { explicit Device(const Subject& subject); };  // a device of the operating system
// clang-format on

std::string pciAddress(hwloc_obj_t object);  // "0000:02:00.0"

// The code of an hwloc enumerator. hwloc stores any number that an export holds; to read a number outside the
// enumeration's range as the enumeration is undefined behaviour.
template <class Enumeration>
unsigned int codeOf(const Enumeration& value)
{
    unsigned int code = 0;
    static_assert(sizeof code == sizeof value);
    std::memcpy(&code, &value, sizeof code);
    return code;
}

}  // namespace inventory
