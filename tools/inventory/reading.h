// Reads this machine, or the XML export of a machine, into nodes: with hwloc (reading.cpp) and libsensors
// (sensors.cpp).
#pragma once

#include <map>
#include <memory>
#include <stdexcept>
#include <string_view>

#include "nodes.h"

namespace inventory {

// Input that cannot be used; the text is for the user.
struct BadInput : std::runtime_error {
    using std::runtime_error::runtime_error;
};

// The nodes, each after its parent. Paths are unique, and the same machine always gets the same paths. In a
// name, each byte but letters, digits and -._: becomes % and two hexadecimal digits.
struct Inventory {
    std::vector<std::unique_ptr<IC::Node>> nodes;
    Site machine;

    // The site of a new node below `parent`. A name that is taken gets "#2" and so on.
    Site site(const Site& parent, IC::Node::SensorType sensor, std::string_view name);

private:
    std::map<std::string, unsigned int> taken_;
    std::map<IC::Node::SensorType, unsigned int> ids_;
};

Inventory readThisMachine();
Inventory readExport(const std::string& xml);   // throws BadInput
std::string readFile(const std::string& name);  // throws BadInput

void readSensors(Inventory& inventory);  // adds the sensors of this machine

}  // namespace inventory
