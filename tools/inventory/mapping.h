// What becomes of an object of hwloc (mapping.cpp) and of a fact about it (facts.cpp).
#pragma once

#include <memory>

#include "nodes.h"

namespace inventory {

// Which sensor type, name in paths and node class an object has.
struct Row {
    hwloc_obj_type_t type;
    int detail;           // a PCI class or its upper half, or a kind of device of the operating system
    const char* subtype;  // null: any
    IC::Node::SensorType sensor;
    const char* word;  // begins the name in paths
    std::unique_ptr<IC::Node> (*make)(const Site&);
};

// The row that fits the object, a part of the machine where one is asked for; null for what is no node.
const Row* findRow(hwloc_obj_t object, IC::Node::SensorType part = IC::Node::SENSOR_UNKNOWN);

struct Fact {
    Key key;  // KEY_OTHER_FACTS for a fact without a property of its own, or not written as expected
    IC::PropertyValue value;
    IC::Node::SensorType part;  // what a fact of the machine is about
};
Fact factOf(const hwloc_info_s& info);

}  // namespace inventory
