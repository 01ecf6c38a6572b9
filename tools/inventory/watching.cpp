// The loop, and the signals that end it.
#include "watching.h"

#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <csignal>
#include <iostream>
#include <thread>

#include "alerts.h"
#include "values.h"

namespace inventory {

namespace {

// Puts off the signals that end the program, so that what is being written is whole.
class SignalsPutOff {
public:
    SignalsPutOff()
    {
        sigset_t ends;
        sigemptyset(&ends);
        sigaddset(&ends, SIGINT);
        sigaddset(&ends, SIGTERM);
        pthread_sigmask(SIG_BLOCK, &ends, &before_);
    }
    ~SignalsPutOff() { pthread_sigmask(SIG_SETMASK, &before_, nullptr); }
    SignalsPutOff(const SignalsPutOff&) = delete;
    SignalsPutOff& operator=(const SignalsPutOff&) = delete;

private:
    sigset_t before_ {};
};

}  // namespace

void watch(const std::function<Inventory()>& read, double seconds, std::ostream& out, const Look& look)
{
    // At any other time nothing is left to do, also amid a reading that takes long.
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
            const SignalsPutOff untilWritten;
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
