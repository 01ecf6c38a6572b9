// The colours of the sensor types.
#pragma once

#include <cstddef>
#include <string>

#include "IC/Node.h"

namespace inventory {

struct Colour {
    IC::Node::SensorType sensor;
    const char* onTerminal;  // the parameters of the escape sequence that selects it
    const char* fill;        // light, because the text on it is black
};

const Colour& colourOf(IC::Node::SensorType sensor);
std::size_t rankOf(IC::Node::SensorType sensor);  // related sensor types follow each other
std::string darkFillOf(const Colour& colour);     // of the same hue, for white text

}  // namespace inventory
