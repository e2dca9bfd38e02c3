#include "results/workbookcache.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QRegularExpression>

using namespace Qt::StringLiterals;

namespace {
constexpr int KeptDays = 7;
}

void removeOldWorkbooks(const QString& folder, const QDateTime& now)
{
    // The names the spreadsheet code gives: "Quillane names <moment>.xlsx",
    // "... (<n>).xlsx" for a second one in a second, and the hidden
    // ".Quillane names <random>.xlsx.part" while one is being written.
    static const QRegularExpression made(
        uR"(^(Quillane names \d{4}-\d\d-\d\d \d\d\.\d\d\.\d\d( \(\d+\))?\.xlsx|\.Quillane names \w{6}\.xlsx\.part)$)"_s);
    const QDateTime limit = now.addDays(-KeptDays);
    const QFileInfoList entries =
        QDir(folder).entryInfoList(QDir::Files | QDir::Hidden | QDir::System | QDir::NoSymLinks);
    for (const QFileInfo& entry : entries) {
        if (entry.isFile() && !entry.isSymLink() && made.match(entry.fileName()).hasMatch()
            && entry.lastModified() < limit)
            QFile::remove(entry.filePath());
    }
}
