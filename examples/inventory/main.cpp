// The command line: describes this machine, or one whose hwloc export is given, as nodes.
#include <CLI/CLI.hpp>
#include <spdlog/cfg/env.h>
#include <spdlog/sinks/stdout_color_sinks.h>
#include <spdlog/spdlog.h>

#include <cstdlib>
#include <iostream>
#include <tuple>

#include "VXLog/RecordSink.h"
#include "reading.h"
#include "values.h"
#include "writing.h"

namespace {

using namespace inventory;

enum ExitStatus { EXIT_DONE = 0, EXIT_REFUSED = 1, EXIT_BAD_INPUT = 2 };

// The library's records go where the program's own go: to spdlog, and so to standard error.
void connectLog()
{
    spdlog::set_default_logger(spdlog::stderr_color_mt("inventory"));
    spdlog::set_pattern("%Y-%m-%dT%H:%M:%S.%e %^%l%$ %v");
    spdlog::cfg::load_env_levels();
    VXLog::setRecordSink([](const VXLog::Record& record) {
        constexpr int failureLevel = 6000;
        const auto level = record.kind == VXLog::Record::Kind::trace ? spdlog::level::trace
            : record.level >= failureLevel                           ? spdlog::level::err
                                                                     : spdlog::level::info;
        spdlog::log(level, "{} {}: {}", record.logger, record.function, printable(record.message));
    });
}

// The text as a value of the stored one's kind. What may be changed here is texts and real numbers.
IC::PropertyValue valueLike(const IC::PropertyValue& stored, const std::string& text)
{
    if (stored.readOnly() || stored.getKind() != IC::PropertyValue::KIND_NUMBER)
        return text;
    const auto number = realNumber(text);
    if (!number)
        throw BadInput("'" + text + "' is no number");
    return IC::Number(*number);
}

ExitStatus change(const Nodes& nodes, const std::string& path, const std::string& keyText,
                  const std::string& text)
{
    const auto key = count(keyText);
    if (!key)
        throw BadInput("'" + keyText + "' is no property number");
    for (const auto& node : nodes) {
        if (node->getPath() != path)
            continue;
        IC::PropertyValue value(text);
        node->getProperty(*key, value);  // stays the text where there is no such property
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

int run(int argc, char** argv)
{
    CLI::App app("Describes this machine, or that of FILE, as nodes with numbered properties.", "inventory");
    app.footer(
        "Exit status: 0; 1 if --set is refused; 2 for input that cannot be used.\n"
        "Log records go to standard error; SPDLOG_LEVEL=trace shows all of them, SPDLOG_LEVEL=off none.");
    app.set_version_flag("--version", "inventory " INVENTORY_VERSION ", hwloc " HWLOC_VERSION);
    std::string file;
    auto* fileOption = app.add_option("FILE", file, "A machine as hwloc exports it (lstopo FILE.xml)");
    TreeForm form;
    app.add_flag("--log", form.own, "Write each node in its own text form, as a log shows it");
    app.add_flag("--properties", form.withProperties,
                 "Write the properties of each node: [number = value] name");
    std::tuple<std::string, std::string, std::string> setting;
    auto* set = app.add_option("--set", setting, "Change one property and write the outcome, nothing else");
    set->type_name("PATH NUMBER TEXT");
    try {
        app.parse(argc, argv);
    } catch (const CLI::Success& success) {  // --help, --version
        return app.exit(success);
    }

    Inventory inventory;
    if (fileOption->count() == 0) {
        inventory = readThisMachine();
        readSensors(inventory);
    } else {
        try {
            inventory = readExport(readFile(file));
        } catch (const BadInput& bad) {
            throw BadInput(file + ": " + bad.what());
        }
    }
    if (set->count() != 0)
        return change(inventory.nodes, std::get<0>(setting), std::get<1>(setting), std::get<2>(setting));
    writeTree(std::cout, inventory.nodes, form);
    std::cout << '\n';
    writeAlerts(std::cout, alertsOf(inventory.nodes));
    std::cout << '\n';
    writeSummary(std::cout, inventory.nodes);
    return EXIT_DONE;
}

}  // namespace

int main(int argc, char** argv)
{
    // hwloc tells what went wrong by what it returns; lines of its own would be one too many.
    setenv("HWLOC_HIDE_ERRORS", "2", 0);
    try {
        connectLog();
        const int status = run(argc, argv);
        if (!std::cout.flush())
            throw BadInput("the output cannot be written");
        return status;
    } catch (const std::exception& error) {
        std::cerr << "inventory: " << printable(error.what()) << '\n';
        return EXIT_BAD_INPUT;
    }
}
