#include "IC/format.h"

#include <string>

#if defined(__cpp_lib_format)  // which IC/format.h has made known
#error "for compilers that have no std::format"
#endif

// IC/format.h compiles, and declares no IC::Number either.
void write(std::string& text, int number)
{
    text = std::to_string(number);
    text = std::format("{}", number);  // does not compile: 'format'
}
