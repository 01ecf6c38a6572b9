#pragma once

#include <string>

#pragma GCC visibility push(default)

namespace VXLog {

// Writes records: each call passes one to the current sink (RecordSink.h) on the calling thread.
//
// Thread-safe. A child of fork() may write records too, whatever the other threads of its parent were doing, if the
// global locale is the classic one. Under another global locale, composing a record may ask for that locale, and the
// child may wait for ever for the standard library's lock if another thread was asking for it at the time of the fork.
// If the sink throws, the exception propagates to the caller.
class __attribute__((visibility("default"))) VXLogger {
public:
    // Writes a log record. `function`, `file` and `line` name the place in the source; `logger` is the category and
    // `message` the text. The sink receives `data`, `a` and `b` unchanged.
    static void logLevelMessage(const char* function, const char* file, int line, const std::string& logger,
                                int level, char* data, int a, int b, const std::string& message);

    // Writes a trace record, with the same arguments.
    static void traceLevelMessage(const char* function, const char* file, int line, const std::string& logger,
                                  int level, char* data, int a, int b, const std::string& message);
};

}  // namespace VXLog

#pragma GCC visibility pop
