// The text format that Prometheus reads.
#include <cmath>
#include <map>
#include <ostream>

#include "values.h"
#include "writing.h"

namespace inventory {

namespace {

using Properties = std::map<unsigned int, IC::PropertyValue>;
using Labels = std::vector<std::pair<const char*, std::string>>;

std::string textIn(const Properties& properties, unsigned int key)
{
    const auto found = properties.find(key);
    return found == properties.end() ? "" : std::string(found->second);
}

class Metrics {
public:
    explicit Metrics(std::ostream& out) : out_(out) { }

    // The metric that the next values belong to.
    void begin(const char* name, const char* help)
    {
        name_ = name;
        out_ << "# HELP " << name << ' ' << help << "\n# TYPE " << name << " gauge\n";
    }

    void add(const Labels& labels, const std::string& value)
    {
        out_ << name_;
        const char* before = "{";
        for (const auto& [label, text] : labels) {
            out_ << before << label << "=\"" << escaped(text) << '"';
            before = ",";
        }
        out_ << (labels.empty() ? " " : "} ") << value << '\n';
    }

private:
    // The text is UTF-8 without control characters then, as the format demands.
    static std::string escaped(const std::string& text)
    {
        std::string out;
        for (const char character : printable(text))
            out += character == '\\' || character == '"' ? std::string("\\") + character
                                                         : std::string(1, character);
        return out;
    }

    std::ostream& out_;
    const char* name_ = "";
};

}  // namespace

void writeMetrics(std::ostream& out, const Nodes& nodes, const std::vector<IC::Alert>& alerts,
                  const char* version)
{
    Metrics metrics(out);
    const Properties machine = nodes.empty() ? Properties() : nodes.front()->getProperties();
    metrics.begin("ic_inventory_info", "The machine and the version of ic-inventory.");
    metrics.add({{"host", hostOf(nodes)},
                 {"maker", textIn(machine, KEY_MAKER)},
                 {"model", textIn(machine, KEY_MODEL)},
                 {"version", version}},
                "1");

    std::map<std::string, std::size_t> counts;
    for (const auto& node : nodes)
        ++counts[IC::pst[node->getSensor()]];
    metrics.begin("ic_nodes", "The number of nodes of a sensor type.");
    for (const auto& [sensor, count] : counts)
        metrics.add({{"sensor", sensor}}, std::to_string(count));

    metrics.begin("ic_node_status", "The status of a node; above 0, something is wrong.");
    for (const auto& node : nodes)
        metrics.add({{"path", node->getPath()}, {"sensor", IC::pst[node->getSensor()]}},
                    std::to_string(static_cast<unsigned int>(node->getStatus())));

    metrics.begin("ic_sensor_reading", "The reading of a sensor in its unit.");
    for (const auto& node : nodes) {
        const Properties properties = node->getProperties();
        const auto reading = properties.find(KEY_READING);
        if (reading == properties.end())
            continue;
        const auto number = realNumber(exactText(reading->second));  // nothing if it could not be read
        if (number)
            metrics.add({{"path", node->getPath()},
                         {"sensor", IC::pst[node->getSensor()]},
                         {"unit", textIn(properties, KEY_UNIT)}},
                        exactText(reading->second));
    }

    constexpr std::size_t severities = IC::Alert::SEVERITY_LARGEST + 1;
    std::size_t raised[severities] = {};
    for (const IC::Alert& alert : alerts)
        ++raised[alert.getSeverity()];
    metrics.begin("ic_alerts", "The number of alerts; 0 is information, 1 a warning, 2 major, 3 critical.");
    for (std::size_t severity = 0; severity < severities; ++severity)
        metrics.add({{"severity", std::to_string(severity)}}, std::to_string(raised[severity]));

    metrics.begin("ic_memory_bytes", "The memory of the machine.");
    const std::string size = textIn(machine, KEY_SIZE);
    metrics.add({}, size.empty() ? "0" : size);
    metrics.begin("ic_up", "1: the machine was read.");
    metrics.add({}, "1");
}

}  // namespace inventory
