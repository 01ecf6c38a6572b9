#include "IC/format.h"

void write(std::string& text, const IC::Number& number, const IC::PropertyValue& value, const IC::Node& node)
{
    text = std::format("{:>6} {:.2} {:*<9}", number, value, node);
    text = std::format("{:d}", number);  // does not compile: consteval
    text = std::format("{:x}", value);   // does not compile: consteval
    text = std::format("{:06}", node);   // does not compile: consteval
}
