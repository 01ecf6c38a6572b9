#include "IC/Property.h"
#include <string>

void assign(std::string& text, int& whole, long& large, unsigned int& sum, IC::EnumValue& state,
            IC::PropertyValue& value)
{
    text = value;  // does not compile: ambiguous
    text = std::string(value);
    whole = value;  // does not compile: deleted
    whole = value.operator IC::Number();
    large = value;  // does not compile: ambiguous
    large = static_cast<unsigned int>(value);
    sum += value;  // does not compile: ambiguous
    sum += static_cast<unsigned int>(value);
    state = 5;  // does not compile: ambiguous
    state = 5u;
    value = 5u;  // does not compile: deleted
    value = IC::Number(5u);
    value = 0.5;  // does not compile: deleted
    value = IC::Number(0.5);
    value = true;  // does not compile: deleted
    value = IC::Number(true);
}
