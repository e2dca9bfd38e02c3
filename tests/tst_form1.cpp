// The main window: start-up from the stored choices, the option clicks, the
// panes, the "Help" message, and start-up with an unusable database.
#include "app/application.h"
#include "app/failure.h"
#include "app/form1.h"
#include "support/testenvironment.h"

#include <QFile>
#include <QLineEdit>
#include <QProcess>
#include <QPushButton>
#include <QRadioButton>
#include <QTest>
#include <QTableView>

using namespace Qt::StringLiterals;

namespace {

template <typename T>
T* control(QWidget& window, const QString& name)
{
    auto* c = window.findChild<T*>(name);
    if (!c)
        qFatal("no control %s", qPrintable(name));
    return c;
}

QStringList paneNames(QWidget& window, const QString& name)
{
    QAbstractItemModel* model = control<QTableView>(window, name)->model();
    QStringList names;
    for (int row = 0; row < model->rowCount(); ++row)
        names.append(model->index(row, 0).data().toString());
    return names;
}

int paneCount(QWidget& window, const QString& name)
{
    return control<QTableView>(window, name)->model()->rowCount();
}

// The counts of the built-in list as shipped.
constexpr int BuiltInLastNames = 88799;
constexpr int BuiltInMaleNames = 1219;
constexpr int BuiltInFemaleNames = 4275;

} // namespace

class TestForm1 : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void firstStartShowsTheBuiltInListForBothGenders()
    {
        TestEnvironment env;
        Form1 form(env.environment);
        form.Form_Load();

        QVERIFY(control<QRadioButton>(form, u"Option9"_s)->isChecked());
        QVERIFY(control<QRadioButton>(form, u"Option1"_s)->isChecked());
        QCOMPARE(control<QLineEdit>(form, u"Text1"_s)->text(), u"100"_s);
        QCOMPARE(form.windowTitle(), u"Quillane"_s);
        QCOMPARE(paneCount(form, u"ListView1"_s), BuiltInLastNames);
        const int firstNames = paneCount(form, u"ListView2"_s);
        QVERIFY(firstNames > BuiltInFemaleNames && firstNames < BuiltInFemaleNames + BuiltInMaleNames);
        QCOMPARE(control<QPushButton>(form, u"PushButton4"_s)->text(), u"Delete"_s);
        // Restoring a choice that was already selected writes nothing; the
        // count box writes its text back.
        QCOMPARE(env.settings->read(u"Option9"_s, u"absent"_s), u"absent"_s);
        QCOMPARE(env.settings->read(u"Text1"_s, u"absent"_s), u"100"_s);
    }

    void storedChoicesComeBack_data()
    {
        QTest::addColumn<QStringList>("stored"); // key=value pairs
        QTest::addColumn<QString>("selected");   // the options expected selected
        QTest::addColumn<QString>("caption");
        QTest::addColumn<bool>("gendersEnabled");
        QTest::addColumn<int>("firstNames");
        QTest::addColumn<int>("lastNames");

        QTest::newRow("user list")
            << QStringList{u"Option9=False"_s, u"Option8=True"_s} << u"Option8 Option1"_s
            << u"Clear"_s << false << 2 << 1;
        QTest::newRow("male only")
            << QStringList{u"Option1=False"_s, u"Option2=True"_s, u"Option3=False"_s}
            << u"Option9 Option2"_s << u"Delete"_s << true << BuiltInMaleNames << BuiltInLastNames;
        QTest::newRow("female only, as numbers")
            << QStringList{u"Option1=0"_s, u"Option2=0"_s, u"Option3=1"_s}
            << u"Option9 Option3"_s << u"Delete"_s << true << BuiltInFemaleNames
            << BuiltInLastNames;
    }

    void storedChoicesComeBack()
    {
        QFETCH(QStringList, stored);
        QFETCH(QString, selected);
        QFETCH(QString, caption);
        QFETCH(bool, gendersEnabled);
        QFETCH(int, firstNames);
        QFETCH(int, lastNames);

        TestEnvironment env;
        insertRows(env.databasePath(), u"user_firstname"_s, u"firstname"_s, {u"Zoe"_s, u"al"_s});
        insertRows(env.databasePath(), u"user_lastname"_s, u"lastname"_s, {u"Quill"_s});
        for (const QString& pair : stored)
            env.settings->write(pair.section(u'=', 0, 0), pair.section(u'=', 1));

        Form1 form(env.environment);
        form.Form_Load();
        for (const QString& name : {u"Option1"_s, u"Option2"_s, u"Option3"_s, u"Option8"_s,
                                    u"Option9"_s}) {
            QCOMPARE(control<QRadioButton>(form, name)->isChecked(),
                     selected.split(u' ').contains(name));
            if (name != u"Option8"_s && name != u"Option9"_s)
                QCOMPARE(control<QRadioButton>(form, name)->isEnabled(), gendersEnabled);
        }
        QCOMPARE(control<QPushButton>(form, u"PushButton4"_s)->text(), caption);
        QCOMPARE(control<QPushButton>(form, u"PushButton3"_s)->text(), caption);
        QCOMPARE(paneCount(form, u"ListView2"_s), firstNames);
        QCOMPARE(paneCount(form, u"ListView1"_s), lastNames);
        if (firstNames == 2)
            QCOMPARE(paneNames(form, u"ListView2"_s), (QStringList{u"al"_s, u"Zoe"_s}));
    }

    void storedCountComesBackAsTyped_data()
    {
        QTest::addColumn<QString>("stored");
        QTest::newRow("empty") << QString();
        QTest::newRow("letters") << u"lots"_s;
        QTest::newRow("number") << u"250"_s;
    }

    void storedCountComesBackAsTyped()
    {
        QFETCH(QString, stored);
        TestEnvironment env;
        env.settings->write(u"Text1"_s, stored);
        Form1 form(env.environment);
        form.Form_Load();
        QCOMPARE(control<QLineEdit>(form, u"Text1"_s)->text(), stored);
    }

    void typingWritesTheCountAtEveryKeystroke()
    {
        TestEnvironment env;
        Form1 form(env.environment);
        form.Form_Load();
        form.show();
        auto* text1 = control<QLineEdit>(form, u"Text1"_s);
        text1->setFocus();
        text1->selectAll();
        QTest::keyClick(text1, Qt::Key_4);
        QCOMPARE(env.settings->read(u"Text1"_s, {}), u"4"_s);
        QTest::keyClick(text1, Qt::Key_2);
        QCOMPARE(env.settings->read(u"Text1"_s, {}), u"42"_s);
    }

    void focusSelectsTheWholeCount()
    {
        TestEnvironment env;
        Form1 form(env.environment);
        form.Form_Load();
        form.show();
        QApplication::setActiveWindow(&form);
        QVERIFY(QTest::qWaitForWindowActive(&form));
        auto* text1 = control<QLineEdit>(form, u"Text1"_s);
        control<QPushButton>(form, u"PushButton1"_s)->setFocus();
        text1->deselect();
        text1->setFocus(Qt::TabFocusReason);
        QCOMPARE(text1->selectedText(), u"100"_s);
    }

    void optionClicks_data()
    {
        QTest::addColumn<QStringList>("clicks");
        QTest::addColumn<QStringList>("written");
        QTest::addColumn<QString>("caption");
        QTest::addColumn<bool>("gendersEnabled");
        QTest::addColumn<int>("firstNames");

        QTest::newRow("user list")
            << QStringList{u"Option8"_s} << QStringList{u"Option9=False"_s, u"Option8=True"_s}
            << u"Clear"_s << false << 1;
        QTest::newRow("back to the built-in list keeps the gender")
            << QStringList{u"Option3"_s, u"Option8"_s, u"Option9"_s}
            << QStringList{u"Option9=True"_s, u"Option8=False"_s, u"Option1=False"_s,
                           u"Option2=False"_s, u"Option3=True"_s}
            << u"Delete"_s << true << BuiltInFemaleNames;
        QTest::newRow("male only")
            << QStringList{u"Option2"_s}
            << QStringList{u"Option1=False"_s, u"Option2=True"_s, u"Option3=False"_s}
            << u"Delete"_s << true << BuiltInMaleNames;
    }

    void optionClicks()
    {
        QFETCH(QStringList, clicks);
        QFETCH(QStringList, written);
        QFETCH(QString, caption);
        QFETCH(bool, gendersEnabled);
        QFETCH(int, firstNames);

        TestEnvironment env;
        insertRows(env.databasePath(), u"user_firstname"_s, u"firstname"_s, {u"Ida"_s});
        Form1 form(env.environment);
        form.Form_Load();
        form.show();
        for (const QString& name : clicks)
            control<QRadioButton>(form, name)->click();

        for (const QString& pair : written) {
            const QString key = pair.section(u'=', 0, 0);
            QVERIFY2(env.settings->read(key, {}) == pair.section(u'=', 1), qPrintable(key));
        }
        QCOMPARE(control<QPushButton>(form, u"PushButton4"_s)->text(), caption);
        QCOMPARE(control<QPushButton>(form, u"PushButton3"_s)->text(), caption);
        QCOMPARE(control<QRadioButton>(form, u"Option2"_s)->isEnabled(), gendersEnabled);
        QCOMPARE(paneCount(form, u"ListView2"_s), firstNames);
    }

    void removingANameFromAPaneLastsUntilTheNextRefresh_data()
    {
        QTest::addColumn<bool>("byKey");
        QTest::newRow("Delete key") << true;
        QTest::newRow("double-click") << false;
    }

    void removingANameFromAPaneLastsUntilTheNextRefresh()
    {
        QFETCH(bool, byKey);
        TestEnvironment env;
        Form1 form(env.environment);
        form.Form_Load();
        form.show();
        QVERIFY(QTest::qWaitForWindowExposed(&form));
        auto* pane = control<QTableView>(form, u"ListView1"_s);
        const QString second = paneNames(form, u"ListView1"_s).at(1);
        pane->setCurrentIndex(pane->model()->index(1, 0));
        if (byKey) {
            QTest::keyClick(pane, Qt::Key_Delete);
        } else {
            const QRect row = pane->visualRect(pane->model()->index(1, 0));
            // A double-click arrives as a click followed by the double-click.
            QTest::mouseClick(pane->viewport(), Qt::LeftButton, {}, row.center());
            QTest::mouseDClick(pane->viewport(), Qt::LeftButton, {}, row.center());
        }
        QCOMPARE(paneCount(form, u"ListView1"_s), BuiltInLastNames - 1);
        QVERIFY(!paneNames(form, u"ListView1"_s).contains(second));
        QCOMPARE(tableColumn(env.databasePath(), u"system_lastname"_s, u"Last"_s).size(),
                 BuiltInLastNames);

        control<QRadioButton>(form, u"Option2"_s)->click();
        QCOMPARE(paneCount(form, u"ListView1"_s), BuiltInLastNames);
        QVERIFY(env.dialogs.shown.isEmpty());
    }

    void deleteKeyWithoutSelectionDoesNothing()
    {
        TestEnvironment env;
        Form1 form(env.environment);
        form.Form_Load();
        form.show();
        auto* pane = control<QTableView>(form, u"ListView2"_s);
        pane->clearSelection();
        const int before = paneCount(form, u"ListView2"_s);
        QTest::keyClick(pane, Qt::Key_Delete);
        QCOMPARE(paneCount(form, u"ListView2"_s), before);
        QVERIFY(env.dialogs.shown.isEmpty());
    }

    void helpExplainsTheTwoSources()
    {
        TestEnvironment env;
        Form1 form(env.environment);
        form.Form_Load();
        QTest::mouseClick(control<QPushButton>(form, u"PushButton8"_s), Qt::LeftButton);
        QCOMPARE(env.dialogs.shown.size(), 1);
        const auto& help = env.dialogs.shown[0];
        QCOMPARE(help.title, u"Quillane"_s);
        QCOMPARE(help.icon, MessageIcon::None);
        QCOMPARE(help.text.toUtf8(),
                 QByteArray("You have two options for generating: \r\r"
                            "1. You can generate from Orvell's List which contains my collection "
                            "of first and last names.\r\r"
                            "2. You can generate using your User List. In this case, names can "
                            "be loaded from a text file or added one at a time."));
    }

    void startUpFailsWithoutAUsableDatabase_data()
    {
        QTest::addColumn<QByteArray>("content");
        QTest::addColumn<QString>("description");
        QTest::newRow("missing") << QByteArray() << u"unable to open database file"_s;
        QTest::newRow("corrupt") << QByteArray(4096, 'x') << u"file is not a database"_s;
    }

    void startUpFailsWithoutAUsableDatabase()
    {
        QFETCH(QByteArray, content);
        QFETCH(QString, description);
        TestEnvironment env(false);
        if (!content.isEmpty()) {
            QFile file(env.databasePath());
            QVERIFY(file.open(QIODevice::WriteOnly));
            file.write(content);
        }
        Form1 form(env.environment);
        try {
            form.Form_Load();
            QFAIL("start-up went on");
        } catch (const Failure& failure) {
            QCOMPARE(failure.description(), description);
        }
        QVERIFY(!form.isVisible());
    }

    void theProgramEndsWithANoticeWhenStartUpFails()
    {
        TestEnvironment env(false);
        QProcess child;
        child.start(QCoreApplication::applicationFilePath(),
                    {u"--start-program-in"_s, env.folder()});
        QVERIFY(child.waitForFinished(60000));
        QCOMPARE(child.exitStatus(), QProcess::NormalExit);
        QCOMPARE(child.exitCode(), 1);
        const QString output = QString::fromUtf8(child.readAllStandardOutput());
        QVERIFY2(output.contains(u"notice: Quillane|unable to open database file"_s),
                 qPrintable(output));
    }
};

// Run as a child process by the test above: the whole program, started in a
// given folder, with dialogs that print instead of waiting.
namespace {
class PrintingDialogs : public FakeDialogs {
public:
    void messageBox(const QString& text, const QString& title, MessageIcon) override
    {
        std::printf("notice: %s|%s\n", qUtf8Printable(title),
                    qUtf8Printable(text.section(u'\n', -1)));
        std::fflush(stdout);
    }
};
} // namespace

int main(int argc, char** argv)
{
    if (argc == 3 && qstrcmp(argv[1], "--start-program-in") == 0) {
        QuillaneApplication app(argc, argv);
        useTemporarySettings();
        PrintingDialogs dialogs;
        app.setDialogs(&dialogs);
        Settings settings;
        FakeShell shell;
        FakeClock clock;
        RandomSource random;
        Environment environment{dialogs, settings, shell, clock, random,
                                QString::fromLocal8Bit(argv[2])};
        return runProgram(app, environment);
    }
    QApplication app(argc, argv);
    TestForm1 test;
    return QTest::qExec(&test, argc, argv);
}

#include "tst_form1.moc"
