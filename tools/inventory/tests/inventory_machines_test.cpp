// What holds for every machine: what it has are nodes in the right places, a part that goes renames no other part,
// and a damaged export is refused in words.
#include <gmock/gmock.h>
#include <hwloc.h>
#include <hwloc/export.h>

#include <algorithm>
#include <cstdlib>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <random>
#include <set>

#include "alerts.h"
#include "comparing.h"
#include "inventory_run.h"
#include "mapping.h"
#include "reading.h"

namespace {

using namespace inventory;
using testing::IsEmpty;

using Topology = std::unique_ptr<hwloc_topology, decltype(&hwloc_topology_destroy)>;

void check(int result, const std::string& what)
{
    if (result != 0)
        throw std::runtime_error("hwloc does not " + what);
}

// All that hwloc knows of a machine: of an export, or made up from a description.
Topology load(const std::string& xml, const std::string& description = "")
{
    hwloc_topology_t made = nullptr;
    check(hwloc_topology_init(&made), "begin");
    Topology topology(made, hwloc_topology_destroy);
    check(description.empty()
              ? hwloc_topology_set_xmlbuffer(made, xml.c_str(), static_cast<int>(xml.size() + 1))
              : hwloc_topology_set_synthetic(made, description.c_str()),
          "take " + description);
    check(hwloc_topology_set_all_types_filter(made, HWLOC_TYPE_FILTER_KEEP_ALL), "keep all types");
    check(hwloc_topology_set_flags(made, HWLOC_TOPOLOGY_FLAG_INCLUDE_DISALLOWED), "include all");
    check(hwloc_topology_load(made), "load " + description);
    return topology;
}

Topology without(const Topology& topology, hwloc_const_bitmap_t threads, unsigned long flags)
{
    hwloc_topology_t copy = nullptr;
    check(hwloc_topology_dup(&copy, topology.get()), "copy");
    Topology rest(copy, hwloc_topology_destroy);
    const std::unique_ptr<hwloc_bitmap_s, decltype(&hwloc_bitmap_free)> kept(
        hwloc_bitmap_dup(hwloc_topology_get_complete_cpuset(copy)), hwloc_bitmap_free);
    hwloc_bitmap_andnot(kept.get(), kept.get(), threads);
    check(hwloc_topology_restrict(copy, kept.get(), flags), "restrict");
    return rest;
}

using Changes = std::vector<Change>;
using ThreadSet = std::set<unsigned int>;

ThreadSet threadsOf(const IC::Node& node)
{
    ThreadSet threads;
    IC::PropertyValue set(IC::NumberArray {});
    static_cast<void>(node.getProperty(KEY_CPU_SET, set));
    for (const IC::Number& thread : set.operator IC::NumberArray())
        threads.insert(thread);
    return threads;
}

ThreadSet setOf(hwloc_const_bitmap_t bitmap)
{
    ThreadSet threads;
    for (int thread = -1; (thread = hwloc_bitmap_next(bitmap, thread)) != -1;)
        threads.insert(static_cast<unsigned int>(thread));
    return threads;
}

// The numbers of the cores that hold these threads, and the lowest of the threads.
bool isLowestIn(hwloc_obj_t core, const ThreadSet& threads, hwloc_topology_t topology)
{
    bool isLowest = *threads.begin() == static_cast<unsigned int>(hwloc_bitmap_first(core->cpuset));
    unsigned int lowest = core->os_index;
    for (hwloc_obj_t other = nullptr;
         (other = hwloc_get_next_obj_by_type(topology, HWLOC_OBJ_CORE, other)) != nullptr;)
        if (threads.count(static_cast<unsigned int>(hwloc_bitmap_first(other->cpuset))) != 0)
            lowest = std::min(lowest, other->os_index);
    return isLowest || lowest == core->os_index;
}

// Takes each core away in turn. Gives what changed although it may not: paths, and differences other than the core,
// what was its own, and the counts and CPU sets of what contained it.
std::set<std::string> wronglyChangedIn(const Topology& topology)
{
    std::set<std::string> wrong;
    const Inventory before = readTopology(topology.get());
    std::map<std::string, ThreadSet> nodes;
    for (const auto& node : before.nodes)
        nodes[node->getPath()] = threadsOf(*node);
    // A package without a number and without memory is named by its lowest thread.
    const auto isNamedByThread = [](const IC::Node& node) {
        return node.getSensor() == IC::Node::SENSOR_CPU && node.getPath().find("-t") != std::string::npos;
    };
    const auto isCacheOrGroup = [&](const IC::Node& node) {
        return node.getSensor() == IC::Node::SENSOR_CACHE || node.getSensor() == IC::Node::SENSOR_GROUP
            || isNamedByThread(node);
    };
    unsigned int number = 0;
    for (hwloc_obj_t core = nullptr;
         (core = hwloc_get_next_obj_by_type(topology.get(), HWLOC_OBJ_CORE, core)) != nullptr; ++number) {
        const ThreadSet own = setOf(core->cpuset);
        if (own.empty()
            || hwloc_bitmap_isequal(core->cpuset, hwloc_topology_get_topology_cpuset(topology.get())) != 0)
            continue;
        // NUMA nodes without threads stay or go.
        const auto flags = number % 8 == 0 ? HWLOC_RESTRICT_FLAG_REMOVE_CPULESS : 0;
        const Inventory after =
            readTopology(without(topology, core->complete_cpuset, static_cast<unsigned long>(flags)).get());
        for (const Change& change : number % 8 < 2 ? changesBetween(before.nodes, after.nodes) : Changes {}) {
            const IC::Node& node = *change.node;
            const ThreadSet threads = threadsOf(node);
            const bool isGone = change.subject == Change::NODE && change.from;
            const bool isOwn =
                !threads.empty() && std::includes(own.begin(), own.end(), threads.begin(), threads.end());
            static const std::set<unsigned int> counts {KEY_CPUS,           KEY_CORES,
                                                        KEY_THREADS,        KEY_UNUSABLE_CPUS,
                                                        KEY_UNUSABLE_CORES, KEY_UNUSABLE_THREADS,
                                                        KEY_CPU_SET};
            // A CPU may lose its only thread that the system may not use; then its status changes too.
            const bool isCount = change.subject == Change::STATUS
                || (change.subject == Change::PROPERTY && counts.count(change.key) != 0);
            // A group that only had this core more than another one goes.
            const bool isGroup = isGone && node.getSensor() == IC::Node::SENSOR_GROUP
                && std::includes(threads.begin(), threads.end(), own.begin(), own.end());
            if (!(isGone && isOwn) && !isCount && !isGroup && !isNamedByThread(node))
                wrong.insert(node.getPath() + (isGone ? " gone" : " differs in " + nameOf(change.key)));
        }
        std::set<std::string> rest;
        for (const auto& node : after.nodes) {
            rest.insert(node->getPath());
            if (nodes.count(node->getPath()) == 0 && !isCacheOrGroup(*node))
                wrong.insert(node->getPath() + " came");
        }
        // The parents of what went went with them, or what is in them moved up.
        for (const auto& node : before.nodes) {
            if (rest.count(node->getPath()) != 0)
                continue;
            const ThreadSet& threads = nodes[node->getPath()];
            const bool isOwn =
                !threads.empty() && std::includes(own.begin(), own.end(), threads.begin(), threads.end());
            const bool mayChange = isCacheOrGroup(*node)
                && std::includes(threads.begin(), threads.end(), own.begin(), own.end())
                && (node->getSensor() == IC::Node::SENSOR_GROUP || isLowestIn(core, threads, topology.get()));
            if (!isOwn && !mayChange)
                wrong.insert(node->getPath() + " went");
        }
    }
    return wrong;
}

TEST(InventoryMachines, KeepThePathsOfWhatStaysWhenACoreGoes)
{
    const auto files = realMachines();
    for (const std::string& file : files) {
        SCOPED_TRACE(file);
        EXPECT_THAT(wronglyChangedIn(load(contentOf(file))), IsEmpty());
    }
    if (files.empty())
        GTEST_SKIP() << whyNoMachines;
}

// The export of a machine that hwloc makes up, with other numbers for the objects of one type.
std::string renumbered(const std::string& description, const std::string& type,
                       const std::function<std::optional<unsigned int>(unsigned int)>& number,
                       unsigned long form)
{
    const Topology topology = load("", description);
    char* text = nullptr;
    int length = 0;
    check(hwloc_topology_export_xmlbuffer(topology.get(), &text, &length, form), "export " + description);
    std::string xml = text;
    hwloc_free_xmlbuffer(topology.get(), text);
    const std::string head = "type=\"" + type + "\" os_index=\"";
    unsigned int count = 0;
    for (std::size_t at = 0; (at = xml.find(head, at)) != std::string::npos; ++at) {
        const auto end = xml.find('"', at + head.size());
        const auto other = number(count++);
        const std::string index = other ? " os_index=\"" + std::to_string(*other) + '"' : "";
        const auto begin = at + type.size() + 7;
        xml.replace(begin, end + 1 - begin, index);
    }
    EXPECT_GT(count, 0u) << type;
    return xml;
}

TEST(InventoryMachines, KeepThePathsAlsoWhereNumbersAreMissingOrOccurTwice)
{
    const auto none = [](unsigned int) { return std::optional<unsigned int>(); };
    const auto zero = [](unsigned int) { return std::optional(0U); };
    const auto ofTwo = [](unsigned int count) { return std::optional(count % 2); };
    const auto same = [](unsigned int count) { return std::optional(count); };
    const auto notTheThird = [](unsigned int count) {
        return count == 2 ? std::nullopt : std::optional(count);
    };
    const struct {
        const char* description;
        const char* type;
        std::function<std::optional<unsigned int>(unsigned int)> number;
        std::vector<std::string> paths;  // some of them
        unsigned long form = 0;          // of the export
    } rows[] = {
        {"pack:2 numa:2 l3:1 core:2 pu:2",
         "Package",
         none,
         {"/machine/package-numa0.1", "/machine/package-numa2.3/core-4", "/machine/package-numa2.3/l3-6"}},
        {"pack:3 core:2 pu:2", "Package", none, {"/machine/package-t4", "/machine/core-5-t10"}},
        {"pack:2 core:1 pu:2", "Package", none, {"/machine/package-t2", "/machine/core-1-t2"}},
        {"pack:3 l3:1 core:2 pu:1",
         "Package",
         zero,
         {"/machine/package-0-t2", "/machine/l3-t4", "/machine/core-5-t5"}},
        {"pack:1 core:3 pu:2",
         "Socket",
         none,
         {"/machine/package", "/machine/core-2-t4"},
         HWLOC_TOPOLOGY_EXPORT_XML_FLAG_V1},
        {"pack:2 l2:2 core:2 pu:2", "Core", none, {"/machine/package-1/core-t8", "/machine/package-0/l2-t4"}},
        {"pack:2 l2:2 core:2 pu:2",
         "Core",
         notTheThird,
         {"/machine/package-0/core-1", "/machine/package-0/core-t4", "/machine/package-0/l2-3"}},
        {"pack:2 l2:2 core:2 pu:2",
         "Core",
         ofTwo,
         {"/machine/package-1/core-1-t14", "/machine/package-0/l2-t4"}},
        {"l3:2 l2:2 core:2 pu:2", "Core", same, {"/machine/core-7-t14", "/machine/l3-t8", "/machine/l2-t12"}},
        {"pack:2 die:2 core:2 pu:1", "Die", ofTwo, {"/machine/package-1/die-1", "/machine/package-1/core-7"}},
        {"pack:2 die:2 core:2 pu:1",
         "Die",
         zero,
         {"/machine/package-1/die-0-t6", "/machine/package-1/core-7"}},
        {"group:2 group:2 pack:2 core:2 pu:1",
         "Core",
         same,
         {"/machine/group-kind10.1-t0", "/machine/package-7/core-14"}},
        {"group:2 group:2 pack:2 core:2 pu:1",
         "Core",
         same,
         {"/machine/group-kind0.0-t8-depth0", "/machine/group-kind0.0-t8-depth1",
          "/machine/group-kind0.0-t12"},
         HWLOC_TOPOLOGY_EXPORT_XML_FLAG_V1},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(std::string(row.description) + ' ' + row.type);
        const Topology topology = load(renumbered(row.description, row.type, row.number, row.form));
        std::set<std::string> paths;
        const Inventory inventory = readTopology(topology.get());
        for (const auto& node : inventory.nodes) {
            paths.insert(node->getPath());
            EXPECT_EQ(node->getDescription().find("number ,"), std::string::npos) << node->getDescription();
        }
        for (const std::string& path : row.paths)
            EXPECT_EQ(paths.count(path), 1u) << path << " of " << testing::PrintToString(paths);
        EXPECT_THAT(wronglyChangedIn(topology), IsEmpty());
    }
}

std::string textOf(const IC::Node& node, Key key)
{
    IC::PropertyValue value("");
    static_cast<void>(node.getProperty(key, value));
    return std::string(value);
}

// What tells a node from others, as far as its properties show it.
std::string identityOf(const IC::Node& node)
{
    std::string text = IC::pst[node.getSensor()];
    for (const Key key : {KEY_INDEX, KEY_NAME, KEY_LEVEL, KEY_CACHE_KIND, KEY_PCI_ADDRESS, KEY_CPU_SET})
        text += '|' + textOf(node, key);
    return text;
}

// The same from the object that the node describes.
std::string identityOf(hwloc_obj_t object)
{
    std::string text = IC::pst[findRow(object)->sensor];
    text += '|' + (object->os_index == HWLOC_UNKNOWN_INDEX ? "" : std::to_string(object->os_index));
    text += '|' + std::string(object->name == nullptr ? "" : object->name) + '|';
    const bool isCache = hwloc_obj_type_is_cache(object->type) != 0 || object->type == HWLOC_OBJ_MEMCACHE;
    if (isCache)
        text += std::to_string(object->attr->cache.depth) + '|'
            + std::to_string(codeOf(object->attr->cache.type));
    else
        text += '|';
    text += '|' + (object->type == HWLOC_OBJ_PCI_DEVICE ? pciAddress(object) : "") + '|';
    if (object->cpuset != nullptr) {
        std::string threads;
        for (const unsigned int thread : setOf(object->cpuset))
            threads += (threads.empty() ? "" : ", ") + std::to_string(thread);
        text += '{' + threads + '}';
    }
    return text;
}

// Each object that has a sensor type and is no view of a PCI device, with the object around it that has one.
void collect(hwloc_obj_t object, const std::string& parent, const hwloc_obj* device,
             std::multiset<std::string>& all, std::multiset<std::string>& views)
{
    std::string around = parent;
    if (object->type == HWLOC_OBJ_PCI_DEVICE)
        device = findRow(object) == nullptr ? nullptr : object;
    if (findRow(object) != nullptr && isView(object) && device != nullptr) {
        views.insert(object->name);
    } else if (findRow(object) != nullptr) {
        around = identityOf(object);
        all.insert(around + " in " + parent);
    }
    for (hwloc_obj_t list :
         {object->first_child, object->memory_first_child, object->io_first_child, object->misc_first_child})
        for (hwloc_obj_t child = list; child != nullptr; child = child->next_sibling)
            collect(child, around, device, all, views);
}

TEST(InventoryMachines, HaveANodeForEachObjectUnderTheRightParent)
{
    const auto files = realMachines();
    for (const std::string& file : files) {
        SCOPED_TRACE(file);
        const Topology topology = load(contentOf(file));
        std::multiset<std::string> objects;
        std::multiset<std::string> views;
        collect(hwloc_get_root_obj(topology.get()), "", nullptr, objects, views);

        std::multiset<std::string> described;
        std::multiset<std::string> describedViews;
        std::map<std::string, std::string> identities;  // of a slot: of what is around it
        const Inventory inventory = readTopology(topology.get());
        for (const auto& node : inventory.nodes) {
            const auto above = identities.find(node->getParent());
            const std::string parent = above == identities.end() ? "" : above->second;
            const bool isSlot = node->getSensor() == IC::Node::SENSOR_SLOT;
            EXPECT_TRUE(identities.emplace(node->getPath(), isSlot ? parent : identityOf(*node)).second);
            EXPECT_EQ(above == identities.end(), node->getPath() == "/machine") << node->getPath();
            IC::PropertyValue names(IC::StringArray {});
            static_cast<void>(node->getProperty(KEY_VIEWS, names));
            for (const std::string& name : names.operator IC::StringArray())
                describedViews.insert(name);
            const bool isPart = node->getPath().find_first_of("-.", 9) == std::string::npos
                && node->getParent() == "/machine" && textOf(*node, KEY_NAME).empty()
                && node->getSensor() != IC::Node::SENSOR_MEMORY_ARRAY;
            if (!isSlot && !isPart)
                described.insert(identityOf(*node) + " in " + parent);
        }
        EXPECT_EQ(described, objects);
        EXPECT_EQ(describedViews, views);
    }
    if (files.empty())
        GTEST_SKIP() << whyNoMachines;
}

TEST(InventoryMachines, CountWhatTheSystemMayNotUseAlsoIfItIsNotInTheTree)
{
    if (realMachines().empty())
        GTEST_SKIP() << whyNoMachines;
    // Threads 0 to 15, of which 0, 1, 3, 4, 6, 12 and 15 are online. In each package, 4 threads in 2 cores.
    const Inventory inventory = readExport(readFile(realMachine("16em64t-4s2c2t-offlines")));
    std::vector<std::string> counts;
    for (const auto& node : inventory.nodes)
        if (node->getSensor() == IC::Node::SENSOR_CPU || node->getPath() == "/machine")
            counts.push_back(node->getPath() + ' ' + textOf(*node, KEY_UNUSABLE_THREADS) + ' '
                             + textOf(*node, KEY_UNUSABLE_CORES) + ' ' + std::to_string(node->getStatus()));
    EXPECT_THAT(counts,
                testing::ElementsAre("/machine 9 2 0", "/machine/package-0 1 0 2", "/machine/package-1 3 1 2",
                                     "/machine/package-2 3 1 2", "/machine/package-3 2 0 2"));
    std::vector<std::string> alerts;
    for (const IC::Alert& alert : alertsOf(inventory.nodes))
        alerts.push_back(alert.getNodePaths().front() + ' ' + alert.getMessage());
    EXPECT_THAT(alerts,
                testing::ElementsAre("/machine/package-0 CPU: the system may not use all of it",
                                     "/machine/package-1 CPU: the system may not use all of it",
                                     "/machine/package-2 CPU: the system may not use all of it",
                                     "/machine/package-3 CPU: the system may not use all of it"));
}

// The export with a few random changes.
std::string damaged(std::string xml, std::mt19937& random)
{
    const auto upTo = [&](std::size_t most) { return random() % (most + 1); };
    const auto lineAt = [&](std::size_t at) {
        const auto begin = xml.rfind('\n', at) == std::string::npos ? 0 : xml.rfind('\n', at) + 1;
        return std::make_pair(begin, std::min(xml.find('\n', at), xml.size() - 1) + 1 - begin);
    };
    for (std::size_t changes = 1 + upTo(3); changes != 0 && xml.size() > 2; --changes) {
        const std::size_t at = upTo(xml.size() - 2);
        const auto [begin, length] = lineAt(at);
        static const char* const numbers[] = {
            "-1", "0", "4294967295", "18446744073709551615", "0xffffffff,0x1", "", "1e99"};
        const auto digit = xml.find_first_of("0123456789", at);
        switch (upTo(6)) {
        case 0:
            xml[at] = static_cast<char>(upTo(255));
            break;
        case 1:
            xml.erase(begin, length);
            break;
        case 2:
            xml.insert(begin, xml.substr(begin, length));
            break;
        case 3:
            xml.insert(begin, std::string("<object type=\"") + (upTo(1) != 0 ? "Group" : "Misc") + "\"/>");
            break;
        case 4:
            xml.resize(at);
            break;
        default:
            if (digit != std::string::npos)
                xml.replace(digit, xml.find_first_not_of("0123456789", digit) - digit, numbers[upTo(6)]);
        }
    }
    return xml;
}

TEST(InventoryMachines, OfDamagedExportsAreRefusedOrSound)
{
    const auto files = realMachines();
    if (files.empty())
        GTEST_SKIP() << whyNoMachines;
    const char* number = std::getenv("INVENTORY_DAMAGED_EXPORTS");
    std::mt19937 random(19);
    std::size_t read = 0;
    std::size_t refused = 0;
    for (int i = number == nullptr ? 200 : std::stoi(number); i > 0; --i) {
        const std::string& file = files[random() % files.size()];
        const std::string xml = damaged(contentOf(file), random);
        SCOPED_TRACE(std::to_string(i) + ' ' + file);
        try {
            const Inventory inventory = readExport(xml);
            std::set<std::string> paths {""};
            for (const auto& node : inventory.nodes) {
                EXPECT_EQ(paths.count(node->getParent()), 1u) << node->getParent();
                EXPECT_TRUE(paths.insert(node->getPath()).second) << node->getPath();
            }
            ++read;
        } catch (const BadInput& refusal) {
            EXPECT_THAT(refusal.what(),
                        testing::AnyOf(testing::StartsWith("not a machine that hwloc "),
                                       testing::StartsWith("takes more than ")));
            ++refused;
        }
    }
    EXPECT_GT(read, 10u);
    EXPECT_GT(refused, 10u);
}

}  // namespace
