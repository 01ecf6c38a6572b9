#pragma once

#include <functional>
#include <string>

#pragma GCC visibility push(default)

namespace VXLog {

// One record as a sink receives it: which logging call was made, and its nine arguments.
//
// It refers to the caller's texts and is valid only during the call of the sink. It cannot be copied: a sink
// copies the texts that it keeps.
struct Record {
    enum class Kind { log, trace };

    Kind kind;
    const char* function;
    const char* file;
    int line;
    const std::string& logger;  // the category
    int level;
    char* data;
    int a;
    int b;
    const std::string& message;

    // Makes a record uncopyable without declaring a constructor: a record stays an aggregate.
    struct NotCopied {
        NotCopied() = default;
        NotCopied(const NotCopied&) = delete;
        NotCopied& operator=(const NotCopied&) = delete;
    };
    NotCopied notCopied = NotCopied();
};

// The lowest level of the records that report a failure.
inline constexpr int failureLevel = 6000;

// Receives every record on the thread that writes it; several threads may call it at the same time. It may write
// records itself and may replace the sink. If it throws, the exception propagates from the logging call.
using RecordSink = std::function<void(const Record&)>;

// Replaces the sink of the whole program and returns the previous one. An empty `sink` restores the default sink,
// standardErrorSink. Thread-safe; a call of the previous sink that has begun runs to its end. If copying the previous
// sink throws or memory runs out, the exception propagates and the previous sink stays.
RecordSink setRecordSink(RecordSink sink);

// The default sink: writes each log record to standard error as one line: time, level, category, file and line,
// function, text. It escapes control and format characters, separators of lines and paragraphs, backslashes and bytes
// that are not UTF-8 (Printable.h), so no text can forge a line or control a terminal. It writes trace records only
// while the environment variable VXLOG_TRACE is set, with the word "trace" after the level.
void standardErrorSink(const Record& record);

}  // namespace VXLog

#pragma GCC visibility pop
