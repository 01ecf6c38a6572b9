#include "Check.h"

static const Check first("first");
