// What is written: the tree of nodes, their properties, alerts, changes and a summary as text (writing.cpp), all
// nodes as JSON (json.cpp) and as a drawing (svg.cpp).
#pragma once

#include <iosfwd>
#include <map>
#include <string>
#include <vector>

#include "IC/Alert.h"
#include "comparing.h"
#include "nodes.h"

namespace inventory {

// For a pipe or a file, unless said otherwise.
struct Look {
    enum Lines : unsigned char { LINES_NONE, LINES_ASCII, LINES_DRAWN };
    bool isColoured = false;
    Lines lines = LINES_NONE;  // between the nodes of the tree
};
Look lookOfStandardOutput();  // with colours and lines on a terminal, as far as it has them

// Each node on a line, indented below its parent: in plain words, or in its own text form.
struct TreeForm {
    bool own = false;
    bool withProperties = false;  // below the node, each on a line
    Look look = {};
};
void writeTree(std::ostream& out, const Nodes& nodes, const TreeForm& form);
void writeProperty(std::ostream& out, unsigned int key, const IC::PropertyValue& value);

void writeAlerts(std::ostream& out, const std::vector<IC::Alert>& alerts, const Look& look = {});

// A line for what went (-) and one for what came (+); what changed is both.
void writeChanges(std::ostream& out, const std::vector<Change>& changes, const Look& look = {});

// How many nodes there are of each sensor type.
void writeSummary(std::ostream& out, const Nodes& nodes);

void writeJson(std::ostream& out, const Nodes& nodes);  // throws BadInput where it was not built in
void writeSvg(std::ostream& out, const Nodes& nodes);

// Shared by text and drawing.
using Children = std::map<std::string, std::vector<const IC::Node*>>;  // by their parent's path
Children childrenOf(const Nodes& nodes);
std::string inWords(const IC::Node& node);  // sensor type, name and description, printable

}  // namespace inventory
