// Keeps a machine with its sensors in a file, and reads it back.
#pragma once

#include <iosfwd>
#include <string>

#include "reading.h"

namespace inventory {

void writeSaved(std::ostream& out, const Inventory& inventory);

bool isSaved(const std::string& content);         // rather than an export of hwloc
Inventory readSaved(const std::string& content);  // throws BadInput

}  // namespace inventory
