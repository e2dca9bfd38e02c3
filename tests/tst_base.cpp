// The foundations that need no window: cursor files as read and written, the
// desktop's shell opening documents and web pages as driven through stand-in
// xdg tools, a failure's text, and the system clock.
#include "base/clock.h"
#include "base/cursorfile.h"
#include "base/failure.h"
#include "base/shell.h"
#include "support/testenvironment.h"

#include <QBuffer>
#include <QElapsedTimer>
#include <QTest>
#include <QTime>
#include <QTimer>
#include <QtEndian>

#include <cmath>

using namespace Qt::StringLiterals;

namespace {

// The bytes with a little-endian number of `size` bytes put at `at`.
QByteArray with(QByteArray bytes, int at, quint32 value, int size = 2)
{
    for (int i = 0; i < size; ++i)
        bytes[at + i] = char(value >> (8 * i));
    return bytes;
}

// A cursor file of one picture around the payload, the hotspot at (1, 0).
QByteArray cursorAround(const QByteArray& payload)
{
    QByteArray bytes = QByteArray::fromHex("000002000100") + QByteArray(16, '\0');
    bytes = with(with(with(bytes, 10, 1), 14, quint32(payload.size()), 4), 18, 22, 4);
    return bytes + payload;
}

// A 2-by-2 bitmap of the given depth, top row red and green, bottom row blue
// and white, nothing masked; a palette picture has the two colours red and
// blue, its top row red, its bottom row blue.
QByteArray bitmap(int bits)
{
    QByteArray info =
        with(with(with(with(QByteArray(40, '\0'), 0, 40, 4), 4, 2, 4), 8, 4, 4), 12, 1);
    info = with(info, 14, quint32(bits));
    // The palette of the 1-bit one, the rows bottom up, each padded to 4
    // bytes, and the mask.
    const QByteArray pixels =
        bits == 1 ? "ff000000 0000ff00 00000000 c0000000" : "ff0000ffffff0000 0000ff00ff000000";
    return info + QByteArray::fromHex(pixels) + QByteArray(8, '\0');
}

QString topRow(const QImage& image)
{
    QStringList colours;
    for (int x = 0; x < image.width(); ++x)
        colours << QColor::fromRgba(image.pixel(x, 0)).name(QColor::HexArgb);
    return colours.join(u' ');
}

} // namespace

class TestBase : public QObject {
    Q_OBJECT

    QTemporaryDir m_desktop; // stand-in xdg tools and desktop entries

    // Writes an executable script of the stand-in tools.
    void tool(const QString& name, const QString& body)
    {
        writeBytes(m_desktop.filePath(u"bin/"_s + name), "#!/bin/sh\n" + body.toUtf8() + '\n');
        QFile::setPermissions(m_desktop.filePath(u"bin/"_s + name),
                              QFile::ReadOwner | QFile::WriteOwner | QFile::ExeOwner);
    }

private Q_SLOTS:
    void cursorFiles_data()
    {
        QTest::addColumn<QByteArray>("bytes");
        QTest::addColumn<QString>("topRow"); // empty: refused
        QImage picture(2, 2, QImage::Format_ARGB32);
        picture.fill(Qt::blue);
        picture.setPixel(0, 0, qRgba(255, 0, 0, 0));
        const QByteArray written = writeCursorFile(picture, {1, 0});
        const QString transparentBlue = u"#00ff0000 #ff0000ff"_s;
        QByteArray noAlpha = written;
        for (int at = 22 + 40 + 3; at < 22 + 40 + 16; at += 4)
            noAlpha[at] = 0;
        QByteArray png;
        QBuffer buffer(&png);
        picture.save(&buffer, "PNG");
        QImage largest(256, 256, QImage::Format_ARGB32);
        largest.fill(Qt::white);
        QTest::newRow("written, read back") << written << transparentBlue;
        QTest::newRow("no alpha: the mask decides") << noAlpha << transparentBlue;
        QTest::newRow("PNG") << cursorAround(png) << transparentBlue;
        QTest::newRow("24-bit") << cursorAround(bitmap(24)) << u"#ffff0000 #ff00ff00"_s;
        QTest::newRow("palette") << cursorAround(bitmap(1)) << u"#ffff0000 #ffff0000"_s;
        QTest::newRow("256 by 256")
            << writeCursorFile(largest, {255, 255}) << QStringList(256, u"#ffffffff"_s).join(u' ');
        QTest::newRow("PNG that does not decode") << cursorAround("\x89PNG\r\n") << QString();
        QTest::newRow("24-bit cut short") << cursorAround(bitmap(24).chopped(9)) << QString();
        QTest::newRow("empty") << QByteArray() << QString();
        QTest::newRow("reserved word") << with(written, 0, 1) << QString();
        QTest::newRow("an icon") << with(written, 2, 1) << QString();
        QTest::newRow("no pictures") << with(written, 4, 0) << QString();
        QTest::newRow("offset in the header") << with(written, 18, 21, 4) << QString();
        QTest::newRow("offset past the end") << with(written, 18, 1000, 4) << QString();
        QTest::newRow("size past the end") << with(written, 14, 200, 4) << QString();
        QTest::newRow("not a bitmap header") << with(written, 22, 12, 4) << QString();
        QTest::newRow("bitmap header cut") << cursorAround(bitmap(32).left(39)) << QString();
        QTest::newRow("no width") << with(written, 26, 0, 4) << QString();
        QTest::newRow("257 wide") << with(written, 26, 257, 4) << QString();
        QTest::newRow("negative height") << with(written, 30, quint32(-4), 4) << QString();
        QTest::newRow("odd height") << with(written, 30, 3, 4) << QString();
        QTest::newRow("257 high") << with(written, 30, 514, 4) << QString();
        QTest::newRow("wider than its colours") << with(written, 26, 4, 4) << QString();
        QTest::newRow("two planes") << with(written, 34, 2) << QString();
        QTest::newRow("compressed") << with(written, 38, 3, 4) << QString();
        QTest::newRow("hotspot below") << with(written, 12, 2) << QString();
    }

    // The first picture with its hotspot, or nothing for a malformed file.
    void cursorFiles()
    {
        QFETCH(QByteArray, bytes);
        QFETCH(QString, topRow);
        const std::optional<CursorPicture> read = readCursorFile(bytes);
        QCOMPARE(read ? ::topRow(read->image) : QString(), topRow);
        if (read)
            QCOMPARE(read->hotSpot, read->image.width() == 2 ? QPoint(1, 0) : QPoint(255, 255));
    }

    void openingADocument_data()
    {
        QTest::addColumn<QString>("file"); // what is opened, in a fresh folder; or a web page
        QTest::addColumn<QString>("mime"); // xdg-mime's answers; null: none, "kill": it crashes
        QTest::addColumn<QString>("entry");
        QTest::addColumn<QString>("installed"); // where the entry is; "-": no xdg-open
        QTest::addColumn<QString>("message");   // its start; empty: opened
        const auto row = [](const char* tag, const QString& file, const QString& mime,
                            const QString& entry, const QString& installed,
                            const QString& message) {
            QTest::newRow(tag) << file << mime << entry << installed << message;
        };
        const QString xlsx = u"a.xlsx"_s, sheet = u"text/x-sheet"_s,
                      app = u"quill-sheets.desktop"_s;
        const QString home = u"data/applications/"_s, none, ok; // ok: opened
        const QString missing = u"There is no program on this desktop that opens "_s;
        const QString noSheets = missing + u"xlsx files (text/x-sheet)."_s;
        row("opened", xlsx, sheet + u"; charset=binary"_s, app, home + app, ok);
        row("entry in a vendor folder", xlsx, sheet, app,
            u"system/applications/quill/sheets.desktop"_s, ok);
        row("entry in a subfolder", xlsx, sheet, app, home + u"more/"_s + app, ok);
        row("entry starting with a dash", xlsx, sheet, u"-s.desktop"_s, home + u"-s.desktop"_s, ok);
        row("type from the name", u"a.txt"_s, u""_s, none, none,
            missing + u"txt files (text/plain)."_s);
        row("no program for the type", xlsx, sheet, none, none, noSheets);
        row("program not installed", xlsx, sheet, app, home + u"other.desktop"_s, noSheets);
        row("xdg-mime crashes", xlsx, u"kill"_s, none, none, u"xdg-mime gave no answer."_s);
        row("no xdg-mime", xlsx, none, none, none, u"xdg-mime could not be run ("_s);
        row("no xdg-open", xlsx, sheet, app, home + app + u" -"_s,
            u"The program for text/x-sheet files could not be started."_s);
        row("no file", u""_s, sheet, none, none, u"The file "_s);
        row("a web page", u"https://quillane.org/?a=1&b=2"_s, none, none, none, ok);
    }

    // The desktop's association is asked first, so that a missing program is
    // reported; xdg-open then gets the file's absolute path, or the page's
    // address as it is.
    void openingADocument()
    {
        QFETCH(QString, file);
        QFETCH(QString, mime);
        QFETCH(QString, entry);
        QFETCH(QString, installed);
        QFETCH(QString, message);
        QVERIFY(m_desktop.isValid());
        QDir(m_desktop.path()).removeRecursively();
        QDir().mkpath(m_desktop.filePath(u"bin"_s));
        qputenv("PATH", QFile::encodeName(m_desktop.filePath(u"bin"_s)));
        qputenv("XDG_DATA_HOME", QFile::encodeName(m_desktop.filePath(u"data"_s)));
        // The system's own folder after it, for the types of files.
        qputenv("XDG_DATA_DIRS",
                QFile::encodeName(m_desktop.filePath(u"system"_s)) + ":/usr/share");
        const QString opened = m_desktop.filePath(u"opened"_s);
        if (!mime.isNull())
            tool(u"xdg-mime"_s,
                 mime == u"kill"_s
                     ? u"kill -9 $$"_s
                     : u"[ \"$2\" = default ] && echo '%1' || echo '%2'"_s.arg(entry, mime));
        if (!installed.endsWith(u" -"_s))
            tool(u"xdg-open"_s, u"echo \"$@\" > '%1'"_s.arg(opened));
        if (!installed.isEmpty())
            writeBytes(m_desktop.filePath(installed.section(u' ', 0, 0)), "[Desktop Entry]\n");
        const bool page = file.startsWith(u"https:"_s);
        const QString path = m_desktop.filePath(file.isEmpty() ? u"gone.xlsx"_s : file);
        if (!file.isEmpty() && !page)
            writeBytes(path, "names\n");

        QString failure;
        try {
            page ? DesktopShell().openWebPage(QUrl(file)) : DesktopShell().openDocument(path);
        } catch (const Failure& f) {
            failure = f.description();
        }
        QVERIFY2(message.isEmpty() ? failure.isEmpty() : failure.startsWith(message),
                 qPrintable(failure));
        if (message.isEmpty())
            QTRY_COMPARE(QFile::exists(opened) ? fileBytes(opened) : QByteArray(),
                         (page ? file.toUtf8() : QFile::encodeName(path)) + '\n');
        else
            QVERIFY(!QFile::exists(opened));
    }

    // Caught as any exception, a failure gives its text in UTF-8.
    void aFailureAsAnyException()
    {
        try {
            throw Failure(u"Größe \u2014 names.mdb"_s);
        } catch (const std::exception& e) {
            QCOMPARE(QByteArray(e.what()), u"Größe \u2014 names.mdb"_s.toUtf8());
        }
    }

    // A wait lets events run and lasts at least as long as asked; a wait of
    // nothing still runs the events that are due.
    void theSystemClockWaits()
    {
        SystemClock clock;
        const double midnight = QTime::currentTime().msecsSinceStartOfDay() / 1000.0;
        QVERIFY(std::fmod(clock.secondsSinceMidnight() - midnight + 86400.0, 86400.0) < 1.0);
        int ran = 0;
        QTimer::singleShot(10, [&] { ++ran; });
        QElapsedTimer elapsed;
        elapsed.start();
        const double start = clock.steadySeconds();
        waitSeconds(clock, 0.05);
        QCOMPARE_GE(elapsed.elapsed(), 50);
        QCOMPARE_GE(clock.steadySeconds() - start, 0.05);
        QCOMPARE(ran, 1);
        QTimer::singleShot(0, [&] { ++ran; });
        clock.waitForEvents(-1);
        QCOMPARE(ran, 2);
    }
};

QTEST_GUILESS_MAIN(TestBase)
#include "tst_base.moc"
