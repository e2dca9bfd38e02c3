#pragma once

// The operations that change the name lists: adding typed names, deleting
// names from the built-in list, clearing a user list and importing a text
// file. Each is written once, with every rule and guard it needs; the main
// window runs them under its error traps, the command-line companion runs
// them as they are. Where the two differ (a blank name is skipped or an
// error, an absent name ignored or an error), the caller says which.

#include "names/database.h"
#include "names/liststore.h"

#include <QString>
#include <QStringList>

#include <functional>

// The connection an operation works over. It is asked for only once there is
// work for the database, so an operation with nothing to store never opens
// it; a failure to give it is the operation's failure.
using ConnectionSource = std::function<Connection&()>;

// What a typed name that stores nothing (blank, or apostrophes only) means.
enum class BlankNames { Skip, Refuse };

// Adds the typed names to the list that the kind and the source choose, all
// of them or, after any failure, none. Every name is checked before the
// database changes (nameToStore); with BlankNames::Refuse a blank one is an
// error and nothing is added. Throws Failure.
void addNames(const ConnectionSource& connect, ListKind kind, const ListChoice& choice,
              const QStringList& typed, BlankNames blanks);

// What a name that is in none of the tables means to a delete.
enum class AbsentNames { Ignore, Refuse };

// Runs one statement's work as a step of the caller's: a window traps it and
// goes on, reporting the failure; returns whether the step completed. Without
// one, the work runs as it is and its failure ends the operation.
using StatementStep = std::function<bool(const char* statement, const std::function<void()>& work)>;

// Deletes each name from the built-in tables that the kind and the gender
// choose: every row holding it, compared without regard to case. A null name
// (nothing selected) fails each statement that would have run. The names go
// together or, when a failure ends the operation, not at all. Throws Failure.
void deleteNames(const ConnectionSource& connect, ListKind kind, const ListChoice& choice,
                 const QStringList& names, AbsentNames absent, const StatementStep& step = {});

// Empties the user's first or last names ("Clear"): all of them go, or after
// a failure none. Throws Failure.
void clearList(Connection& connection, ListKind kind);

// Where an import stood when something went wrong. A window numbers its
// report by it; the command line tells names from files and the database.
enum class ImportStep {
    FindFile,
    OpenDatabase,
    OpenFile,
    Begin,
    Read,
    Store,
    MoreRefused,
    RebuildIndexes,
    Commit,
};

// Whose fault a problem of an import is.
enum class ImportCulprit {
    Name,     // one name was refused; the rest of the file is still imported
    File,     // the file cannot be read as names; its import has ended
    Database, // the database failed; the file's import has ended
};

struct ImportProblem {
    ImportStep step;
    ImportCulprit culprit;
    QString description;
};

// Hears each problem as it happens. It may throw to end the import at once:
// a transaction of the import's own is then rolled back.
using ImportProblems = std::function<void(const ImportProblem&)>;

// FileToListview's work: the names of one text file (see NameSplitter) into
// the list that the kind and the source choose, in file order. A file that is
// not there is reported and nothing else happens; a file that is not text is
// refused whole. The names of the file are committed together, once it has
// been read to its end; names that a list does not store, or that a rule of
// the table refuses, are reported, at most MaxImportReportsPerFile of them
// and then once how many more there were, and the rest is stored. A failure
// of the database itself (full disk, I/O error, read-only or locked file)
// ends the import at once with one report, and nothing of the file stays.
// Over a connection with a transaction already open, the import joins it and
// leaves its end to the caller, so that several files stand or fall together.
// Never throws but for what `problems` throws.
void importNameFile(const ConnectionSource& connect, const QString& path, ListKind kind,
                    const ListChoice& choice, const ImportProblems& problems);
