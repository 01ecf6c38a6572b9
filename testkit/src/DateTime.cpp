#include "ZQ/DateTime.h"

#include <ostream>

#include "Observed.h"

namespace ZQ {

struct DateTime::Fields {
    long seconds;
    unsigned int milliseconds;
    unsigned int scope;
};

DateTime::DateTime() : DateTime(0, 3) { }

DateTime::DateTime(long seconds, unsigned int scope) : fields_(new Fields {seconds, 0, scope})
{
    observe::reached(observe::Call::dateTime);
    observe::count(&observe::Observed::dateTimesAlive, 1);
}

DateTime::DateTime(const DateTime& other) : fields_(new Fields(*other.fields_))
{
    observe::reached(observe::Call::dateTime);
    observe::count(&observe::Observed::dateTimesAlive, 1);
}

DateTime& DateTime::operator=(const DateTime& other)
{
    observe::reached(observe::Call::dateTime);
    if (this != &other)
        *fields_ = *other.fields_;
    return *this;
}

DateTime::~DateTime()
{
    observe::count(&observe::Observed::dateTimesAlive, -1);
}

DateTime DateTime::now()
{
    observe::reached(observe::Call::now);
    const auto [seconds, milliseconds] = observe::readClock();
    DateTime time(seconds, 3);
    time.setMillisecond(milliseconds);
    return time;
}

void DateTime::setMillisecond(unsigned int millisecond)
{
    observe::reached(observe::Call::dateTime);
    fields_->milliseconds = millisecond;
}

unsigned int DateTime::getMillisecond() const
{
    return fields_->milliseconds;
}

unsigned int DateTime::getScope() const
{
    return fields_->scope;
}

DateTime::operator long() const
{
    return fields_->seconds;
}

DateTime::operator std::string() const
{
    observe::reached(observe::Call::dateTimeText);
    return std::to_string(fields_->seconds) + '/' + std::to_string(fields_->scope);
}

std::ostream& operator<<(std::ostream& out, const DateTime& time)
{
    observe::reached(observe::Call::dateTimeText);
    return out << '<' << static_cast<long>(time) << '.' << time.getMillisecond() << '/' << time.getScope()
               << '>';
}

}  // namespace ZQ
