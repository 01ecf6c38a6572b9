#pragma once

#include <ostream>
#include <string>

#include "VXLog/VXLogger.h"
#include "VXLog/VXMessageBuffer.h"

namespace benchmarks {

// Writes the log record and the trace record of a node's `setProperty`, as the library does. `compose` inserts the text
// into a message buffer and returns the stream; it is called for each record.
template <class Compose>
void writeRecords(int level, const Compose& compose)
{
    static const std::string logger = "Vexilon.IC.Node";
    VXLog::VXMessageBuffer buffer;
    VXLog::VXLogger::logLevelMessage("setProperty", "Node", __LINE__, logger, level, nullptr, 0, 0,
                                     buffer.str(compose(buffer)));
    VXLog::VXLogger::traceLevelMessage("setProperty", "Node", __LINE__, logger, level, nullptr, 0, 0,
                                       buffer.str(compose(buffer)));
}

}  // namespace benchmarks
