// The table of colours: related sensor types share a colour on a terminal and have similar ones in a drawing.
#include "colours.h"

#include <algorithm>
#include <cstdio>
#include <iterator>

namespace inventory {

namespace {

using IC::Node;

constexpr Colour colours[] = {
    {Node::SENSOR_COMPUTER, "1", "#f4f4f4"},
    {Node::SENSOR_CHASSIS, "1", "#dcdcdc"},
    {Node::SENSOR_PLANAR, "1", "#d2d7c4"},
    {Node::SENSOR_BIOS, "1", "#c9c9d8"},
    {Node::SENSOR_OS, "1", "#e2dccf"},
    {Node::SENSOR_GROUP, "36", "#e3eef9"},
    {Node::SENSOR_CPU, "36", "#c6e0f5"},
    {Node::SENSOR_CPU_CORE, "36", "#8fc1ea"},
    {Node::SENSOR_CACHE, "94", "#d9d6f5"},
    {Node::SENSOR_MEMORY_ARRAY, "32", "#cdecc8"},
    {Node::SENSOR_DIMM, "32", "#9fd796"},
    {Node::SENSOR_MEMORY_DEVICE, "32", "#b9e3d3"},
    {Node::SENSOR_DISK_CONTROLLER, "33", "#ffe7b3"},
    {Node::SENSOR_HARD_DRIVE, "33", "#ffd077"},
    {Node::SENSOR_NETWORK_CONTROLLER, "35", "#f8d3e8"},
    {Node::SENSOR_NETWORK_PORT, "35", "#efa6d0"},
    {Node::SENSOR_VIDEO, "95", "#dcc3ee"},
    {Node::SENSOR_IO_MODULE, "95", "#c3cdf2"},
    {Node::SENSOR_SLOT, "37", "#ece4f2"},
    {Node::SENSOR_USB_CONTROLLER, "37", "#c8eef0"},
    {Node::SENSOR_SERIAL_PORT, "37", "#b5dadd"},
    {Node::SENSOR_PARALLEL_PORT, "37", "#a6ccd0"},
    {Node::SENSOR_IPMI, "37", "#d8e6a8"},
    {Node::SENSOR_FAN, "96", "#bff3f7"},
    {Node::SENSOR_TEMPERATURE_SENSOR, "96", "#ffc9b8"},
    {Node::SENSOR_VOLTAGE_SENSOR, "96", "#fff3a6"},
    {Node::SENSOR_POWER_SUPPLY, "96", "#f5b5b0"},
};
constexpr Colour other {Node::SENSOR_UNKNOWN, "0", "#ffffff"};

}  // namespace

const Colour& colourOf(Node::SensorType sensor)
{
    for (const Colour& colour : colours)
        if (colour.sensor == sensor)
            return colour;
    return other;
}

std::size_t rankOf(Node::SensorType sensor)
{
    const auto* const found = std::find_if(std::begin(colours), std::end(colours),
                                           [&](const Colour& colour) { return colour.sensor == sensor; });
    return found == std::end(colours) ? std::size(colours) + sensor
                                      : static_cast<std::size_t>(found - std::begin(colours));
}

std::string darkFillOf(const Colour& colour)
{
    // The difference to grey is doubled, because in the dark it is hard to see.
    const std::string fill = colour.fill;
    unsigned long parts[3] = {};
    for (std::size_t i = 0; i < std::size(parts); ++i)
        parts[i] = std::stoul(fill.substr(1 + 2 * i, 2), nullptr, 16);
    const unsigned long least = std::min({parts[0], parts[1], parts[2]});
    char text[64];
    const auto dark = [&](unsigned long part) { return (part + 2 * (part - least)) * 3 / 16; };
    std::snprintf(text, sizeof text, "#%02lx%02lx%02lx", dark(parts[0]), dark(parts[1]), dark(parts[2]));
    return text;
}

}  // namespace inventory
