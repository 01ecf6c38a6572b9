#pragma once

/// Exports a class, function or variable from the shared library, also where a program hides its symbols by default.
/// In a class it stands before the name and covers all members and the type information. A member with an inline body
/// is declared `inline` in the class, because the library would export it otherwise.
#define IC_EXPORT __attribute__((visibility("default")))
