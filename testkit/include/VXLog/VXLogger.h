#pragma once

#include <string>

namespace VXLog {

// Hands every record to observe/Platform.h.
class VXLogger {
public:
    static void logLevelMessage(const char* function, const char* file, int line, const std::string& logger,
                                int level, char* data, int a, int b, const std::string& message);
    static void traceLevelMessage(const char* function, const char* file, int line, const std::string& logger,
                                  int level, char* data, int a, int b, const std::string& message);
};

}  // namespace VXLog
