#include "app/shell.h"

#include "app/failure.h"

#include <QFileInfo>
#include <QMimeDatabase>
#include <QProcess>

using namespace Qt::StringLiterals;

void DesktopShell::openWebPage(const QUrl& url)
{
    QProcess::startDetached(u"xdg-open"_s, {url.toString()});
}

void DesktopShell::openDocument(const QString& path)
{
    const QString mime = QMimeDatabase().mimeTypeForFile(path, QMimeDatabase::MatchExtension).name();
    QProcess query;
    query.start(u"xdg-mime"_s, {u"query"_s, u"default"_s, mime});
    const bool answered = query.waitForFinished(5000) && query.exitStatus() == QProcess::NormalExit;
    if (!answered || query.readAllStandardOutput().trimmed().isEmpty())
        throw Failure(u"There is no program on this desktop that opens %1 files (%2)."_s.arg(
            QFileInfo(path).suffix(), mime));
    if (!QProcess::startDetached(u"xdg-open"_s, {path}))
        throw Failure(u"The program for %1 files could not be started."_s.arg(mime));
}
