#pragma once

#include <pthread.h>

#include <functional>
#include <thread>
#include <vector>

constexpr int threadCount = 8;

// Runs work(0) to work(7), each on its own thread. All of them begin when the last thread has started.
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
