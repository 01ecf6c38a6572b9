#include "detail/Text.h"

#include <charconv>
#include <cstdlib>
#include <stdexcept>

namespace IC::detail {

namespace {

constexpr char digits[] = "0123456789abcdef";

}  // namespace

// A locale other than the classic one may group digits or write them otherwise, which only its own facets
// know; those numbers go through a stream.
template <class T, class... Format>
void Text::addNumber(T number, Format... format)
{
    if (!classic()) {
        addStreamed(number);
        return;
    }
    char buffer[32];  // more than the 20 digits of the largest integer and the 13 characters of any real
    const auto end = std::to_chars(buffer, buffer + sizeof buffer, number, format...).ptr;
    text_.append(buffer, end);
}

void Text::add(int number)
{
    if (!classic()) {
        addStreamed(number);
        return;
    }
    if (number < 0)
        text_ += '-';
    add(static_cast<unsigned int>(std::abs(static_cast<long long>(number))));
}

void Text::add(unsigned int number)
{
    addNumber(number);
}

void Text::add(unsigned long long number)
{
    addNumber(number);
}

void Text::add(double number)
{
    addNumber(number, std::chars_format::general, 6);  // a stream's default form
}

void Text::addHex(unsigned char byte)
{
    text_ += digits[byte >> 4];
    text_ += digits[byte & 0x0F];
}

void Text::addHex(std::string_view bytes)
{
    for (const char byte : bytes)
        addHex(static_cast<unsigned char>(byte));
}

const std::locale& Text::locale()
{
    if (!locale_)
        classic_ = locale_.emplace() == std::locale::classic();
    return *locale_;
}

bool Text::classic()
{
    locale();
    return classic_;
}

const char* checked(const char* text)
{
    if (text == nullptr)
        throw std::logic_error("a text is a null pointer");
    return text;
}

}  // namespace IC::detail
