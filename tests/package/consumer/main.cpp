// Uses every public name of the library but those of IC/fmt.h, IC/format.h and IC/json.h, which not every way can
// compile, so that compilers, standard libraries and the ways to take the library can be compared: each has to print
// expected.txt.

#include <dlfcn.h>

#include <functional>
#include <iostream>
#include <map>
#include <sstream>
#include <stdexcept>
#include <string>
#include <unordered_map>
#include <utility>
#include <variant>
#include <vector>

#include "IC/Alert.h"
#include "IC/EnumValue.h"
#include "IC/Error.h"
#include "IC/ICException.h"
#include "IC/Node.h"
#include "IC/Number.h"
#include "IC/Property.h"
#include "IC/visit.h"

namespace {

// Prints the result of each of the six operators.
template <class Value>
void compare(const char* name, const Value& a, const Value& b)
{
    std::cout << name << ' ' << (a == b) << (a != b) << (a < b) << (a <= b) << (a > b) << (a >= b) << '\n';
}

template <class Value>
void insert(const Value& value)
{
    std::cout << value << " = " << std::string(value) << '\n';
}

// Prints what the operation throws.
template <class Exception, class Operation>
void refuse(const Operation& operation)
{
    try {
        operation();
        std::cout << "nothing was refused\n";
    } catch (const Exception& refusal) {
        std::cout << refusal.what() << '\n';
    }
}

void useNumber()
{
    using IC::Number;
    const Number numbers[] = {true,
                              -7,
                              3600u,
                              18446744073709551615ull,
                              0.5,
                              IC::Version2 {2, 15},
                              IC::sNodeRef {4, 7},
                              ZQ::DateTime(1234567890, 3),
                              Number(1234567890L, 0),
                              Number(static_cast<unsigned char>(1)),
                              Number(Number::KIND_UINT64)};
    for (const Number& number : numbers)
        insert(number);
    for (const Number::KindType kind :
         {Number::KIND_UNKNOWN, Number::KIND_BOOL, Number::KIND_UINT32, Number::KIND_UINT64,
          Number::KIND_REAL, Number::KIND_NAN, Number::KIND_INFINITY, Number::KIND_VERSION}) {
        Number number(3600u);
        number.initKind(kind);
        std::cout << number << ' ' << (number.getKind() == number.operator IC::Number::KindType()) << '\n';
    }
    for (const Number::KindType kind : {Number::KIND_INT, Number::KIND_DATETIME, Number::KIND_NODEREF}) {
        Number number(0u);
        number.setKind(static_cast<unsigned char>(kind));
        std::cout << (number.getKind() == kind) << '\n';
    }

    const bool flag = numbers[0];
    const int whole = numbers[1];
    const unsigned int small = numbers[2];
    const unsigned long long large = numbers[3];
    const double real = numbers[4];
    const IC::Version2 version = numbers[5];
    const IC::NodeRef reference = numbers[6];
    const ZQ::DateTime time = numbers[7];
    std::cout << flag << ' ' << whole << ' ' << small << ' ' << large << ' ' << real << ' ' << +version.major
              << '.' << +version.minor << ' ' << reference.type << ':' << reference.id << ' '
              << time.operator long() << ' ' << time.getScope() << '\n';

    compare("Number", Number(1u), Number(2u));
    compare("Number", Number(0.5), Number(0.5));
    std::cout << (std::hash<Number>()(Number(1u)) == std::hash<Number>()(Number(1u))) << '\n';
    refuse<std::invalid_argument>([] { return Number(1u) < Number(0.5); });
    refuse<std::invalid_argument>([] { return Number(static_cast<unsigned char>(11)); });
    refuse<std::out_of_range>([] { return Number(Number::KIND_NAN).operator unsigned int(); });
}

void useEnumValue()
{
    using IC::EnumValue;
    insert(EnumValue());
    insert(EnumValue(static_cast<unsigned char>(255)));
    insert(EnumValue(static_cast<unsigned short>(65535)));
    const EnumValue value(7u);
    insert(value);
    const unsigned char byte = value;
    const unsigned short small = value;
    const unsigned int whole = value;
    std::cout << +byte << ' ' << small << ' ' << whole << '\n';
    compare("EnumValue", value, EnumValue(8u));
    std::cout << (std::hash<EnumValue>()(value) == std::hash<EnumValue>()(EnumValue(7u))) << '\n';
    enum class State { off, on };
    const EnumValue on(State::on);
    std::cout << on << ' ' << (static_cast<State>(on) == State::on) << '\n';
    refuse<std::out_of_range>([] { return EnumValue(256u).operator unsigned char(); });
    refuse<std::out_of_range>([] { return EnumValue(65536u).operator unsigned short(); });
}

void useProperty()
{
    using IC::PropertyValue;
    const std::string text = "a\"b";
    const IC::Buffer bytes = {0xde, 0xad, 0xbe, 0xef, 0x01};
    const IC::NumberArray numbers = {1u, 0.5};
    const IC::StringArray texts = {text, ""};
    const PropertyValue values[] = {text,
                                    PropertyValue(std::string("moved"), true),
                                    "literal",
                                    IC::Number(3600u),
                                    IC::EnumValue(7u),
                                    bytes,
                                    IC::Buffer {0xff},
                                    numbers,
                                    IC::NumberArray {2u},
                                    texts,
                                    IC::StringArray {"moved"},
                                    PropertyValue(static_cast<unsigned char>(3)),
                                    IC::Number(IC::Version2 {2, 15})};
    for (const PropertyValue& value : values)
        insert(value);
    for (const PropertyValue::KindType kind :
         {PropertyValue::KIND_UNKNOWN, PropertyValue::KIND_NUMBER, PropertyValue::KIND_STRING,
          PropertyValue::KIND_BUFFER, PropertyValue::KIND_ENUMVALUE, PropertyValue::KIND_NUMBERARRAY,
          PropertyValue::KIND_STRINGARRAY}) {
        PropertyValue value(kind, true);
        value.setKind(static_cast<unsigned char>(kind));
        std::cout << value << ' ' << (value.getKind() == value.operator IC::PropertyValue::KindType())
                  << value.readOnly() << '\n';
    }

    const PropertyValue& number = values[3];
    const double real = number;
    const unsigned long long large = number;
    const unsigned int small = number;
    const bool flag = number;
    const IC::Version2 version = values[12];
    std::cout << real << ' ' << large << ' ' << small << ' ' << flag << ' ' << +version.minor << ' '
              << number.operator IC::Number() << ' ' << values[4].operator IC::EnumValue() << ' '
              << (values[5].operator IC::Buffer() == bytes)
              << (values[7].operator IC::NumberArray() == numbers)
              << (values[9].operator IC::StringArray() == texts) << '\n';

    PropertyValue first(text);
    PropertyValue second(std::move(first));
    first = number;
    PropertyValue third(IC::Number(1u));
    third = std::move(second);
    second = first;
    first = "first";
    swap(first, second);
    first.swap(second);
    std::cout << first << ' ' << second << ' ' << third << ' ' << IC::pB(0x0f) << '\n';
    compare("PropertyValue", PropertyValue("a"), PropertyValue("b"));
    compare("PropertyValue", number, PropertyValue(IC::Number(3600u)));
    const std::unordered_map<PropertyValue, int> known = {{number, 1}};
    std::cout << known.count(second) << '\n';
    std::cout << std::pair<unsigned int, PropertyValue>(7u, numbers) << '\n';
    std::cout << std::map<unsigned int, PropertyValue> {{1u, text}, {7u, numbers}} << '\n';
    refuse<IC::PropertyValueInvalidKind>([&] { return number < PropertyValue("text"); });
}

void useError()
{
    using IC::Error;
    insert(Error(IC::Number(17u), Error::STATUS_SUCCESS));
    insert(Error(Error::STATUS_READ_ONLY, IC::Number(17u), "all three"));
    insert(Error(std::string("text"), Error::STATUS_READ_ONLY));
    Error error("no such property", Error::STATUS_NO_SUCH_PROPERTY);
    const Error copy(error);
    error = Error("other", 1);
    error = copy;
    const Error moved(std::move(error));
    insert(moved);
    std::cout << (moved.getStatus() == moved.operator IC::Error::StatusType())
              << +moved.operator unsigned char() << ' ' << moved.getValue() << ' '
              << moved.operator IC::Number() << ' ' << moved.getMessage() << '\n';
}

void useAlert()
{
    using IC::Alert;
    ZQ::DateTime time(1234567890, 3);
    Alert alert(time, Alert::SEVERITY_LARGEST, Alert::CLASS_LARGEST, {"/a", "/b"}, IC::Node::STATUS_LARGEST,
                "Fan failed");
    const Alert copy(alert);
    alert = Alert(Alert::SEVERITY_SMALLEST, Alert::CLASS_SMALLEST, {}, 0, "");
    alert = copy;
    const Alert moved(std::move(alert));
    std::ostringstream inserted;
    inserted << moved;
    std::cout << (inserted.str() == std::string(moved)) << ' ' << moved.getTimeStamp().operator long() << ' '
              << +moved.getSeverity() << +moved.operator IC::Alert::SeverityType() << ' ' << +moved.getClass()
              << +moved.operator IC::Alert::ClassType() << ' ' << ZQ::Uint32 {moved.getStatus()} << ' '
              << ZQ::Uint32 {moved.operator IC::Node::StatusType()} << ' ' << moved.getNodePaths().size()
              << ' ' << moved.getMessage() << ' ' << moved.hexstring("/a") << '\n';
    const ZQ::DateTime constantTime(1234567890, 3);
    const Alert later(constantTime, Alert::SEVERITY_SMALLEST, Alert::CLASS_SMALLEST, {"/a"}, 0, "Fan works");
    // Not its text: each platform inserts a date-time in its own form.
    std::cout << later.getTimeStamp().operator long() << ' ' << later.getMessage() << '\n';
    refuse<std::invalid_argument>([] { return Alert(4, 0, {}, 0, ""); });
}

class Fan final : public IC::Node {
public:
    explicit Fan(const char* name) : Node(SENSOR_FAN)
    {
        const Lock lock(mutex);
        path = name;
        parent = "/";
        description = "a fan";
        status = STATUS_LARGEST;
        properties.insert({1u, IC::PropertyValue(IC::Number(3600u))});
        properties.insert({2u, IC::PropertyValue("fixed", true)});
    }
};

void useNode()
{
    const IC::Node unknown;
    std::cout << unknown.getDescription() << '\n';
    Fan fan("/fan/1");
    IC::Node& node = fan;
    insert(node);
    std::cout << ZQ::Uint32 {node.getStatus()} << ' ' << ZQ::Uint32 {node.operator IC::Node::StatusType()}
              << ' ' << node.getDescription() << ' ' << ZQ::Uint32 {node.getSensor()} << ' '
              << ZQ::Uint32 {node.operator IC::Node::SensorType()} << ' ' << node.getPath() << ' '
              << node.getParent() << ' ' << node.hexstring("/") << ' '
              << ZQ::Uint32 {IC::Node::SENSOR_LARGEST} << '\n';
    IC::PropertyValue value(IC::PropertyValue::KIND_UNKNOWN);
    std::cout << node.getProperty(1u, value) << ' ' << value << ", " << node.getProperty(3u, value) << ", "
              << node.setProperty(1u, IC::Number(1200u)) << ", "
              << node.setProperty(2u, IC::PropertyValue("new")) << ", " << node.getProperties() << '\n';
    compare<IC::Node>("Node", fan, Fan("/fan/2"));
}

void useExceptions()
{
    IC::ICException root("root");
    const IC::ICException copy(root);
    root = IC::ICException();
    IC::PropertyValueInvalidKind kind("kind");
    IC::NodeInvalidSensor sensor("sensor");
    const IC::PropertyValueInvalidKind otherKind(kind);
    const IC::NodeInvalidSensor otherSensor(sensor);
    kind = otherKind;
    sensor = otherSensor;
    std::cout << root.what() << ' ' << copy.what() << ' ' << kind.what() << ' ' << sensor.what() << '\n';
    refuse<IC::ICException>([&copy] { throw copy; });
}

struct Name {
    template <class Value>
    const char* operator()(const Value&) const
    {
        return "a value";
    }
    const char* operator()(const std::monostate&) const { return "nothing"; }
    const char* operator()(const IC::NotANumber&) const { return "not a number"; }
    const char* operator()(const IC::Infinity&) const { return "infinity"; }
    const char* operator()(const IC::InvalidKind& invalid) const
    {
        return invalid.kind == 11 ? "invalid kind 11" : "another kind";
    }
    const char* operator()(const IC::MissingObject& missing) const
    {
        return missing.kind == IC::PropertyValue::KIND_STRING ? "missing text" : "another kind";
    }
};

void useVisit()
{
    using IC::Number;
    using IC::PropertyValue;
    Number invalid(0u);
    refuse<std::invalid_argument>([&invalid] { invalid.initKind(static_cast<Number::KindType>(11)); });
    PropertyValue missing("text");
    refuse<IC::PropertyValueInvalidKind>([&missing] { missing.setKind(static_cast<unsigned char>(7)); });
    std::cout << IC::visit(Number(0.5), Name()) << ", " << IC::visit(Number(Number::KIND_UNKNOWN), Name())
              << ", " << IC::visit(Number(Number::KIND_NAN), Name()) << ", "
              << IC::visit(Number(Number::KIND_INFINITY), Name()) << ", " << IC::visit(invalid, Name())
              << ", " << IC::visit(PropertyValue("text"), Name()) << ", " << IC::visit(missing, Name())
              << '\n';
}

// The argument is the plug-in; without one only the program itself is tried.
int callPlugin(const char* path)
{
    void* const plugin = dlopen(path, RTLD_NOW);
    if (plugin == nullptr) {
        std::cout << dlerror() << '\n';
        return 1;
    }
    const auto function = reinterpret_cast<int (*)()>(dlsym(plugin, "caughtAndThrown"));
    try {
        std::cout << function() << '\n';
    } catch (const IC::PropertyValueInvalidKind& refusal) {
        std::cout << "from the plug-in: " << refusal.what() << '\n';
    }
    return dlclose(plugin);
}

}  // namespace

int main(int argc, char** argv)
{
    std::cout << IC::pst[0] << ", " << IC::pst[74] << '\n';
    std::cout << IC::Node(20) << '\n';
    std::cout << IC::Number(1234567890L, 0) << '\n';
    try {
        const IC::Node node(74);
    } catch (const IC::NodeInvalidSensor& refusal) {
        std::cout << refusal.what() << '\n';
    }
    try {
        const bool flag = IC::PropertyValue("text");
        std::cout << flag << '\n';
    } catch (const IC::PropertyValueInvalidKind& refusal) {
        std::cout << refusal.what() << '\n';
    }
    try {
        const IC::Error error("text", 17);
    } catch (const std::invalid_argument& refusal) {
        std::cout << refusal.what() << '\n';
    }
    useNumber();
    useEnumValue();
    useProperty();
    useError();
    useAlert();
    useNode();
    useExceptions();
    useVisit();
    return argc > 1 ? callPlugin(argv[1]) : 0;
}
