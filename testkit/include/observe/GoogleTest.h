#pragma once

// All that a GoogleTest program uses of IC::Testing: what the platform saw and how it is told to behave, expected
// refusals and records, and values printed readably. Each test begins with observe::reset() and fails where it leaves
// a lock held or a message buffer alive.
#include "observe/Platform.h"
#include "observe/Printing.h"
#include "observe/Refusal.h"
