#pragma once

#include <QString>
#include <QStringList>

#include "base/failure.h"
#include "names/statements.h"

struct sqlite3;
struct sqlite3_stmt;

// A failure of the database engine, with its result code: what went wrong
// with the file or the engine (its description names the file), or a rule of
// a table that refused a row (its description is the rule's).
class DatabaseFailure : public Failure {
public:
    DatabaseFailure(QString description, int code);

    int code() const noexcept { return m_code; }
    // A rule of the table refused the row (a constraint, a trigger, a value
    // too large): the database itself is sound and the next row may pass.
    bool refusedRow() const noexcept;

private:
    int m_code;
};

// The path of the names database in the program folder.
QString namesDatabasePath(const QString& programFolder);

// One connection to the names database, open for reading and writing for the
// length of one operation and closed on every path out. It never creates the
// file: a missing database is a failure, like every other engine failure,
// and carries the engine's own message after the file's name.
class Connection {
public:
    explicit Connection(const QString& path);
    ~Connection();
    Connection(const Connection&) = delete;
    Connection& operator=(const Connection&) = delete;

    // Runs a statement that carries no value, or one with a single bound name.
    void execute(const char* sql);
    void execute(const char* sql, const QString& name);

    // The query's column, every row in the order the engine returns them.
    QStringList queryNames(const Sql::Query& query);

    // Groups many statements into one commit. A statement that fails inside
    // it changes nothing, and the statements before it stay until the end:
    // only commit() keeps them. A transaction that ends otherwise (a failure
    // unwinding through it) is rolled back.
    class Transaction {
    public:
        explicit Transaction(Connection& connection);
        ~Transaction();
        Transaction(const Transaction&) = delete;
        Transaction& operator=(const Transaction&) = delete;
        void commit();
        // Undoes everything since the transaction began; it ends here. The
        // engine may have undone it already, after a failure of the file
        // (full disk, I/O error): that is no second failure.
        void rollback();

    private:
        Connection& m_connection;
        bool m_open = true;
    };

    // Drops the table's plain (not unique) indexes and returns the
    // statements that build them again. Inside a transaction, a bulk insert
    // followed by those statements is much faster than keeping the indexes
    // up to date name by name, and nobody sees the table without them.
    QList<QByteArray> dropPlainIndexes(const char* table);

    // One statement prepared once and run many times with a single bound
    // name each: the bulk import's insert.
    class Prepared {
    public:
        Prepared(Connection& connection, const char* sql);
        ~Prepared();
        Prepared(const Prepared&) = delete;
        Prepared& operator=(const Prepared&) = delete;
        void run(const QString& name);

    private:
        Connection& m_connection;
        sqlite3_stmt* m_stmt = nullptr;
    };

    // True while a transaction is open on this connection.
    bool inTransaction() const;
    // How many rows the last insert or delete changed.
    int changes() const;

    sqlite3* handle() const { return m_db; }
    const QString& path() const;

private:
    [[noreturn]] void fail() const;
    [[noreturn]] void fail(int code) const;

    QString m_path;
    sqlite3* m_db = nullptr;
};
