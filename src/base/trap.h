#pragma once

#include "base/errorreport.h"

#include <QString>

class Dialogs;

// The error trap of a button handler. The handler runs its work as numbered
// steps; a step that fails is reported with the handler's location text and
// the step's number, and the handler goes on with its next step:
//
//     Trap trap(dialogs, location, ClosingLine::Long);
//     trap(10, [&] { ... });
//     trap(20, [&] { ... });
//
// A failure inside a routine that a step calls counts as a failure of that
// step. A loop runs as one step, so a loop whose every turn would fail is
// reported once and ends there instead of reporting once per turn.
class Trap {
public:
    Trap(Dialogs& dialogs, QString location, ClosingLine closing);

    // Runs one step; returns whether it completed without a failure.
    template <typename Step>
    bool operator()(int line, Step&& step)
    {
        try {
            step();
            return true;
        } catch (...) {
            reportCurrentException(line);
            return false;
        }
    }

    int failures() const { return m_failures; }

private:
    void reportCurrentException(int line);

    Dialogs& m_dialogs;
    QString m_location;
    ClosingLine m_closing;
    int m_failures = 0;
};
