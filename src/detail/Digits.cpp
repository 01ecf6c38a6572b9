#include "detail/Digits.h"

#include <algorithm>
#include <charconv>
#include <cmath>

namespace IC::detail {

namespace {

// Writes a real with six significant digits if one multiplication finds them for certain; otherwise returns null.
//
// Multiplying by an exact power of ten moves six digits before the point, with an error below 2^-33. If the product
// is further than that from the middle between two integers, the nearest integer has the digits of the real itself.
char* writeSixDigits(char* out, double real)
{
    static constexpr double smallest[] = {1e5, 1e4, 1e3, 1e2, 1e1, 1e0, 1e-1, 1e-2, 1e-3, 1e-4};
    static constexpr double power[] = {1e0, 1e1, 1e2, 1e3, 1e4, 1e5, 1e6, 1e7, 1e8, 1e9};
    constexpr double uncertain = 0x1p-30;

    const double magnitude = std::fabs(real);
    if (!(magnitude >= 1e-4 && magnitude < 1e6))
        return nullptr;
    int decimals = 0;
    while (magnitude < smallest[decimals])
        ++decimals;
    const double product = magnitude * power[decimals];
    auto number = static_cast<unsigned int>(product);
    const double rest = product - number;
    if (std::fabs(rest - 0.5) <= uncertain)
        return nullptr;
    number += rest > 0.5 ? 1 : 0;
    if (number > 999999)
        return nullptr;

    if (real < 0)
        *out++ = '-';
    const auto scale = static_cast<unsigned int>(power[decimals]);
    out = writeUpToEightDigits(out, number / scale);
    unsigned int fraction = number % scale * static_cast<unsigned int>(power[9 - decimals]);  // nine digits
    if (fraction == 0)
        return out;
    *out++ = '.';
    *out++ = static_cast<char>('0' + fraction / 100000000);
    fraction %= 100000000;
    out = writeFourDigits(writeFourDigits(out, fraction / 10000), fraction % 10000);
    while (out[-1] == '0')
        --out;
    return out;
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
