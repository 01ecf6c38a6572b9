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
                       const std::function<std::optional<unsigned int>(unsigned int)>& number)
{
    const Topology topology = load("", description);
    char* text = nullptr;
    int length = 0;
    check(hwloc_topology_export_xmlbuffer(topology.get(), &text, &length, 0), "export " + description);
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
    EXPECT_GT(count, 1u) << type;
    return xml;
}

TEST(InventoryMachines, KeepThePathsAlsoWhereNumbersAreMissingOrOccurTwice)
{
    const auto none = [](unsigned int) { return std::optional<unsigned int>(); };
    const auto zero = [](unsigned int) { return std::optional(0U); };
    const auto ofTwo = [](unsigned int count) { return std::optional(count % 2); };
    const auto same = [](unsigned int count) { return std::optional(count); };
    const struct {
        const char* description;
        const char* type;
        std::function<std::optional<unsigned int>(unsigned int)> number;
        std::vector<std::string> paths;  // some of them
    } rows[] = {
        {"pack:2 numa:2 l3:1 core:2 pu:2",
         "Package",
         none,
         {"/machine/package-numa0.1", "/machine/package-numa2.3/core-4", "/machine/package-numa2.3/l3-6"}},
        {"pack:3 core:2 pu:2", "Package", none, {"/machine/package-t4", "/machine/core-5-t10"}},
        {"pack:3 l3:1 core:2 pu:1",
         "Package",
         zero,
         {"/machine/package-0-t2", "/machine/l3-t4", "/machine/core-5-t5"}},
        {"pack:2 l2:2 core:2 pu:2", "Core", none, {"/machine/package-1/core-t8", "/machine/package-0/l2-t4"}},
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
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(std::string(row.description) + ' ' + row.type);
        const Topology topology = load(renumbered(row.description, row.type, row.number));
        std::set<std::string> paths;
        for (const auto& node : readTopology(topology.get()).nodes)
            paths.insert(node->getPath());
        for (const std::string& path : row.paths)
            EXPECT_EQ(paths.count(path), 1u) << path << " of " << testing::PrintToString(paths);
        EXPECT_THAT(wronglyChangedIn(topology), IsEmpty());
    }
}

}  // namespace
