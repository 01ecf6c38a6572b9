#pragma once

#include <locale>
#include <string>

// Separates groups of digits with commas.
class GroupingDigits : public std::numpunct<char> {
public:
    explicit GroupingDigits(char digitsPerGroup) : grouping_(1, digitsPerGroup) { }

private:
    char do_thousands_sep() const override { return ','; }
    std::string do_grouping() const override { return grouping_; }

    std::string grouping_;
};

// Tells when the last locale that has it is gone.
class ObservedDigits : public std::numpunct<char> {
public:
    explicit ObservedDigits(bool& isDestroyed) : isDestroyed_(isDestroyed) { }
    ~ObservedDigits() override { isDestroyed_ = true; }

private:
    bool& isDestroyed_;
};

inline std::locale groupingLocale(char digitsPerGroup = 3)
{
    return std::locale(std::locale::classic(), new GroupingDigits(digitsPerGroup));
}

// Makes a locale the global one for the lifetime of the object.
class GlobalLocale {
public:
    explicit GlobalLocale(const std::locale& locale) : before_(std::locale::global(locale)) { }
    ~GlobalLocale() { std::locale::global(before_); }
    GlobalLocale(const GlobalLocale&) = delete;
    GlobalLocale& operator=(const GlobalLocale&) = delete;

private:
    std::locale before_;
};

// Makes a grouping locale the global one for the lifetime of the object.
class GlobalGroupingLocale : GlobalLocale {
public:
    explicit GlobalGroupingLocale(char digitsPerGroup = 3) : GlobalLocale(groupingLocale(digitsPerGroup)) { }
};
