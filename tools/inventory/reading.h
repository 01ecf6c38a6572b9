// From hwloc (reading.cpp) and libsensors (sensors.cpp) to nodes: this machine, or a machine's XML export.
#pragma once

#include <map>
#include <memory>
#include <stdexcept>
#include <string_view>

#include "nodes.h"

namespace inventory {

// Input that cannot be used; the text is for whoever gave it.
struct BadInput : std::runtime_error {
    using std::runtime_error::runtime_error;
};

// The nodes, each after its parent. Paths are the same for the same machine, and each is there once. They are
// made of letters, digits and -._: between the slashes; any other byte of a name becomes % and two digits.
struct Inventory {
    std::vector<std::unique_ptr<IC::Node>> nodes;
    Site machine;

    // The site of a new node below `parent`; "#2" and so on follows a name that is taken.
    Site site(const Site& parent, IC::Node::SensorType sensor, std::string_view name);

private:
    std::map<std::string, unsigned int> taken_;
    std::map<IC::Node::SensorType, unsigned int> ids_;
};

Inventory readThisMachine();
Inventory readExport(const std::string& xml);   // throws BadInput
std::string readFile(const std::string& name);  // throws BadInput

void readSensors(Inventory& inventory);  // adds those of this machine

}  // namespace inventory
