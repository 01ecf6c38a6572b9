// Fills each node class from its hwloc object, and names the properties.
#include "nodes.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <iterator>
#include <new>
#include <set>

#include "mapping.h"
#include "values.h"

namespace inventory {

namespace {

// clang-format off
constexpr KeyInfo keys[] = {
    {KEY_SELF, "self", "noderef", "this node", ""},
    {KEY_PARENT, "parent", "noderef", "parent node", ""},
    {KEY_NAME, "name", "string", "name", ""},
    {KEY_LABEL, "label", "string", "label (the operator's own)", ""},
    {KEY_INDEX, "index", "uint32", "number given by the system", ""},
    {KEY_USABLE, "usable", "bool", "the system may use it", ""},
    {KEY_SUBTYPE, "subtype", "string", "subtype", ""},
    {KEY_OTHER_FACTS, "otherFacts", "strings", "other facts", ""},
    {KEY_READ_AT, "readAt", "datetime", "read at", ""},
    {KEY_SOURCE_VERSION, "sourceVersion", "version", "version of the source", ""},
    {KEY_MAKER, "maker", "string", "maker", ""},
    {KEY_MODEL, "model", "string", "model", ""},
    {KEY_REVISION, "revision", "string", "revision", ""},
    {KEY_VERSION, "version", "version", "version", ""},
    {KEY_RELEASED, "released", "datetime", "released", ""},
    {KEY_SERIAL_NUMBER, "serialNumber", "string", "serial number", ""},
    {KEY_ASSET_TAG, "assetTag", "string", "asset tag", ""},
    {KEY_PART_NUMBER, "partNumber", "string", "part number", ""},
    {KEY_UUID, "uuid", "string", "UUID", ""},
    {KEY_LOCATION, "location", "string", "location", ""},
    {KEY_CHASSIS_TYPE, "chassisType", "enum", "chassis type", ""},
    {KEY_CPUS, "cpus", "uint32", "CPUs", ""},
    {KEY_CORES, "cores", "uint32", "cores", ""},
    {KEY_THREADS, "threads", "uint32", "hardware threads", ""},
    {KEY_CPU_SET, "cpuSet", "numbers", "numbers of the hardware threads", ""},
    {KEY_FREQUENCY, "maximumFrequency", "real", "maximum frequency", "MHz"},
    {KEY_CAPACITY, "capacity", "uint32", "capacity (1024: fastest core)", ""},
    {KEY_SIZE, "size", "uint64", "size", "bytes"},
    {KEY_LEVEL, "level", "uint32", "level", ""},
    {KEY_CACHE_KIND, "cacheKind", "enum", "cache kind", ""},
    {KEY_LINE_SIZE, "lineSize", "uint32", "line size", "bytes"},
    {KEY_WAYS, "ways", "int", "ways (-1: fully associative)", ""},
    {KEY_INCLUSIVE, "inclusive", "bool", "inclusive", ""},
    {KEY_PAGE_SIZES, "pageSizes", "numbers", "page sizes", "bytes"},
    {KEY_PAGE_COUNTS, "pageCounts", "numbers", "numbers of pages", ""},
    {KEY_PCI_ADDRESS, "pciAddress", "string", "PCI address", ""},
    {KEY_PCI_CLASS, "pciClass", "enum", "PCI class", ""},
    {KEY_PCI_DEVICE, "pciDevice", "string", "PCI maker and device", ""},
    {KEY_LINK_SPEED, "linkSpeed", "real", "link speed", "GB/s"},
    {KEY_SECTOR_SIZE, "sectorSize", "uint32", "sector size", "bytes"},
    {KEY_DEVICE_NUMBER, "deviceNumber", "string", "device number", ""},
    {KEY_ADDRESS, "address", "bytes", "address", ""},
    {KEY_PORT, "port", "uint32", "port", ""},
    {KEY_PORT_STATE, "portState", "enum", "port state", ""},
    {KEY_PORT_LID, "portLid", "uint32", "port local id", ""},
    {KEY_PORT_GID, "portGid", "bytes", "port global id", ""},
    {KEY_NODE_GUID, "nodeGuid", "bytes", "node GUID", ""},
    {KEY_READING, "reading", "real", "reading", ""},
    {KEY_UNIT, "unit", "string", "unit", ""},
    {KEY_LOWER_LIMIT, "lowerLimit", "real", "lower limit", ""},
    {KEY_LOWER_CRITICAL, "lowerCritical", "real", "lower critical limit", ""},
    {KEY_UPPER_LIMIT, "upperLimit", "real", "upper limit", ""},
    {KEY_UPPER_CRITICAL, "upperCritical", "real", "upper critical limit", ""},
    {KEY_ALARM, "alarm", "bool", "alarm", ""},
    {KEY_FAULT, "fault", "bool", "fault", ""},
    {KEY_CHIP, "chip", "string", "chip", ""},
    {KEY_HOST_NAME, "hostName", "string", "host name", ""},
    {KEY_VIEWS, "views", "strings", "names in the system", ""},
    {KEY_UNUSABLE_THREADS, "unusableThreads", "uint32", "unusable hardware threads", ""},
    {KEY_UNUSABLE_CORES, "unusableCores", "uint32", "unusable cores", ""},
    {KEY_UNUSABLE_CPUS, "unusableCpus", "uint32", "unusable CPUs", ""},
    {KEY_UNUSABLE_MEMORY_ARRAYS, "unusableMemoryArrays", "uint32", "unusable memory arrays", ""},
    {KEY_CPU_MAKER, "cpuMaker", "string", "maker of the processors", ""},
    {KEY_CPU_MODEL, "cpuModel", "string", "model of the processors", ""},
    {KEY_AVERAGE, "average", "real", "average", ""},
    {KEY_LOWEST, "lowest", "real", "lowest reading", ""},
    {KEY_HIGHEST, "highest", "real", "highest reading", ""},
    {KEY_AVERAGE_LOWEST, "averageLowest", "real", "lowest average", ""},
    {KEY_AVERAGE_HIGHEST, "averageHighest", "real", "highest average", ""},
    {KEY_AVERAGE_INTERVAL, "averageInterval", "real", "time of the average", "s"},
    {KEY_EMERGENCY_LIMIT, "emergencyLimit", "real", "emergency limit", ""},
    {KEY_CAP, "cap", "real", "cap", ""},
    {KEY_RATED_MINIMUM, "ratedMinimum", "real", "rated minimum", ""},
    {KEY_RATED_MAXIMUM, "ratedMaximum", "real", "rated maximum", ""},
    {KEY_LOWER_LIMIT_HYSTERESIS, "minHysteresis", "real", "lower limit, hysteresis", ""},
    {KEY_LOWER_CRITICAL_HYSTERESIS, "lcritHysteresis", "real", "lower critical, hysteresis", ""},
    {KEY_UPPER_LIMIT_HYSTERESIS, "maxHysteresis", "real", "upper limit, hysteresis", ""},
    {KEY_UPPER_CRITICAL_HYSTERESIS, "critHysteresis", "real", "upper critical, hysteresis", ""},
    {KEY_EMERGENCY_HYSTERESIS, "emergencyHysteresis", "real", "emergency limit, hysteresis", ""},
    {KEY_CAP_HYSTERESIS, "capHysteresis", "real", "cap, hysteresis", ""},
    {KEY_MIN_ALARM, "minAlarm", "bool", "lower alarm", ""},
    {KEY_LCRIT_ALARM, "lcritAlarm", "bool", "lower critical alarm", ""},
    {KEY_MAX_ALARM, "maxAlarm", "bool", "upper alarm", ""},
    {KEY_CRIT_ALARM, "critAlarm", "bool", "upper critical alarm", ""},
    {KEY_EMERGENCY_ALARM, "emergencyAlarm", "bool", "emergency alarm", ""},
    {KEY_CAP_ALARM, "capAlarm", "bool", "cap alarm", ""},
    {KEY_BEEP, "beep", "bool", "an alarm beeps", ""},
    {KEY_OFFSET, "offset", "real", "offset", ""},
    {KEY_SENSOR_KIND, "sensorKind", "enum", "kind of temperature sensor", ""},
    {KEY_FAN_DIVISOR, "fanDivisor", "real", "divisor of the fan", ""},
    {KEY_FAN_PULSES, "fanPulses", "real", "pulses a turn of the fan", ""},
    {KEY_BANK, "bank", "string", "bank", ""},
    {KEY_MEMORY_TYPE, "memoryType", "string", "memory type", ""},
    {KEY_MEMORY_DETAIL, "memoryDetail", "string", "detail of the memory type", ""},
    {KEY_FORM_FACTOR, "formFactor", "string", "form factor", ""},
    {KEY_SPEED, "speed", "uint32", "speed", "MT/s"},
    {KEY_CONFIGURED_SPEED, "configuredSpeed", "uint32", "configured speed", "MT/s"},
    {KEY_RANK, "rank", "uint32", "rank", ""},
    {KEY_DATA_WIDTH, "dataWidth", "uint32", "data width", "bits"},
    {KEY_TOTAL_WIDTH, "totalWidth", "uint32", "total width", "bits"},
    {KEY_CONFIGURED_VOLTAGE, "configuredVoltage", "real", "configured voltage", "V"},
    {KEY_SYSTEM_MEMORY, "systemMemory", "uint64", "memory that the system has", "bytes"},
    {KEY_MEMORY_SLOTS, "memorySlots", "uint32", "memory slots", ""},
    {KEY_ERROR_CORRECTION, "errorCorrection", "string", "error correction of the memory", ""},
};
// clang-format on

constexpr bool areInOrder()
{
    unsigned int key = 0;
    for (const KeyInfo& info : keys)
        if (info.key != ++key)
            return false;
    return key == KEY_LAST;
}
static_assert(areInOrder());

constexpr const char* cacheKinds[] = {"unified", "data", "instructions"};
constexpr const char* portStates[] = {"no change", "down",   "initialized",
                                      "armed",     "active", "active, deferred"};
// As DMI counts.
constexpr const char* chassisTypes[] = {"",
                                        "other",
                                        "unknown",
                                        "desktop",
                                        "low-profile desktop",
                                        "pizza box",
                                        "mini tower",
                                        "tower",
                                        "portable",
                                        "laptop",
                                        "notebook",
                                        "hand-held",
                                        "docking station",
                                        "all in one",
                                        "sub-notebook",
                                        "space-saving",
                                        "lunch box",
                                        "main server chassis",
                                        "expansion chassis",
                                        "sub-chassis",
                                        "bus expansion chassis",
                                        "peripheral chassis",
                                        "RAID chassis",
                                        "rack mount chassis",
                                        "sealed-case PC",
                                        "multi-system chassis",
                                        "compact PCI",
                                        "advanced TCA",
                                        "blade",
                                        "blade enclosure",
                                        "tablet",
                                        "convertible",
                                        "detachable",
                                        "IoT gateway",
                                        "embedded PC",
                                        "mini PC",
                                        "stick PC"};

template <std::size_t size>
std::string entry(const char* const (&names)[size], unsigned int code)
{
    return code < size ? names[code] : "";
}

// As hwloc names it.
std::string nameOfPciClass(unsigned int code)
{
    hwloc_obj_attr_u attributes {};
    attributes.pcidev.class_id = static_cast<unsigned short>(code);
    hwloc_obj device {};
    device.type = HWLOC_OBJ_PCI_DEVICE;
    device.attr = &attributes;
    char text[128] = "";  // "busid=0000:00:00.0 id=0000:0000 class=0302(3D)"
    hwloc_obj_attr_snprintf(text, sizeof text, &device, " ", 1);
    const std::string words = text;
    const auto begin = words.find('(');
    const auto end = words.find(')', begin);
    return code > 0xFFFF || begin == std::string::npos || end == std::string::npos
        ? ""
        : words.substr(begin + 1, end - begin - 1);
}

// The text of the property of the first node that has it.
std::string firstOf(const Nodes& nodes, unsigned int key)
{
    for (const auto& node : nodes) {
        const auto properties = node->getProperties();
        if (const auto found = properties.find(key); found != properties.end())
            return std::string(found->second);
    }
    return "";
}

// IC::Number takes unsigned long long; on some machines hwloc's 64-bit type is another type.
IC::Number number64(hwloc_uint64_t number)
{
    return ZQ::Uint64 {number};
}

IC::Number number32(int number)
{
    return static_cast<ZQ::Uint32>(std::max(number, 0));
}

std::vector<hwloc_obj_t> objectsOf(hwloc_topology_t topology, hwloc_obj_type_t type)
{
    std::vector<hwloc_obj_t> objects;
    for (hwloc_obj_t object = nullptr;
         (object = hwloc_get_next_obj_by_type(topology, type, object)) != nullptr;)
        objects.push_back(object);
    return objects;
}

ZQ::Uint32 weightOf(hwloc_const_bitmap_t set)
{
    return static_cast<ZQ::Uint32>(std::max(hwloc_bitmap_weight(set), 0));
}

using Bitmap = std::unique_ptr<hwloc_bitmap_s, decltype(&hwloc_bitmap_free)>;

Bitmap copyOf(hwloc_const_bitmap_t set)
{
    Bitmap copy(set == nullptr ? hwloc_bitmap_alloc() : hwloc_bitmap_dup(set), hwloc_bitmap_free);
    if (!copy)
        throw std::bad_alloc();
    return copy;
}

// What is there, but not both in the tree and allowed. A null set is empty.
Bitmap unusableOf(hwloc_const_bitmap_t there, hwloc_const_bitmap_t inTree, hwloc_const_bitmap_t allowed)
{
    Bitmap unusable = copyOf(inTree);
    hwloc_bitmap_and(unusable.get(), unusable.get(), allowed);
    hwloc_bitmap_andnot(unusable.get(), copyOf(there).get(), unusable.get());
    return unusable;
}

// What a package or the machine has and the system may not use, in the tree of objects or not.
struct Unusable {
    ZQ::Uint32 threads = 0;
    ZQ::Uint32 cores = 0;
    ZQ::Uint32 cpus = 0;
    ZQ::Uint32 memoryArrays = 0;
    bool elsewhere = false;  // threads outside the packages, or memory arrays that are not in the tree
};

Unusable countUnusable(const Subject& subject)
{
    const hwloc_obj* const object = subject.object;
    hwloc_topology* const topology = subject.topology;
    Unusable count;
    const Bitmap threads =
        unusableOf(object->complete_cpuset, object->cpuset, hwloc_topology_get_allowed_cpuset(topology));
    count.threads = weightOf(threads.get());

    // Threads of cores that are not in the tree are taken for cores with as many threads as the largest core.
    const Bitmap gone = copyOf(threads.get());
    ZQ::Uint32 largest = 0;
    for (hwloc_obj_t core : objectsOf(topology, HWLOC_OBJ_CORE)) {
        largest = std::max(largest, weightOf(core->complete_cpuset));
        count.cores += hwloc_bitmap_isincluded(core->complete_cpuset, threads.get()) != 0 ? 1 : 0;
        hwloc_bitmap_andnot(gone.get(), gone.get(), core->complete_cpuset);
    }
    if (largest != 0)
        count.cores += (weightOf(gone.get()) + largest - 1) / largest;

    const Bitmap outside = copyOf(threads.get());
    for (hwloc_obj_t package : objectsOf(topology, HWLOC_OBJ_PACKAGE)) {
        count.cpus += hwloc_bitmap_isincluded(package->complete_cpuset, threads.get()) != 0 ? 1 : 0;
        hwloc_bitmap_andnot(outside.get(), outside.get(), package->complete_cpuset);
    }
    const Bitmap memory =
        unusableOf(object->complete_nodeset, object->nodeset, hwloc_topology_get_allowed_nodeset(topology));
    count.memoryArrays = weightOf(memory.get());
    for (hwloc_obj_t array : objectsOf(topology, HWLOC_OBJ_NUMANODE))
        hwloc_bitmap_andnot(memory.get(), memory.get(), array->complete_nodeset);
    count.elsewhere = hwloc_bitmap_iszero(outside.get()) == 0 || hwloc_bitmap_iszero(memory.get()) == 0;
    return count;
}

IC::Number now()
{
    // In whole seconds, for a short text.
    return {static_cast<long>(ZQ::DateTime::now()), 0};
}

}  // namespace

const KeyInfo* infoOf(unsigned int key)
{
    return key >= 1 && key <= KEY_LAST ? &keys[key - 1] : nullptr;
}

std::string nameOf(unsigned int key)
{
    const KeyInfo* info = infoOf(key);
    if (info == nullptr)
        return "";
    return *info->unit == '\0' ? info->caption : std::string(info->caption) + " in " + info->unit;
}

std::string identifierOf(unsigned int key)
{
    const KeyInfo* info = infoOf(key);
    return info == nullptr ? "property" + std::to_string(key) : info->identifier;
}

std::string nameOfCode(unsigned int key, unsigned int code)
{
    switch (key) {
    case KEY_CACHE_KIND:
        return entry(cacheKinds, code);
    case KEY_PORT_STATE:
        return entry(portStates, code);
    case KEY_CHASSIS_TYPE:
        return entry(chassisTypes, code);
    case KEY_PCI_CLASS:
        return nameOfPciClass(code);
    default:
        return "";
    }
}

std::string hostOf(const Nodes& nodes)
{
    return firstOf(nodes, KEY_HOST_NAME);
}

std::string timeOf(const Nodes& nodes)
{
    return firstOf(nodes, KEY_READ_AT);
}

Component::Component(const Site& site) : Node(site.sensor)
{
    path = site.path;
    parent = site.parent;
    put(KEY_SELF, IC::Number(site.self));
    if (!parent.empty())
        put(KEY_PARENT, IC::Number(site.above));
    put(KEY_LABEL, std::string(), false);  // for the operator to write
}

Component::Component(const Subject& subject) : Component(static_cast<const Site&>(subject))
{
    hwloc_obj* const object = subject.object;
    const bool ofMachine = object->type == HWLOC_OBJ_MACHINE;
    // A driver knows its device better than the bus does: its facts come first.
    if (object->type == HWLOC_OBJ_PCI_DEVICE)
        addViews(subject);
    addFacts(object, ofMachine);
    if (ofMachine && subject.sensor != SENSOR_COMPUTER)
        return;  // the rest is about the machine, not about a part of it
    if (object->type != HWLOC_OBJ_PCI_DEVICE)
        addViews(subject);
    if (object->name != nullptr)
        put(KEY_NAME, std::string(object->name));
    if (object->os_index != HWLOC_UNKNOWN_INDEX)
        put(KEY_INDEX, IC::Number(object->os_index));
    addThreads(subject);
}

void Component::addViews(const Subject& subject)
{
    std::vector<hwloc_obj_t> all = subject.views;
    if (subject.object->type == HWLOC_OBJ_OS_DEVICE)
        all.insert(all.begin(), subject.object);
    std::set<std::string> names;
    ZQ::Uint64 memory = 0;
    for (hwloc_obj_t view : all) {
        if (view->name != nullptr && *view->name != '\0')
            names.insert(view->name);
        if (view != subject.object)
            addFacts(view);
        for (const char* name : {"CXLRAMSize", "CXLPMEMSize"})
            if (const char* text = hwloc_obj_get_info_by_name(view, name); text != nullptr)
                memory += sizeInBytes(text).value_or(0);
    }
    if (memory != 0 && properties.count(KEY_SIZE) == 0)
        put(KEY_SIZE, IC::Number(memory));
    if (!subject.views.empty())
        put(KEY_VIEWS, IC::StringArray(names.begin(), names.end()));
}

void Component::addThreads(const Subject& subject)
{
    const hwloc_obj* const object = subject.object;
    const bool isMemory = hwloc_obj_type_is_memory(object->type) != 0;
    const auto* const all = isMemory ? object->complete_nodeset : object->complete_cpuset;
    if (all != nullptr && hwloc_bitmap_iszero(all) == 0) {
        const auto* const allowed = isMemory ? hwloc_topology_get_allowed_nodeset(subject.topology)
                                             : hwloc_topology_get_allowed_cpuset(subject.topology);
        const bool usable = hwloc_bitmap_intersects(all, allowed) != 0;
        put(KEY_USABLE, IC::Number(usable));
        become(usable ? STATUS_FINE : STATUS_NOT_USABLE);
    }
    const int weight = object->cpuset == nullptr ? -1 : hwloc_bitmap_weight(object->cpuset);
    if (weight < 0)
        return;  // no set, or a set without end, which no machine has
    IC::NumberArray threads;
    for (int thread = -1; (thread = hwloc_bitmap_next(object->cpuset, thread)) != -1;)
        threads.push_back(number32(thread));
    put(KEY_THREADS, number32(weight));
    put(KEY_CPU_SET, threads);
}

void Component::addFacts(hwloc_obj_t object, bool ofMachine)
{
    addFacts(object->infos, object->infos_count, ofMachine);
    if (object->subtype == nullptr || (ofMachine && getSensor() != SENSOR_COMPUTER))
        return;
    const auto [subtype, isNew] =
        properties.insert({KEY_SUBTYPE, IC::PropertyValue(std::string(object->subtype), true)});
    if (!isNew && std::string(subtype->second) != object->subtype)
        addOther(std::string("subtype=") + object->subtype);
}

void Component::addOther(const std::string& fact)
{
    IC::StringArray others;
    if (const auto found = properties.find(KEY_OTHER_FACTS); found != properties.end())
        others = found->second;
    others.push_back(fact);
    put(KEY_OTHER_FACTS, others);
}

void Component::addFacts(const hwloc_info_s* facts, unsigned int number, bool ofMachine)
{
    IC::StringArray others;
    if (const auto found = properties.find(KEY_OTHER_FACTS); found != properties.end())
        others = found->second;
    for (unsigned int i = 0; i < number; ++i) {
        Fact fact = factOf(facts[i]);
        if (fact.key == KEY_NONE || (ofMachine && fact.part != getSensor()))
            continue;
        if (ofMachine && fact.ofProcessor)  // of the processors of a machine without packages
            fact.key = fact.key == KEY_MAKER ? KEY_CPU_MAKER
                : fact.key == KEY_MODEL      ? KEY_CPU_MODEL
                                             : KEY_OTHER_FACTS;
        // A fact that says something else than one before is one of the others.
        if (fact.key != KEY_OTHER_FACTS) {
            const auto [known, isNew] = properties.insert({fact.key, fact.value});
            if (isNew || std::string(known->second) == std::string(fact.value))
                continue;
        }
        others.push_back(std::string(facts[i].name) + '=' + facts[i].value);
    }
    if (!others.empty())
        put(KEY_OTHER_FACTS, others);
}

std::string Component::words(Key key) const
{
    const auto found = properties.find(key);
    return found == properties.end() ? "" : told(std::string(found->second));
}

void Component::describe(const std::vector<std::string>& pieces)
{
    for (const std::string& piece : pieces)
        if (!piece.empty())
            description += (description.empty() ? "" : ", ") + piece;
}

std::string Component::product() const
{
    const std::string maker = words(KEY_MAKER);
    const std::string model = words(KEY_MODEL);
    // Some models begin with the maker's name.
    return maker.empty() || model.compare(0, maker.size(), maker) == 0 ? model : told(maker + ' ' + model);
}

std::string Component::size() const
{
    const auto found = properties.find(KEY_SIZE);
    const ZQ::Uint64 bytes = found == properties.end() ? 0 : found->second.operator ZQ::Uint64();
    return bytes == 0 ? "" : sizeInWords(bytes);
}

Machine::Machine(const Subject& subject) : Component(subject)
{
    put(KEY_READ_AT, now());
    put(KEY_SIZE, number64(subject.object->total_memory));
    put(KEY_CPUS, number32(hwloc_get_nbobjs_by_type(subject.topology, HWLOC_OBJ_PACKAGE)));
    put(KEY_CORES, number32(hwloc_get_nbobjs_by_type(subject.topology, HWLOC_OBJ_CORE)));
    const Unusable unusable = countUnusable(subject);
    put(KEY_UNUSABLE_THREADS, IC::Number(unusable.threads));
    put(KEY_UNUSABLE_CORES, IC::Number(unusable.cores));
    put(KEY_UNUSABLE_CPUS, IC::Number(unusable.cpus));
    put(KEY_UNUSABLE_MEMORY_ARRAYS, IC::Number(unusable.memoryArrays));
    // What a CPU or a memory array lacks is its own trouble.
    if (unusable.elsewhere)
        become(STATUS_PARTLY_USABLE);
    conclude();
}

void Machine::learn(const Facts& facts)
{
    const Lock lock(mutex);
    properties.insert(facts.begin(), facts.end());
    conclude();
}

void Machine::conclude()
{
    description.clear();
    const std::string nodes = size();
    const auto ofSystem = properties.find(KEY_SYSTEM_MEMORY);
    const std::string system =
        ofSystem == properties.end() ? "" : sizeInWords(ofSystem->second.operator ZQ::Uint64());
    describe({product(), "CPUs: " + words(KEY_CPUS), "cores: " + words(KEY_CORES),
              nodes.empty() ? "" : "memory: " + nodes,
              system.empty() ? "" : "memory of the system: " + system});
}

MachinePart::MachinePart(const Subject& subject) : Component(subject)
{
    if (const auto number = version(words(KEY_REVISION)))
        put(KEY_VERSION, IC::Number(*number));
    describe({told(product() + ' ' + words(KEY_REVISION)), words(KEY_RELEASED).substr(0, 10)});  // the day
}

Processor::Processor(const Subject& subject) : Component(subject)
{
    put(KEY_CORES,
        number32(hwloc_get_nbobjs_inside_cpuset_by_type(subject.topology, subject.object->cpuset,
                                                        HWLOC_OBJ_CORE)));
    if (subject.object->type == HWLOC_OBJ_PACKAGE) {
        const Unusable unusable = countUnusable(subject);
        put(KEY_UNUSABLE_THREADS, IC::Number(unusable.threads));
        put(KEY_UNUSABLE_CORES, IC::Number(unusable.cores));
        if (unusable.threads != 0 && status == STATUS_INITIAL)
            become(STATUS_PARTLY_USABLE);
    }
    describe({words(KEY_MODEL), "cores: " + words(KEY_CORES)});
}

Core::Core(const Subject& subject) : Component(subject)
{
    // The facts that all cores of this kind share.
    hwloc_info_s* facts = nullptr;
    unsigned int number = 0;
    const int kind = hwloc_cpukinds_get_by_cpuset(subject.topology, subject.object->cpuset, 0);
    if (kind >= 0)
        hwloc_cpukinds_get_info(subject.topology, static_cast<unsigned int>(kind), nullptr, nullptr, &number,
                                &facts, 0);
    addFacts(facts, number);
    const auto* const allowed = hwloc_topology_get_allowed_cpuset(subject.topology);
    if (status == STATUS_INITIAL && hwloc_bitmap_isincluded(subject.object->complete_cpuset, allowed) == 0)
        become(STATUS_PARTLY_USABLE);
    const std::string frequency = words(KEY_FREQUENCY);
    describe({words(KEY_INDEX).empty() ? "" : "number " + words(KEY_INDEX), "threads: " + words(KEY_THREADS),
              frequency.empty() ? "" : frequency + " MHz"});
}

Cache::Cache(const Subject& subject) : Component(subject)
{
    const auto& cache = subject.object->attr->cache;
    const unsigned int kind = codeOf(cache.type);
    put(KEY_SIZE, number64(cache.size));
    put(KEY_LEVEL, IC::Number(cache.depth));
    put(KEY_CACHE_KIND, IC::EnumValue(kind));
    put(KEY_LINE_SIZE, IC::Number(cache.linesize));
    put(KEY_WAYS, IC::Number(cache.associativity));
    describe({size(),
              kind == HWLOC_OBJ_CACHE_DATA              ? "data"
                  : kind == HWLOC_OBJ_CACHE_INSTRUCTION ? "instructions"
                                                        : ""});
}

MemoryArray::MemoryArray(const Subject& subject) : Component(subject)
{
    const auto& memory = subject.object->attr->numanode;
    IC::NumberArray sizes;
    IC::NumberArray counts;
    for (unsigned int i = 0; i < memory.page_types_len; ++i) {
        sizes.push_back(number64(memory.page_types[i].size));
        counts.push_back(number64(memory.page_types[i].count));
    }
    put(KEY_SIZE, number64(memory.local_memory));
    put(KEY_PAGE_SIZES, sizes);
    put(KEY_PAGE_COUNTS, counts);
    describe({size()});
}

MemoryModule::MemoryModule(const Subject& subject) : Component(subject)
{
    conclude(true);
}

MemoryModule::MemoryModule(const Site& site, const Facts& facts) : Component(site)
{
    learn(facts, true);
}

void MemoryModule::learn(const Facts& facts, bool isPresent)
{
    const Lock lock(mutex);
    properties.insert(facts.begin(), facts.end());
    conclude(isPresent);
}

bool MemoryModule::isModule(const Facts& facts)
{
    constexpr Key signs[] = {KEY_MAKER, KEY_SERIAL_NUMBER, KEY_PART_NUMBER, KEY_MEMORY_TYPE, KEY_SPEED};
    return std::any_of(std::begin(signs), std::end(signs),
                       [&facts](Key key) { return facts.count(key) != 0; });
}

void MemoryModule::conclude(bool isPresent)
{
    become(isPresent && size().empty() && isModule(properties) ? STATUS_SIZE_UNKNOWN : STATUS_FINE);
    const std::string speed = words(KEY_SPEED);
    description.clear();
    describe({product(), words(KEY_PART_NUMBER), size(), words(KEY_MEMORY_TYPE),
              speed.empty() ? "" : speed + " MT/s"});
}

PciDevice::PciDevice(const Subject& subject) : Component(subject)
{
    const auto& device = subject.object->attr->pcidev;
    char ids[16];
    std::snprintf(ids, sizeof ids, "%04hx:%04hx", device.vendor_id, device.device_id);
    const double speed = device.linkspeed;
    put(KEY_PCI_ADDRESS, pciAddress(subject.object));
    put(KEY_PCI_CLASS, IC::EnumValue(device.class_id));
    put(KEY_PCI_DEVICE, std::string(ids));
    put(KEY_LINK_SPEED,
        speed > 0 && std::isfinite(speed) ? IC::Number(speed) : IC::Number(IC::Number::KIND_NAN));
    describe({product().empty() ? ids : product(), size()});
}

std::string pciAddress(hwloc_obj_t object)
{
    const auto& device = object->attr->pcidev;
    char text[24];
    std::snprintf(text, sizeof text, "%04hx:%02hhx:%02hhx.%hhx", device.domain, device.bus, device.dev,
                  device.func);
    return text;
}

Slot::Slot(const Site& site, const std::string& name) : Component(site)
{
    put(KEY_LOCATION, name);
}

Device::Device(const Subject& subject) : Component(subject)
{
    // As in the export, because with colons it is easier to read than the property's text.
    const char* address = hwloc_obj_get_info_by_name(subject.object, "Address");
    describe({product(), size(), address == nullptr ? "" : told(address)});
}

}  // namespace inventory
