// Draws the machine: a box for each part, memory as a bar above what it serves, equal parts in columns.
#include <algorithm>
#include <cmath>
#include <cstdio>
#include <map>
#include <ostream>
#include <set>
#include <sstream>

#include "colours.h"
#include "values.h"
#include "writing.h"

namespace inventory {

namespace {

using IC::Node;

// In units of the drawing. All letters have the same width, so the width of a text is known.
constexpr int letterWidth = 7;
constexpr int lineHeight = 15;
constexpr int gap = 6;
constexpr int pageWidth = 1240;          // no grid is wider unless one of its boxes is
constexpr std::size_t longestLine = 30;  // in letters; more if the box is wider
constexpr std::size_t mostLines = 8;     // about the parts of a device

struct Line {
    const char* style;  // a class
    std::string text;
};

struct Box {
    Node::SensorType sensor = Node::SENSOR_UNKNOWN;
    std::string title;
    bool isTroubled = false;
    std::vector<Line> lines;
    std::vector<Box> bars;     // memory
    std::vector<Box> parts;    // what has cores, in equal columns
    std::vector<Box> devices;  // in equal columns below
    std::size_t columns = 1;   // of the parts
    int x = 0;                 // in the box around it
    int y = 0;
    int width = 0;
    int height = 0;
};

std::size_t lettersIn(const std::string& text)
{
    return static_cast<std::size_t>(
        std::count_if(text.begin(), text.end(), [](char byte) { return (byte & 0xC0) != 0x80; }));
}

int widthOf(std::size_t letters)
{
    return static_cast<int>(letters) * letterWidth + 2 * gap;
}

// Fits the text into lines of this many letters, at most two, broken at blanks.
std::vector<std::string> wrapped(const std::string& text, std::size_t letters)
{
    const auto shortened = [&](const std::string& line) {
        if (lettersIn(line) <= letters)
            return line;
        std::size_t end = 0;
        for (std::size_t count = 0; end < line.size() && count + 3 <= letters; ++end)
            count += (line[end] & 0xC0) != 0x80 ? 1 : 0;
        return line.substr(0, end == 0 ? 0 : end - 1) + "...";
    };
    if (lettersIn(text) <= letters)
        return {text};
    const auto blank = text.find_last_of(' ', letters);
    if (blank == std::string::npos || blank < letters / 3)
        return {shortened(text)};
    return {text.substr(0, blank), shortened(text.substr(blank + 1))};
}

bool isOfProcessor(const Part& part)
{
    switch (part.first().node->getSensor()) {
    case Node::SENSOR_CPU:
    case Node::SENSOR_GROUP:
    case Node::SENSOR_CPU_CORE:
        return true;
    case Node::SENSOR_CACHE:
        return part.first().word != memorySideCache;
    default:
        return false;
    }
}

bool isMemory(const Part& part)
{
    return part.first().node->getSensor() == Node::SENSOR_MEMORY_ARRAY
        || part.first().word == memorySideCache;
}

// A machine, or something that is none of a processor's parts but holds them.
bool isContainer(const Part& part)
{
    return part.first().node->getSensor() == Node::SENSOR_COMPUTER
        || std::any_of(part.inner.begin(), part.inner.end(), [](const Part& inner) {
               return isOfProcessor(inner) || isMemory(inner) || isContainer(inner);
           });
}

std::string inWords(const Part& part)
{
    const std::string details = View::detailsOf(part);
    return View::headOf(part) + (details.empty() ? "" : ": " + details);
}

void addTitle(Box& box, const Part& part)
{
    const std::string troubles = View::troublesOf(part);
    for (const Shown* cache : part.caches)
        box.title += cache->path + '\n';
    box.title +=
        part.first().path + '\n' + inWords(part) + (troubles.empty() ? "" : " -- " + troubles) + '\n';
    box.isTroubled = box.isTroubled || !troubles.empty();
}

void addTroubles(Box& box, const Part& part)
{
    for (const std::string& trouble : part.first().troubles)
        box.lines.push_back({"alert", trouble});
}

void addTitlesBelow(Box& box, const Part& part)
{
    for (const Part& inner : part.inner) {
        addTitle(box, inner);
        addTitlesBelow(box, inner);
    }
}

// What is inside a device, as lines. Returns how many there was no room for.
std::size_t addLinesBelow(Box& box, const std::vector<Part>& folded, const std::string& indent)
{
    std::size_t left = 0;
    for (const Part& inner : folded) {
        const std::string troubles = View::troublesOf(inner);
        if (box.lines.size() < mostLines || !troubles.empty())
            box.lines.push_back({"", indent + inWords(inner)});
        else
            ++left;
        if (!troubles.empty())
            box.lines.push_back({"alert", indent + troubles});
        left += addLinesBelow(box, inner.inner, indent + "  ");
    }
    return left;
}

Box newBox(const Part& part)
{
    Box box;
    box.sensor = part.first().node->getSensor();
    addTitle(box, part);
    return box;
}

// A device, or anything else that holds no processor: one box for it and all that is inside.
Box deviceBox(const Part& part)
{
    Box box = newBox(part);
    const bool isSlot = box.sensor == Node::SENSOR_SLOT && part.inner.size() == 1;
    const Part& shown = isSlot ? part.inner.front() : part;
    if (isSlot) {
        box.sensor = shown.first().node->getSensor();
        box.lines.push_back({"", View::headOf(part)});
    }
    box.lines.push_back({"name", View::headOf(shown)});
    if (const std::string details = View::detailsOf(shown); !details.empty())
        box.lines.push_back({"", details});
    if (isSlot)
        addTroubles(box, shown);
    addTroubles(box, part);
    addTitlesBelow(box, part);
    if (const std::size_t left = addLinesBelow(box, View::fold(shown.inner), "  "); left != 0)
        box.lines.push_back({"", "and " + std::to_string(left) + " more"});
    return box;
}

// A memory-side cache is a bar above the memory behind it.
void addBars(Box& around, const Part& part)
{
    Box bar = newBox(part);
    bar.lines.push_back({"name", inWords(part)});
    addTroubles(bar, part);
    std::vector<Part> others;
    for (const Part& inner : part.inner)
        if (!isMemory(inner))
            others.push_back(inner);
    for (const Part& inner : others) {
        addTitle(bar, inner);
        addTitlesBelow(bar, inner);
    }
    if (const std::size_t left = addLinesBelow(bar, View::fold(others), "  "); left != 0)
        bar.lines.push_back({"", "and " + std::to_string(left) + " more"});
    around.bars.push_back(std::move(bar));
    for (const Part& inner : part.inner)
        if (isMemory(inner))
            addBars(around, inner);
}

Box coreBox(const Part& part)
{
    Box box = newBox(part);
    box.lines.push_back({"name", View::headOf(part)});
    for (const Shown* cache : part.caches)
        box.lines.push_back({"", joined({cache->word, joined(cache->kind)}, " ")});
    for (const std::string& piece : part.first().kind)
        box.lines.push_back({"", piece});
    addTroubles(box, part);
    return box;
}

Box boxOf(const Part& part)
{
    if (isOfProcessor(part) && part.inner.empty())
        return coreBox(part);
    if (!isOfProcessor(part) && !isContainer(part))
        return deviceBox(part);
    Box box = newBox(part);
    if (box.sensor == Node::SENSOR_CACHE) {
        box.lines.push_back({"name", inWords(part)});
    } else {
        box.lines.push_back({"name", View::headOf(part)});
        if (const std::string details = View::detailsOf(part); !details.empty())
            box.lines.push_back({"", details});
    }
    addTroubles(box, part);
    for (const Part& inner : part.inner)
        if (isMemory(inner))
            addBars(box, inner);
        else if (isOfProcessor(inner) || isContainer(inner))
            box.parts.push_back(boxOf(inner));
        else
            box.devices.push_back(boxOf(inner));
    std::stable_sort(box.devices.begin(), box.devices.end(),
                     [](const Box& a, const Box& b) { return rankOf(a.sensor) < rankOf(b.sensor); });
    return box;
}

// The number of columns for this many boxes: the last row as full as possible, the grid wider than high.
std::size_t columnsFor(std::size_t number, std::size_t most)
{
    const double wanted = std::sqrt(1.6 * static_cast<double>(number));
    const auto fewest = static_cast<std::size_t>(std::sqrt(static_cast<double>(number)));
    std::size_t best = 1;
    double least = 1e9;
    for (std::size_t columns = std::max<std::size_t>(1, std::min(fewest, most));
         columns <= std::min(2 * fewest + 1, most); ++columns) {
        const std::size_t empty = (columns - number % columns) % columns;
        const double cost = static_cast<double>(empty) + std::abs(static_cast<double>(columns) - wanted) / 2;
        if (cost < least) {
            least = cost;
            best = columns;
        }
    }
    return best;
}

// The width that the box needs, and its columns.
int widthNeeded(Box& box)
{
    std::size_t letters = 0;
    for (const Line& line : box.lines)
        letters = std::max(letters, std::min(lettersIn(line.text), longestLine));
    int width = widthOf(letters);
    for (Box& bar : box.bars)
        width = std::max(width, widthNeeded(bar) + 2 * gap);
    // Many devices stand in several columns.
    const int columns =
        std::clamp(static_cast<int>(box.devices.size()) / 6, 1, box.sensor == Node::SENSOR_COMPUTER ? 5 : 2);
    for (Box& device : box.devices)
        width = std::max(width, columns * (widthNeeded(device) + gap) + gap);
    int widest = 0;
    for (Box& part : box.parts)
        widest = std::max(widest, widthNeeded(part));
    if (!box.parts.empty()) {
        const int fitting = std::max(1, pageWidth / (widest + gap));
        box.columns = columnsFor(box.parts.size(), static_cast<std::size_t>(fitting));
        width = std::max(width, static_cast<int>(box.columns) * (widest + gap) + gap);
    }
    box.width = width;
    return width;
}

void place(Box& box, int width);

// Places the boxes in this many equal columns, from `top`. Returns where they end.
int placeColumns(std::vector<Box>& boxes, std::size_t columns, int width, int top)
{
    const auto number = static_cast<int>(columns);
    const int each = (width - gap) / number - gap;
    int height = 0;
    for (std::size_t i = 0; i < boxes.size(); ++i) {
        const auto column = static_cast<int>(i % columns);
        if (column == 0 && i != 0) {
            top += height + gap;
            height = 0;
        }
        boxes[i].x = gap + column * (each + gap);
        boxes[i].y = top;
        place(boxes[i], each);
        height = std::max(height, boxes[i].height);
    }
    return boxes.empty() ? top : top + height + gap;
}

// Gives the box this width, and places what is inside.
void place(Box& box, int width)
{
    box.width = width;
    std::vector<Line> lines;
    const auto letters = static_cast<std::size_t>((width - 2 * gap) / letterWidth);
    for (const Line& line : box.lines)
        for (const std::string& text : wrapped(line.text, letters))
            lines.push_back({line.style, text});
    box.lines = std::move(lines);
    int y = static_cast<int>(box.lines.size()) * lineHeight + gap;
    y = placeColumns(box.bars, 1, width, y);
    y = placeColumns(box.parts, box.columns, width, y);
    int widest = 1;
    for (const Box& device : box.devices)
        widest = std::max(widest, device.width);
    const auto fitting = static_cast<std::size_t>(std::max(1, (width - gap) / (widest + gap)));
    y = placeColumns(box.devices, std::min(fitting, std::max<std::size_t>(1, box.devices.size())), width, y);
    box.height = y;
}

void writeRectangle(std::ostream& out, int width, int height, const std::string& style)
{
    out << "<rect width=\"" << width << "\" height=\"" << height << "\" class=\"" << style << "\"/>\n";
}

void writeText(std::ostream& out, int x, int y, const Line& line)
{
    out << "<text x=\"" << x << "\" y=\"" << y << '"';
    if (*line.style != '\0')
        out << " class=\"" << line.style << '"';
    out << '>' << escapedForXml(line.text) << "</text>\n";
}

void openGroup(std::ostream& out, int x, int y, const char* style = "")
{
    out << "<g" << style << " transform=\"translate(" << x << ',' << y << ")\">\n";
}

std::string styleOf(Node::SensorType sensor)
{
    return "sensor" + std::to_string(static_cast<unsigned int>(colourOf(sensor).sensor));
}

void writeBox(std::ostream& out, const Box& box)
{
    openGroup(out, box.x, box.y);
    out << "<title>" << escapedForXml(box.title.substr(0, box.title.size() - 1)) << "</title>\n";
    writeRectangle(out, box.width, box.height, styleOf(box.sensor) + (box.isTroubled ? " alert" : ""));
    for (std::size_t i = 0; i < box.lines.size(); ++i)
        writeText(out, gap, static_cast<int>(i + 1) * lineHeight - 2, box.lines[i]);
    for (const std::vector<Box>* boxes : {&box.bars, &box.parts, &box.devices})
        for (const Box& inner : *boxes)
            writeBox(out, inner);
    out << "</g>\n";
}

struct Legend {
    std::map<std::size_t, Node::SensorType> sensors;
    bool hasAlerts = false;

    void add(const Box& box)
    {
        sensors.emplace(rankOf(box.sensor), box.sensor);
        hasAlerts = hasAlerts || box.isTroubled;
        for (const std::vector<Box>* boxes : {&box.bars, &box.parts, &box.devices})
            for (const Box& inner : *boxes)
                add(inner);
    }

    // In rows of this width. Returns the height.
    int write(std::ostream& out, int width) const
    {
        constexpr int swatch = 12;
        std::vector<std::pair<std::string, std::string>> entries;  // the text and the style
        if (hasAlerts)
            entries.emplace_back("alert", "sensor0 alert");
        for (const auto& [rank, sensor] : sensors)
            entries.emplace_back(IC::pst[sensor], styleOf(sensor));
        int x = gap;
        int y = gap;
        for (const auto& [text, style] : entries) {
            const int entry = swatch + widthOf(text.size()) + gap;
            if (x > gap && x + entry > width) {
                x = gap;
                y += lineHeight + gap;
            }
            openGroup(out, x, y, " class=\"legend\"");
            writeRectangle(out, swatch, swatch, style);
            writeText(out, swatch + gap, swatch - 2, {"", text});
            out << "</g>\n";
            x += entry;
        }
        return y + lineHeight + gap;
    }

    void writeColours(std::ostream& out, bool dark) const
    {
        std::set<std::string> written;
        for (const auto& [rank, sensor] : sensors)
            if (const Colour& colour = colourOf(sensor); written.insert(styleOf(sensor)).second)
                out << ".machine ." << styleOf(sensor)
                    << " { fill: " << (dark ? darkFillOf(colour) : colour.fill) << " }\n";
    }
};

}  // namespace

int writeSvg(std::ostream& out, const View& view)
{
    Box page;
    for (const Part& part : view.merged())
        page.parts.push_back(boxOf(part));
    Legend legend;
    for (const Box& box : page.parts)
        legend.add(box);
    constexpr int narrowest = 560;
    const int width = std::max(widthNeeded(page), narrowest);
    place(page, width);
    std::ostringstream legendText;
    const int top = legend.write(legendText, width);
    out << R"(<svg xmlns="http://www.w3.org/2000/svg" class="machine" font-family="monospace" font-size="11")"
        << " viewBox=\"0 0 " << width << ' ' << top + page.height << "\">\n<title>"
        << escapedForXml(view.title()) << "</title>\n<style>\n"
        << ".machine text { fill: #000; white-space: pre }\n"
           ".machine .name { font-weight: bold }\n"
           ".machine rect { stroke: #666; fill: #fff }\n"
           ".machine .paper { stroke: none }\n";
    legend.writeColours(out, false);
    out << ".machine rect.alert { stroke: #c00; stroke-width: 3 }\n"
           ".machine text.alert { fill: #a00; font-weight: bold }\n"
           "@media (prefers-color-scheme: dark) {\n"
           ".machine text { fill: #f2f2f2 }\n"
           ".machine rect { stroke: #888; fill: #16181c }\n";
    legend.writeColours(out, true);
    out << ".machine rect.alert { stroke: #f55 }\n.machine text.alert { fill: #f99 }\n}\n</style>\n";
    writeRectangle(out, width, top + page.height, "paper");
    out << legendText.str();
    openGroup(out, 0, top);
    for (const Box& box : page.parts)
        writeBox(out, box);
    out << "</g>\n</svg>\n";
    return width;
}

}  // namespace inventory
