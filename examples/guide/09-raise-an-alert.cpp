#include "Fan.h"
#include "IC/Alert.h"
#include <iostream>
#include <stdexcept>

int main()
{
    const Fan fan;
    const IC::Alert alert(ZQ::DateTime(1234567890, 3), 2, 1, {fan.getPath()}, 5, "Fan failed");
    std::cout << alert << '\n';
    std::cout << "severity " << +alert.getSeverity() << ": " << alert.getMessage() << '\n';
    for (const auto& path : alert.getNodePaths())
        std::cout << "about " << path << '\n';

    try {
        const IC::Alert tooSevere(4, 1, {fan.getPath()}, 5, "Fan failed");
        std::cout << tooSevere << '\n';
    } catch (const std::invalid_argument& refusal) {
        std::cout << refusal.what() << '\n';
    }
}
