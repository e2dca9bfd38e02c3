#pragma once

#include "base/failure.h"

#include <QString>

#include <memory>

class SafeFile;

// A save that would write over the names database, whatever path leads
// there (relative, through a link, another hard link): that would replace
// every list with a list of results.
class NamesDatabaseRefusal : public Failure {
public:
    explicit NamesDatabaseRefusal(const QString& path);
};

// The one way results are written over whatever a path names: a file that
// is the names database is refused (namesDatabase empty: there is none to
// keep), then the file is opened as SafeFile describes. Throws Failure.
std::unique_ptr<SafeFile> openResultsFile(const QString& path, const QString& namesDatabase);
