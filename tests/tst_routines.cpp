// The shared window routines: the file test, the skin, the hover cursor and
// its file, the random visit at start-up, the hover rule on a real window,
// and the end of the program when a handler without a trap fails.
#include "app/application.h"
#include "app/cursorfile.h"
#include "app/form1.h"
#include "app/randomvisit.h"
#include "app/windowroutines.h"
#include "support/testenvironment.h"

#include <QDir>
#include <QFile>
#include <QGroupBox>
#include <QLineEdit>
#include <QMouseEvent>
#include <QProcess>
#include <QProgressBar>
#include <QPushButton>
#include <QRadioButton>
#include <QRegularExpression>
#include <QTest>
#include <QTimer>
#include <QTreeView>

#include <cmath>

using namespace Qt::StringLiterals;

namespace {

const QString ShippedCursor = QStringLiteral(QUILLANE_PROGRAM_DIR "/HAND-M.CUR");
const QString ShippedSkin = QStringLiteral(QUILLANE_PROGRAM_DIR "/x/o.cjs");
const QPoint ShippedHotSpot(7, 1);

template <typename T> T* control(QWidget& window, const QString& name)
{
    auto* c = window.findChild<T*>(name);
    if (!c)
        qFatal("no control %s", qPrintable(name));
    return c;
}

QByteArray readAll(const QString& path)
{
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly))
        qFatal("cannot read %s", qPrintable(path));
    return file.readAll();
}

void writeFile(const QString& path, const QByteArray& bytes)
{
    QDir().mkpath(QFileInfo(path).path());
    QFile file(path);
    if (!file.open(QIODevice::WriteOnly) || file.write(bytes) != bytes.size())
        qFatal("cannot write %s", qPrintable(path));
}

// A well-formed cursor file with one field overwritten.
QByteArray patched(qsizetype at, const QByteArray& bytes)
{
    QByteArray cursor = readAll(ShippedCursor);
    cursor.replace(at, bytes.size(), bytes);
    return cursor;
}

QByteArray le16(quint16 v)
{
    QByteArray bytes;
    bytes.append(char(v & 0xff));
    bytes.append(char(v >> 8));
    return bytes;
}

QByteArray le32(quint32 v)
{
    return le16(quint16(v & 0xffff)) + le16(quint16(v >> 16));
}

// The controls that the button-face background reaches, and those it leaves.
const QStringList PaintedControls{u"Frame1"_s,  u"Frame3"_s,  u"Frame4"_s,  u"Frame5"_s,
                                  u"Frame6"_s,  u"Option1"_s, u"Option2"_s, u"Option3"_s,
                                  u"Option8"_s, u"Option9"_s};
const QStringList OwnColourControls{u"PushButton1"_s, u"PushButton4"_s, u"ListView1"_s,
                                    u"ListView2"_s,   u"Text1"_s,       u"ProgressBar1"_s};

void moveOver(QWidget* control)
{
    QWidget* target = control;
    if (auto* view = qobject_cast<QAbstractScrollArea*>(control))
        target = view->viewport();
    const QPointF local(target->width() / 2.0, target->height() / 2.0);
    QMouseEvent move(QEvent::MouseMove, local, target->mapToGlobal(local), Qt::NoButton,
                     Qt::NoButton, Qt::NoModifier);
    QApplication::sendEvent(target, &move);
}

} // namespace

class TestRoutines : public QObject {
    Q_OBJECT

private Q_SLOTS:
    // A folder counts as existing: it is a path that exists, as the
    // modification-time question answers it. Callers that need a file find
    // out when they read it.
    void fileExists_data()
    {
        QTest::addColumn<QString>("kind");
        QTest::addColumn<bool>("exists");
        QTest::newRow("empty path") << u"empty"_s << false;
        QTest::newRow("missing file") << u"missing"_s << false;
        QTest::newRow("existing file") << u"file"_s << true;
        QTest::newRow("empty file") << u"empty file"_s << true;
        QTest::newRow("folder") << u"folder"_s << true;
        QTest::newRow("link to nowhere") << u"dangling"_s << false;
        QTest::newRow("nul in the path") << u"nul"_s << false;
        QTest::newRow("below a file") << u"below file"_s << false;
    }

    void fileExists()
    {
        QFETCH(QString, kind);
        QFETCH(bool, exists);
        QTemporaryDir folder;
        const QString file = folder.filePath(u"names.txt"_s);
        writeFile(file, "Ada\n");
        writeFile(folder.filePath(u"empty.txt"_s), {});
        QVERIFY(QFile::link(folder.filePath(u"gone.txt"_s), folder.filePath(u"link.txt"_s)));

        const QHash<QString, QString> paths{
            {u"empty"_s, QString()},
            {u"missing"_s, folder.filePath(u"missing.txt"_s)},
            {u"file"_s, file},
            {u"empty file"_s, folder.filePath(u"empty.txt"_s)},
            {u"folder"_s, folder.path()},
            {u"dangling"_s, folder.filePath(u"link.txt"_s)},
            {u"nul"_s, file + QChar(u'\0') + u"x"_s},
            {u"below file"_s, file + u"/inner.txt"_s},
        };
        QCOMPARE(FileExists(paths.value(kind)), exists);
    }

    void skin_data()
    {
        QTest::addColumn<QString>("kind");
        QTest::addColumn<bool>("skinned");
        QTest::newRow("present") << u"present"_s << true;
        QTest::newRow("absent") << u"absent"_s << false;
        QTest::newRow("a folder") << u"folder"_s << false;
        QTest::newRow("a link to nowhere") << u"dangling"_s << false;
    }

    void skin()
    {
        QFETCH(QString, kind);
        QFETCH(bool, skinned);
        TestEnvironment env;
        const QString skin = skinFilePath(env.folder());
        if (kind == u"present"_s)
            writeFile(skin, readAll(ShippedSkin));
        else if (kind == u"folder"_s)
            QVERIFY(QDir().mkpath(skin));
        else if (kind == u"dangling"_s)
            QVERIFY(QDir().mkpath(QFileInfo(skin).path())
                    && QFile::link(env.filePath(u"gone.cjs"_s), skin));

        Form1 form(env.environment);
        const QColor buttonFace = form.palette().color(QPalette::Button);
        QCOMPARE(form.palette().color(QPalette::Window), QColor(Qt::white));
        QHash<QString, QPalette> before;
        for (const QString& name : OwnColourControls)
            before.insert(name, control<QWidget>(form, name)->palette());

        QCOMPARE(ApplySkin(&form, env.folder()), skinned);

        const QColor expected = skinned ? buttonFace : QColor(Qt::white);
        QCOMPARE(form.palette().color(QPalette::Window), expected);
        for (const QString& name : PaintedControls)
            QVERIFY2(control<QWidget>(form, name)->palette().color(QPalette::Window) == expected,
                     qPrintable(name));
        for (const QString& name : OwnColourControls) {
            const QPalette now = control<QWidget>(form, name)->palette();
            QVERIFY2(now.color(QPalette::Base) == before[name].color(QPalette::Base)
                         && !control<QWidget>(form, name)->autoFillBackground(),
                     qPrintable(name));
        }
        QCOMPARE(form.styleSheet(), skinned ? QString::fromUtf8(readAll(ShippedSkin)) : QString());
    }

    // The shipped skin is a style sheet Qt reads without complaint, and it
    // keeps every caption inside its control's fixed place.
    void shippedSkinFitsTheLayout()
    {
        TestEnvironment env;
        writeFile(skinFilePath(env.folder()), readAll(ShippedSkin));
        QTest::failOnWarning(QRegularExpression(u"(?i)style ?sheet"_s));
        Form1 form(env.environment);
        form.Form_Load();
        form.show();
        QVERIFY(QTest::qWaitForWindowExposed(&form));
        QVERIFY(!form.styleSheet().isEmpty());
        QVERIFY(!form.grab().isNull());

        for (QPushButton* button : form.findChildren<QPushButton*>()) {
            const int caption = button->fontMetrics().horizontalAdvance(button->text());
            QVERIFY2(caption + 12 <= button->width(), qPrintable(button->objectName()));
            QVERIFY2(button->sizeHint().height() <= button->height(),
                     qPrintable(button->objectName()));
        }
        for (QRadioButton* option : form.findChildren<QRadioButton*>()) {
            QVERIFY2(option->sizeHint().width() <= option->width(),
                     qPrintable(option->objectName()));
            QVERIFY2(option->sizeHint().height() <= option->height(),
                     qPrintable(option->objectName()));
        }
        // The frame titles sit above the first control of each frame.
        for (QGroupBox* frame : form.findChildren<QGroupBox*>()) {
            const int titleBottom = frame->fontMetrics().height();
            for (QWidget* child : frame->findChildren<QWidget*>(Qt::FindDirectChildrenOnly))
                QVERIFY2(child->isWindow() || child->y() >= titleBottom,
                         qPrintable(child->objectName()));
        }
    }

    void startUpSkinsAndCentresTheWindow()
    {
        TestEnvironment env;
        writeFile(skinFilePath(env.folder()), readAll(ShippedSkin));
        Form1 form(env.environment);
        form.Form_Load();
        QVERIFY(!form.styleSheet().isEmpty());
        const QRect screen = form.screen()->geometry();
        const QRect frame = form.frameGeometry();
        QVERIFY(qAbs(frame.center().x() - screen.center().x()) <= 1);
        QVERIFY(qAbs(frame.center().y() - screen.center().y()) <= 1);
    }

    void shippedCursorHasItsHotSpotOnTheFingertip()
    {
        const std::optional<CursorPicture> picture = readCursorFile(readAll(ShippedCursor));
        QVERIFY(picture);
        QCOMPARE(picture->image.size(), QSize(32, 32));
        QCOMPARE(picture->hotSpot, ShippedHotSpot);
        // The hotspot is on the hand's outline, at its very top.
        QCOMPARE(qAlpha(picture->image.pixel(picture->hotSpot)), 255);
        for (int y = 0; y < picture->hotSpot.y(); ++y)
            for (int x = 0; x < 32; ++x)
                QCOMPARE(qAlpha(picture->image.pixel(x, y)), 0);
        QCOMPARE(qAlpha(picture->image.pixel(31, 31)), 0);

        const std::optional<QCursor> cursor = loadCursorFile(ShippedCursor);
        QVERIFY(cursor);
        QCOMPARE(cursor->shape(), Qt::BitmapCursor);
        QCOMPARE(cursor->hotSpot(), ShippedHotSpot);
        QCOMPARE(cursor->pixmap().size(), QSize(32, 32));
    }

    void aWrittenCursorReadsBackAsWritten()
    {
        QImage image(20, 12, QImage::Format_ARGB32);
        image.fill(Qt::transparent);
        image.setPixel(3, 4, qRgba(10, 200, 30, 255));
        image.setPixel(19, 11, qRgba(0, 0, 0, 80));
        const std::optional<CursorPicture> back =
            readCursorFile(writeCursorFile(image, QPoint(3, 4)));
        QVERIFY(back);
        QCOMPARE(back->hotSpot, QPoint(3, 4));
        QCOMPARE(back->image, image);
    }

    void malformedCursorFilesGiveNothing_data()
    {
        QTest::addColumn<QByteArray>("bytes");
        const QByteArray good = readAll(ShippedCursor);
        QTest::newRow("empty") << QByteArray();
        QTest::newRow("garbage") << QByteArray(4286, '\xa5');
        QTest::newRow("text") << QByteArray("not a cursor at all, just some words\n");
        QTest::newRow("header only") << good.left(6);
        QTest::newRow("cut in the directory") << good.left(15);
        QTest::newRow("cut before the bitmap") << good.left(22);
        QTest::newRow("cut in the bitmap header") << good.left(40);
        QTest::newRow("cut in the colours") << good.left(1000);
        QTest::newRow("cut in the mask") << good.left(good.size() - 1);
        QTest::newRow("an icon, not a cursor") << patched(2, le16(1));
        QTest::newRow("no pictures") << patched(4, le16(0));
        QTest::newRow("reserved word set") << patched(0, le16(7));
        QTest::newRow("offset past the end") << patched(18, le32(quint32(good.size()) + 10));
        QTest::newRow("offset into the header") << patched(18, le32(2));
        QTest::newRow("size past the end") << patched(14, le32(0xfffffff0u));
        QTest::newRow("hotspot outside") << patched(10, le16(40));
        QTest::newRow("wrong bitmap header") << patched(22, le32(12));
        QTest::newRow("zero width") << patched(26, le32(0));
        QTest::newRow("negative width") << patched(26, le32(0xffffffe0u));
        QTest::newRow("huge height") << patched(30, le32(0x7ffffffeu));
        QTest::newRow("odd height") << patched(30, le32(63));
        QTest::newRow("no planes") << patched(34, le16(0));
        QTest::newRow("compressed") << patched(38, le32(3));
        QTest::newRow("broken png") << patched(22, QByteArray("\x89PNG\r\n\x1a\n garbage"));
    }

    void malformedCursorFilesGiveNothing()
    {
        QFETCH(QByteArray, bytes);
        QVERIFY(!readCursorFile(bytes));
        QTemporaryDir folder;
        const QString path = cursorFilePath(folder.path());
        writeFile(path, bytes);
        QVERIFY(!loadCursorFile(path));
    }

    void hoverCursorComesFromTheFile_data()
    {
        QTest::addColumn<QString>("file"); // shipped, absent, garbage
        QTest::addColumn<Qt::CursorShape>("overButton");
        QTest::newRow("shipped") << u"shipped"_s << Qt::BitmapCursor;
        QTest::newRow("absent") << u"absent"_s << Qt::ArrowCursor;
        QTest::newRow("unreadable as a cursor") << u"garbage"_s << Qt::ArrowCursor;
    }

    void hoverCursorComesFromTheFile()
    {
        QFETCH(QString, file);
        QFETCH(Qt::CursorShape, overButton);
        TestEnvironment env;
        const QString path = cursorFilePath(env.folder());
        if (file == u"shipped"_s)
            writeFile(path, readAll(ShippedCursor));
        else if (file == u"garbage"_s)
            writeFile(path, "MZ\x90\x00 not a cursor");

        Form1 form(env.environment);
        form.Form_Load();
        form.show();
        moveOver(control<QPushButton>(form, u"PushButton1"_s));
        QCOMPARE(form.pointer().mousePointer(), MousePointer::Custom);
        QCOMPARE(form.cursor().shape(), overButton);
        if (overButton == Qt::BitmapCursor)
            QCOMPARE(form.cursor().hotSpot(), ShippedHotSpot);
        moveOver(control<QGroupBox>(form, u"Frame3"_s));
        QCOMPARE(form.pointer().mousePointer(), MousePointer::Default);
    }

    // Moves over controls in order, starting from the pointer given.
    void hoverRule_data()
    {
        QTest::addColumn<int>("start");
        QTest::addColumn<QStringList>("path");
        QTest::addColumn<int>("end");
        QTest::newRow("hand over a button") << 0 << QStringList{u"PushButton1"_s} << 99;
        QTest::newRow("busy over a button")
            << 11 << QStringList{u"PushButton1"_s, u"PushButton8"_s} << 11;
        QTest::newRow("busy over a pane and a frame")
            << 11 << QStringList{u"ListView2"_s, u"Frame5"_s, u"Form1"_s} << 11;
        QTest::newRow("back to default over a pane")
            << 0 << QStringList{u"PushButton2"_s, u"ListView1"_s} << 0;
        QTest::newRow("back to default over a source option")
            << 0 << QStringList{u"PushButton3"_s, u"Option8"_s} << 0;
        QTest::newRow("a gender option keeps the hand")
            << 0 << QStringList{u"PushButton6"_s, u"Option2"_s} << 99;
        QTest::newRow("the count box keeps the hand")
            << 0 << QStringList{u"PushButton7"_s, u"Text1"_s} << 99;
        QTest::newRow("the progress bar keeps the hand")
            << 0 << QStringList{u"PushButton1"_s, u"ProgressBar1"_s} << 99;
        QTest::newRow("a gender option keeps the default")
            << 99 << QStringList{u"Frame4"_s, u"Option3"_s} << 0;
    }

    void hoverRule()
    {
        QFETCH(int, start);
        QFETCH(QStringList, path);
        QFETCH(int, end);
        TestEnvironment env;
        Form1 form(env.environment);
        form.Form_Load();
        form.show();
        form.pointer().setMousePointer(start);
        for (const QString& name : path)
            moveOver(name == u"Form1"_s ? &form : control<QWidget>(form, name));
        QCOMPARE(form.pointer().mousePointer(), end);
        if (end == MousePointer::Hourglass)
            QCOMPARE(form.cursor().shape(), Qt::WaitCursor);
    }

    void randomVisitOpensThePageForSomeSeeds_data()
    {
        QTest::addColumn<double>("time");
        QTest::addColumn<bool>("opens");
        QTest::newRow("00:02:07.5") << 127.5 << true;
        QTest::newRow("00:02:34.5") << 154.5 << true;
        QTest::newRow("00:03:20.25") << 200.25 << true;
        QTest::newRow("midnight") << 0.0 << false;
        QTest::newRow("noon") << 43200.0 << false;
        QTest::newRow("00:02:07.75") << 127.75 << false;
    }

    void randomVisitOpensThePageForSomeSeeds()
    {
        QFETCH(double, time);
        QFETCH(bool, opens);
        FakeShell shell;
        FakeClock clock;
        clock.now = time;
        RandomSource random;
        random.seed(12345); // reseeded from the clock: earlier state does not matter
        random.next();
        RandomVisit(random, clock, shell);
        QCOMPARE(shell.webPages, opens ? QList<QUrl>{ProductWebPage} : QList<QUrl>{});
        QCOMPARE(ProductWebPage.toString(), u"https://quillane.org/"_s);

        // The draw is used up: generation goes on from the second number.
        RandomSource replay;
        replay.seedFromTimeOfDay(time);
        const double first = replay.next();
        QCOMPARE(opens, int(std::floor(first * 100)) + 1 == 7);
        QCOMPARE(random.next(), replay.next());
    }

    // About one start in a hundred: 10,000 starts at times spread over the
    // day open the page about 100 times; 4 standard deviations (about 10 each)
    // either side.
    void randomVisitOpensThePageAboutOnceInAHundred()
    {
        FakeShell shell;
        FakeClock clock;
        RandomSource random;
        constexpr int Starts = 10000;
        for (int i = 0; i < Starts; ++i) {
            clock.now = i * (86400.0 / Starts) + 0.37;
            RandomVisit(random, clock, shell);
        }
        const qsizetype opened = shell.webPages.size();
        QVERIFY2(opened >= 60 && opened <= 140, qPrintable(QString::number(opened)));
    }

    void startUpVisitsWhenTheClockSaysSo()
    {
        TestEnvironment env;
        env.clock.now = 154.5;
        Form1 form(env.environment);
        form.Form_Load();
        QCOMPARE(env.shell.webPages, QList<QUrl>{ProductWebPage});
    }

    // After start-up, an option click whose refresh fails (the database was
    // made unusable while the program ran) has no trap: the program shows the
    // notice and ends with a failure status.
    void anUntrappedFailureAfterStartUpEndsTheProgram()
    {
        TestEnvironment env;
        QProcess child;
        child.start(QCoreApplication::applicationFilePath(),
                    {u"--click-option-after-breaking-database"_s, env.folder()});
        QVERIFY(child.waitForFinished(60000));
        QCOMPARE(child.exitStatus(), QProcess::NormalExit);
        const QString output = QString::fromUtf8(child.readAllStandardOutput());
        QVERIFY2(output.contains(u"started\n"_s), qPrintable(output));
        QVERIFY2(output.contains(u"notice: Quillane|file is not a database"_s), qPrintable(output));
        QVERIFY2(!output.contains(u"still running"_s), qPrintable(output));
        QCOMPARE(child.exitCode(), 1);
    }
};

// Run as a child process by the test above: the whole program in a given
// folder, with dialogs that print instead of waiting. Once the window is up,
// the database is overwritten and "Male Only" is clicked.
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

int clickOptionAfterBreakingDatabase(int argc, char** argv)
{
    QuillaneApplication app(argc, argv);
    useTemporarySettings();
    PrintingDialogs dialogs;
    app.setDialogs(&dialogs);
    Settings settings;
    FakeShell shell;
    FakeClock clock;
    RandomSource random;
    const QString folder = QString::fromLocal8Bit(argv[2]);
    Environment environment{dialogs, settings, shell, clock, random, folder};
    try {
        Form1 form(environment);
        form.Form_Load();
        form.show();
        QTimer::singleShot(0, &form, [&] {
            std::printf("started\n");
            std::fflush(stdout);
            writeFile(QDir(folder).filePath(u"names.mdb"_s), QByteArray(4096, 'x'));
            QTest::mouseClick(form.findChild<QRadioButton*>(u"Option2"_s), Qt::LeftButton);
            std::printf("still running\n");
            QCoreApplication::exit(0);
        });
        return app.exec();
    } catch (...) {
        app.endOnFailure();
    }
}
} // namespace

int main(int argc, char** argv)
{
    if (argc == 3 && qstrcmp(argv[1], "--click-option-after-breaking-database") == 0)
        return clickOptionAfterBreakingDatabase(argc, argv);
    QApplication app(argc, argv);
    TestRoutines test;
    return QTest::qExec(&test, argc, argv);
}

#include "tst_routines.moc"
