#pragma once

#include <ostream>

#include "ZQ/DateTime.h"

// All that a date-time holds; for comparisons.
struct DateTimeParts {
    long seconds;
    unsigned int milliseconds;
    unsigned int scope;
};

inline bool operator==(const DateTimeParts& a, const DateTimeParts& b)
{
    return a.seconds == b.seconds && a.milliseconds == b.milliseconds && a.scope == b.scope;
}

inline std::ostream& operator<<(std::ostream& out, const DateTimeParts& parts)
{
    return out << parts.seconds << " s, " << parts.milliseconds << " ms, scope " << parts.scope;
}

inline DateTimeParts partsOf(const ZQ::DateTime& time)
{
    return {time.operator long(), time.getMillisecond(), time.getScope()};
}

inline ZQ::DateTime dateTime(long seconds, unsigned int milliseconds, unsigned int scope)
{
    ZQ::DateTime time(seconds, scope);
    time.setMillisecond(milliseconds);
    return time;
}
