// The line for monitoring systems: a word, a text and, after |, the readings as performance data.
#include <algorithm>
#include <cmath>
#include <map>
#include <ostream>

#include "values.h"
#include "writing.h"

namespace inventory {

namespace {

using Properties = std::map<unsigned int, IC::PropertyValue>;

// On one line, without the sign that begins the performance data.
std::string plain(const std::string& text)
{
    std::string out = printable(text);
    std::replace(out.begin(), out.end(), '|', '/');
    return out;
}

std::string realIn(const Properties& properties, unsigned int key)
{
    const auto found = properties.find(key);
    const std::string text = found == properties.end() ? "" : exactText(found->second);
    return realNumber(text) ? text : "";
}

// "" for 0 too, which means that no upper limit is set.
std::string upperIn(const Properties& properties, unsigned int key)
{
    const std::string text = realIn(properties, key);
    return realNumber(text).value_or(0) == 0 ? "" : text;
}

// The range of readings that are in order, as "10:90", "90" for 0 to 90, "~:90" or "10:"; empty without limits.
std::string range(const std::string& lowest, const std::string& highest)
{
    if (lowest.empty())
        return highest.empty() ? "" : "~:" + highest;
    return lowest + ':' + highest;
}

// 'path'=reading;warning;critical
std::string measured(const IC::Node& node)
{
    const Properties properties = node.getProperties();
    const std::string reading = realIn(properties, KEY_READING);
    if (reading.empty())
        return "";
    std::string label = plain(node.getPath());
    label.erase(std::remove_if(label.begin(), label.end(), [](char c) { return c == '\'' || c == '='; }),
                label.end());
    std::string data = " '" + label + "'=" + reading + ';'
        + range(realIn(properties, KEY_LOWER_LIMIT), upperIn(properties, KEY_UPPER_LIMIT)) + ';'
        + range(realIn(properties, KEY_LOWER_CRITICAL), upperIn(properties, KEY_UPPER_CRITICAL));
    data.erase(data.find_last_not_of(';') + 1);
    return data;
}

}  // namespace

CheckStatus writeCheck(std::ostream& out, const Nodes& nodes, const std::vector<IC::Alert>& alerts)
{
    constexpr std::size_t most = 3;
    std::vector<const IC::Alert*> worst;
    for (const IC::Alert& alert : alerts)
        if (alert.getSeverity() > 0)
            worst.push_back(&alert);
    std::stable_sort(worst.begin(), worst.end(), [](const IC::Alert* a, const IC::Alert* b) {
        return a->getSeverity() > b->getSeverity();
    });
    const auto warnings = std::count_if(worst.begin(), worst.end(),
                                        [](const IC::Alert* alert) { return alert->getSeverity() == 1; });
    const auto critical = static_cast<std::ptrdiff_t>(worst.size()) - warnings;
    const CheckStatus status = critical != 0 ? CHECK_CRITICAL : warnings != 0 ? CHECK_WARNING : CHECK_OK;

    static const char* const words[] = {"OK", "WARNING", "CRITICAL"};
    out << words[status] << ": " << nodes.size() << " nodes";
    if (worst.empty())
        out << ", no alert";
    for (std::size_t i = 0; i < std::min(worst.size(), most); ++i)
        out << (i == 0 ? ", " : "; ") << plain(worst[i]->getNodePaths().front()) << ", "
            << plain(worst[i]->getMessage());
    if (worst.size() > most)
        out << "; and " << worst.size() - most << " more";
    out << " | nodes=" << nodes.size() << " warnings=" << warnings << " critical=" << critical;
    for (const auto& node : nodes)
        out << measured(*node);
    out << '\n';
    return status;
}

void writeUnknown(std::ostream& out, const std::string& why)
{
    out << "UNKNOWN: " << plain(why) << '\n';
}

}  // namespace inventory
