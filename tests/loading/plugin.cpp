// Uses the library as a plug-in of the agent does. Its one function returns whether every result was right.

#include <sstream>
#include <stdexcept>
#include <string>

#include "IC/Alert.h"
#include "IC/ICException.h"
#include "IC/Node.h"
#include "VXLog/RecordSink.h"

namespace {

class Fan : public IC::Node {
public:
    Fan() : Node(SENSOR_FAN)
    {
        path = "/chassis/fan1";
        properties.insert({1u, IC::PropertyValue("a model whose name needs memory of its own", true)});
        properties.insert({2u, IC::PropertyValue(IC::Number(3600u))});
    }
};

}  // namespace

extern "C" [[gnu::visibility("default")]] bool useLibrary()
{
    // Each thread counts its own records, because several threads may call this function at the same time.
    thread_local int records = 0;
    records = 0;
    VXLog::setRecordSink([](const VXLog::Record&) { ++records; });

    Fan fan;
    IC::PropertyValue value("");
    const bool isRead = fan.getProperty(2, value) == IC::Error::STATUS_SUCCESS;
    const bool isRefused = fan.setProperty(1, value) == IC::Error::STATUS_READ_ONLY;
    std::ostringstream text;
    text << fan << ' ' << fan.getProperties() << ' ' << IC::Number(IC::NodeRef {20, 1}) << ' '
         << IC::Number(0.1);
    int caught = 0;
    try {
        fan.getProperty(1, value);
        static_cast<void>(value.operator unsigned int());
    } catch (const IC::PropertyValueInvalidKind&) {
        ++caught;
    }
    try {
        const IC::Alert alert(4, 0, {"/chassis/fan1"}, 0, "");
    } catch (const std::invalid_argument&) {
        ++caught;
    }
    return isRead && isRefused && caught == 2 && records == 8
        && text.str()
        == "Node 2f636861737369732f66616e31 : 20, status = 0 [1 = a model whose name needs memory of its "
           "own], "
           "[2 = 3600] Fan:1 0.1";
}
