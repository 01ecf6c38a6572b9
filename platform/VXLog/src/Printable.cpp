#include "VXLog/Printable.h"

#include <algorithm>
#include <cstddef>
#include <iterator>

namespace VXLog {

namespace {

// Characters that reorder or hide text or end a line: the general categories Cf, Zl and Zp of Unicode 15.1, and the
// whole range of the tag characters, U+E0000 to U+E007F.
constexpr struct {
    unsigned int first;
    unsigned int last;
} formatCharacters[] = {{0x00AD, 0x00AD},   {0x0600, 0x0605},   {0x061C, 0x061C},   {0x06DD, 0x06DD},
                        {0x070F, 0x070F},   {0x0890, 0x0891},   {0x08E2, 0x08E2},   {0x180E, 0x180E},
                        {0x200B, 0x200F},   {0x2028, 0x202E},   {0x2060, 0x2064},   {0x2066, 0x206F},
                        {0xFEFF, 0xFEFF},   {0xFFF9, 0xFFFB},   {0x110BD, 0x110BD}, {0x110CD, 0x110CD},
                        {0x13430, 0x1343F}, {0x1BCA0, 0x1BCA3}, {0x1D173, 0x1D17A}, {0xE0000, 0xE007F}};

bool isFormatCharacter(unsigned int character)
{
    return std::any_of(
        std::begin(formatCharacters), std::end(formatCharacters),
        [character](const auto& range) { return character >= range.first && character <= range.last; });
}

// The length of the printable UTF-8 character that `text` begins with, or 0 if it does not begin with one.
std::size_t printableLength(std::string_view text)
{
    const auto byte = [text](std::size_t i) { return static_cast<unsigned char>(text[i]); };
    if (byte(0) < 0x80)
        return byte(0) >= 0x20 && byte(0) != 0x7F ? 1 : 0;

    const std::size_t length = byte(0) >= 0xF0 ? 4 : byte(0) >= 0xE0 ? 3 : 2;
    if (byte(0) < 0xC2 || byte(0) > 0xF4 || text.size() < length)
        return 0;
    unsigned int character = byte(0) & (0xFFu >> (length + 1));
    for (std::size_t i = 1; i < length; ++i) {
        if ((byte(i) & 0xC0) != 0x80)
            return 0;
        character = character << 6 | (byte(i) & 0x3Fu);
    }
    const bool tooLong = (length == 3 && character < 0x800) || (length == 4 && character < 0x10000);
    const bool surrogate = character >= 0xD800 && character <= 0xDFFF;
    const bool unprintable = character < 0xA0 || isFormatCharacter(character);
    return tooLong || surrogate || unprintable || character > 0x10FFFF ? 0 : length;
}

void addEscaped(std::string& out, unsigned char byte)
{
    constexpr char digits[] = "0123456789abcdef";
    switch (byte) {
    case '\n':
        out += "\\n";
        return;
    case '\r':
        out += "\\r";
        return;
    case '\t':
        out += "\\t";
        return;
    default:
        out += "\\x";
        out += digits[byte >> 4];
        out += digits[byte & 0x0F];
    }
}

}  // namespace

std::string printable(std::string_view text)
{
    std::string out;
    while (!text.empty()) {
        const std::size_t length = printableLength(text);
        if (text.front() == '\\')
            out += "\\\\";
        else if (length != 0)
            out += text.substr(0, length);
        else
            addEscaped(out, static_cast<unsigned char>(text.front()));
        text.remove_prefix(length != 0 ? length : 1);
    }
    return out;
}

}  // namespace VXLog
