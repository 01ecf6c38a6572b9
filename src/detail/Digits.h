#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>
#include <string_view>

// Digits as the classic locale writes them. Each `write` function writes at `out` and returns the end of what it wrote.
namespace IC::detail {

// The two digits of each number below base * base.
template <std::size_t base>
inline constexpr auto digitPairs = [] {
    constexpr char digits[] = "0123456789abcdef";
    std::array<char, 2 * base * base> pairs {};
    for (std::size_t number = 0; number < base * base; ++number) {
        pairs[2 * number] = digits[number / base];
        pairs[2 * number + 1] = digits[number % base];
    }
    return pairs;
}();

inline char* writeHex(char* out, unsigned char byte)
{
    std::memcpy(out, digitPairs<16>.data() + 2 * std::size_t {byte}, 2);
    return out + 2;
}

inline char* writeTwoDigits(char* out, std::uint32_t number)
{
    std::memcpy(out, digitPairs<10>.data() + 2 * std::size_t {number}, 2);
    return out + 2;
}

inline char* writeFourDigits(char* out, std::uint32_t number)
{
    return writeTwoDigits(writeTwoDigits(out, number / 100), number % 100);
}

inline char* writeUpToFourDigits(char* out, std::uint32_t number)
{
    if (number >= 1000)
        return writeFourDigits(out, number);
    if (number >= 100) {
        *out++ = static_cast<char>('0' + number / 100);
        return writeTwoDigits(out, number % 100);
    }
    if (number >= 10)
        return writeTwoDigits(out, number);
    *out++ = static_cast<char>('0' + number);
    return out;
}

inline char* writeUpToEightDigits(char* out, std::uint32_t number)
{
    if (number >= 10000)
        return writeFourDigits(writeUpToFourDigits(out, number / 10000), number % 10000);
    return writeUpToFourDigits(out, number);
}

inline char* writeDecimal(char* out, std::uint64_t number)
{
    constexpr std::uint32_t eightDigits = 100000000;
    if (number >= eightDigits) {
        out = writeDecimal(out, number / eightDigits);
        const auto low = static_cast<std::uint32_t>(number % eightDigits);
        return writeFourDigits(writeFourDigits(out, low / 10000), low % 10000);
    }
    return writeUpToEightDigits(out, static_cast<std::uint32_t>(number));
}

inline char* writeInteger(char* out, std::int32_t number)
{
    *out = '-';
    return writeDecimal(out + (number < 0 ? 1 : 0),
                        static_cast<std::uint64_t>(std::abs(std::int64_t {number})));
}

// A real with six significant digits; at most `longestReal` characters. It needs 15 of them, for "-12345." and eight
// characters that are written at once.
char* writeReal(char* out, double real);
constexpr std::size_t longestReal = 17;

// The number in decimal. Writes in place: copying from a buffer stalls on store forwarding.
inline std::string decimalText(std::uint32_t number)
{
    std::string text("4294967295", 10);  // room for the longest
    text.resize(static_cast<std::size_t>(writeDecimal(text.data(), number) - text.data()));
    return text;
}

// The bytes in hexadecimal.
std::string hexOf(std::string_view bytes);

}  // namespace IC::detail
