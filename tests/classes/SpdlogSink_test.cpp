// What VXLog::SpdlogSink passes to a logger of spdlog.

#include "VXLog/SpdlogSink.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <spdlog/sinks/base_sink.h>
#include <spdlog/sinks/ostream_sink.h>

#include <algorithm>
#include <memory>
#include <mutex>
#include <sstream>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

#include "VXLog/RecordSink.h"
#include "VXLog/VXLogger.h"

namespace {

void log(const std::string& message, int level = 6000)
{
    VXLog::VXLogger::logLevelMessage("work", "folder/Worker.cpp", 12, "Some.Category", level, nullptr, 0, 0,
                                     message);
}

void trace(const std::string& message)
{
    VXLog::VXLogger::traceLevelMessage("work", "folder/Worker.cpp", 12, "Some.Category", 6000, nullptr, 0, 0,
                                       message);
}

// Connects a logger, which writes level, place and text.
class SpdlogSink : public testing::Test {
protected:
    void SetUp() override
    {
        logger->set_pattern("%n %l %@ %! %v");
        logger->set_level(spdlog::level::trace);
        before_ = VXLog::setRecordSink(VXLog::SpdlogSink(logger));
    }
    void TearDown() override { VXLog::setRecordSink(before_); }

    // What was written since the last call.
    std::string written()
    {
        const std::string text = stream_.str();
        stream_.str("");
        return text;
    }

private:
    std::ostringstream stream_;
    VXLog::RecordSink before_;

protected:
    const std::shared_ptr<spdlog::logger> logger =
        std::make_shared<spdlog::logger>("agent", std::make_shared<spdlog::sinks::ostream_sink_mt>(stream_));
};

TEST_F(SpdlogSink, PassesLevelPlaceCategoryFunctionAndMessage)
{
    log("no such fan");
    EXPECT_EQ(written(), "agent error folder/Worker.cpp:12 work Some.Category work: no such fan\n");
}

TEST_F(SpdlogSink, MapsLevel6000AndAboveToErrorOthersToInfoAndTraceRecordsToTrace)
{
    const struct {
        int level;
        const char* word;
    } rows[] = {{-1, "info"},    {0, "info"},     {3000, "info"},       {5999, "info"},
                {6000, "error"}, {6001, "error"}, {2147483647, "error"}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.level);
        log("text", row.level);
        EXPECT_EQ(written(),
                  std::string("agent ") + row.word + " folder/Worker.cpp:12 work Some.Category work: text\n");
    }
    trace("text");
    EXPECT_EQ(written(), "agent trace folder/Worker.cpp:12 work Some.Category work: text\n");
}

TEST_F(SpdlogSink, LeavesTheLevelsThatAreWrittenToTheLogger)
{
    logger->set_level(spdlog::level::err);
    log("text", 3000);
    trace("text");
    EXPECT_EQ(written(), "");
    log("text");
    EXPECT_EQ(written(), "agent error folder/Worker.cpp:12 work Some.Category work: text\n");
    logger->set_level(spdlog::level::off);
    log("text");
    EXPECT_EQ(written(), "");
}

TEST_F(SpdlogSink, KeepsRecordsForTheBacktraceOfTheLogger)
{
    logger->set_level(spdlog::level::err);
    logger->enable_backtrace(10);
    log("text", 3000);
    EXPECT_EQ(written(), "");
    logger->dump_backtrace();
    EXPECT_THAT(written(),
                testing::HasSubstr("agent info folder/Worker.cpp:12 work Some.Category work: text\n"));
}

TEST_F(SpdlogSink, EscapesWhatCouldForgeALineAndFormatsNothing)
{
    VXLog::VXLogger::logLevelMessage("wo\nrk", "file", 1, "Cat\negory", 6000, nullptr, 0, 0,
                                     std::string("a\nb\0c\x1b[2J{}%v\xff\xc3\xa4", 16));
    const std::string text = written();
    EXPECT_THAT(text, testing::EndsWith(" Cat\\negory wo\\nrk: a\\nb\\x00c\\x1b[2J{}%v\\xff\xc3\xa4\n"));
}

TEST_F(SpdlogSink, WritesTheRecordsOfSeveralThreadsWhole)
{
    constexpr int threads = 4;
    constexpr int records = 500;
    std::vector<std::thread> running;
    for (int thread = 0; thread < threads; ++thread) {
        running.emplace_back([] {
            for (int i = 0; i < records; ++i)
                log(std::string(200, 'x'));
        });
    }
    for (auto& thread : running)
        thread.join();
    const std::string line =
        "agent error folder/Worker.cpp:12 work Some.Category work: " + std::string(200, 'x') + "\n";
    std::string lines;
    for (int i = 0; i < threads * records; ++i)
        lines += line;
    EXPECT_TRUE(written() == lines);
}

// Throws what is not derived from std::exception, which spdlog passes on.
class ThrowingSink : public spdlog::sinks::base_sink<std::mutex> {
    void sink_it_(const spdlog::details::log_msg& /*message*/) override { throw 7; }
    void flush_() override { }
};

TEST_F(SpdlogSink, PropagatesWhatTheLoggerThrows)
{
    logger->sinks() = {std::make_shared<ThrowingSink>()};
    logger->set_error_handler([](const std::string&) {});  // which spdlog also calls
    EXPECT_THROW(log("text"), int);
}

TEST(NoSpdlogLogger, IsRefused)
{
    EXPECT_THROW(VXLog::SpdlogSink(nullptr), std::invalid_argument);
}

}  // namespace
