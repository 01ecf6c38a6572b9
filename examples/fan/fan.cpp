#include "IC/ICException.h"
#include "IC/Node.h"
#include <iostream>

class Fan : public IC::Node {
public:
    enum { MODEL = 1, SPEED = 2 };

    Fan() : Node(SENSOR_FAN)
    {
        path = "/chassis/fan1";
        properties.insert({MODEL, IC::PropertyValue("AFB0812", true)});  // read-only
        properties.insert({SPEED, IC::PropertyValue(IC::Number(3600u))});
    }
};

int main()
{
    Fan fan;
    IC::PropertyValue value("");
    std::cout << "reading the speed: " << fan.getProperty(Fan::SPEED, value) << '\n';
    unsigned int speed = value;
    std::cout << speed << " turns a minute\n";
    std::cout << "changing the model: " << fan.setProperty(Fan::MODEL, value) << '\n';
    try {
        fan.getProperty(Fan::MODEL, value);
        unsigned int model = value;  // throws: the model is a text
        std::cout << model << '\n';
    } catch (const IC::PropertyValueInvalidKind& refusal) {
        std::cout << refusal.what() << '\n';
    }
    std::cout << fan << '\n' << fan.getProperties() << '\n';
}
