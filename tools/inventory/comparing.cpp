// Finds the differences.
#include "comparing.h"

#include <algorithm>
#include <cmath>
#include <map>
#include <set>
#include <string_view>
#include <tuple>

#include "alerts.h"
#include "values.h"
#include "view.h"

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
                targets_[std::string(self)] = node.get();
        }
    }

    // The node with the same path and the same sensor type, or null. The library's operators compare only the path.
    const IC::Node* find(const IC::Node& node) const
    {
        const auto found = nodes_.find(&node);
        return found == nodes_.end() || (*found)->getSensor() != node.getSensor() ? nullptr : *found;
    }

    // The node that a reference leads to, or null.
    const IC::Node* target(const IC::Number& reference) const
    {
        const auto found = targets_.find(std::string(reference));
        return found == targets_.end() ? nullptr : found->second;
    }

    // A set of threads as ranges; a reference as the path of the node that it leads to, if there is such a node.
    std::string textOf(unsigned int key, const IC::PropertyValue& value) const
    {
        if (std::string ranges = key == KEY_CPU_SET ? rangesOf(value) : ""; !ranges.empty())
            return ranges;
        const bool isReference = value.getKind() == IC::PropertyValue::KIND_NUMBER
            && IC::Number(value).getKind() == IC::Number::KIND_NODEREF;
        const IC::Node* node = isReference ? target(IC::Number(value)) : nullptr;
        return node == nullptr ? exactText(value) : node->getPath();
    }

private:
    std::set<const IC::Node*, ByPath> nodes_;
    std::map<std::string, const IC::Node*> targets_;
};

// What a part with threads is, but for its path and its threads.
struct Sort {
    IC::Node::SensorType sensor;
    std::string level;
    std::string kind;
    std::string number;
    bool operator<(const Sort& other) const
    {
        return std::tie(sensor, level, kind, number)
            < std::tie(other.sensor, other.level, other.kind, other.number);
    }
};

Sort sortOf(const IC::Node& node)
{
    IC::PropertyValue level("");
    IC::PropertyValue kind("");
    IC::PropertyValue number("");
    static_cast<void>(node.getProperty(KEY_LEVEL, level));
    static_cast<void>(node.getProperty(KEY_CACHE_KIND, kind));
    // A group or a cache may have another number, too.
    if (node.getSensor() == IC::Node::SENSOR_CPU || node.getSensor() == IC::Node::SENSOR_CPU_CORE)
        static_cast<void>(node.getProperty(KEY_INDEX, number));
    return {node.getSensor(), std::string(level), std::string(kind), std::string(number)};
}

IC::NumberArray threadsOf(const IC::Node& node)
{
    IC::PropertyValue threads(IC::NumberArray {});
    static_cast<void>(node.getProperty(KEY_CPU_SET, threads));
    return threads.getKind() == IC::PropertyValue::KIND_NUMBERARRAY ? threads.operator IC::NumberArray()
                                                                    : IC::NumberArray {};
}

// Whether the fact only tells how the machine was read.
bool isAboutReading(const std::string& fact)
{
    static constexpr std::string_view names[] = {"Backend=", "LinuxCgroup=", "ProcessName=", "hwlocVersion="};
    return std::any_of(std::begin(names), std::end(names),
                       [&fact](std::string_view name) { return fact.compare(0, name.size(), name) == 0; });
}

// The properties without what only tells how the machine was read.
std::map<unsigned int, IC::PropertyValue> compared(const IC::Node& node)
{
    auto properties = node.getProperties();
    properties.erase(KEY_READ_AT);
    properties.erase(KEY_SOURCE_VERSION);
    const auto others = properties.find(KEY_OTHER_FACTS);
    if (others == properties.end() || others->second.getKind() != IC::PropertyValue::KIND_STRINGARRAY)
        return properties;
    IC::StringArray facts = others->second;
    facts.erase(std::remove_if(facts.begin(), facts.end(), isAboutReading), facts.end());
    if (facts.empty())
        properties.erase(others);
    else
        others->second = IC::PropertyValue(facts, others->second.readOnly());
    return properties;
}

bool isReading(unsigned int key)
{
    return key == KEY_READING || key == KEY_AVERAGE || key == KEY_LOWEST || key == KEY_HIGHEST
        || key == KEY_AVERAGE_LOWEST || key == KEY_AVERAGE_HIGHEST;
}

class Comparison {
public:
    Comparison(const Nodes& before, const Nodes& after) : before_(before), after_(after)
    {
        findRenamed(before, after);
        for (const auto& node : before)
            if (const IC::Node* now = laterOf(*node); now != nullptr)
                compare(*node, *now);
            else
                add({Change::NODE, node.get(), node.get(), 0, node->getDescription(), {}});
        for (const auto& node : after)
            if (earlierOf(*node) == nullptr)
                add({Change::NODE, node.get(), nullptr, 0, {}, node->getDescription()});
    }

    std::vector<Change> take() { return std::move(changes_); }

private:
    void add(Change change) { changes_.push_back(std::move(change)); }

    // Caches, groups and some packages are named by their lowest core or thread. One that has lost it or got a lower
    // one is the same if its threads are some of the former ones, or all of them and more. So is a core with the same
    // number: its path changes where another core with this number came or went.
    void findRenamed(const Nodes& before, const Nodes& after)
    {
        const auto mayBeRenamed = [](const IC::Node& node) {
            switch (node.getSensor()) {
            case IC::Node::SENSOR_CACHE:
            case IC::Node::SENSOR_GROUP:
            case IC::Node::SENSOR_CPU:
            case IC::Node::SENSOR_CPU_CORE:
                return true;
            default:
                return false;
            }
        };
        std::map<std::pair<Sort, std::string>, std::vector<const IC::Node*>> byThread;
        for (const auto& node : after)
            if (mayBeRenamed(*node) && before_.find(*node) == nullptr)
                for (const IC::Number& thread : threadsOf(*node))
                    byThread[{sortOf(*node), std::string(thread)}].push_back(node.get());
        if (byThread.empty())
            return;
        for (const auto& node : before) {
            if (!mayBeRenamed(*node) || after_.find(*node) != nullptr)
                continue;
            const Sort sort = sortOf(*node);
            const IC::NumberArray threads = threadsOf(*node);
            std::map<const IC::Node*, std::size_t> shared;  // numbers of threads that both have
            for (const IC::Number& thread : threads)
                if (const auto found = byThread.find({sort, std::string(thread)}); found != byThread.end())
                    for (const IC::Node* now : found->second)
                        ++shared[now];
            const IC::Node* best = nullptr;
            for (const auto& [now, count] : shared)
                if (earlier_.count(now) == 0 && count == std::min(threads.size(), threadsOf(*now).size())
                    && (best == nullptr
                        || std::make_pair(count, now->getPath())
                            > std::make_pair(shared[best], best->getPath())))
                    best = now;
            if (best != nullptr) {
                later_[node.get()] = best;
                earlier_[best] = node.get();
            }
        }
    }

    const IC::Node* laterOf(const IC::Node& then) const
    {
        const auto renamed = later_.find(&then);
        return renamed == later_.end() ? after_.find(then) : renamed->second;
    }

    const IC::Node* earlierOf(const IC::Node& now) const
    {
        const auto renamed = earlier_.find(&now);
        return renamed == earlier_.end() ? before_.find(now) : renamed->second;
    }

    // Whether another parent only follows from a node that came or went.
    bool followsFromParent(const IC::PropertyValue& then, const IC::PropertyValue& now) const
    {
        if (then.getKind() != IC::PropertyValue::KIND_NUMBER
            || now.getKind() != IC::PropertyValue::KIND_NUMBER)
            return false;
        const IC::Node* former = before_.target(IC::Number(then));
        const IC::Node* present = after_.target(IC::Number(now));
        return (former != nullptr && laterOf(*former) == nullptr)
            || (present != nullptr && earlierOf(*present) == nullptr);
    }

    // Descriptions are not compared, because they are made from the properties.
    void compare(const IC::Node& then, const IC::Node& now)
    {
        const unsigned int statusThen = then.getStatus();
        const unsigned int statusNow = now.getStatus();
        if (statusThen != statusNow)
            add({Change::STATUS, &now, &then, 0, std::to_string(statusThen), std::to_string(statusNow)});
        const auto old = compared(then);
        const auto current = compared(now);
        for (const auto& [key, value] : old) {
            const auto found = current.find(key);
            if (found == current.end())
                add({Change::PROPERTY, &now, &then, key, before_.textOf(key, value), {}});
            else if (!same(value, found->second)
                     && !(key == KEY_PARENT && followsFromParent(value, found->second)))
                add(changed(then, now, key, value, found->second));
        }
        for (const auto& [key, value] : current)
            if (old.count(key) == 0)
                add({Change::PROPERTY, &now, &then, key, {}, after_.textOf(key, value)});
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
            return isSameTarget(a, b);
        return exactText(a) == exactText(b);
    }

    bool isSameTarget(const IC::Number& a, const IC::Number& b) const
    {
        const IC::Node* former = before_.target(a);
        const IC::Node* present = after_.target(b);
        if (former == nullptr || present == nullptr)
            return former == present && std::string(a) == std::string(b);
        return laterOf(*former) == present;
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

    Change changed(const IC::Node& nodeThen, const IC::Node& nodeNow, unsigned int key,
                   const IC::PropertyValue& then, const IC::PropertyValue& now) const
    {
        std::string from = before_.textOf(key, then);
        std::string to = after_.textOf(key, now);
        if (from == to) {  // then only the kinds differ
            from += std::string(" (") + kindName(then) + ')';
            to += std::string(" (") + kindName(now) + ')';
        }
        return {Change::PROPERTY, &nodeNow, &nodeThen, key, from, to};
    }

    Side before_;
    Side after_;
    std::map<const IC::Node*, const IC::Node*> later_;  // of parts with another path
    std::map<const IC::Node*, const IC::Node*> earlier_;
    std::vector<Change> changes_;
};

}  // namespace

std::vector<Change> changesBetween(const Nodes& before, const Nodes& after)
{
    return Comparison(before, after).take();
}

std::vector<Change> withoutMereReadings(std::vector<Change> changes)
{
    const auto isMere = [](const Change& change) {
        return change.subject == Change::PROPERTY && isReading(change.key)
            && troublesOf(*change.before) == troublesOf(*change.node);
    };
    changes.erase(std::remove_if(changes.begin(), changes.end(), isMere), changes.end());
    return changes;
}

std::vector<Change> withoutOtherSources(std::vector<Change> changes)
{
    const auto isOther = [](const Change& change) {
        return change.node->getProperties().count(KEY_CHIP) != 0
            || change.node->getSensor() == IC::Node::SENSOR_DIMM
            || (change.subject == Change::PROPERTY
                && (change.key == KEY_SYSTEM_MEMORY || change.key == KEY_MEMORY_SLOTS
                    || change.key == KEY_ERROR_CORRECTION));
    };
    changes.erase(std::remove_if(changes.begin(), changes.end(), isOther), changes.end());
    return changes;
}

}  // namespace inventory
