#pragma once

// What the benchmarks share: stand-ins for the windows' platform, a fresh
// copy of the shipped database, and the process's processor time and peak
// memory.

#include "base/dialogs.h"
#include "base/shell.h"

#include <QFile>
#include <QTemporaryDir>

#include <cstdio>
#include <ctime>

namespace Bench {

// Prints what would have been shown and counts it; a benchmark never waits
// on a box.
class SilentDialogs : public Dialogs {
public:
    void messageBox(const QString& text, const QString& title, MessageIcon) override
    {
        ++messages;
        std::printf("message: %s | %s\n", qUtf8Printable(title), qUtf8Printable(text.left(200)));
    }
    QString inputBox(const QString&, const QString&) override { return {}; }
    QStringList openFileNames(const QString&, const QString&) override { return {}; }
    QString saveFileName(const QString&, const QString&) override { return {}; }
    int messages = 0;
};

// Hands documents to nobody: the spreadsheet program is not timed.
class NoShell : public Shell {
public:
    void openWebPage(const QUrl&) override {}
    void openDocument(const QString&) override {}
};

// A writable copy of the shipped names database in folder.
inline QString shippedDatabaseCopy(const QTemporaryDir& folder)
{
    const QString path = folder.filePath(QStringLiteral("names.mdb"));
    QFile::copy(QString::fromUtf8(QUILLANE_SHIPPED_DB), path);
    QFile(path).setPermissions(QFile::ReadOwner | QFile::WriteOwner);
    return path;
}

// Peak resident memory of this process so far, in kB.
inline long peakKilobytes()
{
    QFile status(QStringLiteral("/proc/self/status"));
    if (!status.open(QIODevice::ReadOnly))
        return -1;
    for (const QByteArray& line : status.readAll().split('\n')) {
        if (line.startsWith("VmHWM:"))
            return line.mid(6).trimmed().split(' ').first().toLong();
    }
    return -1;
}

// Processor time this process has used, in ms. On a machine shared with
// other work the wall clock also counts the time others held the cores.
inline double processorMs()
{
    timespec now{};
    clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &now);
    return double(now.tv_sec) * 1e3 + double(now.tv_nsec) / 1e6;
}

} // namespace Bench
