#include "base/programfiles.h"

#include "base/failure.h"
#include "base/safefile.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

#include <unistd.h>

using namespace Qt::StringLiterals;

namespace {

// SQLite writes a journal beside the database, so the folder must take new
// files as well as the file being writable.
bool canWrite(const QString& file)
{
    const QByteArray path = QFile::encodeName(file);
    const QByteArray folder = QFile::encodeName(QFileInfo(file).absolutePath());
    return ::access(path.constData(), W_OK) == 0 && ::access(folder.constData(), W_OK | X_OK) == 0;
}

} // namespace

bool FileExists(const QString& path)
{
    if (path.isEmpty() || path.contains(QChar(u'\0')))
        return false;
    return QFileInfo::exists(path);
}

bool InDevelopment()
{
#ifdef NDEBUG
    return false;
#else
    return true;
#endif
}

QString userDataFolder()
{
    QString home = qEnvironmentVariable("XDG_DATA_HOME");
    if (!QDir::isAbsolutePath(home))
        home = QDir::homePath() + u"/.local/share"_s;
    return QDir::cleanPath(home + u"/quillane"_s);
}

NamesDatabaseChoice chooseNamesDatabase(const QString& programFolder)
{
    NamesDatabaseChoice choice;
    choice.shipped = QDir(programFolder).filePath(u"names.mdb"_s);
    if (canWrite(choice.shipped) || !QFileInfo::exists(choice.shipped)) {
        // A missing file is reported by the database itself, under the
        // name the user knows.
        choice.path = choice.shipped;
    } else {
        choice.path = QDir(userDataFolder()).filePath(u"names.mdb"_s);
        choice.ownCopy = true;
    }
    return choice;
}

void makeOwnCopy(const QString& shipped, const QString& copy)
{
    if (QFileInfo::exists(copy))
        return;
    const QString where = QDir::toNativeSeparators(copy);
    const QString folder = QFileInfo(copy).absolutePath();
    if (!QDir().mkpath(folder))
        throw Failure(u"Your own names list %1 cannot be made: the folder %2 cannot be made"_s.arg(
            where, QDir::toNativeSeparators(folder)));
    QFile source(shipped);
    const auto unreadable = [&] {
        return Failure(u"Your own names list %1 cannot be made: %2: %3"_s.arg(
            where, QDir::toNativeSeparators(shipped), source.errorString()));
    };
    if (!source.open(QIODevice::ReadOnly))
        throw unreadable();
    try {
        // Made new, so never over a copy that another start made meanwhile;
        // with the mode of any new file, so the user may write it whatever
        // the shipped file's own mode.
        SafeFile part(copy, SafeFile::Mode::CreateNew);
        while (!source.atEnd()) {
            const QByteArray block = source.read(1 << 20);
            if (source.error() != QFileDevice::NoError)
                throw unreadable();
            part.write(block);
        }
        part.commit();
    } catch (const Failure&) {
        // Another start that won the race made the same copy.
        if (QFileInfo::exists(copy))
            return;
        throw;
    }
}

QString namesDatabaseInUse(const QString& programFolder)
{
    const NamesDatabaseChoice choice = chooseNamesDatabase(programFolder);
    if (choice.ownCopy)
        makeOwnCopy(choice.shipped, choice.path);
    return choice.path;
}

QString describeNamesDatabase(const NamesDatabaseChoice& choice)
{
    const QString path = QDir::toNativeSeparators(choice.path);
    if (!choice.ownCopy)
        return u"names database: %1"_s.arg(path);
    return u"names database: %1 (your own copy of %2%3)"_s.arg(
        path, QDir::toNativeSeparators(choice.shipped),
        QFileInfo::exists(choice.path) ? QString() : u", made on first use"_s);
}
