#include "names/database.h"

#include "base/failure.h"

#include <QDir>

#include <sqlite3.h>

using namespace Qt::StringLiterals;

namespace {

// Another program holding the file locked is reported after this long
// instead of leaving the window hanging.
constexpr int BusyTimeoutMs = 2000;

// A rule of the table refused the row: a constraint, a trigger, a value too
// large. The database itself is sound.
bool isRowRefusal(int code)
{
    const int primary = code & 0xFF;
    return primary == SQLITE_CONSTRAINT || primary == SQLITE_TOOBIG || primary == SQLITE_MISMATCH;
}

// What the user reads of an engine failure. A failure of the file names it;
// a file that opens but lacks the lists is not ours; a row that a rule of its
// table refused is about the row, and says so in the rule's own words.
[[noreturn]] void throwEngineFailure(const QString& path, int code, const QString& message)
{
    const QString file = QDir::toNativeSeparators(path);
    const int primary = code & 0xFF;
    if (primary == SQLITE_NOTADB || message.startsWith(u"no such table:")
        || message.startsWith(u"no such column:"))
        throw DatabaseFailure(u"The file %1 is not a Quillane names database."_s.arg(file), code);
    if (isRowRefusal(code))
        throw DatabaseFailure(message, code);
    throw DatabaseFailure(u"%1: %2"_s.arg(file, message), code);
}

[[noreturn]] void throwEngineFailure(const QString& path, sqlite3* db)
{
    throwEngineFailure(path, sqlite3_extended_errcode(db), QString::fromUtf8(sqlite3_errmsg(db)));
}

// A prepared statement, finalised on every path out.
class Statement {
public:
    Statement(sqlite3* db, const QString& path, const char* sql)
    {
        if (sqlite3_prepare_v2(db, sql, -1, &m_stmt, nullptr) != SQLITE_OK)
            throwEngineFailure(path, db);
    }
    ~Statement() { sqlite3_finalize(m_stmt); }
    Statement(const Statement&) = delete;
    Statement& operator=(const Statement&) = delete;

    sqlite3_stmt* get() const { return m_stmt; }

private:
    sqlite3_stmt* m_stmt = nullptr;
};

int columnIndex(sqlite3_stmt* stmt, const QString& path, const char* name)
{
    const int count = sqlite3_column_count(stmt);
    for (int i = 0; i < count; ++i) {
        if (sqlite3_stricmp(sqlite3_column_name(stmt, i), name) == 0)
            return i;
    }
    throwEngineFailure(path, SQLITE_ERROR, u"no such column: %1"_s.arg(QString::fromUtf8(name)));
}

} // namespace

DatabaseFailure::DatabaseFailure(QString description, int code)
    : Failure(std::move(description))
    , m_code(code)
{
}

bool DatabaseFailure::refusedRow() const noexcept
{
    return isRowRefusal(m_code);
}

const QString& Connection::path() const
{
    return m_path;
}

QString namesDatabasePath(const QString& programFolder)
{
    return QDir(programFolder).filePath(u"names.mdb"_s);
}

Connection::Connection(const QString& path)
    : m_path(path)
{
    const QByteArray file = QFile::encodeName(path);
    const int rc = sqlite3_open_v2(file.constData(), &m_db, SQLITE_OPEN_READWRITE, nullptr);
    if (rc != SQLITE_OK) {
        const QString message =
            m_db ? QString::fromUtf8(sqlite3_errmsg(m_db)) : QString::fromUtf8(sqlite3_errstr(rc));
        const int code = m_db ? sqlite3_extended_errcode(m_db) : rc;
        sqlite3_close(m_db);
        m_db = nullptr;
        throwEngineFailure(path, code, message);
    }
    // Before any statement: reading the lists' definitions waits too.
    sqlite3_busy_timeout(m_db, BusyTimeoutMs);
    sqlite3_extended_result_codes(m_db, 1);
}

Connection::~Connection()
{
    sqlite3_close(m_db);
}

void Connection::fail() const
{
    fail(sqlite3_extended_errcode(m_db));
}

void Connection::fail(int code) const
{
    throwEngineFailure(m_path, code, QString::fromUtf8(sqlite3_errmsg(m_db)));
}

void Connection::execute(const char* sql)
{
    Statement stmt(m_db, m_path, sql);
    if (sqlite3_step(stmt.get()) != SQLITE_DONE)
        fail();
}

void Connection::execute(const char* sql, const QString& name)
{
    Statement stmt(m_db, m_path, sql);
    const QByteArray utf8 = name.toUtf8();
    sqlite3_bind_text(stmt.get(), 1, utf8.constData(), int(utf8.size()), SQLITE_STATIC);
    if (sqlite3_step(stmt.get()) != SQLITE_DONE)
        fail();
}

bool Connection::inTransaction() const
{
    return sqlite3_get_autocommit(m_db) == 0;
}

int Connection::changes() const
{
    return sqlite3_changes(m_db);
}

QStringList Connection::queryNames(const Sql::Query& query)
{
    Statement stmt(m_db, m_path, query.text);
    const int column = columnIndex(stmt.get(), m_path, query.column);
    QStringList names;
    int rc;
    while ((rc = sqlite3_step(stmt.get())) == SQLITE_ROW) {
        const auto* text = reinterpret_cast<const char*>(sqlite3_column_text(stmt.get(), column));
        const int bytes = sqlite3_column_bytes(stmt.get(), column);
        names.append(QString::fromUtf8(text, bytes));
    }
    if (rc != SQLITE_DONE)
        fail();
    return names;
}

Connection::Transaction::Transaction(Connection& connection)
    : m_connection(connection)
{
    m_connection.execute("begin immediate");
}

Connection::Transaction::~Transaction()
{
    if (m_open && m_connection.inTransaction())
        sqlite3_exec(m_connection.m_db, "rollback", nullptr, nullptr, nullptr);
}

void Connection::Transaction::commit()
{
    m_open = false;
    m_connection.execute("commit");
}

void Connection::Transaction::rollback()
{
    m_open = false;
    if (m_connection.inTransaction())
        m_connection.execute("rollback");
}

Connection::Prepared::Prepared(Connection& connection, const char* sql)
    : m_connection(connection)
{
    if (sqlite3_prepare_v2(connection.m_db, sql, -1, &m_stmt, nullptr) != SQLITE_OK)
        connection.fail();
}

Connection::Prepared::~Prepared()
{
    sqlite3_finalize(m_stmt);
}

void Connection::Prepared::run(const QString& name)
{
    const QByteArray utf8 = name.toUtf8();
    sqlite3_bind_text(m_stmt, 1, utf8.constData(), int(utf8.size()), SQLITE_STATIC);
    const int rc = sqlite3_step(m_stmt);
    // The message first: resetting the statement is what lets it run again.
    const QString message =
        rc == SQLITE_DONE ? QString() : QString::fromUtf8(sqlite3_errmsg(m_connection.m_db));
    const int code = rc == SQLITE_DONE ? SQLITE_OK : sqlite3_extended_errcode(m_connection.m_db);
    sqlite3_reset(m_stmt);
    sqlite3_clear_bindings(m_stmt);
    if (rc != SQLITE_DONE)
        throwEngineFailure(m_connection.m_path, code, message);
}

QList<QByteArray> Connection::dropPlainIndexes(const char* table)
{
    QList<QByteArray> names;
    QList<QByteArray> rebuild;
    {
        Statement stmt(m_db, m_path,
                       "select name, sql from sqlite_master where type = 'index' "
                       "and tbl_name = ? and sql is not null");
        sqlite3_bind_text(stmt.get(), 1, table, -1, SQLITE_STATIC);
        int rc;
        while ((rc = sqlite3_step(stmt.get())) == SQLITE_ROW) {
            const QByteArray sql(reinterpret_cast<const char*>(sqlite3_column_text(stmt.get(), 1)));
            if (sql.trimmed().toLower().startsWith("create unique"))
                continue; // it decides what may be stored: it stays
            names.append(
                QByteArray(reinterpret_cast<const char*>(sqlite3_column_text(stmt.get(), 0))));
            rebuild.append(sql);
        }
        if (rc != SQLITE_DONE)
            fail();
    }
    for (const QByteArray& name : std::as_const(names)) {
        QByteArray quoted = name;
        quoted.replace('"', "\"\"");
        execute(QByteArray("drop index \"" + quoted + "\"").constData());
    }
    return rebuild;
}
