// Reads this machine, or the XML export of a machine, into nodes: with hwloc (reading.cpp), udev (memory.cpp) and
// libsensors (sensors.cpp). saving.h reads saved machines.
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

// The nodes, each after its parent. Paths are unique, and the same machine always gets the same paths. A node's path
// need not begin with its parent's: see the manual page about paths. In a name, each byte but letters, digits and
// -._: becomes % and two hexadecimal digits.
struct Inventory {
    std::vector<std::unique_ptr<IC::Node>> nodes;
    Site machine;
    bool isThisSystem = false;  // false too if the environment makes hwloc describe another machine
    bool hasSensors = false;    // whether they were read; no export has any

    // The site of a new node below `parent`, whose path lies below the path `place`, as a rule the parent's. A name of
    // more than 64 bytes is cut off, and a digest of it follows. A path that is taken gets "#2" and so on.
    Site site(const Site& parent, IC::Node::SensorType sensor, std::string_view name);
    Site site(const Site& parent, IC::Node::SensorType sensor, std::string_view name,
              const std::string& place, const std::string& mark = {});

private:
    std::map<std::string, unsigned int> taken_;
    std::map<IC::Node::SensorType, unsigned int> ids_;
};

// The name of a memory module in paths: by its place and, if that is not unique on a board, by its bank.
std::string moduleName(const std::string& location, const std::string& bank);

Inventory readThisMachine();
Inventory readTopology(hwloc_topology_t topology);
// Throws BadInput if hwloc cannot read the export, or if it takes more than 10 s or 2 GiB to describe it.
Inventory readExport(const std::string& xml);
extern const bool limitsMemory;  // not under a sanitizer, which reserves terabytes of addresses
std::string readFile(const std::string& name);  // throws BadInput

void readMemory(Inventory& inventory);   // adds what udev and the kernel know of the memory of this machine
void readSensors(Inventory& inventory);  // adds the sensors of this machine

}  // namespace inventory
