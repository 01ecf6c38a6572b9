// Systems define these macros; the header must work with them and leave them defined.
#define major(device) ((device) >> 8)
#define minor 17

#include "IC/Number.h"

static_assert(major(0x1234) == 0x12);
static_assert(minor == 17);
#undef major
#undef minor

static_assert(IC::Version2 {1, 2}.major == 1);
static_assert(IC::Version2 {1, 2}.minor == 2);
