#pragma once

#include <algorithm>
#include <charconv>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <locale>
#include <optional>
#include <ostream>
#include <sstream>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace IC {
class EnumValue;
class Number;
}  // namespace IC

namespace IC::detail {

// The two digits of each number that has so many, one number after another.
template <unsigned int base>
struct DigitPairs {
    constexpr DigitPairs()
    {
        constexpr char digits[] = "0123456789abcdef";
        for (std::size_t number = 0; number < base * base; ++number) {
            pairs[2 * number] = digits[number / base];
            pairs[2 * number + 1] = digits[number % base];
        }
    }
    char pairs[2 * base * base] = {};
};
inline constexpr DigitPairs<10> decimalDigits;
inline constexpr DigitPairs<16> hexDigits;

// All of these return the end of what they wrote.
inline char* writeHex(char* out, unsigned char byte)
{
    std::memcpy(out, hexDigits.pairs + 2 * std::size_t {byte}, 2);
    return out + 2;
}
inline char* writeTwoDigits(char* out, std::uint32_t number)
{
    std::memcpy(out, decimalDigits.pairs + 2 * std::size_t {number}, 2);
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
inline char* writeDecimal(char* out, std::uint64_t number)
{
    constexpr std::uint32_t eightDigits = 100000000;
    if (number >= eightDigits)
        out = writeDecimal(out, number / eightDigits);
    const auto low = static_cast<std::uint32_t>(number % eightDigits);
    if (number >= eightDigits)
        return writeFourDigits(writeFourDigits(out, low / 10000), low % 10000);
    if (low >= 10000)
        return writeFourDigits(writeUpToFourDigits(out, low / 10000), low % 10000);
    return writeUpToFourDigits(out, low);
}

// The bytes in hexadecimal.
std::string hexOf(std::string_view bytes);

// Collects a text form piece by piece. The text is what a fresh std::ostringstream would give under the global
// locale, which is asked for at the start, but memory that runs out is thrown, not swallowed.
class Text {
public:
    Text();

    // Makes room for so many further characters at once.
    void reserve(std::size_t length) { room(length); }

    // `writer` is given the place for so many characters and returns the end of what it wrote.
    template <class Writer>
    void write(std::size_t longest, Writer writer)
    {
        char* const start = room(longest);
        used_ += static_cast<std::size_t>(writer(start) - start);
    }

    void add(std::string_view piece)
    {
        std::memcpy(room(piece.size()), piece.data(), piece.size());
        used_ += piece.size();
    }
    void add(char piece)
    {
        *room(1) = piece;
        ++used_;
    }
    // Takes back the last characters.
    void remove(std::size_t length) { used_ -= length; }

    // Whether numbers are written as the classic locale writes them.
    bool isClassic() const { return !locale_; }

    void add(int number);
    void add(unsigned int number) { addInteger("", number); }
    void add(unsigned long long number) { addInteger("", number); }
    void add(double number);

    // With what separates it from the number before it: one step for both.
    template <class T>
    void addInteger(std::string_view separator, T number)
    {
        if (locale_) {
            add(separator);
            addStreamed(number);
            return;
        }
        constexpr std::size_t longest = std::numeric_limits<T>::digits10 + 1;
        write(separator.size() + longest, [separator, number](char* out) {
            out = std::copy(separator.begin(), separator.end(), out);
            return writeDecimal(out, number);
        });
    }

    // By the type's own stream insertion.
    template <class T>
    void addStreamed(const T& piece)
    {
        std::ostringstream out;
        out.imbue(locale_ ? *locale_ : std::locale::classic());
        out.exceptions(std::ios_base::badbit);
        out << piece;
        add(out.str());
    }

    std::string take()
    {
        if (long_.empty())
            return std::string(short_, used_);
        long_.resize(used_);
        return std::move(long_);
    }

    Text(const Text&) = delete;
    Text& operator=(const Text&) = delete;

private:
    // Where the next characters go; there is room for so many.
    char* room(std::size_t length)
    {
        if (room_ - used_ < length)
            grow(length);
        return text_ + used_;
    }
    void grow(std::size_t length);

    // Most texts are short and need no memory before they are taken.
    char short_[256];
    std::string long_;
    char* text_ = short_;
    std::size_t room_ = sizeof short_;
    std::size_t used_ = 0;
    // Where it is not the classic one. It may group digits or write them otherwise, which only its own facets
    // know: numbers then go through a stream.
    std::optional<std::locale> locale_;
};

// The text forms that containers write too.
void append(Text& text, const Number& number);
void append(Text& text, const std::vector<Number>& numbers);
void append(Text& text, const EnumValue& value);

// The text itself; throws std::logic_error for a null pointer, which not every std::string notices.
const char* checked(const char* text);

// A text form by itself.
template <class Value>
std::string textOf(const Value& value)
{
    Text text;
    append(text, value);
    return text.take();
}

}  // namespace IC::detail
