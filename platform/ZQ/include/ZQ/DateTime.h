#pragma once

#include <iosfwd>
#include <string>

#pragma GCC visibility push(default)

namespace ZQ {

// A point in time: seconds since the epoch (UTC), milliseconds, and a scope code.
//
// A plain value; one object belongs to one thread at a time. Only the text allocates and can throw std::bad_alloc.
// Nothing is checked or normalised: every reader returns what was set. The meaning of the scope is up to the user
// of the class; the scope changes neither the seconds nor the text.
//
//   ZQ::DateTime time(1234567890, 3);
//   time.setMillisecond(123);
//   std::cout << time;                         // 2009-02-13T23:31:30.123Z
class __attribute__((visibility("default"))) DateTime {
public:
    // The epoch: 0 seconds, 0 milliseconds, scope 3.
    DateTime();

    // With 0 milliseconds.
    DateTime(long seconds, unsigned int scope);

    DateTime(const DateTime& other);
    DateTime& operator=(const DateTime& other);
    ~DateTime();

    // The time of the system clock, rounded down to milliseconds, with scope 3.
    static DateTime now();

    // Takes any value, 1000 and above included.
    void setMillisecond(unsigned int millisecond);
    unsigned int getMillisecond() const;
    unsigned int getScope() const;

    // Seconds since the epoch.
    operator long() const;

    // ISO 8601 in UTC, in any time zone and locale: "2009-02-13T23:31:30Z". Milliseconds other than 0 follow the
    // seconds in at least three digits: "2009-02-13T23:31:30.007Z". Outside the years 0000 to 9999 the text is "@"
    // and the seconds.
    operator std::string() const;

private:
    long seconds_;
    unsigned int millisecond_;
    unsigned int scope_;
};

// Inserts std::string(time) as one text.
std::ostream& operator<<(std::ostream& out, const DateTime& time);

}  // namespace ZQ

#pragma GCC visibility pop
