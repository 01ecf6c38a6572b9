#pragma once

#include <vector>

#include "Trial.h"

// Every public operation, on values of every kind, and with codes that are refused.
std::vector<Operation> operations();
