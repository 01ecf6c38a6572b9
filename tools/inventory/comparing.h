// The differences between two machines, or between two readings of one machine.
#pragma once

#include <optional>
#include <string>

#include "nodes.h"

namespace inventory {

// One difference: a node, the status of one, or one of its properties.
struct Change {
    enum Subject : unsigned char { NODE, STATUS, PROPERTY };
    Subject subject;
    const IC::Node* node;             // the later one; the earlier one if it is gone
    const IC::Node* before;           // the earlier one; null if it is new
    unsigned int key;                 // of the property
    std::optional<std::string> from;  // nothing if it is new
    std::optional<std::string> to;    // nothing if it is gone
};

// In the order of the earlier nodes; new nodes come last. What only tells how the machine was read is not compared: the
// time, the program, its control group, the version of hwloc. A cache or a group whose name has changed with its lowest
// core is found by its threads. Another parent is no change if the former one is gone or the present one is new.
std::vector<Change> changesBetween(const Nodes& before, const Nodes& after);

// Without the readings of sensors that do not change what is wrong with the sensor.
std::vector<Change> withoutMereReadings(std::vector<Change> changes);

// Without what does not come from hwloc alone: the sensors, the memory modules and what the machine knows of them.
std::vector<Change> withoutOtherSources(std::vector<Change> changes);

}  // namespace inventory
