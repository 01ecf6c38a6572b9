#include "Sensor.h"

#include <cmath>
#include <stdexcept>
#include <utility>

#include "IC/ICException.h"

namespace {

// Nothing if the value is no number; then the library has logged why.
std::optional<double> numberIn(const IC::PropertyValue& value)
{
    try {
        const double number = IC::Number(value);
        return number;
    } catch (const IC::PropertyValueInvalidKind&) {  // no std::exception: catch it by its own name
    } catch (const std::out_of_range&) {             // a number that is not a real one, such as a date-time
    }
    return std::nullopt;
}

}  // namespace

Sensor::Sensor(const SensorKind& kind, const std::string& parentPath, const std::string& name,
               const std::string& label, const AlertHandler& onAlert)
    : Node(kind.type),
      kind_(kind),
      onAlert_(onAlert)
{
    path = parentPath + '/' + name;
    parent = parentPath;
    description = label;
    properties.insert({LABEL, IC::PropertyValue(label, true)});
    properties.insert({READING, IC::PropertyValue(IC::Number(IC::Number::KIND_NAN), true)});
    properties.insert({LIMIT, IC::PropertyValue(IC::Number(IC::Number::KIND_NAN))});
}

void Sensor::update(std::optional<double> reading)
{
    // Assignment replaces the read-only mark too, so the new value needs one.
    IC::PropertyValue value(reading ? IC::Number(*reading) : IC::Number(IC::Number::KIND_NAN), true);
    std::optional<IC::Alert> alert;
    {
        const Lock lock(mutex);
        const StatusType next = judge(value, properties.at(LIMIT), alert);  // may throw, so it comes first
        properties.at(READING) = std::move(value);
        status = next;
    }
    if (alert)
        onAlert_(*alert);
}

IC::Error Sensor::setProperty(const unsigned int& key, const IC::PropertyValue& value)
{
    if (key != LIMIT)
        return Node::setProperty(key, value);

    const std::optional<double> limit = numberIn(value);
    if (!limit)
        return {"the limit must be a number", INVALID_LIMIT};
    if (!(*limit >= kind_.lowestLimit && *limit <= kind_.highestLimit))  // refuses NaN too
        return {INVALID_LIMIT, IC::Number(*limit), "the limit is out of range"};

    std::optional<IC::Alert> alert;
    IC::Error outcome = setLimit(*limit, alert);
    if (alert)
        onAlert_(*alert);
    return outcome;
}

// Holds the lock until the status fits the limit. Node::setProperty takes the lock again, which is re-entrant.
IC::Error Sensor::setLimit(double limit, std::optional<IC::Alert>& alert)
{
    const Lock lock(mutex);
    const StatusType next = judge(properties.at(READING), limit, alert);
    // Passes on a new value, because the caller's may be read-only or of another kind of number.
    IC::Error outcome = Node::setProperty(LIMIT, IC::PropertyValue(IC::Number(limit)));
    status = next;
    return outcome;
}

// Gives the status that follows from reading and limit, and an alert if that is a new status. NaN means none. The
// caller holds the lock.
Sensor::StatusType Sensor::judge(double reading, double limit, std::optional<IC::Alert>& alert) const
{
    const bool isBeyond = kind_.limitIsMinimum ? reading < limit : reading > limit;
    const StatusType next = std::isnan(reading) ? UNREADABLE : isBeyond ? BEYOND_LIMIT : NORMAL;
    if (next == status)
        return next;
    const std::string value = IC::Number(reading);
    const char* const comparison =
        kind_.limitIsMinimum ? " is below the limit of " : " is above the limit of ";
    const std::string message = next == UNREADABLE ? "cannot be read"
        : next == NORMAL                           ? value + " is normal"
                                                   : value + comparison + std::string(IC::Number(limit));
    const unsigned char severity = next == NORMAL ? 0 : next == UNREADABLE ? 2 : 3;
    constexpr unsigned char environment = 2;
    alert.emplace(severity, environment, std::vector<std::string> {path}, next, description + ": " + message);
    return next;
}
