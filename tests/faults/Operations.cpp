#include "Operations.h"

#include <limits>
#include <new>
#include <sstream>
#include <stdexcept>
#include <type_traits>

#include "IC/Alert.h"
#include "IC/EnumValue.h"
#include "IC/Error.h"
#include "IC/ICException.h"
#include "IC/Node.h"
#include "IC/Number.h"
#include "IC/Property.h"
#include "IC/visit.h"
#include "ZQ/DateTime.h"
#include "support/PropertySamples.h"

namespace {

using IC::Alert;
using IC::EnumValue;
using IC::Error;
using IC::ICException;
using IC::Node;
using IC::NodeInvalidSensor;
using IC::Number;
using IC::PropertyValue;
using IC::PropertyValueInvalidKind;
using Operations = std::vector<Operation>;
using Strings = std::vector<std::string>;

const std::string longText = "a text that needs memory of its own, with a \"quoted\" word";
const std::string otherText =
    "another text, and a longer one, that needs more memory of its own than the first";

constexpr unsigned char byte(int code)
{
    return static_cast<unsigned char>(code);
}

template <class T>
struct Named {
    std::string name;
    T value;
};

// One number of each kind, in the order of the kind codes, and one with the code that a refused initKind stores.
std::vector<Named<Number>> numbers()
{
    Number invalid(1u);
    try {
        invalid.initKind(static_cast<Number::KindType>(12));
    } catch (const std::invalid_argument&) {
    }
    return {{"unknown", Number::KIND_UNKNOWN},
            {"flag", true},
            {"int", -7},
            {"uint32", 4000000000u},
            {"uint64", 18446744073709551615ull},
            {"real", -1234.5},
            {"NaN", Number::KIND_NAN},
            {"infinity", Number::KIND_INFINITY},
            {"version", IC::Version2 {2, 15}},
            {"date", Number(1234567890L, 123)},
            {"node", IC::NodeRef {25, 4294967295u}},
            {"invalid", invalid}};
}

// One property value of each kind, in the order of the kind codes; some that write records when they are printed; and
// some without an object, as a refused setKind leaves them.
std::vector<Named<PropertyValue>> properties(std::vector<PropertyValue> ofEachKind)
{
    std::vector<Named<PropertyValue>> all;
    const char* const names[] = {"nothing", "number", "text", "bytes", "enumerated", "numbers", "texts"};
    for (const char* const name : names)
        all.push_back({name, ofEachKind[all.size()]});
    all.push_back({"date", PropertyValue(Number(1234567890L, 123), true)});
    // Assigning longer strings makes each of these grow.
    all.push_back({"short texts", IC::StringArray {"a", "b", "c", "d"}});
    all.push_back({"dates", IC::NumberArray {Number(1234567890L, 123), Number(1L, 7), Number(5.25)}});
    for (const char* const name : {"text", "numbers"}) {
        PropertyValue empty = name == std::string("text") ? ofEachKind[2] : ofEachKind[5];
        try {
            empty.setKind(7);
        } catch (const PropertyValueInvalidKind&) {
        }
        all.push_back({"no object, " + std::string(name), empty});
    }
    return all;
}

template <class T>
auto given(const T& value)
{
    return [value] { return value; };
}

template <class A, class B>
auto given(const A& a, const B& b)
{
    return [a, b] { return std::make_pair(a, b); };
}

// What every value supports.
template <class T>
void addValue(Operations& all, const std::string& name, const T& value)
{
    all.push_back(on("copy of " + name, given(value), [](const T& source) { return T(source); }));
    all.push_back(on("move of " + name, given(value), [](T& source) { return T(std::move(source)); }));
    all.push_back(on("self-assignment of " + name, given(value), [](T& target) {
        const T& source = target;
        target = source;
    }));
}

// Inserts into a stream that throws if the insertion fails.
const auto toThrowingStream = [](const auto& value) {
    std::ostringstream out;
    out.exceptions(std::ios_base::badbit | std::ios_base::failbit);
#ifdef _LIBCPP_VERSION
    try {
        out << value;
    } catch (const std::ios_base::failure&) {
        throw std::bad_alloc();  // which libc++'s string stream does not let through
    }
#else
    out << value;
#endif
    return out.str();
};

// Inserts into a stream that turns bad if the insertion fails, and throws then, as the sweeps expect.
const auto toStream = [](const auto& value) {
    std::ostringstream out;
    out << value;
    if (!out)
        throw std::bad_alloc();
    return out.str();
};

template <class T>
void addText(Operations& all, const std::string& name, const T& value)
{
    const auto add = [&](Operation operation) {
        operation.writesText = true;
        all.push_back(std::move(operation));
    };
    if constexpr (std::is_convertible_v<T, std::string>)
        add(on("text of " + name, given(value), [](const T& v) { return v.operator std::string(); }));
    add(on(name + " to a stream that throws", given(value), toThrowingStream));
    add(on(name + " to a stream that turns bad", given(value), toStream));
}

template <class T>
void addAssignment(Operations& all, const std::string& from, const T& source, const std::string& to,
                   const T& target)
{
    all.push_back(on(to + " = " + from, given(target, source), [](auto& two) { two.first = two.second; }));
    all.push_back(on(to + " = moved " + from, given(target, source), [](auto& two) {
        T moving(two.second);  // may throw; the assignment does not
        two.first = std::move(moving);
    }));
}

template <class T>
void addComparisons(Operations& all, const std::string& a, const T& x, const std::string& b, const T& y)
{
    all.push_back(on(a + " == " + b, given(x, y), [](auto& two) { return two.first == two.second; }));
    all.push_back(on(a + " != " + b, given(x, y), [](auto& two) { return two.first != two.second; }));
    all.push_back(on(a + " < " + b, given(x, y), [](auto& two) { return two.first < two.second; }));
    all.push_back(on(a + " <= " + b, given(x, y), [](auto& two) { return two.first <= two.second; }));
    all.push_back(on(a + " > " + b, given(x, y), [](auto& two) { return two.first > two.second; }));
    all.push_back(on(a + " >= " + b, given(x, y), [](auto& two) { return two.first >= two.second; }));
}

template <class To, class T>
void addConversion(Operations& all, const std::string& name, const T& value, const char* to)
{
    all.push_back(on(name + " to " + to, given(value), [](const T& v) { return v.operator To(); }));
}

// Construction from a native type, and assignment from it to a value with other content.
template <class T, class Native>
void addNative(Operations& all, const std::string& name, const T& old, const Native& native)
{
    all.push_back(on(name, given(native), [](const Native& from) { return T(from); }));
    all.push_back(
        on("assignment from " + name, given(old, native), [](auto& two) { two.first = two.second; }));
}

void addNumbers(Operations& all)
{
    const Number old(otherText.size() * 1ull);
    addNative(all, "Number(bool)", old, true);
    addNative(all, "Number(int)", old, -7);
    addNative(all, "Number(unsigned int)", old, 7u);
    addNative(all, "Number(unsigned long long)", old, 7ull);
    addNative(all, "Number(double)", old, 0.5);
    addNative(all, "Number(Version2)", old, IC::Version2 {2, 15});
    addNative(all, "Number(NodeRef)", old, IC::NodeRef {4, 7});
    all.push_back(on("Number(seconds, milliseconds)", [] { return Number(1234567890L, 250); }));
    all.push_back(on(
        "Number(DateTime)", [] { return ZQ::DateTime(1234567890, 2); },
        [](const ZQ::DateTime& time) { return Number(time); }));
    for (const int code : {0, 1, 2, 3, 4, 5, 6, 7, 8, 10, 11, 255}) {
        const std::string name = '(' + std::to_string(code) + ')';
        const auto kind = static_cast<Number::KindType>(code);
        all.push_back(on("Number" + name, [code] { return Number(byte(code)); }));
        all.push_back(on("Number from kind " + name, [kind] { return Number(kind); }));
        all.push_back(on("initKind" + name, given(old), [kind](Number& n) { n.initKind(kind); }));
        all.push_back(on("setKind" + name, given(old), [code](Number& n) { n.setKind(byte(code)); }));
    }
    // Without the content, which is the current time.
    all.push_back(on("Number(9)", [] { return Number(byte(9)).getKind(); }));
    all.push_back(on("initKind(9)", [old] {
        Number now(old);
        now.initKind(Number::KIND_DATETIME);
        return now.getKind();
    }));

    for (const auto& [name, value] : numbers()) {
        const std::string called = "Number " + name;
        addValue(all, called, value);
        addText(all, called, value);
        all.push_back(on("kind of " + called, given(value), [](const Number& n) { return n.getKind(); }));
        addConversion<Number::KindType>(all, called, value, "KindType");
        addConversion<bool>(all, called, value, "bool");
        addConversion<int>(all, called, value, "int");
        addConversion<unsigned int>(all, called, value, "unsigned int");
        addConversion<unsigned long long>(all, called, value, "unsigned long long");
        addConversion<double>(all, called, value, "double");
        addConversion<IC::Version2>(all, called, value, "Version2");
        addConversion<ZQ::DateTime>(all, called, value, "DateTime");
        addConversion<IC::NodeRef>(all, called, value, "NodeRef");
        all.push_back(on("visit of " + called, given(value), [](const Number& n) {
            return IC::visit(n, [](const auto& content) { return sizeof content; });
        }));
        for (const auto& [otherName, other] : numbers()) {
            const std::string otherCalled = "Number " + otherName;
            addAssignment(all, otherCalled, other, called, value);
            addComparisons(all, called, value, otherCalled, other);
        }
    }
    addText(all, "Number real 1e300", Number(1e300));
    addText(all, "Number date", Number(std::numeric_limits<long>::max(), 0));
    const Number large(1e300);
    addConversion<int>(all, "Number 1e300", large, "int");
    addConversion<unsigned int>(all, "Number 1e300", large, "unsigned int");
    addConversion<unsigned long long>(all, "Number 1e300", large, "unsigned long long");
    addConversion<IC::Version2>(all, "Number 256", Number(256u), "Version2");
}

void addEnumValues(Operations& all)
{
    const EnumValue old(7u);
    addNative(all, "EnumValue(unsigned char)", old, byte(255));
    addNative(all, "EnumValue(unsigned short)", old, std::numeric_limits<unsigned short>::max());
    addNative(all, "EnumValue(unsigned int)", old, 4294967295u);
    all.push_back(on("EnumValue()", [] { return EnumValue(); }));
    for (const unsigned int value : {0u, 255u, 256u, 65535u, 65536u, 4294967295u}) {
        const std::string name = "EnumValue " + std::to_string(value);
        addValue(all, name, EnumValue(value));
        addText(all, name, EnumValue(value));
        addConversion<unsigned int>(all, name, EnumValue(value), "unsigned int");
        addConversion<unsigned short>(all, name, EnumValue(value), "unsigned short");
        addConversion<unsigned char>(all, name, EnumValue(value), "unsigned char");
        addConversion<Node::SensorType>(all, name, EnumValue(value), "SensorType");
        addConversion<Error::StatusType>(all, name, EnumValue(value), "StatusType");
        addComparisons(all, name, EnumValue(value), "EnumValue 7", old);
        addAssignment(all, name, EnumValue(value), "EnumValue 7", old);
    }
}

void addProperties(Operations& all)
{
    const IC::Buffer bytes {1, 2, 3, 4, 5};
    const IC::NumberArray numberArray {Number(1u), Number(2.5)};
    const IC::StringArray texts {longText, "short", otherText};
    for (const PropertyValue& old : samples(true)) {
        const std::string to = " to kind " + std::to_string(old.getKind());
        addNative(all, "PropertyValue(string)" + to, old, longText);
        addNative(all, "PropertyValue(const char*)" + to, old, longText.c_str());
        addNative(all, "PropertyValue(Number)" + to, old, Number(5u));
        addNative(all, "PropertyValue(EnumValue)" + to, old, EnumValue(5u));
        addNative(all, "PropertyValue(Buffer)" + to, old, bytes);
        addNative(all, "PropertyValue(NumberArray)" + to, old, numberArray);
        addNative(all, "PropertyValue(StringArray)" + to, old, texts);
        for (int kind = 0; kind <= 8; ++kind)
            all.push_back(on("setKind(" + std::to_string(kind) + ")" + to, given(old),
                             [kind](PropertyValue& value) { value.setKind(byte(kind)); }));
    }
    all.push_back(on("PropertyValue(string&&)", [] { return PropertyValue(std::string(longText), true); }));
    all.push_back(on("PropertyValue(Buffer&&)", [bytes] { return PropertyValue(IC::Buffer(bytes), true); }));
    all.push_back(on("PropertyValue(NumberArray&&)",
                     [numberArray] { return PropertyValue(IC::NumberArray(numberArray), true); }));
    all.push_back(
        on("PropertyValue(StringArray&&)", [texts] { return PropertyValue(IC::StringArray(texts), true); }));
    all.push_back(on("PropertyValue(null)", [] { return PropertyValue(static_cast<const char*>(nullptr)); }));
    for (const int code : {0, 1, 2, 3, 4, 5, 6, 7, 255, 257}) {
        const std::string name = std::to_string(code) + ")";
        if (code <= 255)
            all.push_back(on("PropertyValue(" + name, [code] { return PropertyValue(byte(code)); }));
        all.push_back(on("PropertyValue(kind " + name,
                         [code] { return PropertyValue(static_cast<PropertyValue::KindType>(code), true); }));
    }

    for (const auto& [name, value] : properties(samples())) {
        const std::string called = "property " + name;
        addValue(all, called, value);
        addText(all, called, value);
        addText(all, "numbered " + called, std::make_pair(7u, value));
        all.push_back(
            on("kind of " + called, given(value), [](const PropertyValue& v) { return v.getKind(); }));
        all.push_back(
            on("mark of " + called, given(value), [](const PropertyValue& v) { return v.readOnly(); }));
        addConversion<PropertyValue::KindType>(all, called, value, "KindType");
        addConversion<double>(all, called, value, "double");
        addConversion<unsigned long long>(all, called, value, "unsigned long long");
        addConversion<unsigned int>(all, called, value, "unsigned int");
        addConversion<bool>(all, called, value, "bool");
        addConversion<Number>(all, called, value, "Number");
        addConversion<IC::Version2>(all, called, value, "Version2");
        addConversion<EnumValue>(all, called, value, "EnumValue");
        addConversion<IC::Buffer>(all, called, value, "Buffer");
        addConversion<IC::NumberArray>(all, called, value, "NumberArray");
        addConversion<IC::StringArray>(all, called, value, "StringArray");
        for (const auto& [otherName, other] : properties(otherSamples(true))) {
            const std::string otherCalled = "property " + otherName;
            addAssignment(all, otherCalled, other, called, value);
            addComparisons(all, called, value, otherCalled, other);
            all.push_back(on("swap of " + called + " and " + otherCalled, given(value, other), [](auto& two) {
                swap(two.first, two.second);
                two.second.swap(two.first);
            }));
        }
    }

    std::map<unsigned int, PropertyValue> map;
    addText(all, "an empty property map", map);
    for (const auto& [name, value] : properties(samples()))
        map.insert({1000u + static_cast<unsigned int>(map.size()), value});
    addText(all, "a property map", map);
    all.push_back(on("pB", [] { return IC::pB(byte(0xa5)); }));
}

void addErrors(Operations& all)
{
    for (const int status : {0, 16, 17, 255}) {
        const std::string name = " of status " + std::to_string(status);
        all.push_back(on("Error(Number)" + name, [status] { return Error(Number(-7), byte(status)); }));
        all.push_back(on("Error(Number, string)" + name,
                         [status] { return Error(byte(status), Number(-7), longText); }));
        all.push_back(
            on("Error(const char*)" + name, [status] { return Error(longText.c_str(), byte(status)); }));
        all.push_back(on("Error(string)" + name, [status] { return Error(longText, byte(status)); }));
    }
    all.push_back(on("Error(null)", [] { return Error(static_cast<const char*>(nullptr), 5); }));

    const std::vector<Named<Error>> errors {{"Error bare", Error(Number(Number::KIND_UNKNOWN), 0)},
                                            {"Error short", Error(5, Number(1234567u), "short")},
                                            {"Error long", Error(16, Number(-7), longText)},
                                            {"Error longer", Error(1, Number(0.5), otherText + longText)},
                                            {"Error date", Error(2, Number(1234567890L, 123), otherText)}};
    for (const auto& [name, error] : errors) {
        addValue(all, name, error);
        addText(all, name, error);
        all.push_back(on("getStatus of " + name, given(error), [](const Error& e) { return e.getStatus(); }));
        all.push_back(on("getValue of " + name, given(error), [](const Error& e) { return e.getValue(); }));
        all.push_back(
            on("getMessage of " + name, given(error), [](const Error& e) { return e.getMessage(); }));
        addConversion<Error::StatusType>(all, name, error, "StatusType");
        addConversion<unsigned char>(all, name, error, "unsigned char");
        addConversion<Number>(all, name, error, "Number");
        for (const auto& [otherName, other] : errors)
            addAssignment(all, otherName, other, name, error);
    }
}

void addAlerts(Operations& all)
{
    const Strings paths {"/a/path/that/needs/memory/of/its/own", "/b"};
    const struct {
        const char* name;
        int severity;
        int alertClass;
        unsigned int status;
    } codes[] = {{"Alert", 3, 5, 85},
                 {"Alert of a wrong severity", 4, 6, 86},
                 {"Alert of a wrong class", 3, 6, 86},
                 {"Alert of a wrong status", 3, 5, 86}};
    for (const auto& code : codes) {
        all.push_back(on(std::string(code.name) + " of now", [code, paths] {
            return Alert(byte(code.severity), byte(code.alertClass), paths, code.status, longText);
        }));
        all.push_back(on(
            std::string(code.name) + " of a time", [] { return ZQ::DateTime(1234567890, 2); },
            [code, paths](ZQ::DateTime& time) {
                return Alert(time, byte(code.severity), byte(code.alertClass), paths, code.status, longText);
            }));
        all.push_back(on(
            std::string(code.name) + " of a constant time", [] { return ZQ::DateTime(1234567890, 2); },
            [code, paths](const ZQ::DateTime& time) {
                return Alert(time, byte(code.severity), byte(code.alertClass), paths, code.status, longText);
            }));
    }

    ZQ::DateTime time(1234567890, 2);
    const std::vector<Named<Alert>> alerts {
        {"Alert bare", Alert(0, 0, {}, 0, "")},
        {"Alert short", Alert(time, 1, 2, {"/c"}, 3, "short")},
        {"Alert long", Alert(time, 3, 5, paths, 85, longText)},
        {"Alert longer", Alert(2, 4, {otherText, "", longText}, 6, otherText)}};
    for (const auto& [name, alert] : alerts) {
        addValue(all, name, alert);
        addText(all, name, alert);
        all.push_back(
            on("getTimeStamp of " + name, given(alert), [](const Alert& a) { return a.getTimeStamp(); }));
        all.push_back(
            on("getSeverity of " + name, given(alert), [](const Alert& a) { return a.getSeverity(); }));
        all.push_back(on("getClass of " + name, given(alert), [](const Alert& a) { return a.getClass(); }));
        all.push_back(on("getStatus of " + name, given(alert), [](const Alert& a) { return a.getStatus(); }));
        all.push_back(
            on("getNodePaths of " + name, given(alert), [](const Alert& a) { return a.getNodePaths(); }));
        all.push_back(
            on("getMessage of " + name, given(alert), [](const Alert& a) { return a.getMessage(); }));
        all.push_back(
            on("hexstring of " + name, given(alert), [](const Alert& a) { return a.hexstring(longText); }));
        addConversion<Alert::SeverityType>(all, name, alert, "SeverityType");
        addConversion<Alert::ClassType>(all, name, alert, "ClassType");
        addConversion<Node::StatusType>(all, name, alert, "StatusType");
        for (const auto& [otherName, other] : alerts)
            addAssignment(all, otherName, other, name, alert);
    }
}

void addNodes(Operations& all)
{
    all.push_back(on("Node()", [] { return std::make_unique<Node>(); }));
    for (const unsigned int sensor : {0u, 73u, 74u, 4294967295u})
        all.push_back(
            on("Node(" + std::to_string(sensor) + ")", [sensor] { return std::make_unique<Node>(sensor); }));

    for (const auto& [name, value] : properties(samples())) {
        const std::string ofNode = "of a node with " + name;
        const auto node = [held = value] { return SampleNode(held); };
        all.push_back(
            on("construction " + ofNode, [held = value] { return std::make_unique<SampleNode>(held); }));
        all.push_back(on("getProperties " + ofNode, node, [](SampleNode& n) { return n.getProperties(); }));
        for (const auto& [otherName, other] : properties(otherSamples())) {
            const auto both = [held = value, passed = other] {
                return NodeAndValue {SampleNode(held), passed};
            };
            all.push_back(on("getProperty " + ofNode + " into " + otherName, both,
                             [](NodeAndValue& b) { return b.node.getProperty(1, b.value); }));
            all.push_back(on("setProperty " + ofNode + " to " + otherName, both,
                             [](NodeAndValue& b) { return b.node.setProperty(1, b.value); }));
        }
        const auto both = [passed = value] {
            return NodeAndValue {SampleNode(PropertyValue(longText)), passed};
        };
        all.push_back(on("getProperty without such a property, into " + name, both,
                         [](NodeAndValue& b) { return b.node.getProperty(3, b.value); }));
        all.push_back(on("setProperty without such a property, to " + name, both,
                         [](NodeAndValue& b) { return b.node.setProperty(3, b.value); }));
        all.push_back(on("setProperty of a read-only one, to " + name, both,
                         [](NodeAndValue& b) { return b.node.setProperty(2, b.value); }));
    }

    const auto node = [] { return SampleNode(PropertyValue(longText)); };
    all.push_back(on("getStatus of a node", node, [](SampleNode& n) { return n.getStatus(); }));
    all.push_back(
        on("StatusType of a node", node, [](SampleNode& n) { return n.operator Node::StatusType(); }));
    all.push_back(on("getSensor of a node", node, [](SampleNode& n) { return n.getSensor(); }));
    all.push_back(
        on("SensorType of a node", node, [](SampleNode& n) { return n.operator Node::SensorType(); }));
    all.push_back(on("getDescription of a node", node, [](SampleNode& n) { return n.getDescription(); }));
    all.push_back(on("getPath of a node", node, [](SampleNode& n) { return n.getPath(); }));
    all.push_back(on("getParent of a node", node, [](SampleNode& n) { return n.getParent(); }));
    all.push_back(on("hexstring of a node", node, [](SampleNode& n) { return n.hexstring(longText); }));
    all.push_back(on("text of a node", node, [](SampleNode& n) { return n.operator std::string(); }));
    all.push_back(on("a node to a stream that throws", node, toThrowingStream));
    all.push_back(on("a node to a stream that turns bad", node, toStream));

    const auto two = [] {
        return TwoNodes {SampleNode(PropertyValue(longText), "/a"),
                         SampleNode(PropertyValue(longText), "/b")};
    };
    all.push_back(on("node == node", two, [](TwoNodes& nodes) { return nodes.a == nodes.b; }));
    all.push_back(on("node != node", two, [](TwoNodes& nodes) { return nodes.a != nodes.b; }));
    all.push_back(on("node < node", two, [](TwoNodes& nodes) { return nodes.a < nodes.b; }));
    all.push_back(on("node <= node", two, [](TwoNodes& nodes) { return nodes.a <= nodes.b; }));
    all.push_back(on("node > node", two, [](TwoNodes& nodes) { return nodes.a > nodes.b; }));
    all.push_back(on("node >= node", two, [](TwoNodes& nodes) { return nodes.a >= nodes.b; }));
}

template <class Exception>
void addException(Operations& all, const std::string& name)
{
    const Exception exception(longText);
    addNative(all, name, Exception(otherText), exception);
    all.push_back(on(name + "(string)", [] { return Exception(longText); }));
    all.push_back(on("what of " + name, given(exception), [](const Exception& e) { return e.what(); }));
    addAssignment(all, "another " + name, Exception(otherText), name, exception);
}

}  // namespace

std::vector<Operation> operations()
{
    Operations all;
    addNumbers(all);
    addEnumValues(all);
    addProperties(all);
    addErrors(all);
    addAlerts(all);
    addNodes(all);
    addException<ICException>(all, "ICException");
    addException<PropertyValueInvalidKind>(all, "PropertyValueInvalidKind");
    addException<NodeInvalidSensor>(all, "NodeInvalidSensor");
    return all;
}
