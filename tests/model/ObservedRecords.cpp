#include "Agreement.h"
#include "observe/Platform.h"

namespace agreement {

std::vector<LoggerCall> takeLoggerCalls()
{
    std::vector<LoggerCall> calls;
    for (const observe::Record& record : observe::records())
        calls.push_back({record.trace,
                         record.line,
                         record.data == nullptr && record.a == 0 && record.b == 0,
                         {record.function, record.file, record.logger, record.level, record.message}});
    observe::reset();
    return calls;
}

}  // namespace agreement
