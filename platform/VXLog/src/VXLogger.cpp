#include "VXLog/VXLogger.h"

#include <pthread.h>

#include <array>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <mutex>
#include <utility>

#include "Striped.h"
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

// The sink of the program; null for the default sink. Calls in progress share it, so they can finish after it is
// replaced.
using Sink = std::shared_ptr<const RecordSink>;

// Initialised before the program's own objects at namespace scope, and destroyed after them.
[[gnu::init_priority(101)]] Striped<Sink> current;
[[gnu::init_priority(101)]] const ForkHandlers<current> forkHandlers;

// The same sink for each processor, with a count of calls of its own: threads that change one count wait for each other.
std::array<Sink, Striped<Sink>::count> shares(RecordSink sink)
{
    std::array<Sink, Striped<Sink>::count> all;
    if (!sink)
        return all;
    const Sink only = std::make_shared<const RecordSink>(std::move(sink));
    struct alignas(64) Share {  // a line of the processor's cache
        Sink sink;
    };
    for (Sink& one : all)
        one = Sink(std::make_shared<const Share>(Share {only}), only.get());
    return all;
}

Sink currentSink()
{
    return current.withOwn([](const Sink& sink) { return sink; });
}

void pass(const Record& record)
{
    if (const Sink sink = currentSink())
        (*sink)(record);
    else
        standardErrorSink(record);
}

}  // namespace

RecordSink setRecordSink(RecordSink sink)
{
    auto next = shares(std::move(sink));  // and later the previous ones, which end outside the locks
    for (;;) {
        const Sink before = currentSink();
        // Outside the locks: copying runs the program's code and may throw.
        RecordSink copy = before ? *before : RecordSink(standardErrorSink);
        const std::lock_guard lock(current);
        if (current.at(0) == before) {  // nobody has replaced it meanwhile
            for (std::size_t i = 0; i < next.size(); ++i)
                current.at(i).swap(next.at(i));
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
