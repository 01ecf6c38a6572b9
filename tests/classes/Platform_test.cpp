// Tests of the stand-ins for the agent's two platform libraries.

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sched.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cfenv>
#include <chrono>
#include <cstdlib>
#include <ctime>
#include <iomanip>
#include <limits>
#include <memory>
#include <optional>
#include <sstream>
#include <stdexcept>
#include <thread>
#include <type_traits>
#include <vector>

#include "VXLog/Printable.h"
#include "VXLog/RecordSink.h"
#include "VXLog/VXLogger.h"
#include "VXLog/VXMessageBuffer.h"
#include "ZQ/DateTime.h"
#include "ZQ/Mutex.h"
#include "ZQ/Types.h"
#include "support/AllocationFailure.h"
#include "support/DateTimes.h"
#include "support/GroupingLocale.h"

namespace {

static_assert(std::is_same_v<ZQ::Uint8, unsigned char>);
static_assert(std::is_same_v<ZQ::Uint16, unsigned short>);
static_assert(std::is_same_v<ZQ::Uint32, unsigned int>);
static_assert(std::is_same_v<ZQ::Uint64, unsigned long long>);
static_assert(std::is_same_v<ZQ::Real64, double>);

static_assert(!std::is_copy_constructible_v<VXLog::Record>);  // it refers to texts of the caller

thread_local std::optional<int> processor;  // what sched_getcpu returns instead of the true number
thread_local bool isProcessorRead = false;

}  // namespace

// Replaces the C library's function, also in the shared libraries.
extern "C" [[gnu::visibility("default")]] int sched_getcpu() noexcept
{
    isProcessorRead = true;
    if (processor)
        return *processor;
    unsigned int number = 0;
    return syscall(SYS_getcpu, &number, nullptr, nullptr) == 0 ? static_cast<int>(number) : -1;
}

namespace {

// Makes sched_getcpu return the number on this thread for the lifetime of the object. Expects that it is called.
class OnProcessor {
public:
    explicit OnProcessor(int number)
    {
        processor = number;
        isProcessorRead = false;
    }
    ~OnProcessor()
    {
        EXPECT_TRUE(isProcessorRead);
        processor.reset();
    }
    OnProcessor(const OnProcessor&) = delete;
    OnProcessor& operator=(const OnProcessor&) = delete;
};

// The stand-ins keep 16 copies and choose one by the remainder: all remainders, larger numbers, and -1, a failure.
constexpr int processors[] = {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15, 16, 20, 1000, -1};

// Sets an environment variable for the lifetime of the object.
class Environment {
public:
    Environment(const char* name, const char* value) : name_(name) { setenv(name, value, 1); }
    ~Environment() { unsetenv(name_); }
    Environment(const Environment&) = delete;
    Environment& operator=(const Environment&) = delete;

private:
    const char* name_;
};

// Whether a date-time can hold so many seconds: with a 32-bit long, it ends in January 2038.
constexpr bool isHeld(long long seconds)
{
    return static_cast<long>(seconds) == seconds;
}

std::string textOf(long long seconds, unsigned int milliseconds)
{
    return dateTime(static_cast<long>(seconds), milliseconds, 3);
}

TEST(DateTime, KeepsSecondsMillisecondsAndScopeUnchanged)
{
    for (const long seconds : {0L, -1L, 1234567890L, std::numeric_limits<long>::min()}) {
        for (const unsigned int scope : {0u, 1u, 2u, 3u, 4u, 4294967295u}) {
            ZQ::DateTime time(seconds, scope);
            EXPECT_EQ(time.getMillisecond(), 0u);
            time.setMillisecond(65535);
            const ZQ::DateTime copy(time);
            ZQ::DateTime assigned;
            assigned = copy;
            EXPECT_EQ(partsOf(assigned), (DateTimeParts {seconds, 65535, scope}));
        }
    }
}

TEST(DateTime, DefaultsToTheEpochWithScope3)
{
    EXPECT_EQ(partsOf(ZQ::DateTime()), (DateTimeParts {0, 0, 3}));
}

TEST(DateTime, NowIsTheSystemClockInMillisecondsWithScope3)
{
    using namespace std::chrono;
    const auto milliseconds = [](const ZQ::DateTime& time) {
        return static_cast<long long>(static_cast<long>(time)) * 1000 + time.getMillisecond();
    };
    const auto clock = [] {
        return duration_cast<std::chrono::milliseconds>(system_clock::now().time_since_epoch()).count();
    };
    const auto before = clock();
    const ZQ::DateTime now = ZQ::DateTime::now();
    const auto after = clock();
    EXPECT_LE(before, milliseconds(now));
    EXPECT_LE(milliseconds(now), after);
    EXPECT_EQ(now.getScope(), 3u);

    bool anyMilliseconds = false;
    for (int i = 0; i < 20 && !anyMilliseconds; ++i) {
        anyMilliseconds = ZQ::DateTime::now().getMillisecond() != 0;
        std::this_thread::sleep_for(std::chrono::milliseconds(3));
    }
    EXPECT_TRUE(anyMilliseconds);
}

TEST(DateTimeText, IsIso8601InUtc)
{
    const struct {
        long long seconds;
        unsigned int milliseconds;
        const char* text;
    } rows[] = {
        {0, 0, "1970-01-01T00:00:00Z"},
        {-1, 0, "1969-12-31T23:59:59Z"},
        {1234567890, 0, "2009-02-13T23:31:30Z"},
        {1234567890, 123, "2009-02-13T23:31:30.123Z"},
        {1234567890, 7, "2009-02-13T23:31:30.007Z"},
        {1234567890, 250, "2009-02-13T23:31:30.250Z"},
        {1234567890, 65535, "2009-02-13T23:31:30.65535Z"},
        {951782399, 0, "2000-02-28T23:59:59Z"},
        {951782400, 0, "2000-02-29T00:00:00Z"},
        {951868800, 0, "2000-03-01T00:00:00Z"},
        {4107542399, 0, "2100-02-28T23:59:59Z"},
        {4107542400, 0, "2100-03-01T00:00:00Z"},
        {2147483647, 0, "2038-01-19T03:14:07Z"},
        {-2147483648, 0, "1901-12-13T20:45:52Z"},
        {2147483648, 0, "2038-01-19T03:14:08Z"},
        {-62135596801, 0, "0000-12-31T23:59:59Z"},
        {-62135596800, 0, "0001-01-01T00:00:00Z"},
        {-62162121600, 0, "0000-02-29T00:00:00Z"},
        {-62167219200, 0, "0000-01-01T00:00:00Z"},
        {253402300799, 999, "9999-12-31T23:59:59.999Z"},
    };
    for (const auto& row : rows) {
        if (isHeld(row.seconds)) {
            EXPECT_EQ(textOf(row.seconds, row.milliseconds), row.text);
        }
    }
}

// A 32-bit long can hold none of these rows.
TEST(DateTimeText, IsTheSecondsOutsideTheYears0To9999)
{
    const struct {
        long long seconds;
        unsigned int milliseconds;
        const char* text;
    } rows[] = {
        {253402300800, 0, "@253402300800"},
        {253402300800, 5, "@253402300800"},
        {-62167219201, 0, "@-62167219201"},
        {std::numeric_limits<long long>::max(), 0, "@9223372036854775807"},
        {std::numeric_limits<long long>::min(), 0, "@-9223372036854775808"},
    };
    for (const auto& row : rows) {
        if (isHeld(row.seconds)) {
            EXPECT_EQ(textOf(row.seconds, row.milliseconds), row.text);
        }
    }
}

TEST(DateTimeText, ShowsEveryMillisecond)
{
    for (unsigned int millisecond = 1; millisecond <= 999; ++millisecond) {
        const std::string digits = std::to_string(1000 + millisecond).substr(1);
        ASSERT_EQ(textOf(0, millisecond), "1970-01-01T00:00:00." + digits + "Z");
    }
}

TEST(DateTimeText, AgreesWithTheSystemsCalendarOnEveryDayOfFourCenturies)
{
    for (long long day = -146097; day <= 146097; ++day) {
        const long long seconds = day * 86400 + 4271;
        if (!isHeld(seconds))
            continue;
        const auto time = static_cast<std::time_t>(seconds);
        std::tm civil {};
        ASSERT_NE(gmtime_r(&time, &civil), nullptr);
        char expected[32];
        ASSERT_NE(std::strftime(expected, sizeof expected, "%Y-%m-%dT%H:%M:%SZ", &civil), 0u);
        ASSERT_EQ(textOf(seconds, 0), expected);
    }
}

TEST(DateTimeText, DependsOnNeitherTimeZoneNorLocaleNorScope)
{
    const GlobalGroupingLocale grouping;
    const Environment zone("TZ", "right/Asia/Tokyo");
    tzset();
    for (const unsigned int scope : {0u, 1u, 2u, 3u, 255u})
        EXPECT_EQ(std::string(ZQ::DateTime(1234567890, scope)), "2009-02-13T23:31:30Z");
    if (isHeld(253402300800)) {
        EXPECT_EQ(textOf(253402300800, 0), "@253402300800");
    }
}

TEST(DateTimeText, IsInsertedIntoAStreamAsOneText)
{
    std::ostringstream out;
    out.imbue(groupingLocale());
    out << std::hex << std::setfill('*') << std::setw(22) << ZQ::DateTime(1234567890, 3);
    EXPECT_EQ(out.str(), "**2009-02-13T23:31:30Z");
}

TEST(Mutex, IsRecursiveAndHeldUntilTheLastUnlock)
{
    ZQ::Mutex mutex;
    const auto freeForAnother = [&mutex] {
        bool obtained = false;
        std::thread([&] {
            obtained = mutex.lock(0);
            if (obtained)
                mutex.unlock();
        }).join();
        return obtained;
    };
    EXPECT_TRUE(mutex.lock(0xFFFFFFFF));
    EXPECT_TRUE(mutex.lock(0));
    mutex.unlock();
    EXPECT_FALSE(freeForAnother());
    mutex.unlock();
    EXPECT_TRUE(freeForAnother());
}

TEST(Mutex, GivesUpAfterTheTimeOut)
{
    ZQ::Mutex mutex;
    ASSERT_TRUE(mutex.lock(0xFFFFFFFF));
#ifndef __SANITIZE_THREAD__  // ThreadSanitizer sees the unlock, but not the lock with a time-out
    ASSERT_TRUE(mutex.lock(10));
    mutex.unlock();
#endif
    std::thread([&mutex] {
        const auto start = std::chrono::steady_clock::now();
        EXPECT_FALSE(mutex.lock(50));
        EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(50));
    }).join();
    mutex.unlock();
}

#ifdef __SANITIZE_THREAD__
TEST(Mutex, LetsThreadSanitizerSeeTheOrderOfLocks)
{
    EXPECT_EXIT(
        {
            ZQ::Mutex first;
            ZQ::Mutex second;
            for (const bool isReverse : {false, true}) {
                (isReverse ? second : first).lock(0xFFFFFFFF);
                (isReverse ? first : second).lock(0xFFFFFFFF);
                first.unlock();
                second.unlock();
            }
            std::exit(0);
        },
        testing::ExitedWithCode(66), "lock-order-inversion");
}
#endif

TEST(Mutex, WaitsForEverWith0xFFFFFFFF)
{
    ZQ::Mutex mutex;
    int order = 0;
    ASSERT_TRUE(mutex.lock(0xFFFFFFFF));
    std::thread waiting([&] {
        EXPECT_TRUE(mutex.lock(0xFFFFFFFF));
        EXPECT_EQ(order, 1);
        mutex.unlock();
    });
    std::this_thread::sleep_for(std::chrono::milliseconds(100));
    order = 1;
    mutex.unlock();
    waiting.join();
}

TEST(MessageBuffer, StrReturnsTheTextSinceTheLastStr)
{
    VXLog::VXMessageBuffer buffer;
    EXPECT_EQ(buffer.str(buffer << "only a literal"), "only a literal");
    EXPECT_EQ(buffer.str(buffer << "kind=" << 4294967295u << ", real=" << 0.1), "kind=4294967295, real=0.1");
    EXPECT_EQ(buffer.str(buffer << "" << 18446744073709551615ull << std::string("|")),
              "18446744073709551615|");
    EXPECT_EQ(buffer.str(buffer), "");
}

TEST(MessageBuffer, IgnoresTheGlobalLocale)
{
    const GlobalGroupingLocale grouping;
    VXLog::VXMessageBuffer buffer;
    EXPECT_EQ(buffer.str(buffer << "" << 1234567u << " " << 1.5), "1234567 1.5");
}

TEST(MessageBuffer, RoundsRealsToTheNearestTextInAnyRoundingMode)
{
    const int before = std::fegetround();
    for (const int mode : {FE_UPWARD, FE_DOWNWARD}) {
        ASSERT_EQ(std::fesetround(mode), 0);
        VXLog::VXMessageBuffer buffer;
        const std::string third = buffer.str(buffer << "" << 1.0 / 3);
        const std::string twoThirds = buffer.str(buffer << "" << 2.0 / 3);
        std::fesetround(before);
        EXPECT_EQ(third, "0.333333");
        EXPECT_EQ(twoThirds, "0.666667");
    }
}

TEST(MessageBuffer, StartsWithDefaultSettingsAfterABufferThatChangedThem)
{
    {
        VXLog::VXMessageBuffer buffer;
        std::ostream& stream = buffer << "left behind" << 1u;
        stream << std::hex << std::setfill('*') << std::setprecision(2) << std::setw(9);
        stream.imbue(groupingLocale());
        stream.setstate(std::ios_base::failbit);
    }
    VXLog::VXMessageBuffer buffer;
    EXPECT_EQ(buffer.str(buffer << "" << 1234567ull << ' ' << 1234567 << ' ' << 0.123456),
              "1234567 1234567 0.123456");
}

TEST(MessageBuffer, TakesALocaleOfSeveralNamesWhenMemoryRunsOut)
{
    const std::locale severalNames(std::locale::classic(), "C.UTF-8", std::locale::collate);
    VXLog::VXMessageBuffer buffer;
    std::ostream& stream = buffer;
    EXPECT_TRUE(allocation::completesWith(0, [&] { stream.imbue(severalNames); }));
}

TEST(MessageBuffer, ReleasesTheLocaleThatItsUserSet)
{
    for (const bool isSetInStream : {true, false}) {
        bool isDestroyed = false;
        {
            VXLog::VXMessageBuffer buffer;
            std::ostream& stream = buffer;
            const std::locale locale(std::locale::classic(), new ObservedDigits(isDestroyed));
            if (isSetInStream)
                stream.imbue(locale);
            else
                stream.rdbuf()->pubimbue(locale);
        }
        EXPECT_TRUE(isDestroyed) << isSetInStream;
    }
}

// The events that a callback on the stream of a message buffer was called for.
std::vector<std::ios_base::event>& streamEvents()
{
    static std::vector<std::ios_base::event> events;
    return events;
}

TEST(MessageBuffer, ForgetsTheWordsAndCallbacksOfTheBufferBefore)
{
    const int near = std::ios_base::xalloc();
    int far = near;
    while (far < near + 100)  // a stream has the first words in itself and allocates the others
        far = std::ios_base::xalloc();
    int object = 0;
    for (const int index : {near, far}) {
        for (const bool hasNumber : {true, false}) {
            {
                VXLog::VXMessageBuffer buffer;
                std::ostream& stream = buffer;
                if (hasNumber)
                    stream.iword(index) = 1;
                else
                    stream.pword(index) = &object;
            }
            VXLog::VXMessageBuffer buffer;
            std::ostream& stream = buffer;
            EXPECT_EQ(stream.iword(index), 0);
            EXPECT_EQ(stream.pword(index), nullptr);
        }
    }

    streamEvents().clear();
    const auto callback = [](std::ios_base::event event, std::ios_base&, int) {
        streamEvents().push_back(event);
    };
    {
        VXLog::VXMessageBuffer buffer;
        static_cast<std::ostream&>(buffer).register_callback(callback, 0);
    }
    // The last call is the one before the code of the callback may be unloaded.
    EXPECT_THAT(streamEvents(), testing::ElementsAre(std::ios_base::erase_event));
    {
        VXLog::VXMessageBuffer buffer;
        static_cast<std::ostream&>(buffer).imbue(groupingLocale());
    }
    EXPECT_THAT(streamEvents(), testing::ElementsAre(std::ios_base::erase_event));
}

TEST(MessageBuffer, KeepsAStreamForTheNextBuffer)
{
    const OnProcessor here(0);  // another processor may have kept an older stream
    const void* first = nullptr;
    {
        VXLog::VXMessageBuffer buffer;
        first = &static_cast<std::ostream&>(buffer << "used");
    }
    VXLog::VXMessageBuffer buffer;
    EXPECT_EQ(&static_cast<std::ostream&>(buffer), first);
}

TEST(MessageBuffer, MayBeUsedWhileAnotherIsInUse)
{
    VXLog::VXMessageBuffer outer;
    std::ostream& last = outer << "outer " << 1u;
    {
        VXLog::VXMessageBuffer inner;
        EXPECT_EQ(inner.str(inner << "inner " << 2u), "inner 2");
    }
    EXPECT_EQ(outer.str(last << " still"), "outer 1 still");
}

TEST(MessageBuffer, MayBeDestroyedOrConstructedOnAnotherThread)
{
    auto buffer = std::make_unique<VXLog::VXMessageBuffer>();
    EXPECT_EQ(buffer->str(*buffer << "made here"), "made here");
    std::thread([&buffer] { buffer.reset(); }).join();
    std::thread([&buffer] { buffer = std::make_unique<VXLog::VXMessageBuffer>(); }).join();
    EXPECT_EQ(buffer->str(*buffer << "made there"), "made there");
}

TEST(MessageBuffer, MayBeConstructedAndDestroyedOnAnyProcessor)
{
    std::unique_ptr<VXLog::VXMessageBuffer> buffer;
    for (const int first : processors) {
        for (const int second : processors) {
            {
                const OnProcessor here(first);
                buffer = std::make_unique<VXLog::VXMessageBuffer>();
            }
            EXPECT_EQ(buffer->str(*buffer << "number " << 17u), "number 17") << first << ' ' << second;
            *buffer << "left behind";
            const OnProcessor there(second);
            buffer.reset();
        }
    }
}

TEST(MessageBuffer, KeepsAtMostFourStreamsForEachOf16Processors)
{
    const OnProcessor here(9);
    const auto useAtOnce = [](std::size_t count) {
        std::vector<VXLog::VXMessageBuffer> buffers(count);
        for (VXLog::VXMessageBuffer& buffer : buffers) {
            EXPECT_EQ(buffer.str(buffer << "number " << 17u), "number 17");
            buffer << "left behind";
        }
    };
    useAtOnce(64);
    const long kept = allocation::aliveNow;
    useAtOnce(65);
    EXPECT_EQ(allocation::aliveNow, kept);
}

// std::exit destroys it after the thread-local objects of the main thread.
VXLog::VXMessageBuffer& globalBuffer()
{
    static VXLog::VXMessageBuffer buffer;
    return buffer;
}

TEST(MessageBuffer, AStaticBufferMayBeDestroyedAtExit)
{
    EXPECT_EXIT(
        {
            globalBuffer() << "used before the exit";
            std::exit(0);
        },
        testing::ExitedWithCode(0), "");
}

TEST(MessageBuffer, KeepsNulBytes)
{
    VXLog::VXMessageBuffer buffer;
    const std::string text("a\0b", 3);
    EXPECT_EQ(buffer.str(buffer << text), text);
}

TEST(MessageBuffer, IsCompleteOrThrowsWhenMemoryRunsOut)
{
    const std::string piece(1000, 'x');
    const std::string whole = "literal " + piece + "4294967295";
    for (long allowed = 0;; ++allowed) {
        ASSERT_LT(allowed, 100);
        std::string text;
        const bool completed = allocation::completesWith(allowed, [&] {
            VXLog::VXMessageBuffer buffer;
            text = buffer.str(buffer << "literal " << piece << 4294967295u);
        });
        if (completed) {
            EXPECT_EQ(text, whole) << "with memory for " << allowed << " allocations";
            EXPECT_GT(allowed, 0);
            break;
        }
    }
}

// Gives each test the default sink, and restores the earlier sink afterwards.
class Sink : public testing::Test {
protected:
    void SetUp() override { before_ = VXLog::setRecordSink(nullptr); }
    void TearDown() override { VXLog::setRecordSink(before_); }

    static void log(const std::string& message)
    {
        VXLog::VXLogger::logLevelMessage("work", "Worker", 12, "Some.Category", 6000, nullptr, 0, 0, message);
    }

    static void trace(const std::string& message)
    {
        VXLog::VXLogger::traceLevelMessage("work", "Worker", 12, "Some.Category", 6000, nullptr, 0, 0,
                                           message);
    }

    // What `write` writes to standard error.
    template <class Write>
    static std::string standardError(Write write)
    {
        testing::internal::CaptureStderr();
        write();
        return testing::internal::GetCapturedStderr();
    }

private:
    VXLog::RecordSink before_;
};

TEST_F(Sink, ReceivesAllNineFieldsAndTheKindOfRecord)
{
    char data = 'd';
    int seen = 0;
    VXLog::setRecordSink([&](const VXLog::Record& record) {
        EXPECT_EQ(record.kind, seen == 0 ? VXLog::Record::Kind::log : VXLog::Record::Kind::trace);
        EXPECT_STREQ(record.function, "function");
        EXPECT_STREQ(record.file, "file");
        EXPECT_EQ(record.line, 17);
        EXPECT_EQ(record.logger, "category");
        EXPECT_EQ(record.level, 3000);
        EXPECT_EQ(record.data, &data);
        EXPECT_EQ(record.a, -1);
        EXPECT_EQ(record.b, 2);
        EXPECT_EQ(record.message, std::string("text\0 and more", 14));
        ++seen;
    });
    const std::string message("text\0 and more", 14);
    VXLog::VXLogger::logLevelMessage("function", "file", 17, "category", 3000, &data, -1, 2, message);
    VXLog::VXLogger::traceLevelMessage("function", "file", 17, "category", 3000, &data, -1, 2, message);
    EXPECT_EQ(seen, 2);
}

TEST_F(Sink, IsReplacedByTheNextAndReturned)
{
    std::string texts;
    VXLog::setRecordSink([&](const VXLog::Record& record) { texts += "first " + record.message + ";"; });
    log("1");
    const auto first =
        VXLog::setRecordSink([&](const VXLog::Record& record) { texts += "second " + record.message + ";"; });
    log("2");
    VXLog::setRecordSink(first);
    log("3");
    EXPECT_EQ(texts, "first 1;second 2;first 3;");
}

TEST_F(Sink, IsReplacedForAllProcessors)
{
    std::string texts;
    const auto writeOnAll = [&texts] {
        texts.clear();
        for (const int number : processors) {
            const OnProcessor here(number);
            VXLog::VXMessageBuffer buffer;
            log(buffer.str(buffer << "" << number));
        }
        return texts;
    };
    VXLog::RecordSink first;
    for (const int number : processors) {
        SCOPED_TRACE(number);
        {
            const OnProcessor here(number);
            VXLog::setRecordSink(
                [&](const VXLog::Record& record) { texts += "first " + record.message + ';'; });
            first = VXLog::setRecordSink([&](const VXLog::Record& record) { texts += record.message + ';'; });
        }
        // A processor that keeps another sink makes later calls of setRecordSink wait for ever: end here.
        ASSERT_EQ(writeOnAll(), "0;1;2;3;4;5;6;7;8;9;10;11;12;13;14;15;16;20;1000;-1;");
        VXLog::setRecordSink(first);
        ASSERT_EQ(
            writeOnAll(),
            "first 0;first 1;first 2;first 3;first 4;first 5;first 6;first 7;first 8;first 9;"
            "first 10;first 11;first 12;first 13;first 14;first 15;first 16;first 20;first 1000;first -1;");
    }
}

TEST_F(Sink, AnEmptySinkRestoresTheDefault)
{
    VXLog::setRecordSink([](const VXLog::Record&) { FAIL(); });
    VXLog::setRecordSink(nullptr);
    EXPECT_THAT(standardError([] { log("back"); }), testing::EndsWith(": back\n"));
}

TEST_F(Sink, TheReturnedDefaultCanBeCalled)
{
    VXLog::RecordSink standard;
    standard = VXLog::setRecordSink([&](const VXLog::Record& record) { standard(record); });
    EXPECT_THAT(standardError([] { log("passed on"); }), testing::EndsWith(": passed on\n"));
}

TEST_F(Sink, MayCallTheDefaultSink)
{
    VXLog::setRecordSink([](const VXLog::Record& record) { VXLog::standardErrorSink(record); });
    EXPECT_THAT(standardError([] { log("passed on"); }), testing::EndsWith(" work: passed on\n"));
}

TEST_F(Sink, ExceptionsPropagateToTheCallerOfTheLogger)
{
    VXLog::setRecordSink([](const VXLog::Record&) { throw std::length_error("full"); });
    EXPECT_THROW(log("x"), std::length_error);
    EXPECT_THROW(trace("x"), std::length_error);
}

TEST_F(Sink, MayWriteRecordsAndReplaceItself)
{
    int depth = 0;
    VXLog::setRecordSink([&](const VXLog::Record&) {
        if (++depth < 3)
            log("again");
        else
            VXLog::setRecordSink([&](const VXLog::Record&) { depth = 100; });
    });
    log("x");
    EXPECT_EQ(depth, 3);
    log("y");
    EXPECT_EQ(depth, 100);
}

TEST_F(Sink, MayBeReplacedWhileThreadsWriteRecords)
{
    std::atomic<int> count {0};
    const auto counting = [&count](const VXLog::Record&) { ++count; };
    VXLog::setRecordSink(counting);
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i) {
        threads.emplace_back([] {
            for (int k = 0; k < 500; ++k)
                log("x");
        });
    }
    for (int k = 0; k < 200; ++k)
        VXLog::setRecordSink(counting);
    for (auto& thread : threads)
        thread.join();
    EXPECT_EQ(count, 2000);
}

TEST_F(Sink, WritesALogRecordToStandardErrorAsOneLine)
{
    EXPECT_THAT(
        standardError([] { log("some text"); }),
        testing::ContainsRegex("^[0-9]{4}-[0-9]{2}-[0-9]{2}T[0-9]{2}:[0-9]{2}:[0-9]{2}(\\.[0-9]{3})?Z "
                               "6000 Some\\.Category Worker:12 work: some text\n$"));
}

TEST_F(Sink, WritesTraceRecordsOnlyWhenVxlogTraceIsSet)
{
    EXPECT_EQ(standardError([] { trace("hidden"); }), "");
    {
        const Environment variable("VXLOG_TRACE", "1");
        EXPECT_THAT(standardError([] { trace("shown"); }),
                    testing::ContainsRegex(" 6000 trace Some\\.Category Worker:12 work: shown\n$"));
        EXPECT_THAT(standardError([] { log("log"); }), testing::HasSubstr(" 6000 Some.Category "));
    }
    EXPECT_EQ(standardError([] { trace("hidden"); }), "");
}

TEST_F(Sink, EscapesWhatCouldForgeALineOrDriveATerminal)
{
    const struct {
        std::string text;
        const char* written;
    } rows[] = {
        {"plain text, %n %s \"quoted\"", "plain text, %n %s \"quoted\""},
        {"a\nb", "a\\nb"},
        {"a\rb\tc", "a\\rb\\tc"},
        {std::string("a\0b", 3), "a\\x00b"},
        {"\x1b[31mred", "\\x1b[31mred"},
        {"\x7f", "\\x7f"},
        {"a\\nb", "a\\\\nb"},
        {"23 \xc2\xb0"
         "C, \xe2\x82\xac, \xf0\x9f\x98\x80",
         "23 \xc2\xb0"
         "C, \xe2\x82\xac, \xf0\x9f\x98\x80"},
        {"\x9b"
         "31m",
         "\\x9b31m"},  // one-byte control sequence introducer
        {"\xc2\x9b"
         "31m",
         "\\xc2\\x9b31m"},         // the same in UTF-8
        {"\xc2\xa0", "\xc2\xa0"},  // the first character after the controls
        {"\xe2\x80\xa8\xe2\x80\xa9", "\\xe2\\x80\\xa8\\xe2\\x80\\xa9"},  // line and paragraph separator
        {"\xc3", "\\xc3"},                                               // incomplete
        {"\xe2\x82", "\\xe2\\x82"},
        {"\xc3\x28", "\\xc3("},      // without a continuation byte
        {"\xc0\x8a", "\\xc0\\x8a"},  // an overlong newline
        {"\xe0\x80\x8a", "\\xe0\\x80\\x8a"},
        {"\xf0\x80\x80\x8a", "\\xf0\\x80\\x80\\x8a"},
        {"\xed\xa0\x80", "\\xed\\xa0\\x80"},           // a surrogate
        {"\xf4\x90\x80\x80", "\\xf4\\x90\\x80\\x80"},  // beyond U+10FFFF
        {"\xf4\x8f\xbf\xbd", "\xf4\x8f\xbf\xbd"},      // U+10FFFD
        {"\xff\xfe\x80", "\\xff\\xfe\\x80"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.written);
        EXPECT_THAT(standardError([&] { log(row.text); }),
                    testing::EndsWith(std::string(" work: ") + row.written + "\n"));
        EXPECT_EQ(VXLog::printable(row.text), row.written);
    }
}

TEST_F(Sink, EscapesWhatReordersOrHidesText)
{
    const struct {
        std::string text;
        const char* written;
    } rows[] = {
        {"\xe2\x80\xaa", "\\xe2\\x80\\xaa"},  // U+202A, left-to-right embedding
        {"gnp.\xe2\x80\xae"
         "exe",
         "gnp.\\xe2\\x80\\xaeexe"},                    // U+202E, right-to-left override
        {"\xe2\x80\xaf", "\xe2\x80\xaf"},              // U+202F, a narrow blank
        {"\xe2\x81\xa5", "\xe2\x81\xa5"},              // U+2065, unassigned
        {"\xe2\x81\xa6", "\\xe2\\x81\\xa6"},           // U+2066, left-to-right isolate
        {"\xe2\x81\xa9", "\\xe2\\x81\\xa9"},           // U+2069, the end of an isolate
        {"\xe2\x81\xb0", "\xe2\x81\xb0"},              // U+2070, superscript zero
        {"\xe2\x80\x8a", "\xe2\x80\x8a"},              // U+200A, hair space
        {"\xe2\x80\x8b", "\\xe2\\x80\\x8b"},           // U+200B, zero-width space
        {"\xe2\x80\x8f", "\\xe2\\x80\\x8f"},           // U+200F, right-to-left mark
        {"\xe2\x80\x90", "\xe2\x80\x90"},              // U+2010, hyphen
        {"\xc2\xac", "\xc2\xac"},                      // U+00AC, not sign
        {"\xc2\xad", "\\xc2\\xad"},                    // U+00AD, soft hyphen
        {"\xc2\xae", "\xc2\xae"},                      // U+00AE, registered sign
        {"\xd8\x9b", "\xd8\x9b"},                      // U+061B, Arabic semicolon
        {"\xd8\x9c", "\\xd8\\x9c"},                    // U+061C, Arabic letter mark
        {"\xef\xbb\xbe", "\xef\xbb\xbe"},              // U+FEFE
        {"\xef\xbb\xbf", "\\xef\\xbb\\xbf"},           // U+FEFF, byte order mark
        {"\xef\xbf\xb9", "\\xef\\xbf\\xb9"},           // U+FFF9, interlinear annotation
        {"\xef\xbf\xbc", "\xef\xbf\xbc"},              // U+FFFC, object replacement
        {"\xf3\x9f\xbf\xbf", "\xf3\x9f\xbf\xbf"},      // U+DFFFF
        {"\xf3\xa0\x80\x80", "\\xf3\\xa0\\x80\\x80"},  // U+E0000, the first tag
        {"\xf3\xa0\x81\xbf", "\\xf3\\xa0\\x81\\xbf"},  // U+E007F, the last tag
        {"\xf3\xa0\x82\x80", "\xf3\xa0\x82\x80"},      // U+E0080
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.written);
        EXPECT_THAT(standardError([&] { log(row.text); }),
                    testing::EndsWith(std::string(" work: ") + row.written + "\n"));
    }
}

TEST_F(Sink, EscapesOnlyWhatIsNotPrintable)
{
    const struct {
        std::string text;
        const char* written;
    } rows[] = {
        {"\xc2\x9f", "\\xc2\\x9f"},                    // the last control character
        {"\xf0\x8f\xbf\xbf", "\\xf0\\x8f\\xbf\\xbf"},  // U+FFFF, overlong
        {"\xf0\x90\x80\x80", "\xf0\x90\x80\x80"},      // U+10000
        {"\xe0\x9f\xbf", "\\xe0\\x9f\\xbf"},           // U+07FF, overlong
        {"\xe0\xa0\x80", "\xe0\xa0\x80"},              // U+0800
        {"\xed\x9f\xbf", "\xed\x9f\xbf"},              // before the surrogates
        {"\xed\xbf\xbf", "\\xed\\xbf\\xbf"},           // the last surrogate
        {"\xee\x80\x80", "\xee\x80\x80"},              // after the surrogates
    };
    for (const auto& row : rows)
        EXPECT_THAT(standardError([&] { log(row.text); }),
                    testing::EndsWith(std::string(" work: ") + row.written + "\n"));
}

TEST_F(Sink, WritesOneLineForEveryByte)
{
    for (int byte = 0; byte < 256; ++byte) {
        const std::string line = standardError([byte] { log(std::string(3, static_cast<char>(byte))); });
        EXPECT_EQ(std::count(line.begin(), line.end(), '\n'), 1) << byte;
        EXPECT_EQ(line.find_first_of(std::string("\0\x1b\x7f\r\b", 5)), std::string::npos) << byte;
    }
}

TEST_F(Sink, EscapesCategoryFileAndFunction)
{
    EXPECT_THAT(standardError(
                    [] { VXLog::VXLogger::logLevelMessage("f\n", "F\n", 1, "C\n", 1, nullptr, 0, 0, "m"); }),
                testing::EndsWith(" 1 C\\n F\\n:1 f\\n: m\n"));
}

// A sink whose copy constructor throws while `fail` is set.
struct ThrowingCopy {
    static bool fail;
    ThrowingCopy() = default;
    ThrowingCopy(const ThrowingCopy&)
    {
        if (fail)
            throw std::length_error("no copy");
    }
    void operator()(const VXLog::Record&) const { ++calls; }
    static int calls;
};
bool ThrowingCopy::fail = false;
int ThrowingCopy::calls = 0;

TEST_F(Sink, StaysWhenItCannotBeCopied)
{
    VXLog::setRecordSink(ThrowingCopy());
    ThrowingCopy::fail = true;
    EXPECT_THROW(VXLog::setRecordSink([](const VXLog::Record&) {}), std::length_error);
    ThrowingCopy::fail = false;
    log("x");
    EXPECT_EQ(ThrowingCopy::calls, 1);
    VXLog::setRecordSink(nullptr);
}

}  // namespace
