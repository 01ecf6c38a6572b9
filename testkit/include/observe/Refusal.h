#pragma once

#include <cstddef>
#include <exception>
#include <string>
#include <typeinfo>
#include <vector>

#include <gtest/gtest.h>

#include "observe/Platform.h"

// Checks for a refusal: a log record, the same record again as a trace record, then the exception.
//
// In a program that includes this header, observe::reset() runs before each test, and each test fails if it leaves a
// message buffer alive or a lock held.

namespace observe {

// Adds a refusal that a test expected to GoogleTest's report of that test: a property with the name
// "file|function|level|message", where # stands for each run of digits, and the value "type of the exception|what()".
inline void report(const std::string& function, const std::string& file, int level,
                   const std::string& message, const std::string& exception)
{
    std::string pattern;
    for (const char character : message) {
        const bool digit = character >= '0' && character <= '9';
        if (!digit || pattern.empty() || pattern.back() != '#')
            pattern += digit ? '#' : character;
    }
    testing::Test::RecordProperty(file + '|' + function + '|' + std::to_string(level) + '|' + pattern,
                                  exception);
}

}  // namespace observe

// Expects records[first] to be a log record and records[first + 1] its trace record, with these fields and with null,
// 0 and 0 for `data`, `a` and `b`. Returns their line, or 0 if there are too few records. For operations that write
// several pairs, or that write without throwing:
//
//   const auto records = observe::records();
//   ASSERT_EQ(records.size(), 4u);
//   expectRecordPair(records, 0, "setProperty", "Node", "Vexilon.IC.Node", 3000, "setProperty: 7 true");
//   expectRecordPair(records, 2, "setProperty", "Node", "Vexilon.IC.Node", 6000, "setProperty: 7 read-only");
inline int expectRecordPair(const std::vector<observe::Record>& records, std::size_t first,
                            const std::string& function, const std::string& file, const std::string& category,
                            int level, const std::string& message)
{
    if (records.size() < first + 2) {
        ADD_FAILURE() << "records " << first << " and " << first + 1 << " are missing, expected: " << message;
        return 0;
    }
    if (level == 6000)
        observe::report(function, file, level, message, std::string());
    for (const bool trace : {false, true}) {
        SCOPED_TRACE(trace ? "trace record" : "log record");
        const observe::Record& record = records[first + (trace ? 1 : 0)];
        EXPECT_EQ(record.trace, trace);
        EXPECT_EQ(record.function, function);
        EXPECT_EQ(record.file, file);
        EXPECT_GT(record.line, 0);
        EXPECT_EQ(record.logger, category);
        EXPECT_EQ(record.level, level);
        EXPECT_EQ(record.data, nullptr);
        EXPECT_EQ(record.a, 0);
        EXPECT_EQ(record.b, 0);
        EXPECT_EQ(record.message, message);
    }
    EXPECT_EQ(records[first].line, records[first + 1].line);
    return records[first].line;
}

// Expects the operation to write exactly one such pair, of level 6000, and to throw this exception with this what().
// An exception of a derived class fails the test. Returns the line in the records, or 0 if they are missing. The caller
// checks that the object is unchanged.
//
//   expectRefusal<std::out_of_range>([&] { return static_cast<bool>(number); },
//                                    "operator bool", "Number", "Vexilon.IC.Number",           // where
//                                    "bool: Can't return current value as a Boolean, kind=2",  // logged
//                                    "Can't return current value as a Boolean");               // what()
template <class Exception, class Operation>
int expectRefusal(Operation operation, const std::string& function, const std::string& file,
                  const std::string& category, const std::string& logged, const std::string& sentence)
{
    const std::size_t before = observe::records().size();
    try {
        static_cast<void>(operation());
        ADD_FAILURE() << "no exception was thrown, expected: " << sentence;
    } catch (const Exception& exception) {
        EXPECT_TRUE(typeid(exception) == typeid(Exception)) << typeid(exception).name();
        EXPECT_EQ(std::string(exception.what()), sentence);
    } catch (const std::exception& other) {
        ADD_FAILURE() << "another exception was thrown: " << typeid(other).name() << ": " << other.what();
    } catch (...) {
        ADD_FAILURE() << "another exception was thrown, expected: " << sentence;
    }
    const std::vector<observe::Record> records = observe::records();
    EXPECT_EQ(records.size(), before + 2) << "records written by the refusal: " << records.size() - before;
    const int line = expectRecordPair(records, before, function, file, category, 6000, logged);
    observe::report(function, file, 6000, logged,
                    std::string(typeid(Exception).name()).append("|").append(sentence));
    return line;
}

namespace observe {

// A message that the library writes twice: as a log record and as a trace record.
struct Message {
    std::string function;
    std::string logger;
    int level;
    std::string text;
};

}  // namespace observe

// Expects the records since the start of the test, or since observe::reset(), to be those of these messages in this
// order, and no others.
//
//   expectRecords({{"setProperty", "Vexilon.IC.Node", 3000, "setProperty: 7 true"}});
inline void expectRecords(const std::vector<observe::Message>& expected)
{
    const auto line = [](bool trace, const std::string& function, const std::string& logger, int level,
                         const std::string& text) {
        std::string result(trace ? "trace " : "log   ");
        result.append(function).append(" ").append(logger).append(" ").append(std::to_string(level));
        return result.append(": ").append(text).append("\n");
    };
    std::string wanted;
    for (const observe::Message& message : expected)
        for (const bool trace : {false, true})
            wanted += line(trace, message.function, message.logger, message.level, message.text);
    std::string written;
    for (const observe::Record& record : observe::records())
        written += line(record.trace, record.function, record.logger, record.level, record.message);
    EXPECT_EQ(written, wanted);  // GoogleTest prints the difference of texts that have several lines
}

namespace observe {

// Begins each test with reset() and checks what it leaves behind.
class ObserveEachTest : public testing::EmptyTestEventListener {
public:
    // Runs before main. GoogleTest deletes the listener.
    static bool append()
    {
        testing::UnitTest::GetInstance()->listeners().Append(new ObserveEachTest);
        return true;
    }

private:
    void OnTestStart(const testing::TestInfo&) override { reset(); }

    void OnTestEnd(const testing::TestInfo&) override
    {
        EXPECT_EQ(buffersAlive(), 0);
        EXPECT_EQ(locksHeld(), 0);
    }
};

inline const bool everyTestIsObserved = ObserveEachTest::append();

}  // namespace observe
