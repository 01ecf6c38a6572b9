// The command line: describes this machine, or the machine of an hwloc export, as nodes.
#include <CLI/CLI.hpp>
#include <spdlog/cfg/env.h>
#include <spdlog/sinks/stdout_color_sinks.h>
#include <spdlog/spdlog.h>

#include <cerrno>  // program_invocation_short_name: the installed program has another name
#include <csignal>
#include <cstdlib>
#include <fstream>
#include <iostream>
#include <tuple>

#include "VXLog/SpdlogSink.h"
#include "alerts.h"
#include "comparing.h"
#include "reading.h"
#include "values.h"
#include "watching.h"
#include "writing.h"

namespace {

using namespace inventory;

enum ExitStatus { EXIT_DONE = 0, EXIT_REFUSED = 1, EXIT_DIFFERENT = 1, EXIT_BAD_INPUT = 2 };

// Sends the library's records to spdlog, which writes to standard error.
void connectLog()
{
    spdlog::set_default_logger(spdlog::stderr_color_mt(program_invocation_short_name));
    spdlog::set_pattern("%Y-%m-%dT%H:%M:%S.%e %^%l%$ %v");
    spdlog::cfg::load_env_levels();
    VXLog::setRecordSink(VXLog::SpdlogSink(spdlog::default_logger()));
}

// The text as a value of the stored value's kind. Writable properties hold texts or real numbers.
IC::PropertyValue valueLike(const IC::PropertyValue& stored, const std::string& text)
{
    if (stored.readOnly() || stored.getKind() != IC::PropertyValue::KIND_NUMBER)
        return text;
    const auto number = realNumber(text);
    if (!number)
        throw BadInput("'" + text + "' is not a number");
    return IC::Number(*number);
}

ExitStatus change(const Nodes& nodes, const std::string& path, const std::string& keyText,
                  const std::string& text)
{
    const auto key = count(keyText);
    if (!key)
        throw BadInput("'" + keyText + "' is not a property number");
    for (const auto& node : nodes) {
        if (node->getPath() != path)
            continue;
        IC::PropertyValue value(text);
        node->getProperty(*key, value);  // leaves `value` as it is if there is no such property
        const IC::Error outcome = node->setProperty(*key, valueLike(value, text));
        const bool isDone = outcome.getStatus() == IC::Error::STATUS_SUCCESS;
        const bool isReadOnly = outcome.getStatus() == IC::Error::STATUS_READ_ONLY;
        const char* words = isDone ? "changed" : isReadOnly ? "read-only" : "no such property";
        std::cout << outcome << " (" << words << ")\n";
        if (node->getProperty(*key, value).getStatus() == IC::Error::STATUS_SUCCESS)
            writeProperty(std::cout, *key, value);
        std::cout << *node << '\n';
        return isDone ? EXIT_DONE : EXIT_REFUSED;
    }
    throw BadInput("no node has the path '" + path + "'");
}

// The parsed command line.
struct Request {
    std::string file;
    TreeForm form;
    std::tuple<std::string, std::string, std::string> setting;
    std::pair<std::string, std::string> sides;
    std::string drawing;
    std::string period;
    bool asJson = false;
};

Inventory readFrom(const std::string& file)
{
    try {
        return readExport(readFile(file));
    } catch (const BadInput& bad) {
        throw BadInput(file + ": " + bad.what());
    }
}

Inventory readHere()
{
    Inventory inventory = readThisMachine();
    readSensors(inventory);
    return inventory;
}

void describe(const Nodes& nodes, const TreeForm& form)
{
    writeTree(std::cout, nodes, form);
    std::cout << '\n';
    writeAlerts(std::cout, alertsOf(nodes), form.look);
    std::cout << '\n';
    writeSummary(std::cout, nodes);
}

ExitStatus compare(const std::string& before, const std::string& after)
{
    const Inventory old = readFrom(before);
    const Inventory current = readFrom(after);
    const auto changes = changesBetween(old.nodes, current.nodes);
    if (changes.empty())
        return EXIT_DONE;
    std::cout << "--- " << printable(before) << "\n+++ " << printable(after) << '\n';
    writeChanges(std::cout, changes, lookOfStandardOutput());
    return EXIT_DIFFERENT;
}

ExitStatus draw(const Nodes& nodes, const std::string& name)
{
    std::ofstream file(name, std::ios::binary);
    if (file)
        writeSvg(file, nodes);
    file.close();
    if (file)
        return EXIT_DONE;
    std::cerr << program_invocation_short_name << ": " << printable(name)
              << ": the drawing cannot be written\n";
    return EXIT_REFUSED;
}

double secondsIn(const std::string& text)
{
    constexpr double fewest = 0.001;
    constexpr double most = 1e9;
    const auto seconds = realNumber(text);
    if (!seconds || !(*seconds >= fewest && *seconds <= most))
        throw BadInput("--watch: '" + text + "' is not a number of seconds from 0.001 to 1000000000");
    return *seconds;
}

// Throws BadInput if more than one of these options is given.
void allowOne(const std::vector<const CLI::Option*>& options)
{
    const CLI::Option* given = nullptr;
    for (const CLI::Option* option : options) {
        if (option->count() == 0)
            continue;
        if (given != nullptr)
            throw BadInput(given->get_name() + " and " + option->get_name() + " exclude each other");
        given = option;
    }
}

// The exit status: `failure` if the output cannot be written. With --diff, status 1 means that something differs, so
// its `failure` is another status.
int flushed(int status, ExitStatus failure)
{
    if (std::cout.flush())
        return status;
    std::cerr << program_invocation_short_name << ": the output cannot be written\n";
    return failure;
}

int run(int argc, char** argv)
{
    CLI::App app("Describes this machine, or that of FILE, as nodes with numbered properties.",
                 program_invocation_short_name);
    app.footer(
        "Examples:\n"
        "  inventory                            this machine as a tree\n"
        "  lstopo day1.xml                      exports it, to read or compare it later\n"
        "  inventory --properties day1.xml      all properties of the machine of that file\n"
        "  inventory --diff day1.xml day2.xml   what has changed in between\n"
        "  inventory --watch 10                 alerts, as changes happen\n"
        "  inventory --json | jq '.nodes[].path'\n"
        "  inventory --svg machine.svg && xdg-open machine.svg\n\n"
        "Exit status: 0; 1 if --set is refused, --diff finds differences or the output cannot be written;\n"
        "2 for options or input that cannot be used, and for --diff if the output cannot be written.\n"
        "Log records go to standard error; SPDLOG_LEVEL=trace shows all of them, SPDLOG_LEVEL=off none.\n"
        "On a terminal the tree is drawn with lines and colours; NO_COLOR=1 turns the colours off.");
    app.set_version_flag("--version",
                         program_invocation_short_name
                             + std::string(" " INVENTORY_VERSION ", hwloc " HWLOC_VERSION));
    Request request;
    const auto* file =
        app.add_option("FILE", request.file, "A machine as hwloc exports it (lstopo FILE.xml)");
    const auto* log =
        app.add_flag("--log", request.form.own, "Write each node in its own text form, as a log shows it");
    const auto* properties = app.add_flag("--properties", request.form.withProperties,
                                          "Write the properties of each node: [number = value] name");
    const auto* set =
        app.add_option("--set", request.setting, "Change one property and write the outcome, nothing else")
            ->type_name("PATH NUMBER TEXT");
    const auto* json = app.add_flag("--json", request.asJson,
                                    "Write the nodes and their properties as JSON; a text that is not"
                                    " UTF-8 becomes {\"hex\": \"fffe\"}");
    const auto* svg = app.add_option("--svg", request.drawing, "Draw the nodes as nested boxes into OUTPUT")
                          ->type_name("OUTPUT");
    const auto* watching = app.add_option("--watch", request.period,
                                          "Read again every SECONDS and write what changed, as alerts")
                               ->type_name("SECONDS");
    const auto* diff = app.add_option("--diff", request.sides, "Write the differences between two machines")
                           ->type_name("BEFORE AFTER");
    try {
        app.parse(argc, argv);
    } catch (const CLI::Success& success) {  // --help, --version
        return flushed(app.exit(success), EXIT_REFUSED);
    }
    for (const CLI::Option* form : {log, properties})
        for (const CLI::Option* mode : {set, json, svg, watching, diff})
            allowOne({form, mode});
    allowOne({set, json, svg, watching, diff});
    allowOne({diff, file});

    if (diff->count() != 0)
        return flushed(compare(request.sides.first, request.sides.second), EXIT_BAD_INPUT);
    const auto read = [&] { return file->count() != 0 ? readFrom(request.file) : readHere(); };
    request.form.look = lookOfStandardOutput();
    if (watching->count() != 0) {
        watch(read, secondsIn(request.period), std::cout, request.form.look);
        return flushed(EXIT_DONE, EXIT_REFUSED);
    }
    const Inventory inventory = read();
    ExitStatus status = EXIT_DONE;
    if (set->count() != 0)
        status = std::apply([&](const auto&... words) { return change(inventory.nodes, words...); },
                            request.setting);
    else if (svg->count() != 0)
        status = draw(inventory.nodes, request.drawing);
    else if (request.asJson)
        writeJson(std::cout, inventory.nodes);
    else
        describe(inventory.nodes, request.form);
    return flushed(status, EXIT_REFUSED);
}

}  // namespace

int main(int argc, char** argv)
{
    // Failures of hwloc are reported by their return values; hwloc must not write lines of its own.
    setenv("HWLOC_HIDE_ERRORS", "2", 0);
    std::signal(SIGPIPE, SIG_IGN);  // writing to a closed pipe then fails and is reported
    try {
        connectLog();
        return run(argc, argv);
    } catch (const std::exception& error) {
        std::cerr << program_invocation_short_name << ": " << printable(error.what()) << '\n';
        return EXIT_BAD_INPUT;
    }
}
