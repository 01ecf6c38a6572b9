#pragma once

// Everything that a GoogleTest program uses of IC::Testing: what the platform saw, how to control it, expected refusals
// and records, and how values are printed. Each test begins with observe::reset(), and fails if it leaves a lock held
// or a message buffer alive.
#include "observe/Platform.h"
#include "observe/Printing.h"
#include "observe/Refusal.h"
