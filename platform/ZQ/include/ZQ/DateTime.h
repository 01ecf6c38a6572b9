#pragma once

#include <iosfwd>
#include <string>

#pragma GCC visibility push(default)

namespace ZQ {

// A point in time: seconds since the epoch (UTC), milliseconds beside them, and a scope code.
//
// A plain value; one object belongs to one thread at a time. Only the text needs memory and may throw
// std::bad_alloc. Nothing is checked or normalised: what is given is what is given back. The scope says how
// its owner means the time; it is carried for the owner and changes neither the seconds nor the text.
//
//   ZQ::DateTime time(1234567890, 3);
//   time.setMillisecond(123);
//   std::cout << time;                         // 2009-02-13T23:31:30.123Z
class __attribute__((visibility("default"))) DateTime {
public:
    // The epoch: 0 seconds, 0 milliseconds, scope 3.
    DateTime();

    // Milliseconds 0.
    DateTime(long seconds, unsigned int scope);

    DateTime(const DateTime& other);
    DateTime& operator=(const DateTime& other);
    ~DateTime();

    // The system clock's time, cut to milliseconds, with scope 3.
    static DateTime now();

    void setMillisecond(unsigned int millisecond);
    unsigned int getMillisecond() const;
    unsigned int getScope() const;

    // Seconds since the epoch.
    operator long() const;

    // ISO 8601 in UTC, whatever the time zone and the locale: "2009-02-13T23:31:30Z". Milliseconds that are
    // not 0 stand before the Z with at least three digits: "2009-02-13T23:31:30.007Z". Seconds outside the
    // years 0000 to 9999 have no such form; their text is "@" and the seconds.
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
