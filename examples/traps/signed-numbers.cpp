#include "IC/Number.h"
#include <iostream>
#include <stdexcept>

int main()
{
    const IC::Number number(5);  // a literal without u is signed
    try {
        const double real = number;
        std::cout << real << '\n';
    } catch (const std::out_of_range& refusal) {
        std::cout << refusal.what() << '\n';
    }
    const int whole = number;
    const double real = IC::Number(5u);
    std::cout << whole << ' ' << real << '\n';
}
