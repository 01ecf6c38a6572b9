// A provider of the agent: it describes two temperature sensors of the machine as nodes.
//
//   provider FOLDER...
//
// One thread, the writer, reads both sensors from each FOLDER in turn. A real provider reads one folder, such as
// /sys/class/hwmon/hwmon0, again every second; the folders in samples/ show it at three moments. Meanwhile the main
// thread changes a limit, as the agent does for an operator.
#include <fstream>
#include <functional>
#include <future>
#include <iostream>
#include <sstream>
#include <vector>

#include "Sensor.h"

namespace {

struct Source {
    std::string file;  // holds the reading in thousandths of a degree
    Sensor& sensor;
};

// A number of KIND_NAN if the file is missing or holds anything but one number.
IC::Number readTemperature(const std::string& file)
{
    std::ifstream in(file);
    double thousandths = 0;
    if (in >> thousandths && (in >> std::ws).eof())
        return thousandths / 1000;
    return IC::Number::KIND_NAN;
}

// The writer.
void updateSensors(const std::vector<Source>& sources, const std::vector<std::string>& folders)
{
    for (const std::string& folder : folders)
        for (const Source& source : sources) {
            const IC::Number reading = readTemperature(folder + '/' + source.file);
            const std::optional<IC::Alert> alert = source.sensor.update(reading);
            std::cout << source.sensor.getPath() << ": " << reading << ", status "
                      << source.sensor.getStatus() << '\n';
            if (alert)  // the severity is a byte, which prints as a character; + makes it a number
                std::cout << "alert of severity " << +alert->getSeverity() << ": " << alert->getMessage()
                          << '\n';
        }
}

}  // namespace

int main(int argc, char** argv)
{
    Sensor inlet("inlet", "Air inlet");
    Sensor disk("disk", "Disk");
    const std::vector<Source> sources {{"temp1_input", inlet}, {"temp2_input", disk}};
    const std::vector<std::string> folders(argv + 1, argv + argc);
    std::future<void> writer =
        std::async(std::launch::async, updateSensors, std::cref(sources), std::cref(folders));

    std::ostringstream outcomes;  // printed later: the writer prints now
    const std::vector<IC::PropertyValue> limits {IC::Number(55.5), "hot",
                                                 IC::Number(IC::Number::KIND_UNKNOWN), IC::Number(1000.0)};
    for (const IC::PropertyValue& limit : limits)
        outcomes << "limit " << limit << ": " << disk.setProperty(Sensor::LIMIT, limit) << '\n';
    outcomes << "label: " << disk.setProperty(Sensor::LABEL, "SSD") << '\n';

    writer.get();  // waits until the thread ends, and throws what it threw
    std::cout << outcomes.str() << inlet.getProperties() << '\n' << disk.getProperties() << '\n';
}
