// RealText [COUNT]: compares the texts of reals, and of arrays of a hundred reals, with those that new streams write.
// First come powers of ten and of two with their neighbours, and denormals; then COUNT reals: random bits, random
// decimals of up to 17 digits, halfway cases. Exits with 1 at the first difference.
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <iostream>
#include <limits>
#include <random>
#include <sstream>
#include <string>

#include "IC/Number.h"
#include "IC/Property.h"

namespace {

std::mt19937_64 randomBits(20260801);

// Collects the reals and their texts, and compares each hundred.
bool agreesInArray(double real, const std::string& text)
{
    constexpr std::size_t count = 100;
    static IC::NumberArray reals;
    static std::string expected;
    reals.emplace_back(real);
    expected += (reals.size() == 1 ? "{" : ", ") + text;
    if (reals.size() < count)
        return true;
    expected += '}';
    const std::string written = IC::PropertyValue(reals);
    const bool same = written == expected;
    if (!same)
        std::cout << "an array is written " << written << " instead of " << expected << '\n';
    reals.clear();
    expected.clear();
    return same;
}

bool agree(double real)
{
    std::ostringstream stream;
    stream << real;
    if (std::string(IC::Number(real)) == stream.str())
        return agreesInArray(real, stream.str());
    std::cout << std::hexfloat << real << " is written " << std::string(IC::Number(real)) << " instead of "
              << stream.str() << '\n';
    return false;
}

bool agreeAround(double real)
{
    constexpr double infinity = std::numeric_limits<double>::infinity();
    return agree(real) && agree(-real) && agree(std::nextafter(real, infinity))
        && agree(std::nextafter(real, -infinity));
}

bool agreeAtEdges()
{
    bool same = agreeAround(0.0) && agreeAround(std::numeric_limits<double>::infinity())
        && agree(std::numeric_limits<double>::quiet_NaN()) && agree(-std::numeric_limits<double>::quiet_NaN())
        && agreeAround(std::numeric_limits<double>::denorm_min());
    for (int exponent = -1074; exponent <= 1023; ++exponent)
        same = same && agreeAround(std::ldexp(1.0, exponent));
    for (int exponent = -323; exponent <= 308; ++exponent) {
        const std::string power = std::to_string(exponent);
        for (const char* digits : {"1", "9.99999", "9.999995", "9.9999949999", "1.000005", "1.234565", "5"})
            same = same
                && agreeAround(std::strtod(std::string(digits).append("e").append(power).c_str(), nullptr));
    }
    return same;
}

double ofRandomBits()
{
    const std::uint64_t bits = randomBits();
    double real = 0.0;
    std::memcpy(&real, &bits, sizeof real);
    return real;
}

// Moves the point by up to 45 digits.
double moved(double real)
{
    const double power = std::pow(10.0, static_cast<double>(randomBits() % 46));
    return randomBits() % 2 == 0 ? real * power : real / power;
}

// A decimal of up to 17 digits.
double randomDecimal()
{
    const double longest = std::pow(10.0, static_cast<double>(randomBits() % 17 + 1));
    return moved(static_cast<double>(randomBits() % static_cast<std::uint64_t>(longest)));
}

// Six digits and a five, moved: about the middle between two texts, mostly the nearest real or one of its neighbours.
double halfway()
{
    const auto digits = static_cast<double>((randomBits() % 1000000) * 10 + 5);
    const double real = moved(digits);
    const auto choice = randomBits() % 3;
    return choice == 0 ? real : std::nextafter(real, choice == 1 ? 0.0 : 1e99);
}

}  // namespace

int main(int argc, char** argv)
{
    const long long count = argc > 1 ? std::atoll(argv[1]) : 1000000000;
    bool same = agreeAtEdges();
    for (long long i = 0; same && i < count / 4; ++i) {
        const double decimal = randomDecimal();
        same = agree(ofRandomBits()) && agree(decimal) && agree(-decimal) && agree(halfway());
    }
    if (same)
        std::cout << count << " reals are written as streams write them\n";
    return same ? EXIT_SUCCESS : EXIT_FAILURE;
}
