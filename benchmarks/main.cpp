#include <benchmark/benchmark.h>

#include <condition_variable>
#include <mutex>
#include <thread>

#include "Peers.h"
#include "VXLog/RecordSink.h"

namespace {

// A second thread that sleeps as long as the object lives. In a process with one thread the C library skips the atomic
// operations of locks, which would then look free.
class SecondThread {
public:
    ~SecondThread()
    {
        {
            const std::lock_guard<std::mutex> lock(mutex_);
            finished_ = true;
        }
        woken_.notify_one();
        thread_.join();
    }

private:
    void sleep()
    {
        std::unique_lock<std::mutex> lock(mutex_);
        woken_.wait(lock, [this] { return finished_; });
    }

    std::mutex mutex_;
    std::condition_variable woken_;
    bool finished_ = false;
    std::thread thread_ {&SecondThread::sleep, this};
};

}  // namespace

int main(int argc, char** argv)
{
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv))
        return 1;
    benchmark::AddCustomContext("peers", benchmarks::peers);
    benchmark::AddCustomContext("missing peers", benchmarks::missingPeers);
    benchmark::AddCustomContext("compiler", benchmarks::compiler);

    // Records are composed and passed to the sink, which drops them.
    VXLog::setRecordSink([](const VXLog::Record&) {});
    const SecondThread secondThread;
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
}
