#include "IC/Number.h"
#include <iostream>
#include <limits>
#include <stdexcept>

int main()
{
    std::cout << std::boolalpha;

    const IC::Number infinity(IC::Number::KIND_INFINITY);
    const IC::Number number(5.0);
    std::cout << "on the left: " << (infinity > number) << ' ' << (infinity < number) << '\n';
    try {
        std::cout << (number < infinity) << '\n';
    } catch (const std::invalid_argument& refusal) {
        std::cout << "on the right: " << refusal.what() << '\n';
    }
    const IC::Number infiniteReal(std::numeric_limits<double>::infinity());
    std::cout << "an infinite real: " << (infiniteReal > number) << ' ' << (number < infiniteReal) << '\n';
}
