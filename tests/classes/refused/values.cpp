// Calls that would silently take a wrong value.
#include "IC/Alert.h"
#include "IC/Node.h"
#include <atomic>
#include <bitset>
#include <functional>
#include <type_traits>
#include <vector>

enum class Long : long long { None };

extern const IC::Number number;
extern IC::PropertyValue value;
extern IC::EnumValue state;
extern const IC::Error error;
extern const IC::Alert alert;
extern IC::Node node;
extern unsigned int speed;
extern long offset;
extern char letter;
extern std::vector<bool> flags;
extern const std::vector<bool> constantFlags;
extern std::bitset<8> bits;
extern std::atomic<unsigned int> counter;
extern const std::atomic<long> constantCounter;
extern std::atomic<bool> changed;

void kinds()
{
    node.setProperty(2, IC::Number(speed));
    node.setProperty(2, speed);  // does not compile: deleted
    value = speed;               // does not compile: deleted
    value = offset;              // does not compile: deleted
    value = letter;              // does not compile: deleted
    value = 5;  // does not compile: an integer is a kind code: write Number(value), or a KindType
}

void objects()
{
    value = IC::PropertyValue(IC::Number(counter.load()));
    value = IC::PropertyValue(IC::Number(bool {flags[0]}));
    value = flags[0];                                     // does not compile: deleted
    value = IC::PropertyValue(flags[0]);                  // does not compile: deleted
    value = IC::PropertyValue(flags[0], true);            // does not compile: deleted
    value = IC::PropertyValue(bits[0]);                   // does not compile: deleted
    value = IC::PropertyValue(counter);                   // does not compile: deleted
    value = IC::PropertyValue(constantCounter);           // does not compile: deleted
    value = IC::PropertyValue(changed, flags[0]);         // does not compile: deleted
    value = IC::PropertyValue(std::ref(speed));           // does not compile: deleted
    value = IC::PropertyValue(std::true_type());          // does not compile: deleted
    value = IC::PropertyValue {std::true_type()};         // does not compile: deleted
    node.setProperty(2, {std::true_type()});              // does not compile: deleted
    const IC::PropertyValue reference(std::ref(letter));  // does not compile: deleted
}

void marks()
{
    value = IC::PropertyValue("AFB0812", flags[0]);
    value = IC::PropertyValue("AFB0812", "read-only");           // does not compile: deleted
    value = IC::PropertyValue("AFB0812", 1);                     // does not compile: deleted
    value = IC::PropertyValue("AFB0812", IC::Node::SENSOR_FAN);  // does not compile: deleted
    value = IC::PropertyValue("AFB0812", number);                // does not compile: deleted
    value = IC::PropertyValue(number, value);                    // does not compile: deleted
}

void references(IC::NodeRef& reference)
{
    reference = static_cast<IC::NodeRef>(number);
    reference = static_cast<IC::NodeRef>(value);  // does not compile: deleted
    reference = static_cast<IC::NodeRef>(state);  // does not compile: deleted
    reference = static_cast<IC::NodeRef>(error);  // does not compile: deleted
    reference = static_cast<IC::NodeRef>(alert);  // does not compile: deleted
    reference = static_cast<IC::NodeRef>(node);   // does not compile: deleted
}

void enumerations()
{
    state = IC::EnumValue(Long::None);  // does not compile: deleted
}
