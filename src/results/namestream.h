#pragma once

// The writers of a streamed run: every row format a loading program reads,
// written block by block as the rows are made, and the workbook, written
// row by row. Memory stays the same whatever the count. The results
// window's text files are laid out by the same rows (formatRows).

#include "generate/rowstream.h"
#include "results/outputchoice.h"

#include <QByteArray>
#include <QString>

#include <cstdint>

class ResultRows;

enum class RowFormat {
    Text,      // "First Last" CR LF: the results window's text file
    Lines,     // "First Last" LF
    Csv,       // header first_name,last_name; CR LF; a field quoted when it must be
    Tsv,       // the same with tabs, LF
    JsonLines, // {"first_name":...,"last_name":...} LF
    Sql,       // INSERT statements of up to SqlBatchRows rows each
};

inline constexpr std::int64_t SqlBatchRows = 1000;

// Rows of a format that stay together in one shard: a statement's rows.
std::int64_t rowsKeptTogether(RowFormat format);

// A field of separated values as a reader takes it back: quoted, with its
// quotes doubled, when it holds the separator, a quote or a line end.
QString separatedField(const QString& name, QChar separator);

// A table name as SQL reads it: as it stands when it is a plain identifier
// that is no keyword, otherwise in double quotes with its quotes doubled.
QString sqlIdentifier(const QString& name);

// Writes the run's shard in the format to sink: the header line with the
// first shard only, then every row. table names the table of SQL inserts.
void writeRows(const NameRun& run, RowFormat format, const QString& table, int threads,
               const ByteSink& sink);

// The results list's rows in a format, the header line first, in one
// buffer: the same bytes as a run of the same rows streamed by writeRows.
// table names the table of SQL inserts.
QByteArray formatRows(const ResultRows& rows, RowFormat format, const QString& table = {});

// The rows a worksheet holds. A run of more cannot be a workbook: the
// refusal says so; empty when count fits.
inline constexpr std::int64_t SheetRows = 1048576;
QString workbookRefusal(std::int64_t count);

// Writes the whole run as a workbook at path, in the layout of the results
// window's spreadsheet choices, as saving writes every workbook (never over
// the names database); throws Failure (the refusal above too).
void writeWorkbook(const NameRun& run, OutputChoice layout, const QString& path,
                   const QString& namesDatabase);
