#include "IC/Number.h"
#include <iostream>

int main()
{
    std::cout << std::boolalpha;

    const IC::Number one(1);
    const IC::Number two(2);
    std::cout << "signed: " << (one == two) << ' ' << (one < two) << '\n';
    const int first = one;
    const int second = two;
    std::cout << "as int: " << (first == second) << ' ' << (first < second) << '\n';
    std::cout << "unsigned: " << (IC::Number(1u) == IC::Number(2u)) << ' '
              << (IC::Number(1u) < IC::Number(2u)) << '\n';

    const IC::Number fan(IC::NodeRef {20, 1});
    const IC::Number disk(IC::NodeRef {11, 7});
    std::cout << "references: " << (fan == disk) << '\n';
    const IC::NodeRef fanReference = fan;
    const IC::NodeRef diskReference = disk;
    const bool same = fanReference.type == diskReference.type && fanReference.id == diskReference.id;
    std::cout << "their fields: " << same << '\n';
}
