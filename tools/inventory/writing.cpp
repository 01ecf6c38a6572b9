// Writes the tree, the properties, the alerts, the changes and the summary as text.
#include "writing.h"

#include <langinfo.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <algorithm>
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

// The text with the signs that the output can show.
std::string shownAs(std::string text, const Look& look)
{
    static const struct {
        std::string_view sign;
        const char* plain;
    } signs[] = {{"\u00d7", "x"}, {"\u00b0", ""}};
    for (const auto& row : signs)
        for (std::size_t at = 0; !look.isUtf8 && (at = text.find(row.sign, at)) != std::string::npos;)
            text.replace(at, row.sign.size(), row.plain);
    return text;
}

// Every character of the texts is one column wide.
std::size_t columnsOf(const std::string& text)
{
    return static_cast<std::size_t>(
        std::count_if(text.begin(), text.end(), [](char byte) { return (byte & 0xC0) != 0x80; }));
}

std::string cut(const std::string& text, std::size_t columns)
{
    constexpr std::string_view dots = "...";
    if (columnsOf(text) <= columns)
        return text;
    const std::size_t kept = columns < dots.size() ? columns : columns - dots.size();
    std::size_t end = 0;
    for (std::size_t column = 0; column <= kept; ++end)
        column += (text[end] & 0xC0) != 0x80 ? 1 : 0;
    return text.substr(0, end - 1) + std::string(dots.substr(0, columns - kept));
}

struct Painted {
    const char* colour;
    std::string text;
};

// Writes the pieces. If they are wider than the terminal, the one with this index becomes shorter, then all.
void writeLine(std::ostream& out, const Look& look, std::vector<Painted> pieces, std::size_t shortened)
{
    std::size_t columns = 0;
    for (Painted& piece : pieces) {
        piece.text = shownAs(piece.text, look);
        columns += columnsOf(piece.text);
    }
    if (look.width != 0 && columns > look.width) {
        std::string& text = pieces[shortened].text;
        const std::size_t others = columns - columnsOf(text);
        constexpr std::size_t fewest = 3;  // the dots
        text = cut(text, std::max(look.width - std::min(others, look.width), fewest));
    }
    std::size_t left = look.width == 0 ? std::string::npos : look.width;
    for (const Painted& piece : pieces) {
        const std::string text = cut(piece.text, left);
        left -= left == std::string::npos ? 0 : columnsOf(text);
        out << (text.empty() || *piece.colour == '\0' ? text : painted(look, piece.colour, text));
    }
    out << '\n';
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

void writePart(std::ostream& out, const Part& part, const TreeForm& form, const std::string& indent,
               const char* branch)
{
    const Lines& lines = linesOfLook[form.look.lines];
    const Shown& first = part.first();
    if (form.own) {
        out << indent << branch << textOf(*first.node) << '\n';
    } else {
        const std::string details = View::detailsOf(part);
        const std::string troubles = View::troublesOf(part);
        writeLine(out, form.look,
                  {{"", indent + branch},
                   {colourOf(first.node->getSensor()).onTerminal, View::headOf(part)},
                   {"", details.empty() ? "" : ": " + details},
                   {severities[2], troubles.empty() ? "" : " -- " + troubles}},
                  2);
    }
    const std::string below = indent
        + (branch == lines.lastChild ? lines.belowLast
               : *branch == '\0'     ? ""
                                     : lines.belowChild);
    if (form.withProperties)
        for (const auto& [key, value] : first.properties)
            if (key != KEY_LABEL || !exactText(value).empty())
                writeProperty(out << below << (part.inner.empty() ? lines.lastProperty : lines.property), key,
                              value);
    for (const Part& inner : part.inner)
        writePart(out, inner, form, below, &inner == &part.inner.back() ? lines.lastChild : lines.child);
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

Look lookOfFile()
{
    std::setlocale(LC_CTYPE, "");
    return {false, Look::LINES_NONE, std::strcmp(nl_langinfo(CODESET), "UTF-8") == 0};
}

Look lookOfStandardOutput()
{
    Look look = lookOfFile();
    if (isatty(STDOUT_FILENO) == 0)
        return look;
    const auto is = [](const char* name) {
        const char* value = std::getenv(name);
        return std::string(value == nullptr ? "" : value);
    };
    look.isColoured = is("NO_COLOR").empty() && is("TERM") != "dumb";
    look.lines = look.isUtf8 ? Look::LINES_DRAWN : Look::LINES_ASCII;
    winsize window {};
    look.width = ioctl(STDOUT_FILENO, TIOCGWINSZ, &window) == 0 ? window.ws_col : 0;
    return look;
}

void writeFirstScreen(std::ostream& out, const View& view, const Look& look)
{
    constexpr std::size_t most = 25;
    constexpr std::size_t labelWidth = 12;
    constexpr const char* bold = "1";
    writeLine(out, look, {{bold, view.title()}}, 0);
    std::size_t lines = 1;
    for (const Entry& row : view.entries())
        for (const std::string& line : row.lines) {
            std::string label = &line == &row.lines.front() ? row.label : "";
            label.resize(labelWidth, ' ');
            writeLine(out, look, {{bold, "  " + label}, {"", line}}, 1);
            ++lines;
        }
    const auto& alerts = view.alerts();
    std::string label = "Alerts";
    label.resize(labelWidth, ' ');
    writeLine(out, look,
              {{bold, "  " + label}, {"", alerts.empty() ? "none" : std::to_string(alerts.size())}}, 1);
    ++lines;
    const std::size_t shown = alerts.size() <= most - lines ? alerts.size() : most - lines - 1;
    for (std::size_t i = 0; i < shown; ++i)
        writeLine(out, look,
                  {{"", "    "},
                   {severities[alerts[i].severity], severityName(alerts[i].severity)},
                   {"", " " + alerts[i].path + ", "},
                   {"", alerts[i].message}},
                  3);
    if (shown < alerts.size())
        writeLine(out, look,
                  {{"", "    and " + std::to_string(alerts.size() - shown) + " more; --all writes them"}}, 0);
}

void writeTree(std::ostream& out, const View& view, const TreeForm& form)
{
    const bool all = form.own || form.withProperties || form.all;
    for (const Part& part : all ? view.all() : view.folded())
        writePart(out, part, form, "", "");
}

void writeProperty(std::ostream& out, unsigned int key, const IC::PropertyValue& value)
{
    const std::string ranges = key == KEY_CPU_SET ? rangesOf(value) : "";
    const std::string text =
        ranges.empty() ? textOf(std::make_pair(key, value)) : std::to_string(key) + " = " + ranges;
    out << '[' << text << "] " << nameOf(key) << '\n';
}

void writeAlerts(std::ostream& out, const std::vector<IC::Alert>& alerts, const Look& look)
{
    out << "Alerts: " << alerts.size() << '\n';
    for (const IC::Alert& alert : alerts) {
        writeLine(out, look,
                  {{"", "  "},
                   {severities[alert.getSeverity()],
                    printable(alert.getNodePaths().front() + ", " + alert.getMessage())}},
                  1);
        writeLine(out, look, {{"", "    " + textOf(alert)}}, 0);
    }
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
