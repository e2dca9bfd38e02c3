#include "base/shell.h"

#include "base/failure.h"

#include <QDir>
#include <QDirIterator>
#include <QFileInfo>
#include <QMimeDatabase>
#include <QProcess>
#include <QStandardPaths>

using namespace Qt::StringLiterals;

namespace {

// Runs one of the desktop's query tools and gives what it printed.
QString ask(const QString& program, const QStringList& arguments)
{
    QProcess query;
    query.start(program, arguments);
    if (!query.waitForStarted(5000))
        throw Failure(u"%1 could not be run (%2); it comes with the desktop's xdg-utils."_s.arg(
            program, query.errorString()));
    if (!query.waitForFinished(5000) || query.exitStatus() != QProcess::NormalExit)
        throw Failure(u"%1 gave no answer."_s.arg(program));
    return QString::fromLocal8Bit(query.readAllStandardOutput()).trimmed();
}

// Whether the desktop entry that the association names is installed, looked
// for the way xdg-open looks: in every applications folder and below it,
// with "vendor-app.desktop" also found as "vendor/app.desktop".
bool desktopEntryInstalled(const QString& entry)
{
    QString nested = entry;
    if (const qsizetype dash = nested.indexOf(u'-'); dash > 0)
        nested[dash] = u'/';
    for (const QString& folder :
         QStandardPaths::standardLocations(QStandardPaths::ApplicationsLocation)) {
        if (QFileInfo::exists(QDir(folder).filePath(entry))
            || QFileInfo::exists(QDir(folder).filePath(nested)))
            return true;
        QDirIterator below(folder, {entry}, QDir::Files, QDirIterator::Subdirectories);
        if (below.hasNext())
            return true;
    }
    return false;
}

} // namespace

void DesktopShell::openWebPage(const QUrl& url)
{
    QProcess::startDetached(u"xdg-open"_s, {url.toString()});
}

// xdg-open is started without waiting for the program it starts, so it
// cannot tell whether a program opened the file; the desktop's association
// for the file's type is asked first instead, which is what lets a missing
// program be reported.
void DesktopShell::openDocument(const QString& path)
{
    const QFileInfo file(path);
    if (!file.isFile())
        throw Failure(u"The file %1 does not exist."_s.arg(QDir::toNativeSeparators(path)));
    const QString absolute = file.absoluteFilePath();

    // The type as xdg-open will see it (from the contents), and failing
    // that, from the name.
    QString mime = ask(u"xdg-mime"_s, {u"query"_s, u"filetype"_s, absolute}).section(u';', 0, 0);
    if (mime.isEmpty())
        mime = QMimeDatabase().mimeTypeForFile(absolute, QMimeDatabase::MatchExtension).name();

    const QString entry = ask(u"xdg-mime"_s, {u"query"_s, u"default"_s, mime});
    if (entry.isEmpty() || !desktopEntryInstalled(entry))
        throw Failure(u"There is no program on this desktop that opens %1 files (%2)."_s.arg(
            file.suffix(), mime));
    if (!QProcess::startDetached(u"xdg-open"_s, {absolute}))
        throw Failure(u"The program for %1 files could not be started."_s.arg(mime));
}
