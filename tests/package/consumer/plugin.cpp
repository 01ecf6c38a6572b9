#include "IC/ICException.h"
#include "IC/Node.h"

// Catches an exception of the library by its type, and does not catch the next one.
extern "C" [[gnu::visibility("default")]] int caughtAndThrown()
{
    int caught = 0;
    try {
        const IC::Node node(74);
    } catch (const IC::NodeInvalidSensor&) {
        ++caught;
    }
    const IC::PropertyValue value(IC::PropertyValue::KIND_STRING);
    return caught + static_cast<int>(value.operator unsigned int());
}
