#include "base/settings.h"

#include "base/dialogs.h"
#include "base/errorreport.h"

#include <QDir>
#include <QFileInfo>
#include <QLocale>

#include <cerrno>
#include <cstring>

#include <sys/stat.h>
#include <unistd.h>

using namespace Qt::StringLiterals;

namespace {

const QString Section = u"Quillane/"_s;

// What tells one version of a file from the next: a write replaces the file
// by a new one, which has its own inode.
struct FileIdentity {
    bool exists = false;
    dev_t device = 0;
    ino_t inode = 0;
    timespec modified{};
    off_t size = 0;

    bool operator==(const FileIdentity& o) const
    {
        return exists == o.exists && device == o.device && inode == o.inode
               && modified.tv_sec == o.modified.tv_sec && modified.tv_nsec == o.modified.tv_nsec
               && size == o.size;
    }
};

FileIdentity identity(const QString& path)
{
    struct stat info {};
    if (::stat(QFile::encodeName(path).constData(), &info) != 0)
        return {};
    return {true, info.st_dev, info.st_ino, info.st_mtim, info.st_size};
}

QString systemError(int error)
{
    return QString::fromLocal8Bit(std::strerror(error));
}

// Why the file cannot be written, in the system's words where it has them.
QString whyNotWritable(const QString& path)
{
    const QFileInfo file(path);
    if (file.isDir())
        return systemError(EISDIR);
    const QByteArray encoded = QFile::encodeName(path);
    if (file.exists() && ::access(encoded.constData(), W_OK) != 0)
        return systemError(errno);
    // A link leads to where the file would be made.
    const QString target = file.isSymLink() ? file.symLinkTarget() : file.absoluteFilePath();
    const QByteArray folder = QFile::encodeName(QFileInfo(target).absolutePath());
    if (::access(folder.constData(), W_OK | X_OK) != 0)
        return systemError(errno);
    return {};
}

} // namespace

Settings::Settings()
    : m_store(QSettings::IniFormat, QSettings::UserScope, u"Varnholt"_s)
{
}

QString Settings::read(const QString& key, const QString& defaultValue) const
{
    const QString path = Section + key;
    if (!m_store.contains(path))
        return defaultValue;
    return m_store.value(path).toString();
}

void Settings::write(const QString& key, const QString& value)
{
    // The value in memory holds for the rest of the run even when the file
    // cannot take it.
    m_store.setValue(Section + key, value);
    if (sync() || m_writeFailed)
        return;
    m_writeFailed = true;
    if (!m_dialogs)
        return;
    const QString reason = whyNotWritable(fileName());
    m_dialogs->messageBox(
        u"The settings file %1 cannot be written%2. Quillane goes on with your choices, but "
        "they will not be there at its next start."_s.arg(
            QDir::toNativeSeparators(fileName()), reason.isEmpty() ? QString() : u": "_s + reason),
        ErrorReportTitle, MessageIcon::Exclamation);
}

bool Settings::sync()
{
    // QSettings keeps the first error it met: after a malformed file was
    // read, FormatError stays and hides whether later writes reached the
    // disk. A write that did replaced the file.
    const FileIdentity before = identity(fileName());
    m_store.sync();
    switch (m_store.status()) {
    case QSettings::NoError:
        return true;
    case QSettings::FormatError:
        return !(identity(fileName()) == before);
    case QSettings::AccessError:
        break;
    }
    return false;
}

bool Settings::readBool(const QString& key, const QString& defaultValue) const
{
    if (const auto stored = parseStoredBool(read(key, defaultValue)))
        return *stored;
    return parseStoredBool(defaultValue).value_or(false);
}

void Settings::writeBool(const QString& key, bool value)
{
    write(key, value ? u"True"_s : u"False"_s);
}

std::optional<bool> parseStoredBool(const QString& text)
{
    const QString trimmed = text.trimmed();
    if (trimmed.compare(u"True"_s, Qt::CaseInsensitive) == 0)
        return true;
    if (trimmed.compare(u"False"_s, Qt::CaseInsensitive) == 0)
        return false;
    bool isNumber = false;
    double number = trimmed.toDouble(&isNumber);
    if (!isNumber)
        number = QLocale::system().toDouble(trimmed, &isNumber);
    if (!isNumber)
        return std::nullopt;
    return number != 0.0;
}
