#pragma once

#include <QString>

// Questions about the program's files that need no window.

// True only for a path that exists (a file or a folder); an empty or
// malformed path is false, and nothing is ever reported.
bool FileExists(const QString& path);

// True in a debug build, where pauses are shortened.
bool InDevelopment();
