// The table of troubles, and the alerts.
#include "alerts.h"

#include <algorithm>
#include <map>
#include <optional>

namespace inventory {

namespace {

constexpr auto all = IC::Node::SENSOR_UNKNOWN;
constexpr auto fan = IC::Node::SENSOR_FAN;
constexpr auto voltage = IC::Node::SENSOR_VOLTAGE_SENSOR;
constexpr auto intrusion = IC::Node::SENSOR_INTRUSION;

constexpr auto env = CLASS_ENVIRONMENT;
constexpr auto conf = CLASS_CONFIGURATION;

// The worst first. A row for a sensor type replaces the row for all.
// clang-format off
constexpr Trouble troubles[] = {
    {3, env, Trouble::ABOVE, KEY_EMERGENCY_LIMIT, all, STATUS_OUTSIDE_LIMITS, "it is above its emergency limit"},
    {3, env, Trouble::FLAG_SET, KEY_EMERGENCY_ALARM, all, STATUS_ALARM, "it raises its emergency alarm"},
    {3, env, Trouble::ABOVE, KEY_UPPER_CRITICAL, all, STATUS_OUTSIDE_LIMITS, "it is above its upper critical limit"},
    {3, env, Trouble::FLAG_SET, KEY_CRIT_ALARM, all, STATUS_ALARM, "it raises its upper critical alarm"},
    {3, env, Trouble::BELOW, KEY_LOWER_CRITICAL, all, STATUS_OUTSIDE_LIMITS, "it is below its lower critical limit"},
    {3, env, Trouble::FLAG_SET, KEY_LCRIT_ALARM, all, STATUS_ALARM, "it raises its lower critical alarm"},
    {2, conf, Trouble::IN_STATUS, STATUS_NOT_USABLE, all, STATUS_NOT_USABLE, "the system may not use it"},
    {2, env, Trouble::FLAG_SET, KEY_FAULT, all, STATUS_FAULT, "it reports a fault"},
    {2, env, Trouble::FLAG_SET, KEY_ALARM, all, STATUS_ALARM, "it raises an alarm"},
    {2, env, Trouble::IN_STATUS, STATUS_OUTSIDE_LIMITS, all, STATUS_OUTSIDE_LIMITS, "it is outside its limits"},
    {2, env, Trouble::IN_STATUS, STATUS_ALARM, all, STATUS_ALARM, "it raises an alarm"},
    {2, env, Trouble::IN_STATUS, STATUS_FAULT, all, STATUS_FAULT, "it reports a fault"},
    {2, env, Trouble::BELOW, KEY_LOWER_LIMIT, fan, STATUS_OUTSIDE_LIMITS, "it is below its lower limit"},
    {2, env, Trouble::FLAG_SET, KEY_MIN_ALARM, fan, STATUS_ALARM, "it raises its lower alarm"},
    {2, env, Trouble::BELOW, KEY_LOWER_LIMIT, voltage, STATUS_OUTSIDE_LIMITS, "it is below its lower limit"},
    {2, env, Trouble::FLAG_SET, KEY_MIN_ALARM, voltage, STATUS_ALARM, "it raises its lower alarm"},
    {2, env, Trouble::ABOVE, KEY_UPPER_LIMIT, voltage, STATUS_OUTSIDE_LIMITS, "it is above its upper limit"},
    {2, env, Trouble::FLAG_SET, KEY_MAX_ALARM, voltage, STATUS_ALARM, "it raises its upper alarm"},
    {1, env, Trouble::ABOVE, KEY_UPPER_LIMIT, all, STATUS_OUTSIDE_LIMITS, "it is above its upper limit"},
    {1, env, Trouble::FLAG_SET, KEY_MAX_ALARM, all, STATUS_ALARM, "it raises its upper alarm"},
    {1, env, Trouble::BELOW, KEY_LOWER_LIMIT, all, STATUS_OUTSIDE_LIMITS, "it is below its lower limit"},
    {1, env, Trouble::FLAG_SET, KEY_MIN_ALARM, all, STATUS_ALARM, "it raises its lower alarm"},
    {1, env, Trouble::ABOVE, KEY_CAP, all, STATUS_OUTSIDE_LIMITS, "it is above its cap"},
    {1, env, Trouble::FLAG_SET, KEY_CAP_ALARM, all, STATUS_ALARM, "it raises its cap alarm"},
    {1, env, Trouble::FLAG_SET, KEY_ALARM, intrusion, STATUS_ALARM, "the chassis has been opened"},
    {1, env, Trouble::NO_READING, KEY_READING, all, STATUS_UNREAD, "it cannot be read"},
    {1, env, Trouble::IN_STATUS, STATUS_UNREAD, all, STATUS_UNREAD, "it cannot be read"},
    {1, conf, Trouble::IN_STATUS, STATUS_PARTLY_USABLE, all, STATUS_PARTLY_USABLE, "the system may not use all of it"},
    {1, conf, Trouble::IN_STATUS, STATUS_SIZE_UNKNOWN, all, STATUS_SIZE_UNKNOWN, "its size is unknown"},
};
// clang-format on

constexpr bool isWorstFirst()
{
    unsigned int severity = 3;
    for (const Trouble& trouble : troubles) {
        if (trouble.severity > severity)
            return false;
        severity = trouble.severity;
    }
    return true;
}
static_assert(isWorstFirst());

using Properties = std::map<unsigned int, IC::PropertyValue>;

// The property, or nothing unless it holds a number of this kind.
std::optional<IC::Number> numberIn(const Properties& properties, unsigned int key, IC::Number::KindType kind)
{
    const auto found = properties.find(key);
    if (found == properties.end() || found->second.getKind() != IC::PropertyValue::KIND_NUMBER)
        return {};
    const IC::Number number(found->second);
    return number.getKind() == kind ? std::optional(number) : std::nullopt;
}

bool isSet(const Properties& properties, unsigned int key)
{
    const auto flag = numberIn(properties, key, IC::Number::KIND_BOOL);
    return flag && flag->operator bool();
}

// An upper limit of 0 means that none is set. Where there is a fault, the reading says nothing.
bool isBeyond(const Properties& properties, unsigned int key, bool above)
{
    const auto reading = numberIn(properties, KEY_READING, IC::Number::KIND_REAL);
    const auto limit = numberIn(properties, key, IC::Number::KIND_REAL);
    if (!reading || !limit || isSet(properties, KEY_FAULT))
        return false;
    return above ? limit->operator double() != 0 && *reading > *limit : *reading < *limit;
}

bool isSeen(const Trouble& trouble, unsigned int status, const Properties& properties)
{
    switch (trouble.sign) {
    case Trouble::IN_STATUS:
        return status == trouble.number;
    case Trouble::FLAG_SET:
        return isSet(properties, trouble.number);
    case Trouble::ABOVE:
    case Trouble::BELOW:
        return isBeyond(properties, trouble.number, trouble.sign == Trouble::ABOVE);
    case Trouble::NO_READING:
        return numberIn(properties, trouble.number, IC::Number::KIND_NAN) && !isSet(properties, KEY_FAULT);
    }
    return false;
}

bool concerns(const Trouble& trouble, const IC::Node& node)
{
    const auto sensor = node.getSensor();
    const auto replaces = [&trouble, sensor](const Trouble& other) {
        return other.sign == trouble.sign && other.number == trouble.number && other.sensor == sensor;
    };
    return trouble.sensor == sensor
        || (trouble.sensor == all && std::none_of(std::begin(troubles), std::end(troubles), replaces));
}

// What the change of this property shows to be wrong now, or null.
const Trouble* troubleIn(const Change& change)
{
    for (const Trouble* trouble : troublesOf(*change.node))
        if (trouble->sign == Trouble::FLAG_SET && trouble->number == change.key)
            return trouble;
    return nullptr;
}

AlertClass classOf(const IC::Node& node)
{
    switch (node.getSensor()) {
    case IC::Node::SENSOR_FAN:
    case IC::Node::SENSOR_TEMPERATURE_SENSOR:
    case IC::Node::SENSOR_VOLTAGE_SENSOR:
    case IC::Node::SENSOR_POWER_SUPPLY:
    case IC::Node::SENSOR_POWER_DOMAIN:
    case IC::Node::SENSOR_COOLING_DOMAIN:
    case IC::Node::SENSOR_INTRUSION:
    case IC::Node::SENSOR_ALERT_INDICATION:
        return CLASS_ENVIRONMENT;
    default:
        return CLASS_CONFIGURATION;
    }
}

// A CPU and a memory array tell what of them the system may not use; their parts do not tell it again.
bool isToldOf(const IC::Node& node, Status status)
{
    switch (node.getSensor()) {
    case IC::Node::SENSOR_COMPUTER:
    case IC::Node::SENSOR_CPU:
    case IC::Node::SENSOR_MEMORY_ARRAY:
        return true;
    default:
        return status != STATUS_NOT_USABLE && status != STATUS_PARTLY_USABLE;
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
    const Trouble* trouble = change.subject == Change::STATUS ? troubleOf(node)
        : change.subject == Change::PROPERTY                  ? troubleIn(change)
                                                              : nullptr;
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

std::vector<Trouble> allTroubles()
{
    return {std::begin(troubles), std::end(troubles)};
}

std::vector<const Trouble*> troublesOf(const IC::Node& node)
{
    std::vector<const Trouble*> found;
    const unsigned int status = node.getStatus();
    const Properties properties = node.getProperties();
    for (const Trouble& trouble : troubles)
        if (isSeen(trouble, status, properties) && concerns(trouble, node))
            found.push_back(&trouble);
    // A sensor's limit, flag or reading says more than its status.
    const bool isExplained = std::any_of(found.begin(), found.end(), [](const Trouble* trouble) {
        return trouble->sign != Trouble::IN_STATUS;
    });
    const auto isVague = [](const Trouble* trouble) {
        return trouble->sign == Trouble::IN_STATUS && trouble->status >= STATUS_OUTSIDE_LIMITS;
    };
    if (isExplained)
        found.erase(std::remove_if(found.begin(), found.end(), isVague), found.end());
    return found;
}

const Trouble* troubleOf(const IC::Node& node)
{
    const auto found = troublesOf(node);
    return found.empty() ? nullptr : found.front();
}

std::vector<IC::Alert> alertsOf(const Nodes& nodes)
{
    std::vector<IC::Alert> alerts;
    for (const auto& node : nodes) {
        const unsigned int status = node->getStatus();
        for (const Trouble* trouble : troublesOf(*node))
            if (isToldOf(*node, trouble->status))
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
