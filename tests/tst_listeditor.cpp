// Adding, deleting and clearing names by hand: what reaches the tables and
// the panes, and what the user is told.
#include "app/errorreport.h"
#include "app/form1.h"
#include "names/listeditor.h"
#include "names/namelists.h"
#include "support/fakepointer.h"
#include "support/testenvironment.h"

#include <QPushButton>
#include <QRadioButton>
#include <QTest>
#include <QTableView>

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

struct Table {
    QString name;
    QString column;
};

const QList<Table> AllTables{{u"system_mfirstname"_s, u"Mfirst"_s},
                             {u"system_ffirstname"_s, u"Ffirst"_s},
                             {u"system_lastname"_s, u"Last"_s},
                             {u"user_firstname"_s, u"firstname"_s},
                             {u"user_lastname"_s, u"lastname"_s}};

Table table(const QString& name)
{
    for (const Table& t : AllTables) {
        if (t.name == name)
            return t;
    }
    qFatal("no table %s", qPrintable(name));
}

// The editor over a fresh copy of the shipped database. start() fills the
// panes for the choice as the window shows them before a click.
struct Rig {
    explicit Rig(ListChoice initial)
        : choice(initial)
    {
    }
    void start()
    {
        lists.RefreshLists(choice);
        pointer.history.clear();
    }

    QStringList column(const QString& tableName) const
    {
        const Table t = table(tableName);
        return tableColumn(env.databasePath(), t.name, t.column);
    }
    QList<QStringList> snapshot() const
    {
        QList<QStringList> all;
        for (const Table& t : AllTables)
            all.append(tableColumn(env.databasePath(), t.name, t.column));
        return all;
    }
    bool refreshed() const { return pointer.history.contains(MousePointer::Hourglass); }

    TestEnvironment env;
    FakePointer pointer;
    ListChoice choice;
    NameLists lists{env.databasePath(), pointer};
    ListEditor editor{env.dialogs, env.databasePath(), lists, pointer, [this] { return choice; }};
};

} // namespace

class TestListEditor : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void addingStoresTheTypedName_data()
    {
        QTest::addColumn<ListChoice>("choice");
        QTest::addColumn<int>("kind");
        QTest::addColumn<QStringList>("replies"); // none: the user cancels
        QTest::addColumn<QString>("table");
        QTest::addColumn<QStringList>("stored");
        QTest::addColumn<bool>("shownInPane");

        const int first = int(ListKind::FirstNames);
        const int last = int(ListKind::LastNames);
        QTest::newRow("cancel") << userList() << first << QStringList() << u"user_firstname"_s
                                << QStringList() << false;
        QTest::newRow("empty reply") << userList() << first << QStringList{u""_s}
                                     << u"user_firstname"_s << QStringList() << false;
        QTest::newRow("spaces only") << userList() << last << QStringList{u"   "_s}
                                     << u"user_lastname"_s << QStringList() << false;
        QTest::newRow("apostrophes only") << userList() << first << QStringList{u"'''"_s}
                                          << u"user_firstname"_s << QStringList() << false;
        QTest::newRow("apostrophes and spaces only")
            << builtIn(true, false, false) << last << QStringList{u" ' "_s} << u"system_lastname"_s
            << QStringList() << false;
        QTest::newRow("spaces around the name kept")
            << userList() << first << QStringList{u"  Ann Lee "_s} << u"user_firstname"_s
            << QStringList{u"  Ann Lee "_s} << true;
        QTest::newRow("apostrophes removed, case kept")
            << userList() << last << QStringList{u"o'Ne'il"_s} << u"user_lastname"_s
            << QStringList{u"oNeil"_s} << true;
        QTest::newRow("built-in, Both: female table, shown")
            << builtIn(true, false, false) << first << QStringList{u"Quillonne"_s}
            << u"system_ffirstname"_s << QStringList{u"Quillonne"_s} << true;
        QTest::newRow("built-in, Male Only: female table, not shown")
            << builtIn(false, true, false) << first << QStringList{u"Quillonne"_s}
            << u"system_ffirstname"_s << QStringList{u"Quillonne"_s} << false;
        QTest::newRow("built-in, Female Only: female table, shown")
            << builtIn(false, false, true) << first << QStringList{u"Quillonne"_s}
            << u"system_ffirstname"_s << QStringList{u"Quillonne"_s} << true;
        QTest::newRow("built-in last name")
            << builtIn(false, true, false) << last << QStringList{u"Varnwick"_s}
            << u"system_lastname"_s << QStringList{u"Varnwick"_s} << true;
        QTest::newRow("user first name, letters beyond ASCII")
            << userList() << first << QStringList{u"Zoë Ørsted"_s} << u"user_firstname"_s
            << QStringList{u"Zoë Ørsted"_s} << true;
        QTest::newRow("no source chosen: nothing stored")
            << ListChoice{false, false, true, false, false} << first << QStringList{u"Nobody"_s}
            << u"user_firstname"_s << QStringList() << false;
    }

    void addingStoresTheTypedName()
    {
        QFETCH(ListChoice, choice);
        QFETCH(int, kind);
        QFETCH(QStringList, replies);
        QFETCH(QString, table);
        QFETCH(QStringList, stored);
        QFETCH(bool, shownInPane);

        Rig rig(choice);
        rig.start();
        const QList<QStringList> before = rig.snapshot();
        for (const QString& reply : replies)
            rig.env.dialogs.answerInput(reply);
        const bool firstNames = ListKind(kind) == ListKind::FirstNames;
        if (firstNames)
            rig.editor.PushButton2_Click();
        else
            rig.editor.PushButton5_Click();

        QCOMPARE(rig.env.dialogs.shown.size(), 1);
        const FakeDialogs::Shown& box = rig.env.dialogs.shown.first();
        QCOMPARE(box.kind, FakeDialogs::Kind::Input);
        QCOMPARE(box.text, firstNames ? u"Input first name: "_s : u"Input last name: "_s);
        QCOMPARE(box.title, u"Quillane"_s);

        const QList<QStringList> after = rig.snapshot();
        for (int t = 0; t < AllTables.size(); ++t) {
            const QStringList expected =
                AllTables[t].name == table ? before[t] + stored : before[t];
            QCOMPARE(after[t], expected);
        }
        // The panes are filled again whether or not a name was stored.
        QVERIFY(rig.refreshed());
        const PaneModel& pane = firstNames ? rig.lists.firstPane() : rig.lists.lastPane();
        for (const QString& name : stored)
            QCOMPARE(pane.names().contains(name), shownInPane);
    }

    void overlongTypedNameIsRefused()
    {
        Rig rig(userList());
        rig.start();
        rig.env.dialogs.answerInput(QString(300, u'x'));
        rig.editor.PushButton2_Click();
        const QStringList messages = rig.env.dialogs.messages();
        QCOMPARE(messages.size(), 1);
        QVERIFY(messages[0].contains(u"in Tessmark.Form1.PushButton2_Click at line 30"_s));
        QVERIFY(messages[0].endsWith(u"Please email screenshot of this message to "_s +
                                     SupportAddress));
        QVERIFY(rig.column(u"user_firstname"_s).isEmpty());
    }

    void deletingFromTheBuiltInList_data()
    {
        QTest::addColumn<ListChoice>("choice");
        QTest::addColumn<int>("kind");
        QTest::addColumn<QString>("selected"); // empty: nothing selected
        QTest::addColumn<QStringList>("goneFrom");
        QTest::addColumn<QStringList>("keptIn");
        QTest::addColumn<QList<int>>("reportLines");

        const int first = int(ListKind::FirstNames);
        const int last = int(ListKind::LastNames);
        const QString male = u"system_mfirstname"_s;
        const QString female = u"system_ffirstname"_s;
        QTest::newRow("Both: male and female tables")
            << builtIn(true, false, false) << first << u"Quillon"_s << QStringList{male, female}
            << QStringList() << QList<int>();
        QTest::newRow("Male Only: male table only")
            << builtIn(false, true, false) << first << u"Quillon"_s << QStringList{male}
            << QStringList{female} << QList<int>();
        QTest::newRow("Female Only: female table only")
            << builtIn(false, false, true) << first << u"Quillon"_s << QStringList{female}
            << QStringList{male} << QList<int>();
        QTest::newRow("last name")
            << builtIn(true, false, false) << last << u"Quillon"_s
            << QStringList{u"system_lastname"_s} << QStringList() << QList<int>();
        QTest::newRow("name with an apostrophe, Both")
            << builtIn(true, false, false) << first << u"O'Quill"_s << QStringList{male, female}
            << QStringList() << QList<int>();
        QTest::newRow("last name with an apostrophe")
            << builtIn(true, false, false) << last << u"O'Quill"_s
            << QStringList{u"system_lastname"_s} << QStringList() << QList<int>();
        QTest::newRow("no selection, Both: one report per delete")
            << builtIn(true, false, false) << first << QString() << QStringList()
            << QStringList{male, female} << QList<int>{20, 30};
        QTest::newRow("no selection, Female Only")
            << builtIn(false, false, true) << first << QString() << QStringList()
            << QStringList{male, female} << QList<int>{30};
        QTest::newRow("no selection, last names")
            << builtIn(false, true, false) << last << QString() << QStringList()
            << QStringList{u"system_lastname"_s} << QList<int>{40};
    }

    void deletingFromTheBuiltInList()
    {
        QFETCH(ListChoice, choice);
        QFETCH(int, kind);
        QFETCH(QString, selected);
        QFETCH(QStringList, goneFrom);
        QFETCH(QStringList, keptIn);
        QFETCH(QList<int>, reportLines);

        Rig rig(choice);
        // Names shipped in the tables, some twice, beside the real ones.
        const QString db = rig.env.databasePath();
        for (const QString& name : {u"Quillon"_s, u"O'Quill"_s}) {
            insertRows(db, u"system_mfirstname"_s, u"Mfirst"_s, {name});
            insertRows(db, u"system_ffirstname"_s, u"Ffirst"_s, {name, name});
            insertRows(db, u"system_lastname"_s, u"Last"_s, {name, name});
        }
        rig.start();

        const bool firstNames = ListKind(kind) == ListKind::FirstNames;
        const PaneModel& pane = firstNames ? rig.lists.firstPane() : rig.lists.lastPane();
        const int row = selected.isEmpty() ? -1 : int(pane.names().indexOf(selected));
        QVERIFY(selected.isEmpty() || row >= 0);
        const int namesBefore = pane.count();
        if (firstNames)
            rig.editor.PushButton4_Click(row);
        else
            rig.editor.PushButton3_Click(row);

        const QString marker = selected.isEmpty() ? u"Quillon"_s : selected;
        for (const QString& t : goneFrom)
            QVERIFY2(!rig.column(t).contains(marker), qPrintable(t));
        for (const QString& t : keptIn)
            QVERIFY2(rig.column(t).contains(marker), qPrintable(t));

        QStringList expected;
        const QString location = firstNames ? u"in Tessmark.Form1.PushButton4_Click "_s
                                            : u"in Tessmark.Form1.PushButton3_Click "_s;
        for (int line : reportLines)
            expected.append(errorReportText(u"No name is selected in the list."_s, location, line,
                                            firstNames ? ClosingLine::Short : ClosingLine::Long));
        QCOMPARE(rig.env.dialogs.messages(), expected);
        QVERIFY(rig.refreshed());
        if (goneFrom.isEmpty())
            QCOMPARE(pane.count(), namesBefore);
        else
            QVERIFY(!pane.names().contains(marker));
    }

    void clearingEmptiesOneUserList_data()
    {
        QTest::addColumn<int>("kind");
        QTest::addColumn<int>("selectedRow");
        QTest::newRow("first names, a name selected") << int(ListKind::FirstNames) << 1;
        QTest::newRow("first names, nothing selected") << int(ListKind::FirstNames) << -1;
        QTest::newRow("last names, a name selected") << int(ListKind::LastNames) << 0;
        QTest::newRow("last names, nothing selected") << int(ListKind::LastNames) << -1;
    }

    void clearingEmptiesOneUserList()
    {
        QFETCH(int, kind);
        QFETCH(int, selectedRow);
        Rig rig(userList());
        const QStringList firsts{u"Ann"_s, u"Bo"_s, u"Bo"_s};
        const QStringList lasts{u"Yu"_s, u"de Vries"_s};
        insertRows(rig.env.databasePath(), u"user_firstname"_s, u"firstname"_s, firsts);
        insertRows(rig.env.databasePath(), u"user_lastname"_s, u"lastname"_s, lasts);
        rig.start();
        const QList<QStringList> before = rig.snapshot();

        const bool firstNames = ListKind(kind) == ListKind::FirstNames;
        if (firstNames)
            rig.editor.PushButton4_Click(selectedRow);
        else
            rig.editor.PushButton3_Click(selectedRow);

        QVERIFY(rig.env.dialogs.shown.isEmpty()); // no question, no message
        QCOMPARE(rig.column(u"user_firstname"_s), firstNames ? QStringList() : firsts);
        QCOMPARE(rig.column(u"user_lastname"_s), firstNames ? lasts : QStringList());
        QCOMPARE(rig.lists.firstPane().count(), firstNames ? 0 : 3);
        QCOMPARE(rig.lists.lastPane().count(), firstNames ? 2 : 0);
        // The built-in list is untouched.
        const QList<QStringList> after = rig.snapshot();
        for (int t = 0; t < 3; ++t)
            QCOMPARE(after[t], before[t]);
    }

    void anEmptyPaneDoesNothing_data()
    {
        QTest::addColumn<int>("kind");
        QTest::newRow("first names") << int(ListKind::FirstNames);
        QTest::newRow("last names") << int(ListKind::LastNames);
    }

    void anEmptyPaneDoesNothing()
    {
        QFETCH(int, kind);
        Rig rig(userList());
        rig.start();
        QFile::remove(rig.env.databasePath()); // any database work would fail loudly
        if (ListKind(kind) == ListKind::FirstNames)
            rig.editor.PushButton4_Click(-1);
        else
            rig.editor.PushButton3_Click(-1);
        QVERIFY(rig.env.dialogs.shown.isEmpty());
        QVERIFY(rig.pointer.history.isEmpty());
    }

    void aMissingDatabaseIsReportedAndTheHandlerGoesOn()
    {
        Rig rig(userList());
        rig.start();
        QFile::remove(rig.env.databasePath());
        rig.env.dialogs.answerInput(u"Ann"_s);
        rig.editor.PushButton5_Click();
        const QStringList messages = rig.env.dialogs.messages();
        // Opening, the insert and the refresh each fail in turn.
        QCOMPARE(messages.size(), 3);
        QVERIFY(messages[0].contains(u"in Tessmark.Form1.PushButton5_Click at line 10\r\r"_s));
        QVERIFY(messages[1].startsWith(u"The names database is not open.\r\n"_s));
        QVERIFY(messages[2].contains(u"in Tessmark.Form1.PushButton5_Click at line 50\r\r"_s));
        QVERIFY(!QFile::exists(rig.env.databasePath())); // never created
        QCOMPARE(rig.pointer.value, MousePointer::Default);
    }

    // The window's buttons reach the editor: a user adds, deletes and clears
    // and sees the panes follow.
    void theWindowsButtonsEditTheLists()
    {
        TestEnvironment env;
        Form1 form(env.environment);
        form.Form_Load();
        auto* firstPane = form.findChild<QTableView*>(u"ListView2"_s);
        auto* lastPane = form.findChild<QTableView*>(u"ListView1"_s);
        const auto names = [](QTableView* view) {
            return static_cast<PaneModel*>(view->model())->names();
        };

        env.dialogs.answerInput(u"Quillonne"_s);
        form.findChild<QPushButton*>(u"PushButton2"_s)->click();
        QVERIFY(names(firstPane).contains(u"Quillonne"_s));

        const int row = int(names(firstPane).indexOf(u"Quillonne"_s));
        firstPane->setCurrentIndex(firstPane->model()->index(row, 0));
        form.findChild<QPushButton*>(u"PushButton4"_s)->click();
        QVERIFY(!names(firstPane).contains(u"Quillonne"_s));

        form.findChild<QRadioButton*>(u"Option8"_s)->click();
        env.dialogs.answerInput(u"Varnwick"_s);
        form.findChild<QPushButton*>(u"PushButton5"_s)->click();
        QCOMPARE(names(lastPane), QStringList{u"Varnwick"_s});
        form.findChild<QPushButton*>(u"PushButton3"_s)->click();
        QVERIFY(names(lastPane).isEmpty());
        QVERIFY(env.dialogs.messages().isEmpty());
    }
};

QTEST_MAIN(TestListEditor)
#include "tst_listeditor.moc"
