// Reads a machine periodically and reports the changes.
#pragma once

#include <functional>

#include "reading.h"
#include "writing.h"

namespace inventory {

// Writes an alert for each change until SIGINT or SIGTERM ends the program with status 0. Returns only if the output
// cannot be written, and throws BadInput if the first reading fails. If a later reading fails, its message goes to
// standard error, but not twice in a row, and the next reading is compared with the last successful one.
void watch(const std::function<Inventory()>& read, double seconds, std::ostream& out, const Look& look);

}  // namespace inventory
