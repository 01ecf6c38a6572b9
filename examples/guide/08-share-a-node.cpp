#include "IC/Node.h"
#include <iostream>
#include <thread>

class Door : public IC::Node {
public:
    enum { OPENED = 1 };

    Door() : Node(SENSOR_INTRUSION)
    {
        path = "/chassis/door";
        properties.insert({OPENED, IC::PropertyValue(IC::Number(0u))});
    }

    void countOpening()
    {
        const Lock lock(mutex);
        const unsigned int opened = properties.at(OPENED);
        properties.at(OPENED) = IC::Number(opened + 1);
    }
};

int main()
{
    Door door;
    const auto openOften = [&door] {
        for (int i = 0; i < 1000; ++i)
            door.countOpening();
    };
    std::thread front(openOften);
    std::thread back(openOften);
    front.join();
    back.join();

    IC::PropertyValue value(IC::PropertyValue::KIND_UNKNOWN);
    door.getProperty(Door::OPENED, value);
    std::cout << "opened " << value << " times\n";
}
