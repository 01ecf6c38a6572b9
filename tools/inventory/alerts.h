// Alerts about what is wrong, and about changes.
#pragma once

#include "IC/Alert.h"
#include "comparing.h"

namespace inventory {

enum AlertClass : unsigned char { CLASS_CONFIGURATION = 1, CLASS_ENVIRONMENT = 2 };

// Something that can be wrong with a node, a row of the table in alerts.cpp.
struct Trouble {
    unsigned char severity;
    AlertClass alertClass;
    enum Sign : unsigned char {
        IN_STATUS,  // the node's status is `number`
        FLAG_SET,   // the property `number` is true
        ABOVE,      // the reading is above the limit `number`
        BELOW,      // the reading is below the limit `number`
        NO_READING  // the property `number` is not a number
    } sign;
    unsigned int number;
    IC::Node::SensorType sensor;  // the only sensor type that the row is about, or SENSOR_UNKNOWN for all
    Status status;                // of a sensor whose worst trouble this is
    const char* words;
};
std::vector<Trouble> allTroubles();                            // the table
std::vector<const Trouble*> troublesOf(const IC::Node& node);  // in the order of the table, the worst first
const Trouble* troubleOf(const IC::Node& node);                // the worst, or null

// One for each trouble of each node. Of the parts that the system may not use, only CPUs, memory arrays and the machine
// get one.
std::vector<IC::Alert> alertsOf(const Nodes& nodes);

// One alert for each change.
std::vector<IC::Alert> alertsOf(const std::vector<Change>& changes);

}  // namespace inventory
