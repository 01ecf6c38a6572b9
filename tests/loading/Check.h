#pragma once

// Says on standard output, by a line with its name, whether the library's names and categories are right when it is
// made and when it goes.
class Check {
public:
    explicit Check(const char* name);
    ~Check();
    Check(const Check&) = delete;
    Check& operator=(const Check&) = delete;

private:
    const char* name_;
};
