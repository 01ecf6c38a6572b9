// What is printed: the tree of nodes, their properties, alerts, a summary.
#pragma once

#include <iosfwd>
#include <memory>
#include <vector>

#include "IC/Alert.h"
#include "IC/Node.h"

namespace inventory {

using Nodes = std::vector<std::unique_ptr<IC::Node>>;

// Each node on a line, indented below its parent: in plain words, or in its own text form.
struct TreeForm {
    bool own = false;
    bool withProperties = false;  // below the node, each on a line
};
void writeTree(std::ostream& out, const Nodes& nodes, const TreeForm& form);
void writeProperty(std::ostream& out, unsigned int key, const IC::PropertyValue& value);

// One for each node with a status above 0; what lies inside a node that may not be used is not told again.
std::vector<IC::Alert> alertsOf(const Nodes& nodes);
void writeAlerts(std::ostream& out, const std::vector<IC::Alert>& alerts);

// How many nodes there are of each sensor type.
void writeSummary(std::ostream& out, const Nodes& nodes);

}  // namespace inventory
