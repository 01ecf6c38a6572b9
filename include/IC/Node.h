#pragma once

#include <iosfwd>
#include <map>
#include <string>

#include "IC/Error.h"
#include "IC/ICException.h"
#include "IC/Property.h"
#include "IC/detail/Export.h"
#include "IC/detail/ThreadSafety.h"
#include "ZQ/Mutex.h"
#include "ZQ/Types.h"

/// Models a machine as nodes with typed, numbered properties. Error is the outcome of an operation, Alert an event.
namespace IC {

/// A managed object: one component of the machine, with a sensor type, a status, a description, its own path and its
/// parent's, and numbered properties. The base of the agent's node classes, which fill the protected members.
///
/// Threads may share a node: its re-entrant lock guards status, description and properties, and readers get copies.
/// Sensor type, paths and comparison use no lock: set paths in the constructor only. One thread destroys the node,
/// after its last use. A child of fork() must not use a node that another thread of its parent had locked. No
/// operation holds two nodes' locks. An exception or a cancelled thread releases the lock.
///
/// Refusals are [logged](docs/refusals.md), except in getProperty. Exceptions from the lock, the logger or an override
/// propagate unchanged (but not from the destructor). Copies and texts may throw std::bad_alloc. If anything throws,
/// nothing has changed.
///
///     class Fan : public IC::Node {
///     public:
///         Fan() : Node(SENSOR_FAN)
///         {
///             path = "/chassis/fan1";
///             properties.insert({1u, IC::PropertyValue(IC::Number(3600u))});
///         }
///     };
class IC_EXPORT Node {
public:
    /// What a node is. The table `pst` has the display names.
    enum SensorType : ZQ::Uint32 {
        SENSOR_UNKNOWN = 0,
        SENSOR_CHASSIS = 1,
        SENSOR_BIOS = 2,
        SENSOR_FIRMWARE = 3,
        SENSOR_CPU = 4,
        SENSOR_USB_CONTROLLER = 5,
        SENSOR_USB_PORT = 6,
        SENSOR_SERIAL_PORT = 7,
        SENSOR_PARALLEL_PORT = 8,
        SENSOR_VIDEO = 9,
        SENSOR_FLOPPY_DRIVE = 10,
        SENSOR_HARD_DRIVE = 11,
        SENSOR_NETWORK_PORT = 12,
        SENSOR_BMC = 13,
        SENSOR_TOLK = 14,
        SENSOR_SMBIOS = 15,
        SENSOR_VPD = 16,
        SENSOR_OS = 17,
        SENSOR_RAM = 18,
        SENSOR_DIMM = 19,
        SENSOR_FAN = 20,
        SENSOR_VOLTAGE_SENSOR = 21,
        SENSOR_TEMPERATURE_SENSOR = 22,
        SENSOR_INTRUSION = 23,
        SENSOR_PFA = 24,
        SENSOR_POWER_SUPPLY = 25,
        SENSOR_BLUE_LIGHT = 26,
        SENSOR_FRONT_PANEL = 27,
        SENSOR_BACK_PANEL = 28,
        SENSOR_NETWORK_IP_CONFIGURATION = 29,
        SENSOR_SYSTEM = 30,
        SENSOR_CACHE = 31,
        SENSOR_MEMORY_ARRAY = 32,
        SENSOR_MEMORY_DEVICE = 33,
        SENSOR_IPMI = 34,
        SENSOR_LOG = 35,
        SENSOR_GLIMTRACE = 36,
        SENSOR_SERVICE_PROCESSOR = 37,
        SENSOR_OS_HW = 38,
        SENSOR_OS_SW = 39,
        SENSOR_COMPUTER = 40,
        SENSOR_PLANAR = 41,
        SENSOR_CPU_CORE = 42,
        SENSOR_APPLICATION = 43,
        SENSOR_DRIVER = 44,
        SENSOR_PARTITION = 45,
        SENSOR_USER = 46,
        SENSOR_LOG_ENTRY = 47,
        SENSOR_PFA_SENSOR = 48,
        SENSOR_NETWORK_CONTROLLER = 49,
        SENSOR_DISK_CONTROLLER = 50,
        SENSOR_GROUP = 51,
        SENSOR_PELLION_ALERT_CONFIG = 52,
        SENSOR_DIAGNOSTICS = 53,
        SENSOR_SMBIOS_DATA = 54,
        SENSOR_SMBIOS_TABLE = 55,
        SENSOR_NETWORK_TEAMING = 56,
        SENSOR_SCALABLE_PARTITION = 57,
        SENSOR_SCALABLE_SYSTEM = 58,
        SENSOR_ROOT = 59,
        SENSOR_MODULAR_CHASSIS = 60,
        SENSOR_SLOT_GROUP = 61,
        SENSOR_SLOT = 62,
        SENSOR_CMM = 63,
        SENSOR_IO_MODULE = 64,
        SENSOR_COOLING_DOMAIN = 65,
        SENSOR_POWER_DOMAIN = 66,
        SENSOR_CHASSIS_MID_PLANE_CARD = 67,
        SENSOR_MODULAR_GROUP = 68,
        SENSOR_ALERT_INDICATION = 69,
        SENSOR_CONNECTOR = 70,
        SENSOR_BMC_USER = 71,
        SENSOR_DRIVE_SLOT_SENSOR = 72,
        SENSOR_LAN_END_POINT = 73,
        SENSOR_LARGEST = SENSOR_LAN_END_POINT
    };

    /// The codes 1 to 84 have no names. A node begins with STATUS_INITIAL; an Alert takes no status above
    /// STATUS_LARGEST.
    enum StatusType : ZQ::Uint32 { STATUS_INITIAL = 0, STATUS_LARGEST = 85 };

    /// @name Construction
    ///@{

    /// A node of sensor type 0 with the description "UNKNOWN SENSOR NODE CREATED BY DEFAULT CONSTRUCTOR".
    Node();

    /// A node of this sensor type with an empty description. Throws NodeInvalidSensor for a code above 73.
    explicit Node(unsigned int sensor);

    /// Neither copied nor assigned.
    Node(const Node&) = delete;
    Node& operator=(const Node&) = delete;

    /// Empties the properties under the lock. Calls std::terminate if the lock throws.
    virtual ~Node();

    ///@}
    /// @name Status and description
    ///@{

    /// A copy, made under the lock.
    virtual StatusType getStatus() const;
    virtual std::string getDescription() const;

    /// The member `status`, also if a derived class overrides getStatus.
    operator StatusType() const;

    ///@}
    /// @name Properties
    ///@{

    /// Copies the property and its read-only mark into `value`. Returns STATUS_SUCCESS, or STATUS_NO_SUCH_PROPERTY
    /// and leaves `value` as it was. Logs nothing.
    virtual Error getProperty(unsigned int key, PropertyValue& value) const;

    /// A copy of all of them as they are at one moment.
    virtual std::map<unsigned int, PropertyValue> getProperties() const;

    /// Replaces the property and its mark; never adds one. Returns STATUS_SUCCESS, STATUS_NO_SUCH_PROPERTY, or
    /// STATUS_READ_ONLY if the stored value is read-only. Logs the request before it takes the lock, and a refusal
    /// under it. If anything throws, the property is as it was; records already written stay.
    virtual Error setProperty(const unsigned int& key, const PropertyValue& value);

    ///@}
    /// @name Identity
    /// Fixed after construction, and read without the lock.
    ///@{

    /// The sensor type, under two names.
    SensorType getSensor() const noexcept { return sensor_; }
    operator SensorType() const noexcept { return sensor_; }

    /// Deleted: in C++20 `NodeRef x(node);` would not have the number of the node.
    explicit operator sNodeRef() const = delete;

    /// The node's own path, and its parent's.
    std::string getPath() const { return path; }
    std::string getParent() const { return parent; }

    ///@}
    /// @name Text
    ///@{

    /// "Node 6162 : 20, status = 0": the path in hexadecimal, the sensor code, and the result of getStatus, called
    /// under the lock. As a fresh std::ostringstream writes it under the global locale.
    virtual operator std::string() const;

    /// Two lower-case hexadecimal digits for each byte, NUL bytes included. Takes no lock.
    std::string hexstring(std::string bytes) const;

    ///@}

protected:
    /// Holds the node's lock: `const Lock lock(mutex);`. Re-entrant; see IC/detail/Lock.h.
    class Lock;

    /// Guards status, description and properties; take it with Lock.
    mutable ZQ::Mutex mutex;
    IC_GUARDED StatusType status = STATUS_INITIAL;  ///< see getStatus

private:
    friend bool operator==(const Node& a, const Node& b);
    friend bool operator<(const Node& a, const Node& b);

    SensorType sensor_ = SENSOR_UNKNOWN;

protected:
    IC_GUARDED std::string description;                           ///< see getDescription
    IC_GUARDED std::map<unsigned int, PropertyValue> properties;  ///< by number
    std::string path;                                             ///< identifies the node
    std::string parent;  ///< the path of the node that contains this one
};

/// @name Comparison
/// @relates Node
///@{

/// By path alone, byte by byte as unsigned values: nodes with the same path are equal. Without a lock; nothing is
/// thrown.
IC_EXPORT bool operator==(const Node& a, const Node& b);
IC_EXPORT bool operator!=(const Node& a, const Node& b);
IC_EXPORT bool operator<(const Node& a, const Node& b);
IC_EXPORT bool operator<=(const Node& a, const Node& b);
IC_EXPORT bool operator>(const Node& a, const Node& b);
IC_EXPORT bool operator>=(const Node& a, const Node& b);

///@}

/// @relates Node
/// Inserts the text that the node's own class returns, as one text: width and fill apply to the whole. If the
/// conversion throws, nothing is inserted.
IC_EXPORT std::ostream& operator<<(std::ostream& out, const Node& node);

}  // namespace IC

// The interface ends here.
#include "IC/detail/Lock.h"
