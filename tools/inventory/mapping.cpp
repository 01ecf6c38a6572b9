// The table of the hwloc objects that nodes describe.
#include "mapping.h"

#include <cstring>

namespace inventory {

namespace {

using IC::Node;

constexpr int any = -1;

template <class NodeClass>
std::unique_ptr<Node> make(const Site& site)
{
    return std::make_unique<NodeClass>(site);
}

// The first row that fits is used. No node describes an object without a row: hardware threads belong to their
// core, and no sensor type fits bridges and DMA channels.
// clang-format off
const Row rows[] = {
    {HWLOC_OBJ_MACHINE, any, nullptr, Node::SENSOR_COMPUTER, "machine", make<Machine>},
    {HWLOC_OBJ_MACHINE, any, nullptr, Node::SENSOR_CHASSIS, "chassis", make<MachinePart>},
    {HWLOC_OBJ_MACHINE, any, nullptr, Node::SENSOR_PLANAR, "planar", make<MachinePart>},
    {HWLOC_OBJ_MACHINE, any, nullptr, Node::SENSOR_BIOS, "bios", make<MachinePart>},
    {HWLOC_OBJ_MACHINE, any, nullptr, Node::SENSOR_OS, "os", make<MachinePart>},
    {HWLOC_OBJ_GROUP, any, nullptr, Node::SENSOR_GROUP, "group", make<Processor>},
    {HWLOC_OBJ_PACKAGE, any, nullptr, Node::SENSOR_CPU, "cpu", make<Processor>},
    {HWLOC_OBJ_DIE, any, nullptr, Node::SENSOR_GROUP, "die", make<Processor>},
    {HWLOC_OBJ_CORE, any, nullptr, Node::SENSOR_CPU_CORE, "core", make<Core>},
    {HWLOC_OBJ_L1CACHE, any, nullptr, Node::SENSOR_CACHE, "l1cache", make<Cache>},
    {HWLOC_OBJ_L2CACHE, any, nullptr, Node::SENSOR_CACHE, "l2cache", make<Cache>},
    {HWLOC_OBJ_L3CACHE, any, nullptr, Node::SENSOR_CACHE, "l3cache", make<Cache>},
    {HWLOC_OBJ_L4CACHE, any, nullptr, Node::SENSOR_CACHE, "l4cache", make<Cache>},
    {HWLOC_OBJ_L5CACHE, any, nullptr, Node::SENSOR_CACHE, "l5cache", make<Cache>},
    {HWLOC_OBJ_L1ICACHE, any, nullptr, Node::SENSOR_CACHE, "l1icache", make<Cache>},
    {HWLOC_OBJ_L2ICACHE, any, nullptr, Node::SENSOR_CACHE, "l2icache", make<Cache>},
    {HWLOC_OBJ_L3ICACHE, any, nullptr, Node::SENSOR_CACHE, "l3icache", make<Cache>},
    {HWLOC_OBJ_MEMCACHE, any, nullptr, Node::SENSOR_CACHE, "memcache", make<Cache>},
    {HWLOC_OBJ_NUMANODE, any, nullptr, Node::SENSOR_MEMORY_ARRAY, "memory", make<MemoryArray>},
    {HWLOC_OBJ_MISC, any, "MemoryModule", Node::SENSOR_DIMM, "dimm", make<MemoryModule>},
    {HWLOC_OBJ_PCI_DEVICE, any, "NVSwitch", Node::SENSOR_IO_MODULE, "switch", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x01, nullptr, Node::SENSOR_DISK_CONTROLLER, "storage", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x02, nullptr, Node::SENSOR_NETWORK_CONTROLLER, "network", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x03, nullptr, Node::SENSOR_VIDEO, "display", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x0700, nullptr, Node::SENSOR_SERIAL_PORT, "serial", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x0701, nullptr, Node::SENSOR_PARALLEL_PORT, "parallel", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x0b40, nullptr, Node::SENSOR_VIDEO, "coprocessor", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x0c03, nullptr, Node::SENSOR_USB_CONTROLLER, "usb", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x0c06, nullptr, Node::SENSOR_NETWORK_CONTROLLER, "network", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x0c07, nullptr, Node::SENSOR_IPMI, "ipmi", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x0d, nullptr, Node::SENSOR_NETWORK_CONTROLLER, "network", make<PciDevice>},
    {HWLOC_OBJ_PCI_DEVICE, 0x12, nullptr, Node::SENSOR_VIDEO, "coprocessor", make<PciDevice>},
    {HWLOC_OBJ_OS_DEVICE, HWLOC_OBJ_OSDEV_BLOCK, "NVM", Node::SENSOR_MEMORY_DEVICE, "nvm", make<Device>},
    {HWLOC_OBJ_OS_DEVICE, HWLOC_OBJ_OSDEV_BLOCK, "SPM", Node::SENSOR_MEMORY_DEVICE, "spm", make<Device>},
    {HWLOC_OBJ_OS_DEVICE, HWLOC_OBJ_OSDEV_BLOCK, nullptr, Node::SENSOR_HARD_DRIVE, "disk", make<Device>},
    {HWLOC_OBJ_OS_DEVICE, HWLOC_OBJ_OSDEV_GPU, nullptr, Node::SENSOR_VIDEO, "gpu", make<Device>},
    {HWLOC_OBJ_OS_DEVICE, HWLOC_OBJ_OSDEV_COPROC, nullptr, Node::SENSOR_VIDEO, "coproc", make<Device>},
    {HWLOC_OBJ_OS_DEVICE, HWLOC_OBJ_OSDEV_NETWORK, nullptr, Node::SENSOR_NETWORK_PORT, "net", make<Device>},
    {HWLOC_OBJ_OS_DEVICE, HWLOC_OBJ_OSDEV_OPENFABRICS, nullptr, Node::SENSOR_NETWORK_CONTROLLER, "fabric", make<Device>},
};
// clang-format on

bool fits(const Row& row, hwloc_obj_t object)
{
    if (row.type != object->type)
        return false;
    if (row.subtype != nullptr
        && (object->subtype == nullptr || std::strcmp(row.subtype, object->subtype) != 0))
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
            return &row;
    return nullptr;
}

}  // namespace inventory
