#include "Fan.h"
#include <iostream>

void report(std::ostream& log, const IC::Node& node)
{
    log << node << '\n' << node.getProperties() << '\n';
}

int main()
{
    const Fan fan;
    report(std::cout, fan);

    const IC::Error error("no reading", IC::Error::STATUS_NO_SUCH_PROPERTY);
    std::cout << error << '\n';
    const std::string text = IC::Number(0.5);
    std::cout << text << '\n';
}
