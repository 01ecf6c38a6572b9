#include "FanProvider.h"

#include <utility>

namespace {

constexpr auto stopped = static_cast<IC::Node::StatusType>(3);

}  // namespace

FanProvider::FanProvider(const std::string& model) : Node(SENSOR_FAN)
{
    path = "/chassis/fan1";
    parent = "/chassis";
    properties.insert({MODEL, IC::PropertyValue(model, true)});
    properties.insert({SPEED, IC::PropertyValue(IC::Number(0u))});
}

void FanProvider::measured(unsigned int speed)
{
    IC::PropertyValue value {IC::Number(speed)};  // may throw, so it comes before any change
    const Lock lock(mutex);
    properties.at(SPEED) = std::move(value);
    status = speed == 0 ? stopped : STATUS_INITIAL;
}

IC::Alert FanProvider::alert() const
{
    return IC::Alert(2, 1, {path}, getStatus(), "The fan has stopped");
}
