#include "Fan.h"
#include "IC/ICException.h"
#include <iostream>
#include <stdexcept>

void printVersion(const IC::PropertyValue& value)
{
    try {
        const IC::Version2 version = value;
        std::cout << "version " << +version.major << '.' << +version.minor << '\n';
    } catch (const IC::PropertyValueInvalidKind& refusal) {  // the property is not a number
        std::cout << "no number: " << refusal.what() << '\n';
    } catch (const std::out_of_range& refusal) {  // a number that does not fit into a version
        std::cout << "no version: " << refusal.what() << '\n';
    }
}

int main()
{
    const Fan fan;
    IC::PropertyValue value(IC::Number(IC::Version2 {2, 15}));
    printVersion(value);
    fan.getProperty(Fan::MODEL, value);
    printVersion(value);
    fan.getProperty(Fan::SPEED, value);
    printVersion(value);
}
