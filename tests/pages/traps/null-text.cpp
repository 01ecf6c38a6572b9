#include "IC/Error.h"
#include <iostream>
#include <stdexcept>

int main()
{
    try {
        const IC::Error error(0, 5);  // 0 is a null pointer to a text
        std::cout << error << '\n';
    } catch (const std::logic_error&) {
        std::cout << "a null text\n";
    }
    const IC::Error error(IC::Number(0), 5);
    std::cout << error << '\n';
}
