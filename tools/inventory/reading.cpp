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
#include <set>
#include <sstream>
#include <string_view>
#include <system_error>

#include "alerts.h"
#include "mapping.h"
#include "values.h"
#include "writing.h"

namespace inventory {

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

// A sanitizer reserves terabytes of addresses.
#if defined(__has_feature)
#if __has_feature(address_sanitizer) || __has_feature(thread_sanitizer) || __has_feature(memory_sanitizer)
#define INVENTORY_SANITIZED
#endif
#endif
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
#define INVENTORY_SANITIZED
#endif

void limit(decltype(RLIMIT_AS) resource, rlim_t most)
{
    rlimit limits {};
    getrlimit(resource, &limits);
    limits.rlim_cur = std::min(limits.rlim_cur, most);
    setrlimit(resource, &limits);
}

Inventory readFrom(const Topology& topology);

// In the child process. The status tells whether the memory was enough.
enum Trial : unsigned char { TRIAL_DONE, TRIAL_REFUSED, TRIAL_NO_MEMORY };
[[noreturn]] void describeForTrial(const std::string& xml)
{
    limit(RLIMIT_CORE, 0);
    limit(RLIMIT_CPU, secondsAtMost);
#ifndef INVENTORY_SANITIZED
    limit(RLIMIT_AS, bytesAtMost);
#endif
    dup2(open("/dev/null", O_WRONLY), STDERR_FILENO);
    std::signal(SIGALRM, SIG_DFL);
    alarm(secondsAtMost);
    try {
        const Inventory inventory = readFrom(load(&xml));
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

class Reader {
public:
    Reader(hwloc_topology_t topology, Inventory& inventory) : topology_(topology), inventory_(inventory) { }

    void read(hwloc_obj_t object, Site parent)
    {
        const char* slot = hwloc_obj_get_info_by_name(object, "PCISlot");
        if (slot != nullptr && (object->type == HWLOC_OBJ_PCI_DEVICE || object->type == HWLOC_OBJ_BRIDGE))
            parent = slotOf(parent, slot);
        if (const Row* row = findRow(object); row != nullptr)
            parent = add(*row, object, parent, nameOf(object, *row, parent));
        if (object->type == HWLOC_OBJ_MACHINE)
            inventory_.machine = parent;
        for (unsigned int i = 0; object->type == HWLOC_OBJ_MACHINE && i < object->infos_count; ++i)
            readPart(object, factOf(object->infos[i]).part, object->infos[i].value);
        // Not hwloc_get_next_child: in hwloc 2.9 it begins again after a memory-side cache.
        for (hwloc_obj_t first : {object->first_child, object->memory_first_child, object->io_first_child,
                                  object->misc_first_child})
            for (hwloc_obj_t child = first; child != nullptr; child = child->next_sibling)
                read(child, parent);
    }

private:
    Site add(const Row& row, hwloc_obj_t object, const Site& parent, const std::string& name)
    {
        Site site = inventory_.site(parent, row.sensor, name);
        site.topology = topology_;
        site.object = object;
        inventory_.nodes.push_back(row.make(site));
        return site;
    }

    // A name that is the same in each reading if there is one: of a device or of a memory module's location. Other
    // objects are numbered.
    std::string nameOf(hwloc_obj_t object, const Row& row, const Site& parent)
    {
        if (object->type == HWLOC_OBJ_MACHINE)
            return row.word;
        if (object->type == HWLOC_OBJ_PCI_DEVICE)
            return row.word + ('-' + pciAddress(object));
        if (object->type == HWLOC_OBJ_OS_DEVICE && object->name != nullptr && *object->name != '\0')
            return object->name;
        const char* location = hwloc_obj_get_info_by_name(object, "DeviceLocation");
        if (location != nullptr && !told(location).empty())
            return row.word + ('-' + told(location));
        return row.word + std::to_string(numbers_[parent.path + '/' + row.word]++);
    }

    // One node for a slot, however many functions its card has.
    Site slotOf(const Site& parent, const std::string& name)
    {
        const auto [found, isNew] = slots_.try_emplace({parent.path, name});
        if (isNew) {
            found->second = inventory_.site(parent, IC::Node::SENSOR_SLOT, "slot-" + told(name));
            inventory_.nodes.push_back(std::make_unique<Slot>(found->second, name));
        }
        return found->second;
    }

    // Adds a node for a part of the machine at the first fact about it that is not empty.
    void readPart(hwloc_obj_t machine, IC::Node::SensorType part, const std::string& text)
    {
        const Row* row = findRow(machine, part);
        if (part != IC::Node::SENSOR_COMPUTER && !told(text).empty() && parts_.insert(part).second)
            add(*row, machine, inventory_.machine, row->word);
    }

    hwloc_topology_t topology_;
    Inventory& inventory_;
    std::map<std::string, unsigned int> numbers_;
    std::map<std::pair<std::string, std::string>, Site> slots_;
    std::set<IC::Node::SensorType> parts_;
};

Inventory readFrom(const Topology& topology)
{
    Inventory inventory;
    Reader(topology.get(), inventory).read(hwloc_get_root_obj(topology.get()), Site());
    return inventory;
}

}  // namespace

Site Inventory::site(const Site& parent, IC::Node::SensorType sensor, std::string_view name)
{
    constexpr std::size_t longest = 64;
    constexpr std::string_view plain = "0123456789-._:ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz";
    Site site;
    site.sensor = sensor;
    site.path = parent.path + '/';
    for (const char character : name.substr(0, longest)) {
        const bool isPlain = plain.find(character) != std::string_view::npos;
        site.path +=
            isPlain ? std::string(1, character) : '%' + IC::pB(static_cast<unsigned char>(character));
    }
    if (const unsigned int times = ++taken_[site.path]; times > 1)
        site.path += '#' + std::to_string(times);  // unambiguous: a # in a name has become %23
    site.parent = parent.path;
    site.self = {sensor, ids_[sensor]++};
    site.above = parent.self;
    return site;
}

Inventory readThisMachine()
{
    return readFrom(load(nullptr));
}

Inventory readExport(const std::string& xml)
{
    tryFirst(xml);
    return readFrom(load(&xml));
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
