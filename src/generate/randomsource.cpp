#include "generate/randomsource.h"

#include <array>
#include <bit>
#include <memory>
#include <mutex>
#include <vector>

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

namespace {

// The generator's step is linear over the bits of its state: a 256 x 256
// matrix over GF(2), kept as its columns. Jumping by steps multiplies the
// state by the powers of two of that matrix that make up steps.
using State = std::array<std::uint64_t, 4>;
using Matrix = std::array<State, 256>;

State times(const Matrix& matrix, const State& state)
{
    State result{};
    for (int word = 0; word < 4; ++word) {
        for (std::uint64_t bits = state[std::size_t(word)]; bits != 0; bits &= bits - 1) {
            const State& column = matrix[std::size_t(word * 64 + std::countr_zero(bits))];
            for (std::size_t i = 0; i < 4; ++i)
                result[i] ^= column[i];
        }
    }
    return result;
}

State step(State s)
{
    const std::uint64_t t = s[1] << 17;
    s[2] ^= s[0];
    s[3] ^= s[1];
    s[1] ^= s[2];
    s[0] ^= s[3];
    s[2] ^= t;
    s[3] = (s[3] << 45) | (s[3] >> 19);
    return s;
}

// The matrix of 2^power steps, made once and shared by every thread; the
// higher powers only when a jump first needs them.
const Matrix& stepPower(int power)
{
    static std::mutex guard;
    static std::vector<std::unique_ptr<Matrix>> powers;
    const std::lock_guard lock(guard);
    if (powers.empty()) {
        auto one = std::make_unique<Matrix>();
        for (std::size_t bit = 0; bit < 256; ++bit) {
            State unit{};
            unit[bit / 64] = std::uint64_t(1) << (bit % 64);
            (*one)[bit] = step(unit);
        }
        powers.push_back(std::move(one));
    }
    while (int(powers.size()) <= power) {
        const Matrix& last = *powers.back();
        auto squared = std::make_unique<Matrix>();
        for (std::size_t column = 0; column < 256; ++column)
            (*squared)[column] = times(last, last[column]);
        powers.push_back(std::move(squared));
    }
    return *powers[std::size_t(power)];
}

} // namespace

void RandomSource::jump(std::uint64_t steps)
{
    State state{m_state[0], m_state[1], m_state[2], m_state[3]};
    for (; steps != 0; steps &= steps - 1)
        state = times(stepPower(std::countr_zero(steps)), state);
    for (std::size_t i = 0; i < 4; ++i)
        m_state[i] = state[i];
}
