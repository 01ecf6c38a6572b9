// What differs between two machines, or between two days of one.
#pragma once

#include <optional>
#include <string>

#include "nodes.h"

namespace inventory {

// One difference: a node, the status of one, or one of its properties.
struct Change {
    enum Subject : unsigned char { NODE, STATUS, PROPERTY };
    Subject subject;
    const IC::Node* node;             // as it is, or as it was where it is gone
    unsigned int key;                 // of the property
    std::optional<std::string> from;  // nothing: it came
    std::optional<std::string> to;    // nothing: it went
};

// Node by node, in the order of the nodes before, then what came. The time of reading is no difference.
std::vector<Change> changesBetween(const Nodes& before, const Nodes& after);

}  // namespace inventory
