#pragma once

#include <optional>
#include <string>

#include "IC/Alert.h"
#include "IC/Node.h"

// A temperature sensor of the machine, in degrees Celsius. Any thread may call any operation.
class Sensor : public IC::Node {
public:
    enum Key : unsigned int { LABEL = 1, READING = 2, LIMIT = 3 };  // only the limit is writable

    static constexpr StatusType NORMAL = STATUS_INITIAL;
    static constexpr auto ABOVE_LIMIT = static_cast<StatusType>(1);
    static constexpr auto UNREADABLE = static_cast<StatusType>(2);

    static constexpr unsigned char INVALID_LIMIT = 1;  // the status of an error that setProperty returns

    // The path is "/chassis/" and the name. Begins without a reading, with a limit of 70 degrees.
    Sensor(const std::string& name, const std::string& label);

    // Stores a reading; one of KIND_NAN means that the sensor cannot be read. Returns an alert if the reading is above
    // the limit and the status was another one before.
    std::optional<IC::Alert> update(const IC::Number& reading);

    // A limit must be a number from -100 to 300; otherwise this returns an error of status INVALID_LIMIT and changes
    // nothing. A new limit applies from the next reading on. Node::setProperty handles the other properties.
    IC::Error setProperty(const unsigned int& key, const IC::PropertyValue& value) override;
};
