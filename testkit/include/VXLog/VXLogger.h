#pragma once

#include <string>

namespace VXLog {

// Stores every record for observe::records() and calls what observe::onRecord has set. Can be made to throw.
// Thread-safe.
class VXLogger {
public:
    // Writes a log record.
    static void logLevelMessage(const char* function, const char* file, int line, const std::string& logger,
                                int level, char* data, int a, int b, const std::string& message);

    // Writes a trace record.
    static void traceLevelMessage(const char* function, const char* file, int line, const std::string& logger,
                                  int level, char* data, int a, int b, const std::string& message);
};

}  // namespace VXLog
