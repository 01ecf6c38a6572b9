// The inventory's sensors, on hardware that umockdev simulates.
#include <gmock/gmock.h>

#include "inventory_run.h"

namespace {

using testing::EndsWith;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;

// Runs the program on a machine with one chip that has these files.
Outcome runWith(const std::string& files, std::vector<std::string> arguments = {})
{
    const Folder folder;
    const std::string device = folder.write("board.umockdev",
                                            "P: /devices/platform/board.1\nE: SUBSYSTEM=platform\n\n"
                                            "P: /devices/platform/board.1/hwmon/hwmon0\nE: SUBSYSTEM=hwmon\n"
                                            "A: name=board\\n\n"
                                                + files + "L: device=../../../board.1\n\n");
    // umockdev-run takes only arguments in ASCII, so the shell reads the program's path from the environment.
    // umockdev-run preloads a library, and AddressSanitizer demands to be the first one, although it works as the
    // second too. hwloc's plugin "pci" leaks memory.
    std::vector<std::string> words {"env",
                                    "PROGRAM=" INVENTORY_PROGRAM,
                                    "ASAN_OPTIONS=verify_asan_link_order=0",
                                    "HWLOC_COMPONENTS=-pci",
                                    UMOCKDEV_RUN,
                                    "--device",
                                    device,
                                    "--",
                                    "sh",
                                    "-c",
                                    "exec \"$PROGRAM\" \"$@\"",
                                    "sh"};
    words.insert(words.end(), arguments.begin(), arguments.end());
    return runProgram(words);
}

TEST(InventorySensors, AreNodesBelowTheMachine)
{
    const Outcome outcome = runWith("A: fan1_input=4200\\n\nA: fan1_min=1000\\n\nA: temp1_input=41500\\n\n"
                                    "A: temp1_crit=90000\\n\nA: temp1_label=Inlet\\n\nA: in0_input=12050\\n\n"
                                    "A: in0_min=11000\\n\nA: in0_max=13000\\n\nA: in0_alarm=0\\n\n"
                                    "A: power1_input=250000000\\n\nA: curr1_input=1\\n\n",
                                    {"--properties"});
    EXPECT_EQ(outcome.status, 0) << outcome.err;
    EXPECT_THAT(outcome.out, HasSubstr("\n  Fan board-isa-0001:fan1: fan1, 4200 RPM\n"));
    EXPECT_THAT(outcome.out, HasSubstr(" = 4200] reading\n"));
    EXPECT_THAT(outcome.out, HasSubstr(" = 1000] lower limit\n"));
    EXPECT_THAT(outcome.out,
                HasSubstr("\n  Temperature Sensor board-isa-0001:temp1: Inlet, 41.5 degrees Celsius\n"));
    EXPECT_THAT(outcome.out, HasSubstr(" = 90] upper critical limit\n"));
    EXPECT_THAT(outcome.out, HasSubstr("\n  Voltage Sensor board-isa-0001:in0: in0, 12.05 V\n"));
    EXPECT_THAT(outcome.out, HasSubstr(" = 11] lower limit\n"));
    EXPECT_THAT(outcome.out, HasSubstr(" = 13] upper limit\n"));
    EXPECT_THAT(outcome.out, HasSubstr(" = false] alarm\n"));
    EXPECT_THAT(outcome.out, HasSubstr("\n  PowerDomain board-isa-0001:power1: power1, 250 W\n"));
    EXPECT_THAT(outcome.out, HasSubstr("\n  PowerDomain board-isa-0001:curr1: curr1, 0.001 A\n"));
    EXPECT_THAT(outcome.out, HasSubstr("\nAlerts: 0\n"));
}

TEST(InventorySensors, RaiseAnAlertBeyondALimit)
{
    const struct {
        const char* files;
        const char* trouble;  // empty: none
    } rows[] = {
        {"A: fan1_input=1000\\n\nA: fan1_min=1000\\n\n", ""},
        {"A: fan1_input=999\\n\nA: fan1_min=1000\\n\n", "it is below its lower limit"},
        {"A: fan1_input=0\\n\nA: fan1_min=0\\n\n", ""},
        {"A: temp1_input=90000\\n\nA: temp1_crit=90000\\n\n", ""},
        {"A: temp1_input=90100\\n\nA: temp1_crit=90000\\n\n", "it is above its upper critical limit"},
        {"A: temp1_input=-5000\\n\nA: temp1_min=-4000\\n\n", "it is below its lower limit"},
        {"A: temp1_input=50000\\n\nA: temp1_max=0\\n\n", ""},
        {"A: in0_input=10900\\n\nA: in0_lcrit=11000\\n\n", "it is below its lower critical limit"},
        {"A: in0_input=13100\\n\nA: in0_max=13000\\n\n", "it is above its upper limit"},
        {"A: power1_average=300000000\\n\nA: power1_cap=250000000\\n\n", "it is above its cap"},
        {"A: fan1_input=2000\\n\nA: fan1_alarm=1\\n\n", "it raises an alarm"},
        {"A: in0_input=12000\\n\nA: in0_min_alarm=0\\n\nA: in0_max_alarm=1\\n\n",
         "it raises the alarm of its upper limit"},
        {"A: in0_input=12000\\n\nA: in0_min_alarm=1\\n\nA: in0_max_alarm=0\\n\n",
         "it raises the alarm of its lower limit"},
        {"A: temp1_input=50000\\n\nA: temp1_fault=1\\n\n", "it reports a fault"},
        {"A: temp1_input=broken\\n\n", "it cannot be read"},
        {"A: fan1_min=1000\\n\n", "it cannot be read"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.files);
        const Outcome outcome = runWith(row.files);
        EXPECT_EQ(outcome.status, 0) << outcome.err;
        const bool isFine = std::string(row.trouble).empty();
        EXPECT_THAT(outcome.out, HasSubstr(isFine ? "\nAlerts: 0\n" : "\nAlerts: 1\n"));
        EXPECT_THAT(outcome.out, HasSubstr("board-isa-0001:"));
        EXPECT_THAT(outcome.out, HasSubstr(isFine ? "" : " -- " + std::string(row.trouble) + "\n"));
    }
}

TEST(InventorySensors, HaveWritableLimits)
{
    const std::string fan = "A: fan1_input=900\\n\nA: fan1_min=1000\\n\n";
    const std::string path = "/machine/board-isa-0001:fan1";
    const Outcome properties = runWith(fan, {"--properties"});
    const auto end = properties.out.find(" = 1000] lower limit");
    ASSERT_NE(end, std::string::npos) << properties.out;
    const auto begin = properties.out.rfind('[', end) + 1;
    const std::string key = properties.out.substr(begin, end - begin);

    Outcome outcome = runWith(fan, {"--set", path, key, "850.5"});
    EXPECT_EQ(outcome.status, 0);
    EXPECT_THAT(outcome.out, StartsWith("0 (changed)\n[" + key + " = 850.5] lower limit\nNode "));
    EXPECT_THAT(outcome.out, EndsWith(" : 20, status = 0\n"));
    outcome = runWith(fan, {"--set", path, key, "950"});
    EXPECT_THAT(outcome.out, EndsWith(" : 20, status = 4\n"));
    outcome = runWith(fan, {"--set", path, key, "slow"});
    EXPECT_EQ(outcome.status, 2);
    EXPECT_EQ(outcome.err, "inventory: 'slow' is not a number\n");
    EXPECT_EQ(outcome.out, "");
}

TEST(InventorySensors, AreNotReadWithAnExport)
{
    const Folder folder;
    const std::string file = folder.write("machine.xml", machineOf(""));
    const Outcome outcome = runWith("A: fan1_input=900\\n\n", {file});
    EXPECT_EQ(outcome.status, 0) << outcome.err;
    EXPECT_THAT(outcome.out, StartsWith("Computer machine"));
    EXPECT_THAT(outcome.out, Not(HasSubstr("Fan")));
}

}  // namespace
