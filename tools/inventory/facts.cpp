// The table of the facts that become properties.
#include "mapping.h"

#include <algorithm>
#include <string_view>

#include "values.h"

namespace inventory {

namespace {

// The name of a fact begins with its subject; the rest, such as "Vendor", is the same for all subjects.
const struct Prefix {
    std::string_view text;
    IC::Node::SensorType part = IC::Node::SENSOR_COMPUTER;
} prefixes[] = {{"DMIProduct"},
                {"DMISys"},
                {"DMIBoard", IC::Node::SENSOR_PLANAR},
                {"DMIChassis", IC::Node::SENSOR_CHASSIS},
                {"DMIBIOS", IC::Node::SENSOR_BIOS},
                {"OS", IC::Node::SENSOR_OS},
                {"CPU"},
                {"PCI"},
                {"GPU"},
                {"NVIDIA"},
                {"CUDA"},
                {"OpenCL"},
                {""}};

// A read-only value of what `parse` finds in the text, or a value of KIND_UNKNOWN.
template <class T, auto parse>
IC::PropertyValue as(const std::string& text)
{
    const auto found = parse(text);
    return found ? IC::PropertyValue(T(*found), true) : IC::PropertyValue(IC::PropertyValue::KIND_UNKNOWN);
}

std::optional<std::string> text(const std::string& text)
{
    return text;
}

std::optional<bool> flag(const std::string& text)
{
    const auto number = count(text);
    return number && *number < 2 ? std::optional(*number == 1) : std::nullopt;
}

IC::PropertyValue changeable(const std::string& text)
{
    return text;
}

constexpr auto asText = as<std::string, text>;
constexpr auto asCount = as<IC::Number, count>;
constexpr auto asSize = as<IC::Number, sizeInBytes>;
constexpr auto asCode = as<IC::EnumValue, count>;
constexpr auto asBytes = as<IC::Buffer, address>;

const struct FactRow {
    std::string_view name;  // without the prefix
    Key key;
    IC::PropertyValue (*read)(const std::string& text);
} factRows[] = {
    {"Vendor", KEY_MAKER, asText},
    {"Name", KEY_MODEL, asText},
    {"Model", KEY_MODEL, asText},
    {"PlatformModel", KEY_MODEL, asText},
    {"Device", KEY_MODEL, asText},
    {"Version", KEY_REVISION, asText},
    {"Release", KEY_REVISION, asText},
    {"Revision", KEY_REVISION, asText},
    {"Date", KEY_RELEASED, as<IC::Number, date>},
    {"Serial", KEY_SERIAL_NUMBER, asText},
    {"SerialNumber", KEY_SERIAL_NUMBER, asText},
    {"AssetTag", KEY_ASSET_TAG, changeable},
    {"PartNumber", KEY_PART_NUMBER, asText},
    {"UUID", KEY_UUID, asText},
    {"DeviceLocation", KEY_LOCATION, asText},
    {"BankLocation", KEY_BANK, asText},
    {"FormFactor", KEY_FORM_FACTOR, asText},
    {"Rank", KEY_RANK, asCount},
    {"Slot", KEY_LOCATION, asText},
    {"Type", KEY_CHASSIS_TYPE, asCode},
    {"HostName", KEY_HOST_NAME, asText},
    {"hwlocVersion", KEY_SOURCE_VERSION, as<IC::Number, version>},
    {"FrequencyMaxMHz", KEY_FREQUENCY, as<IC::Number, realNumber>},
    {"LinuxCapacity", KEY_CAPACITY, asCount},
    {"Inclusive", KEY_INCLUSIVE, as<IC::Number, flag>},
    {"Size", KEY_SIZE, asSize},
    {"GlobalMemorySize", KEY_SIZE, asSize},
    {"SectorSize", KEY_SECTOR_SIZE, asCount},
    {"LinuxDeviceID", KEY_DEVICE_NUMBER, asText},
    {"Address", KEY_ADDRESS, asBytes},
    {"Port", KEY_PORT, asCount},
    {"Port1State", KEY_PORT_STATE, asCode},
    {"Port1LID", KEY_PORT_LID, asCount},
    {"Port1GID0", KEY_PORT_GID, asBytes},
    {"NodeGUID", KEY_NODE_GUID, asBytes},
};

bool saysNothing(Key key, const char* text)
{
    const bool identifies =
        key == KEY_SERIAL_NUMBER || key == KEY_ASSET_TAG || key == KEY_PART_NUMBER || key == KEY_UUID;
    return (identifies ? toldIdentity(text) : told(text)).empty();
}

}  // namespace

Fact factOf(const hwloc_info_s& info)
{
    const std::string_view name = info.name;
    for (const Prefix& prefix : prefixes)
        for (const FactRow& row : factRows)
            if (name.substr(0, prefix.text.size()) == prefix.text
                && name.substr(std::min(name.size(), prefix.text.size())) == row.name) {
                if (saysNothing(row.key, info.value))
                    return {};
                IC::PropertyValue value = row.read(info.value);
                const bool fits = value.getKind() != IC::PropertyValue::KIND_UNKNOWN;
                return {fits ? row.key : KEY_OTHER_FACTS, std::move(value), prefix.part,
                        prefix.text == "CPU"};
            }
    return {saysNothing(KEY_OTHER_FACTS, info.value) ? KEY_NONE : KEY_OTHER_FACTS};
}

}  // namespace inventory
