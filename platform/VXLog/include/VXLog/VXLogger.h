#pragma once

#include <string>

#pragma GCC visibility push(default)

namespace VXLog {

// Writes records: each call hands one to the current sink (RecordSink.h), on the calling thread. Any thread
// may call at any time, and so may a child of fork(), whatever the other threads of its parent were doing.
// What the sink throws reaches the caller.
class __attribute__((visibility("default"))) VXLogger {
public:
    // `function` and `file` name the place in the source together with `line`; `logger` is the category.
    // `data`, `a` and `b` are handed on untouched.
    static void logLevelMessage(const char* function, const char* file, int line, const std::string& logger,
                                int level, char* data, int a, int b, const std::string& message);

    // The same for a trace record.
    static void traceLevelMessage(const char* function, const char* file, int line, const std::string& logger,
                                  int level, char* data, int a, int b, const std::string& message);
};

}  // namespace VXLog

#pragma GCC visibility pop
