// The shared window routines: the file test, the skin, the hover cursor and
// its file, the random visit at start-up, the hover rule on a real window,
// and the end of the program when a handler without a trap fails.
#include "app/form2.h"
#include "app/randomvisit.h"
#include "app/windowroutines.h"
#include "support/program.h"

#include <QAbstractButton>
#include <QMouseEvent>
#include <QTimer>

using namespace Qt::StringLiterals;

class TestRoutines : public QObject {
    Q_OBJECT

private Q_SLOTS:
    // A folder counts as existing: callers that need a file find out when
    // they read it.
    void fileExists()
    {
        const QString folder = QStringLiteral(QUILLANE_PROGRAM_DIR);
        QVERIFY(FileExists(cursorFilePath(folder)));
        QVERIFY(FileExists(folder));
        QVERIFY(!FileExists(folder + u"/gone.txt"_s));
        QVERIFY(!FileExists(QString()));
        QVERIFY(!FileExists(folder + QChar(0) + u"/gone.txt"_s)); // not cut at the NUL
    }

    void skin_data()
    {
        QTest::addColumn<QString>("skin"); // what is at the skin's path
        QTest::newRow("present") << u"present"_s;
        QTest::newRow("absent") << u"absent"_s;
        QTest::newRow("a folder") << u"folder"_s;
    }

    // The frames and option buttons take the button face; the push buttons,
    // panes, count box and progress bar keep their own background.
    void skin()
    {
        QFETCH(QString, skin);
        TestEnvironment env;
        const QByteArray shippedSkin = fileBytes(QStringLiteral(QUILLANE_PROGRAM_DIR "/x/o.cjs"));
        if (skin == u"present"_s)
            writeBytes(skinFilePath(env.folder()), shippedSkin);
        else if (skin == u"folder"_s)
            QDir().mkpath(skinFilePath(env.folder()));
        Form1 form(env.environment);
        const bool skinned = skin == u"present"_s;
        const QColor expected = skinned ? form.palette().color(QPalette::Button) : Qt::white;
        QCOMPARE(ApplySkin(&form, env.folder()), skinned);
        QCOMPARE(form.palette().color(QPalette::Window), expected);
        for (const QString& name : u"Frame1 Frame4 Option1 Option8"_s.split(u' '))
            QVERIFY2(control<QWidget>(form, name)->palette().color(QPalette::Window) == expected,
                     qPrintable(name));
        for (const QString& name : u"PushButton1 ListView1 Text1 ProgressBar1"_s.split(u' '))
            QVERIFY2(!control<QWidget>(form, name)->autoFillBackground(), qPrintable(name));
        QCOMPARE(form.styleSheet().toUtf8(), skinned ? shippedSkin : QByteArray());
    }

    void cursorFile_data()
    {
        QTest::addColumn<QByteArray>("bytes");
        QTest::addColumn<bool>("loads");
        const QByteArray shipped = fileBytes(QStringLiteral(QUILLANE_PROGRAM_DIR "/HAND-M.CUR"));
        QTest::newRow("shipped") << shipped << true;
        // Anything past the picture is ignored, up to a file of one mebibyte.
        // Malformed pictures: tst_base.
        QTest::newRow("1 MiB") << shipped + QByteArray((1 << 20) - shipped.size(), '\0') << true;
        QTest::newRow("1 MiB and a byte")
            << shipped + QByteArray((1 << 20) + 1 - shipped.size(), '\0') << false;
    }

    void cursorFile()
    {
        QFETCH(QByteArray, bytes);
        QFETCH(bool, loads);
        TestEnvironment env(false);
        createEmptyDatabase(env.databasePath());
        writeBytes(cursorFilePath(env.folder()), bytes);
        const std::optional<QCursor> cursor = loadCursorFile(cursorFilePath(env.folder()));
        QCOMPARE(bool(cursor), loads);
        if (loads) // the hotspot on the fingertip
            QCOMPARE(cursor->hotSpot(), QPoint(7, 1));
        // Over the buttons both windows show the file's hand, or the arrow.
        const auto form = loadedForm1(env.environment);
        form->lists().firstPane().setNames({u"Ann"_s});
        form->lists().lastPane().setNames({u"Lee"_s});
        control<QAbstractButton>(*form, u"PushButton1"_s)->click();
        Form2* results = form->resultsWindow();
        form->pointer().setMousePointer(MousePointer::Custom);
        results->pointer().setMousePointer(MousePointer::Custom);
        const Qt::CursorShape hand = loads ? Qt::BitmapCursor : Qt::ArrowCursor;
        QCOMPARE(form->cursor().shape(), hand);
        QCOMPARE(results->cursor().shape(), hand);
    }

    // Moves over controls in order, starting from the pointer given: the
    // hand (99) and the default (0) follow the pointer, the busy pointer (11)
    // stays, and controls without a handler keep whatever came last. "Form2"
    // moves over the results window instead.
    void hoverRule_data()
    {
        QTest::addColumn<int>("start");
        QTest::addColumn<QString>("path");
        QTest::addColumn<int>("end");
        QTest::newRow("hand over a button") << 0 << u"PushButton1"_s << 99;
        QTest::newRow("busy stays") << 11 << u"PushButton1 ListView2 Frame5"_s << 11;
        QTest::newRow("keeps the hand") << 0 << u"PushButton6 Option2 Text1 ProgressBar1"_s << 99;
        QTest::newRow("default over a pane") << 99 << u"ListView1"_s << 0;
        QTest::newRow("keeps the default") << 99 << u"Frame4 Option3 ProgressBar1"_s << 0;
        QTest::newRow("results: hand over Save") << 0 << u"Form2 PushButton2"_s << 99;
        QTest::newRow("results: hand over Back") << 0 << u"Form2 PushButton8"_s << 99;
        QTest::newRow("results: default over an option") << 99 << u"Form2 Option4"_s << 0;
        QTest::newRow("results: default over a frame") << 99 << u"Form2 Frame2"_s << 0;
    }

    void hoverRule()
    {
        QFETCH(int, start);
        QFETCH(QString, path);
        QFETCH(int, end);
        TestEnvironment env;
        const auto form = loadedForm1(env.environment, true);
        QWidget* window = form.get();
        PointerOwner* pointer = &form->pointer();
        if (path.startsWith(u"Form2 "_s)) {
            control<QAbstractButton>(*form, u"PushButton1"_s)->click();
            window = form->resultsWindow();
            pointer = &form->resultsWindow()->pointer();
            path = path.mid(6);
        }
        pointer->setMousePointer(start);
        for (const QString& name : path.split(u' ')) {
            // A list view receives its mouse moves on its viewport.
            QWidget* target = control<QWidget>(*window, name);
            if (auto* view = qobject_cast<QAbstractScrollArea*>(target))
                target = view->viewport();
            QMouseEvent move(QEvent::MouseMove, QPointF(2, 2), target->mapToGlobal(QPointF(2, 2)),
                             Qt::NoButton, Qt::NoButton, Qt::NoModifier);
            QApplication::sendEvent(target, &move);
        }
        QCOMPARE(pointer->mousePointer(), end);
    }

    void randomVisit_data()
    {
        QTest::addColumn<double>("time");
        QTest::addColumn<bool>("opens");
        QTest::newRow("00:02:07.5") << 127.5 << true;
        QTest::newRow("00:02:07.75") << 127.75 << false;
    }

    void randomVisit()
    {
        QFETCH(double, time);
        QFETCH(bool, opens);
        TestEnvironment env;
        env.clock.now = time;
        RandomVisit(env.random, env.clock, env.shell);
        QCOMPARE(env.shell.webPages, opens ? QList<QUrl>{ProductWebPage} : QList<QUrl>{});

        // Seeded from the time of day, and one draw used up either way:
        // generation goes on from the second number.
        RandomSource replay;
        replay.seedFromTimeOfDay(time);
        replay.next();
        QCOMPARE(env.random.next(), replay.next());
    }

    // 10,000 starts spread over the day open the page about 100 times; the
    // bounds are 4 standard deviations (about 10 each) either side.
    void randomVisitOpensThePageAboutOnceInAHundred()
    {
        TestEnvironment env;
        for (int i = 0; i < 10000; ++i) {
            env.clock.now = i * 8.64 + 0.37;
            RandomVisit(env.random, env.clock, env.shell);
        }
        QCOMPARE_GE(env.shell.webPages.size(), 60);
        QCOMPARE_LE(env.shell.webPages.size(), 140);
    }

    // An option click whose refresh fails after start-up (the database was
    // broken while the program ran) has no trap: the program shows the
    // notice and ends with a failure status.
    void anUntrappedFailureAfterStartUpEndsTheProgram()
    {
        TestEnvironment env;
        QCOMPARE(runSelf({u"--click-option-after-breaking-database"_s, env.folder()}),
                 u"notice: Quillane|The file %1 is not a Quillane names database.\nexit 1"_s.arg(
                     env.databasePath()));
    }
};

namespace {
// The child of the test above: once the window is up and the event loop
// runs, names.mdb is overwritten and "Male Only" is clicked. Were the
// program to go on, the test would give up on it after a minute.
int clickOptionAfterBreakingDatabase(int& argc, char** argv)
{
    ChildProgram child(argc, argv);
    const auto form = loadedForm1(child.environment, true);
    QTimer::singleShot(0, form.get(), [&] {
        writeBytes(child.environment.programFolder + u"/names.mdb"_s, QByteArray(4096, 'x'));
        QTest::mouseClick(control<QWidget>(*form, u"Option2"_s), Qt::LeftButton);
    });
    return child.app.exec();
}
} // namespace

QUILLANE_TEST_MAIN_WITH_CHILD(TestRoutines, "--click-option-after-breaking-database",
                              clickOptionAfterBreakingDatabase)

#include "tst_routines.moc"
