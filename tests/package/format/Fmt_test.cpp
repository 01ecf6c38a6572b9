#include "IC/fmt.h"

#include <iterator>
#include <string>
#include <string_view>
#include <vector>

#include <fmt/ranges.h>
#include <gtest/gtest.h>

#include "Texts.h"

// FMT_STRING checks a format when it is compiled, also as C++17.

TEST(Fmt, FormatsEveryText)
{
    forEveryText([](const auto& value, std::string_view text) {
        EXPECT_EQ(fmt::format("{}", value), text);
        EXPECT_EQ(fmt::format(FMT_STRING("{0}, {0}"), value), std::string(text).append(", ").append(text));
    });
}

TEST(Fmt, TakesTheOptionsOfATextForEveryText)
{
    forEveryText([](const auto& value, std::string_view text) {
        EXPECT_EQ(fmt::format(FMT_STRING("{:*^99.3s}"), value), fmt::format("{:*^99.3s}", text));
        EXPECT_EQ(fmt::format("{:{}.{}}", value, 20, 10), fmt::format("{:{}.{}}", text, 20, 10));
    });
}

TEST(Fmt, FillsAlignsAndCuts)
{
    const IC::Number speed(3600u);
    EXPECT_EQ(fmt::format("[{:6}]", speed), "[3600  ]");  // a text is aligned to the left
    EXPECT_EQ(fmt::format("[{:>6}]", speed), "[  3600]");
    EXPECT_EQ(fmt::format("[{:*^7}]", speed), "[*3600**]");
    EXPECT_EQ(fmt::format("[{:.2}]", speed), "[36]");
    EXPECT_EQ(fmt::format("[{:2}]", speed), "[3600]");
    EXPECT_EQ(fmt::format("[{:>23}]", IC::Node(20)), "[ Node  : 20, status = 0]");
}

TEST(Fmt, KeepsNulsWithinItsWidth)
{
    using namespace std::string_literals;
    EXPECT_EQ(fmt::format("{:->5}", IC::PropertyValue("a\0b"s)), "--a\0b"s);
}

TEST(Fmt, RefusesTheOptionsOfANumber)
{
    for (const std::string format : {"{:d}", "{:x}", "{:+}", "{:#}", "{:06}"})
        EXPECT_THROW(static_cast<void>(fmt::format(fmt::runtime(format), IC::Number(3600u))),
                     fmt::format_error)
            << format;
}

TEST(Fmt, FormatsIntoWhatIsThere)
{
    std::string line = "speed ";
    fmt::format_to(std::back_inserter(line), "{} of {}", IC::Number(3600u), IC::EnumValue(7u));
    EXPECT_EQ(line, "speed 3600 of 7");
}

// Quotes would make texts of numbers.
TEST(Fmt, QuotesNothingInARange)
{
    const std::vector<IC::Number> numbers = {1u, 0.5};
    EXPECT_EQ(fmt::format("{}", numbers), "[1, 0.5]");
    EXPECT_EQ(fmt::format("{:>3}", fmt::join(numbers, "|")), "  1|0.5");
}
