// The inventory's sensors and memory modules, on hardware that umockdev simulates.
#include <gmock/gmock.h>

#include <cmath>
#include <map>
#include <nlohmann/json.hpp>

#include "inventory_run.h"

namespace {

using testing::Contains;
using testing::ElementsAre;
using testing::EndsWith;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;
using testing::StartsWith;
using testing::UnorderedElementsAre;
using Json = nlohmann::json;

// A chip with these files, each as "fan1_input=4200", below a device of the system.
std::string chipAt(const std::string& device, const std::string& subsystem, const std::string& number,
                   const std::string& name, const std::vector<std::string>& files)
{
    std::string text = "P: " + device + "\nE: SUBSYSTEM=" + subsystem + "\n\nP: " + device + "/hwmon/hwmon"
        + number + "\nE: SUBSYSTEM=hwmon\nA: name=" + name + "\\n\n";
    for (const std::string& file : files)
        text += "A: " + file + "\\n\n";
    return text + "L: device=../../../" + device.substr(device.rfind('/') + 1) + "\n\n";
}

std::string board(const std::vector<std::string>& files)
{
    return chipAt("/devices/platform/board.1", "platform", "0", "board", files);
}

// Runs a program on a machine with these devices.
Outcome runOn(const std::string& devices, const std::vector<std::string>& command,
              const std::vector<std::string>& environment = {})
{
    const Folder folder;
    const std::string description = folder.write("devices.umockdev", devices);
    // umockdev-run takes only arguments in ASCII, so the shell reads the program's path from the environment.
    // umockdev-run preloads a library, and AddressSanitizer demands to be the first one, although it works as the
    // second too. hwloc's plugin "pci" leaks memory.
    std::vector<std::string> words {"env", "PROGRAM=" + command.front(),
                                    "ASAN_OPTIONS=verify_asan_link_order=0", "HWLOC_COMPONENTS=-pci"};
    words.insert(words.end(), environment.begin(), environment.end());
    for (const char* word :
         {UMOCKDEV_RUN, "--device", description.c_str(), "--", "sh", "-c", "exec \"$PROGRAM\" \"$@\"", "sh"})
        words.emplace_back(word);
    words.insert(words.end(), command.begin() + 1, command.end());
    return runProgram(words);
}

Outcome runInventory(const std::string& devices, std::vector<std::string> arguments = {})
{
    arguments.insert(arguments.begin(), INVENTORY_PROGRAM);
    return runOn(devices, arguments);
}

// What --json says of the machine.
class Described {
public:
    explicit Described(const std::string& devices, const std::vector<std::string>& environment = {})
    {
        const Outcome outcome = runOn(devices, {INVENTORY_PROGRAM, "--json"}, environment);
        EXPECT_EQ(outcome.status, 0) << outcome.err;
        EXPECT_EQ(outcome.err, "");
        document_ = Json::parse(outcome.out, nullptr, false);
        EXPECT_FALSE(document_.is_discarded()) << outcome.out;
    }

    // The node whose path ends so; null if there is none.
    Json node(const std::string& end) const
    {
        for (const Json& node : document_["nodes"]) {
            const std::string path = node["path"];
            if (path.size() >= end.size() && path.compare(path.size() - end.size(), end.size(), end) == 0)
                return node;
        }
        return {};
    }

    Json value(const std::string& end, const std::string& key) const
    {
        const Json found = node(end);
        return found.is_null() || !found["properties"].contains(key) ? Json()
                                                                     : found["properties"][key]["value"];
    }

    std::vector<std::string> pathsOf(const std::string& sensorName) const
    {
        std::vector<std::string> paths;
        for (const Json& node : document_["nodes"])
            if (node["sensorName"] == sensorName)
                paths.push_back(node["path"]);
        return paths;
    }

    // "2 /machine/board-isa-0001:fan1 Fan: it is below its lower limit"
    std::vector<std::string> alerts() const
    {
        std::vector<std::string> texts;
        for (const Json& alert : document_["alerts"])
            texts.push_back(std::to_string(alert["severity"].get<int>()) + ' '
                            + alert["paths"][0].get<std::string>() + ' '
                            + alert["message"].get<std::string>());
        return texts;
    }

private:
    Json document_;
};

TEST(InventorySensors, AreNodesOfEachFeature)
{
    const Described machine(
        board({"fan1_input=4200", "temp1_input=41500", "temp1_label=Inlet", "in0_input=12050",
               "power1_input=250000000", "power2_average=90000000", "energy1_input=123456789",
               "curr1_input=1500", "humidity1_input=45500", "cpu0_vid=1350", "intrusion0_alarm=0",
               "beep_enable=1", "temp2_input=20000", "temp2_label=N/A"}));
    const struct {
        const char* feature;
        const char* sensor;
        const char* unit;  // empty: no reading either
        double reading;
        const char* description;
    } rows[] = {
        {"fan1", "Fan", "rpm", 4200, "fan1, 4200 RPM"},
        {"temp1", "Temperature Sensor", "celsius", 41.5, "Inlet, 41.5 degrees Celsius"},
        {"temp2", "Temperature Sensor", "celsius", 20, "temp2, 20 degrees Celsius"},
        {"in0", "Voltage Sensor", "volts", 12.05, "in0, 12.05 V"},
        {"power1", "PowerDomain", "watts", 250, "power1, 250 W"},
        {"power2", "PowerDomain", "watts", 90, "power2, 90 W"},
        {"energy1", "PowerDomain", "joules", 123.456789, "energy1, 123.457 J"},
        {"curr1", "PowerDomain", "amperes", 1.5, "curr1, 1.5 A"},
        {"humidity1", "CoolingDomain", "percent", 45.5, "humidity1, 45.5 %"},
        {"cpu0_vid", "Voltage Sensor", "volts", 1.35, "cpu0_vid, 1.35 V"},
        {"intrusion0", "Intrusion", "", 0, "intrusion0"},
        {"beep_enable", "AlertIndication", "", 0, "beep_enable"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.feature);
        const std::string path = std::string("/machine/board-isa-0001:") + row.feature;
        const Json node = machine.node(path);
        ASSERT_FALSE(node.is_null());
        EXPECT_EQ(node["sensorName"], row.sensor);
        EXPECT_EQ(node["parent"], "/machine");
        EXPECT_EQ(node["status"], 0);
        EXPECT_EQ(node["description"], row.description);
        EXPECT_EQ(machine.value(path, "chip"), "board-isa-0001");
        if (*row.unit == '\0')
            EXPECT_EQ(machine.value(path, "reading"), Json());
        else {
            EXPECT_EQ(machine.value(path, "unit"), row.unit);
            EXPECT_DOUBLE_EQ(machine.value(path, "reading").get<double>(), row.reading);
        }
    }
    EXPECT_THAT(machine.alerts(), IsEmpty());
}

// The properties that hold what sensors(1) prints, by the end of its name there.
const std::map<std::string, std::string> keysOfValues {
    {"", "reading"},
    {"_input", "reading"},
    {"_average", "average"},
    {"_lowest", "lowest"},
    {"_highest", "highest"},
    {"_input_lowest", "lowest"},
    {"_input_highest", "highest"},
    {"_average_lowest", "averageLowest"},
    {"_average_highest", "averageHighest"},
    {"_average_interval", "averageInterval"},
    {"_rated_min", "ratedMinimum"},
    {"_rated_max", "ratedMaximum"},
    {"_min", "lowerLimit"},
    {"_lcrit", "lowerCritical"},
    {"_max", "upperLimit"},
    {"_crit", "upperCritical"},
    {"_emergency", "emergencyLimit"},
    {"_cap", "cap"},
    {"_min_hyst", "minHysteresis"},
    {"_lcrit_hyst", "lcritHysteresis"},
    {"_max_hyst", "maxHysteresis"},
    {"_crit_hyst", "critHysteresis"},
    {"_emergency_hyst", "emergencyHysteresis"},
    {"_cap_hyst", "capHysteresis"},
    {"_alarm", "alarm"},
    {"_min_alarm", "minAlarm"},
    {"_lcrit_alarm", "lcritAlarm"},
    {"_max_alarm", "maxAlarm"},
    {"_crit_alarm", "critAlarm"},
    {"_emergency_alarm", "emergencyAlarm"},
    {"_cap_alarm", "capAlarm"},
    {"_fault", "fault"},
    {"_beep", "beep"},
    {"_type", "sensorKind"},
    {"_offset", "offset"},
    {"_div", "fanDivisor"},
    {"_pulses", "fanPulses"},
};

// As a number, as sensors(1) prints all of them.
double numberIn(const Json& value)
{
    if (value.is_boolean())
        return value.get<bool>() ? 1 : 0;
    if (value.is_object() && value.contains("code"))
        return value["code"].get<double>();
    return value.is_number() ? value.get<double>() : std::nan("");
}

// Every file of the hwmon class that a feature can have, as the kernel documents them, each with another value.
std::string boardWithEverything()
{
    const struct {
        const char* feature;
        std::vector<std::string> numbers;
        std::vector<std::string> flags;
    } features[] = {
        {"in0",
         {"input", "min", "max", "lcrit", "crit", "average", "lowest", "highest", "rated_min", "rated_max"},
         {"alarm", "min_alarm", "max_alarm", "lcrit_alarm", "crit_alarm", "beep"}},
        {"fan1",
         {"input", "min", "max", "div", "pulses"},
         {"alarm", "min_alarm", "max_alarm", "fault", "beep"}},
        {"temp1",
         {"input", "min", "max", "lcrit", "crit", "emergency", "min_hyst", "max_hyst", "lcrit_hyst",
          "crit_hyst", "emergency_hyst", "lowest", "highest", "offset"},
         {"alarm", "min_alarm", "max_alarm", "lcrit_alarm", "crit_alarm", "emergency_alarm", "fault",
          "beep"}},
        {"power1",
         {"input", "average", "average_lowest", "average_highest", "average_interval", "input_lowest",
          "input_highest", "cap", "cap_hyst", "min", "max", "lcrit", "crit", "rated_min", "rated_max"},
         {"alarm", "cap_alarm", "min_alarm", "max_alarm", "lcrit_alarm", "crit_alarm"}},
        {"power2", {"average"}, {}},
        {"energy1", {"input"}, {}},
        {"curr1",
         {"input", "min", "max", "lcrit", "crit", "average", "lowest", "highest", "rated_min", "rated_max"},
         {"alarm", "min_alarm", "max_alarm", "lcrit_alarm", "crit_alarm", "beep"}},
        {"humidity1", {"input"}, {}},
        {"intrusion0", {}, {"alarm", "beep"}},
        {"freq1", {"input"}, {}},
    };
    std::vector<std::string> files {"cpu0_vid=1350", "beep_enable=1", "temp1_type=4",
                                    "pwm1=128",      "pwm1_enable=2", "in0_label=Vcore: +\xc2\xb5"};
    int number = 1000;
    for (const auto& feature : features) {
        for (const std::string& value : feature.numbers)
            files.push_back(std::string(feature.feature) + '_' + value + '='
                            + std::to_string(++number * 1003));
        for (std::size_t flag = 0; flag < feature.flags.size(); ++flag)
            files.push_back(std::string(feature.feature) + '_' + feature.flags[flag] + '='
                            + std::to_string((flag + 1) % 2));
    }
    return board(files);
}

TEST(InventorySensors, HoldEveryValueThatSensorsPrints)
{
    const std::string devices = boardWithEverything()
        + chipAt("/devices/pci0000:00/0000:00:01.0", "pci", "1", "amdgpu",
                 {"temp1_input=52000", "temp1_crit=100000", "power1_average=35000000", "power1_cap=220000000",
                  "in0_input=800", "fan1_input=0", "fan1_min=0"});
    const Outcome printed = runOn(devices, {SENSORS_PROGRAM, "-u"});
    ASSERT_EQ(printed.status, 0) << printed.err;
    const Described machine(devices);
    std::string chip;
    std::size_t compared = 0;
    for (const std::string& line : linesOf(printed.out)) {
        const std::size_t colon = line.rfind(": ");
        if (line.rfind("  ", 0) != 0) {
            if (colon == std::string::npos && !line.empty() && line.back() != ':')
                chip = line;
            continue;
        }
        ASSERT_NE(colon, std::string::npos) << line;
        SCOPED_TRACE(chip + line);
        const std::string name = line.substr(2, colon - 2);
        const double number = std::stod(line.substr(colon + 2));
        // A feature is a word with a number; the rest is the value's.
        const std::size_t digit = name.find_first_of("0123456789");
        const bool isWhole = digit == std::string::npos || name == "cpu0_vid";
        const std::size_t end = isWhole ? name.size() : name.find_first_not_of("0123456789", digit);
        const std::string feature = name.substr(0, end);
        const std::string ending = end == std::string::npos ? "" : name.substr(end);
        const std::string path = "/machine/" + chip + ':' + feature;
        const auto key = keysOfValues.find(ending);
        if (key != keysOfValues.end())
            EXPECT_NEAR(numberIn(machine.value(path, name == "beep_enable" ? "beep" : key->second)), number,
                        0.0005);
        else
            EXPECT_THAT(machine.value(path, "otherFacts").dump(), HasSubstr(name + '='));
        ++compared;
    }
    EXPECT_GE(compared, 80u) << printed.out;
}

TEST(InventorySensors, EachFlagAndEachLimitIsAnAlert)
{
    const struct {
        std::vector<std::string> files;
        std::vector<std::string> alerts;  // severity and what is wrong
    } rows[] = {
        {{"fan1_input=1000", "fan1_min=1000"}, {}},
        {{"fan1_input=999", "fan1_min=1000"}, {"2 it is below its lower limit"}},
        {{"fan1_input=0", "fan1_min=0"}, {}},
        {{"fan1_input=5001", "fan1_max=5000"}, {"1 it is above its upper limit"}},
        {{"fan1_input=2000", "fan1_alarm=1"}, {"2 it raises an alarm"}},
        {{"fan1_input=2000", "fan1_min_alarm=1"}, {"2 it raises its lower alarm"}},
        {{"fan1_input=2000", "fan1_max_alarm=1"}, {"1 it raises its upper alarm"}},
        {{"fan1_input=0", "fan1_min=1000", "fan1_fault=1"}, {"2 it reports a fault"}},
        {{"fan1_input=900", "fan1_min=1000", "fan1_alarm=1", "fan1_min_alarm=1"},
         {"2 it raises an alarm", "2 it is below its lower limit", "2 it raises its lower alarm"}},
        {{"fan1_min=1000"}, {"1 it cannot be read"}},
        {{"fan1_input=2000", "fan1_beep=1"}, {}},
        {{"temp1_input=90000", "temp1_crit=90000"}, {}},
        {{"temp1_input=90100", "temp1_crit=90000"}, {"3 it is above its upper critical limit"}},
        {{"temp1_input=85000", "temp1_max=80000", "temp1_crit=90000"}, {"1 it is above its upper limit"}},
        {{"temp1_input=110000", "temp1_emergency=105000"}, {"3 it is above its emergency limit"}},
        {{"temp1_input=-5000", "temp1_min=-4000"}, {"1 it is below its lower limit"}},
        {{"temp1_input=-50000", "temp1_lcrit=-40000"}, {"3 it is below its lower critical limit"}},
        {{"temp1_input=50000", "temp1_max=0", "temp1_crit=0"}, {}},
        {{"temp1_input=50000", "temp1_min_alarm=1"}, {"1 it raises its lower alarm"}},
        {{"temp1_input=50000", "temp1_max_alarm=1"}, {"1 it raises its upper alarm"}},
        {{"temp1_input=50000", "temp1_lcrit_alarm=1"}, {"3 it raises its lower critical alarm"}},
        {{"temp1_input=50000", "temp1_crit_alarm=1"}, {"3 it raises its upper critical alarm"}},
        {{"temp1_input=50000", "temp1_emergency_alarm=1"}, {"3 it raises its emergency alarm"}},
        {{"temp1_input=-128000", "temp1_fault=1"}, {"2 it reports a fault"}},
        {{"temp1_input=broken", "temp1_fault=1"}, {"2 it reports a fault"}},
        {{"temp1_input=broken"}, {"1 it cannot be read"}},
        {{"in0_input=10900", "in0_min=11000"}, {"2 it is below its lower limit"}},
        {{"in0_input=10900", "in0_lcrit=11000"}, {"3 it is below its lower critical limit"}},
        {{"in0_input=13100", "in0_max=13000"}, {"2 it is above its upper limit"}},
        {{"in0_input=12000", "in0_min_alarm=0", "in0_max_alarm=1"}, {"2 it raises its upper alarm"}},
        {{"in0_input=12000", "in0_min_alarm=1", "in0_max_alarm=0"}, {"2 it raises its lower alarm"}},
        {{"curr1_input=12000", "curr1_crit=11000"}, {"3 it is above its upper critical limit"}},
        {{"curr1_input=12000", "curr1_alarm=1"}, {"2 it raises an alarm"}},
        {{"power1_average=300000000", "power1_cap=250000000"}, {"1 it is above its cap"}},
        {{"power1_input=250000000", "power1_cap_alarm=1"}, {"1 it raises its cap alarm"}},
        {{"intrusion0_alarm=1"}, {"1 the chassis has been opened"}},
        {{"intrusion0_alarm=broken"}, {"1 it cannot be read"}},
        {{"beep_enable=0"}, {}},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(testing::PrintToString(row.files));
        const Described machine(board(row.files));
        const std::string feature = row.files[0].substr(0, row.files[0].find_first_of("_="));
        const Json node = machine.node("board-isa-0001:" + (feature == "beep" ? "beep_enable" : feature));
        ASSERT_FALSE(node.is_null());
        EXPECT_EQ(node["status"] == 0, row.alerts.empty());
        std::vector<std::string> expected;
        for (const std::string& alert : row.alerts)
            expected.push_back(alert.substr(0, 2) + node["path"].get<std::string>() + ' '
                               + node["sensorName"].get<std::string>() + ": " + alert.substr(2));
        EXPECT_EQ(machine.alerts(), expected);
    }
}

TEST(InventorySensors, OnlyAPowerSupplysChipIsAPowerSupply)
{
    const Described machine(
        chipAt("/devices/pci0000:00/0000:00:01.0", "pci", "0", "amdgpu", {"power1_average=35000000"})
        + chipAt("/devices/platform/i2c-7/7-0058", "i2c", "1", "pfe1100",
                 {"power1_input=400000000", "power2_input=380000000", "fan1_input=9000"})
        + chipAt("/devices/platform/i2c-7/7-0059", "i2c", "2", "PSU2", {"power1_input=1000000"})
        + chipAt("/devices/platform/supply", "platform", "3", "BAT0", {"power1_input=1000000"})
        + chipAt("/devices/platform/i2c-7/7-0060", "i2c", "4", "combat", {"power1_input=1000000"}));
    EXPECT_THAT(machine.pathsOf("Power Supply"),
                UnorderedElementsAre("/machine/pfe1100-i2c-7-58:power1", "/machine/PSU2-i2c-7-59:power1",
                                     "/machine/BAT0-isa-0000:power1"));
    EXPECT_THAT(machine.pathsOf("PowerDomain"),
                UnorderedElementsAre("/machine/amdgpu-pci-0008:power1", "/machine/pfe1100-i2c-7-58:power2",
                                     "/machine/combat-i2c-7-60:power1"));
}

TEST(InventorySensors, OfChipsWithTheSameNameAreNamedByTheirDevices)
{
    const auto chip = [](const std::string& device, const std::string& number, const std::string& degrees) {
        return chipAt("/devices/platform/" + device, "platform", number, "probe", {"temp1_input=" + degrees});
    };
    const std::vector<std::string> devices {
        chip("rack-probe", "0", "21000") + chip("sill-probe", "1", "22000"),
        chip("rack-probe", "1", "21000") + chip("sill-probe", "0", "22000")};
    for (const std::string& text : devices) {
        const Described machine(text);
        EXPECT_EQ(machine.value("/machine/probe-isa-0000-rack-probe:temp1", "reading"), 21.0);
        EXPECT_EQ(machine.value("/machine/probe-isa-0000-sill-probe:temp1", "reading"), 22.0);
    }
}

TEST(InventorySensors, HaveWritableLimits)
{
    const std::string fan = board({"fan1_input=900", "fan1_min=1000"});
    const std::string path = "/machine/board-isa-0001:fan1";
    const std::string key = "50";  // lowerLimit
    Outcome outcome = runInventory(fan, {"--set", path, key, "850.5"});
    EXPECT_EQ(outcome.status, 0);
    EXPECT_THAT(outcome.out, StartsWith("0 (changed)\n[50 = 850.5] lower limit\nNode "));
    EXPECT_THAT(outcome.out, EndsWith(" : 20, status = 0\n"));
    outcome = runInventory(fan, {"--set", path, key, "950"});
    EXPECT_THAT(outcome.out, EndsWith(" : 20, status = 4\n"));
    outcome = runInventory(fan, {"--set", path, key, "slow"});
    EXPECT_EQ(outcome.status, 2);
    EXPECT_EQ(outcome.err, "inventory: 'slow' is not a number\n");
    EXPECT_EQ(outcome.out, "");
}

TEST(InventorySensors, AreNotReadWithAnExport)
{
    const Folder folder;
    const std::string file = folder.write("machine.xml", machineOf(""));
    const Outcome outcome = runInventory(board({"fan1_input=900"}), {"--json", file});
    EXPECT_EQ(outcome.status, 0) << outcome.err;
    EXPECT_THAT(outcome.out, Not(HasSubstr("\"Fan\"")));
}

// --- Memory ---

// udev's properties of the firmware's table of memory devices.
std::string memory(const std::vector<std::string>& properties)
{
    std::string text = "P: /devices/virtual/dmi/id\nE: SUBSYSTEM=dmi\n";
    for (const std::string& property : properties)
        text += "E: MEMORY_" + property + '\n';
    return text + '\n';
}

const std::vector<std::string> fourSlots {
    "ARRAY_NUM_DEVICES=4",
    "ARRAY_EC_TYPE=Multi-bit ECC",
    "DEVICE_0_SIZE=17179869184",
    "DEVICE_0_LOCATOR=DIMM A1",
    "DEVICE_0_BANK_LOCATOR=Not Specified",
    "DEVICE_0_TYPE=DDR4",
    "DEVICE_0_TYPE_DETAIL=Synchronous Registered (Buffered)",
    "DEVICE_0_FORM_FACTOR=DIMM",
    "DEVICE_0_SPEED_MTS=3200",
    "DEVICE_0_CONFIGURED_SPEED_MTS=2933",
    "DEVICE_0_MANUFACTURER=Vexilon",
    "DEVICE_0_PART_NUMBER=V93A2K43",
    "DEVICE_0_SERIAL_NUMBER=03B1F2C4",
    "DEVICE_0_ASSET_TAG=DIMM_A1_AssetTag (date:19/02)",
    "DEVICE_0_RANK=2",
    "DEVICE_0_DATA_WIDTH=64",
    "DEVICE_0_TOTAL_WIDTH=72",
    "DEVICE_0_CONFIGURED_VOLTAGE=1.2",
    "DEVICE_0_MEMORY_TECHNOLOGY=DRAM",
    "DEVICE_1_PRESENT=0",
    "DEVICE_1_LOCATOR=DIMM A2",
    "DEVICE_1_MANUFACTURER=NO DIMM",
    "DEVICE_1_TYPE=Unknown",
    "DEVICE_2_LOCATOR=DIMM B1",
    "DEVICE_2_PART_NUMBER=V1",
    "DEVICE_3_LOCATOR=DIMM B2",
    "DEVICE_3_SERIAL_NUMBER=00000000",
    "DEVICE_3_SPEED_MTS=",
    "DEVICE_4_SIZE=16777216",
    "DEVICE_4_LOCATOR=SYSTEM ROM",
    "DEVICE_4_TYPE=Flash",
};

TEST(InventoryMemory, ModulesComeFromUdev)
{
    const Described machine(memory(fourSlots));
    EXPECT_THAT(machine.pathsOf("DIMM"), ElementsAre("/machine/dimm-DIMM%20A1", "/machine/dimm-DIMM%20B1"));
    const std::string path = "/machine/dimm-DIMM%20A1";
    const std::pair<const char*, Json> rows[] = {
        {"size", 17179869184},
        {"location", "DIMM A1"},
        {"bank", {}},
        {"memoryType", "DDR4"},
        {"memoryDetail", "Synchronous Registered (Buffered)"},
        {"formFactor", "DIMM"},
        {"speed", 3200},
        {"configuredSpeed", 2933},
        {"maker", "Vexilon"},
        {"partNumber", "V93A2K43"},
        {"serialNumber", "03B1F2C4"},
        {"assetTag", {}},
        {"rank", 2},
        {"dataWidth", 64},
        {"totalWidth", 72},
        {"configuredVoltage", 1.2},
        {"otherFacts", Json::array({"MEMORY_TECHNOLOGY=DRAM"})},
    };
    for (const auto& [key, value] : rows)
        EXPECT_EQ(machine.value(path, key), value) << key;
    EXPECT_EQ(machine.node(path)["status"], 0);
    EXPECT_EQ(machine.node(path)["parent"], "/machine");
    EXPECT_THAT(machine.alerts(), ElementsAre("1 /machine/dimm-DIMM%20B1 DIMM: its size is unknown"));
    EXPECT_EQ(machine.value("/machine", "memorySlots"), 4);
    EXPECT_EQ(machine.value("/machine", "errorCorrection"), "Multi-bit ECC");
}

TEST(InventoryMemory, ModulesOfTheSamePlaceHaveTheNumberOfTheirSlot)
{
    const Described machine(memory(
        {"DEVICE_0_PRESENT=0", "DEVICE_0_LOCATOR=DIMM 0", "DEVICE_1_SIZE=1024", "DEVICE_1_LOCATOR=DIMM 0",
         "DEVICE_2_SIZE=2048", "DEVICE_2_LOCATOR=DIMM 0", "DEVICE_2_BANK_LOCATOR=P1 B", "DEVICE_3_SIZE=1"}));
    EXPECT_THAT(machine.pathsOf("DIMM"),
                ElementsAre("/machine/dimm-DIMM%200-1", "/machine/dimm-P1%20B-DIMM%200", "/machine/dimm"));
    EXPECT_EQ(machine.node("/machine/dimm")["description"], "1 byte");
}

TEST(InventoryMemory, ModulesThatHwlocShowsAreTheSameNodes)
{
    const auto module = [](const std::string& number, const std::string& place, const std::string& facts) {
        return "<object type=\"Misc\" os_index=\"" + number + "\" subtype=\"MemoryModule\">"
            + fact("DeviceLocation", place) + facts + "</object>";
    };
    const Folder folder;
    const std::string file = folder.write("machine.xml",
                                          machineOf("",
                                                    module("0", "DIMM A1 ", fact("SerialNumber", "03B1F2C4"))
                                                        + module("1", "DIMM A2", fact("Vendor", "Leftover"))
                                                        + module("9", "DIMM C1", fact("PartNumber", "X"))));
    const Described machine(memory(fourSlots), {"HWLOC_COMPONENTS=xml", "HWLOC_XMLFILE=" + file});
    EXPECT_THAT(machine.pathsOf("DIMM"),
                UnorderedElementsAre("/machine/dimm-DIMM%20A1", "/machine/dimm-DIMM%20A2",
                                     "/machine/dimm-DIMM%20C1", "/machine/dimm-DIMM%20B1"));
    EXPECT_EQ(machine.value("/machine/dimm-DIMM%20A1", "size"), 17179869184);
    EXPECT_EQ(machine.value("/machine/dimm-DIMM%20A1", "serialNumber"), "03B1F2C4");
    EXPECT_THAT(machine.alerts(),
                UnorderedElementsAre("1 /machine/dimm-DIMM%20B1 DIMM: its size is unknown",
                                     "1 /machine/dimm-DIMM%20C1 DIMM: its size is unknown"));
}

// The kernel's MemTotal, in bytes.
double memTotal()
{
    std::istringstream file(contentOf("/proc/meminfo"));
    std::string word;
    double kibibytes = 0;
    while (file >> word && word != "MemTotal:") { }
    file >> kibibytes;
    return kibibytes * 1024;
}

TEST(InventoryMemory, OfTheSystemIsShownWhereItDiffersByMoreThan5PerCent)
{
    const double total = memTotal();
    ASSERT_GT(total, 0);
    const auto machineOfSize = [](double bytes, const char* isThis) {
        return Described(board({"temp1_input=1"}),
                         {"HWLOC_COMPONENTS=synthetic",
                          "HWLOC_SYNTHETIC=pack:1 [numa(memory="
                              + std::to_string(static_cast<long long>(bytes)) + ")] core:1 pu:1",
                          std::string("HWLOC_THISSYSTEM=") + isThis});
    };
    for (const double factor : {0.94, 1.06}) {
        const Described machine = machineOfSize(total * factor, "1");
        EXPECT_EQ(machine.value("/machine", "systemMemory"), total) << factor;
        EXPECT_THAT(machine.node("/machine")["description"].get<std::string>(),
                    HasSubstr("memory of the system: "));
    }
    for (const double factor : {0.96, 1.04})
        EXPECT_EQ(machineOfSize(total * factor, "1").value("/machine", "systemMemory"), Json()) << factor;
    EXPECT_EQ(machineOfSize(total / 2, "0").value("/machine", "systemMemory"), Json());
}

}  // namespace
