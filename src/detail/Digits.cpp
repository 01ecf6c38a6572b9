#include "detail/Digits.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstdlib>

namespace IC::detail {

namespace {

// Powers of ten. A double holds those from 1e0 on exactly, and the others with an error below 2^-53 of them.
constexpr double powers[] = {1e-15, 1e-14, 1e-13, 1e-12, 1e-11, 1e-10, 1e-9, 1e-8, 1e-7, 1e-6, 1e-5,
                             1e-4,  1e-3,  1e-2,  1e-1,  1e0,   1e1,   1e2,  1e3,  1e4,  1e5,  1e6,
                             1e7,   1e8,   1e9,   1e10,  1e11,  1e12,  1e13, 1e14, 1e15};
constexpr int largestPower = 15;

constexpr double powerOfTen(int exponent)
{
    return powers[exponent + largestPower];
}

// The decimal exponent of 2^exponent, for |exponent| < 1650.
constexpr int decimalExponent(int exponent)
{
    return exponent * 315653 >> 20;
}

// The six digits of a number, each in a byte, the first in the lowest.
std::uint64_t sixDigits(std::uint32_t number)
{
    const auto pair = [](std::uint32_t two) {
        const char* const text = digitPairs<10>.data() + 2 * std::size_t {two};
        const auto first = static_cast<unsigned char>(text[0]);
        const auto second = static_cast<unsigned char>(text[1]);
        return std::uint64_t {first} | std::uint64_t {second} << 8;
    };
    const std::uint32_t high = number / 10000;
    const std::uint32_t low = number % 10000;
    return pair(high) | pair(low / 100) << 16 | pair(low % 100) << 32;
}

// Writes all eight bytes, the lowest first.
void store(char* out, std::uint64_t text)
{
    if constexpr (__BYTE_ORDER__ == __ORDER_BIG_ENDIAN__)
        text = __builtin_bswap64(text);
    std::memcpy(out, &text, sizeof text);
}

// Writes a real with six significant digits if up to three multiplications find them for certain; otherwise returns
// null.
//
// Scaling by powers of ten moves six digits before the point. A multiplication adds an error below 2^-32; in a rounding
// mode other than to the nearest, below 2^-31. Three of them stay below `uncertain`. A result that is further than that
// from the middle between two integers has the same nearest integer as the exact product. Only the check asks for the
// distance, so the digits do not wait for it.
char* writeSixDigits(char* out, double real)
{
    constexpr double uncertain = 0x1p-29;
    constexpr int digits = 6;

    std::uint64_t bits = 0;
    std::memcpy(&bits, &real, sizeof bits);
    double scaled = std::fabs(real);
    int exponent = decimalExponent(static_cast<int>(bits >> 52 & 0x7ff) - 1023);
    int power = digits - 1 - exponent;
    if (power > largestPower) {
        scaled *= powerOfTen(largestPower);
        power -= largestPower;
    } else if (power < -largestPower) {
        scaled *= powerOfTen(-largestPower);
        power += largestPower;
    }
    if (power > largestPower || power < -largestPower)
        return nullptr;  // also infinity, a NaN and 0
    scaled *= powerOfTen(power);
    if (scaled >= powerOfTen(digits)) {  // 2^exponent is below a power of ten, and the real is not
        ++exponent;
        scaled *= powerOfTen(-1);
    }
    // NOLINTNEXTLINE(bugprone-incorrect-roundings): what lies in the middle is refused
    const auto number = static_cast<std::uint32_t>(scaled + 0.5);
    if (std::fabs(scaled - number) >= 0.5 - uncertain)
        return nullptr;
    if (number > 999999)
        return nullptr;

    const std::uint64_t text = sixDigits(number);
    const int length = 8 - __builtin_clzll(text ^ 0x303030303030) / 8;  // without the zeros at the end

    *out = '-';
    out += bits >> 63;
    const bool scientific = exponent >= digits || exponent < -4;
    if (exponent < 0 && !scientific) {
        std::copy_n("0.000", 5, out);
        out += 1 - exponent;
        store(out, text);
        return out + length;
    }
    const int whole = scientific ? 1 : exponent + 1;
    store(out, text);
    out += whole;
    if (length > whole) {
        *out++ = '.';
        store(out, text >> 8 * whole);
        out += length - whole;
    }
    if (!scientific)
        return out;
    *out++ = 'e';
    *out++ = exponent < 0 ? '-' : '+';
    return writeTwoDigits(out, static_cast<std::uint32_t>(std::abs(exponent)));
}

}  // namespace

char* writeReal(char* out, double real)
{
    if (char* const end = writeSixDigits(out, real))
        return end;
    if (std::isnan(real))  // std::to_chars may write more than a stream does
        return std::signbit(real) ? std::copy_n("-nan", 4, out) : std::copy_n("nan", 3, out);
    return std::to_chars(out, out + longestReal, real, std::chars_format::general, 6).ptr;
}

std::string hexOf(std::string_view bytes)
{
    std::string hex(2 * bytes.size(), '0');
    char* out = hex.data();
    for (const char byte : bytes)
        out = writeHex(out, static_cast<unsigned char>(byte));
    return hex;
}

}  // namespace IC::detail
