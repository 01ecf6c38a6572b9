// RandomReals [COUNT [SEED]]: converts random reals, each to one type that a real converts to, and compares value,
// exception and records with those of the model (Number.h). Prints SEED. Exits with 1 at the first difference.
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <iostream>
#include <random>

#include "Agreement.h"
#include "Pairs.h"

namespace {

class RandomReals {
public:
    explicit RandomReals(std::uint64_t seed) : bits_(seed) { }

    // In turn: a real of random bits, one of a random magnitude from 2^-4 to 2^70, one near a limit of an integer type.
    double next(unsigned long long turn)
    {
        switch (turn % 3) {
        case 0:
            return ofAnyBits();
        case 1:
            return ofAnyMagnitude();
        default:
            return besideALimit();
        }
    }

private:
    double ofAnyBits()
    {
        const std::uint64_t bits = bits_();
        double real = 0.0;
        std::memcpy(&real, &bits, sizeof real);
        return real;
    }

    double ofAnyMagnitude()
    {
        const auto exponent = static_cast<int>(bits_() % 74) - 4;
        return withSign(std::ldexp(static_cast<double>(bits_() >> 11), exponent - 53));
    }

    double besideALimit()
    {
        constexpr int powers[] = {0, 1, 8, 16, 31, 32, 53, 63, 64};
        const double limit = std::ldexp(1.0, powers[bits_() % std::size(powers)]);
        // In steps of 0.25, or of the distance to the next real.
        const double step = bits_() % 2 == 0 ? std::nextafter(limit, 0x1p70) - limit : 0.25;
        return withSign(limit + step * (static_cast<double>(bits_() % 17) - 8.0));
    }

    double withSign(double real) { return bits_() % 8 == 0 ? -real : real; }

    std::mt19937_64 bits_;
};

// Converts each real to one type only, the types in turn, because refusals take most of the time.
bool agree(double real, unsigned long long turn)
{
    constexpr agreement::Target targets[] = {agreement::BOOL, agreement::INT, agreement::UINT32,
                                             agreement::UINT64, agreement::REAL};
    const agreement::NumberPair pair = agreement::pairOf(real);
    const std::string found =
        agreement::differenceInConversion(pair.actual, pair.expected, targets[turn % std::size(targets)]);
    if (!found.empty())
        std::cout << std::hexfloat << real << ' ' << found << '\n';
    return found.empty();
}

}  // namespace

int main(int argc, char** argv)
{
    const unsigned long long count = argc > 1 ? std::strtoull(argv[1], nullptr, 10) : 1000000000;
    const unsigned long long seed = argc > 2 ? std::strtoull(argv[2], nullptr, 10) : 20260801;
    std::cout << "seed " << seed << std::endl;
    RandomReals reals(seed);
    for (unsigned long long i = 0; i < count; ++i)
        if (!agree(reals.next(i), i))
            return EXIT_FAILURE;
    std::cout << count << " reals convert as the model says\n";
    return EXIT_SUCCESS;
}
