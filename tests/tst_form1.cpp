// The main window: start-up from the stored choices, the option clicks, the
// panes, the count box, the "Help" message, what a screen reader says, the
// titles the window system shows, and start-up with an unusable database or
// settings store.
#include "app/form2.h"
#include "app/qtdialogs.h"
#include "base/failure.h"
#include "support/program.h"

#include <QAccessible>
#include <QGroupBox>
#include <QLineEdit>
#include <QRadioButton>
#include <QTimer>
#include <QWindow>

#include <functional>

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
        // A screen reader says what each button and frame shows, "Clear" too.
        for (QWidget* widget : form->findChildren<QWidget*>()) {
            const auto* button = qobject_cast<QAbstractButton*>(widget);
            const auto* frame = qobject_cast<QGroupBox*>(widget);
            if (button || frame)
                QCOMPARE(QAccessible::queryAccessibleInterface(widget)->text(QAccessible::Name),
                         button ? button->text() : frame->title());
        }
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

    // One plain message that names both sources.
    void helpExplainsTheTwoSources()
    {
        TestEnvironment env;
        const auto form = loadedForm1(env.environment);
        QTest::mouseClick(control<QAbstractButton>(*form, u"PushButton8"_s), Qt::LeftButton);
        QCOMPARE(env.dialogs.shown.size(), 1);
        const FakeDialogs::Shown& help = env.dialogs.shown[0];
        QVERIFY2(help.text.contains(u"Orvell's List"_s) && help.text.contains(u"User List"_s),
                 qPrintable(help.text));
        QCOMPARE(help.title, u"Quillane"_s);
        QCOMPARE(help.icon, MessageIcon::None);
    }

    void startsWithADamagedOrUnwritableStore_data()
    {
        QTest::addColumn<QString>("kind"); // of Varnholt.ini: file, folder, link
        QTest::addColumn<QByteArray>("content");
        QTest::addColumn<QString>("reason"); // of the one report; empty: none
        QTest::addColumn<QString>("shown");  // after the user list and 42 were chosen

        const QString user = u"Option1 Option8|Clear Clear|off|42|0 0"_s;
        QTest::newRow("malformed lines")
            << u"file"_s
            << QByteArray("[Quillane]\nOption9=False\n=junk\n\x01\x1b[2J\nOption3=1\n"
                          "Text1=250\n")
            << QString() << u"Option3 Option8|Clear Clear|off|42|0 0"_s;
        QTest::newRow("a folder in its place")
            << u"folder"_s << QByteArray() << u"Is a directory"_s << user;
        QTest::newRow("dangling link")
            << u"link"_s << QByteArray() << u"No such file or directory"_s << user;
    }

    // The window starts whatever the store's state. A malformed file gives
    // the choices it holds; a store that cannot be written is reported once,
    // and the choices made hold until the program ends.
    void startsWithADamagedOrUnwritableStore()
    {
        QFETCH(QString, kind);
        QFETCH(QByteArray, content);
        QFETCH(QString, reason);
        QFETCH(QString, shown);
        TestEnvironment env;
        QTemporaryDir store;
        const QString path = store.filePath(u"Varnholt.ini"_s);
        if (kind == u"file")
            writeBytes(path, content);
        else if (kind == u"folder")
            QVERIFY(QDir(store.path()).mkdir(u"Varnholt.ini"_s));
        else
            QVERIFY(QFile::link(u"missing/Varnholt.ini"_s, path));
        QSettings::setPath(QSettings::IniFormat, QSettings::UserScope, store.path());
        Settings settings;
        settings.reportWriteFailuresTo(&env.dialogs);
        Environment environment{env.dialogs, settings,   env.shell,
                                env.clock,   env.random, env.folder()};
        const auto form = loadedForm1(environment, true);
        if (kind == u"file")
            QCOMPARE(control<QLineEdit>(*form, u"Text1"_s)->text(), u"250"_s);
        control<QRadioButton>(*form, u"Option8"_s)->click();
        control<QLineEdit>(*form, u"Text1"_s)->setText(u"42"_s);
        QCOMPARE(shownChoice(*form), shown);
        QCOMPARE(settings.read(u"Text1"_s, {}), u"42"_s);
        QCOMPARE(settings.read(u"Option8"_s, {}), u"True"_s);
        if (reason.isEmpty()) {
            QVERIFY(env.dialogs.shown.isEmpty());
            QVERIFY(fileBytes(path).contains("Text1=42\n"));
        } else {
            QCOMPARE(env.dialogs.messages().size(), 1);
            QVERIFY2(env.dialogs.messages()[0].contains(path + u" cannot be written: "_s + reason),
                     qPrintable(env.dialogs.messages()[0]));
            QCOMPARE(env.dialogs.shown[0].title, u"Application Error"_s);
            QCOMPARE(env.dialogs.shown[0].icon, MessageIcon::Exclamation);
        }
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
