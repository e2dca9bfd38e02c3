// "Start Generating" and the results window: the refusals as the user sees
// them, the rows, "< Back", saving, and the window itself. The progress bar
// and each output choice: tst_form1; the pointer over its controls:
// tst_routines.
#include "app/form1.h"
#include "app/form2.h"
#include "support/controls.h"
#include "support/testenvironment.h"

#include <QTest>
#include <QtWidgets>

using namespace Qt::StringLiterals;

class TestForm2 : public QObject {
    Q_OBJECT

    std::unique_ptr<TestEnvironment> env;
    std::unique_ptr<Form1> form;

    // Types the count and presses "Start Generating".
    void generate(const QString& count)
    {
        control<QLineEdit>(*form, u"Text1"_s)->setText(count);
        control<QPushButton>(*form, u"PushButton1"_s)->click();
    }
    Form2& results() { return *form->resultsWindow(); }
    void click(const QString& name) { control<QAbstractButton>(results(), name)->click(); }

private Q_SLOTS:
    // Every test starts from a first run of two rows of Ann Lee, the main
    // window over an empty database with its panes filled by hand.
    void init()
    {
        env = std::make_unique<TestEnvironment>(false);
        createEmptyDatabase(env->databasePath());
        form = std::make_unique<Form1>(env->environment);
        form->Form_Load();
        form->lists().firstPane().setNames({u"ann"_s});
        form->lists().lastPane().setNames({u"LEE"_s});
        form->show();
        generate(u"2"_s);
    }
    void cleanup() { form.reset(); }

    // A second run over the row's panes: either one message refuses it, in
    // the order the checks run, leaving the first run's rows and the main
    // window showing, or its rows replace the first run's.
    void secondRun_data()
    {
        QTest::addColumn<QStringList>("firsts");
        QTest::addColumn<QStringList>("lasts");
        QTest::addColumn<QString>("count");
        QTest::addColumn<QString>("message");
        QTest::addColumn<QStringList>("firstNames"); // the results list's first column

        const QStringList none, F{u"ann"_s, u"bo"_s}, L{u"lee"_s}, kept(2, u"Ann"_s);
        const QStringList john{u"JOHN"_s}, mac{u"mcdonald"_s}, johns(3, u"John"_s);
        const QStringList blank{u"  "_s}, blanks(2, QString());
        const QString ok, noFirst = u"You must add a first name"_s;
        const QString noLast = u"You must add a last name"_s;
        const QString notANumber = u"How many does not appear to be a number."_s;
        const QString tooMany = u"You must select an amount less than one million."_s;
        QTest::newRow("both panes empty") << none << none << u"5"_s << noFirst << kept;
        QTest::newRow("not a number, a pane empty") << F << none << u"x"_s << noLast << kept;
        QTest::newRow("not a number, panes full") << F << L << u"x"_s << notANumber << kept;
        QTest::newRow("too many, before the panes") << none << none << u"2e6"_s << tooMany << kept;
        QTest::newRow("zero: empty list") << F << L << u"0"_s << ok << none;
        QTest::newRow("negative: empty list") << F << L << u"-12"_s << ok << none;
        QTest::newRow("one-item panes") << john << mac << u"3"_s << ok << johns;
        QTest::newRow("spaces only: empty name") << blank << L << u"2"_s << ok << blanks;
    }

    void secondRun()
    {
        QFETCH(QStringList, firsts);
        QFETCH(QStringList, lasts);
        QFETCH(QString, count);
        QFETCH(QString, message);
        click(u"PushButton8"_s);
        form->lists().firstPane().setNames(firsts);
        form->lists().lastPane().setNames(lasts);

        generate(count);
        QCOMPARE(env->dialogs.messages().join(u'\n'), message);
        for (const FakeDialogs::Shown& shown : env->dialogs.shown) // plain, not an error report
            QVERIFY(shown.title == u"Quillane"_s && shown.icon == MessageIcon::None);
        QTEST(shownColumn(results(), u"ListView1"_s), "firstNames");
        QCOMPARE(form->isVisible(), !message.isEmpty());
        QCOMPARE(results().isVisible(), message.isEmpty());
        QCOMPARE(form->pointer().mousePointer(), MousePointer::Default);
    }

    // "< Back" only hides the window: the rows and the output choice stay,
    // the next run shows the same window, and its columns are added once.
    void backKeepsTheRowsAndTheChoice()
    {
        click(u"Option6"_s);
        for (int run = 0; run < 3; ++run) {
            click(u"PushButton8"_s);
            QVERIFY(form->isVisible() && !results().isVisible());
            QCOMPARE(shownColumn(results(), u"ListView1"_s), QStringList(2, u"Ann"_s));
            generate(u"2"_s);
        }
        QVERIFY(control<QRadioButton>(results(), u"Option6"_s)->isChecked());
        QCOMPARE(control<QTableView>(results(), u"ListView1"_s)->horizontalHeader()->count(), 2);
    }

    void aRetypedFirstNameIsSavedUntilTheNextRun()
    {
        QAbstractItemModel* model = control<QTableView>(results(), u"ListView1"_s)->model();
        QVERIFY(model->setData(model->index(1, 0), u"Zoe"_s, Qt::EditRole));
        env->dialogs.answerSave(env->filePath(u"names.txt"_s));
        click(u"PushButton2"_s);
        QCOMPARE(fileBytes(env->filePath(u"names.txt"_s)), QByteArray("Ann Lee\r\nZoe Lee\r\n"));
        click(u"PushButton8"_s);
        generate(u"2"_s);
        QCOMPARE(shownColumn(results(), u"ListView1"_s), QStringList(2, u"Ann"_s));
    }

    // The program's own names database is never replaced by the results: one
    // error report. (The other ways of naming it: tst_saving.)
    void savingOverTheNamesDatabaseIsRefused()
    {
        const QByteArray before = fileBytes(env->databasePath());
        env->dialogs.answerSave(env->databasePath());
        click(u"PushButton2"_s);
        QCOMPARE(env->dialogs.messages().size(), 1);
        QVERIFY2(env->dialogs.messages().constFirst().contains(u"it is the names database"_s),
                 qPrintable(env->dialogs.messages().constFirst()));
        QCOMPARE(fileBytes(env->databasePath()), before);
    }

    void closingTheResultsWindowEndsTheProgram()
    {
        QTimer::singleShot(0, &results(), [&] { results().close(); });
        // Only a safety net: a program that does not end fails instead of hanging.
        QTimer::singleShot(10000, qApp, [] { QCoreApplication::exit(1); });
        QCOMPARE(QApplication::exec(), 0);
    }
};

QTEST_MAIN(TestForm2)
#include "tst_form2.moc"
