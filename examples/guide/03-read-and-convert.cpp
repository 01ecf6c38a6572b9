#include "Fan.h"
#include <iostream>

int main()
{
    const Fan fan;
    IC::PropertyValue value(IC::PropertyValue::KIND_UNKNOWN);

    if (fan.getProperty(Fan::SPEED, value) == IC::Error::STATUS_SUCCESS) {
        const unsigned int speed = value;
        std::cout << "speed " << speed << '\n';
    }
    if (fan.getProperty(Fan::MODEL, value) == IC::Error::STATUS_SUCCESS) {
        const std::string model = value;
        std::cout << "model " << model << '\n';
    }
    if (fan.getProperty(Fan::STATE, value) == IC::Error::STATUS_SUCCESS) {
        const IC::EnumValue state = value;
        const unsigned char code = state;
        std::cout << "state " << +code << '\n';
    }
    if (fan.getProperty(Fan::LEVELS, value) == IC::Error::STATUS_SUCCESS) {
        const IC::NumberArray levels = value;
        const unsigned int highest = levels.back();
        std::cout << levels.size() << " levels up to " << highest << '\n';
    }
    std::cout << "no such property: status " << fan.getProperty(99, value) << '\n';
}
