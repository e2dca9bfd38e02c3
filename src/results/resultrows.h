#pragma once

#include <QString>

// The rows of the results list as saving reads them: row i's first name (the
// row's text) and last name (its second column), rows counted from 0.
class ResultRows {
public:
    virtual ~ResultRows() = default;
    virtual int rowCount() const = 0;
    virtual QString firstName(int row) const = 0;
    virtual QString lastName(int row) const = 0;
};
