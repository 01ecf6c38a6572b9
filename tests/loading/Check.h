#pragma once

// Uses the library when it is constructed and when it is destroyed, and prints each time a line with its name and
// whether the library's names and categories were right.
class Check {
public:
    explicit Check(const char* name);
    ~Check();
    Check(const Check&) = delete;
    Check& operator=(const Check&) = delete;

private:
    const char* name_;
};
