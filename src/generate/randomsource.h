#pragma once

#include <cstdint>

// The program's one pseudo-random generator (xoshiro256**). It is seeded
// once, at start-up, from the time of day; generation continues the same
// sequence, so a run can be replayed from its seed.
class RandomSource {
public:
    RandomSource();

    void seed(std::uint64_t value);
    // Seeds from the time of day in seconds since midnight, fractions included.
    void seedFromTimeOfDay(double secondsSinceMidnight);

    // The next draw: a real r with 0 <= r < 1 and 53 bits of resolution.
    double next() { return static_cast<double>(nextBits() >> 11) * 0x1.0p-53; }

    // Moves on as steps calls of nextBits() would, in time that grows with
    // the number of bits of steps, not with steps: a part of a long run
    // starts where it stands in the whole sequence without drawing the rest.
    void jump(std::uint64_t steps);

    std::uint64_t nextBits()
    {
        const std::uint64_t result = rotl(m_state[1] * 5, 7) * 9;
        const std::uint64_t t = m_state[1] << 17;
        m_state[2] ^= m_state[0];
        m_state[3] ^= m_state[1];
        m_state[1] ^= m_state[2];
        m_state[0] ^= m_state[3];
        m_state[2] ^= t;
        m_state[3] = rotl(m_state[3], 45);
        return result;
    }

private:
    static std::uint64_t rotl(std::uint64_t x, int k) { return (x << k) | (x >> (64 - k)); }

    std::uint64_t m_state[4];
};
