#include "Fan.h"
#include <iostream>

int main()
{
    const Fan fan;
    for (const auto& property : fan.getProperties())
        std::cout << property.first << ": kind " << property.second.getKind() << ", " << property.second
                  << '\n';
}
