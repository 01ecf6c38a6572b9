#pragma once

#include "IC/Alert.h"
#include "IC/Node.h"

// A fan whose speed comes from somewhere else, and the alert that it has stopped.
class FanProvider : public IC::Node {
public:
    enum { MODEL = 1, SPEED = 2 };

    explicit FanProvider(const std::string& model);

    // Takes over a measurement, in revolutions a minute. Under the node's lock, so that nobody sees the speed of one
    // moment with the status of another.
    void measured(unsigned int speed);

    // What to tell the operator about the present state.
    IC::Alert alert() const;
};
