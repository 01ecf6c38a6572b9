#pragma once

#include <iosfwd>
#include <memory>
#include <string>

namespace ZQ {

// A date-time whose two texts differ, so a test sees which of them was used. One object belongs to one thread at a
// time. The objects are counted, and each allocates. Every call that makes or changes one can be made to throw, and so
// can now() and both texts (observe/Platform.h).
class DateTime {
public:
    // 0 seconds, 0 milliseconds, scope 3.
    DateTime();

    // With 0 milliseconds.
    DateTime(long seconds, unsigned int scope);

    DateTime(const DateTime& other);
    DateTime& operator=(const DateTime& other);
    ~DateTime();

    // The time that observe::setClock has set, with scope 3. Each call is counted.
    static DateTime now();

    void setMillisecond(unsigned int millisecond);
    unsigned int getMillisecond() const;
    unsigned int getScope() const;

    // The seconds.
    operator long() const;

    // Seconds and scope: "1234567890/3".
    operator std::string() const;

private:
    struct Fields;
    std::unique_ptr<Fields> fields_;
};

// Inserts "<1234567890.250/3>": seconds, milliseconds and scope, formatted as the stream formats numbers.
std::ostream& operator<<(std::ostream& out, const DateTime& time);

}  // namespace ZQ
