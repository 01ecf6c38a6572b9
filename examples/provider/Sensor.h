#pragma once

#include <functional>
#include <optional>
#include <string>

#include "IC/Alert.h"
#include "IC/Node.h"

// What all sensors of one kind have in common.
struct SensorKind {
    IC::Node::SensorType type;
    bool limitIsMinimum;  // a fan must not be slower, a temperature must not be higher
    double lowestLimit;   // a limit outside this range is refused
    double highestLimit;
};

// A sensor of the machine: its reading, its limit, and the status that follows from both. Each change of the status
// raises one alert. Any thread may call any operation.
class Sensor : public IC::Node {
public:
    enum Key : unsigned int { LABEL = 1, READING = 2, LIMIT = 3 };  // only the limit is writable

    static constexpr StatusType NORMAL = STATUS_INITIAL;
    static constexpr auto BEYOND_LIMIT = static_cast<StatusType>(1);
    static constexpr auto UNREADABLE = static_cast<StatusType>(2);

    static constexpr unsigned char INVALID_LIMIT = 1;  // the status of an error that setProperty returns

    // Is called without the node's lock, by the thread that changed the sensor. Its exceptions propagate to the
    // caller of update or setProperty; the sensor has changed by then.
    using AlertHandler = std::function<void(const IC::Alert&)>;

    // Begins without a reading and without a limit.
    Sensor(const SensorKind& kind, const std::string& parentPath, const std::string& name,
           const std::string& label, const AlertHandler& onAlert);

    // Stores a reading; nothing means that the sensor cannot be read.
    void update(std::optional<double> reading);

    // A new limit must be a number in the range of the sensor's kind; if not, this returns an error of status
    // INVALID_LIMIT and changes nothing. Node::setProperty handles every other property.
    IC::Error setProperty(const unsigned int& key, const IC::PropertyValue& value) override;

private:
    IC::Error setLimit(double limit, std::optional<IC::Alert>& alert);
    StatusType judge(double reading, double limit, std::optional<IC::Alert>& alert) const;

    const SensorKind kind_;
    const AlertHandler onAlert_;
};
