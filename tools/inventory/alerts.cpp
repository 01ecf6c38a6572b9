// The table of troubles, and the alerts.
#include "alerts.h"

#include <map>

namespace inventory {

namespace {

constexpr Trouble troubles[] = {
    {STATUS_NOT_USABLE, 2, CLASS_CONFIGURATION, "the system may not use it"},
    {STATUS_PARTLY_USABLE, 1, CLASS_CONFIGURATION, "the system may not use all of it"},
    {STATUS_SIZE_UNKNOWN, 1, CLASS_CONFIGURATION, "its size is unknown"},
    {STATUS_OUTSIDE_LIMITS, 3, CLASS_ENVIRONMENT, "it is outside its limits"},
    {STATUS_ALARM, 3, CLASS_ENVIRONMENT, "it raises an alarm"},
    {STATUS_FAULT, 2, CLASS_ENVIRONMENT, "it cannot be read"},
};

AlertClass classOf(const IC::Node& node)
{
    switch (node.getSensor()) {
    case IC::Node::SENSOR_FAN:
    case IC::Node::SENSOR_TEMPERATURE_SENSOR:
    case IC::Node::SENSOR_VOLTAGE_SENSOR:
    case IC::Node::SENSOR_POWER_SUPPLY:
        return CLASS_ENVIRONMENT;
    default:
        return CLASS_CONFIGURATION;
    }
}

std::string messageOf(const Change& change)
{
    const std::string node = IC::pst[change.node->getSensor()];
    if (change.subject == Change::NODE)
        return node + (change.from ? " went" : " came");
    const std::string subject =
        node + ": " + (change.subject == Change::STATUS ? "status" : nameOf(change.key));
    return !change.from ? subject + " came: " + *change.to
        : !change.to    ? subject + " went: " + *change.from
                        : subject + " changed from " + *change.from + " to " + *change.to;
}

IC::Alert alertOf(const Change& change)
{
    const IC::Node& node = *change.node;
    const Trouble* trouble = change.subject == Change::STATUS ? troubleOf(node) : nullptr;
    const bool isLoss = change.subject == Change::NODE && change.from;
    // A new node, a status that is 0 again and a new reading are only information.
    const bool isNews = change.subject != Change::PROPERTY || change.key == KEY_READING;
    const int severity = trouble != nullptr ? trouble->severity : isLoss ? 2 : isNews ? 0 : 1;
    return {static_cast<unsigned char>(severity),
            trouble != nullptr ? trouble->alertClass : classOf(node),
            {node.getPath()},
            node.getStatus(),
            messageOf(change)};
}

}  // namespace

const Trouble* troubleOf(const IC::Node& node)
{
    for (const Trouble& trouble : troubles)
        if (trouble.status == static_cast<unsigned int>(node.getStatus()))
            return &trouble;
    return nullptr;
}

std::vector<IC::Alert> alertsOf(const Nodes& nodes)
{
    std::vector<IC::Alert> alerts;
    std::map<std::string, unsigned int> statuses;
    for (const auto& node : nodes) {
        const unsigned int status = statuses[node->getPath()] = node->getStatus();
        const Trouble* trouble = troubleOf(*node);
        if (trouble == nullptr || (status == STATUS_NOT_USABLE && statuses[node->getParent()] == status))
            continue;
        alerts.emplace_back(trouble->severity, trouble->alertClass,
                            std::vector<std::string> {node->getPath()}, status,
                            IC::pst[node->getSensor()] + ": " + trouble->words);
    }
    return alerts;
}

std::vector<IC::Alert> alertsOf(const std::vector<Change>& changes)
{
    std::vector<IC::Alert> alerts;
    alerts.reserve(changes.size());
    for (const Change& change : changes)
        alerts.push_back(alertOf(change));
    return alerts;
}

}  // namespace inventory
