#include "results/resultsfile.h"

#include "base/safefile.h"

#include <QDir>
#include <QFile>

#include <sys/stat.h>

using namespace Qt::StringLiterals;

NamesDatabaseRefusal::NamesDatabaseRefusal(const QString& path)
    : Failure(u"The file %1 could not be saved: it is the names database, whose lists the "
              u"results would replace"_s.arg(QDir::toNativeSeparators(path)))
{
}

std::unique_ptr<SafeFile> openResultsFile(const QString& path, const QString& namesDatabase)
{
    // The same file is the same device and inode, however it is reached.
    struct stat target {
    }, database{};
    if (!namesDatabase.isEmpty() && ::stat(QFile::encodeName(path).constData(), &target) == 0
        && ::stat(QFile::encodeName(namesDatabase).constData(), &database) == 0
        && target.st_dev == database.st_dev && target.st_ino == database.st_ino)
        throw NamesDatabaseRefusal(path);
    return std::make_unique<SafeFile>(path);
}
