// Finds the differences.
#include "comparing.h"

#include <algorithm>
#include <cmath>
#include <map>
#include <set>

#include "values.h"

namespace inventory {

namespace {

// The library's order of nodes, which compares only their paths.
struct ByPath {
    bool operator()(const IC::Node* a, const IC::Node* b) const { return *a < *b; }
};

// The nodes of one side, by path and by reference.
class Side {
public:
    explicit Side(const Nodes& nodes)
    {
        for (const auto& node : nodes) {
            nodes_.insert(node.get());
            IC::PropertyValue self("");
            if (node->getProperty(KEY_SELF, self).getStatus() == IC::Error::STATUS_SUCCESS)
                paths_[std::string(self)] = node->getPath();
        }
    }

    // The node with the same path and the same sensor type, or null. The library's operators compare only the path.
    const IC::Node* find(const IC::Node& node) const
    {
        const auto found = nodes_.find(&node);
        return found == nodes_.end() || (*found)->getSensor() != node.getSensor() ? nullptr : *found;
    }

    // The path of the node that a reference leads to; the reference's own text if there is no such node.
    std::string target(const IC::Number& reference) const
    {
        const auto found = paths_.find(std::string(reference));
        return found == paths_.end() ? std::string(reference) : found->second;
    }

    std::string textOf(const IC::PropertyValue& value) const
    {
        const bool isReference = value.getKind() == IC::PropertyValue::KIND_NUMBER
            && IC::Number(value).getKind() == IC::Number::KIND_NODEREF;
        return isReference ? target(IC::Number(value)) : exactText(value);
    }

private:
    std::set<const IC::Node*, ByPath> nodes_;
    std::map<std::string, std::string> paths_;
};

class Comparison {
public:
    Comparison(const Nodes& before, const Nodes& after) : before_(before), after_(after)
    {
        for (const auto& node : before)
            if (const IC::Node* now = after_.find(*node))
                compare(*node, *now);
            else
                add({Change::NODE, node.get(), 0, node->getDescription(), {}});
        for (const auto& node : after)
            if (before_.find(*node) == nullptr)
                add({Change::NODE, node.get(), 0, {}, node->getDescription()});
    }

    std::vector<Change> take() { return std::move(changes_); }

private:
    void add(Change change) { changes_.push_back(std::move(change)); }

    // Descriptions are not compared, because they are made from the properties.
    void compare(const IC::Node& then, const IC::Node& now)
    {
        const unsigned int statusThen = then.getStatus();
        const unsigned int statusNow = now.getStatus();
        if (statusThen != statusNow)
            add({Change::STATUS, &now, 0, std::to_string(statusThen), std::to_string(statusNow)});
        const auto old = then.getProperties();
        const auto current = now.getProperties();
        for (const auto& [key, value] : old) {
            const auto found = current.find(key);
            if (key == KEY_READ_AT)
                continue;
            if (found == current.end())
                add({Change::PROPERTY, &now, key, before_.textOf(value), {}});
            else if (!same(value, found->second))
                add(changed(now, key, value, found->second));
        }
        for (const auto& [key, value] : current)
            if (key != KEY_READ_AT && old.count(key) == 0)
                add({Change::PROPERTY, &now, key, {}, after_.textOf(value)});
    }

    // Numbers that the library's operators call unequal differ, except that a real NaN equals no number, not even
    // itself. Some numbers that the operators call equal differ too:
    // - All signed numbers compare equal: compare their texts.
    // - All node references compare equal, and each reading numbers the nodes anew, so CPU:1 may be another CPU
    //   today. Two references are the same if they lead to the same node.
    bool same(const IC::Number& a, const IC::Number& b) const
    {
        const auto isNan = [](const IC::Number& number) {
            return number.getKind() == IC::Number::KIND_REAL && std::isnan(number.operator double());
        };
        if (a != b)
            return isNan(a) && isNan(b);
        if (a.getKind() == IC::Number::KIND_NODEREF)
            return before_.target(a) == after_.target(b);
        return exactText(a) == exactText(b);
    }

    // Texts, bytes and codes compare equal only if they are the same.
    bool same(const IC::PropertyValue& a, const IC::PropertyValue& b) const
    {
        const auto kind = a.getKind();
        if (kind != b.getKind())
            return false;
        if (kind == IC::PropertyValue::KIND_NUMBER)
            return same(IC::Number(a), IC::Number(b));
        if (kind != IC::PropertyValue::KIND_NUMBERARRAY)
            return a == b;
        const IC::NumberArray left = a;
        const IC::NumberArray right = b;
        return std::equal(left.begin(), left.end(), right.begin(), right.end(),
                          [this](const auto& one, const auto& other) { return same(one, other); });
    }

    Change changed(const IC::Node& node, unsigned int key, const IC::PropertyValue& then,
                   const IC::PropertyValue& now) const
    {
        std::string from = before_.textOf(then);
        std::string to = after_.textOf(now);
        if (from == to) {  // then only the kinds differ
            from += std::string(" (") + kindName(then) + ')';
            to += std::string(" (") + kindName(now) + ')';
        }
        return {Change::PROPERTY, &node, key, from, to};
    }

    Side before_;
    Side after_;
    std::vector<Change> changes_;
};

}  // namespace

std::vector<Change> changesBetween(const Nodes& before, const Nodes& after)
{
    return Comparison(before, after).take();
}

}  // namespace inventory
