// Writes the tree of nodes, properties, alerts, changes and a summary as text (writing.cpp), and all nodes as JSON
// (json.cpp) and as a drawing (svg.cpp).
#pragma once

#include <iosfwd>
#include <map>
#include <string>
#include <vector>

#include "IC/Alert.h"
#include "comparing.h"
#include "nodes.h"

namespace inventory {

// The defaults are for a pipe or a file.
struct Look {
    enum Lines : unsigned char { LINES_NONE, LINES_ASCII, LINES_DRAWN };
    bool isColoured = false;
    Lines lines = LINES_NONE;  // between the nodes of the tree
};
Look lookOfStandardOutput();  // with the colours and lines that a terminal can show

// Each node on a line, indented below its parent: in plain words, or in its own text form.
struct TreeForm {
    bool own = false;
    bool withProperties = false;  // below the node, each on a line
    Look look = {};
};
void writeTree(std::ostream& out, const Nodes& nodes, const TreeForm& form);
void writeProperty(std::ostream& out, unsigned int key, const IC::PropertyValue& value);

void writeAlerts(std::ostream& out, const std::vector<IC::Alert>& alerts, const Look& look = {});

// A line with - for what is gone and a line with + for what is new; a change is both.
void writeChanges(std::ostream& out, const std::vector<Change>& changes, const Look& look = {});

// How many nodes there are of each sensor type.
void writeSummary(std::ostream& out, const Nodes& nodes);

void writeJson(std::ostream& out, const Nodes& nodes, const std::vector<IC::Alert>& alerts);
void writeSvg(std::ostream& out, const Nodes& nodes);

// Used for the text and for the drawing.
using Children = std::map<std::string, std::vector<const IC::Node*>>;  // the key is the parent's path
Children childrenOf(const Nodes& nodes);
std::string inWords(const IC::Node& node);  // sensor type, name and description, printable

}  // namespace inventory
