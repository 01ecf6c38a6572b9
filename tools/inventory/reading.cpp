// Loads a machine with hwloc and makes nodes of its objects.
#include "reading.h"

#include <fcntl.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <set>
#include <string_view>
#include <system_error>

#include "mapping.h"
#include "values.h"

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

// Some damaged exports crash hwloc or make it loop for ever. So a child process loads each export first; if the child
// fails, this process does not load the export.
bool survives(const std::string& xml)
{
    constexpr unsigned int secondsAtMost = 60;
    const pid_t child = fork();
    if (child < 0)
        return true;  // not tested: no process is available
    if (child == 0) {
        const rlimit noCore {0, 0};
        setrlimit(RLIMIT_CORE, &noCore);
        dup2(open("/dev/null", O_WRONLY), STDERR_FILENO);
        alarm(secondsAtMost);
        try {
            load(&xml);
            _exit(0);
        } catch (...) {
            _exit(1);
        }
    }
    int status = 0;
    while (waitpid(child, &status, 0) < 0 && errno == EINTR) { }
    return status == 0;
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
        for (hwloc_obj_t child = nullptr;
             (child = hwloc_get_next_child(topology_, object, child)) != nullptr;)
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
    if (!survives(xml))
        throw unreadable();
    return readFrom(load(&xml));
}

std::string readFile(const std::string& name)
{
    constexpr std::size_t largest = 64 << 20;
    errno = 0;
    // Not decltype(&std::fclose): g++ 14 warns that a template argument drops the function's attributes.
    const std::unique_ptr<std::FILE, int (*)(std::FILE*)> file(std::fopen(name.c_str(), "rb"), std::fclose);
    std::string content;
    char piece[4096];
    for (std::size_t length = 1; file && length != 0 && content.size() <= largest;
         content.append(piece, length))
        length = std::fread(piece, 1, sizeof piece, file.get());
    if (!file || std::ferror(file.get()) != 0)
        throw BadInput(std::generic_category().message(errno));
    if (content.size() > largest)
        throw BadInput("too large for a machine");
    return content;
}

}  // namespace inventory
