// Loads a machine with hwloc and makes nodes of its objects.
#include "reading.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstdio>
#include <optional>
#include <set>
#include <sstream>
#include <string_view>
#include <system_error>
#include <tuple>

#include "alerts.h"
#include "mapping.h"
#include "values.h"
#include "writing.h"

namespace inventory {

#if defined(__has_feature)
#if __has_feature(address_sanitizer) || __has_feature(thread_sanitizer) || __has_feature(memory_sanitizer)
#define INVENTORY_SANITIZED
#endif
#endif
#if defined(INVENTORY_SANITIZED) || defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
const bool limitsMemory = false;
#else
const bool limitsMemory = true;
#endif

namespace {

BadInput unreadable()
{
    return BadInput("not a machine that hwloc " HWLOC_VERSION " can read");
}

using Topology = std::unique_ptr<hwloc_topology, decltype(&hwloc_topology_destroy)>;

// Loads all that hwloc knows of the export or, if `xml` is null, of this machine.
Topology load(const std::string* xml)
{
    hwloc_topology_t made = nullptr;
    if (hwloc_topology_init(&made) != 0)
        throw std::bad_alloc();
    Topology topology(made, hwloc_topology_destroy);
    if ((xml != nullptr
         && hwloc_topology_set_xmlbuffer(made, xml->c_str(), static_cast<int>(xml->size() + 1)) != 0)
        || hwloc_topology_set_all_types_filter(made, HWLOC_TYPE_FILTER_KEEP_ALL) != 0
        || hwloc_topology_set_flags(made, HWLOC_TOPOLOGY_FLAG_INCLUDE_DISALLOWED) != 0
        || hwloc_topology_load(made) != 0)
        throw unreadable();
    return topology;
}

// What an export may take. Damaged exports crash hwloc, make it loop for ever or fill the memory.
constexpr unsigned int secondsAtMost = 10;
constexpr rlim_t bytesAtMost = rlim_t {2} << 30;

void limit(decltype(RLIMIT_AS) resource, rlim_t most)
{
    rlimit limits {};
    getrlimit(resource, &limits);
    limits.rlim_cur = std::min(limits.rlim_cur, most);
    setrlimit(resource, &limits);
}

// In the child process. The status tells whether the memory was enough.
enum Trial : unsigned char { TRIAL_DONE, TRIAL_REFUSED, TRIAL_NO_MEMORY };
[[noreturn]] void describeForTrial(const std::string& xml)
{
    limit(RLIMIT_CORE, 0);
    limit(RLIMIT_CPU, secondsAtMost);
    if (limitsMemory)
        limit(RLIMIT_AS, bytesAtMost);
    dup2(open("/dev/null", O_WRONLY), STDERR_FILENO);
    std::signal(SIGALRM, SIG_DFL);
    alarm(secondsAtMost);
    try {
        const Inventory inventory = readTopology(load(&xml).get());
        std::ostringstream text;
        writeTree(text, inventory.nodes, {false, true});
        writeAlerts(text, alertsOf(inventory.nodes));
        _exit(text ? TRIAL_DONE : TRIAL_NO_MEMORY);
    } catch (const std::bad_alloc&) {
        _exit(TRIAL_NO_MEMORY);
    } catch (...) {
        _exit(errno == ENOMEM ? TRIAL_NO_MEMORY : TRIAL_REFUSED);
    }
}

// A child process describes the export first. Throws BadInput if it fails; then this process does not load the export.
void tryFirst(const std::string& xml)
{
    const pid_t child = fork();
    if (child < 0)
        return;  // not tried: no process is available
    if (child == 0)
        describeForTrial(xml);
    int status = 0;
    rusage usage {};
    while (wait4(child, &status, 0, &usage) < 0 && errno == EINTR) { }
    if (status == 0)
        return;
    const int signal = WIFSIGNALED(status) ? WTERMSIG(status) : 0;
    if (signal == SIGALRM || signal == SIGXCPU)
        throw BadInput("takes more than " + std::to_string(secondsAtMost) + " s");
    // hwloc may crash where it gets no memory; then the child had filled most of what it may take.
    const bool wasFull = signal != 0 && static_cast<rlim_t>(usage.ru_maxrss) > bytesAtMost / 1024 / 4 * 3;
    if (wasFull || (signal == 0 && WEXITSTATUS(status) == TRIAL_NO_MEMORY))
        throw BadInput("takes more than " + std::to_string(bytesAtMost >> 30) + " GiB");
    throw unreadable();
}

// 8 hexadecimal digits that depend on every byte of the text (FNV-1a).
std::string digest(std::string_view text)
{
    ZQ::Uint32 hash = 2166136261U;
    for (const char character : text)
        hash = (hash ^ static_cast<unsigned char>(character)) * 16777619U;
    char digits[9];
    std::snprintf(digits, sizeof digits, "%08x", static_cast<unsigned int>(hash));
    return digits;
}

// A node to be: the object, and what its path is made of.
struct Plan {
    const Row* row;      // null for a slot
    hwloc_obj_t object;  // for a slot: the first device in it
    std::size_t parent;  // of these three, plans that come before; the machine is its own
    std::size_t place;   // the node under whose path this one's lies
    std::string name;
    std::string mark = {};  // behind the name, where another part has the same name
    std::string slot = {};  // as the export writes it
    std::vector<hwloc_obj_t> views = {};
};

// Plans all nodes, each after its parent. A name is made of what stays when other parts come and go: so the path of a
// core leads through its package, but not through the caches and groups around it.
class Planner {
public:
    explicit Planner(hwloc_topology_t topology)
    {
        hwloc_obj* const machine = hwloc_get_root_obj(topology);
        learn(machine, nullptr);
        plan(machine, Around {});
        tellApart();
    }

    std::vector<Plan> plans;

private:
    // The plans around an object.
    struct Around {
        std::size_t parent = 0;
        std::optional<std::size_t> package;  // if the package's name stays whatever happens to its cores
        std::optional<std::size_t> slot;
        std::optional<std::size_t> pciDevice;
    };

    static bool isNumbered(hwloc_obj_t object) { return object->os_index != HWLOC_UNKNOWN_INDEX; }

    template <class Visit>
    static void forEachChild(hwloc_obj_t object, Visit visit)
    {
        // Not hwloc_get_next_child: in hwloc 2.9 it begins again after a memory-side cache.
        for (hwloc_obj_t first : {object->first_child, object->memory_first_child, object->io_first_child,
                                  object->misc_first_child})
            for (hwloc_obj_t child = first; child != nullptr; child = child->next_sibling)
                visit(child);
    }

    // Finds the numbers that occur twice: of packages in the machine, of what is in a package in that package. Then
    // those of all packages, all cores and so on are no names, so that a core that goes changes no other name as long
    // as another number occurs twice.
    void learn(hwloc_obj_t object, hwloc_obj_t package)
    {
        packages_ += object->type == HWLOC_OBJ_PACKAGE ? 1 : 0;
        cores_ += object->type == HWLOC_OBJ_CORE ? 1 : 0;
        const bool isNamed = object->type == HWLOC_OBJ_CORE || object->type == HWLOC_OBJ_PACKAGE
            || object->type == HWLOC_OBJ_DIE || object->type == HWLOC_OBJ_GROUP;
        if (isNamed && isNumbered(object)
            && !numbers_.insert({sortOf(object), package, object->os_index}).second)
            twice_.insert(sortOf(object));
        for (hwloc_obj_t child = object->first_child; child != nullptr; child = child->next_sibling)
            learn(child, object->type == HWLOC_OBJ_PACKAGE ? object : package);
    }

    // The word that begins the name. Groups of different kinds, such as books and drawers, are numbered apart.
    static std::string wordOf(const Row& row, hwloc_obj_t object)
    {
        std::string word = row.word;
        if (object->type == HWLOC_OBJ_GROUP && object->subtype != nullptr && *object->subtype != '\0')
            word = object->subtype;
        std::transform(word.begin(), word.end(), word.begin(), [](unsigned char letter) {
            return static_cast<char>(letter >= 'A' && letter <= 'Z' ? letter - 'A' + 'a' : letter);
        });
        return word;
    }

    using Sort = std::pair<hwloc_obj_type_t, std::string>;
    static Sort sortOf(hwloc_obj_t object) { return {object->type, wordOf(*findRow(object), object)}; }

    bool isUnique(hwloc_obj_t object) const
    {
        return isNumbered(object) && twice_.count(sortOf(object)) == 0;
    }

    static hwloc_const_bitmap_t threadsOf(hwloc_obj_t object)
    {
        return object->complete_cpuset != nullptr ? object->complete_cpuset : object->cpuset;
    }

    static std::string lowestThread(hwloc_obj_t object)
    {
        const hwloc_const_bitmap_t threads = threadsOf(object);
        const int first = threads == nullptr ? -1 : hwloc_bitmap_first(threads);
        return first < 0 ? "" : 't' + std::to_string(first);
    }

    static bool hasMemory(hwloc_obj_t object)
    {
        if (object->memory_first_child != nullptr)
            return true;
        for (hwloc_obj_t child = object->first_child; child != nullptr; child = child->next_sibling)
            if (hasMemory(child))
                return true;
        return false;
    }

    static std::string kindOf(hwloc_obj_t group)
    {
        return "kind" + std::to_string(group->attr->group.kind) + '.'
            + std::to_string(group->attr->group.subkind);
    }

    // Whether a package needs nothing that tells it apart. One with a single core may be what is left of two.
    bool isAlone() const { return packages_ == 1 && cores_ > 1; }

    // Tells packages, dies and groups apart that have no unique number. Memory stays when a core goes; the lowest
    // thread does not always.
    std::string substitute(hwloc_obj_t object) const
    {
        if (object->type == HWLOC_OBJ_GROUP && !hasMemory(object))
            return kindOf(object) + '-' + lowestThread(object);  // groups of several kinds lie in each other
        if (object->type == HWLOC_OBJ_CORE || object->nodeset == nullptr || !hasMemory(object))
            return object->type == HWLOC_OBJ_PACKAGE && isAlone() ? "" : lowestThread(object);
        std::string name = "numa";
        for (int node = -1; (node = hwloc_bitmap_next(object->nodeset, node)) != -1;)
            name += (name.size() > 4 ? "." : "") + std::to_string(node);
        return name;
    }

    static std::string joined(const std::string& word, const std::string& key)
    {
        return key.empty() ? word : word + '-' + key;
    }

    std::string numbered(const std::string& word, hwloc_obj_t object, bool mayBeUnique) const
    {
        const std::string name = isNumbered(object) ? word + '-' + std::to_string(object->os_index) : word;
        return mayBeUnique && isUnique(object) ? name : joined(name, substitute(object));
    }

    // The lowest number of the cores inside that have one.
    static std::optional<unsigned int> lowestCore(hwloc_obj_t object)
    {
        std::optional<unsigned int> lowest;
        for (hwloc_obj_t child = object->first_child; child != nullptr; child = child->next_sibling) {
            const auto inside = child->type != HWLOC_OBJ_CORE ? lowestCore(child)
                : isNumbered(child)                           ? std::optional(child->os_index)
                                                              : std::nullopt;
            if (inside && (!lowest || *inside < *lowest))
                lowest = inside;
        }
        return lowest;
    }

    std::string cacheName(const Row& row, hwloc_obj_t object, const Around& around) const
    {
        const auto& cache = object->attr->cache;
        std::string word = row.word;
        if (object->type == HWLOC_OBJ_MEMCACHE) {
            const int node = object->nodeset == nullptr ? -1 : hwloc_bitmap_first(object->nodeset);
            word += cache.depth > 1 ? std::to_string(cache.depth) : "";
            return joined(word, node < 0 ? lowestThread(object) : std::to_string(node));
        }
        if (codeOf(cache.type) == HWLOC_OBJ_CACHE_DATA)
            word += 'd';
        const auto core = lowestCore(object);
        const bool isNamed = around.package && core && twice_.count({HWLOC_OBJ_CORE, "core"}) == 0;
        return joined(word, isNamed ? std::to_string(*core) : lowestThread(object));
    }

    static std::string factOf(hwloc_obj_t object, const char* name)
    {
        const char* text = hwloc_obj_get_info_by_name(object, name);
        return text == nullptr ? "" : told(text);
    }

    std::string nameOf(const Row& row, hwloc_obj_t object, const Around& around) const
    {
        switch (object->type) {
        case HWLOC_OBJ_MACHINE:
            return row.word;
        case HWLOC_OBJ_PACKAGE:
        case HWLOC_OBJ_GROUP:
        case HWLOC_OBJ_NUMANODE:
            return numbered(wordOf(row, object), object, true);
        case HWLOC_OBJ_DIE:
        case HWLOC_OBJ_CORE:
            return numbered(row.word, object, around.package.has_value());
        case HWLOC_OBJ_PCI_DEVICE:
            return row.word + ('-' + pciAddress(object));
        case HWLOC_OBJ_OS_DEVICE:
            return object->name == nullptr || *object->name == '\0' ? row.word : object->name;
        case HWLOC_OBJ_MISC:
            return moduleName(factOf(object, "DeviceLocation"), factOf(object, "BankLocation"));
        default:
            return cacheName(row, object, around);
        }
    }

    // The node under whose path the object's lies.
    static std::size_t placeOf(hwloc_obj_t object, const Around& around)
    {
        if (object->type == HWLOC_OBJ_OS_DEVICE)
            return around.pciDevice.value_or(0);
        const bool isInPackage =
            hwloc_obj_type_is_normal(object->type) != 0 && object->type != HWLOC_OBJ_PACKAGE;
        return isInPackage ? around.package.value_or(0) : 0;
    }

    std::size_t add(Plan plan)
    {
        plans.push_back(std::move(plan));
        return plans.size() - 1;
    }

    void plan(hwloc_obj_t object, Around around)
    {
        const bool isPciDevice = object->type == HWLOC_OBJ_PCI_DEVICE;
        if (isPciDevice || object->type == HWLOC_OBJ_BRIDGE)
            if (const char* slot = hwloc_obj_get_info_by_name(object, "PCISlot"); slot != nullptr)
                around.parent = *(around.slot = slotOf(object, around, slot));
        if (isPciDevice)
            around.pciDevice.reset();
        const Row* row = findRow(object);
        if (row != nullptr && !joinsAnother(object, around)) {
            const std::size_t it =
                add({row, object, around.parent, placeOf(object, around), nameOf(*row, object, around)});
            around.parent = it;
            if (isPciDevice)
                around.pciDevice = it;
            if (object->type == HWLOC_OBJ_PACKAGE && (isUnique(object) || hasMemory(object)))
                around.package = it;
        }
        for (unsigned int i = 0; object->type == HWLOC_OBJ_MACHINE && i < object->infos_count; ++i)
            planPart(object, object->infos[i]);
        forEachChild(object, [&](hwloc_obj_t child) { plan(child, around); });
    }

    // Whether a device of the system is only another view of a device that has a plan: of its PCI device or, without
    // one, of a device with the same UUID.
    bool joinsAnother(hwloc_obj_t object, const Around& around)
    {
        if (!isView(object))
            return false;
        if (around.pciDevice) {
            plans[*around.pciDevice].views.push_back(object);
            return true;
        }
        std::size_t device = plans.size();
        for (const std::string& uuid : uuidsOf(object))
            device = devices_.try_emplace(uuid, device).first->second;
        if (device == plans.size())
            return false;
        if (object->name != nullptr && *object->name != '\0')
            plans[device].name = std::min(plans[device].name, std::string(object->name));
        plans[device].views.push_back(object);
        return true;
    }

    static std::vector<std::string> uuidsOf(hwloc_obj_t object)
    {
        std::vector<std::string> uuids;
        for (unsigned int i = 0; i < object->infos_count; ++i)
            if (inventory::factOf(object->infos[i]).key == KEY_UUID && !told(object->infos[i].value).empty())
                uuids.emplace_back(object->infos[i].value);
        return uuids;
    }

    // One node for a slot, however many functions its card has.
    std::size_t slotOf(hwloc_obj_t object, const Around& around, const std::string& name)
    {
        const auto [found, isNew] = slots_.try_emplace({around.parent, name}, plans.size());
        if (isNew)
            add({nullptr, object, around.parent, around.slot.value_or(0), "slot-" + told(name), "", name});
        return found->second;
    }

    // Plans a part of the machine at the first fact about it that is not empty.
    void planPart(hwloc_obj_t machine, const hwloc_info_s& info)
    {
        const IC::Node::SensorType part = inventory::factOf(info).part;
        if (part == IC::Node::SENSOR_COMPUTER || told(info.value).empty() || !parts_.insert(part).second)
            return;
        const Row* row = findRow(machine, part);
        add({row, machine, 0, 0, row->word});
    }

    // Two of one name get what tells them apart: nested groups their kind or their depth, slots their PCI address,
    // devices and modules a number that their facts yield. Any other part keeps its name if the other one is a device.
    void tellApart()
    {
        std::map<std::pair<std::size_t, std::string>, std::vector<Plan*>> byName;
        for (Plan& plan : plans)
            byName[{plan.place, plan.name}].push_back(&plan);
        for (const auto& [name, same] : byName)
            for (Plan* plan : same)
                if (same.size() > 1)
                    plan->mark = difference(*plan);
    }

    static std::string difference(const Plan& plan)
    {
        hwloc_obj* const object = plan.object;
        if (plan.row == nullptr)
            return '-' + pciAddress(object);
        if (object->type == HWLOC_OBJ_GROUP) {
            const std::string kind = '-' + kindOf(object);
            return plan.name.find(kind) == std::string::npos
                ? kind
                : "-depth" + std::to_string(object->attr->group.depth);
        }
        if (object->type != HWLOC_OBJ_OS_DEVICE && object->type != HWLOC_OBJ_MISC)
            return "";
        if (object->type == HWLOC_OBJ_MISC && object->os_index != HWLOC_UNKNOWN_INDEX)
            return '-' + std::to_string(object->os_index);  // as memory.cpp does: udev counts as hwloc does
        std::string facts;
        for (unsigned int i = 0; i < object->infos_count; ++i)
            facts += std::string(object->infos[i].name) + '=' + object->infos[i].value + '\n';
        return '#' + digest(facts);
    }

    struct Number {
        Sort sort;
        hwloc_obj_t package;
        unsigned int number;
        bool operator<(const Number& other) const
        {
            return std::tie(sort, package, number) < std::tie(other.sort, other.package, other.number);
        }
    };
    std::set<Number> numbers_;
    std::set<Sort> twice_;
    unsigned int packages_ = 0;
    unsigned int cores_ = 0;
    std::map<std::pair<std::size_t, std::string>, std::size_t> slots_;
    std::map<std::string, std::size_t> devices_;  // by UUID
    std::set<IC::Node::SensorType> parts_;
};

}  // namespace

Inventory readTopology(hwloc_topology_t topology)
{
    Inventory inventory;
    inventory.isThisSystem = hwloc_topology_is_thissystem(topology) != 0;
    std::vector<Site> sites;
    for (const Plan& plan : Planner(topology).plans) {
        const bool isMachine = sites.empty();
        Subject subject;
        static_cast<Site&>(subject) =
            inventory.site(isMachine ? Site() : sites[plan.parent],
                           plan.row == nullptr ? IC::Node::SENSOR_SLOT : plan.row->sensor, plan.name,
                           isMachine ? "" : sites[plan.place].path, plan.mark);
        sites.push_back(subject);
        if (isMachine)
            inventory.machine = subject;
        subject.topology = topology;
        subject.object = plan.object;
        subject.views = plan.views;
        inventory.nodes.push_back(plan.row == nullptr ? std::make_unique<Slot>(subject, plan.slot)
                                                      : plan.row->make(subject));
    }
    return inventory;
}

Site Inventory::site(const Site& parent, IC::Node::SensorType sensor, std::string_view name)
{
    return site(parent, sensor, name, parent.path);
}

Site Inventory::site(const Site& parent, IC::Node::SensorType sensor, std::string_view name,
                     const std::string& place, const std::string& mark)
{
    constexpr std::size_t longest = 64;
    constexpr std::string_view plain = "0123456789-._:ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz";
    Site site;
    site.sensor = sensor;
    site.path = place + '/';
    for (const char character : name.substr(0, longest)) {
        const bool isPlain = plain.find(character) != std::string_view::npos;
        site.path +=
            isPlain ? std::string(1, character) : '%' + IC::pB(static_cast<unsigned char>(character));
    }
    // Unambiguous: a # in a name has become %23.
    if (name.size() > longest)
        site.path += '#' + digest(name);
    site.path += mark;
    if (const unsigned int times = ++taken_[site.path]; times > 1)
        site.path += '#' + std::to_string(times);
    site.parent = parent.path;
    site.self = {sensor, ids_[sensor]++};
    site.above = parent.self;
    return site;
}

std::string moduleName(const std::string& location, const std::string& bank)
{
    std::string name = "dimm";
    for (const std::string& part : {bank, location})
        name += part.empty() ? "" : '-' + part;
    return name;
}

Inventory readThisMachine()
{
    return readTopology(load(nullptr).get());
}

Inventory readExport(const std::string& xml)
{
    tryFirst(xml);
    return readTopology(load(&xml).get());
}

std::string readFile(const std::string& name)
{
    constexpr std::size_t largest = 64 << 20;
    const auto failed = [] { return BadInput(std::generic_category().message(errno)); };
    // Opening a pipe waits for a writer otherwise.
    const int file = open(name.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC);
    if (file < 0)
        throw failed();
    const std::unique_ptr<const int, void (*)(const int*)> closer(&file, [](const int* it) { close(*it); });
    std::string content;
    char piece[1 << 16];
    while (content.size() <= largest) {
        pollfd ready {file, POLLIN, 0};
        const int count = poll(&ready, 1, secondsAtMost * 1000);
        if (count == 0)
            throw BadInput("nobody wrote to it for " + std::to_string(secondsAtMost) + " s");
        const ssize_t length = count < 0 ? -1 : read(file, piece, sizeof piece);
        if (length < 0 && errno != EINTR && errno != EAGAIN)
            throw failed();
        if (length == 0)
            return content;
        content.append(piece, length < 0 ? 0 : static_cast<std::size_t>(length));
    }
    throw BadInput("too large for a machine");
}

}  // namespace inventory
