// What a status above 0 and what a change mean: alerts.
#pragma once

#include "IC/Alert.h"
#include "comparing.h"

namespace inventory {

enum AlertClass : unsigned char { CLASS_CONFIGURATION = 1, CLASS_ENVIRONMENT = 2 };

// What a status above 0 means.
struct Trouble {
    Status status;
    unsigned char severity;
    AlertClass alertClass;
    const char* words;
};
const Trouble* troubleOf(const IC::Node& node);  // null: none

// One for each node with a status above 0; what lies inside a node that may not be used is not told again.
std::vector<IC::Alert> alertsOf(const Nodes& nodes);

// One for each change.
std::vector<IC::Alert> alertsOf(const std::vector<Change>& changes);

}  // namespace inventory
