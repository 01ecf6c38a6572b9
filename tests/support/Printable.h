#pragma once

#include <algorithm>
#include <iterator>

// Whether the default sink writes the character as it is, but for a backslash: not a control character, not a format
// character, a line or paragraph separator (general categories Cf, Zl, Zp of Unicode 15.1) or a tag, not a surrogate.
// Stated independently of the stand-in.
inline bool isPrintable(char32_t character)
{
    constexpr char32_t single[] = {0xAD,  0x61C,  0x6DD,  0x70F,   0x890,  0x891,
                                   0x8E2, 0x180E, 0xFEFF, 0x110BD, 0x110CD};
    constexpr struct {
        char32_t begin;
        char32_t end;
    } others[] = {
        {0x0, 0x20},              // controls
        {0x7F, 0xA0},             // controls
        {0x600, 0x606},           // Arabic signs that enclose numbers
        {0x200B, 0x2010},         // characters of no width, marks of direction
        {0x2028, 0x202A},         // separators of lines and paragraphs
        {0x202A, 0x202F},         // embedding and override of direction
        {0x2060, 0x2065},         // word joiner, invisible operators
        {0x2066, 0x206A},         // isolation of direction
        {0x206A, 0x2070},         // deprecated shaping
        {0xD800, 0xE000},         // surrogates
        {0xFFF9, 0xFFFC},         // interlinear annotation
        {0x13430, 0x13440},       // joiners of hieroglyphs
        {0x1BCA0, 0x1BCA4},       // shorthand
        {0x1D173, 0x1D17B},       // musical notation
        {0xE0000, 0xE0080},       // tags
        {0x110000, 0xFFFFFFFFu},  // beyond Unicode
    };
    return std::find(std::begin(single), std::end(single), character) == std::end(single)
        && std::none_of(std::begin(others), std::end(others), [character](const auto& range) {
               return character >= range.begin && character < range.end;
           });
}
