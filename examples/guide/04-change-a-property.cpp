#include "Fan.h"
#include <iostream>

int main()
{
    Fan fan;
    const IC::Error changed = fan.setProperty(Fan::SPEED, IC::PropertyValue(IC::Number(4200u)));
    const IC::Error readOnly = fan.setProperty(Fan::MODEL, IC::PropertyValue("AFB0912"));
    const IC::Error missing = fan.setProperty(99, IC::PropertyValue("anything"));
    std::cout << changed << ' ' << readOnly << ' ' << missing << '\n';
    if (readOnly == IC::Error::STATUS_READ_ONLY)
        std::cout << "the model cannot be changed\n";

    IC::PropertyValue value(IC::PropertyValue::KIND_UNKNOWN);
    fan.getProperty(Fan::SPEED, value);
    std::cout << "speed " << value << '\n';
}
