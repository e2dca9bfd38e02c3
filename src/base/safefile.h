#pragma once

// Writing a file so that a failure never leaves it half-written: a regular
// file (or a new name) is written under a temporary name beside it and takes
// its place only on commit; a device or a FIFO is written directly.

#include <QByteArrayView>
#include <QString>

#include <memory>

class QFileDevice;

class SafeFile {
public:
    // Opens for writing; throws Failure.
    explicit SafeFile(const QString& path);
    // Discards what was written unless it was committed.
    ~SafeFile();
    SafeFile(const SafeFile&) = delete;
    SafeFile& operator=(const SafeFile&) = delete;

    // Throws Failure with the file system's description.
    void write(QByteArrayView bytes);
    // Where the bytes go until commit; the path itself for a direct write.
    QString temporaryPath() const;
    // Puts the file in place; throws Failure.
    void commit();

private:
    QString m_path;
    std::unique_ptr<QFileDevice> m_file;
    bool m_direct = false;
};
