#include "IC/format.h"

#include <iostream>
#include <iterator>
#include <limits>
#include <string>
#include <string_view>
#include <vector>

#include "Texts.h"

// Without GoogleTest, which Debian builds with a standard library that may lack <format>.

namespace {

int compared = 0;
int different = 0;

void expectEqual(std::string_view actual, std::string_view expected)
{
    ++compared;
    if (actual != expected) {
        ++different;
        std::cout << "got \"" << actual << "\" instead of \"" << expected << "\"\n";
    }
}

void expectRefused(std::string_view format, const IC::Number& number)
{
    std::string outcome = "formatted";
    try {
        static_cast<void>(std::vformat(format, std::make_format_args(number)));
    } catch (const std::format_error&) {
        outcome = "refused";
    }
    expectEqual(outcome, "refused");
}

}  // namespace

int main()
{
    forEveryText([](const auto& value, std::string_view text) {
        expectEqual(std::format("{}", value), text);
        expectEqual(std::format("{:*^99.3s}", value), std::format("{:*^99.3s}", text));
        expectEqual(std::format("{:{}.{}}", value, 20, 10), std::format("{:{}.{}}", text, 20, 10));
    });

    expectEqual(std::format("{}", IC::Number(-std::numeric_limits<double>::quiet_NaN())), "-nan");

    const IC::Number speed(3600u);
    expectEqual(std::format("[{:6}]", speed), "[3600  ]");
    expectEqual(std::format("[{:>6}]", speed), "[  3600]");
    expectEqual(std::format("[{:*^7}]", speed), "[*3600**]");
    expectEqual(std::format("[{:.2}]", speed), "[36]");
    expectEqual(std::format("[{:>23}]", IC::Node(20)), "[ Node  : 20, status = 0]");
    expectEqual(std::format("{:->5}", IC::PropertyValue(std::string("a\0b", 3))),
                std::string_view("--a\0b", 5));

    for (const std::string_view format : {"{:d}", "{:x}", "{:+}", "{:#}", "{:06}"})
        expectRefused(format, speed);

    std::string line = "speed ";
    std::format_to(std::back_inserter(line), "{} of {}", speed, IC::EnumValue(7u));
    expectEqual(line, "speed 3600 of 7");

#if defined(__cpp_lib_format_ranges)
    expectEqual(std::format("{}", std::vector<IC::Number> {1u, 0.5}), "[1, 0.5]");
#endif

    std::cout << compared << " compared, " << different << " different\n";
    return different == 0 ? 0 : 1;
}
