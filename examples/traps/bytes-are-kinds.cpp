#include "IC/Property.h"
#include <cstdint>
#include <iostream>

int main()
{
    const std::uint8_t byte = 3;
    const std::uint16_t word = 3;
    const IC::PropertyValue property(byte);  // of kind 3, KIND_BUFFER, without a byte
    const IC::Number fromByte(byte);         // of kind 3, KIND_UINT32, with the value 0
    const IC::Number fromWord(word);         // a signed number
    const IC::Number wanted(static_cast<unsigned int>(byte));
    std::cout << '"' << property << "\" of kind " << property.getKind() << '\n';
    std::cout << fromByte << " of kind " << fromByte.getKind() << '\n';
    std::cout << fromWord << " of kind " << fromWord.getKind() << '\n';
    std::cout << wanted << " of kind " << wanted.getKind() << '\n';
}
