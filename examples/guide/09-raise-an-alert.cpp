#include "Fan.h"
#include "IC/Alert.h"
#include <iostream>
#include <stdexcept>

int main()
{
    const Fan fan;
    ZQ::DateTime time(1234567890, 3);  // without a time: the current time
    const IC::Alert alert(time, 2, 1, {fan.getPath()}, 5, "Fan failed");
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
