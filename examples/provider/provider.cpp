// A provider of the agent: it describes the fans and temperature sensors of this machine as nodes.
//
//   provider [FOLDER [SECONDS]]
//
// Finds the sensors below FOLDER (/sys/class/hwmon) and prints their nodes. One thread reads the sensors again after
// every SECONDS (1) and prints an alert when the status of a sensor changes. Each line "PATH NUMBER VALUE" on standard
// input is a request to change a property, as the agent would make it. The program ends when its input ends.
#include <filesystem>
#include <fstream>
#include <future>
#include <iostream>
#include <memory>
#include <mutex>
#include <regex>
#include <set>
#include <sstream>

#include "Sensor.h"

namespace {

namespace fs = std::filesystem;

// Two threads print; no text begins inside another.
void print(std::ostream& out, const std::string& text)
{
    static std::mutex mutex;
    const std::lock_guard guard(mutex);
    out << text << std::endl;
}

void printAlert(const IC::Alert& alert)
{
    std::ostringstream text;  // severity and class are bytes, which print as characters; + makes them numbers
    text << "alert: severity " << +alert.getSeverity() << ", class " << +alert.getClass() << ", status "
         << alert.getStatus() << ", " << alert.getNodePaths().front() << ": " << alert.getMessage();
    print(std::cout, text.str());
}

void printNode(const IC::Node& node)
{
    std::ostringstream text;
    text << node.getPath() << ": " << IC::pst[node.getSensor()] << ", status " << node.getStatus();
    for (const auto& [number, value] : node.getProperties())
        text << "\n  " << number << " = " << value << (value.readOnly() ? " (read-only)" : "");
    print(std::cout, text.str());
}

// Nothing unless the whole text is one number.
std::optional<double> parse(const std::string& text)
{
    std::istringstream in(text);
    double number = 0;
    if (!(in >> number))
        return std::nullopt;
    return (in >> std::ws).eof() ? std::optional(number) : std::nullopt;
}

// Empty if the file cannot be read, for instance because it has vanished.
std::string firstLine(const fs::path& file)
{
    std::string line;
    std::ifstream in(file);
    std::getline(in, line);
    return line;
}

// Each sensor has files such as temp1_input, temp1_label and temp1_max, in the folder of its chip.
struct Files {
    const char* limit;  // ends the name of the file with the limit
    double divisor;     // temperatures are in thousandths of a degree Celsius
    SensorKind kind;
};
const Files fans {"_min", 1, {IC::Node::SENSOR_FAN, true, 0, 100000}};
const Files temperatures {"_max", 1000, {IC::Node::SENSOR_TEMPERATURE_SENSOR, false, -100, 300}};

class Source {
public:
    Source(const fs::path& chip, const std::string& name, const Files& files)
        : input_(chip / (name + "_input")),
          divisor_(files.divisor)
    {
        const std::string label = firstLine(chip / (name + "_label"));
        sensor_ = std::make_unique<Sensor>(files.kind, "/chassis/" + chip.filename().string(), name,
                                           firstLine(chip / "name") + ' ' + (label.empty() ? name : label),
                                           printAlert);
        update();
        if (const auto limit = parse(firstLine(chip / (name + files.limit)))) {
            const IC::Error outcome = sensor_->setProperty(Sensor::LIMIT, IC::Number(*limit / divisor_));
            if (outcome != IC::Error::STATUS_SUCCESS)
                print(std::cerr, sensor_->getPath() + ": " + std::string(outcome));
        }
    }

    Sensor& sensor() const { return *sensor_; }

    void update() const
    {
        const std::optional<double> number = parse(firstLine(input_));
        sensor_->update(number ? std::optional(*number / divisor_) : std::nullopt);
    }

private:
    fs::path input_;
    double divisor_;
    std::unique_ptr<Sensor> sensor_;
};

// In the order of the files' names. Throws std::filesystem::filesystem_error if a folder cannot be listed.
std::vector<Source> findSensors(const fs::path& folder)
{
    using Sorted = std::set<fs::path>;
    const std::regex inputName("((fan|temp)[0-9]+)_input");
    std::vector<Source> sources;
    for (const fs::path& chip : Sorted(fs::directory_iterator(folder), {}))
        for (const fs::path& file : Sorted(fs::directory_iterator(chip), {})) {
            const std::string name = file.filename().string();
            if (std::smatch match; std::regex_match(name, match, inputName))
                sources.emplace_back(chip, match[1], match[2] == "fan" ? fans : temperatures);
        }
    return sources;
}

void carryOut(const std::string& request, const std::vector<Source>& sources)
{
    std::istringstream words(request);
    std::string path;
    unsigned int number = 0;
    std::string text;
    if (!(words >> path >> number >> std::ws) || !std::getline(words, text))
        return print(std::cout, "a request is PATH NUMBER VALUE");
    for (const Source& source : sources)
        if (source.sensor().getPath() == path) {
            const std::optional<double> real = parse(text);
            const IC::PropertyValue value =
                real ? IC::PropertyValue(IC::Number(*real)) : IC::PropertyValue(text);
            const IC::Error outcome = source.sensor().setProperty(number, value);
            print(std::cout, "outcome: " + std::string(outcome));
            return printNode(source.sensor());
        }
    print(std::cout, "no node has the path " + path);
}

// The writer of the readings: reads all sensors after each period, until `end` is set or abandoned.
void keepReading(const std::vector<Source>& sources, std::chrono::duration<double> period,
                 const std::future<void>& end)
{
    while (end.wait_for(period) == std::future_status::timeout)
        for (const Source& source : sources)
            try {
                source.update();
            } catch (const std::exception& error) {  // such as std::bad_alloc; the other sensors are read
                print(std::cerr, source.sensor().getPath() + ": " + error.what());
            }
}

}  // namespace

int main(int argc, char** argv)
{
    const std::chrono::duration<double> period(parse(argc > 2 ? argv[2] : "1").value_or(0));
    if (argc > 3 || !(period.count() >= 0.001 && period.count() <= 3600)) {
        std::cerr << "usage: provider [FOLDER [SECONDS]]\n";
        return 2;
    }
    try {
        const std::vector<Source> sources = findSensors(argc > 1 ? argv[1] : "/sys/class/hwmon");
        for (const Source& source : sources)
            printNode(source.sensor());
        std::future<void> writer;  // waits for the thread when it is destroyed
        std::promise<void> end;    // is destroyed before, which ends the thread
        writer = std::async(std::launch::async, keepReading, std::cref(sources), period, end.get_future());
        for (std::string request; std::getline(std::cin, request);)
            carryOut(request, sources);
    } catch (const std::exception& error) {
        print(std::cerr, std::string("provider: ") + error.what());
        return 2;
    }
    return std::cout ? 0 : 1;
}
