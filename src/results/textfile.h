#pragma once

#include <QByteArray>
#include <QString>

class ResultRows;

// The bytes of a results file: for every row, in list order, the first
// name, one space, the last name and CR LF, in the system's 8-bit encoding
// (UTF-8 on a current Linux desktop), without a byte-order mark. The file
// ends right after the last row's CR LF, so an empty list gives no bytes.
QByteArray resultsText(const ResultRows& rows);

// The same rows for other programs, in the results file's encoding: "first
// last" and LF per row, or comma-separated values after the header line
// "first_name,last_name", with CR LF line ends and a field quoted only when
// it holds a comma, a quote or a line end.
QByteArray resultsLines(const ResultRows& rows);
QByteArray resultsCsv(const ResultRows& rows);

// Writes text to path, replacing what it names, as SafeFile describes: a
// failure (no write access, a full disk, a path that names a folder) throws
// Failure with the system's description and leaves an existing file as it
// was. The names database (namesDatabase; empty for none) is never written
// over: NamesDatabaseRefusal.
void WriteTextFile(const QByteArray& text, const QString& path, const QString& namesDatabase);
