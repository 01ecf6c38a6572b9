#pragma once

#include <pthread.h>
#include <sys/uio.h>
#include <systemd/sd-journal.h>
#include <unistd.h>

#include <array>
#include <cerrno>  // program_invocation_short_name
#include <cstddef>
#include <string>
#include <utility>

#include "VXLog/RecordSink.h"

namespace VXLog {

/// A sink that writes each record to the systemd journal.
///
///     VXLog::setRecordSink(VXLog::JournalSink());
///
/// An entry has these fields, each with the bytes of the record, whatever they are:
///
///     MESSAGE             the message
///     PRIORITY            3 (err) for level 6000 and above, otherwise 6 (info); 7 (debug) for a trace record
///     CODE_FILE           the file
///     CODE_LINE           its line
///     CODE_FUNC           the function
///     SYSLOG_IDENTIFIER   the identifier
///     VXLOG_CATEGORY      the category
///     VXLOG_LEVEL         the level
///
/// If a record cannot be sent, for example because no journal runs, the sink passes it to standardErrorSink. Several
/// threads may call one sink. It has no lock, so a child of fork() may call it too.
///
/// Optional: no other header includes this one. Link IC::VXLog and libsystemd (Debian's libsystemd-dev, pkg-config's
/// libsystemd) yourself.
class JournalSink {
public:
    /// The identifier is the name of the program without its folders.
    JournalSink() : JournalSink(program_invocation_short_name) { }

    /// The identifier can have any bytes.
    explicit JournalSink(std::string identifier) : identifier_(std::move(identifier)) { }

    /// Sends the record. Waits while the queue of the journal is full; a cancellation of the thread takes effect after
    /// the record is sent. Throws only std::bad_alloc; then the record is not sent.
    void operator()(const Record& record) const
    {
        std::array<std::string, 8> fields {"MESSAGE=" + record.message,
                                           std::string("PRIORITY=") + priorityOf(record),
                                           std::string("CODE_FILE=") + record.file,
                                           "CODE_LINE=" + std::to_string(record.line),
                                           std::string("CODE_FUNC=") + record.function,
                                           "SYSLOG_IDENTIFIER=" + identifier_,
                                           "VXLOG_CATEGORY=" + record.logger,
                                           "VXLOG_LEVEL=" + std::to_string(record.level)};
        std::array<iovec, 8> parts {};
        for (std::size_t i = 0; i < fields.size(); ++i)
            parts[i] = {fields[i].data(), fields[i].size()};
        if (!isSent(parts))
            standardErrorSink(record);
    }

private:
    static char priorityOf(const Record& record)
    {
        if (record.kind == Record::Kind::trace)
            return '7';
        return record.level >= failureLevel ? '3' : '6';
    }

    static bool isSent(const std::array<iovec, 8>& parts)
    {
        // libsystemd reports success where there is no socket.
        if (access("/run/systemd/journal/socket", F_OK) != 0)
            return false;
        // libsystemd may have opened a file, which a cancellation would leave open.
        int before = 0;
        pthread_setcancelstate(PTHREAD_CANCEL_DISABLE, &before);
        // In parentheses: the macro of this name adds the place of this call as CODE_FILE, CODE_LINE and CODE_FUNC.
        const int outcome = (sd_journal_sendv)(parts.data(), static_cast<int>(parts.size()));
        pthread_setcancelstate(before, nullptr);
        return outcome == 0;
    }

    std::string identifier_;
};

}  // namespace VXLog
