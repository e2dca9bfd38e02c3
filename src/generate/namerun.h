#pragma once

// A run of generation that streams its rows: any count, cut into shards that
// run anywhere, each made by several threads, and still one reproducible
// sequence of names for a seed.
//
// Every row's pair is a function of its row number alone: independent draws
// start where the random source stands after two draws per earlier row (a
// jump, not a replay), and distinct pairs come from a keyed permutation of
// the pair numbers. So any part of a run can be made without the rest.

#include "generate/generation.h"
#include "generate/randomsource.h"

#include <QStringList>

#include <array>
#include <cstdint>
#include <span>

// Rows begin (counted from 0) up to end, not included.
struct RowRange {
    std::int64_t begin = 0;
    std::int64_t end = 0;
    std::int64_t size() const { return end - begin; }
    bool operator==(const RowRange&) const = default;
};

// The rows of shard `shard` of `shards` (counted from 1) of a run of count
// rows. The shards in order are the whole run, each row in one shard; every
// shard but the last begins and ends at a multiple of unit, and their sizes
// in units differ by at most one.
RowRange shardRows(std::int64_t count, int shard, int shards, std::int64_t unit = 1);

// A keyed pseudo-random permutation of 0 .. size-1, for sizes up to 2^62:
// a Feistel network of eight rounds over the fewest bits that hold size-1
// (unbalanced by one bit when they are odd), its round function the
// SplitMix64 finaliser of a half plus a round key; a result outside the
// range is enciphered again (cycle walking) until it falls inside, which
// keeps it a permutation of exactly size elements. It needs no memory
// beyond its keys.
class PairPermutation {
public:
    // The round keys are the next draws of keys.
    PairPermutation(std::uint64_t size, RandomSource keys);

    std::uint64_t size() const { return m_size; }
    std::uint64_t at(std::uint64_t index) const;

private:
    static constexpr int Rounds = 8;
    std::uint64_t encipher(std::uint64_t value) const;

    std::uint64_t m_size;
    int m_leftBits = 1;
    int m_rightBits = 1;
    std::array<std::uint64_t, Rounds> m_keys{};
};

struct RunOptions {
    std::int64_t count = 0;
    // No two rows with the same first and last name, as printed.
    bool unique = false;
    // This run makes shard `shard` of `shards`, counted from 1.
    int shard = 1;
    int shards = 1;
    // Shards begin at a multiple of this many rows: a format that groups
    // rows keeps each group whole in one shard.
    std::int64_t shardUnit = 1;
};

// What a run draws from and which pair each of its rows gets. Independent
// draws pick pane positions as the window's generation does, from the
// random source as it stands at the start; distinct pairs are numbered over
// the panes' names after tidying, each distinct name once.
class NameRun {
public:
    // Throws Failure when distinct pairs are asked for and the lists make
    // fewer than the count. The panes must not be empty.
    NameRun(const QStringList& firstPane, const QStringList& lastPane, const RandomSource& start,
            const RunOptions& options);

    // The tidied names that pairs index.
    const QStringList& firstNames() const { return m_firstNames; }
    const QStringList& lastNames() const { return m_lastNames; }

    // The rows of the whole run, and those of this shard.
    std::int64_t count() const { return m_options.count; }
    RowRange rows() const { return m_rows; }
    bool isFirstShard() const { return m_options.shard == 1; }

    // The pairs of rows firstRow, firstRow + 1, ..., as many as out holds.
    // Safe to call from several threads at once.
    void pairs(std::int64_t firstRow, std::span<NamePair> out) const;

private:
    RunOptions m_options;
    RowRange m_rows;
    QStringList m_firstNames;
    QStringList m_lastNames;
    RandomSource m_start;
    PairPermutation m_permutation;
};
