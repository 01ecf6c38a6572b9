// What a person reads about the nodes: the first screen, the texts of nodes and the tree in which a core holds its own
// caches. The text, the drawing and the page are made from it. Its texts are printable ASCII, but for the signs ° and ×.
#pragma once

#include <deque>
#include <map>

#include "nodes.h"

namespace inventory {

// Without the empty pieces.
std::string joined(const std::vector<std::string>& pieces, const char* separator = ", ");

// "0-95,192-287". Empty for a value that is no set of numbers.
std::string rangesOf(const IC::PropertyValue& value);

// The value with a unit that a person uses: "20 MiB", "45 °C", "0-95,192-287".
std::string valueInWords(unsigned int key, const std::map<unsigned int, IC::PropertyValue>& properties);

constexpr const char* memorySideCache = "memory-side cache";

// One node in words.
struct Shown {
    const IC::Node* node = nullptr;
    const Shown* parent = nullptr;  // null if it does not come before the node
    std::map<unsigned int, IC::PropertyValue> properties;
    std::string word;  // "core", "L2", "network port"
    std::string path;
    std::string name;                   // the end of the path
    std::vector<std::string> kind;      // what equal parts share: product, size, counts, reading
    std::string link;                   // speed of its link, which equal parts share as well
    std::string own;                    // what they do not share: an address
    std::vector<std::string> troubles;  // what its alerts say
};

// A part of the machine: a node, or several that look equal, and what is inside.
struct Part {
    std::vector<const Shown*> shown;   // one node; after folding, each node that looks like it
    std::vector<const Shown*> caches;  // that only this core uses, the largest first
    std::vector<Part> inner;
    std::size_t times = 1;  // how many of them are in the part around it
    std::size_t kind = 0;   // equal parts have equal numbers

    const Shown& first() const { return *shown.front(); }
};

struct Entry {
    std::string label;
    std::vector<std::string> lines;
};

// Everything that a person sees.
class View {
public:
    View(const Nodes& nodes);  // implicit: what writes a view also takes nodes, which must outlive it

    // Each node as a part of its own.
    std::vector<Part> all() const;
    // A cache that one core uses is in the core's part.
    std::vector<Part> merged() const;
    // Parts of one parent that look equal are one part.
    std::vector<Part> folded() const;
    static std::vector<Part> fold(std::vector<Part> parts);

    // "8 × core: L2 1 MiB, 2 threads" is the head "8 × core" and the details.
    static std::string headOf(const Part& part);
    static std::string detailsOf(const Part& part);
    static std::string troublesOf(const Part& part);

    // Of the first screen: "host: maker model", then labels with a few lines each. No label is empty.
    std::string title() const;
    std::vector<Entry> entries() const;

    // "major: /machine/fan-1: Fan: it raises an alarm", the most severe first.
    struct AlertLine {
        unsigned int severity;
        std::string path;
        std::string message;
    };
    const std::vector<AlertLine>& alerts() const { return alerts_; }
    const std::deque<Shown>& shown() const { return shown_; }

private:
    enum Merging : bool { MERGE_NONE, MERGE_CACHES };
    std::vector<Part> partsIn(const Shown* around, Merging merging) const;
    const Shown* machine() const;
    std::vector<const Shown*> each(IC::Node::SensorType sensor) const;

    std::deque<Shown> shown_;
    std::map<const Shown*, std::vector<const Shown*>> inside_;  // null: in no other
    std::vector<AlertLine> alerts_;
};

const char* severityName(unsigned int severity);  // "information", "warning", "major", "critical"

}  // namespace inventory
