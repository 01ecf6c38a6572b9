// Reads the memory modules that udev knows of from the firmware, and the memory that the kernel has.
#include <libudev.h>

#include <charconv>
#include <cmath>
#include <fstream>
#include <memory>

#include "reading.h"
#include "values.h"

namespace inventory {

namespace {

// One entry of the firmware's table of memory devices: a slot, by the number that udev gives it.
struct Slot {
    bool isPresent = true;
    Component::Facts facts;
    IC::StringArray others;

    std::string textOf(Key key) const
    {
        const auto found = facts.find(key);
        return found == facts.end() ? "" : std::string(found->second);
    }
    std::string name() const { return moduleName(textOf(KEY_LOCATION), textOf(KEY_BANK)); }
};
using Slots = std::map<unsigned int, Slot>;

// What follows MEMORY_DEVICE_3_ in the name of a property.
const struct SlotRow {
    std::string_view name;
    Key key;
    enum Form : unsigned char { TEXT, IDENTITY, COUNT, BYTES, REAL } form;
} slotRows[] = {
    {"LOCATOR", KEY_LOCATION, SlotRow::TEXT},
    {"BANK_LOCATOR", KEY_BANK, SlotRow::TEXT},
    {"SIZE", KEY_SIZE, SlotRow::BYTES},
    {"TYPE", KEY_MEMORY_TYPE, SlotRow::TEXT},
    {"TYPE_DETAIL", KEY_MEMORY_DETAIL, SlotRow::TEXT},
    {"FORM_FACTOR", KEY_FORM_FACTOR, SlotRow::TEXT},
    {"SPEED_MTS", KEY_SPEED, SlotRow::COUNT},
    {"CONFIGURED_SPEED_MTS", KEY_CONFIGURED_SPEED, SlotRow::COUNT},
    {"MANUFACTURER", KEY_MAKER, SlotRow::TEXT},
    {"PART_NUMBER", KEY_PART_NUMBER, SlotRow::IDENTITY},
    {"SERIAL_NUMBER", KEY_SERIAL_NUMBER, SlotRow::IDENTITY},
    {"ASSET_TAG", KEY_ASSET_TAG, SlotRow::IDENTITY},
    {"FIRMWARE_VERSION", KEY_REVISION, SlotRow::TEXT},
    {"RANK", KEY_RANK, SlotRow::COUNT},
    {"DATA_WIDTH", KEY_DATA_WIDTH, SlotRow::COUNT},
    {"TOTAL_WIDTH", KEY_TOTAL_WIDTH, SlotRow::COUNT},
    {"CONFIGURED_VOLTAGE", KEY_CONFIGURED_VOLTAGE, SlotRow::REAL},
};

template <class T>
std::optional<T> wholeNumber(std::string_view text)
{
    T number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    return error == std::errc() && end == text.data() + text.size() ? std::optional(number) : std::nullopt;
}

// The value, or a value of KIND_UNKNOWN if the text has another form.
IC::PropertyValue valueOf(SlotRow::Form form, const std::string& text)
{
    switch (form) {
    case SlotRow::TEXT:
    case SlotRow::IDENTITY:
        return {text, true};
    case SlotRow::COUNT:
        if (const auto number = wholeNumber<ZQ::Uint32>(text))
            return {IC::Number(*number), true};
        break;
    case SlotRow::BYTES:
        if (const auto number = wholeNumber<ZQ::Uint64>(text))
            return {IC::Number(*number), true};
        break;
    case SlotRow::REAL:
        if (const auto number = realNumber(text))
            return {IC::Number(*number), true};
        break;
    }
    return IC::PropertyValue(IC::PropertyValue::KIND_UNKNOWN);
}

void add(Slot& slot, std::string_view name, const std::string& value)
{
    if (name == "PRESENT") {
        slot.isPresent = value != "0";
        return;
    }
    for (const SlotRow& row : slotRows) {
        if (row.name != name)
            continue;
        const std::string text = row.form == SlotRow::IDENTITY ? toldIdentity(value) : told(value);
        IC::PropertyValue fact = valueOf(row.form, text);
        if (text.empty())
            return;
        if (fact.getKind() != IC::PropertyValue::KIND_UNKNOWN) {
            slot.facts.insert({row.key, std::move(fact)});
            return;
        }
    }
    if (!told(value).empty())
        slot.others.push_back(std::string(name) + '=' + value);
}

struct Firmware {
    Slots slots;
    Component::Facts ofMachine;
};

Firmware readFirmware()
{
    Firmware firmware;
    const std::unique_ptr<udev, decltype(&udev_unref)> library(udev_new(), udev_unref);
    if (!library)
        return firmware;
    const std::unique_ptr<udev_device, decltype(&udev_device_unref)> device(
        udev_device_new_from_syspath(library.get(), "/sys/devices/virtual/dmi/id"), udev_device_unref);
    if (!device)
        return firmware;
    constexpr std::string_view beginning = "MEMORY_DEVICE_";
    udev_list_entry* entry = nullptr;
    udev_list_entry_foreach(entry, udev_device_get_properties_list_entry(device.get()))
    {
        std::string_view name = udev_list_entry_get_name(entry);
        const char* const text = udev_list_entry_get_value(entry);
        const std::string value = text == nullptr ? "" : text;
        if (name == "MEMORY_ARRAY_EC_TYPE" && !told(value).empty())
            firmware.ofMachine.insert({KEY_ERROR_CORRECTION, IC::PropertyValue(told(value), true)});
        if (name.substr(0, beginning.size()) != beginning)
            continue;
        name.remove_prefix(beginning.size());
        const std::size_t underscore = name.find('_');
        const auto number = wholeNumber<unsigned int>(name.substr(0, underscore));
        if (number && underscore != std::string_view::npos)
            add(firmware.slots[*number], name.substr(underscore + 1), value);
    }
    // The firmware itself is in a memory device too, which is none of the machine's memory.
    for (auto slot = firmware.slots.begin(); slot != firmware.slots.end();) {
        const std::string type = slot->second.textOf(KEY_MEMORY_TYPE);
        const bool isFirmware =
            type == "Flash" || type == "ROM" || type == "EPROM" || type == "EEPROM" || type == "FEPROM";
        slot = isFirmware ? firmware.slots.erase(slot) : std::next(slot);
    }
    if (!firmware.slots.empty())
        firmware.ofMachine.insert(
            {KEY_MEMORY_SLOTS,
             IC::PropertyValue(IC::Number(static_cast<ZQ::Uint32>(firmware.slots.size())), true)});
    return firmware;
}

std::string textIn(const IC::Node& node, Key key)
{
    IC::PropertyValue value("");
    node.getProperty(key, value);
    return told(std::string(value));
}

// The modules that hwloc shows, by their name from place and bank. Several may have the same name.
using Modules = std::multimap<std::string, MemoryModule*>;

Modules modulesIn(const Inventory& inventory)
{
    Modules modules;
    for (const auto& node : inventory.nodes)
        if (auto* module = dynamic_cast<MemoryModule*>(node.get()))
            modules.insert({moduleName(textIn(*module, KEY_LOCATION), textIn(*module, KEY_BANK)), module});
    return modules;
}

// Takes the module in this slot from the modules; null if it is not there. Where several have its name, hwloc's number
// is the slot's.
MemoryModule* take(Modules& modules, const std::string& name, unsigned int number)
{
    const auto [first, last] = modules.equal_range(name);
    if (first == last)
        return nullptr;
    auto found = first;
    for (auto candidate = first; candidate != last; ++candidate)
        if (textIn(*candidate->second, KEY_INDEX) == std::to_string(number))
            found = candidate;
    MemoryModule* const module = found->second;
    modules.erase(found);
    return module;
}

void addModules(Inventory& inventory, const Slots& slots)
{
    Modules modules = modulesIn(inventory);
    std::map<std::string, unsigned int> names;
    for (const auto& [number, slot] : slots)
        ++names[slot.name()];
    for (const auto& [number, slot] : slots) {
        Component::Facts facts = slot.isPresent ? slot.facts : Component::Facts {};
        if (slot.isPresent && !slot.others.empty())
            facts.insert({KEY_OTHER_FACTS, IC::PropertyValue(slot.others, true)});
        std::string name = slot.name();
        if (MemoryModule* module = take(modules, name, number)) {
            module->learn(facts, slot.isPresent);
            continue;
        }
        if (names[name] > 1)  // the firmware counts its slots; empty ones too, so that the number stays
            name += '-' + std::to_string(number);
        if (!slot.isPresent || (facts.count(KEY_SIZE) == 0 && !MemoryModule::isModule(facts)))
            continue;
        const Site site = inventory.site(inventory.machine, IC::Node::SENSOR_DIMM, name);
        inventory.nodes.push_back(std::make_unique<MemoryModule>(site, facts));
    }
}

// What the kernel has, in bytes; 0 if it does not say.
ZQ::Uint64 systemMemory()
{
    std::ifstream file("/proc/meminfo");
    for (std::string line; std::getline(file, line);)
        if (constexpr std::string_view name = "MemTotal:"; line.compare(0, name.size(), name) == 0)
            return sizeInBytes(line.substr(name.size())).value_or(0);
    return 0;
}

// The memory of the system, if it differs from that of the NUMA nodes by more than 5 per cent.
void compareMemory(const IC::Node& machine, Component::Facts& facts)
{
    constexpr double tolerance = 0.05;
    IC::PropertyValue size(IC::Number(0ull));
    machine.getProperty(KEY_SIZE, size);
    const ZQ::Uint64 system = systemMemory();
    const auto ofSystem = static_cast<double>(system);
    const auto ofNodes = static_cast<double>(size.operator ZQ::Uint64());
    if (system != 0 && std::abs(ofNodes - ofSystem) > tolerance * ofSystem)
        facts.insert({KEY_SYSTEM_MEMORY, IC::PropertyValue(IC::Number(system), true)});
}

}  // namespace

void readMemory(Inventory& inventory)
{
    Firmware firmware = readFirmware();
    addModules(inventory, firmware.slots);
    for (const auto& node : inventory.nodes)
        if (auto* machine = dynamic_cast<Machine*>(node.get())) {
            if (inventory.isThisSystem)
                compareMemory(*machine, firmware.ofMachine);
            machine->learn(firmware.ofMachine);
            return;
        }
}

}  // namespace inventory
