#pragma once

#include <QDateTime>
#include <QString>

// Workbooks handed to the spreadsheet program pile up in the cache folder:
// the user saves what they keep from the spreadsheet program, elsewhere.
// Removes from folder (not below it) the workbooks this program made there,
// and the unfinished ones a killed run left, once they are more than seven
// days older than now. Files of other names, links and folders stay; a
// file that cannot be removed is left for the next time, silently.
void removeOldWorkbooks(const QString& folder, const QDateTime& now);
