#pragma once

#include <functional>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include "Shown.h"
#include "observe/Platform.h"

// One try of an operation while something fails, and what is right afterwards.

// How a try went.
struct Outcome {
    std::string before;  // what the operation was tried on
    std::string ended;   // "returned" and the result, or the exception
    std::string after;   // what it was tried on, afterwards
    std::vector<observe::Record> records;
    bool struck = false;      // the fault was reached
    bool lockIsHeld = false;  // another thread does not get the lock
};

// Something that fails between `begin` and `end`, which says whether it was reached.
struct Fault {
    std::function<void()> begin;
    std::function<bool()> end;
};

const Fault& noFault();

struct Operation {
    std::string name;
    std::function<Outcome(const Fault&)> run;
    bool writesText = false;  // for which the global locale counts
};

// What is wrong with a try in which the fault was reached; empty where nothing is. Right is that `exception`
// reached the caller, with all else as it was or, where the operation refuses anyhow, as that leaves it.
std::string wrongAfterFault(const Outcome& tried, const Outcome& undisturbed, const std::string& exception);

// What went otherwise than undisturbed; empty where nothing did.
std::string difference(const Outcome& tried, const Outcome& undisturbed);

// What `act` returns, or the type of the exception that left it and what that says.
std::string endOf(const std::function<std::string()>& act);

// The records, a line each.
std::string listed(const std::vector<observe::Record>& records);

// Whether another thread obtains the mutex; the one that holds it always does.
bool isFree(ZQ::Mutex& mutex);

// The time in which the fault is there. Takes down what was recorded in it.
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

// An operation that does `act` on what `prepare` makes; nothing fails but in `act`.
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
