#include "IC/Property.h"
#include <iostream>

int main()
{
    const IC::PropertyValue kind(5);  // an empty array of numbers: KIND_NUMBERARRAY is 5
    const IC::PropertyValue number(IC::Number(5u));
    std::cout << kind << " of kind " << kind.getKind() << '\n';
    std::cout << number << " of kind " << number.getKind() << '\n';
}
