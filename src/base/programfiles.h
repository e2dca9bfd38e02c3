#pragma once

#include <QString>

// Questions about the program's files that need no window.

// True only for a path that exists (a file or a folder); an empty or
// malformed path is false, and nothing is ever reported.
bool FileExists(const QString& path);

// True in a debug build, where pauses are shortened.
bool InDevelopment();

// Which names database the program works on. names.mdb beside the program
// is the list wherever it can be written (a build folder, an install in the
// user's own prefix). Where it cannot (an install for every account on the
// machine), each user works on a copy of it of their own in
// userDataFolder(), made from it on first use.
struct NamesDatabaseChoice {
    QString path;         // the file to work on
    QString shipped;      // names.mdb beside the program
    bool ownCopy = false; // path is the user's own copy of shipped
};

// Decides without changing anything.
NamesDatabaseChoice chooseNamesDatabase(const QString& programFolder);

// $XDG_DATA_HOME/quillane, or ~/.local/share/quillane when it is unset or
// not an absolute path.
QString userDataFolder();

// The file to work on: the choice's path, the user's copy made first if the
// choice needs one and there is none yet. Throws Failure naming the copy
// that could not be made.
QString namesDatabaseInUse(const QString& programFolder);

// Copies shipped to copy (and the folders above it) unless copy exists.
// The copy is its owner's to write whatever the shipped file's mode, and it
// appears complete or not at all, even with two programs starting at once.
void makeOwnCopy(const QString& shipped, const QString& copy);

// One line for --version: the file in use and why.
QString describeNamesDatabase(const NamesDatabaseChoice& choice);
