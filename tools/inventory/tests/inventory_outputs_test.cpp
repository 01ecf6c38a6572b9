// The inventory's output as JSON; its command line and its manual.
#include <gmock/gmock.h>

#include <limits>
#include <regex>
#include <set>

#include "alerts.h"
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

// As --properties writes them: without empty labels.
constexpr const char* countNodes =
    "import json, sys\n"
    "nodes = json.load(open(sys.argv[1], encoding='utf-8'))['nodes']\n"
    "written = [1 for node in nodes for key, its in node['properties'].items()\n"
    "           if key != 'label' or its['value']]\n"
    "print('Nodes: %d, properties: %d' % (len(nodes), len(written)))\n";

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
        {{file, "--metrics", "--watch", "1"}, "--metrics and --watch exclude each other"},
        {{file, "--output", "x", "--watch", "1"}, "--output and --watch exclude each other"},
        {{file, "--output", "x", "--svg", "y"}, "--svg and --output exclude each other"},
        {{file, "--readings"}, "--readings needs --watch or --diff"},
        {{file, "--svg", "x", "--watch", "1"}, "--svg and --watch exclude each other"},
        {{"--diff", file, file, "--json"}, "--json and --diff exclude each other"},
        {{"--diff", file, file, "--watch", "1"}, "--diff and --watch exclude each other"},
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
    const std::set<std::string> expected {"all", "check",   "diff",    "help",       "html",     "json",
                                          "log", "metrics", "output",  "properties", "readings", "save",
                                          "set", "svg",     "version", "watch"};
    EXPECT_EQ(optionsIn(help, "--"), expected);
    EXPECT_EQ(optionsIn(manual, "\n\\.It Fl (?:h , )?-"), expected);
    EXPECT_EQ(optionsIn(manual.substr(manual.find(".Sh EXAMPLES")), "--"),
              (std::set<std::string> {"check", "diff", "json", "metrics", "output", "properties", "save",
                                      "set", "svg", "watch"}));
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

TEST(InventoryManual, ListsAllAlerts)
{
    std::map<unsigned int, std::string> tables;  // by severity
    for (const Trouble& trouble : allTroubles()) {
        const bool isOfStatus = trouble.sign == Trouble::IN_STATUS;
        EXPECT_EQ(trouble.alertClass,
                  isOfStatus && trouble.number <= STATUS_SIZE_UNKNOWN ? CLASS_CONFIGURATION
                                                                      : CLASS_ENVIRONMENT);
        tables[trouble.severity] += ".It "
            + (isOfStatus ? "status " + std::to_string(trouble.number) : infoOf(trouble.number)->identifier)
            + " Ta " + trouble.words + " Ta"
            + (trouble.sensor == IC::Node::SENSOR_UNKNOWN ? "" : ' ' + IC::pst[trouble.sensor]) + '\n';
    }
    const std::string manual = contentOf(INVENTORY_MANUAL);
    for (const auto& [severity, table] : tables) {
        const auto begin = manual.find("\nSeverity " + std::to_string(severity) + ", ");
        ASSERT_NE(begin, std::string::npos);
        const auto first = manual.find("Ta Sy Only of\n", begin);
        EXPECT_EQ(manual.substr(first, manual.find(".El\n", begin) - first), "Ta Sy Only of\n" + table);
    }
    EXPECT_EQ(tables.size(), 3u);
}

}  // namespace
