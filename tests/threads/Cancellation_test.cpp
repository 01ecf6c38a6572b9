// A thread may be cancelled in an operation on a node: the lock is given back, and nothing stays behind.

#include <fcntl.h>
#include <gtest/gtest.h>
#include <pthread.h>
#include <semaphore.h>
#include <unistd.h>

#include <cstdio>
#include <memory>
#include <string>
#include <thread>

#include "AllocationFailure.h"
#include "IC/Node.h"
#include "VXLog/RecordSink.h"

namespace {

using IC::Node;
using IC::PropertyValue;

sem_t reached;

// Waits to be cancelled; in no function that ThreadSanitizer stands in for, which would be left half done.
void waitHere()
{
    sem_post(&reached);
    for (;;) {
        pthread_testcancel();
        std::this_thread::yield();
    }
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
        if (waitsInStatus)
            waitHere();
        return Node::getStatus();
    }

    using Node::mutex;
    bool waitsInStatus = false;
};

struct Job {
    Fan fan;
    void (*operation)(Fan&) = nullptr;
    long alive = 0;  // objects that the thread has left on the heap
};

void* run(void* argument)
{
    auto& job = *static_cast<Job*>(argument);
    struct Count {
        explicit Count(long& result) : alive(result), before(allocation::aliveNow) { }
        ~Count() { alive = allocation::aliveNow - before; }
        Count(const Count&) = delete;
        Count& operator=(const Count&) = delete;
        long& alive;
        long before;
    };
    const Count count(job.alive);
    job.operation(job.fan);
    return nullptr;
}

// Cancels a thread in the operation as soon as it waits there.
void cancelIn(void (*operation)(Fan&), bool waitsInStatus)
{
    sem_init(&reached, 0, 0);
    for (int i = 0; i < 100; ++i) {
        auto owned = std::make_unique<Job>();
        Job& job = *owned;
        job.fan.waitsInStatus = waitsInStatus;
        job.operation = operation;
        pthread_t thread {};
        ASSERT_EQ(pthread_create(&thread, nullptr, run, owned.get()), 0);
        while (sem_wait(&reached) != 0) { }
        ASSERT_EQ(pthread_cancel(thread), 0);
        void* result = nullptr;
        ASSERT_EQ(pthread_join(thread, &result), 0);
        ASSERT_EQ(result, PTHREAD_CANCELED);
        if (!job.fan.mutex.lock(0)) {
            static_cast<void>(owned.release());  // its destructor would wait for ever
            FAIL() << "the lock was not given back";
        }
        job.fan.mutex.unlock();
        if (i > 1) {  // the first two have left room for the texts of later records
            ASSERT_EQ(job.alive, 0);
        }
        PropertyValue value("");
        ASSERT_EQ(job.fan.getProperty(1, value).getStatus(), 0);
        ASSERT_EQ(std::string(value), "a text that needs memory of its own");
    }
    sem_destroy(&reached);
}

class Cancellation : public testing::Test {
protected:
    void SetUp() override { before_ = VXLog::setRecordSink(nullptr); }
    void TearDown() override { VXLog::setRecordSink(before_); }

private:
    VXLog::RecordSink before_;
};

TEST_F(Cancellation, InARecordBeforeTheLockLeavesNothingBehind)
{
    VXLog::setRecordSink([](const VXLog::Record&) { waitHere(); });
    cancelIn([](Fan& fan) { fan.setProperty(1, PropertyValue("another text that needs memory of its own")); },
             false);
}

TEST_F(Cancellation, InARecordUnderTheLockGivesTheLockBack)
{
    VXLog::setRecordSink([](const VXLog::Record& record) {
        if (record.level == 6000)
            waitHere();
    });
    cancelIn([](Fan& fan) { fan.setProperty(7, PropertyValue("another text that needs memory of its own")); },
             false);
}

TEST_F(Cancellation, InAnOverrideUnderTheLockGivesTheLockBack)
{
    cancelIn([](Fan& fan) { static_cast<void>(fan.operator std::string()); }, true);
}

// The default sink writes to standard error, here a pipe that is full.
TEST_F(Cancellation, InTheDefaultSinkLeavesStandardErrorUsable)
{
    int ends[2];
    ASSERT_EQ(pipe(ends), 0);
    ASSERT_EQ(fcntl(ends[1], F_SETFL, O_NONBLOCK), 0);
    while (write(ends[1], "x", 1) == 1) { }
    ASSERT_EQ(fcntl(ends[1], F_SETFL, 0), 0);
    const int standardError = dup(STDERR_FILENO);
    dup2(ends[1], STDERR_FILENO);
    cancelIn(
        [](Fan& fan) {
            sem_post(&reached);
            fan.setProperty(7, PropertyValue("another text that needs memory of its own"));
        },
        false);
    dup2(standardError, STDERR_FILENO);
    close(standardError);
    close(ends[0]);
    close(ends[1]);
    ASSERT_EQ(ferror(stderr), 0);
}

}  // namespace
