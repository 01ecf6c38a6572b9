// Which node class describes an hwloc object (mapping.cpp), and which property holds a fact about it (facts.cpp).
#pragma once

#include <memory>

#include "nodes.h"

namespace inventory {

// The sensor type, the name in paths and the node class for one sort of object.
struct Row {
    hwloc_obj_type_t type;
    int detail;           // a PCI class or its upper byte, or hwloc's type of an operating system device
    const char* subtype;  // or the letters that begin a block device's name; null: any
    IC::Node::SensorType sensor;
    const char* word;  // begins the name in paths
    std::unique_ptr<IC::Node> (*make)(const Subject&);
};

// The row for the object or, if `part` is given, for that part of the machine; null if no node describes it.
const Row* findRow(hwloc_obj_t object, IC::Node::SensorType part = IC::Node::SENSOR_UNKNOWN);

// Whether an object of the operating system is only a driver's view of its PCI device, not a part of it such as a disk
// or a network interface.
bool isView(hwloc_obj_t object);

struct Fact {
    // KEY_OTHER_FACTS if the fact has no property of its own or cannot be parsed, KEY_NONE if it says nothing.
    Key key = KEY_NONE;
    IC::PropertyValue value {IC::PropertyValue::KIND_UNKNOWN};
    IC::Node::SensorType part = IC::Node::SENSOR_COMPUTER;  // the part of the machine that the fact is about
    bool ofProcessor = false;
};
Fact factOf(const hwloc_info_s& info);

}  // namespace inventory
