#include "ZQ/DateTime.h"

#include <chrono>
#include <cstdio>
#include <ostream>

namespace ZQ {

namespace {

constexpr unsigned int defaultScope = 3;

constexpr long long secondsADay = 86400;
constexpr long long firstSecond = -62167219200;  // 0000-01-01T00:00:00Z
constexpr long long lastSecond = 253402300799;   // 9999-12-31T23:59:59Z

struct Date {
    long long year;
    long long month;
    long long day;
};

// The date of a day that is counted from 0000-03-01. Years begin in March here, so a leap day is the last day of its
// year. Any 400 years have 146097 days.
Date dateOf(long long days)
{
    const long long era = days / 146097;
    const long long dayOfEra = days % 146097;
    const long long yearOfEra = (dayOfEra - dayOfEra / 1460 + dayOfEra / 36524 - dayOfEra / 146096) / 365;
    const long long dayOfYear = dayOfEra - (365 * yearOfEra + yearOfEra / 4 - yearOfEra / 100);
    const long long monthFromMarch = (5 * dayOfYear + 2) / 153;
    const long long day = dayOfYear - (153 * monthFromMarch + 2) / 5 + 1;
    const long long month = monthFromMarch < 10 ? monthFromMarch + 3 : monthFromMarch - 9;
    return {era * 400 + yearOfEra + (month <= 2 ? 1 : 0), month, day};
}

}  // namespace

DateTime::DateTime() : DateTime(0, defaultScope) { }

DateTime::DateTime(long seconds, unsigned int scope) : seconds_(seconds), millisecond_(0), scope_(scope) { }

DateTime::DateTime(const DateTime& other) = default;
DateTime& DateTime::operator=(const DateTime& other) = default;
DateTime::~DateTime() = default;

DateTime DateTime::now()
{
    using namespace std::chrono;
    const auto sinceEpoch = system_clock::now().time_since_epoch();
    const auto wholeSeconds = floor<seconds>(sinceEpoch);
    DateTime time(static_cast<long>(wholeSeconds.count()), defaultScope);
    time.setMillisecond(static_cast<unsigned int>(floor<milliseconds>(sinceEpoch - wholeSeconds).count()));
    return time;
}

void DateTime::setMillisecond(unsigned int millisecond)
{
    millisecond_ = millisecond;
}

unsigned int DateTime::getMillisecond() const
{
    return millisecond_;
}

unsigned int DateTime::getScope() const
{
    return scope_;
}

DateTime::operator long() const
{
    return seconds_;
}

DateTime::operator std::string() const
{
    const long long seconds = seconds_;  // a long of 32 bits could not hold the limits
    if (seconds < firstSecond || seconds > lastSecond)
        return std::string("@").append(std::to_string(seconds));

    // Days count from the year -400, so that no value below is negative.
    constexpr long long daysToMarch = 146097 - 60;
    const long long sinceFirst = seconds - firstSecond;
    Date date = dateOf(sinceFirst / secondsADay + daysToMarch);
    date.year -= 400;
    const long long second = sinceFirst % secondsADay;

    char text[64];
    int length = std::snprintf(text, sizeof text, "%04lld-%02lld-%02lldT%02lld:%02lld:%02lld", date.year,
                               date.month, date.day, second / 3600, second / 60 % 60, second % 60);
    std::string result(text, static_cast<std::size_t>(length));
    if (millisecond_ != 0) {
        length = std::snprintf(text, sizeof text, ".%03u", millisecond_);
        result.append(text, static_cast<std::size_t>(length));
    }
    return result + 'Z';
}

std::ostream& operator<<(std::ostream& out, const DateTime& time)
{
    return out << std::string(time);
}

}  // namespace ZQ
