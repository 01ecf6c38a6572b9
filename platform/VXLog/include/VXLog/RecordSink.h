#pragma once

#include <functional>
#include <string>

#pragma GCC visibility push(default)

namespace VXLog {

// One record on its way to a sink: the nine arguments of the logging call and which call it was.
// It refers to the caller's texts and is good only during the call of the sink, so it cannot be copied;
// a sink copies the texts that it keeps.
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

    struct NotCopied {
        NotCopied() = default;
        NotCopied(const NotCopied&) = delete;
        NotCopied& operator=(const NotCopied&) = delete;
    };
    NotCopied notCopied = NotCopied();
};

// Receives every record, on the thread that wrote it and from several threads at once where several write.
// It may itself write records or replace the sink. What it throws reaches whoever wrote the record.
using RecordSink = std::function<void(const Record&)>;

// Replaces the sink of the whole program and returns the one before it; an empty `sink` restores the default.
// Any thread may call at any time; a call of the old sink that has begun runs to its end. Where the old sink
// cannot be copied, or memory runs out, what that throws is thrown and the old sink stays.
//
// The default sink writes each log record to standard error as one line: time, level, category, file and
// line, function, text. Control characters, backslashes and bytes that are not UTF-8 are written escaped, so
// that no text can forge a line or drive a terminal. Trace records are written, with the word "trace" after
// the level, only while the environment variable VXLOG_TRACE is set.
RecordSink setRecordSink(RecordSink sink);

}  // namespace VXLog

#pragma GCC visibility pop
