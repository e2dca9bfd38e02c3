#include "support/testenvironment.h"

#include <QDir>
#include <QFile>
#include <QSettings>
#include <QTest>

#include <sqlite3.h>

using namespace Qt::StringLiterals;

namespace {

QTemporaryDir& settingsFolder()
{
    static QTemporaryDir folder;
    return folder;
}

struct Db {
    explicit Db(const QString& path)
    {
        if (sqlite3_open(QFile::encodeName(path).constData(), &handle) != SQLITE_OK)
            qFatal("cannot open %s", qPrintable(path));
    }
    ~Db() { sqlite3_close(handle); }
    void exec(const QByteArray& sql)
    {
        char* error = nullptr;
        if (sqlite3_exec(handle, sql.constData(), nullptr, nullptr, &error) != SQLITE_OK)
            qFatal("%s: %s", sql.constData(), error);
    }
    sqlite3* handle = nullptr;
};

} // namespace

void useTemporarySettings()
{
    useSettingsFolder(settingsFolder().path());
}

void useSettingsFolder(const QString& folder)
{
    QSettings::setPath(QSettings::IniFormat, QSettings::UserScope, folder);
    QFile::remove(QDir(folder).filePath(u"Varnholt.ini"_s));
}

TestEnvironment::TestEnvironment(bool shippedDatabase)
    : settings((useTemporarySettings(), std::make_unique<Settings>()))
    , environment{dialogs, *settings, shell, clock, random, m_folder.path()}
{
    settings->reportWriteFailuresTo(&dialogs);
    if (shippedDatabase && !QFile::copy(QString::fromUtf8(QUILLANE_SHIPPED_DB), databasePath()))
        qFatal("cannot copy the shipped database");
    QFile(databasePath()).setPermissions(QFile::ReadOwner | QFile::WriteOwner);
}

QString TestEnvironment::databasePath() const
{
    return filePath(u"names.mdb"_s);
}

QString TestEnvironment::filePath(const QString& name) const
{
    return QDir(m_folder.path()).filePath(name);
}

void createEmptyDatabase(const QString& path)
{
    QFile schema(QString::fromUtf8(QUILLANE_SCHEMA));
    if (!schema.open(QIODevice::ReadOnly))
        qFatal("cannot read the schema");
    Db(path).exec(schema.readAll());
}

QStringList tableColumn(const QString& databasePath, const QString& table, const QString& column)
{
    Db db(databasePath);
    sqlite3_stmt* stmt = nullptr;
    const QByteArray sql =
        QString(u"select "_s + column + u" from "_s + table + u" order by rowid"_s).toUtf8();
    if (sqlite3_prepare_v2(db.handle, sql.constData(), -1, &stmt, nullptr) != SQLITE_OK)
        qFatal("%s", sqlite3_errmsg(db.handle));
    QStringList values;
    while (sqlite3_step(stmt) == SQLITE_ROW)
        values.append(
            QString::fromUtf8(reinterpret_cast<const char*>(sqlite3_column_text(stmt, 0))));
    sqlite3_finalize(stmt);
    return values;
}

void insertRows(const QString& databasePath, const QString& table, const QString& column,
                const QStringList& values)
{
    Db db(databasePath);
    db.exec("begin");
    const QByteArray sql =
        QString(u"insert into "_s + table + u" ("_s + column + u") values (?)"_s).toUtf8();
    sqlite3_stmt* stmt = nullptr;
    sqlite3_prepare_v2(db.handle, sql.constData(), -1, &stmt, nullptr);
    for (const QString& value : values) {
        const QByteArray utf8 = value.toUtf8();
        sqlite3_bind_text(stmt, 1, utf8.constData(), int(utf8.size()), SQLITE_TRANSIENT);
        sqlite3_step(stmt);
        sqlite3_reset(stmt);
    }
    sqlite3_finalize(stmt);
    db.exec("commit");
}
