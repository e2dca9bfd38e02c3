#include "base/programfiles.h"

#include "base/failure.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QTemporaryFile>

#include <cerrno>
#include <cstring>

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
    // Built under a hidden name and given its own only when complete, never
    // over one that another start made meanwhile.
    QTemporaryFile part(QDir(folder).filePath(u".names.mdb.XXXXXX"_s));
    QFile source(shipped);
    bool copied = part.open() && source.open(QIODevice::ReadOnly);
    while (copied && !source.atEnd()) {
        const QByteArray block = source.read(1 << 20);
        copied = source.error() == QFileDevice::NoError && part.write(block) == block.size();
    }
    copied = copied && part.flush() && ::fsync(part.handle()) == 0;
    if (!copied) {
        const QString reason =
            part.error() != QFileDevice::NoError || !part.isOpen()
                ? part.errorString()
                : u"%1: %2"_s.arg(QDir::toNativeSeparators(shipped), source.errorString());
        throw Failure(u"Your own names list %1 cannot be made: %2"_s.arg(where, reason));
    }
    part.setPermissions(QFileDevice::ReadOwner | QFileDevice::WriteOwner | QFileDevice::ReadGroup
                        | QFileDevice::ReadOther);
    part.close();
    const QByteArray from = QFile::encodeName(part.fileName());
    const QByteArray to = QFile::encodeName(copy);
    // link() refuses an existing name, where rename() would replace it; a
    // file system without links gets Qt's rename, which refuses one too.
    if (::link(from.constData(), to.constData()) != 0) {
        const int error = errno;
        if (!QFileInfo::exists(copy) && !QFile::rename(part.fileName(), copy)
            && !QFileInfo::exists(copy))
            throw Failure(u"Your own names list %1 cannot be made: %2"_s.arg(
                where, QString::fromLocal8Bit(std::strerror(error))));
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
