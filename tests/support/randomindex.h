#pragma once

#include "generate/randomsource.h"

#include <cmath>

// The tests' own account of one draw: a whole number from 1 to n, each
// equally likely, as a real number. Replaying a run with it checks the
// generator's draws without using its code.
inline double RandomIndex(RandomSource& random, int n)
{
    return std::floor(random.next() * n) + 1.0;
}
