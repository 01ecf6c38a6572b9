// The words, the numbers and the tree that a person sees.
#include "view.h"

#include <strings.h>

#include <algorithm>
#include <cctype>
#include <cmath>
#include <cstdio>
#include <optional>

#include "alerts.h"
#include "values.h"

namespace inventory {

namespace {

using IC::Node;
using Properties = std::map<unsigned int, IC::PropertyValue>;
using Pieces = std::vector<std::string>;

std::string counted(std::size_t number, const std::string& word)
{
    return std::to_string(number) + ' ' + word + (number == 1 || word.empty() ? "" : "s");
}

std::string times(std::size_t number, const std::string& what)
{
    return std::to_string(number) + " \u00d7 " + what;
}

// The property as one printable line, "" if there is none.
std::string textOf(const Properties& properties, unsigned int key)
{
    const auto found = properties.find(key);
    return found == properties.end() ? "" : printable(told(exactText(found->second)));
}

std::optional<double> numberOf(const Properties& properties, unsigned int key)
{
    const auto found = properties.find(key);
    const bool isNumber =
        found != properties.end() && found->second.getKind() == IC::PropertyValue::KIND_NUMBER;
    return isNumber ? realNumber(exactText(found->second)) : std::nullopt;
}

// "8 cores"; "" for 0, which means that the number is not known.
std::string amountOf(double number, const char* word)
{
    return number >= 1 && number < 1e15 ? counted(static_cast<std::size_t>(number), word) : "";
}

std::string countOf(const Properties& properties, unsigned int key, const char* word)
{
    return amountOf(numberOf(properties, key).value_or(0), word);
}

std::string sizeOf(const Properties& properties, unsigned int key = KEY_SIZE)
{
    const double bytes = numberOf(properties, key).value_or(0);
    return bytes >= 1 && bytes < 0x1p64 ? sizeInWords(static_cast<ZQ::Uint64>(bytes)) : "";
}

std::string rounded(double number)
{
    char text[32];
    std::snprintf(text, sizeof text, "%.4g", number);
    return text;
}

std::string unitInWords(const std::string& unit)
{
    static const struct {
        const char* name;
        const char* sign;
    } signs[] = {{"rpm", "RPM"},  {"celsius", "\u00b0C"}, {"volts", "V"},   {"watts", "W"},
                 {"joules", "J"}, {"amperes", "A"},       {"percent", "%"}, {"hertz", "Hz"}};
    for (const auto& row : signs)
        if (unit == row.name)
            return row.sign;
    return printable(unit);
}

std::string withUnit(const Properties& properties, unsigned int key)
{
    const auto number = numberOf(properties, key);
    const auto unit = properties.find(KEY_UNIT);
    return !number || unit == properties.end()
        ? ""
        : told(rounded(*number) + ' ' + unitInWords(std::string(unit->second)));
}

// hwloc counts gigabytes a second.
std::string linkSpeed(const Properties& properties)
{
    const double gigabytes = numberOf(properties, KEY_LINK_SPEED).value_or(0);
    return gigabytes > 0 ? rounded(gigabytes * 8) + " Gbit/s" : "";
}

std::string frequency(const Properties& properties)
{
    const double megahertz = numberOf(properties, KEY_FREQUENCY).value_or(0);
    return megahertz > 0 ? rounded(megahertz / 1000) + " GHz" : "";
}

// Maker and model, without the maker's name twice.
std::string productOf(const Properties& properties)
{
    const std::string maker = textOf(properties, KEY_MAKER);
    const std::string model = textOf(properties, KEY_MODEL);
    return maker.empty() || model.compare(0, maker.size(), maker) == 0 ? model : told(maker + ' ' + model);
}

// The model alone if it begins as its maker does: "NVIDIA Corporation" and "NVIDIA H100".
std::string deviceOf(const Properties& properties)
{
    const std::string maker = textOf(properties, KEY_MAKER);
    const std::string model = textOf(properties, KEY_MODEL);
    const std::string first = maker.substr(0, maker.find(' ')) + ' ';
    return first.size() > 1 && model.compare(0, first.size(), first) == 0 ? model : productOf(properties);
}

// Without the code that firmware writes for a maker whose name it does not know, such as "00AD063200AD".
std::string moduleOf(const Properties& properties)
{
    const std::string maker = textOf(properties, KEY_MAKER);
    const bool isCode = maker.size() >= 4 && maker.find_first_of("0123456789") != std::string::npos
        && maker.find_first_not_of("0123456789abcdefABCDEFx") == std::string::npos;
    return joined(
        {isCode ? textOf(properties, KEY_MODEL) : productOf(properties), textOf(properties, KEY_PART_NUMBER)},
        " ");
}

// Without "16-Core Processor" at its end: the number of cores stands beside it.
std::string processorModel(const Properties& properties, unsigned int key = KEY_MODEL)
{
    constexpr std::string_view ending = "-Core Processor";
    std::string model = textOf(properties, key);
    if (model.size() > ending.size()
        && model.compare(model.size() - ending.size(), ending.size(), ending) == 0) {
        const auto blank = model.find_last_of(' ', model.size() - ending.size());
        if (blank != std::string::npos && blank != 0)
            model.erase(blank);
    }
    return model;
}

bool isCpuKind(const Node& node)
{
    return node.getSensor() == Node::SENSOR_CPU || node.getSensor() == Node::SENSOR_GROUP;
}

// A device that the system has given a name, such as eth0.
bool isNamedBySystem(const Node& node)
{
    return node.getSensor() == Node::SENSOR_HARD_DRIVE || node.getSensor() == Node::SENSOR_NETWORK_PORT
        || node.getSensor() == Node::SENSOR_MEMORY_DEVICE;
}

// "PowerDomain", "USB Controller": "power domain", "USB controller".
std::string inSmallLetters(const std::string& text)
{
    const auto is = [&](std::size_t i, int (*kind)(int)) {
        return i < text.size() && kind(static_cast<unsigned char>(text[i])) != 0;
    };
    std::string small;
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (i > 0 && is(i, std::isupper) && is(i - 1, std::islower))
            small += ' ';
        const bool begins = is(i, std::isupper) && is(i + 1, std::islower);
        small += begins ? static_cast<char>(std::tolower(static_cast<unsigned char>(text[i]))) : text[i];
    }
    return small;
}

std::string wordOf(const Node& node, const std::string& name, const Properties& properties)
{
    static const char* const cacheKinds[] = {"", "d", "i"};
    switch (node.getSensor()) {
    case Node::SENSOR_COMPUTER:
        return "machine";
    case Node::SENSOR_CPU:
        return "package";
    case Node::SENSOR_GROUP:
        return name.compare(0, 3, "die") == 0 ? "die" : "group";
    case Node::SENSOR_CPU_CORE:
        return "core";
    case Node::SENSOR_MEMORY_ARRAY:
        return "NUMA node";
    case Node::SENSOR_DIMM:
        return "memory module";
    case Node::SENSOR_VIDEO:
        return "GPU";
    case Node::SENSOR_CACHE: {
        if (name.compare(0, 3, "mem") == 0)
            return memorySideCache;
        const auto kind = properties.find(KEY_CACHE_KIND);
        const std::string code = kind == properties.end() ? "" : exactText(kind->second);
        const std::string level = textOf(properties, KEY_LEVEL);
        return level.empty() ? "cache" : 'L' + level + cacheKinds[code == "1" ? 1 : code == "2" ? 2 : 0];
    }
    default:
        return inSmallLetters(IC::pst[node.getSensor()]);
    }
}

Pieces kindOf(const Node& node, const Properties& properties)
{
    Pieces pieces;
    const auto add = [&](const std::string& piece) {
        if (!piece.empty())
            pieces.push_back(piece);
    };
    switch (node.getSensor()) {
    case Node::SENSOR_CPU:
    case Node::SENSOR_GROUP:
        add(processorModel(properties));
        add(countOf(properties, KEY_CORES, "core"));
        add(countOf(properties, KEY_THREADS, "thread"));
        break;
    case Node::SENSOR_CPU_CORE:
        add(countOf(properties, KEY_THREADS, "thread"));
        if (const std::string most = frequency(properties); !most.empty())
            add("up to " + most);
        break;
    case Node::SENSOR_CACHE:
    case Node::SENSOR_MEMORY_ARRAY:
        add(sizeOf(properties));
        break;
    case Node::SENSOR_DIMM:
        add(sizeOf(properties));
        add(textOf(properties, KEY_MEMORY_TYPE));
        if (const std::string speed = countOf(properties, KEY_SPEED, ""); !speed.empty())
            add(speed + "MT/s");
        add(moduleOf(properties));
        break;
    default:
        if (properties.count(KEY_CHIP) != 0)  // the name of a sensor says what it measures
            add(textOf(properties, KEY_NAME));
        if (node.getSensor() == Node::SENSOR_COMPUTER) {
            add(productOf(properties));
            break;
        }
        add(joined({deviceOf(properties), textOf(properties, KEY_REVISION)}, " "));
        if (const std::string ids = textOf(properties, KEY_PCI_DEVICE); pieces.empty() && ids != "0000:0000")
            add(ids);
        add(textOf(properties, KEY_RELEASED).substr(0, 10));  // the day
        add(sizeOf(properties));
        add(withUnit(properties, KEY_READING));
        if (const std::string least = withUnit(properties, KEY_LOWER_LIMIT); !least.empty())
            add("at least " + least);
        // An upper limit of 0 is none.
        if (numberOf(properties, KEY_UPPER_LIMIT).value_or(0) != 0)
            add("at most " + withUnit(properties, KEY_UPPER_LIMIT));
    }
    // Of a node that has no properties.
    if (properties.empty())
        add(printable(node.getDescription()));
    return pieces;
}

// "84:8f:69:fe:cc:41"
std::string addressOf(const Properties& properties)
{
    const auto found = properties.find(KEY_ADDRESS);
    if (found == properties.end() || found->second.getKind() != IC::PropertyValue::KIND_BUFFER)
        return "";
    std::string text;
    for (const unsigned char byte : found->second.operator IC::Buffer())
        text.append(text.empty() ? "" : ":").append(IC::pB(byte));
    return text;
}

class NumberSet {
public:
    NumberSet() : bitmap_(hwloc_bitmap_alloc(), hwloc_bitmap_free) { }

    // False, and nothing is added, unless the value is an array of numbers that threads can have.
    bool add(const IC::PropertyValue& value)
    {
        constexpr double most = 1 << 20;
        if (value.getKind() != IC::PropertyValue::KIND_NUMBERARRAY)
            return false;
        std::vector<unsigned int> numbers;
        for (const IC::Number& number : value.operator IC::NumberArray()) {
            const auto real = realNumber(exactText(number));
            if (!real || !(*real >= 0 && *real < most) || *real != std::floor(*real))
                return false;
            numbers.push_back(static_cast<unsigned int>(*real));
        }
        for (const unsigned int number : numbers)
            hwloc_bitmap_set(bitmap_.get(), number);
        return true;
    }

    std::string ranges() const
    {
        std::string text(static_cast<std::size_t>(hwloc_bitmap_list_snprintf(nullptr, 0, bitmap_.get())),
                         '\0');
        hwloc_bitmap_list_snprintf(text.data(), text.size() + 1, bitmap_.get());
        return text;
    }

private:
    std::unique_ptr<hwloc_bitmap_s, decltype(&hwloc_bitmap_free)> bitmap_;
};

// "eth0, eth1"; of many, the first ones and how many more.
std::string namesIn(const std::vector<const Shown*>& shown)
{
    constexpr std::size_t most = 8;
    Pieces names;
    for (const Shown* one : shown)
        if (names.size() < most || shown.size() == most + 1)
            names.push_back(one->name);
    return joined(names)
        + (names.size() < shown.size() ? " and " + std::to_string(shown.size() - names.size()) + " more"
                                       : "");
}

// What distinguishes the nodes of a part from other equal ones, in parentheses.
std::string ownOf(const std::vector<const Shown*>& shown)
{
    const Shown& first = *shown.front();
    if (isCpuKind(*first.node)) {
        NumberSet threads;
        bool isKnown = true;
        for (const Shown* one : shown) {
            const auto set = one->properties.find(KEY_CPU_SET);
            isKnown = isKnown && set != one->properties.end() && threads.add(set->second);
        }
        return isKnown ? threads.ranges() : "";
    }
    if (shown.size() == 1)
        return first.own;
    return isNamedBySystem(*first.node) ? namesIn(shown) : "";
}

// Makes equal parts one part, which keeps the place of the first. Their inside becomes one as well.
class Folding {
public:
    void fold(std::vector<Part>& parts)
    {
        std::vector<Part> kept;
        std::map<std::size_t, std::size_t> places;
        for (Part& part : parts) {
            fold(part.inner);
            part.kind = kindNumber(part);
            const auto [found, isNew] = places.try_emplace(part.kind, kept.size());
            if (isNew)
                kept.push_back(std::move(part));
            else
                merge(kept[found->second], part);
        }
        parts = std::move(kept);
    }

private:
    using Inside = std::vector<std::pair<std::size_t, std::size_t>>;  // kind and how often

    std::size_t kindNumber(const Part& part)
    {
        const Shown& first = part.first();
        std::string text = first.word + ": " + joined(first.kind) + "; " + first.link;
        for (const Shown* cache : part.caches)
            text += '\n' + cache->word + ' ' + joined(cache->kind);
        for (const std::string& trouble : first.troubles)
            text += "\n-- " + trouble;
        Inside inside;
        for (const Part& inner : part.inner)
            inside.emplace_back(inner.kind, inner.times);
        std::sort(inside.begin(), inside.end());
        return numbers_.try_emplace({text, inside}, numbers_.size()).first->second;
    }

    static void merge(Part& part, const Part& other)
    {
        join(part, other);
        ++part.times;
    }

    static void join(Part& part, const Part& other)
    {
        part.shown.insert(part.shown.end(), other.shown.begin(), other.shown.end());
        for (Part& inner : part.inner)
            for (const Part& same : other.inner)
                if (same.kind == inner.kind)
                    join(inner, same);
    }

    std::map<std::pair<std::string, Inside>, std::size_t> numbers_;
};

}  // namespace

std::string joined(const Pieces& pieces, const char* separator)
{
    std::string text;
    for (const std::string& piece : pieces)
        text += (text.empty() || piece.empty() ? "" : separator) + piece;
    return text;
}

std::string rangesOf(const IC::PropertyValue& value)
{
    NumberSet set;
    return set.add(value) ? set.ranges() : "";
}

std::string valueInWords(unsigned int key, const Properties& properties)
{
    const auto found = properties.find(key);
    if (found == properties.end())
        return "";
    std::string text;
    switch (key) {
    case KEY_CPU_SET:
        text = rangesOf(found->second);
        break;
    case KEY_SIZE:
    case KEY_SYSTEM_MEMORY:
        text = sizeOf(properties, key);
        break;
    case KEY_FREQUENCY:
        text = frequency(properties);
        break;
    case KEY_LINK_SPEED:
        text = linkSpeed(properties);
        break;
    case KEY_ADDRESS:
        text = addressOf(properties);
        break;
    case KEY_UNIT:
        return unitInWords(std::string(found->second));
    case KEY_READING:
    case KEY_AVERAGE:
    case KEY_LOWEST:
    case KEY_HIGHEST:
    case KEY_AVERAGE_LOWEST:
    case KEY_AVERAGE_HIGHEST:
    case KEY_LOWER_LIMIT:
    case KEY_LOWER_CRITICAL:
    case KEY_UPPER_LIMIT:
    case KEY_UPPER_CRITICAL:
    case KEY_EMERGENCY_LIMIT:
    case KEY_CAP:
    case KEY_RATED_MINIMUM:
    case KEY_RATED_MAXIMUM:
    case KEY_LOWER_LIMIT_HYSTERESIS:
    case KEY_LOWER_CRITICAL_HYSTERESIS:
    case KEY_UPPER_LIMIT_HYSTERESIS:
    case KEY_UPPER_CRITICAL_HYSTERESIS:
    case KEY_EMERGENCY_HYSTERESIS:
    case KEY_CAP_HYSTERESIS:
    case KEY_OFFSET:
        text = withUnit(properties, key);
        break;
    default:
        if (found->second.getKind() == IC::PropertyValue::KIND_ENUMVALUE)
            text = nameOfCode(key, IC::EnumValue(found->second));
        break;
    }
    return text.empty() ? printable(exactText(found->second)) : text;
}

const char* severityName(unsigned int severity)
{
    static const char* const names[] = {"information", "warning", "major", "critical"};
    return names[std::min(severity, 3u)];
}

View::View(const Nodes& nodes)
{
    // Deeper trees come only from damaged input; what is deeper is beside what it belongs into.
    constexpr std::size_t deepest = 200;
    struct Place {
        const Shown* shown;
        const Shown* above;
        std::size_t depth;
    };
    std::map<std::string, Place> places;
    std::map<std::string, Pieces> troubles;
    for (const IC::Alert& alert : alertsOf(nodes)) {
        const std::vector<std::string> paths = alert.getNodePaths();
        const std::string message = printable(alert.getMessage());
        alerts_.push_back({alert.getSeverity(), paths.empty() ? "" : printable(paths.front()), message});
        const std::size_t colon = message.find(": ");
        for (const std::string& path : paths)
            troubles[path].push_back(colon == std::string::npos ? message : message.substr(colon + 2));
    }
    std::stable_sort(alerts_.begin(), alerts_.end(),
                     [](const AlertLine& a, const AlertLine& b) { return a.severity > b.severity; });

    for (const auto& node : nodes) {
        const std::string path = node->getPath();
        // A node whose parent does not come before it is in no other.
        const auto found = places.find(node->getParent());
        const Place above = found == places.end() ? Place {} : found->second;
        const bool isDeep = above.depth >= deepest;
        const Shown* const around = isDeep ? above.above : above.shown;

        Shown shown;
        shown.node = node.get();
        shown.parent = above.shown;
        shown.properties = node->getProperties();
        shown.path = printable(path);
        shown.name = printable(path.substr(path.rfind('/') + 1));
        shown.word = wordOf(*node, shown.name, shown.properties);
        shown.kind = kindOf(*node, shown.properties);
        shown.own = addressOf(shown.properties);
        shown.link = linkSpeed(shown.properties);
        if (const auto its = troubles.find(path); its != troubles.end())
            shown.troubles = its->second;
        else if (node->getStatus() != 0)
            if (const Trouble* trouble = troubleOf(*node); trouble != nullptr)
                shown.troubles.emplace_back(trouble->words);
        shown_.push_back(std::move(shown));
        inside_[around].push_back(&shown_.back());
        places.try_emplace(path, Place {&shown_.back(), around, isDeep ? deepest : above.depth + 1});
    }
}

std::vector<Part> View::partsIn(const Shown* around, Merging merging) const
{
    std::vector<Part> parts;
    const auto found = inside_.find(around);
    if (found == inside_.end())
        return parts;
    for (const Shown* shown : found->second) {
        Part part;
        while (merging == MERGE_CACHES && shown->node->getSensor() == Node::SENSOR_CACHE
               && shown->troubles.empty()) {
            const auto inner = inside_.find(shown);
            if (inner == inside_.end() || inner->second.size() != 1)
                break;
            const Node::SensorType sensor = inner->second.front()->node->getSensor();
            if (sensor != Node::SENSOR_CACHE && sensor != Node::SENSOR_CPU_CORE)
                break;
            part.caches.push_back(shown);
            shown = inner->second.front();
        }
        part.shown.push_back(shown);
        part.inner = partsIn(shown, merging);
        parts.push_back(std::move(part));
    }
    return parts;
}

std::vector<Part> View::all() const
{
    return partsIn(nullptr, MERGE_NONE);
}

std::vector<Part> View::merged() const
{
    return partsIn(nullptr, MERGE_CACHES);
}

std::vector<Part> View::folded() const
{
    return fold(merged());
}

std::vector<Part> View::fold(std::vector<Part> parts)
{
    Folding().fold(parts);
    return parts;
}

std::string View::headOf(const Part& part)
{
    const Shown& first = part.first();
    if (part.times > 1)
        return times(part.times, first.word);
    if (part.shown.size() > 1 || first.name.empty())
        return first.word;
    // The name alone if it begins with the word: package-0, l3-0.
    const bool isWord = first.name.size() >= first.word.size()
        && std::equal(first.word.begin(), first.word.end(), first.name.begin(), [](char a, char b) {
                            return std::tolower(static_cast<unsigned char>(a))
                                == std::tolower(static_cast<unsigned char>(b));
                        });
    return isWord ? first.name : first.word + ' ' + first.name;
}

std::string View::detailsOf(const Part& part)
{
    Pieces pieces;
    for (const Shown* cache : part.caches)
        pieces.push_back(joined({cache->word, joined(cache->kind)}, " "));
    const Shown& first = part.first();
    const bool isCache = !part.caches.empty() && first.node->getSensor() == Node::SENSOR_CACHE;
    if (isCache)
        pieces.push_back(joined({first.word, joined(first.kind)}, " "));
    else
        pieces.insert(pieces.end(), first.kind.begin(), first.kind.end());
    if (!first.link.empty())
        pieces.push_back("link " + first.link);
    const std::string own = ownOf(part.shown);
    const std::string text = joined(pieces);
    return own.empty() ? text : text.empty() ? own : text + " (" + own + ')';
}

std::string View::troublesOf(const Part& part)
{
    return joined(part.first().troubles, "; ");
}

const Shown* View::machine() const
{
    for (const Shown& shown : shown_)
        if (shown.node->getSensor() == Node::SENSOR_COMPUTER)
            return &shown;
    return nullptr;
}

// Without those inside one of the same type.
std::vector<const Shown*> View::each(Node::SensorType sensor) const
{
    std::vector<const Shown*> found;
    for (const Shown& shown : shown_)
        if (shown.node->getSensor() == sensor
            && (shown.parent == nullptr || shown.parent->node->getSensor() != sensor))
            found.push_back(&shown);
    return found;
}

std::string View::title() const
{
    const Shown* its = machine();
    if (its == nullptr)
        return "machine";
    const std::string text =
        joined({textOf(its->properties, KEY_HOST_NAME), productOf(its->properties)}, ": ");
    return text.empty() ? "machine" : text;
}

namespace {

// The things of one kind: how many, and their names.
struct Kinds {
    Pieces texts;
    std::map<std::string, std::vector<const Shown*>> of;

    void add(const std::string& text, const Shown* shown, const std::vector<const Shown*>& names = {})
    {
        if (of.find(text) == of.end())
            texts.push_back(text);
        of[text].push_back(shown);
        named[text].insert(named[text].end(), names.begin(), names.end());
    }
    std::map<std::string, std::vector<const Shown*>> named;
};

void addLines(Entry& row, const Kinds& kinds, std::size_t most)
{
    std::size_t left = 0;
    for (const auto& kind : kinds.of)
        left += kind.second.size();
    std::size_t written = 0;
    for (const std::string& text : kinds.texts) {
        if (written + 1 == most && written + 1 < kinds.texts.size()) {
            row.lines.push_back("and " + std::to_string(left) + " more of "
                                + std::to_string(kinds.texts.size() - written) + " kinds");
            return;
        }
        ++written;
        left -= kinds.of.at(text).size();
        const auto& names = kinds.named.at(text);
        row.lines.push_back(times(kinds.of.at(text).size(), text)
                            + (names.empty() ? "" : " (" + namesIn(names) + ')'));
    }
}

constexpr std::size_t mostKinds = 3;  // lines of a label

using Several = std::vector<const Shown*>;

std::string kindInWords(const Shown* shown)
{
    return shown->kind.empty() ? shown->word : joined(shown->kind);
}

// Processors of one kind, with all their cores and threads.
struct Processors {
    std::size_t number = 0;
    double cores = 0;
    double threads = 0;
};

Entry processorsEntry(const Several& packages, const Properties& ofMachine)
{
    Entry entry {"Processors", {}};
    const std::string modelOfAll = processorModel(ofMachine, KEY_CPU_MODEL);  // of old exports
    Pieces models;
    std::map<std::string, Processors> sums;
    for (const Shown* shown : packages) {
        std::string model = processorModel(shown->properties);
        model = model.empty() ? modelOfAll : model;
        if (sums.find(model) == sums.end())
            models.push_back(model);
        Processors& sum = sums[model];
        ++sum.number;
        sum.cores += numberOf(shown->properties, KEY_CORES).value_or(0);
        sum.threads += numberOf(shown->properties, KEY_THREADS).value_or(0);
    }
    for (const std::string& model : models) {
        if (entry.lines.size() + 1 == mostKinds && models.size() > mostKinds) {
            entry.lines.push_back("and " + std::to_string(models.size() - entry.lines.size())
                                  + " other kinds");
            return entry;
        }
        const Processors& sum = sums[model];
        entry.lines.push_back(
            joined({model.empty() ? counted(sum.number, "processor") : times(sum.number, model),
                    amountOf(sum.cores, "core"), amountOf(sum.threads, "thread")}));
    }
    const std::string counts = joined(
        {modelOfAll, countOf(ofMachine, KEY_CORES, "core"), countOf(ofMachine, KEY_THREADS, "thread")});
    if (models.empty() && !counts.empty())
        entry.lines.push_back(counts);
    return entry;
}

Entry memoryEntry(const Properties& ofMachine, std::size_t numaNodes, const Several& modules,
                  const Several& devices)
{
    Entry entry {"Memory", {}};
    const std::string nodes = numaNodes > 1 ? " in " + counted(numaNodes, "NUMA node") : "";
    const std::string size = sizeOf(ofMachine);
    // Only a machine on which the system counts something else has this property.
    const std::string ofSystem = sizeOf(ofMachine, KEY_SYSTEM_MEMORY);
    const std::string sizes =
        joined({size.empty() ? "" : size + nodes, ofSystem.empty() ? "" : ofSystem + " in the system"});
    if (!sizes.empty())
        entry.lines.push_back(sizes);
    Kinds kindsOfModules;
    for (const Shown* shown : modules)
        kindsOfModules.add(joined({kindInWords(shown), joined(shown->troubles)}), shown);
    addLines(entry, kindsOfModules, mostKinds);
    Kinds kindsOfDevices;
    for (const Shown* shown : devices)
        kindsOfDevices.add(joined({shown->word, joined(shown->kind)}), shown, {shown});
    addLines(entry, kindsOfDevices, mostKinds - 1);
    return entry;
}

Entry networkEntry(const Several& controllers, const Several& ports)
{
    Entry entry {"Network", {}};
    std::map<std::string, Several> portsOf;
    for (const Shown* shown : controllers)
        portsOf[shown->node->getPath()] = {};
    Several alone;
    for (const Shown* shown : ports) {
        const auto controller = portsOf.find(shown->node->getParent());
        (controller == portsOf.end() ? alone : controller->second).push_back(shown);
    }
    Kinds kinds;
    for (const Shown* shown : controllers)
        kinds.add(kindInWords(shown), shown, portsOf[shown->node->getPath()]);
    for (const Shown* shown : alone)
        kinds.add(joined({shown->word, joined(shown->kind)}), shown, {shown});
    addLines(entry, kinds, mostKinds);
    return entry;
}

enum Naming : bool { UNNAMED, NAMED };

Entry devicesEntry(const char* label, const Several& devices, Naming naming)
{
    Entry entry {label, {}};
    Kinds kinds;
    for (const Shown* shown : devices)
        kinds.add(kindInWords(shown), shown, naming == NAMED ? Several {shown} : Several {});
    addLines(entry, kinds, mostKinds);
    return entry;
}

Entry systemEntry(const Several& systems, const Several& firmware)
{
    Entry entry {"System", {}};
    if (!systems.empty() && !systems.front()->kind.empty())
        entry.lines.push_back(joined(systems.front()->kind));
    if (!firmware.empty() && !firmware.front()->kind.empty())
        entry.lines.push_back("BIOS " + joined(firmware.front()->kind));
    return entry;
}

}  // namespace

std::vector<Entry> View::entries() const
{
    const Shown* const its = machine();
    const Properties ofMachine = its == nullptr ? Properties() : its->properties;
    std::vector<Entry> entries {
        processorsEntry(each(Node::SENSOR_CPU), ofMachine),
        memoryEntry(ofMachine, each(Node::SENSOR_MEMORY_ARRAY).size(), each(Node::SENSOR_DIMM),
                    each(Node::SENSOR_MEMORY_DEVICE)),
        devicesEntry("GPUs", each(Node::SENSOR_VIDEO), UNNAMED),
        networkEntry(each(Node::SENSOR_NETWORK_CONTROLLER), each(Node::SENSOR_NETWORK_PORT)),
        devicesEntry("Disks", each(Node::SENSOR_HARD_DRIVE), NAMED),
        systemEntry(each(Node::SENSOR_OS), each(Node::SENSOR_BIOS))};
    entries.erase(std::remove_if(entries.begin(), entries.end(),
                                 [](const Entry& entry) { return entry.lines.empty(); }),
                  entries.end());
    return entries;
}

}  // namespace inventory
