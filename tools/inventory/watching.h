// Reads a machine periodically and reports the changes.
#pragma once

#include <functional>

#include "reading.h"
#include "writing.h"

namespace inventory {

struct Watch {
    double seconds = 0;
    bool withReadings = false;  // also those that do not change what is wrong with a sensor
    bool asJson = false;        // one object a line
    Look look = {};
};

// Writes an alert for each change until SIGINT or SIGTERM ends the program with status 0. If standard output goes to
// the journal, each line is an alert and begins with its priority. Returns only if the output cannot be written, and
// throws BadInput if the first reading fails. If a later reading fails, its message goes to standard error, but not
// twice in a row, and the next reading is compared with the last successful one.
void watch(const std::function<Inventory()>& read, const Watch& settings, std::ostream& out);

}  // namespace inventory
