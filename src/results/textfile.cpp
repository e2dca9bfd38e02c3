#include "results/textfile.h"

#include "app/failure.h"
#include "results/resultrows.h"

#include <QDir>
#include <QSaveFile>
#include <QStringEncoder>

#include <algorithm>

using namespace Qt::StringLiterals;

namespace {

// Every row's bytes, in list order, in one buffer. Each name is encoded
// straight into the end of the buffer: no text of the whole list is built
// twice, and no small array is made per name. writeRow appends one row at
// out, never more than room(first, last) bytes, and returns the new end.
template <typename Room, typename WriteRow>
QByteArray encodeRows(const ResultRows& rows, QByteArray bytes, Room room, WriteRow writeRow)
{
    QStringEncoder encoder(QStringEncoder::System, QStringEncoder::Flag::Stateless);
    const int count = rows.rowCount();
    qsizetype used = bytes.size();
    bytes.resize(used + qsizetype(count) * 18);
    for (int row = 0; row < count; ++row) {
        const QString first = rows.firstName(row);
        const QString last = rows.lastName(row);
        const qsizetype most = room(encoder, first, last);
        if (used + most > bytes.size())
            bytes.resize(std::max(bytes.size() * 2, used + most));
        char* out = writeRow(encoder, bytes.data() + used, first, last);
        used = out - bytes.constData();
    }
    bytes.truncate(used);
    return bytes;
}

qsizetype plainRoom(QStringEncoder& encoder, const QString& first, const QString& last)
{
    return encoder.requiredSpace(first.size() + last.size()) + 3;
}

// A field as a CSV reader takes it back: quoted, with its quotes doubled,
// when it holds a comma, a quote or a line end.
QString csvField(const QString& name)
{
    const bool plain = std::none_of(name.cbegin(), name.cend(), [](QChar c) {
        return c == u',' || c == u'"' || c == u'\r' || c == u'\n';
    });
    return plain ? name : u'"' + QString(name).replace(u"\""_s, u"\"\""_s) + u'"';
}

} // namespace

QByteArray resultsText(const ResultRows& rows)
{
    return encodeRows(
        rows, {}, plainRoom,
        [](QStringEncoder& encoder, char* out, const QString& first, const QString& last) {
            out = encoder.appendToBuffer(out, first);
            *out++ = ' ';
            out = encoder.appendToBuffer(out, last);
            *out++ = '\r';
            *out++ = '\n';
            return out;
        });
}

QByteArray resultsLines(const ResultRows& rows)
{
    return encodeRows(
        rows, {}, plainRoom,
        [](QStringEncoder& encoder, char* out, const QString& first, const QString& last) {
            out = encoder.appendToBuffer(out, first);
            *out++ = ' ';
            out = encoder.appendToBuffer(out, last);
            *out++ = '\n';
            return out;
        });
}

QByteArray resultsCsv(const ResultRows& rows)
{
    const auto room = [](QStringEncoder& encoder, const QString& first, const QString& last) {
        // Quoting at most doubles a field and adds two quotes to each.
        return encoder.requiredSpace(2 * (first.size() + last.size())) + 7;
    };
    return encodeRows(
        rows, QByteArray("first_name,last_name\r\n"), room,
        [](QStringEncoder& encoder, char* out, const QString& first, const QString& last) {
            out = encoder.appendToBuffer(out, csvField(first));
            *out++ = ',';
            out = encoder.appendToBuffer(out, csvField(last));
            *out++ = '\r';
            *out++ = '\n';
            return out;
        });
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
