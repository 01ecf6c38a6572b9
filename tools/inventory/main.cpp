// The command line: describes this machine, or the machine of a file, as nodes.
#include <CLI/CLI.hpp>
#include <spdlog/cfg/env.h>
#include <spdlog/sinks/stdout_color_sinks.h>
#include <spdlog/spdlog.h>

#include <algorithm>
#include <cerrno>  // program_invocation_short_name: the installed program has another name
#include <csignal>
#include <cstdlib>
#include <functional>
#include <iomanip>
#include <iostream>
#include <sstream>
#include <system_error>
#include <tuple>

#include "VXLog/SpdlogSink.h"
#include "alerts.h"
#include "comparing.h"
#include "notice.h"
#include "output.h"
#include "reading.h"
#include "saving.h"
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

// Writes a line about what went wrong to standard error.
void complain(const std::string& text)
{
    std::cerr << program_invocation_short_name << ": " << printable(text) << '\n';
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

int change(std::ostream& out, const Nodes& nodes, const std::string& path, const std::string& keyText,
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
        out << outcome << " (" << words << ")\n";
        if (node->getProperty(*key, value).getStatus() == IC::Error::STATUS_SUCCESS)
            writeProperty(out, *key, value);
        out << *node << '\n';
        return isDone ? EXIT_DONE : EXIT_REFUSED;
    }
    throw BadInput("no node has the path '" + path + "'");
}

// The parsed command line.
struct Request {
    std::string file;
    TreeForm form;
    std::tuple<std::string, std::string, std::string> setting;
    std::vector<std::string> sides;
    std::string output = "-";  // standard output
    std::string drawing = "-";
    std::string page = "-";
    std::string saved = "-";
    std::string period;
    bool withReadings = false;
};

Inventory readFrom(const std::string& file)
{
    const Notice notice("reading the machine...");
    try {
        const std::string content = readFile(file);
        return isSaved(content) ? readSaved(content) : readExport(content);
    } catch (const BadInput& bad) {
        throw BadInput(file + ": " + bad.what());
    }
}

Inventory readHere()
{
    const Notice notice("reading the machine...");
    Inventory inventory = readThisMachine();
    readMemory(inventory);
    readSensors(inventory);
    inventory.hasSensors = true;
    return inventory;
}

Look uncut(Look look)
{
    look.width = 0;
    return look;
}

void describe(std::ostream& out, const Nodes& nodes, const TreeForm& form)
{
    const View view(nodes);
    if (!form.own) {
        writeFirstScreen(out, view, form.look);
        out << '\n';
    }
    writeTree(out, view, form);
    if (!form.own && !form.withProperties && !form.all)
        return;
    out << '\n';
    writeAlerts(out, alertsOf(nodes), form.own ? uncut(form.look) : form.look);
    out << '\n';
    writeSummary(out, nodes);
}

int compare(std::ostream& out, const Request& request)
{
    const std::vector<std::string>& sides = request.sides;
    const Inventory old = readFrom(sides.front());
    const Inventory current = sides.size() > 1 ? readFrom(sides[1])
        : old.hasSensors                       ? readHere()
                                               : readThisMachine();
    auto changes = changesBetween(old.nodes, current.nodes);
    if (old.hasSensors != current.hasSensors)
        changes = withoutOtherSources(std::move(changes));
    if (!request.withReadings)
        changes = withoutMereReadings(std::move(changes));
    if (changes.empty())
        return EXIT_DONE;
    out << "--- " << printable(sides.front()) << "\n+++ "
        << (sides.size() > 1 ? printable(sides[1]) : "this machine") << '\n';
    writeChanges(out, changes, request.form.look);
    return EXIT_DIFFERENT;
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

bool isGiven(const CLI::Option* option)
{
    return option->count() != 0;
}

// Throws BadInput if more than one of these options is given.
void allowOne(const std::vector<const CLI::Option*>& options)
{
    const CLI::Option* given = nullptr;
    for (const CLI::Option* option : options) {
        if (!isGiven(option))
            continue;
        if (given != nullptr)
            throw BadInput(given->get_name() + " and " + option->get_name() + " exclude each other");
        given = option;
    }
}

// The exit status: `failure` if the output cannot be written. That nobody reads it any more is no failure.
int flushed(int status, int failure)
{
    if (std::cout.flush() || isOutputClosed())
        return status;
    complain("the output cannot be written");
    return failure;
}

// Writes what `write` gives to the file, or to standard output if it is "-".
int written(const std::string& file, const std::function<int(std::ostream&)>& write, int failure)
{
    if (file == "-")
        return flushed(write(std::cout), failure);
    std::ostringstream content;
    const int status = write(content);
    try {
        replaceFile(file, content.str());
        return status;
    } catch (const std::system_error& error) {
        complain(file + ": the output cannot be written: " + error.code().message());
        return failure;
    }
}

std::string help()
{
    const std::string name = program_invocation_short_name;
    const std::pair<const char*, const char*> examples[] = {
        {"", "this machine as a tree"},
        {" --save day1.json", "keeps it, to read or compare it later"},
        {" --properties day1.json", "all properties of the machine of that file"},
        {" --diff day1.json", "what has changed since then"},
        {" --watch 10", "alerts, as changes happen"},
        {" --json | jq -r '.nodes[].path'", "the paths of all nodes"},
        {" --svg machine.svg", "a drawing"},
        {" --html machine.html", "a page for a browser, with the drawing and a search"},
        {" --check", "a line and an exit status for a monitoring system"},
        {" --metrics --output ic.prom", "metrics for the node exporter of Prometheus"},
    };
    std::ostringstream text;
    text << "Examples:\n";
    for (const auto& [words, meaning] : examples)
        text << "  " << std::left << std::setw(46) << name + words << ' ' << meaning << '\n';
    text << "\nExit status: 0; 1 if --set is refused, --diff finds differences or the output cannot be "
            "written;\n"
            "2 for options or input that cannot be used, and for --diff if the output cannot be written.\n"
            "With --check: 0 all is well, 1 a warning, 2 critical, 3 cannot tell.\n"
            "Log records go to standard error; SPDLOG_LEVEL=trace shows all of them, SPDLOG_LEVEL=off none.\n"
            "On a terminal the tree is drawn with lines and colours; NO_COLOR=1 turns the colours off.";
    return text.str();
}

// Writes what the options ask for, the tree without them. Gives the exit status.
int writeMachine(std::ostream& out, const CLI::App& app, const Request& request, const Inventory& inventory)
{
    const auto has = [&](const char* option) { return app.count(option) != 0; };
    if (has("--set"))
        return std::apply([&](const auto&... words) { return change(out, inventory.nodes, words...); },
                          request.setting);
    if (has("--check"))
        return writeCheck(out, inventory.nodes, alertsOf(inventory.nodes));
    if (has("--svg"))
        writeSvg(out, inventory.nodes);
    else if (has("--html"))
        writeHtml(out, inventory.nodes);
    else if (has("--save"))
        writeSaved(out, inventory);
    else if (has("--json"))
        writeJson(out, inventory.nodes, alertsOf(inventory.nodes));
    else if (has("--metrics"))
        writeMetrics(out, inventory.nodes, alertsOf(inventory.nodes), INVENTORY_VERSION);
    else
        describe(out, inventory.nodes, request.form);
    return EXIT_DONE;
}

int run(int argc, char** argv)
{
    CLI::App app("Describes this machine, or that of FILE, as nodes with numbered properties.",
                 program_invocation_short_name);
    app.footer(help());
    app.set_version_flag("--version",
                         program_invocation_short_name
                             + std::string(" " INVENTORY_VERSION ", hwloc " HWLOC_VERSION));
    Request request;
    const auto* file = app.add_option(
        "FILE", request.file, "A machine that --save has kept, or that hwloc exports (lstopo FILE.xml)");
    const auto* log =
        app.add_flag("--log", request.form.own, "Write each node in its own text form, as a log shows it");
    const auto* all =
        app.add_flag("--all", request.form.all, "Write each node; otherwise equal parts share a line");
    const auto* properties = app.add_flag("--properties", request.form.withProperties,
                                          "Write the properties of each node: [number = value] name");
    // Not as the second argument, which CLI11 could also take for a variable as C++20.
    const auto* json =
        app.add_flag("--json")->description("Write the nodes, their properties and the alerts as JSON");
    const auto* metrics =
        app.add_flag("--metrics")->description("Write metrics in the text format that Prometheus reads");
    const auto* check = app.add_flag("--check")->description(
        "Write a line for monitoring systems, with the readings; see the exit status");
    const auto* save = app.add_option("--save", request.saved, "Keep the machine, with its sensors, in SAVED")
                           ->type_name("SAVED");
    const auto* svg = app.add_option("--svg", request.drawing, "Draw the machine into SVG")->type_name("SVG");
    const auto* html =
        app.add_option("--html", request.page, "Write all about the machine as one page into HTML")
            ->type_name("HTML");
    const auto* output =
        app.add_option("--output", request.output,
                       "Write to OUTPUT, as a whole or not at all, instead of to standard output")
            ->type_name("OUTPUT");
    const auto* diff = app.add_option("--diff", request.sides,
                                      "Write the differences between two machines; the second is this one if"
                                      " AFTER is missing")
                           ->type_name("BEFORE [AFTER]")
                           ->expected(1, CLI::detail::expected_max_vector_size);
    const auto* watching = app.add_option("--watch", request.period,
                                          "Read again every SECONDS and write what changed, as alerts")
                               ->type_name("SECONDS");
    const auto* readings = app.add_flag("--readings", request.withReadings,
                                        "With --watch and --diff: also readings that pass no limit");
    const auto* set =
        app.add_option("--set", request.setting, "Change one property and write the outcome, nothing else")
            ->type_name("PATH NUMBER TEXT");
    try {
        app.parse(argc, argv);
    } catch (const CLI::Success& success) {  // --help, --version
        return flushed(app.exit(success), EXIT_REFUSED);
    }
    for (const CLI::Option* form : {log, all, properties})
        for (const CLI::Option* mode : {set, json, metrics, check, save, svg, html, watching, diff})
            allowOne({form, mode});
    allowOne({set, json, metrics, check, save, svg, html, diff});
    for (const CLI::Option* mode : {set, metrics, check, save, svg, html, diff, output})
        allowOne({mode, watching});
    if (request.sides.size() > 2 || (isGiven(diff) && isGiven(file)))
        throw BadInput("--diff and FILE exclude each other");
    if (isGiven(readings) && !isGiven(watching) && !isGiven(diff))
        throw BadInput("--readings needs --watch or --diff");

    const auto read = [&] { return isGiven(file) ? readFrom(request.file) : readHere(); };
    if (isGiven(watching)) {
        watch(read,
              {secondsIn(request.period), request.withReadings, isGiven(json), uncut(lookOfStandardOutput())},
              std::cout);
        return flushed(EXIT_DONE, EXIT_REFUSED);
    }

    // Each option that names a file of its own.
    std::string target = request.output;
    for (const auto& [option, own] : {std::pair(save, &request.saved), std::pair(svg, &request.drawing),
                                      std::pair(html, &request.page)}) {
        if (*own != "-") {
            allowOne({option, output});
            target = *own;
        }
    }
    request.form.look = target == "-" ? lookOfStandardOutput() : lookOfFile();
    if (isGiven(diff))
        return written(
            target, [&](std::ostream& out) { return compare(out, request); }, EXIT_BAD_INPUT);
    const Inventory inventory = read();
    const auto write = [&](std::ostream& out) { return writeMachine(out, app, request, inventory); };
    return written(target, write, isGiven(check) ? int {CHECK_UNKNOWN} : int {EXIT_REFUSED});
}

}  // namespace

int main(int argc, char** argv)
{
    // Failures of hwloc are reported by their return values; hwloc must not write lines of its own.
    setenv("HWLOC_HIDE_ERRORS", "2", 0);
    std::signal(SIGPIPE, SIG_IGN);  // writing to a closed pipe then fails
    std::signal(SIGXFSZ, SIG_IGN);  // and so does writing a file that is larger than allowed
    try {
        connectLog();
        return run(argc, argv);
    } catch (const std::exception& error) {
        // A monitoring system reads only standard output, also if the options are wrong.
        if (std::count(argv, argv + argc, std::string_view("--check")) != 0) {
            writeUnknown(std::cout, error.what());
            return flushed(CHECK_UNKNOWN, CHECK_UNKNOWN);
        }
        complain(error.what());
        return EXIT_BAD_INPUT;
    }
}
