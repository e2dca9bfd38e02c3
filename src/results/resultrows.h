#pragma once

#include "generate/generation.h"

#include <QString>

#include <optional>

// The rows of a run as two tables of distinct names and, for every row, an
// index into each.
struct IndexedNames {
    const QStringList& firstNames;
    const QStringList& lastNames;
    const std::vector<NamePair>& rows;
};

// The rows of the results list as saving reads them: row i's first name (the
// row's text) and last name (its second column), rows counted from 0.
class ResultRows {
public:
    virtual ~ResultRows() = default;
    virtual int rowCount() const = 0;
    virtual QString firstName(int row) const = 0;
    virtual QString lastName(int row) const = 0;

    // The same rows as indices into tables, when every row reads from them:
    // a writer can then encode each distinct name once instead of once per
    // row. None when the rows are kept otherwise.
    virtual std::optional<IndexedNames> indexedNames() const { return std::nullopt; }
};
