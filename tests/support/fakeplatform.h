#pragma once

#include "base/clock.h"
#include "base/failure.h"
#include "base/shell.h"

#include <QStringList>
#include <QUrl>

#include <cmath>
#include <functional>

// A shell that records what it was asked to open. Without a program for
// documents it fails the way the desktop's shell does.
class FakeShell : public Shell {
public:
    void openWebPage(const QUrl& url) override { webPages.append(url); }
    void openDocument(const QString& path) override
    {
        if (!hasDocumentProgram)
            throw Failure(QStringLiteral("There is no program on this desktop that opens it."));
        documents.append(path);
    }

    bool hasDocumentProgram = true;
    QList<QUrl> webPages;
    QStringList documents;
};

// A clock that stands still until a test moves it. A wait moves it on by
// the time asked for (or by `step` seconds when a test sets one, as events
// arriving would end a wait early), records what was asked, and then runs
// `duringWait`, the test's stand-in for the user acting meanwhile.
class FakeClock : public Clock {
public:
    double secondsSinceMidnight() const override { return now; }
    double steadySeconds() const override { return steady; }
    void waitForEvents(int milliseconds) override
    {
        waits.append(milliseconds);
        advance(step > 0 ? step : milliseconds / 1000.0);
        if (duringWait)
            duringWait();
    }

    // Moves both clocks on; the time of day starts again at midnight.
    void advance(double seconds)
    {
        steady += seconds;
        now = std::fmod(now + seconds, 86400.0);
    }

    double now = 12 * 3600.0;
    double steady = 1000.0;
    double step = 0;
    QList<int> waits;
    std::function<void()> duringWait;
};
