#pragma once

#include <functional>
#include <string>
#include <vector>

namespace ZQ {
class Mutex;
}

// What this second implementation of the two platform libraries has seen, and how a test controls it.
// All functions are thread-safe.
namespace observe {

// Forgets what was seen and undoes what was set with the functions below. What is still held or alive is still counted.
void reset();

// A logging call with its nine arguments.
struct Record {
    bool trace;  // a trace record, otherwise a log record
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

// Sets what each logging call runs, on its thread, after it has stored the record. If `action` throws, the exception
// propagates from the logging call. An empty `action` ends this.
void onRecord(std::function<void(const Record&)> action);

// A call of ZQ::Mutex that acquired or released it.
struct LockCall {
    const ZQ::Mutex* mutex;
    bool lock;                         // otherwise unlock
    unsigned int timeoutMilliseconds;  // 0 for unlock
    int depth;                         // how often the calling thread holds the mutex after the call
    std::size_t records;               // how many records had been written before the call
};

// The calls of ZQ::Mutex since reset, oldest first.
std::vector<LockCall> lockCalls();

// How many locks are held, over all mutexes and threads.
int locksHeld();

// Sets what runs while a mutex is held: at the end of each lock (true) and at the start of each unlock (false).
void onLock(std::function<void(bool lock)> action);

// Sets what ZQ::Mutex::lock returns when it has acquired the mutex. With false, the caller holds the mutex all the same.
void setLockResult(bool obtained);

// Sets the time that ZQ::DateTime::now() gives. Its scope is always 3.
void setClock(long seconds, unsigned int milliseconds);

// How often ZQ::DateTime::now() was called since reset.
int clockReadings();

// How many objects of VXLog::VXMessageBuffer and of ZQ::DateTime exist.
int buffersAlive();
int dateTimesAlive();

// The calls of the platform that can be made to throw. `dateTime` is every call that makes or changes a DateTime; `any`
// is every call except these.
enum class Call { any, bufferConstructor, insertion, str, log, trace, now, dateTimeText, lock, dateTime };

// Makes the `nth` such call from now on (the next is 1) throw observe::Thrown, once. 0 makes none throw.
void throwAt(Call call, int nth);

// Whether the call that throwAt has named was reached and threw.
bool thrown();

// The exception that throwAt asks for, with its two arguments.
struct Thrown {
    Call call;
    int nth;
};

}  // namespace observe
