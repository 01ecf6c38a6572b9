// Draws the machine as nested boxes: a box for each node, with the boxes of its parts inside.
#include <algorithm>
#include <cmath>
#include <ostream>
#include <set>
#include <sstream>

#include "alerts.h"
#include "colours.h"
#include "values.h"
#include "writing.h"

namespace inventory {

namespace {

// In pixels. All letters have the same width, so the width of a text is known.
constexpr int letterWidth = 7;
constexpr int lineHeight = 15;
constexpr int gap = 5;
constexpr std::size_t longestLine = 32;  // in letters; more if the box is wider

struct Box {
    const IC::Node* node = nullptr;
    std::vector<std::string> lines;
    std::vector<Box> inner;
    int x = 0;  // in the box around it
    int y = 0;
    int width = 0;
    int height = 0;
};

// The texts are printable ASCII, so only XML's own characters need escaping.
std::string escaped(const std::string& text)
{
    std::string out;
    for (const char character : text)
        switch (character) {
        case '&':
            out += "&amp;";
            break;
        case '<':
            out += "&lt;";
            break;
        case '>':
            out += "&gt;";
            break;
        default:
            out += character;
        }
    return out;
}

std::string shortened(const std::string& text, std::size_t letters)
{
    return text.size() <= letters ? text : text.substr(0, letters - 3) + "...";
}

int widthOf(const std::string& text)
{
    return static_cast<int>(text.size()) * letterWidth;
}

// Places the inner boxes below the text, in rows from left to right. Rows are not quite full, so the result is
// narrower than widthToHeight says.
void arrange(Box& box)
{
    constexpr double widthToHeight = 2.5;
    double area = 0;
    int widest = 0;
    for (const Box& inner : box.inner) {
        area += static_cast<double>(inner.width + gap) * (inner.height + gap);
        widest = std::max(widest, inner.width);
    }
    const int limit = std::max(widest, static_cast<int>(std::sqrt(area * widthToHeight))) + gap;
    int x = gap;
    int y = box.height;
    int row = 0;
    for (Box& inner : box.inner) {
        if (x > gap && x + inner.width > limit) {
            x = gap;
            y += row + gap;
            row = 0;
        }
        inner.x = x;
        inner.y = y;
        x += inner.width + gap;
        row = std::max(row, inner.height);
        box.width = std::max(box.width, x);
    }
    box.height = box.inner.empty() ? box.height : y + row + gap;
}

Box boxOf(const Children& children, const IC::Node& node)
{
    Box box;
    box.node = &node;
    // The colour shows the sensor type.
    const std::string words = inWords(node).substr(IC::pst[node.getSensor()].size() + 1);
    const std::size_t colon = words.find(": ");
    box.lines.push_back(words.substr(0, colon));
    if (colon != std::string::npos)
        box.lines.push_back(words.substr(colon + 2));
    box.height = static_cast<int>(box.lines.size()) * lineHeight + gap;
    if (const auto found = children.find(node.getPath()); found != children.end())
        for (const IC::Node* child : found->second)
            box.inner.push_back(boxOf(children, *child));
    arrange(box);
    const auto letters =
        std::max(longestLine, static_cast<std::size_t>(std::max(box.width / letterWidth - 2, 0)));
    for (std::string& line : box.lines) {
        line = shortened(line, letters);
        box.width = std::max(box.width, widthOf(line) + 2 * gap);
    }
    return box;
}

void drawText(std::ostream& out, int x, int y, const std::string& text, const char* style = "")
{
    out << "<text x=\"" << x << "\" y=\"" << y << '"' << style << '>' << escaped(text) << "</text>\n";
}

void drawRectangle(std::ostream& out, int width, int height, const char* fill, const char* style = "")
{
    out << "<rect width=\"" << width << "\" height=\"" << height << "\" fill=\"" << fill << '"' << style
        << "/>\n";
}

void openGroup(std::ostream& out, int x, int y, const char* style = "")
{
    out << "<g" << style << " transform=\"translate(" << x << ',' << y << ")\">\n";
}

void draw(std::ostream& out, const Box& box)
{
    const Trouble* trouble = troubleOf(*box.node);
    openGroup(out, box.x, box.y);
    out << "<title>"
        << escaped(inWords(*box.node) + (trouble == nullptr ? "" : std::string(" -- ") + trouble->words))
        << "</title>\n";
    drawRectangle(out, box.width, box.height, colourOf(box.node->getSensor()).fill,
                  trouble == nullptr ? "" : " class=\"trouble\"");
    for (std::size_t i = 0; i < box.lines.size(); ++i)
        drawText(out, gap, static_cast<int>(i + 1) * lineHeight - gap / 2, box.lines[i],
                 i == 0 ? " class=\"name\"" : "");
    for (const Box& inner : box.inner)
        draw(out, inner);
    out << "</g>\n";
}

// Draws one entry for each sensor type, in rows of the given width. Returns the height.
int drawLegend(std::ostream& out, const Nodes& nodes, int width)
{
    std::set<IC::Node::SensorType> sensors;
    for (const auto& node : nodes)
        sensors.insert(node->getSensor());
    constexpr int entry = 26 * letterWidth;  // the longest name has 25 letters
    constexpr int swatch = 12;
    int x = gap;
    int y = gap;
    for (const auto sensor : sensors) {
        if (x > gap && x + entry > width) {
            x = gap;
            y += lineHeight + gap;
        }
        openGroup(out, x, y, " class=\"legend\"");
        drawRectangle(out, swatch, swatch, colourOf(sensor).fill);
        drawText(out, swatch + gap, swatch - 1, IC::pst[sensor]);
        out << "</g>\n";
        x += entry;
    }
    return y + lineHeight + gap;
}

}  // namespace

void writeSvg(std::ostream& out, const Nodes& nodes)
{
    const Children children = childrenOf(nodes);
    Box page;
    for (const auto& node : nodes)
        if (node->getParent().empty())
            page.inner.push_back(boxOf(children, *node));
    arrange(page);
    constexpr int narrowest = 560;
    const int width = std::max(page.width, narrowest);
    std::ostringstream legend;
    const int top = drawLegend(legend, nodes, width);
    const int height = top + page.height;
    out << "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<svg xmlns=\"http://www.w3.org/2000/svg\" width=\""
        << width << "\" height=\"" << height << "\" viewBox=\"0 0 " << width << ' ' << height
        << "\">\n<title>Inventory</title>\n"
           "<style>text { font: 11px monospace; fill: #000 } .name { font-weight: bold }\n"
           "rect { stroke: #555 } .page { stroke: none } .trouble { stroke: #c00; stroke-width: 3 "
           "}</style>\n";
    drawRectangle(out, width, height, "#fff", " class=\"page\"");
    out << legend.str();
    openGroup(out, 0, top);
    for (const Box& box : page.inner)
        draw(out, box);
    out << "</g>\n</svg>\n";
}

}  // namespace inventory
