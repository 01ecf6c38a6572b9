#pragma once

#include <functional>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include "Shown.h"
#include "observe/Platform.h"

// One try of an operation while something fails, and what has to be true afterwards.

// How a try went.
struct Outcome {
    std::string before;  // the subject of the operation before it
    std::string ended;   // "returned" and the result, or the exception
    std::string after;   // the subject after it
    std::vector<observe::Record> records;
    bool struck = false;      // the fault was reached
    bool lockIsHeld = false;  // another thread cannot acquire the node's lock
};

// Something that fails between `begin` and `end`. `end` returns whether it was reached.
struct Fault {
    std::function<void()> begin;
    std::function<bool()> end;
};

const Fault& noFault();

struct Operation {
    std::string name;
    std::function<Outcome(const Fault&)> run;
    bool writesText = false;  // the global locale affects it
};

// Says what is wrong with a try in which the fault was reached, or nothing. Right is: `exception` reached the caller,
// the subject is as before (or as a refusal leaves it, if the operation refuses without the fault too), and the records
// are the first of those that the operation writes without the fault.
std::string wrongAfterFault(const Outcome& tried, const Outcome& undisturbed, const std::string& exception);

// Says how the try differs from the one without a fault, or nothing.
std::string difference(const Outcome& tried, const Outcome& undisturbed);

// Returns what `act` returns, or the type and the text of the exception that it throws.
std::string endOf(const std::function<std::string()>& act);

// The records, a line each.
std::string listed(const std::vector<observe::Record>& records);

// Whether another thread can acquire the mutex. (The thread that holds it always can.)
bool isFree(ZQ::Mutex& mutex);

// Begins the fault, and ends it at the latest when it is destroyed. Stores whether it was reached, and the records.
class Exposure {
public:
    Exposure(const Fault& fault, Outcome& outcome) : fault_(fault), outcome_(outcome) { fault_.begin(); }
    ~Exposure() { end(); }
    Exposure(const Exposure&) = delete;
    Exposure& operator=(const Exposure&) = delete;

    void end()
    {
        if (ended_)
            return;
        ended_ = true;
        outcome_.struck = fault_.end();
        outcome_.records = observe::records();
    }

private:
    const Fault& fault_;
    Outcome& outcome_;
    bool ended_ = false;
};

// An operation that runs `act` on the subject that `prepare` makes. The fault exists during `act` only.
template <class Prepare, class Act>
Operation on(std::string name, Prepare prepare, Act act)
{
    return {std::move(name), [prepare, act](const Fault& fault) {
                auto subject = prepare();
                Outcome outcome;
                outcome.before = shown(subject);
                observe::reset();
                outcome.ended = endOf([&]() -> std::string {
                    Exposure exposure(fault, outcome);
                    if constexpr (std::is_void_v<decltype(act(subject))>) {
                        act(subject);
                        exposure.end();
                        return "returned";
                    } else {
                        const auto& result = act(subject);
                        exposure.end();
                        return "returned " + shown(result);
                    }
                });
                ZQ::Mutex* const mutex = mutexOf(subject);
                if (mutex != nullptr && !observe::lockCalls().empty())
                    outcome.lockIsHeld = !isFree(*mutex);
                outcome.after = shown(subject);
                observe::reset();
                return outcome;
            }};
}

template <class Act>
Operation on(std::string name, Act act)
{
    return on(
        std::move(name), [] { return Nothing(); }, [act](const Nothing&) { return act(); });
}
