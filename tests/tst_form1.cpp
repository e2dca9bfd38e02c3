// The main window: start-up from the stored choices, the option clicks, the
// panes, the count box, the "Help" message, and start-up with an unusable
// database.
#include "base/failure.h"
#include "support/program.h"

#include <QLineEdit>
#include <QRadioButton>

using namespace Qt::StringLiterals;

namespace {

// The last names of the built-in list as shipped.
constexpr int LastNames = 88799;

// What the window shows of the choice, by part: the selected options, the
// captions of the two buttons that follow the source, whether the gender
// options are enabled, the count, and how many names the first-name and the
// last-name pane hold.
QString shownChoice(QWidget& form)
{
    QStringList options;
    for (const QString& name : u"Option1 Option2 Option3 Option8 Option9"_s.split(u' '))
        if (control<QRadioButton>(form, name)->isChecked())
            options << name;
    return QStringList{options.join(u' '),
                       control<QAbstractButton>(form, u"PushButton3"_s)->text() + u' '
                           + control<QAbstractButton>(form, u"PushButton4"_s)->text(),
                       control<QWidget>(form, u"Option2"_s)->isEnabled() ? u"on"_s : u"off"_s,
                       control<QLineEdit>(form, u"Text1"_s)->text(),
                       u"%1 %2"_s.arg(shownRowCount(form, u"ListView2"_s))
                           .arg(shownRowCount(form, u"ListView1"_s))}
        .join(u'|');
}

} // namespace

class TestForm1 : public QObject {
    Q_OBJECT

private Q_SLOTS:
    // The user list holds "Zoe" and "al" as first names and "Quill" as a last
    // name. The built-in list has 1219 male and 4275 female first names,
    // 5163 together, and 88799 last names.
    void choices_data()
    {
        // Settings stored before start-up (key=value) and options clicked after it.
        QTest::addColumn<QString>("steps");
        QTest::addColumn<QString>("written"); // key=value ..., read back afterwards
        QTest::addColumn<QString>("shown");   // as shownChoice() puts it
        const QString builtIn = u"Option1 Option9|Delete Delete|on|%1|5163 88799"_s;
        const QString user = u"Option1 Option8|Clear Clear|off|100|2 1"_s;
        QTest::newRow("empty store") << u""_s << u"Text1=100"_s << builtIn.arg(100);
        QTest::newRow("user list stored") << u"Option9=False Option8=True"_s << u""_s << user;
        QTest::newRow("count stored empty") << u"Text1="_s << u"Text1="_s << builtIn.arg(u""_s);
        QTest::newRow("count text") << u"Text1=lots"_s << u"Text1=lots"_s << builtIn.arg(u"lots"_s);
        QTest::newRow("to user list") << u"Option8"_s << u"Option9=False Option8=True"_s << user;
        QTest::newRow("back to the built-in list keeps the gender")
            << u"Option3 Option8 Option9"_s
            << u"Option9=True Option8=False Option1=False Option2=False Option3=True"_s
            << u"Option3 Option9|Delete Delete|on|100|4275 88799"_s;
        QTest::newRow("male only clicked")
            << u"Option2"_s << u"Option1=False Option2=True Option3=False"_s
            << u"Option2 Option9|Delete Delete|on|100|1219 88799"_s;
    }

    void choices()
    {
        QFETCH(QString, steps);
        QFETCH(QString, written);
        QFETCH(QString, shown);
        TestEnvironment env;
        insertRows(env.databasePath(), u"user_firstname"_s, u"firstname"_s, {u"Zoe"_s, u"al"_s});
        insertRows(env.databasePath(), u"user_lastname"_s, u"lastname"_s, {u"Quill"_s});
        const QStringList all = steps.split(u' ', Qt::SkipEmptyParts);
        for (const QString& pair : all)
            if (pair.contains(u'='))
                env.settings->write(pair.section(u'=', 0, 0), pair.section(u'=', 1));
        const auto form = loadedForm1(env.environment, true);
        for (const QString& name : all)
            if (!name.contains(u'='))
                control<QRadioButton>(*form, name)->click();
        for (const QString& pair : written.split(u' ', Qt::SkipEmptyParts))
            QCOMPARE(env.settings->read(pair.section(u'=', 0, 0), u"<absent>"_s),
                     pair.section(u'=', 1));
        QCOMPARE(shownChoice(*form), shown);
    }

    // The focus selects the whole count, so typing replaces it; every
    // keystroke is written at once.
    void theCountBox()
    {
        TestEnvironment env;
        const auto form = loadedForm1(env.environment, true);
        QVERIFY(QTest::qWaitForWindowActive(form.get()));
        auto* text1 = control<QLineEdit>(*form, u"Text1"_s);
        control<QWidget>(*form, u"PushButton1"_s)->setFocus();
        text1->setFocus(Qt::TabFocusReason);
        QCOMPARE(text1->selectedText(), u"100"_s);
        QTest::keyClick(text1, Qt::Key_4);
        QCOMPARE(env.settings->read(u"Text1"_s, {}), u"4"_s);
        QTest::keyClick(text1, Qt::Key_2);
        QCOMPARE(env.settings->read(u"Text1"_s, {}), u"42"_s);
    }

    // A name removed from a pane stays in the database, and the next refresh
    // brings it back.
    void removingANameLastsUntilTheNextRefresh_data()
    {
        QTest::addColumn<bool>("selected");
        QTest::addColumn<bool>("byKey");
        QTest::newRow("Delete key") << true << true;
        QTest::newRow("double-click") << true << false;
        QTest::newRow("Delete key, nothing selected") << false << true;
    }

    void removingANameLastsUntilTheNextRefresh()
    {
        QFETCH(bool, selected);
        QFETCH(bool, byKey);
        TestEnvironment env;
        const auto form = loadedForm1(env.environment, true);
        QVERIFY(QTest::qWaitForWindowExposed(form.get()));
        auto* pane = control<QAbstractItemView>(*form, u"ListView1"_s);
        const QModelIndex second = pane->model()->index(1, 0);
        const QString name = second.data().toString();
        const QPoint at = pane->visualRect(second).center();
        pane->setCurrentIndex(second);
        if (!selected)
            pane->clearSelection();
        if (byKey) {
            QTest::keyClick(pane, Qt::Key_Delete);
        } else { // a double-click arrives as a click followed by the double-click
            QTest::mouseClick(pane->viewport(), Qt::LeftButton, {}, at);
            QTest::mouseDClick(pane->viewport(), Qt::LeftButton, {}, at);
        }
        QCOMPARE(shownRowCount(*form, u"ListView1"_s), LastNames - (selected ? 1 : 0));
        QCOMPARE(shownColumn(*form, u"ListView1"_s).contains(name), !selected);
        QVERIFY(tableColumn(env.databasePath(), u"system_lastname"_s, u"Last"_s).contains(name));
        control<QRadioButton>(*form, u"Option2"_s)->click();
        QCOMPARE(shownRowCount(*form, u"ListView1"_s), LastNames);
        QVERIFY(env.dialogs.shown.isEmpty());
    }

    void helpExplainsTheTwoSources()
    {
        TestEnvironment env;
        const auto form = loadedForm1(env.environment);
        QTest::mouseClick(control<QAbstractButton>(*form, u"PushButton8"_s), Qt::LeftButton);
        QCOMPARE(env.dialogs.messages(),
                 QStringList{u"You have two options for generating: \r\r"
                             "1. You can generate from Orvell's List which contains my collection "
                             "of first and last names.\r\r"
                             "2. You can generate using your User List. In this case, names can "
                             "be loaded from a text file or added one at a time."_s});
        QCOMPARE(env.dialogs.shown[0].title, u"Quillane"_s);
        QCOMPARE(env.dialogs.shown[0].icon, MessageIcon::None);
    }

    void startUpFailsWithoutAUsableDatabase_data()
    {
        QTest::addColumn<QByteArray>("content"); // of names.mdb; empty: no file
        QTest::addColumn<QString>("description");
        QTest::newRow("missing") << QByteArray() << u"%1: unable to open database file"_s;
        QTest::newRow("corrupt") << QByteArray(4096, 'x')
                                 << u"The file %1 is not a Quillane names database."_s;
    }

    // Start-up fails before the window is shown; the whole program then
    // shows the notice and ends with status 1.
    void startUpFailsWithoutAUsableDatabase()
    {
        QFETCH(QByteArray, content);
        QFETCH(QString, description);
        TestEnvironment env(false);
        if (!content.isEmpty())
            writeBytes(env.databasePath(), content);
        Form1 form(env.environment);
        QVERIFY_THROWS_EXCEPTION(Failure, form.Form_Load());
        QVERIFY(!form.isVisible());
        // The whole program shows the failure's description in its notice.
        QCOMPARE(runSelf({u"--start-program-in"_s, env.folder()}),
                 u"notice: Quillane|%1\nexit 1"_s.arg(description.arg(env.databasePath())));
    }
};

namespace {
// The child of the test above: the whole program in the folder given.
int startProgramIn(int& argc, char** argv)
{
    ChildProgram child(argc, argv);
    return runProgram(child.app, child.environment);
}
} // namespace

QUILLANE_TEST_MAIN_WITH_CHILD(TestForm1, "--start-program-in", startProgramIn)

#include "tst_form1.moc"
