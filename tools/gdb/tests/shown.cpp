#include <cstring>
#include <stdexcept>

#include "IC/Alert.h"
#include "IC/EnumValue.h"
#include "IC/Error.h"
#include "IC/ICException.h"
#include "IC/Node.h"
#include "IC/Number.h"
#include "IC/Property.h"

// Values of every class and kind. GDB stops in stop() and prints them.

namespace {

class Fan : public IC::Node {
public:
    Fan() : Node(SENSOR_FAN)
    {
        path = "/chassis/fan1";
        parent = "/chassis";
        description = "Front fan";
        properties.insert({1, IC::PropertyValue("AFB0812", true)});
        properties.insert({2, IC::PropertyValue(IC::Number(3600u))});
        properties.insert({4, IC::PropertyValue(IC::NumberArray {1200u, 2400u})});
    }
};

IC::Number readAs(IC::Number::KindType kind, IC::Number number)
{
    number.setKind(static_cast<unsigned char>(kind));
    return number;
}

IC::Number ofRefusedKind()
{
    IC::Number number(1u);
    try {
        number.initKind(static_cast<IC::Number::KindType>(12));
    } catch (const std::invalid_argument&) {
    }
    return number;
}

IC::PropertyValue withoutObject()
{
    IC::PropertyValue value("text");
    try {
        value.setKind(7);
    } catch (const IC::PropertyValueInvalidKind&) {
    }
    return value;
}

ZQ::DateTime dateTime(long seconds, unsigned int milliseconds)
{
    ZQ::DateTime time(seconds, 2);
    time.setMillisecond(milliseconds);
    return time;
}

struct Shown {
    IC::Version2 version {2, 15};
    IC::NodeRef nodeRef {4, 7};
    IC::NodeRef noSensor {74, 4294967295u};

    IC::Number unknown {IC::Number::KIND_UNKNOWN};
    IC::Number flag {true};
    IC::Number oddFlag {readAs(IC::Number::KIND_BOOL, 0x02020202u)};
    IC::Number integer {-7};
    IC::Number uint32 {4294967295u};
    IC::Number uint64 {18446744073709551615ull};
    IC::Number real {0.1};
    IC::Number negativeInfinity {-1e308 * 10};
    IC::Number nan {IC::Number::KIND_NAN};
    IC::Number infinity {IC::Number::KIND_INFINITY};
    IC::Number numberOfVersion {version};
    IC::Number numberOfDateTime {1234567890L, 7};
    IC::Number numberOfNodeRef {nodeRef};
    IC::Number refused {ofRefusedKind()};

    IC::EnumValue state {4294967295u};

    IC::PropertyValue nothing {IC::PropertyValue::KIND_UNKNOWN};
    IC::PropertyValue number {IC::Number(3600u)};
    IC::PropertyValue text {std::string("a \"quote\" and \0 NUL", 19), true};
    IC::PropertyValue buffer {IC::Buffer {0x0a, 0xff}};
    IC::PropertyValue emptyBuffer {IC::Buffer()};
    IC::PropertyValue enumValue {IC::EnumValue(7u), true};
    IC::PropertyValue numbers {IC::NumberArray {1u, 0.5}};
    IC::PropertyValue noNumbers {IC::NumberArray(), true};
    IC::PropertyValue texts {IC::StringArray {"a", ""}, true};
    IC::PropertyValue lost {withoutObject()};

    IC::Error success {0, IC::Number(17u), ""};
    IC::Error other {"a text", 7};
    ZQ::DateTime time {dateTime(1234567890, 250)};
    ZQ::DateTime farTime {dateTime(999999999999999, 0)};
    IC::Alert alert {time, 2, 1, {"/fan/1", "/fan/2"}, 5, "Fan failed"};
    Fan fan;
    IC::Node noNode;

    IC::ICException exception {IC::ICException("a message")};
    IC::PropertyValueInvalidKind invalidKind {IC::PropertyValueInvalidKind("Invalid kind of property")};
    IC::NodeInvalidSensor invalidSensor {IC::NodeInvalidSensor("74 is not a valid sensor")};
};

// Storage of a T that was never constructed or has been overwritten.
template <class T>
union Storage {
    explicit Storage(int byte) { std::memset(bytes, byte, sizeof bytes); }
    ~Storage() { }

    T value;
    unsigned char bytes[sizeof(T)];
};

// The layout of a PropertyValue.
struct Fields {
    const void* object;
    unsigned int kind;
    bool readOnly;
};

struct Damaged {
    Storage<IC::Number> number {0xab};
    Storage<IC::EnumValue> enumValue {0xab};
    Storage<IC::PropertyValue> value {0xab};
    Storage<IC::Error> error {0xab};
    Storage<IC::Alert> alert {0xab};
    Storage<Fan> fan {0xab};
    Storage<IC::Node> zeros {0};
    Storage<IC::NodeInvalidSensor> exception {0xab};
    Storage<ZQ::DateTime> time {0xab};
    Storage<std::string> string {0xab};
    const void* array[3] = {unreadable, &array, &array};  // begin, end, and the end of the storage

    Fields noKind {nullptr, 7, false};
    Fields nullText {nullptr, 2, true};
    Fields noNumber {unreadable, 1, false};
    Fields noText {unreadable, 2, false};
    Fields noBuffer {unreadable, 3, false};
    Fields noEnumValue {unreadable, 4, false};
    Fields noNumbers {unreadable, 5, false};
    Fields noTexts {unreadable, 6, false};
    Fields damagedText {&string, 2, false};
    Fields damagedBuffer {&array, 3, false};
    Fields damagedNumbers {&array, 5, false};
    Fields damagedTexts {&array, 6, false};

private:
    static inline const void* const unreadable = reinterpret_cast<const void*>(16);
};

// Keeps both objects in memory and the version in a register at any level of optimisation.
[[gnu::noinline]] void stop(const Shown& shown, const Damaged& damaged, IC::Version2 version)
{
    asm volatile("" : : "r"(&shown), "r"(&damaged), "r"(version.major), "r"(version.minor) : "memory");
}

}  // namespace

int main()
{
    const Shown shown;
    const Damaged damaged;
    stop(shown, damaged, shown.version);
    return 0;
}
