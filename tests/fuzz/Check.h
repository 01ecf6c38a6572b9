#pragma once

#include <cstdlib>
#include <iostream>
#include <string>

// Aborts, so that the fuzzer reports the input.
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

// Fails if there is a difference, as returned by the functions of tests/model/Agreement.h.
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
