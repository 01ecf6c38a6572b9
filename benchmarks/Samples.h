#pragma once

#include <cstddef>
#include <cstdint>
#include <iomanip>
#include <sstream>
#include <string>
#include <vector>

// The contents of the measured values: the same for every contender.
namespace benchmarks {

using Bytes = std::vector<unsigned char>;
using Numbers = std::vector<std::uint32_t>;
using Texts = std::vector<std::string>;

enum class Subject { number, real, text12, text40, bytes64, numbers100, texts100 };

constexpr const char* nameOf(Subject subject)
{
    switch (subject) {
    case Subject::number:
        return "number";
    case Subject::real:
        return "real";
    case Subject::text12:
        return "text12";
    case Subject::text40:
        return "text40";
    case Subject::bytes64:
        return "bytes64";
    case Subject::numbers100:
        return "numbers100";
    case Subject::texts100:
        return "texts100";
    }
    return "";
}

// A text that ends in four digits: the texts of neighbouring samples differ only at their ends.
inline std::string textOfLength(std::size_t length, std::size_t index)
{
    std::string text = "Fan module of the upper rear chassis bay";
    text.resize(length - 4, '.');
    return text + std::to_string(1000 + index);
}

inline Numbers numbersOfLength(std::size_t length, std::size_t index)
{
    Numbers numbers(length);
    for (std::size_t i = 0; i < length; ++i)
        numbers[i] = static_cast<std::uint32_t>(3600 + i * 37);
    numbers.back() += static_cast<std::uint32_t>(index);
    return numbers;
}

inline Texts textsOfLength(std::size_t length, std::size_t index)
{
    Texts texts(length);
    for (std::size_t i = 0; i < length; ++i)
        texts[i] = textOfLength(12, i % 1000);
    texts.back() = textOfLength(12, 1000 + index);
    return texts;
}

// The content of one sample. Samples differ only at their ends, and a larger `index` gives a larger content.
template <Subject S>
auto content(std::size_t index)
{
    if constexpr (S == Subject::number) {
        return static_cast<std::uint32_t>(3600 + index);
    } else if constexpr (S == Subject::real) {
        // Six significant digits: every contender prints all of them.
        return 120.375 + static_cast<double>(index);
    } else if constexpr (S == Subject::text12) {
        return textOfLength(12, index);
    } else if constexpr (S == Subject::text40) {
        return textOfLength(40, index);
    } else if constexpr (S == Subject::bytes64) {
        Bytes bytes(64);
        for (std::size_t i = 0; i < bytes.size(); ++i)
            bytes[i] = static_cast<unsigned char>(0xA0 + i);
        bytes.back() = static_cast<unsigned char>(index);
        return bytes;
    } else if constexpr (S == Subject::numbers100) {
        return numbersOfLength(100, index);
    } else {
        static_assert(S == Subject::texts100);
        return textsOfLength(100, index);
    }
}

// The texts that the library gives for these contents.
inline std::string textOf(std::uint32_t number)
{
    return std::to_string(number);
}
inline std::string textOf(double real)
{
    std::ostringstream out;
    out << real;
    return out.str();
}
inline std::string textOf(const std::string& text)
{
    return text;
}
inline std::string textOf(const Bytes& bytes)
{
    std::ostringstream out;
    out << std::hex << std::setfill('0');
    for (std::size_t i = 0; i < bytes.size(); ++i)
        out << std::setw(2) << static_cast<unsigned int>(bytes[i]) << (i % 4 == 3 ? " " : "");
    return out.str();
}
inline std::string textOf(const Numbers& numbers)
{
    std::string text;
    for (const auto number : numbers)
        text += (text.empty() ? "{" : ", ") + std::to_string(number);
    return text + '}';
}
inline std::string textOf(const Texts& texts)
{
    std::string text;
    for (const auto& element : texts)
        text += (text.empty() ? "{\"" : ", \"") + element + '"';
    return text + '}';
}

}  // namespace benchmarks
