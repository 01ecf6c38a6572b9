#include "Trial.h"

#include <cstdlib>
#include <cxxabi.h>
#include <pthread.h>

#include <algorithm>
#include <exception>
#include <typeinfo>

#include "IC/ICException.h"
#include "ZQ/Mutex.h"

const Fault& noFault()
{
    static const Fault none {[] {}, [] { return false; }};
    return none;
}

namespace {

std::string nameOf(const std::type_info& type)
{
    char* const demangled = abi::__cxa_demangle(type.name(), nullptr, nullptr, nullptr);
    const std::string name = demangled != nullptr ? demangled : type.name();
    std::free(demangled);
    return name + ": ";
}

}  // namespace

std::string endOf(const std::function<std::string()>& act)
{
    try {
        return act();
    } catch (const std::exception& exception) {
        return nameOf(typeid(exception)) + exception.what();
    } catch (const IC::PropertyValueInvalidKind& exception) {
        return nameOf(typeid(exception)) + exception.what();
    } catch (const IC::NodeInvalidSensor& exception) {
        return nameOf(typeid(exception)) + exception.what();
    } catch (const observe::Thrown& thrown) {
        return nameOf(typeid(thrown)) + "call " + std::to_string(static_cast<int>(thrown.call)) + ", "
            + std::to_string(thrown.nth);
    } catch (...) {
        return "another exception";
    }
}

// Uses pthread, because std::thread frees in one thread what it allocates in another, and the allocations are counted
// for each thread.
bool isFree(ZQ::Mutex& mutex)
{
    struct Attempt {
        ZQ::Mutex& mutex;
        bool obtained;
    };
    Attempt attempt {mutex, false};
    const auto lockAndUnlock = [](void* argument) -> void* {
        auto& its = *static_cast<Attempt*>(argument);
        its.obtained = its.mutex.lock(0);
        if (its.obtained)
            its.mutex.unlock();
        return nullptr;
    };
    pthread_t thread {};
    if (pthread_create(&thread, nullptr, lockAndUnlock, &attempt) != 0)
        return false;
    pthread_join(thread, nullptr);
    return attempt.obtained;
}

namespace {

bool same(const observe::Record& a, const observe::Record& b)
{
    return a.trace == b.trace && a.function == b.function && a.file == b.file && a.line == b.line
        && a.logger == b.logger && a.level == b.level && a.data == b.data && a.a == b.a && a.b == b.b
        && a.message == b.message;
}

// Whether `records` are the first of `all`, each of them whole.
bool beginWith(const std::vector<observe::Record>& all, const std::vector<observe::Record>& records)
{
    return records.size() <= all.size() && std::equal(records.begin(), records.end(), all.begin(), same);
}

}  // namespace

std::string listed(const std::vector<observe::Record>& records)
{
    std::string list;
    for (const observe::Record& record : records)
        list += (record.trace ? "\n    trace " : "\n    log ") + record.function + ", " + record.file + ", "
            + std::to_string(record.line) + ", " + record.logger + ", " + std::to_string(record.level) + ": "
            + record.message;
    return list;
}

std::string difference(const Outcome& tried, const Outcome& undisturbed)
{
    if (tried.lockIsHeld)
        return "another thread cannot acquire the lock";
    if (tried.ended != undisturbed.ended)
        return tried.ended + "\n  without the fault: " + undisturbed.ended;
    if (tried.after != undisturbed.after)
        return "afterwards " + tried.after + "\n  without the fault: " + undisturbed.after;
    if (tried.records.size() != undisturbed.records.size() || !beginWith(undisturbed.records, tried.records))
        return "records:" + listed(tried.records) + "\n  without the fault:" + listed(undisturbed.records);
    return {};
}

std::string wrongAfterFault(const Outcome& tried, const Outcome& undisturbed, const std::string& exception)
{
    if (tried.lockIsHeld)
        return "another thread cannot acquire the lock";
    if (tried.ended != exception)
        return tried.ended + "\n  expected: " + exception + "\n  without the fault: " + undisturbed.ended;
    const bool refused = undisturbed.ended.rfind("returned", 0) != 0;
    if (tried.after != tried.before && !(refused && tried.after == undisturbed.after))
        return "afterwards " + tried.after + "\n  before: " + tried.before
            + "\n  without the fault: " + undisturbed.after;
    if (!beginWith(undisturbed.records, tried.records))
        return "records:" + listed(tried.records) + "\n  without the fault:" + listed(undisturbed.records);
    return {};
}
