// The loop, and the signals that end it.
#include "watching.h"

#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <csignal>
#include <cstdlib>
#include <iostream>
#include <thread>

#include "alerts.h"
#include "output.h"
#include "values.h"

namespace inventory {

namespace {

// Whether systemd has connected standard output to the journal.
bool isJournal()
{
    const char* stream = std::getenv("JOURNAL_STREAM");
    struct stat output { };
    return stream != nullptr && fstat(STDOUT_FILENO, &output) == 0
        && stream == std::to_string(output.st_dev) + ':' + std::to_string(output.st_ino);
}

// What the journal reads at the beginning of a line.
const char* priorityOf(const IC::Alert& alert)
{
    static const char* const priorities[] = {"<6>", "<4>", "<3>", "<2>"};
    return priorities[alert.getSeverity()];
}

void writeAll(std::ostream& out, const std::vector<IC::Alert>& alerts, const Watch& settings, bool toJournal)
{
    if (!settings.asJson && !toJournal) {
        if (!alerts.empty())
            writeAlerts(out, alerts, settings.look);
        return;
    }
    for (const IC::Alert& alert : alerts) {
        if (toJournal)
            out << priorityOf(alert);
        if (settings.asJson)
            writeJsonLine(out, alert);
        else
            out << printable(alert.getNodePaths().front() + ", " + alert.getMessage()) << '\n';
    }
}

}  // namespace

void watch(const std::function<Inventory()>& read, const Watch& settings, std::ostream& out)
{
    // At any other time the program can end at once, even during a long reading.
    for (const int signal : {SIGINT, SIGTERM})
        std::signal(signal, [](int) { _exit(0); });
    const bool toJournal = isJournal();
    Inventory last = read();
    if (!settings.asJson)
        out << (toJournal ? "<6>" : "") << "Nodes: " << last.nodes.size() << ", watched every "
            << exactText(IC::Number(settings.seconds)) << " s\n";
    std::string told;
    while (out.flush() && !isOutputClosed()) {
        std::this_thread::sleep_for(std::chrono::duration<double>(settings.seconds));
        try {
            Inventory next = read();
            auto changes = changesBetween(last.nodes, next.nodes);
            if (!settings.withReadings)
                changes = withoutMereReadings(std::move(changes));
            const auto alerts = alertsOf(changes);
            const BlockedSignals untilWritten;
            writeAll(out, alerts, settings, toJournal);
            out.flush();
            last = std::move(next);
            told.clear();
        } catch (const BadInput& bad) {
            if (told != bad.what())
                std::cerr << (toJournal ? "<4>" : "") << program_invocation_short_name << ": "
                          << printable(bad.what()) << '\n';
            told = bad.what();
        }
    }
}

}  // namespace inventory
