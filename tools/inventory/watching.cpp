// The loop, and the signals that end it.
#include "watching.h"

#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <csignal>
#include <iostream>
#include <thread>

#include "alerts.h"
#include "output.h"
#include "values.h"

namespace inventory {

void watch(const std::function<Inventory()>& read, double seconds, std::ostream& out, const Look& look)
{
    // At any other time the program can end at once, even during a long reading.
    for (const int signal : {SIGINT, SIGTERM})
        std::signal(signal, [](int) { _exit(0); });
    Inventory last = read();
    out << "Nodes: " << last.nodes.size() << ", watched every " << exactText(IC::Number(seconds)) << " s\n";
    std::string told;
    while (out.flush()) {
        std::this_thread::sleep_for(std::chrono::duration<double>(seconds));
        try {
            Inventory next = read();
            const auto alerts = alertsOf(changesBetween(last.nodes, next.nodes));
            const BlockedSignals untilWritten;
            if (!alerts.empty())
                writeAlerts(out, alerts, look);
            out.flush();
            last = std::move(next);
            told.clear();
        } catch (const BadInput& bad) {
            if (told != bad.what())
                std::cerr << program_invocation_short_name << ": " << printable(bad.what()) << '\n';
            told = bad.what();
        }
    }
}

}  // namespace inventory
