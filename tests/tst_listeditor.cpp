// Adding, deleting and clearing names by hand: what reaches the tables and
// the panes, and what the user is told.
#include "app/listeditor.h"
#include "names/listoperations.h"
#include "names/namelists.h"
#include "support/fakepointer.h"
#include "support/testenvironment.h"

#include <QTest>

#include <optional>

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

    // A names database without names, copied for each case that needs one:
    // faster than making it anew.
    QTemporaryDir m_fixtures;
    const QString m_empty = m_fixtures.filePath(u"names.mdb"_s);

private Q_SLOTS:
    void initTestCase() { createEmptyDatabase(m_empty); }

    void clicking_data()
    {
        QTest::addColumn<Click>("c");
        const QString m = u"system_mfirstname"_s, f = u"system_ffirstname"_s, nq = u"Quillonne"_s;
        const QString uf = u"user_firstname"_s, ul = u"user_lastname"_s;
        const QString lee = u" Ann Lee "_s, on = u"o'Ne'il"_s;
        constexpr ClosingLine Short = ClosingLine::Short;
        // A name typed and stored, in the table given.
        const auto adds = [](ListChoice choice, int button, const QString& typed,
                             const QString& table, const QString& stored, bool shown = true) {
            return Click{choice, button, typed, {table}, stored, shown};
        };
        QTest::newRow("add: cancel") << Click{.choice = User, .button = 2};
        QTest::newRow("add: spaces only") << Click{.choice = User, .button = 5, .input = u"   "_s};
        QTest::newRow("add: apostrophes only")
            << Click{.choice = User, .button = 2, .input = u"'''"_s};
        // Only spaces make a reply blank; a control character is refused.
        QTest::newRow("add: a no-break space") << adds(User, 5, u"\u00A0"_s, ul, u"\u00A0"_s);
        QTest::newRow("add: a line break")
            << Click{.choice = User, .button = 5, .input = u"Ann\nLee"_s, .reports = {30}};
        QTest::newRow("add: spaces kept") << adds(User, 2, lee, uf, lee);
        QTest::newRow("add: apostrophes out") << adds(User, 5, on, ul, u"oNeil"_s);
        QTest::newRow("add: built-in, Male Only") << adds(MaleOnly, 2, nq, f, nq, false);
        QTest::newRow("delete: Both, an apostrophe")
            << Click{.choice = Both, .button = 4, .input = u"O'Quill"_s, .tables = {m, f}};
        QTest::newRow("none selected")
            << Click{.choice = Both, .button = 4, .reports = {20, 30}, .closing = Short};
        QTest::newRow("none selected, last") << Click{.choice = Both, .button = 3, .reports = {40}};
        QTest::newRow("clear first names, none selected")
            << Click{.choice = User, .button = 4, .tables = {uf}};
        // The first delete's step fails, and the rest is not tried.
        QTest::newRow("delete, no database") << Click{.choice = Both,
                                                      .button = 4,
                                                      .reports = {10, 20, 70},
                                                      .closing = Short,
                                                      .noDatabase = true};
        QTest::newRow("add, no database")
            << Click{.choice = Both, .button = 2, .reports = {10, 50}, .noDatabase = true};
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

    // Typed names, all of them or none: every one is checked before the
    // list changes. 255 characters (UTF-16 code units) at most, counted
    // after the apostrophes go (the limit's every side: tst_import).
    void addingSeveralNames_data()
    {
        QTest::addColumn<QStringList>("typed");
        QTest::addColumn<ListChoice>("choice");
        QTest::addColumn<QString>("stored"); // user_lastname afterwards, joined by '|'
        QTest::addColumn<QString>("failure");
        QTest::addColumn<bool>("joined"); // to the caller's transaction, which it rolls back
        const QString x254(254, u'x'), a127 = u"a"_s + QString(u"\U0001F600"_s).repeated(127);
        const auto tooLong = [](const QString& name) {
            return u"The name \"%1...\" is longer than 255 characters and was not stored."_s.arg(
                name.left(40));
        };
        const auto row = [](const char* tag, const QStringList& typed, const QString& stored,
                            const QString& failure = {}, ListChoice choice = User,
                            bool joined = false) {
            QTest::newRow(tag) << typed << choice << stored << failure << joined;
        };
        row("255 code units in 128 characters", {a127}, u"Old|"_s + a127);
        row("256 code units", {u"Ann"_s, a127 + u'b'}, u"Old"_s, tooLong(a127));
        row("255 once the apostrophes go", {x254 + u"'y'"_s}, u"Old|"_s + x254 + u'y');
        row("a CR", {u"Ann"_s, u"Ann\rLee"_s}, u"Old"_s,
            u"The name \"Ann\\rLee\" holds a control character and was not stored."_s);
        row("a line separator", {u"Ann\u2028Lee"_s}, u"Old"_s,
            u"The name \"Ann\\u2028Lee\" holds a control character and was not stored."_s);
        row("a rule refuses the second", {u"Ann"_s, u"Bad"_s, u"Bo"_s}, u"Old"_s, u"no"_s);
        row("a blank one", {u"Ann"_s, u"  "_s}, u"Old"_s,
            u"The name \"  \" is blank: nothing was added."_s);
        row("a paragraph separator", {u"Ann\u2029Lee"_s}, u"Old"_s,
            u"The name \"Ann\\u2029Lee\" holds a control character and was not stored."_s);
        row("no source chosen", {u"Ann"_s, u"  "_s}, u"Old"_s, {}, ListChoice{.builtIn = false});
        row("joined to the caller's", {u"Ann"_s}, u"Old"_s, {}, User, true);
    }

    void addingSeveralNames()
    {
        QFETCH(QStringList, typed);
        QFETCH(ListChoice, choice);
        QTemporaryDir folder;
        const QString db = folder.filePath(u"names.mdb"_s);
        QVERIFY(QFile::copy(m_empty, db));
        insertRows(db, u"user_lastname"_s, u"lastname"_s, {u"Old"_s});
        const QMap<QString, QStringList> others = snapshot(db);
        std::optional<Connection> connection;
        connection.emplace(db).execute(
            "create trigger refuse before insert on user_lastname when new.lastname = 'Bad' "
            "begin select raise(abort, 'no'); end");
        QFETCH(bool, joined);
        std::optional<Connection::Transaction> callers;
        if (joined)
            callers.emplace(*connection);
        QString failure;
        try {
            addNames([&]() -> Connection& { return *connection; }, ListKind::LastNames, choice,
                     typed, BlankNames::Refuse);
        } catch (const Failure& f) {
            failure = f.description();
        }
        QCOMPARE(connection->inTransaction(), joined);
        callers.reset();
        connection.reset();
        QTEST(failure, "failure");
        QTEST(tableColumn(db, u"user_lastname"_s, u"*"_s).join(u'|'), "stored");
        QMap<QString, QStringList> all = snapshot(db);
        all[u"user_lastname"_s] = others[u"user_lastname"_s];
        QCOMPARE(all, others);
    }

    // Deleting first names from the built-in list: all of them or, when a
    // failure ends the delete, none; a step that traps a refused statement
    // goes on with the next, unless the refusal undid the transaction.
    void deletingNames_data()
    {
        QTest::addColumn<ListChoice>("choice");
        QTest::addColumn<QStringList>("names");
        QTest::addColumn<bool>("refuseAbsent");
        QTest::addColumn<QByteArray>("rule"); // how a rule refuses deleting the male Bo
        QTest::addColumn<bool>("trapped");
        QTest::addColumn<QStringList>("after"); // the male and female first names
        QTest::addColumn<QStringList>("failures");
        const ListChoice noGender{.both = false};
        const QString both = u"Ann,Bo"_s, ann = u"Ann"_s;
        const QStringList bo{u"Bo"_s}, boZed{u"Bo"_s, u"Zed"_s}, no{u"no"_s};
        const auto row = [](const char* tag, ListChoice choice, const QStringList& names,
                            bool refuseAbsent, const char* rule, bool trapped, QString m, QString f,
                            const QStringList& failures = {}) {
            QTest::newRow(tag) << choice << names << refuseAbsent << QByteArray(rule) << trapped
                               << QStringList{m, f} << failures;
        };
        row("no gender chosen", noGender, bo, true, "", false, both, both);
        row("an absent name ignored", Both, boZed, false, "", false, ann, ann);
        row("an absent name refused", Both, boZed, true, "", false, both, both,
            {u"\"Zed\" is not in the list: nothing was deleted."_s});
        row("refused", Both, bo, false, "abort", false, both, both, no);
        row("refused, trapped", Both, bo, false, "abort", true, both, ann, no);
        row("undone, trapped", Both, bo, false, "rollback", true, both, both, no);
    }

    void deletingNames()
    {
        QFETCH(ListChoice, choice);
        QFETCH(QStringList, names);
        QFETCH(bool, refuseAbsent);
        QFETCH(QByteArray, rule);
        QFETCH(bool, trapped);
        QTemporaryDir folder;
        const QString db = folder.filePath(u"names.mdb"_s);
        QVERIFY(QFile::copy(m_empty, db));
        for (qsizetype t = 0; t < Tables.size(); ++t)
            insertRows(db, Tables[t], Columns[t], {u"Ann"_s, u"Bo"_s});
        std::optional<Connection> connection;
        connection.emplace(db);
        if (!rule.isEmpty())
            connection->execute(QByteArray("create trigger refuse before delete on "
                                           "system_mfirstname when old.Mfirst = 'Bo' begin "
                                           "select raise("
                                           + rule + ", 'no'); end")
                                    .constData());
        const QMap<QString, QStringList> before = snapshot(db);
        QStringList failures;
        const StatementStep trap = [&](const char*, const std::function<void()>& work) {
            try {
                work();
                return true;
            } catch (const Failure& f) {
                failures += f.description();
                return false;
            }
        };
        try {
            ::deleteNames([&]() -> Connection& { return *connection; }, ListKind::FirstNames,
                          choice, names, refuseAbsent ? AbsentNames::Refuse : AbsentNames::Ignore,
                          trapped ? trap : StatementStep());
        } catch (const Failure& f) {
            failures += f.description();
        }
        QVERIFY(!connection->inTransaction());
        connection.reset();
        QTEST(failures, "failures");
        QMap<QString, QStringList> all = snapshot(db);
        QTEST((QStringList{all.take(Tables[0]).join(u','), all.take(Tables[1]).join(u',')}),
              "after");
        for (const QString& table : all.keys())
            QCOMPARE(all[table], before[table]);
    }
};

QTEST_MAIN(TestListEditor)
#include "tst_listeditor.moc"