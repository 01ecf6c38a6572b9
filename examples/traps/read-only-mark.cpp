#include "IC/Node.h"
#include <iostream>

class Fan : public IC::Node {
public:
    enum { SPEED = 2 };

    Fan() : Node(SENSOR_FAN) { properties.insert({SPEED, IC::PropertyValue(IC::Number(3600u))}); }
};

int main()
{
    std::cout << std::boolalpha;

    IC::PropertyValue model("AFB0812", true);
    model = IC::PropertyValue("AFB0912");  // not refused, and writable again
    std::cout << model << ' ' << model.readOnly() << '\n';
    model = IC::PropertyValue("AFB0912", true);
    std::cout << model << ' ' << model.readOnly() << '\n';

    Fan fan;
    std::cout << fan.setProperty(Fan::SPEED, IC::PropertyValue(IC::Number(4200u), true)) << '\n';
    std::cout << fan.setProperty(Fan::SPEED, IC::PropertyValue(IC::Number(4800u)))
              << '\n';  // read-only since the call above
}
