#pragma once

#include <malloc.h>

#include <benchmark/benchmark.h>

#include <cstddef>
#include <string>
#include <vector>

// Registers a row of the table: a time or a size.
namespace benchmarks {

// The name of a benchmark: its row and its column in the table. report.py splits the name at the bar.
inline std::string benchmarkName(const std::string& row, const char* contender)
{
    return row + '|' + contender;
}

// The heap memory in use, by all libraries together.
inline double bytesInUse()
{
    const auto information = mallinfo2();
    return static_cast<double>(information.uordblks) + static_cast<double>(information.hblkhd);
}

// Counts the bytes of one object that `make` returns, including everything that it owns.
template <class Make>
void countBytes(benchmark::State& state, const Make& make)
{
    constexpr std::size_t count = 10000;
    for (auto _ : state) {
        using Object = decltype(make(std::size_t {0}));
        std::vector<Object> objects;
        objects.reserve(count);
        const double before = bytesInUse();
        for (std::size_t i = 0; i < count; ++i)
            objects.push_back(make(i));
        const double owned = bytesInUse() - before;
        state.counters["bytes"] = owned / static_cast<double>(count) + static_cast<double>(sizeof(Object));
    }
}

template <class Contender, class Function>
void add(const std::string& row, Function function)
{
    benchmark::RegisterBenchmark(benchmarkName(row, Contender::name).c_str(), function);
}

// Times the work in one thread and in two at once. `function` sets the number of items processed.
template <class Contender>
void addThreads(const std::string& row, void (*function)(benchmark::State&))
{
    benchmark::RegisterBenchmark(benchmarkName("two-threads/" + row, Contender::name).c_str(), function)
        ->ThreadRange(1, 2)
        ->UseRealTime();
}

template <class Contender, class Make>
void addBytes(const std::string& row, Make make)
{
    const auto count = [make](benchmark::State& state) { countBytes(state, make); };
    benchmark::RegisterBenchmark(benchmarkName("bytes/" + row, Contender::name).c_str(), count)
        ->Iterations(1);
}

}  // namespace benchmarks
