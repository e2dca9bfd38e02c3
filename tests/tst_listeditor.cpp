// Adding, deleting and clearing names by hand: what reaches the tables and
// the panes, and what the user is told.
#include "app/form1.h"
#include "support/controls.h"
#include "support/fakepointer.h"
#include "support/testenvironment.h"

#include <QAbstractButton>
#include <QTest>

using namespace Qt::StringLiterals;

namespace {

const ListChoice Both{.builtIn = true, .user = false, .both = true, .male = false, .female = false};
const ListChoice MaleOnly{
    .builtIn = true, .user = false, .both = false, .male = true, .female = false};
const ListChoice User{.builtIn = false, .user = true, .both = true, .male = false, .female = false};
const QStringList &Tables = DatabaseTables, &Columns = DatabaseColumns;

QMap<QString, QStringList> snapshot(const QString& db)
{
    QMap<QString, QStringList> all;
    for (qsizetype t = 0; t < Tables.size(); ++t)
        all[Tables[t]] = tableColumn(db, Tables[t], Columns[t]);
    return all;
}

// One click of an editing button: 2 and 5 add a first and a last name, 4 and
// 3 delete (or, on the user list, clear) the first and the last names.
struct Click {
    ListChoice choice;
    int button;
    QString input = {};      // the reply typed or the name selected; null: cancel or none
    QStringList tables = {}; // where the name is stored, or deleted from
    QString stored = {};     // the name as stored
    bool shown = false;      // the pane shows the stored or the selected name afterwards
    QList<int> reports = {}; // the lines of the error reports, in order
    ClosingLine closing = ClosingLine::Long;
    bool noDatabase = false; // removed after the panes are filled
};

} // namespace

class TestListEditor : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void clicking_data()
    {
        QTest::addColumn<Click>("c");
        const QString m = u"system_mfirstname"_s, f = u"system_ffirstname"_s, nq = u"Quillonne"_s;
        const QString uf = u"user_firstname"_s, ul = u"user_lastname"_s, l = u"system_lastname"_s;
        const QString lee = u" Ann Lee "_s, on = u"o'Ne'il"_s;
        constexpr ClosingLine Short = ClosingLine::Short;
        QTest::newRow("add: cancel") << Click{.choice = User, .button = 2};
        QTest::newRow("add: empty") << Click{.choice = User, .button = 2, .input = u""_s};
        QTest::newRow("add: spaces only") << Click{.choice = User, .button = 5, .input = u"   "_s};
        QTest::newRow("add: apostrophes only")
            << Click{.choice = User, .button = 2, .input = u"'''"_s};
        // Only spaces make a reply blank; a control character is refused.
        QTest::newRow("add: a no-break space") << Click{.choice = User,
                                                        .button = 5,
                                                        .input = u"\u00A0"_s,
                                                        .tables = {ul},
                                                        .stored = u"\u00A0"_s,
                                                        .shown = true};
        QTest::newRow("add: a tab")
            << Click{.choice = User, .button = 2, .input = u"\t"_s, .reports = {30}};
        QTest::newRow("add: a line break")
            << Click{.choice = User, .button = 5, .input = u"Ann\nLee"_s, .reports = {30}};
        QTest::newRow("add: spaces kept") << Click{.choice = User,
                                                   .button = 2,
                                                   .input = lee,
                                                   .tables = {uf},
                                                   .stored = lee,
                                                   .shown = true};
        QTest::newRow("add: apostrophes out") << Click{.choice = User,
                                                       .button = 5,
                                                       .input = on,
                                                       .tables = {ul},
                                                       .stored = u"oNeil"_s,
                                                       .shown = true};
        QTest::newRow("add: built-in, Male Only")
            << Click{.choice = MaleOnly, .button = 2, .input = nq, .tables = {f}, .stored = nq};
        QTest::newRow("add: built-in last name") << Click{.choice = MaleOnly,
                                                          .button = 5,
                                                          .input = nq,
                                                          .tables = {l},
                                                          .stored = nq,
                                                          .shown = true};
        QTest::newRow("delete: Both, an apostrophe")
            << Click{.choice = Both, .button = 4, .input = u"O'Quill"_s, .tables = {m, f}};
        QTest::newRow("none selected")
            << Click{.choice = Both, .button = 4, .reports = {20, 30}, .closing = Short};
        QTest::newRow("none selected, last") << Click{.choice = Both, .button = 3, .reports = {40}};
        QTest::newRow("clear first names, none selected")
            << Click{.choice = User, .button = 4, .tables = {uf}};
        QTest::newRow("PushButton2")
            << Click{.choice = Both, .button = 2, .reports = {10, 50}, .noDatabase = true};
        QTest::newRow("PushButton5")
            << Click{.choice = Both, .button = 5, .reports = {10, 50}, .noDatabase = true};
        // An empty pane's button does no database work: the missing file goes unnoticed.
        QTest::newRow("empty pane") << Click{.choice = User, .button = 3, .noDatabase = true};
    }

    void clicking()
    {
        QFETCH(Click, c);
        const bool adding = c.button == 2 || c.button == 5;
        TestEnvironment env;
        FakePointer pointer;
        const QString db = env.databasePath();
        // A name in every table twice, as an older database may hold it: a delete takes both.
        for (qsizetype t = 0; t < Tables.size() && !c.noDatabase; ++t)
            insertRows(db, Tables[t], Columns[t], {u"O'Quill"_s, u"O'Quill"_s});
        NameLists lists(db);
        lists.RefreshLists(c.choice);
        pointer.history.clear();
        ListEditor editor(env.dialogs, db, lists, pointer, [&] { return c.choice; });
        PaneModel& pane = c.button % 2 ? lists.lastPane() : lists.firstPane();
        const bool refreshes = adding || pane.count() > 0;
        QMap<QString, QStringList> want = snapshot(db);
        for (const QString& t : c.tables) { // a user list is cleared whole
            want[t].removeIf([&](auto& n) { return !adding && (c.choice.user || n == c.input); });
            want[t] += adding ? QStringList{c.stored} : QStringList();
        }
        QVERIFY(!c.noDatabase || QFile::remove(db));
        env.dialogs.answerInput(c.input); // null: cancel
        const int row = int(pane.names().indexOf(c.input));
        adding ? (c.button == 2 ? editor.PushButton2_Click() : editor.PushButton5_Click())
               : (c.button == 4 ? editor.PushButton4_Click(row) : editor.PushButton3_Click(row));

        const QStringList messages = env.dialogs.messages();
        QCOMPARE(messages.size(), c.reports.size());
        const QString location = u"in Tessmark.Form1.PushButton%1_Click "_s.arg(c.button);
        for (int i = 0; i < c.reports.size(); ++i)
            QVERIFY(messages[i].endsWith(errorReportText({}, location, c.reports[i], c.closing)));
        const QString prompt = c.button == 2 ? u"Input first name: "_s : u"Input last name: "_s;
        const FakeDialogs::Shown& box = env.dialogs.shown.value(c.noDatabase); // after a report
        QVERIFY(!adding || (box.text == prompt && box.title == u"Quillane"_s));
        QCOMPARE(c.noDatabase ? want : snapshot(db), want);
        QCOMPARE(QFile::exists(db), !c.noDatabase); // never made anew
        QCOMPARE(pointer.history.contains(MousePointer::Hourglass), refreshes);
        QCOMPARE(pane.names().contains(adding ? c.stored : c.input), c.shown);
    }

    void theWindowsButtonsEditTheLists()
    {
        TestEnvironment env;
        Form1 form(env.environment);
        env.dialogs.answerInput(u"Quillonne"_s);
        control<QAbstractButton>(form, u"PushButton2"_s)->click();
        control<QAbstractItemView>(form, u"ListView2"_s)->keyboardSearch(u"Quillonne"_s);
        control<QAbstractButton>(form, u"PushButton4"_s)->click();
        QVERIFY(!shownColumn(form, u"ListView2"_s).contains(u"Quillonne"_s));
        QVERIFY(env.dialogs.messages().isEmpty()); // so the name was there to select
    }
};

QTEST_MAIN(TestListEditor)
#include "tst_listeditor.moc"