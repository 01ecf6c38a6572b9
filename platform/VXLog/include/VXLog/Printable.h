#pragma once

#include <string>
#include <string_view>

#pragma GCC visibility push(default)

namespace VXLog {

// Returns the text in a form that stays on one line and cannot control a terminal. Printable UTF-8 stays as it is.
// Control characters (U+0000 to U+001F, U+007F to U+009F), format characters, which reorder or hide text, separators
// (the general categories Cf, Zl and Zp of Unicode 15.1, and U+E0000 to U+E007F) and bytes that are not UTF-8 become
// \n, \r, \t, or \x and two hexadecimal digits for each byte. A backslash becomes two.
std::string printable(std::string_view text);

}  // namespace VXLog

#pragma GCC visibility pop
