// What systems that watch fleets read: metrics, the check, saved machines and files written as a whole.
#include <gmock/gmock.h>
#include <sys/stat.h>

#include <random>
#include <regex>
#include <set>

#include "inventory_run.h"

namespace {

using testing::EndsWith;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;

Outcome run(std::vector<std::string> words)
{
    words.insert(words.begin(), INVENTORY_PROGRAM);
    return runProgram(words);
}

std::string real(const std::string& value)
{
    return R"({"kind":"real","value":)" + value + "}";
}

// A saved machine with a fan and a temperature.
std::string savedMachine(const std::string& rpm, const std::string& celsius, const std::string& more = "")
{
    return R"({"format":"ic-inventory-machine","version":1,"sensors":true,"nodes":[)"
           R"({"sensor":40,"status":0,"description":"","path":"/machine","parent":"","properties":{)"
           R"("9":{"kind":"dateTime","value":{"seconds":60,"milliseconds":0,"scope":3}},)"
           R"("11":{"kind":"string","value":"A \"B\" \\ C\n"},"28":{"kind":"uint64","value":1024},)"
           R"("57":{"kind":"string","value":"rack4"})"
        + more + R"(}},)"
        + R"({"sensor":20,"status":0,"description":"","path":"/machine/x:fan1","parent":"/machine","properties":{)"
        + R"("48":)" + real(rpm) + R"(,"49":{"kind":"string","value":"rpm"},"50":)" + real("1000")
        + R"(,"56":{"kind":"string","value":"x"}}},)"
        + R"({"sensor":22,"status":0,"description":"","path":"/machine/x:temp1","parent":"/machine","properties":{)"
        + R"("48":)" + real(celsius) + R"(,"49":{"kind":"string","value":"celsius"},"52":)" + real("80")
        + R"(,"53":)" + real("90") + R"(,"56":{"kind":"string","value":"x"}}}]})";
}

class InventoryFleet : public testing::Test {
protected:
    std::string write(const std::string& rpm, const std::string& celsius, const std::string& more = "")
    {
        return folder.write("saved" + std::to_string(++number) + ".json", savedMachine(rpm, celsius, more));
    }

    // All files of the folder.
    std::set<std::string> files() const
    {
        std::set<std::string> names;
        for (const auto& file : std::filesystem::directory_iterator(folder.path("")))
            names.insert(file.path().filename().string());
        return names;
    }

    Folder folder;
    int number = 0;
    std::string machine = folder.write("machine.xml", machineOf(fact("HostName", "rack4")));
};

// --- Metrics ---

TEST_F(InventoryFleet, HasTheseMetrics)
{
    const Outcome outcome = run({"--metrics", write("1200", "45.5")});
    EXPECT_EQ(outcome.status, 0) << outcome.err;
    EXPECT_THAT(outcome.out,
                StartsWith(R"(# HELP ic_inventory_info The machine and the version of ic-inventory.
# TYPE ic_inventory_info gauge
ic_inventory_info{host="rack4",maker="A \"B\" \\ C\\x0a",model="",version=")"));
    const auto rest = outcome.out.find("# HELP ic_nodes");
    ASSERT_NE(rest, std::string::npos);
    EXPECT_EQ(outcome.out.substr(rest), R"(# HELP ic_nodes The number of nodes of a sensor type.
# TYPE ic_nodes gauge
ic_nodes{sensor="Computer"} 1
ic_nodes{sensor="Fan"} 1
ic_nodes{sensor="Temperature Sensor"} 1
# HELP ic_node_status The status of a node; above 0, something is wrong.
# TYPE ic_node_status gauge
ic_node_status{path="/machine",sensor="Computer"} 0
ic_node_status{path="/machine/x:fan1",sensor="Fan"} 0
ic_node_status{path="/machine/x:temp1",sensor="Temperature Sensor"} 0
# HELP ic_sensor_reading The reading of a sensor in its unit.
# TYPE ic_sensor_reading gauge
ic_sensor_reading{path="/machine/x:fan1",sensor="Fan",unit="rpm"} 1200
ic_sensor_reading{path="/machine/x:temp1",sensor="Temperature Sensor",unit="celsius"} 45.5
# HELP ic_alerts The number of alerts; 0 is information, 1 a warning, 2 major, 3 critical.
# TYPE ic_alerts gauge
ic_alerts{severity="0"} 0
ic_alerts{severity="1"} 0
ic_alerts{severity="2"} 0
ic_alerts{severity="3"} 0
# HELP ic_memory_bytes The memory of the machine.
# TYPE ic_memory_bytes gauge
ic_memory_bytes 1024
# HELP ic_up 1: the machine was read.
# TYPE ic_up gauge
ic_up 1
)");
}

TEST_F(InventoryFleet, HasMetricsThatPromtoolAccepts)
{
    if (std::string_view(PROMTOOL).empty())
        GTEST_SKIP() << "the Debian package prometheus is missing";
    std::vector<std::string> machines = realMachines();
    machines.push_back(write("0", "45", R"(,"12":{"kind":"string","value":{"hex":"22fffe5c0a"}})"));
    for (const std::string& file : machines) {
        SCOPED_TRACE(file);
        const Outcome outcome = runProgram(
            {"sh", "-c",
             quoted({INVENTORY_PROGRAM, "--metrics", file}) + "| " + quoted({PROMTOOL, "check", "metrics"})});
        EXPECT_EQ(outcome.status, 0);
        EXPECT_EQ(outcome.out + outcome.err, "");
    }
}

// --- The check ---

TEST_F(InventoryFleet, HasALineForMonitoringSystems)
{
    const struct {
        std::string rpm;
        std::string celsius;
        int status;
        std::string line;
    } rows[] = {
        {"1200", "45.5", 0,
         "OK: 3 nodes, no alert | nodes=3 warnings=0 critical=0 '/machine/x:fan1'=1200;1000: "
         "'/machine/x:temp1'=45.5;~:80;~:90\n"},
        {"1200", "81", 1,
         "WARNING: 3 nodes, /machine/x:temp1, Temperature Sensor: it is above its upper limit | nodes=3 "
         "warnings=1 critical=0 '/machine/x:fan1'=1200;1000: '/machine/x:temp1'=81;~:80;~:90\n"},
        {"999", "45", 2,
         "CRITICAL: 3 nodes, /machine/x:fan1, Fan: it is below its lower limit | nodes=3 warnings=0 "
         "critical=1 '/machine/x:fan1'=999;1000: '/machine/x:temp1'=45;~:80;~:90\n"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.line);
        const Outcome outcome = run({"--check", write(row.rpm, row.celsius)});
        EXPECT_EQ(outcome.status, row.status);
        EXPECT_EQ(outcome.out, row.line);
        EXPECT_EQ(outcome.err, "");
    }
    // An upper limit of 0 is none.
    const std::string unlimited =
        std::regex_replace(savedMachine("1200", "45"), std::regex(R"("value":[89]0\})"), R"("value":0})");
    EXPECT_THAT(run({"--check", folder.write("unlimited.json", unlimited)}).out,
                EndsWith(" '/machine/x:fan1'=1200;1000: '/machine/x:temp1'=45\n"));
}

TEST_F(InventoryFleet, CannotTellWhatItCannotReadOrWrite)
{
    const std::string broken = folder.write("broken.xml", "hello|\n");
    const std::vector<std::string> rows[] = {{"--check", folder.path("missing|.xml")},
                                             {broken, "--check"},
                                             {"--check", "--bogus"},
                                             {"--check", "--json", machine},
                                             {"--check", machine, machine}};
    for (const auto& words : rows) {
        SCOPED_TRACE(quoted(words));
        const Outcome outcome = run(words);
        EXPECT_EQ(outcome.status, 3);
        EXPECT_THAT(outcome.out, testing::MatchesRegex("UNKNOWN: [^|\n]*\n"));
        EXPECT_EQ(outcome.err, "");
    }
    EXPECT_EQ(runWithoutSpace({INVENTORY_PROGRAM, "--check", machine}).status, 3);
    EXPECT_EQ(run({"--check", "--output", folder.path("missing/x"), machine}).status, 3);
}

// --- Files ---

TEST_F(InventoryFleet, ReplacesAFileAsAWholeOrNotAtAll)
{
    const std::string target = folder.write("target", "old");
    chmod(target.c_str(), 0600);
    const std::string link = folder.path("link");
    std::filesystem::create_symlink("target", link);
    const auto before = files();
    const auto permissions = [&] {
        struct stat status { };
        stat(target.c_str(), &status);
        return status.st_mode & 0777U;
    };
    const auto limited = [&](const std::string& limit, const std::string& option, const std::string& file) {
        return runProgram(
            {"sh", "-c", limit + " exec " + quoted({INVENTORY_PROGRAM, option, "--output", file, machine})});
    };

    // The file may have no more than 512 bytes.
    Outcome outcome = limited("ulimit -f 1;", "--json", target);
    EXPECT_EQ(outcome.status, 1);
    EXPECT_EQ(outcome.err, "inventory: " + target + ": the output cannot be written: File too large\n");
    EXPECT_EQ(contentOf(target), "old");
    outcome = run({"--json", "--output", target, folder.path("missing.xml")});
    EXPECT_EQ(outcome.status, 2);
    EXPECT_EQ(contentOf(target), "old");
    EXPECT_EQ(permissions(), 0600U);

    outcome = limited("umask 027;", "--metrics", link);
    EXPECT_EQ(outcome.status, 0) << outcome.err;
    EXPECT_EQ(outcome.out, "");
    EXPECT_THAT(contentOf(target), StartsWith("# HELP ic_inventory_info "));
    EXPECT_EQ(permissions(), 0640U);
    EXPECT_TRUE(std::filesystem::is_symlink(link));
    EXPECT_EQ(files(), before);

    // Every form.
    const std::string other = folder.write("other.xml", machineOf(""));
    const std::vector<std::string> forms[] = {{},
                                              {"--log"},
                                              {"--properties"},
                                              {"--json"},
                                              {"--metrics"},
                                              {"--check"},
                                              {"--save", "-"},
                                              {"--svg", "-"},
                                              {"--diff", other, machine},
                                              {"--set", "/machine", "4", "x"}};
    for (std::vector<std::string> words : forms) {
        SCOPED_TRACE(quoted(words));
        if (words.empty() || words.front() != "--diff")
            words.push_back(machine);
        const Outcome direct = run(words);
        words.insert(words.begin(), {"--output", target});
        const Outcome through = run(words);
        EXPECT_EQ(through.status, direct.status);
        EXPECT_EQ(through.out, "");
        EXPECT_NE(direct.out, "");
        const auto withoutTimes = [](const std::string& text) {
            return std::regex_replace(text, std::regex("[0-9-]{10}T[0-9:]{8}Z|\"seconds\":[0-9]+"), "");
        };
        EXPECT_EQ(withoutTimes(contentOf(target)), withoutTimes(direct.out));
    }
}

// --- Saved machines ---

TEST_F(InventoryFleet, ReadsASavedMachineAsItWas)
{
    std::vector<std::string> machines = realMachines();
    machines.push_back(write("1200", "45", R"(,"12":{"kind":"string","value":{"hex":"22fffe5c0a"}})"));
    for (const std::string& file : machines) {
        SCOPED_TRACE(file);
        const std::string saved = folder.path("saved.json");
        ASSERT_EQ(run({"--save", saved, file}).status, 0);
        const Outcome same = run({"--diff", file, saved});
        EXPECT_EQ(same.status, 0);
        EXPECT_EQ(same.out + same.err, "");
        EXPECT_EQ(run({"--metrics", saved}).out, run({"--metrics", file}).out);
    }
}

TEST_F(InventoryFleet, ComparesThisMachineWithASavedOne)
{
    setenv("HWLOC_COMPONENTS", "-pci", 1);  // its plugin leaks memory
    const std::string saved = folder.path("saved.json");
    ASSERT_EQ(run({"--save", saved}).status, 0);
    const Outcome same = run({"--diff", saved});
    EXPECT_EQ(same.status, 0) << same.out;
    const Outcome other = run({"--diff", machine});
    unsetenv("HWLOC_COMPONENTS");
    EXPECT_EQ(other.status, 1);
    EXPECT_THAT(other.out, HasSubstr("\n+++ this machine\n"));
}

TEST_F(InventoryFleet, ComparesNotHowTheMachineWasRead)
{
    const auto export_ = [&](const std::string& name, const std::string& process,
                             const std::string& version) {
        return folder.write(name,
                            machineOf(fact("ProcessName", process) + fact("LinuxCgroup", "/" + process)
                                      + fact("hwlocVersion", version) + fact("Backend", process)
                                      + fact("Other", "same")));
    };
    const std::string one = export_("one.xml", "lstopo", "2.9.0");
    const Outcome same = run({"--diff", one, export_("two.xml", "hwloc-ls", "2.10.1")});
    EXPECT_EQ(same.status, 0);
    EXPECT_EQ(same.out, "");
    EXPECT_EQ(run({"--diff", one, machine}).status, 1);
}

TEST_F(InventoryFleet, ComparesReadingsThatPassALimit)
{
    const std::string before = write("1200", "45");
    EXPECT_EQ(run({"--diff", before, write("1100", "46")}).status, 0);
    const Outcome all = run({"--diff", before, write("1100", "46"), "--readings"});
    EXPECT_EQ(all.status, 1);
    EXPECT_THAT(all.out, HasSubstr("[48 = 1100] reading"));
    EXPECT_THAT(all.out, HasSubstr("[48 = 46] reading"));
    const Outcome slow = run({"--diff", before, write("900", "46")});
    EXPECT_EQ(slow.status, 1);
    EXPECT_THAT(slow.out, HasSubstr("[48 = 900] reading"));
    EXPECT_THAT(slow.out, Not(HasSubstr("[48 = 46] reading")));
}

TEST_F(InventoryFleet, ComparesWithAnExportOnlyWhatHwlocKnows)
{
    const std::string size = R"(,"102":{"kind":"uint64","value":4096},"103":{"kind":"uint32","value":8})";
    std::string saved = savedMachine("1200", "45", size);
    const std::string module =
        R"(,{"sensor":19,"status":0,"description":"","path":"/machine/dimm-A1","parent":"/machine","properties":{}})";
    saved.insert(saved.rfind(']'), module);
    const Outcome mixed = run({"--diff", folder.write("saved.json", saved),
                               folder.write("export.xml", machineOf(fact("Other", "new")))});
    EXPECT_EQ(mixed.status, 1);
    EXPECT_THAT(mixed.out, HasSubstr("[8 = {\"Other=new\"}] other facts"));
    for (const char* other : {"x:fan1", "x:temp1", "dimm-A1", "[102 = ", "[103 = "})
        EXPECT_THAT(mixed.out, Not(HasSubstr(other)));
}

TEST_F(InventoryFleet, RefusesHostileSavedMachinesInOneLine)
{
    const std::string good = savedMachine("1200", "45");
    const auto with = [&good](const std::string& from, const std::string& to) {
        std::string text = good;
        const auto at = text.find(from);
        EXPECT_NE(at, std::string::npos) << from;
        return text.replace(at, from.size(), to);
    };
    const struct {
        std::string content;
        std::string told;
    } rows[] = {
        {"{", "parse error"},
        {good.substr(0, good.size() / 2), "parse error"},
        {"{}", "its format is not ic-inventory-machine"},
        {with("ic-inventory-machine", "ic-inventory"), "its format is not ic-inventory-machine"},
        {with("\"version\":1", "\"version\":2"), "its version is not 1"},
        {with("\"sensors\":true", "\"sensors\":7"), "type must be boolean"},
        {with("\"nodes\":[", "\"nodes\":7,\"others\":["), "not a saved machine: "},
        {R"({"format":"ic-inventory-machine","version":1,"sensors":true,"nodes":[]})", "it has no nodes"},
        {"{\"format\":" + std::string(100000, '['), "too many levels"},
        {with("\"sensor\":40", "\"sensor\":400"), "/sensor"},
        {with("\"status\":0", "\"status\":86"), "/machine has no status"},
        {with("\"path\":\"/machine\"", "\"path\":\"\""), "'' is no path"},
        {with("x:temp1", "x:fan1"), "two nodes have the path /machine/x:fan1"},
        {with("\"parent\":\"\"", "\"parent\":\"/x\""), "the parent of /machine is missing"},
        {with("\"kind\":\"uint64\",\"value\":1024", "\"kind\":\"string\",\"value\":\"1024\""),
         "size of /machine is no uint64"},
        {with("\"kind\":\"uint64\",\"value\":1024", "\"kind\":\"uint64\",\"value\":-1"),
         "not a saved machine: "},
        {with("\"kind\":\"uint64\",\"value\":1024", "\"kind\":\"missing\",\"value\":\"number\""),
         "size of /machine is no uint64"},
        {with("\"kind\":\"string\",\"value\":\"rack4\"", "\"kind\":\"string\",\"value\":\"\xff\""),
         "parse error"},
        {with("\"seconds\":60", "\"seconds\":9223372036854775807"), "readAt of /machine is no datetime"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.told);
        const std::string file = folder.write("hostile.json", row.content);
        for (const std::vector<std::string>& words :
             {std::vector<std::string> {file}, {"--diff", file, machine}, {"--json", file}}) {
            const Outcome outcome = run(words);
            EXPECT_EQ(outcome.status, 2);
            EXPECT_EQ(outcome.out, "");
            EXPECT_THAT(outcome.err, StartsWith("inventory: " + file + ": not a saved machine: "));
            EXPECT_THAT(outcome.err, HasSubstr(row.told));
            EXPECT_EQ(linesOf(outcome.err).size(), 1U) << outcome.err;
        }
    }
}

TEST_F(InventoryFleet, LeavesOutPropertiesThatItDoesNotKnow)
{
    const Outcome outcome =
        run({"--properties", write("1200", "45", R"(,"99999":{"kind":"uint32","value":1})")});
    EXPECT_EQ(outcome.status, 0) << outcome.err;
    EXPECT_THAT(outcome.out, HasSubstr("rack4"));
    EXPECT_THAT(outcome.out, Not(HasSubstr("99999")));
}

TEST_F(InventoryFleet, ReadsOrRefusesEachMutatedSavedMachine)
{
    const std::string good = savedMachine("1200", "45");
    constexpr std::string_view symbols = "0123456789{}[]\",:\\-.ensux/";
    std::mt19937 random(19);  // NOLINT(cert-msc32-c,cert-msc51-cpp): the same mutations each time
    const auto below = [&random](std::size_t end) { return static_cast<std::size_t>(random()) % end; };
    int refused = 0;
    for (int i = 0; i < 150; ++i) {
        std::string text = good;
        for (std::size_t times = 1 + below(3); times > 0; --times) {
            const std::size_t at = below(text.size());
            const std::size_t from = below(text.size());
            switch (below(4)) {
            case 0:
                text[at] = symbols[below(symbols.size())];
                break;
            case 1:
                text.erase(at, 1 + below(20));
                break;
            case 2:
                text.insert(at, text.substr(from, below(40)));
                break;
            default:  // another digit, which is often another machine
                if (const auto digit = text.find_first_of("123456789", at); digit != std::string::npos)
                    text[digit] = symbols[1 + below(9)];
            }
        }
        const Outcome outcome = run({"--metrics", folder.write("mutated.json", text)});
        SCOPED_TRACE(text);
        ASSERT_TRUE(outcome.status == 0 || outcome.status == 2) << outcome.status;
        ASSERT_EQ(linesOf(outcome.err).size(), outcome.status == 0 ? 0U : 1U) << outcome.err;
        refused += outcome.status == 2 ? 1 : 0;
    }
    EXPECT_GT(refused, 50);
    EXPECT_LT(refused, 150);
}

// --- The watch and systemd ---

// The lines that --watch writes to a file, which is its journal too, while the fan breaks again and again, until one of
// them has this text.
std::vector<std::string> watched(const Folder& folder, const std::string& option, const std::string& text)
{
    std::string broken = savedMachine("900", "46");
    const std::string fan = "\"sensor\":20,\"status\":";
    broken.replace(broken.find(fan), fan.size() + 1, fan + '4');
    folder.write("fine", savedMachine("1200", "45"));
    folder.write("broken", broken);
    folder.write("now", savedMachine("1200", "45"));
    const Outcome outcome =
        runProgram({"sh", "-c",
                    "cd \"$1\" && : >out && JOURNAL_STREAM=$(stat -c %d:%i out) && export JOURNAL_STREAM\n"
                    "\"$2\" --watch 0.05 $3 now >out & watch=$!\n"
                    "for turn in $(seq 300); do\n"
                    "    for state in broken fine; do cp $state next; mv next now; sleep 0.1; done\n"
                    "    grep -qF -e \"$4\" out && break\n"
                    "done\n"
                    "kill $watch; wait $watch; cat out",
                    "sh", folder.path(""), INVENTORY_PROGRAM, option, text});
    EXPECT_EQ(outcome.err, "");
    return linesOf(outcome.out);
}

TEST_F(InventoryFleet, WatchesWithPrioritiesForTheJournal)
{
    const auto lines = watched(folder, "", "status changed from 0 to 4");
    ASSERT_FALSE(lines.empty());
    EXPECT_EQ(lines.front(), "<6>Nodes: 3, watched every 0.05 s");
    EXPECT_THAT(lines, testing::Contains("<3>/machine/x:fan1, Fan: status changed from 0 to 4"));
    EXPECT_THAT(lines, testing::Contains("<6>/machine/x:fan1, Fan: reading changed from 1200 to 900"));
    for (const std::string& line : lines)
        EXPECT_THAT(line, Not(HasSubstr("x:temp1")));  // its reading passes no limit
}

TEST_F(InventoryFleet, WatchesWithAJsonObjectALine)
{
    const auto lines =
        watched(folder, "--json --readings", "Temperature Sensor: reading changed from 45 to 46");
    ASSERT_FALSE(lines.empty());
    for (const std::string& line : lines)
        EXPECT_THAT(
            line,
            testing::MatchesRegex("<[0-9]>\\{\"time\":\"[0-9TZ:-]+\",\"severity\":[0-3],\"class\":[0-5],"
                                  "\"status\":[0-9]+,\"paths\":\\[\"[^\"]+\"\\],\"message\":\"[^\"]+\"\\}"));
}

TEST_F(InventoryFleet, HasUnitsThatSystemdAccepts)
{
    if (std::string_view(SYSTEMD_ANALYZE).empty())
        GTEST_SKIP() << "the Debian package systemd is missing";
    const std::filesystem::path packaging = INVENTORY_PACKAGING;
    const std::pair<const char*, const char*> units[] = {
        {"ic-inventory.service", "ic-inventory.service"},
        {"ic-inventory.ic-inventory-metrics.service", "ic-inventory-metrics.service"},
        {"ic-inventory.ic-inventory-metrics.timer", "ic-inventory-metrics.timer"}};
    std::vector<std::string> words {SYSTEMD_ANALYZE, "verify", "--man=no"};
    for (const auto& [file, unit] : units) {
        // The program need not be installed here.
        const std::string text = contentOf(packaging / file);
        words.push_back(
            folder.write(unit, std::regex_replace(text, std::regex("/usr/bin/ic-inventory"), "/bin/true")));
    }
    const Outcome outcome = runProgram(words);
    EXPECT_EQ(outcome.status, 0);
    EXPECT_EQ(outcome.out + outcome.err, "");
}

}  // namespace
