#pragma once

#include "IC/Alert.h"
#include "IC/Node.h"

// A fan with a measured speed, and the alert that the fan has stopped.
class FanProvider : public IC::Node {
public:
    enum { MODEL = 1, SPEED = 2 };

    explicit FanProvider(const std::string& model);

    // Stores a measured speed in revolutions per minute. Speed and status change under one lock, so no reader sees
    // the new speed with the old status.
    void measured(unsigned int speed);

    // The alert for the operator, with the present status.
    IC::Alert alert() const;
};
