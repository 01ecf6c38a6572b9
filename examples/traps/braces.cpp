#include "IC/Property.h"
#include <iostream>

int main()
{
    const IC::PropertyValue value(IC::StringArray {"a", "b", "c"});
    const IC::StringArray wrapped {value};  // one element: the text of the array
    const IC::StringArray texts = value;
    std::cout << wrapped.size() << ": " << wrapped.front() << '\n';
    std::cout << texts.size() << ": " << texts.front() << '\n';
}
