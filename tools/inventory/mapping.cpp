// The table of the hwloc objects that nodes describe.
#include "mapping.h"

#include <string_view>

namespace inventory {

namespace {

using IC::Node;

constexpr int any = -1;

template <class NodeClass>
std::unique_ptr<Node> make(const Subject& subject)
{
    return std::make_unique<NodeClass>(subject);
}

// The first row that fits is used. No node describes an object without a row, or whose row has SENSOR_UNKNOWN:
// hardware threads belong to their core, and no sensor type fits bridges, DMA channels, optical and tape drives.
// clang-format off
const Row rows[] = {
    {HWLOC_OBJ_MACHINE, any, nullptr, Node::SENSOR_COMPUTER, "machine", make<Machine>},
    {HWLOC_OBJ_MACHINE, any, nullptr, Node::SENSOR_CHASSIS, "chassis", make<MachinePart>},
    {HWLOC_OBJ_MACHINE, any, nullptr, Node::SENSOR_PLANAR, "planar", make<MachinePart>},
    {HWLOC_OBJ_MACHINE, any, nullptr, Node::SENSOR_BIOS, "bios", make<MachinePart>},
    {HWLOC_OBJ_MACHINE, any, nullptr, Node::SENSOR_OS, "os", make<MachinePart>},
    {HWLOC_OBJ_GROUP, any, nullptr, Node::SENSOR_GROUP, "group", make<Processor>},
    {HWLOC_OBJ_PACKAGE, any, nullptr, Node::SENSOR_CPU, "package", make<Processor>},
    {HWLOC_OBJ_DIE, any, nullptr, Node::SENSOR_GROUP, "die", make<Processor>},
    {HWLOC_OBJ_CORE, any, nullptr, Node::SENSOR_CPU_CORE, "core", make<Core>},
    {HWLOC_OBJ_L1CACHE, any, nullptr, Node::SENSOR_CACHE, "l1", make<Cache>},
    {HWLOC_OBJ_L2CACHE, any, nullptr, Node::SENSOR_CACHE, "l2", make<Cache>},
    {HWLOC_OBJ_L3CACHE, any, nullptr, Node::SENSOR_CACHE, "l3", make<Cache>},
    {HWLOC_OBJ_L4CACHE, any, nullptr, Node::SENSOR_CACHE, "l4", make<Cache>},
    {HWLOC_OBJ_L5CACHE, any, nullptr, Node::SENSOR_CACHE, "l5", make<Cache>},
    {HWLOC_OBJ_L1ICACHE, any, nullptr, Node::SENSOR_CACHE, "l1i", make<Cache>},
    {HWLOC_OBJ_L2ICACHE, any, nullptr, Node::SENSOR_CACHE, "l2i", make<Cache>},
    {HWLOC_OBJ_L3ICACHE, any, nullptr, Node::SENSOR_CACHE, "l3i", make<Cache>},
    {HWLOC_OBJ_MEMCACHE, any, nullptr, Node::SENSOR_CACHE, "memcache", make<Cache>},
    {HWLOC_OBJ_NUMANODE, any, nullptr, Node::SENSOR_MEMORY_ARRAY, "numa", make<MemoryArray>},
    {HWLOC_OBJ_MISC, any, "MemoryModule", Node::SENSOR_DIMM, "dimm", make<MemoryModule>},
    {HWLOC_OBJ_PCI_DEVICE, any, "NVSwitch", Node::SENSOR_IO_MODULE, "switch", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x01, nullptr, Node::SENSOR_DISK_CONTROLLER, "storage", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x02, nullptr, Node::SENSOR_NETWORK_CONTROLLER, "network", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x03, nullptr, Node::SENSOR_VIDEO, "display", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x0502, nullptr, Node::SENSOR_MEMORY_DEVICE, "cxl", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x0700, nullptr, Node::SENSOR_SERIAL_PORT, "serial", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x0701, nullptr, Node::SENSOR_PARALLEL_PORT, "parallel", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x0b40, nullptr, Node::SENSOR_VIDEO, "coprocessor", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x0c03, nullptr, Node::SENSOR_USB_CONTROLLER, "usb", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x0c04, nullptr, Node::SENSOR_DISK_CONTROLLER, "storage", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x0c06, nullptr, Node::SENSOR_NETWORK_CONTROLLER, "network", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x0c07, nullptr, Node::SENSOR_IPMI, "ipmi", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x0d, nullptr, Node::SENSOR_NETWORK_CONTROLLER, "network", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x12, nullptr, Node::SENSOR_VIDEO, "coprocessor", make<PciDevice>},
    {HWLOC_OBJ_OS_DEVICE, HWLOC_OBJ_OSDEV_BLOCK, "NVM", Node::SENSOR_MEMORY_DEVICE, "nvm", make<Device>},
    {HWLOC_OBJ_OS_DEVICE, HWLOC_OBJ_OSDEV_BLOCK, "SPM", Node::SENSOR_MEMORY_DEVICE, "spm", make<Device>},
    {HWLOC_OBJ_OS_DEVICE, HWLOC_OBJ_OSDEV_BLOCK, "CXLMem", Node::SENSOR_MEMORY_DEVICE, "cxl", make<Device>},
    {HWLOC_OBJ_OS_DEVICE, HWLOC_OBJ_OSDEV_BLOCK, "fd", Node::SENSOR_FLOPPY_DRIVE, "floppy", make<Device>},
    {HWLOC_OBJ_OS_DEVICE, HWLOC_OBJ_OSDEV_BLOCK, "Removable Media Device", Node::SENSOR_UNKNOWN, "", nullptr},
    {HWLOC_OBJ_OS_DEVICE, HWLOC_OBJ_OSDEV_BLOCK, "Tape", Node::SENSOR_UNKNOWN, "", nullptr},
    {HWLOC_OBJ_OS_DEVICE, HWLOC_OBJ_OSDEV_BLOCK, "sr", Node::SENSOR_UNKNOWN, "", nullptr},
    {HWLOC_OBJ_OS_DEVICE, HWLOC_OBJ_OSDEV_BLOCK, "st", Node::SENSOR_UNKNOWN, "", nullptr},
    {HWLOC_OBJ_OS_DEVICE, HWLOC_OBJ_OSDEV_BLOCK, nullptr, Node::SENSOR_HARD_DRIVE, "disk", make<Device>},
    {HWLOC_OBJ_OS_DEVICE, HWLOC_OBJ_OSDEV_GPU, nullptr, Node::SENSOR_VIDEO, "gpu", make<Device>},
    {HWLOC_OBJ_OS_DEVICE, HWLOC_OBJ_OSDEV_COPROC, nullptr, Node::SENSOR_VIDEO, "coproc", make<Device>},
    {HWLOC_OBJ_OS_DEVICE, HWLOC_OBJ_OSDEV_NETWORK, nullptr, Node::SENSOR_NETWORK_PORT, "net", make<Device>},
    {HWLOC_OBJ_OS_DEVICE, HWLOC_OBJ_OSDEV_OPENFABRICS, nullptr, Node::SENSOR_NETWORK_CONTROLLER, "fabric", make<Device>},
};
// clang-format on

std::string_view subtypeOf(hwloc_obj_t object)
{
    return object->subtype == nullptr ? "" : object->subtype;
}

// The letters before the first digit of a block device's name: "sr" of sr0. hwloc knows the subtype only if udev runs.
std::string_view driverOf(hwloc_obj_t object)
{
    const std::string_view name = object->name == nullptr ? "" : object->name;
    const bool isBlock = object->type == HWLOC_OBJ_OS_DEVICE
        && codeOf(object->attr->osdev.type) == static_cast<unsigned int>(HWLOC_OBJ_OSDEV_BLOCK);
    const auto digit = isBlock ? name.find_first_of("0123456789") : std::string_view::npos;
    return digit == std::string_view::npos ? "" : name.substr(0, digit);
}

bool fits(const Row& row, hwloc_obj_t object)
{
    if (row.type != object->type)
        return false;
    if (row.subtype != nullptr && row.subtype != subtypeOf(object) && row.subtype != driverOf(object))
        return false;
    if (row.detail == any)
        return true;
    if (row.type == HWLOC_OBJ_OS_DEVICE)
        return static_cast<unsigned int>(row.detail) == codeOf(object->attr->osdev.type);
    const int pciClass = object->attr->pcidev.class_id;
    return row.detail == (row.detail > 0xFF ? pciClass : pciClass >> 8);
}

}  // namespace

const Row* findRow(hwloc_obj_t object, Node::SensorType part)
{
    for (const Row& row : rows)
        if (fits(row, object) && (part == Node::SENSOR_UNKNOWN || part == row.sensor))
            return row.sensor == Node::SENSOR_UNKNOWN ? nullptr : &row;
    // A PCI device of another class is what its driver makes of it.
    for (hwloc_obj_t view = object->type == HWLOC_OBJ_PCI_DEVICE ? object->io_first_child : nullptr;
         view != nullptr; view = view->next_sibling)
        if (const Row* row = isView(view) ? findRow(view) : nullptr; row != nullptr)
            for (const Row& ofDevice : rows)
                if (ofDevice.type == HWLOC_OBJ_PCI_DEVICE && ofDevice.sensor == row->sensor)
                    return &ofDevice;
    return nullptr;
}

bool isView(hwloc_obj_t object)
{
    if (object->type != HWLOC_OBJ_OS_DEVICE)
        return false;
    switch (codeOf(object->attr->osdev.type)) {
    case HWLOC_OBJ_OSDEV_BLOCK:
        return subtypeOf(object) == "CXLMem";
    case HWLOC_OBJ_OSDEV_NETWORK:
        return false;
    default:
        return true;
    }
}

}  // namespace inventory
