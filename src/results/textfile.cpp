#include "results/textfile.h"

#include "base/safefile.h"
#include "results/namestream.h"
#include "results/resultsfile.h"

#include <memory>

QByteArray resultsText(const ResultRows& rows)
{
    return formatRows(rows, RowFormat::Text);
}

QByteArray resultsLines(const ResultRows& rows)
{
    return formatRows(rows, RowFormat::Lines);
}

QByteArray resultsCsv(const ResultRows& rows)
{
    return formatRows(rows, RowFormat::Csv);
}

void WriteTextFile(const QByteArray& text, const QString& path, const QString& namesDatabase)
{
    const std::unique_ptr<SafeFile> file = openResultsFile(path, namesDatabase);
    file->write(text);
    file->commit();
}
