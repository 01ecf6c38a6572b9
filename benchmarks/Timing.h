#pragma once

#include <benchmark/benchmark.h>

#include <cstddef>
#include <string>

#if defined(__x86_64__)
#include <immintrin.h>
#endif

namespace benchmarks {

// How many different values a timed loop goes through between two looks at its end.
constexpr std::size_t batchSize = 16;

#if defined(__x86_64__)
[[gnu::target("avx")]] inline void clearUpperVectorHalves()
{
    _mm256_zeroupper();
}
#endif

// Called before every timed loop. A contender that leaves the upper halves of the vector registers in use would
// slow down the next one, which uses the lower halves.
inline void beforeTiming()
{
#if defined(__x86_64__)
    if (__builtin_cpu_supports("avx"))
        clearUpperVectorHalves();
#endif
}

// The row of the table and its column. The report takes the name apart at the bar.
inline std::string benchmarkName(const std::string& row, const char* contender)
{
    return row + '|' + contender;
}

}  // namespace benchmarks
