#pragma once

#include <string>

#include <gtest/gtest.h>

#include "support/GroupingLocale.h"

// Expects digitsOf(bytes) to give two lower-case hexadecimal digits for each byte, whatever the global locale.
template <class Function>
void expectTwoLowerCaseDigitsForEachByte(Function digitsOf)
{
    const struct {
        std::string bytes;
        const char* digits;
    } rows[] = {{"", ""},
                {"ab", "6162"},
                {"/a", "2f61"},
                {"\xff", "ff"},
                {"\x80\x7f", "807f"},
                {std::string("\0", 1), "00"},
                {std::string("\0\x7f\xff", 3), "007fff"},
                {std::string("a\0b", 3), "610062"},
                {"\x09\x0a\x90\xa0", "090a90a0"},
                {";{} ", "3b7b7d20"}};
    for (const auto& row : rows)
        EXPECT_EQ(digitsOf(row.bytes), row.digits);
    const GlobalGroupingLocale grouping(1);
    for (const auto& row : rows)
        EXPECT_EQ(digitsOf(row.bytes), row.digits);
}

// The same for one text of all 256 bytes.
template <class Function>
void expectTwoLowerCaseDigitsForAllBytes(Function digitsOf)
{
    const std::string digits = "0123456789abcdef";
    std::string all;
    std::string expected;
    for (unsigned int code = 0; code < 256; ++code) {
        all += static_cast<char>(code);
        expected += digits[code / 16];
        expected += digits[code % 16];
    }
    EXPECT_EQ(digitsOf(all), expected);
}
