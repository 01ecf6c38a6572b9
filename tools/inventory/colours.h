// The colours of the sensor types.
#pragma once

#include "IC/Node.h"

namespace inventory {

struct Colour {
    IC::Node::SensorType sensor;
    const char* onTerminal;  // the parameters of the escape sequence that selects it
    const char* fill;        // light, because the text on it is black
};

const Colour& colourOf(IC::Node::SensorType sensor);

}  // namespace inventory
