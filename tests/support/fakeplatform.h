#pragma once

#include "app/clock.h"
#include "app/failure.h"
#include "app/shell.h"

#include <QStringList>
#include <QUrl>

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

// A clock that stands still until a test moves it.
class FakeClock : public Clock {
public:
    double secondsSinceMidnight() const override { return now; }
    double now = 12 * 3600.0;
};
