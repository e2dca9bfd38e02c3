// The splash window: when it is shown and when not, the picture it picks,
// its layout around the picture, the check box that keeps it away, and the
// length of its pause, measured on a fake clock.
#include "app/form1.h"
#include "app/splash.h"
#include "app/windowroutines.h"
#include "support/testenvironment.h"

#include <QCheckBox>
#include <QDir>
#include <QDirIterator>
#include <QFile>
#include <QLabel>
#include <QScreen>
#include <QTest>
#include <QTimer>

using namespace Qt::StringLiterals;

namespace {

// Marks a "ShowAgain" that is not in the settings store at all.
const QString Absent = u"<absent>"_s;

template <typename T> T* control(QWidget& window, const QString& name)
{
    auto* c = window.findChild<T*>(name);
    if (!c)
        qFatal("no control %s", qPrintable(name));
    return c;
}

void writePicture(const QString& path, QSize size, QColor colour = Qt::red)
{
    QImage picture(size, QImage::Format_RGB32);
    picture.fill(colour);
    if (!picture.save(path, "PNG"))
        qFatal("cannot write %s", qPrintable(path));
}

void writeText(const QString& path, const QByteArray& text)
{
    QFile file(path);
    if (!file.open(QIODevice::WriteOnly) || file.write(text) != text.size())
        qFatal("cannot write %s", qPrintable(path));
}

QString splashFolder(const TestEnvironment& env)
{
    return env.filePath(u"Splash"_s);
}

// The folder the splash reads, filled as a row of a table asks.
void prepareFolder(const TestEnvironment& env, const QString& content)
{
    const QDir folder(splashFolder(env));
    if (content == u"missing")
        return;
    QDir().mkpath(folder.path());
    if (content == u"one picture")
        writePicture(folder.filePath(u"greeting.png"_s), {267, 200});
    else if (content == u"hidden picture only")
        writePicture(folder.filePath(u".greeting.png"_s), {267, 200});
    else if (content == u"subfolder only") {
        QDir().mkpath(folder.filePath(u"more.png"_s));
        writePicture(folder.filePath(u"more.png/greeting.png"_s), {267, 200});
    } else if (content == u"not a picture")
        writeText(folder.filePath(u"greeting.png"_s), "these are not the pixels you want\n");
    else if (content == u"empty picture")
        writeText(folder.filePath(u"greeting.png"_s), {});
}

// Counts the times a window is put on screen.
class ShowCounter : public QObject {
public:
    explicit ShowCounter(QWidget* window) { window->installEventFilter(this); }
    int shown = 0;

protected:
    bool eventFilter(QObject*, QEvent* event) override
    {
        if (event->type() == QEvent::Show)
            ++shown;
        return false;
    }
};

double expectedPause()
{
    return InDevelopment() ? 0.4 : 4.0;
}

} // namespace

class TestSplash : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void shownOnlyWhenWantedAndAPictureIsThere_data()
    {
        QTest::addColumn<QString>("showAgain");
        QTest::addColumn<QString>("folder");
        QTest::addColumn<bool>("shown");

        QTest::newRow("first start") << Absent << u"one picture"_s << true;
        QTest::newRow("wanted") << u"0"_s << u"one picture"_s << true;
        QTest::newRow("hidden at this start") << u"1"_s << u"one picture"_s << false;
        QTest::newRow("any number but 0 keeps it away") << u"-1"_s << u"one picture"_s << false;
        QTest::newRow("text that is no number") << u"often"_s << u"one picture"_s << false;
        QTest::newRow("empty text") << u""_s << u"one picture"_s << false;
        QTest::newRow("no Splash folder") << Absent << u"missing"_s << false;
        QTest::newRow("empty Splash folder") << Absent << u"empty"_s << false;
        QTest::newRow("only a hidden file") << Absent << u"hidden picture only"_s << false;
        QTest::newRow("only a subfolder") << Absent << u"subfolder only"_s << false;
        QTest::newRow("first file is no picture") << Absent << u"not a picture"_s << false;
        QTest::newRow("first file is empty") << Absent << u"empty picture"_s << false;
    }

    void shownOnlyWhenWantedAndAPictureIsThere()
    {
        QFETCH(QString, showAgain);
        QFETCH(QString, folder);
        QFETCH(bool, shown);

        TestEnvironment env;
        if (showAgain != Absent)
            env.settings->write(u"ShowAgain"_s, showAgain);
        prepareFolder(env, folder);
        Splash splash(env.environment);
        ShowCounter counter(&splash);
        bool visibleDuringPause = false;
        env.clock.duringWait = [&] { visibleDuringPause = splash.isVisible(); };
        const double start = env.clock.steady;

        splash.SplashShow();

        QCOMPARE(counter.shown, shown ? 1 : 0);
        QCOMPARE(visibleDuringPause, shown);
        QVERIFY(!splash.isVisible());
        // A skipped splash costs no time at all.
        QCOMPARE(env.clock.waits.isEmpty(), !shown);
        QCOMPARE(env.clock.steady - start >= expectedPause(), shown);
        // Showing reads the setting; only the check box writes it.
        QCOMPARE(env.settings->read(u"ShowAgain"_s, Absent), showAgain);
        QVERIFY(env.dialogs.shown.isEmpty());
    }

    void severalPicturesAlwaysTheFirstOfTheListing()
    {
        TestEnvironment env;
        const QDir folder(splashFolder(env));
        QDir().mkpath(folder.path());
        // Told apart by their widths.
        const QStringList names{u"b.png"_s, u"a.png"_s, u"c.png"_s, u"d.png"_s};
        for (qsizetype i = 0; i < names.size(); ++i)
            writePicture(folder.filePath(names[i]), QSize(100 + 10 * int(i), 50));
        writePicture(folder.filePath(u".hidden.png"_s), {400, 50});
        QDir().mkpath(folder.filePath(u"sub"_s));

        QDirIterator listing(folder.path(), QDir::Files);
        listing.next();
        const QString first = listing.fileName();
        const int expectedWidth = 100 + 10 * int(names.indexOf(first));
        QCOMPARE(splashPicturePath(env.folder()), folder.filePath(first));

        for (int start = 0; start < 3; ++start) {
            Splash splash(env.environment);
            splash.SplashShow();
            QCOMPARE(splash.width(), expectedWidth);
        }
    }

    void windowFitsThePicture_data()
    {
        QTest::addColumn<QSize>("picture"); // pixels; 15 twips make a pixel
        // 4005 x 3000 twips: the nearest whole pixels to 4000 x 3000.
        QTest::newRow("4005 x 3000 twips") << QSize(267, 200);
        QTest::newRow("the shipped size") << QSize(480, 300);
        QTest::newRow("narrower than the box") << QSize(120, 40);
    }

    void windowFitsThePicture()
    {
        QFETCH(QSize, picture);
        TestEnvironment env;
        QDir().mkpath(splashFolder(env));
        writePicture(QDir(splashFolder(env)).filePath(u"p.png"_s), picture, Qt::red);
        Splash splash(env.environment);

        const int width = picture.width();
        const int height = picture.height() + 20; // the white strip of 300 twips
        bool checked = false;
        env.clock.duringWait = [&] {
            if (checked)
                return;
            checked = true;
            QCOMPARE(splash.size(), QSize(width, height));
            QCOMPARE(splash.width() * 15, picture.width() * 15);
            QCOMPARE(splash.height() * 15, picture.height() * 15 + 300);
            QCOMPARE(splash.windowTitle(), u"Quillane"_s);
            QVERIFY(splash.windowFlags() & Qt::FramelessWindowHint);
            QCOMPARE(splash.windowType(), Qt::SplashScreen);

            // Centred on the screen.
            const QRect screen = splash.screen()->geometry();
            QVERIFY(qAbs(splash.geometry().center().x() - screen.center().x()) <= 1);
            QVERIFY(qAbs(splash.geometry().center().y() - screen.center().y()) <= 1);

            auto* image = control<QLabel>(splash, u"Image1"_s);
            QCOMPARE(image->pos(), QPoint(0, 0));
            QCOMPARE(image->pixmap().size(), picture);

            // The box: top at H - 395 twips, to the pixel.
            auto* box = control<QCheckBox>(splash, u"Check1"_s);
            QVERIFY(qAbs(box->y() * 15 - (height * 15 - 395)) <= 15);
            QCOMPARE(box->geometry(), QRect(8, height - 26, 281, 25));
            QCOMPARE(box->text(), u"Hide this at next startup"_s);
            QVERIFY(!box->isChecked());
            QVERIFY(box->font().bold());
            QCOMPARE(box->font().pointSizeF(), 9.0);

            // What the user sees: the picture unstretched, the white strip,
            // and the four lines along the edges, over the picture.
            const QImage shot = splash.grab().toImage();
            const QRgb ink = splash.palette().color(QPalette::WindowText).rgb();
            const QRgb white = QColor(Qt::white).rgb();
            const QRgb red = QColor(Qt::red).rgb();
            QCOMPARE(shot.pixel(width / 2, picture.height() / 2), red);
            QCOMPARE(shot.pixel(2, picture.height() + 5), white);
            QCOMPARE(shot.pixel(0, picture.height() / 2), ink);
            QCOMPARE(shot.pixel(width / 2, 0), ink);
            QCOMPARE(shot.pixel(width - 1, picture.height() / 2), ink);
            QCOMPARE(shot.pixel(4, height - 1), ink);
            QCOMPARE(shot.pixel(width - 2, picture.height() / 2), red);
            // The box's white background covers the foot of the picture.
            QCOMPARE(shot.pixel(qMin(box->geometry().right(), width - 2) - 1, box->y() + 2), white);
        };

        splash.SplashShow();
        QVERIFY(checked);
        QVERIFY(!splash.isVisible());
    }

    void theBoxWritesAtEveryClick_data()
    {
        QTest::addColumn<int>("clicks");
        QTest::addColumn<QStringList>("written"); // the stored value after each click
        QTest::addColumn<bool>("shownAtNextStart");

        QTest::newRow("ticked") << 1 << QStringList{u"1"_s} << false;
        QTest::newRow("ticked, unticked") << 2 << QStringList{u"1"_s, u"0"_s} << true;
        QTest::newRow("ticked, unticked, ticked")
            << 3 << QStringList{u"1"_s, u"0"_s, u"1"_s} << false;
    }

    void theBoxWritesAtEveryClick()
    {
        QFETCH(int, clicks);
        QFETCH(QStringList, written);
        QFETCH(bool, shownAtNextStart);

        TestEnvironment env;
        prepareFolder(env, u"one picture"_s);
        const double start = env.clock.steady;
        QStringList stored;
        {
            Splash splash(env.environment);
            auto* box = control<QCheckBox>(splash, u"Check1"_s);
            env.clock.step = 0.5; // events end some waits early
            env.clock.duringWait = [&] {
                if (stored.size() < clicks) {
                    QTest::mouseClick(box, Qt::LeftButton);
                    stored.append(env.settings->read(u"ShowAgain"_s, Absent));
                }
            };
            splash.SplashShow();
        }
        QCOMPARE(stored, written);
        // The splash stays for the rest of its pause.
        QVERIFY(env.clock.steady - start >= expectedPause());

        // The next start.
        env.clock.duringWait = nullptr;
        env.clock.waits.clear();
        Splash next(env.environment);
        next.SplashShow();
        QCOMPARE(!env.clock.waits.isEmpty(), shownAtNextStart);
    }

    void pauseEndsOnTime_data()
    {
        QTest::addColumn<double>("timeOfDay");
        QTest::addColumn<double>("seconds");
        QTest::addColumn<double>("step"); // 0: each wait runs its full time

        QTest::newRow("4 s at noon") << 12 * 3600.0 << 4.0 << 0.0;
        QTest::newRow("0.4 s at noon") << 12 * 3600.0 << 0.4 << 0.0;
        QTest::newRow("4 s woken by events") << 12 * 3600.0 << 4.0 << 0.3;
        QTest::newRow("4 s across midnight") << 86400.0 - 1.5 << 4.0 << 0.0;
        QTest::newRow("across midnight, woken by events") << 86400.0 - 0.2 << 4.0 << 0.7;
        QTest::newRow("nothing to wait") << 12 * 3600.0 << 0.0 << 0.0;
    }

    void pauseEndsOnTime()
    {
        QFETCH(double, timeOfDay);
        QFETCH(double, seconds);
        QFETCH(double, step);

        FakeClock clock;
        clock.now = timeOfDay;
        clock.step = step;
        const double start = clock.steady;

        waitSeconds(clock, seconds);

        const double elapsed = clock.steady - start;
        QVERIFY2(elapsed >= seconds, qPrintable(QString::number(elapsed)));
        // Not a step more than needed, and never a busy loop of empty waits.
        QVERIFY2(elapsed < seconds + qMax(step, 0.002), qPrintable(QString::number(elapsed)));
        for (const int milliseconds : clock.waits)
            QVERIFY(milliseconds > 0 && milliseconds <= int(seconds * 1000) + 1);
        if (step > 0)
            QVERIFY(clock.waits.size() <= int(seconds / step) + 1);
        else
            QVERIFY(clock.waits.size() <= 2);
    }

    void systemClockLetsEventsRunWhileWaiting()
    {
        // Not a measurement of time: only that events go on arriving.
        SystemClock clock;
        bool ran = false;
        QTimer::singleShot(0, this, [&] { ran = true; });
        const double before = clock.steadySeconds();
        clock.waitForEvents(20);
        QVERIFY(ran);
        QVERIFY(clock.steadySeconds() >= before);
    }

    void startUpGreetsBeforeTheMainWindow()
    {
        TestEnvironment env;
        prepareFolder(env, u"one picture"_s);
        Form1 form(env.environment);
        bool splashUp = false;
        bool mainWindowUp = true;
        env.clock.duringWait = [&] {
            const auto windows = QApplication::topLevelWidgets();
            for (QWidget* w : windows) {
                if (w->objectName() == u"Splash" && w->isVisible())
                    splashUp = true;
            }
            mainWindowUp = form.isVisible();
        };

        form.Form_Load();

        QVERIFY(splashUp);
        QVERIFY(!mainWindowUp);
        QVERIFY(env.clock.steady >= 1000.0 + expectedPause());
        QCOMPARE(form.windowTitle(), u"Quillane"_s);
        QVERIFY(!form.windowIcon().isNull());
        QVERIFY(form.windowIcon().availableSizes().contains(QSize(32, 32)));
        for (QWidget* w : QApplication::topLevelWidgets())
            QVERIFY(w->objectName() != u"Splash" || !w->isVisible());
    }
};

QTEST_MAIN(TestSplash)
#include "tst_splash.moc"
