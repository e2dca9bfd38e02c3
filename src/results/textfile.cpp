#include "results/textfile.h"

#include "app/failure.h"
#include "results/resultrows.h"

#include <QDir>
#include <QSaveFile>
#include <QStringEncoder>

#include <algorithm>

using namespace Qt::StringLiterals;

QByteArray resultsText(const ResultRows& rows)
{
    // Each name is encoded straight into the end of one buffer: no text of
    // the whole list is built twice, and no small array is made per name.
    QStringEncoder encoder(QStringEncoder::System, QStringEncoder::Flag::Stateless);
    const int count = rows.rowCount();
    QByteArray bytes;
    bytes.resize(qsizetype(count) * 18);
    qsizetype used = 0;
    for (int row = 0; row < count; ++row) {
        const QString first = rows.firstName(row);
        const QString last = rows.lastName(row);
        const qsizetype most = encoder.requiredSpace(first.size() + last.size()) + 3;
        if (used + most > bytes.size())
            bytes.resize(std::max(bytes.size() * 2, used + most));
        char* out = bytes.data() + used;
        out = encoder.appendToBuffer(out, first);
        *out++ = ' ';
        out = encoder.appendToBuffer(out, last);
        *out++ = '\r';
        *out++ = '\n';
        used = out - bytes.constData();
    }
    bytes.truncate(used);
    return bytes;
}

void WriteTextFile(const QByteArray& text, const QString& path)
{
    const auto fail = [&path](const QString& reason) {
        return Failure(
            u"The file %1 could not be saved: %2"_s.arg(QDir::toNativeSeparators(path), reason));
    };

    QSaveFile file(path);
    // Without the fallback a folder where no temporary file can be made is
    // a failure too, instead of a direct write that could cut the old file.
    file.setDirectWriteFallback(false);
    if (!file.open(QIODevice::WriteOnly))
        throw fail(file.errorString());
    if (file.write(text) != text.size()) {
        const QString reason = file.errorString();
        file.cancelWriting();
        throw fail(reason);
    }
    if (!file.commit())
        throw fail(file.errorString());
}
