#include "IC/Node.h"
#include <iostream>

class Fan : public IC::Node {
public:
    enum { SPEED = 2, TARGET = 3 };

    Fan() : Node(SENSOR_FAN)
    {
        properties.insert({TARGET, IC::PropertyValue(IC::PropertyValue::KIND_UNKNOWN)});  // not known yet
    }
};

int main()
{
    Fan fan;
    const IC::PropertyValue value(IC::Number(3600u));
    std::cout << "speed: " << fan.setProperty(Fan::SPEED, value) << '\n';
    std::cout << "target: " << fan.setProperty(Fan::TARGET, value) << '\n';
    std::cout << fan.getProperties() << '\n';
}
