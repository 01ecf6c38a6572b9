// The inventory's output on a terminal, as JSON and as a drawing; its command line and its manual.
#include <gmock/gmock.h>
#include <pty.h>

#include <cmath>
#include <cstring>
#include <limits>
#include <regex>
#include <set>

#include "colours.h"
#include "inventory_run.h"
#include "writing.h"

namespace {

using namespace inventory;
using testing::HasSubstr;
using testing::StartsWith;

struct Made : IC::Node {
    Made(SensorType sensor, const std::string& itsPath, const std::string& itsParent,
         const std::string& itsDescription, const std::map<unsigned int, IC::PropertyValue>& its = {},
         Status itsStatus = STATUS_FINE)
        : Node(sensor)
    {
        path = itsPath;
        parent = itsParent;
        description = itsDescription;
        properties = its;
        status = static_cast<StatusType>(itsStatus);
    }
};

// The output of a Python program that reads the file. The program fails if the file is not valid.
std::string readByPython(const std::string& program, const std::string& file)
{
    const Outcome outcome = runProgram({PYTHON, "-c", program, file});
    EXPECT_EQ(outcome.status, 0) << outcome.err;
    return outcome.out;
}

class InventoryOutput : public testing::Test {
protected:
    // With hwloc's parser that accepts characters that XML forbids.
    static Outcome run(std::vector<std::string> words)
    {
        words.insert(words.begin(), {"env", "HWLOC_LIBXML=0", INVENTORY_PROGRAM});
        return runProgram(words);
    }

    Folder folder;
    std::string file = folder.write(
        "machine.xml",
        machineOf(fact("DMIProductName", "One"),
                  "<object type=\"Misc\" subtype=\"MemoryModule\">" + fact("SerialNumber", "7")
                      + "</object>"
                        "<object type=\"PCIDev\" pci_busid=\"0000:01:00.0\" pci_type=\"0106 [8086:1d02]"
                        " [0000:0000] 01\"><object type=\"OSDev\" osdev_type=\"0\" name=\"sda\"/></object>"));
    std::string hostileText =
        "\xff\xfe&quot;\x01\x1b[2J]]&gt;&lt;/text&gt;&amp;amp;'\x7f\xed\xa0\x80\xc3\xa4";
    std::string hostile =
        folder.write("hostile.xml",
                     machineOf(fact("DMIProductName", hostileText) + fact(hostileText, hostileText)
                                   + fact("UUID", "\xc3\xa4"),
                               "<object type=\"OSDev\" osdev_type=\"2\" name=\"" + hostileText + "\">"
                                   + fact("Address", hostileText) + "</object>"));
};

// --- Terminals ---

class InventoryTerminal : public InventoryOutput {
protected:
    void SetUp() override
    {
        int ours = -1;
        int its = -1;
        if (openpty(&ours, &its, nullptr, nullptr, nullptr) != 0)
            GTEST_SKIP() << "no pseudo-terminal can be opened: " << std::strerror(errno);
        close(ours);
        close(its);
    }

    static Outcome run(const std::vector<std::string>& environment, const std::vector<std::string>& words)
    {
        const std::vector<std::string> usual {"env", "-u", "NO_COLOR", "TERM=xterm"};
        return runProgram({"env", "SHELL=/bin/sh", "script", "-qec",
                           quoted(usual) + quoted(environment) + quoted({INVENTORY_PROGRAM}) + quoted(words),
                           "/dev/null"});
    }
};

TEST_F(InventoryTerminal, HasColoursAndLines)
{
    const Outcome outcome = run({"LC_ALL=C.UTF-8"}, {file});
    EXPECT_EQ(outcome.status, 0);
    EXPECT_THAT(outcome.out,
                StartsWith("\x1b[1mComputer\x1b[0m machine: One, CPUs: 0, cores: 0\r\n"
                           "├── \x1b[32mMemory Array\x1b[0m numa-0\r\n"
                           "├── \x1b[33mDisk Controller\x1b[0m storage-0000:01:00.0: 8086:1d02\r\n"
                           "│   └── \x1b[33mHard Drive\x1b[0m sda\r\n"
                           "└── \x1b[32mDIMM\x1b[0m dimm\x1b[31m -- its size is unknown\x1b[0m\r\n"
                           "\r\n"
                           "Alerts: 1\r\n"
                           "  \x1b[33m/machine/dimm, DIMM: its size is unknown\x1b[0m\r\n"));
}

TEST_F(InventoryTerminal, HasNoColoursIfTheyAreTurnedOff)
{
    for (const char* setting : {"NO_COLOR=1", "TERM=dumb"}) {
        SCOPED_TRACE(setting);
        EXPECT_THAT(run({"LC_ALL=C.UTF-8", setting}, {file}).out,
                    StartsWith("Computer machine: One, CPUs: 0, cores: 0\r\n"
                               "├── Memory Array numa-0\r\n"
                               "├── Disk Controller storage-0000:01:00.0: 8086:1d02\r\n"
                               "│   └── Hard Drive sda\r\n"
                               "└── DIMM dimm -- its size is unknown\r\n"
                               "\r\n"
                               "Alerts: 1\r\n"
                               "  /machine/dimm, DIMM: its size is unknown\r\n"));
    }
    EXPECT_THAT(run({"LC_ALL=C.UTF-8", "NO_COLOR="}, {file}).out, StartsWith("\x1b[1mComputer"));
}

TEST_F(InventoryTerminal, HasAsciiLinesIfItIsNotUtf8)
{
    EXPECT_THAT(run({"LC_ALL=C", "NO_COLOR=1"}, {"--properties", "--log", file}).out,
                testing::MatchesRegex("Node 2f6d616368696e65 : 40, status = 0\r\n"
                                      "\\|     \\[1 = Computer:0\\] this node\r\n(.|\n)*"
                                      "\\|-- Node 2f6d616368696e652f6e756d612d30 : 32, status = 0\r\n"
                                      "\\|         \\[1 = Memory Array:0\\] this node\r\n(.|\n)*"
                                      "`-- Node [0-9a-f]* : 19, status = 3\r\n"
                                      "          \\[1 = DIMM:0\\] this node\r\n(.|\n)*"));
}

TEST_F(InventoryOutput, IsPlainTextInAPipe)
{
    setenv("LC_ALL", "C.UTF-8", 1);
    const Outcome outcome = run({file});
    unsetenv("LC_ALL");
    EXPECT_THAT(outcome.out,
                StartsWith("Computer machine: One, CPUs: 0, cores: 0\n"
                           "  Memory Array numa-0\n"
                           "  Disk Controller storage-0000:01:00.0: 8086:1d02\n"
                           "    Hard Drive sda\n"
                           "  DIMM dimm -- its size is unknown\n"
                           "\n"
                           "Alerts: 1\n"
                           "  /machine/dimm, DIMM: its size is unknown\n"));
}

TEST_F(InventoryTerminal, HasColouredChanges)
{
    const std::string other = folder.write("other.xml", machineOf(fact("DMIProductName", "Two")));
    const Outcome outcome = run({"LC_ALL=C"}, {"--diff", file, other});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_THAT(outcome.out,
                HasSubstr("  Computer /machine\r\n"
                          "\x1b[31m-   [12 = One] model\x1b[0m\r\n"
                          "\x1b[32m+   [12 = Two] model\x1b[0m\r\n"));
}

// --- JSON ---

// Whether Debian's python3-jsonschema is there.
bool canValidate()
{
    static const bool can = runProgram({PYTHON, "-c", "import jsonschema"}).status == 0;
    return can;
}

// Prints nothing if each file is a valid document. The schema, too, has to be valid.
constexpr const char* validate = R"(
import json, jsonschema, sys
schema = json.load(open(sys.argv[1]))
jsonschema.Draft202012Validator.check_schema(schema)
validator = jsonschema.Draft202012Validator(schema)
for name in sys.argv[2:]:
    for error in validator.iter_errors(json.load(open(name, encoding='utf-8'))):
        print(name, list(error.absolute_path), str(error.message)[:200])
)";

void expectToFitTheSchema(const std::string& document)
{
    if (!canValidate())
        return;  // as another test reports
    const Folder folder;
    const Outcome outcome =
        runProgram({PYTHON, "-c", validate, INVENTORY_SCHEMA, folder.write("document.json", document)});
    EXPECT_EQ(outcome.status, 0) << outcome.err;
    EXPECT_EQ(outcome.out, "");
}

TEST(InventoryJson, HasAValueForEachKind)
{
    const double infinity = std::numeric_limits<double>::infinity();
    const IC::PropertyValue values[] = {
        IC::PropertyValue("a\"\\\n\xc3\xa4", true),
        IC::PropertyValue("\xff\xfe"),
        IC::PropertyValue(std::string("\0\x1b", 2)),
        IC::Number(true),
        IC::Number(-1),
        IC::Number(4294967295u),
        IC::Number(18446744073709551615ull),
        IC::Number(0.1),
        IC::Number(-infinity),
        IC::Number(IC::Number::KIND_NAN),
        IC::Number(IC::Version2 {6, 17}),
        IC::Number(60L, 0),
        IC::Number(IC::NodeRef {4, 2}),
        IC::Buffer {0x84, 0x0f},
        IC::EnumValue(3u),
        IC::NumberArray {1u, -2, 0.5},
        IC::StringArray {"x", "\x80"},
        IC::PropertyValue(IC::PropertyValue::KIND_UNKNOWN),
    };
    std::map<unsigned int, IC::PropertyValue> properties;
    for (const IC::PropertyValue& value : values)
        properties.insert({static_cast<unsigned int>(properties.size()) + 1001, value});
    Nodes nodes;
    nodes.push_back(
        std::make_unique<Made>(IC::Node::SENSOR_FAN, "/fan", "", "\xe9t\xe9", properties, STATUS_ALARM));
    std::ostringstream out;
    writeJson(out, nodes, {});
    const Folder folder;
    EXPECT_EQ(readByPython("import json, sys\n"
                           "node = json.load(open(sys.argv[1], 'rb'))['nodes'][0]\n"
                           "properties = node.pop('properties')\n"
                           "print(ascii(node))\n"
                           "for name, one in properties.items(): print(name, one['number'], one['readOnly'], "
                           "one['kind'], ascii(one['value']))\n",
                           folder.write("made.json", out.str())),
              "{'path': '/fan', 'parent': '', 'sensorType': 20, 'sensorName': 'Fan', 'status': 5, "
              "'description': {'hex': 'e974e9'}}\n"
              "property1001 1001 True string 'a\"\\\\\\n\\xe4'\n"
              "property1002 1002 False string {'hex': 'fffe'}\n"
              "property1003 1003 False string '\\x00\\x1b'\n"
              "property1004 1004 False bool True\n"
              "property1005 1005 False int -1\n"
              "property1006 1006 False uint32 4294967295\n"
              "property1007 1007 False uint64 18446744073709551615\n"
              "property1008 1008 False real 0.1\n"
              "property1009 1009 False real '-inf'\n"
              "property1010 1010 False nan None\n"
              "property1011 1011 False version '6.17'\n"
              "property1012 1012 False datetime '1970-01-01T00:01:00Z'\n"
              "property1013 1013 False noderef {'sensorType': 4, 'id': 2}\n"
              "property1014 1014 False bytes '840f'\n"
              "property1015 1015 False enum {'code': 3, 'name': ''}\n"
              "property1016 1016 False numbers [1, -2, 0.5]\n"
              "property1017 1017 False strings ['x', {'hex': '80'}]\n"
              "property1018 1018 False unknown None\n");
    expectToFitTheSchema(out.str());
}

TEST(InventoryJson, HasThisLayout)
{
    Nodes nodes;
    nodes.push_back(std::make_unique<Made>(IC::Node::SENSOR_CACHE, "/cache", "", "slow",
                                           std::map<unsigned int, IC::PropertyValue> {
                                               {KEY_READ_AT, IC::Number(60L, 0)},
                                               {KEY_SIZE, IC::Number(1048576ull)},
                                               {KEY_CACHE_KIND, IC::PropertyValue(IC::EnumValue(1u), true)},
                                               {KEY_HOST_NAME, "here"}}));
    const IC::Alert alert(ZQ::DateTime(90, 3), 2, 1, {"/cache"}, 3, "hot");
    std::ostringstream out;
    writeJson(out, nodes, {alert});
    EXPECT_EQ(out.str(), R"({
  "format": "ic-inventory",
  "version": 1,
  "host": "here",
  "time": "1970-01-01T00:01:00Z",
  "nodes": [
    {
      "path": "/cache",
      "parent": "",
      "sensorType": 31,
      "sensorName": "Cache",
      "status": 0,
      "description": "slow",
      "properties": {
        "readAt": {
          "number": 9,
          "caption": "read at",
          "kind": "datetime",
          "readOnly": false,
          "value": "1970-01-01T00:01:00Z"
        },
        "size": {
          "number": 28,
          "caption": "size",
          "unit": "bytes",
          "kind": "uint64",
          "readOnly": false,
          "value": 1048576
        },
        "cacheKind": {
          "number": 30,
          "caption": "cache kind",
          "kind": "enum",
          "readOnly": true,
          "value": {
            "code": 1,
            "name": "data"
          }
        },
        "hostName": {
          "number": 57,
          "caption": "host name",
          "kind": "string",
          "readOnly": false,
          "value": "here"
        }
      }
    }
  ],
  "alerts": [
    {
      "time": "1970-01-01T00:01:30Z",
      "severity": 2,
      "class": 1,
      "status": 3,
      "paths": [
        "/cache"
      ],
      "message": "hot"
    }
  ]
}
)");
    expectToFitTheSchema(out.str());
}

constexpr const char* countNodes =
    "import json, sys\n"
    "nodes = json.load(open(sys.argv[1], encoding='utf-8'))['nodes']\n"
    "print('Nodes: %d, properties: %d' % (len(nodes), sum(len(node['properties'])"
    " for node in nodes)))\n";

TEST_F(InventoryOutput, IsValidJsonForEveryMachine)
{
    if (realMachines().empty())
        GTEST_SKIP() << whyNoMachines;
    std::vector<std::string> validation {PYTHON, "-c", validate, INVENTORY_SCHEMA};
    for (const std::string& machine : realMachines()) {
        SCOPED_TRACE(machine);
        validation.push_back(folder.path(std::filesystem::path(machine).filename().string() + ".json"));
        const Outcome outcome = run({"--json", machine});
        folder.write(std::filesystem::path(validation.back()).filename(), outcome.out);
        EXPECT_EQ(outcome.status, 0) << outcome.err;
        std::size_t nodes = 0;
        std::size_t properties = 0;
        for (const std::string& line : linesOf(run({"--properties", machine}).out)) {
            const bool isProperty =
                line.find_first_not_of(' ') != std::string::npos && line[line.find_first_not_of(' ')] == '[';
            properties += isProperty ? 1 : 0;
            if (line.compare(0, 7, "Nodes: ") == 0)
                nodes = std::stoul(line.substr(7));
        }
        EXPECT_EQ(readByPython(countNodes, folder.write("machine.json", outcome.out)),
                  "Nodes: " + std::to_string(nodes) + ", properties: " + std::to_string(properties) + '\n');
    }
    if (!canValidate())
        GTEST_SKIP() << "the Debian package python3-jsonschema is missing";
    const Outcome outcome = runProgram(validation);
    EXPECT_EQ(outcome.status, 0) << outcome.err;
    EXPECT_EQ(outcome.out, "");
}

TEST_F(InventoryOutput, IsValidJsonForTextsThatAreNotUtf8)
{
    const Outcome outcome = run({"--json", hostile});
    EXPECT_EQ(outcome.status, 0) << outcome.err;
    EXPECT_EQ(readByPython("import json, sys\n"
                           "nodes = json.load(open(sys.argv[1], encoding='utf-8'))['nodes']\n"
                           "print([nodes[0]['properties']['model']['value']])\n"
                           "print([ascii(nodes[0]['properties']['uuid']['value'])])\n"
                           "print(nodes[2]['description'])\n",
                           folder.write("hostile.json", outcome.out)),
              "[{'hex': 'fffe22011b5b324a5d5d3e3c2f746578743e26616d703b277feda080c3a4'}]\n"
              "[\"'\\\\xe4'\"]\n"
              "{'hex': 'fffe22011b5b324a5d5d3e3c2f746578743e26616d703b277feda080c3a4'}\n");
}

// --- The drawing ---

// Checks that each box lies in its parent's box without overlapping its siblings, and each text in its box. Prints the
// numbers of boxes and of colours. Takes a letter of the monospaced 11-pixel font as 6.7 pixels wide.
constexpr const char* measure = R"(
import re, sys
import xml.etree.ElementTree as tree
svg = '{http://www.w3.org/2000/svg}'
root = tree.parse(sys.argv[1]).getroot()
fills = set()
count = 0

def box(group):
    rectangle = group.find(svg + 'rect')
    x, y = map(int, re.fullmatch(r'translate\((\d+),(\d+)\)', group.get('transform')).groups())
    return x, y, x + int(rectangle.get('width')), y + int(rectangle.get('height'))

def check(groups, width, height):
    global count
    boxes = [box(group) for group in groups]
    for i, (left, top, right, bottom) in enumerate(boxes):
        assert 0 <= left < right <= width and 0 <= top < bottom <= height, (boxes[i], width, height)
        for other in boxes[:i]:
            assert right < other[0] or other[2] < left or bottom < other[1] or other[3] < top, (boxes[i], other)
    for group, (left, top, right, bottom) in zip(groups, boxes):
        count += 1
        fills.add(group.find(svg + 'rect').get('fill'))
        assert group.find(svg + 'title').text
        for text in group.findall(svg + 'text'):
            assert int(text.get('x')) + 6.7 * len(text.text) <= right - left, text.text
            assert int(text.get('y')) < bottom - top
        check(group.findall(svg + 'g'), right - left, bottom - top)

legend = root.findall(svg + "g[@class='legend']")
page = [group for group in root.findall(svg + 'g') if group not in legend]
assert len(page) == 1
top = int(re.fullmatch(r'translate\(0,(\d+)\)', page[0].get('transform')).group(1))
check(page[0].findall(svg + 'g'), int(root.get('width')), int(root.get('height')) - top)
assert fills == {entry.find(svg + 'rect').get('fill') for entry in legend}
print('boxes: %d, colours: %d' % (count, len(legend)))
)";

class InventoryDrawing : public InventoryOutput {
protected:
    std::string draw(const std::string& machine) const
    {
        const Outcome outcome = run({"--svg", folder.path("machine.svg"), machine});
        EXPECT_EQ(outcome.status, 0) << outcome.err;
        EXPECT_EQ(outcome.out, "");
        return folder.path("machine.svg");
    }
};

TEST_F(InventoryDrawing, NestsTheBoxesAsTheNodes)
{
    Nodes nodes;
    nodes.push_back(std::make_unique<Made>(IC::Node::SENSOR_CPU, "/cpu", "", "a<b"));
    nodes.push_back(std::make_unique<Made>(IC::Node::SENSOR_FAN, "/cpu/fan", "/cpu", "\"x\" & \xff",
                                           std::map<unsigned int, IC::PropertyValue> {}, STATUS_ALARM));
    std::ostringstream out;
    writeSvg(out, nodes);
    EXPECT_EQ(out.str(), R"svg(<?xml version="1.0" encoding="UTF-8"?>
<svg xmlns="http://www.w3.org/2000/svg" width="560" height="105" viewBox="0 0 560 105">
<title>Inventory</title>
<style>text { font: 11px monospace; fill: #000 } .name { font-weight: bold }
rect { stroke: #555 } .page { stroke: none } .trouble { stroke: #c00; stroke-width: 3 }</style>
<rect width="560" height="105" fill="#fff" class="page"/>
<g class="legend" transform="translate(5,5)">
<rect width="12" height="12" fill="#c6e0f5"/>
<text x="17" y="11">CPU</text>
</g>
<g class="legend" transform="translate(187,5)">
<rect width="12" height="12" fill="#bff3f7"/>
<text x="17" y="11">Fan</text>
</g>
<g transform="translate(0,25)">
<g transform="translate(5,0)">
<title>CPU cpu: a&lt;b</title>
<rect width="90" height="75" fill="#c6e0f5"/>
<text x="5" y="13" class="name">cpu</text>
<text x="5" y="28">a&lt;b</text>
<g transform="translate(5,35)">
<title>Fan fan: "x" &amp; \xff -- it raises an alarm</title>
<rect width="80" height="35" fill="#bff3f7" class="trouble"/>
<text x="5" y="13" class="name">fan</text>
<text x="5" y="28">"x" &amp; \xff</text>
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
        std::string nodes;
        for (const std::string& line : linesOf(run({machine}).out))
            if (line.compare(0, 7, "Nodes: ") == 0)
                nodes = line;
        EXPECT_EQ(readByPython(measure, draw(machine)),
                  std::regex_replace(nodes, std::regex("Nodes: (.*), sensor types: (.*)"),
                                     "boxes: $1, colours: $2\n"));
    }
}

TEST_F(InventoryDrawing, IsValidForTextsThatAreNotUtf8)
{
    EXPECT_EQ(readByPython(measure, draw(hostile)), "boxes: 3, colours: 3\n");
}

TEST_F(InventoryDrawing, HasALightColourOfItsOwnForEachSensorType)
{
    // The contrast as WCAG defines it; its strictest level demands 7.
    const auto contrastToBlack = [](const std::string& fill) {
        const double weights[] = {0.2126, 0.7152, 0.0722};
        double luminance = 0;
        for (std::size_t i = 0; i < 3; ++i) {
            const double part = std::stoi(fill.substr(1 + 2 * i, 2), nullptr, 16) / 255.0;
            luminance +=
                weights[i] * (part <= 0.04045 ? part / 12.92 : std::pow((part + 0.055) / 1.055, 2.4));
        }
        return (luminance + 0.05) / 0.05;
    };
    std::set<std::string> fills;
    for (unsigned int sensor = 0; sensor <= IC::Node::SENSOR_LARGEST; ++sensor) {
        const Colour& colour = colourOf(static_cast<IC::Node::SensorType>(sensor));
        EXPECT_GE(contrastToBlack(colour.fill), 7) << IC::pst[sensor];
        const bool isShared = colour.sensor == IC::Node::SENSOR_UNKNOWN;
        EXPECT_TRUE(isShared || fills.insert(colour.fill).second) << IC::pst[sensor];
    }
    EXPECT_EQ(fills.size(), 27u);
}

TEST_F(InventoryDrawing, IsNotCreatedIfTheMachineCannotBeRead)
{
    const Outcome outcome = run({"--svg", folder.path("new.svg"), folder.path("missing.xml")});
    EXPECT_EQ(outcome.status, 2);
    EXPECT_FALSE(std::filesystem::exists(folder.path("new.svg")));
}

TEST_F(InventoryDrawing, FailsIfItCannotBeWritten)
{
    for (const std::string& drawing : {std::string("/dev/full"), folder.path("missing/machine.svg")}) {
        const Outcome outcome = run({file, "--svg", drawing});
        EXPECT_EQ(outcome.status, 1);
        EXPECT_EQ(outcome.out, "");
        EXPECT_EQ(outcome.err,
                  "inventory: " + drawing + ": the output cannot be written: "
                      + (drawing == "/dev/full" ? "No space left on device" : "No such file or directory")
                      + '\n');
    }
}

// --- The command line and the manual ---

TEST_F(InventoryOutput, IsOneErrorLineForInvalidOptions)
{
    const struct {
        std::vector<std::string> words;
        std::string told;
    } rows[] = {
        {{"--jsonn"}, "--jsonn"},
        {{"-x"}, "-x"},
        {{"--svg"}, "--svg"},
        {{"--watch"}, "--watch"},
        {{"--diff"}, "--diff"},
        {{"--set", "/machine", "4"}, "--set"},
        {{file, "--json", "--svg", "x"}, "--json and --svg exclude each other"},
        {{file, "--json", "--watch", "1"}, "--json and --watch exclude each other"},
        {{file, "--svg", "x", "--watch", "1"}, "--svg and --watch exclude each other"},
        {{"--diff", file, file, "--json"}, "--json and --diff exclude each other"},
        {{"--diff", file, file, "--watch", "1"}, "--watch and --diff exclude each other"},
        {{file, "--set", "/machine", "4", "x", "--json"}, "--set and --json exclude each other"},
        {{file, "--set", "/machine", "4", "x", "--log"}, "--log and --set exclude each other"},
        {{file, "--json", "--properties"}, "--properties and --json exclude each other"},
        {{file, "--json", "--log"}, "--log and --json exclude each other"},
        {{"--diff", file, file, file}, "--diff and FILE exclude each other"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.told);
        const Outcome outcome = run(row.words);
        EXPECT_EQ(outcome.status, 2);
        EXPECT_EQ(outcome.out, "");
        EXPECT_EQ(linesOf(outcome.err).size(), 1u) << outcome.err;
        EXPECT_THAT(outcome.err, StartsWith("inventory: "));
        EXPECT_THAT(outcome.err, HasSubstr(row.told));
    }
    EXPECT_FALSE(std::filesystem::exists("x"));
}

TEST_F(InventoryOutput, FailsIfItCannotBeWritten)
{
    const std::vector<std::string> rows[] = {{file}, {"--json", file}, {"--help"}, {"--version"}};
    for (std::vector<std::string> words : rows) {
        SCOPED_TRACE(words.front());
        words.insert(words.begin(), INVENTORY_PROGRAM);
        const Outcome full = runWithoutSpace(words);
        EXPECT_EQ(full.status, 1);
        EXPECT_EQ(full.err, "inventory: the output cannot be written\n");
    }
    const Outcome closed = runProgram({PYTHON, "-c",
                                       "import os, subprocess, sys\n"
                                       "reader, writer = os.pipe()\n"
                                       "os.close(reader)\n"
                                       "sys.exit(subprocess.run(sys.argv[1:], stdout=writer).returncode)\n",
                                       INVENTORY_PROGRAM, file});
    EXPECT_EQ(closed.status, 0);  // as with `| head`
    EXPECT_EQ(closed.err, "");
}

// The long options in a text; `mark` precedes each.
std::set<std::string> optionsIn(const std::string& text, const std::string& mark)
{
    const std::regex option(mark + "([a-z]+)");
    std::set<std::string> options;
    for (std::sregex_iterator found(text.begin(), text.end(), option); found != std::sregex_iterator();
         ++found)
        options.insert((*found)[1]);
    return options;
}

TEST_F(InventoryOutput, HasTheSameOptionsInHelpAndManual)
{
    const std::string help = run({"--help"}).out;
    const std::string manual = contentOf(INVENTORY_MANUAL);
    const std::set<std::string> expected {"diff",       "help", "json", "log",     "output",
                                          "properties", "set",  "svg",  "version", "watch"};
    EXPECT_EQ(optionsIn(help, "--"), expected);
    EXPECT_EQ(optionsIn(manual, "\n\\.It Fl (?:h , )?-"), expected);
    EXPECT_EQ(optionsIn(manual.substr(manual.find(".Sh EXAMPLES")), "--"),
              (std::set<std::string> {"diff", "json", "properties", "set", "svg", "watch"}));
}

TEST(InventoryManual, ListsAllProperties)
{
    std::string table;
    const std::regex identifier("[a-z][A-Za-z0-9]*");
    std::set<std::string> identifiers;
    for (unsigned int key = 1; key <= KEY_LAST; ++key) {
        const KeyInfo& info = *infoOf(key);
        EXPECT_TRUE(std::regex_match(info.identifier, identifier)) << info.identifier;
        EXPECT_TRUE(identifiers.insert(info.identifier).second) << info.identifier;
        table += ".It " + std::to_string(key) + " Ta " + info.identifier + " Ta " + info.caption + " Ta"
            + (*info.unit == '\0' ? "" : " ") + info.unit + '\n';
    }
    const std::string manual = contentOf(INVENTORY_MANUAL);
    const auto begin = manual.find(".It 1 Ta ");
    ASSERT_NE(begin, std::string::npos);
    EXPECT_EQ(manual.substr(begin, manual.find(".El\n", begin) - begin), table);
}

}  // namespace
