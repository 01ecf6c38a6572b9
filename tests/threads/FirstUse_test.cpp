// Eight threads of a new process use the whole library for the first time, at the same time. CTest runs each test in
// its own process, and nothing here uses the library before the threads do.

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <sstream>
#include <string>

#include "AtOnce.h"
#include "IC/Alert.h"
#include "IC/ICException.h"
#include "IC/Node.h"

namespace {

// Writes a value of every class that has a text, and the texts of refusals; the default sink writes their records.
std::string useEverything()
{
    const IC::Node node(20);
    std::ostringstream out;
    out << node << ' ' << node.hexstring("\xff") << ' ' << IC::pB(0xa0) << ' ' << IC::Number(0.1) << ' '
        << IC::Number(-7) << ' ' << IC::Number(IC::NodeRef {20, 1}) << ' ' << IC::EnumValue(7u) << ' '
        << IC::PropertyValue(IC::StringArray {"a"}) << ' ' << IC::Error("text", 5) << ' ';
    ZQ::DateTime time(1234567890, 3);
    const IC::Alert alert(time, 1, 2, {"ab"}, 3, "text");
    out << alert << ' ' << alert.hexstring("\x01") << ' ';
    try {
        static_cast<void>(IC::PropertyValue("text").operator unsigned int());
    } catch (const IC::PropertyValueInvalidKind& refusal) {
        out << refusal.what() << ' ';
    }
    try {
        const IC::Node none(74);
    } catch (const IC::NodeInvalidSensor& refusal) {
        out << refusal.what();
    }
    return out.str();
}

class FirstUse : public testing::TestWithParam<int> { };

TEST_P(FirstUse, OfEverythingMayHappenOnAllThreadsAtOnce)
{
    try {
        throw 0;  // the first exception of a process initialises the C++ runtime
    } catch (int) {
    }
    std::array<std::string, threadCount> seen;
    testing::internal::CaptureStderr();
    runAtOnce([&seen](int number) { seen.at(static_cast<std::size_t>(number)) = useEverything(); });
    const std::string records = testing::internal::GetCapturedStderr();
    for (const std::string& text : seen)
        EXPECT_EQ(text,
                  "Node  : 20, status = 0 ff a0 0.1 -7 Fan:1 7 {\"a\"} 5 - text "
                  "Alert 1; 2; 3; text; 2009-02-13T23:31:30Z; { 6162 } 01 "
                  "Can't return current value as a Number "
                  "74 is not a valid sensor. The largest possible sensor is 73");
    EXPECT_EQ(std::count(records.begin(), records.end(), '\n'), 2 * threadCount);
}

INSTANTIATE_TEST_SUITE_P(FreshProcess, FirstUse, testing::Range(0, 10));

}  // namespace
