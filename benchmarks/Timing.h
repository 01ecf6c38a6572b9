#pragma once

#include <benchmark/benchmark.h>

#include <cstddef>

#if defined(__x86_64__)
#include <immintrin.h>
#endif

namespace benchmarks {

// A timed loop uses so many different values before it asks whether it may end.
constexpr std::size_t batchSize = 16;

#if defined(__x86_64__)
[[gnu::target("avx")]] inline void clearUpperVectorHalves()
{
    _mm256_zeroupper();
}
#endif

// Called before every timed loop. If a contender leaves the upper halves of the vector registers in use, the next one,
// which uses the lower halves, runs slower.
inline void beforeTiming()
{
#if defined(__x86_64__)
    if (__builtin_cpu_supports("avx"))
        clearUpperVectorHalves();
#endif
}

}  // namespace benchmarks
