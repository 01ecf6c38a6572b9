#include "VXLog/VXLogger.h"

#include "Observed.h"

namespace VXLog {

namespace {

void pass(const observe::Record& record)
{
    observe::reached(record.trace ? observe::Call::trace : observe::Call::log);
    std::function<void(const observe::Record&)> action;
    {
        observe::Observed& all = observe::observed();
        const std::lock_guard<std::mutex> lock(all.mutex);
        all.state.records.push_back(record);
        action = all.state.action;
    }
    if (action)
        action(record);
}

}  // namespace

void VXLogger::logLevelMessage(const char* function, const char* file, int line, const std::string& logger,
                               int level, char* data, int a, int b, const std::string& message)
{
    pass({false, function, file, line, logger, level, data, a, b, message});
}

void VXLogger::traceLevelMessage(const char* function, const char* file, int line, const std::string& logger,
                                 int level, char* data, int a, int b, const std::string& message)
{
    pass({true, function, file, line, logger, level, data, a, b, message});
}

}  // namespace VXLog
