#include "detail/Text.h"

#include <algorithm>
#include <cmath>
#include <stdexcept>

namespace IC::detail {

namespace {

// Writes a real with six significant digits where they can be had quickly and are certain, and returns the end;
// null where they are not.
//
// The real is brought to six digits before the point by one multiplication with a power of ten that is exact, so
// the product is off by less than 2^-33 of a unit. Where it is further than that from the middle between two
// integers, the nearest integer is the one that the real itself rounds to.
char* writeSixDigits(char* out, double real)
{
    constexpr double smallest[] = {1e5, 1e4, 1e3, 1e2, 1e1, 1e0, 1e-1, 1e-2, 1e-3, 1e-4};
    constexpr double power[] = {1e0, 1e1, 1e2, 1e3, 1e4, 1e5, 1e6, 1e7, 1e8, 1e9};
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
    out = writeDecimal(out, number / scale);
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

// A copy of one's own is found sooner than the standard library's.
[[gnu::init_priority(101)]] static const std::locale classicLocale = std::locale::classic();

bool globalLocaleIsClassic()
{
    return std::locale() == classicLocale;
}

Text::Text()
{
    std::locale global;
    if (global != classicLocale)
        locale_ = std::move(global);
}

void Text::add(int number)
{
    if (locale_) {
        addStreamed(number);
        return;
    }
    if (number < 0)
        add('-');
    add(static_cast<unsigned int>(std::abs(static_cast<long long>(number))));
}

void Text::add(double number)
{
    if (locale_) {
        addStreamed(number);
        return;
    }
    constexpr std::size_t longest = 17;  // -123456.000000000 before it is shortened; -1.23457e+308 is shorter
    write(longest, [number](char* out) {
        if (char* const end = writeSixDigits(out, number))
            return end;
        if (std::isnan(number))  // of which std::to_chars may say more than a stream
            return std::signbit(number) ? std::copy_n("-nan", 4, out) : std::copy_n("nan", 3, out);
        return std::to_chars(out, out + longest, number, std::chars_format::general, 6).ptr;
    });
}

void Text::grow(std::size_t length)
{
    const bool first = long_.empty();
    long_.resize(std::max(used_ + length, 2 * room_));
    if (first)
        std::memcpy(long_.data(), short_, used_);
    text_ = long_.data();
    room_ = long_.size();
}

std::string hexOf(std::string_view bytes)
{
    std::string hex(2 * bytes.size(), '0');
    char* out = hex.data();
    for (const char byte : bytes)
        out = writeHex(out, static_cast<unsigned char>(byte));
    return hex;
}

const char* checked(const char* text)
{
    if (text == nullptr)
        throw std::logic_error("a text is a null pointer");
    return text;
}

}  // namespace IC::detail
