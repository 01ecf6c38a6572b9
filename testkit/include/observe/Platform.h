#pragma once

#include <functional>
#include <string>
#include <vector>

namespace ZQ {
class Mutex;
}

// What this second implementation of the two platform libraries saw, and how it is told to behave.
// Every function may be called from any thread.
namespace observe {

// Forgets everything seen and undoes everything set below.
void reset();

// The nine arguments of a logging call, and which call it was.
struct Record {
    bool trace;
    std::string function;
    std::string file;
    int line;
    std::string logger;
    int level;
    char* data;
    int a;
    int b;
    std::string message;
};

// The records since reset, oldest first.
std::vector<Record> records();

// Called with each record, on the thread that writes it and before the logging call returns.
void onRecord(std::function<void(const Record&)> action);

// The calls of ZQ::Mutex since reset, oldest first. `depth` is how often the calling thread holds the mutex
// after the call. `records` is how many records had been written before the call.
struct LockCall {
    const ZQ::Mutex* mutex;
    bool lock;  // otherwise unlock
    unsigned int timeoutMilliseconds;
    int depth;
    std::size_t records;
};
std::vector<LockCall> lockCalls();

// How many locks are held, over all mutexes and threads.
int locksHeld();

// Called while the mutex is held: at the end of each lock (true) and at the start of each unlock (false).
void onLock(std::function<void(bool lock)> action);

// What ZQ::Mutex::lock returns from now on; the mutex is obtained all the same.
void setLockResult(bool obtained);

// What ZQ::DateTime::now() gives from now on (scope 3), and how often it was asked since reset.
void setClock(long seconds, unsigned int milliseconds);
int clockReadings();

// How many objects of these classes exist.
int buffersAlive();
int dateTimesAlive();

// Makes the platform throw observe::Thrown at its `nth` call (from 1) of these from now on, once. `dateTime` is
// whatever makes or changes a DateTime; `any` leaves it out.
enum class Call { any, bufferConstructor, insertion, str, log, trace, now, dateTimeText, lock, dateTime };
void throwAt(Call call, int nth);
// Whether the call that was to throw has been reached.
bool thrown();
// What throwAt was given.
struct Thrown {
    Call call;
    int nth;
};

}  // namespace observe
