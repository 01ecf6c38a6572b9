#include "IC/Number.h"
#include <iostream>

int main()
{
    const IC::Number tens(1234567890, 250);
    const IC::Number others(1234567890, 123);
    std::cout << tens << '\n' << others << '\n';
    const ZQ::DateTime time = others;
    std::cout << time << '\n';
}
