#include "app/randomvisit.h"

#include "base/clock.h"
#include "base/shell.h"
#include "generate/randomsource.h"

#include <cmath>

void RandomVisit(RandomSource& random, const Clock& clock, Shell& shell)
{
    random.seedFromTimeOfDay(clock.secondsSinceMidnight());
    const int n = int(std::floor(random.next() * 100)) + 1;
    if (n == 7)
        shell.openWebPage(ProductWebPage);
}
