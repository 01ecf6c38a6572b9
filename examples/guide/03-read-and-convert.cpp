#include "Fan.h"
#include "IC/visit.h"
#include <iostream>

struct Describe {
    void operator()(const std::string& text) const { std::cout << text.size() << " characters\n"; }
    void operator()(const IC::NumberArray& numbers) const { std::cout << numbers.size() << " numbers\n"; }
    template <class Other>
    void operator()(const Other&) const
    {
        std::cout << "something else\n";
    }
};

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
        const bool running = static_cast<Fan::State>(state) == Fan::State::Running;
        std::cout << (running ? "running\n" : "stopped\n");
    }
    if (fan.getProperty(Fan::LEVELS, value) == IC::Error::STATUS_SUCCESS) {
        const IC::NumberArray levels = value;
        const unsigned int highest = levels.back();
        std::cout << levels.size() << " levels up to " << highest << '\n';
    }
    for (const auto& [key, property] : fan.getProperties()) {
        std::cout << key << ": ";
        IC::visit(property, Describe());
    }
    std::cout << "no such property: status " << fan.getProperty(99, value) << '\n';
}
