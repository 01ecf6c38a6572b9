// Reads a machine again and again, and tells what changed.
#pragma once

#include <functional>

#include "reading.h"
#include "writing.h"

namespace inventory {

// Writes an alert for each change, until SIGINT or SIGTERM ends the program with status 0. Returns only where
// nothing can be written any more; throws where the first reading fails. What a later one throws goes to standard
// error, once, and the next is compared with the last that succeeded.
void watch(const std::function<Inventory()>& read, double seconds, std::ostream& out, const Look& look);

}  // namespace inventory
