#include "results/textfile.h"

#include "app/failure.h"
#include "results/resultrows.h"

#include <QDir>
#include <QSaveFile>

using namespace Qt::StringLiterals;

QString resultsText(const ResultRows& rows) {
    const int count = rows.rowCount();
    QString text;
    // Typical names are short; a fair guess saves most of the regrowing of
    // a text that can hold a million lines.
    text.reserve(qsizetype(count) * 20);
    for (int row = 0; row < count; ++row) {
        text += rows.firstName(row);
        text += u' ';
        text += rows.lastName(row);
        text += u"\r\n";
    }
    return text;
}

void WriteTextFile(const QString& text, const QString& path) {
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
    const QByteArray bytes = text.toLocal8Bit();
    if (file.write(bytes) != bytes.size()) {
        const QString reason = file.errorString();
        file.cancelWriting();
        throw fail(reason);
    }
    if (!file.commit())
        throw fail(file.errorString());
}
