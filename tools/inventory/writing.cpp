// Writes the tree, the properties, the alerts, the changes and the summary as text.
#include "writing.h"

#include <langinfo.h>
#include <unistd.h>

#include <clocale>
#include <cstdlib>
#include <cstring>
#include <iomanip>
#include <ostream>
#include <sstream>

#include "alerts.h"
#include "colours.h"
#include "values.h"

namespace inventory {

namespace {

constexpr const char* removed = "31";
constexpr const char* added = "32";
constexpr const char* severities[] = {"32", "33", "31", "1;31"};

std::string painted(const Look& look, const char* colour, const std::string& text)
{
    return look.isColoured ? std::string("\x1b[") + colour + 'm' + text + "\x1b[0m" : text;
}

template <class T>
std::string textOf(const T& value)
{
    std::ostringstream text;
    text << value;
    return printable(text.str());
}

std::string troubleIn(const IC::Node& node)
{
    const Trouble* trouble = troubleOf(node);
    return trouble == nullptr ? "" : std::string(" -- ") + trouble->words;
}

std::string nodeLine(const IC::Node& node, const TreeForm& form)
{
    if (form.own)
        return textOf(node);
    const std::string text = inWords(node);
    const std::size_t sensor = IC::pst[node.getSensor()].size();
    const std::string trouble = troubleIn(node);
    return painted(form.look, colourOf(node.getSensor()).onTerminal, text.substr(0, sensor))
        + text.substr(sensor) + (trouble.empty() ? "" : painted(form.look, severities[2], trouble));
}

// The beginnings of lines: of a child that another child follows, of the last child, of the lines below each of the
// two, and of the properties of a node with children and of a node without.
struct Lines {
    const char* child;
    const char* lastChild;
    const char* belowChild;
    const char* belowLast;
    const char* property;
    const char* lastProperty;
};
constexpr Lines linesOfLook[] = {
    {"  ", "  ", "  ", "  ", "    ", "    "},
    {"|-- ", "`-- ", "|   ", "    ", "|     ", "      "},
    {"\u251c\u2500\u2500 ", "\u2514\u2500\u2500 ", "\u2502   ", "    ", "\u2502     ", "      "}};

void writeNode(std::ostream& out, const Children& children, const IC::Node& node, const TreeForm& form,
               const std::string& indent)
{
    const Lines& lines = linesOfLook[form.look.lines];
    const auto found = children.find(node.getPath());
    const bool hasChildren = found != children.end();
    out << nodeLine(node, form) << '\n';
    if (form.withProperties)
        for (const auto& [key, value] : node.getProperties())
            writeProperty(out << indent << (hasChildren ? lines.property : lines.lastProperty), key, value);
    if (!hasChildren)
        return;
    for (const IC::Node* child : found->second) {
        const bool isLast = child == found->second.back();
        out << indent << (isLast ? lines.lastChild : lines.child);
        writeNode(out, children, *child, form, indent + (isLast ? lines.belowLast : lines.belowChild));
    }
}

std::string heading(const IC::Node& node)
{
    return IC::pst[node.getSensor()] + ' ' + node.getPath();
}

std::string changedIn(const Change& change, const std::string& text)
{
    if (change.subject == Change::NODE)
        return heading(*change.node) + (text.empty() ? "" : ": " + text);
    if (change.subject == Change::STATUS)
        return "  status " + text;
    return "  [" + std::to_string(change.key) + " = " + text + "] " + nameOf(change.key);
}

}  // namespace

Look lookOfStandardOutput()
{
    if (isatty(STDOUT_FILENO) == 0)
        return {};
    const auto is = [](const char* name) {
        const char* value = std::getenv(name);
        return std::string(value == nullptr ? "" : value);
    };
    std::setlocale(LC_CTYPE, "");
    const bool isUtf8 = std::strcmp(nl_langinfo(CODESET), "UTF-8") == 0;
    return {is("NO_COLOR").empty() && is("TERM") != "dumb", isUtf8 ? Look::LINES_DRAWN : Look::LINES_ASCII};
}

Children childrenOf(const Nodes& nodes)
{
    Children children;
    for (const auto& node : nodes)
        children[node->getParent()].push_back(node.get());
    return children;
}

std::string inWords(const IC::Node& node)
{
    const std::string path = node.getPath();
    const std::string description = node.getDescription();
    return printable(IC::pst[node.getSensor()] + ' ' + path.substr(path.rfind('/') + 1)
                     + (description.empty() ? "" : ": " + description));
}

void writeTree(std::ostream& out, const Nodes& nodes, const TreeForm& form)
{
    const Children children = childrenOf(nodes);
    for (const auto& node : nodes)
        if (node->getParent().empty())
            writeNode(out, children, *node, form, "");
}

void writeProperty(std::ostream& out, unsigned int key, const IC::PropertyValue& value)
{
    out << '[' << textOf(std::make_pair(key, value)) << "] " << nameOf(key) << '\n';
}

void writeAlerts(std::ostream& out, const std::vector<IC::Alert>& alerts, const Look& look)
{
    out << "Alerts: " << alerts.size() << '\n';
    for (const IC::Alert& alert : alerts)
        out << "  "
            << painted(look, severities[alert.getSeverity()],
                       printable(alert.getNodePaths().front() + ", " + alert.getMessage()))
            << "\n    " << textOf(alert) << '\n';
}

void writeChanges(std::ostream& out, const std::vector<Change>& changes, const Look& look)
{
    const IC::Node* last = nullptr;
    for (const Change& change : changes) {
        if (change.subject != Change::NODE && change.node != last)
            out << "  " << printable(heading(*change.node)) << '\n';
        last = change.node;
        if (change.from)
            out << painted(look, removed, "- " + printable(changedIn(change, *change.from))) << '\n';
        if (change.to)
            out << painted(look, added, "+ " + printable(changedIn(change, *change.to))) << '\n';
    }
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
