#pragma once

#include <cstddef>
#include <cstdint>
#include <iomanip>
#include <sstream>
#include <string>
#include <variant>
#include <vector>

// The contents of the measured values: the same for every contender.
namespace benchmarks {

using Bytes = std::vector<unsigned char>;
using Numbers = std::vector<std::uint32_t>;
using Texts = std::vector<std::string>;
using Reals = std::vector<double>;
using MixedNumber = std::variant<std::uint32_t, double, std::int32_t, unsigned long long>;
using MixedNumbers = std::vector<MixedNumber>;

// The subjects from `anyNumber` on have content of all lengths; neighbouring samples differ in every digit.
enum class Subject {
    number,
    real,
    text12,
    text40,
    bytes64,
    numbers100,
    texts100,
    wholeReal,
    anyNumber,
    anyReal,
    anyNumbers100,
    reals100,
    mixed100,
    quotedTexts100
};

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
    case Subject::wholeReal:
        return "whole-real";
    case Subject::anyNumber:
        return "any-number";
    case Subject::anyReal:
        return "any-real";
    case Subject::anyNumbers100:
        return "any-numbers100";
    case Subject::reals100:
        return "reals100";
    case Subject::mixed100:
        return "mixed100";
    case Subject::quotedTexts100:
        return "quoted-texts100";
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

// Scatters `index` over all 64-bit integers.
constexpr std::uint64_t scattered(std::uint64_t index)
{
    index = (index + 1) * 0x9E3779B97F4A7C15u;
    index = (index ^ index >> 30) * 0xBF58476D1CE4E5B9u;
    index = (index ^ index >> 27) * 0x94D049BB133111EBu;
    return index ^ index >> 31;
}

inline std::string scatteredDigits(std::uint64_t index, std::size_t count)
{
    return std::to_string(scattered(index)).substr(1, count);  // the first digit would often be 1
}

// 1 to 10 digits, each length about equally often.
inline std::uint32_t numberOfAnyLength(std::size_t index)
{
    const auto choice = scattered(index);
    return static_cast<std::uint32_t>(std::stoull(scatteredDigits(choice, 1 + choice % 10)));
}

// 1 to 17 significant digits, exponents from -20 to 20, one in four negative.
inline double realOfAnyLength(std::size_t index)
{
    const auto choice = scattered(index);
    std::string text = scatteredDigits(choice, 1 + choice / 4 % 17).insert(1, ".");
    if (choice % 4 == 0)
        text.insert(0, "-");
    return std::stod(text + 'e' + std::to_string(static_cast<int>(choice / 68 % 41) - 20));
}

inline Reals realsOfLength(std::size_t length, std::size_t index)
{
    Reals reals(length);
    for (std::size_t i = 0; i < length; ++i)
        reals[i] = realOfAnyLength(index * length + i);
    return reals;
}

// The content of one sample. A larger `index` gives a larger content, but for the subjects of all lengths.
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
    } else if constexpr (S == Subject::texts100) {
        return textsOfLength(100, index);
    } else if constexpr (S == Subject::wholeReal) {
        return static_cast<double>(3600 + index);
    } else if constexpr (S == Subject::anyNumber) {
        return numberOfAnyLength(index);
    } else if constexpr (S == Subject::anyReal) {
        return realOfAnyLength(index);
    } else if constexpr (S == Subject::anyNumbers100) {
        Numbers numbers(100);
        for (std::size_t i = 0; i < numbers.size(); ++i)
            numbers[i] = numberOfAnyLength(100 * index + i);
        return numbers;
    } else if constexpr (S == Subject::reals100) {
        return realsOfLength(100, index);
    } else if constexpr (S == Subject::mixed100) {
        MixedNumbers numbers;
        for (std::size_t i = 100 * index; numbers.size() < 100; i += 4) {
            numbers.emplace_back(numberOfAnyLength(i));
            numbers.emplace_back(realOfAnyLength(i + 1));
            numbers.emplace_back(static_cast<std::int32_t>(numberOfAnyLength(i + 2)));
            numbers.emplace_back(0ull + (scattered(i + 3) >> scattered(i) % 60));
        }
        return numbers;
    } else {
        static_assert(S == Subject::quotedTexts100);
        auto texts = textsOfLength(100, index);
        for (std::size_t i = 0; i < texts.size(); i += 2)
            texts[i].insert(scattered(i) % 8, "\"rear\" ");
        return texts;
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
inline std::string textOf(const MixedNumber& number)
{
    std::ostringstream out;
    std::visit([&out](auto plain) { out << plain; }, number);
    return out.str();
}
inline std::string textOf(const Bytes& bytes)
{
    std::ostringstream out;
    out << std::hex << std::setfill('0');
    for (std::size_t i = 0; i < bytes.size(); ++i)
        out << std::setw(2) << static_cast<unsigned int>(bytes[i]) << (i % 4 == 3 ? " " : "");
    return out.str();
}
template <class Number>
std::string textOf(const std::vector<Number>& numbers)
{
    std::string text;
    for (const auto& number : numbers)
        text += (text.empty() ? "{" : ", ") + textOf(number);
    return text + '}';
}
inline std::string textOf(const Texts& texts)
{
    std::ostringstream out;
    const char* separator = "{";
    for (const auto& element : texts) {
        out << separator << std::quoted(element, '"', '\\');
        separator = ", ";
    }
    return out.str() + '}';
}

}  // namespace benchmarks
