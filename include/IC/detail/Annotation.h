#pragma once

// An attribute of clang's thread-safety analysis. The library's own build defines it; a program's need not.
#ifndef IC_ANNOTATION
#define IC_ANNOTATION(attribute)
#endif
