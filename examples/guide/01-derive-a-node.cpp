#include "IC/Node.h"
#include <iostream>

class Fan : public IC::Node {
public:
    Fan() : Node(SENSOR_FAN)
    {
        path = "/chassis/fan1";
        parent = "/chassis";
        description = "Front fan";
    }
};

int main()
{
    const Fan fan;
    std::cout << fan.getDescription() << ", a " << IC::pst[fan.getSensor()] << ", in " << fan.getParent()
              << '\n';
}
