#include <utility>

#include "Agreement.h"
#include "VXLog/RecordSink.h"

namespace agreement {

namespace {

std::vector<LoggerCall> calls;

// The sink is set at the latest when takeLoggerCalls is first called; outcomeOf calls that before each operation.
const VXLog::RecordSink before = VXLog::setRecordSink([](const VXLog::Record& record) {
    calls.push_back({record.kind == VXLog::Record::Kind::trace,
                     record.line,
                     record.data == nullptr && record.a == 0 && record.b == 0,
                     {record.function, record.file, record.logger, record.level, record.message}});
});

}  // namespace

std::vector<LoggerCall> takeLoggerCalls()
{
    return std::exchange(calls, {});
}

}  // namespace agreement
