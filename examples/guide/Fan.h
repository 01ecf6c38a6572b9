#pragma once

#include "IC/Node.h"

class Fan : public IC::Node {
public:
    enum { MODEL = 1, SPEED = 2, STATE = 3, LEVELS = 4, IDENTITY = 5 };
    enum class State { Stopped = 1, Running = 2 };

    Fan() : Node(SENSOR_FAN)
    {
        path = "/chassis/fan1";
        parent = "/chassis";
        description = "Front fan";
        properties.insert({MODEL, IC::PropertyValue("AFB0812", true)});  // read-only
        properties.insert({SPEED, IC::PropertyValue(IC::Number(3600u))});
        properties.insert({STATE, IC::PropertyValue(IC::EnumValue(State::Running))});
        properties.insert({LEVELS, IC::PropertyValue(IC::NumberArray {1200u, 2400u, 3600u})});
        properties.insert({IDENTITY, IC::PropertyValue(IC::Buffer {0x0a, 0xff}, true)});
    }
};
