// The main window: start-up from the stored choices, the option clicks, every
// control of the windows clicked with every table checked afterwards, the
// count box and its bound, the report cap of a loaded file, the progress bar,
// what a screen reader says, the titles the window system shows, and
// start-up with an unusable database.
#include "app/form2.h"
#include "app/qtdialogs.h"
#include "base/failure.h"
#include "support/program.h"

#include <QAccessible>
#include <QGroupBox>
#include <QLineEdit>
#include <QProgressBar>
#include <QRadioButton>
#include <QSignalSpy>
#include <QTimer>
#include <QWindow>

#include <functional>
#include <numeric>
#include <utility>

using namespace Qt::StringLiterals;

namespace {

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
                       u"%1 %2"_s.arg(shownColumn(form, u"ListView2"_s).size())
                           .arg(shownColumn(form, u"ListView1"_s).size())}
        .join(u'|');
}

// The title the window system gets for a window: Qt's integration appends
// " \u2014 " and the application's display name to every other title when
// the program has set a display name; one not set follows the
// application's name.
QString shownTitle(QWidget* window)
{
    const QString title = window->windowHandle()->title();
    const QString name = QCoreApplication::applicationName();
    QCoreApplication::setApplicationName(u"?"_s);
    const QString displayName = QGuiApplication::applicationDisplayName();
    QCoreApplication::setApplicationName(name);
    if (displayName == u"?"_s || title.endsWith(displayName))
        return title;
    return title + u" \u2014 "_s + displayName;
}

// Runs an action that opens a modal dialog, closes the dialog as soon as it
// is up, and returns the title the window system got for it.
QString dialogTitle(const std::function<void()>& action)
{
    QString title = u"<no dialog>"_s;
    QTimer poll;
    QObject::connect(&poll, &QTimer::timeout, [&] {
        if (QWidget* dialog = QApplication::activeModalWidget()) {
            title = shownTitle(dialog);
            dialog->close();
        }
    });
    poll.start(20);
    action();
    return title;
}

// Every table of the names database, its names in storage order, the
// tables in the shared order, separated by "|".
QString allTables(const QString& db)
{
    QStringList tables;
    for (qsizetype t = 0; t < DatabaseTables.size(); ++t)
        tables << tableColumn(db, DatabaseTables[t], DatabaseColumns[t]).join(u' ');
    return tables.join(u'|');
}

// A fresh program folder whose every table holds names: Bo is both a male
// and a female first name.
void fillAllTables(TestEnvironment& env)
{
    createEmptyDatabase(env.databasePath());
    const QStringList names = u"Adam Bo|Cleo Bo|Lee Moss|Zoe Al|Quill Rook"_s.split(u'|');
    for (qsizetype t = 0; t < DatabaseTables.size(); ++t)
        insertRows(env.databasePath(), DatabaseTables[t], DatabaseColumns[t], names[t].split(u' '));
}

// Selects the row of the pane that shows the name.
QAbstractItemView* selectName(QWidget& form, const QString& paneAndName)
{
    auto* pane = control<QAbstractItemView>(form, paneAndName.section(u':', 0, 0));
    const QStringList shown = shownColumn(form, pane->objectName());
    pane->setCurrentIndex(
        pane->model()->index(int(shown.indexOf(paneAndName.section(u':', 1))), 0));
    return pane;
}

} // namespace

class TestForm1 : public QObject {
    Q_OBJECT

    QList<int> m_painted; // the values of the progress bar's paints

    bool eventFilter(QObject* watched, QEvent* event) override
    {
        if (event->type() == QEvent::Paint)
            m_painted.append(qobject_cast<QProgressBar*>(watched)->value());
        return false;
    }

private Q_SLOTS:
    // The user list holds "Zoe" and "al" as first names and "Quill" as a last
    // name. The built-in list has 4275 female first names, 5163 of either
    // gender, and 88799 last names.
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
        // A screen reader says what each button and frame shows, "Clear" too.
        for (QWidget* widget : form->findChildren<QWidget*>()) {
            const auto* button = qobject_cast<QAbstractButton*>(widget);
            const auto* frame = qobject_cast<QGroupBox*>(widget);
            if (button || frame)
                QCOMPARE(QAccessible::queryAccessibleInterface(widget)->text(QAccessible::Name),
                         button ? button->text() : frame->title());
        }
    }

    void clickingEverything_data()
    {
        // What the user does, in order: a control's name clicks it (Form2.
        // for the results window's; Check1 is the splash's box, clicked during
        // its pause), input= and file= answer the next prompt or file dialog
        // (a file's lines separated by commas), save answers the save dialog,
        // Text1= types the count, select= and double= select and double-click
        // a pane's name, unselect= leaves a pane's current name unselected,
        // key= presses Delete (or the key after a colon) on a pane. A name
        // removed from a pane is back at the next refresh.
        QTest::addColumn<QString>("steps");
        QTest::addColumn<QString>("tables"); // allTables() afterwards
        // The first and the last names shown, the messages, the results
        // shown, what reached outside the program.
        QTest::addColumn<QString>("shown");
        const QString start = u"Adam Bo|Cleo Bo|Lee Moss|Zoe Al|Quill Rook"_s;
        const QString both = u"Adam Bo Cleo|Lee Moss|0"_s, user = u"Al Zoe|Quill Rook|0"_s;
        const auto row = [](const char* tag, const QString& steps, const QString& tables,
                            QString shown) {
            while (shown.count(u'|') < 4)
                shown += u'|';
            QTest::newRow(tag) << steps << tables << shown;
        };
        row("Male Only", u"Option2"_s, start, u"Adam Bo|Lee Moss|0"_s);
        row("Female Only", u"Option3"_s, start, u"Bo Cleo|Lee Moss|0"_s);
        row("Both", u"Option2 Option1"_s, start, both);
        row("User List", u"Option8"_s, start, user);
        row("Orvell's List", u"Option8 Option9"_s, start, both);
        row("Add First Name", u"input=Nia PushButton2"_s,
            u"Adam Bo|Cleo Bo Nia|Lee Moss|Zoe Al|Quill Rook"_s, u"Adam Bo Cleo Nia|Lee Moss|0"_s);
        row("Add Last Name", u"input=Nia PushButton5"_s,
            u"Adam Bo|Cleo Bo|Lee Moss Nia|Zoe Al|Quill Rook"_s, u"Adam Bo Cleo|Lee Moss Nia|0"_s);
        row("Add First Name, user", u"Option8 input=Nia PushButton2"_s,
            u"Adam Bo|Cleo Bo|Lee Moss|Zoe Al Nia|Quill Rook"_s, u"Al Nia Zoe|Quill Rook|0"_s);
        row("Add Last Name, user", u"Option8 input=Nia PushButton5"_s,
            u"Adam Bo|Cleo Bo|Lee Moss|Zoe Al|Quill Rook Nia"_s, u"Al Zoe|Nia Quill Rook|0"_s);
        row("Delete first name, Both", u"select=ListView2:Bo PushButton4"_s,
            u"Adam|Cleo|Lee Moss|Zoe Al|Quill Rook"_s, u"Adam Cleo|Lee Moss|0"_s);
        row("Delete first name, Male Only", u"Option2 select=ListView2:Bo PushButton4"_s,
            u"Adam|Cleo Bo|Lee Moss|Zoe Al|Quill Rook"_s, u"Adam|Lee Moss|0"_s);
        row("Delete first name, Female Only", u"Option3 select=ListView2:Bo PushButton4"_s,
            u"Adam Bo|Cleo|Lee Moss|Zoe Al|Quill Rook"_s, u"Cleo|Lee Moss|0"_s);
        row("Delete last name", u"select=ListView1:Moss PushButton3"_s,
            u"Adam Bo|Cleo Bo|Lee|Zoe Al|Quill Rook"_s, u"Adam Bo Cleo|Lee|0"_s);
        row("Clear first names", u"Option8 PushButton4"_s,
            u"Adam Bo|Cleo Bo|Lee Moss||Quill Rook"_s, u"|Quill Rook|0"_s);
        row("Clear last names", u"Option8 select=ListView1:Rook PushButton3"_s,
            u"Adam Bo|Cleo Bo|Lee Moss|Zoe Al|"_s, u"Al Zoe||0"_s);
        row("Load First Names", u"file=Nia,Ola PushButton6"_s,
            u"Adam Bo|Cleo Bo Nia Ola|Lee Moss|Zoe Al|Quill Rook"_s,
            u"Adam Bo Cleo Nia Ola|Lee Moss|0"_s);
        // Names too long to store are reported, ten at most, the rest in one
        // more report (its text: tst_import); the names that fit are stored
        // all the same.
        const QString overlong = QString(256, u'x') + u',';
        const auto tooLong = [&](int n) -> QString {
            return u"file="_s + overlong.repeated(n) + u"Nia PushButton6"_s;
        };
        const QString nia = u"Adam Bo|Cleo Bo Nia|Lee Moss|Zoe Al|Quill Rook"_s;
        row("10 names too long", tooLong(10), nia, u"Adam Bo Cleo Nia|Lee Moss|10"_s);
        row("12 names too long", tooLong(12), nia, u"Adam Bo Cleo Nia|Lee Moss|11"_s);
        row("Load Last Names", u"file=Nia PushButton7"_s,
            u"Adam Bo|Cleo Bo|Lee Moss Nia|Zoe Al|Quill Rook"_s, u"Adam Bo Cleo|Lee Moss Nia|0"_s);
        row("Load First Names, user", u"Option8 file=Nia PushButton6"_s,
            u"Adam Bo|Cleo Bo|Lee Moss|Zoe Al Nia|Quill Rook"_s, u"Al Nia Zoe|Quill Rook|0"_s);
        row("Load Last Names, user", u"Option8 file=Nia PushButton7"_s,
            u"Adam Bo|Cleo Bo|Lee Moss|Zoe Al|Quill Rook Nia"_s, u"Al Zoe|Nia Quill Rook|0"_s);
        row("Help", u"PushButton8"_s, start, u"Adam Bo Cleo|Lee Moss|1"_s);
        row("Delete key", u"select=ListView2:Bo key=ListView2"_s, start, u"Adam Cleo|Lee Moss|0"_s);
        row("another key", u"select=ListView1:Moss key=ListView1:L"_s, start, both);
        row("Delete key, nothing selected",
            u"select=ListView1:Moss unselect=ListView1 key=ListView1"_s, start, both);
        row("Delete key, then a refresh", u"select=ListView1:Moss key=ListView1 Option2"_s, start,
            u"Adam Bo|Lee Moss|0"_s);
        row("double-click", u"double=ListView1:Moss"_s, start, u"Adam Bo Cleo|Lee|0"_s);
        row("double-click, first names", u"double=ListView2:Adam"_s, start,
            u"Bo Cleo|Lee Moss|0"_s);
        row("Start Generating", u"Text1=3 PushButton1"_s, start, both + u"|3 rows"_s);
        row("< Back", u"PushButton1 Form2.PushButton8"_s, start, both + u"|back"_s);
        row("Text File", u"PushButton1 Form2.Option5 Form2.Option4 save Form2.PushButton2"_s, start,
            both + u"|100 rows|saved"_s);
        row("Excel (2 cells)", u"PushButton1 Form2.Option5 Form2.PushButton2"_s, start,
            both + u"|100 rows|opened"_s);
        row("Excel (1 cell)", u"PushButton1 Form2.Option6 Form2.PushButton2"_s, start,
            both + u"|100 rows|opened"_s);
        row("Hide this at next startup", u"Check1"_s, start, both + u"||ShowAgain=1"_s);
        // The bound of the count box; half a name rounds to the even count.
        row("1000000", u"Text1=1000000 PushButton1"_s, start, both + u"|1000000 rows"_s);
        row("1000000.5", u"Text1=1000000.5 PushButton1"_s, start, both + u"|1000000 rows"_s);
        row("1000001", u"Text1=1000001 PushButton1"_s, start, u"Adam Bo Cleo|Lee Moss|1"_s);
    }

    // Each button, option and command with names in every table: the one
    // table it should change changes, and every other table stays as it was.
    void clickingEverything()
    {
        QFETCH(QString, steps);
        TestEnvironment env(false);
        fillAllTables(env);
        bool ticked = false; // once: the pause may end in more than one wait
        if (steps.contains(u"Check1"_s)) {
            QImage picture(40, 20, QImage::Format_RGB32);
            picture.fill(Qt::red);
            QDir().mkpath(env.filePath(u"Splash"_s));
            QVERIFY(picture.save(env.filePath(u"Splash/a.png"_s)));
            env.clock.duringWait = [&ticked] {
                for (QWidget* window : QApplication::topLevelWidgets())
                    if (window->objectName() == u"Splash"_s && !std::exchange(ticked, true))
                        QTest::mouseClick(control<QWidget>(*window, u"Check1"_s), Qt::LeftButton);
            };
        }
        const auto form = loadedForm1(env.environment, true);
        for (const QString& step : steps.split(u' ')) {
            const QString value = step.section(u'=', 1);
            if (step.startsWith(u"Text1="_s)) {
                control<QLineEdit>(*form, u"Text1"_s)->setText(value);
            } else if (step.startsWith(u"input="_s)) {
                env.dialogs.answerInput(value);
            } else if (step.startsWith(u"file="_s)) {
                writeBytes(env.filePath(u"list.txt"_s),
                           QString(value).replace(u',', u'\n').toUtf8());
                env.dialogs.answerOpen({env.filePath(u"list.txt"_s)});
            } else if (step == u"save"_s) {
                env.dialogs.answerSave(env.filePath(u"saved.txt"_s));
            } else if (step.startsWith(u"select="_s)) {
                selectName(*form, value);
            } else if (step.startsWith(u"unselect="_s)) {
                control<QAbstractItemView>(*form, value)->clearSelection();
            } else if (step.startsWith(u"key="_s)) {
                auto* pane = control<QWidget>(*form, value.section(u':', 0, 0));
                const QString key = value.section(u':', 1);
                key.isEmpty() ? QTest::keyClick(pane, Qt::Key_Delete)
                              : QTest::keyClick(pane, key.at(0).toLatin1());
            } else if (step.startsWith(u"double="_s)) {
                QAbstractItemView* pane = selectName(*form, value);
                const QPoint at = pane->visualRect(pane->currentIndex()).center();
                QTest::mouseClick(pane->viewport(), Qt::LeftButton, {}, at);
                QTest::mouseDClick(pane->viewport(), Qt::LeftButton, {}, at);
            } else if (step.startsWith(u"Form2."_s)) {
                control<QAbstractButton>(*form->resultsWindow(), step.mid(6))->click();
            } else if (step != u"Check1"_s) {
                control<QAbstractButton>(*form, step)->click();
            }
        }
        QTEST(allTables(env.databasePath()), "tables");
        QStringList outside;
        if (QFile::exists(env.filePath(u"saved.txt"_s)))
            outside << u"saved"_s;
        if (!env.shell.documents.isEmpty())
            outside << u"opened"_s;
        if (const QString showAgain = env.settings->read(u"ShowAgain"_s, {}); !showAgain.isEmpty())
            outside << u"ShowAgain="_s + showAgain;
        Form2* results = form->resultsWindow();
        QTEST(QStringList({shownColumn(*form, u"ListView2"_s).join(u' '),
                           shownColumn(*form, u"ListView1"_s).join(u' '),
                           QString::number(env.dialogs.messages().size()),
                           !results               ? QString()
                           : results->isVisible() ? u"%1 rows"_s.arg(results->results().rowCount())
                                                  : u"back"_s,
                           outside.join(u' ')})
                  .join(u'|'),
              "shown");
    }

    void theBarDuringARun_data()
    {
        QTest::addColumn<int>("count");
        QTest::addColumn<QList<int>>("values"); // the bar's, in turn
        QList<int> each(100);
        std::iota(each.begin(), each.end(), 1);
        QTest::newRow("none") << 0 << QList<int>{};
        QTest::newRow("200: halves to even, each value once") << 200 << (each << 0);
    }

    // The bar moves up to full, then goes back to empty for the next run (the
    // values for other counts: tst_generation).
    // The run holds the event loop, so each value is painted on the spot, in
    // turn; the closing empty bar is painted whenever the window is next.
    void theBarDuringARun()
    {
        QFETCH(int, count);
        TestEnvironment env(false);
        fillAllTables(env);
        const auto form = loadedForm1(env.environment, true);
        auto* bar = control<QProgressBar>(*form, u"ProgressBar1"_s);
        bar->installEventFilter(this);
        QSignalSpy values(bar, &QProgressBar::valueChanged);
        control<QLineEdit>(*form, u"Text1"_s)->setText(QString::number(count));
        control<QAbstractButton>(*form, u"PushButton1"_s)->click();
        QList<int> seen;
        for (const QList<QVariant>& value : values)
            seen << value[0].toInt();
        QTEST(seen, "values");
        qsizetype painted = 0; // of the values seen, in turn
        for (int value : m_painted)
            painted += painted < seen.size() && value == seen[painted];
        QCOMPARE_GE(painted, seen.size() - 1);
    }

    void shownTitles_data()
    {
        QTest::addColumn<QString>("window");
        QTest::addColumn<QString>("title");
        QTest::newRow("main window") << u"main"_s << u"Quillane"_s;
        QTest::newRow("error report") << u"report"_s << u"Application Error"_s;
        QTest::newRow("results window") << u"results"_s << u"Preview"_s;
        QTest::newRow("save dialog") << u"save"_s << u"Save File As"_s;
        QTest::newRow("load dialog")
            << u"load"_s << u"Load List(s) - Hold Ctrl to select multiple list files"_s;
    }

    // The windows and the real dialogs, as the window system titles them.
    void shownTitles()
    {
        QFETCH(QString, window);
        QFETCH(QString, title);
        TestEnvironment env;
        QtDialogs dialogs;
        Environment real{dialogs, *env.settings, env.shell, env.clock, env.random, env.folder()};
        const auto form = loadedForm1(real, true);
        const auto generate = [&] {
            control<QAbstractButton>(*form, u"PushButton1"_s)->click();
            return form->resultsWindow();
        };
        QString shown;
        if (window == u"main")
            shown = shownTitle(form.get());
        else if (window == u"results")
            shown = shownTitle(generate());
        else if (window == u"report")
            shown = dialogTitle([&] {
                ShowErrorReport(dialogs, u"Disk full"_s, u"in Tessmark.Form1.PushButton2_Click "_s,
                                30, ClosingLine::Long);
            });
        else if (window == u"save")
            shown = dialogTitle([&, results = generate()] {
                control<QAbstractButton>(*results, u"PushButton2"_s)->click();
            });
        else
            shown =
                dialogTitle([&] { control<QAbstractButton>(*form, u"PushButton6"_s)->click(); });
        QCOMPARE(shown, title);
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

    void closingTheMainWindowEndsTheProgram()
    {
        TestEnvironment env;
        const auto form = loadedForm1(env.environment, true);
        QTimer::singleShot(0, form.get(), [&] { form->close(); });
        // Only a safety net: a program that does not end fails instead of hanging.
        QTimer::singleShot(10000, qApp, [] { QCoreApplication::exit(1); });
        QCOMPARE(QApplication::exec(), 0);
    }

    // Start-up with a damaged database fails before the window is shown;
    // the whole program then shows the failure's description in its notice
    // and ends with status 1. (A missing one fails in the same way:
    // tst_database.)
    void startUpFailsWithoutAUsableDatabase()
    {
        TestEnvironment env(false);
        writeBytes(env.databasePath(), QByteArray(4096, 'x'));
        Form1 form(env.environment);
        QVERIFY_THROWS_EXCEPTION(Failure, form.Form_Load());
        QVERIFY(!form.isVisible());
        QCOMPARE(runSelf({u"--start-program-in"_s, env.folder()}),
                 u"notice: Quillane|The file %1 is not a Quillane names database.\nexit 1"_s.arg(
                     env.databasePath()));
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

int main(int argc, char** argv)
{
    if (argc == 3 && qstrcmp(argv[1], "--start-program-in") == 0)
        return startProgramIn(argc, argv);
    // The program's own application object: what it sets decides what the
    // window system adds to the titles.
    QuillaneApplication app(argc, argv);
    TestForm1 test;
    return QTest::qExec(&test, argc, argv);
}

#include "tst_form1.moc"
