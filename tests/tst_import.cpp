// Importing names from text files: how a file's bytes become names, where
// they are stored, what the user is told, and that no file, however
// strange, harms the database.
#include "app/errorreport.h"
#include "names/listeditor.h"
#include "names/namelists.h"
#include "names/namesplitter.h"
#include "support/fakepointer.h"
#include "support/testenvironment.h"

#include <QFile>
#include <QRandomGenerator>
#include <QTemporaryFile>
#include <QTest>

#include <sqlite3.h>

using namespace Qt::StringLiterals;

namespace {

const QString ImportLocation = u"in Tessmark.Main.FileToListview "_s;

ListChoice userList()
{
    return {false, true, true, false, false};
}

QStringList texts(const std::vector<NameSplitter::Name>& names)
{
    QStringList result;
    for (const NameSplitter::Name& name : names)
        result.append(name.text);
    return result;
}

QString integrity(const QString& path)
{
    sqlite3* db = nullptr;
    sqlite3_open_v2(QFile::encodeName(path).constData(), &db, SQLITE_OPEN_READONLY, nullptr);
    sqlite3_stmt* stmt = nullptr;
    QString result = u"cannot check"_s;
    if (sqlite3_prepare_v2(db, "pragma integrity_check", -1, &stmt, nullptr) == SQLITE_OK &&
        sqlite3_step(stmt) == SQLITE_ROW)
        result = QString::fromUtf8(reinterpret_cast<const char*>(sqlite3_column_text(stmt, 0)));
    sqlite3_finalize(stmt);
    sqlite3_close(db);
    return result;
}

struct Rig {
    explicit Rig(ListChoice initial = userList())
        : choice(initial)
    {
    }

    QString writeFile(const QString& name, const QByteArray& bytes) const
    {
        const QString path = env.filePath(name);
        QFile file(path);
        if (!file.open(QIODevice::WriteOnly) || file.write(bytes) != bytes.size())
            qFatal("cannot write %s", qPrintable(path));
        return path;
    }
    QStringList firstNames() const
    {
        return tableColumn(env.databasePath(), u"user_firstname"_s, u"firstname"_s);
    }
    // The database is whole and the panes can be read from it.
    void verifyIntact()
    {
        QCOMPARE(integrity(env.databasePath()), u"ok"_s);
        lists.RefreshLists(choice);
    }

    TestEnvironment env;
    FakePointer pointer;
    ListChoice choice;
    NameLists lists{env.databasePath(), pointer};
    ListEditor editor{env.dialogs, env.databasePath(), lists, pointer, [this] { return choice; }};
};

} // namespace

class TestImport : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void splittingIntoNames_data()
    {
        QTest::addColumn<QByteArray>("bytes");
        QTest::addColumn<QStringList>("names");

        const QStringList abc{u"Ann"_s, u"Bo"_s, u"Cy"_s};
        QTest::newRow("LF only") << "Ann\nBo\nCy"_ba << abc;
        QTest::newRow("CR only") << "Ann\rBo\rCy"_ba << abc;
        QTest::newRow("CR LF") << "Ann\r\nBo\r\nCy"_ba << abc;
        QTest::newRow("final line end") << "Ann\r\nBo\r\nCy\r\n"_ba << abc;
        QTest::newRow("blank lines skipped") << "\r\n\nAnn\n\n\r\rBo\r\n\r\nCy\n\n"_ba << abc;
        QTest::newRow("a line of spaces is a name")
            << "Ann\n   \nBo\n"_ba << QStringList{u"Ann"_s, u"   "_s, u"Bo"_s};
        QTest::newRow("spaces and case kept") << " ann lee \n"_ba << QStringList{u" ann lee "_s};
        QTest::newRow("apostrophes removed")
            << "O'Brien\n'''\nD'Arcy'\n"_ba << QStringList{u"OBrien"_s, u"DArcy"_s};
        QTest::newRow("UTF-8 byte-order mark")
            << "\xEF\xBB\xBFZo\xC3\xAB\r\nBo"_ba << QStringList{u"Zoë"_s, u"Bo"_s};
        QTest::newRow("byte-order mark alone") << "\xEF\xBB\xBF"_ba << QStringList();
        QTest::newRow("UTF-16 with byte-order mark") << QByteArray("\xFF\xFE"
                                                                   "A\0n\0n\0\r\0\n\0Z\0o\0\xEB\0",
                                                                   18)
                                                     << QStringList{u"Ann"_s, u"Zoë"_s};
        QTest::newRow("NUL characters removed")
            << QByteArray("A\0nn\n\0\nBo", 10) << QStringList{u"Ann"_s, u"Bo"_s};
        QTest::newRow("invalid UTF-8 becomes U+FFFD")
            << "Ann\xFF\nBo"_ba << QStringList{u"Ann\uFFFD"_s, u"Bo"_s};
        QTest::newRow("tab kept") << "Ann\tLee\n"_ba << QStringList{u"Ann\tLee"_s};
        QTest::newRow("empty file") << QByteArray() << QStringList();
    }

    void splittingIntoNames()
    {
        QFETCH(QByteArray, bytes);
        QFETCH(QStringList, names);
        QCOMPARE(texts(NameSplitter::split(bytes)), names);

        // Read a byte at a time, the names are the same.
        NameSplitter splitter;
        std::vector<NameSplitter::Name> pieces;
        for (char byte : bytes)
            splitter.feed(QByteArrayView(&byte, 1), pieces);
        splitter.finish(pieces);
        QCOMPARE(texts(pieces), names);
    }

    void anOverlongNameKeepsOnlyItsLength()
    {
        const QByteArray line(3'000'000, 'x');
        const std::vector<NameSplitter::Name> names =
            NameSplitter::split(QByteArray(line + "\nBo"));
        QCOMPARE(names.size(), size_t(2));
        QVERIFY(names[0].overlong());
        QCOMPARE(names[0].length, qsizetype(3'000'000));
        QCOMPARE(names[0].text.size(), NameSplitter::MaxNameLength);
        QVERIFY(!names[1].overlong());
    }

    void importingAFile_data()
    {
        QTest::addColumn<QByteArray>("bytes");
        QTest::addColumn<QStringList>("stored");
        QTest::newRow("LF only") << "Cy\nAnn\nBo\n"_ba << QStringList{u"Cy"_s, u"Ann"_s, u"Bo"_s};
        QTest::newRow("CR only, no final line end")
            << "Cy\rAnn\rBo"_ba << QStringList{u"Cy"_s, u"Ann"_s, u"Bo"_s};
        QTest::newRow("CR LF, blank lines, spaces, O'Brien, BOM")
            << "\xEF\xBB\xBFZo\xC3\xAB\r\n\r\n  \r\nO'Brien\r\n"_ba
            << QStringList{u"Zoë"_s, u"  "_s, u"OBrien"_s};
    }

    void importingAFile()
    {
        QFETCH(QByteArray, bytes);
        QFETCH(QStringList, stored);
        Rig rig;
        rig.env.dialogs.answerOpen({rig.writeFile(u"names.txt"_s, bytes)});
        rig.editor.PushButton6_Click();

        QCOMPARE(rig.env.dialogs.shown.size(), 1);
        const FakeDialogs::Shown& dialog = rig.env.dialogs.shown.first();
        QCOMPARE(dialog.kind, FakeDialogs::Kind::Open);
        QCOMPARE(dialog.title, u"Load List(s) - Hold Ctrl to select multiple list files"_s);
        QCOMPARE(dialog.filter, u"Text Files (*.txt);;All Files (*)"_s);
        QCOMPARE(rig.firstNames(), stored);
        // The panes show the names sorted, after one refresh under the
        // hourglass that the import itself showed.
        QStringList sorted = stored;
        sorted.sort(Qt::CaseInsensitive);
        QCOMPARE(rig.lists.firstPane().names(), sorted);
        QCOMPARE(rig.pointer.history.first(), MousePointer::Hourglass);
        QCOMPARE(rig.pointer.value, MousePointer::Default);
        rig.verifyIntact();
    }

    void namesGoWhereTheSourceSends_data()
    {
        QTest::addColumn<ListChoice>("choice");
        QTest::addColumn<bool>("lastNames");
        QTest::addColumn<QString>("table");
        QTest::addColumn<QString>("column");
        QTest::addColumn<bool>("shown");
        QTest::newRow("built-in, Male Only: female table, not shown")
            << ListChoice{true, false, false, true, false} << false << u"system_ffirstname"_s
            << u"Ffirst"_s << false;
        QTest::newRow("built-in, Both: female table, shown")
            << ListChoice{true, false, true, false, false} << false << u"system_ffirstname"_s
            << u"Ffirst"_s << true;
        QTest::newRow("built-in last names") << ListChoice{true, false, true, false, false} << true
                                             << u"system_lastname"_s << u"Last"_s << true;
        QTest::newRow("user last names")
            << userList() << true << u"user_lastname"_s << u"lastname"_s << true;
    }

    void namesGoWhereTheSourceSends()
    {
        QFETCH(ListChoice, choice);
        QFETCH(bool, lastNames);
        QFETCH(QString, table);
        QFETCH(QString, column);
        QFETCH(bool, shown);
        Rig rig(choice);
        const QStringList before = tableColumn(rig.env.databasePath(), table, column);
        rig.env.dialogs.answerOpen({rig.writeFile(u"n.txt"_s, "Quillonne\nVarnwick\n")});
        if (lastNames)
            rig.editor.PushButton7_Click();
        else
            rig.editor.PushButton6_Click();
        QCOMPARE(tableColumn(rig.env.databasePath(), table, column),
                 before + QStringList({u"Quillonne"_s, u"Varnwick"_s}));
        const PaneModel& pane = lastNames ? rig.lists.lastPane() : rig.lists.firstPane();
        QCOMPARE(pane.names().contains(u"Varnwick"_s), shown);
        QVERIFY(rig.env.dialogs.messages().isEmpty());
    }

    void cancelChangesNothing()
    {
        Rig rig;
        rig.editor.PushButton7_Click();
        QCOMPARE(rig.env.dialogs.shown.size(), 1);
        QVERIFY(rig.pointer.history.isEmpty()); // no hourglass, no refresh
        QCOMPARE(rig.lists.lastPane().count(), 0);
    }

    void severalFilesInTheDialogsOrder()
    {
        Rig rig;
        const QString a = rig.writeFile(u"a.txt"_s, "Ann\n");
        const QString c = rig.writeFile(u"c.txt"_s, "Cy\n");
        const QString b = rig.writeFile(u"b.txt"_s, "Bo\n");
        const QString missing = rig.env.filePath(u"gone.txt"_s);
        rig.env.dialogs.answerOpen({c, missing, a, b});
        rig.editor.PushButton6_Click();

        QCOMPARE(rig.firstNames(), (QStringList{u"Cy"_s, u"Ann"_s, u"Bo"_s}));
        QCOMPARE(rig.env.dialogs.shown.size(), 2);
        const FakeDialogs::Shown& refusal = rig.env.dialogs.shown[1];
        QCOMPARE(refusal.text, u"File not found"_s);
        QCOMPARE(refusal.title, u"Quillane"_s);
        QCOMPARE(refusal.icon, MessageIcon::None);
        QCOMPARE(rig.lists.firstPane().names(), (QStringList{u"Ann"_s, u"Bo"_s, u"Cy"_s}));
        // One refresh at the end: the hourglass of the import, then the refresh's.
        QCOMPARE(rig.pointer.history.count(MousePointer::Hourglass), 2);
    }

    void aPathInTheRootFolderIsUsedAsGiven()
    {
        QTemporaryFile rootFile(u"/quillane-import-XXXXXX.txt"_s);
        if (!rootFile.open())
            QSKIP("the root folder is not writable here");
        rootFile.write("Rooted\n");
        rootFile.close();
        const QString path = rootFile.fileName();
        QCOMPARE(path.count(u'/'), 1);

        Rig rig;
        rig.env.dialogs.answerOpen({path, u"/quillane-no-such-file.txt"_s});
        rig.editor.PushButton6_Click();
        QCOMPARE(rig.firstNames(), QStringList{u"Rooted"_s});
        QCOMPARE(rig.env.dialogs.messages(), QStringList{u"File not found"_s});
    }

    void rejectedNamesAreReportedAndTheRestStays()
    {
        Rig rig;
        sqlite3* db = nullptr;
        sqlite3_open(QFile::encodeName(rig.env.databasePath()).constData(), &db);
        QCOMPARE(
            sqlite3_exec(db,
                         "create trigger refuse before insert on user_firstname "
                         "when new.firstname = 'Bad' begin select raise(abort, 'refused'); end",
                         nullptr, nullptr, nullptr),
            SQLITE_OK);
        sqlite3_close(db);

        rig.env.dialogs.answerOpen({rig.writeFile(u"n.txt"_s, "Ann\nBad\nBo\nBad\nCy\n")});
        rig.editor.PushButton6_Click();
        const QString report = errorReportText(u"refused"_s, ImportLocation, 50, ClosingLine::Long);
        QCOMPARE(rig.env.dialogs.messages(), (QStringList{report, report}));
        QCOMPARE(rig.firstNames(), (QStringList{u"Ann"_s, u"Bo"_s, u"Cy"_s}));
        rig.verifyIntact();
    }

    void reportsOfOneFileAreBounded()
    {
        Rig rig;
        QByteArray bytes;
        const int overlong = ListEditor::MaxReportsPerFile + 15;
        for (int i = 0; i < overlong; ++i)
            bytes += QByteArray("Ann\n" + QByteArray(300, 'x') + "\n");
        rig.env.dialogs.answerOpen({rig.writeFile(u"n.txt"_s, bytes)});
        rig.editor.PushButton6_Click();

        const QStringList messages = rig.env.dialogs.messages();
        QCOMPARE(messages.size(), ListEditor::MaxReportsPerFile + 1);
        QVERIFY(messages[0].startsWith(u"The name \"xxxxx"_s));
        QVERIFY(messages[0].contains(ImportLocation + u"at line 50"_s));
        QCOMPARE(messages.last(), errorReportText(u"15 more names of this file were not stored."_s,
                                                  ImportLocation, 60, ClosingLine::Long));
        QCOMPARE(rig.firstNames(), QStringList(overlong, u"Ann"_s));
    }

    void aFileThatIsNotTextHarmsNothing_data()
    {
        QTest::addColumn<QByteArray>("bytes");
        QRandomGenerator random(42);
        QByteArray noise(2 * 1024 * 1024, Qt::Uninitialized);
        for (char& byte : noise)
            byte = char(random.bounded(256));
        QTest::newRow("random bytes with NULs") << noise;
        QByteArray png("\x89PNG\r\n\x1A\n\0\0\0\rIHDR", 16);
        png += noise.left(100000);
        QTest::newRow("an image") << png;
        QTest::newRow("one line of 20 MB") << QByteArray(20 * 1024 * 1024, 'z');
        QTest::newRow("NULs only") << QByteArray(100000, '\0');
    }

    void aFileThatIsNotTextHarmsNothing()
    {
        QFETCH(QByteArray, bytes);
        Rig rig;
        rig.env.dialogs.answerOpen({rig.writeFile(u"odd.txt"_s, QByteArray(bytes + "\nAfter\n"))});
        rig.editor.PushButton6_Click();
        QVERIFY(rig.env.dialogs.messages().size() <= ListEditor::MaxReportsPerFile + 1);
        for (const QString& name : rig.firstNames()) {
            QVERIFY(!name.isEmpty() && name.size() <= NameSplitter::MaxNameLength);
            QVERIFY(!name.contains(u'\0') && !name.contains(u'\''));
        }
        QCOMPARE(rig.firstNames().last(), u"After"_s);
        rig.verifyIntact();
    }

    void aLargeFileKeepsTheTablesIndexes()
    {
        Rig rig;
        QByteArray bytes;
        for (int i = 0; i < 600000; ++i)
            bytes += QByteArray::number(999999 - i) + "\n";
        QVERIFY(bytes.size() > 4 * 1024 * 1024);
        rig.env.dialogs.answerOpen({rig.writeFile(u"big.txt"_s, bytes + "Zed\n")});
        rig.editor.PushButton6_Click();

        QVERIFY(rig.env.dialogs.messages().isEmpty());
        const QStringList stored = rig.firstNames();
        QCOMPARE(stored.size(), 600001);
        QCOMPARE(stored.first(), u"999999"_s); // in file order
        QCOMPARE(stored.last(), u"Zed"_s);
        QCOMPARE(tableColumn(rig.env.databasePath(), u"sqlite_master"_s, u"name"_s)
                     .contains(u"user_firstname_firstname"_s),
                 true);
        QCOMPARE(rig.lists.firstPane().names().first(), u"400000"_s);
        rig.verifyIntact();
    }

    void aLockedDatabaseIsReportedNotWaitedFor()
    {
        Rig rig;
        sqlite3* other = nullptr;
        sqlite3_open(QFile::encodeName(rig.env.databasePath()).constData(), &other);
        QCOMPARE(sqlite3_exec(other, "begin exclusive", nullptr, nullptr, nullptr), SQLITE_OK);

        rig.env.dialogs.answerOpen({rig.writeFile(u"n.txt"_s, "Ann\nBo\n")});
        rig.editor.PushButton6_Click();
        const QStringList messages = rig.env.dialogs.messages();
        QCOMPARE(messages.size(), 2);
        QCOMPARE(messages[0],
                 errorReportText(u"database is locked"_s, ImportLocation, 30, ClosingLine::Long));
        QCOMPARE(messages[1],
                 errorReportText(u"database is locked"_s, u"in Tessmark.Form1.PushButton6_Click "_s,
                                 30, ClosingLine::Long));
        QCOMPARE(rig.pointer.value, MousePointer::Default);

        sqlite3_exec(other, "rollback", nullptr, nullptr, nullptr);
        sqlite3_close(other);
        QVERIFY(rig.firstNames().isEmpty());
        rig.verifyIntact();
        // Once the lock is gone the same file imports.
        rig.env.dialogs.answerOpen({rig.env.filePath(u"n.txt"_s)});
        rig.editor.PushButton6_Click();
        QCOMPARE(rig.firstNames(), (QStringList{u"Ann"_s, u"Bo"_s}));
    }

    void aDeviceIsNotReadWithoutEnd()
    {
        Rig rig;
        rig.env.dialogs.answerOpen({u"/dev/zero"_s});
        rig.editor.PushButton6_Click();
        QCOMPARE(rig.env.dialogs.messages(),
                 QStringList{
                     errorReportText(u"This is not a file that names can be read from: /dev/zero"_s,
                                     ImportLocation, 20, ClosingLine::Long)});
        QVERIFY(rig.firstNames().isEmpty());
    }

    void aMissingDatabaseEndsTheFilesImport()
    {
        Rig rig;
        const QString path = rig.writeFile(u"n.txt"_s, "Ann\n");
        QFile::remove(rig.env.databasePath());
        rig.editor.FileToListview(path, ListKind::FirstNames);
        const QStringList messages = rig.env.dialogs.messages();
        QCOMPARE(messages.size(), 1);
        QVERIFY(messages[0].contains(ImportLocation + u"at line 10\r\r"_s));
        QVERIFY(!QFile::exists(rig.env.databasePath()));
    }
};

QTEST_MAIN(TestImport)
#include "tst_import.moc"
