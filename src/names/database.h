#pragma once

#include <QString>
#include <QStringList>

#include "names/statements.h"

struct sqlite3;
struct sqlite3_stmt;

// The path of the names database in the program folder.
QString namesDatabasePath(const QString& programFolder);

// One connection to the names database, open for reading and writing for the
// length of one operation and closed on every path out. It never creates the
// file: a missing database is a failure, like every other engine failure,
// and carries the engine's own message.
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
    // it changes nothing, and the statements before it stay; the transaction
    // commits when it ends, failure or not.
    class Transaction {
    public:
        explicit Transaction(Connection& connection);
        ~Transaction();
        Transaction(const Transaction&) = delete;
        Transaction& operator=(const Transaction&) = delete;
        void commit();
        // Undoes everything since the transaction began; it ends here.
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

private:
    [[noreturn]] void fail() const;

    sqlite3* m_db = nullptr;
};
