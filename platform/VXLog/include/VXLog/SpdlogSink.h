#pragma once

#include <spdlog/logger.h>

#include <memory>
#include <stdexcept>
#include <string>
#include <utility>

#include "VXLog/Printable.h"
#include "VXLog/RecordSink.h"

namespace VXLog {

/// A sink that passes each record to a logger of spdlog.
///
///     VXLog::setRecordSink(VXLog::SpdlogSink(spdlog::default_logger()));
///
/// The level is error for level 6000 and above, otherwise info; it is trace for a trace record. The text is category,
/// function and message ("Vexilon.IC.Node setProperty: setProperty: 1 read-only"), escaped as standardErrorSink does.
/// The source location is the record's.
///
/// Several threads may call one sink if they may use the logger, as one with sinks whose names end in _mt. spdlog has
/// locks: in a child of fork(), set another sink. A logger with a queue (spdlog::async_logger) keeps the pointers to
/// the names of file and function. In the library's records these are literals, valid until the library is unloaded.
///
/// Optional: no other header includes this one. Link IC::VXLog and spdlog (Debian's libspdlog-dev) yourself.
class SpdlogSink {
public:
    /// Throws std::invalid_argument if there is no logger.
    explicit SpdlogSink(std::shared_ptr<spdlog::logger> logger) : logger_(std::move(logger))
    {
        if (!logger_)
            throw std::invalid_argument("VXLog::SpdlogSink: there is no logger");
    }

    /// Passes the record on if the logger writes its level or keeps it for a backtrace. What the logger throws
    /// propagates; spdlog itself handles what is derived from std::exception.
    void operator()(const Record& record) const
    {
        const auto level = record.kind == Record::Kind::trace ? spdlog::level::trace
            : record.level >= failureLevel                    ? spdlog::level::err
                                                              : spdlog::level::info;
        if (!logger_->should_log(level) && !logger_->should_backtrace())
            return;
        const std::string text =
            printable(record.logger) + ' ' + printable(record.function) + ": " + printable(record.message);
        logger_->log(spdlog::source_loc(record.file, record.line, record.function), level,
                     spdlog::string_view_t(text.data(), text.size()));
    }

private:
    std::shared_ptr<spdlog::logger> logger_;
};

}  // namespace VXLog
