#pragma once

#include <pthread.h>

#include <functional>
#include <thread>
#include <vector>

constexpr int threadCount = 8;

// Runs work(0) to work(7), each on a thread of its own, which all begin when the last of them is there.
inline void runAtOnce(const std::function<void(int)>& work)
{
    pthread_barrier_t barrier;
    pthread_barrier_init(&barrier, nullptr, threadCount);
    std::vector<std::thread> threads;
    for (int number = 0; number < threadCount; ++number) {
        threads.emplace_back([&, number] {
            pthread_barrier_wait(&barrier);
            work(number);
        });
    }
    for (std::thread& thread : threads)
        thread.join();
    pthread_barrier_destroy(&barrier);
}
