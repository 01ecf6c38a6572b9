// Alerts about nodes with a status above 0, and about changes.
#pragma once

#include "IC/Alert.h"
#include "comparing.h"

namespace inventory {

enum AlertClass : unsigned char { CLASS_CONFIGURATION = 1, CLASS_ENVIRONMENT = 2 };

// The meaning of a status above 0.
struct Trouble {
    Status status;
    unsigned char severity;
    AlertClass alertClass;
    const char* words;
};
const Trouble* troubleOf(const IC::Node& node);  // null for status 0

// One for each node with a status above 0. A node that the system may not use gets none if the same holds for its
// parent.
std::vector<IC::Alert> alertsOf(const Nodes& nodes);

// One alert for each change.
std::vector<IC::Alert> alertsOf(const std::vector<Change>& changes);

}  // namespace inventory
