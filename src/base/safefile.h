#pragma once

#include <QByteArrayView>
#include <QString>

#include <csignal>

#include <sys/types.h>

// The one way the program writes a file.
//
// A regular file, or a name that does not exist yet, is written to a
// temporary file beside it that takes its place in one step on commit(): a
// failure at any point (no write access, a full disk, a kill) leaves what
// was there exactly as it was. The replaced file's permissions (and, where
// allowed, its owner) carry over; a new file gets those of any new file.
//
// A symbolic link is followed: its target is replaced and the link stays.
// As the kernel does, a link that another user made in a shared sticky
// folder such as /tmp is not followed but refused.
// Anything else that exists (a character device, a FIFO, /dev/stdout and
// its kin) cannot be replaced and is written directly, as a shell's
// redirection writes it; a write that fails there (no space on the device,
// a reader gone) is a failure all the same.
//
// What the user may not write is refused, the same for every kind of file,
// even where the folder would let a new file take its place.
//
// Every failure throws Failure: "The file PATH could not be saved: " and
// the system's own description of what went wrong.
//
// Temporary files are named ".quillane-PID-XXXXXX.part". Whenever a file is
// written through one, the stale ones of this program in that folder (their
// process gone, or untouched for a day) are removed first: a process killed
// while writing leaves nothing behind for long.
class SafeFile {
public:
    enum class Mode {
        Replace,  // what the path names is replaced, as described above
        CreateNew // the path must name nothing, now and at commit(); links are not followed
    };

    explicit SafeFile(const QString& path);
    SafeFile(const QString& path, Mode mode);
    // Discards the work unless committed: the temporary file is removed.
    ~SafeFile();

    SafeFile(const SafeFile&) = delete;
    SafeFile& operator=(const SafeFile&) = delete;

    // Appends bytes. Throws Failure.
    void write(QByteArrayView bytes);

    // The temporary file, for a writer that wants a path of its own to write
    // (it may reopen and truncate it); empty when the target is written
    // directly, and then write() is the only way in.
    QString temporaryPath() const { return m_temporary; }

    // Writes the file out to the disk and gives it its name. Throws Failure,
    // and then the target is as it was.
    void commit();

    // The path as the caller gave it.
    const QString& path() const { return m_path; }

    // The pattern of the temporary files, for tests: ".quillane-PID-".
    static QString temporaryPrefix(pid_t pid);

private:
    [[noreturn]] void fail(int error) const;
    void openTemporary(const QByteArray& folder);
    void discard();

    QString m_path;
    Mode m_mode;
    QByteArray m_target; // where the bytes end up, links resolved
    QString m_temporary; // empty when writing directly
    int m_fd = -1;
    bool m_direct = false;
    bool m_existed = false; // a regular file is being replaced
    mode_t m_targetMode = 0;
    uid_t m_targetOwner = 0;
    gid_t m_targetGroup = 0;
    bool m_failed = false;
};

// While one lives, on this thread, a write beyond the file size limit or to
// a pipe whose reader is gone fails (EFBIG, EPIPE) instead of ending the
// program by a signal; the failure is then reported like any other.
// SafeFile holds them for its own writes; a writer that writes a file of
// its own (libxlsxwriter) is run under one.
class WriteSignalsHeld {
public:
    WriteSignalsHeld();
    // Discards the signals raised meanwhile.
    ~WriteSignalsHeld();
    WriteSignalsHeld(const WriteSignalsHeld&) = delete;
    WriteSignalsHeld& operator=(const WriteSignalsHeld&) = delete;

private:
    sigset_t m_held;
    sigset_t m_pendingBefore;
    sigset_t m_old;
};
