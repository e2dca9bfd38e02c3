#include "generate/namerun.h"

#include "base/failure.h"

#include <QSet>

#include <bit>
#include <utility>

using namespace Qt::StringLiterals;

RowRange shardRows(std::int64_t count, int shard, int shards, std::int64_t unit)
{
    // Whole units, the last one perhaps short, shared out as evenly as the
    // units allow: floor(units * i / shards), worked out so that nothing
    // overflows however near count is to 2^63.
    const std::int64_t units = count / unit + (count % unit != 0 ? 1 : 0);
    const auto boundary = [&](std::int64_t i) {
        const std::int64_t unitsBefore = units / shards * i + units % shards * i / shards;
        return unitsBefore >= units ? count : unitsBefore * unit;
    };
    return {boundary(shard - 1), boundary(shard)};
}

namespace {

std::uint64_t mix(std::uint64_t z)
{
    z = (z ^ (z >> 30)) * 0xbf58476d1ce4e5b9ULL;
    z = (z ^ (z >> 27)) * 0x94d049bb133111ebULL;
    return z ^ (z >> 31);
}

} // namespace

PairPermutation::PairPermutation(std::uint64_t size, RandomSource keys)
    : m_size(size)
{
    // The fewest bits that hold every number below size: the domain is less
    // than twice the range, so an index is enciphered less than twice on
    // average.
    const int bits = std::max(2, int(std::bit_width(size > 0 ? size - 1 : 0)));
    m_leftBits = bits / 2;
    m_rightBits = bits - m_leftBits;
    for (std::uint64_t& key : m_keys)
        key = keys.nextBits();
}

std::uint64_t PairPermutation::encipher(std::uint64_t value) const
{
    // An unbalanced network when the bits are odd: the halves trade places
    // and widths each round, and each round is a permutation of the bits.
    int leftBits = m_leftBits;
    int rightBits = m_rightBits;
    std::uint64_t left = value >> rightBits;
    std::uint64_t right = value & ((std::uint64_t(1) << rightBits) - 1);
    for (const std::uint64_t key : m_keys) {
        const std::uint64_t next = left ^ (mix(right + key) & ((std::uint64_t(1) << leftBits) - 1));
        left = right;
        right = next;
        std::swap(leftBits, rightBits);
    }
    return (left << rightBits) | right;
}

std::uint64_t PairPermutation::at(std::uint64_t index) const
{
    // The walk ends: the cycle of the permutation through index holds index.
    std::uint64_t value = encipher(index);
    while (value >= m_size)
        value = encipher(value);
    return value;
}

namespace {

// Every item of a pane tidied, in pane order: what independent draws index.
QStringList tidiedPane(const QStringList& pane)
{
    QStringList names;
    names.reserve(pane.size());
    for (const QString& name : pane)
        names.append(tidyName(name));
    return names;
}

// The different names of a pane as printed, each once, in the order they
// first come: names that tidy alike are one name.
QStringList distinctNames(const QStringList& pane)
{
    QStringList names;
    QSet<QString> seen;
    for (const QString& name : pane) {
        QString tidied = tidyName(name);
        if (!seen.contains(tidied)) {
            seen.insert(tidied);
            names.append(std::move(tidied));
        }
    }
    return names;
}

} // namespace

NameRun::NameRun(const QStringList& firstPane, const QStringList& lastPane,
                 const RandomSource& start, const RunOptions& options)
    : m_options(options)
    , m_rows(shardRows(options.count, options.shard, options.shards, options.shardUnit))
    , m_firstNames(options.unique ? distinctNames(firstPane) : tidiedPane(firstPane))
    , m_lastNames(options.unique ? distinctNames(lastPane) : tidiedPane(lastPane))
    , m_start(start)
    , m_permutation(std::uint64_t(m_firstNames.size()) * std::uint64_t(m_lastNames.size()), start)
{
    if (options.unique && std::uint64_t(options.count) > m_permutation.size())
        throw Failure(u"These lists make %1 different names: ask for at most %1, not %2."_s
                          .arg(m_permutation.size())
                          .arg(options.count));
}

void NameRun::pairs(std::int64_t firstRow, std::span<NamePair> out) const
{
    const auto lastCount = std::uint64_t(m_lastNames.size());
    if (m_options.unique) {
        std::uint64_t row = std::uint64_t(firstRow);
        for (NamePair& pair : out) {
            const std::uint64_t number = m_permutation.at(row++);
            pair = {std::uint32_t(number / lastCount), std::uint32_t(number % lastCount)};
        }
        return;
    }
    RandomSource random = m_start;
    random.jump(2 * std::uint64_t(firstRow));
    const int firstCount = int(m_firstNames.size());
    for (NamePair& pair : out)
        pair = drawPositions(random, firstCount, int(lastCount));
}
