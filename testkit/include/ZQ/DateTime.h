#pragma once

#include <iosfwd>
#include <memory>
#include <string>

namespace ZQ {

// A date-time whose two texts differ, so that a test sees which of them was asked for: std::string gives
// "1234567890/3" (seconds and scope), the stream operator "<1234567890.250/3>" (milliseconds too;
// its numbers follow the stream).
// now() is the clock that the test has set (observe/Platform.h). Objects are counted.
class DateTime {
public:
    DateTime();
    DateTime(long seconds, unsigned int scope);
    DateTime(const DateTime& other);
    DateTime& operator=(const DateTime& other);
    ~DateTime();

    static DateTime now();
    void setMillisecond(unsigned int millisecond);
    unsigned int getMillisecond() const;
    unsigned int getScope() const;
    operator long() const;
    operator std::string() const;

private:
    struct Fields;
    std::unique_ptr<Fields> fields_;
};

std::ostream& operator<<(std::ostream& out, const DateTime& time);

}  // namespace ZQ
