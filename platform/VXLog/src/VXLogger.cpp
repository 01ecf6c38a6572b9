#include "VXLog/VXLogger.h"

#include <pthread.h>

#include <cstdio>
#include <cstdlib>
#include <memory>
#include <mutex>
#include <utility>

#include "Locks.h"
#include "VXLog/Printable.h"
#include "VXLog/RecordSink.h"
#include "ZQ/DateTime.h"

namespace VXLog {

void standardErrorSink(const Record& record)
{
    const bool trace = record.kind == Record::Kind::trace;
    if (trace && std::getenv("VXLOG_TRACE") == nullptr)
        return;
    std::string line = ZQ::DateTime::now();
    line += ' ' + std::to_string(record.level) + (trace ? " trace " : " ");
    line += printable(record.logger) + ' ' + printable(record.file) + ':' + std::to_string(record.line) + ' '
        + printable(record.function) + ": " + printable(record.message) + '\n';
    // Cancellation waits until the line is written: clang assumes that fwrite does not unwind, so a cancellation
    // inside it would end the program.
    int before = 0;
    pthread_setcancelstate(PTHREAD_CANCEL_DISABLE, &before);
    // One call, so that the lines of several threads do not mix. There is nowhere to report a failure.
    static_cast<void>(std::fwrite(line.data(), 1, line.size(), stderr));
    pthread_setcancelstate(before, nullptr);
}

namespace {

// The sink of the program. Calls in progress share it, so they can finish after it is replaced.
struct Current {
    std::shared_ptr<const RecordSink> sink = std::make_shared<const RecordSink>(standardErrorSink);
};

// Initialised before the program's own objects at namespace scope, and destroyed after them.
[[gnu::init_priority(101)]] Current current;

std::shared_ptr<const RecordSink> currentSink()
{
    const std::lock_guard<std::mutex> lock(sinkLock);
    return current.sink;
}

void pass(const Record& record)
{
    (*currentSink())(record);
}

}  // namespace

RecordSink setRecordSink(RecordSink sink)
{
    auto next = std::make_shared<const RecordSink>(sink ? std::move(sink) : RecordSink(standardErrorSink));
    for (;;) {
        const auto before = currentSink();
        RecordSink copy = *before;  // outside the lock: copying runs the program's code and may throw
        const std::lock_guard<std::mutex> lock(sinkLock);
        if (current.sink == before) {
            current.sink = std::move(next);
            return copy;
        }
    }
}

void VXLogger::logLevelMessage(const char* function, const char* file, int line, const std::string& logger,
                               int level, char* data, int a, int b, const std::string& message)
{
    pass({Record::Kind::log, function, file, line, logger, level, data, a, b, message});
}

void VXLogger::traceLevelMessage(const char* function, const char* file, int line, const std::string& logger,
                                 int level, char* data, int a, int b, const std::string& message)
{
    pass({Record::Kind::trace, function, file, line, logger, level, data, a, b, message});
}

}  // namespace VXLog
