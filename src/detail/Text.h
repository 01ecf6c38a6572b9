#pragma once

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

// The two digits of each number below 100, and of each byte.
inline constexpr char decimalDigits[] = "0001020304050607080910111213141516171819"
                                        "2021222324252627282930313233343536373839"
                                        "4041424344454647484950515253545556575859"
                                        "6061626364656667686970717273747576777879"
                                        "8081828384858687888990919293949596979899";
inline constexpr char hexDigits[] = "000102030405060708090a0b0c0d0e0f"
                                    "101112131415161718191a1b1c1d1e1f"
                                    "202122232425262728292a2b2c2d2e2f"
                                    "303132333435363738393a3b3c3d3e3f"
                                    "404142434445464748494a4b4c4d4e4f"
                                    "505152535455565758595a5b5c5d5e5f"
                                    "606162636465666768696a6b6c6d6e6f"
                                    "707172737475767778797a7b7c7d7e7f"
                                    "808182838485868788898a8b8c8d8e8f"
                                    "909192939495969798999a9b9c9d9e9f"
                                    "a0a1a2a3a4a5a6a7a8a9aaabacadaeaf"
                                    "b0b1b2b3b4b5b6b7b8b9babbbcbdbebf"
                                    "c0c1c2c3c4c5c6c7c8c9cacbcccdcecf"
                                    "d0d1d2d3d4d5d6d7d8d9dadbdcdddedf"
                                    "e0e1e2e3e4e5e6e7e8e9eaebecedeeef"
                                    "f0f1f2f3f4f5f6f7f8f9fafbfcfdfeff";

// All of these return the end of what they wrote.
inline char* writeHex(char* out, unsigned char byte)
{
    std::memcpy(out, hexDigits + 2 * std::size_t {byte}, 2);
    return out + 2;
}
inline char* writeTwoDigits(char* out, std::uint32_t number)
{
    std::memcpy(out, decimalDigits + 2 * std::size_t {number}, 2);
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
    if (number >= eightDigits) {
        out = writeDecimal(out, number / eightDigits);
        const auto low = static_cast<std::uint32_t>(number % eightDigits);
        return writeFourDigits(writeFourDigits(out, low / 10000), low % 10000);
    }
    const auto all = static_cast<std::uint32_t>(number);
    if (all >= 10000)
        return writeFourDigits(writeUpToFourDigits(out, all / 10000), all % 10000);
    return writeUpToFourDigits(out, all);
}

// The bytes in hexadecimal.
std::string hexOf(std::string_view bytes);

// The number as the classic locale writes it: in its place, since what is written elsewhere and then copied keeps the
// processor waiting.
inline std::string decimalText(std::uint32_t number)
{
    std::string text("4294967295", 10);  // room for the longest
    text.resize(static_cast<std::size_t>(writeDecimal(text.data(), number) - text.data()));
    return text;
}

bool globalLocaleIsClassic();

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
    void add(unsigned int number) { addInteger(number); }
    void add(unsigned long long number) { addInteger(number); }
    void add(double number);

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
    template <class T>
    void addInteger(T number)
    {
        if (locale_) {
            addStreamed(number);
            return;
        }
        constexpr std::size_t longest = std::numeric_limits<T>::digits10 + 1;
        write(longest, [number](char* out) { return writeDecimal(out, number); });
    }

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
