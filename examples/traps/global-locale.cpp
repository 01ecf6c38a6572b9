#include "IC/Number.h"
#include <iostream>
#include <locale>
#include <sstream>

class Grouping : public std::numpunct<char> {
    char do_thousands_sep() const override { return ','; }
    std::string do_grouping() const override { return "\3"; }
};

int main()
{
    std::locale::global(std::locale(std::locale::classic(), new Grouping));

    const IC::Number number(1234567u);
    std::ostringstream out;
    out.imbue(std::locale::classic());
    out << number << '\n';  // formatted by the global locale
    const unsigned int native = number;
    out << native << '\n';
    std::cout << out.str();
}
