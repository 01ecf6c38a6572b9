#include "Sensor.h"

#include <cmath>
#include <stdexcept>
#include <utility>

#include "IC/ICException.h"

Sensor::Sensor(const std::string& name, const std::string& label) : Node(SENSOR_TEMPERATURE_SENSOR)
{
    path = "/chassis/" + name;
    parent = "/chassis";
    description = label;
    properties.insert({LABEL, IC::PropertyValue(label, true)});  // true: read-only
    properties.insert({READING, IC::PropertyValue(IC::Number(IC::Number::KIND_NAN), true)});
    properties.insert({LIMIT, IC::PropertyValue(IC::Number(70.0))});
}

std::optional<IC::Alert> Sensor::update(const IC::Number& reading)
{
    const double degrees = reading;          // KIND_NAN converts to a NaN
    IC::PropertyValue value(reading, true);  // assignment replaces the read-only mark too
    std::optional<IC::Alert> alert;

    const Lock lock(mutex);
    const double limit = properties.at(LIMIT);
    StatusType next = NORMAL;
    if (std::isnan(degrees))
        next = UNREADABLE;
    else if (degrees > limit)
        next = ABOVE_LIMIT;
    if (next == ABOVE_LIMIT && status != ABOVE_LIMIT) {
        constexpr unsigned char critical = 3;
        constexpr unsigned char environment = 2;
        alert = IC::Alert(critical, environment, {path}, next,
                          description + ": " + std::string(reading) + " is above the limit of "
                              + std::string(IC::Number(limit)));
    }
    // All that may throw comes before these two lines: reading and status change together or not at all.
    properties.at(READING) = std::move(value);
    status = next;
    return alert;
}

IC::Error Sensor::setProperty(const unsigned int& key, const IC::PropertyValue& value)
{
    if (key != LIMIT)
        return Node::setProperty(key, value);

    double limit = 0;
    try {
        limit = IC::Number(value);
    } catch (const IC::PropertyValueInvalidKind&) {  // no std::exception: catch it by its own name
        return {"the limit must be a number", INVALID_LIMIT};
    } catch (const std::out_of_range&) {  // a number of a kind that gives no real, such as a date-time
        return {"the limit must be a real number", INVALID_LIMIT};
    }
    if (!(limit >= -100 && limit <= 300))  // refuses NaN too
        return {INVALID_LIMIT, IC::Number(limit), "the limit is out of range"};

    // Passes on a new value: the caller's may be marked read-only, which would refuse every later limit.
    return Node::setProperty(LIMIT, IC::PropertyValue(IC::Number(limit)));
}
