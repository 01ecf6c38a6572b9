// What a person sees: the first screen, the tree, terminals, the drawing and the page.
#include <gmock/gmock.h>
#include <hwloc.h>
#include <hwloc/export.h>
#include <pty.h>

#include <cmath>
#include <cstring>
#include <regex>
#include <set>

#include "colours.h"
#include "inventory_run.h"
#include "reading.h"
#include "synthetic.h"
#include "values.h"
#include "writing.h"

namespace {

using namespace inventory;
using testing::AllOf;
using testing::EndsWith;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;

// Two processors with eight cores each, memory modules and devices.
std::string server(const std::string& modules)
{
    std::string xml = synthetic("pack:2 [numa(memory=1073741824)] l3:1(size=20971520) l2:8(size=1048576) "
                                "l1d:1(size=32768) l1i:1(size=32768)"
                                " core:1 pu:2(indexes=core:pu)");
    const auto addBehind = [&](const std::string& mark, const std::string& text) {
        for (auto at = xml.find(mark); at != std::string::npos; at = xml.find(mark, at + 1 + text.size()))
            xml.insert(xml.find('>', at) + 1, text);
    };
    addBehind("<object type=\"Package\"", fact("CPUModel", "AMD EPYC 7313 16-Core Processor"));
    addBehind("<object type=\"Machine\"",
              fact("HostName", "node7") + fact("DMISysVendor", "Maker") + fact("DMIProductName", "Model 9"));
    std::string objects = modules;
    const auto device = [&](int bus, const std::string& ids, const std::string& product,
                            const std::string& inner) {
        objects += "<object type=\"PCIDev\" pci_busid=\"0000:0" + std::to_string(bus)
            + ":00.0\" pci_link_speed=\"7.876923\" pci_type=\"" + ids + " [0000:0000] 01\">" + product + inner
            + "</object>";
    };
    const std::string network =
        fact("PCIVendor", "Intel Corporation") + fact("PCIDevice", "I350 Gigabit Network Connection");
    const auto port = [](const std::string& name, const std::string& address) {
        return "<object type=\"OSDev\" osdev_type=\"2\" name=\"" + name + "\">" + fact("Address", address)
            + "</object>";
    };
    const auto disk = [](const std::string& name) {
        return "<object type=\"OSDev\" osdev_type=\"0\" name=\"" + name + "\">" + fact("Size", "468851544")
            + fact("Model", "SSD 1") + "</object>";
    };
    device(1, "0200 [8086:1521]", network, port("eth0", "00:00:00:00:00:01"));
    device(2, "0200 [8086:1521]", network, port("eth1", "00:00:00:00:00:02"));
    device(3, "0106 [8086:1d02]", fact("PCIDevice", "SATA Controller"), disk("sda") + disk("sdb"));
    xml.insert(xml.rfind("</object>"), objects);
    return xml;
}

std::string memoryModule(const std::string& place, const std::string& size)
{
    return "<object type=\"Misc\" subtype=\"MemoryModule\">" + fact("DeviceLocation", place)
        + (size.empty() ? "" : fact("Size", size)) + fact("PartNumber", "P-1") + "</object>";
}

constexpr Look utf8 {false, Look::LINES_NONE, true, 0};

std::string firstScreen(const Inventory& inventory, const Look& look = utf8)
{
    std::ostringstream out;
    writeFirstScreen(out, inventory.nodes, look);
    return out.str();
}

std::string tree(const Inventory& inventory, const TreeForm& form = {false, false, false, utf8})
{
    std::ostringstream out;
    writeTree(out, inventory.nodes, form);
    return out.str();
}

std::size_t columnsOf(const std::string& line)
{
    return static_cast<std::size_t>(
        std::count_if(line.begin(), line.end(), [](char byte) { return (byte & 0xC0) != 0x80; }));
}

// --- The first screen and the tree ---

TEST(InventoryFirstScreen, SaysWhatTheMachineIsAndWhatIsWrong)
{
    const std::string modules =
        memoryModule("A1", "16777216") + memoryModule("A2", "16777216") + memoryModule("A3", "");
    const std::string screen = firstScreen(readExport(server(modules)));
    EXPECT_THAT(
        screen,
        StartsWith("node7: Maker Model 9\n"
                   "  Processors  2 × AMD EPYC 7313, 16 cores, 32 threads\n"
                   "  Memory      2 GiB in 2 NUMA nodes\n"
                   "              2 × 16 GiB, P-1\n"
                   "              1 × P-1, its size is unknown\n"
                   "  Network     2 × Intel Corporation I350 Gigabit Network Connection (eth0, eth1)\n"
                   "  Disks       2 × SSD 1, 447.1 GiB (sda, sdb)\n"
                   "  Alerts      1\n"
                   "    warning /machine/"));
    EXPECT_THAT(screen, EndsWith(", DIMM: its size is unknown\n"));
    EXPECT_THAT(firstScreen(readExport(server("")), {}),
                AllOf(HasSubstr("  Processors  2 x AMD EPYC 7313, 16 cores, 32 threads\n"),
                      HasSubstr("  Alerts      none\n")));
}

TEST(InventoryFirstScreen, SaysHowManyMoreAlertsThereAre)
{
    std::string modules;
    for (int i = 0; i < 100; ++i)
        modules += memoryModule("A" + std::to_string(i), "");
    const std::vector<std::string> lines = linesOf(firstScreen(readExport(server(modules))));
    ASSERT_EQ(lines.size(), 25u);
    EXPECT_EQ(lines[6], "  Alerts      100");
    EXPECT_THAT(lines[23], HasSubstr("A16"));
    EXPECT_EQ(lines[24], "    and 83 more; --all writes them");
}

TEST(InventoryTree, HasOneLineForEqualParts)
{
    const std::string modules =
        memoryModule("A1", "16777216") + memoryModule("A2", "16777216") + memoryModule("A3", "");
    std::string text = tree(readExport(server(modules)));
    text = std::regex_replace(text, std::regex("(storage-0000:03:00.0|dimm-A3)"), "NAME");
    EXPECT_EQ(
        text,
        "machine: Maker Model 9\n"
        "  2 × package: AMD EPYC 7313, 8 cores, 16 threads (0-31)\n"
        "    L3: 20 MiB\n"
        "      8 × core: L2 1 MiB, L1d 32 KiB, L1i 32 KiB, 2 threads\n"
        "    NUMA node: 1 GiB\n"
        "  2 × network controller: Intel Corporation I350 Gigabit Network Connection, link 63.02 Gbit/s\n"
        "    network port: eth0, eth1\n"
        "  disk controller NAME: SATA Controller, link 63.02 Gbit/s\n"
        "    2 × hard drive: SSD 1, 447.1 GiB (sda, sdb)\n"
        "  2 × memory module: 16 GiB, P-1\n"
        "  memory module NAME: P-1 -- its size is unknown\n");
}

TEST(InventoryTree, HasEachNodeOnRequest)
{
    const Inventory inventory = readExport(server(""));
    const std::string text = tree(inventory, {false, false, true, utf8});
    EXPECT_EQ(linesOf(text).size(), inventory.nodes.size());
    EXPECT_THAT(text, Not(HasSubstr("×")));
    EXPECT_THAT(text, HasSubstr(": 32 KiB\n"));
    EXPECT_THAT(text, HasSubstr("network port eth0: 00:00:00:00:00:01\n"));
}

TEST(InventoryTree, WritesSetsAsRanges)
{
    const Inventory inventory = readExport(synthetic("pack:2 core:96 pu:2(indexes=2*192:1*2)"));
    const std::string all = tree(inventory, {false, false, true, utf8});
    EXPECT_THAT(all, HasSubstr("96 cores, 192 threads (0-95,192-287)\n"));
    EXPECT_THAT(all, HasSubstr("96 cores, 192 threads (96-191,288-383)\n"));
    EXPECT_THAT(tree(inventory, {false, true, true, utf8}), HasSubstr("= 0-95,192-287]"));
    EXPECT_EQ(rangesOf(IC::NumberArray {3u, 1u, 2u, 9u}), "1-3,9");
    EXPECT_EQ(rangesOf(IC::NumberArray {}), "");
    EXPECT_EQ(rangesOf(IC::NumberArray {-1}), "");
    EXPECT_EQ(rangesOf(IC::NumberArray {4294967295u}), "");
    EXPECT_EQ(rangesOf(std::string("1")), "");
}

struct Made : IC::Node {
    Made(const std::string& itsPath, const std::string& itsParent,
         const std::map<unsigned int, IC::PropertyValue>& its = {}, SensorType sensor = SENSOR_FAN)
        : Node(sensor)
    {
        path = itsPath;
        parent = itsParent;
        properties = its;
    }
};

TEST(InventoryTree, HasTheUnitsOfAPerson)
{
    Nodes nodes;
    const auto add = [&](const char* unit, double reading, IC::Node::SensorType sensor) {
        nodes.push_back(std::make_unique<Made>("/one", "",
                                               std::map<unsigned int, IC::PropertyValue> {
                                                   {KEY_READING, IC::PropertyValue(IC::Number(reading))},
                                                   {KEY_UNIT, IC::PropertyValue(unit)},
                                                   {KEY_UPPER_LIMIT, IC::PropertyValue(IC::Number(3000.0))}},
                                               sensor));
    };
    add("celsius", 45.5, IC::Node::SENSOR_TEMPERATURE_SENSOR);
    add("rpm", 1200, IC::Node::SENSOR_FAN);
    add("volts", 12.05, IC::Node::SENSOR_VOLTAGE_SENSOR);
    add("watts", 250, IC::Node::SENSOR_POWER_DOMAIN);
    add("amperes", -0.25, IC::Node::SENSOR_POWER_DOMAIN);
    add("\x1b[2J", 1, IC::Node::SENSOR_FAN);
    nodes.push_back(
        std::make_unique<Made>("/two", "",
                               std::map<unsigned int, IC::PropertyValue> {
                                   {KEY_SIZE, IC::PropertyValue(IC::Number(ZQ::Uint64 {1} << 34))},
                                   {KEY_CORES, IC::PropertyValue(IC::Number(1e300))},
                                   {KEY_LINK_SPEED, IC::PropertyValue(IC::Number(15.754))}},
                               IC::Node::SENSOR_VIDEO));
    std::ostringstream out;
    writeTree(out, nodes, {false, false, true, utf8});
    EXPECT_EQ(out.str(),
              "temperature sensor one: 45.5 °C, at most 3000 °C\n"
              "fan one: 1200 RPM, at most 3000 RPM\n"
              "voltage sensor one: 12.05 V, at most 3000 V\n"
              "power domain one: 250 W, at most 3000 W\n"
              "power domain one: -0.25 A, at most 3000 A\n"
              "fan one: 1 \\x1b[2J, at most 3000 \\x1b[2J\n"
              "GPU two: 16 GiB, link 126 Gbit/s\n");
    std::ostringstream plain;
    writeTree(plain, nodes, {false, false, true});
    EXPECT_THAT(plain.str(), StartsWith("temperature sensor one: 45.5 C, at most"));
}

TEST(InventoryTree, NamesTheMakerOfADeviceOnce)
{
    const std::pair<std::pair<const char*, const char*>, const char*> rows[] = {
        {{"NVIDIA Corporation", "NVIDIA H100 80GB HBM3"}, "NVIDIA H100 80GB HBM3"},
        {{"NVIDIA Corporation", "Tesla T4"}, "NVIDIA Corporation Tesla T4"},
        {{"AMD", "AMD Instinct MI210"}, "AMD Instinct MI210"},
        {{"Mat Rox", "Matrox G200"}, "Mat Rox Matrox G200"},
    };
    for (const auto& [device, text] : rows) {
        Nodes nodes;
        nodes.push_back(std::make_unique<Made>(
            "/gpu0", "",
            std::map<unsigned int, IC::PropertyValue> {{KEY_MAKER, IC::PropertyValue(device.first)},
                                                       {KEY_MODEL, IC::PropertyValue(device.second)}},
            IC::Node::SENSOR_VIDEO));
        std::ostringstream out;
        writeTree(out, nodes, {});
        EXPECT_EQ(out.str(), std::string("gpu0: ") + text + '\n');
    }
}

TEST(InventoryTree, NamesTheMakerOfAModuleButNotItsCode)
{
    for (const auto& [maker, text] : std::vector<std::pair<std::string, std::string>> {
             {"Samsung", "Samsung P-1"}, {"Face", "Face P-1"}, {"00AD063200AD", "P-1"}, {"0x2c00", "P-1"}}) {
        const Inventory inventory =
            readExport(machineOf("",
                                 "<object type=\"Misc\" subtype=\"MemoryModule\">" + fact("Vendor", maker)
                                     + fact("Size", "1024") + fact("PartNumber", "P-1") + "</object>"));
        EXPECT_THAT(firstScreen(inventory), HasSubstr("  Memory      1 × 1 MiB, " + text + '\n'));
        EXPECT_THAT(tree(inventory), HasSubstr("memory module dimm: 1 MiB, " + text + '\n'));
    }
}

TEST(InventoryTree, HasEveryNodeOfADamagedOrderOnce)
{
    // A parent of its own, a parent that comes later, two nodes of one path.
    Nodes nodes;
    for (const auto& [path, parent] : std::vector<std::pair<const char*, const char*>> {
             {"/a", "/a"}, {"/b", "/c"}, {"/c", "/b"}, {"/c", ""}, {"/d", "/c"}})
        nodes.push_back(std::make_unique<Made>(path, parent));
    std::ostringstream out;
    writeTree(out, nodes, {false, false, true});
    EXPECT_EQ(out.str(), "fan a\nfan b\n  fan c\n    fan d\nfan c\n");
    // So deep that a program that follows it to its end needs more stack than there is.
    std::string parent;
    for (int i = 0; i < 100000; ++i) {
        const std::string path = "/" + std::to_string(i);
        nodes.push_back(std::make_unique<Made>(path, parent));
        parent = path;
    }
    std::ostringstream deep;
    writeTree(deep, nodes, {false, false, true});
    EXPECT_EQ(linesOf(deep.str()).size(), nodes.size());
}

TEST(InventoryTree, IsShortAndFitsTheTerminalForEveryMachine)
{
    if (realMachines().empty())
        GTEST_SKIP() << whyNoMachines;
    for (const std::string& machine : realMachines()) {
        SCOPED_TRACE(machine);
        const Inventory inventory = readExport(readFile(machine));
        EXPECT_LE(linesOf(firstScreen(inventory)).size(), 25u);
        EXPECT_LE(linesOf(tree(inventory)).size(), 150u);
        EXPECT_EQ(linesOf(tree(inventory, {false, false, true})).size(), inventory.nodes.size());
        for (const std::size_t width : {1u, 40u, 80u}) {
            const Look look {false, Look::LINES_DRAWN, true, width};
            for (const std::string& text :
                 {firstScreen(inventory, look), tree(inventory, {false, false, true, look})})
                for (const std::string& line : linesOf(text))
                    EXPECT_LE(columnsOf(line), width) << line;
        }
        // No label without a value, no separator without a text.
        for (const char* empty : {": \n", ", \n", ", ,", "()", " : ", " 0 bytes", " 0 cores", " 0 threads"})
            EXPECT_THAT(firstScreen(inventory) + tree(inventory)
                            + tree(inventory, {false, false, true, utf8}),
                        Not(HasSubstr(empty)));
    }
}

TEST(InventoryTree, ShowsAnAlertAlthoughTheLineIsCut)
{
    const Inventory inventory = readExport(server(memoryModule("A1", "")));
    const Look look {false, Look::LINES_NONE, true, 50};
    EXPECT_THAT(tree(inventory, {false, false, false, look}), HasSubstr(":... -- its size is unknown\n"));
}

// --- The program ---

class InventoryViews : public testing::Test {
protected:
    // With hwloc's parser that accepts characters that XML forbids.
    static Outcome run(std::vector<std::string> words)
    {
        words.insert(words.begin(), {"env", "HWLOC_LIBXML=0", INVENTORY_PROGRAM});
        return runProgram(words);
    }

    // In a pseudo-terminal.
    static Outcome runOnTerminal(const std::vector<std::string>& environment, const std::string& command)
    {
        const std::vector<std::string> usual {"env", "-u", "NO_COLOR", "TERM=xterm",
                                              "PROGRAM=" INVENTORY_PROGRAM};
        return runProgram({"env", "SHELL=/bin/sh", "script", "-qec",
                           quoted(usual) + quoted(environment) + quoted({"sh", "-c", command}), "/dev/null"});
    }

    static bool hasTerminals()
    {
        int ours = -1;
        int its = -1;
        if (openpty(&ours, &its, nullptr, nullptr, nullptr) != 0)
            return false;
        close(ours);
        close(its);
        return true;
    }

    Folder folder;
    std::string file = folder.write("machine.xml", server(memoryModule("A1", "")));
    std::string hostileText =
        "\xff\xfe&quot;\x01\x1b[2J]]&gt;&lt;/text&gt;&lt;/td&gt;&lt;img src=x"
        " onerror=&quot;hacked=1&quot;&gt;&lt;/script&gt;&lt;script&gt;hacked=1&lt;/script&gt;"
        "&amp;amp;'\x7f\xed\xa0\x80\xc3\xa4";
    std::string hostile = folder.write(
        "hostile.xml",
        machineOf(fact("HostName", hostileText) + fact("DMIProductName", hostileText)
                      + fact(hostileText, hostileText) + fact("UUID", "\xc3\xa4"),
                  "<object type=\"OSDev\" osdev_type=\"2\" name=\"" + hostileText + "\">"
                      + fact("Address", hostileText)
                      + "</object><object type=\"Misc\" subtype=\"MemoryModule\">"
                      + fact("DeviceLocation", hostileText) + fact("PartNumber", hostileText) + "</object>"));
};

TEST_F(InventoryViews, FollowTheLocaleInAPipe)
{
    const std::string command = quoted({INVENTORY_PROGRAM, file});
    const Outcome plain = runProgram({"sh", "-c", "LC_ALL=C " + command});
    EXPECT_EQ(plain.status, 0);
    EXPECT_EQ(plain.err, "");
    EXPECT_THAT(plain.out, StartsWith("node7: Maker Model 9\n  Processors  2 x AMD EPYC 7313, "));
    EXPECT_THAT(plain.out, HasSubstr("\n\nmachine: Maker Model 9\n  2 x package: "));
    EXPECT_THAT(runProgram({"sh", "-c", "LC_ALL=C.UTF-8 " + command}).out,
                StartsWith("node7: Maker Model 9\n  Processors  2 × AMD EPYC 7313, "));
}

TEST_F(InventoryViews, HaveColoursAndLinesOnATerminal)
{
    if (!hasTerminals())
        GTEST_SKIP() << "no pseudo-terminal can be opened: " << std::strerror(errno);
    const std::string command = "stty cols 70; exec \"$PROGRAM\" " + quoted({file});
    const Outcome drawn = runOnTerminal({"LC_ALL=C.UTF-8"}, command);
    EXPECT_EQ(drawn.status, 0);
    EXPECT_THAT(
        drawn.out,
        AllOf(
            StartsWith("\x1b[1mnode7: Maker Model 9\x1b[0m\r\n\x1b[1m  Processors  \x1b[0m2 × AMD"),
            HasSubstr("\r\n    \x1b[33mwarning\x1b[0m /machine/"),
            HasSubstr(
                "\r\n\r\n\x1b[1mmachine\x1b[0m: Maker Model 9\r\n"
                "├── \x1b[36m2 × package\x1b[0m: AMD EPYC 7313, 8 cores, 16 threads (0-31)\r\n"
                "│   ├── \x1b[94mL3\x1b[0m: 20 MiB\r\n"
                "│   │   └── \x1b[36m8 × core\x1b[0m: L2 1 MiB, L1d 32 KiB, L1i 32 KiB, 2 threads\r\n"
                "│   └── \x1b[32mNUMA node\x1b[0m: 1 GiB\r\n"
                "├── \x1b[35m2 × network controller\x1b[0m: Intel Corporation I350 Gigabit Network ...\r\n"),
            HasSubstr("\x1b[31m -- its size is unknown\x1b[0m\r\n")));
    for (const char* setting : {"NO_COLOR=1", "TERM=dumb"}) {
        SCOPED_TRACE(setting);
        EXPECT_THAT(runOnTerminal({"LC_ALL=C.UTF-8", setting}, command).out,
                    AllOf(Not(HasSubstr("\x1b")), HasSubstr("├── 2 × package: AMD EPYC 7313")));
    }
    EXPECT_THAT(runOnTerminal({"LC_ALL=C", "NO_COLOR=1"}, command + " --log --properties").out,
                testing::MatchesRegex("Node 2f6d616368696e65 : 40, status = 0\r\n"
                                      "\\|     \\[1 = Computer:0\\] this node\r\n(.|\n)*"
                                      "\\|-- Node [0-9a-f]* : 4, status = 0\r\n"
                                      "\\|   \\|     \\[1 = CPU:0\\] this node\r\n(.|\n)*"
                                      "`-- Node [0-9a-f]* : 19, status = 3\r\n"
                                      "          \\[1 = DIMM:0\\] this node\r\n(.|\n)*"));
    EXPECT_THAT(runOnTerminal({"LC_ALL=C", "NO_COLOR=1"}, command).out,
                HasSubstr("|-- 2 x package: AMD EPYC"));
    const std::string all = runOnTerminal({"LC_ALL=C", "NO_COLOR=1"}, command + " --all").out;
    EXPECT_THAT(all, HasSubstr("\r\n    Alert 1; 1; 3; DIMM: its size is unknown; "));
    for (const std::string& line : linesOf(all))
        EXPECT_LE(line.size(), 70 + std::strlen("\r")) << line;
}

TEST_F(InventoryViews, HaveColouredChangesOnATerminal)
{
    if (!hasTerminals())
        GTEST_SKIP() << "no pseudo-terminal can be opened: " << std::strerror(errno);
    const std::string one = folder.write("one.xml", machineOf(fact("DMIProductName", "One")));
    const std::string two = folder.write("two.xml", machineOf(fact("DMIProductName", "Two")));
    const Outcome outcome = runOnTerminal({"LC_ALL=C"}, "exec \"$PROGRAM\" " + quoted({"--diff", one, two}));
    EXPECT_EQ(outcome.status, 1);
    EXPECT_THAT(outcome.out,
                HasSubstr("  Computer /machine\r\n"
                          "\x1b[31m-   [12 = One] model\x1b[0m\r\n"
                          "\x1b[32m+   [12 = Two] model\x1b[0m\r\n"));
}

TEST_F(InventoryViews, SayOnATerminalWhatTakesLong)
{
    if (!hasTerminals())
        GTEST_SKIP() << "no pseudo-terminal can be opened: " << std::strerror(errno);
    const std::string slow = folder.path("slow");
    const std::string command = "mkfifo '" + slow + "'; (sleep 1.2; exec cat '" + file + "' >'" + slow
        + "') & exec \"$PROGRAM\" '" + slow + "' | head -1";
    const Outcome outcome = runOnTerminal({"LC_ALL=C"}, command);
    const std::string said = "reading the machine...";
    EXPECT_EQ(outcome.out, said + '\r' + std::string(said.size(), ' ') + "\rnode7: Maker Model 9\r\n");
}

TEST_F(InventoryViews, EndWithoutAWordIfNobodyReadsOn)
{
    for (const char* form : {"--all", "--properties", "--json", "--svg=-", "--html=-", "--help"}) {
        SCOPED_TRACE(form);
        const Outcome outcome =
            runProgram({PYTHON, "-c",
                        "import os, subprocess, sys\n"
                        "reader, writer = os.pipe()\n"
                        "os.close(reader)\n"
                        "sys.exit(subprocess.run(sys.argv[1:], stdout=writer).returncode)\n",
                        INVENTORY_PROGRAM, file, form});
        EXPECT_EQ(outcome.status, 0);
        EXPECT_EQ(outcome.err, "");
    }
}

TEST_F(InventoryViews, NameTheProgramInItsHelpAsItWasStarted)
{
    const std::string other = folder.path("other-name");
    std::filesystem::create_symlink(INVENTORY_PROGRAM, other);
    const Outcome help = runProgram({other, "--help"});
    EXPECT_EQ(help.status, 0);
    EXPECT_THAT(help.out, HasSubstr("Usage: other-name "));
    EXPECT_THAT(help.out, HasSubstr("\n  other-name --diff day1"));
    EXPECT_THAT(help.out, Not(HasSubstr("inventory")));
}

// --- The drawing ---

// Checks that each box lies in the box around it without overlapping others, that each text lies in its box, that equal
// parts have equal boxes in columns, and that memory is above what it serves. Prints how often nodes, alerts and alerts
// in the legend are drawn. Takes a letter of the monospaced 11-pixel font as 6.7 pixels wide.
constexpr const char* measure = R"(
import re, sys
import xml.etree.ElementTree as tree
svg = '{http://www.w3.org/2000/svg}'
root = tree.parse(sys.argv[1]).getroot()
assert root.get('width') is None and root.get('height') is None
left, top, width, height = map(int, root.get('viewBox').split())
assert left == 0 and top == 0
paths = []
alerts = 0
styles = set()

def box(group):
    rectangle = group.find(svg + 'rect')
    x, y = map(int, re.fullmatch(r'translate\((\d+),(\d+)\)', group.get('transform')).groups())
    return x, y, x + int(rectangle.get('width')), y + int(rectangle.get('height'))

def form(group):
    # All but the names and numbers of a core.
    return (group.find(svg + 'rect').get('class'),
            tuple(text.text for text in group.findall(svg + 'text') if text.get('class') != 'name'),
            tuple(form(inner) for inner in group.findall(svg + 'g')))

def check(groups, width, height):
    global alerts
    boxes = [box(group) for group in groups]
    for i, (left, top, right, bottom) in enumerate(boxes):
        assert 0 <= left < right <= width and 0 <= top < bottom <= height, (boxes[i], width, height)
        for other in boxes[:i]:
            assert right < other[0] or other[2] < left or bottom < other[1] or other[3] < top, (boxes[i], other)
    equal = {}
    for group, (left, top, right, bottom) in zip(groups, boxes):
        equal.setdefault(form(group), []).append((left, top, right - left, bottom - top))
    for places in equal.values():
        assert len({place[2:] for place in places}) == 1, places
        rows = len({place[1] for place in places})
        assert len({place[0] for place in places}) >= -(-len(places) // rows), places
    bars = [place for group, place in zip(groups, boxes)
            if group.find(svg + 'rect').get('class').split()[0] == 'sensor32']
    for group, place in zip(groups, boxes):
        if place not in bars and not group.find(svg + 'text').text.startswith('memory-side cache'):
            assert all(bar[3] < place[1] and bar[0] <= place[0] and place[2] <= bar[2] for bar in bars), (place, bars)
    for group, (left, top, right, bottom) in zip(groups, boxes):
        style = group.find(svg + 'rect').get('class').split()
        styles.add(style[0])
        alerts += 'alert' in style
        paths.extend(line for line in group.find(svg + 'title').text.split('\n') if line.startswith('/'))
        for text in group.findall(svg + 'text'):
            assert int(text.get('x')) + 6.7 * len(text.text) <= right - left, text.text
            assert int(text.get('y')) < bottom - top
        check(group.findall(svg + 'g'), right - left, bottom - top)

legend = root.findall(svg + "g[@class='legend']")
page = [group for group in root.findall(svg + 'g') if group not in legend]
assert len(page) == 1
top = int(re.fullmatch(r'translate\(0,(\d+)\)', page[0].get('transform')).group(1))
check(page[0].findall(svg + 'g'), width, height - top)
assert len(paths) == len(set(paths))
named = [entry.find(svg + 'rect').get('class').split() for entry in legend]
assert {style[0] for style in named if 'alert' not in style} == styles, (named, styles)
print('nodes: %d, alerts: %s, in the legend: %d' % (len(paths), alerts > 0, sum('alert' in style for style in named)))
)";

class InventoryDrawing : public InventoryViews {
protected:
    std::string draw(const std::string& machine) const
    {
        const Outcome outcome = run({"--svg", folder.path("machine.svg"), machine});
        EXPECT_EQ(outcome.status, 0) << outcome.err;
        EXPECT_EQ(outcome.out, "");
        return folder.path("machine.svg");
    }
};

TEST_F(InventoryDrawing, HasABoxForEachPart)
{
    std::ostringstream out;
    const Inventory small =
        readExport(synthetic("pack:1 [numa(memory=4294967296)] l2:2(size=1048576) core:1 pu:1"));
    writeSvg(out, small.nodes);
    EXPECT_THAT(out.str(), Not(HasSubstr("px")));
    // Without the colours, the legend and the names.
    std::string text = out.str();
    const auto cutOut = [&](const std::string& from, const std::string& behind) {
        const auto begin = text.find(from);
        text.erase(begin, text.find(behind, begin) - begin);
    };
    cutOut(" font-family=\"monospace\" font-size=\"11\"", " viewBox");
    cutOut("<style>", "<rect");
    cutOut("<g class=", "<g transform");
    text = std::regex_replace(text, std::regex("/machine[^\n]*\n"), "");
    text = std::regex_replace(text, std::regex("[-a-zN][-A-Za-z ]*[a-z-][0-9]+([:<])"), "NAME$1");
    EXPECT_EQ(text,
              R"svg(<svg xmlns="http://www.w3.org/2000/svg" class="machine" viewBox="0 0 560 186">
<title>machine</title>
<rect width="560" height="186" class="paper"/>
<g transform="translate(0,27)">
<g transform="translate(6,6)">
<title>machine</title>
<rect width="548" height="147" class="sensor40"/>
<text x="6" y="13" class="name">machine</text>
<g transform="translate(6,21)">
<title>NAME: 2 cores, 2 threads (0-1)</title>
<rect width="536" height="120" class="sensor4"/>
<text x="6" y="13" class="name">NAME</text>
<text x="6" y="28">2 cores, 2 threads (0-1)</text>
<g transform="translate(6,36)">
<title>NAME: 4 GiB</title>
<rect width="524" height="21" class="sensor32"/>
<text x="6" y="13" class="name">NAME: 4 GiB</text>
</g>
<g transform="translate(6,63)">
<title>NAME: L2 1 MiB, 1 thread</title>
<rect width="259" height="51" class="sensor42"/>
<text x="6" y="13" class="name">NAME</text>
<text x="6" y="28">L2 1 MiB</text>
<text x="6" y="43">1 thread</text>
</g>
<g transform="translate(271,63)">
<title>NAME: L2 1 MiB, 1 thread</title>
<rect width="259" height="51" class="sensor42"/>
<text x="6" y="13" class="name">NAME</text>
<text x="6" y="28">L2 1 MiB</text>
<text x="6" y="43">1 thread</text>
</g>
</g>
</g>
</g>
</svg>
)svg");
}

TEST_F(InventoryDrawing, IsValidAndLegibleForEveryMachine)
{
    if (realMachines().empty())
        GTEST_SKIP() << whyNoMachines;
    for (const std::string& machine : realMachines()) {
        SCOPED_TRACE(machine);
        const Inventory inventory = readExport(readFile(machine));
        const bool hasAlerts = !View(inventory.nodes).alerts().empty();
        EXPECT_EQ(readByPython(measure, draw(machine)),
                  "nodes: " + std::to_string(inventory.nodes.size())
                      + ", alerts: " + (hasAlerts ? "True" : "False")
                      + ", in the legend: " + (hasAlerts ? "1" : "0") + '\n');
    }
}

TEST_F(InventoryDrawing, IsValidForHostileTexts)
{
    EXPECT_EQ(readByPython(measure, draw(hostile)), "nodes: 4, alerts: True, in the legend: 1\n");
}

TEST_F(InventoryDrawing, HasAColourOfItsOwnForEachSensorType)
{
    // The contrast as WCAG defines it; its strictest level demands 7.
    const auto luminance = [](const std::string& fill) {
        const double weights[] = {0.2126, 0.7152, 0.0722};
        double sum = 0;
        for (std::size_t i = 0; i < 3; ++i) {
            const double part = std::stoi(fill.substr(1 + 2 * i, 2), nullptr, 16) / 255.0;
            sum += weights[i] * (part <= 0.04045 ? part / 12.92 : std::pow((part + 0.055) / 1.055, 2.4));
        }
        return sum;
    };
    std::set<std::string> fills;
    std::set<std::string> darkFills;
    for (unsigned int sensor = 0; sensor <= IC::Node::SENSOR_LARGEST; ++sensor) {
        const Colour& colour = colourOf(static_cast<IC::Node::SensorType>(sensor));
        EXPECT_GE((luminance(colour.fill) + 0.05) / 0.05, 7) << IC::pst[sensor];
        EXPECT_GE((luminance("#f2f2f2") + 0.05) / (luminance(darkFillOf(colour)) + 0.05), 7)
            << IC::pst[sensor];
        const bool isShared = colour.sensor == IC::Node::SENSOR_UNKNOWN;
        EXPECT_TRUE(isShared || fills.insert(colour.fill).second) << IC::pst[sensor];
        EXPECT_TRUE(isShared || darkFills.insert(darkFillOf(colour)).second) << IC::pst[sensor];
    }
    EXPECT_EQ(fills.size(), 27u);
}

TEST_F(InventoryDrawing, GoesToAFileOrToStandardOutput)
{
    for (const char* option : {"--svg", "--html"}) {
        SCOPED_TRACE(option);
        const std::string name = folder.path("output");
        EXPECT_EQ(run({option, name, file}).status, 0);
        const Outcome outcome = run({option, "-", file});
        EXPECT_EQ(outcome.status, 0);
        EXPECT_EQ(outcome.out.substr(0, 100), contentOf(name).substr(0, 100));
        EXPECT_FALSE(std::filesystem::exists("-"));
        EXPECT_EQ(run({option, folder.path("new"), folder.path("missing.xml")}).status, 2);
        EXPECT_FALSE(std::filesystem::exists(folder.path("new")));
        for (const std::string& bad : {std::string("/dev/full"), folder.path("missing/output")}) {
            const Outcome failed = run({file, option, bad});
            EXPECT_EQ(failed.status, 1);
            EXPECT_EQ(failed.out, "");
            EXPECT_THAT(failed.err,
                        AllOf(StartsWith("inventory: " + bad + ": "), HasSubstr(" cannot be written")));
        }
    }
}

// --- The page ---

// Opens each page in a frame of each width, and writes what is wrong with it. PAGES is a list of file names.
constexpr const char* driver = R"(<!DOCTYPE html><meta charset="utf-8"><body><script>
(async () => {
    const wrong = [];
    let checks = 0;
    for (const name of PAGES)
        for (const width of [1280, 400]) {
            const frame = document.createElement('iframe');
            frame.style.cssText = 'border: 0; height: 700px; width: ' + width + 'px';
            frame.src = name;
            const loaded = new Promise(done => frame.onload = done);
            document.body.append(frame);
            await loaded;
            const page = frame.contentWindow.document;
            const expect = (is, what) => { ++checks; if (!is) wrong.push(name + ' ' + width + ': ' + what); };
            expect(frame.contentWindow.errors.length === 0, 'errors ' + frame.contentWindow.errors);
            expect(frame.contentWindow.hacked === undefined, 'a text was run');
            expect(!page.querySelector('img, [src]'), 'refers to another file');
            expect([...page.querySelectorAll('[href]')].every(one => /^(#|data:)/.test(one.getAttribute('href'))), 'a link');
            expect(page.documentElement.scrollWidth <= width, 'is wider: ' + page.documentElement.scrollWidth);
            const wide = [...page.body.querySelectorAll('*')].filter(one => one.getBoundingClientRect().right > width + 0.5);
            expect(wide.length === 0, 'wide: ' + wide.slice(0, 3).map(one => one.outerHTML.slice(0, 100)));
            expect(page.querySelector('svg').getBoundingClientRect().width > 0.7 * Math.min(width, 600), 'a narrow drawing');

            const search = page.querySelector('input');
            const rows = [...page.querySelectorAll('.nodes tbody tr')];
            const shown = () => rows.filter(row => row.getBoundingClientRect().height > 0);
            const searchFor = text => { search.value = text; search.dispatchEvent(new Event('input', {bubbles: true})); };
            expect(shown().length === rows.length && rows.length > 0, 'hides rows at first');
            for (const text of ['CPU', 'hardware threads', '/machine', 'no such text']) {
                searchFor(text);
                const fitting = rows.filter(row => row.textContent.toLowerCase().includes(text.toLowerCase()));
                const now = shown();
                expect(now.length === fitting.length && now.every((row, i) => row === fitting[i]), 'search for ' + text);
                expect((text === 'no such text') === (now.length === 0), 'found ' + now.length + ' for ' + text);
            }
            searchFor('');
            expect(shown().length === rows.length, 'does not show all rows again');
            frame.remove();
        }
    document.body.textContent = wrong.length ? wrong.join('\n') : 'ALL WELL after ' + checks + ' checks';
})().catch(error => document.body.textContent = 'FAILED: ' + error);
</script>)";

class InventoryPage : public InventoryViews { };

TEST_F(InventoryPage, WorksInABrowser)
{
#ifdef CHROMIUM
    std::vector<std::string> machines = realMachines();
    machines.push_back(hostile);
    std::string pages;
    for (const std::string& machine : machines) {
        const Outcome outcome = run({"--html", "-", machine});
        ASSERT_EQ(outcome.status, 0) << outcome.err;
        std::string page = outcome.out;
        page.insert(page.find("<head>") + 6,
                    "<script>errors = []; addEventListener('error', one => errors.push(one.message));"
                    " addEventListener('securitypolicyviolation', () => errors.push('policy'))"
                    "</script>");
        const std::string name = std::filesystem::path(machine).stem().string() + ".html";
        folder.write(name, page);
        pages += (pages.empty() ? "'" : ", '") + name + '\'';
    }
    std::string test = driver;
    test.replace(test.find("PAGES"), 5, '[' + pages + ']');
    const Outcome outcome = runProgram(
        {"env", "HOME=" + folder.path("home"), CHROMIUM, "--headless=new", "--no-sandbox", "--disable-gpu",
         "--user-data-dir=" + folder.path("profile"), "--allow-file-access-from-files",
         "--enable-logging=stderr", "--virtual-time-budget=600000", "--dump-dom",
         "file://" + folder.write("driver.html", test)});
    EXPECT_EQ(outcome.status, 0);
    EXPECT_THAT(outcome.out,
                HasSubstr("ALL WELL after " + std::to_string(machines.size() * 2 * 17) + " checks"));
    EXPECT_THAT(outcome.err, Not(HasSubstr("CONSOLE")));
#else
    GTEST_SKIP() << "the Debian package chromium is missing";
#endif
}

}  // namespace
