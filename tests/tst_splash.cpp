// The splash window: when it is shown and when not, the picture it picks,
// its size around the picture, the check box that keeps it away, and the
// length of its pause, measured on a fake clock.
#include "app/splash.h"
#include "app/windowroutines.h"
#include "support/program.h"

#include <algorithm>

using namespace Qt::StringLiterals;

namespace {

// The splash's pause, shortened in a development build.
const double Pause = InDevelopment() ? 0.4 : 4.0;

void writePicture(const QString& path, QSize size = {267, 200})
{
    QDir().mkpath(QFileInfo(path).path());
    QImage picture(size, QImage::Format_RGB32);
    picture.fill(Qt::red);
    QVERIFY(picture.save(path, "PNG"));
}

} // namespace

class TestSplash : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void shownOnlyWhenWantedAndAPictureIsThere_data()
    {
        QTest::addColumn<QString>("showAgain"); // null: not stored at all
        // The one file in the Splash folder, a picture when it ends in .png;
        // null for no folder (an empty one lists no file either).
        QTest::addColumn<QString>("file");
        QTest::addColumn<bool>("shown");
        QTest::newRow("first start") << QString() << u"a.png"_s << true;
        QTest::newRow("hidden at this start") << u"1"_s << u"a.png"_s << false;
        QTest::newRow("not a number") << u"often"_s << u"a.png"_s << false;
        QTest::newRow("no Splash folder") << QString() << QString() << false;
        QTest::newRow("only a hidden file") << QString() << u".a.png"_s << false;
        QTest::newRow("only a subfolder") << QString() << u"more/a.png"_s << false;
        QTest::newRow("first file is no picture") << QString() << u"a.txt"_s << false;
    }

    void shownOnlyWhenWantedAndAPictureIsThere()
    {
        QFETCH(QString, showAgain);
        QFETCH(QString, file);
        QFETCH(bool, shown);
        TestEnvironment env;
        if (!showAgain.isNull())
            env.settings->write(u"ShowAgain"_s, showAgain);
        if (file.endsWith(u".png"_s))
            writePicture(env.filePath(u"Splash/"_s + file));
        else if (!file.isNull())
            writeBytes(env.filePath(u"Splash/"_s + file), "these are not pixels\n");
        Splash splash(env.environment);
        bool visibleDuringPause = false;
        env.clock.duringWait = [&] { // a close from outside does not cut the pause short
            splash.close();
            visibleDuringPause = splash.isVisible();
        };

        splash.SplashShow();

        // Up during the pause, hidden after it.
        QCOMPARE(visibleDuringPause && !splash.isVisible(), shown);
        // The pause is the splash's alone: no splash, no wait at all.
        QCOMPARE_GE(env.clock.steady - 1000.0, shown ? Pause : 0.0);
        QCOMPARE_LE(env.clock.steady - 1000.0, shown ? Pause + 0.01 : 0.0);
    }

    void severalPicturesAlwaysTheSameOne()
    {
        TestEnvironment env;
        for (const int width : {120, 100, 130, 110}) // told apart by their widths
            writePicture(env.filePath(u"Splash/%1.png"_s.arg(width)), {width, 50});
        const int first = QImage(splashPicturePath(env.folder())).width();
        for (int start = 0; start < 3; ++start) {
            Splash splash(env.environment);
            splash.SplashShow();
            QCOMPARE(splash.width(), first);
        }
    }

    // The window shows the whole picture, and the box ends in a strip below it.
    // Each click on the box during the pause writes at once.
    void theBoxKeepsTheSplashAway()
    {
        TestEnvironment env;
        writePicture(env.filePath(u"Splash/a.png"_s));
        Splash splash(env.environment);
        QWidget* box = control<QWidget>(splash, u"Check1"_s);
        QStringList stored;           // after each click
        env.clock.step = 0.3 * Pause; // the clicks end the waits early
        env.clock.duringWait = [&] {
            QTest::mouseClick(box, Qt::LeftButton);
            stored.append(env.settings->read(u"ShowAgain"_s, {}));
        };
        splash.SplashShow();
        QCOMPARE(stored, (QStringList{u"1"_s, u"0"_s, u"1"_s, u"0"_s}));
        QCOMPARE(splash.width(), 267);
        QCOMPARE_GT(splash.height(), 200);
        QCOMPARE_GT(box->geometry().bottom(), 200);
        QCOMPARE_LT(box->geometry().bottom(), splash.height());
    }

    void pauseEndsOnTime_data()
    {
        QTest::addColumn<double>("timeOfDay");
        QTest::addColumn<double>("seconds");
        QTest::addColumn<double>("step"); // 0: each wait runs its full time
        QTest::newRow("4 s at noon") << 43200.0 << 4.0 << 0.0;
        QTest::newRow("4 s across midnight") << 86400.0 - 1.5 << 4.0 << 0.0;
        QTest::newRow("across midnight, woken by events") << 86400.0 - 0.2 << 4.0 << 0.7;
        QTest::newRow("150 s: a minute at most each") << 43200.0 << 150.0 << 0.0;
    }

    void pauseEndsOnTime()
    {
        QFETCH(double, timeOfDay);
        QFETCH(double, seconds);
        QFETCH(double, step);
        FakeClock clock;
        clock.now = timeOfDay;
        clock.step = step;
        waitSeconds(clock, seconds);
        QCOMPARE_GE(clock.steady - 1000.0, seconds);
        // Not a step more than needed, and never a busy loop of empty waits.
        QCOMPARE_LT(clock.steady - 1000.0, seconds + qMax(step, 0.002));
        QCOMPARE_LE(clock.waits.size(), step > 0 ? int(seconds / step) + 1 : int(seconds / 60) + 2);
        QCOMPARE_LE(*std::max_element(clock.waits.begin(), clock.waits.end()), 60000);
    }
};

QTEST_MAIN(TestSplash)
#include "tst_splash.moc"
