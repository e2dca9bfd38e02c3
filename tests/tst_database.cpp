// The names database: what each query of the catalogue shows in the panes,
// what the inserts and deletes do, and how engine failures reach the caller.
#include "app/failure.h"
#include "app/pointer.h"
#include "names/database.h"
#include "names/namelists.h"
#include "support/fakepointer.h"
#include "support/testenvironment.h"

#include <QFile>
#include <QTest>

using namespace Qt::StringLiterals;

namespace {

ListChoice builtIn(bool both, bool male, bool female)
{
    return {true, false, both, male, female};
}

ListChoice userList()
{
    return {false, true, true, false, false};
}

} // namespace

class TestDatabase : public QObject {
    Q_OBJECT

private:
    QTemporaryDir m_dir;
    QString m_path;

private Q_SLOTS:
    void init()
    {
        m_path = m_dir.filePath(u"names.mdb"_s);
        QFile::remove(m_path);
        createEmptyDatabase(m_path);
        insertRows(m_path, u"system_mfirstname"_s, u"Mfirst"_s,
                   {u"Terry"_s, u"adam"_s, u"Zack"_s, u"Terry"_s});
        insertRows(m_path, u"system_ffirstname"_s, u"Ffirst"_s,
                   {u"Terry"_s, u"Mary"_s, u"beth"_s, u"O'Hara"_s});
        insertRows(m_path, u"system_lastname"_s, u"Last"_s,
                   {u"smith"_s, u"Jones"_s, u"ADAMS"_s, u"Jones"_s});
        insertRows(m_path, u"user_firstname"_s, u"firstname"_s,
                   {u"cleo"_s, u"Bo"_s, u"Bo"_s, u"AL"_s});
        insertRows(m_path, u"user_lastname"_s, u"lastname"_s, {u"Yu"_s, u"de Vries"_s});
    }

    void panesShowEachQuery_data()
    {
        QTest::addColumn<ListChoice>("choice");
        QTest::addColumn<QStringList>("firstNames");
        QTest::addColumn<QStringList>("lastNames");

        const QStringList builtInLast{u"ADAMS"_s, u"Jones"_s, u"Jones"_s, u"smith"_s};
        QTest::newRow("built-in, both: union, each name once, case-blind order")
            << builtIn(true, false, false)
            << QStringList{u"adam"_s, u"beth"_s, u"Mary"_s, u"O'Hara"_s, u"Terry"_s, u"Zack"_s}
            << builtInLast;
        QTest::newRow("built-in, male only: distinct")
            << builtIn(false, true, false) << QStringList{u"adam"_s, u"Terry"_s, u"Zack"_s}
            << builtInLast;
        QTest::newRow("built-in, female only")
            << builtIn(false, false, true)
            << QStringList{u"beth"_s, u"Mary"_s, u"O'Hara"_s, u"Terry"_s} << builtInLast;
        QTest::newRow("user list: duplicates shown twice")
            << userList() << QStringList{u"AL"_s, u"Bo"_s, u"Bo"_s, u"cleo"_s}
            << QStringList{u"de Vries"_s, u"Yu"_s};
    }

    void panesShowEachQuery()
    {
        QFETCH(ListChoice, choice);
        QFETCH(QStringList, firstNames);
        QFETCH(QStringList, lastNames);

        FakePointer pointer;
        NameLists lists(m_path, pointer);
        lists.RefreshLists(choice);
        QCOMPARE(lists.firstPane().names(), firstNames);
        QCOMPARE(lists.lastPane().names(), lastNames);
        QCOMPARE(pointer.history, (QList<int>{MousePointer::Hourglass, MousePointer::Default}));
    }

    void groupWithoutSelectionKeepsPanes_data()
    {
        QTest::addColumn<ListChoice>("choice");
        QTest::addColumn<bool>("lastPaneKept");
        QTest::newRow("no gender selected") << ListChoice{true, false, false, false, false} << false;
        QTest::newRow("no source selected") << ListChoice{false, false, true, false, false} << true;
    }

    void groupWithoutSelectionKeepsPanes()
    {
        QFETCH(ListChoice, choice);
        QFETCH(bool, lastPaneKept);

        FakePointer pointer;
        NameLists lists(m_path, pointer);
        lists.firstPane().setNames({u"kept"_s});
        lists.lastPane().setNames({u"kept"_s});
        lists.RefreshLists(choice);
        QCOMPARE(lists.firstPane().names(), QStringList{u"kept"_s});
        QCOMPARE(lists.lastPane().names() == QStringList{u"kept"_s}, lastPaneKept);
    }

    void statementsChangeTheirTable_data()
    {
        QTest::addColumn<QByteArray>("sql");
        QTest::addColumn<QString>("name");
        QTest::addColumn<QString>("table");
        QTest::addColumn<QString>("column");
        QTest::addColumn<QStringList>("expected");

        QTest::newRow("insert built-in first name")
            << QByteArray(Sql::InsertBuiltInFirstName) << u"Ann"_s << u"system_ffirstname"_s
            << u"Ffirst"_s << QStringList{u"Terry"_s, u"Mary"_s, u"beth"_s, u"O'Hara"_s, u"Ann"_s};
        QTest::newRow("insert user first name keeps spaces")
            << QByteArray(Sql::InsertUserFirstName) << u" Ann "_s << u"user_firstname"_s
            << u"firstname"_s
            << QStringList{u"cleo"_s, u"Bo"_s, u"Bo"_s, u"AL"_s, u" Ann "_s};
        QTest::newRow("insert built-in last name")
            << QByteArray(Sql::InsertBuiltInLastName) << u"Lee"_s << u"system_lastname"_s
            << u"Last"_s
            << QStringList{u"smith"_s, u"Jones"_s, u"ADAMS"_s, u"Jones"_s, u"Lee"_s};
        QTest::newRow("insert user last name")
            << QByteArray(Sql::InsertUserLastName) << u"Lee"_s << u"user_lastname"_s
            << u"lastname"_s << QStringList{u"Yu"_s, u"de Vries"_s, u"Lee"_s};
        QTest::newRow("delete male first name, every equal row, case-blind")
            << QByteArray(Sql::DeleteBuiltInMaleFirstName) << u"TERRY"_s
            << u"system_mfirstname"_s << u"Mfirst"_s << QStringList{u"adam"_s, u"Zack"_s};
        QTest::newRow("delete a shipped name that holds an apostrophe")
            << QByteArray(Sql::DeleteBuiltInFemaleFirstName) << u"O'Hara"_s
            << u"system_ffirstname"_s << u"Ffirst"_s
            << QStringList{u"Terry"_s, u"Mary"_s, u"beth"_s};
        QTest::newRow("delete last name")
            << QByteArray(Sql::DeleteBuiltInLastName) << u"jones"_s << u"system_lastname"_s
            << u"Last"_s << QStringList{u"smith"_s, u"ADAMS"_s};
        QTest::newRow("a quote in a name is data, not SQL")
            << QByteArray(Sql::InsertUserLastName) << u"x'); delete from user_lastname; --"_s
            << u"user_lastname"_s << u"lastname"_s
            << QStringList{u"Yu"_s, u"de Vries"_s, u"x'); delete from user_lastname; --"_s};
    }

    void statementsChangeTheirTable()
    {
        QFETCH(QByteArray, sql);
        QFETCH(QString, name);
        QFETCH(QString, table);
        QFETCH(QString, column);
        QFETCH(QStringList, expected);

        Connection(m_path).execute(sql.constData(), name);
        QCOMPARE(tableColumn(m_path, table, column), expected);
    }

    void clearingEmptiesOneUserList()
    {
        Connection(m_path).execute(Sql::ClearUserFirstNames);
        QVERIFY(tableColumn(m_path, u"user_firstname"_s, u"firstname"_s).isEmpty());
        QCOMPARE(tableColumn(m_path, u"user_lastname"_s, u"lastname"_s).size(), 2);
        Connection(m_path).execute(Sql::ClearUserLastNames);
        QVERIFY(tableColumn(m_path, u"user_lastname"_s, u"lastname"_s).isEmpty());
    }

    void unusableDatabaseFailsWithEngineMessage_data()
    {
        QTest::addColumn<QByteArray>("content"); // empty: no file at all
        QTest::addColumn<QString>("message");
        QTest::newRow("missing") << QByteArray() << u"unable to open database file"_s;
        QTest::newRow("not a database")
            << QByteArray("this is a text file, not a database, and it is long enough to "
                          "fill the header of one.\n")
                   .repeated(20)
            << u"file is not a database"_s;
    }

    void unusableDatabaseFailsWithEngineMessage()
    {
        QFETCH(QByteArray, content);
        QFETCH(QString, message);

        QFile::remove(m_path);
        if (!content.isEmpty()) {
            QFile file(m_path);
            QVERIFY(file.open(QIODevice::WriteOnly));
            file.write(content);
        }
        FakePointer pointer;
        NameLists lists(m_path, pointer);
        lists.firstPane().setNames({u"kept"_s});
        try {
            lists.RefreshLists(builtIn(true, false, false));
            QFAIL("no failure");
        } catch (const Failure& failure) {
            QCOMPARE(failure.description(), message);
        }
        QCOMPARE(lists.firstPane().names(), QStringList{u"kept"_s});
        QCOMPARE(pointer.value, MousePointer::Default);
        QCOMPARE(QFile::exists(m_path), !content.isEmpty()); // never created
    }

    void shippedDatabaseHoldsTheBuiltInLists()
    {
        const QString shipped = m_dir.filePath(u"shipped.mdb"_s);
        QFile::remove(shipped);
        QVERIFY(QFile::copy(QString::fromUtf8(QUILLANE_SHIPPED_DB), shipped));
        QCOMPARE(tableColumn(shipped, u"system_mfirstname"_s, u"Mfirst"_s).size(), 1219);
        QCOMPARE(tableColumn(shipped, u"system_ffirstname"_s, u"Ffirst"_s).size(), 4275);
        QCOMPARE(tableColumn(shipped, u"system_lastname"_s, u"Last"_s).size(), 88799);
        QVERIFY(tableColumn(shipped, u"user_firstname"_s, u"firstname"_s).isEmpty());
        QVERIFY(tableColumn(shipped, u"user_lastname"_s, u"lastname"_s).isEmpty());
    }
};

QTEST_GUILESS_MAIN(TestDatabase)
#include "tst_database.moc"
