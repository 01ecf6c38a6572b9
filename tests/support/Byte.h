#pragma once

// A code in the type that constructors take, without a warning about the conversion.
constexpr unsigned char byte(unsigned int code)
{
    return static_cast<unsigned char>(code);
}
