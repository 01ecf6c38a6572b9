#include <benchmark/benchmark.h>

#include <condition_variable>
#include <mutex>
#include <thread>

#include "Peers.h"
#include "VXLog/RecordSink.h"

namespace {

// A second thread that sleeps as long as the object lives. The C library takes short cuts in a process that has
// but one thread, and locks would look free.
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

    // Records are composed and handed on, and then nobody wants them.
    VXLog::setRecordSink([](const VXLog::Record&) {});
    const SecondThread secondThread;
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
}
