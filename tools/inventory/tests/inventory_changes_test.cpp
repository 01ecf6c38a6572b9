// The changes that the inventory reports: between nodes made here, between two exports, and with --watch.
#include <fcntl.h>
#include <gmock/gmock.h>
#include <poll.h>
#include <sys/stat.h>

#include <chrono>
#include <cmath>
#include <csignal>
#include <limits>

#include "alerts.h"
#include "inventory_run.h"
#include "writing.h"

namespace {

using namespace inventory;
using testing::HasSubstr;
using testing::IsEmpty;

using Properties = std::map<unsigned int, IC::PropertyValue>;

struct Made : IC::Node {
    Made(SensorType sensor, const std::string& itsPath, const Properties& its = {},
         Status itsStatus = STATUS_FINE)
        : Node(sensor)
    {
        path = itsPath;
        properties = its;
        status = static_cast<StatusType>(itsStatus);
    }
};

Nodes listOf(std::initializer_list<Made*> nodes)
{
    Nodes list;
    for (Made* node : nodes)
        list.emplace_back(node);
    return list;
}

constexpr auto cpu = IC::Node::SENSOR_CPU;
constexpr auto fan = IC::Node::SENSOR_FAN;

IC::NumberArray threads(const std::vector<unsigned int>& numbers)
{
    return {numbers.begin(), numbers.end()};
}

std::string written(const Nodes& before, const Nodes& after)
{
    std::ostringstream out;
    writeChanges(out, changesBetween(before, after));
    return out.str();
}

// The lines for a change of property 12 from one value to another.
std::string between(const IC::PropertyValue& before, const IC::PropertyValue& after)
{
    return written(listOf({new Made(cpu, "/cpu0", {{KEY_MODEL, before}})}),
                   listOf({new Made(cpu, "/cpu0", {{KEY_MODEL, after}})}));
}

std::string linesFor(const std::string& before, const std::string& after)
{
    return "  CPU /cpu0\n-   [12 = " + before + "] model\n+   [12 = " + after + "] model\n";
}

TEST(InventoryChanges, IncludeValuesThatCompareUnequal)
{
    EXPECT_EQ(between("a", "b"), linesFor("a", "b"));
    EXPECT_EQ(between(IC::Number(1u), IC::Number(2u)), linesFor("1", "2"));
    EXPECT_EQ(between(IC::Buffer {1}, IC::Buffer {1, 2}), linesFor("01", "0102"));
    EXPECT_EQ(between(IC::EnumValue(1u), IC::EnumValue(2u)), linesFor("1", "2"));
    EXPECT_EQ(between(IC::StringArray {"a", "b"}, IC::StringArray {"b", "a"}),
              linesFor("{\"a\", \"b\"}", "{\"b\", \"a\"}"));
    EXPECT_EQ(between(IC::NumberArray {1u}, IC::NumberArray {1u, 2u}), linesFor("{1}", "{1, 2}"));
    EXPECT_EQ(between(IC::Number(60L, 0), IC::Number(61L, 0)),
              linesFor("1970-01-01T00:01:00Z", "1970-01-01T00:01:01Z"));
}

TEST(InventoryChanges, IncludeSignedNumbersAlthoughTheyCompareEqual)
{
    ASSERT_EQ(IC::Number(-1), IC::Number(16));
    EXPECT_EQ(between(IC::Number(-1), IC::Number(16)), linesFor("-1", "16"));
    EXPECT_EQ(between(IC::NumberArray {1, 2}, IC::NumberArray {1, 3}), linesFor("{1, 2}", "{1, 3}"));
    EXPECT_EQ(between(IC::Number(-1), IC::Number(-1)), "");
}

TEST(InventoryChanges, IncludeRealsThatHaveTheSameText)
{
    EXPECT_EQ(between(IC::Number(0.1), IC::Number(0.1000000001)), linesFor("0.1", "0.1000000001"));
    EXPECT_EQ(between(IC::NumberArray {0.1}, IC::NumberArray {0.1000000001}),
              linesFor("{0.1}", "{0.1000000001}"));
    EXPECT_EQ(between(IC::Number(0.1), IC::Number(0.1)), "");
}

TEST(InventoryChanges, ExcludeARealThatStaysNaN)
{
    const double nan = std::nan("");
    ASSERT_NE(IC::Number(nan), IC::Number(nan));
    EXPECT_EQ(between(IC::Number(nan), IC::Number(nan)), "");
    EXPECT_EQ(between(IC::NumberArray {nan}, IC::NumberArray {nan}), "");
    EXPECT_EQ(between(IC::Number(nan), IC::Number(1.0)), linesFor("nan", "1"));
}

TEST(InventoryChanges, NameTheKindsIfTheTextsAreEqual)
{
    EXPECT_EQ(between("5", IC::Number(5u)), linesFor("5 (string)", "5 (uint32)"));
    EXPECT_EQ(between(IC::Number(5u), IC::Number(5ull)), linesFor("5 (uint32)", "5 (uint64)"));
    EXPECT_EQ(between(IC::EnumValue(5u), IC::Number(5)), linesFor("5 (enum)", "5 (int)"));
}

TEST(InventoryChanges, CompareReferencesByTheNodesThatTheyLeadTo)
{
    const auto reference = [](unsigned int id) {
        return IC::PropertyValue(IC::Number(IC::NodeRef {cpu, id}));
    };
    ASSERT_EQ(reference(0), reference(1));
    // Two processors, and a fan that belongs to one of them.
    const auto machine = [&](unsigned int first, unsigned int second, unsigned int owner) {
        return listOf({new Made(cpu, "/cpu0", {{KEY_SELF, reference(first)}}),
                       new Made(cpu, "/cpu1", {{KEY_SELF, reference(second)}}),
                       new Made(fan, "/fan", {{KEY_PARENT, reference(owner)}})});
    };
    const Nodes first = machine(0, 1, 0);
    EXPECT_EQ(written(first, machine(0, 1, 0)), "");
    EXPECT_EQ(written(first, machine(0, 1, 1)),
              "  Fan /fan\n-   [2 = /cpu0] parent node\n+   [2 = /cpu1] parent node\n");
    // The processors have exchanged their numbers.
    EXPECT_EQ(written(first, machine(1, 0, 0)),
              "  Fan /fan\n-   [2 = /cpu0] parent node\n+   [2 = /cpu1] parent node\n");
    EXPECT_EQ(written(first, machine(1, 0, 1)), "");
    EXPECT_EQ(written(first, machine(0, 1, 7)),
              "  Fan /fan\n-   [2 = /cpu0] parent node\n+   [2 = CPU:7] parent node\n");
}

TEST(InventoryChanges, WriteSetsAsRanges)
{
    const Nodes old = listOf({new Made(cpu, "/cpu0", {{KEY_CPU_SET, threads({0, 1, 2, 3, 192, 193})}}),
                              new Made(cpu, "/cpu1", {{KEY_CPU_SET, threads({4, 5})}})});
    const Nodes current = listOf({new Made(cpu, "/cpu0", {{KEY_CPU_SET, threads({0, 1, 2, 192})}}),
                                  new Made(cpu, "/cpu1", {{KEY_CPU_SET, threads({})}})});
    EXPECT_EQ(written(old, current),
              "  CPU /cpu0\n"
              "-   [25 = 0-3,192-193] numbers of the hardware threads\n"
              "+   [25 = 0-2,192] numbers of the hardware threads\n"
              "  CPU /cpu1\n"
              "-   [25 = 4-5] numbers of the hardware threads\n"
              "+   [25 = {}] numbers of the hardware threads\n");
}

TEST(InventoryChanges, IncludeNodesAndPropertiesThatComeAndGo)
{
    const Nodes before = listOf({new Made(cpu, "/cpu0", {{KEY_MODEL, "x"}, {KEY_MAKER, "y"}}),
                                 new Made(cpu, "/cpu1", {{KEY_MODEL, "x"}}), new Made(fan, "/a")});
    const Nodes after = listOf({new Made(fan, "/fan1"), new Made(cpu, "/a"),
                                new Made(cpu, "/cpu0", {{KEY_MODEL, "x"}, {KEY_REVISION, "z"}})});
    EXPECT_EQ(written(before, after),
              "  CPU /cpu0\n"
              "-   [11 = y] maker\n"
              "+   [13 = z] revision\n"
              "- CPU /cpu1\n"
              "- Fan /a\n"
              "+ Fan /fan1\n"
              "+ CPU /a\n");
}

TEST(InventoryChanges, ExcludeAnotherPathOfTheSameCoreOrPackage)
{
    const auto core = [](const char* path, unsigned int number, unsigned int thread) {
        return new Made(IC::Node::SENSOR_CPU_CORE, path,
                        {{KEY_INDEX, IC::Number(number)}, {KEY_CPU_SET, threads({thread})}});
    };
    const Nodes before = listOf({new Made(cpu, "/p-t0", {{KEY_CPU_SET, threads({0, 1})}}),
                                 core("/core-4-t0", 4, 0), core("/core-4-t1", 4, 1)});
    EXPECT_EQ(written(before,
                      listOf({new Made(cpu, "/p-t1", {{KEY_CPU_SET, threads({1})}}), core("/core-4", 4, 1)})),
              "  CPU /p-t1\n"
              "-   [25 = 0-1] numbers of the hardware threads\n"
              "+   [25 = 1] numbers of the hardware threads\n"
              "- CPU Core /core-4-t0\n");
    // With another number it is another core.
    EXPECT_EQ(written(before,
                      listOf({new Made(cpu, "/p-t0", {{KEY_CPU_SET, threads({0, 1})}}),
                              core("/core-4-t0", 4, 0), core("/core-5", 5, 1)})),
              "- CPU Core /core-4-t1\n+ CPU Core /core-5\n");
}

TEST(InventoryChanges, ExcludeTheTimeOfReading)
{
    const Nodes before =
        listOf({new Made(cpu, "/cpu0", {{KEY_READ_AT, IC::Number(60L, 0)}}), new Made(fan, "/a")});
    const Nodes after = listOf({new Made(cpu, "/cpu0", {{KEY_READ_AT, IC::Number(61L, 0)}}),
                                new Made(fan, "/a", {{KEY_READ_AT, "x"}})});
    EXPECT_THAT(changesBetween(before, after), IsEmpty());
    EXPECT_THAT(changesBetween(after, before), IsEmpty());
}

TEST(InventoryChanges, BecomeAlertsWithASeverityAndAClass)
{
    const auto alert = [](const Nodes& before, const Nodes& after) {
        const auto alerts = alertsOf(changesBetween(before, after));
        if (alerts.size() != 1 || alerts[0].getNodePaths() != std::vector<std::string> {"/a"})
            return std::string("not one alert of /a");
        return std::to_string(alerts[0].getSeverity()) + ' ' + std::to_string(alerts[0].getClass()) + ' '
            + std::to_string(alerts[0].getStatus()) + ' ' + alerts[0].getMessage();
    };
    const auto one = [](IC::Node::SensorType sensor, const Properties& properties = {},
                        Status status = STATUS_FINE) {
        return listOf({new Made(sensor, "/a", properties, status)});
    };
    const IC::Number slow(900.0);
    const IC::Number fast(1000.0);
    EXPECT_EQ(alert({}, one(cpu)), "0 1 0 CPU came");
    EXPECT_EQ(alert(one(cpu, {}, STATUS_NOT_USABLE), {}), "2 1 1 CPU went");
    EXPECT_EQ(alert(one(fan), {}), "2 2 0 Fan went");
    EXPECT_EQ(alert(one(cpu, {{KEY_MODEL, "x"}}), one(cpu, {{KEY_MODEL, "y"}})),
              "1 1 0 CPU: model changed from x to y");
    EXPECT_EQ(alert(one(cpu), one(cpu, {{KEY_MODEL, "y"}})), "1 1 0 CPU: model came: y");
    EXPECT_EQ(alert(one(cpu, {{KEY_MODEL, "y"}}), one(cpu)), "1 1 0 CPU: model went: y");
    EXPECT_EQ(alert(one(fan, {{KEY_READING, slow}}), one(fan, {{KEY_READING, fast}})),
              "0 2 0 Fan: reading changed from 900 to 1000");
    EXPECT_EQ(alert(one(fan, {{KEY_LOWER_LIMIT, slow}}), one(fan, {{KEY_LOWER_LIMIT, fast}})),
              "1 2 0 Fan: lower limit changed from 900 to 1000");
    const Properties tooSlow {{KEY_READING, slow}, {KEY_LOWER_LIMIT, fast}};
    EXPECT_EQ(alert(one(fan, tooSlow), one(fan, tooSlow, STATUS_OUTSIDE_LIMITS)),
              "2 2 4 Fan: status changed from 0 to 4");
    const Properties tooHot {{KEY_READING, fast}, {KEY_UPPER_CRITICAL, slow}};
    EXPECT_EQ(alert(one(fan, tooHot), one(fan, tooHot, STATUS_OUTSIDE_LIMITS)),
              "3 2 4 Fan: status changed from 0 to 4");
    EXPECT_EQ(alert(one(fan, {}, STATUS_FAULT), one(fan)), "0 2 0 Fan: status changed from 6 to 0");
    const auto flagged = [&one](bool isSet) {
        return one(fan, {{KEY_CRIT_ALARM, IC::Number(isSet)}}, STATUS_ALARM);
    };
    EXPECT_EQ(alert(flagged(false), flagged(true)),
              "3 2 5 Fan: upper critical alarm changed from false to true");
    EXPECT_EQ(alert(one(cpu), one(cpu, {}, STATUS_PARTLY_USABLE)), "1 1 2 CPU: status changed from 0 to 2");
}

// --- The program ---

std::string disk(const std::string& name, const std::string& facts)
{
    return "<object type=\"OSDev\" osdev_type=\"0\" name=\"" + name + "\">" + facts + "</object>";
}

class InventoryDiff : public testing::Test {
protected:
    static Outcome run(const std::string& before, const std::string& after)
    {
        return runProgram({INVENTORY_PROGRAM, "--diff", before, after});
    }

    Folder folder;
    std::string before = folder.write(
        "before.xml",
        machineOf(fact("DMIProductName", "One"),
                  disk("sda", fact("Size", "1024") + fact("Serial", "7")) + disk("sdb", fact("Model", "X"))));
    std::string after = folder.write("after.xml",
                                     machineOf(fact("DMIProductName", "Two"),
                                               disk("sda", fact("Size", "2048") + fact("Model", "Y"))
                                                   + disk("sdc", fact("Model", "X\x1b"))));
};

TEST_F(InventoryDiff, WritesEachNodeAndPropertyThatDiffers)
{
    setenv("HWLOC_LIBXML", "0", 1);  // the parser that accepts control characters
    const Outcome outcome = run(before, after);
    unsetenv("HWLOC_LIBXML");
    EXPECT_EQ(outcome.status, 1);
    EXPECT_EQ(outcome.err, "");
    EXPECT_EQ(outcome.out,
              "--- " + before + "\n+++ " + after
                  + "\n"
                    "  Computer /machine\n"
                    "-   [12 = One] model\n"
                    "+   [12 = Two] model\n"
                    "  Hard Drive /machine/sda\n"
                    "-   [16 = 7] serial number\n"
                    "-   [28 = 1048576] size in bytes\n"
                    "+   [28 = 2097152] size in bytes\n"
                    "+   [12 = Y] model\n"
                    "- Hard Drive /machine/sdb: X\n"
                    "+ Hard Drive /machine/sdc: X\\x1b\n");
}

TEST_F(InventoryDiff, WritesNothingIfNothingDiffers)
{
    const Outcome outcome = run(before, before);
    EXPECT_EQ(outcome.status, 0);
    EXPECT_EQ(outcome.out, "");
    EXPECT_EQ(outcome.err, "");
}

TEST_F(InventoryDiff, ExitsWith2OnFailure)
{
    const std::string broken = folder.write("broken.xml", "hello\n");
    for (const auto& [one, other] : {std::pair(before, broken), std::pair(broken, before)}) {
        const Outcome outcome = run(one, other);
        EXPECT_EQ(outcome.status, 2);
        EXPECT_EQ(outcome.out, "");
        EXPECT_EQ(linesOf(outcome.err).size(), 1u);
        EXPECT_THAT(outcome.err, HasSubstr("broken.xml: not a machine that hwloc "));
    }
    const Outcome full =
        runWithoutSpace({"env", "HWLOC_LIBXML=0", INVENTORY_PROGRAM, "--diff", before, after});
    EXPECT_EQ(full.status, 2);
    EXPECT_EQ(full.err, "inventory: the output cannot be written\n");
}

TEST_F(InventoryDiff, FindsTheDifferencesOfRealMachines)
{
    const auto files = realMachines();
    if (files.empty())
        GTEST_SKIP() << whyNoMachines;
    ASSERT_GE(files.size(), 2u);
    for (std::size_t i = 0; i < files.size(); ++i) {
        SCOPED_TRACE(files[i]);
        const Outcome same = run(files[i], files[i]);
        EXPECT_EQ(same.status, 0);
        EXPECT_EQ(same.out, "");
        const Outcome other = run(files[i], files[(i + 1) % files.size()]);
        EXPECT_EQ(other.status, 1);
        EXPECT_THAT(other.out, HasSubstr("\n  Computer /machine\n"));
    }
}

// A running program; its output, standard error included, comes through a pipe.
class Running {
public:
    explicit Running(const std::vector<std::string>& words)
    {
        int ends[2];
        if (pipe(ends) != 0)
            throw std::runtime_error("no pipe");
        std::vector<char*> arguments;
        for (const std::string& word : words)
            arguments.push_back(const_cast<char*>(word.c_str()));
        arguments.push_back(nullptr);
        process_ = fork();
        if (process_ == 0) {
            dup2(ends[1], STDOUT_FILENO);
            dup2(ends[1], STDERR_FILENO);
            close(ends[0]);
            close(ends[1]);
            execv(arguments[0], arguments.data());
            _exit(127);
        }
        close(ends[1]);
        out_ = ends[0];
    }
    ~Running()
    {
        if (process_ > 0)
            end(SIGKILL);
        close(out_);
    }
    Running(const Running&) = delete;
    Running& operator=(const Running&) = delete;

    // Waits for the text in the output that follows the last match; gives that output up to the end of the text.
    std::string await(const std::string& text)
    {
        std::size_t at = 0;
        while ((at = written_.find(text)) == std::string::npos) {
            constexpr int longest = 60000;
            pollfd ready {out_, POLLIN, 0};
            char piece[4096];
            const ssize_t length = poll(&ready, 1, longest) == 1 ? read(out_, piece, sizeof piece) : 0;
            if (length <= 0)
                throw std::runtime_error("'" + text + "' never came, but " + written_);
            written_.append(piece, static_cast<std::size_t>(length));
        }
        const std::string before = written_.substr(0, at + text.size());
        written_.erase(0, before.size());
        return before;
    }

    // The state of the process: S sleeps, R runs.
    char state() const
    {
        const std::string line = contentOf("/proc/" + std::to_string(process_) + "/stat");
        return line.at(line.rfind(')') + 2);
    }

    // The number of context switches, voluntary or not.
    long switches() const
    {
        long sum = 0;
        for (const std::string& line : linesOf(contentOf("/proc/" + std::to_string(process_) + "/status")))
            if (const auto found = line.find("ctxt_switches:"); found != std::string::npos)
                sum += std::stol(line.substr(line.find(':') + 1));
        return sum;
    }

    // Sends the signal and gives the exit status, -1 if a signal ended the program.
    int end(int signal)
    {
        kill(process_, signal);
        int status = 0;
        for (int i = 0; waitpid(process_, &status, WNOHANG) == 0; ++i) {
            constexpr int most = 60000;
            if (i == most)
                kill(process_, SIGKILL);
            usleep(1000);
        }
        process_ = 0;
        return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    }

private:
    pid_t process_ = 0;
    int out_ = -1;
    std::string written_;
};

class InventoryWatch : public testing::Test {
protected:
    // Replaces the file at once, so that no reading sees half of it.
    void put(const std::string& text) const
    {
        std::filesystem::rename(folder.write("new.xml", text), folder.path("machine.xml"));
    }

    Folder folder;
    std::string file = folder.write("machine.xml", machineOf(fact("DMIProductName", "One"), disk("sda", "")));
};

TEST_F(InventoryWatch, WritesAnAlertForEachChange)
{
    Running program({INVENTORY_PROGRAM, "--watch", "0.02", file});
    EXPECT_EQ(program.await("\n"), "Nodes: 3, watched every 0.02 s\n");
    put(machineOf(fact("DMIProductName", "Two"), disk("sdb", fact("Model", "X"))));
    EXPECT_EQ(program.await("Alert 1; 1; 0; "),
              "Alerts: 3\n"
              "  /machine, Computer: model changed from One to Two\n"
              "    Alert 1; 1; 0; ");
    EXPECT_THAT(program.await("  /machine/sda, "),
                testing::MatchesRegex(
                    "Computer: model changed from One to Two; [0-9TZ:.-]*; \\{ 2f6d616368696e65 \\}\n"
                    "  /machine/sda, "));
    EXPECT_EQ(program.await("Hard Drive went; "), "Hard Drive went\n    Alert 2; 1; 0; Hard Drive went; ");
    EXPECT_THAT(program.await("Hard Drive came; "),
                HasSubstr("\n  /machine/sdb, Hard Drive came\n    Alert 0; 1; 0; Hard Drive came; "));
    put(machineOf(fact("DMIProductName", "Two"), disk("sdb", "")));
    EXPECT_THAT(program.await("model went: X; "),
                HasSubstr("\nAlerts: 1\n  /machine/sdb, Hard Drive: model went: X\n    Alert 1; 1; 0; "));
    EXPECT_EQ(program.end(SIGTERM), 0);
}

TEST_F(InventoryWatch, ContinuesAfterAFailedReading)
{
    Running program({INVENTORY_PROGRAM, "--watch", "0.02", file});
    program.await("\n");
    put("hello\n");
    EXPECT_THAT(program.await("\n"), HasSubstr("machine.xml: not a machine that hwloc "));
    std::filesystem::remove(file);  // another failure, so another message
    EXPECT_EQ(program.await("\n"), "inventory: " + file + ": No such file or directory\n");
    put(machineOf(fact("DMIProductName", "Two"), disk("sda", "")));
    EXPECT_THAT(program.await("One to Two\n"),
                HasSubstr("Alerts: 1\n  /machine, Computer: model changed from "));
    EXPECT_EQ(program.end(SIGINT), 0);
}

TEST_F(InventoryWatch, ExitsWith0OnASignal)
{
    const std::string never = folder.path("never");  // a pipe without a writer: reading it never ends
    ASSERT_EQ(mkfifo(never.c_str(), S_IRUSR | S_IWUSR), 0);
    for (const int signal : {SIGINT, SIGTERM}) {
        Running waiting({INVENTORY_PROGRAM, "--watch", "1000000000", file});
        waiting.await("\n");
        EXPECT_EQ(waiting.end(signal), 0);
        Running reading({INVENTORY_PROGRAM, "--watch", "1000000000", never});
        int writer = -1;
        while ((writer = open(never.c_str(), O_WRONLY | O_NONBLOCK)) < 0) { }  // until it is read
        EXPECT_EQ(reading.end(signal), 0);
        close(writer);
    }
}

TEST_F(InventoryWatch, EndsWhenNobodyReadsOn)
{
    // The shell waits for both programs.
    const Outcome outcome = runProgram(
        {"timeout", "60", "sh", "-c", "\"$0\" --watch 0.02 \"$1\" | head -n 1", INVENTORY_PROGRAM, file});
    EXPECT_EQ(outcome.status, 0);
    EXPECT_EQ(outcome.out, "Nodes: 3, watched every 0.02 s\n");
    EXPECT_EQ(outcome.err, "");
}

TEST_F(InventoryWatch, SleepsBetweenReadings)
{
    Running program({INVENTORY_PROGRAM, "--watch", "1000000000", file});
    program.await("\n");
    const auto giveUp = std::chrono::steady_clock::now() + std::chrono::seconds(60);
    while (program.state() != 'S' && std::chrono::steady_clock::now() < giveUp)
        usleep(1000);
    ASSERT_EQ(program.state(), 'S');
    const long switches = program.switches();
    usleep(200000);  // a sleeping process is not switched, however long this takes
    EXPECT_EQ(program.switches(), switches);
    EXPECT_EQ(program.end(SIGTERM), 0);
}

TEST_F(InventoryWatch, RefusesAnInvalidPeriod)
{
    for (const char* seconds :
         {"", "0", "-1", "0.0009", "1000000001", "nan", "inf", "1e999", "ten", "1s", "1,5"}) {
        const Outcome outcome = runProgram({INVENTORY_PROGRAM, "--watch", seconds, file});
        EXPECT_EQ(outcome.status, 2);
        EXPECT_EQ(outcome.out, "");
        EXPECT_EQ(outcome.err,
                  "inventory: --watch: '" + std::string(seconds)
                      + "' is not a number of seconds from 0.001 to 1000000000\n");
    }
}

TEST_F(InventoryWatch, FailsIfTheFirstReadingOrTheOutputFails)
{
    Outcome outcome = runProgram({INVENTORY_PROGRAM, "--watch", "1", folder.path("missing.xml")});
    EXPECT_EQ(outcome.status, 2);
    EXPECT_EQ(outcome.out, "");
    EXPECT_THAT(outcome.err, HasSubstr("missing.xml: No such file or directory\n"));
    outcome = runWithoutSpace({INVENTORY_PROGRAM, "--watch", "1", file});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_EQ(outcome.err, "inventory: the output cannot be written\n");
}

}  // namespace
