// Writes the first screen, the tree of nodes, properties, alerts, changes and a summary as text (writing.cpp), and all
// nodes as JSON (json.cpp), as a drawing (svg.cpp) and as a page (html.cpp).
#pragma once

#include <iosfwd>
#include <string>
#include <vector>

#include "IC/Alert.h"
#include "comparing.h"
#include "nodes.h"
#include "view.h"

namespace inventory {

// The defaults are for a pipe or a file in the locale "C".
struct Look {
    enum Lines : unsigned char { LINES_NONE, LINES_ASCII, LINES_DRAWN };
    bool isColoured = false;
    Lines lines = LINES_NONE;  // between the nodes of the tree
    bool isUtf8 = false;       // otherwise \u00d7 is written as x, and \u00b0C as C
    std::size_t width = 0;     // of the longest line; 0: lines are not cut
};
Look lookOfFile();            // with the signs of the locale
Look lookOfStandardOutput();  // with the colours, signs and lines that a terminal or the locale can show

// What the machine is and what is wrong with it: 25 lines at most.
void writeFirstScreen(std::ostream& out, const View& view, const Look& look = {});

// The parts, each on a line, indented below the part around it. Equal parts share a line.
struct TreeForm {
    bool own = false;             // each node in its own text form
    bool withProperties = false;  // each node, and below it its properties, each on a line
    bool all = false;             // each node
    Look look = {};
};
void writeTree(std::ostream& out, const View& view, const TreeForm& form);
void writeProperty(std::ostream& out, unsigned int key, const IC::PropertyValue& value);

void writeAlerts(std::ostream& out, const std::vector<IC::Alert>& alerts, const Look& look = {});

// A line with - for what is gone and a line with + for what is new; a change is both.
void writeChanges(std::ostream& out, const std::vector<Change>& changes, const Look& look = {});

// How many nodes there are of each sensor type.
void writeSummary(std::ostream& out, const Nodes& nodes);

void writeJson(std::ostream& out, const Nodes& nodes, const std::vector<IC::Alert>& alerts);
void writeJsonLine(std::ostream& out, const IC::Alert& alert);  // an object without line breaks
// In the format that Prometheus reads. The version is that of this program.
void writeMetrics(std::ostream& out, const Nodes& nodes, const std::vector<IC::Alert>& alerts,
                  const char* version);

// The line for monitoring systems, and the exit status that they expect.
enum CheckStatus : unsigned char { CHECK_OK, CHECK_WARNING, CHECK_CRITICAL, CHECK_UNKNOWN };
CheckStatus writeCheck(std::ostream& out, const Nodes& nodes, const std::vector<IC::Alert>& alerts);
void writeUnknown(std::ostream& out, const std::string& why);

int writeSvg(std::ostream& out, const View& view);  // returns the drawing's width in its own units
void writeHtml(std::ostream& out, const View& view);

}  // namespace inventory
