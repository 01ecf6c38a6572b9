#pragma once

#include <locale>
#include <string>

// Writes a comma between the groups of the digits of a number.
class GroupingDigits : public std::numpunct<char> {
public:
    explicit GroupingDigits(char digitsPerGroup) : grouping_(1, digitsPerGroup) { }

private:
    char do_thousands_sep() const override { return ','; }
    std::string do_grouping() const override { return grouping_; }

    std::string grouping_;
};

inline std::locale groupingLocale(char digitsPerGroup = 3)
{
    return std::locale(std::locale::classic(), new GroupingDigits(digitsPerGroup));
}

// Makes such a locale the global one while it lives.
class GlobalGroupingLocale {
public:
    explicit GlobalGroupingLocale(char digitsPerGroup = 3)
        : before_(std::locale::global(groupingLocale(digitsPerGroup)))
    {
    }
    ~GlobalGroupingLocale() { std::locale::global(before_); }
    GlobalGroupingLocale(const GlobalGroupingLocale&) = delete;
    GlobalGroupingLocale& operator=(const GlobalGroupingLocale&) = delete;

private:
    std::locale before_;
};
