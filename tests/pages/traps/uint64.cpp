#include "IC/Number.h"
#include <cstdint>

void copy(IC::Number& number, std::uint64_t& bytes)
{
    number = bytes;  // does not compile: ambiguous
    number = ZQ::Uint64 {bytes};
    bytes = number;  // does not compile: ambiguous
    bytes = static_cast<ZQ::Uint64>(number);
}
