#pragma once

#include "app/environment.h"
#include "base/settings.h"
#include "generate/randomsource.h"
#include "support/fakedialogs.h"
#include "support/fakeplatform.h"

#include <QDir>
#include <QFile>
#include <QStringList>
#include <QTemporaryDir>

#include <memory>

// Points the settings store at a fresh temporary folder, so no test ever
// touches the user's settings. Call before the first Settings is made.
void useTemporarySettings();
// Points the settings store at an empty settings file in folder.
void useSettingsFolder(const QString& folder);

// A program folder of its own for one test: a fresh copy of the shipped
// names database, an empty settings store, scripted dialogs, a fake shell
// and clock, and a random source with a fixed seed.
class TestEnvironment {
    QTemporaryDir m_folder; // first: the environment below points into it

public:
    // With shippedDatabase false the folder starts without names.mdb.
    explicit TestEnvironment(bool shippedDatabase = true);

    QString folder() const { return m_folder.path(); }
    QString databasePath() const;
    QString filePath(const QString& name) const;

    FakeDialogs dialogs;
    FakeShell shell;
    FakeClock clock;
    RandomSource random;
    std::unique_ptr<Settings> settings;
    Environment environment;
};

// The names database's tables, and the one column of each, in the same order.
inline const QStringList DatabaseTables{
    QStringLiteral("system_mfirstname"), QStringLiteral("system_ffirstname"),
    QStringLiteral("system_lastname"), QStringLiteral("user_firstname"),
    QStringLiteral("user_lastname")};
inline const QStringList DatabaseColumns{QStringLiteral("Mfirst"), QStringLiteral("Ffirst"),
                                         QStringLiteral("Last"), QStringLiteral("firstname"),
                                         QStringLiteral("lastname")};

// A names database with the program's tables and no rows.
void createEmptyDatabase(const QString& path);

// Direct access for checking what the program stored: every value of a
// table's column in storage order, and a count of its rows.
QStringList tableColumn(const QString& databasePath, const QString& table, const QString& column);
void insertRows(const QString& databasePath, const QString& table, const QString& column,
                const QStringList& values);

// Whole files, for fixtures; a file that cannot be read or written ends the run.
inline QByteArray fileBytes(const QString& path)
{
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly))
        qFatal("cannot read %s", qPrintable(path));
    return file.readAll();
}

inline void writeBytes(const QString& path, const QByteArray& bytes)
{
    QDir().mkpath(QFileInfo(path).path());
    QFile file(path);
    if (!file.open(QIODevice::WriteOnly) || file.write(bytes) != bytes.size())
        qFatal("cannot write %s", qPrintable(path));
}
