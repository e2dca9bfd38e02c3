#include "base/safefile.h"

#include "base/failure.h"

#include <QDir>
#include <QFile>
#include <QRandomGenerator>

#include <cctype>
#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <utility>

#include <dirent.h>
#include <fcntl.h>
#include <linux/magic.h>
#include <pthread.h>
#include <sys/stat.h>
#include <sys/statfs.h>
#include <unistd.h>

using namespace Qt::StringLiterals;

namespace {

constexpr int MostLinks = 40;                 // as the kernel follows them
constexpr std::time_t StaleAfter = 24 * 3600; // untouched this long, a part file is nobody's
constexpr char Prefix[] = ".quillane-";
constexpr char Suffix[] = ".part";
constexpr int RandomLength = 6;

QByteArray folderOf(const QByteArray& path)
{
    const qsizetype slash = path.lastIndexOf('/');
    if (slash < 0)
        return ".";
    return slash == 0 ? QByteArray("/") : path.left(slash);
}

// A link in /proc/self/fd and its kin stands for an open file, which may
// be a pipe or a deleted file: it is no path to replace.
bool inProcessFiles(const QByteArray& folder)
{
    struct statfs info {};
    return ::statfs(folder.constData(), &info) == 0 && info.f_type == PROC_SUPER_MAGIC;
}

// Whether name is one of our temporary files whose writer is gone.
bool isStale(int folder, const char* name, std::time_t now)
{
    const std::size_t length = std::strlen(name);
    const std::size_t prefix = sizeof Prefix - 1, suffix = sizeof Suffix - 1;
    if (length <= prefix + suffix || std::strncmp(name, Prefix, prefix) != 0
        || std::strcmp(name + length - suffix, Suffix) != 0)
        return false;
    // PID-XXXXXX between them.
    const QByteArray middle(name + prefix, qsizetype(length - prefix - suffix));
    const qsizetype dash = middle.indexOf('-');
    if (dash <= 0 || middle.size() - dash - 1 != RandomLength)
        return false;
    bool number = false;
    const pid_t pid = pid_t(middle.left(dash).toInt(&number));
    if (!number || pid <= 0 || pid == ::getpid())
        return false;
    for (const char c : middle.mid(dash + 1)) {
        if (!std::isalnum(static_cast<unsigned char>(c)))
            return false;
    }
    struct stat info {};
    if (::fstatat(folder, name, &info, AT_SYMLINK_NOFOLLOW) != 0 || !S_ISREG(info.st_mode)
        || info.st_uid != ::geteuid())
        return false;
    const bool gone = ::kill(pid, 0) != 0 && errno == ESRCH;
    return gone || now - info.st_mtime > StaleAfter;
}

void removeStale(const QByteArray& folder)
{
    DIR* dir = ::opendir(folder.constData());
    if (!dir)
        return;
    const std::time_t now = std::time(nullptr);
    while (const dirent* entry = ::readdir(dir)) {
        if (isStale(::dirfd(dir), entry->d_name, now))
            ::unlinkat(::dirfd(dir), entry->d_name, 0);
    }
    ::closedir(dir);
}

} // namespace

SafeFile::SafeFile(const QString& path)
    : SafeFile(path, Mode::Replace)
{
}

SafeFile::SafeFile(const QString& path, Mode mode)
    : m_path(path)
    , m_mode(mode)
{
    if (path.isEmpty())
        fail(ENOENT);
    QByteArray current = QFile::encodeName(path);
    if (mode == Mode::CreateNew) {
        struct stat info {};
        if (::lstat(current.constData(), &info) == 0)
            fail(EEXIST);
        m_target = current;
        openTemporary(folderOf(current));
        return;
    }

    for (int links = 0;; ++links) {
        if (links > MostLinks)
            fail(ELOOP);
        struct stat info {};
        if (::lstat(current.constData(), &info) != 0) {
            if (errno != ENOENT)
                fail(errno);
            break; // a new name (perhaps a dangling link's target)
        }
        if (S_ISLNK(info.st_mode)) {
            const QByteArray folder = folderOf(current);
            if (inProcessFiles(folder)) {
                m_direct = true;
                break;
            }
            // The kernel's rule for links in a shared folder such as /tmp:
            // one planted there by another user is not followed.
            struct stat shared {};
            if (::stat(folder.constData(), &shared) == 0 && (shared.st_mode & S_ISVTX)
                && (shared.st_mode & S_IWOTH) && info.st_uid != shared.st_uid
                && info.st_uid != ::geteuid())
                fail(EACCES);
            QByteArray target(qsizetype(info.st_size > 0 ? info.st_size : 4096) + 1, '\0');
            const ssize_t length = ::readlink(current.constData(), target.data(), target.size());
            if (length < 0)
                fail(errno);
            target.truncate(length);
            current = target.startsWith('/') ? target : folder + '/' + target;
            continue;
        }
        if (S_ISDIR(info.st_mode))
            fail(EISDIR);
        if (!S_ISREG(info.st_mode)) {
            m_direct = true;
            break;
        }
        // The folder may let anyone replace the file; its own mode says
        // whether this user may change it.
        if (::faccessat(AT_FDCWD, current.constData(), W_OK, AT_EACCESS) != 0)
            fail(errno);
        m_existed = true;
        m_targetMode = info.st_mode;
        m_targetOwner = info.st_uid;
        m_targetGroup = info.st_gid;
        break;
    }
    m_target = current;

    if (m_direct) {
        // Appending, as what stands behind /dev/stdout may be a log that the
        // shell opened for appending.
        do {
            m_fd = ::open(current.constData(), O_WRONLY | O_APPEND | O_NOCTTY | O_CLOEXEC);
        } while (m_fd < 0 && errno == EINTR);
        if (m_fd < 0)
            fail(errno);
        return;
    }
    openTemporary(folderOf(current));
}

SafeFile::~SafeFile()
{
    discard();
}

QString SafeFile::temporaryPrefix(pid_t pid)
{
    return QString::fromLatin1(Prefix) + QString::number(pid) + u'-';
}

void SafeFile::fail(int error) const
{
    throw Failure(u"The file %1 could not be saved: %2"_s.arg(
        QDir::toNativeSeparators(m_path), QString::fromLocal8Bit(std::strerror(error))));
}

void SafeFile::openTemporary(const QByteArray& folder)
{
    removeStale(folder);
    static const char Letters[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789";
    // A file being replaced may be private: its contents are not shown to
    // others on the way. A new file is made as any new file is.
    const mode_t mode = m_existed ? 0600 : 0666;
    for (int attempt = 0; attempt < 100; ++attempt) {
        QByteArray name = folder + '/' + QFile::encodeName(temporaryPrefix(::getpid()));
        for (int i = 0; i < RandomLength; ++i)
            name += Letters[QRandomGenerator::global()->bounded(int(sizeof Letters - 1))];
        name += Suffix;
        m_fd = ::open(name.constData(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, mode);
        if (m_fd >= 0) {
            m_temporary = QFile::decodeName(name);
            return;
        }
        if (errno != EEXIST && errno != EINTR)
            fail(errno);
    }
    fail(EEXIST);
}

void SafeFile::write(QByteArrayView bytes)
{
    if (m_fd < 0 || m_failed)
        fail(EBADF);
    const WriteSignalsHeld held;
    const char* data = bytes.data();
    qsizetype left = bytes.size();
    while (left > 0) {
        const ssize_t written = ::write(m_fd, data, std::size_t(left));
        if (written < 0) {
            if (errno == EINTR)
                continue;
            const int error = errno;
            m_failed = true;
            fail(error);
        }
        data += written;
        left -= written;
    }
}

void SafeFile::commit()
{
    if (m_fd < 0 || m_failed)
        fail(EBADF);
    const auto failAndDiscard = [this](int error) {
        m_failed = true;
        discard();
        fail(error);
    };
    if (m_direct) {
        const int fd = std::exchange(m_fd, -1);
        if (::close(fd) != 0 && errno != EINTR)
            failAndDiscard(errno);
        return;
    }

    if (::fdatasync(m_fd) != 0)
        failAndDiscard(errno);
    if (m_existed) {
        // The special bits stay only with the owner they were set for.
        const bool sameOwner = ::fchown(m_fd, m_targetOwner, m_targetGroup) == 0;
        if (::fchmod(m_fd, m_targetMode & (sameOwner ? 07777 : 0777)) != 0)
            failAndDiscard(errno);
    }
    if (::close(std::exchange(m_fd, -1)) != 0 && errno != EINTR)
        failAndDiscard(errno);

    const QByteArray temporary = QFile::encodeName(m_temporary);
    if (m_mode == Mode::CreateNew) {
        if (::renameat2(AT_FDCWD, temporary.constData(), AT_FDCWD, m_target.constData(),
                        RENAME_NOREPLACE)
            != 0) {
            // A file system without the flag: a new hard link never
            // replaces either.
            if (errno != EINVAL && errno != ENOSYS)
                failAndDiscard(errno);
            if (::link(temporary.constData(), m_target.constData()) != 0)
                failAndDiscard(errno);
            ::unlink(temporary.constData());
        }
    } else if (::rename(temporary.constData(), m_target.constData()) != 0) {
        failAndDiscard(errno);
    }
    m_temporary.clear();
}

void SafeFile::discard()
{
    if (m_fd >= 0)
        ::close(std::exchange(m_fd, -1));
    if (!m_temporary.isEmpty()) {
        ::unlink(QFile::encodeName(m_temporary).constData());
        m_temporary.clear();
    }
}

WriteSignalsHeld::WriteSignalsHeld()
{
    sigemptyset(&m_held);
    sigaddset(&m_held, SIGPIPE);
    sigaddset(&m_held, SIGXFSZ);
    if (sigpending(&m_pendingBefore) != 0)
        sigemptyset(&m_pendingBefore);
    pthread_sigmask(SIG_BLOCK, &m_held, &m_old);
}

WriteSignalsHeld::~WriteSignalsHeld()
{
    sigset_t pending;
    if (sigpending(&pending) == 0) {
        for (const int signal : {SIGPIPE, SIGXFSZ}) {
            if (sigismember(&pending, signal) != 1 || sigismember(&m_pendingBefore, signal) == 1)
                continue;
            sigset_t one;
            sigemptyset(&one);
            sigaddset(&one, signal);
            const timespec now{};
            while (sigtimedwait(&one, nullptr, &now) < 0 && errno == EINTR) {
            }
        }
    }
    // Only what this one blocked is let go, so that holders that end out
    // of order never leave a signal blocked.
    sigset_t release;
    sigemptyset(&release);
    for (const int signal : {SIGPIPE, SIGXFSZ}) {
        if (sigismember(&m_old, signal) != 1)
            sigaddset(&release, signal);
    }
    pthread_sigmask(SIG_UNBLOCK, &release, nullptr);
}
