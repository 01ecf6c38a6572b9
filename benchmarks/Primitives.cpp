// The time of what the workloads consist of: an allocation, a throw, a lock, a conversion to digits, a stream.

#include <charconv>
#include <mutex>
#include <new>
#include <sstream>
#include <stdexcept>

#include "Registration.h"
#include "Timing.h"

namespace benchmarks {

namespace {

void timeAllocation(benchmark::State& state)
{
    beforeTiming();
    for (auto _ : state) {
        void* memory = ::operator new(32);
        benchmark::DoNotOptimize(memory);
        ::operator delete(memory);
    }
}

[[gnu::noinline]] void throwError()
{
    throw std::out_of_range("refused");
}

void timeThrowAndCatch(benchmark::State& state)
{
    bool caught = false;
    beforeTiming();
    for (auto _ : state) {
        try {
            throwError();
        } catch (const std::out_of_range&) {
            caught = true;
        }
        benchmark::DoNotOptimize(caught);
    }
}

void timeLockAndUnlock(benchmark::State& state)
{
    std::recursive_mutex mutex;
    beforeTiming();
    for (auto _ : state) {
        mutex.lock();
        benchmark::ClobberMemory();
        mutex.unlock();
    }
}

void timeNumberToCharacters(benchmark::State& state)
{
    unsigned int number = 3600;
    char text[16];
    beforeTiming();
    for (auto _ : state) {
        benchmark::DoNotOptimize(number);
        const char* end = std::to_chars(text, text + sizeof text, number).ptr;
        benchmark::DoNotOptimize(end);
    }
}

void timeRealToCharacters(benchmark::State& state)
{
    double real = 120.375;
    char text[32];
    beforeTiming();
    for (auto _ : state) {
        benchmark::DoNotOptimize(real);
        const char* end = std::to_chars(text, text + sizeof text, real, std::chars_format::general, 6).ptr;
        benchmark::DoNotOptimize(end);
    }
}

void timeFreshStream(benchmark::State& state)
{
    beforeTiming();
    for (auto _ : state) {
        std::ostringstream out;
        benchmark::DoNotOptimize(out);
    }
}

bool add(const std::string& row, void (*function)(benchmark::State&))
{
    benchmark::RegisterBenchmark(benchmarkName("primitive/" + row, "primitive").c_str(), function);
    return true;
}

const bool added = add("allocate-32-bytes", timeAllocation) && add("throw-and-catch", timeThrowAndCatch)
    && add("lock-and-unlock", timeLockAndUnlock) && add("number-to-characters", timeNumberToCharacters)
    && add("real-to-characters", timeRealToCharacters) && add("fresh-stream", timeFreshStream);

}  // namespace

}  // namespace benchmarks
