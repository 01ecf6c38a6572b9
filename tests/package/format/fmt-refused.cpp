#include "IC/fmt.h"

void write(std::string& text, const IC::Number& number, const IC::PropertyValue& value, const IC::Node& node)
{
    text = fmt::format("{:>6} {:.2} {:*<9}", number, value, node);
    text = fmt::format("{:d}", number);  // does not compile: consteval
    text = fmt::format("{:x}", value);   // does not compile: consteval
    text = fmt::format("{:06}", node);   // does not compile: consteval
}
