// The tree, the properties, the alerts and the summary.
#include "writing.h"

#include <iomanip>
#include <map>
#include <ostream>
#include <sstream>

#include "nodes.h"
#include "values.h"

namespace inventory {

namespace {

enum AlertClass : unsigned char { CLASS_CONFIGURATION = 1, CLASS_ENVIRONMENT = 2 };

// What a status above 0 means, and the alert that it gives.
const struct Trouble {
    Status status;
    unsigned char severity;
    AlertClass alertClass;
    const char* words;
} troubles[] = {
    {STATUS_NOT_USABLE, 2, CLASS_CONFIGURATION, "the system may not use it"},
    {STATUS_PARTLY_USABLE, 1, CLASS_CONFIGURATION, "the system may not use all of it"},
    {STATUS_SIZE_UNKNOWN, 1, CLASS_CONFIGURATION, "its size is unknown"},
    {STATUS_OUTSIDE_LIMITS, 3, CLASS_ENVIRONMENT, "it is outside its limits"},
    {STATUS_ALARM, 3, CLASS_ENVIRONMENT, "it raises an alarm"},
    {STATUS_FAULT, 2, CLASS_ENVIRONMENT, "it cannot be read"},
};

const Trouble* troubleOf(const IC::Node& node)
{
    for (const Trouble& trouble : troubles)
        if (trouble.status == static_cast<unsigned int>(node.getStatus()))
            return &trouble;
    return nullptr;
}

template <class T>
std::string textOf(const T& value)
{
    std::ostringstream text;
    text << value;
    return printable(text.str());
}

std::string inWords(const IC::Node& node)
{
    const std::string path = node.getPath();
    const std::string description = node.getDescription();
    const Trouble* trouble = troubleOf(node);
    return printable(IC::pst[node.getSensor()] + ' ' + path.substr(path.rfind('/') + 1)
                     + (description.empty() ? "" : ": " + description)
                     + (trouble == nullptr ? "" : std::string(" -- ") + trouble->words));
}

using Children = std::map<std::string, std::vector<const IC::Node*>>;  // by their parent's path

void writeBelow(std::ostream& out, const Children& children, const std::string& parent, const TreeForm& form,
                const std::string& indent)
{
    const auto found = children.find(parent);
    if (found == children.end())
        return;
    for (const IC::Node* node : found->second) {
        out << indent << (form.own ? textOf(*node) : inWords(*node)) << '\n';
        if (form.withProperties)
            for (const auto& [key, value] : node->getProperties())
                writeProperty(out << indent << "    ", key, value);
        writeBelow(out, children, node->getPath(), form, indent + "  ");
    }
}

}  // namespace

void writeTree(std::ostream& out, const Nodes& nodes, const TreeForm& form)
{
    Children children;
    for (const auto& node : nodes)
        children[node->getParent()].push_back(node.get());
    writeBelow(out, children, "", form, "");
}

void writeProperty(std::ostream& out, unsigned int key, const IC::PropertyValue& value)
{
    out << '[' << textOf(std::make_pair(key, value)) << "] " << nameOf(key) << '\n';
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

void writeAlerts(std::ostream& out, const std::vector<IC::Alert>& alerts)
{
    out << "Alerts: " << alerts.size() << '\n';
    for (const IC::Alert& alert : alerts)
        out << "  " << printable(alert.getNodePaths().front() + ", " + alert.getMessage()) << "\n    "
            << textOf(alert) << '\n';
}

void writeSummary(std::ostream& out, const Nodes& nodes)
{
    std::map<IC::Node::SensorType, std::size_t> counts;
    for (const auto& node : nodes)
        ++counts[node->getSensor()];
    out << "Nodes: " << nodes.size() << ", sensor types: " << counts.size() << '\n';
    for (const auto& [sensor, count] : counts)
        out << std::setw(6) << count << "  " << IC::pst[sensor] << '\n';
}

}  // namespace inventory
