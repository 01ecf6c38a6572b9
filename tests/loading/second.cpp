#include "Check.h"

static const Check second("second");
