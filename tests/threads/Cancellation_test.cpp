// A thread may be cancelled in an operation on a node: the lock is released and no memory leaks.

#include <gtest/gtest.h>
#include <pthread.h>

#include <algorithm>
#include <memory>
#include <string>

#include "IC/Node.h"
#include "VXLog/RecordSink.h"
#include "support/HeapInUse.h"

namespace {

using IC::Node;
using IC::PropertyValue;

// Takes effect at the next cancellation point. The thread cancels itself, so it is always cancelled in the same place.
void cancelThisThread()
{
    pthread_cancel(pthread_self());
}

class Fan : public Node {
public:
    Fan() : Node(SENSOR_FAN)
    {
        path = "/chassis/fan1";
        properties.insert({1u, PropertyValue("a text that needs memory of its own")});
    }

    StatusType getStatus() const override
    {
        cancelThisThread();
        pthread_testcancel();
        return Node::getStatus();
    }

    using Node::mutex;
};

struct Job {
    Fan fan;
    void (*operation)(Fan&) = nullptr;
};

void* run(void* argument)
{
    auto& job = *static_cast<Job*>(argument);
    job.operation(job.fan);
    return nullptr;
}

void cancelOnceIn(void (*operation)(Fan&))
{
    auto job = std::make_unique<Job>();
    job->operation = operation;
    pthread_t thread {};
    ASSERT_EQ(pthread_create(&thread, nullptr, run, job.get()), 0);
    void* result = nullptr;
    ASSERT_EQ(pthread_join(thread, &result), 0);
    ASSERT_EQ(result, PTHREAD_CANCELED);
    if (!job->fan.mutex.lock(0)) {
        static_cast<void>(job.release());  // its destructor would wait for ever
        FAIL() << "the lock was not released";
    }
    job->fan.mutex.unlock();
    PropertyValue value("");
    ASSERT_EQ(job->fan.getProperty(1, value).getStatus(), 0);
    ASSERT_EQ(std::string(value), "a text that needs memory of its own");
}

void cancelIn(void (*operation)(Fan&))
{
    for (int i = 0; i < 10; ++i)  // the platform and the C library keep some memory for later rounds
        ASSERT_NO_FATAL_FAILURE(cancelOnceIn(operation));
    const std::size_t memory = heapInUse();
    constexpr int rounds = 100;
    for (int i = 0; i < rounds; ++i)
        ASSERT_NO_FATAL_FAILURE(cancelOnceIn(operation)) << "in round " << i;
    constexpr std::size_t smallestBlock = 32;
    EXPECT_LT(heapInUse(), memory + rounds * smallestBlock);
}

class Cancellation : public testing::Test {
protected:
    void SetUp() override
    {
        before_ = VXLog::setRecordSink(nullptr);
#ifdef _LIBCPP_VERSION
        GTEST_SKIP()
            << "the unwinder of libc++ cannot unwind a cancelled thread: glibc begins that with GCC's";
#endif
    }
    void TearDown() override
    {
        VXLog::setRecordSink(before_);
    }

private:
    VXLog::RecordSink before_;
};

TEST_F(Cancellation, WhileARecordIsWrittenLeaksNothing)
{
    VXLog::setRecordSink([](const VXLog::Record&) {
        cancelThisThread();
        pthread_testcancel();
    });
    cancelIn(
        [](Fan& fan) { fan.setProperty(1, PropertyValue("another text that needs memory of its own")); });
}

TEST_F(Cancellation, WhileARecordIsWrittenUnderTheLockReleasesTheLock)
{
    VXLog::setRecordSink([](const VXLog::Record& record) {
        if (record.level != 6000)
            return;
        cancelThisThread();
        pthread_testcancel();
    });
    cancelIn(
        [](Fan& fan) { fan.setProperty(7, PropertyValue("another text that needs memory of its own")); });
}

TEST_F(Cancellation, InAnOverrideUnderTheLockReleasesTheLock)
{
    cancelIn([](Fan& fan) { static_cast<void>(fan.operator std::string()); });
}

TEST_F(Cancellation, TakesEffectAfterTheDefaultSinkHasWrittenItsLine)
{
    testing::internal::CaptureStderr();
    cancelIn([](Fan& fan) {
        cancelThisThread();
        fan.setProperty(7, PropertyValue("another text that needs memory of its own"));
        pthread_testcancel();
    });
    const std::string written = testing::internal::GetCapturedStderr();
    EXPECT_EQ(std::count(written.begin(), written.end(), '\n'), 2 * 110);  // two in each round
    EXPECT_NE(written.find(": setProperty: 7 does not exist\n"), std::string::npos) << written;
}

}  // namespace
