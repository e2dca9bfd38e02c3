// The names database: what each query shows in the panes, what the inserts
// and deletes do, and how engine failures reach the caller.
#include "base/failure.h"
#include "names/database.h"
#include "names/namelists.h"
#include "support/testenvironment.h"

#include <QFile>
#include <QTest>
#include <QThread>

#include <sqlite3.h>

#include <optional>
#include <thread>

using namespace Qt::StringLiterals;

class TestDatabase : public QObject {
    Q_OBJECT

    QTemporaryDir m_dir;
    const QString m_path = m_dir.filePath(u"names.mdb"_s);

    // Every table's rows in storage order.
    QStringList everything() const
    {
        QStringList all;
        for (const QString& table : DatabaseTables)
            all.append(tableColumn(m_path, table, u"*"_s).join(u','));
        return all;
    }

private Q_SLOTS:
    // Small tables with mixed case, duplicates and a name with an apostrophe.
    void init()
    {
        QFile::remove(m_path);
        createEmptyDatabase(m_path);
        Connection db(m_path);
        db.execute("insert into system_mfirstname values ('Terry'),('adam'),('Zack'),('Terry')");
        db.execute("insert into system_ffirstname values ('Terry'),('Mary'),('beth'),('O''Hara')");
        db.execute("insert into system_lastname values ('smith'),('Jones'),('ADAMS'),('Jones')");
        db.execute("insert into user_firstname values ('cleo'),('Bo'),('Bo'),('AL')");
        db.execute("insert into user_lastname values ('Yu'),('de Vries')");
    }

    // Both panes start as "kept": a group with no option selected leaves its
    // panes as they are, and so does a failure, which carries the engine's
    // message. A missing database is never created.
    void panesShowEachQuery_data()
    {
        QTest::addColumn<ListChoice>("choice");
        QTest::addColumn<QString>("firstNames");
        QTest::addColumn<QString>("lastNames");
        QTest::addColumn<QString>("failure");

        // Each as it differs from the first start's choice: the built-in list, both genders.
        const ListChoice both{}, male{.both = false, .male = true};
        const ListChoice female{.both = false, .female = true};
        const ListChoice user{.builtIn = false, .user = true}, noGender{.both = false};
        const ListChoice noSource{.builtIn = false};
        const QString last = u"ADAMS,Jones,Jones,smith"_s, kept = u"kept"_s;
        const auto row = [](const char* tag, ListChoice c, QString f, QString l, QString e = {}) {
            QTest::newRow(tag) << c << f << l << e; // choice, the two panes, the failure
        };
        row("both: union, each once", both, u"adam,beth,Mary,O'Hara,Terry,Zack"_s, last);
        row("male: each once", male, u"adam,Terry,Zack"_s, last);
        row("female", female, u"beth,Mary,O'Hara,Terry"_s, last);
        row("user: duplicates twice", user, u"AL,Bo,Bo,cleo"_s, u"de Vries,Yu"_s);
        row("no gender selected", noGender, kept, last);
        row("no source selected", noSource, kept, kept);
        // A failure names the file; one that is not ours says so.
        const QString notOurs = u"The file %1 is not a Quillane names database."_s.arg(m_path);
        row("missing", both, kept, kept, m_path + u": unable to open database file"_s);
        row("corrupt", both, kept, kept, notOurs);
        row("foreign", user, kept, kept, notOurs);
        row("foreign columns", user, kept, kept, notOurs);
        // Another program writing for a moment is waited for.
        row("busy", user, u"AL,Bo,Bo,cleo"_s, u"de Vries,Yu"_s);
    }

    void panesShowEachQuery()
    {
        QFETCH(ListChoice, choice);
        // The rows named "missing" and "corrupt" start from such a database.
        const QByteArrayView database(QTest::currentDataTag());
        QFile db(m_path);
        if (database == "missing")
            QVERIFY(db.remove());
        if (database == "corrupt") // written over the database
            QVERIFY(db.open(QIODevice::WriteOnly) && db.write(QByteArray(999, 'x')) && db.flush());
        // Another program's database, or the lists' tables as another program made them.
        if (database.startsWith("foreign")) {
            QVERIFY(db.remove());
            sqlite3* other = nullptr;
            sqlite3_open(QFile::encodeName(m_path).constData(), &other);
            const char* sql =
                database == "foreign" ? "create table t (x)" : "create table user_firstname (name)";
            QCOMPARE(sqlite3_exec(other, sql, nullptr, nullptr, nullptr), SQLITE_OK);
            sqlite3_close(other);
        }
        std::optional<Connection> writer;
        std::thread release;
        if (database == "busy") {
            writer.emplace(m_path);
            writer->execute("begin exclusive");
            release = std::thread([&] {
                QThread::msleep(300);
                writer->execute("commit");
            });
        }
        NameLists lists(m_path);
        lists.firstPane().setNames({u"kept"_s});
        lists.lastPane().setNames({u"kept"_s});
        QString failure;
        try {
            lists.RefreshLists(choice);
        } catch (const Failure& f) {
            failure = f.description();
        }
        if (release.joinable())
            release.join();
        QTEST(failure, "failure");
        QTEST(lists.firstPane().names().join(u','), "firstNames");
        QTEST(lists.lastPane().names().join(u','), "lastNames");
        QCOMPARE(QFile::exists(m_path), database != "missing");
    }

    // A statement changes the table it names, and no other.
    void statementsChangeTheirTable_data()
    {
        QTest::addColumn<QByteArray>("sql");
        QTest::addColumn<QString>("name"); // bound to the statement's ?, if it has one
        QTest::addColumn<QString>("rows");
        const auto row = [](const char* tag, const char* sql, QString name, QString rows) {
            QTest::newRow(tag) << QByteArray(sql) << name << rows;
        };
        row("female table", Sql::InsertBuiltInFirstName, u"Ann"_s, u"Terry,Mary,beth,O'Hara,Ann"_s);
        row("spaces kept", Sql::InsertUserFirstName, u" Ann "_s, u"cleo,Bo,Bo,AL, Ann "_s);
        row("last name", Sql::InsertBuiltInLastName, u"Lee"_s, u"smith,Jones,ADAMS,Jones,Lee"_s);
        const QString quote = u"x'); delete from user_lastname; --"_s;
        row("a quote is data", Sql::InsertUserLastName, quote, u"Yu,de Vries,"_s + quote);
        row("every Terry, case-blind", Sql::DeleteBuiltInMaleFirstName, u"TERRY"_s, u"adam,Zack"_s);
        row("apostrophe", Sql::DeleteBuiltInFemaleFirstName, u"O'Hara"_s, u"Terry,Mary,beth"_s);
        row("every Jones", Sql::DeleteBuiltInLastName, u"jones"_s, u"smith,ADAMS"_s);
        row("clear user first names", Sql::ClearUserFirstNames, QString(), QString());
        row("clear user last names", Sql::ClearUserLastNames, QString(), QString());
    }

    void statementsChangeTheirTable()
    {
        QFETCH(QByteArray, sql);
        QFETCH(QString, name);
        QFETCH(QString, rows);
        // The table a statement names: "insert into T ...", "delete from T ...".
        const QString table = QString::fromLatin1(sql).section(u' ', 2, 2);
        QStringList expected = everything();
        expected[DatabaseTables.indexOf(table)] = rows;
        Connection c(m_path);
        name.isNull() ? c.execute(sql.constData()) : c.execute(sql.constData(), name);
        QCOMPARE(everything(), expected);
    }

    // Only commit() keeps a transaction's work: a failure that unwinds through
    // it, whether a statement's or the caller's, leaves every table as it was.
    void aTransactionKeepsOnlyWhatIsCommitted_data()
    {
        QTest::addColumn<QString>("end"); // how the transaction ends after two inserts
        QTest::addColumn<QString>("rows");
        QTest::newRow("commit") << u"commit"_s << u"Yu,de Vries,Ann,Bo"_s;
        QTest::newRow("rollback") << u"rollback"_s << u"Yu,de Vries"_s;
        QTest::newRow("the caller fails") << u"throw"_s << u"Yu,de Vries"_s;
        QTest::newRow("a statement fails") << u"refused"_s << u"Yu,de Vries"_s;
    }

    void aTransactionKeepsOnlyWhatIsCommitted()
    {
        QFETCH(QString, end);
        Connection db(m_path);
        db.execute("create trigger refuse before insert on user_lastname when new.lastname = "
                   "'Bad' begin select raise(abort, 'no'); end");
        try {
            Connection::Transaction transaction(db);
            db.execute(Sql::InsertUserLastName, u"Ann"_s);
            db.execute(Sql::InsertUserLastName, u"Bo"_s);
            if (end == u"commit")
                transaction.commit();
            else if (end == u"rollback")
                transaction.rollback();
            else if (end == u"throw")
                throw Failure(u"the caller's"_s);
            else
                db.execute(Sql::InsertUserLastName, u"Bad"_s);
        } catch (const Failure&) {
        }
        QVERIFY(!db.inTransaction());
        QTEST(tableColumn(m_path, u"user_lastname"_s, u"*"_s).join(u','), "rows");
    }

    void shippedDatabaseHoldsTheBuiltInLists()
    {
        QList<qsizetype> counts;
        for (const QString& table : DatabaseTables)
            counts.append(tableColumn(QStringLiteral(QUILLANE_SHIPPED_DB), table, u"*"_s).size());
        QCOMPARE(counts, (QList<qsizetype>{1219, 4275, 88799, 0, 0}));
    }
};

QTEST_GUILESS_MAIN(TestDatabase)
#include "tst_database.moc"
