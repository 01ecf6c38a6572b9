// Runs a program of operations on a node and on a map: the node's results, properties, texts and records match the map.
#include <iterator>
#include <map>

#include "AnyValue.h"
#include "Check.h"
#include "IC/Node.h"

namespace {

using agreement::ValuePair;
using Records = std::vector<model::Record>;

class ProgrammedNode : public IC::Node {
public:
    ProgrammedNode(unsigned int sensor, const std::string& ownPath) : Node(sensor) { path = ownPath; }

    void add(unsigned int key, const IC::PropertyValue& value) { properties.insert_or_assign(key, value); }
    void setStatus(unsigned int code) { status = static_cast<StatusType>(code); }
    void describe(const std::string& text) { description = text; }
};

struct Expected {
    unsigned int sensor;
    std::string path;
    unsigned int status = 0;
    std::string description;
    std::map<unsigned int, model::PropertyValue> properties;
};

model::Record nodeRecord(int level, const std::string& text)
{
    return {"setProperty", "Node", "Vexilon.IC.Node", level, text};
}

// The pairs of records that one source file logged. setProperty composes its text while it writes its two records, so
// records of Number stand between them.
Records recordsOf(const std::string& file, const std::vector<agreement::LoggerCall>& calls)
{
    std::vector<agreement::LoggerCall> ofFile;
    for (const agreement::LoggerCall& call : calls)
        if (call.record.file == file)
            ofFile.push_back(call);
    return agreement::inPairs(ofFile);
}

void requireError(const IC::Error& error, unsigned int status)
{
    require(error.getStatus() == status, "a node returns the expected status");
    require(error.getValue().getKind() == IC::Number::KIND_UNKNOWN && error.getMessage().empty(),
            "the error that a node returns has no value and no message");
}

void setProperty(IC::Node& node, Expected& expected, unsigned int key, const ValuePair& value)
{
    const auto text = model::textOf(value.expected);
    const std::string start = "setProperty: " + std::to_string(key);
    Records records = {nodeRecord(3000, start + ' ' + *text.value)};
    unsigned int status = 0;
    const auto found = expected.properties.find(key);
    if (found == expected.properties.end()) {
        status = 5;
        records.push_back(nodeRecord(6000, start + " does not exist"));
    } else if (found->second.readOnly) {
        status = 16;
        records.push_back(nodeRecord(6000, start + " read-only"));
    } else {
        found->second = value.expected;
    }
    Records ofText = text.records;
    ofText.insert(ofText.end(), text.records.begin(), text.records.end());

    agreement::takeLoggerCalls();
    requireError(node.setProperty(key, value.actual), status);
    const auto calls = agreement::takeLoggerCalls();
    require(recordsOf("Node", calls) == records, "setProperty logs the expected records");
    require(recordsOf("Number", calls) == ofText, "composing the text of a value logs the expected records");
    require(calls.size() == 2 * (records.size() + ofText.size()), "setProperty logs no other records");
}

void getProperty(const IC::Node& node, const Expected& expected, unsigned int key, ValuePair value)
{
    const auto found = expected.properties.find(key);
    agreement::takeLoggerCalls();
    requireError(node.getProperty(key, value.actual), found == expected.properties.end() ? 5 : 0);
    require(agreement::takeLoggerCalls().empty(), "reading a property logs nothing");
    requireNone(agreement::differenceInContent(
        value.actual, found == expected.properties.end() ? value.expected : found->second));
}

void requireAsExpected(const IC::Node& node, const Expected& expected)
{
    const auto properties = node.getProperties();
    require(properties.size() == expected.properties.size(), "a node has the expected number of properties");
    auto wanted = expected.properties.begin();
    for (const auto& [key, value] : properties) {
        require(key == wanted->first, "a node has the expected keys");
        requireNone(agreement::differenceInContent(value, wanted->second));
        ++wanted;
    }
    require(node.getSensor() == expected.sensor && node.getStatus() == expected.status
                && node.operator IC::Node::StatusType() == expected.status,
            "a node has the expected sensor and status");
    requireSame(node.getDescription(), expected.description, "description");
    requireSame(node.getPath(), expected.path, "path");
    std::string hexadecimal;
    for (const char character : expected.path)
        hexadecimal += model::hexadecimal(static_cast<unsigned char>(character));
    requireSame(node.operator std::string(),
                "Node " + hexadecimal + " : " + std::to_string(expected.sensor)
                    + ", status = " + std::to_string(expected.status),
                "text of a node");
}

void requireCompared(const IC::Node& a, const IC::Node& b)
{
    const int order = a.getPath().compare(b.getPath());
    require((a == b) == (order == 0) && (a != b) == (order != 0) && (a < b) == (order < 0)
                && (a <= b) == (order <= 0) && (a > b) == (order > 0) && (a >= b) == (order >= 0),
            "nodes compare by their paths");
}

void requireSensorRefused(unsigned int sensor)
{
    agreement::takeLoggerCalls();
    try {
        const IC::Node node(sensor);
        fail("an invalid sensor type is accepted");
    } catch (const IC::NodeInvalidSensor& refusal) {
        requireSame(refusal.what(),
                    std::to_string(sensor) + " is not a valid sensor. The largest possible sensor is 73",
                    "exception text for an invalid sensor type");
    }
    const Records expected = {{"Node", "Node", "Vexilon.IC.Node", 6000,
                               "Node: Sensor value out of range: " + std::to_string(sensor)}};
    require(agreement::inPairs(agreement::takeLoggerCalls()) == expected,
            "an invalid sensor type logs the expected record");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    FuzzedDataProvider bytes(data, size);
    const auto sensor = anyInteger<unsigned int>(bytes);
    if (sensor > 73) {
        requireSensorRefused(sensor);
        return 0;
    }
    Expected expected {sensor, bytes.ConsumeRandomLengthString(12), 0, {}, {}};
    ProgrammedNode node(sensor, expected.path);

    for (int step = 0; step < 10 && bytes.remaining_bytes() != 0; ++step) {
        const auto key = bytes.ConsumeIntegralInRange(0u, 3u);
        switch (bytes.ConsumeIntegralInRange(0u, 6u)) {
        case 0:
        case 1: {
            const ValuePair value = anyValue(bytes);
            node.add(key, value.actual);
            expected.properties[key] = value.expected;
            break;
        }
        case 2:
        case 3:
            setProperty(node, expected, key, anyValue(bytes));
            break;
        case 4:
            getProperty(node, expected, key, anyValue(bytes));
            break;
        case 5:
            expected.status = anyInteger<unsigned int>(bytes);
            node.setStatus(expected.status);
            expected.description = bytes.ConsumeRandomLengthString(12);
            node.describe(expected.description);
            break;
        default: {
            const ProgrammedNode other(0, bytes.ConsumeRandomLengthString(12));
            requireCompared(node, other);
            requireCompared(node, node);
        }
        }
    }
    requireAsExpected(node, expected);
    return 0;
}
