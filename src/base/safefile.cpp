#include "base/safefile.h"

#include "base/failure.h"

#include <QDir>
#include <QFileInfo>
#include <QSaveFile>

using namespace Qt::StringLiterals;

namespace {

Failure saveFailure(const QString& path, const QString& reason)
{
    return Failure(
        u"The file %1 could not be saved: %2"_s.arg(QDir::toNativeSeparators(path), reason));
}

} // namespace

SafeFile::SafeFile(const QString& path)
    : m_path(path)
{
    const QFileInfo info(path);
    m_direct = info.exists() && !info.isFile() && !info.isDir();
    if (m_direct) {
        m_file = std::make_unique<QFile>(path);
    } else {
        auto file = std::make_unique<QSaveFile>(path);
        file->setDirectWriteFallback(false);
        m_file = std::move(file);
    }
    if (!m_file->open(QIODevice::WriteOnly | QIODevice::Unbuffered))
        throw saveFailure(m_path, m_file->errorString());
}

SafeFile::~SafeFile()
{
    if (auto* save = dynamic_cast<QSaveFile*>(m_file.get()); save && save->isOpen())
        save->cancelWriting();
}

void SafeFile::write(QByteArrayView bytes)
{
    if (m_file->write(bytes.data(), bytes.size()) != bytes.size())
        throw saveFailure(m_path, m_file->errorString());
}

QString SafeFile::temporaryPath() const
{
    return m_file->fileName();
}

void SafeFile::commit()
{
    if (auto* save = dynamic_cast<QSaveFile*>(m_file.get())) {
        if (!save->commit())
            throw saveFailure(m_path, save->errorString());
        return;
    }
    if (!m_file->flush())
        throw saveFailure(m_path, m_file->errorString());
    m_file->close();
}
