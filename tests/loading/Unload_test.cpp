// A program that is not linked with the library loads a plug-in that is, uses it, and unloads it.

#include <dlfcn.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <pthread.h>

#include <condition_variable>
#include <cstdlib>
#include <fstream>
#include <functional>
#include <iterator>
#include <mutex>
#include <string>
#include <thread>

#include "support/HeapInUse.h"

namespace {

// The system's list of what is mapped into the process.
std::string mapped()
{
    std::ifstream maps("/proc/self/maps");
    return {std::istreambuf_iterator<char>(maps), {}};
}

void expectUnmapped()
{
    const std::string all = mapped();
    EXPECT_THAT(all, testing::HasSubstr("Unload_test"));
    for (const char* name : {"loading_plugin", "libIC.so", "libVXLog.so", "libZQ.so"})
        EXPECT_THAT(all, testing::Not(testing::HasSubstr(name)));
}

// A thread that outlives the library that it uses.
class Worker {
public:
    Worker() : thread_([this] { work(); }) { }
    ~Worker()
    {
        run(nullptr);
        thread_.join();
    }
    Worker(const Worker&) = delete;
    Worker& operator=(const Worker&) = delete;

    // Returns when the thread has run the task. An empty task ends the thread.
    void run(std::function<void()> task)
    {
        std::unique_lock<std::mutex> lock(mutex_);
        task_ = std::move(task);
        isWaiting_ = true;
        changed_.notify_all();
        changed_.wait(lock, [this] { return !isWaiting_; });
    }

private:
    void work()
    {
        std::unique_lock<std::mutex> lock(mutex_);
        for (bool isLast = false; !isLast;) {
            changed_.wait(lock, [this] { return isWaiting_; });
            isLast = !task_;
            if (task_)
                task_();
            isWaiting_ = false;
            changed_.notify_all();
        }
    }

    std::mutex mutex_;
    std::condition_variable changed_;
    std::function<void()> task_;
    bool isWaiting_ = false;
    std::thread thread_;
};

// Loads the plug-in, uses it on this thread and another, and unloads it.
void cycle(Worker& worker)
{
    void* const plugin = dlopen(PLUGIN, RTLD_NOW | RTLD_LOCAL);
    ASSERT_NE(plugin, nullptr) << dlerror();
    const auto use = reinterpret_cast<bool (*)()>(dlsym(plugin, "useLibrary"));
    ASSERT_NE(use, nullptr) << dlerror();
    EXPECT_TRUE(use());
    worker.run([use] { EXPECT_TRUE(use()); });
    EXPECT_EQ(dlclose(plugin), 0);
    expectUnmapped();
}

// The number of the next thread-specific key: it grows if a key is never deleted.
unsigned int nextKey()
{
    pthread_key_t key = 0;
    EXPECT_EQ(pthread_key_create(&key, nullptr), 0);
    EXPECT_EQ(pthread_key_delete(key), 0);
    return key;
}

TEST(Unload, LeavesNothingMappedAndLeaksNothing)
{
    Worker worker;
    for (int i = 0; i < 10; ++i)
        ASSERT_NO_FATAL_FAILURE(cycle(worker));
    const std::size_t memory = heapInUse();
    const unsigned int key = nextKey();
    const char* const wanted = std::getenv("IC_TEST_CYCLES");
    const int cycles = wanted != nullptr ? std::atoi(wanted) : 1000;
    for (int i = 0; i < cycles; ++i) {
        ASSERT_NO_FATAL_FAILURE(cycle(worker));
        ASSERT_FALSE(HasFailure()) << "in cycle " << i;
    }
    // A leak in each cycle costs at least this much; smaller differences come from malloc's own bookkeeping.
    constexpr std::size_t smallestBlock = 32;
    EXPECT_LT(heapInUse(), memory + static_cast<std::size_t>(cycles) * smallestBlock);
    EXPECT_EQ(nextKey(), key);
}

}  // namespace
