// Calls that would silently take a wrong value.
#include "IC/Alert.h"
#include "IC/Node.h"
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

void kinds()
{
    node.setProperty(2, IC::Number(speed));
    node.setProperty(2, speed);  // does not compile: deleted
    value = speed;               // does not compile: deleted
    value = offset;              // does not compile: deleted
    value = letter;              // does not compile: deleted
    value = flags[0];            // does not compile: deleted
    value = 5;  // does not compile: an integer is a kind code: write Number(value), or a KindType
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
