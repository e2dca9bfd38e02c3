#include "generate/randomsource.h"

#include <bit>

namespace {

// Spreads one 64-bit seed over the generator's whole state.
std::uint64_t splitMix64(std::uint64_t& x)
{
    std::uint64_t z = (x += 0x9e3779b97f4a7c15ULL);
    z = (z ^ (z >> 30)) * 0xbf58476d1ce4e5b9ULL;
    z = (z ^ (z >> 27)) * 0x94d049bb133111ebULL;
    return z ^ (z >> 31);
}

} // namespace

RandomSource::RandomSource()
{
    seed(0);
}

void RandomSource::seed(std::uint64_t value)
{
    for (std::uint64_t& word : m_state)
        word = splitMix64(value);
}

void RandomSource::seedFromTimeOfDay(double secondsSinceMidnight)
{
    seed(std::bit_cast<std::uint64_t>(secondsSinceMidnight));
}
