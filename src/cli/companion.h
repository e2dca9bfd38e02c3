#pragma once

// quillane-cli: the program's names database, generator and writers for
// scripts, builds and test-data pipelines. Each subcommand does what one of
// the main window's buttons does, through the same code and statements; it
// differs only in how it ends: the first failure stops it, and nothing it
// was writing is left half-done.
//
// Results go to standard output (or to -o FILE), everything else to
// standard error. Exit status: 0 done, 1 failed, 2 the command line was
// wrong.

#include <QString>
#include <QStringList>

#include <cstdio>

namespace Companion {

inline constexpr int Done = 0;
inline constexpr int Failed = 1;
inline constexpr int UsageError = 2;

// Runs one command line (arguments[0] is the program) against the names
// database in programFolder unless --database names another; returns the
// exit status.
int run(const QStringList& arguments, const QString& programFolder, std::FILE* out, std::FILE* err);

} // namespace Companion
