#pragma once

// Streaming a run's rows in constant memory: the rows are made a block at a
// time on several threads and handed on in row order, so the bytes do not
// depend on the number of threads and no more than a few blocks are held.

#include "generate/namerun.h"

#include <QByteArray>
#include <QByteArrayView>

#include <functional>
#include <span>

// Where a stream's bytes go, in order: a file, standard output, a buffer.
// It reports a failure by throwing, which ends the stream.
using ByteSink = std::function<void(QByteArrayView bytes)>;

// Turns rows into bytes. Called from several threads at once, for blocks of
// rows in any order: the bytes of a row may depend on its row number and on
// the run, never on the rows made before it.
class RowFormatter {
public:
    virtual ~RowFormatter() = default;
    // Appends the bytes of rows firstRow, firstRow + 1, ... with the pairs given.
    virtual void appendRows(std::int64_t firstRow, std::span<const NamePair> pairs,
                            QByteArray& out) const = 0;
};

// The number of threads to use when asked for threads: every core for 0.
int threadsFor(int asked);

// Makes the rows of the run's shard and hands their bytes to sink in row
// order, a block at a time, on threads threads (every core for 0).
void streamRows(const NameRun& run, const RowFormatter& formatter, int threads,
                const ByteSink& sink);
