// The inventory: the nodes that it makes of hwloc's objects, and the program.
#include <gmock/gmock.h>
#include <hwloc.h>
#include <hwloc/export.h>
#include <sys/stat.h>

#include <chrono>
#include <future>
#include <map>
#include <memory>
#include <set>
#include <sstream>

#include "IC/ICException.h"
#include "VXLog/RecordSink.h"
#include "alerts.h"
#include "inventory_run.h"
#include "mapping.h"
#include "reading.h"
#include "synthetic.h"
#include "values.h"
#include "writing.h"

namespace {

using namespace inventory;
using testing::AllOf;
using testing::Contains;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;

void replace(std::string& text, const std::string& from, const std::string& to)
{
    const auto at = text.find(from);
    if (at == std::string::npos)
        throw std::runtime_error("no " + from);
    text.replace(at, from.size(), to);
}

// The export of a machine with two threads, with further facts about it and further objects in it.
std::string machineWith(const std::string& facts, const std::string& objects = "")
{
    std::string xml = synthetic("pack:1 core:1 pu:2");
    const auto firstFact = xml.find("    <info");
    xml.insert(firstFact, facts);
    xml.insert(xml.rfind("</object>"), objects);
    return xml;
}

std::string info(const std::string& name, const std::string& value)
{
    return "<info name=\"" + name + "\" value=\"" + value + "\"/>";
}

const IC::Node& nodeAt(Inventory&&, std::string_view) = delete;  // the node would not outlive the call
const IC::Node& nodeAt(const Inventory& inventory, std::string_view path)
{
    for (const auto& node : inventory.nodes)
        if (node->getPath() == path)
            return *node;
    throw std::runtime_error("no node " + std::string(path));
}

IC::PropertyValue property(const IC::Node& node, Key key)
{
    IC::PropertyValue value("not there");
    EXPECT_EQ(node.getProperty(key, value).getStatus(), IC::Error::STATUS_SUCCESS) << nameOf(key);
    return value;
}

bool has(const IC::Node& node, Key key)
{
    return node.getProperties().count(key) != 0;
}

std::vector<std::string> pathsOf(const Inventory& inventory)
{
    std::vector<std::string> paths;
    for (const auto& node : inventory.nodes)
        paths.push_back(node->getPath());
    return paths;
}

std::map<std::string, unsigned int> countsOf(const Inventory& inventory)
{
    std::map<std::string, unsigned int> counts;
    for (const auto& node : inventory.nodes)
        ++counts[IC::pst[node->getSensor()]];
    return counts;
}

// Converts a number to its native type and back.
IC::Number roundTrip(const IC::Number& number)
{
    switch (number.getKind()) {
    case IC::Number::KIND_BOOL:
        return number.operator bool();
    case IC::Number::KIND_INT:
        return number.operator int();
    case IC::Number::KIND_UINT32:
        return number.operator unsigned int();
    case IC::Number::KIND_UINT64:
        return number.operator unsigned long long();
    case IC::Number::KIND_REAL:
        return number.operator double();
    case IC::Number::KIND_VERSION:
        return number.operator IC::Version2();
    case IC::Number::KIND_DATETIME:
        return number.operator ZQ::DateTime();
    case IC::Number::KIND_NODEREF:
        return number.operator IC::sNodeRef();
    default:
        return number.getKind();
    }
}

IC::PropertyValue roundTrip(const IC::PropertyValue& value)
{
    switch (value.getKind()) {
    case IC::PropertyValue::KIND_NUMBER:
        return roundTrip(IC::Number(value));
    case IC::PropertyValue::KIND_STRING:
        return std::string(value);
    case IC::PropertyValue::KIND_BUFFER:
        return value.operator IC::Buffer();
    case IC::PropertyValue::KIND_ENUMVALUE:
        return value.operator IC::EnumValue();
    case IC::PropertyValue::KIND_NUMBERARRAY: {
        IC::NumberArray numbers;
        for (const IC::Number& number : value.operator IC::NumberArray())
            numbers.push_back(roundTrip(number));
        return numbers;
    }
    case IC::PropertyValue::KIND_STRINGARRAY:
        return value.operator IC::StringArray();
    default:
        return value.getKind();
    }
}

// Compares the texts too, because all node references compare equal, and so do all signed numbers.
void expectSame(const IC::PropertyValue& a, const IC::PropertyValue& b)
{
    EXPECT_EQ(a, b);
    EXPECT_EQ(std::string(a), std::string(b));
}

// Counts the library's records instead of printing them: these tests cause thousands.
class Records {
public:
    Records()
    {
        VXLog::setRecordSink([this](const VXLog::Record& record) {
            count_ += record.kind == VXLog::Record::Kind::log ? 1 : 0;
        });
    }
    ~Records() { VXLog::setRecordSink({}); }
    Records(const Records&) = delete;
    Records& operator=(const Records&) = delete;

    int count() const { return count_; }

private:
    int count_ = 0;
};

// Checks what holds for the nodes of every machine.
void expectSound(const Inventory& inventory)
{
    const Records records;
    std::map<std::string, IC::NodeRef> selves;
    std::set<std::pair<unsigned int, unsigned int>> references;
    for (const auto& node : inventory.nodes) {
        SCOPED_TRACE(node->getPath());
        EXPECT_EQ(node->getPath().find_first_not_of("abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ"
                                                    "0123456789-._:/%#"),
                  std::string::npos);
        const IC::NodeRef self = IC::Number(property(*node, KEY_SELF));
        EXPECT_EQ(self.type, node->getSensor());
        EXPECT_TRUE(references.insert({self.type, self.id}).second) << "twice";
        EXPECT_TRUE(selves.insert({node->getPath(), self}).second) << "twice";
        if (!node->getParent().empty()) {
            const IC::NodeRef parent = IC::Number(property(*node, KEY_PARENT));
            EXPECT_EQ(selves.count(node->getParent()), 1u) << node->getParent();
            EXPECT_EQ(parent.type, selves[node->getParent()].type);
            EXPECT_EQ(parent.id, selves[node->getParent()].id);
        }
        for (const auto& [key, value] : node->getProperties()) {
            SCOPED_TRACE(nameOf(key));
            ASSERT_NE(infoOf(key), nullptr) << key;
            const std::string kind = kindName(value) == "nan" ? "real" : kindName(value);
            EXPECT_EQ(kind, infoOf(key)->kind);
            IC::PropertyValue read("");
            EXPECT_EQ(node->getProperty(key, read).getStatus(), IC::Error::STATUS_SUCCESS);
            expectSame(read, value);
            EXPECT_EQ(read.readOnly(), value.readOnly());
            expectSame(roundTrip(value), value);
            const bool isChangeable = key == KEY_LABEL || key == KEY_ASSET_TAG;
            EXPECT_EQ(value.readOnly(), !isChangeable);
            const IC::PropertyValue newValue("something else");
            EXPECT_EQ(node->setProperty(key, newValue).getStatus(),
                      isChangeable ? IC::Error::STATUS_SUCCESS : IC::Error::STATUS_READ_ONLY);
            EXPECT_EQ(node->getProperty(key, read).getStatus(), IC::Error::STATUS_SUCCESS);
            expectSame(read, isChangeable ? newValue : value);
            if (isChangeable) {
                EXPECT_EQ(node->setProperty(key, value).getStatus(), IC::Error::STATUS_SUCCESS);
                EXPECT_EQ(node->getProperty(key, read).getStatus(), IC::Error::STATUS_SUCCESS);
                expectSame(read, value);
            }
        }
        const int before = records.count();
        EXPECT_EQ(node->setProperty(KEY_LAST + 1, IC::PropertyValue("")).getStatus(),
                  IC::Error::STATUS_NO_SUCH_PROPERTY);
        EXPECT_EQ(records.count(), before + 2);  // the request and the refusal
    }
}

TEST(InventoryValues, CountsAreWholeNumbersOf32Bits)
{
    EXPECT_EQ(count("0"), 0u);
    EXPECT_EQ(count(" 12 "), 12u);
    EXPECT_EQ(count("0x3a4"), 0x3a4u);
    EXPECT_EQ(count("4294967295"), 4294967295u);
    for (const char* text :
         {"", " ", "-1", "+1", "1.5", "12x", "0x", "4294967296", "99999999999999999999", "x"})
        EXPECT_EQ(count(text), std::nullopt) << text;
}

TEST(InventoryValues, RealsAreFinite)
{
    EXPECT_EQ(realNumber("2701"), 2701.0);
    EXPECT_EQ(realNumber("-0.5"), -0.5);
    EXPECT_EQ(realNumber("1e3"), 1000.0);
    for (const char* text : {"", "nan", "inf", "-inf", "1e999", "1,5", "1 V", "V"})
        EXPECT_EQ(realNumber(text), std::nullopt) << text;
}

TEST(InventoryValues, SizesAreInBytesWhateverTheirUnit)
{
    EXPECT_EQ(sizeInBytes("4194304"), 4294967296u);
    EXPECT_EQ(sizeInBytes("4194304KiB"), 4294967296u);
    EXPECT_EQ(sizeInBytes("4 GiB"), 4294967296u);
    EXPECT_EQ(sizeInBytes("4096 MB "), 4294967296u);
    EXPECT_EQ(sizeInBytes("17B"), 17u);
    EXPECT_EQ(sizeInBytes("18014398509481983"), 18446744073709550592u);
    for (const char* text : {"", "-1", "KiB", "1 parsec", "1.5 GiB", "18014398509481984", "16777216 TiB",
                             "18446744073709551616 B", "Unknown", "No Module Installed"})
        EXPECT_EQ(sizeInBytes(text), std::nullopt) << text;
}

TEST(InventoryValues, VersionsAreTheFirstTwoNumbers)
{
    const auto text = [](const char* from) {
        const auto found = version(from);
        return found ? std::string(IC::Number(*found)) : "none";
    };
    EXPECT_EQ(text("6.17.0-1014-nvidia"), "6.17");
    EXPECT_EQ(text("1.0 (pvr 004c 0100)"), "1.0");
    EXPECT_EQ(text("255.255"), "255.255");
    for (const char* none : {"", "6", "6.", ".6", "256.1", "1.256", "v1.0", "-1.0", "PR-436"})
        EXPECT_EQ(text(none), "none") << none;
}

TEST(InventoryValues, DatesAreDays)
{
    const auto text = [](const char* from) {
        const auto found = date(from);
        return found ? std::string(*found) : "none";
    };
    EXPECT_EQ(text("08/06/2025"), "2025-08-06T00:00:00Z");
    EXPECT_EQ(text("02/29/2012"), "2012-02-29T00:00:00Z");
    for (const char* none : {"", "2025-08-06", "13/01/2012", "01/32/2012", "01/01/2012x", "N/A"})
        EXPECT_EQ(text(none), "none") << none;
}

TEST(InventoryValues, AddressesAreBytes)
{
    EXPECT_EQ(address("84:8f:69:fe:cc:41"), (IC::Buffer {0x84, 0x8f, 0x69, 0xfe, 0xcc, 0x41}));
    EXPECT_EQ(address("0002:c903:00f9:bfa0"), (IC::Buffer {0, 2, 0xc9, 3, 0, 0xf9, 0xbf, 0xa0}));
    for (const char* text : {"", ":", "8", "84:", ":84", "84::8f", "84:8", "84 8f", "0x84", "zz", "-1"})
        EXPECT_EQ(address(text), std::nullopt) << text;
}

TEST(InventoryValues, PlaceholdersSayNothing)
{
    for (const char* nothing : {"",
                                "   ",
                                "N/A",
                                "n.a.",
                                "None",
                                "NONE ",
                                "--",
                                "To Be Filled By O.E.M.",
                                "to be filled by o.e.m",
                                "To be filled by OEM",
                                "Default string",
                                "Default string000",
                                "Not Specified",
                                "NOT SPECIFIED",
                                "0123456789",
                                "System manufacturer",
                                "System Product Name",
                                "Base Board Serial Number",
                                "Unknown",
                                "<BAD INDEX>",
                                "NO DIMM",
                                "[Empty]",
                                "No Module Installed",
                                "Not Available",
                                "O.E.M.",
                                "Undefined",
                                "SerNum0",
                                "A1_AssetTag0",
                                "P1-DIMMA1_AssetTag (date:19/02)",
                                "Array1_PartNumber3",
                                "Manufacturer00",
                                "OEM_Define1",
                                "Type1ProductConfigId",
                                "Board Name",
                                "No Enclosure",
                                "x.x",
                                "XXXXXXXX",
                                "Type2 - Board Version"})
        EXPECT_EQ(told(nothing), "") << nothing;
    for (const char* nothing : {"0", "00000000", "0000-0000", "FFFFFFFF", "xxxxxxxx", "123456789", "Unknown",
                                "00000000-0000-0000-0000-000000000000", "Asset-1234567890",
                                "SSN12345678901234567", "03000200-0400-0500-0006-000700080009"})
        EXPECT_EQ(toldIdentity(nothing), "") << nothing;
    for (const char* something : {"0", "00000000", "Nanya", "Noname", "Samsung", "Version 2", "\xe6\x97\xa5",
                                  "NA1234", "System x3650", "123456789", "X", "X10"})
        EXPECT_EQ(told(something), something);
    for (const char* something : {"1", "00000001", "48AAE639", "F", "01", "S0000000"})
        EXPECT_EQ(toldIdentity(something), something);
}

TEST(InventoryValues, TextsAreTrimmedAndSizesHaveUnits)
{
    EXPECT_EQ(told(" DIMM_A1 "), "DIMM_A1");
    EXPECT_EQ(toldIdentity(" 48AAE639 "), "48AAE639");
    EXPECT_EQ(sizeInWords(0), "0 bytes");
    EXPECT_EQ(sizeInWords(1), "1 byte");
    EXPECT_EQ(sizeInWords(1), "1 byte");
    EXPECT_EQ(sizeInWords(1023), "1023 bytes");
    EXPECT_EQ(sizeInWords(20971520), "20 MiB");
    EXPECT_EQ(sizeInWords(128520671232), "119.7 GiB");
    EXPECT_EQ(sizeInWords(~ZQ::Uint64 {0}), "16 EiB");
}

TEST(InventoryValues, PrintableTextHasNoControlCharacters)
{
    EXPECT_EQ(printable("a\"\\~ b"), "a\"\\~ b");
    EXPECT_EQ(printable(std::string("\0\x1b[2J\n\x7f\x9b\xff", 9)), "\\x00\\x1b[2J\\x0a\\x7f\\x9b\\xff");
}

TEST(InventoryPaths, HoldTheNumbersOfTheSystem)
{
    const Inventory inventory = readExport(synthetic("pack:2 l2:1 core:2 pu:2"));
    EXPECT_THAT(pathsOf(inventory),
                ElementsAre("/machine", "/machine/package-0", "/machine/package-0/l2-0",
                            "/machine/package-0/core-0", "/machine/package-0/core-1", "/machine/package-1",
                            "/machine/package-1/l2-2", "/machine/package-1/core-2",
                            "/machine/package-1/core-3", "/machine/numa-0"));
    EXPECT_EQ(nodeAt(inventory, "/machine/package-1/core-3").getParent(), "/machine/package-1/l2-2");
    expectSound(inventory);
}

TEST(InventoryPaths, DoNotDependOnHowHwlocNumbersItsObjects)
{
    std::string xml = synthetic("pack:2 numa:2 l3:1 core:4 pu:2");
    const auto before = pathsOf(readExport(xml));
    EXPECT_EQ(pathsOf(readExport(xml)), before);
    std::size_t changed = 0;
    for (std::size_t at = 0; (at = xml.find("gp_index=\"", at)) != std::string::npos; ++changed)
        xml.insert(at += 10, std::to_string(900 - changed % 9 * 100));
    EXPECT_GT(changed, 20u);
    EXPECT_EQ(pathsOf(readExport(xml)), before);
}

TEST(InventoryPaths, AreUniqueWhateverTheNames)
{
    const std::string device = "<object type=\"OSDev\" osdev_type=\"2\" name=";
    const Inventory inventory = readExport(
        machineWith("",
                    device + "\"eth0\">" + info("Address", "01") + "</object>" + device + "\"eth0\"/>"
                        + device + "\"eth0\"/>" + device + "\"package-0\"/>" + device + "\"a/b #2\"/>"
                        + device + "\"\"/>" + device + "\"" + std::string(100000, 'x') + "\"/>"));
    EXPECT_THAT(pathsOf(inventory),
                ElementsAre("/machine", "/machine/package-0", "/machine/package-0/core-0", "/machine/numa-0",
                            "/machine/eth0#d2512265", "/machine/eth0#811c9dc5", "/machine/eth0#811c9dc5#2",
                            "/machine/package-0#811c9dc5", "/machine/a%2fb%20%232", "/machine/net",
                            "/machine/" + std::string(64, 'x') + "#0da3ee45"));
    expectSound(inventory);
}

TEST(InventoryNodes, HoldEveryKindOfValue)
{
    const std::string address20 = "80:00:00:48:fe:80:00:00:00:00:00:00:00:02:c9:03:00:f9:bf:a1";
    const Inventory inventory = readExport(machineWith(
        info("DMIProductName", "DCS8000Z") + info("DMIProductVersion", "") + info("DMISysVendor", "Vexilon")
            + info("DMIBoardName", "0W6W6G") + info("DMIBoardAssetTag", "N/A") + info("DMIChassisType", "23")
            + info("DMIBIOSVersion", "1.0.30") + info("DMIBIOSDate", "08/06/2012") + info("OSName", "Linux")
            + info("OSRelease", "6.17.0-1014") + info("HostName", "here"),
        "<object type=\"Bridge\" bridge_type=\"0-1\" depth=\"0\" bridge_pci=\"0000:[00-01]\">"
        "<object type=\"PCIDev\" pci_busid=\"0000:01:00.0\" pci_type=\"0280 [15b3:1003] [0000:0000] 01\""
        " pci_link_speed=\"7.876923\">"
            + info("PCISlot", "01 ") + info("PCIVendor", "Vexilon")
            + "<object type=\"OSDev\" osdev_type=\"2\"" + " name=\"ib0\">" + info("Address", address20)
            + info("Port", "1") + "</object>" + "<object type=\"OSDev\" osdev_type=\"3\" name=\"mlx4_0\">"
            + info("NodeGUID", "0002:c903:00f9:bfa0") + info("Port1State", "4") + info("Port1LID", "0x3a4")
            + "</object></object></object>"
            + "<object type=\"OSDev\" osdev_type=\"0\" name=\"sda\" subtype=\"Disk\">"
            + info("Size", "390711384")
            + "</object><object type=\"OSDev\" osdev_type=\"0\" name=\"dax0\" subtype=\"NVM\"/>"
            + "<object type=\"OSDev\" osdev_type=\"4\" name=\"dma0\"/>"
            + "<object type=\"Misc\" subtype=\"MemoryModule\">" + info("DeviceLocation", "DIMM_A1 ")
            + info("Size", "4194304KiB") + "</object><object type=\"Misc\" subtype=\"Other\"/>"));
    expectSound(inventory);

    const IC::Node& machine = nodeAt(inventory, "/machine");
    EXPECT_EQ(machine.getSensor(), IC::Node::SENSOR_COMPUTER);
    EXPECT_EQ(std::string(property(machine, KEY_MODEL)), "DCS8000Z");
    EXPECT_FALSE(has(machine, KEY_REVISION));
    const ZQ::DateTime readAt = IC::Number(property(machine, KEY_READ_AT));
    EXPECT_NEAR(static_cast<double>(static_cast<long>(readAt)),
                static_cast<double>(static_cast<long>(ZQ::DateTime::now())), 60);
    EXPECT_EQ(std::string(property(machine, KEY_HOST_NAME)), "here");
    EXPECT_EQ(property(machine, KEY_USABLE), IC::PropertyValue(IC::Number(true)));

    EXPECT_FALSE(has(nodeAt(inventory, "/machine/planar"), KEY_ASSET_TAG));
    EXPECT_EQ(property(nodeAt(inventory, "/machine/chassis"), KEY_CHASSIS_TYPE).operator IC::EnumValue(),
              IC::EnumValue(23u));
    const IC::Node& bios = nodeAt(inventory, "/machine/bios");
    EXPECT_EQ(std::string(property(bios, KEY_VERSION)), "1.0");
    EXPECT_EQ(std::string(property(bios, KEY_RELEASED)), "2012-08-06T00:00:00Z");
    EXPECT_EQ(bios.getDescription(), "1.0.30, 2012-08-06");
    const IC::Version2 kernel = property(nodeAt(inventory, "/machine/os"), KEY_VERSION);
    EXPECT_EQ(kernel.major, 6);
    EXPECT_EQ(kernel.minor, 17);

    const IC::Node& core = nodeAt(inventory, "/machine/package-0/core-0");
    EXPECT_EQ(property(core, KEY_CPU_SET).operator IC::NumberArray(), (IC::NumberArray {0u, 1u}));
    EXPECT_EQ(property(core, KEY_THREADS).operator unsigned int(), 2u);

    EXPECT_EQ(nodeAt(inventory, "/machine/slot-01").getSensor(), IC::Node::SENSOR_SLOT);
    EXPECT_EQ(std::string(property(nodeAt(inventory, "/machine/slot-01"), KEY_LOCATION)), "01 ");
    const IC::Node& controller = nodeAt(inventory, "/machine/network-0000:01:00.0");
    EXPECT_EQ(controller.getSensor(), IC::Node::SENSOR_NETWORK_CONTROLLER);
    EXPECT_NEAR(property(controller, KEY_LINK_SPEED).operator double(), 7.876923, 1e-6);
    EXPECT_EQ(property(controller, KEY_PCI_CLASS).operator unsigned int(), 0x280u);
    EXPECT_EQ(std::string(property(controller, KEY_PCI_DEVICE)), "15b3:1003");
    const IC::Node& port = nodeAt(inventory, "/machine/network-0000:01:00.0/ib0");
    EXPECT_EQ(port.getSensor(), IC::Node::SENSOR_NETWORK_PORT);
    EXPECT_EQ(std::string(property(port, KEY_ADDRESS)), "80000048 fe800000 00000000 0002c903 00f9bfa1 ");
    EXPECT_EQ(property(port, KEY_ADDRESS).operator IC::Buffer().size(), 20u);
    EXPECT_EQ(port.getDescription(), address20);
    EXPECT_EQ(property(controller, KEY_PORT_LID).operator unsigned int(), 0x3a4u);
    EXPECT_EQ(property(controller, KEY_PORT_STATE).operator IC::EnumValue(), IC::EnumValue(4u));

    const IC::Node& disk = nodeAt(inventory, "/machine/sda");
    EXPECT_EQ(disk.getSensor(), IC::Node::SENSOR_HARD_DRIVE);
    EXPECT_EQ(property(disk, KEY_SIZE).operator unsigned long long(), 400088457216u);
    const Records records;
    EXPECT_THROW(property(disk, KEY_SIZE).operator unsigned int(), std::out_of_range);
    EXPECT_EQ(nodeAt(inventory, "/machine/dax0").getSensor(), IC::Node::SENSOR_MEMORY_DEVICE);
    const IC::Node& module = nodeAt(inventory, "/machine/dimm-DIMM_A1");
    EXPECT_EQ(std::string(property(module, KEY_LOCATION)), "DIMM_A1 ");
    EXPECT_EQ(property(module, KEY_SIZE).operator unsigned long long(), 4294967296u);
    EXPECT_THROW(property(module, KEY_LOCATION).operator unsigned int(), IC::PropertyValueInvalidKind);

    const auto counts = countsOf(inventory);
    EXPECT_EQ(counts.at("DIMM"), 1u);  // the other Misc object and the DMA channel are no nodes
    EXPECT_EQ(inventory.nodes.size(), 14u);
    EXPECT_TRUE(alertsOf(inventory.nodes).empty());
}

TEST(InventoryNodes, JoinTheViewsOfOneDevice)
{
    const auto view = [](const char* type, const char* name, const std::string& facts) {
        return std::string("<object type=\"OSDev\" osdev_type=\"") + type + "\" name=\"" + name + "\">"
            + facts + "</object>";
    };
    const Inventory inventory = readExport(machineWith(
        "",
        view("5", "opencl0d0", info("NVIDIAUUID", "GPU-1")) + view("5", "cuda0", info("NVIDIAUUID", "GPU-1"))
            + view("5", "", info("NVIDIAUUID", "GPU-1")) + view("5", "cuda1", info("NVIDIAUUID", "GPU-2"))
            + view("5", "mic0", "")
            // Classes without a sensor type: what the driver makes of the device.
            + "<object type=\"PCIDev\" pci_busid=\"0000:01:00.0\" pci_type=\"ff00 [10de:1] [0000:0000] 01\">"
            + view("1", "card0", "") + view("1", "renderD128", "") + view("4", "dma0", "") + "</object>"
            + "<object type=\"PCIDev\" pci_busid=\"0000:02:00.0\" pci_type=\"0880 [8086:1] [0000:0000] 01\">"
            + view("4", "dma1", "") + view("2", "eth0", "") + "</object>"
            + "<object type=\"PCIDev\" pci_busid=\"0000:03:00.0\" pci_type=\"0c04 [8086:1] [0000:0000] 01\"/>"
            + view("0", "sr0", "") + view("0", "st0", "") + view("0", "fd0", "") + view("0", "sdr0", "")
            + "<object type=\"OSDev\" osdev_type=\"0\" name=\"x\" subtype=\"Tape\"/>"));
    expectSound(inventory);
    const auto paths = pathsOf(inventory);
    EXPECT_EQ(std::vector(paths.begin() + 4, paths.end()),
              (std::vector<std::string> {"/machine/cuda0", "/machine/cuda1", "/machine/mic0",
                                         "/machine/display-0000:01:00.0", "/machine/eth0",
                                         "/machine/storage-0000:03:00.0", "/machine/fd0", "/machine/sdr0"}));
    EXPECT_THAT(property(nodeAt(inventory, "/machine/cuda0"), KEY_VIEWS).operator IC::StringArray(),
                ElementsAre("cuda0", "opencl0d0"));
    EXPECT_THAT(
        property(nodeAt(inventory, "/machine/display-0000:01:00.0"), KEY_VIEWS).operator IC::StringArray(),
        ElementsAre("card0", "renderD128"));
    EXPECT_EQ(nodeAt(inventory, "/machine/fd0").getSensor(), IC::Node::SENSOR_FLOPPY_DRIVE);
    EXPECT_EQ(nodeAt(inventory, "/machine/sdr0").getSensor(), IC::Node::SENSOR_HARD_DRIVE);
    EXPECT_EQ(nodeAt(inventory, "/machine/storage-0000:03:00.0").getSensor(),
              IC::Node::SENSOR_DISK_CONTROLLER);
}

TEST(InventoryNodes, KeepFactsThatCannotBeParsedAsText)
{
    const Inventory inventory = readExport(
        machineWith(info("DMIBIOSDate", "yesterday") + info("DMIBIOSVersion", "1"),
                    "<object type=\"OSDev\" osdev_type=\"0\" name=\"sda\">" + info("Size", "-5")
                        + info("SectorSize", "99999999999999999999") + info("Address", "zz")
                        + info("Model", "A") + info("Model", "B") + info("Unheard", "of") + "</object>"));
    const IC::Node& disk = nodeAt(inventory, "/machine/sda");
    EXPECT_THAT(
        property(disk, KEY_OTHER_FACTS).operator IC::StringArray(),
        ElementsAre("Size=-5", "SectorSize=99999999999999999999", "Address=zz", "Model=B", "Unheard=of"));
    EXPECT_FALSE(has(disk, KEY_SIZE));
    EXPECT_EQ(std::string(property(disk, KEY_MODEL)), "A");
    EXPECT_THAT(property(nodeAt(inventory, "/machine/bios"), KEY_OTHER_FACTS).operator IC::StringArray(),
                ElementsAre("DMIBIOSDate=yesterday"));
    EXPECT_FALSE(has(nodeAt(inventory, "/machine"), KEY_RELEASED));
    expectSound(inventory);
}

TEST(InventoryNodes, DescribeOnlyPartsOfTheMachineThatHaveFacts)
{
    const Inventory inventory =
        readExport(machineWith(info("DMIBoardName", "  ") + info("DMIChassisVendor", "Vexilon")));
    const auto counts = countsOf(inventory);
    EXPECT_EQ(counts.count("Planar"), 0u);
    EXPECT_EQ(counts.count("BIOS"), 0u);
    EXPECT_EQ(counts.at("Chassis"), 1u);
}

TEST(InventoryAlerts, NameNodesThatTheSystemMayNotUse)
{
    // The system may use threads 0 to 4 of 8: the first package, one thread of the next core, nothing of the last.
    std::string xml = synthetic("pack:2 core:2 pu:2");
    replace(xml, "allowed_cpuset=\"0x000000ff\"", "allowed_cpuset=\"0x0000001f\"");
    const Inventory inventory = readExport(xml);
    std::vector<std::string> texts;
    for (const IC::Alert& alert : alertsOf(inventory.nodes)) {
        ASSERT_EQ(alert.getNodePaths().size(), 1u);
        texts.push_back(alert.getNodePaths().front() + " " + std::to_string(alert.getStatus()));
        EXPECT_EQ(nodeAt(inventory, alert.getNodePaths().front()).getStatus(), alert.getStatus());
    }
    EXPECT_THAT(texts, ElementsAre("/machine/package-1 2"));
    EXPECT_EQ(nodeAt(inventory, "/machine/package-1/core-2").getStatus(), STATUS_PARTLY_USABLE);
    EXPECT_EQ(nodeAt(inventory, "/machine/package-1/core-3").getStatus(), STATUS_NOT_USABLE);
    EXPECT_EQ(property(nodeAt(inventory, "/machine/package-1/core-3"), KEY_USABLE),
              IC::PropertyValue(IC::Number(false)));
}

TEST(InventoryAlerts, AreRaisedOnceForACpuAndOnceForItsMemoryArray)
{
    std::string xml = synthetic("pack:2 numa:1 core:2 pu:2");
    replace(xml, "allowed_cpuset=\"0x000000ff\"", "allowed_cpuset=\"0x0000000f\"");
    replace(xml, "allowed_nodeset=\"0x00000003\"", "allowed_nodeset=\"0x00000001\"");
    const Inventory inventory = readExport(xml);
    const auto alerts = alertsOf(inventory.nodes);
    ASSERT_EQ(alerts.size(), 2u);
    EXPECT_THAT(alerts[0].getNodePaths(), ElementsAre("/machine/package-1"));
    EXPECT_THAT(alerts[1].getNodePaths(), ElementsAre("/machine/numa-1"));
    EXPECT_EQ(nodeAt(inventory, "/machine/package-1/core-2").getStatus(), STATUS_NOT_USABLE);
    EXPECT_EQ(nodeAt(inventory, "/machine/numa-1").getStatus(), STATUS_NOT_USABLE);
    EXPECT_EQ(nodeAt(inventory, "/machine/numa-0").getStatus(), STATUS_FINE);
    EXPECT_EQ(nodeAt(inventory, "/machine").getStatus(), STATUS_FINE);
}

TEST(InventoryAlerts, AreRaisedForTheMachineIfNoPartOfItInTheTreeLacksSomething)
{
    std::string xml = synthetic("pack:2 core:2 pu:2");
    replace(xml, "complete_cpuset=\"0x000000ff\"", "complete_cpuset=\"0x00000fff\"");
    replace(xml, "complete_nodeset=\"0x00000001\"", "complete_nodeset=\"0x00000007\"");
    const Inventory inventory = readExport(xml);
    const auto alerts = alertsOf(inventory.nodes);
    ASSERT_EQ(alerts.size(), 1u);
    EXPECT_THAT(alerts[0].getNodePaths(), ElementsAre("/machine"));
    EXPECT_EQ(alerts[0].getStatus(), STATUS_PARTLY_USABLE);
    const IC::Node& machine = nodeAt(inventory, "/machine");
    EXPECT_EQ(property(machine, KEY_UNUSABLE_THREADS).operator unsigned int(), 4u);
    EXPECT_EQ(property(machine, KEY_UNUSABLE_CORES).operator unsigned int(), 2u);
    EXPECT_EQ(property(machine, KEY_UNUSABLE_CPUS).operator unsigned int(), 0u);
    EXPECT_EQ(property(machine, KEY_UNUSABLE_MEMORY_ARRAYS).operator unsigned int(), 2u);
}

TEST(InventoryAlerts, AreRaisedForMemoryModulesOfUnknownSize)
{
    for (const char* size : {"", "0", "Unknown", "-1"}) {
        SCOPED_TRACE(size);
        const Inventory inventory =
            readExport(machineWith("",
                                   "<object type=\"Misc\" subtype=\"MemoryModule\">" + info("Size", size)
                                       + info("PartNumber", "HMT351R7CFR8C-PB") + "</object>"));
        const auto alerts = alertsOf(inventory.nodes);
        ASSERT_EQ(alerts.size(), 1u);
        EXPECT_EQ(alerts[0].getStatus(), STATUS_SIZE_UNKNOWN);
        EXPECT_THAT(alerts[0].getNodePaths(), ElementsAre("/machine/dimm"));
    }
}

TEST(InventoryAlerts, AreNotRaisedForEmptyMemorySlots)
{
    const Inventory inventory = readExport(
        machineWith("",
                    "<object type=\"Misc\" subtype=\"MemoryModule\">" + info("DeviceLocation", "A1")
                        + info("Vendor", "NO DIMM") + info("SerialNumber", "00000000")
                        + info("PartNumber", "Not Specified") + info("Size", "0") + "</object>"));
    EXPECT_EQ(nodeAt(inventory, "/machine/dimm-A1").getStatus(), STATUS_FINE);
    EXPECT_EQ(alertsOf(inventory.nodes).size(), 0u);
}

TEST(InventoryExports, CutOffAnywhereAreRefusedOrRead)
{
    const std::string xml = machineWith(info("DMIProductName", "x"));
    std::size_t refused = 0;
    for (std::size_t length = 0; length < xml.size(); length += 97) {
        try {
            expectSound(readExport(xml.substr(0, length)));
        } catch (const BadInput&) {
            ++refused;
        }
    }
    EXPECT_GT(refused, 10u);
    expectSound(readExport(xml));
}

TEST(InventoryExports, OfAnotherFormatAreRefused)
{
    std::string xml = synthetic("pack:1 core:1 pu:1");
    replace(xml, "topology version=\"2.0\"", "topology version=\"99.0\"");
    EXPECT_THROW(readExport(xml), BadInput);
    EXPECT_THROW(readExport("<?xml version=\"1.0\"?><machine/>"), BadInput);
    EXPECT_THROW(readExport("\x89PNG"), BadInput);
    EXPECT_THROW(readExport(machineWith("", "<object type=\"Turbine\"/>")), BadInput);
}

// hwloc has two parsers, one of them in a separate package; they accept different bytes.
TEST(InventoryExports, WithBytesThatAreNotUtf8AreRefusedOrSound)
{
    try {
        expectSound(readExport(machineWith(info("DMIProductName", "\xff\xfe"))));
    } catch (const BadInput& refusal) {
        EXPECT_THAT(refusal.what(), HasSubstr("not a machine that hwloc"));
    }
}

// A core without complete_cpuset crashes hwloc 2.9.
TEST(InventoryExports, ThatCrashHwlocAreRefused)
{
    std::string xml = synthetic("pack:1 core:2 pu:2");
    const auto core = xml.find("type=\"Core\"");
    const auto set = xml.find(" complete_cpuset=", core);
    xml.erase(set, xml.find("\" ", set) + 1 - set);
    EXPECT_THROW(readExport(xml), BadInput);
}

TEST(InventoryExports, WithMissingAttributesAreRead)
{
    const Inventory inventory = readExport(machineWith(
        "",
        "<object type=\"PCIDev\"/><object type=\"PCIDev\" pci_busid=\"zz\" pci_type=\"0200\"/>"
        "<object type=\"OSDev\"/><object type=\"Misc\"/><object type=\"Misc\" subtype=\"MemoryModule\"/>"
        "<object type=\"PCIDev\" pci_busid=\"ffff:ff:1f.7\" pci_type=\"0300 [ffff:ffff] [ffff:ffff] ff\""
        " pci_link_speed=\"-1\"/>"));
    expectSound(inventory);
    EXPECT_EQ(std::string(property(nodeAt(inventory, "/machine/display-ffff:ff:1f.7"), KEY_LINK_SPEED)),
              "not a number");
}

TEST(InventoryExports, MayHoldCodesThatHwlocDoesNotKnow)
{
    for (const char* code : {"-1", "6", "77", "99999999999", "block"}) {
        SCOPED_TRACE(code);
        std::string xml = synthetic("pack:1 l2:1 core:1 pu:1");
        replace(xml, "cache_type=\"0\"", std::string("cache_type=\"") + code + "\"");
        xml.insert(xml.rfind("</object>"),
                   std::string("<object type=\"OSDev\" name=\"x\" osdev_type=\"") + code + "\"/>");
        expectSound(readExport(xml));
    }
}

TEST(InventoryExports, MayHoldThousandsOfObjectsAndNestDeeply)
{
    std::string objects;
    for (int i = 0; i < 3000; ++i)
        objects += "<object type=\"OSDev\" osdev_type=\"2\" name=\"eth\"/>";
    for (int i = 0; i < 200; ++i)
        objects += "<object type=\"Misc\" subtype=\"MemoryModule\">";
    for (int i = 0; i < 200; ++i)
        objects += "</object>";
    const Inventory deep = readExport(machineWith("", objects));
    EXPECT_EQ(deep.nodes.size(), 4 + 3000 + 200);
    std::ostringstream out;
    writeTree(out, deep.nodes, {true, true});
    EXPECT_EQ(countsOf(readExport(synthetic("pack:16 core:128 pu:2"))).at("CPU Core"), 2048u);
}

// --- Exports of real machines ---

class InventoryOfRealMachines : public testing::Test {
protected:
    void SetUp() override
    {
        if (realMachines().empty())
            GTEST_SKIP() << whyNoMachines;
    }

    static Inventory read(const std::string& name) { return readExport(readFile(realMachine(name))); }

    static constexpr const char* names[] = {"x86-2socket-dimms-nvme-infiniband",
                                            "x86-24socket-384thread",
                                            "x86-16socket-disks-nics",
                                            "x86-2socket-16gpu",
                                            "power8-4gpu",
                                            "arm64-20core-workstation",
                                            "cxlmem+dax.v2",
                                            "memorysidecaches",
                                            "16em64t-4s2c2t-offlines"};
};

TEST_F(InventoryOfRealMachines, HasEveryNode)
{
    using Counts = std::map<std::string, unsigned int>;
    const std::map<std::string, Counts> expected {
        {names[0],
         {{"BIOS", 1},
          {"CPU", 2},
          {"CPU Core", 16},
          {"Cache", 50},
          {"Chassis", 1},
          {"Computer", 1},
          {"DIMM", 8},
          {"Disk Controller", 2},
          {"Hard Drive", 2},
          {"Memory Array", 2},
          {"Memory Device", 8},
          {"Network Controller", 3},
          {"Network Port", 3},
          {"Planar", 1},
          {"Slot", 2},
          {"USB Controller", 2},
          {"Video", 2}}},
        {names[1],
         {{"BIOS", 1},
          {"CPU", 24},
          {"CPU Core", 192},
          {"Cache", 600},
          {"Computer", 1},
          {"Disk Controller", 4},
          {"Hard Drive", 2},
          {"Memory Array", 24},
          {"Network Controller", 7},
          {"Network Port", 7},
          {"OS", 1},
          {"Video", 1}}},
        {names[2],
         {{"BIOS", 1},
          {"CPU", 16},
          {"CPU Core", 96},
          {"Cache", 160},
          {"Chassis", 1},
          {"Computer", 1},
          {"Disk Controller", 5},
          {"Group", 4},
          {"Hard Drive", 3},
          {"Memory Array", 4},
          {"Network Controller", 8},
          {"Network Port", 8},
          {"OS", 1},
          {"Planar", 1},
          {"Video", 1}}},
        {names[3],
         {{"CPU", 2},
          {"CPU Core", 4},
          {"Cache", 14},
          {"Computer", 1},
          {"IO Module", 12},
          {"Memory Array", 2},
          {"Planar", 1},
          {"Video", 16}}},
        {names[4],
         {{"CPU", 2},
          {"CPU Core", 8},
          {"Cache", 8},
          {"Computer", 1},
          {"Memory Array", 2},
          {"OS", 1},
          {"Video", 4}}},
        {names[5],
         {{"BIOS", 1},
          {"CPU", 1},
          {"CPU Core", 20},
          {"Cache", 62},
          {"Chassis", 1},
          {"Computer", 1},
          {"Memory Array", 1},
          {"OS", 1},
          {"Planar", 1}}},
        {names[6],
         {{"BIOS", 1},
          {"CPU", 1},
          {"CPU Core", 4},
          {"Cache", 13},
          {"Chassis", 1},
          {"Computer", 1},
          {"Disk Controller", 1},
          {"Hard Drive", 1},
          {"Memory Array", 1},
          {"Memory Device", 5},
          {"Network Controller", 1},
          {"Network Port", 1},
          {"OS", 1},
          {"Slot", 7},
          {"Video", 1}}},
        {names[7],
         {{"BIOS", 1},
          {"CPU", 2},
          {"CPU Core", 40},
          {"Cache", 46},
          {"Chassis", 1},
          {"Computer", 1},
          {"Group", 4},
          {"Memory Array", 4},
          {"OS", 1},
          {"Planar", 1}}},
        {names[8], {{"CPU", 4}, {"CPU Core", 6}, {"Cache", 16}, {"Computer", 1}, {"Memory Array", 1}}}};
    std::set<std::string> sensorTypes;
    for (const char* name : names) {
        SCOPED_TRACE(name);
        const auto counts = countsOf(read(name));
        EXPECT_EQ(counts, expected.at(name));
        for (const auto& [sensorType, count] : counts)
            sensorTypes.insert(sensorType);
    }
    EXPECT_EQ(sensorTypes.size(), 20u);
}

TEST_F(InventoryOfRealMachines, ReadsBackEveryProperty)
{
    for (const char* name : names) {
        SCOPED_TRACE(name);
        expectSound(read(name));
    }
}

TEST_F(InventoryOfRealMachines, KeepsTheirValuesUnchanged)
{
    const Inventory machine = read("x86-2socket-dimms-nvme-infiniband");
    const IC::Node& module = nodeAt(machine, "/machine/dimm-DIMM_A1");
    EXPECT_EQ(std::string(property(module, KEY_LOCATION)), "DIMM_A1 ");
    EXPECT_EQ(std::string(property(module, KEY_PART_NUMBER)), "HMT351R7CFR8C-PB  ");
    EXPECT_EQ(module.getStatus(), STATUS_SIZE_UNKNOWN);
    EXPECT_EQ(alertsOf(machine.nodes).size(), 8u);
    EXPECT_FALSE(has(nodeAt(machine, "/machine"), KEY_REVISION));
    EXPECT_FALSE(has(nodeAt(machine, "/machine/chassis"), KEY_REVISION));
    EXPECT_EQ(property(nodeAt(machine, "/machine/numa-0"), KEY_SIZE).operator unsigned long long(),
              17149054976u);
    EXPECT_EQ(property(nodeAt(machine, "/machine/numa-0"), KEY_PAGE_COUNTS).operator IC::NumberArray(),
              (IC::NumberArray {4186781ull, 0ull}));
    const IC::Node& port = nodeAt(machine, "/machine/network-0000:82:00.0/ib0");
    EXPECT_EQ(property(port, KEY_ADDRESS).operator IC::Buffer().size(), 20u);
    const Inventory workstation = read("arm64-20core-workstation");
    const IC::Node& core = nodeAt(workstation, "/machine/package-36/core-5");
    EXPECT_EQ(property(core, KEY_FREQUENCY).operator double(), 3900.0);
    EXPECT_EQ(property(core, KEY_CAPACITY).operator unsigned int(), 997u);
}

TEST_F(InventoryOfRealMachines, HasOneNodeForEachDeviceWithWhatEachDriverKnows)
{
    const Inventory gpus = read("power8-4gpu");
    const IC::Node& gpu = nodeAt(gpus, "/machine/display-0002:01:00.0");
    EXPECT_THAT(property(gpu, KEY_VIEWS).operator IC::StringArray(),
                ElementsAre("cuda0", "nvml0", "opencl0d0"));
    EXPECT_EQ(std::string(property(gpu, KEY_MODEL)), "Tesla P100-SXM2-16GB");
    EXPECT_EQ(std::string(property(gpu, KEY_SUBTYPE)), "CUDA");
    EXPECT_EQ(property(gpu, KEY_SIZE).operator unsigned long long(), 17071734784u);
    EXPECT_THAT(
        property(gpu, KEY_OTHER_FACTS).operator IC::StringArray(),
        testing::IsSupersetOf({"CUDAMultiProcessors=56", "subtype=NVML", "subtype=OpenCL", "Backend=NVML"}));

    const Inventory expanders = read("cxlmem+dax.v2");
    const IC::Node& expander = nodeAt(expanders, "/machine/cxl-0000:16:00.0");
    EXPECT_EQ(expander.getSensor(), IC::Node::SENSOR_MEMORY_DEVICE);
    EXPECT_EQ(expander.getParent(), "/machine/slot-0/slot-2/slot-7");
    EXPECT_THAT(property(expander, KEY_VIEWS).operator IC::StringArray(), ElementsAre("mem1"));
    EXPECT_EQ(property(expander, KEY_SIZE).operator unsigned long long(), 536870912u);
}

TEST_F(InventoryOfRealMachines, AreDescribedInUnderASecond)
{
    const auto begin = std::chrono::steady_clock::now();
    for (const char* name : names) {
        const Inventory inventory = read(name);
        std::ostringstream out;
        writeTree(out, inventory.nodes, {false, true});
        writeAlerts(out, alertsOf(inventory.nodes));
        writeSummary(out, inventory.nodes);
        EXPECT_GT(out.str().size(), 10000u);
    }
    const std::chrono::duration<double> took = std::chrono::steady_clock::now() - begin;
#ifdef NDEBUG
    EXPECT_LT(took.count(), 1.0);
#else
    EXPECT_LT(took.count(), 20.0);  // debug builds and sanitizers are slower
#endif
}

// --- The program ---

class InventoryProgram : public testing::Test {
protected:
    static Outcome run(std::vector<std::string> arguments)
    {
        arguments.insert(arguments.begin(), {"env", "LC_ALL=C", INVENTORY_PROGRAM});
        return runProgram(arguments);
    }

    Folder folder;
    std::string small = folder.write("small.xml", synthetic("pack:1 core:2 pu:1"));
};

TEST_F(InventoryProgram, WritesATreeInPlainWords)
{
    const Outcome outcome = run({small});
    EXPECT_EQ(outcome.status, 0);
    EXPECT_EQ(outcome.err, "");
    EXPECT_EQ(outcome.out,
              "machine\n"
              "  Processors  1 processor, 2 cores, 2 threads\n"
              "  Memory      1 GiB\n"
              "  Alerts      none\n"
              "\n"
              "machine\n"
              "  package-0: 2 cores, 2 threads (0-1)\n"
              "    2 x core: 1 thread\n"
              "    NUMA node numa-0: 1 GiB\n");
    EXPECT_EQ(run({small, "--all"}).out,
              "machine\n"
              "  Processors  1 processor, 2 cores, 2 threads\n"
              "  Memory      1 GiB\n"
              "  Alerts      none\n"
              "\n"
              "machine\n"
              "  package-0: 2 cores, 2 threads (0-1)\n"
              "    core-0: 1 thread\n"
              "    core-1: 1 thread\n"
              "    NUMA node numa-0: 1 GiB\n"
              "\n"
              "Alerts: 0\n"
              "\n"
              "Nodes: 5, sensor types: 4\n"
              "     1  CPU\n"
              "     1  Memory Array\n"
              "     1  Computer\n"
              "     2  CPU Core\n");
}

TEST_F(InventoryProgram, WritesNodesAsALogShowsThem)
{
    const auto lines = linesOf(run({"--log", small}).out);
    ASSERT_GE(lines.size(), 3u);
    EXPECT_EQ(lines[0], "Node 2f6d616368696e65 : 40, status = 0");
    EXPECT_EQ(lines[1], "  Node 2f6d616368696e652f7061636b6167652d30 : 4, status = 0");
}

TEST_F(InventoryProgram, WritesPropertiesWithTheirNames)
{
    const Outcome outcome = run({small, "--properties"});
    EXPECT_EQ(outcome.status, 0);
    EXPECT_THAT(outcome.out,
                HasSubstr("    core-1: 1 thread\n"
                          "        [1 = CPU Core:1] this node\n"
                          "        [2 = CPU:0] parent node\n"
                          "        [5 = 1] number given by the system\n"
                          "        [6 = true] the system may use it\n"));
    EXPECT_THAT(outcome.out, Not(HasSubstr("label")));  // an empty one
}

TEST_F(InventoryProgram, WritesAlerts)
{
    const std::string file = folder.write("alert.xml",
                                          machineWith("",
                                                      "<object type=\"Misc\" subtype=\"MemoryModule\">"
                                                          + info("PartNumber", "A1") + "</object>"));
    const Outcome outcome = run({file, "--all"});
    EXPECT_EQ(outcome.status, 0);
    EXPECT_THAT(outcome.out,
                HasSubstr("\n  Alerts      1\n    warning /machine/dimm, DIMM: its size is unknown\n"));
    EXPECT_THAT(outcome.out, HasSubstr("  memory module dimm: A1 -- its size is unknown\n"));
    EXPECT_THAT(outcome.out,
                HasSubstr("Alerts: 1\n  /machine/dimm, DIMM: its size is unknown\n"
                          "    Alert 1; 1; 3; DIMM: its size is unknown; "));
    EXPECT_THAT(outcome.out, HasSubstr("; { 2f6d616368696e652f64696d6d }\n"));
}

TEST_F(InventoryProgram, ChangesAProperty)
{
    for (const char* text : {"rack 4", "", "-5", "{}", "--log"}) {
        SCOPED_TRACE(text);
        const Outcome outcome = run({"--set", "/machine/package-0", "4", text, small});
        EXPECT_EQ(outcome.status, 0);
        EXPECT_EQ(outcome.out,
                  "0 (changed)\n[4 = " + std::string(text)
                      + "] label (the operator's own)\n"
                        "Node 2f6d616368696e652f7061636b6167652d30 : 4, status = 0\n");
        EXPECT_THAT(outcome.err,
                    HasSubstr("info Vexilon.IC.Node setProperty: setProperty: 4 " + std::string(text)));
    }
}

TEST_F(InventoryProgram, TellsWhyAPropertyIsNotChanged)
{
    Outcome outcome = run({small, "--set", "/machine/package-0", "5", "7"});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_EQ(outcome.out,
              "16 (read-only)\n[5 = 0] number given by the system\n"
              "Node 2f6d616368696e652f7061636b6167652d30 : 4, status = 0\n");
    EXPECT_THAT(outcome.err, HasSubstr("error Vexilon.IC.Node setProperty: setProperty: 5 read-only\n"));
    outcome = run({small, "--set", "/machine/package-0", "99", "7"});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_EQ(outcome.out,
              "5 (no such property)\nNode 2f6d616368696e652f7061636b6167652d30 : 4, status = 0\n");
    EXPECT_THAT(outcome.err,
                HasSubstr("error Vexilon.IC.Node setProperty: setProperty: 99 does not exist\n"));
}

TEST_F(InventoryProgram, RefusesBadInputInOneLine)
{
    std::string newer = synthetic("pack:1 core:1 pu:1");
    replace(newer, "topology version=\"2.0\"", "topology version=\"99.0\"");
    std::string crashing = synthetic("pack:1 core:2 pu:2");
    const auto set = crashing.find(" complete_cpuset=", crashing.find("type=\"Core\""));
    crashing.erase(set, crashing.find("\" ", set) + 1 - set);
    const std::string topology = " is no machine";
    const struct {
        std::vector<std::string> arguments;
        std::string told;
    } rows[] = {
        {{folder.path("missing.xml")}, "missing.xml: No such file or directory"},
        {{folder.path("")}, ": Is a directory"},
        {{""}, ": No such file or directory"},
        {{"/dev/zero"}, "/dev/zero: too large for a machine"},
        {{folder.write("empty.xml", "")}, "empty.xml: not a machine that hwloc "},
        {{folder.write("text.xml", "hello\n")}, "text.xml: not a machine that hwloc "},
        {{folder.write("cut.xml", synthetic("pu:2").substr(0, 700))}, "cut.xml: not a machine that hwloc "},
        {{folder.write("newer.xml", newer)}, "newer.xml: not a machine that hwloc "},
        {{folder.write("crash.xml", crashing)}, "crash.xml: not a machine that hwloc "},
        {{small, small}, "not expected"},
        {{"--colour"}, "--colour"},
        {{"--set", "/machine"}, "--set"},
        {{"--log=maybe", small}, "--log"},
        {{small, "--set", "/machine/package-9", "4", "x"}, "no node has the path '/machine/package-9'"},
        {{small, "--set", "/machine/package-0", "four", "x"}, "'four' is not a property number"},
        {{small, "--set", "/machine/package-0", "-4", "x"}, "'-4' is not a property number"},
        {{small, "--set", "/machine/package-0", "4294967296", "x"}, "'4294967296' is not a property number"},
        {{small, "--set", "\x1b[2J\n", "4", "x"}, "no node has the path '\\x1b[2J\\x0a'"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.told);
        const Outcome outcome = run(row.arguments);
        EXPECT_EQ(outcome.status, 2);
        EXPECT_EQ(outcome.out, "");
        EXPECT_EQ(linesOf(outcome.err).size(), 1u) << outcome.err;
        EXPECT_EQ(outcome.err.substr(0, 11), "inventory: ");
        EXPECT_THAT(outcome.err, HasSubstr(row.told));
    }
}

TEST_F(InventoryProgram, GivesUpWhatNeverEnds)
{
    const std::string never = folder.path("never");
    ASSERT_EQ(mkfifo(never.c_str(), S_IRUSR | S_IWUSR), 0);
    std::string modules;
    for (int i = 0; i < 200000; ++i)  // hwloc takes quadratic time
        modules += "<object type=\"Misc\" subtype=\"MemoryModule\"/>";
    const std::string large = folder.write("large.xml", machineOf("", modules));
    const auto begin = std::chrono::steady_clock::now();
    auto waiting = std::async(std::launch::async, [&] { return run({never}); });
    const Outcome computing = run({large});
    const std::chrono::duration<double> took = std::chrono::steady_clock::now() - begin;
    EXPECT_EQ(computing.status, 2);
    EXPECT_EQ(computing.err, "inventory: " + large + ": takes more than 10 s\n");
    EXPECT_GT(took.count(), 9);
    EXPECT_LT(took.count(), 60);  // a busy machine is slower
    const Outcome waited = waiting.get();
    EXPECT_EQ(waited.status, 2);
    EXPECT_EQ(waited.err, "inventory: " + never + ": nobody wrote to it for 10 s\n");
}

TEST_F(InventoryProgram, GivesUpWhatFillsTheMemory)
{
    if (!limitsMemory)
        GTEST_SKIP() << "a sanitizer reserves more addresses than an export may take";
    std::string threads;  // for a high number hwloc allocates a set of half a GiB
    for (unsigned int number = 4294967200; number < 4294967208; ++number)
        threads += "<object type=\"PU\" os_index=\"" + std::to_string(number) + "\"/>";
    std::string xml = machineOf("", threads);
    const std::string sets =
        xml.substr(xml.find(" cpuset="), xml.find('>', xml.find(" cpuset=")) - xml.find(" cpuset="));
    for (std::size_t at = 0; (at = xml.find("\"/>", xml.find("os_index=\"42949", at))) != std::string::npos;
         ++at)
        xml.insert(at + 1, sets);
    const std::string file = folder.write("numbers.xml", xml);
    const Outcome outcome = run({file});
    EXPECT_EQ(outcome.status, 2);
    EXPECT_EQ(outcome.err, "inventory: " + file + ": takes more than 2 GiB\n");
}

TEST_F(InventoryProgram, ReadsAPipe)
{
    const Outcome outcome =
        runProgram({"sh", "-c", "{ head -c 100 \"$1\"; sleep 0.2; tail -c +101 \"$1\"; } | \"$0\" /dev/stdin",
                    INVENTORY_PROGRAM, small});
    EXPECT_EQ(outcome.status, 0) << outcome.err;
    EXPECT_EQ(outcome.out, runProgram({INVENTORY_PROGRAM, small}).out);
}

TEST_F(InventoryProgram, ReportsThatItCannotWrite)
{
    const Outcome outcome = runWithoutSpace({INVENTORY_PROGRAM, small});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_EQ(outcome.err, "inventory: the output cannot be written\n");
}

TEST_F(InventoryProgram, WritesNoControlCharacters)
{
    // One of hwloc's parsers accepts control characters that XML forbids, the other only those that XML allows.
    const struct {
        const char* libxml;
        const char* text;
    } rows[] = {{"HWLOC_LIBXML=0", "\x1b[2J\x07"},
                {"HWLOC_LIBXML=1",
                 "\xc2\x9b"
                 "2J\xe2\x80\xae"}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.libxml);
        const std::string file =
            folder.write("hostile.xml",
                         machineWith(info("DMIProductName", row.text) + info(row.text, row.text),
                                     std::string("<object type=\"OSDev\" osdev_type=\"2\" name=\"") + row.text
                                         + "\">" + info("Address", row.text) + "</object>"));
        const Outcome outcome =
            runProgram({"env", "LC_ALL=C", row.libxml, INVENTORY_PROGRAM, "--properties", file});
        EXPECT_EQ(outcome.status, 0) << outcome.err;
        EXPECT_THAT(outcome.out, HasSubstr("2J\\x"));
        for (const char character : outcome.out)
            EXPECT_TRUE(character == '\n' || (character >= ' ' && character <= '~')) << int {character};
    }
}

TEST_F(InventoryProgram, ShowsTraceRecordsOnRequest)
{
    const std::vector<std::string> change {INVENTORY_PROGRAM, "--set", "/machine", "4", "x", small};
    std::vector<std::string> words {"env", "SPDLOG_LEVEL=trace"};
    words.insert(words.end(), change.begin(), change.end());
    EXPECT_EQ(linesOf(runProgram(change).err).size(), 1u);
    EXPECT_EQ(linesOf(runProgram(words).err).size(), 2u);
}

TEST_F(InventoryProgram, PrintsItsHelpAndItsVersion)
{
    const Outcome help = run({"--help"});
    EXPECT_EQ(help.status, 0);
    for (const char* option : {"FILE", "--log", "--properties", "--set PATH NUMBER TEXT", "--version"})
        EXPECT_THAT(help.out, HasSubstr(option));
    const Outcome version = run({"--version"});
    EXPECT_EQ(version.status, 0);
    EXPECT_EQ(version.out.substr(0, 10), "inventory ");
}

TEST_F(InventoryProgram, DescribesThisMachine)
{
    // hwloc finds PCI devices in two ways; its plugin "pci" leaks memory.
    setenv("HWLOC_COMPONENTS", "-pci", 1);
    const Outcome outcome = run({"--properties"});
    EXPECT_EQ(outcome.status, 0);
    EXPECT_EQ(outcome.err, "");
    EXPECT_THAT(outcome.out, HasSubstr("\n  Alerts      "));
    EXPECT_THAT(outcome.out, HasSubstr("  CPU Core\n"));
    const Inventory first = readThisMachine();
    expectSound(first);
    EXPECT_EQ(pathsOf(readThisMachine()), pathsOf(first));
    unsetenv("HWLOC_COMPONENTS");
}

}  // namespace
