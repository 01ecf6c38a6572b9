#pragma once

#include <cstdlib>
#include <iostream>
#include <string>

// Ends the program, which the fuzzer reports together with its input.
[[noreturn]] inline void fail(const std::string& what)
{
    std::cerr << "broken: " << what << std::endl;
    std::abort();
}

inline void require(bool holds, const char* rule)
{
    if (!holds)
        fail(rule);
}

// Takes what the functions of tests/model/Agreement.h return.
inline void requireNone(const std::string& difference)
{
    if (!difference.empty())
        fail(difference);
}

inline void requireSame(const std::string& actual, const std::string& expected, const char* what)
{
    if (actual != expected)
        fail(std::string(what) + ": \"" + actual + "\" instead of \"" + expected + '"');
}
