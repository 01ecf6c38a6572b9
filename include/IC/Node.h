#pragma once

#include <iosfwd>
#include <map>
#include <string>

#include "IC/Error.h"
#include "IC/Property.h"
#include "ZQ/Mutex.h"
#include "ZQ/Types.h"

// The library's own build says what clang is to check (-Wthread-safety); for everybody else this is empty.
#ifndef IC_ANNOTATION
#define IC_ANNOTATION(attribute)
#endif

#pragma GCC visibility push(default)

/// The machine that a hardware-management agent manages, as nodes, values, errors and alerts.
namespace IC {

/// A managed object: one component of the machine, with a sensor type, a status, a description, its own path
/// and its parent's, and numbered properties.
///
/// The base class of the agent's node classes, which fill the protected members in their constructors. A node
/// is neither copied nor assigned. It may be shared between threads: status, description and properties are
/// read and changed under its lock, and what is read is a copy. Sensor type, path and parent are read without
/// the lock; they are taken as fixed once the node is built. No operation holds the locks of two nodes. The
/// lock is given back on every way out, also by an exception and where the thread is cancelled. One thread
/// destroys the node, when no other uses it any more. A child of fork() must not use a node that another
/// thread of its parent held.
///
/// What locks passes on what the lock throws, what writes a record what the platform throws there, what calls
/// an override what that throws; whatever makes or copies a value, a map or a text may throw std::bad_alloc.
/// Then nothing has changed. Comparisons and the readers of the sensor type throw nothing.
///
///     class Fan : public IC::Node {
///     public:
///         Fan() : Node(SENSOR_FAN)
///         {
///             path = "/chassis/fan1";
///             properties.insert({1u, IC::PropertyValue(IC::Number(3600u))});
///         }
///     };
class __attribute__((visibility("default"))) Node {
public:
    /// The display names are in `pst`.
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

    /// The codes are numbers without names. A node begins with STATUS_INITIAL; an Alert takes no status above
    /// STATUS_LARGEST.
    enum StatusType : ZQ::Uint32 { STATUS_INITIAL = 0, STATUS_LARGEST = 85 };

    /// A node of sensor type 0 with the description "UNKNOWN SENSOR NODE CREATED BY DEFAULT CONSTRUCTOR".
    Node();

    /// A node of the given sensor type with an empty description. A code above 73 is refused with
    /// NodeInvalidSensor: what is logged (category "Vexilon.IC.Node", level 6000), with the code, and below it
    /// what the exception says.
    ///
    ///     "Node: Sensor value out of range: "
    ///       "74 is not a valid sensor. The largest possible sensor is 73"
    explicit Node(unsigned int sensor);

    Node(const Node&) = delete;
    Node& operator=(const Node&) = delete;

    /// Empties the properties under the lock. The program ends (std::terminate) should the lock throw here.
    virtual ~Node();

    ///@{
    /// Read under the lock.
    virtual StatusType getStatus() const;
    virtual std::string getDescription() const;
    ///@}

    /// Copies the property into `value`, read-only mark included. Returns STATUS_SUCCESS, or
    /// STATUS_NO_SUCH_PROPERTY with `value` untouched, as it is where anything throws. Writes no record.
    virtual Error getProperty(unsigned int key, PropertyValue& value) const;

    /// A copy of all of them, made under the lock.
    virtual std::map<unsigned int, PropertyValue> getProperties() const;

    /// Replaces the property by a copy of `value`, its read-only mark included; the mark of the stored value
    /// alone decides whether that may be. Never adds a property.
    ///
    ///     returned                  logged under the lock, level 6000
    ///     STATUS_SUCCESS            nothing
    ///     STATUS_NO_SUCH_PROPERTY   "setProperty: 7 does not exist"
    ///     STATUS_READ_ONLY          "setProperty: 7 read-only"
    ///
    /// Whatever the outcome, the request is logged before the lock is taken: "setProperty: ", the key, a blank
    /// and the value, at level 3000. Every log record is followed by its trace record; the category is
    /// "Vexilon.IC.Node". Where anything throws, the property is as it was; the records before it stay.
    virtual Error setProperty(const unsigned int& key, const PropertyValue& value);

    /// "Node 6162 : 20, status = 0": the path in hexadecimal, the sensor code, the status as getStatus gives
    /// it, which is called under the lock. As a fresh std::ostringstream writes it under the global locale.
    virtual operator std::string() const;

    ///@{
    /// Fixed once the node is built, and read without the lock.
    SensorType getSensor() const noexcept { return sensor_; }
    operator SensorType() const noexcept { return sensor_; }
    std::string getPath() const { return path; }
    std::string getParent() const { return parent; }
    ///@}

    /// The status of this very object, under the lock, also where a derived class overrides getStatus.
    operator StatusType() const;

    /// Two lower-case hexadecimal digits for each byte, NUL bytes included. Without the lock.
    std::string hexstring(std::string bytes) const;

protected:
    ///@{
    /// Guards status, description and properties. Who holds it may call every operation: it is re-entrant.
    mutable ZQ::Mutex mutex;
    StatusType status IC_ANNOTATION(guarded_by(mutex)) = STATUS_INITIAL;  // see getStatus
    ///@}

private:
    friend bool operator==(const Node& a, const Node& b);
    friend bool operator<(const Node& a, const Node& b);

    SensorType sensor_ = SENSOR_UNKNOWN;

protected:
    std::string description IC_ANNOTATION(guarded_by(mutex));  ///< see getDescription
    std::map<unsigned int, PropertyValue> properties IC_ANNOTATION(guarded_by(mutex));  ///< by their numbers
    std::string path;    ///< what tells one node from another
    std::string parent;  ///< the path of the node that this one is part of
};

///@{
/// Compare the paths, byte by byte as unsigned values, and nothing else: nodes with the same path are equal.
/// Without any lock; nothing is thrown.
bool operator==(const Node& a, const Node& b);
bool operator!=(const Node& a, const Node& b);
bool operator<(const Node& a, const Node& b);
bool operator<=(const Node& a, const Node& b);
bool operator>(const Node& a, const Node& b);
bool operator>=(const Node& a, const Node& b);
///@}

/// Inserts the node's text, as its class writes it, as one text: width and fill apply to the whole of it.
/// Where the text throws, nothing is inserted.
std::ostream& operator<<(std::ostream& out, const Node& node);

}  // namespace IC

#pragma GCC visibility pop
