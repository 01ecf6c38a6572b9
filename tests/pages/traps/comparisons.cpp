#include "IC/Error.h"
#include "IC/Property.h"

void compare(bool& result, const IC::Number& number, const IC::EnumValue& state,
             const IC::PropertyValue& value, const IC::Error& error)
{
    result = number < 5u;  // does not compile: ambiguous
    result = number < IC::Number(5u);
    result = state == 5u;  // does not compile: ambiguous
    result = state == IC::EnumValue(5u);
    result = value == number;  // does not compile: ambiguous
    result = value == IC::PropertyValue(number);
    result = value == "AFB0812";  // a text compiles
    result = error != 0;          // does not compile: ambiguous
    result = error != IC::Error::STATUS_SUCCESS;
}
